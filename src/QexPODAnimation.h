// World matrices for the engine's own modules: the cached matrix itself instead of a copy.
//
// The pointer is good until a frame or an override changes; drawing code uses it at once.
#pragma once

#include "Qex.h"

const QexMatrix* QexPODAnimation_WorldMatrix(QexPODModel* scene, QexPODNode* node);

// What carries a skinned vertex into the world along one bone, see QexPODModel_GetBoneWorldMatrix. It is kept
// for the mesh node that asked last, so that batches, passes and eyes share it.
const QexMatrix* QexPODAnimation_BoneMatrix(QexPODModel* scene, const QexPODNode* meshNode,
                                            QexPODNode* boneNode);
