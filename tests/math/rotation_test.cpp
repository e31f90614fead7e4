#include <algorithm>
#include <cmath>

#include "support/Glm.h"

namespace {

constexpr double kPi = 3.141592653589793;

QexQuaternion FromGlm(const glm::dquat& q) {
    return {float(q.x), float(q.y), float(q.z), float(q.w)};
}
glm::dquat ToGlm(const QexQuaternion& q) {
    return glm::dquat(double{q.w}, double{q.x}, double{q.y}, double{q.z});
}
// Random, or near another one, by that distance.
QexQuaternion Unit(Random& random, const glm::dquat& near = {0, 0, 0, 0}, double distance = 1) {
    const glm::dquat any(double{random()}, double{random()}, double{random()}, double{random()});
    return FromGlm(glm::normalize(near + distance * any));
}

void ExpectNear(const QexQuaternion& actual, const QexQuaternion& expected, float tolerance) {
    for (int i = 0; i < 4; ++i) EXPECT_NEAR((&actual.x)[i], (&expected.x)[i], tolerance) << i;
}

TEST(Quaternion, SlerpIsWithinAMillionthOfItsDefinition) {
    Random random;
    double worst = 0;
    for (int i = 0; i < 100000; ++i) {
        const QexQuaternion a = Unit(random);
        // Anywhere, or near a or its opposite. Below that distance the cosine's last bit decides.
        const double near = i % 4 == 0 ? 0 : i % 4 == 1 ? -1 : 1;
        const QexQuaternion b = Unit(random, near * ToGlm(a), std::pow(10.0, -2 * std::fabs(random())));
        const float t = i % 100 == 0 ? 1.0f : std::fabs(random());
        QexQuaternion q;
        QexQuaternion_Slerp(&q, &a, &b, t);
        const glm::dquat expected = glm::slerp(ToGlm(a), ToGlm(b), double{t});
        for (int k = 0; k < 4; ++k) worst = std::max(worst, std::fabs(ToGlm(q)[k] - expected[k]));
    }
    EXPECT_LT(worst, 1e-6);
}

TEST(Quaternion, RulesAtTheEdges) {
    const QexQuaternion one = {0, 0, 0, 1}, minus = {0, 0, 0, -1}, half = {0.5f, 0.5f, 0.5f, 0.5f};
    const struct {
        QexQuaternion from, to;
        float t;
        QexQuaternion expected;
    } cases[] = {{half, one, -0.001f, one},          {half, minus, 1.5f, one}, {half, one, NAN, one},
                 {one, {1e-4f, 0, 0, 1}, 0.3f, one}, {one, minus, 0.3f, one},  {half, half, 1, half}};
    QexQuaternion q;
    for (const auto& c : cases) {
        QexQuaternion_Slerp(&q, &c.from, &c.to, c.t);
        ExpectNear(q, c.expected, 0);
    }
    QexVec3 axis;
    float angle;
    for (const float w : {1.0f, 1.0000001f}) {
        q = {0, 0, 0, w};
        QexQuaternion_ToAxisAngle(&q, &axis, &angle);
        EXPECT_EQ(angle, 0);
        ExpectNear(axis, glm::vec3(0), 0);
    }
    q = {0, 0, 0, 0};
    QexQuaternion_Normalize(&q);
    ExpectNear(q, {0, 0, 0, 0}, 0);
}

TEST(Quaternion, MatricesProductsAndAxesAgreeWithGlm) {
    Random random;
    for (int i = 0; i < 100; ++i) {
        const QexQuaternion a = Unit(random), b = Unit(random);
        QexMatrix m;
        QexQuaternion_ToRotationMatrix(&m, &a);
        ExpectNear(m, glm::mat4_cast(ToGlm(a)), 1e-6f);
        QexQuaternion q = b;
        QexQuaternion_Multiply(&q, &a, &q);
        ExpectNear(q, FromGlm(ToGlm(a) * ToGlm(b)), 1e-6f);
        QexVec3 axis;
        float angle;
        QexQuaternion_ToAxisAngle(&a, &axis, &angle);
        QexQuaternion_RotationAxis(&q, &axis, angle);
        ExpectNear(q, a, 1e-5f);
    }
}

void ExpectRotation(const QexMatrix& expected, const float* degrees) {
    QexMatrix m;
    QexMatrix_RotateXYZ(&m, degrees[0], degrees[1], degrees[2]);
    ExpectNear(m, ToGlm(expected), 2e-6f);
}

TEST(Decomposition, AnglesRebuildTheRotation) {
    float first[3], second[3], radians[3];
    QexMatrix m;
    for (float x = -170; x <= 170; x += 34) {
        for (float y = -170; y <= 170; y += 34) {
            QexMatrix_RotateXYZ(&m, x, y, 55);
            const int32_t nearer = GetRotationXYZFromRotationMatrix(&m, first, second);
            ExpectRotation(m, first);
            ExpectRotation(m, second);
            EXPECT_EQ(nearer,
                      glm::length(glm::make_vec3(first)) < glm::length(glm::make_vec3(second)) ? 1 : 2);
            QexMatrix_ToEulerAnglesXYZ(&m, radians);
            for (float& angle : radians) angle = static_cast<float>(angle * 180 / kPi);
            ExpectRotation(m, radians);
        }
    }
    // At the poles both solutions are one, with no turn about Z.
    for (const float pole : {-1.0f, 1.0f}) {
        m = {{0, 0, -pole, 0, 0.6f * pole, 0.8f, 0, 0, 0.8f * pole, -0.6f, 0, 0, 0, 0, 0, 1}};
        EXPECT_EQ(GetRotationXYZFromRotationMatrix(&m, first, second), 2);
        EXPECT_FLOAT_EQ(first[1], 90 * pole);
        EXPECT_EQ(first[2], 0);
        ExpectRotation(m, first);
        ExpectRotation(m, second);
        QexMatrix_ToEulerAnglesXYZ(&m, radians);
        EXPECT_FLOAT_EQ(radians[1], static_cast<float>(kPi / 2) * pole);
        EXPECT_EQ(radians[2], 0);
    }
    EXPECT_EQ(GetRotationXYZFromRotationMatrix(&g_sMatIdentity, first, second), 1);
    EXPECT_EQ(first[1], 0);
    for (const float angle : second) EXPECT_FLOAT_EQ(std::fabs(angle), 180);
}

TEST(Decomposition, SplitsTranslationRotationAndScale) {
    QexMatrix scale, rotation, translation, m;
    QexMatrix_Scale(&scale, 2, 3, 4);
    QexMatrix_RotateXYZ(&rotation, 20, 30, 40);
    QexMatrix_Translate(&translation, 5, 6, 7);
    QexMatrix_Multiply(&m, &rotation, &scale);
    QexMatrix_Multiply(&m, &translation, &m);
    const std::pair<int32_t (*)(const QexMatrix*, QexMatrix*), const QexMatrix*> cases[] = {
        {GetRotationMatrixFromMatrix, &rotation},
        {GetScaleMatrixFromMatrix, &scale},
        {GetTranslationMatrixFromMatrix, &translation}};
    for (const auto& [function, expected] : cases) {
        QexMatrix part = m;
        EXPECT_EQ(function(&part, &part), 1);
        ExpectNear(part, ToGlm(*expected), 1e-6f);
        EXPECT_EQ(function(nullptr, &part) + function(&m, nullptr), 0);
    }
    float first[3], second[3];
    EXPECT_EQ(GetRotationXYZFromTransformMatrix(&m, first, second), 1);
    ExpectRotation(rotation, first);
    EXPECT_EQ(GetRotationXYZFromTransformMatrix(&m, nullptr, second), 0);
}

}  // namespace
