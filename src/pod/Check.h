// What a scene must fulfil to be drawn.
#pragma once

#include "pod/Extents.h"
#include "Qex/pod.h"

constexpr uint32_t kPODMaxParents = 1000;  // the world matrix of a node is found by recursion

struct QexPODFault {
    char text[224];
};

// Null, or what makes a scene that was read whole unfit to be drawn, in the text of the fault.
const char* QexPODScene_Check(const QexPODModel& scene, QexPODExtents* const extents[kPODKinds],
                              QexPODFault* fault);
