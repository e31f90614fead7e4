// Bone batching for the engine's own modules and its tools.
#pragma once

#include "Qex.h"

// Where the weights and bone indices of some vertices lie.
struct QexBoneVertices {
    const uint8_t* data;
    uint32_t count;
    uint32_t stride;
    uint32_t weightOffset;
    uint32_t weightType;
    uint32_t indexOffset;
    uint32_t indexType;
    int32_t components;  // bones a vertex, 1 to 4
};

enum class QexMadeBatches {
    Made,
    Impossible,  // a triangle follows too many bones, there would be too many batches, or it cannot be read
    OutOfMemory
};

// QexBoneBatches_Create; where `join` is set, batches that fit into one become one, as each costs a draw.
QexMadeBatches QexBoneBatches_Make(QexBoneBatches* batches, uint32_t* outVertexCount, void** outVertices,
                                   uint32_t* indices, const QexBoneVertices& vertices, uint32_t triangleCount,
                                   int32_t maxBones, bool join);
