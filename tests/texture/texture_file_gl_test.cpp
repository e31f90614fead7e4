// Texture files as they are drawn: compressed pixels on a GL that takes them and on one that does not, and
// mipmaps that a file lacks.
#include <GLES2/gl2.h>

#include <fstream>

#include "support/Capture.h"
#include "support/ImageFiles.h"
#include "support/RealFiles.h"
#include "support/RenderScenes.h"
#include "texture/Container.h"

namespace {

constexpr char kVertex[] = "attribute vec4 place; void main() { gl_Position = place; }";
// Texel for pixel of a level, or all of the texture on one. The middle of a face of a cube lies at `middle`,
// its s and t grow along `right` and `down`; a texture of two dimensions has no middle.
constexpr char kFragment[] = R"(
precision highp float;
uniform sampler2D image;
uniform samplerCube cube;
uniform vec2 size;
uniform vec3 middle, right, down;
void main() {
    vec2 at = gl_FragCoord.xy / size;
    vec3 direction = middle + right * (2.0 * at.x - 1.0) + down * (2.0 * at.y - 1.0);
    gl_FragColor = middle == vec3(0.0) ? texture2D(image, at) : textureCube(cube, direction);
}
)";

// Of the faces +X -X +Y -Y +Z -Z, as GL defines them.
const float kFaces[6][3][3] = {{{1, 0, 0}, {0, 0, -1}, {0, -1, 0}}, {{-1, 0, 0}, {0, 0, 1}, {0, -1, 0}},
                               {{0, 1, 0}, {1, 0, 0}, {0, 0, 1}},   {{0, -1, 0}, {1, 0, 0}, {0, 0, -1}},
                               {{0, 0, 1}, {1, 0, 0}, {0, -1, 0}},  {{0, 0, -1}, {-1, 0, 0}, {0, -1, 0}}};

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

    // The texels of a face of the bound texture as they are drawn where `across` x `up` pixels show all of
    // it: its first rows first, no more than the surface holds.
    std::vector<Rgba> Draw(int across, int up, const float (*face)[3] = nullptr) {
        const char* const directions[] = {"middle", "right", "down"};
        const float none[3] = {};
        const float triangle[] = {-1, -1, 3, -1, -1, 3};
        Clear();
        glUseProgram(program_);
        glUniform2f(glGetUniformLocation(program_, "size"), static_cast<float>(across),
                    static_cast<float>(up));
        for (int i = 0; i < 3; ++i)
            glUniform3fv(glGetUniformLocation(program_, directions[i]), 1, face ? face[i] : none);
        glUniform1i(glGetUniformLocation(program_, "image"), face ? 1 : 0);
        glUniform1i(glGetUniformLocation(program_, "cube"), face ? 0 : 1);
        glViewport(0, 0, kWidth, kHeight);
        glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, triangle);
        glEnableVertexAttribArray(0);
        glDrawArrays(GL_TRIANGLES, 0, 3);
        glDisableVertexAttribArray(0);
        const Picture picture = Read();
        std::vector<Rgba> texels;
        for (int y = 0; y < std::min(up, kHeight); ++y)
            for (int x = 0; x < std::min(across, kWidth); ++x)
                texels.push_back(picture.Pixel(x, kHeight - 1 - y));
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

