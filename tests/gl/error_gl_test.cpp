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
        {"glDrawElements", 1, "Shaders/QexTextureNoAlphaShader", [&] { model.DrawNode(noAlpha); }},
        {"glUseProgram", 1, "QexRuntimeContext", drawAll},
        {"glBufferData", 2, "QexModel", [&] { QexModel_DownloadGeometry(&model.model); }},
        {"glTexImage2D", 1, "QexTexture", [] { SolidTexture({}); }},
        // glCreateShader itself is not checked; the next check finds its error.
        {"glCreateShader", 1, "QexShader", [&] { QexShader_Create(&shader, "", GL_VERTEX_SHADER); }},
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

class UncheckedCalls : public NullRenderTest {};

// Where an error is not worth its reading, or is the next check's to find.
TEST_F(UncheckedCalls, ReadNoError) {
    QexRenderTarget target;
    QexRenderTarget_Create(&target, 8, 8, 0);
    QexBillboard* billboard = nullptr;
    QexParticleSet set;
    QexShaderModule* module = nullptr;
    const std::function<void()> creations[] = {
        [&] { billboard = QexBillboard_Create(nullptr); },
        [&] { QexParticleSet_Create(&set, nullptr, nullptr, 1, 1, 1); },
        [&] { module = QexGouraudShader_CreateProgram(); }};
    for (const auto& create : creations) {
        const GLCalls calls(create);
        std::string before;
        for (const gltapCall* call : calls.Of({"glGetAttribLocation", "glGetUniformLocation", "glUniform1i",
                                               "glUniform1f", "glUseProgram", "glGetError"})) {
            const std::string name = gltapFunctionName(call->function);
            EXPECT_FALSE(name == "glGetError" && before.find("Location") != std::string::npos);
            before = name;
        }
    }
    QexRenderState_UseProgram(0);
    const auto reads = [](const std::function<void()>& code) {
        const GLCalls calls(code);
        return calls.Of({"glGetError"}).size();
    };
    EXPECT_EQ(reads([&] { QexRenderTarget_BeginScene(&target); }), 1u);
    EXPECT_EQ(reads([&] { QexRenderTarget_EndScene(&target); }), 1u);
    EXPECT_EQ(reads([&] { QexRenderTarget_SetRenderTarget(&runtime_, nullptr); }), 2u);
    EXPECT_EQ(reads([&] { QexRenderTarget_Release(&target), QexBillboard_Release(billboard); }), 0u);
    EXPECT_EQ(reads([] { QexModel_RenderFromShadowCamera(nullptr, nullptr); }), 0u);
    QexParticleSet_Release(&set);
    QexGouraudShader_Release(&module);
}

// Sizes that the GL cannot draw into.
TEST_F(UncheckedCalls, ImpossibleSizesAreRefused) {
    Capture log(STDERR_FILENO);
    QexRenderTarget target;
    for (const int size : {0, -1, INT_MAX}) {
        const GLCalls calls([&] { EXPECT_EQ(QexRenderTarget_Create(&target, 8, size, 0), -1); });
        EXPECT_EQ(calls.Text({"glGenTextures"}), "");
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
        for (const gltapCall* call : calls.Of({"glViewport"}))
            EXPECT_EQ(call->argument[2].i + call->argument[3].i, 0) << mode;
    }
    // The size that shadow maps have stays.
    QexModel_SetShadowMapSize(64, 32);
    QexModel_SetShadowMapSize(0, 8);
    QexModel_SetShadowMapSize(8, -1);
    const GLCalls made([] { QexModel_CreateDefaultShader(); });
    EXPECT_EQ(made.Text({"glRenderbufferStorage"}),
              "glRenderbufferStorage(GL_RENDERBUFFER, GL_DEPTH_COMPONENT16, 64, 32)\n");
    QexModel_ReleaseShader(0);
    QexModel_SetShadowMapSize(512, 512);
    QexTexture cube = {};
    for (const int size : {0, -1, INT_MAX})
        EXPECT_EQ(QexTexture_GenerateNormalisationCubeMap(&cube, size), -1);
    EXPECT_EQ(cube.glName, 0u);
}

}  // namespace
