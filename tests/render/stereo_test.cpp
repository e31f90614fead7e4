// Stereo: the calls of each mode, and what the two eyes leave on the surface.
#include <cmath>

#include "Scenes.h"

namespace {

class StereoTest : public RenderTest {};
class StereoCallsTest : public NullRenderTest {};

std::string Viewport(int x, int width) {
    return "glViewport(" + std::to_string(x) + ", 0, " + std::to_string(width) + ", 480)\n";
}

TEST_F(StereoCallsTest, ModesSetMasksAndViewports) {
    const std::string clear = "glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT)\n",
                      clearDepth = "glClear(GL_DEPTH_BUFFER_BIT)\n", mask = "glColorMask(GL_",
                      red = mask + "TRUE, GL_FALSE, GL_FALSE, GL_TRUE)\n",
                      blue = clearDepth + mask + "FALSE, GL_FALSE, GL_TRUE, GL_TRUE)\n",
                      cyan = clearDepth + mask + "FALSE, GL_TRUE, GL_TRUE, GL_TRUE)\n",
                      all = mask + "TRUE, GL_TRUE, GL_TRUE, GL_TRUE)\n";
    const struct {
        uint32_t mode;
        float separation;
        std::string left, right;
    } cases[] = {{0, 4.7f, "", ""},
                 {1, 4.7f, red + Viewport(-4, 801), blue + Viewport(4, 801)},
                 {2, -4.7f, red + Viewport(4, 801), cyan + Viewport(-4, 801)},
                 {2, NAN, red + Viewport(0, 801), cyan + Viewport(0, 801)},
                 {3, 4.7f, Viewport(0, 400), clearDepth + Viewport(400, 400)},
                 {4, 4.7f, "", ""}};
    QexRuntimeContext context = {};
    context.width = 801;
    context.height = 480;
    for (const auto& c : cases) {
        EXPECT_EQ(QexRenderer_EnableStereo3D(&context, c.mode, 99), 0);
        QexRenderer_SetDepthSeperation(&context, c.separation);
        EXPECT_EQ(GLCalls([&] { QexRenderer_PrepareLeft(&context); }).Text(), clear + c.left) << c.mode;
        EXPECT_EQ(GLCalls([&] { QexRenderer_PrepareRight(&context); }).Text(), c.right) << c.mode;
        QexRenderer_DisableStereo3D(&context);
        EXPECT_EQ(GLCalls([&] { QexRenderer_PrepareRight(&context); }).Text(), "");
        EXPECT_EQ(GLCalls([&] { QexRenderer_FinishStereo3D(&context); }).Text(), all + Viewport(0, 801));
    }
}

TEST_F(StereoTest, EachEyeDrawsItsColoursAtItsPlace) {
    // A white rectangle, moved 8 pixels aside in the colour modes, half as wide in each half of the surface.
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(40, 24, 80, 72))));
    QexShaderModule* white = QexSimpleShader_CreateProgram();
    const Rgba r = {255, 0, 0, 255}, b = {0, 0, 255, 255}, c = {0, 255, 255, 255}, m = {255, 0, 255, 255},
               w = {255, 255, 255, 255};
    const std::vector<std::tuple<int, int, Rgba>> columns[] = {{{40, 80, w}},
                                                               {{32, 48, r}, {48, 72, m}, {72, 88, b}},
                                                               {{32, 48, r}, {48, 72, w}, {72, 88, c}},
                                                               {{20, 40, w}, {84, 104, w}}};
    QexRenderer_SetZTestFunc(1);
    for (uint32_t mode = 0; mode < 4; ++mode) {
        QexRenderer_EnableStereo3D(&runtime_, mode, 8.9f);
        Clear(0, 0, 0, 1);
        QexRenderer_PrepareLeft(&runtime_);
        model.DrawNode(white);
        QexRenderer_PrepareRight(&runtime_);
        model.DrawNode(white);
        QexRenderer_FinishStereo3D(&runtime_);
        Picture expected;
        expected.Fill(0, 0, kWidth, kHeight, {0, 0, 0, 255});
        for (const auto& [from, to, colour] : columns[mode]) expected.Fill(from, 24, to, 72, colour);
        EXPECT_TRUE(SamePicture(Read(), expected)) << mode;
    }
    QexSimpleShader_Release(&white);
}

}  // namespace
