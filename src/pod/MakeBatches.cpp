// Bone batching: cuts a skinned mesh into runs of triangles that need few bones each. Nothing here is
// exported: tools compile this file in.
#include "pod/MakeBatches.h"

#include <cstring>
#include <utility>

#include "base/Memory.h"
#include "pod/Types.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

namespace {

constexpr uint32_t kMaxBatches = 512;
constexpr int32_t kNone = -1;

struct Influences {
    float bones[4];
    float weights[4];
};

Influences ReadInfluences(const QexBoneVertices& layout, uint32_t vertex) {
    const uint8_t* source = layout.data + uint64_t{vertex} * layout.stride;
    Influences in;
    QexPODVertex_ReadVec(in.weights, source + layout.weightOffset, layout.weightType, layout.components);
    QexPODVertex_ReadVec(in.bones, source + layout.indexOffset, layout.indexType, layout.components);
    return in;
}

// Collects the bones that a triangle follows; false when there are too many, or one is no node index.
bool CollectBones(CBatch* bones, const QexBoneVertices& layout, const uint32_t* triangle) {
    CBatch_Clear(bones);
    for (int corner = 0; corner < 3; ++corner) {
        const Influences in = ReadInfluences(layout, triangle[corner]);
        for (int32_t i = 0; i < layout.components; ++i) {
            if (in.weights[i] == 0) continue;
            const bool isIndex = in.bones[i] > -1.0f && in.bones[i] < 2147483648.0f;
            if (!isIndex || !CBatch_Add(bones, static_cast<int32_t>(in.bones[i]))) return false;
        }
    }
    return true;
}

// A bit for each bone, several bones to a bit: a batch that lacks a bit of a set cannot contain it.
uint64_t Signature(const CBatch* batch) {
    uint64_t bits = 0;
    for (int32_t i = 0; i < batch->count; ++i) bits |= uint64_t{1} << (batch->bones[i] & 63);
    return bits;
}

struct BatchList {
    CBatch batches[kMaxBatches];
    uint64_t signatures[kMaxBatches];
    uint32_t numbers[kMaxBatches];  // of the batches before they were joined
    uint32_t count;
    // The unjoined batches in the order in which their triangles come out, and where each of them went.
    uint32_t runs[kMaxBatches];
    uint32_t joinedInto[kMaxBatches];
    uint32_t runCount;

    bool Contains(uint32_t i, const CBatch* set, uint64_t signature) const {
        return !(signature & ~signatures[i]) && CBatch_Contains(&batches[i], set);
    }
    bool IsWithin(uint32_t i, const CBatch* set, uint64_t signature) const {
        return !(signatures[i] & ~signature) && CBatch_Contains(set, &batches[i]);
    }
    void NumberAll() {
        runCount = count;
        for (uint32_t i = 0; i < count; ++i) numbers[i] = runs[i] = joinedInto[i] = i;
    }
    void AddRun(uint32_t i, uint32_t into) {
        runs[runCount++] = numbers[i];
        joinedInto[numbers[i]] = into;
    }
    // Puts a batch further to the front, before those that were there.
    void Move(uint32_t from, uint32_t to) {
        Rotate(batches, from, to);
        Rotate(signatures, from, to);
        Rotate(numbers, from, to);
    }
    void Remove(uint32_t i) {
        CBatch_Destructor(&batches[i]);
        for (--count; i < count; ++i) Move(i + 1, i);
    }
    void Release() {
        for (uint32_t i = 0; i < count; ++i) CBatch_Destructor(&batches[i]);
        count = 0;
    }
    // False, and nothing to release, when memory runs out.
    bool Copy(const BatchList& from) {
        *this = from;
        for (count = 0; count < from.count; ++count) {
            CBatch_CopyConstructor(&batches[count], &from.batches[count]);
            if (batches[count].bones) continue;
            Release();
            return false;
        }
        return true;
    }

