// Triangles go into batches that share their bones.
#include "convert/Batches.h"

#include <Qex.h>
#include <algorithm>
#include <cstddef>
#include <new>
#include <set>
#include <unordered_map>

#include "pod/MakeBatches.h"

namespace {

// A vertex as the engine's batching takes it; it comes back with its bones counted within the batch.
struct BatchVertex {
    uint32_t source;
    float bones[4];
    uint8_t weights[4];
};

// What the engine's batching makes of some triangles.
struct Batched {
    Batched(const std::vector<BatchVertex>& in, std::vector<uint32_t> triangles, int maxBones)
        : indices(std::move(triangles)) {
        const QexBoneVertices layout = {reinterpret_cast<const uint8_t*>(in.data()),
                                        static_cast<uint32_t>(in.size()),
                                        sizeof(BatchVertex),
                                        offsetof(BatchVertex, weights),
                                        QEX_POD_UNSIGNED_BYTE_NORM,
                                        offsetof(BatchVertex, bones),
                                        QEX_POD_FLOAT,
                                        4};
        uint32_t count = 0;
        void* block = nullptr;
        result =
            QexBoneBatches_Make(&batches, &count, &block, indices.data(), layout,
                                static_cast<uint32_t>(indices.size() / 3), maxBones, QexBoneJoin::Grouped);
        vertices = static_cast<BatchVertex*>(block);
    }
    ~Batched() {
        QexBoneBatches_Release(&batches);
        QexMemory_Free(vertices);
    }
    Batched(const Batched&) = delete;
    Batched& operator=(const Batched&) = delete;

    QexMadeBatches result;
    QexBoneBatches batches = {};
    BatchVertex* vertices;
    std::vector<uint32_t> indices;
};

class PieceWriter {
  public:
    explicit PieceWriter(uint32_t maxVertices) : maxVertices_(maxVertices) {}

    void Add(const Batched& made) {
        const QexBoneBatches& b = made.batches;
        for (ptrdiff_t batch = 0; batch < b.batchCount; ++batch) {
            const bool last = batch + 1 == b.batchCount;
            const int32_t* bones = b.boneTable + batch * b.maxBones;
            AddBatch(made, {bones, bones + b.bonesPerBatch[batch]}, 3 * static_cast<size_t>(b.offsets[batch]),
                     last ? made.indices.size() : 3 * static_cast<size_t>(b.offsets[batch + 1]));
        }
    }
    std::vector<SkinPiece> Take() { return std::move(pieces_); }

  private:
    // The corners `first` to `end`, which follow these bones.
    void AddBatch(const Batched& made, const std::vector<int32_t>& bones, size_t first, size_t end) {
        bool open = false;
        for (size_t i = first; i < end; i += 3) {
            // Three new vertices at the most; a piece may end up to two short of its limit.
            if (pieces_.empty() || pieces_.back().sources.size() + 3 > maxVertices_) {
                pieces_.emplace_back();
                known_.clear();
                open = false;
            }
            SkinPiece& piece = pieces_.back();
            if (!open) {
                piece.batchOffsets.push_back(static_cast<int32_t>(piece.indices.size() / 3));
                piece.batchBones.push_back(bones);
                open = true;
            }
            for (size_t corner = i; corner < i + 3; ++corner) {
                piece.indices.push_back(NumberOf(made.vertices[made.indices[corner]], &piece));
            }
        }
    }

    uint32_t NumberOf(const BatchVertex& vertex, SkinPiece* piece) {
        std::array<uint8_t, 4> bones{};
        for (size_t i = 0; i < 4; ++i) bones[i] = static_cast<uint8_t>(vertex.bones[i]);
        uint64_t key = vertex.source;
        for (const uint8_t bone : bones) key = key << 8 | bone;
        const auto [entry, isNew] = known_.emplace(key, static_cast<uint32_t>(piece->sources.size()));
        if (isNew) {
            piece->sources.push_back(vertex.source);
            piece->boneIndices.push_back(bones);
        }
        return entry->second;
    }

    uint32_t maxVertices_;
    std::vector<SkinPiece> pieces_;
    std::unordered_map<uint64_t, uint32_t> known_;  // the vertices of the last piece
};

// Batches the triangles; where they need more batches than the engine's list holds, half of them at a time.
void AddBatches(const std::vector<BatchVertex>& vertices, std::vector<uint32_t> indices, int maxBones,
                PieceWriter* writer) {
    const Batched made(vertices, indices, maxBones);
    if (made.result == QexMadeBatches::Made) return writer->Add(made);
    if (made.result == QexMadeBatches::OutOfMemory || indices.size() < 6) throw std::bad_alloc();
    const auto middle = indices.begin() + static_cast<ptrdiff_t>(indices.size() / 6 * 3);
    AddBatches(vertices, {indices.begin(), middle}, maxBones, writer);
    AddBatches(vertices, {middle, indices.end()}, maxBones, writer);
}

}  // namespace

int MostBonesOfATriangle(const std::vector<VertexBones>& vertices, const std::vector<uint32_t>& indices) {
    size_t most = 0;
    for (size_t i = 0; i + 3 <= indices.size(); i += 3) {
        std::set<uint32_t> bones;
        for (size_t corner = i; corner < i + 3; ++corner) {
            const VertexBones& vertex = vertices[indices[corner]];
            for (size_t k = 0; k < 4; ++k) {
                if (vertex.weights[k]) bones.insert(vertex.bones[k]);
            }
        }
        most = std::max(most, bones.size());
    }
    return static_cast<int>(most);
}

std::vector<SkinPiece> BatchSkin(const std::vector<VertexBones>& vertices,
                                 const std::vector<uint32_t>& indices, int maxBones, uint32_t maxVertices) {
    std::vector<BatchVertex> whole(vertices.size());
    for (size_t v = 0; v < vertices.size(); ++v) {
        whole[v].source = static_cast<uint32_t>(v);
        for (size_t i = 0; i < 4; ++i) {
            whole[v].bones[i] = static_cast<float>(vertices[v].bones[i]);
            whole[v].weights[i] = vertices[v].weights[i];
        }
    }
    PieceWriter writer(maxVertices);
    AddBatches(whole, indices, maxBones, &writer);
    return writer.Take();
}
