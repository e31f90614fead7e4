#include "QexGLSL.h"
#include "QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_LIGHT_VECTOR R"(
attribute highp vec3 inVertex;
attribute mediump vec3 inTangent;
attribute mediump vec3 inBiNormal;
attribute mediump vec3 inNormal;
attribute mediump vec2 inTexCoord;
uniform highp mat4 transMatrix;
uniform highp mat3 normalMatrix;
uniform highp mat4 mvpMatrix;
uniform mediump int lightCount;
varying mediump vec3 fTangent;
varying mediump vec3 fBinormal;
varying mediump vec3 fNormal;
varying mediump vec3 fLight[3];
varying mediump vec2 fTexCoord;
void main() {
    highp vec3 point = (transMatrix * vec4(inVertex, 1.0)).xyz;
    for (int i = 0; i < 3; ++i)
        if (i < lightCount) fLight[i] = lightVector(i, point);
    fTangent = normalize(normalMatrix * inTangent);
    fBinormal = normalize(normalMatrix * inBiNormal);
    fNormal = normalize(normalMatrix * inNormal);
    fTexCoord = inTexCoord;
    gl_Position = mvpMatrix * vec4(inVertex, 1.0);
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
varying mediump vec3 fLight[3];
void main() {
    mediump vec3 texel = normalize((texture2D(sNormalMap, fTexCoord).grb - 0.5) * 2.0);
    mediump vec3 normal = mat3(fTangent, fBinormal, fNormal) * texel;
    mediump vec3 diffuse = vec3(0.0);
    for (int i = 0; i < 3; ++i)
        if (i < lightCount) diffuse += clamp(dot(normal, fLight[i]), 0.0, 1.0) * lightColor[i].rgb;
    gl_FragColor = surfaceColour(sceneDiffuse * diffuse);
}
)";

const QexLitShaderType kType = {
    {"src/Shaders/QexGouraudNormalMapShader",
     kVertexSource,
     kFragmentSource,
     QexGouraudNormalMapShader_Render,
     {{"inVertex", QEX_ELEMENT_POSITION},
      {"inTangent", QEX_ELEMENT_TANGENT},
      {"inBiNormal", QEX_ELEMENT_BINORMAL},
      {"inNormal", QEX_ELEMENT_NORMAL},
      {"inTexCoord", QEX_ELEMENT_UV0}},
     {QEX_STATIC_UNIFORMS, QEX_LIGHT_UNIFORMS, "opacity", "alphaThreshold"},
     {{"sTexture", kDiffuseUnit}, {"sNormalMap", kNormalMapUnit}, {"alphaTexture", kAlphaUnit}},
     true,
     11},
    false,
    true,
    false,
    false};

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudNormalMapShader, &kType)

}  // extern "C"
