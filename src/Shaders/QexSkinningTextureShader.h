// What the unlit skinned modules have in common.
#pragma once

#include "Qex/math.h"
#include "Shaders/QexShaderModule.h"

// Puts a skinned vertex on the screen and passes its texture coordinates on.
extern const char* const kQexSkinningVertexSource;

// Slots of both modules.
enum {
    kSkinningBoneCount,
    kSkinningBoneMatrixArray,
    kSkinningViewProjMatrix,
    kSkinningOpacity,
    kSkinningAlphaThreshold,
    kSkinningThreshold
};

// Sets opacity, threshold and matrix.
void QexSkinningTextureShader_SetUniforms(const QexShaderDraw& draw, const QexMatrix* view,
                                          const QexMatrix* projection);
