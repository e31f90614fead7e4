// Models for the engine's own modules: the shader modules that all models share.
//
// They are made with the first model and go with the last; QexModel_CreateDefaultShader and
// QexModel_ReleaseShader count.
#pragma once

#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"

struct QexModelSharedShaders {
    QexShaderModule* texture;  // null while there are none
    QexShaderModule* skinning;
    QexShaderModule* simple;
    uint32_t shadowTexture;  // GL names of the shadow target
    uint32_t shadowDepth;
    uint32_t shadowFramebuffer;
    int32_t shadowWidth;  // pixels, of the target that exists
    int32_t shadowHeight;
};

const QexModelSharedShaders* QexModel_GetSharedShaders();

// Which shared set this is, counted from 1. A model that was loaded with an earlier one, as before the engine
// was ended and started again, holds no share of this one, and its nodes' modules are gone.
uint32_t QexModel_GetSharedGeneration();
inline bool QexModel_IsOutdated(const QexModel* model) {
    return model->sharedGeneration && model->sharedGeneration != QexModel_GetSharedGeneration();
}

// The lit module that models made of arrays share: made when first asked for, gone with the others.
QexShaderModule* QexModel_GetSharedLitShader();

// Frees an array of casters and their node lists, as shadow and reflection records own one.
inline void QexModel_FreeCasters(QexShadowCaster* casters, uint32_t count) {
    for (uint32_t i = 0; i < count; ++i) QexMemory_Free(casters[i].nodeIndices);
    QexMemory_Free(casters);
}

// Builds a mesh's attribute layout and box, and its GL buffers' contents where the mesh's own bytes cannot be
// uploaded as they are.
struct QexMeshUpload {
    const uint8_t* vertices;  // vertexBytes to upload; the mesh's own or `packedVertices`
    uint32_t vertexBytes;
    const uint16_t* indices;  // indexCount to upload, or null
    uint32_t indexCount;
    uint8_t* packedVertices;  // owned, or null
    uint16_t* packedIndices;  // owned, or null
};

// False, with a line in the log, when the mesh cannot be drawn or memory runs out. Free with Release in any
// case.
bool QexModelGeometry_Prepare(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t meshIndex);
void QexModelGeometry_Release(QexMeshUpload* upload);
