// Textures on the screen, and pictures drawn into textures.
#include <GLES2/gl2.h>

#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

class QuadTest : public RenderTest {};

// Rows of a texture's data count from below, so the last row is the upper one.
TEST_F(QuadTest, ColourAndAlphaOfThePixels) {
    const uint8_t rows[] = {255, 0, 0, 255, 255, 0, 0, 255, 0, 255, 0, 255, 0, 255, 0, 255};
    ScopedTexture texture(2, 2, rows), half({128, 0, 0, 255});
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
    Clear(0, 0, 1, 1);
    QexTexture_Draw(&runtime_, &texture, 20, 10, nullptr, 10, 10, 0xFFFFFFFF);
    QexTexture_Draw2(&runtime_, &texture, &half, 60, 10, nullptr, 10, 10, 0x80FF80FF);
    const GLCalls calls([&] { QexTexture_Draw(&runtime_, nullptr, 100, 10, nullptr, 8, 8, 0xFF102030); });
    EXPECT_EQ(calls.Text({"glEnable", "glDisable", "glDepthFunc", "glBlendFuncSeparate"}), "");
    const Picture picture = Read();
    EXPECT_EQ(picture.Pixel(30, 12), (Rgba{0, 255, 0, 255}));
    EXPECT_EQ(picture.Pixel(30, 38), (Rgba{255, 0, 0, 255}));
    EXPECT_EQ(picture.Pixel(30, 41), (Rgba{0, 0, 255, 255})) << "below";
    // Drawn one texel larger than it is: from 20 to 50.
    EXPECT_EQ(picture.Pixel(49, 12), (Rgba{0, 255, 0, 255}));
    for (const int x : {19, 50}) EXPECT_EQ(picture.Pixel(x, 12), (Rgba{0, 0, 255, 255})) << "beside";
    // Half alpha of half: a quarter of the texel in the colour, over blue.
    EXPECT_TRUE(Near(picture.Pixel(75, 12), {0, 32, 191, 207}, 2));
    EXPECT_EQ(picture.Pixel(104, 14), (Rgba{0x10, 0x20, 0x30, 255}));
}

TEST_F(QuadTest, TheFontIsMadeWhenItIsMissing) {
    QexFont_Release();
    QexFont_CreateShader();  // alone is no font
    ScopedTexture texture({1, 2, 3, 255});
    Capture log(STDERR_FILENO);
    EXPECT_EQ(QexTexture_Draw2(&runtime_, &texture, nullptr, 0, 0, nullptr, 8, 8, 0xFFFFFFFF), 0);
    EXPECT_EQ(QexTexture_Draw(&runtime_, &texture, 0, 0, nullptr, 8, 8, 0xFFFFFFFF), 0);
    const std::string text = log.Text();
    EXPECT_NE(text.find("<QexTexture_Draw2> Call texture draw before font created!"), std::string::npos);
    EXPECT_EQ(text.find("<QexTexture_Draw> Call"), std::string::npos) << "it is there by then";
    EXPECT_EQ(Read().Pixel(3, 3), (Rgba{1, 2, 3, 255}));
}

TEST_F(QuadTest, TargetsNestAndComeBack) {
    const std::string before = LiveObjects();
    QexRenderTarget outer, inner;
    QexTexture_Set(nullptr, 0);
    glScissor(0, 0, kWidth, kHeight);
    EXPECT_EQ(StateChange([&] {
                  QexRenderTarget_Create(&outer, 64, 32, 0);
                  QexTexture_Set(nullptr, 0);
                  glBindRenderbuffer(GL_RENDERBUFFER, 0);
              }),
              "");
    glBindFramebuffer(GL_FRAMEBUFFER, outer.framebuffer);
    QexRenderTarget_Create(&inner, 16, 16, 0);
    gltapState state;
    gltapGetState(&state);
    EXPECT_EQ(state.framebuffer, outer.framebuffer) << "creating leaves it bound";
    EXPECT_EQ(glCheckFramebufferStatus(GL_FRAMEBUFFER), GLenum(GL_FRAMEBUFFER_COMPLETE));
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    EXPECT_EQ(inner.colorTexture.format, uint32_t{GL_RGBA});
    EXPECT_EQ(inner.colorTexture.flags, 1u);
    glDisable(GL_SCISSOR_TEST);
    glViewport(3, 4, 50, 60);
    EXPECT_EQ(StateChange([&] {
                  QexRenderTarget_BeginScene(&outer);
                  Clear(1, 0, 0, 1);
                  QexRenderTarget_BeginScene(&inner);
                  Clear(0, 1, 0, 1);
                  QexRenderTarget_EndScene(&inner);
                  // The upper half of the outer one.
                  glEnable(GL_SCISSOR_TEST);
                  glScissor(0, 16, 64, 16);
                  Clear(0, 0, 1, 1);
                  glDisable(GL_SCISSOR_TEST);
                  glScissor(0, 0, kWidth, kHeight);
                  QexRenderTarget_EndScene(&outer);
                  Clear();
              }),
              "");
    glViewport(0, 0, kWidth, kHeight);
    QexTexture_Draw(&runtime_, &outer.colorTexture, 10, 10, nullptr, 1, 1, 0xFFFFFFFF);
    QexTexture_Draw(&runtime_, &inner.colorTexture, 100, 10, nullptr, 1, 1, 0xFFFFFFFF);
    const Picture picture = Read();
    EXPECT_EQ(picture.Pixel(20, 14), (Rgba{0, 0, 255, 255})) << "the upper half is above";
    EXPECT_EQ(picture.Pixel(20, 38), (Rgba{255, 0, 0, 255}));
    EXPECT_EQ(picture.Pixel(108, 18), (Rgba{0, 255, 0, 255}));

    QexRenderTarget_SetRenderTarget(&runtime_, &inner);
    gltapGetState(&state);
    EXPECT_EQ(state.framebuffer, inner.framebuffer);
    EXPECT_EQ(state.viewport[2], 16);
    QexRenderTarget_SetRenderTarget(&runtime_, nullptr);
    gltapGetState(&state);
    EXPECT_EQ(state.framebuffer, 0u);
    EXPECT_EQ(glm::make_vec2(state.viewport + 2), glm::ivec2(kWidth, kHeight));
    EXPECT_EQ(QexRenderTarget_CreateFromTexture(nullptr, nullptr), 0);
    for (int twice = 0; twice < 2; ++twice)
        for (QexRenderTarget* target : {&outer, &inner, static_cast<QexRenderTarget*>(nullptr)})
            QexRenderTarget_Release(target);
    EXPECT_EQ(LiveObjects(), before);
}

}  // namespace
