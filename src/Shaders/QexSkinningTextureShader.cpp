// Unlit, alpha from the alpha texture, on bones.
#include "Shaders/QexSkinningTextureShader.h"

#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexTextureShader.h"

#define QEX_MODULE (draw.type->path)

const char* const kQexSkinningVertexSource = QEX_GLSL_SKINNED_VERTEX R"(
void main() {
    placeVertex();
}
)";

namespace {

const QexShaderModuleType kType = {
    "src/Shaders/QexSkinningTextureShader",
    kQexSkinningVertexSource,
    kQexTextureFragmentSource,
    QexSkinningTextureShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0, QEX_ELEMENT_BONE_INDEX, QEX_ELEMENT_BONE_WEIGHT),
    QexShaderList_Of(kUniform_boneCount, kUniform_boneMatrixArray, kUniform_viewProjMatrix, kUniform_opacity,
                     kUniform_alphaThreshold),
    QexShaderList_Of(kDiffuseUnit, kAlphaUnit),
    true,
    kSkinningThreshold,
    0,
    false,
    kTraitSkinned | kTraitAlphaTexture | kTraitKeepsPass | kTraitVariants,
};

}  // namespace

void QexSkinningTextureShader_SetUniforms(const QexShaderDraw& draw, const QexMatrix* view,
                                          const QexMatrix* projection) {
    const QexShaderSlot* slots = draw.module->slots;
    QexMatrix viewProjection;
    QexMatrix_Multiply(&viewProjection, projection, view);
    QEX_GL(glUniform1f(slots[kSkinningOpacity].location, QexShaderModule_Opacity(draw)));
    QEX_GL(glUniform1f(slots[kSkinningAlphaThreshold].location, slots[kSkinningThreshold].value));
    QEX_GL(glUniformMatrix4fv(slots[kSkinningViewProjMatrix].location, 1, GL_FALSE, viewProjection.m));
}

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexSkinningTextureShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexSkinningTextureShader, kSkinningThreshold)

int32_t QexSkinningTextureShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                          const QexMatrix* modelMatrix) {
    const QexShaderBones bones = {QexShaderModule_Location(module, kSkinningBoneCount),
                                  QexShaderModule_Location(module, kSkinningBoneMatrixArray), false, 0,
                                  modelMatrix};
    return QexShaderModule_DrawSkinnedMesh(&kType, model, nodeIndex, bones);
}

void QexSkinningTextureShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                     const QexLightSet*, const QexMatrix* modelMatrix, const QexMatrix* view,
                                     const QexMatrix* projection, const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexSkinningTextureShader_SetUniforms(draw, view, projection);
    QexShaderModule_BindMaterialKeepPass(draw);
    QexSkinningTextureShader_DrawMesh(module, model, nodeIndex, modelMatrix);
}

}  // extern "C"
