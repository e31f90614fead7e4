// What the lit modules have in common: how they are described, how their uniforms are set, and their whole
// Render.
#pragma once

#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderModule.h"

// What a module has beside diffuse light.
enum QexLitFeature : uint32_t {
    kLit = 0,  // that alone
    kLitSkinned = 1,
    kLitStatic = 2,
    kLitNormalMap = 4,
    kLitSpecular = 8,
    kLitShadow = 16,
    kLitShadowFade = 32  // the fade's value is in the slot behind the threshold
};

struct QexLitShaderType {
    QexShaderModuleType module;
    uint32_t features;               // kLit...
    uint8_t slots[kShaderUniforms];  // of the uniforms that the module has
};

// A module from its sources and features. Threshold and fade, 0.5 and 1 at first, follow the uniforms.
constexpr QexLitShaderType QexLitShader_Describe(const char* path, const char* vertexSource,
                                                 const char* fragmentSource, QexShaderRenderFn render,
                                                 uint32_t features) {
    constexpr struct {
        uint8_t item;
        uint32_t feature;
    } uniforms[] = {{kUniform_transMatrix, kLitStatic},
                    {kUniform_normalMatrix, kLitStatic},
                    {kUniform_mvpMatrix, kLitStatic},
                    {kUniform_viewProjMatrix, kLitSkinned},
                    {kUniform_boneCount, kLitSkinned},
                    {kUniform_boneMatrixArray, kLitSkinned},
                    {kUniform_boneVecMatrixArray, kLitSkinned},
                    {kUniform_cameraPos, kLitSpecular},
                    {kUniform_lightCount, kLit},
                    {kUniform_lightType, kLit},
                    {kUniform_lightPosDir, kLit},
                    {kUniform_lightColor, kLit},
                    {kUniform_sceneAmbient, kLit},
                    {kUniform_sceneDiffuse, kLit},
                    {kUniform_sceneSpecular, kLitSpecular},
                    {kUniform_shininess, kLitSpecular},
                    {kUniform_opacity, kLit},
                    {kUniform_alphaThreshold, kLit},
                    {kUniform_shadowLightDir, kLitShadow},
                    {kUniform_shadowSpaceMatrix, kLitShadow},
                    {kUniform_biasValue, kLitShadow},
                    {kUniform_shadowIntensity, kLitShadow},
                    {kUniform_shadowFade, kLitShadowFade}},
      attributes[] = {{QEX_ELEMENT_POSITION, kLit},
                      {QEX_ELEMENT_TANGENT, kLitNormalMap},
                      {QEX_ELEMENT_BINORMAL, kLitNormalMap},
                      {QEX_ELEMENT_NORMAL, kLit},
                      {QEX_ELEMENT_UV0, kLit},
                      {QEX_ELEMENT_BONE_INDEX, kLitSkinned},
                      {QEX_ELEMENT_BONE_WEIGHT, kLitSkinned}},
      units[] = {{kDiffuseUnit, kLit},
                 {kNormalMapUnit, kLitNormalMap},
                 {kShadowMapUnit, kLitShadow},
                 {kAlphaUnit, kLit}};
    QexLitShaderType type = {};
    type.module.path = path;
    type.module.vertexSource = vertexSource;
    type.module.fragmentSource = fragmentSource;
    type.module.render = render;
    type.features = features;
    for (const auto& row : uniforms) {
        if ((features & row.feature) != row.feature) continue;
        type.slots[row.item] = type.module.uniforms.count;
        type.module.uniforms.Add(row.item);
    }
    for (const auto& row : attributes)
        if ((features & row.feature) == row.feature) type.module.attributes.Add(row.item);
    for (const auto& row : units)
        if ((features & row.feature) == row.feature) type.module.units.Add(row.item);
    type.module.hasThreshold = true;
    type.module.thresholdSlot = type.module.uniforms.count;
    type.module.secondDefault = features & kLitShadowFade ? 1.0f : 0.0f;
    return type;
}

void QexLitShader_Render(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                         uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
                         const QexMatrix* view, const QexMatrix* projection, const QexShadowInfo* shadow);
void QexLitShader_RenderSkinned(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                                uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
                                const QexMatrix* view, const QexMatrix* projection);
int32_t QexLitShader_DrawSkinnedMesh(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                                     uint32_t nodeIndex, const QexMatrix* modelMatrix);

// The operations of a lit module.
#define QEX_LIT_SHADER(Name, type)                                                                          \
    QEX_SHADER_MODULE_LIFETIME(Name, &(type)->module)                                                       \
    QEX_SHADER_MODULE_THRESHOLD(Name, (type)->module.thresholdSlot)                                         \
    QEX_SHADER_MODULE_DRAW_MESH(Name, &(type)->module)                                                      \
    void Name##_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,                        \
                       const QexLightSet* lights, const QexMatrix* modelMatrix, const QexMatrix* view,      \
                       const QexMatrix* projection, const QexShadowInfo* shadow) {                          \
        QexLitShader_Render(type, module, model, nodeIndex, lights, modelMatrix, view, projection, shadow); \
    }

#define QEX_SKINNED_LIT_SHADER(Name, type)                                                                 \
    QEX_SHADER_MODULE_LIFETIME(Name, &(type)->module)                                                      \
    QEX_SHADER_MODULE_THRESHOLD(Name, (type)->module.thresholdSlot)                                        \
    int32_t Name##_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,                  \
                            const QexMatrix* modelMatrix) {                                                \
        return QexLitShader_DrawSkinnedMesh(type, module, model, nodeIndex, modelMatrix);                  \
    }                                                                                                      \
    void Name##_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,                       \
                       const QexLightSet* lights, const QexMatrix* modelMatrix, const QexMatrix* view,     \
                       const QexMatrix* projection, const QexShadowInfo*) {                                \
        QexLitShader_RenderSkinned(type, module, model, nodeIndex, lights, modelMatrix, view, projection); \
    }
