// Checks a scene that was read whole: what is broken here fails with one line. It changes nothing.
#include "pod/Check.h"

#include <cstdarg>
#include <cstdio>

#include "base/Diagnostics.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/pod.h"

namespace {

struct Check {
    const QexPODModel& scene;
    QexPODFault* fault;
    const char* kind;  // the record being checked
    uint32_t index;
};

bool Fail(const Check& at, const char* format, ...) QEX_PRINTF(2, 3);
bool Fail(const Check& at, const char* format, ...) {
    char* text = at.fault->text;
    const size_t used =
        static_cast<size_t>(snprintf(text, sizeof at.fault->text, "%s %u: ", at.kind, at.index));
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text + used, sizeof at.fault->text - used, format, arguments);
    va_end(arguments);
    return false;
}

// ---- Meshes ----

bool CheckElement(const Check& at, const QexPODMesh& mesh, uint32_t number, uint32_t ownBytes) {
    const CPODData& element = *QexPODMesh_Element(&mesh, number);
    const char* name = QexPODElement_Of(number).name;
    const uint64_t offset = mesh.interleaved ? reinterpret_cast<uintptr_t>(element.data) : 0;
    const uint64_t bytes = mesh.interleaved ? mesh.interleavedBytes : ownBytes;
    if (!element.componentCount || !mesh.vertexCount) return true;
    if (!QexPODType_Of(element.type).componentSize)
        return Fail(at, "%s of unknown type %u", name, element.type);
    if (element.componentCount > 4) return Fail(at, "%s of %u components", name, element.componentCount);
    const uint32_t size = QexPODData_ElementSize(element);
    if (element.stride < size && mesh.vertexCount > 1)
        return Fail(at, "%s of %u bytes with a stride of %u", name, size, element.stride);
    const uint64_t end = offset + uint64_t{mesh.vertexCount - 1} * element.stride + size;
    if (end <= bytes) return true;
    return Fail(at, "%s of %u vertices reach byte %llu of %llu", name, mesh.vertexCount,
                static_cast<unsigned long long>(end), static_cast<unsigned long long>(bytes));
}

bool CheckElements(const Check& at, const QexPODMesh& mesh, const uint32_t* extents) {
    for (uint32_t i = kPODVertices; i < QexPODMesh_ElementCount(&mesh); ++i)
        if (!CheckElement(at, mesh, i, extents[kExtentElements + i])) return false;
    return true;
}

template <class Index>
uint32_t Highest(const uint8_t* data, uint64_t count) {
    const Index* indices = reinterpret_cast<const Index*>(data);
    Index highest = 0;
    for (uint64_t i = 0; i < count; ++i) highest = indices[i] > highest ? indices[i] : highest;
    return highest;
}

// The first `count` face indices.
bool CheckIndices(const Check& at, const QexPODMesh& mesh, uint32_t count, uint32_t bytes) {
    const bool wide = mesh.faces.type == QEX_POD_UNSIGNED_INT;
    if (!wide && mesh.faces.type != QEX_POD_UNSIGNED_SHORT)
        return Fail(at, "face indices of type %u", mesh.faces.type);
    const uint32_t given = bytes / QexPODData_ElementSize(mesh.faces.type, 1);
    if (count > given) return Fail(at, "its faces need %u indices, it has %u", count, given);
    if (!count) return true;
    const uint32_t highest =
        wide ? Highest<uint32_t>(mesh.faces.data, count) : Highest<uint16_t>(mesh.faces.data, count);
    return highest < mesh.vertexCount || Fail(at, "a face uses vertex %u of %u", highest, mesh.vertexCount);
}

bool CheckFaces(const Check& at, const QexPODMesh& mesh, const uint32_t* extents) {
    uint64_t count = uint64_t{mesh.faceCount} * 3;
    if (mesh.stripCount) {
        if (mesh.stripCount > extents[kExtentStrips])
            return Fail(at, "%u strips, but %u strip lengths", mesh.stripCount, extents[kExtentStrips]);
        count = 0;
        for (uint32_t i = 0; i < mesh.stripCount; ++i) count += uint64_t{mesh.stripLengths[i]} + 2;
    }
    if (count > INT32_MAX) return Fail(at, "more faces than can be drawn");
    const uint32_t corners = static_cast<uint32_t>(count);
    if (mesh.faces.data) return CheckIndices(at, mesh, corners, extents[kExtentElements + kPODFaces]);
    // Only positions show that the vertices counted are really there.
    const uint32_t vertices = mesh.vertices.componentCount ? mesh.vertexCount : 0;
    return corners <= vertices || Fail(at, "its faces need %u vertices, it has %u", corners, vertices);
}

