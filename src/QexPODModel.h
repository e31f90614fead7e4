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
