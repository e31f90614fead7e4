// Boxes of bones: measured once, carried along with the bones whenever the mesh's box is asked for.
#include "pod/BoneBoxes.h"

#include "math/Float4.h"
#include "pod/Animation.h"
#include "pod/Scene.h"
#include "Qex/geometry.h"
#include "Qex/math.h"

namespace {

void Widen(QexAABB* box, const QexVec3& point) {
    const QexAABB at = {point, point};
    QexBoundingBox_UnionAAABB(box, box, &at);
}

Float4 ToLanes(const QexVec3& v) {
    return Float4{v.x, v.y, v.z, 0};
}

QexVec3 FromLanes(Float4 v) {
    return {v[0], v[1], v[2]};
}

// The box around a box that a matrix carries along.
QexAABB Carry(const Float4x4& m, const QexAABB& box) {
    const Float4 low = ToLanes(box.min), high = ToLanes(box.max);
    const Float4 centre = (low + high) * 0.5f, reach = (high - low) * 0.5f;
    const Float4 at = Combine3(m.x, m.y, m.z, centre) + m.w;
    const Float4 half = Combine3(Magnitude(m.x), Magnitude(m.y), Magnitude(m.z), reach);
    return {FromLanes(at - half), FromLanes(at + half)};
}

}  // namespace

void QexPODMesh_MeasureBones(QexPODMesh* mesh, const uint8_t* positions, uint32_t stride) {
    const QexBoneBatches& batches = mesh->boneBatches;
    QexMemory_FreeArray(mesh->boneBoxes);
    if (!mesh->skinned || !QexPODMesh_HasBones(*mesh) || !QexPODMesh_IsIndexedList(*mesh)) return;
    const uint32_t perBatch = static_cast<uint32_t>(batches.maxBones);
    const uint32_t count = static_cast<uint32_t>(batches.batchCount) * perBatch;
    const uint32_t influences = QexPODData_Components(mesh->boneIndices);
    mesh->boneBoxes = QexMemory_AllocArray<QexAABB>(count);
    mesh->boneBoxCount = mesh->boneBoxes ? count : 0;
    if (!mesh->boneBoxes) return;
    for (uint32_t i = 0; i < count; ++i) QexBoundingBox_InitAABB(&mesh->boneBoxes[i]);
    const bool measured = QexPODMesh_VisitBatches(*mesh, [=](uint32_t vertex, uint32_t batch) {
        float bones[4], weights[4];
        QexVec3 position;
        if (vertex >= mesh->vertexCount) return false;
        memcpy(&position, positions + uint64_t{vertex} * stride, sizeof position);
        QexPODMesh_ReadInfluences(mesh, vertex, bones, weights);
        for (uint32_t i = 0; i < influences; ++i) {
            if (!(weights[i] >= 0)) return false;
            if (weights[i] > 0 && bones[i] >= 0 && bones[i] < static_cast<float>(perBatch))
                Widen(&mesh->boneBoxes[batch * perBatch + static_cast<uint32_t>(bones[i])], position);
        }
        return true;
    });
    if (!measured) QexMemory_FreeArray(mesh->boneBoxes);
}

bool QexPODAnimation_SkinnedBox(QexPODModel* scene, uint32_t meshNode, QexAABB* out) {
    QexPODNode* node = &scene->nodes[meshNode];
    const QexPODMesh& mesh = *QexPODModel_MeshOf(scene, meshNode);
    const QexBoneBatches& batches = mesh.boneBatches;
    // Batches that were made anew since then have no boxes.
    const int64_t entries = int64_t{batches.batchCount} * batches.maxBones;
    if (!mesh.skinned || !mesh.boneBoxes || entries != mesh.boneBoxCount) return false;
    QexBoundingBox_InitAABB(out);
    for (int32_t batch = 0; batch < batches.batchCount; ++batch) {
        const int64_t first = int64_t{batch} * batches.maxBones;
        for (int64_t i = first; i < first + batches.bonesPerBatch[batch]; ++i) {
            const QexAABB& box = mesh.boneBoxes[i];
            if (!(box.min.x <= box.max.x)) continue;
            QexPODNode* bone = QexPODAnimation_BoneNode(scene, node, batches.boneTable[i]);
            const QexAABB carried = Carry(Load4x4(QexPODAnimation_BoneMatrix(scene, node, bone)->m), box);
            QexBoundingBox_UnionAAABB(out, out, &carried);
        }
    }
    return out->min.x <= out->max.x;
}
