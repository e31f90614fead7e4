// Parts of a scene, for the engine's own modules.
#pragma once

#include "Qex.h"

// The mesh of a mesh node.
inline QexPODMesh* QexPODModel_MeshOf(const QexPODModel* scene, uint32_t nodeIndex) {
    return &scene->meshes[scene->nodes[nodeIndex].objectIndex];
}

// Where the first vertex of an element lies: in the mesh's interleaved block, or in the element's own data.
inline uint8_t* QexPODMesh_ElementData(const QexPODMesh* mesh, const CPODData& element) {
    return mesh->interleaved ? mesh->interleaved + reinterpret_cast<uintptr_t>(element.data) : element.data;
}

// The triangles of a mesh, those of strips included, and their corners: three vertices each, all wound alike.
uint32_t QexPODMesh_CountTriangles(const QexPODMesh& mesh);
void QexPODMesh_ListCorners(const QexPODMesh& mesh, uint32_t* corners);

// The bones that a vertex follows and their weights, zeros behind the last. A bone is an index into its
// batch's list; in a mesh without batches, a node's.
void QexPODMesh_ReadInfluences(const QexPODMesh* mesh, uint32_t vertex, float bones[4], float weights[4]);

// Cuts a skinned mesh of sound data anew into batches of at most maxBones bones: its triangles, strips too,
// become an indexed list, its vertices one interleaved block of those that triangles use. Null, or why it
// cannot be done; then the mesh is as it was.
const char* QexPODMesh_MakeBatches(QexPODMesh* mesh, int32_t maxBones);
