#include <GLES2/gl2.h>

#include "support/RenderScenes.h"

namespace {

class BillboardTest : public RenderTest {};

TEST_F(BillboardTest, ModesTurnAsDescribed) {
    ScopedTexture texture({255, 255, 255, 255});
    QexBillboard* billboard = QexBillboard_Create(&texture);
    *billboard = {&texture, 64, 32, 1, {0.5f, 2, 7}, {20, -50, 70}, {3, -4, 5}, 1, 1};
    const glm::vec3 x(1, 0, 0), y(0, 1, 0), z(0, 0, 1), at(3, -4, 5);
    const auto turn = [](float degrees, glm::vec3 axis) {
        return glm::rotate(glm::mat4(1), glm::radians(degrees), axis);
    };
    const glm::mat4 roll = turn(70, z);
    // About the billboard: in front, to the sides, behind, and, where there is no yaw, above and below.
    // Angles come out a little too large, as of pi two places count.
    const float large = 3.14159265f / 3.14f;
    const struct {
        glm::vec3 eye;
        float yaw, pitch;
    } cases[] = {{{0, 0, 9}, 0, 0},
                 {{8, 0, 0}, 90, 0},
                 {{-8, 0, 0}, -90, 0},
                 {{3, -5, 4}, 36.8699f, -45},
                 {{-3, 5, -4}, -143.1301f, 45},
                 {{0, 9, 0}, 0, 90},
                 {{0, -9, 0}, 0, -90}};
    for (const auto& c : cases) {
        QexCamera camera;
        QexCamera_Create(&camera, 0);
        const QexVec3 eye = {3 + c.eye.x, -4 + c.eye.y, 5 + c.eye.z}, target = {1, 2, 0.5f};
        QexCamera_LookAt(&camera, &eye, &target, nullptr);
        QexCamera_Project(&camera, 1, 1.5f, 1, 50);
        const glm::mat4 free = roll * turn(-50, y) * turn(20, x), yawed = turn(c.yaw * large, y) * roll,
                        turned[] = {free, free, free, turn(c.pitch * large, x) * yawed, yawed, free};
        // A view with perspective of its own: its bottom row stays.
        for (const float bottom : {0.25f, 0.0f}) {
            camera.viewMatrix.m[3] = bottom;
            for (const int32_t mode : {1, 2, 3, 4, 0, 5}) {
                billboard->mode = mode;
                glm::mat4 m = glm::scale(
                    glm::translate(glm::make_mat4(camera.viewMatrix.m), at) * turned[mode], {32, 64, 1});
                if (mode == 1) m[1] = {0, 64, 0, m[1].w};
                if (mode == 1 || mode == 2) m[0] = {32, 0, 0, m[0].w}, m[2] = {0, 0, 1, m[2].w};
                const GLCalls calls([&] { QexBillboard_Draw(billboard, &camera); });
                EXPECT_TRUE(SameMatrix(calls.Of({"glUniformMatrix4fv"}).at(0)->data,
                                       glm::make_mat4(camera.projectionMatrix.m) * m))
                    << "mode " << mode << ", yaw " << c.yaw << ", pitch " << c.pitch;
            }
        }
    }
    QexBillboard_Release(billboard);
}

TEST_F(BillboardTest, CoversItsTexels) {
    const uint8_t texels[4][4] = {{255, 0, 0, 255}, {0, 255, 0, 200}, {0, 0, 255, 100}, {255, 255, 0, 0}};
    ScopedTexture texture(2, 2, texels[0]);
    const QexCamera camera = PixelCamera({kWidth / 2, kHeight / 2, 0});
    QexBillboard* billboard = QexBillboard_Create(&texture);
    billboard->scale = {32, 16, 1};
    billboard->rotation = {30, 40, 50};
    billboard->position = {-4, 8, 2};
    billboard->opacity = 0.5f;
    Clear(0.2f, 0.4f, 0.6f, 1);
    QexBillboard_Draw(billboard, &camera);
    Picture expected;
    expected.Fill(0, 0, kWidth, kHeight, {51, 102, 153, 255});
    for (int i = 0; i < 4; ++i) {
        // The first row of texels is the lower one.
        const uint8_t* t = texels[i];
        const int left = 60 - 32 + i % 2 * 32, top = 40 - i / 2 * 16;
        expected.Fill(left, top, left + 32, top + 16, {t[0], t[1], t[2], t[3] / 2});
    }
    EXPECT_TRUE(SamePicture(Read(), expected, 1));
    QexBillboard_Release(billboard);
}

TEST_F(BillboardTest, LifeAndStateLeftBehind) {
    const std::string before = LiveObjects();
    const QexCamera camera = PixelCamera({kWidth / 2, kHeight / 2, 0});
    QexBillboard_Release(nullptr);
    QexBillboard_SetTexture(nullptr, nullptr);
    QexBillboard_Draw(nullptr, &camera);
    for (int round = 0; round < 2; ++round) {
        QexBillboard* first = QexBillboard_Create(nullptr);
        QexBillboard* second = QexBillboard_Create(nullptr);
        ASSERT_NE(first, nullptr);
        ASSERT_NE(second, nullptr);
        EXPECT_EQ(g_BillboardCount, 2);
        EXPECT_EQ(g_VecUp.y, 1);
        EXPECT_EQ(g_VecNormal.z, 1);
        // Without a texture it shows the default one.
        EXPECT_EQ(first->texture, Qextexture_GetDefault());
        EXPECT_EQ(first->width, 64);
        QexBillboard_Draw(first, nullptr);
        QexBillboard_Draw(first, &camera);
        const std::string program = std::to_string(g_BillboardShaderProgramID);
        QexRenderState_UseProgram(0);
        QexRenderState_ActiveTexture(GL_TEXTURE2);
        QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
        EXPECT_EQ(StateChange([&] { QexBillboard_Draw(second, &camera); }),
                  "program: 0 -> " + program + "\nactiveUnit: 2 -> 0\ncullFace: 0 -> 1\n");
        QexBillboard_Release(first);
        EXPECT_EQ(std::to_string(g_BillboardShaderProgramID), program);
        QexBillboard_Release(second);
        EXPECT_EQ(g_BillboardShaderProgramID, 0u);
        EXPECT_EQ(LiveObjects(), before);
    }
}

}  // namespace
