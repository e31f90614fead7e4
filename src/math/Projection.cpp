// Matrices that a frame makes few of: projections, views, mirrors, turns, inverses of any matrix.
#include <cmath>
#include <cstring>

#include "math/Pi.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"

namespace {

float Degrees(double radians) {
    return static_cast<float>(radians / kQexPi * 180);
}

// Between unit vectors. The arc cosine of the dot product alone would lose small angles.
double AngleBetween(const QexVec3& a, const QexVec3& b) {
    QexVec3 cross;
    QexVec3_CrossProduct(&cross, &a, &b);
    const double sine = sqrt(static_cast<double>(QexVec3_DotProduct(&cross, &cross)));
    return atan2(sine, static_cast<double>(QexVec3_DotProduct(&a, &b)));
}

}  // namespace

QexMatrix* QexMatrix_Perspective(QexMatrix* out, float fov, float aspect, float nearPlane, float farPlane) {
    const float ratio = nearPlane / farPlane;
    const float cotangent = static_cast<float>(1 / tan(fov * 0.5));
    const float scale = cotangent / farPlane;
    QexMatrix_Scale(out, scale, scale * aspect, (1 / farPlane) / (ratio - 1));
    out->m[11] = -1 / farPlane;
    out->m[14] = ratio / (ratio - 1);
    out->m[15] = 0;
    return out;
}

QexMatrix* QexMatrix_Orthographic(QexMatrix* out, float left, float right, float bottom, float top,
                                  float nearPlane, float farPlane) {
    QexMatrix_Scale(out, 2 / (right - left), 2 / (top - bottom), 2 / (farPlane - nearPlane));
    out->m[12] = -(right + left) / (right - left);
    out->m[13] = -(top + bottom) / (top - bottom);
    out->m[14] = -(farPlane + nearPlane) / (farPlane - nearPlane);
    return out;
}

QexMatrix* QexMatrix_LookUp(QexMatrix* out, const QexVec3* direction, const QexVec3* up) {
    QexVec3 x, y, z;
    QexVec3_Scale(&z, direction, -1);
    QexVec3_Normalize(&z, &z);
    QexVec3 along;
    QexVec3_Scale(&along, &z, QexVec3_DotProduct(&z, up));
    QexVec3_Subtract(&y, up, &along);
    QexVec3_Normalize(&y, &y);
    QexVec3_CrossProduct(&x, &y, &z);
    *out = {{x.x, y.x, z.x, 0, x.y, y.y, z.y, 0, x.z, y.z, z.z, 0, 0, 0, 0, 1}};
    return out;
}

QexMatrix* QexMatrix_LookAtRH(QexMatrix* out, const QexVec3* eye, const QexVec3* target, const QexVec3* up) {
    QexVec3 direction;
    QexVec3_Subtract(&direction, target, eye);
    QexMatrix rotation, translation;
    QexMatrix_LookUp(&rotation, &direction, up);
    QexMatrix_Translate(&translation, -eye->x, -eye->y, -eye->z);
    QexMatrix_Multiply(out, &rotation, &translation);
    return out;
}

QexMatrix* QexMatrix_CreateReflectionMatrix(const QexVec3* planePoint, const QexVec3* planeNormal,
                                            QexMatrix* out) {
    const QexVec3 up = {0, 1, 0}, point = *planePoint;
    QexVec3 normal, axis;
    QexVec3_Normalize(&normal, planeNormal);
    QexVec3_CrossProduct(&axis, &up, &normal);
    // A normal along Y needs no turning, but the axis must have a length.
    if (axis.x == 0 && axis.z == 0) axis = {0, 0, 1};
    const float degrees = Degrees(AngleBetween(up, normal));

    // Read from the right: plane to the origin, its normal onto +Y, mirror Y, and back again.
    QexMatrix step;
    QexMatrix_Translate(out, point.x, point.y, point.z);
    QexMatrix_Multiply(out, out, QexMatrix_RotateAngelAxis(&step, degrees, axis.x, axis.y, axis.z));
    QexMatrix_Multiply(out, out, QexMatrix_Scale(&step, 1, -1, 1));
    QexMatrix_Multiply(out, out, QexMatrix_RotateAngelAxis(&step, -degrees, axis.x, axis.y, axis.z));
    QexMatrix_Multiply(out, out, QexMatrix_Translate(&step, -point.x, -point.y, -point.z));
    return out;
}

QexMatrix* QexMatrix_GetRotation(QexMatrix* out, const QexVec3* from, const QexVec3* to) {
    QexVec3 a, b, axis;
    QexVec3_Normalize(&a, from);
    QexVec3_Normalize(&b, to);
    const double angle = AngleBetween(b, a);
    if (fabs(angle) < 0.01) return QexMatrix_Identity(out);

    QexVec3_CrossProduct(&axis, &b, &a);
    // Opposite directions: any axis perpendicular to them will do.
    if (axis.x == 0 && axis.y == 0 && axis.z == 0) QexMatrix_GetPerpendicularVector(&axis, &a);
    return QexMatrix_RotateAngelAxis(out, -Degrees(angle), axis.x, axis.y, axis.z);
}

QexMatrix* QexMatrix_InverseEx(QexMatrix* out, const QexMatrix* m) {
    QexMatrix inverse;
    for (int i = 0; i < 4; ++i) {
        // Row i of the inverse times m is row i of the identity; transposed, four equations in four unknowns.
        float system[4][5], solution[4];
        float* rows[4];
        for (int j = 0; j < 4; ++j) {
            system[j][0] = i == j ? 1.0f : 0.0f;
            memcpy(system[j] + 1, m->m + 4 * j, 4 * sizeof(float));
            rows[j] = system[j];
        }
        QexMath_LinearEqSolve(solution, rows, 4);
        for (int k = 0; k < 4; ++k) inverse.m[4 * k + i] = solution[k];
    }
    *out = inverse;
    return out;
}

void QexMatrixPrint(const QexMatrix* m) {
    QexSystem_Printf("\n");
    for (int r = 0; r < 4; ++r) {
        QexSystem_Printf("%.1f\t%.1f\t%.1f\t%.1f\t\n", static_cast<double>(m->m[r]),
                         static_cast<double>(m->m[4 + r]), static_cast<double>(m->m[8 + r]),
                         static_cast<double>(m->m[12 + r]));
    }
    QexSystem_Printf("\n");
}
