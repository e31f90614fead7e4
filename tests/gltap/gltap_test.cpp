#include "gltap.h"

#include <dlfcn.h>
#define GL_GLEXT_PROTOTYPES
#include <GLES2/gl2.h>
#include <GLES2/gl2ext.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <functional>
#include <memory>
#include <set>
#include <sstream>

#include "Headless.h"
#include "support/FolderTest.h"

namespace {

using Recording = std::unique_ptr<gltapRecording, decltype(&gltapReleaseRecording)>;

Recording Record(const std::function<void()>& calls) {
    gltapBeginRecording();
    calls();
    return Recording(gltapEndRecording(), gltapReleaseRecording);
}

struct GLTap : testing::Test {
    GLTap() {
        gltapReset();
        gltapSetMode(GLTAP_FORWARD);
    }
    ~GLTap() override { gltapReset(); }
};

TEST_F(GLTap, ExportsEveryFunctionOfTheHeader) {
    std::istringstream header(ReadText(GLES2_HEADER));
    const std::string before = "GL_APIENTRY ";
    std::set<std::string> declared;
    for (std::string line; std::getline(header, line);) {
        const size_t name = line.find(before) + before.size();
        if (line.rfind("GL_APICALL", 0) == 0 && name >= before.size())
            declared.insert(line.substr(name, line.find_first_of(" (", name) - name));
    }
    EXPECT_EQ(142u, declared.size());
    EXPECT_EQ(static_cast<int>(declared.size()) + 4, gltapFunctionCount()) << "with vertex array objects";

    for (const std::string& name : declared) {
        Dl_info info = {};
        EXPECT_GE(gltapFunctionNumber(name.c_str()), 0) << name;
        ASSERT_NE(dladdr(dlsym(RTLD_DEFAULT, name.c_str()), &info), 0) << name;
        EXPECT_TRUE(Contains(info.dli_fname, "libgltap")) << name;
    }
    EXPECT_EQ(-1, gltapFunctionNumber("glNoSuchFunction"));
}

void SetUnusualState() {
    glActiveTexture(GL_TEXTURE3);
    glEnable(GL_BLEND);
    glEnable(GL_POLYGON_OFFSET_FILL);
    glDisable(GL_DITHER);
    glBlendFuncSeparate(GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA, GL_ONE, GL_DST_COLOR);
    glBlendEquationSeparate(GL_FUNC_SUBTRACT, GL_FUNC_ADD);
    glColorMask(GL_TRUE, GL_FALSE, GL_TRUE, GL_FALSE);
    glCullFace(GL_FRONT);
    glFrontFace(GL_CW);
    glDepthMask(GL_FALSE);
    glDepthFunc(GL_GEQUAL);
    glStencilFuncSeparate(GL_BACK, GL_NOTEQUAL, 3, 0x0f);
    glStencilOpSeparate(GL_FRONT, GL_INCR, GL_DECR, GL_REPLACE);
    glStencilMaskSeparate(GL_BACK, 0x70);
    glViewport(1, 2, 3, 4);
    glScissor(4, 3, 2, 1);
    glClearStencil(7);
    glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
    glPixelStorei(GL_PACK_ALIGNMENT, 2);
}

void ExpectDriverAgrees(GLenum query) {
    GLint driver[4] = {}, followed[4] = {};
    glGetIntegerv(query, driver);
    gltapSetMode(GLTAP_NULL);
    glGetIntegerv(query, followed);
    gltapSetMode(GLTAP_FORWARD);
    for (int i = 0; i < 4; ++i) EXPECT_EQ(driver[i], followed[i]) << std::hex << query << " " << i;
}

// The driver is the judge: what the tap followed has to be what the driver answers.
TEST_F(GLTap, FollowsTheStateThatTheDriverHas) {
    std::string error;
    const auto context = qex::HeadlessContext::Create(5, 3, &error);
    ASSERT_TRUE(context) << error;
    SetUnusualState();
    // To bind a name makes the object.
    const GLuint buffer = 7;
    glBindTexture(GL_TEXTURE_2D, 5);
    GLuint arrays[2];
    glGenVertexArraysOES(2, arrays);
    glBindVertexArrayOES(arrays[0]);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 9);
    glBindVertexArrayOES(arrays[1]);
    ExpectDriverAgrees(GL_ELEMENT_ARRAY_BUFFER_BINDING);
    glBindVertexArrayOES(arrays[0]);
    ExpectDriverAgrees(GL_ELEMENT_ARRAY_BUFFER_BINDING);
    ExpectDriverAgrees(GL_VERTEX_ARRAY_BINDING_OES);
    glDeleteVertexArraysOES(2, arrays);
    ExpectDriverAgrees(GL_VERTEX_ARRAY_BINDING_OES);
    glBindBuffer(GL_ARRAY_BUFFER, buffer);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 8);
    glBindRenderbuffer(GL_RENDERBUFFER, 6);
    glDeleteBuffers(1, &buffer);

    // clang-format off
    for (const GLenum query : {
        GL_ACTIVE_TEXTURE, GL_TEXTURE_BINDING_2D, GL_TEXTURE_BINDING_CUBE_MAP, GL_ARRAY_BUFFER_BINDING,
        GL_ELEMENT_ARRAY_BUFFER_BINDING, GL_FRAMEBUFFER_BINDING, GL_RENDERBUFFER_BINDING,
        GL_CURRENT_PROGRAM, GL_BLEND, GL_CULL_FACE, GL_DEPTH_TEST, GL_DITHER, GL_POLYGON_OFFSET_FILL,
        GL_SCISSOR_TEST, GL_STENCIL_TEST, GL_SAMPLE_COVERAGE, GL_SAMPLE_ALPHA_TO_COVERAGE, GL_BLEND_SRC_RGB,
        GL_BLEND_SRC_ALPHA, GL_BLEND_DST_RGB, GL_BLEND_DST_ALPHA, GL_BLEND_EQUATION_RGB,
        GL_BLEND_EQUATION_ALPHA, GL_COLOR_WRITEMASK, GL_CULL_FACE_MODE, GL_FRONT_FACE, GL_DEPTH_WRITEMASK,
        GL_DEPTH_FUNC, GL_STENCIL_FUNC, GL_STENCIL_BACK_FUNC, GL_STENCIL_REF, GL_STENCIL_BACK_REF,
        GL_STENCIL_BACK_VALUE_MASK, GL_STENCIL_FAIL, GL_STENCIL_PASS_DEPTH_FAIL, GL_STENCIL_PASS_DEPTH_PASS,
        GL_STENCIL_BACK_FAIL, GL_STENCIL_BACK_WRITEMASK, GL_VIEWPORT, GL_SCISSOR_BOX,
        GL_STENCIL_CLEAR_VALUE, GL_PACK_ALIGNMENT, GL_UNPACK_ALIGNMENT})
        ExpectDriverAgrees(query);
    // clang-format on
    // Last, since the driver clamps the stencil reference to the bits of the bound framebuffer.
    glBindFramebuffer(GL_FRAMEBUFFER, 9);
    ExpectDriverAgrees(GL_FRAMEBUFFER_BINDING);
    EXPECT_EQ(GLenum(GL_NO_ERROR), glGetError());
}

