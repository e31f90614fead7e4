// Quaternions, Euler angles, decomposition.
#include <cmath>

#include "math/Pi.h"
#include "math/Rotation.h"
#include "Qex/math.h"

namespace {

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
    Store4x4(out->m, QexRotation_Matrix(Load4(&q->x)));
}

void QexQuaternion_Slerp(QexQuaternion* out, const QexQuaternion* a, const QexQuaternion* b, float t) {
    Store4(&out->x, QexRotation_Slerp(Load4(&a->x), Load4(&b->x), t));
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
