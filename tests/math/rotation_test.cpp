#include <algorithm>
#include <cmath>

#include "support/Glm.h"

namespace {

constexpr double kPi = 3.141592653589793;

QexQuaternion Unit(double x, double y, double z, double w) {
    const glm::dvec4 unit = glm::normalize(glm::dvec4(x, y, z, w));
    return {float(unit.x), float(unit.y), float(unit.z), float(unit.w)};
}
QexQuaternion Unit(Random& random) {
    return Unit(double{random()}, double{random()}, double{random()}, double{random()});
}

void ExpectNear(const QexQuaternion& actual, const QexQuaternion& expected, float tolerance) {
    for (int i = 0; i < 4; ++i) EXPECT_NEAR((&actual.x)[i], (&expected.x)[i], tolerance) << i;
}

// The interpolation by its definition, in double; only the cosine is single, as it decides between the rules.
void SlerpByDefinition(double out[4], QexQuaternion a, QexQuaternion b, float t) {
    float c = a.w * b.w + a.x * b.x + a.y * b.y + a.z * b.z;
    const double side = c < 0 ? -1 : 1;
    c = std::fabs(c);
    double s0 = 1, s1 = 0, length = 0;
    if (c < 1) {
        const double angle = std::acos(double{c});
        s0 = std::sin((1 - double{t}) * angle) / std::sin(angle);
        s1 = side * std::sin(double{t} * angle) / std::sin(angle);
    }
    for (int i = 0; i < 4; ++i) out[i] = s0 * (&a.x)[i] + s1 * (&b.x)[i];
    for (int i = 0; i < 4; ++i) length += out[i] * out[i];
    for (int i = 0; i < 4 && c < 1; ++i) out[i] /= std::sqrt(length);
}

TEST(Quaternion, SlerpIsWithinAMillionthOfItsDefinition) {
    Random random;
    double worst = 0;
    for (int i = 0; i < 100000; ++i) {
        const QexQuaternion a = Unit(random);
        QexQuaternion b = Unit(random), q;
        if (i % 4 != 0) {
            // Near a, or near its opposite, by a distance of any size down to the last bits.
            const double distance = std::pow(10.0, -8 * std::fabs(random())), side = i % 4 == 1 ? -1 : 1;
            b = Unit(side * a.x + distance * b.x, side * a.y + distance * b.y, side * a.z + distance * b.z,
                     side * a.w + distance * b.w);
        }
        const float t = i % 100 == 0 ? 1.0f : std::fabs(random());
        double expected[4];
        QexQuaternion_Slerp(&q, &a, &b, t);
        SlerpByDefinition(expected, a, b, t);
        for (int k = 0; k < 4; ++k) worst = std::max(worst, std::fabs((&q.x)[k] - expected[k]));
    }
    EXPECT_LT(worst, 1e-6);
}

TEST(Quaternion, RulesAtTheEdges) {
    const QexQuaternion a = Unit(1, 2, 3, 4), opposite = {-a.x, -a.y, -a.z, -a.w}, b = Unit(-2, 1, 0, 1);
    QexQuaternion q;
    for (const float t : {-0.001f, 1.5f, NAN}) {
        QexQuaternion_Slerp(&q, &a, &b, t);
        ExpectNear(q, {0, 0, 0, 1}, 0);
    }
    for (const float t : {0.0f, 0.3f, 1.0f}) {
        QexQuaternion_Slerp(&q, &a, &opposite, t);
        ExpectNear(q, a, 1e-6f);
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
        const glm::quat ga(a.w, a.x, a.y, a.z), gb(b.w, b.x, b.y, b.z), product = ga * gb;
        QexMatrix m;
        QexQuaternion_ToRotationMatrix(&m, &a);
        ExpectNear(m, glm::mat4_cast(ga), 1e-6f);
        QexQuaternion q = b;
        QexQuaternion_Multiply(&q, &a, &q);
        ExpectNear(q, {product.x, product.y, product.z, product.w}, 1e-6f);
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
    for (int x = -170; x <= 170; x += 34) {
        for (int y = -170; y <= 170; y += 34) {
            QexMatrix_RotateXYZ(&m, static_cast<float>(x), static_cast<float>(y), 55);
            const int32_t nearer = GetRotationXYZFromRotationMatrix(&m, first, second);
            ExpectRotation(m, first);
            ExpectRotation(m, second);
            const auto size = [](const float* a) { return a[0] * a[0] + a[1] * a[1] + a[2] * a[2]; };
            EXPECT_EQ(nearer, size(first) < size(second) ? 1 : 2);
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