TEST_F(GLTap, RecordsCopiesThatReplayIdentically) {
    gltapSetMode(GLTAP_NULL);
    GLfloat matrix[16] = {1, 2.5f, -3};
    GLubyte image[2 * 2 * 3] = {10, 20, 30};
    GLushort indices[3] = {0, 1, 2};
    const GLchar* sources[] = {"void ma", "in() {}//"};
    const GLint lengths[] = {-1, 7};
    const Recording first = Record([&] {
        glUniformMatrix4fv(3, 1, GL_FALSE, matrix);
        glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
        glTexImage2D(GL_TEXTURE_2D, 0, GL_RGB, 2, 2, 0, GL_RGB, GL_UNSIGNED_BYTE, image);
        glTexImage2D(GL_TEXTURE_2D, 0, GL_RGB, 2, 2, 0, GL_RGB, GL_UNSIGNED_BYTE, nullptr);
        glBufferData(GL_ARRAY_BUFFER, sizeof(image), image, GL_STATIC_DRAW);
        glDrawElements(GL_TRIANGLES, 3, GL_UNSIGNED_SHORT, indices);
        glShaderSource(8, 2, sources, lengths);
        glGetUniformLocation(8, "color");
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    });
    matrix[1] = 0;
    image[1] = 0;
    indices[2] = 0;
    const char* expected[] = {
        "glUniformMatrix4fv(3, 1, GL_FALSE, {1, 2.5, -3, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0})",
        "glPixelStorei(GL_UNPACK_ALIGNMENT, 1)",
        "glTexImage2D(GL_TEXTURE_2D, 0, GL_RGB, 2, 2, 0, GL_RGB, GL_UNSIGNED_BYTE, <12 bytes>)",
        "glTexImage2D(GL_TEXTURE_2D, 0, GL_RGB, 2, 2, 0, GL_RGB, GL_UNSIGNED_BYTE, NULL)",
        "glBufferData(GL_ARRAY_BUFFER, 12, <12 bytes>, GL_STATIC_DRAW)",
        "glDrawElements(GL_TRIANGLES, 3, GL_UNSIGNED_SHORT, <6 bytes>)",
        "glShaderSource(8, 1, \"void main() {}\", NULL)",
        "glGetUniformLocation(8, \"color\") = 0",
        "glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT)",
    };
    ASSERT_EQ(std::size(expected), gltapRecordingSize(first.get()));
    for (size_t i = 0; i < std::size(expected); ++i) {
        const gltapCall* call = gltapRecordingCall(first.get(), i);
        char text[200];
        gltapDescribeCall(call, text, sizeof text);
        EXPECT_STREQ(expected[i], text);
    }
    EXPECT_EQ(20, static_cast<const GLubyte*>(gltapRecordingCall(first.get(), 2)->argument[8].p)[1]);
    EXPECT_EQ(nullptr, gltapRecordingCall(first.get(), std::size(expected)));

    char difference[200];
    const Recording second = Record([&] { gltapReplay(first.get()); });
    EXPECT_TRUE(gltapSameRecording(first.get(), second.get(), difference, sizeof(difference))) << difference;
    matrix[1] = 9;
    const Recording other = Record([&] { glUniform4fv(0, 1, matrix); });
    EXPECT_FALSE(gltapSameRecording(other.get(), first.get(), difference, sizeof(difference)));
    EXPECT_TRUE(Contains(difference, "call 0: glUniform4fv(0, 1, {1, 9, -3, 0}) | glUniformMatrix4fv(3, 1,"))
        << difference;
}