  private:
    template <class T>
    static void Rotate(T* array, uint32_t from, uint32_t to) {
        const T moved = array[from];
        memmove(array + to + 1, array + to, (from - to) * sizeof(T));
        array[to] = moved;
    }
};

// An output vertex: an input vertex with its bones counted within a batch.
struct Copy {
    uint32_t source;
    float bones[4];
    int32_t next;  // another copy of the same vertex, or none
};

// The scratch memory of one run.
struct Work {
    Work() { CBatch_Constructor(&set); }
    ~Work() {
        if (list) list[0].Release();
        CBatch_Destructor(&set);
    }
    Work(const Work&) = delete;
    Work& operator=(const Work&) = delete;

    bool Alloc(uint32_t vertices, uint32_t triangles, int32_t maxBones) {
        const uint64_t corners = uint64_t{triangles} * 3;
        CBatch_SetSize(&set, maxBones);
        if (!list.Alloc(1)) return false;
        list[0].count = 0;  // before the next step that can fail: the end frees as many batches
        if (!set.bones || !batchOf.Alloc(triangles) || !indices.Alloc(corners) || !copies.Alloc(corners) ||
            !firstCopy.Alloc(vertices))
            return false;
        for (uint32_t i = 0; i < vertices; ++i) firstCopy[i] = kNone;
        return true;
    }

