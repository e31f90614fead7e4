// The camera record: its view, its projection, its frustum.
#include <cmath>
#include <initializer_list>

#include "Qex/geometry.h"
#include "Qex/math.h"

int32_t QexCamera_Create(QexCamera* camera, int32_t tag) {
    *camera = {};
    camera->tag = tag;
    return 0;
}

void QexCamera_Release(QexCamera* camera) {
    *camera = {};
}

void QexCamera_LookAt(QexCamera* camera, const QexVec3* eye, const QexVec3* target, const QexVec3* up) {
    // A little longer than 1: applications may compare the default with what they set.
    const QexVec3 defaultUp = {0, 1.0001f, 0};
    if (eye) camera->eye = *eye;
    if (target) camera->target = *target;
    camera->up = up ? *up : defaultUp;
    QexMatrix_LookAtRH(&camera->viewMatrix, &camera->eye, &camera->target, &camera->up);
}

QexMatrix* QexCamera_Project(QexCamera* camera, float fov, float aspect, float nearPlane, float farPlane) {
    camera->fov = fov;
    camera->aspect = aspect;
    camera->nearPlane = nearPlane;
    camera->farPlane = farPlane;
    return QexMatrix_Perspective(&camera->projectionMatrix, fov, aspect, nearPlane, farPlane);
}

void QexCamera_BuildMVPMatrix(QexCamera* camera, QexMatrix* out, const QexMatrix* model) {
    QexMatrix_Multiply(&camera->modelViewMatrix, &camera->viewMatrix, model);
    QexMatrix_Multiply(out, &camera->projectionMatrix, &camera->modelViewMatrix);
}

void QexCamera_GetFrustumVerticesInObjectSpace(const QexCamera* camera, QexVec3* out) {
    // The whole angle, not its half: the corners enclose the projected volume with room around it.
    const float tangent = static_cast<float>(tan(static_cast<double>(camera->fov)));
    for (const float distance : {camera->nearPlane, camera->farPlane}) {
        const float x = tangent * distance, y = tangent * camera->aspect * distance;
        *out++ = {x, y, -distance};
        *out++ = {-x, y, -distance};
        *out++ = {-x, -y, -distance};
        *out++ = {x, -y, -distance};
    }
}

#if UINTPTR_MAX == UINT32_MAX
static_assert(sizeof(QexCamera) == 14 * 4 + 3 * 64, "plain words");
#endif
