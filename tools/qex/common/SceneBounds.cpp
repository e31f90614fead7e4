// Vertices as the engine draws them: unpacked, moved by their bones and their node.
#include "common/SceneBounds.h"

#include <algorithm>
#include <cmath>

namespace {

const uint8_t* ElementAt(const QexPODMesh& mesh, const CPODData& element, uint32_t vertex) {
    const uint8_t* base =
        mesh.interleaved ? mesh.interleaved + reinterpret_cast<uintptr_t>(element.data) : element.data;
    return base + static_cast<size_t>(vertex) * element.stride;
}

QexVec4 ReadPosition(const QexPODMesh& mesh, uint32_t vertex) {
    QexVec4 position = ReadElement(mesh, mesh.vertices, vertex);
    position.w = 1;
    QexMatrix_TransformVec4(&mesh.unpackMatrix, &position, &position);
    return position;
}

void AddPoint(const QexVec4& p, std::vector<QexVec3>* points) {
    if (std::isfinite(p.x) && std::isfinite(p.y) && std::isfinite(p.z)) points->push_back({p.x, p.y, p.z});
}

float Component(const QexVec4& v, uint32_t i) {
    return i == 0 ? v.x : i == 1 ? v.y : i == 2 ? v.z : v.w;
}

// The vertices of each batch's triangles, moved by the batch's bones.
void CollectSkinned(QexPODModel* scene, uint32_t meshNode, uint32_t step, std::vector<QexVec3>* points) {
    QexPODNode* node = &scene->nodes[meshNode];
    const QexPODMesh& mesh = scene->meshes[node->objectIndex];
    const QexBoneBatches& batches = mesh.boneBatches;
    // One at least: bones of weight 0 count as bone 0, even in batches without bones.
    std::vector<QexMatrix> matrices(static_cast<size_t>(std::max(batches.maxBones, 1)));
    const uint32_t indexSize = mesh.faces.type == QEX_POD_UNSIGNED_INT ? 4 : 2;
    for (int32_t b = 0; b < batches.batchCount; ++b) {
        const int32_t* bones = batches.boneTable + static_cast<ptrdiff_t>(b) * batches.maxBones;
        for (int32_t i = 0; i < batches.bonesPerBatch[b]; ++i)
            QexPODModel_GetBoneWorldMatrix(scene, &matrices[static_cast<size_t>(i)], node,
                                           bones[i] < 0 ? node : &scene->nodes[bones[i]]);
        const uint32_t end =
            b + 1 < batches.batchCount ? static_cast<uint32_t>(batches.offsets[b + 1]) : mesh.faceCount;
        for (uint32_t i = static_cast<uint32_t>(batches.offsets[b]) * 3; i < end * 3; i += step) {
            uint32_t vertex = 0;
            QexPODVertex_ReadInt(&vertex, mesh.faces.data + static_cast<size_t>(i) * indexSize,
                                 mesh.faces.type);
            const QexVec4 position = ReadPosition(mesh, vertex);
            const QexVec4 index = ReadElement(mesh, mesh.boneIndices, vertex),
                          weight = ReadElement(mesh, mesh.boneWeights, vertex);
            QexVec4 sum = {0, 0, 0, 0};
            for (uint32_t k = 0; k < mesh.boneIndices.componentCount; ++k) {
                QexVec4 moved;
                // Weights in unscaled bytes are shares of 255.
                float share = Component(weight, k);
                if (mesh.boneWeights.type == QEX_POD_UNSIGNED_BYTE) share /= 255.0f;
                QexMatrix_TransformVec4(&matrices[static_cast<size_t>(Component(index, k))], &position,
                                        &moved);
                sum = {sum.x + moved.x * share, sum.y + moved.y * share, sum.z + moved.z * share, 1};
            }
            AddPoint(sum, points);
        }
    }
}

}  // namespace

void Bounds::Add(const QexVec3& p) {
    if (empty) low = high = p;
    empty = false;
    low = {std::min(low.x, p.x), std::min(low.y, p.y), std::min(low.z, p.z)};
    high = {std::max(high.x, p.x), std::max(high.y, p.y), std::max(high.z, p.z)};
}

QexVec4 ReadElement(const QexPODMesh& mesh, const CPODData& element, uint32_t vertex) {
    QexVec4 value;
    QexPODVertex_ReadVec(&value.x, ElementAt(mesh, element, vertex), element.type,
                         static_cast<int32_t>(element.componentCount));
    return value;
}

void CollectPoints(QexPODModel* scene, uint32_t meshNode, size_t limit, std::vector<QexVec3>* points) {
    QexPODNode* node = &scene->nodes[meshNode];
    const QexPODMesh& mesh = scene->meshes[node->objectIndex];
    if (!mesh.vertices.componentCount || !mesh.vertexCount) return;
    const uint32_t count = mesh.skinned ? mesh.faceCount * 3 : mesh.vertexCount;
    const uint32_t step = std::max<uint32_t>(1, static_cast<uint32_t>(count / std::max<size_t>(1, limit)));
    if (mesh.skinned) {
        CollectSkinned(scene, meshNode, step, points);
        return;
    }
    QexMatrix world;
    QexPODModel_GetWorldMatrix(scene, &world, node);
    for (uint32_t v = 0; v < mesh.vertexCount; v += step) {
        QexVec4 position = ReadPosition(mesh, v);
        QexMatrix_TransformVec4(&world, &position, &position);
        AddPoint(position, points);
    }
}

float Bounds::LongestEdge() const {
    return std::max({high.x - low.x, high.y - low.y, high.z - low.z});
}

Bounds BoundsOf(const std::vector<QexVec3>& points) {
    Bounds bounds;
    for (const QexVec3& point : points) bounds.Add(point);
    return bounds;
}
