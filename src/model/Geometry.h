// What of a mesh goes into GL buffers, and in which layout.
#pragma once

#include <cstdint>

#include "Qex/pod.h"

// Builds a mesh's attribute layout and box, and its GL buffers' contents where the mesh's own bytes cannot be
// uploaded as they are.
struct QexMeshUpload {
    const uint8_t* vertices;  // vertexBytes to upload; the mesh's own or `packedVertices`
    uint32_t vertexBytes;
    const uint16_t* indices;  // indexCount to upload, or null
    uint32_t indexCount;
    uint8_t* packedVertices;  // owned, or null
    uint16_t* packedIndices;  // owned, or null
};

// False, with a line in the log, when the mesh cannot be drawn or memory runs out. Free with Release in any
// case.
bool QexModelGeometry_Prepare(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t meshIndex);
void QexModelGeometry_Release(QexMeshUpload* upload);
