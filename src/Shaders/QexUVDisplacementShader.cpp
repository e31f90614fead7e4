// Unlit, alpha from the alpha texture, with shifted texture coordinates.
#include "Shaders/QexUVDisplacementShader.h"

#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexTextureShader.h"

#define QEX_MODULE (draw.type->path)

// A shift may be animated past 1 for long; low precision would not hold it.
const char* const kQexUVDisplacementVertexSource = QEX_GLSL_UNLIT_VERTEX R"(
uniform mediump vec2 displacement;
void main() {
    placeVertex();
    fTexCoord = inTexCoord + displacement;
}
)";

namespace {

const QexShaderModuleType kType = {
    "src/Shaders/QexUVDisplacementShader",
    kQexUVDisplacementVertexSource,
    kQexTextureFragmentSource,
    QexUVDisplacementShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0),
    QexShaderList_Of(kUniform_displacement, kUniform_mvpMatrix, kUniform_opacity, kUniform_alphaThreshold),
    QexShaderList_Of(kDiffuseUnit, kAlphaUnit),
    true,
    kDisplacementThreshold,
    0,
    false,
    kTraitStatic | kTraitAlphaTexture | kTraitDisplaced | kTraitVariants,
};

}  // namespace

void QexUVDisplacementShader_SetUniforms(const QexShaderDraw& draw, const QexMatrix* modelMatrix,
                                         const QexMatrix* view, const QexMatrix* projection) {
    const QexShaderSlot* slots = draw.module->slots;
    const float shift[] = {slots[kDisplacementU].value, slots[kDisplacementV].value};
    QexMatrix mvp;
    QexShaderModule_ModelViewProjection(draw, &mvp, modelMatrix, view, projection);
    QEX_GL(glUniform1f(slots[kDisplacementOpacity].location, QexShaderModule_Opacity(draw)));
    QEX_GL(glUniform1f(slots[kDisplacementAlphaThreshold].location, slots[kDisplacementThreshold].value));
    QEX_GL(glUniform2fv(slots[kDisplacementUniform].location, 1, shift));
    QEX_GL(glUniformMatrix4fv(slots[kDisplacementMvpMatrix].location, 1, GL_FALSE, mvp.m));
}

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexUVDisplacementShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexUVDisplacementShader, kDisplacementThreshold)
QEX_SHADER_MODULE_DRAW_MESH(QexUVDisplacementShader, &kType)
QEX_UV_DISPLACEMENT(QexUVDisplacementShader)

void QexUVDisplacementShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                    const QexLightSet*, const QexMatrix* modelMatrix, const QexMatrix* view,
                                    const QexMatrix* projection, const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexUVDisplacementShader_SetUniforms(draw, modelMatrix, view, projection);
    QexShaderModule_BindMaterial(draw);
    QexUVDisplacementShader_DrawMesh(module, model, nodeIndex);
}

}  // extern "C"
