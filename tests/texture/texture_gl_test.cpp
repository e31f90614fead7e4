// Textures as the ready-made programs sample them; what the loaders upload is tested with the loaders.
#include <GLES2/gl2.h>

#include "support/Capture.h"
#include "support/ImageFiles.h"
#include "support/RenderScenes.h"

namespace {

struct Vertex {
    float position[3], normal[3], colour[4], uv[2];
};

// One triangle covers the whole surface; its corners lie outside.
const Vertex kTriangle[] = {{{-1, -1, 0}, {0, 0, 0.6f}, {1, 0, 0, 1}, {0, 0}},
                            {{3, -1, 0}, {0, 0, 0.6f}, {0, 1, 0, 1}, {2, 0}},
                            {{-1, 3, 0}, {0, 0, 0.6f}, {0, 0, 1, 0}, {0, 2}}};

void DrawTriangle(std::initializer_list<std::array<int, 2>> offsetsAndSizes) {
    GLuint index = 0;
    for (const auto& attribute : offsetsAndSizes) {
        glVertexAttribPointer(index, attribute[1], GL_FLOAT, GL_FALSE, sizeof(Vertex),
                              reinterpret_cast<const uint8_t*>(kTriangle) + attribute[0]);
        glEnableVertexAttribArray(index++);
    }
    glDrawArrays(GL_TRIANGLES, 0, 3);
    while (index-- > 0) glDisableVertexAttribArray(index);
}

class TextureTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        ASSERT_EQ(QexShaderProgram_Create(&lit_, QEX_PROGRAM_TEXTURE_LIGHT), 0);
    }
    void TearDown() override {
        QexShaderProgram_Release(&lit_);
        RenderTest::TearDown();
    }

    void DrawLit(const QexVec3& direction, const QexVec3& light, float alpha) {
        QexShaderProgram_Apply(&lit_);
        glUniformMatrix4fv(lit_.mvpMatrixLoc, 1, GL_FALSE, g_sMatIdentity.m);
        glUniform3f(lit_.lightDirectionLoc, direction.x, direction.y, direction.z);
        glUniform3f(lit_.lightColorLoc, light.x, light.y, light.z);
        glUniform1f(lit_.globalAlphaLoc, alpha);
        DrawTriangle({{0, 3}, {12, 3}, {40, 2}});
    }

    // Draws what is bound on unit 0 over the lower left width x height pixels and reads them back, the lowest
    // row first: texel by texel where the sizes agree.
    std::vector<Rgba> Texels(int width, int height) {
        glViewport(0, 0, width, height);
        DrawLit({0, 0, -1 / 0.6f}, {1, 1, 1}, 1);
        const Picture picture = Read();
        std::vector<Rgba> texels;
        for (int y = 0; y < height; ++y)
            for (int x = 0; x < width; ++x) texels.push_back(picture.Pixel(x, kHeight - 1 - y));
        return texels;
    }

    QexShaderProgram lit_;
};

TEST_F(TextureTest, ReadyMadeProgramsDraw) {
    ScopedTexture texture({255, 128, 255, 204});
    QexShaderProgram colour;
    EXPECT_EQ(QexShaderProgram_Create(&colour, 3), -1);
    ASSERT_EQ(QexShaderProgram_Create(&colour, QEX_PROGRAM_TEXTURE_COLOUR), 0);
    QexTexture_Set(&texture, 0);
    QexShaderProgram_Apply(&colour);
    glUniformMatrix4fv(colour.mvpMatrixLoc, 1, GL_FALSE, g_sMatIdentity.m);
    DrawTriangle({{0, 3}, {12, 3}, {24, 4}, {40, 2}});
    // At the pixel with x = 1/4 and y = 1/8 of the surface, the corners weigh 13/16, 1/8 and 1/16.
    const int x = kWidth / 4, y = kHeight - kHeight / 8;
    EXPECT_TRUE(Near(Read().Pixel(x, y), {207, 16, 16, 191}, 3));

    // The other record's shaders are not lost. Intensity 0.6 * 0.8 = 0.48, times light and texel.
    QexShaderProgram_Release(&colour);
    DrawLit({0, 0.6f, -0.8f}, {1, 0.5f, 0.25f}, 0.5f);
    EXPECT_TRUE(Near(Read().Pixel(x, y), {122, 31, 31, 102}, 2));
}

