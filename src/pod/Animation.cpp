#include "pod/Animation.h"

#include <cmath>
#include <cstring>

#include "base/Diagnostics.h"

namespace {

constexpr int32_t kNullArgument = -9;
constexpr int32_t kUnknownName = -11;
constexpr int32_t kIndexOutOfRange = -12;
constexpr int32_t kNoMeshNode = -1;

uint32_t LastFrame(const QexPODModel* scene) {
    return scene->frameCount ? scene->frameCount - 1 : 0;
}

float NodeKey(const QexPODNode* node) {
    return static_cast<float>(node->frame) + node->frameFraction;
}

// Splits a frame into integer part and fraction; what is no frame at all counts as 0.
void SplitFrame(float frame, uint32_t* integer, float* fraction) {
    if (!(frame > 0) || frame >= 4294967040.0f) frame = 0;
    *integer = static_cast<uint32_t>(frame);
    *fraction = frame - static_cast<float>(*integer);
}

void SetNodeFrame(QexPODNode* node, float frame) {
    SplitFrame(frame, &node->frame, &node->frameFraction);
}

// A frame given for one node: beyond the last, it is taken modulo the frame count.
float WrapNodeFrame(const QexPODModel* scene, float frame) {
    if (scene->frameCount < 2) return 0;
    const float last = static_cast<float>(LastFrame(scene));
    return frame > last ? fmodf(frame, static_cast<float>(scene->frameCount)) : frame;
}

// A frame within the loop of `last` frames, whose end is its start.
float WrapLoop(float frame, float last) {
    if (frame >= last) return fmodf(frame, last);
    if (frame >= 0) return frame;
    const float rest = fmodf(frame, last);
    return rest < 0 ? rest + last : 0;
}

// The two frames around a node's current one; beyond the last key there is only the last.
struct Frames {
    uint32_t a;
    uint32_t b;
};

Frames FindFrames(const QexPODModel* scene, const QexPODNode* node) {
    const uint32_t last = LastFrame(scene);
    const uint32_t a = node->frame < last ? node->frame : last;
    return {a, a < last ? a + 1 : last};
}

// The channels of a node, as QexPODNode::keyFrames counts them.
enum Channel { kPosition, kRotation, kScale, kMatrix };

// The same for a channel, which may have keys for the first frames only: the last of them holds. A count of 0
// stands for all frames, so its last is the highest number there is.
inline Frames WithinKeys(const QexPODNode* node, Channel channel, const Frames& frames) {
    const uint32_t last = node->keyFrames[channel] - 1;
    if (__builtin_expect(last >= frames.b, 1)) return frames;
    return {frames.a < last ? frames.a : last, last};
}

// Where a frame's key starts in its channel's data, in floats.
inline uint64_t KeyOffset(const uint32_t* index, uint32_t frame, uint32_t keyFloats) {
    return index ? index[frame] : uint64_t{frame} * keyFloats;
}

template <class T>
T LoadKey(const float* data, uint64_t offset) {
    T key;
    memcpy(static_cast<void*>(&key), reinterpret_cast<const uint8_t*>(data) + offset * sizeof(float),
           sizeof key);
    return key;
}

// Position or scale between two frames.
inline QexVec3 InterpolateVec3(const QexPODNode* node, Channel channel, const Frames& frames,
                               const float* data, const uint32_t* index, uint32_t keyFloats,
                               uint32_t animatedBit) {
    if (!(node->animationFlags & animatedBit)) return LoadKey<QexVec3>(data, 0);
    const Frames keyed = WithinKeys(node, channel, frames);
    const QexVec3 a = LoadKey<QexVec3>(data, KeyOffset(index, keyed.a, keyFloats));
    const QexVec3 b = LoadKey<QexVec3>(data, KeyOffset(index, keyed.b, keyFloats));
    QexVec3 result;
    QexVec3_Lerp(&result, &a, &b, node->frameFraction);
    return result;
}

inline QexVec3 Position(const QexPODNode* node, const Frames& frames) {
    return InterpolateVec3(node, kPosition, frames, node->position, node->positionIndex, 3,
                           QEX_NODE_POSITION_ANIMATED);
}

inline QexVec3 Scale(const QexPODNode* node, const Frames& frames) {
    return InterpolateVec3(node, kScale, frames, node->scale, node->scaleIndex, 7, QEX_NODE_SCALE_ANIMATED);
}

void RotationMatrix(QexMatrix* out, const QexPODNode* node, const Frames& frames) {
    if (!node->rotation) {
        QexMatrix_Identity(out);
        return;
    }
    QexQuaternion q = LoadKey<QexQuaternion>(node->rotation, 0);
    if (node->animationFlags & QEX_NODE_ROTATION_ANIMATED) {
        const Frames keyed = WithinKeys(node, kRotation, frames);
        const QexQuaternion a =
            LoadKey<QexQuaternion>(node->rotation, KeyOffset(node->rotationIndex, keyed.a, 4));
        const QexQuaternion b =
            LoadKey<QexQuaternion>(node->rotation, KeyOffset(node->rotationIndex, keyed.b, 4));
        QexQuaternion_Slerp(&q, &a, &b, node->frameFraction);
    }
    QexQuaternion_ToRotationMatrix(out, &q);
}

// translation * rotation * scale, without multiplying the zeros.
void LocalMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    if (node->matrix) {
        QexPODModel_GetTransformationMatrix(scene, out, node);
        return;
    }
    const Frames frames = FindFrames(scene, node);
    RotationMatrix(out, node, frames);
    if (node->scale) {
        const QexVec3 s = Scale(node, frames);
        for (int r = 0; r < 3; ++r) {
            out->m[r] *= s.x;
            out->m[4 + r] *= s.y;
            out->m[8 + r] *= s.z;
        }
    }
    if (node->position) {
        const QexVec3 p = Position(node, frames);
        out->m[12] = p.x;
        out->m[13] = p.y;
        out->m[14] = p.z;
    }
}

