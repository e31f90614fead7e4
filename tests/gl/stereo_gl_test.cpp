// Stereo: the calls of each mode, and what the two eyes leave on the surface.
#include <cmath>

#include "support/RenderScenes.h"

namespace {

class StereoTest : public RenderTest {};

std::string View(int x, int width) {
    return "glViewport(" + std::to_string(x) + ", 0, " + std::to_string(width) + ", 96)\n";
}

TEST_F(StereoTest, EachEyeHasItsMaskItsViewportAndItsPicture) {
    const std::string clear = "glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT)\n",
                      clearDepth = "glClear(GL_DEPTH_BUFFER_BIT)\n", mask = "glColorMask(GL_",
                      red = mask + "TRUE, GL_FALSE, GL_FALSE, GL_TRUE)\n",
                      blue = clearDepth + mask + "FALSE, GL_FALSE, GL_TRUE, GL_TRUE)\n",
                      cyan = clearDepth + mask + "FALSE, GL_TRUE, GL_TRUE, GL_TRUE)\n",
                      all = mask + "TRUE, GL_TRUE, GL_TRUE, GL_TRUE)\n";
    const Rgba r = {255, 0, 0, 255}, b = {0, 0, 255, 255}, c = {0, 255, 255, 255}, m = {255, 0, 255, 255},
               w = {255, 255, 255, 255};
    const struct {
        int width;
        uint32_t mode;
        float separation;
        std::string left, right;
        std::vector<std::tuple<int, int, Rgba>> columns;  // from, to, colour of what is drawn
    } cases[] = {
        {128, 0, 8, "", "", {{40, 80, w}}},
        {128, 1, 8.9f, red + View(-8, 128), blue + View(8, 128), {{32, 48, r}, {48, 72, m}, {72, 88, b}}},
        {128, 2, -8.9f, red + View(8, 128), cyan + View(-8, 128), {{32, 48, c}, {48, 72, w}, {72, 88, r}}},
        {128, 2, NAN, red + View(0, 128), cyan + View(0, 128), {{40, 80, w}}},
        {128, 4, 8, "", "", {{40, 80, w}}},
        {129, 3, 8, View(0, 64), clearDepth + View(64, 64), {{20, 40, w}, {84, 104, w}}},
    };
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(40, 24, 80, 72))));
    QexShaderModule* white = QexSimpleShader_CreateProgram();
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS);
    for (const auto& [width, mode, separation, left, right, columns] : cases) {
        runtime_.width = width;
        EXPECT_EQ(QexRenderer_EnableStereo3D(&runtime_, mode, 99), 0);
        QexRenderer_SetDepthSeperation(&runtime_, separation);
        Clear(0, 0, 0, 1);
        EXPECT_EQ(GLCalls([&] { QexRenderer_PrepareLeft(&runtime_); }).Text(), clear + left) << mode;
        model.DrawNode(white);
        EXPECT_EQ(GLCalls([&] { QexRenderer_PrepareRight(&runtime_); }).Text(), right) << mode;
        model.DrawNode(white);
        QexRenderer_DisableStereo3D(&runtime_);
        EXPECT_EQ(GLCalls([&] { QexRenderer_FinishStereo3D(&runtime_); }).Text(), all + View(0, width));
        EXPECT_EQ(GLCalls([&] { QexRenderer_PrepareRight(&runtime_); }).Text(), "");
        Picture expected;
        expected.Fill(0, 0, kWidth, kHeight, {0, 0, 0, 255});
        for (const auto& [from, to, colour] : columns) expected.Fill(from, 24, to, 72, colour);
        EXPECT_TRUE(SamePicture(Read(), expected)) << mode;
    }
    QexSimpleShader_Release(&white);
}

}  // namespace