    CBatch set;  // the bones of the triangle at hand
    QexScratch<BatchList> list;
    QexScratch<uint32_t> batchOf;   // of each triangle
    QexScratch<uint32_t> indices;   // the new triangles
    QexScratch<Copy> copies;        // the output vertices
    QexScratch<int32_t> firstCopy;  // of each input vertex
    uint32_t copyCount = 0;
};

uint32_t Largest(const BatchList& list, uint32_t first) {
    uint32_t largest = first;
    for (uint32_t k = first + 1; k < list.count; ++k)
        if (list.batches[k].count > list.batches[largest].count) largest = k;
    return largest;
}

// The batch behind the one of index i that costs it the fewest new bones, the first or last such; the count
// when none fits.
uint32_t BestToMerge(const BatchList& list, uint32_t i, bool last) {
    uint32_t best = list.count;
    int32_t fewest = list.batches[i].capacity - list.batches[i].count;
    for (uint32_t k = i + 1; k < list.count; ++k) {
        // As many bits as it lacks are bones that it lacks, at the least.
        if (__builtin_popcountll(list.signatures[k] & ~list.signatures[i]) > fewest) continue;
        const int32_t missing = CBatch_TestMerge(&list.batches[i], &list.batches[k]);
        if (missing < 0 || missing > fewest || (missing == fewest && best < list.count && !last)) continue;
        fewest = missing;
        best = k;
    }
    return best;
}

// Joins batches: from the one with most bones on, each takes in what costs it the fewest new bones for as
// long as anything fits.
void JoinBatches(BatchList* list, bool last) {
    list->runCount = 0;
    for (uint32_t i = 0; i < list->count; ++i) {
        list->Move(Largest(*list, i), i);
        list->AddRun(i, i);
        for (;;) {
            const uint32_t best = BestToMerge(*list, i, last);
            if (best == list->count) break;
            CBatch_Merge(&list->batches[i], &list->batches[best]);
            list->signatures[i] |= list->signatures[best];
            list->AddRun(best, i);
            list->Remove(best);
        }
    }
}

// Joins batches as well as two ways of choosing among equals can; one way where memory is short.
void JoinBest(BatchList* list) {
    QexScratch<BatchList> other(1);
    const bool copied = other && other[0].Copy(*list);
    JoinBatches(list, false);
    if (!copied) return;
    JoinBatches(other.Get(), true);
    if (other[0].count < list->count) std::swap(*list, other[0]);
    other[0].Release();
}

bool AppendBatch(BatchList* list, int32_t maxBones, bool join) {
    if (list->count == kMaxBatches && join) {
        list->NumberAll();
        JoinBest(list);
    }
    if (list->count == kMaxBatches) return false;
    CBatch* batch = &list->batches[list->count++];
    CBatch_Constructor(batch);
    CBatch_SetSize(batch, maxBones);
    return batch->bones != nullptr;
}

// The batch list: a set that no batch contains widens the first batch that it contains, or becomes a new one.
bool ListBatches(Work& work, const QexBoneVertices& layout, const uint32_t* indices, uint32_t triangles,
                 int32_t maxBones, bool join) {
    BatchList& list = work.list[0];
    for (uint32_t t = 0; t < triangles; ++t) {
        if (!CollectBones(&work.set, layout, indices + 3 * uint64_t{t})) return false;
        const uint64_t signature = Signature(&work.set);
        uint32_t i = 0;
        bool contained = false;
        for (; i < list.count; ++i) {
            contained = list.Contains(i, &work.set, signature);
            if (contained || list.IsWithin(i, &work.set, signature)) break;
        }
        if (contained) continue;
        if (i == list.count) {
            if (!AppendBatch(&list, maxBones, join)) return false;
            i = list.count - 1;
        }
        CBatch_Assign(&list.batches[i], &work.set);
        list.signatures[i] = signature;
    }
    list.NumberAll();
    return true;
}

void AssignTriangles(Work& work, const QexBoneVertices& layout, const uint32_t* indices, uint32_t triangles) {
    const BatchList& list = work.list[0];
    for (uint32_t t = 0; t < triangles; ++t) {
        CollectBones(&work.set, layout, indices + 3 * uint64_t{t});
        const uint64_t signature = Signature(&work.set);
        uint32_t i = 0;
        while (!list.Contains(i, &work.set, signature)) ++i;
        work.batchOf[t] = i;
    }
}

// Joins the batches that triangles were assigned to; the others go.
void JoinAssigned(Work& work, uint32_t triangles, bool inOrder) {
    BatchList& list = work.list[0];
    bool used[kMaxBatches] = {};
    for (uint32_t t = 0; t < triangles; ++t) used[work.batchOf[t]] = true;
    for (uint32_t i = list.count; i-- > 0;)
        if (!used[i]) list.Remove(i);
    JoinBest(&list);
    if (!inOrder) return;
    for (uint32_t t = 0; t < triangles; ++t) work.batchOf[t] = list.joinedInto[work.batchOf[t]];
    list.NumberAll();
}

// The output vertex that is `vertex` with its bones counted within the batch.
uint32_t OutputVertex(Work& work, const QexBoneVertices& layout, uint32_t vertex, const CBatch* batch) {
    Influences in = ReadInfluences(layout, vertex);
    CBatch_GetVertexBoneIndices(batch, in.bones, in.weights, layout.components);
    for (int32_t i = layout.components; i < 4; ++i) in.bones[i] = 0;
    for (int32_t c = work.firstCopy[vertex]; c != kNone; c = work.copies[static_cast<uint32_t>(c)].next)
        if (memcmp(work.copies[static_cast<uint32_t>(c)].bones, in.bones, sizeof in.bones) == 0)
            return static_cast<uint32_t>(c);
    Copy& copy = work.copies[work.copyCount];
    copy.source = vertex;
    memcpy(copy.bones, in.bones, sizeof copy.bones);
    copy.next = work.firstCopy[vertex];
    work.firstCopy[vertex] = static_cast<int32_t>(work.copyCount);
    return work.copyCount++;
}

bool AllocTables(QexBoneBatches* out, uint32_t batches, int32_t maxBones) {
    const uint64_t bones = uint64_t{batches} * static_cast<uint32_t>(maxBones);
    out->boneTable = QexMemory_AllocZeroed<int32_t>(bones);
    out->bonesPerBatch = QexMemory_AllocZeroed<int32_t>(batches);
    out->offsets = QexMemory_AllocZeroed<int32_t>(batches);
    out->maxBones = maxBones;
    return out->boneTable && out->bonesPerBatch && out->offsets;
}

// Writes the batches and, grouped by them, the new triangles.
void EmitBatches(Work& work, QexBoneBatches* out, const QexBoneVertices& layout, const uint32_t* indices,
                 uint32_t triangles) {
    const BatchList& list = work.list[0];
    uint32_t emitted = 0;
    for (uint32_t r = 0; r < list.runCount; ++r) {
        const uint32_t run = list.runs[r], b = list.joinedInto[run];
        const CBatch* batch = &list.batches[b];
        if (b == static_cast<uint32_t>(out->batchCount)) {
            CBatch_Write(batch, out->boneTable + uint64_t{b} * static_cast<uint32_t>(out->maxBones),
                         &out->bonesPerBatch[b]);
            out->offsets[b] = static_cast<int32_t>(emitted / 3);
            ++out->batchCount;
        }
        for (uint32_t t = 0; t < triangles; ++t)
            for (uint32_t corner = 0; corner < 3 && work.batchOf[t] == run; ++corner)
                work.indices[emitted++] = OutputVertex(work, layout, indices[3 * t + corner], batch);
    }
}

// The block of output vertices, for the caller to own; null when memory runs out.
uint8_t* WriteVertices(Work& work, const QexBoneVertices& layout) {
    QexScratch<uint8_t> block;
    if (!block.Alloc(uint64_t{work.copyCount} * layout.stride)) return nullptr;
    for (uint32_t i = 0; i < work.copyCount; ++i) {
        const Copy& copy = work.copies[i];
        uint8_t* vertex = block.Get() + uint64_t{i} * layout.stride;
        memcpy(vertex, layout.data + uint64_t{copy.source} * layout.stride, layout.stride);
        QexVertexWriteVec(vertex + layout.indexOffset, layout.indexType, layout.components, copy.bones);
    }
    return block.Take();
}

// Whether the arguments describe vertices and triangles that can be read.
bool IsReadable(const QexBoneVertices& layout, const uint32_t* indices, uint32_t triangles) {
    const auto inside = [&](uint32_t offset, uint32_t type) {
        const uint32_t size = QexPODData_ElementSize(type, static_cast<uint32_t>(layout.components));
        return size && uint64_t{offset} + size <= layout.stride;
    };
    if (!inside(layout.weightOffset, layout.weightType) || !inside(layout.indexOffset, layout.indexType))
        return false;
    if (triangles > INT32_MAX / 12) return false;
    for (uint32_t i = 0; i < 3 * triangles; ++i)
        if (indices[i] >= layout.count) return false;
    return true;
}

}  // namespace

