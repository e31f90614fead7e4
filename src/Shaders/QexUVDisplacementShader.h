// What the two modules that shift texture coordinates have in common.
#pragma once

#include "Qex/math.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderModule.h"

extern const char* const kQexUVDisplacementVertexSource;

enum {
    kDisplacementUniform,
    kDisplacementMvpMatrix,
    kDisplacementOpacity,
    kDisplacementAlphaThreshold,
    kDisplacementU,
    kDisplacementV,
    kDisplacementThreshold
};

// Sets opacity, threshold, shift and matrix.
void QexUVDisplacementShader_SetUniforms(const QexShaderDraw& draw, const QexMatrix* modelMatrix,
                                         const QexMatrix* view, const QexMatrix* projection);

#define QEX_UV_DISPLACEMENT(Name)                                                    \
    void Name##_SetDisplacement(QexShaderModule* module, float u, float v) {         \
        module->slots[kDisplacementU].value = u;                                     \
        module->slots[kDisplacementV].value = v;                                     \
    }                                                                                \
    void Name##_GetDisplacement(const QexShaderModule* module, float* u, float* v) { \
        *u = module->slots[kDisplacementU].value;                                    \
        *v = module->slots[kDisplacementV].value;                                    \
    }
