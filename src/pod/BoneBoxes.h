// Boxes of what follows each bone of a mesh, and the box around a mesh as its bones stand.
#pragma once

#include "Qex/pod.h"

struct QexAABB;

// Measures the vertices that follow each bone of each batch, from positions as they are drawn: three floats
// each, `stride` bytes apart. Where memory runs out the mesh has no such boxes.
void QexPODMesh_MeasureBones(QexPODMesh* mesh, const uint8_t* positions, uint32_t stride);

// The axis-aligned box around a skinned mesh node in the world, as its bones stand now. A vertex lies between
// the places that its bones alone would carry it to, so that the box holds it. False for a mesh that was not
// measured, as with a weight below 0.
bool QexPODAnimation_SkinnedBox(QexPODModel* scene, uint32_t meshNode, QexAABB* out);
