// What of a mesh goes into GL buffers, and in which layout.
#pragma once

#include "base/Step.h"
#include "Qex/pod.h"

// An element that is uploaded.
struct QexMeshUploadElement {
    const CPODData* data;
    const uint8_t* source;  // of the first vertex
    bool asFloats;          // converted at upload
    uint32_t size;          // bytes a vertex in the upload
};

// Builds a mesh's attribute layout and box, and its GL buffers' contents where the mesh's own bytes cannot be
// uploaded as they are.
struct QexMeshUpload {
    const uint8_t* vertices;  // vertexBytes to upload; the mesh's own or `packedVertices`
    uint32_t vertexBytes;
    const uint16_t* indices;  // indexCount to upload, or null
    uint32_t indexCount;
    uint8_t* packedVertices;  // owned, or null
    uint16_t* packedIndices;  // owned, or null
    QexVec3* madeBinormals;   // owned, or null
    uint32_t* corners;        // of the triangles that say where binormals are turned, owned, or null
    uint8_t* turned;          // by vertex; owned, or null
    uint32_t stride;          // of packed vertices
    uint32_t phase, done;     // of laying out, and items of it
    QexMeshUploadElement elements[QEX_ELEMENT_COUNT];
};

// Finds the layout, converts the indices and finds room. False, with a line in the log, when the mesh cannot
// be drawn or memory runs out. Free with Release in any case.
bool QexModelGeometry_Begin(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t meshIndex);

// Makes what the file lacks and lays out the vertices, so many bytes of them at most; then measures the
// boxes.
QexStep QexModelGeometry_LayOut(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t piece);

// Both at once.
bool QexModelGeometry_Prepare(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t meshIndex);
void QexModelGeometry_Release(QexMeshUpload* upload);
