// Stereo: what the two eyes leave on the surface.
#include <GLES2/gl2.h>

#include <cmath>

#include "support/RenderScenes.h"

namespace {

class StereoTest : public RenderTest {};

TEST_F(StereoTest, EachEyeHasItsPicture) {
    const Rgba r = {255, 0, 0, 255}, b = {0, 0, 255, 255}, c = {0, 255, 255, 255}, m = {255, 0, 255, 255},
               w = {255, 255, 255, 255};
    const struct {
        int width;
        uint32_t mode;
        float separation;
        std::vector<std::tuple<int, int, Rgba>> columns;  // from, to, colour of what is drawn
    } cases[] = {
        {128, 0, 8, {{40, 80, w}}},
        {128, 1, 8.9f, {{32, 48, r}, {48, 72, m}, {72, 88, b}}},
        {128, 2, -8.9f, {{32, 48, c}, {48, 72, w}, {72, 88, r}}},
        {128, 2, NAN, {{40, 80, w}}},
        {129, 3, 8, {{20, 40, w}, {84, 104, w}}},
        // No mode at all, over the whole surface again.
        {129, 4, 8, {{40, 81, w}}},
    };
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(40, 24, 80, 72))));
    QexShaderModule* white = QexSimpleShader_CreateProgram();
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS);
    for (const auto& [width, mode, separation, columns] : cases) {
        runtime_.width = width;
        EXPECT_EQ(QexRenderer_EnableStereo3D(&runtime_, mode, 99), 0);
        QexRenderer_SetDepthSeperation(&runtime_, separation);
        Clear(1, 1, 0, 1);  // which the first eye clears, too
        glClearColor(0, 0, 0, 1);
        QexRenderer_PrepareLeft(&runtime_);
        model.DrawNode(white);
        QexRenderer_PrepareRight(&runtime_);
        model.DrawNode(white);
        QexRenderer_DisableStereo3D(&runtime_);
        QexRenderer_FinishStereo3D(&runtime_);
        EXPECT_EQ(GLCalls([&] { QexRenderer_PrepareRight(&runtime_); }).Size(), 0u);
        Picture expected;
        expected.Fill(0, 0, kWidth, kHeight, {0, 0, 0, 255});
        for (const auto& [from, to, colour] : columns) expected.Fill(from, 24, to, 72, colour);
        EXPECT_TRUE(SamePicture(Read(), expected)) << mode;
    }
    QexSimpleShader_Release(&white);
}

}  // namespace
