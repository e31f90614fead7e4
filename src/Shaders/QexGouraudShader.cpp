#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

const char* const kVertexSource =
    QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp") QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") R"(
varying mediump vec3 fDiffuse;
void main() {
    highp vec3 point = placeVertex();
    fDiffuse = diffuseLight(point, normalize(worldVector(inNormal)));
}
)";

const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_GOURAUD_FRAGMENT;

const QexLitShaderType kType = {
    {"src/Shaders/QexGouraudShader",
     kVertexSource,
     kFragmentSource,
     QexGouraudShader_Render,
     {{"inVertex", QEX_ELEMENT_POSITION}, {"inNormal", QEX_ELEMENT_NORMAL}, {"inTexCoord", QEX_ELEMENT_UV0}},
     {QEX_STATIC_UNIFORMS, QEX_LIGHT_UNIFORMS, "opacity", "alphaThreshold"},
     {{"sTexture", kDiffuseUnit}, {"alphaTexture", kAlphaUnit}},
     true,
     11},
    false,
    false,
    false,
    false};

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudShader, &kType)

}  // extern "C"
