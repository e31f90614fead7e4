// Frames and world matrices for the engine's own modules: the cached matrix itself instead of a copy.
//
// The pointer is good until a frame or an override changes; drawing code uses it at once.
#pragma once

#include "Qex/math.h"
#include "Qex/pod.h"

inline uint32_t QexPODAnimation_LastFrame(const QexPODModel* scene) {
    return scene->frameCount ? scene->frameCount - 1 : 0;
}

// The frame that a node is at.
inline float QexPODAnimation_NodeFrame(const QexPODNode* node) {
    return static_cast<float>(node->frame) + node->frameFraction;
}

const QexMatrix* QexPODAnimation_WorldMatrix(QexPODModel* scene, QexPODNode* node);

// What carries a skinned vertex into the world along one bone, see QexPODModel_GetBoneWorldMatrix. It is kept
// for the mesh node that asked last, so that batches, passes and eyes share it.
const QexMatrix* QexPODAnimation_BoneMatrix(QexPODModel* scene, const QexPODNode* meshNode,
                                            QexPODNode* boneNode);

// The node of an entry of a bone table. An entry of -1, a bone that the scene does not have, stands for the
// mesh node itself: what follows it moves as the mesh would without bones.
inline QexPODNode* QexPODAnimation_BoneNode(QexPODModel* scene, QexPODNode* meshNode, int32_t bone) {
    return bone < 0 ? meshNode : &scene->nodes[bone];
}
