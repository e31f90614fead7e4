#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") QEX_GLSL_SHADOW_VERTEX;

const char* const kFragmentSource =
    QEX_GLSL_FRAGMENT_PRECISION QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_SHADOW_DEPTH R"(
void main() {
    float shadow = shadowDepth() > 0.0 ? shadowIntensity : 1.0;
    gl_FragColor = surfaceColour(shadow * sceneDiffuse * fDiffuse);
}
)";

const QexLitShaderType kType = {
    {"src/Shaders/QexGouraudShadowShader",
     kVertexSource,
     kFragmentSource,
     QexGouraudShadowShader_Render,
     {{"inVertex", QEX_ELEMENT_POSITION}, {"inNormal", QEX_ELEMENT_NORMAL}, {"inTexCoord", QEX_ELEMENT_UV0}},
     {QEX_STATIC_UNIFORMS, QEX_LIGHT_UNIFORMS, "opacity", "alphaThreshold", QEX_SHADOW_UNIFORMS},
     {{"sTexture", kDiffuseUnit}, {"shadowTexture", kShadowMapUnit}, {"alphaTexture", kAlphaUnit}},
     true,
     15},
    false,
    false,
    true,
    false};

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudShadowShader, &kType)

}  // extern "C"