QexMadeBatches QexBoneBatches_Make(QexBoneBatches* batches, uint32_t* outVertexCount, void** outVertices,
                                   uint32_t* indices, const QexBoneVertices& layout, uint32_t triangleCount,
                                   int32_t maxBones, QexBoneJoin join) {
    memset(batches, 0, sizeof *batches);
    if (!IsReadable(layout, indices, triangleCount)) return QexMadeBatches::Impossible;
    Work work;
    if (!work.Alloc(layout.count, triangleCount, maxBones)) return QexMadeBatches::OutOfMemory;
    const bool joined = join != QexBoneJoin::None;
    if (!ListBatches(work, layout, indices, triangleCount, maxBones, joined))
        return QexMadeBatches::Impossible;
    AssignTriangles(work, layout, indices, triangleCount);
    if (joined) JoinAssigned(work, triangleCount, join == QexBoneJoin::InOrder);
    const bool allocated = AllocTables(batches, work.list[0].count, maxBones);
    if (allocated) EmitBatches(work, batches, layout, indices, triangleCount);
    uint8_t* block = allocated ? WriteVertices(work, layout) : nullptr;
    if (!block) {
        QexBoneBatches_Release(batches);
        return QexMadeBatches::OutOfMemory;
    }
    if (triangleCount) memcpy(indices, work.indices.Get(), uint64_t{triangleCount} * 3 * sizeof *indices);
    *outVertices = block;
    if (outVertexCount) *outVertexCount = work.copyCount;
    return QexMadeBatches::Made;
}
