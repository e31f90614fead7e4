// Light per vertex, with shadows that fade with their distance.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource = QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") QEX_GLSL_SHADOW_VERTEX;

constexpr const char* kFragmentSource =
    QEX_GLSL_FRAGMENT_PRECISION QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_SHADOW_DEPTH R"(
uniform mediump float shadowFade;
void main() {
    float depth = shadowDepth();
    float shadow = depth > 0.0 ? clamp(shadowIntensity + depth * shadowFade, 0.0, 1.0) : 1.0;
    gl_FragColor = surfaceColour(shadow * sceneDiffuse * fDiffuse);
}
)";

constexpr QexLitShaderType kType =
    QexLitShader_Describe("src/Shaders/QexGouraudShadowExtShader", kVertexSource, kFragmentSource,
                          QexGouraudShadowExtShader_Render, kTraitStatic | kTraitShadow | kTraitShadowFade);

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudShadowExtShader, &kType)

void QexGouraudShadowExtShader_SetShadowFade(QexShaderModule* module, float fade) {
    module->slots[kType.module.thresholdSlot + 1].value = fade;
}

float QexGouraudShadowExtShader_GetShadowFade(const QexShaderModule* module) {
    return module->slots[kType.module.thresholdSlot + 1].value;
}

}  // extern "C"
