// Unlit, alpha from the texture.
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexTextureShader.h"

// The texture is looked up once for both.
const char* const kQexTextureNoAlphaFragmentSource =
    QEX_GLSL_TEXEL "lowp vec4 surface;\n" QEX_GLSL_ALPHA_OF("surface.a") R"(
void main() {
    surface = texel();
    gl_FragColor = vec4(surface.rgb, surfaceAlpha());
}
)";

namespace {

const QexShaderModuleType kType = {
    "src/Shaders/QexTextureNoAlphaShader",
    kQexTextureVertexSource,
    kQexTextureNoAlphaFragmentSource,
    QexTextureNoAlphaShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0),
    QexShaderList_Of(kUniform_mvpMatrix, kUniform_opacity, kUniform_alphaThreshold),
    QexShaderList_Of(kDiffuseUnit),
    true,
    kTextureThreshold,
    0,
    false,
    kTraitStatic | kTraitVariants,
};

}  // namespace

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexTextureNoAlphaShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexTextureNoAlphaShader, kTextureThreshold)
QEX_SHADER_MODULE_DRAW_MESH(QexTextureNoAlphaShader, &kType)

void QexTextureNoAlphaShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                    const QexLightSet*, const QexMatrix* modelMatrix, const QexMatrix* view,
                                    const QexMatrix* projection, const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexTextureShader_SetUniforms(draw, modelMatrix, view, projection);
    QexShaderModule_BindDiffuseOnly(draw, QexBindHook::kAsk);
    QexTextureNoAlphaShader_DrawMesh(module, model, nodeIndex);
}

}  // extern "C"
