// Vectors of two, three and four floats.
#include <cmath>

#include "Qex/math.h"

void QexVec2_Set(QexVec2* out, float x, float y) {
    *out = {x, y};
}

void QexVec3_Set(QexVec3* out, float x, float y, float z) {
    *out = {x, y, z};
}

void QexVec4_Set(QexVec4* out, float x, float y, float z, float w) {
    *out = {x, y, z, w};
}

void QexVec3_Add(QexVec3* out, const QexVec3* a, const QexVec3* b) {
    *out = {a->x + b->x, a->y + b->y, a->z + b->z};
}

void QexVec3_Subtract(QexVec3* out, const QexVec3* a, const QexVec3* b) {
    *out = {a->x - b->x, a->y - b->y, a->z - b->z};
}

QexVec3* QexVec3_Scale(QexVec3* out, const QexVec3* a, float s) {
    *out = {a->x * s, a->y * s, a->z * s};
    return out;
}

void QexVec3_Lerp(QexVec3* out, const QexVec3* a, const QexVec3* b, float t) {
    *out = {a->x + (b->x - a->x) * t, a->y + (b->y - a->y) * t, a->z + (b->z - a->z) * t};
}

float QexVec3_DotProduct(const QexVec3* a, const QexVec3* b) {
    return a->x * b->x + a->y * b->y + a->z * b->z;
}

float QexVec4_DotProduct(const QexVec4* a, const QexVec4* b) {
    return a->x * b->x + a->y * b->y + a->z * b->z + a->w * b->w;
}

void QexVec3_CrossProduct(QexVec3* out, const QexVec3* a, const QexVec3* b) {
    *out = {a->y * b->z - a->z * b->y, a->z * b->x - a->x * b->z, a->x * b->y - a->y * b->x};
}

QexVec3* QexVec3_Normalize(QexVec3* out, const QexVec3* a) {
    const double length = sqrt(static_cast<double>(QexVec3_DotProduct(a, a)));
    return QexVec3_Scale(out, a, length > 0 ? static_cast<float>(1 / length) : 0.0f);
}

void QexMatrix_GetPerpendicularVector(QexVec3* out, const QexVec3* v) {
    if (v->x == 0 && v->y == 0)
        *out = {1, 0, 0};
    else
        *out = {v->y, -v->x, 0};
}
