/* Vectors, matrices, scalars, rotations. */
#ifndef QEX_MATH_H
#define QEX_MATH_H

#include "Qex/base.h"

QEX_BEGIN

/* ======================================================================================================
 * Math: vectors, matrices, scalars
 *
 * Plain functions over the caller's records; nothing allocates. The output comes first, except in the
 * transforms and the reflection, where it comes last. No pointer may be null. Inputs are not changed, and an
 * output may be an input as well unless a function says otherwise. Functions with a pointer result return
 * their output. Input that has no answer (near = far, an axis of length 0, ...) gives zeros, infinities or
 * NaNs, never a crash. No GL context needed on this page.
 * ====================================================================================================== */

/** Two floats. */
typedef struct QexVec2 {
    float x, y; /* components */
} QexVec2;

/** Three floats: a point, a direction, a colour. */
typedef struct QexVec3 {
    float x, y, z; /* components */
} QexVec3;

/** Four floats. A plane a * x + b * y + c * z + d = 0 is the four floats (a, b, c, d), (a, b, c) of unit
 *  length. */
typedef struct QexVec4 {
    float x, y, z, w; /* components */
} QexVec4;

/** A 3x3 matrix, column-major. */
typedef struct QexMatrix3 {
    float m[9]; /* element (row r, column c) at 3 * c + r */
} QexMatrix3;

/** A 4x4 matrix, column-major, as GL takes it without transposing. Columns 0 to 2 are the transformed axes,
 *  elements 12 to 14 the translation. */
typedef struct QexMatrix {
    float m[16]; /* element (row r, column c) at 4 * c + r */
} QexMatrix;

/** The identity matrix. */
QEX_API extern const QexMatrix g_sMatIdentity;

/** out = (x, y). */
QEX_API void QexVec2_Set(QexVec2* out, float x, float y);

/** out = (x, y, z). */
QEX_API void QexVec3_Set(QexVec3* out, float x, float y, float z);

/** out = (x, y, z, w). */
QEX_API void QexVec4_Set(QexVec4* out, float x, float y, float z, float w);

/** out = a + b. */
QEX_API void QexVec3_Add(QexVec3* out, const QexVec3* a, const QexVec3* b);

/** out = a - b. */
QEX_API void QexVec3_Subtract(QexVec3* out, const QexVec3* a, const QexVec3* b);

/** out = a * s.
 *  @return out. */
QEX_API QexVec3* QexVec3_Scale(QexVec3* out, const QexVec3* a, float s);

/** out = a + (b - a) * t, with t not clamped. */
QEX_API void QexVec3_Lerp(QexVec3* out, const QexVec3* a, const QexVec3* b, float t);

/** @return the dot product of two vectors. */
QEX_API float QexVec3_DotProduct(const QexVec3* a, const QexVec3* b);

/** @return the dot product of two vectors, over four components. */
QEX_API float QexVec4_DotProduct(const QexVec4* a, const QexVec4* b);

/** out = a x b, right-handed. */
QEX_API void QexVec3_CrossProduct(QexVec3* out, const QexVec3* a, const QexVec3* b);

/** out = a at unit length. A vector of length 0 gives (0, 0, 0). Lengths from 1e-19 to 1e19 are good,
 *  others are off or give (0, 0, 0) as well.
 *  @return out. */
QEX_API QexVec3* QexVec3_Normalize(QexVec3* out, const QexVec3* a);

/** out = the identity.
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Identity(QexMatrix* out);

/** out = the translation by (x, y, z).
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Translate(QexMatrix* out, float x, float y, float z);

/** out = the scaling by (x, y, z) about the origin.
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Scale(QexMatrix* out, float x, float y, float z);

/** out = the rotation about +X, counter-clockwise seen from +X.
 *  @param degrees  angle in degrees
 *  @return out. */
QEX_API QexMatrix* QexMatrixRotateX(QexMatrix* out, float degrees);

/** out = the rotation about +Y, counter-clockwise seen from +Y.
 *  @param degrees  angle in degrees
 *  @return out. */
QEX_API QexMatrix* QexMatrix_RotateY(QexMatrix* out, float degrees);

/** out = the rotation about +Z, counter-clockwise seen from +Z.
 *  @param degrees  angle in degrees
 *  @return out. */
QEX_API QexMatrix* QexMatrixRotateZ(QexMatrix* out, float degrees);

