#include "QexGLSL.h"
#include "QexLitShader.h"

namespace {

const char* const kVertexSource =
    QEX_GLSL_SKIN QEX_GLSL_SKIN_VECTOR QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") R"(
attribute mediump vec3 inNormal;
attribute mediump vec2 inTexCoord;
uniform highp mat4 viewProjMatrix;
varying mediump vec3 fDiffuse;
varying mediump vec2 fTexCoord;
void main() {
    highp vec4 position = skinPosition();
    highp vec3 point = position.xyz;
    highp vec3 normal = normalize(skinVector(inNormal));
    fDiffuse = diffuseLight(point, normal);
    fTexCoord = inTexCoord;
    gl_Position = viewProjMatrix * position;
}
)";

const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE R"(
varying mediump vec3 fDiffuse;
void main() {
    gl_FragColor = surfaceColour(sceneDiffuse * fDiffuse);
}
)";

const QexLitShaderType kType = {{"src/Shaders/QexSkinningGouraudShader",
                                 kVertexSource,
                                 kFragmentSource,
                                 QexSkinningGouraudShader_Render,
                                 {{"inVertex", QEX_ELEMENT_POSITION},
                                  {"inNormal", QEX_ELEMENT_NORMAL},
                                  {"inTexCoord", QEX_ELEMENT_UV0},
                                  {"inBoneIndex", QEX_ELEMENT_BONE_INDEX},
                                  {"inBoneWeight", QEX_ELEMENT_BONE_WEIGHT}},
                                 {QEX_SKINNED_UNIFORMS, QEX_LIGHT_UNIFORMS, "opacity", "alphaThreshold"},
                                 {{"sTexture", kDiffuseUnit}, {"alphaTexture", kAlphaUnit}},
                                 true,
                                 12},
                                false,
                                false,
                                false,
                                false};

}  // namespace

extern "C" {

QEX_SKINNED_LIT_SHADER(QexSkinningGouraudShader, &kType)

}  // extern "C"
