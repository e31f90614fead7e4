/* Boxes, planes, equations, random numbers, the camera. */
#ifndef QEX_GEOMETRY_H
#define QEX_GEOMETRY_H

#include "Qex/base.h"
#include "Qex/math.h"

QEX_BEGIN

/* ======================================================================================================
 * Math: boxes, planes, equations, random numbers
 *
 * No pointer may be null except where a function says so. No GL context needed on this page.
 * ====================================================================================================== */

/** A box by its corners. QexBoundingBox_ComputeInterleaved builds one from vertices. */
typedef struct QexBoundingBox {
    QexVec3 corners[8]; /* with 0 for the minimum and 1 for the maximum of x, y, z: 000, 001, 010, 011, 100,
                           101, 110, 111; a transform moves the corners and keeps their order */
    QexVec3 centre;     /* centre of the axis-aligned box */
    QexVec3 halfExtent; /* half sizes along x, y, z */
    float reserved[3];  /* not used */
} QexBoundingBox;

/** An axis-aligned box. It is empty when a minimum is greater than its maximum. */
typedef struct QexAABB {
    QexVec3 min; /* smallest coordinates */
    QexVec3 max; /* largest coordinates */
} QexAABB;

/** aabb = the empty box (minimum FLT_MAX, maximum -FLT_MAX), which any union replaces. */
QEX_API void QexBoundingBox_InitAABB(QexAABB* aabb);

/** aabb = the axis-aligned box around the eight corners. */
QEX_API void QexBoundingBox_GetAABBNative(const QexBoundingBox* box, QexAABB* aabb);

/** The same as QexBoundingBox_GetAABBNative. */
QEX_API void QexBoundingBox_GetAABB(const QexBoundingBox* box, QexAABB* aabb);

/** out = the smallest box around a and b. out may be a or b. */
QEX_API void QexBoundingBox_UnionAAABB(QexAABB* out, const QexAABB* a, const QexAABB* b);

/** out = what a and b have in common, empty when nothing. out may be a or b. */
QEX_API void QexBoundingBox_IntersectionAABB(QexAABB* out, const QexAABB* a, const QexAABB* b);

/** @return 1 when a and b overlap by more than an edge in x and y, else 0; z does not count. */
QEX_API int32_t QexBoundingBox_isAABBIntersectedXY(const QexAABB* a, const QexAABB* b);

/** Transforms the corners as points, with division by w. Centre and half extents of out are left alone.
 *  @param matrix  transform
 *  @param in      box
 *  @param out     out; may be in */
QEX_API void QexBoundingBox_TransformBoundingBoxNative(const QexMatrix* matrix, const QexBoundingBox* in,
                                                       QexBoundingBox* out);

/** The same as QexBoundingBox_TransformBoundingBoxNative. */
QEX_API void QexBoundingBox_TransformBoundingBox(const QexMatrix* matrix, const QexBoundingBox* in,
                                                 QexBoundingBox* out);

/** Tests two boxes with corners in axis-aligned order; boxes that touch overlap.
 *  @param a        box
 *  @param b        box
 *  @param overlap  out, a's maximum less b's minimum along each axis up to the first that separates them, 0
 *                  from there on; may be null
 *  @return 1 when they overlap along all three axes, else 0. */
QEX_API int32_t QexBoundingBox_TestBBoxBBox(const QexBoundingBox* a, const QexBoundingBox* b,
                                            QexVec3* overlap);

/** Tests a box against a camera's view volume. The far plane does not count.
 *  @param box      box
 *  @param matrix   from the box's space to clip space, depth 0..1 (projection * view * model)
 *  @param partial  out, 1 when the box is visible and reaches over the near plane, else 0
 *  @return 0 when all eight corners lie outside one side plane or before the near plane, else 1. */
QEX_API int32_t QexBoundingBox_IsVisibleFromZAxis(const QexBoundingBox* box, const QexMatrix* matrix,
                                                  int32_t* partial);

/** out = the point where a line meets a plane. A parallel line gives infinities or NaNs.
 *  @param plane  plane (a, b, c, d)
 *  @param p0     point of the line; p1 another */
QEX_API void QexMath_CalcIntersectionLinePlane(QexVec3* out, const QexVec4* plane, const QexVec3* p0,
                                               const QexVec3* p1);

/** The part of an infinite plane that a camera sees from above, as a convex polygon. The view volume's far
 *  corners are scaled by farPlane about the origin: that is exact for a projection with w = -z, such as
 *  QexMatrix_Perspective's times its farPlane. For QexMatrix_Perspective's own, 1 is exact; the far distance
 *  gives a polygon that reaches further and strays from the picture by up to the eye's distance from the
 *  origin.
 *  @param out       out, room for 5 vertices of three floats each, of any alignment
 *  @param stride    bytes from one vertex to the next, 12 for consecutive ones
 *  @param plane     plane (a, b, c, d), unit normal
 *  @param matrix    inverse of projection * view
 *  @param eye       position of the camera
 *  @param farPlane  scale of the far corners
 *  @return the number of vertices, 0 to 5; 0 when the eye is below the plane. */
