// Which frame each node of a scene is at, and whether it animates and is drawn.
#include <cmath>

#include "base/Diagnostics.h"
#include "pod/Animation.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

namespace {

constexpr int32_t kNullArgument = -9;
constexpr int32_t kUnknownName = -11;
constexpr int32_t kIndexOutOfRange = -12;

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
    const float last = static_cast<float>(QexPODAnimation_LastFrame(scene));
    return frame > last ? fmodf(frame, static_cast<float>(scene->frameCount)) : frame;
}

// A frame within the loop of `last` frames, whose end is its start.
float WrapLoop(float frame, float last) {
    if (frame >= last) return fmodf(frame, last);
    if (frame >= 0) return frame;
    const float rest = fmodf(frame, last);
    return rest < 0 ? rest + last : 0;
}

uint32_t SetStateBit(QexPODModel* scene, int64_t index, uint32_t bit, uint32_t enable) {
    if (index < 0 || index >= scene->nodeCount) return 0;
    uint32_t& flags = scene->nodes[index].stateFlags;
    const uint32_t previous = flags & bit ? 1 : 0;
    flags = enable & 1 ? flags | bit : flags & ~bit;
    return previous;
}

}  // namespace

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
    const float last = static_cast<float>(QexPODAnimation_LastFrame(scene));
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
        const float current = QexPODAnimation_NodeFrame(node);
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

// ---- State ----

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

}  // extern "C"
