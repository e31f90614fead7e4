// Gives a skinned mesh new bone batches: one that was read without any, or whose batches need more bones than
// the shaders hold.
#include "pod/Rebatch.h"

#include <cstddef>
#include <cstring>

#include "base/Memory.h"
#include "pod/MakeBatches.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

namespace {

constexpr uint32_t kMaxVertices = 65536;  // that 16-bit indices reach
const char* const kOutOfMemory = "out of memory";

// A vertex of the mesh, with the nodes that it follows.
struct SkinVertex {
    uint32_t source;
    float bones[4];
    float weights[4];
};

struct Triangles {
    uint32_t count = 0;
    QexScratch<uint32_t> corners;  // three a triangle: numbers of vertices in the mesh, then in `vertices`
    QexScratch<SkinVertex> vertices;
    uint32_t vertexCount = 0;
};

// Elements other than faces and bone indices that a mesh has.
struct ElementList {
    CPODData* elements[kPODMaxElements];
    uint32_t count = 0;
};

// `bones` is a batch's row of the bone table, or null where the vertices hold node indices.
SkinVertex ReadVertex(const QexPODMesh& mesh, uint32_t vertex, const int32_t* bones) {
    SkinVertex out = {vertex, {}, {}};
    QexPODMesh_ReadInfluences(&mesh, vertex, out.bones, out.weights);
    for (int i = 0; i < 4; ++i) {
        if (out.weights[i] == 0)
            out.bones[i] = 0;
        else if (bones)
            out.bones[i] = static_cast<float>(bones[static_cast<int32_t>(out.bones[i])]);
    }
    return out;
}

// Fills the triangles; a vertex that several batches use becomes one for each, as its bones differ.
bool ReadTriangles(const QexPODMesh& mesh, Triangles* out) {
    const QexBoneBatches& batches = mesh.boneBatches;
    const uint32_t batchCount = batches.batchCount ? static_cast<uint32_t>(batches.batchCount) : 1;
    out->count = QexPODMesh_CountTriangles(mesh);
    const uint64_t corners = uint64_t{out->count} * 3;
    struct Seen {
        uint32_t batch;  // counted from 1
        uint32_t number;
    };
    QexScratch<Seen> seen;
    if (!out->corners.Alloc(corners) || !out->vertices.Alloc(corners) || !seen.Alloc(mesh.vertexCount))
        return false;
    memset(seen.Get(), 0, mesh.vertexCount * sizeof(Seen));
    QexPODMesh_ListCorners(mesh, out->corners.Get());
    for (uint32_t b = 0; b < batchCount; ++b) {
        const bool tables = batches.batchCount > 0;
        const int32_t* bones = tables ? batches.boneTable + int64_t{b} * batches.maxBones : nullptr;
        const QexPODFaceRun run = tables ? QexPODMesh_FacesOfBatch(mesh, b) : QexPODFaceRun{0, out->count};
        for (uint64_t i = uint64_t{run.first} * 3; i < uint64_t{run.end} * 3; ++i) {
            Seen& at = seen[out->corners[i]];
            if (at.batch != b + 1) {
                at = {b + 1, out->vertexCount};
                out->vertices[out->vertexCount++] = ReadVertex(mesh, out->corners[i], bones);
            }
            out->corners[i] = at.number;
        }
    }
    return true;
}

ElementList ListElements(QexPODMesh* mesh) {
    ElementList list;
    for (uint32_t i = kPODVertices; i < QexPODMesh_ElementCount(mesh); ++i) {
        CPODData* element = QexPODMesh_Element(mesh, i);
        if (i != kPODBoneIndices && element->componentCount) list.elements[list.count++] = element;
    }
    return list;
}

uint32_t AlignedSize(const CPODData& element) {
    return (QexPODData_ElementSize(element) + 3) / 4 * 4;
}

// Lays the vertices out as one interleaved block, the bone indices as bytes at its front.
bool ReplaceVertices(QexPODMesh* mesh, const SkinVertex* vertices, uint32_t count) {
    const ElementList list = ListElements(mesh);
    const uint32_t bones = QexPODData_Components(mesh->boneIndices);
    uint32_t stride = 4;
    for (uint32_t e = 0; e < list.count; ++e) stride += AlignedSize(*list.elements[e]);
    const uint64_t bytes = uint64_t{stride} * count;
    uint8_t* block = QexMemory_AllocZeroed<uint8_t>(bytes);
    if (!block) return false;
    for (uint32_t v = 0; v < count; ++v)
        QexVertexWriteVec(block + uint64_t{v} * stride, QEX_POD_UNSIGNED_BYTE, static_cast<int32_t>(bones),
                          vertices[v].bones);
    const bool own = !mesh->interleaved;
    uint32_t offset = 4;
    for (uint32_t e = 0; e < list.count; ++e) {
        CPODData* element = list.elements[e];
        const uint8_t* source = QexPODMesh_ElementData(mesh, *element);
        const uint32_t size = QexPODData_ElementSize(*element);
        for (uint32_t v = 0; v < count; ++v)
            memcpy(block + uint64_t{v} * stride + offset,
                   source + uint64_t{vertices[v].source} * element->stride, size);
        if (own) QexMemory_Free(element->data);
        element->data = reinterpret_cast<uint8_t*>(uintptr_t{offset});
        element->stride = stride;
        offset += AlignedSize(*element);
    }
    if (own) QexMemory_Free(mesh->boneIndices.data);
    mesh->boneIndices = {QEX_POD_UNSIGNED_BYTE, bones, stride, nullptr};
    QexMemory_Free(mesh->interleaved);
    mesh->interleaved = block;
    mesh->interleavedBytes = static_cast<uint32_t>(bytes);
    mesh->vertexCount = count;
    return true;
}

}  // namespace

