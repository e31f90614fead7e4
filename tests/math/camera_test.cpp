#include <cmath>

#include "support/Glm.h"

namespace {

TEST(Camera, LookAtKeepsWhatIsNotGiven) {
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    const QexVec3 eye = {1, 2, 3}, target = {0, 0, -5}, other = {4, 0, 0}, up = {1, 0, 0};
    QexCamera_LookAt(&camera, &eye, &target, nullptr);
    const uint32_t upBits = 0x3F800347;
    EXPECT_EQ(memcmp(&camera.up.y, &upBits, sizeof upBits), 0);
    ExpectNear(camera.viewMatrix, glm::lookAtRH(glm::vec3(1, 2, 3), {0, 0, -5}, {0, 1, 0}), 1e-6f);
    QexCamera_LookAt(&camera, nullptr, &other, &up);
    ExpectNear(camera.viewMatrix, glm::lookAtRH(glm::vec3(1, 2, 3), {4, 0, 0}, {1, 0, 0}), 1e-6f);
    // No up is the default up, not the stored one.
    QexCamera_LookAt(&camera, &target, nullptr, nullptr);
    ExpectNear(camera.viewMatrix, glm::lookAtRH(glm::vec3(0, 0, -5), {4, 0, 0}, {0, 1, 0}), 1e-6f);

    QexCamera_Project(&camera, 1, 1.5f, 1, 50);
    QexMatrix m;
    QexMatrix_RotateXYZ(&m, 10, 20, 30);
    const glm::mat4 modelView = ToGlm(camera.viewMatrix) * ToGlm(m);
    QexCamera_BuildMVPMatrix(&camera, &m, &m);
    ExpectNear(camera.modelViewMatrix, modelView, 1e-6f);
    ExpectNear(m, ToGlm(camera.projectionMatrix) * modelView, 1e-6f);
}

TEST(Camera, FrustumCornersUseTheWholeAngle) {
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    QexCamera_Project(&camera, std::atan(0.5f), 1.5f, 2, 8);
    QexVec3 corners[8];
    QexCamera_GetFrustumVerticesInObjectSpace(&camera, corners);
    constexpr float kSigns[4][2] = {{1, 1}, {-1, 1}, {-1, -1}, {1, -1}};
    for (int i = 0; i < 8; ++i) {
        const float distance = i < 4 ? 2 : 8, *sign = kSigns[i % 4];
        ExpectNear(corners[i], {sign[0] * 0.5f * distance, sign[1] * 0.75f * distance, -distance});
    }
}

}  // namespace
