// New bone batches for a skinned mesh.
#pragma once

#include "Qex/pod.h"

// Cuts a skinned mesh of sound data anew into batches of at most maxBones bones: its triangles, strips too,
// become an indexed list, its vertices one interleaved block of those that triangles use. Null, or why it
// cannot be done; then the mesh is as it was.
const char* QexPODMesh_MakeBatches(QexPODMesh* mesh, int32_t maxBones);
