// 3x3 and 4x4 matrices: what every node of every frame goes through.
#include <cmath>
#include <cstring>

#include "math/Float4.h"
#include "math/Pi.h"
#include "Qex/base.h"
#include "Qex/math.h"

const QexMatrix g_sMatIdentity = {{1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}};

namespace {

// m * (x, y, z, w) as the sum of the scaled columns.
Float4 Combine(const QexMatrix* m, float x, float y, float z, float w) {
    return Load4(m->m) * x + Load4(m->m + 4) * y + Load4(m->m + 8) * z + Load4(m->m + 12) * w;
}

struct SinCos {
    float sin, cos;
};

SinCos SinCosDegrees(float degrees) {
    const double radians = degrees * kQexPi / 180;
    return {static_cast<float>(sin(radians)), static_cast<float>(cos(radians))};
}

struct StridedVectors {
    const char* in;
    char* out;
    uint32_t count, stride;
};

template <class Transform>
void ForEachVector(const StridedVectors& vectors, Transform transform) {
    for (uint32_t i = 0; i < vectors.count; ++i) {
        const size_t offset = size_t{i} * vectors.stride;
        QexVec3 v;
        memcpy(&v, vectors.in + offset, sizeof v);
        transform(&v);
        memcpy(vectors.out + offset, &v, sizeof v);
    }
}

}  // namespace

QexMatrix* QexMatrix_Identity(QexMatrix* out) {
    *out = g_sMatIdentity;
    return out;
}

QexMatrix* QexMatrix_Translate(QexMatrix* out, float x, float y, float z) {
    *out = {{1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, x, y, z, 1}};
    return out;
}

QexMatrix* QexMatrix_Scale(QexMatrix* out, float x, float y, float z) {
    *out = {{x, 0, 0, 0, 0, y, 0, 0, 0, 0, z, 0, 0, 0, 0, 1}};
    return out;
}

QexMatrix* QexMatrixRotateX(QexMatrix* out, float degrees) {
    const auto [s, c] = SinCosDegrees(degrees);
    *out = {{1, 0, 0, 0, 0, c, s, 0, 0, -s, c, 0, 0, 0, 0, 1}};
    return out;
}

QexMatrix* QexMatrix_RotateY(QexMatrix* out, float degrees) {
    const auto [s, c] = SinCosDegrees(degrees);
    *out = {{c, 0, -s, 0, 0, 1, 0, 0, s, 0, c, 0, 0, 0, 0, 1}};
    return out;
}

QexMatrix* QexMatrixRotateZ(QexMatrix* out, float degrees) {
    const auto [s, c] = SinCosDegrees(degrees);
    *out = {{c, s, 0, 0, -s, c, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}};
    return out;
}

QexMatrix* QexMatrix_RotateXYZ(QexMatrix* out, float x, float y, float z) {
    QexMatrix rotateX, rotateY, rotateZ;
    QexMatrixRotateX(&rotateX, x);
    QexMatrix_RotateY(&rotateY, y);
    QexMatrixRotateZ(&rotateZ, z);
    QexMatrix_Multiply(out, &rotateY, &rotateX);
    QexMatrix_Multiply(out, &rotateZ, out);
    return out;
}

QexMatrix* QexMatrix_RotateAngelAxis(QexMatrix* out, float degrees, float x, float y, float z) {
    const auto [s, c] = SinCosDegrees(degrees);
    const float scale = static_cast<float>(1 / sqrt(static_cast<double>(x * x + y * y + z * z)));
    x *= scale;
    y *= scale;
    z *= scale;
    const float k = 1 - c;
    // clang-format off
    *out = {{k * x * x + c,     k * y * x + s * z, k * z * x - s * y, 0,
             k * x * y - s * z, k * y * y + c,     k * z * y + s * x, 0,
             k * x * z + s * y, k * y * z - s * x, k * z * z + c,     0,
             0,                 0,                 0,                 1}};
    // clang-format on
    return out;
}

void QexMatrix_Multiply(QexMatrix* out, const QexMatrix* a, const QexMatrix* b) {
    const Float4x4 left = Load4x4(a->m);
    // A column of the product needs the same column of b only, so out may be b.
    for (int c = 0; c < 16; c += 4) Store4(out->m + c, Transform(left, Load4(b->m + c)));
}

void QexMatrix_Transpose(QexMatrix* m) {
    const QexMatrix t = *m;
    for (int c = 0; c < 4; ++c)
        for (int r = 0; r < 4; ++r) m->m[4 * c + r] = t.m[4 * r + c];
}