bool CheckBatch(const Check& at, const QexPODMesh& mesh, int32_t batch) {
    const QexBoneBatches& b = mesh.boneBatches;
    const int32_t bones = b.bonesPerBatch[batch];
    if (bones < 0 || bones > b.maxBones)
        return Fail(at, "batch %d has %d bones of %d", batch, bones, b.maxBones);
    const QexPODFaceRun run = QexPODMesh_FacesOfBatch(mesh, static_cast<uint32_t>(batch));
    if (run.first > run.end || run.end > mesh.faceCount || (batch == 0 && run.first != 0))
        return Fail(at, "batch %d covers faces %u to %u of %u", batch, run.first, run.end, mesh.faceCount);
    return true;
}

// Every bone that a vertex really follows lies in its batch.
bool CheckBones(const Check& at, const QexPODMesh& mesh, uint32_t vertex, int32_t bones) {
    float bone[4], weight[4];
    QexPODMesh_ReadInfluences(&mesh, vertex, bone, weight);
    for (uint32_t i = 0; i < QexPODData_Components(mesh.boneIndices); ++i)
        if (weight[i] != 0 && !(bone[i] >= 0 && bone[i] < static_cast<float>(bones)))
            return Fail(at, "vertex %u follows bone %g of a batch of %d", vertex,
                        static_cast<double>(bone[i]), bones);
    return true;
}

bool CheckSkin(const Check& at, const QexPODMesh& mesh, const uint32_t* extents) {
    const QexBoneBatches& b = mesh.boneBatches;
    if (b.batchCount < 0 || b.maxBones < 0)
        return Fail(at, "%d batches of %d bones", b.batchCount, b.maxBones);
    const uint64_t table = static_cast<uint64_t>(b.batchCount) * static_cast<uint64_t>(b.maxBones);
    const uint32_t count = static_cast<uint32_t>(b.batchCount);
    if (table > extents[kExtentBoneTable] || count > extents[kExtentBonesPerBatch] ||
        count > extents[kExtentBatchOffsets])
        return Fail(at, "%d batches of %d bones, but shorter tables", b.batchCount, b.maxBones);
    if (!QexPODMesh_HasBones(mesh)) return true;
    const uint32_t indices = QexPODData_Components(mesh.boneIndices);
    const uint32_t weights = QexPODData_Components(mesh.boneWeights);
    if (indices != weights) return Fail(at, "%u bone indices, but %u weights a vertex", indices, weights);
    if (!QexPODMesh_IsIndexedList(mesh)) return true;
    for (int32_t batch = 0; batch < b.batchCount; ++batch)
        if (!CheckBatch(at, mesh, batch)) return false;
    return QexPODMesh_VisitBatches(mesh, [&](uint32_t vertex, uint32_t batch) {
        return CheckBones(at, mesh, vertex, b.bonesPerBatch[batch]);
    });
}

// ---- The rest ----

// Walks up the parents, which must end at a root.
bool CheckParents(const Check& at) {
    const uint32_t nodes = at.scene.nodeCount;
    int32_t parent = at.scene.nodes[at.index].parentIndex;
    for (uint32_t steps = 0; parent != -1; ++steps) {
        if (static_cast<uint32_t>(parent) >= nodes)
            return Fail(at, "its parent is node %d of %u", parent, nodes);
        if (steps > kPODMaxParents)
            return Fail(at, "its parents form a circle, or more than %u of them", kPODMaxParents);
        parent = at.scene.nodes[parent].parentIndex;
    }
    return true;
}

bool CheckNode(const Check& at) {
    const int32_t mesh = at.scene.nodes[at.index].objectIndex;
    if (at.index < at.scene.meshNodeCount && static_cast<uint32_t>(mesh) >= at.scene.meshCount)
        return Fail(at, "it draws mesh %d of %u", mesh, at.scene.meshCount);
    return CheckParents(at);
}

bool CheckCounts(const QexPODModel& scene, QexPODFault* fault) {
    const uint64_t ordered = uint64_t{scene.meshNodeCount} + scene.lightCount + scene.cameraCount;
    if (ordered <= scene.nodeCount) return true;
    snprintf(fault->text, sizeof fault->text, "%u nodes, but %u mesh nodes, %u lights and %u cameras",
             scene.nodeCount, scene.meshNodeCount, scene.lightCount, scene.cameraCount);
    return false;
}

bool CheckMesh(const Check& at, const uint32_t* extents) {
    const QexPODMesh& mesh = at.scene.meshes[at.index];
    return CheckElements(at, mesh, extents) && CheckFaces(at, mesh, extents) && CheckSkin(at, mesh, extents);
}

}  // namespace

const char* QexPODScene_Check(const QexPODModel& scene, QexPODExtents* const extents[kPODKinds],
                              uint32_t part, QexPODFault* fault) {
    bool sound;
    if (part == 0)
        sound = CheckCounts(scene, fault);
    else if (part <= scene.meshCount)
        sound = CheckMesh({scene, fault, "mesh", part - 1}, extents[kPODMesh][part - 1]);
    else
        sound = CheckNode({scene, fault, "node", part - 1 - scene.meshCount});
    return sound ? nullptr : fault->text;
}
