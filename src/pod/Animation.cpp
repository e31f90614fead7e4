// Matrices of nodes: from their keys, the overrides and the parents to the world, kept until something moves.
#include "pod/Animation.h"

#include <cstring>

#include "math/Rotation.h"
#include "pod/Types.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

namespace {

constexpr int32_t kNoMeshNode = -1;

// The two frames around a node's current one; beyond the last key there is only the last.
struct Frames {
    uint32_t a;
    uint32_t b;
};

Frames FindFrames(const QexPODModel* scene, const QexPODNode* node) {
    const uint32_t last = QexPODAnimation_LastFrame(scene);
    const uint32_t a = node->frame < last ? node->frame : last;
    return {a, a < last ? a + 1 : last};
}

// The same for a channel, which may have keys for the first frames only: the last of them holds. A count of 0
// stands for all frames, so its last is the highest number there is.
inline Frames WithinKeys(const QexPODNode* node, QexPODChannelNumber channel, const Frames& frames) {
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

// The frame's key of a node that is moved by matrices, which are not interpolated.
const float* MatrixKey(const QexPODNode* node, const Frames& frames) {
    if (!(node->animationFlags & QEX_NODE_MATRIX_ANIMATED)) return node->matrix;
    const uint32_t frame = WithinKeys(node, kPODMatrix, frames).a;
    return node->matrix + KeyOffset(node->matrixIndex, frame, kPODChannelTable[kPODMatrix].stride);
}

// The first three floats, and a fourth for the last lane.
Float4 LoadVec3(const float* data, uint64_t offset, float w) {
    const QexVec3 v = LoadKey<QexVec3>(data, offset);
    return Float4{v.x, v.y, v.z, w};
}

// Position or scale between two frames, and 1 in the last lane.
template <QexPODChannelNumber number>
inline Float4 InterpolateVec3(const QexPODNode* node, const Frames& frames) {
    constexpr QexPODChannel channel = kPODChannelTable[number];
    const float* keys = node->*channel.keys;
    if (!(node->animationFlags & channel.animated)) return LoadVec3(keys, 0, 1);
    const uint32_t* index = node->*channel.index;
    const Frames keyed = WithinKeys(node, number, frames);
    const Float4 a = LoadVec3(keys, KeyOffset(index, keyed.a, channel.stride), 1);
    const Float4 b = LoadVec3(keys, KeyOffset(index, keyed.b, channel.stride), 1);
    return a + (b - a) * node->frameFraction;
}

Float4x4 RotationMatrix(const QexPODNode* node, const Frames& frames) {
    if (!node->rotation) return Load4x4(g_sMatIdentity.m);
    if (!(node->animationFlags & QEX_NODE_ROTATION_ANIMATED))
        return QexRotation_Matrix(LoadKey<Float4>(node->rotation, 0));
    const QexPODChannel& channel = kPODChannelTable[kPODRotation];
    const Frames keyed = WithinKeys(node, kPODRotation, frames);
    const Float4 a = LoadKey<Float4>(node->rotation, KeyOffset(node->rotationIndex, keyed.a, channel.stride));
    const Float4 b = LoadKey<Float4>(node->rotation, KeyOffset(node->rotationIndex, keyed.b, channel.stride));
    return QexRotation_Matrix(QexRotation_Slerp(a, b, node->frameFraction));
}

// translation * rotation * scale, without multiplying the zeros.
Float4x4 LocalMatrix(const QexPODModel* scene, const QexPODNode* node) {
    const Frames frames = FindFrames(scene, node);
    if (node->matrix) return Load4x4(MatrixKey(node, frames));
    Float4x4 local = RotationMatrix(node, frames);
    if (node->scale) {
        const Float4 s = InterpolateVec3<kPODScale>(node, frames);
        local.x *= Shuffle<0, 0, 0, 3>(s);
        local.y *= Shuffle<1, 1, 1, 3>(s);
        local.z *= Shuffle<2, 2, 2, 3>(s);
    }
    if (node->position) local.w = InterpolateVec3<kPODPosition>(node, frames);
    return local;
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

}  // namespace

const QexMatrix* QexPODAnimation_WorldMatrix(QexPODModel* scene, QexPODNode* node) {
    SPVRTPODImpl* impl = scene->runtime;
    if (!impl) return &g_sMatIdentity;
    if (scene->cacheStale) {
        for (uint32_t i = 0; i < scene->nodeCount; ++i) impl->cacheKeys[i] = -1.0f;
        scene->cacheStale = 0;
    }
    const size_t i = static_cast<size_t>(node - scene->nodes);
    const float key = QexPODAnimation_NodeFrame(node);
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
        if (impl->bindMeshNodes[bone] != mesh) {
            QexMatrix_Multiply(&impl->meshToBone[bone], &impl->inverseBindPose[bone], &impl->bindPose[mesh]);
            impl->bindMeshNodes[bone] = mesh;
        }
        QexMatrix_Multiply(&impl->boneMatrices[bone], world, &impl->meshToBone[bone]);
        impl->boneMeshNodes[bone] = mesh;
    }
    return &impl->boneMatrices[bone];
}

extern "C" {

// ---- Overrides ----

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
    const Float4 p = InterpolateVec3<kPODPosition>(node, FindFrames(scene, node));
    QexMatrix_Translate(out, p[0], p[1], p[2]);
}

void QexPODModel_GetRotationMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    Store4x4(out->m, RotationMatrix(node, FindFrames(scene, node)));
}

void QexPODModel_GetScalingMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    QexMatrix_Identity(out);
    if (!node->scale) return;
    const Float4 s = InterpolateVec3<kPODScale>(node, FindFrames(scene, node));
    QexMatrix_Scale(out, s[0], s[1], s[2]);
}

void QexPODModel_GetTransformationMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node) {
    QexMatrix_Identity(out);
    if (node->matrix) Store4x4(out->m, Load4x4(MatrixKey(node, FindFrames(scene, node))));
}

void QexPODModel_GetWorldMatrixNoCache(QexPODModel* scene, QexMatrix* out, QexPODNode* node) {
    Float4x4 world = LocalMatrix(scene, node);
    if (node->stateFlags & QEX_NODE_OVERRIDDEN) {
        UpdateOverride(node);
        world = Product(Load4x4(node->overrideMatrix.m), world);
    }
    if (node->parentIndex >= 0 && static_cast<uint32_t>(node->parentIndex) < scene->nodeCount) {
        const QexMatrix* parent = QexPODAnimation_WorldMatrix(scene, &scene->nodes[node->parentIndex]);
        world = Product(Load4x4(parent->m), world);
    }
    Store4x4(out->m, world);
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
        impl->bindMeshNodes[i] = kNoMeshNode;
    }
}

void QexPODModel_GetBoneWorldMatrix(QexPODModel* scene, QexMatrix* out, QexPODNode* meshNode,
                                    QexPODNode* boneNode) {
    *out = *QexPODAnimation_BoneMatrix(scene, meshNode, boneNode);
}

}  // extern "C"
