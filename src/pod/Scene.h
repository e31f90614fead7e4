// Parts of a scene, for the engine's own modules.
#pragma once

#include "base/Memory.h"
#include "pod/Types.h"
#include "Qex/pod.h"

// What a zeroed record holds before anything is known of it.
void QexPODMaterial_SetDefaults(QexPODMaterial* material);
void QexPODMesh_SetDefaults(QexPODMesh* mesh);
void QexPODNode_SetDefaults(QexPODNode* node);

// Frees a channel's keys, unless they lie in the memory that the scene was read from, and forgets them.
void QexPODNode_FreeKeys(QexPODNode* node, const QexPODChannel& channel);

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

// ---- Bones ----

// Whether the vertices of a mesh follow bones.
inline bool QexPODMesh_HasBones(const QexPODMesh& mesh) {
    return mesh.boneIndices.componentCount && mesh.boneWeights.componentCount && mesh.vertexCount;
}

// Whether the triangles of a mesh are such as batches can be drawn of.
inline bool QexPODMesh_IsIndexedList(const QexPODMesh& mesh) {
    return mesh.faces.data && !mesh.stripCount;
}

// The bones that a vertex follows and their weights, zeros behind the last. A bone is an index into its
// batch's list; in a mesh without batches, a node's.
void QexPODMesh_ReadInfluences(const QexPODMesh* mesh, uint32_t vertex, float bones[4], float weights[4]);

// The triangles of a batch.
struct QexPODFaceRun {
    uint32_t first;
    uint32_t end;
};

inline QexPODFaceRun QexPODMesh_FacesOfBatch(const QexPODMesh& mesh, uint32_t batch) {
    const QexBoneBatches& b = mesh.boneBatches;
    const bool last = batch + 1 >= static_cast<uint32_t>(b.batchCount);
    return {static_cast<uint32_t>(b.offsets[batch]),
            last ? mesh.faceCount : static_cast<uint32_t>(b.offsets[batch + 1])};
}

// Calls visit(vertex, its batch) for the vertices of all batches of an indexed list, each once a
// batch where memory allows. Ends with false as soon as a visit does.
template <class Visit>
bool QexPODMesh_VisitBatches(const QexPODMesh& mesh, Visit visit) {
    const uint32_t count = static_cast<uint32_t>(mesh.boneBatches.batchCount);
    const uint32_t size = QexPODData_ElementSize(mesh.faces.type, 1);
    QexScratch<uint32_t> seenIn;  // of each vertex: the last batch that had it, counted from 1
    seenIn.Own(QexMemory_AllocZeroed<uint32_t>(count ? mesh.vertexCount : 0));
    for (uint32_t batch = 0; batch < count; ++batch) {
        const QexPODFaceRun run = QexPODMesh_FacesOfBatch(mesh, batch);
        for (uint64_t i = uint64_t{run.first} * 3; i < uint64_t{run.end} * 3; ++i) {
            uint32_t vertex = 0;
            QexPODVertex_ReadInt(&vertex, mesh.faces.data + i * size, mesh.faces.type);
            if (seenIn && seenIn[vertex] == batch + 1) continue;
            if (seenIn) seenIn[vertex] = batch + 1;
            if (!visit(vertex, batch)) return false;
        }
    }
    return true;
}
