// Unlit, alpha from the alpha texture.
#include "Shaders/QexTextureShader.h"

#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"

#define QEX_MODULE (type->path)

const char* const kQexTextureVertexSource = QEX_GLSL_UNLIT_VERTEX R"(
void main() {
    placeVertex();
}
)";

const char* const kQexTextureFragmentSource = QEX_GLSL_ALPHA R"(
void main() {
    gl_FragColor = vec4(texel().rgb, surfaceAlpha());
}
)";

namespace {

const QexShaderModuleType kType = {
    "src/Shaders/QexTextureShader",
    kQexTextureVertexSource,
    kQexTextureFragmentSource,
    QexTextureShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0),
    QexShaderList_Of(kUniform_mvpMatrix, kUniform_opacity, kUniform_alphaThreshold),
    QexShaderList_Of(kDiffuseUnit, kAlphaUnit),
    true,
    kTextureThreshold,
    0,
    false,
    kTraitStatic | kTraitAlphaTexture | kTraitVariants,
};

}  // namespace

void QexTextureShader_SetUniforms(const QexShaderDraw& draw, const QexMatrix* modelMatrix,
                                  const QexMatrix* view, const QexMatrix* projection) {
    const QexShaderModuleType* type = draw.type;
    const QexShaderSlot* slots = draw.module->slots;
    QexMatrix mvp;
    QexShaderModule_ModelViewProjection(draw, &mvp, modelMatrix, view, projection);
    QEX_GL(glUniform1f(slots[kTextureOpacity].location, QexShaderModule_Opacity(draw)));
    QEX_GL(glUniform1f(slots[kTextureAlphaThreshold].location, slots[kTextureThreshold].value));
    QEX_GL(glUniformMatrix4fv(slots[kTextureMvpMatrix].location, 1, GL_FALSE, mvp.m));
}

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexTextureShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexTextureShader, kTextureThreshold)
QEX_SHADER_MODULE_DRAW_MESH(QexTextureShader, &kType)

void QexTextureShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex, const QexLightSet*,
                             const QexMatrix* modelMatrix, const QexMatrix* view, const QexMatrix* projection,
                             const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexTextureShader_SetUniforms(draw, modelMatrix, view, projection);
    QexShaderModule_BindMaterial(draw);
    QexTextureShader_DrawMesh(module, model, nodeIndex);
}

}  // extern "C"
