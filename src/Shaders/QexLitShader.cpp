// Lights, material and shadow as the lit modules' uniforms take them.
#include "Shaders/QexLitShader.h"

#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Qex/textures.h"

#include <cstring>

#define QEX_MODULE (draw.type->path)

namespace {

// A light set as the shaders take it: one array a field.
struct LightArrays {
    GLint count;
    GLint types[QEX_MAX_LIGHTS];
    float vectors[QEX_MAX_LIGHTS][3];
    float colours[QEX_MAX_LIGHTS][4];
};

// Null is the empty set.
LightArrays ToArrays(const QexLightSet* lights) {
    LightArrays arrays = {};
    const uint32_t count = lights ? lights->count : 0;
    arrays.count = static_cast<GLint>(count < QEX_MAX_LIGHTS ? count : QEX_MAX_LIGHTS);
    for (GLint i = 0; i < arrays.count; ++i) {
        const QexLight& light = lights->lights[i];
        arrays.types[i] = light.type;
        memcpy(arrays.vectors[i], light.vector, sizeof arrays.vectors[i]);
        memcpy(arrays.colours[i], light.colour, sizeof arrays.colours[i]);
    }
    return arrays;
}

int32_t Location(const QexShaderDraw& draw, const QexLitShaderType* type, QexShaderUniform uniform) {
    return QexShaderModule_Location(draw.module, type->slots[uniform]);
}

// A parameter's value: the threshold's, or the one behind it.
float Parameter(const QexShaderDraw& draw, uint32_t number) {
    return draw.module->slots[draw.type->thresholdSlot + number].value;
}

// Sets what has to do with lights and material.
void SetSurface(const QexShaderDraw& draw, const QexLitShaderType* type, const QexLightSet* lights,
                const QexMatrix* view) {
    const QexPODMaterial& material = *draw.material;
    const LightArrays set = ToArrays(lights);
    const bool specular = type->module.traits & kTraitSpecular;
    if (specular)
        QEX_GL(
            glUniform3f(Location(draw, type, kUniform_cameraPos), -view->m[12], -view->m[13], -view->m[14]));
    QEX_GL(glUniform1i(Location(draw, type, kUniform_lightCount), set.count));
    QEX_GL(glUniform1iv(Location(draw, type, kUniform_lightType), QEX_MAX_LIGHTS, set.types));
    QEX_GL(glUniform3fv(Location(draw, type, kUniform_lightPosDir), QEX_MAX_LIGHTS, set.vectors[0]));
    QEX_GL(glUniform4fv(Location(draw, type, kUniform_lightColor), QEX_MAX_LIGHTS, set.colours[0]));
    QEX_GL(glUniform3fv(Location(draw, type, kUniform_sceneAmbient), 1, material.ambient));
    QEX_GL(glUniform3fv(Location(draw, type, kUniform_sceneDiffuse), 1, material.diffuse));
    if (specular) {
        QEX_GL(glUniform3fv(Location(draw, type, kUniform_sceneSpecular), 1, material.specular));
        QEX_GL(glUniform1f(Location(draw, type, kUniform_shininess), material.shininess * 256.0f));
    }
    QEX_GL(glUniform1f(Location(draw, type, kUniform_opacity), QexShaderModule_Opacity(draw)));
    QEX_GL(glUniform1f(Location(draw, type, kUniform_alphaThreshold), Parameter(draw, 0)));
}

void SetMatrices(const QexShaderDraw& draw, const QexLitShaderType* type, const QexMatrix& world,
                 const QexMatrix* view, const QexMatrix* projection) {
    QexMatrix mvp;
    QexMatrix3 normal;
    QexShaderModule_NormalMatrix(&normal, &world);
    QexMatrix_Multiply(&mvp, projection, view);
    QexMatrix_Multiply(&mvp, &mvp, &world);
    QEX_GL(glUniformMatrix4fv(Location(draw, type, kUniform_transMatrix), 1, GL_FALSE, world.m));
    QEX_GL(glUniformMatrix3fv(Location(draw, type, kUniform_normalMatrix), 1, GL_FALSE, normal.m));
    QEX_GL(glUniformMatrix4fv(Location(draw, type, kUniform_mvpMatrix), 1, GL_FALSE, mvp.m));
}

// Without shadow parameters nothing is in shadow: an empty map holds 1 everywhere.
void SetShadow(const QexShaderDraw& draw, const QexLitShaderType* type, const QexMatrix& world,
               const QexShadowInfo* shadow) {
    if (shadow) {
        QexMatrix space;
        QexMatrix_Multiply(&space, &shadow->shadowSpaceMatrix, &world);
        QEX_GL(glUniform3fv(Location(draw, type, kUniform_shadowLightDir), 1, &shadow->lightDir.x));
        QEX_GL(glUniformMatrix4fv(Location(draw, type, kUniform_shadowSpaceMatrix), 1, GL_FALSE, space.m));
        QEX_GL(glUniform1f(Location(draw, type, kUniform_shadowIntensity), shadow->shadowIntensity));
        QEX_GL(glUniform1f(Location(draw, type, kUniform_biasValue), shadow->biasValue));
        if (type->module.traits & kTraitShadowFade)
            QEX_GL(glUniform1f(Location(draw, type, kUniform_shadowFade), Parameter(draw, 1)));
    }
    QexRenderState_ActiveTexture(GL_TEXTURE0 + kShadowMapUnit);
    QexRenderState_Bind(GL_TEXTURE_2D, shadow && shadow->shadowTexture ? shadow->shadowTexture
                                                                       : Qextexture_GetDefault()->glName);
}

void BindTextures(const QexShaderDraw& draw, const QexLitShaderType* type) {
    if (type->module.traits & kTraitNormalMap) QexTexture_SetBlankNormalMap(kNormalMapUnit);
    QexShaderModule_BindMaterial(draw);
}

}  // namespace

