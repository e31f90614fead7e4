// The render-state cache and the renderer settings, seen through the calls that reach GL.
#include <GLES2/gl2.h>

#include "support/RenderFixture.h"

namespace {

class StateTest : public NullRenderTest {};

// Names mean what GL calls so.
#define FACTOR(name) static_assert(QEX_FACTOR_##name == GL_##name, "as GL has it")
// clang-format off
FACTOR(ZERO); FACTOR(ONE); FACTOR(SRC_COLOR); FACTOR(ONE_MINUS_SRC_COLOR); FACTOR(SRC_ALPHA); FACTOR(ONE_MINUS_SRC_ALPHA);
FACTOR(DST_ALPHA); FACTOR(ONE_MINUS_DST_ALPHA); FACTOR(DST_COLOR); FACTOR(ONE_MINUS_DST_COLOR); FACTOR(SRC_ALPHA_SATURATE);
// clang-format on

TEST_F(StateTest, OnlyChangesReachGL) {
    const GLCalls calls([] {
        for (int pass = 0; pass < 2; ++pass) {
            QexRenderState_Reset(nullptr);
            for (const uint32_t program : {0u, 0u, 7u, 7u}) QexRenderState_UseProgram(program);
            for (int i = 0; i < 2; ++i) QexRenderState_ActiveTexture(GL_TEXTURE0);
            for (int i = 0; i < 2; ++i) QexRenderState_Bind(GL_TEXTURE_2D, 5);
            QexRenderState_Bind(GL_TEXTURE_CUBE_MAP, 6);
        }
    });
    const std::string pass =
        "glUseProgram(0)\nglUseProgram(7)\nglActiveTexture(GL_TEXTURE0)\nglBindTexture(GL_TEXTURE_2D, 5)\n"
        "glBindTexture(GL_TEXTURE_2D, 5)\nglBindTexture(GL_TEXTURE_CUBE_MAP, 6)\n";
    EXPECT_EQ(calls.Text(), pass + pass);
}

TEST_F(StateTest, ModesReachGLAndUnknownOnesDoNot) {
    const std::string depth = "glEnable(GL_DEPTH_TEST)\n", cull = "glEnable(GL_CULL_FACE)\n";
    const auto function = [&](const char* name) { return depth + "glDepthFunc(GL_" + name + ")\n"; };
    const struct {
        void (*set)(int);
        std::vector<std::pair<int, std::string>> calls;
    } settings[] = {
        {[](int mode) { QexRenderer_SetZTestFunc(static_cast<uint32_t>(mode)); },
         {{QEX_DEPTH_NEVER, function("NEVER")},
          {QEX_DEPTH_LESS, function("LESS")},
          {QEX_DEPTH_EQUAL, function("EQUAL")},
          {QEX_DEPTH_LESS_EQUAL, function("LEQUAL")},
          {QEX_DEPTH_GREATER, function("GREATER")},
          {QEX_DEPTH_NOT_EQUAL, function("NOTEQUAL")},
          {QEX_DEPTH_GREATER_EQUAL, function("GEQUAL")},
          {QEX_DEPTH_ALWAYS, function("ALWAYS")},
          {8, depth}}},
        {QexRenderer_SetZWrite,
         {{-1, "glDepthMask(GL_TRUE)\n"}, {0, "glDepthMask(GL_FALSE)\n"}, {1, "glDepthMask(GL_TRUE)\n"}}},
        {QexRenderer_SetBackFaceCulling,
         {{-1, ""},
          {QEX_CULL_NONE, "glDisable(GL_CULL_FACE)\n"},
          {QEX_CULL_BACK, cull + "glCullFace(GL_BACK)\n"},
          {QEX_CULL_FRONT, cull + "glCullFace(GL_FRONT)\n"},
          {QEX_CULL_BOTH, cull + "glCullFace(GL_FRONT_AND_BACK)\n"},
          {4, ""}}},
    };
    for (const auto& setting : settings)
        for (const auto& [mode, calls] : setting.calls)
            EXPECT_EQ(GLCalls([&, mode = mode] { setting.set(mode); }).Text(), calls) << mode;
}

TEST_F(StateTest, BlendModes) {
    const std::string factors[] = {"GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA", "GL_SRC_ALPHA, GL_ONE",
                                   "GL_ONE, GL_ONE", "GL_ZERO, GL_ONE"};
    const auto expected = [&](int mode, size_t alpha) -> std::string {
        if (mode == 0) return "glDisable(GL_BLEND)\n";
        if (mode < 1 || mode > 3) return "";
        return "glEnable(GL_BLEND)\nglBlendFuncSeparate(" + factors[mode - 1] + ", " + factors[alpha] + ")\n";
    };
    for (int mode = -1; mode < 6; ++mode) {
        EXPECT_EQ(GLCalls([=] { QexRenderer_SetAlphaBlendMode(mode); }).Text(),
                  expected(mode, static_cast<size_t>(mode - 1)));
        for (const uint32_t alpha : {0u, 1u, 2u, 3u, 4u, 0x80000001u})
            EXPECT_EQ(GLCalls([=] { QexRenderer_SetAlphaBlendModeSeparate(mode, alpha); }).Text(),
                      expected(mode, alpha >= 1 && alpha <= 3 ? alpha - 1 : 3))
                << mode << " " << alpha;
    }
}

}  // namespace
