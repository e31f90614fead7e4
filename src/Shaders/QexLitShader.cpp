#include "Shaders/QexLitShader.h"

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

// Sets everything from `slot` on that has to do with lights and material; returns the slot behind.
uint32_t SetSurface(const QexShaderDraw& draw, uint32_t slot, bool specular, const QexLightSet* lights,
                    const QexMatrix* view) {
    const QexShaderSlot* slots = draw.module->slots;
    const QexPODMaterial& material = *draw.material;
    const LightArrays set = ToArrays(lights);
    if (specular) QEX_GL(glUniform3f(slots[slot++].location, -view->m[12], -view->m[13], -view->m[14]));
    QEX_GL(glUniform1i(slots[slot++].location, set.count));
    QEX_GL(glUniform1iv(slots[slot++].location, QEX_MAX_LIGHTS, set.types));
    QEX_GL(glUniform3fv(slots[slot++].location, QEX_MAX_LIGHTS, set.vectors[0]));
    QEX_GL(glUniform4fv(slots[slot++].location, QEX_MAX_LIGHTS, set.colours[0]));
    QEX_GL(glUniform3fv(slots[slot++].location, 1, material.ambient));
    QEX_GL(glUniform3fv(slots[slot++].location, 1, material.diffuse));
    if (specular) {
        QEX_GL(glUniform3fv(slots[slot++].location, 1, material.specular));
        QEX_GL(glUniform1f(slots[slot++].location, material.shininess * 256.0f));
    }
    QEX_GL(glUniform1f(slots[slot++].location, QexShaderModule_Opacity(draw)));
    QEX_GL(glUniform1f(slots[slot++].location, slots[draw.type->thresholdSlot].value));
    return slot;
}

void SetMatrices(const QexShaderDraw& draw, const QexMatrix& world, const QexMatrix* view,
                 const QexMatrix* projection) {
    const QexShaderSlot* slots = draw.module->slots;
    QexMatrix mvp;
    QexMatrix3 normal;
    QexShaderModule_NormalMatrix(&normal, &world);
    QexMatrix_Multiply(&mvp, projection, view);
    QexMatrix_Multiply(&mvp, &mvp, &world);
    QEX_GL(glUniformMatrix4fv(slots[kTransMatrix].location, 1, GL_FALSE, world.m));
    QEX_GL(glUniformMatrix3fv(slots[kNormalMatrix].location, 1, GL_FALSE, normal.m));
    QEX_GL(glUniformMatrix4fv(slots[kMvpMatrix].location, 1, GL_FALSE, mvp.m));
}

// Without shadow parameters nothing is in shadow: an empty map holds 1 everywhere.
void SetShadow(const QexShaderDraw& draw, uint32_t slot, bool fade, const QexMatrix& world,
               const QexShadowInfo* shadow) {
    const QexShaderSlot* slots = draw.module->slots;
    if (shadow) {
        QexMatrix space;
        QexMatrix_Multiply(&space, &shadow->shadowSpaceMatrix, &world);
        QEX_GL(glUniform3fv(slots[slot].location, 1, &shadow->lightDir.x));
        QEX_GL(glUniformMatrix4fv(slots[slot + 1].location, 1, GL_FALSE, space.m));
        QEX_GL(glUniform1f(slots[slot + 3].location, shadow->shadowIntensity));
        QEX_GL(glUniform1f(slots[slot + 2].location, shadow->biasValue));
        if (fade) QEX_GL(glUniform1f(slots[slot + 4].location, slots[draw.type->thresholdSlot + 1].value));
    }
    QexRenderState_ActiveTexture(GL_TEXTURE0 + kShadowMapUnit);
    QexRenderState_Bind(GL_TEXTURE_2D, shadow && shadow->shadowTexture ? shadow->shadowTexture
                                                                       : Qextexture_GetDefault()->glName);
}

void BindTextures(const QexShaderDraw& draw, const QexLitShaderType* type) {
    if (type->normalMap) QexTexture_SetBlankNormalMap(kNormalMapUnit);
    QexShaderModule_BindMaterial(draw);
}

}  // namespace

void QexLitShader_Render(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                         uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
                         const QexMatrix* view, const QexMatrix* projection, const QexShadowInfo* shadow) {
    QexShaderDraw draw;
    QexMatrix world;
    if (!QexShaderModule_Begin(&draw, &type->module, module, model, nodeIndex)) return;
    QexShaderModule_World(draw, &world, modelMatrix);
    const uint32_t slot = SetSurface(draw, kFirstStaticLight, type->specular, lights, view);
    SetMatrices(draw, world, view, projection);
    if (type->shadow) SetShadow(draw, slot, type->shadowFade, world, shadow);
    BindTextures(draw, type);
    QexShaderModule_DrawMesh(&type->module, model, nodeIndex);
}

void QexLitShader_RenderSkinned(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                                uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
                                const QexMatrix* view, const QexMatrix* projection) {
    QexShaderDraw draw;
    QexMatrix viewProjection;
    if (!QexShaderModule_Begin(&draw, &type->module, module, model, nodeIndex)) return;
    SetSurface(draw, kFirstSkinnedLight, type->specular, lights, view);
    QexMatrix_Multiply(&viewProjection, projection, view);
    QEX_GL(glUniformMatrix4fv(module->slots[kViewProjMatrix].location, 1, GL_FALSE, viewProjection.m));
    BindTextures(draw, type);
    QexLitShader_DrawSkinnedMesh(type, module, model, nodeIndex, modelMatrix);
}

int32_t QexLitShader_DrawSkinnedMesh(const QexLitShaderType* type, QexShaderModule* module, QexModel* model,
                                     uint32_t nodeIndex, const QexMatrix* modelMatrix) {
    const QexShaderBones bones = {module->slots[kBoneCount].location,
                                  module->slots[kBoneMatrixArray].location, true,
                                  module->slots[kBoneVecMatrixArray].location, modelMatrix};
    return QexShaderModule_DrawSkinnedMesh(&type->module, model, nodeIndex, bones);
}
