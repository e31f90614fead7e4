// Unlit, alpha from the texture, with shifted texture coordinates.
#include "Shaders/QexUVDisplacementShader.h"

#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexTextureShader.h"

namespace {

const QexShaderModuleType kType = {
    "src/Shaders/QexUVDisplacementNoAlphaShader",
    kQexUVDisplacementVertexSource,
    kQexTextureNoAlphaFragmentSource,
    QexUVDisplacementNoAlphaShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0),
    QexShaderList_Of(kUniform_displacement, kUniform_mvpMatrix, kUniform_opacity, kUniform_alphaThreshold),
    QexShaderList_Of(kDiffuseUnit),
    true,
    kDisplacementThreshold,
    0,
    false,
    kTraitStatic | kTraitDisplaced | kTraitVariants,
};

}  // namespace

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexUVDisplacementNoAlphaShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexUVDisplacementNoAlphaShader, kDisplacementThreshold)
QEX_SHADER_MODULE_DRAW_MESH(QexUVDisplacementNoAlphaShader, &kType)
QEX_UV_DISPLACEMENT(QexUVDisplacementNoAlphaShader)

void QexUVDisplacementNoAlphaShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                           const QexLightSet*, const QexMatrix* modelMatrix,
                                           const QexMatrix* view, const QexMatrix* projection,
                                           const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexUVDisplacementShader_SetUniforms(draw, modelMatrix, view, projection);
    QexShaderModule_BindDiffuseOnly(draw, QexBindHook::kAsk);
    QexUVDisplacementNoAlphaShader_DrawMesh(module, model, nodeIndex);
}

}  // extern "C"
