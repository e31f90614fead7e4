#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") QEX_GLSL_SHADOW_VERTEX;

const char* const kFragmentSource =
    QEX_GLSL_FRAGMENT_PRECISION QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_SHADOW_DEPTH R"(
uniform mediump float shadowFade;
void main() {
    float depth = shadowDepth();
    float shadow = depth > 0.0 ? clamp(shadowIntensity + depth * shadowFade, 0.0, 1.0) : 1.0;
    gl_FragColor = surfaceColour(shadow * sceneDiffuse * fDiffuse);
}
)";

enum { kThresholdSlot = 16, kFadeSlot };

const QexLitShaderType kType = {
    {"src/Shaders/QexGouraudShadowExtShader",
     kVertexSource,
     kFragmentSource,
     QexGouraudShadowExtShader_Render,
     {{"inVertex", QEX_ELEMENT_POSITION}, {"inNormal", QEX_ELEMENT_NORMAL}, {"inTexCoord", QEX_ELEMENT_UV0}},
     {QEX_STATIC_UNIFORMS, QEX_LIGHT_UNIFORMS, "opacity", "alphaThreshold", QEX_SHADOW_UNIFORMS,
      "shadowFade"},
     {{"sTexture", kDiffuseUnit}, {"shadowTexture", kShadowMapUnit}, {"alphaTexture", kAlphaUnit}},
     true,
     kThresholdSlot,
     1.0f},
    false,
    false,
    true,
    true};

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudShadowExtShader, &kType)

void QexGouraudShadowExtShader_SetShadowFade(QexShaderModule* module, float fade) {
    module->slots[kFadeSlot].value = fade;
}

float QexGouraudShadowExtShader_GetShadowFade(const QexShaderModule* module) {
    return module->slots[kFadeSlot].value;
}

}  // extern "C"