QEX_API int32_t QexMath_CalculateInfinitePlane(void* out, int32_t stride, const QexVec4* plane,
                                               const QexMatrix* matrix, const QexVec3* eye, float farPlane);

/** Solves n linear equations by elimination. A singular system gives infinities or NaNs.
 *  @param result  out, the n unknowns
 *  @param rows    n rows of n + 1 floats: the right side, then the coefficients; they are changed
 *  @param n       number of equations; below 1 nothing happens */
QEX_API void QexMath_LinearEqSolve(float* result, float** rows, int32_t n);

#ifdef QEX_UNPREFIXED_NAMES
/** A random number. The first call seeds the C library's lrand48 generator with the time.
 *  @return 0 to 2147483647. */
QEX_API int32_t GetRandomNumber(void);

/** @return a random number, 0 <= f < 1. */
QEX_API float GetRandomFloat(void);

/** @return min + (max - min) * GetRandomFloat(). */
QEX_API float GetRandomFloatByRange(float min, float max);

/** A random integer: (max - min + 1) * GetRandomFloat() + min in single precision, cut towards 0.
 *  @param min  smallest result, >= 0 for an even spread; for a negative one the cut moves every result
 *              below 0 up by one, so that min hardly ever comes
 *  @param max  largest result, >= min
 *  @return min to max; up to max + 1 when max is negative. */
QEX_API int32_t GetRandomInt(int32_t min, int32_t max);
#endif

/* ======================================================================================================
 * Math: camera
 *
 * A camera is the caller's record: set it with QexCamera_LookAt and QexCamera_Project, in any order. It owns
 * nothing. The renderer reads eye, viewMatrix and projectionMatrix. No GL context needed on this page.
 * ====================================================================================================== */

/** A camera. */
typedef struct QexCamera {
    int32_t tag;                /* the application's own, not read by the engine */
    QexVec3 eye;                /* position, world space */
    QexVec3 target;             /* point looked at, world space */
    QexVec3 up;                 /* up direction, (0, 1.0001, 0) by default */
    float fov;                  /* field of view across the width, radians */
    float nearPlane;            /* distance of the near plane, > 0 */
    float farPlane;             /* distance of the far plane, > nearPlane */
    float aspect;               /* width / height */
    QexMatrix viewMatrix;       /* world to camera space */
    QexMatrix projectionMatrix; /* camera to clip space, depth 0..1 */
    QexMatrix modelViewMatrix;  /* of the last QexCamera_BuildMVPMatrix */
} QexCamera;

/** Clears a camera.
 *  @param camera  out; all fields 0 except the tag
 *  @param tag     stored for the application
 *  @return always 0. */
QEX_API int32_t QexCamera_Create(QexCamera* camera, int32_t tag);

/** Clears a camera, its tag included. Nothing is freed.
 *  @param camera  camera */
QEX_API void QexCamera_Release(QexCamera* camera);

/** Places a camera and rebuilds its view matrix.
 *  @param camera  camera
 *  @param eye     position, or null to keep the stored one
 *  @param target  point looked at, or null to keep the stored one
 *  @param up      up direction, or null for the default (0, 1.0001, 0) */
QEX_API void QexCamera_LookAt(QexCamera* camera, const QexVec3* eye, const QexVec3* target,
                              const QexVec3* up);

/** Stores the projection parameters and rebuilds the projection matrix (QexMatrix_Perspective).
 *  @param camera     camera
 *  @param fov        field of view across the width, radians
 *  @param aspect     width / height
 *  @param nearPlane  distance of the near plane, > 0
 *  @param farPlane   distance of the far plane, > nearPlane
 *  @return the camera's projection matrix, which stays the camera's. */
QEX_API QexMatrix* QexCamera_Project(QexCamera* camera, float fov, float aspect, float nearPlane,
                                     float farPlane);

/** Joins a model matrix with a camera; modelViewMatrix becomes view * model.
 *  @param camera  camera
 *  @param out     out, projection * view * model; may be model
 *  @param model   model matrix */
QEX_API void QexCamera_BuildMVPMatrix(QexCamera* camera, QexMatrix* out, const QexMatrix* model);

/** The eight corners of a view volume in camera space, wider than the projection's: half its width at
 *  distance 1 is tan(fov), half its height tan(fov) * aspect. Shadow maps are fitted to it.
 *  @param camera  camera
 *  @param out     out, 8 corners: near (+x +y), (-x +y), (-x -y), (+x -y), then far in the same order */
QEX_API void QexCamera_GetFrustumVerticesInObjectSpace(const QexCamera* camera, QexVec3* out);

QEX_END

#endif
