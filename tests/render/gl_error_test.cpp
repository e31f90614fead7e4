// A GL error ends the process with its place in the log.
#include <GLES2/gl2.h>

#include "Scenes.h"

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
            ":[0-9]+\n";
        EXPECT_EXIT((gltapInjectError(c.function, c.nth, GL_INVALID_OPERATION), c.action()),
                    testing::ExitedWithCode(255), testing::MatchesRegex(expected))
            << c.function;
    }
    QexTextureNoAlphaShader_Release(&noAlpha);
}

}  // namespace
