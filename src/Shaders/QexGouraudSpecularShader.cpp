#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "mediump") QEX_GLSL_SPECULAR_VERTEX("3");

const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_HIGHLIGHT("3") R"(
void main() {
    gl_FragColor = surfaceColour(sceneDiffuse * fDiffuse) + vec4(highlight(), 0.0);
}
)";

const QexLitShaderType kType = {
    {"src/Shaders/QexGouraudSpecularShader",
     kVertexSource,
     kFragmentSource,
     QexGouraudSpecularShader_Render,
     {{"inVertex", QEX_ELEMENT_POSITION}, {"inNormal", QEX_ELEMENT_NORMAL}, {"inTexCoord", QEX_ELEMENT_UV0}},
     {QEX_STATIC_UNIFORMS, "cameraPos", QEX_LIGHT_UNIFORMS, "sceneSpecular", "shininess", "opacity",
      "alphaThreshold"},
     {{"sTexture", kDiffuseUnit}, {"alphaTexture", kAlphaUnit}},
     true,
     14},
    true,
    false,
    false,
    false};

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudSpecularShader, &kType)

}  // extern "C"
