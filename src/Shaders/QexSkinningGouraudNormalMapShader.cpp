#include "QexGLSL.h"
#include "QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_SKIN QEX_GLSL_SKIN_VECTOR QEX_GLSL_LIGHT_VECTOR R"(
attribute mediump vec3 inTangent;
attribute mediump vec3 inBiNormal;
attribute mediump vec3 inNormal;
attribute mediump vec2 inTexCoord;
uniform highp mat4 viewProjMatrix;
uniform mediump int lightCount;
varying mediump vec3 fTangent;
varying mediump vec3 fBinormal;
varying mediump vec3 fNormal;
varying mediump vec3 fLight[4];
varying mediump vec2 fTexCoord;
void main() {
    highp vec4 position = skinPosition();
    highp vec3 point = position.xyz;
    for (int i = 0; i < 4; ++i)
        if (i < lightCount) fLight[i] = lightVector(i, point);
    fTangent = normalize(skinVector(inTangent));
    fBinormal = normalize(skinVector(inBiNormal));
    fNormal = normalize(skinVector(inNormal));
    fTexCoord = inTexCoord;
    gl_Position = viewProjMatrix * position;
}
)";

// The map holds the direction in the order green, red, blue.
const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE R"(
uniform sampler2D sNormalMap;
uniform mediump int lightCount;
uniform mediump vec4 lightColor[4];
varying mediump vec3 fTangent;
varying mediump vec3 fBinormal;
varying mediump vec3 fNormal;
varying mediump vec3 fLight[4];
void main() {
    mediump vec3 texel = normalize((texture2D(sNormalMap, fTexCoord).grb - 0.5) * 2.0);
    mediump vec3 normal = mat3(fTangent, fBinormal, fNormal) * texel;
    mediump vec3 diffuse = vec3(0.0);
    for (int i = 0; i < 4; ++i)
        if (i < lightCount) diffuse += clamp(dot(normal, fLight[i]), 0.0, 1.0) * lightColor[i].rgb;
    gl_FragColor = surfaceColour(sceneDiffuse * diffuse);
}
)";

const QexLitShaderType kType = {
    {"src/Shaders/QexSkinningGouraudNormalMapShader",
     kVertexSource,
     kFragmentSource,
     QexSkinningGouraudNormalMapShader_Render,
     {{"inVertex", QEX_ELEMENT_POSITION},
      {"inTangent", QEX_ELEMENT_TANGENT},
      {"inBiNormal", QEX_ELEMENT_BINORMAL},
      {"inNormal", QEX_ELEMENT_NORMAL},
      {"inTexCoord", QEX_ELEMENT_UV0},
      {"inBoneIndex", QEX_ELEMENT_BONE_INDEX},
      {"inBoneWeight", QEX_ELEMENT_BONE_WEIGHT}},
     {QEX_SKINNED_UNIFORMS, QEX_LIGHT_UNIFORMS, "opacity", "alphaThreshold"},
     {{"sTexture", kDiffuseUnit}, {"sNormalMap", kNormalMapUnit}, {"alphaTexture", kAlphaUnit}},
     true,
     12},
    false,
    true,
    false,
    false};

}  // namespace

extern "C" {

QEX_SKINNED_LIT_SHADER(QexSkinningGouraudNormalMapShader, &kType)

}  // extern "C"