void QexLitShader_SendLights(const int32_t* locations, const QexLightSet& lights) {
    const LightArrays set = ToArrays(&lights);
    const GLsizei count = set.count ? set.count : 1;
    glUniform1i(locations[kUniform_lightCount], set.count);
    glUniform1iv(locations[kUniform_lightType], count, set.types);
    glUniform3fv(locations[kUniform_lightPosDir], count, set.vectors[0]);
    glUniform4fv(locations[kUniform_lightColor], count, set.colours[0]);
}

void QexLitShader_Render(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                         uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
                         const QexMatrix* view, const QexMatrix* projection, const QexShadowInfo* shadow) {
    QexShaderDraw draw;
    QexMatrix world;
    if (!QexShaderModule_Begin(&draw, &type->module, module, model, nodeIndex)) return;
    QexShaderModule_World(draw, &world, modelMatrix);
    SetSurface(draw, type, lights, view);
    SetMatrices(draw, type, world, view, projection);
    if (type->module.traits & kTraitShadow) SetShadow(draw, type, world, shadow);
    BindTextures(draw, type);
    QexShaderModule_DrawMesh(&type->module, model, nodeIndex);
}

void QexLitShader_RenderSkinned(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                                uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
                                const QexMatrix* view, const QexMatrix* projection) {
    QexShaderDraw draw;
    QexMatrix viewProjection;
    if (!QexShaderModule_Begin(&draw, &type->module, module, model, nodeIndex)) return;
    SetSurface(draw, type, lights, view);
    QexMatrix_Multiply(&viewProjection, projection, view);
    QEX_GL(glUniformMatrix4fv(Location(draw, type, kUniform_viewProjMatrix), 1, GL_FALSE, viewProjection.m));
    BindTextures(draw, type);
    QexLitShader_DrawSkinnedMesh(type, module, model, nodeIndex, modelMatrix);
}

int32_t QexLitShader_DrawSkinnedMesh(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                                     uint32_t nodeIndex, const QexMatrix* modelMatrix) {
    const uint8_t* slots = type->slots;
    const QexShaderBones bones = {QexShaderModule_Location(module, slots[kUniform_boneCount]),
                                  QexShaderModule_Location(module, slots[kUniform_boneMatrixArray]), true,
                                  QexShaderModule_Location(module, slots[kUniform_boneVecMatrixArray]),
                                  modelMatrix};
    return QexShaderModule_DrawSkinnedMesh(&type->module, model, nodeIndex, bones);
}
