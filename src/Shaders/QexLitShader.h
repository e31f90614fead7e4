// What the lit modules have in common: how they are described, how their uniforms are set, and their whole
// Render.
#pragma once

#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderModule.h"

// Sends lights to uniforms by number, -1 where there is none; of lights that do not count nothing is sent.
void QexLitShader_SendLights(const int32_t* locations, const QexLightSet& lights);

struct QexLitShaderType {
    QexShaderModuleType module;
    uint8_t slots[kShaderUniforms];  // of the uniforms that the module has
};

// A module from its sources and what it has beside diffuse light. Threshold and fade, 0.5 and 1 at first,
// follow the uniforms.
constexpr QexLitShaderType QexLitShader_Describe(const char* path, const char* vertexSource,
                                                 const char* fragmentSource, QexShaderRenderFn render,
                                                 uint32_t traits) {
    constexpr struct {
        uint8_t item;
        uint32_t trait;
    } uniforms[] = {{kUniform_transMatrix, kTraitStatic},
                    {kUniform_normalMatrix, kTraitStatic},
                    {kUniform_mvpMatrix, kTraitStatic},
                    {kUniform_viewProjMatrix, kTraitSkinned},
                    {kUniform_boneCount, kTraitSkinned},
                    {kUniform_boneMatrixArray, kTraitSkinned},
                    {kUniform_boneVecMatrixArray, kTraitSkinned},
                    {kUniform_cameraPos, kTraitSpecular},
                    {kUniform_lightCount, 0},
                    {kUniform_lightType, 0},
                    {kUniform_lightPosDir, 0},
                    {kUniform_lightColor, 0},
                    {kUniform_sceneAmbient, 0},
                    {kUniform_sceneDiffuse, 0},
                    {kUniform_sceneSpecular, kTraitSpecular},
                    {kUniform_shininess, kTraitSpecular},
                    {kUniform_opacity, 0},
                    {kUniform_alphaThreshold, 0},
                    {kUniform_shadowLightDir, kTraitShadow},
                    {kUniform_shadowSpaceMatrix, kTraitShadow},
                    {kUniform_biasValue, kTraitShadow},
                    {kUniform_shadowIntensity, kTraitShadow},
                    {kUniform_shadowFade, kTraitShadowFade}},
      attributes[] = {{QEX_ELEMENT_POSITION, 0},
                      {QEX_ELEMENT_TANGENT, kTraitNormalMap},
                      {QEX_ELEMENT_BINORMAL, kTraitNormalMap},
                      {QEX_ELEMENT_NORMAL, 0},
                      {QEX_ELEMENT_UV0, 0},
                      {QEX_ELEMENT_BONE_INDEX, kTraitSkinned},
                      {QEX_ELEMENT_BONE_WEIGHT, kTraitSkinned}},
      units[] = {{kDiffuseUnit, 0},
                 {kNormalMapUnit, kTraitNormalMap},
                 {kShadowMapUnit, kTraitShadow},
                 {kAlphaUnit, 0}};
    QexLitShaderType type = {};
    type.module.path = path;
    type.module.vertexSource = vertexSource;
    type.module.fragmentSource = fragmentSource;
    type.module.render = render;
    type.module.traits = traits | kTraitLit | kTraitAlphaTexture | kTraitVariants;
    for (const auto& row : uniforms) {
        if ((traits & row.trait) != row.trait) continue;
        type.slots[row.item] = type.module.uniforms.count;
        type.module.uniforms.Add(row.item);
    }
    for (const auto& row : attributes)
        if ((traits & row.trait) == row.trait) type.module.attributes.Add(row.item);
    for (const auto& row : units)
        if ((traits & row.trait) == row.trait) type.module.units.Add(row.item);
    type.module.hasThreshold = true;
    type.module.thresholdSlot = type.module.uniforms.count;
    type.module.secondDefault = traits & kTraitShadowFade ? 1.0f : 0.0f;
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