const char* QexPODMesh_MakeBatches(QexPODMesh* mesh, int32_t maxBones) {
    Triangles triangles;
    if (!QexPODMesh_CountTriangles(*mesh)) return "it has no faces";
    if (!ReadTriangles(*mesh, &triangles)) return kOutOfMemory;
    QexBoneBatches batches;
    uint32_t count = 0;
    void* made = nullptr;
    const QexBoneVertices layout = {reinterpret_cast<const uint8_t*>(triangles.vertices.Get()),
                                    triangles.vertexCount,
                                    sizeof(SkinVertex),
                                    offsetof(SkinVertex, weights),
                                    QEX_POD_FLOAT,
                                    offsetof(SkinVertex, bones),
                                    QEX_POD_FLOAT,
                                    static_cast<int32_t>(QexPODData_Components(mesh->boneIndices))};
    const QexMadeBatches result =
        QexBoneBatches_Make(&batches, &count, &made, triangles.corners.Get(), layout, triangles.count,
                            maxBones, QexBoneJoin::InOrder);
    if (result == QexMadeBatches::OutOfMemory) return kOutOfMemory;
    if (result != QexMadeBatches::Made)
        return "a triangle follows too many bones, or there would be more than 512 batches";
    SkinVertex* vertices = static_cast<SkinVertex*>(made);
    const uint64_t corners = uint64_t{triangles.count} * 3;
    QexScratch<uint16_t> faces(corners);
    const char* fault = count > kMaxVertices ? "too many vertices for 16-bit indices"
                        : !faces || !ReplaceVertices(mesh, vertices, count) ? kOutOfMemory
                                                                            : nullptr;
    QexMemory_Free(vertices);
    if (fault) {
        QexBoneBatches_Release(&batches);
        return fault;
    }
    for (uint64_t i = 0; i < corners; ++i) faces[i] = static_cast<uint16_t>(triangles.corners[i]);
    QexMemory_Free(mesh->faces.data);
    mesh->faces.data = reinterpret_cast<uint8_t*>(faces.Take());
    mesh->faces.type = QEX_POD_UNSIGNED_SHORT;
    mesh->faceCount = triangles.count;
    QexMemory_FreeArray(mesh->stripLengths);
    mesh->stripCount = 0;
    QexBoneBatches_Release(&mesh->boneBatches);
    mesh->boneBatches = batches;
    return nullptr;
}
