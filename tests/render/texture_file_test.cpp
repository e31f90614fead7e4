// Texture files as they are drawn: compressed pixels on a GL that takes them and on one that does not, and
// mipmaps that a file lacks.
#include <GLES2/gl2.h>

#include "loaders/ImageFiles.h"
#include "Scenes.h"
#include "support/Capture.h"

namespace {

constexpr char kVertex[] = "attribute vec4 place; void main() { gl_Position = place; }";
// Texel for pixel, or all of the texture on one.
constexpr char kFragment[] =
    "precision highp float; uniform sampler2D image; uniform vec2 size;"
    "void main() { gl_FragColor = texture2D(image, gl_FragCoord.xy / size); }";

class TextureFileTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        const char* attributes[] = {"place"};
        uint32_t shaders[2];
        char log[QEX_SHADER_LOG_SIZE];
        QexShader_Create(&shaders[0], kVertex, GL_VERTEX_SHADER);
        QexShader_Create(&shaders[1], kFragment, GL_FRAGMENT_SHADER);
        ASSERT_EQ(QexShader_CreateProgram(&program_, shaders[0], shaders[1], attributes, 1, log), 0) << log;
        for (const uint32_t shader : shaders) glDeleteShader(shader);
    }
    void TearDown() override {
        glDeleteProgram(program_);
        QexRenderState_Reset(nullptr);
        RenderTest::TearDown();
    }

    // The bound texture's texels as they are drawn on `across` x `up` pixels, its first row first.
    std::vector<Rgba> Draw(int across, int up) {
        const float triangle[] = {-1, -1, 3, -1, -1, 3};
        Clear();
        glUseProgram(program_);
        glUniform2f(glGetUniformLocation(program_, "size"), static_cast<float>(across),
                    static_cast<float>(up));
        glViewport(0, 0, across, up);
        glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, triangle);
        glEnableVertexAttribArray(0);
        glDrawArrays(GL_TRIANGLES, 0, 3);
        glDisableVertexAttribArray(0);
        const Picture picture = Read();
        std::vector<Rgba> texels;
        for (int y = 0; y < up; ++y)
            for (int x = 0; x < across; ++x) texels.push_back(picture.Pixel(x, kHeight - 1 - y));
        return texels;
    }
    static void UseTexels() {
        glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
        glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
    }

    uint32_t program_ = 0;
};

std::vector<Rgba> ToTexels(const std::vector<uint8_t>& rgba) {
    std::vector<Rgba> texels;
    for (size_t i = 0; i < rgba.size(); i += 4)
        texels.push_back({rgba[i], rgba[i + 1], rgba[i + 2], rgba[i + 3]});
    return texels;
}

// Whether a block is one of two colours of which the second, given as a difference, is out of range. The
// format leaves those undefined, and drivers differ.
bool IsUndefined(const uint8_t* block) {
    bool outside = false;
    for (int c = 0; c < 3; ++c) {
        const int first = block[c] >> 3, difference = (block[c] & 7) - (block[c] & 4) * 2;
        outside |= first + difference < 0 || first + difference > 31;
    }
    return outside && block[3] & 2;
}

// Defined ETC1 blocks of any bytes, in a PVR file of one level.
Bytes NoiseETC(int width, int height, uint32_t seed) {
    pod::PvrImage image;
    image.type = pod::kPvrEtc1;
    image.width = static_cast<uint32_t>(width);
    image.height = static_cast<uint32_t>(height);
    image.surfaces = {{Noise(pod::PvrLevelSize(image.type, image.width, image.height), seed)}};
    for (uint8_t* block = image.surfaces[0][0].data();
         block < image.surfaces[0][0].data() + image.surfaces[0][0].size(); block += 8)
        if (IsUndefined(block)) block[3] &= 0xFD;
    return pod::WritePvr(image);
}

pod::PvrImage PlainImage(uint32_t width, uint32_t height, const std::vector<uint8_t>& greys) {
    pod::PvrImage image;
    image.width = width;
    image.height = height;
    image.surfaces.emplace_back();
    for (const uint8_t grey : greys) {
        image.surfaces[0].push_back(Bytes(size_t{width} * height * 4, grey));
        width = std::max(width / 2, 1u);
        height = std::max(height / 2, 1u);
    }
    return image;
}

TEST_F(TextureFileTest, ETC1IsDecodedAsTheDriverDoes) {
    std::vector<std::pair<int, int>> sizes = {{64, 64}, {64, 64}, {128, 96}};
    for (int w = 1; w <= 8; ++w)
        for (int h = 1; h <= 8; ++h) sizes.push_back({w, h});
    for (const auto& [width, height] : sizes) {
        SCOPED_TRACE(testing::Message() << width << " x " << height);
        const Bytes file =
            NoiseETC(width, height, static_cast<uint32_t>(sizes.size() * 7 + width * 10 + height));
        std::vector<uint8_t> decoded(static_cast<size_t>(width * height) * 4);
        QexDecompressETC(file.data() + 52, width, height, decoded.data(), 0);
        for (const bool native : {true, false}) {
            gltapReset();
            if (!native) gltapSetInteger(GL_NUM_COMPRESSED_TEXTURE_FORMATS, 0);
            QexTexture texture = {};
            const GLCalls calls([&] {
                EXPECT_EQ(QexTexture_LoadPVRFromMem(&texture, file.data(), nullptr, 1, 0, nullptr), 0);
            });
            EXPECT_EQ(calls.Of({"glCompressedTexImage2D"}).size(), native ? 1u : 0u);
            UseTexels();
            EXPECT_TRUE(Draw(width, height) == ToTexels(decoded)) << native;
            QexTexture_Release(&texture);
        }
    }
}

TEST_F(TextureFileTest, MissingMipmapsAreMade) {
    Bytes pvr = pod::WritePvr(PlainImage(8, 8, {90}));
    PutWord(&pvr, 12, 3);  // its count of mipmaps
    Ktx ktx;
    ktx.width = ktx.height = 8;
    ktx.levels = {{Bytes(256, 90)}};
    const Bytes files[] = {pvr, ktx.File()};
    for (const Bytes& file : files) {
        QexTexture texture = {};
        ASSERT_EQ(QexTexture_LoadPVRFromMem(&texture, file.data(), nullptr, 1, 0, nullptr), 0);
        // Drawn on one pixel, level 3 is asked for.
        EXPECT_EQ(Draw(1, 1)[0], (Rgba{90, 90, 90, 90}));
        QexTexture_Release(&texture);
    }
}

TEST_F(TextureFileTest, WithoutOddMipmapsTheFirstLevelIsDrawn) {
    const Bytes file = pod::WritePvr(PlainImage(6, 2, {90, 200, 250}));
    for (const bool poor : {false, true}) {
        gltapReset();
        if (poor) gltapHideExtension("GL_OES_texture_npot");
        QexTexture texture = {};
        Capture out(STDOUT_FILENO);
        const GLCalls calls(
            [&] { EXPECT_EQ(QexTexture_LoadPVRFromMem(&texture, file.data(), nullptr, 1, 0, nullptr), 0); });
        const std::string printed = out.Text();
        EXPECT_EQ(calls.Of({"glTexImage2D"}).size(), poor ? 1u : 3u);
        EXPECT_EQ(printed.find("no mipmaps of 6 x 2 pixels here") != std::string::npos, poor) << printed;
        EXPECT_EQ(Draw(1, 1)[0], poor ? (Rgba{90, 90, 90, 90}) : (Rgba{250, 250, 250, 250}));
        QexTexture_Release(&texture);
    }
}

}  // namespace
