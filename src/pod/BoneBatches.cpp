// Sets of bones, growing arrays, and the batches of a mesh.
#include <cmath>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "pod/MakeBatches.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

#define QEX_MODULE "src/QexBoneBatches"

constexpr uint32_t kVectorStep = 64;

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
    const QexMadeBatches made = QexBoneBatches_Make(batches, outVertexCount, outVertices, indices, layout,
                                                    triangleCount, maxBones, QexBoneJoin::None);
    if (made == QexMadeBatches::OutOfMemory) QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return made == QexMadeBatches::Made ? 0 : -1;
}

void QexBoneBatches_Release(QexBoneBatches* batches) {
    QexMemory_FreeArray(batches->boneTable);
    QexMemory_FreeArray(batches->bonesPerBatch);
    QexMemory_FreeArray(batches->offsets);
    batches->batchCount = 0;
}

}  // extern "C"