// Rebuilds the parts of an override that have changed.
void UpdateOverride(QexPODNode* node) {
    const uint32_t changed =
        node->stateFlags & (QEX_NODE_POSITION_CHANGED | QEX_NODE_ROTATION_CHANGED | QEX_NODE_SCALE_CHANGED);
    if (!changed) return;
    const float* s = node->overrideScale;
    const float* r = node->overrideRotation;
    const float* p = node->overridePosition;
    if (changed & QEX_NODE_SCALE_CHANGED) QexMatrix_Scale(&node->overrideScaleMatrix, s[0], s[1], s[2]);
    if (changed & QEX_NODE_ROTATION_CHANGED)
        QexMatrix_RotateXYZ(&node->overrideRotationMatrix, r[0], r[1], r[2]);
    if (changed & QEX_NODE_POSITION_CHANGED)
        QexMatrix_Translate(&node->overrideTranslationMatrix, p[0], p[1], p[2]);
    node->stateFlags &= ~changed;
    QexMatrix_Multiply(&node->overrideMatrix, &node->overrideTranslationMatrix,
                       &node->overrideRotationMatrix);
    QexMatrix_Multiply(&node->overrideMatrix, &node->overrideMatrix, &node->overrideScaleMatrix);
}

// Stores one part of a node's override.
void StoreOverride(QexPODModel* scene, uint32_t index, float (QexPODNode::*part)[3], uint32_t bit, float x,
                   float y, float z) {
    if (index >= scene->nodeCount) return;
    QexPODNode* node = &scene->nodes[index];
    (node->*part)[0] = x;
    (node->*part)[1] = y;
    (node->*part)[2] = z;
    node->stateFlags |= bit | QEX_NODE_OVERRIDDEN;
    scene->cacheStale = 1;
}

uint32_t SetStateBit(QexPODModel* scene, int64_t index, uint32_t bit, uint32_t enable) {
    if (index < 0 || index >= scene->nodeCount) return 0;
    uint32_t& flags = scene->nodes[index].stateFlags;
    const uint32_t previous = flags & bit ? 1 : 0;
    flags = enable & 1 ? flags | bit : flags & ~bit;
    return previous;
}

QexPODNode* CameraNode(const QexPODModel* scene, uint32_t index) {
    if (index >= scene->cameraCount || !scene->runtime) return nullptr;
    return &scene->nodes[scene->meshNodeCount + scene->lightCount + index];
}

