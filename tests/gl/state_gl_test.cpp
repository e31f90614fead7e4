// The render-state cache and the renderer settings, seen through the calls that reach GL.
#include <GLES2/gl2.h>

#include "support/RenderFixture.h"

namespace {

class StateTest : public NullRenderTest {};

// Names mean what GL calls so.
constexpr uint32_t kPairs[][2] = {{GL_NEVER + QEX_DEPTH_LESS, GL_LESS},
                                  {GL_NEVER + QEX_DEPTH_EQUAL, GL_EQUAL},
                                  {GL_NEVER + QEX_DEPTH_LESS_EQUAL, GL_LEQUAL},
                                  {GL_NEVER + QEX_DEPTH_GREATER, GL_GREATER},
                                  {GL_NEVER + QEX_DEPTH_NOT_EQUAL, GL_NOTEQUAL},
                                  {GL_NEVER + QEX_DEPTH_GREATER_EQUAL, GL_GEQUAL},
                                  {GL_NEVER + QEX_DEPTH_ALWAYS, GL_ALWAYS},
                                  {QEX_FACTOR_ZERO, GL_ZERO},
                                  {QEX_FACTOR_ONE, GL_ONE},
                                  {QEX_FACTOR_SRC_COLOR, GL_SRC_COLOR},
                                  {QEX_FACTOR_ONE_MINUS_SRC_COLOR, GL_ONE_MINUS_SRC_COLOR},
                                  {QEX_FACTOR_SRC_ALPHA, GL_SRC_ALPHA},
                                  {QEX_FACTOR_ONE_MINUS_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA},
                                  {QEX_FACTOR_DST_ALPHA, GL_DST_ALPHA},
                                  {QEX_FACTOR_ONE_MINUS_DST_ALPHA, GL_ONE_MINUS_DST_ALPHA},
                                  {QEX_FACTOR_DST_COLOR, GL_DST_COLOR},
                                  {QEX_FACTOR_ONE_MINUS_DST_COLOR, GL_ONE_MINUS_DST_COLOR},
                                  {QEX_FACTOR_SRC_ALPHA_SATURATE, GL_SRC_ALPHA_SATURATE}};
constexpr bool AllAlike() {
    for (const auto& pair : kPairs)
        if (pair[0] != pair[1]) return false;
    return true;
}
static_assert(AllAlike(), "a name differs from GL's");

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
    const std::string depth = "glEnable(GL_DEPTH_TEST)\nglDepthFunc(GL_", cull = "glEnable(GL_CULL_FACE)\n";
    const struct {
        std::function<void(int)> set;
        int first;
        std::vector<std::string> calls;
    } settings[] = {
        {[](int mode) { QexRenderer_SetZTestFunc(static_cast<uint32_t>(mode)); },
         0,
         {depth + "NEVER)\n", depth + "LESS)\n", depth + "EQUAL)\n", depth + "LEQUAL)\n",
          depth + "GREATER)\n", depth + "NOTEQUAL)\n", depth + "GEQUAL)\n", depth + "ALWAYS)\n",
          "glEnable(GL_DEPTH_TEST)\n"}},
        {[](int mode) { QexRenderer_SetZWrite(mode); },
         -1,
         {"glDepthMask(GL_TRUE)\n", "glDepthMask(GL_FALSE)\n", "glDepthMask(GL_TRUE)\n"}},
        {[](int mode) { QexRenderer_SetBackFaceCulling(mode); },
         -1,
         {"", "glDisable(GL_CULL_FACE)\n", cull + "glCullFace(GL_BACK)\n", cull + "glCullFace(GL_FRONT)\n",
          cull + "glCullFace(GL_FRONT_AND_BACK)\n", ""}},
    };
    for (const auto& setting : settings)
        for (size_t i = 0; i < setting.calls.size(); ++i) {
            const int mode = setting.first + static_cast<int>(i);
            EXPECT_EQ(GLCalls([&] { setting.set(mode); }).Text(), setting.calls[i]) << mode;
        }
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
