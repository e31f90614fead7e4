// A GL error ends the process with its place in the log.
#include <GLES2/gl2.h>
#include <unistd.h>

#include <climits>

#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

class GLErrorDeathTest : public NullRenderTest {};

TEST_F(GLErrorDeathTest, NamesTheModuleAndEndsTheProcess) {
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8))));
    QexShaderModule* noAlpha = QexTextureNoAlphaShader_CreateProgram();
    uint32_t shader = 0;
    const auto drawAll = [&] { model.Draw(); };
    const struct {
        const char* function;
        uint32_t nth;
        const char* module;
        std::function<void()> action;
    } cases[] = {
        {"glUniform1f", 1, "Shaders/QexTextureShader", drawAll},
        {"glUniformMatrix4fv", 1, "Shaders/QexTextureShader", drawAll},
        {"glDisableVertexAttribArray", 2, "Shaders/QexTextureShader", drawAll},
        {"glDrawElements", 1, "Shaders/QexTextureNoAlphaShader", [&] { model.DrawNode(noAlpha); }},
        {"glUseProgram", 1, "QexRuntimeContext", drawAll},
        {"glBufferData", 2, "QexModel", [&] { QexModel_DownloadGeometry(&model.model); }},
        {"glDeleteBuffers", 1, "QexModel", [&] { QexModel_UnloadGeometry(&model.model); }},
        {"glTexImage2D", 1, "QexTexture", [] { SolidTexture({}); }},
        {"glCompileShader", 1, "QexShader", [&] { QexShader_Create(&shader, "", GL_VERTEX_SHADER); }},
        // glCreateShader itself is not checked; the next check finds its error.
        {"glCreateShader", 1, "QexShader", [&] { QexShader_Create(&shader, "", GL_VERTEX_SHADER); }},
        {"glEnableVertexAttribArray", 3, "QexFont", [&] { QexFont_DrawNum(&runtime_, 0, 32, 1, ~0u); }},
    };
    for (const auto& c : cases) {
        const std::string expected =
            std::string("E/QexEngine: glGetError\\(\\) = 1282 \\(0x00000502\\) at src/") + c.module +
            ":[0-9]+\nE/QexEngine: in [A-Za-z]+/[A-Za-z]+\\.cpp, line [0-9]+\n";
        EXPECT_EXIT((gltapInjectError(c.function, c.nth, GL_INVALID_OPERATION), c.action()),
                    testing::ExitedWithCode(255), testing::MatchesRegex(expected))
            << c.function;
    }
    QexTextureNoAlphaShader_Release(&noAlpha);
}

std::string Sequence(const std::function<void()>& code, std::initializer_list<std::string> only = {}) {
    return GLCalls(code).Sequence(only);
}

class UncheckedCalls : public NullRenderTest {};

// Where an error is not worth its reading, or is the next check's to find.
TEST_F(UncheckedCalls, ReadNoError) {
    QexRenderTarget target;
    QexRenderTarget_Create(&target, 8, 8, 0);
    EXPECT_EQ(Sequence([&] { QexRenderTarget_BeginScene(&target); }),
              "GetIntegerv ! GetIntegerv BindFramebuffer Viewport ");
    EXPECT_EQ(Sequence([&] { QexRenderTarget_EndScene(&target); }), "BindFramebuffer ! Viewport ");
    EXPECT_EQ(Sequence([&] { QexRenderTarget_SetRenderTarget(&runtime_, nullptr); }),
              "BindFramebuffer ! Viewport ! ");
    EXPECT_EQ(Sequence([&] { QexRenderTarget_Release(&target); }),
              "DeleteTextures DeleteRenderbuffers DeleteFramebuffers ");
    QexBillboard* billboard = nullptr;
    const auto lookUps = [](const std::function<void()>& code) {
        return Sequence(code, {"glGetAttribLocation", "glGetUniformLocation"}).find('!');
    };
    EXPECT_EQ(lookUps([&] { billboard = QexBillboard_Create(nullptr); }), std::string::npos);
    QexRenderState_UseProgram(0);
    EXPECT_EQ(Sequence([&] { QexBillboard_Release(billboard); }), "DeleteProgram DeleteShader DeleteShader ");
    QexParticleSet set;
    EXPECT_EQ(lookUps([&] { QexParticleSet_Create(&set, nullptr, nullptr, 1, 1, 1); }), std::string::npos);
    QexParticleSet_Release(&set);
    QexShaderModule* module = nullptr;
    EXPECT_EQ(lookUps([&] { module = QexGouraudShader_CreateProgram(); }), std::string::npos);
    QexGouraudShader_Release(&module);
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8))));
    const QexMatrix m = PixelProjection();
    EXPECT_EQ(
        Sequence([&] { QexModel_RenderReflectionPlaneStencil(&model.model, 9, nullptr, nullptr, &m, &m); }),
        "Enable ColorMask Disable StencilFunc StencilOp ColorMask Enable StencilFunc StencilOp ");
    EXPECT_EQ(Sequence([&] { QexModel_RenderFromShadowCamera(nullptr, nullptr); }), "BindBuffer BindBuffer ");
}

// Sizes that the GL cannot draw into.
TEST_F(UncheckedCalls, ImpossibleSizesAreRefused) {
    Capture log(STDERR_FILENO);
    QexRenderTarget target;
    for (const int size : {0, -1, INT_MAX}) {
        EXPECT_EQ(
            Sequence([&] { EXPECT_EQ(QexRenderTarget_Create(&target, 8, size, 0), -1); }, {"glGenTextures"}),
            "");
        EXPECT_EQ(target.framebuffer + target.created, 0u);
    }
    EXPECT_NE(log.Text().find("<QexRenderTarget_Create> 8 x 0 pixels; this GL takes 1 to "),
              std::string::npos);
    QexRuntimeContext odd = {};
    odd.width = -5;
    odd.height = -1;
    for (uint32_t mode = 0; mode < 4; ++mode) {
        QexRenderer_EnableStereo3D(&odd, mode, 3);
        const GLCalls calls([&] {
            QexRenderer_PrepareLeft(&odd);
            QexRenderer_PrepareRight(&odd);
            QexRenderer_FinishStereo3D(&odd);
        });
        for (const gltapCall* call : calls.Of({"glViewport"})) {
            EXPECT_EQ(call->argument[2].i, 0);
            EXPECT_EQ(call->argument[3].i, 0);
        }
    }
    // The size that shadow maps have stays.
    QexModel_SetShadowMapSize(64, 32);
    QexModel_SetShadowMapSize(0, 8);
    QexModel_SetShadowMapSize(8, -1);
    const GLCalls made([] { QexModel_CreateDefaultShader(); });
    const auto storage = made.Of({"glRenderbufferStorage"});
    ASSERT_EQ(storage.size(), 1u);
    EXPECT_EQ(storage[0]->argument[2].i, 64);
    EXPECT_EQ(storage[0]->argument[3].i, 32);
    QexModel_ReleaseShader(0);
    QexModel_SetShadowMapSize(512, 512);
    QexTexture cube = {};
    for (const int size : {0, -1, INT_MAX})
        EXPECT_EQ(QexTexture_GenerateNormalisationCubeMap(&cube, size), -1);
    EXPECT_EQ(cube.glName, 0u);
}

}  // namespace