float CameraFov(const QexPODModel* scene, const QexPODCamera& camera) {
    if (!camera.animatedFov) return camera.fov;
    const uint32_t last = LastFrame(scene);
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

const QexMatrix* QexPODAnimation_WorldMatrix(QexPODModel* scene, QexPODNode* node) {
    SPVRTPODImpl* impl = scene->runtime;
    if (!impl) return &g_sMatIdentity;
    if (scene->cacheStale) {
        for (uint32_t i = 0; i < scene->nodeCount; ++i) impl->cacheKeys[i] = -1.0f;
        scene->cacheStale = 0;
    }
    const size_t i = static_cast<size_t>(node - scene->nodes);
    const float key = NodeKey(node);
    if (impl->cacheKeys[i] != key) {
        QexPODModel_GetWorldMatrixNoCache(scene, &impl->cachedMatrices[i], node);
        impl->cacheKeys[i] = key;
        impl->boneMeshNodes[i] = kNoMeshNode;
    }
    return &impl->cachedMatrices[i];
}

const QexMatrix* QexPODAnimation_BoneMatrix(QexPODModel* scene, const QexPODNode* meshNode,
                                            QexPODNode* boneNode) {
    const SPVRTPODImpl* impl = scene->runtime;
    if (!impl) return &g_sMatIdentity;
    const QexMatrix* world = QexPODAnimation_WorldMatrix(scene, boneNode);
    const size_t bone = static_cast<size_t>(boneNode - scene->nodes);
    const int32_t mesh = static_cast<int32_t>(meshNode - scene->nodes);
    if (impl->boneMeshNodes[bone] != mesh) {
        QexMatrix* out = &impl->boneMatrices[bone];
        QexMatrix_Multiply(out, &impl->inverseBindPose[bone], &impl->bindPose[mesh]);
        QexMatrix_Multiply(out, world, out);
        impl->boneMeshNodes[bone] = mesh;
    }
    return &impl->boneMatrices[bone];
}

extern "C" {

// ---- Frames ----

void QexPODModel_SetFrame(QexPODModel* scene, float frame) {
    SPVRTPODImpl* impl = scene->runtime;
    scene->cacheStale = 1;
    if (!impl) return;
    impl->frame = frame;
    impl->frameFraction = 0;
    impl->frameInteger = 0;
    if (scene->frameCount < 2) return;
    const float last = static_cast<float>(LastFrame(scene));
    const float target = frame > -4294967040.0f && frame < 4294967040.0f ? frame : 0;
    // Whole turns are taken off while the frame lies beyond the last; the last itself stays.
    float wrapped = target < 0 ? WrapLoop(target, last) : target;
    if (target > last) {
        wrapped = fmodf(target, last);
        if (wrapped == 0) wrapped = last;
    }
    SplitFrame(wrapped, &impl->frameInteger, &impl->frameFraction);
    for (uint32_t i = 0; i < scene->nodeCount; ++i) {
        QexPODNode* node = &scene->nodes[i];
        if (!(node->stateFlags & QEX_NODE_ANIMATION_ENABLED)) continue;
        const float current = NodeKey(node);
        const float goal = current < target ? target : target + last;
        // A node of full speed lands on the frame itself, free of the rounding of the sum.
        const float next = node->speed == 1 ? target : current + (goal - current) * node->speed;
        SetNodeFrame(node, WrapLoop(next, last));
    }
}

int32_t QexPODModel_SetNodeAnimationFrame(QexPODModel* scene, uint32_t index, float frame) {
    if (index >= scene->nodeCount) return kIndexOutOfRange;
    SetNodeFrame(&scene->nodes[index], WrapNodeFrame(scene, frame));
    scene->cacheStale = 1;
    return 0;
}

int32_t QexPODModel_SetNodeAnimationFrameA(QexPODModel* scene, QexPODNode* node, float frame) {
    if (node) SetNodeFrame(node, scene->frameCount ? frame : 0);
    scene->cacheStale = 1;
    return 0;
}

int32_t QexPODModel_SetNodeAnimationFrameByName(QexPODModel* scene, const char* name, float frame) {
    const int32_t index = QexPODModel_FindNodeIdxByName(scene, name);
    if (index < 0) return kUnknownName;
    return QexPODModel_SetNodeAnimationFrame(scene, static_cast<uint32_t>(index), frame);
}

int32_t QexPODModel_SetNodeAnimationTime(QexPODModel* scene, uint32_t index, float time) {
    if (index >= scene->nodeCount) {
        QexLog(QEX_TAG, "illegal node index %d", static_cast<int32_t>(index));
        return -1;
    }
    return QexPODModel_SetNodeAnimationFrame(scene, index, static_cast<float>(scene->framesPerSecond) * time);
}

int32_t QexPODModel_SetNodeAnimationTimeByName(QexPODModel* scene, const char* name, float time) {
    const int32_t index = QexPODModel_FindNodeIdxByName(scene, name);
    if (index < 0) return kUnknownName;
    return QexPODModel_SetNodeAnimationTime(scene, static_cast<uint32_t>(index), time);
}

int32_t QexPODModel_SetMeshNodeBoneAnimationFrame(QexPODModel* scene, uint32_t index, float frame) {
    if (index >= scene->nodeCount) return kIndexOutOfRange;
    return QexPODModel_SetMeshNodeBoneAnimationFrameA(scene, &scene->nodes[index], frame);
}

int32_t QexPODModel_SetMeshNodeBoneAnimationFrameA(QexPODModel* scene, QexPODNode* node, float frame) {
    if (!scene || !node) return kNullArgument;
    // Lights, cameras and plain nodes have no mesh, and so no bones.
    const bool inScene = node >= scene->nodes && node < scene->nodes + scene->nodeCount;
    if (inScene && node >= scene->nodes + scene->meshNodeCount) return 0;
    if (static_cast<uint32_t>(node->objectIndex) >= scene->meshCount) return 0;
    const QexPODMesh& mesh = scene->meshes[node->objectIndex];
    const QexBoneBatches& batches = mesh.boneBatches;
    if (!mesh.skinned) return 0;
    const float wrapped = WrapNodeFrame(scene, frame);
    for (int64_t batch = 0; batch < batches.batchCount; ++batch)
        for (int32_t i = 0; i < batches.bonesPerBatch[batch]; ++i) {
            const uint32_t bone = static_cast<uint32_t>(batches.boneTable[batch * batches.maxBones + i]);
            if (bone < scene->nodeCount) SetNodeFrame(&scene->nodes[bone], wrapped);
        }
    scene->cacheStale = 1;
    return 0;
}

int32_t QexPODModel_SetMeshNodeBoneAnimationFrameByName(QexPODModel* scene, const char* name, float frame) {
    QexPODNode* node = QexPODModel_FindNodeByName(scene, name);
    return node ? QexPODModel_SetMeshNodeBoneAnimationFrameA(scene, node, frame) : kUnknownName;
}

// ---- State and overrides ----

uint32_t QexPODModel_EnableNodeAnimation(QexPODModel* scene, uint32_t index, uint32_t enable) {
    return SetStateBit(scene, index, QEX_NODE_ANIMATION_ENABLED, enable);
}

uint32_t QexPODModel_EnableNodeRendering(QexPODModel* scene, uint32_t index, uint32_t enable) {
    return SetStateBit(scene, index, QEX_NODE_RENDERING_ENABLED, enable);
}

uint32_t QexPODModel_EnableNodeAnimationByName(QexPODModel* scene, const char* name, uint32_t enable) {
    return SetStateBit(scene, QexPODModel_FindNodeIdxByName(scene, name), QEX_NODE_ANIMATION_ENABLED, enable);
}

uint32_t QexPODModel_EnableNodeRenderingByName(QexPODModel* scene, const char* name, uint32_t enable) {
    return SetStateBit(scene, QexPODModel_FindNodeIdxByName(scene, name), QEX_NODE_RENDERING_ENABLED, enable);
}

void QexPODModel_SetNodePosition(QexPODModel* scene, uint32_t index, float x, float y, float z) {
    StoreOverride(scene, index, &QexPODNode::overridePosition, QEX_NODE_POSITION_CHANGED, x, y, z);
}

void QexPODModel_SetNodeRotation(QexPODModel* scene, uint32_t index, float x, float y, float z) {
    StoreOverride(scene, index, &QexPODNode::overrideRotation, QEX_NODE_ROTATION_CHANGED, x, y, z);
}

void QexPODModel_SetNodeScale(QexPODModel* scene, uint32_t index, float x, float y, float z) {
    StoreOverride(scene, index, &QexPODNode::overrideScale, QEX_NODE_SCALE_CHANGED, x, y, z);
}

void QexPODModel_SetNodeMatrix(QexPODModel* scene, uint32_t index, const QexMatrix* matrix) {
    if (index >= scene->nodeCount) return;
    QexPODNode* node = &scene->nodes[index];
    node->overrideMatrix = *matrix;
    node->stateFlags |= QEX_NODE_OVERRIDDEN;
    node->stateFlags &= ~(QEX_NODE_POSITION_CHANGED | QEX_NODE_ROTATION_CHANGED | QEX_NODE_SCALE_CHANGED);
    scene->cacheStale = 1;
}

void QexPODModel_ResetNodeTransform(QexPODNode* node) {
    QexMatrix_Identity(&node->overrideScaleMatrix);
    QexMatrix_Identity(&node->overrideRotationMatrix);
    QexMatrix_Identity(&node->overrideTranslationMatrix);
    QexMatrix_Identity(&node->overrideMatrix);
    for (int i = 0; i < 3; ++i) {
        node->overrideScale[i] = 1;
        node->overrideRotation[i] = 0;
        node->overridePosition[i] = 0;
    }
    node->stateFlags &= QEX_NODE_ANIMATION_ENABLED | QEX_NODE_RENDERING_ENABLED;
}

// ---- Matrices ----

void QexPODModel_GetTranslationMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    QexMatrix_Identity(out);
    if (!node->position) return;
    const QexVec3 p = Position(node, FindFrames(scene, node));
    QexMatrix_Translate(out, p.x, p.y, p.z);
}

void QexPODModel_GetRotationMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    RotationMatrix(out, node, FindFrames(scene, node));
}

