// Meshes of plain arrays, for the engine's own modules.
#pragma once

#include "Qex/math.h"
#include "Qex/meshes.h"

// Arrays of a mesh in one block that the mesh owns. False, with the mesh empty, without memory. Which arrays
// there are is the caller's choice; the pointers are to be written through.
struct QexMeshArrays {
    QexVec3* positions;
    QexVec3* normals;
    QexVec2* uvs;
    uint16_t* indices;
};
bool QexMesh_Alloc(QexMesh* mesh, QexMeshArrays* arrays, uint64_t vertexCount, uint64_t indexCount);

// A vertex of a triangle.
inline uint32_t QexMesh_Corner(const QexMesh& mesh, uint32_t i) {
    return mesh.indexCount ? mesh.indices[i] : i;
}
inline uint32_t QexMesh_CornerCount(const QexMesh& mesh) {
    return mesh.indexCount ? mesh.indexCount : mesh.vertexCount;
}

// The colours of a mesh as a texture: RGBA, width x height, the first row at t = 0.
struct QexMeshColours {
    uint8_t* pixels;  // owned; from QexMemory_Alloc
    uint32_t width, height;
};

// Bakes vertex colours. One colour for all leaves the mesh as it is, and `parted` empty; otherwise `parted`
// is the mesh with three vertices of its own for each triangle and the texture coordinates of its patch.
// Null, or why it cannot be done.
const char* QexMesh_BakeColours(const QexMesh& mesh, QexMesh* parted, QexMeshColours* colours);

// Tangents of a mesh with normals and texture coordinates, of unit length and perpendicular to the normals.
void QexMesh_MakeTangents(const QexMesh& mesh, QexVec3* tangents);
