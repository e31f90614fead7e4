// Unlit, alpha from the texture, on bones.
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexSkinningTextureShader.h"
#include "Shaders/QexTextureShader.h"

namespace {

const QexShaderModuleType kType = {
    "src/Shaders/QexSkinningTextureNoAlphaShader",
    kQexSkinningVertexSource,
    kQexTextureNoAlphaFragmentSource,
    QexSkinningTextureNoAlphaShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0, QEX_ELEMENT_BONE_INDEX, QEX_ELEMENT_BONE_WEIGHT),
    QexShaderList_Of(kUniform_boneCount, kUniform_boneMatrixArray, kUniform_viewProjMatrix, kUniform_opacity,
                     kUniform_alphaThreshold),
    QexShaderList_Of(kDiffuseUnit),
    true,
    kSkinningThreshold,
    0,
    false,
    kTraitSkinned | kTraitVariants,
};

}  // namespace

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexSkinningTextureNoAlphaShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexSkinningTextureNoAlphaShader, kSkinningThreshold)

// The slots are those of the module with alpha texture.
int32_t QexSkinningTextureNoAlphaShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                                 const QexMatrix* modelMatrix) {
    return QexSkinningTextureShader_DrawMesh(module, model, nodeIndex, modelMatrix);
}

void QexSkinningTextureNoAlphaShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                            const QexLightSet*, const QexMatrix* modelMatrix,
                                            const QexMatrix* view, const QexMatrix* projection,
                                            const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexSkinningTextureShader_SetUniforms(draw, view, projection);
    QexShaderModule_BindDiffuseOnly(draw, QexBindHook::kIgnore);
    QexSkinningTextureShader_DrawMesh(module, model, nodeIndex, modelMatrix);
}

}  // extern "C"
