// Every shader of the engine passes a strict compiler, not only the driver at hand.
#include <GLES2/gl2.h>

#include <cstdlib>
#include <fstream>
#include <map>

#include "RenderFixture.h"
#include "support/Capture.h"

namespace {

// Starts and ends everything that compiles shaders.
void UseEverything() {
    QexRuntimeContext runtime;
    QexEngineConfig config = SurfaceConfig();
    QexEngine_Init(&runtime, sizeof config, &config);
    QexModel_CreateDefaultShader();
    for (uint32_t kind = 0; kind < 32; ++kind)
        QexShaders_ReleaseShaderProgram(QexShaders_CreateShaderProgram(kind), kind);
    for (const uint32_t type : {QEX_PROGRAM_TEXTURE_COLOUR, QEX_PROGRAM_TEXTURE_LIGHT}) {
        QexShaderProgram program;
        QexShaderProgram_Create(&program, type);
        QexShaderProgram_Release(&program);
    }
    QexEngine_Shutdown(&runtime);
}

TEST(GlslTest, EverySourceIsStrictGlslEs100) {
    if (std::system("glslangValidator --version > /dev/null") != 0)
        GTEST_SKIP() << "glslangValidator is not installed";
    gltapSetMode(GLTAP_NULL);
    gltapReset();
    Capture quiet(STDERR_FILENO);
    const GLCalls calls(UseEverything);
    gltapSetMode(GLTAP_FORWARD);

    std::map<int64_t, int64_t> types;
    for (const gltapCall* call : calls.Of({"glCreateShader"})) types[call->result.i] = call->argument[0].i;
    const auto sources = calls.Of({"glShaderSource"});
    EXPECT_GE(sources.size(), 20u);
    for (const gltapCall* call : sources) {
        const bool vertex = types[call->argument[0].i] == GL_VERTEX_SHADER;
        const std::string path = OutputPath(vertex ? "source.vert" : "source.frag");
        const std::string text = static_cast<const char*>(call->data);
        std::ofstream(path) << (text.compare(0, 8, "#version") == 0 ? "" : "#version 100\n") << text;
        const std::string command = "glslangValidator '" + path + "' > '" + path + ".log'";
        EXPECT_EQ(std::system((command + " && ! grep WARNING '" + path + ".log'").c_str()), 0)
            << std::ifstream(path + ".log").rdbuf() << text;
    }
}

}  // namespace
