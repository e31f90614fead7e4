// The shader modules that all models share, and the shadow target.
//
// They are made with the first model and go with the last; QexModel_CreateDefaultShader and
// QexModel_ReleaseShader count.
#pragma once

#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"

struct QexShaderModuleType;

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

// What draws casters into the shadow map, through what the shader modules share.
const QexShaderModuleType* QexModel_CasterType(bool skinned);

// The lit module that models made of arrays share: made when first asked for, gone with the others.
QexShaderModule* QexModel_GetSharedLitShader();
