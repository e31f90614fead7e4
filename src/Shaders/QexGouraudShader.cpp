#include "QexGLSL.h"
#include "QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") R"(
attribute highp vec3 inVertex;
attribute highp vec3 inNormal;
attribute mediump vec2 inTexCoord;
uniform highp mat4 transMatrix;
uniform highp mat3 normalMatrix;
uniform highp mat4 mvpMatrix;
varying mediump vec3 fDiffuse;
varying mediump vec2 fTexCoord;
void main() {
    highp vec3 point = (transMatrix * vec4(inVertex, 1.0)).xyz;
    highp vec3 normal = normalize(normalMatrix * inNormal);
    fDiffuse = diffuseLight(point, normal);
    fTexCoord = inTexCoord;
    gl_Position = mvpMatrix * vec4(inVertex, 1.0);
}
)";

const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE R"(
varying mediump vec3 fDiffuse;
void main() {
    gl_FragColor = surfaceColour(sceneDiffuse * fDiffuse);
}
)";

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
