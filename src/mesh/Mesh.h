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

// Tangents of a mesh with normals and texture coordinates, of unit length and perpendicular to the normals.
void QexMesh_MakeTangents(const QexMesh& mesh, QexVec3* tangents);
