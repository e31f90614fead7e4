#include <cmath>

#include "support/Glm.h"

namespace {

QexBoundingBox Box(QexVec3 min, QexVec3 max) {
    QexBoundingBox box = {};
    for (int i = 0; i < 8; ++i)
        box.corners[i] = {i & 4 ? max.x : min.x, i & 2 ? max.y : min.y, i & 1 ? max.z : min.z};
    return box;
}

TEST(Box, UnionIntersectionAndExtent) {
    const QexAABB a = {{0, 0, 0}, {2, 2, 2}}, b = {{1, -1, 5}, {3, 1, 6}}, beside = {{2, 0, 0}, {3, 2, 2}};
    const QexAABB both = {{0, -1, 0}, {3, 2, 6}}, common = {{1, 0, 5}, {2, 1, 2}};
    QexAABB out;
    QexBoundingBox_InitAABB(&out);
    QexBoundingBox_UnionAAABB(&out, &out, &a);
    QexBoundingBox_UnionAAABB(&out, &out, &b);
    EXPECT_EQ(memcmp(&out, &both, sizeof both), 0);
    QexBoundingBox_IntersectionAABB(&out, &a, &b);
    EXPECT_EQ(memcmp(&out, &common, sizeof common), 0) << "empty along z: minimum 5, maximum 2";
    EXPECT_EQ(QexBoundingBox_isAABBIntersectedXY(&a, &b), 1) << "z does not count";
    EXPECT_EQ(QexBoundingBox_isAABBIntersectedXY(&a, &beside), 0) << "touching is not overlapping";

    QexMatrix turn;
    QexMatrixRotateZ(&turn, 90);
    QexBoundingBox box = Box({1, 2, 3}, {4, 6, 8});
    QexBoundingBox_TransformBoundingBox(&turn, &box, &box);
    QexBoundingBox_GetAABB(&box, &out);
    ExpectNear(out.min, {-6, 1, 3});
    ExpectNear(out.max, {-2, 4, 8});
}

TEST(Box, VisibilityFollowsTheViewVolume) {
    QexMatrix projection;
    QexMatrix_Perspective(&projection, 3.14159265f / 2, 1, 1, 100);  // |x| < -z, |y| < -z, near 1
    const struct {
        QexVec3 min, max;
        int32_t visible, partial;
    } cases[] = {{{-1, -1, -6}, {1, 1, -5}, 1, 0},     {{-1, -1, -6}, {1, 1, 5}, 1, 1},
                 {{-1, -1, 2}, {1, 1, 5}, 0, 0},       {{7, -1, -6}, {9, 1, -5}, 0, 0},
                 {{-9, -1, -6}, {-7, 1, -5}, 0, 0},    {{-1, 7, -6}, {1, 9, -5}, 0, 0},
                 {{-1, -9, -6}, {1, -7, -5}, 0, 0},    {{5, -1, -6}, {9, 1, -5}, 1, 0},
                 {{-50, -50, -6}, {50, 50, -5}, 1, 0}, {{-1, -1, -900}, {1, 1, -800}, 1, 0}};
    for (const auto& c : cases) {
        const QexBoundingBox box = Box(c.min, c.max);
        int32_t partial = 7;
        EXPECT_EQ(QexBoundingBox_IsVisibleFromZAxis(&box, &projection, &partial), c.visible) << c.min.x;
        EXPECT_EQ(partial, c.partial) << c.min.x;
    }
}

TEST(Plane, TheInfiniteOneCoversWhatTheCameraSeesOfIt) {
    constexpr float kFar = 100;
    const float s = std::sqrt(0.5f);
    const struct {
        QexVec3 eye, target;
        QexVec4 plane;
        int32_t vertices;
    } cases[] = {{{0, 5, 0}, {0, 0, -10}, {0, 1, 0, 0}, 4},        // wholly below the horizon
                 {{0, 5, 0}, {0, 5, -10}, {0, 1, 0, 0}, 4},        // level: two of them on the horizon
                 {{0, 5, 0}, {3, 0.5f, -1}, {0, 1, 0, 0}, 4},      // steeply down
                 {{0, 5, 0}, {0, 50, -10}, {0, 1, 0, 0}, 0},       // up into the sky
                 {{0, -5, 0}, {0, -6, -10}, {0, 1, 0, 0}, 0},      // from below
                 {{-20, 25, 0}, {-21, 24, -5}, {s, s, 0, 0}, 5}};  // rolled, one corner above it
    for (const auto& c : cases) {
        QexCamera camera;
        QexCamera_Create(&camera, 0);
        QexCamera_LookAt(&camera, &c.eye, &c.target, nullptr);
        QexCamera_Project(&camera, 1, 1.5f, 1, kFar);
        for (float& element : camera.projectionMatrix.m) element *= kFar;
        QexMatrix viewProjection, inverse;
        QexMatrix_Multiply(&viewProjection, &camera.projectionMatrix, &camera.viewMatrix);
        QexMatrix_InverseEx(&inverse, &viewProjection);
        // Three numbers each, and a fourth between them that is left alone.
        QexVec4 vertices[6];
        std::fill_n(vertices, 6, QexVec4{77, 77, 77, 77});
        ASSERT_EQ(QexMath_CalculateInfinitePlane(vertices, sizeof(QexVec4), &c.plane, &inverse, &c.eye, kFar),
                  c.vertices);
        for (int i = 0; i < c.vertices; ++i) {
            const QexVec3 at = {vertices[i].x, vertices[i].y, vertices[i].z};
            EXPECT_NEAR(at.x * c.plane.x + at.y * c.plane.y, 0, 3e-3f) << "on the plane";
            EXPECT_EQ(vertices[i].w, 77);
            // On the border of the picture or at the far plane.
            QexVec3 clip;
            QexMatrix_TransformHomoVec3(&viewProjection, &at, &clip, 1);
            EXPECT_NEAR(std::fmax(std::fmax(std::fabs(clip.x), std::fabs(clip.y)), clip.z), 1, 1e-2f);
        }
        EXPECT_EQ(vertices[c.vertices].x, 77) << "and no more";
    }
}

TEST(Equations, LinesMeetPlanesAndRowsArePivoted) {
    const QexVec4 plane = {0, 1, 0, -2};
    const QexVec3 p0 = {1, 0, 1}, p1 = {3, 4, 1};
    QexVec3 hit;
    QexMath_CalcIntersectionLinePlane(&hit, &plane, &p0, &p1);
    ExpectNear(hit, {2, 2, 1});
    // Zeros where the pivots would be: x = 1, y = -2, z = 3.
    float s0[] = {-2, 0, 1, 0}, s1[] = {4, 1, 0, 1}, s2[] = {-1, 1, 1, 0}, x[3];
    float* rows[] = {s0, s1, s2};
    QexMath_LinearEqSolve(x, rows, 3);
    ExpectNear({x[0], x[1], x[2]}, {1, -2, 3});
    QexMath_LinearEqSolve(nullptr, nullptr, 0);
}

}  // namespace
