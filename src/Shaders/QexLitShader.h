// What the lit modules have in common: how their uniforms are ordered and set, and their whole Render.
//
// A static module's slots begin with transMatrix, normalMatrix and mvpMatrix, a skinned one's with
// viewProjMatrix, boneCount, boneMatrixArray and boneVecMatrixArray. From `firstLight` on both go on with
// cameraPos (specular modules), the light set, sceneAmbient, sceneDiffuse, sceneSpecular and shininess
// (specular modules), opacity and alphaThreshold; modules that receive shadows end with shadowLightDir,
// shadowSpaceMatrix, biasValue, shadowIntensity and, when it fades, shadowFade.
#pragma once

#include "Shaders/QexShaderModule.h"

struct QexLitShaderType {
    QexShaderModuleType module;
    bool specular;
    bool normalMap;
    bool shadow;
    bool shadowFade;  // the fade's value is in the slot behind the threshold
};

enum { kTransMatrix, kNormalMatrix, kMvpMatrix, kFirstStaticLight };
enum { kViewProjMatrix, kBoneCount, kBoneMatrixArray, kBoneVecMatrixArray, kFirstSkinnedLight };

#define QEX_LIGHT_UNIFORMS \
    "lightCount", "lightType", "lightPosDir", "lightColor", "sceneAmbient", "sceneDiffuse"
#define QEX_STATIC_UNIFORMS "transMatrix", "normalMatrix", "mvpMatrix"
#define QEX_SKINNED_UNIFORMS "viewProjMatrix", "boneCount", "boneMatrixArray", "boneVecMatrixArray"
#define QEX_SHADOW_UNIFORMS "shadowLightDir", "shadowSpaceMatrix", "biasValue", "shadowIntensity"

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