/** out = Rz(z) * Ry(y) * Rx(x): the rotation about X is applied first.
 *  @param x  angle about X in degrees; y and z likewise
 *  @return out. */
QEX_API QexMatrix* QexMatrix_RotateXYZ(QexMatrix* out, float x, float y, float z);

/** out = the rotation about an axis, counter-clockwise seen from the axis' tip.
 *  @param degrees  angle in degrees
 *  @param x        axis, of any length but 0; y and z likewise
 *  @return out. */
QEX_API QexMatrix* QexMatrix_RotateAngelAxis(QexMatrix* out, float degrees, float x, float y, float z);

/** out = the right-handed perspective projection to depth 0 (near plane) .. 1 (far plane), divided by
 *  farPlane throughout, which leaves projected points where they are.
 *  @param fov        field of view across the width, in radians
 *  @param aspect     width / height: the vertical scale is the horizontal one times this
 *  @param nearPlane  distance of the near plane, > 0
 *  @param farPlane   distance of the far plane, > nearPlane
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Perspective(QexMatrix* out, float fov, float aspect, float nearPlane,
                                         float farPlane);

/** out = the orthographic projection of a box to -1 .. 1 along each axis. Z keeps its direction: nearPlane
 *  and farPlane are the z coordinates that map to -1 and 1.
 *  @param left  x that maps to -1; right maps to 1. bottom and top likewise for y
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Orthographic(QexMatrix* out, float left, float right, float bottom, float top,
                                          float nearPlane, float farPlane);

/** out = the rotation into the space of a viewer at the origin, which looks down -Z with +Y up.
 *  @param direction  viewing direction, of any length but 0
 *  @param up         up direction, not parallel to direction
 *  @return out. */
QEX_API QexMatrix* QexMatrix_LookUp(QexMatrix* out, const QexVec3* direction, const QexVec3* up);

/** out = the right-handed view matrix of a camera, which looks down its -Z with +Y up.
 *  @param eye     position of the camera
 *  @param target  point looked at, not the eye
 *  @param up      up direction, not parallel to the viewing direction
 *  @return out. */
QEX_API QexMatrix* QexMatrix_LookAtRH(QexMatrix* out, const QexVec3* eye, const QexVec3* target,
                                      const QexVec3* up);

/** out = the mirror through a plane. A normal and its opposite give the same mirror.
 *  @param planePoint   a point on the plane
 *  @param planeNormal  normal of the plane, of any length but 0
 *  @return out. */
QEX_API QexMatrix* QexMatrix_CreateReflectionMatrix(const QexVec3* planePoint, const QexVec3* planeNormal,
                                                    QexMatrix* out);

/** out = the rotation that turns one direction onto another, about the axis perpendicular to both. The
 *  identity when they are less than 0.01 radians apart; opposite directions turn by half a circle about an
 *  axis perpendicular to them.
 *  @param from  direction, of any length but 0
 *  @param to    direction, of any length but 0
 *  @return out. */
QEX_API QexMatrix* QexMatrix_GetRotation(QexMatrix* out, const QexVec3* from, const QexVec3* to);

/** out = a * b: b is applied first. out may be a or b. */
QEX_API void QexMatrix_Multiply(QexMatrix* out, const QexMatrix* a, const QexMatrix* b);

/** Transposes m in place. */
QEX_API void QexMatrix_Transpose(QexMatrix* m);

/** out = the inverse of an affine matrix, one whose bottom row is (0, 0, 0, 1). out may be m.
 *  @return out, or null when m is singular: out is not written. */
QEX_API QexMatrix* QexMatrix_Inverse(QexMatrix* out, const QexMatrix* m);

/** out = the inverse of any matrix, by elimination. A singular matrix gives infinities or NaNs. out may be m.
 *  @return out. */
QEX_API QexMatrix* QexMatrix_InverseEx(QexMatrix* out, const QexMatrix* m);

/** out = the upper left 3x3 of m. */
QEX_API void QexMatrix3_ConstructorFromMatrix(QexMatrix3* out, const QexMatrix* m);

/** out = the transpose of m. */
QEX_API void QexMatrix3_Transpose(QexMatrix3* out, const QexMatrix3* m);

/** out = the inverse of m. A singular matrix gives infinities or NaNs. out may be m.
 *  @return out. */
QEX_API QexMatrix3* QexMatrix3_Inverse(QexMatrix3* out, const QexMatrix3* m);

