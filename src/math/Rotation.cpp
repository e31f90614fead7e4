// Quaternions, Euler angles, decomposition.
#include <cmath>

#include "math/Float4.h"
#include "math/Pi.h"
#include "Qex/math.h"

namespace {

// Polynomials fitted at the Chebyshev points of the range; both are off by less than the last bit of a float.

// asin(sqrt(x)) / sqrt(x) for x in [0, 1/2]. Summed in pairs, since the terms do not wait for each other
// then.
inline float ArcSineRatio(float x) {
    const float x2 = x * x, x4 = x2 * x2;
    const float low = (1.0f + 0.166666142f * x) + (0.0750275732f + 0.0440916167f * x) * x2;
    const float high = (0.0358142393f - 0.00702057912f * x) + (0.107400021f - 0.135916271f * x) * x2;
    return low + (high + 0.123913495f * x4) * x4;
}

// sin(sqrt(x)) / sqrt(x) for x in [0, (pi / 2)^2].
inline float SineRatio(float x) {
    const float x2 = x * x;
    const float low = (1.0f - 0.166666666f * x) + (0.00833333097f - 0.000198408612f * x) * x2;
    return low + (2.75252698e-6f - 2.38892177e-8f * x) * (x2 * x2);
}

struct Euler {
    double x, y, z;
};

double SquaredSum(const Euler& e) {
    return e.x * e.x + e.y * e.y + e.z * e.z;
}

void StoreDegrees(float* out, const Euler& e) {
    out[0] = static_cast<float>(e.x * 180 / kQexPi);
    out[1] = static_cast<float>(e.y * 180 / kQexPi);
    out[2] = static_cast<float>(e.z * 180 / kQexPi);
}

float ColumnLength(const float* column) {
    return sqrtf(column[0] * column[0] + column[1] * column[1] + column[2] * column[2]);
}

double Atan2(float y, float x) {
    return atan2(static_cast<double>(y), static_cast<double>(x));
}

// Rounding can bring a sine or cosine of a rotation past 1.
double Clamped(float value) {
    return static_cast<double>(QexMath_ClampFloat(value, -1, 1));
}

// Away from the poles: the solution whose angle about Y is y.
Euler SolveEuler(const float* m, double y) {
    const double c = cos(y);
    const auto angle = [c](float sine, float cosine) {
        return atan2(static_cast<double>(sine) / c, static_cast<double>(cosine) / c);
    };
    return {angle(m[6], m[10]), y, angle(m[1], m[0])};
}

}  // namespace

void QexQuaternion_Identity(QexQuaternion* q) {
    *q = {0, 0, 0, 1};
}

void QexQuaternion_Normalize(QexQuaternion* q) {
    const double length = sqrt(static_cast<double>(q->w * q->w + q->x * q->x + q->y * q->y + q->z * q->z));
    if (length == 0) return;
    const float scale = static_cast<float>(1 / length);
    *q = {q->x * scale, q->y * scale, q->z * scale, q->w * scale};
}

void QexQuaternion_Multiply(QexQuaternion* out, const QexQuaternion* a, const QexQuaternion* b) {
    *out = {a->w * b->x + b->w * a->x + (a->y * b->z - a->z * b->y),
            a->w * b->y + b->w * a->y + (a->z * b->x - a->x * b->z),
            a->w * b->z + b->w * a->z + (a->x * b->y - a->y * b->x),
            a->w * b->w - (a->x * b->x + a->y * b->y + a->z * b->z)};
    QexQuaternion_Normalize(out);
}

void QexQuaternion_RotationAxis(QexQuaternion* out, const QexVec3* axis, float angle) {
    const double half = static_cast<double>(angle) / 2;
    const float s = static_cast<float>(sin(half));
    *out = {axis->x * s, axis->y * s, axis->z * s, static_cast<float>(cos(half))};
    QexQuaternion_Normalize(out);
}

void QexQuaternion_ToAxisAngle(const QexQuaternion* q, QexVec3* axis, float* angle) {
    const double w = Clamped(q->w);
    *angle = static_cast<float>(2 * acos(w));
    float s = static_cast<float>(sqrt(1 - w * w));
    if (s < 0.0005f) s = 1;
    *axis = {q->x / s, q->y / s, q->z / s};
}

void QexQuaternion_ToRotationMatrix(QexMatrix* out, const QexQuaternion* q) {
    const Float4 xyz = {q->x, q->y, q->z, 0}, one = {1, 1, 1, 0};
    const Float4 yzx = Shuffle<1, 2, 0, 3>(xyz), zxy = Shuffle<2, 0, 1, 3>(xyz), twice = zxy + zxy;
    const Float4 diagonal = one - (yzx + yzx) * yzx - twice * zxy;
    const Float4 products = (xyz + xyz) * yzx, turns = twice * q->w;
    const Float4 sums = products + turns, differences = products - turns;
    const Float4 c0 = Shuffle<0, 1, 6, 7>(Shuffle<0, 4, 1, 5>(diagonal, sums), differences);
    const Float4 c1 = Shuffle<0, 3, 5, 7>(Shuffle<0, 4, 1, 5>(differences, diagonal), sums);
    const Float4 c2 = Shuffle<0, 2, 6, 7>(Shuffle<2, 2, 5, 5>(sums, differences), diagonal),
                 c3 = {0, 0, 0, 1};
    Store4(out->m, c0);
    Store4(out->m + 4, c1);
    Store4(out->m + 8, c2);
    Store4(out->m + 12, c3);
}