// Files of every kind that the engine loads and qex reads, each level and face: what is drawn is what qex
// decodes with a reader of its own, which is compared with other programs' pictures where it is tested.
class DecodedFileTest : public TextureFileTest {
  protected:
    void ExpectDrawnAsDecoded(const std::string& path) {
        SCOPED_TRACE(path.substr(path.rfind('/') + 1));
        Texture decoded;
        std::string error;
        QexTexture texture = {};
        if (!ReadTexture(ReadAll(path), &decoded, &error)) return;
        if (HoldsUndefined(decoded)) gltapSetInteger(GL_NUM_COMPRESSED_TEXTURE_FORMATS, 0);
        int32_t result;
        {
            Capture out(STDOUT_FILENO), log(STDERR_FILENO);
            result = QexTexture_LoadPVRFromFile(&texture, path.c_str(), nullptr, 1, 0);
        }
        if (result == 0) {
            ++loaded_;
            const bool cube = texture.flags & QEX_TEXFLAG_CUBEMAP;
            const GLenum target = cube ? GL_TEXTURE_CUBE_MAP : GL_TEXTURE_2D;
            const bool whole = decoded.levels.size() ==
                               QexImage_ChainLength(decoded.levels[0].width, decoded.levels[0].height);
            glTexParameteri(target, GL_TEXTURE_MIN_FILTER, whole ? GL_NEAREST_MIPMAP_NEAREST : GL_NEAREST);
            glTexParameteri(target, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
            for (size_t level = 0; level < (whole ? decoded.levels.size() : 1); ++level)
                for (size_t face = 0; face < decoded.faces; ++face)
                    Compare(DecodeFace(decoded, level, face), *decoded.format, cube ? kFaces[face] : nullptr);
            QexTexture_Release(&texture);
        }
        gltapReset();
    }
    int loaded_ = 0;

  private:
    static bool HoldsUndefined(const Texture& texture) {
        bool found = false;
        for (size_t level = 0; texture.format->coding == kQexETC1 && level < texture.levels.size(); ++level)
            for (size_t face = 0; face < texture.faces; ++face)
                for (uint64_t i = 0; i < texture.levels[level].bytes; i += 8)
                    found |= IsUndefined(&texture.file[texture.FaceOffset(level, face) + i]);
        return found;
    }
    void Compare(const Image& image, const PixelFormat& format, const float (*face)[3]) {
        const std::vector<Rgba> drawn = Draw(image.width, image.height, face);
        const int across = std::min(image.width, kWidth);
        int worst = 0;
        for (size_t i = 0; i < drawn.size(); ++i) {
            const uint8_t* p = image.Pixel(static_cast<int>(i) % across, static_cast<int>(i) / across);
            for (size_t c = format.pvrType == pod::kPvrAlpha8 ? 3 : 0; c < 4; ++c)
                worst = std::max(worst, std::abs(drawn[i][c] - p[c]));
        }
        EXPECT_LE(worst, 1) << image.width << " x " << image.height;
    }
    static Bytes ReadAll(const std::string& path) {
        std::ifstream stream(path, std::ios::binary);
        return Bytes((std::istreambuf_iterator<char>(stream)), {});
    }
};

TEST_F(DecodedFileTest, FilesAreDrawnAsTheyDecode) {
    int written = 0;
    for (const uint32_t type : {0x10u, 0x11u, 0x12u, 0x13u, 0x15u, 0x16u, 0x17u, 0x18u, 0x19u, 0x1Bu, 0x36u})
        for (const uint32_t surfaces : {1u, 6u}) {
            const std::string path = OutputPath("decoded" + std::to_string(written++) + ".pvr");
            pod::WriteFile(path, pod::WritePvr(PvrNoise(type, 16, 16, 5, surfaces)));
            ExpectDrawnAsDecoded(path);
        }
    Ktx narrow;
    narrow.width = 5;
    narrow.format = narrow.base = narrow.internal = GL_RGB;
    narrow.levels = {{Noise(64)}};
    for (const Bytes& file :
         {SoundKtx().File(), CubeKtx().File(), Etc1Ktx().File(), narrow.File(), SwappedFile(narrow)}) {
        const std::string path = OutputPath("decoded" + std::to_string(written++) + ".ktx");
        pod::WriteFile(path, file);
        ExpectDrawnAsDecoded(path);
    }
    EXPECT_EQ(loaded_, written);
}

TEST_F(DecodedFileTest, RealFilesAreDrawnAsTheyDecode) {
    std::vector<std::string> files = RealFilesIn("textures", ".pvr");
    for (const std::string& ktx : RealFilesIn("textures", ".ktx")) files.push_back(ktx);
    if (files.empty()) GTEST_SKIP() << "QEX_REAL_FILES names no folder with textures/";
    for (const std::string& file : files) ExpectDrawnAsDecoded(file);
    EXPECT_GT(loaded_, 20);
}

}  // namespace