using GLTapPreload = FolderTest;

// What the client wrote under the preloaded tap; it ends with status 0.
std::string RunClient(const std::string& environment, const std::string& arguments) {
    // A sanitizer's runtime wants to be loaded before a preloaded library and refuses to start otherwise.
    const std::string command =
        "ASAN_OPTIONS=verify_asan_link_order=0:detect_leaks=0 LD_PRELOAD=" GLTAP_LIBRARY " " + environment +
        " " GLTAP_CLIENT " " + arguments + " 2>&1";
    std::FILE* pipe = popen(command.c_str(), "r");
    std::string output;
    for (int c; pipe && (c = std::fgetc(pipe)) != EOF;) output += static_cast<char>(c);
    EXPECT_TRUE(pipe && pclose(pipe) == 0);
    return output;
}

TEST_F(GLTapPreload, ForwardsLogsCountsAndInjects) {
    EXPECT_EQ("error 0000\nerror 0502\nerror 0000\npixel 0 255 0 255\n",
              RunClient("GLTAP_LOG=" + Path("log") + " GLTAP_COUNTS=" + Path("counts") +
                            " GLTAP_FAIL=glClear:2:0x502",
                        ""));
    const std::string lines = ReadText(Path("log")) + ReadText(Path("counts"));
    for (const char* part :
         {"\nglClearColor(0, 1, 0, 1)\nglClear(GL_COLOR_BUFFER_BIT)\nglGetError() = GL_NO_ERROR\n",
          "glClear: not carried out, injected GL_INVALID_OPERATION\n", " 2 glClear\n",
          "live objects:\ntextures: 1 ("})
        EXPECT_TRUE(Contains(lines, part)) << lines;
}

TEST_F(GLTapPreload, NullModeAndBadVariables) {
    const std::string output =
        RunClient("GLTAP_MODE=null GLTAP_FAIL=glClear:one:2 GLTAP_LOG=/no/such/folder/log", "--no-context");
    for (const char* part : {"pixel 0 0 0 0\n", "gltap: cannot write /no/such/folder/log: No such file",
                             "gltap: GLTAP_FAIL: 'glClear:one:2' is not FUNCTION:NTH:ERROR\n"})
        EXPECT_TRUE(Contains(output, part)) << output;
}

}  // namespace
