// What a scene says of its cameras, lights and planes at the current frame, and which node has a name.
#include <cstring>

#include "base/Diagnostics.h"
#include "pod/Animation.h"
#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

namespace {

QexPODNode* CameraNode(const QexPODModel* scene, uint32_t index) {
    if (index >= scene->cameraCount || !scene->runtime) return nullptr;
    return &scene->nodes[scene->meshNodeCount + scene->lightCount + index];
}

float CameraFov(const QexPODModel* scene, const QexPODCamera& camera) {
    if (!camera.animatedFov) return camera.fov;
    const uint32_t last = QexPODAnimation_LastFrame(scene);
    const uint32_t a = scene->runtime->frameInteger < last ? scene->runtime->frameInteger : last;
    const float from = camera.animatedFov[a], to = camera.animatedFov[a < last ? a + 1 : last];
    return from + (to - from) * scene->runtime->frameFraction;
}

// The first vertex element of a mesh node with an interleaved block; false when there is none.
bool FirstElement(const QexPODModel* scene, uint32_t index, CPODData QexPODMesh::*element, float* value) {
    if (index < scene->meshNodeCount && scene->runtime) {
        const QexPODMesh& mesh = scene->meshes[scene->nodes[index].objectIndex];
        const CPODData& data = mesh.*element;
        if (mesh.interleaved && data.componentCount && mesh.vertexCount) {
            QexPODVertex_ReadVec(value, mesh.interleaved + reinterpret_cast<uintptr_t>(data.data), data.type,
                                 static_cast<int32_t>(data.componentCount));
            return true;
        }
    }
    QexLog(QEX_TAG,
           "<QexPODModel_GetNodePlaneNormal> unsupported vertex array format - must export as interleaved "
           "data.");
    return false;
}

}  // namespace

extern "C" {

float QexPODModel_GetCameraPos(QexPODModel* scene, float* position, float* target, uint32_t index) {
    QexPODNode* node = CameraNode(scene, index);
    if (!node) return 0;
    const QexPODCamera& camera = scene->cameras[index];
    memcpy(position, &QexPODAnimation_WorldMatrix(scene, node)->m[12], 3 * sizeof(float));
    if (camera.targetIndex >= 0)
        memcpy(target, &QexPODAnimation_WorldMatrix(scene, &scene->nodes[camera.targetIndex])->m[12],
               3 * sizeof(float));
    return CameraFov(scene, camera);
}

float QexPODModel_GetCameraPosEx(QexPODModel* scene, float* position, float* target, float* up,
                                 uint32_t index) {
    QexPODNode* node = CameraNode(scene, index);
    if (!node) return 0;
    const float* m = QexPODAnimation_WorldMatrix(scene, node)->m;
    for (int i = 0; i < 3; ++i) {
        position[i] = m[12 + i];
        target[i] = m[12 + i] - m[4 + i];
        up[i] = -m[8 + i];
    }
    return CameraFov(scene, scene->cameras[index]);
}

void QexPODModel_GetCameraNearFar(const QexPODModel* scene, float* zNear, float* zFar, uint32_t index) {
    if (index >= scene->cameraCount) return;
    *zNear = scene->cameras[index].nearPlane;
    *zFar = scene->cameras[index].farPlane;
}

void QexPODModel_GetLight(QexPODModel* scene, float* position, float* direction, uint32_t index) {
    if (index >= scene->lightCount || !scene->runtime) return;
    const float* m = QexPODAnimation_WorldMatrix(scene, &scene->nodes[scene->meshNodeCount + index])->m;
    for (int i = 0; i < 3; ++i) {
        position[i] = m[12 + i];
        direction[i] = -m[8 + i];
    }
}

int32_t QexPODModel_GetLightDirection(QexPODModel* scene, uint32_t index, float* direction) {
    float position[3];
    if (index >= scene->lightCount || !scene->runtime || scene->lights[index].type == QEX_POD_LIGHT_POINT) {
        direction[0] = direction[2] = 0.5f;
        direction[1] = direction[3] = 0;
        return -1;
    }
    QexPODModel_GetLight(scene, position, direction, index);
    direction[3] = 0;
    return 0;
}

void QexPODModel_GetNodePlanePoint(QexPODModel* scene, uint32_t index, float* point) {
    QexVec4 p = {0, 0, 0, 1};
    point[0] = point[1] = point[2] = 0;
    if (!FirstElement(scene, index, &QexPODMesh::vertices, &p.x)) return;
    p.w = 1;
    QexMatrix_TransformVec4(QexPODAnimation_WorldMatrix(scene, &scene->nodes[index]), &p, &p);
    memcpy(point, &p, 3 * sizeof(float));
}

void QexPODModel_GetNodePlaneNormal(QexPODModel* scene, uint32_t index, float* normal) {
    float n[4] = {0, 1, 0, 0};
    QexMatrix3 world, inverse;
    normal[0] = normal[2] = 0;
    normal[1] = 1;
    if (!FirstElement(scene, index, &QexPODMesh::normals, n)) return;
    const QexVec3 v = {n[0], n[1], n[2]};
    QexVec3 result;
    QexMatrix3_ConstructorFromMatrix(&world, QexPODAnimation_WorldMatrix(scene, &scene->nodes[index]));
    QexMatrix3_Inverse(&world, &world);
    QexMatrix3_Transpose(&inverse, &world);
    QexMatrix_TransformVec3(&inverse, &v, &result);
    memcpy(normal, &result, sizeof result);
}

QexPODNode* QexPODModel_FindNodeByName(const QexPODModel* scene, const char* name) {
    const int32_t index = QexPODModel_FindNodeIdxByName(scene, name);
    return index < 0 ? nullptr : &scene->nodes[index];
}

int32_t QexPODModel_FindNodeIdxByName(const QexPODModel* scene, const char* name) {
    for (uint32_t i = 0; name && i < scene->nodeCount; ++i)
        if (scene->nodes[i].name && strcmp(scene->nodes[i].name, name) == 0) return static_cast<int32_t>(i);
    return -1;
}

}  // extern "C"
