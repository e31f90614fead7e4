// Triangles go into batches that share their bones.
#include "convert/Batches.h"

#include <Qex.h>
#include <algorithm>
#include <cstddef>
#include <list>
#include <new>
#include <set>
#include <unordered_map>

namespace {

// A vertex as the engine's batching takes it; it comes back with its bones counted within the batch.
struct BatchVertex {
    uint32_t source;
    float bones[4];
    uint8_t weights[4];
};

struct Batch {
    explicit Batch(int capacity) {
        CBatch_Constructor(&bones);
        CBatch_SetSize(&bones, capacity);
        if (!bones.bones) throw std::bad_alloc();
    }
    ~Batch() { CBatch_Destructor(&bones); }
    Batch(const Batch&) = delete;
    Batch& operator=(const Batch&) = delete;

    CBatch bones;
    std::vector<uint32_t> corners;  // three vertices of the whole mesh to a triangle
};

using Batches = std::list<Batch>;

// What the engine's batching made of some triangles. Batches that were left without a triangle are dropped.
void AddBatches(const QexBoneBatches& made, const std::vector<uint32_t>& indices, const BatchVertex* vertices,
                Batches* out) {
    for (int32_t b = 0; b < made.batchCount; ++b) {
        const auto first = static_cast<size_t>(made.offsets[b]) * 3;
        const size_t end =
            b + 1 < made.batchCount ? static_cast<size_t>(made.offsets[b + 1]) * 3 : indices.size();
        if (first == end) continue;
        out->emplace_back(made.maxBones);
        Batch& batch = out->back();
        for (int32_t i = 0; i < made.bonesPerBatch[b]; ++i) {
            CBatch_Add(&batch.bones, made.boneTable[static_cast<ptrdiff_t>(b) * made.maxBones + i]);
        }
        for (size_t i = first; i < end; ++i) batch.corners.push_back(vertices[indices[i]].source);
    }
}

// Batches the triangles; where they need more batches than the engine's list holds, half of them at a time.
void CollectBatches(const std::vector<BatchVertex>& vertices, std::vector<uint32_t> indices, int maxBones,
                    Batches* out) {
    QexBoneBatches made;
    uint32_t count = 0;
    void* block = nullptr;
    const size_t triangles = indices.size() / 3;
    const int32_t result = QexBoneBatches_Create(
        &made, &count, &block, indices.data(), static_cast<uint32_t>(vertices.size()), vertices.data(),
        sizeof(BatchVertex), offsetof(BatchVertex, weights), QEX_POD_UNSIGNED_BYTE_NORM,
        offsetof(BatchVertex, bones), QEX_POD_FLOAT, static_cast<uint32_t>(triangles), maxBones, 4);
    if (result == 0) {
        AddBatches(made, indices, static_cast<const BatchVertex*>(block), out);
        QexBoneBatches_Release(&made);
        QexMemory_Free(block);
        return;
    }
    if (triangles < 2) throw std::bad_alloc();
    const auto middle = indices.begin() + static_cast<ptrdiff_t>(triangles / 2 * 3);
    CollectBatches(vertices, {indices.begin(), middle}, maxBones, out);
    CollectBatches(vertices, {middle, indices.end()}, maxBones, out);
}

void Absorb(Batch* into, const Batch& batch) {
    CBatch_Merge(&into->bones, &batch.bones);
    into->corners.insert(into->corners.end(), batch.corners.begin(), batch.corners.end());
}

// Joins batches: from the one with most bones on, each takes in what costs it the fewest new bones for as
// long as anything fits.
Batches JoinBatches(Batches left) {
    Batches joined;
    while (!left.empty()) {
        const auto largest = std::max_element(left.begin(), left.end(), [](const Batch& a, const Batch& b) {
            return a.bones.count < b.bones.count;
        });
        joined.splice(joined.end(), left, largest);
        Batch& batch = joined.back();
        for (auto best = left.begin(); best != left.end();) {
            int32_t fewest = batch.bones.capacity + 1;
            best = left.end();
            for (auto it = left.begin(); it != left.end();) {
                const int32_t missing = CBatch_TestMerge(&batch.bones, &it->bones);
                if (missing == 0) {
                    Absorb(&batch, *it);
                    it = left.erase(it);
                    continue;
                }
                if (missing > 0 && missing < fewest) {
                    fewest = missing;
                    best = it;
                }
                ++it;
            }
            if (best == left.end()) break;
            Absorb(&batch, *best);
            left.erase(best);
            best = left.begin();
        }
    }
    return joined;
}

class PieceWriter {
  public:
    PieceWriter(const std::vector<VertexBones>& vertices, uint32_t maxVertices)
        : vertices_(vertices), maxVertices_(maxVertices) {}

    void Add(const Batch& batch) {
        bool open = false;
        for (size_t i = 0; i + 3 <= batch.corners.size(); i += 3) {
            // Three new vertices at the most; a piece may end up to two short of its limit.
            if (pieces_.empty() || pieces_.back().sources.size() + 3 > maxVertices_) {
                pieces_.emplace_back();
                known_.clear();
                open = false;
            }
            SkinPiece& piece = pieces_.back();
            if (!open) {
                piece.batchOffsets.push_back(static_cast<int32_t>(piece.indices.size() / 3));
                piece.batchBones.emplace_back(batch.bones.bones, batch.bones.bones + batch.bones.count);
                open = true;
            }
            for (size_t corner = i; corner < i + 3; ++corner) {
                piece.indices.push_back(VertexOf(batch, batch.corners[corner], &piece));
            }
        }
    }
    std::vector<SkinPiece> Take() { return std::move(pieces_); }

  private:
    uint32_t VertexOf(const Batch& batch, uint32_t source, SkinPiece* piece) {
        const VertexBones& vertex = vertices_[source];
        std::array<uint8_t, 4> local{};
        const int32_t* const begin = batch.bones.bones;
        for (size_t i = 0; i < 4; ++i) {
            if (vertex.weights[i] == 0) continue;
            const int32_t* const found =
                std::find(begin, begin + batch.bones.count, static_cast<int32_t>(vertex.bones[i]));
            local[i] = static_cast<uint8_t>(found - begin);
        }
        uint64_t key = source;
        for (const uint8_t index : local) key = key << 8 | index;
        const auto [entry, isNew] = known_.emplace(key, static_cast<uint32_t>(piece->sources.size()));
        if (isNew) {
            piece->sources.push_back(source);
            piece->boneIndices.push_back(local);
        }
        return entry->second;
    }

    const std::vector<VertexBones>& vertices_;
    uint32_t maxVertices_;
    std::vector<SkinPiece> pieces_;
    std::unordered_map<uint64_t, uint32_t> known_;  // the vertices of the last piece
};

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
    Batches batches;
    CollectBatches(whole, indices, maxBones, &batches);
    PieceWriter writer(vertices, maxVertices);
    for (const Batch& batch : JoinBatches(std::move(batches))) writer.Add(batch);
    return writer.Take();
}
