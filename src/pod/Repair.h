// What is odd in a scene, but can be drawn.
#pragma once

#include "pod/Extents.h"
#include "Qex/pod.h"

// Puts right what is odd in a scene that passed the checks, with a line in the log for each kind of it, and
// marks its skinned meshes.
void QexPODScene_Repair(QexPODModel* scene, QexPODExtents* const extents[kPODKinds]);
