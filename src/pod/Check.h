// What a scene must fulfil to be drawn.
#pragma once

#include "pod/Extents.h"
#include "Qex/pod.h"

constexpr uint32_t kPODMaxParents = 1000;  // the world matrix of a node is found by recursion

struct QexPODFault {
    char text[224];
};

// What a scene that was read whole has to be checked for: its counts, then each mesh, then each node.
inline uint32_t QexPODScene_CheckParts(const QexPODModel& scene) {
    return 1 + scene.meshCount + scene.nodeCount;
}

// Null, or what makes that part of the scene unfit to be drawn, in the text of the fault.
const char* QexPODScene_Check(const QexPODModel& scene, QexPODExtents* const extents[kPODKinds],
                              uint32_t part, QexPODFault* fault);
