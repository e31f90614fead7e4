// Bone batching: cuts a skinned mesh into runs of triangles that need few bones each.
#include "pod/BoneBatches.h"

#include <cmath>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "pod/Reader.h"

#define QEX_MODULE "src/QexBoneBatches"

namespace {

constexpr uint32_t kMaxBatches = 512;
constexpr uint32_t kVectorStep = 64;
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
    uint32_t count;

    bool Contains(uint32_t i, const CBatch* set, uint64_t signature) const {
        return !(signature & ~signatures[i]) && CBatch_Contains(&batches[i], set);
    }
    bool IsWithin(uint32_t i, const CBatch* set, uint64_t signature) const {
        return !(signatures[i] & ~signature) && CBatch_Contains(set, &batches[i]);
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
        for (uint32_t i = 0; list && i < list[0].count; ++i) CBatch_Destructor(&list[0].batches[i]);
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

// Joins batches that fit into one, those that share most bones first.
void JoinBatches(BatchList* list) {
    for (uint32_t i = 0; i < list->count; ++i) {
        for (;;) {
            uint32_t best = list->count;
            int32_t fewest = INT32_MAX;
            for (uint32_t k = i + 1; k < list->count; ++k) {
                const int32_t missing = CBatch_TestMerge(&list->batches[i], &list->batches[k]);
                if (missing < 0 || missing >= fewest) continue;
                fewest = missing;
                best = k;
            }
            if (best == list->count) break;
            CBatch_Merge(&list->batches[i], &list->batches[best]);
            list->signatures[i] |= list->signatures[best];
            CBatch_Destructor(&list->batches[best]);
            --list->count;
            list->batches[best] = list->batches[list->count];
            list->signatures[best] = list->signatures[list->count];
        }
    }
}

bool AppendBatch(BatchList* list, int32_t maxBones, bool join) {
    if (list->count == kMaxBatches && join) JoinBatches(list);
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
    if (join) JoinBatches(&list);
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
    uint32_t emitted = 0;
    for (uint32_t b = 0; b < work.list[0].count; ++b) {
        const CBatch* batch = &work.list[0].batches[b];
        CBatch_Write(batch, out->boneTable + uint64_t{b} * static_cast<uint32_t>(out->maxBones),
                     &out->bonesPerBatch[b]);
        out->offsets[b] = static_cast<int32_t>(emitted / 3);
        ++out->batchCount;
        for (uint32_t t = 0; t < triangles; ++t)
            for (uint32_t corner = 0; corner < 3 && work.batchOf[t] == b; ++corner)
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

int32_t QexBoneBatches_Make(QexBoneBatches* batches, uint32_t* outVertexCount, void** outVertices,
                            uint32_t* indices, const QexBoneVertices& layout, uint32_t triangleCount,
                            int32_t maxBones, bool join) {
    memset(batches, 0, sizeof *batches);
    if (!IsReadable(layout, indices, triangleCount)) return -1;
    Work work;
    if (!work.Alloc(layout.count, triangleCount, maxBones)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return -1;
    }
    if (!ListBatches(work, layout, indices, triangleCount, maxBones, join)) return -1;
    AssignTriangles(work, layout, indices, triangleCount);
    const bool allocated = AllocTables(batches, work.list[0].count, maxBones);
    if (allocated) EmitBatches(work, batches, layout, indices, triangleCount);
    uint8_t* block = allocated ? WriteVertices(work, layout) : nullptr;
    if (!block) {
        QexBoneBatches_Release(batches);
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return -1;
    }
    if (triangleCount) memcpy(indices, work.indices.Get(), uint64_t{triangleCount} * 3 * sizeof *indices);
    *outVertices = block;
    if (outVertexCount) *outVertexCount = work.copyCount;
    return 0;
}

extern "C" {

// ---- Sets of bones ----

void CBatch_Constructor(CBatch* batch) {
    memset(batch, 0, sizeof *batch);
}

void CBatch_Destructor(CBatch* batch) {
    QexMemory_FreeArray(batch->bones);
}

void CBatch_SetSize(CBatch* batch, int32_t capacity) {
    QexMemory_FreeArray(batch->bones);
    batch->count = 0;
    batch->bones = capacity > 0 ? QexMemory_AllocArray<int32_t>(static_cast<uint32_t>(capacity)) : nullptr;
    batch->capacity = batch->bones ? capacity : 0;
}

void CBatch_Clear(CBatch* batch) {
    batch->count = 0;
}

int32_t CBatch_Add(CBatch* batch, int32_t bone) {
    if (bone < 0) return 0;
    if (CBatch_ContainsIdx(batch, bone)) return 1;
    if (batch->count >= batch->capacity) return 0;
    batch->bones[batch->count++] = bone;
    return 1;
}

int32_t CBatch_ContainsIdx(const CBatch* batch, int32_t bone) {
    for (int32_t i = 0; i < batch->count; ++i)
        if (batch->bones[i] == bone) return 1;
    return 0;
}

int32_t CBatch_Contains(const CBatch* a, const CBatch* b) {
    for (int32_t i = 0; i < b->count; ++i)
        if (!CBatch_ContainsIdx(a, b->bones[i])) return 0;
    return 1;
}

int32_t CBatch_TestMerge(const CBatch* a, const CBatch* b) {
    int32_t missing = 0;
    for (int32_t i = 0; i < b->count; ++i) missing += !CBatch_ContainsIdx(a, b->bones[i]);
    return a->count + missing <= a->capacity ? missing : -1;
}

void CBatch_Merge(CBatch* a, const CBatch* b) {
    for (int32_t i = 0; i < b->count; ++i) CBatch_Add(a, b->bones[i]);
}

void CBatch_Assign(CBatch* a, const CBatch* b) {
    a->count = b->count < a->capacity ? b->count : a->capacity;
    if (a->count) memcpy(a->bones, b->bones, static_cast<size_t>(a->count) * sizeof *a->bones);
}

void CBatch_CopyConstructor(CBatch* a, const CBatch* b) {
    CBatch_Constructor(a);
    CBatch_SetSize(a, b->capacity);
    CBatch_Assign(a, b);
}

void CBatch_Write(const CBatch* batch, int32_t* destination, int32_t* count) {
    if (batch->count)
        memcpy(destination, batch->bones, static_cast<size_t>(batch->count) * sizeof *destination);
    *count = batch->count;
}

void CBatch_GetVertexBoneIndices(const CBatch* batch, float* indices, const float* weights, int32_t n) {
    for (int32_t i = 0; i < n; ++i) {
        if (weights[i] == 0) {
            indices[i] = 0;
            continue;
        }
        for (int32_t k = 0; k < batch->count; ++k)
            if (static_cast<float>(batch->bones[k]) == truncf(indices[i])) {
                indices[i] = static_cast<float>(k);
                break;
            }
    }
}

// ---- Growing arrays ----

void CGrowableArray_Constructor(CGrowableArray* array, uint32_t elementSize) {
    array->data = nullptr;
    array->elementSize = elementSize;
    array->elementCount = 0;
}

void CGrowableArray_Destructor(CGrowableArray* array) {
    QexMemory_FreeArray(array->data);
    array->elementCount = 0;
}

void CGrowableArray_Append(CGrowableArray* array, const void* source, uint32_t n) {
    const uint64_t count = uint64_t{array->elementCount} + n, size = array->elementSize;
    if (!n || !size) return;
    if (count > UINT32_MAX || !QexMemory_Resize(array->data, count * size)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return;
    }
    memcpy(static_cast<uint8_t*>(array->data) + array->elementCount * size, source,
           static_cast<size_t>(n * size));
    array->elementCount = static_cast<uint32_t>(count);
}

void* CGrowableArray_at(const CGrowableArray* array, uint32_t i) {
    return static_cast<uint8_t*>(array->data) + uint64_t{i} * array->elementSize;
}

void* CGrowableArray_last(const CGrowableArray* array) {
    return array->elementCount ? CGrowableArray_at(array, array->elementCount - 1) : nullptr;
}

uint32_t CGrowableArray_size(const CGrowableArray* array) {
    return array->elementCount;
}

uint32_t CGrowableArray_Surrender(CGrowableArray* array, void** block) {
    const uint32_t count = array->elementCount;
    *block = array->data;
    array->data = nullptr;
    array->elementCount = 0;
    return count;
}

void CStdVectorInt_Constructor(CStdVectorInt* vector, uint32_t capacity) {
    vector->data = QexMemory_AllocArray<int32_t>(capacity);
    vector->capacity = vector->data ? capacity : 0;
    vector->size = 0;
}

void CStdVectorInt_Destructor(CStdVectorInt* vector) {
    QexMemory_Free(vector->data);
    memset(vector, 0, sizeof *vector);
}

void CStdVectorInt_PushBack(CStdVectorInt* vector, int32_t value) {
    if (vector->size + 1 >= vector->capacity) {
        const uint64_t capacity = uint64_t{vector->capacity} + kVectorStep;
        if (!QexMemory_Resize(vector->data, capacity * sizeof *vector->data)) {
            QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
            return;
        }
        vector->capacity = static_cast<uint32_t>(capacity);
    }
    vector->data[vector->size++] = value;
}

int32_t CStdVectorInt_At(const CStdVectorInt* vector, uint32_t i) {
    return vector->data[i];
}

uint32_t CStdVectorInt_Size(const CStdVectorInt* vector) {
    return vector->size;
}

// ---- Batches ----

int32_t QexBoneBatches_Create(QexBoneBatches* batches, uint32_t* outVertexCount, void** outVertices,
                              uint32_t* indices, uint32_t vertexCount, const void* vertices, uint32_t stride,
                              uint32_t weightOffset, uint32_t weightType, uint32_t indexOffset,
                              uint32_t indexType, uint32_t triangleCount, int32_t maxBones,
                              uint32_t bonesPerVertex) {
    memset(batches, 0, sizeof *batches);
    if (bonesPerVertex < 1 || bonesPerVertex > 4 || maxBones < 1) return -1;
    const QexBoneVertices layout = {static_cast<const uint8_t*>(vertices),
                                    vertexCount,
                                    stride,
                                    weightOffset,
                                    weightType,
                                    indexOffset,
                                    indexType,
                                    static_cast<int32_t>(bonesPerVertex)};
    return QexBoneBatches_Make(batches, outVertexCount, outVertices, indices, layout, triangleCount, maxBones,
                               false);
}

void QexBoneBatches_Release(QexBoneBatches* batches) {
    QexMemory_FreeArray(batches->boneTable);
    QexMemory_FreeArray(batches->bonesPerBatch);
    QexMemory_FreeArray(batches->offsets);
    batches->batchCount = 0;
}

}  // extern "C"