// Rows of three texels are no multiple of four bytes in three of the formats.
TEST_F(TextureTest, EveryFormatKeepsItsTexels) {
    uint8_t four[] = {255, 0,  0,  255, 0,   255, 0,   255, 0, 0, 255, 255,
                      136, 68, 17, 204, 255, 255, 255, 255, 0, 0, 0,   0};
    uint8_t three[] = {255, 0, 0, 0, 255, 0, 0, 0, 255, 136, 68, 17, 255, 255, 255, 0, 0, 0};
    uint16_t nibbles[] = {0xF00F, 0x0F0F, 0x00FF, 0x841C, 0xFFFF, 0x0000};
    // 17 of 31 is 140 of 255.
    uint16_t fives[] = {0xF801, 0x07C1, 0x003F, 17 << 11 | 8 << 6 | 2 << 1, 0xFFFF, 0x0000};
    const struct {
        uint32_t format;
        void* pixels;
        Rgba fourth, sixth;
    } formats[] = {{QEX_TEXFMT_RGBA8888, four, {136, 68, 17, 204}, {0, 0, 0, 0}},
                   {QEX_TEXFMT_RGB888, three, {136, 68, 17, 255}, {0, 0, 0, 255}},
                   {QEX_TEXFMT_RGBA4444, nibbles, {136, 68, 17, 204}, {0, 0, 0, 0}},
                   {QEX_TEXFMT_RGBA5551, fives, {140, 66, 16, 0}, {0, 0, 0, 0}}};
    for (const auto& f : formats) {
        glPixelStorei(GL_UNPACK_ALIGNMENT, 8);
        QexTexture t;
        QexTexture_CreateFromPixels(&t, 3, 2, f.format, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP, f.pixels);
        QexTexture_Set(&t, 0);
        const std::vector<Rgba> texels = Texels(3, 2);
        const Rgba expected[] = {{255, 0, 0, 255}, {0, 255, 0, 255},     {0, 0, 255, 255},
                                 f.fourth,         {255, 255, 255, 255}, f.sixth};
        for (size_t i = 0; i < 6; ++i)
            EXPECT_TRUE(Near(texels[i], expected[i], 1)) << f.format << " texel " << i;
        QexTexture_Release(&t);
    }
}

// At every size of the viewport another mip level is sampled.
TEST_F(TextureTest, BuiltInTexturesAreUniformAtEveryLevel) {
    for (int size = 64; size >= 1; size /= 2) {
        QexTexture_Set(nullptr, 0);
        for (const Rgba& texel : Texels(size, size)) ASSERT_EQ(texel, (Rgba{255, 255, 255, 255}));
        QexTexture_SetBlankNormalMap(0);
        for (const Rgba& texel : Texels(size, size)) ASSERT_EQ(texel, (Rgba{128, 128, 255, 255}));
    }
}

// Levels of one grey each.
pod::PvrImage Greys(uint32_t width, uint32_t height, const std::vector<uint8_t>& greys) {
    pod::PvrImage image = PvrNoise(pod::kPvrRgba8888, width, height, static_cast<uint32_t>(greys.size()), 1);
    for (size_t i = 0; i < greys.size(); ++i)
        std::fill(image.surfaces[0][i].begin(), image.surfaces[0][i].end(), greys[i]);
    return image;
}

TEST_F(TextureTest, MipmapsThatAFileLacksAreMade) {
    Bytes pvr = pod::WritePvr(Greys(8, 8, {90}));
    PutWord(&pvr, 12, 3);  // its count of mipmaps
    Ktx ktx;
    ktx.width = ktx.height = 8;
    ktx.levels = {{Bytes(256, 90)}};
    for (const Bytes& file : {pvr, ktx.File()}) {
        QexTexture texture = {};
        ASSERT_EQ(QexTexture_LoadPVRFromMem(&texture, file.data(), nullptr, 1, 0, nullptr), 0);
        // Drawn on one pixel, level 3 is asked for.
        EXPECT_EQ(Texels(1, 1)[0], (Rgba{90, 90, 90, 90}));
        QexTexture_Release(&texture);
    }
}

TEST_F(TextureTest, WithoutOddMipmapsTheFirstLevelIsDrawn) {
    const Bytes file = pod::WritePvr(Greys(6, 2, {90, 200, 250}));
    for (const bool poor : {false, true}) {
        gltapReset();
        if (poor) gltapHideExtension("GL_OES_texture_npot");
        QexTexture texture = {};
        Capture out(STDOUT_FILENO);
        EXPECT_EQ(QexTexture_LoadPVRFromMem(&texture, file.data(), nullptr, 1, 0, nullptr), 0);
        const std::string printed = out.Text();
        EXPECT_EQ(gltapCount("glTexImage2D"), poor ? 1u : 3u);
        EXPECT_EQ(printed.find("no mipmaps of 6 x 2 pixels here") != std::string::npos, poor) << printed;
        EXPECT_EQ(Texels(1, 1)[0], poor ? (Rgba{90, 90, 90, 90}) : (Rgba{250, 250, 250, 250}));
        QexTexture_Release(&texture);
    }
}

}  // namespace