void QexPODModel_GetScalingMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    QexMatrix_Identity(out);
    if (!node->scale) return;
    const QexVec3 s = Scale(node, FindFrames(scene, node));
    QexMatrix_Scale(out, s.x, s.y, s.z);
}

void QexPODModel_GetTransformationMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    QexMatrix_Identity(out);
    if (!node->matrix) return;
    const bool animated = node->animationFlags & QEX_NODE_MATRIX_ANIMATED;
    const uint32_t frame = WithinKeys(node, kMatrix, FindFrames(scene, node)).a;
    *out = LoadKey<QexMatrix>(node->matrix, animated ? KeyOffset(node->matrixIndex, frame, 16) : 0);
}

void QexPODModel_GetWorldMatrixNoCache(QexPODModel* scene, QexMatrix* out, QexPODNode* node) {
    LocalMatrix(scene, out, node);
    if (node->stateFlags & QEX_NODE_OVERRIDDEN) {
        UpdateOverride(node);
        QexMatrix_Multiply(out, &node->overrideMatrix, out);
    }
    if (node->parentIndex < 0 || static_cast<uint32_t>(node->parentIndex) >= scene->nodeCount) return;
    QexMatrix_Multiply(out, QexPODAnimation_WorldMatrix(scene, &scene->nodes[node->parentIndex]), out);
}

void QexPODModel_GetWorldMatrix(QexPODModel* scene, QexMatrix* out, QexPODNode* node) {
    *out = *QexPODAnimation_WorldMatrix(scene, node);
}

void QexPODModel_FlushCache(QexPODModel* scene) {
    SPVRTPODImpl* impl = scene->runtime;
    if (!impl) return;
    QexPODModel_SetFrame(scene, 0);
    for (uint32_t i = 0; i < scene->nodeCount; ++i) {
        impl->bindPose[i] = *QexPODAnimation_WorldMatrix(scene, &scene->nodes[i]);
        if (!QexMatrix_Inverse(&impl->inverseBindPose[i], &impl->bindPose[i]))
            QexMatrix_Identity(&impl->inverseBindPose[i]);
        impl->cacheKeys[i] = 0;
    }
}

void QexPODModel_GetBoneWorldMatrix(QexPODModel* scene, QexMatrix* out, QexPODNode* meshNode,
                                    QexPODNode* boneNode) {
    *out = *QexPODAnimation_BoneMatrix(scene, meshNode, boneNode);
}

// ---- Cameras, lights, planes, names ----

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
