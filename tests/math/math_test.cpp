#include <cmath>
#include <limits>

#include "support/Glm.h"

namespace {

using glm::mat4;
using glm::vec3;

constexpr float kPi = 3.14159265f;

QexVec3 Apply(const QexMatrix& m, QexVec3 v, float w = 1) {
    QexMatrix_TransformHomoVec3(&m, &v, &v, w);
    return v;
}

mat4 RandomMatrix(Random& random) {
    mat4 m;
    for (int i = 0; i < 16; ++i) glm::value_ptr(m)[i] = random();
    return m;
}
mat4 RandomAffine(Random& random) {
    return glm::row(RandomMatrix(random), 3, glm::vec4(0, 0, 0, 1));
}

TEST(Matrix, BuildersAgreeWithGlm) {
    const mat4 one(1);
    const float angle = 0.7f, degrees = glm::degrees(angle);
    const vec3 axis(1, -2, 0.5f), eye(3, 4, 5), target(-1, 0, 2), up(0.1f, 1, 0);
    const vec3 x(1, 0, 0), y(0, 1, 0), z(0, 0, 1);
    const QexVec3 e = FromGlm(eye), t = FromGlm(target), u = FromGlm(up);
    QexMatrix m;
    ExpectNear(*QexMatrixRotateX(&m, degrees), glm::rotate(one, angle, x), 1e-6f, "X");
    ExpectNear(*QexMatrix_RotateY(&m, degrees), glm::rotate(one, angle, y), 1e-6f, "Y");
    ExpectNear(*QexMatrixRotateZ(&m, degrees), glm::rotate(one, angle, z), 1e-6f, "Z");
    const mat4 turnZ = glm::rotate(one, glm::radians(110.0f), z),
               turnYZ = glm::rotate(turnZ, glm::radians(-50.0f), y);
    ExpectNear(*QexMatrix_RotateXYZ(&m, 30, -50, 110), glm::rotate(turnYZ, glm::radians(30.0f), x), 1e-6f);
    ExpectNear(*QexMatrix_RotateAngelAxis(&m, degrees, 1, -2, 0.5f), glm::rotate(one, angle, axis), 1e-6f);
    ExpectNear(*QexMatrix_Translate(&m, 1, 2, 3), glm::translate(one, {1, 2, 3}), 0, "translate");
    ExpectNear(*QexMatrix_Scale(&m, 1, 2, 3), glm::scale(one, {1, 2, 3}), 0, "scale");
    ExpectNear(*QexMatrix_LookAtRH(&m, &e, &t, &u), glm::lookAtRH(eye, target, up), 1e-5f, "look-at");
    // Z is not mirrored, unlike GLM's: near maps to -1.
    ExpectNear(*QexMatrix_Orthographic(&m, -1, 3, 2, 7, -4, 9),
               glm::orthoRH_NO(-1.0f, 3.0f, 2.0f, 7.0f, 4.0f, -9.0f), 1e-6f, "ortho");
    EXPECT_NEAR(Apply(m, {0, 0, -4}).z, -1, 1e-6f);
    // The field of view is the horizontal one, and all of the usual matrix is divided by the far distance.
    const float fov = 1.1f, vertical = 2 * std::atan(std::tan(fov / 2) / 1.6f);
    ExpectNear(*QexMatrix_Perspective(&m, fov, 1.6f, 0.5f, 80),
               glm::perspectiveRH_ZO(vertical, 1.6f, 0.5f, 80.0f) / 80.0f, 1e-6f, "perspective");
}

TEST(Matrix, ProductsAndInversesAgreeWithGlm) {
    Random random;
    for (int i = 0; i < 200; ++i) {
        const mat4 ga = RandomMatrix(random), gb = RandomMatrix(random), affine = RandomAffine(random);
        const QexMatrix a = FromGlm(ga), b = FromGlm(gb);
        QexMatrix m, left = a, right = b;
        QexMatrix_Multiply(&m, &a, &b);
        ExpectNear(m, ga * gb, 1e-6f, "product");
        QexMatrix_Multiply(&left, &left, &b);
        QexMatrix_Multiply(&right, &a, &right);
        EXPECT_EQ(memcmp(&left, &m, sizeof m), 0) << "out is a";
        EXPECT_EQ(memcmp(&right, &m, sizeof m), 0) << "out is b";
        m = a;
        QexMatrix_Transpose(&m);
        ExpectNear(m, glm::transpose(ga), 0, "transpose");
        m = a;
        if (std::fabs(glm::determinant(ga)) > 0.1f)
            ExpectNear(*QexMatrix_InverseEx(&m, &m), glm::inverse(ga), 1e-3f, "general inverse");
        if (std::fabs(glm::determinant(affine)) < 0.05f) continue;
        m = FromGlm(affine);
        QexMatrix3 n, transposed;
        QexMatrix3_ConstructorFromMatrix(&n, &m);
        EXPECT_EQ(QexMatrix_Inverse(&m, &m), &m);
        ExpectNear(m, glm::inverse(affine), 2e-4f, "affine inverse");
        QexMatrix3_Inverse(&n, &n);
        QexMatrix3_Transpose(&transposed, &n);
        for (int k = 0; k < 9; ++k) {
            EXPECT_NEAR(n.m[k], glm::value_ptr(glm::inverse(glm::mat3(affine)))[k], 2e-4f);
            EXPECT_EQ(transposed.m[k], n.m[k % 3 * 3 + k / 3]);
        }
    }
}

TEST(Matrix, InverseRefusesSingularMatricesOfEverySizeAndNoOthers) {
    Random random;
    const mat4 turn = glm::rotate(mat4(1), 0.5f, vec3(1, 2, 3));
    for (const float scale : {1e-6f, 1.0f, 1e6f})
        for (int i = 0; i < 50; ++i) {
            mat4 flat = RandomAffine(random);
            flat[1] = i ? flat[0] : glm::vec4(0);
            for (const mat4& g : {flat, turn}) {
                const QexMatrix m = FromGlm(glm::scale(g, vec3(scale)));
                QexMatrix out = g_sMatIdentity;
                EXPECT_EQ(QexMatrix_Inverse(&out, &m) != nullptr, g == turn);
                EXPECT_EQ(memcmp(&out, &g_sMatIdentity, sizeof out) != 0, g == turn) << "left as it was";
            }
        }
}

TEST(Matrix, TransformsAgreeWithGlm) {
    Random random;
    const mat4 g = RandomMatrix(random);
    const QexMatrix m = FromGlm(g);
    const glm::vec4 gv(1, -2, 3, 0.5f), product = g * gv, transposed = gv * g;
    QexVec4 v = {gv.x, gv.y, gv.z, gv.w}, raw = v;
    QexMatrix_TransformVec4(&m, &v, &v);
    QexMatrix_TransformVec4Raw(&m, &raw, &raw);
    for (int i = 0; i < 4; ++i) {
        EXPECT_NEAR((&v.x)[i], product[i], 1e-5f);
        EXPECT_NEAR((&raw.x)[i], transposed[i], 1e-5f);
    }
    ExpectNear(Apply(m, {1, -2, 3}, 0.5f), vec3(product) / product.w, 1e-4f);
    QexMatrix3 n;
    QexMatrix3_ConstructorFromMatrix(&n, &m);
    QexVec3 direction = {1, -2, 3};
    QexMatrix_TransformVec3(&n, &direction, &direction);
    ExpectNear(direction, glm::mat3(g) * vec3(gv));
}

TEST(Matrix, ArrayTransformsKeepToTheirStride) {
    QexMatrix move;
    QexMatrix_Translate(&move, 10, 20, 30);
    // Records of three floats and two bytes: unaligned from the second on.
    unsigned char bytes[2 * 14], moved[sizeof bytes];
    memset(moved, 0x77, sizeof moved);
    const QexVec3 points[2] = {{1, 2, -3}, {4, 5, 6}};
    for (int i = 0; i < 2; ++i) memcpy(bytes + 14 * i, &points[i], 12);
    QexMatrix_TransformVec3Array(&move, bytes, moved, 2, 2, 14);
    QexMatrix_TransformHomoVec3Array(&move, bytes, bytes, 123, 2, 14);
    for (int i = 0; i < 2; ++i) {
        QexVec3 once, twice;
        memcpy(&once, bytes + 14 * i, 12);
        memcpy(&twice, moved + 14 * i, 12);
        ExpectNear(once, vec3(points[i].x + 10, points[i].y + 20, points[i].z + 30));
        ExpectNear(twice, vec3(points[i].x + 20, points[i].y + 40, points[i].z + 60));
        EXPECT_EQ(moved[14 * i + 12], 0x77);
    }
}

TEST(Matrix, ReflectionMirrorsThroughThePlane) {
    Random random;
    const vec3 normals[] = {
        {0, 1, 0}, {0, -1, 0}, {0, -2, 0}, {1, 0, 0}, {0.001f, 1, 0}, {-0.001f, -1, 0.001f}, {1, 2, -3}};
    for (const vec3& normal : normals) {
        const vec3 point = random.Vec3(5), n = glm::normalize(normal);
        const QexVec3 qp = FromGlm(point), qn = FromGlm(normal);
        QexMatrix m;
        QexMatrix_CreateReflectionMatrix(&qp, &qn, &m);
        for (int i = 0; i < 20; ++i) {
            const vec3 v = random.Vec3(5);
            ExpectNear(Apply(m, FromGlm(v)), v - 2 * glm::dot(n, v - point) * n, 2e-5f);
        }
    }
}

TEST(Matrix, GetRotationTurnsOneDirectionOntoTheOther) {
    Random random;
    QexMatrix m;
    for (int i = 0; i < 100; ++i) {
        const vec3 a = random.Vec3(3), b = i % 10 == 0 ? -a : random.Vec3(3);
        const QexVec3 from = FromGlm(a), to = FromGlm(b);
        QexMatrix_GetRotation(&m, &from, &to);
        ExpectNear(Apply(m, FromGlm(glm::normalize(a))), glm::normalize(b), 2e-5f);
    }
    const QexVec3 x = {1, 0, 0};
    for (const auto& [angle, turned] : {std::pair{0.005f, false}, {0.02f, true}}) {
        const QexVec3 to = {std::cos(angle), std::sin(angle), 0};
        QexMatrix_GetRotation(&m, &x, &to);
        EXPECT_NEAR(m.m[1], turned ? std::sin(angle) : 0, 1e-6f);
    }
}

TEST(Scalar, RootsAndArcsAreCloseToTheCLibrary) {
    EXPECT_EQ(Qex_Sqrt(-4), 0);
    for (const float a : {0.0f, 1e-4f, 0.3f, 1.0f, 2.0f, 1000.0f, 1e10f, 3e38f})
        EXPECT_NEAR(Qex_Sqrt(a), std::sqrt(a), 2e-6f + 1e-6f * std::sqrt(a));
    EXPECT_TRUE(std::isinf(Qex_Sqrt(std::numeric_limits<float>::infinity())));
    EXPECT_TRUE(std::isnan(Qex_Sqrt(std::nanf(""))));

    for (float a = 0.01f; a < 20; a *= 1.1f) EXPECT_NEAR(Qex_ArcTan(a), std::atan(a), 1.4e-5f);
    for (float a = 0; a <= 1; a += 0.05f) {
        EXPECT_NEAR(Qex_ArcSin(a), std::asin(a), 5e-4f);
        EXPECT_NEAR(Qex_ArcCos(a), std::acos(a), 5e-4f);
    }
    for (int degree = 1; degree < 360; degree += 7) {
        const float angle = static_cast<float>(degree) * kPi / 180;
        EXPECT_NEAR(Qex_ArcTan2(2 * std::cos(angle), 2 * std::sin(angle)), angle, 2e-6f);
    }
    EXPECT_FLOAT_EQ(Qex_ArcTan2(0, 3), kPi / 2);
    EXPECT_FLOAT_EQ(Qex_ArcTan2(0, -1), -kPi / 2);
    EXPECT_EQ(Qex_ArcTan2(0, 0), 0);
    EXPECT_LT(Qex_ArcTan2(1, -1e-9f), 2 * kPi);
    for (const uint32_t n : {1u, 2u, 1024u, 0x80000000u}) EXPECT_EQ(util_number_is_power_2(n), 1u);
    for (const uint32_t n : {0u, 3u, 1023u, 0xFFFFFFFFu}) EXPECT_EQ(util_number_is_power_2(n), 0u);
}

}  // namespace
