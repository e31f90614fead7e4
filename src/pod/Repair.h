// What is odd in a scene, but can be drawn.
#pragma once

#include "pod/Extents.h"
#include "Qex/pod.h"

// Indices that may name what the scene does not have: they count as none.
enum QexPODReference {
    kMaterialOfNode,
    kTextureOfMaterial,
    kTargetOfCamera,
    kTargetOfLight,
    kBoneOfBatch,
    kReferences
};

struct QexPODRepair {
    QexPODModel* scene;
    uint32_t dangling[kReferences];  // how many indices of each name nothing
};

// What of a scene is put right one after the other: each mesh, each node, then the rest.
inline uint32_t QexPODScene_RepairParts(const QexPODModel& scene) {
    return scene.meshCount + scene.nodeCount + 1;
}

// Puts right what is odd in a part of a scene that passed the checks, with a line in the log for each kind of
// it, and marks its skinned meshes.
void QexPODScene_Repair(QexPODRepair* repair, QexPODExtents* const extents[kPODKinds], uint32_t part);