/** out = (v.y, -v.x, 0), which is perpendicular to v; (1, 0, 0) when v.x and v.y are 0. Not normalised. */
QEX_API void QexMatrix_GetPerpendicularVector(QexVec3* out, const QexVec3* v);

/** Prints m with QexSystem_Printf, row by row, the translation in the last column. */
QEX_API void QexMatrixPrint(const QexMatrix* m);

/** out = m * v. out may be v. */
QEX_API void QexMatrix_TransformVec4(const QexMatrix* m, const QexVec4* v, QexVec4* out);

/** out = transpose(m) * v, which carries a plane v through the inverse of m. out may be v. */
QEX_API void QexMatrix_TransformVec4Raw(const QexMatrix* m, const QexVec4* v, QexVec4* out);

/** out = m * v with a 3x3 matrix, for directions and normals. out may be v. */
QEX_API void QexMatrix_TransformVec3(const QexMatrix3* m, const QexVec3* v, QexVec3* out);

/** out = m * (v, w), divided by the w of the product. out may be v.
 *  @param w  fourth component of the input: 1 for points */
QEX_API void QexMatrix_TransformHomoVec3(const QexMatrix* m, const QexVec3* v, QexVec3* out, float w);

/** Transforms an array, without division: each out = the first three components of m * (in, w).
 *  @param in      count times three floats, stride bytes apart, of any alignment
 *  @param out     likewise; may be in
 *  @param w       fourth component of every input: 1 for points, 0 for directions
 *  @param count   number of vectors; 0 does nothing
 *  @param stride  bytes from one vector to the next, in both arrays */
QEX_API void QexMatrix_TransformVec3Array(const QexMatrix* m, const void* in, void* out, float w,
                                          uint32_t count, uint32_t stride);

/** Transforms an array of points: each out = m * (in, 1), divided by the w of the product.
 *  @param in       count times three floats, stride bytes apart, of any alignment
 *  @param out      likewise; may be in
 *  @param ignored  not used
 *  @param count    number of vectors; 0 does nothing
 *  @param stride   bytes from one vector to the next, in both arrays */
QEX_API void QexMatrix_TransformHomoVec3Array(const QexMatrix* m, const void* in, void* out, float ignored,
                                              uint32_t count, uint32_t stride);

/** @return 1 when a > 1e-7, -1 when a < -1e-7, else 0. */
QEX_API float Qex_Sign(float a);

/** Square root by Newton's iteration, to 1e-6 for a below 1, to 1e-7 of the root above.
 *  @return the root; 0 when a <= 0; infinity and NaN as they are. */
QEX_API float Qex_Sqrt(float a);

/** Arc tangent by a short series, to 1.4e-5.
 *  @param t  tangent, >= 0
 *  @return the angle in radians, 0 to pi/2. */
QEX_API float Qex_ArcTan(float t);

/** Angle of the point (x, y) by a short series, to 1.3e-6.
 *  @return the angle in radians: 0 to 2 pi when x is not 0; for x = 0, pi/2, -pi/2 or 0 by the sign of y.
 *          Points on the negative X axis (x < 0, y = 0) give 0. */
QEX_API float Qex_ArcTan2(float x, float y);

/** Arc sine by Qex_ArcTan.
 *  @param a  sine, 0 to 1
 *  @return the angle in radians, 0 to pi/2. */
QEX_API float Qex_ArcSin(float a);

/** Arc cosine by Qex_ArcTan.
 *  @param a  cosine, 0 to 1
 *  @return the angle in radians, 0 to pi/2. */
QEX_API float Qex_ArcCos(float a);

/** @return v clamped to the range between a and b, which may come in either order. */
QEX_API float QexMath_ClampFloat(float v, float a, float b);

#ifdef QEX_UNPREFIXED_NAMES
/** @return 1 when n is a power of two, else 0; 0 for 0. */
QEX_API uint32_t util_number_is_power_2(uint32_t n);
#endif

/** @return 1 when the host stores integers little-endian, else 0. */
QEX_API int32_t QexIsLittleEndian(void);

/* ======================================================================================================
 * Math: rotations and decomposition
 *
 * Quaternions and Euler angles. No pointer may be null except where a function says so. No GL context
 * needed on this page.
 * ====================================================================================================== */

/** A quaternion. The rotation by an angle about a unit axis is (axis * sin(angle / 2), cos(angle / 2)). */
typedef struct QexQuaternion {
    float x, y, z, w; /* vector part, then the scalar part */
} QexQuaternion;

