#include <GLES2/gl2.h>

#include <cstring>
#include <fstream>

#include "support/Capture.h"
#include "support/RenderFixture.h"

namespace {

class ShaderTest : public RenderTest {};

const char* const kVertex = "attribute highp vec4 p; void main() { gl_Position = p; }";
const char* const kFragment = "void main() { gl_FragColor = vec4(1.0); }";

TEST_F(ShaderTest, DefinesGoInFront) {
    const char* const defines[] = {"A", "B 2"};
    const std::string lines[] = {"", "#define A\n", "#define A\n#define B 2\n"};
    const std::string path = OutputPath("shader.fsh");
    std::ofstream(path) << kFragment;
    uint32_t shader;
    for (uint32_t i = 0; i < 6; ++i) {
        const bool file = i % 2;
        const GLCalls calls([&] {
            const auto create = file ? QexShader_CreateFromFileEx : QexShader_CreateFromMemEx;
            EXPECT_EQ(create(&shader, file ? path.c_str() : kFragment, GL_FRAGMENT_SHADER, defines, i / 2),
                      0);
        });
        const auto sources = calls.Of({"glShaderSource"});
        ASSERT_EQ(sources.size(), 1u);
        EXPECT_EQ(static_cast<const char*>(sources[0]->data), lines[i / 2] + kFragment);
        glDeleteShader(shader);
    }
    Capture out(STDOUT_FILENO), log(STDERR_FILENO);
    EXPECT_EQ(QexShader_CreateFromFileEx(&shader, "none.fsh", GL_FRAGMENT_SHADER, nullptr, 0), -1);
    EXPECT_EQ(out.Text(), "ERROR:<QexShader_CreateFromFileEx> Read file none.fsh failed!\n");
    // Lines, text and the closing zero fill 4096 bytes and no more.
    for (const size_t length : {size_t{4095}, size_t{4096}, size_t{5000}}) {
        const std::string tail(kFragment), source = std::string(length - 10 - tail.size(), ' ') + tail;
        Capture limit(STDERR_FILENO);
        EXPECT_EQ(QexShader_CreateFromMemEx(&shader, source.c_str(), GL_FRAGMENT_SHADER, defines, 1),
                  length < 4096 ? 0 : -1);
        EXPECT_EQ(limit.Text().find("exceed 4096 bytes") != std::string::npos, length >= 4096);
        glDeleteShader(shader);
    }
}

TEST_F(ShaderTest, CompileAndLinkFailures) {
    uint32_t bad, vertex, fragment, unlinkable, program;
    Capture log(STDERR_FILENO);
    EXPECT_EQ(QexShader_Create(&bad, "void main() { nonsense }", GL_VERTEX_SHADER), -1);
    EXPECT_EQ(log.Text(), "");
    ASSERT_EQ(QexShader_Create(&vertex, kVertex, GL_VERTEX_SHADER), 0);
    ASSERT_EQ(QexShader_Create(&fragment, kFragment, GL_FRAGMENT_SHADER), 0);
    // Inputs that the vertex shader never writes, with names long enough to overflow any log buffer.
    std::string source = "precision mediump float;\n", sum = "vec4(0.0)";
    for (int i = 0; i < 8; ++i) {
        const std::string name = "missing" + std::to_string(i) + std::string(100, 'x');
        source += "varying vec4 " + name + ";\n";
        sum += " + " + name;
    }
    source += "void main() { gl_FragColor = " + sum + "; }";
    ASSERT_EQ(QexShader_Create(&unlinkable, source.c_str(), GL_FRAGMENT_SHADER), 0);

    std::string buffer(QEX_SHADER_LOG_SIZE + 16, 'z');
    const char* const names[] = {"p"};
    EXPECT_EQ(QexShader_CreateProgram(&program, vertex, unlinkable, names, 1, buffer.data()), -1);
    EXPECT_GT(std::strlen(buffer.c_str()), 10u);
    EXPECT_LT(std::strlen(buffer.c_str()), size_t{QEX_SHADER_LOG_SIZE});
    EXPECT_EQ(buffer.substr(QEX_SHADER_LOG_SIZE), std::string(16, 'z'));
    glDeleteProgram(program);

    EXPECT_EQ(QexShader_CreateProgram(&program, vertex, fragment, names, 1, buffer.data()), 0);
    EXPECT_EQ(buffer[0], 0);
    EXPECT_EQ(g_QexCachedRenderStates.currentProgram, program);
    EXPECT_EQ(glGetAttribLocation(program, "p"), 0);
    QexRenderState_UseProgram(0);
    glDeleteProgram(program);
    for (const uint32_t shader : {bad, vertex, fragment, unlinkable}) glDeleteShader(shader);
}

}  // namespace