QexMatrix* QexMatrix_Inverse(QexMatrix* out, const QexMatrix* m) {
    // Nothing depends on the fourth lanes.
    const Float4 a = Load4(m->m), b = Load4(m->m + 4), c = Load4(m->m + 8), t = Load4(m->m + 12);

    // The six products of the determinant, two each of x, y and z of all axes; the second one's sign is
    // opposite in z alone. In double those of a singular matrix cancel to within their last bits; the sum of
    // their magnitudes is the scale that the determinant is judged by.
    const Double2 aXY = Widen(a), bXY = Widen(b), cXY = Widen(c);
    const Double2 bYX = {bXY[1], bXY[0]}, cYX = {cXY[1], cXY[0]};
    const Double2 ofC = aXY * bYX * Widen(Splat<2>(c)), ofB = aXY * cYX * Widen(Splat<2>(b));
    const Double2 ofA = bXY * cYX * Widen(Splat<2>(a));
    const Double2 difference = ofC - ofB, scales = Magnitude(ofC) + Magnitude(ofB) + Magnitude(ofA);
    const double determinant = (difference[0] - difference[1]) + (ofA[0] - ofA[1]);
    if (fabs(determinant) <= 1e-15 * (scales[0] + scales[1])) return nullptr;

    // The rows of the inverse are the cross products of the axes, here as z, x, y. They are scaled last, as
    // the division takes longest.
    const Float4 aYZX = Shuffle<1, 2, 0, 3>(a), bYZX = Shuffle<1, 2, 0, 3>(b), cYZX = Shuffle<1, 2, 0, 3>(c);
    const Float4 row0 = b * cYZX - bYZX * c, row1 = c * aYZX - cYZX * a,
                 row2 = FirstThree(a * bYZX - aYZX * b);
    const Float4 low = Shuffle<0, 4, 1, 5>(row0, row1), high = Shuffle<2, 6, 3, 7>(row0, row1);
    const float scale = static_cast<float>(1 / determinant);
    const Float4 inverse = FirstThree(Float4{scale, scale, scale, scale}), origin = {0, 0, 0, 1};
    const Float4 x = Shuffle<2, 3, 5, 7>(low, row2) * inverse, y = Shuffle<0, 1, 6, 7>(high, row2) * inverse;
    const Float4 z = Shuffle<0, 1, 4, 7>(low, row2) * inverse;
    Store4x4(out->m, {x, y, z, origin - Combine3(x, y, z, t)});
    return out;
}

void QexMatrix3_ConstructorFromMatrix(QexMatrix3* out, const QexMatrix* m) {
    const float* s = m->m;
    *out = {{s[0], s[1], s[2], s[4], s[5], s[6], s[8], s[9], s[10]}};
}

void QexMatrix3_Transpose(QexMatrix3* out, const QexMatrix3* m) {
    const float* s = m->m;
    *out = {{s[0], s[3], s[6], s[1], s[4], s[7], s[2], s[5], s[8]}};
}

QexMatrix3* QexMatrix3_Inverse(QexMatrix3* out, const QexMatrix3* m) {
    const float* s = m->m;
    const float c0 = s[4] * s[8] - s[7] * s[5];
    const float c1 = s[1] * s[8] - s[7] * s[2];
    const float c2 = s[1] * s[5] - s[4] * s[2];
    const float inverse = 1 / (s[0] * c0 - s[3] * c1 + s[6] * c2);
    *out = {{c0 * inverse, -c1 * inverse, c2 * inverse,  //
             -(s[3] * s[8] - s[6] * s[5]) * inverse, (s[0] * s[8] - s[6] * s[2]) * inverse,
             -(s[0] * s[5] - s[3] * s[2]) * inverse,  //
             (s[3] * s[7] - s[6] * s[4]) * inverse, -(s[0] * s[7] - s[6] * s[1]) * inverse,
             (s[0] * s[4] - s[3] * s[1]) * inverse}};
    return out;
}

void QexMatrix_TransformVec4(const QexMatrix* m, const QexVec4* v, QexVec4* out) {
    const Float4 product = Combine(m, v->x, v->y, v->z, v->w);
    *out = {product[0], product[1], product[2], product[3]};
}

void QexMatrix_TransformVec4Raw(const QexMatrix* m, const QexVec4* v, QexVec4* out) {
    const QexVec4 p = *v;
    float result[4];
    for (int i = 0; i < 4; ++i) {
        const float* column = m->m + 4 * i;
        result[i] = column[0] * p.x + column[1] * p.y + column[2] * p.z + column[3] * p.w;
    }
    *out = {result[0], result[1], result[2], result[3]};
}

void QexMatrix_TransformVec3(const QexMatrix3* m, const QexVec3* v, QexVec3* out) {
    const float* s = m->m;
    const QexVec3 p = *v;
    *out = {s[0] * p.x + s[3] * p.y + s[6] * p.z, s[1] * p.x + s[4] * p.y + s[7] * p.z,
            s[2] * p.x + s[5] * p.y + s[8] * p.z};
}

void QexMatrix_TransformHomoVec3(const QexMatrix* m, const QexVec3* v, QexVec3* out, float w) {
    const Float4 product = Combine(m, v->x, v->y, v->z, w);
    *out = {product[0] / product[3], product[1] / product[3], product[2] / product[3]};
}

void QexMatrix_TransformVec3Array(const QexMatrix* m, const void* in, void* out, float w, uint32_t count,
                                  uint32_t stride) {
    const StridedVectors vectors = {static_cast<const char*>(in), static_cast<char*>(out), count, stride};
    ForEachVector(vectors, [m, w](QexVec3* v) {
        const Float4 product = Combine(m, v->x, v->y, v->z, w);
        *v = {product[0], product[1], product[2]};
    });
}

void QexMatrix_TransformHomoVec3Array(const QexMatrix* m, const void* in, void* out, float /*ignored*/,
                                      uint32_t count, uint32_t stride) {
    const StridedVectors vectors = {static_cast<const char*>(in), static_cast<char*>(out), count, stride};
    ForEachVector(vectors, [m](QexVec3* v) { QexMatrix_TransformHomoVec3(m, v, v, 1); });
}
