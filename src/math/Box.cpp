// Boxes and axis-aligned boxes: extents, unions, intersections, overlaps.
#include <cfloat>
#include <initializer_list>

#include "Qex/geometry.h"
#include "Qex/math.h"

namespace {

float Min(float a, float b) {
    return a < b ? a : b;
}
float Max(float a, float b) {
    return a > b ? a : b;
}

QexVec3 Min(const QexVec3& a, const QexVec3& b) {
    return {Min(a.x, b.x), Min(a.y, b.y), Min(a.z, b.z)};
}
QexVec3 Max(const QexVec3& a, const QexVec3& b) {
    return {Max(a.x, b.x), Max(a.y, b.y), Max(a.z, b.z)};
}

// While a box is axis-aligned, its extent is in its first corner and those that differ from it along one
// axis.
QexAABB AlignedExtent(const QexBoundingBox& box) {
    return {box.corners[0], {box.corners[4].x, box.corners[2].y, box.corners[1].z}};
}

}  // namespace

void QexBoundingBox_InitAABB(QexAABB* aabb) {
    *aabb = {{FLT_MAX, FLT_MAX, FLT_MAX}, {-FLT_MAX, -FLT_MAX, -FLT_MAX}};
}

void QexBoundingBox_GetAABBNative(const QexBoundingBox* box, QexAABB* aabb) {
    QexBoundingBox_InitAABB(aabb);
    for (const QexVec3& corner : box->corners) {
        aabb->min = Min(aabb->min, corner);
        aabb->max = Max(aabb->max, corner);
    }
}

void QexBoundingBox_GetAABB(const QexBoundingBox* box, QexAABB* aabb) {
    QexBoundingBox_GetAABBNative(box, aabb);
}

void QexBoundingBox_UnionAAABB(QexAABB* out, const QexAABB* a, const QexAABB* b) {
    *out = {Min(a->min, b->min), Max(a->max, b->max)};
}

void QexBoundingBox_IntersectionAABB(QexAABB* out, const QexAABB* a, const QexAABB* b) {
    *out = {Max(a->min, b->min), Min(a->max, b->max)};
}

int32_t QexBoundingBox_isAABBIntersectedXY(const QexAABB* a, const QexAABB* b) {
    QexAABB common;
    QexBoundingBox_IntersectionAABB(&common, a, b);
    return common.max.x > common.min.x && common.max.y > common.min.y;
}

void QexBoundingBox_TransformBoundingBoxNative(const QexMatrix* matrix, const QexBoundingBox* in,
                                               QexBoundingBox* out) {
    for (int i = 0; i < 8; ++i) QexMatrix_TransformHomoVec3(matrix, &in->corners[i], &out->corners[i], 1);
}

void QexBoundingBox_TransformBoundingBox(const QexMatrix* matrix, const QexBoundingBox* in,
                                         QexBoundingBox* out) {
    QexBoundingBox_TransformBoundingBoxNative(matrix, in, out);
}

int32_t QexBoundingBox_TestBBoxBBox(const QexBoundingBox* a, const QexBoundingBox* b, QexVec3* overlap) {
    const QexAABB boxA = AlignedExtent(*a), boxB = AlignedExtent(*b);
    QexVec3 ignored;
    QexVec3* const common = overlap ? overlap : &ignored;
    *common = {0, 0, 0};
    for (float QexVec3::*axis : {&QexVec3::x, &QexVec3::y, &QexVec3::z}) {
        if (boxA.min.*axis > boxB.max.*axis || boxA.max.*axis < boxB.min.*axis) return 0;
        common->*axis = boxA.max.*axis - boxB.min.*axis;
    }
    return 1;
}

int32_t QexBoundingBox_IsVisibleFromZAxis(const QexBoundingBox* box, const QexMatrix* matrix,
                                          int32_t* partial) {
    int left = 0, right = 0, below = 0, above = 0, before = 0;
    for (const QexVec3& corner : box->corners) {
        QexVec4 p = {corner.x, corner.y, corner.z, 1};
        QexMatrix_TransformVec4(matrix, &p, &p);
        // Behind the eye, where w < 0, a corner can be beyond both sides of a pair; it counts for the first.
        if (p.x < -p.w)
            ++left;
        else if (p.x > p.w)
            ++right;
        if (p.y < -p.w)
            ++below;
        else if (p.y > p.w)
            ++above;
        if (p.z < 0) ++before;
    }
    const bool visible = left < 8 && right < 8 && below < 8 && above < 8 && before < 8;
    *partial = visible && before > 0;
    return visible;
}