void QexQuaternion_Slerp(QexQuaternion* out, const QexQuaternion* a, const QexQuaternion* b, float t) {
    // Written so that a NaN is refused too.
    if (!(t >= 0 && t <= 1)) return QexQuaternion_Identity(out);
    float c = a->w * b->w + a->x * b->x + a->y * b->y + a->z * b->z;
    float sign = 1;
    if (c < 0) {
        c = -c;
        sign = -1;
    }
    if (!(c < 1)) {
        *out = *a;
        return;
    }
    // With h = (1 - c) / 2, the angle is 2 sqrt(h) asin(sqrt(h)) / sqrt(h), so its square needs no root. What
    // sin(t * angle) and sin((1 - t) * angle) have in common goes with the normalisation.
    const float h = (1 - c) * 0.5f;
    const float ratio = ArcSineRatio(h);
    const float angle2 = 4 * h * ratio * ratio;
    const float s0 = (1 - t) * SineRatio((1 - t) * (1 - t) * angle2);
    const float s1 = t * SineRatio(t * t * angle2);
    const float sb = sign * s1;
    const Float4 sum = s0 * Load4(&a->x) + sb * Load4(&b->x);
    const Float4 squares = sum * sum;
    const float length2 = (squares[0] + squares[1]) + (squares[2] + squares[3]);
    Store4(&out->x, length2 > 0 ? sum / sqrtf(length2) : sum);
}

void QexMatrix_ToEulerAnglesXYZ(const QexMatrix* m, float* out) {
    const float* e = m->m;
    const double y = -asin(Clamped(e[2]));
    Euler angles = {0, y, 0};
    if (y >= kQexPi / 2) {
        angles.x = -Atan2(e[4], e[5]);
    } else if (y > -kQexPi / 2) {
        angles.x = -Atan2(-e[6], e[10]);
        angles.z = -Atan2(-e[1], e[0]);
    } else {
        angles.x = Atan2(e[4], e[5]);
    }
    out[0] = static_cast<float>(angles.x);
    out[1] = static_cast<float>(angles.y);
    out[2] = static_cast<float>(angles.z);
}

int32_t GetRotationXYZFromRotationMatrix(const QexMatrix* m, float* out1, float* out2) {
    if (!m || !out1 || !out2) return 0;
    const float* e = m->m;
    Euler first, second;
    if (e[2] <= -1) {
        first = second = {Atan2(e[4], e[8]), kQexPi / 2, 0};
    } else if (e[2] >= 1) {
        first = second = {Atan2(-e[4], -e[8]), -kQexPi / 2, 0};
    } else {
        const double y = -asin(static_cast<double>(e[2]));
        first = SolveEuler(e, y);
        second = SolveEuler(e, kQexPi - y);
    }
    const int32_t nearer = SquaredSum(first) < SquaredSum(second) ? 1 : 2;
    StoreDegrees(out1, first);
    StoreDegrees(out2, second);
    return nearer;
}

int32_t GetRotationXYZFromTransformMatrix(const QexMatrix* m, float* out1, float* out2) {
    QexMatrix rotation;
    if (!GetRotationMatrixFromMatrix(m, &rotation)) return 0;
    return GetRotationXYZFromRotationMatrix(&rotation, out1, out2);
}

int32_t GetRotationMatrixFromMatrix(const QexMatrix* m, QexMatrix* out) {
    if (!m || !out) return 0;
    QexMatrix rotation = g_sMatIdentity;
    for (int c = 0; c < 12; c += 4) {
        const float length = ColumnLength(m->m + c);
        for (int r = 0; r < 3; ++r) rotation.m[c + r] = m->m[c + r] / length;
    }
    *out = rotation;
    return 1;
}

int32_t GetScaleFromMatrix(const QexMatrix* m, QexVec3* out) {
    if (!m || !out) return 0;
    *out = {ColumnLength(m->m), ColumnLength(m->m + 4), ColumnLength(m->m + 8)};
    return 1;
}

int32_t GetScaleMatrixFromMatrix(const QexMatrix* m, QexMatrix* out) {
    QexVec3 scale;
    if (!out || !GetScaleFromMatrix(m, &scale)) return 0;
    QexMatrix_Scale(out, scale.x, scale.y, scale.z);
    return 1;
}

int32_t GetTranslationFromMatrix(const QexMatrix* m, QexVec3* out) {
    if (!m || !out) return 0;
    *out = {m->m[12], m->m[13], m->m[14]};
    return 1;
}

int32_t GetTranslationMatrixFromMatrix(const QexMatrix* m, QexMatrix* out) {
    QexVec3 translation;
    if (!out || !GetTranslationFromMatrix(m, &translation)) return 0;
    QexMatrix_Translate(out, translation.x, translation.y, translation.z);
    return 1;
}
