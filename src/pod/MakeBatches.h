// Bone batching for the engine's own modules and its tools.
#pragma once

#include "Qex/pod.h"

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

// Whether batches that fit into one become one, as each costs a draw, and those without triangles go.
enum class QexBoneJoin {
    None,     // as QexBoneBatches_Create does it
    InOrder,  // within a batch the triangles keep their order
    Grouped   // within a batch those that follow the same bones come together
};

QexMadeBatches QexBoneBatches_Make(QexBoneBatches* batches, uint32_t* outVertexCount, void** outVertices,
                                   uint32_t* indices, const QexBoneVertices& vertices, uint32_t triangleCount,
                                   int32_t maxBones, QexBoneJoin join);
