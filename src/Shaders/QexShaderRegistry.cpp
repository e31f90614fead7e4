// Modules by number.
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"

namespace {

// The modules that an application can create by number: one row each.
struct Row {
    uint32_t kind;
    QexShaderModule* (*create)(void);
    void (*release)(QexShaderModule**);
    float (*getThreshold)(const QexShaderModule*);
    void (*setThreshold)(QexShaderModule*, float);
    // Only for modules that shift texture coordinates.
    void (*getDisplacement)(const QexShaderModule*, float*, float*);
    void (*setDisplacement)(QexShaderModule*, float, float);
};

#define ROW(kind, Name)                                                                                 \
    {                                                                                                   \
        kind, Name##_CreateProgram, Name##_Release, Name##_GetAlphaThreshold, Name##_SetAlphaThreshold, \
            nullptr, nullptr                                                                            \
    }

const Row kRows[] = {
    ROW(QEX_SHADER_TEXTURE, QexTextureShader),
    ROW(QEX_SHADER_TEXTURE_NOALPHA, QexTextureNoAlphaShader),
    {QEX_SHADER_UV_DISPLACEMENT, QexUVDisplacementShader_CreateProgram, QexUVDisplacementShader_Release,
     QexUVDisplacementShader_GetAlphaThreshold, QexUVDisplacementShader_SetAlphaThreshold,
     QexUVDisplacementShader_GetDisplacement, QexUVDisplacementShader_SetDisplacement},
    ROW(QEX_SHADER_GOURAUD, QexGouraudShader),
    ROW(QEX_SHADER_GOURAUD_SHADOW, QexGouraudShadowShader),
    ROW(QEX_SHADER_GOURAUD_NORMALMAP, QexGouraudNormalMapShader),
    ROW(QEX_SHADER_GOURAUD_SPECULAR, QexGouraudSpecularShader),
    ROW(QEX_SHADER_SKINNING_TEXTURE, QexSkinningTextureShader),
    ROW(QEX_SHADER_SKINNING_GOURAUD, QexSkinningGouraudShader),
    ROW(QEX_SHADER_SKINNING_GOURAUD_NORMALMAP, QexSkinningGouraudNormalMapShader),
    ROW(QEX_SHADER_SKINNING_GOURAUD_SPECULAR, QexSkinningGouraudSpecularShader),
    ROW(QEX_SHADER_SKINNING_TEXTURE_NOALPHA, QexSkinningTextureNoAlphaShader),
    ROW(QEX_SHADER_GOURAUD_SHADOW_EXT, QexGouraudShadowExtShader),
};

const Row* Find(uint32_t kind) {
    for (const Row& row : kRows)
        if (row.kind == kind) return &row;
    return nullptr;
}

// The row of a module that is there; null otherwise.
const Row* Find(const QexShaderModule* module, uint32_t kind) {
    return module ? Find(kind) : nullptr;
}

}  // namespace

extern "C" {

QexShaderModule* QexShaders_CreateShaderProgram(uint32_t kind) {
    const Row* row = Find(kind);
    return row ? row->create() : nullptr;
}

void QexShaders_ReleaseShaderProgram(QexShaderModule* module, uint32_t kind) {
    const Row* row = Find(module, kind);
    if (row) row->release(&module);
}

float QexShaders_GetShaderAlphaThreshold(QexShaderModule* module, uint32_t kind) {
    const Row* row = Find(module, kind);
    return row ? row->getThreshold(module) : 0.0f;
}

void QexShaders_SetShaderAlphaThreshold(QexShaderModule* module, uint32_t kind, float threshold) {
    const Row* row = Find(module, kind);
    if (row) row->setThreshold(module, threshold);
}

void QexShaders_GetShaderUVDisplacement(QexShaderModule* module, uint32_t kind, float* u, float* v) {
    const Row* row = Find(module, kind);
    if (row && row->getDisplacement) row->getDisplacement(module, u, v);
}

void QexShaders_SetShaderUVDisplacement(QexShaderModule* module, uint32_t kind, float u, float v) {
    const Row* row = Find(module, kind);
    if (row && row->setDisplacement) row->setDisplacement(module, u, v);
}

}  // extern "C"