/** q = (0, 0, 0, 1), no rotation. */
QEX_API void QexQuaternion_Identity(QexQuaternion* q);

/** Brings q to unit length, in place. A quaternion of length 0 stays as it is. */
QEX_API void QexQuaternion_Normalize(QexQuaternion* q);

/** out = a * b, normalised: the rotation b is applied first. out may be a or b. */
QEX_API void QexQuaternion_Multiply(QexQuaternion* out, const QexQuaternion* a, const QexQuaternion* b);

/** out = the rotation about an axis, normalised as a whole: give a unit axis, unless only the direction of
 *  the result's axis matters.
 *  @param axis   axis, unit length
 *  @param angle  angle in radians */
QEX_API void QexQuaternion_RotationAxis(QexQuaternion* out, const QexVec3* axis, float angle);

/** Splits a unit quaternion.
 *  @param q      unit quaternion
 *  @param axis   out, unit axis; not normalised when the angle is within 0.001 of 0 or 2 pi
 *  @param angle  out, radians, 0 to 2 pi */
QEX_API void QexQuaternion_ToAxisAngle(const QexQuaternion* q, QexVec3* axis, float* angle);

/** out = the rotation matrix of a unit quaternion. */
QEX_API void QexQuaternion_ToRotationMatrix(QexMatrix* out, const QexQuaternion* q);

/** out = the spherical interpolation from a to b along the shorter arc. out may be a or b.
 *  @param a  unit quaternion
 *  @param b  unit quaternion
 *  @param t  0 (a) to 1 (b); outside, out is the identity */
QEX_API void QexQuaternion_Slerp(QexQuaternion* out, const QexQuaternion* a, const QexQuaternion* b, float t);

/** Euler angles of a rotation matrix.
 *  @param m    rotation matrix, no scale
 *  @param out  out, three floats: angles about X, Y, Z in radians, as QexMatrix_RotateXYZ takes them in
 *              degrees. At the poles (Y at +-pi/2) Z is 0 and X has the opposite sign. */
QEX_API void QexMatrix_ToEulerAnglesXYZ(const QexMatrix* m, float* out);

#ifdef QEX_UNPREFIXED_NAMES
/** Both sets of Euler angles of a rotation matrix, for QexMatrix_RotateXYZ.
 *  @param m     rotation matrix, no scale; may be null
 *  @param out1  out, three floats: angles about X, Y, Z in degrees; may be null
 *  @param out2  out, three floats: the other solution; may be null
 *  @return 1 or 2, the solution whose squared angles have the smaller sum; 0, nothing written, when a
 *          pointer is null. */
QEX_API int32_t GetRotationXYZFromRotationMatrix(const QexMatrix* m, float* out1, float* out2);

/** As GetRotationXYZFromRotationMatrix, for a matrix with translation and scale, which are removed first.
 *  @param m     transform without shear; may be null
 *  @param out1  out, three floats, degrees; may be null
 *  @param out2  out, three floats, degrees; may be null
 *  @return 1 or 2, the solution with the smaller angles; 0, nothing written, when a pointer is null. */
QEX_API int32_t GetRotationXYZFromTransformMatrix(const QexMatrix* m, float* out1, float* out2);

/** out = the rotation in a transform: no translation, columns at unit length. A negative scale is not found.
 *  @param m    transform without shear or zero scale; may be null
 *  @param out  out; may be m; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetRotationMatrixFromMatrix(const QexMatrix* m, QexMatrix* out);

/** out = the scale in a transform: the lengths of its first three columns.
 *  @param m    transform without shear; may be null
 *  @param out  out; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetScaleFromMatrix(const QexMatrix* m, QexVec3* out);

/** out = the scaling matrix of GetScaleFromMatrix.
 *  @param m    transform without shear; may be null
 *  @param out  out; may be m; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetScaleMatrixFromMatrix(const QexMatrix* m, QexMatrix* out);

/** out = the translation in a transform.
 *  @param m    transform; may be null
 *  @param out  out; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetTranslationFromMatrix(const QexMatrix* m, QexVec3* out);

/** out = the translation matrix of GetTranslationFromMatrix.
 *  @param m    transform; may be null
 *  @param out  out; may be m; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetTranslationMatrixFromMatrix(const QexMatrix* m, QexMatrix* out);
#endif

QEX_END

#endif
