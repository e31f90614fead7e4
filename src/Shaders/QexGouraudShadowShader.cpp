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
uniform mediump vec3 shadowLightDir;
uniform highp mat4 shadowSpaceMatrix;
uniform mediump float biasValue;
varying highp vec3 fShadow;
varying mediump float fFacing;
varying mediump vec3 fDiffuse;
varying mediump vec2 fTexCoord;
void main() {
    highp vec3 point = (transMatrix * vec4(inVertex, 1.0)).xyz;
    highp vec3 normal = normalize(normalMatrix * inNormal);
    fDiffuse = diffuseLight(point, normal);
    fShadow = (shadowSpaceMatrix * vec4(inVertex, 1.0)).xyz - vec3(0.0, 0.0, biasValue);
    fFacing = dot(normal, normalize(-shadowLightDir));
    fTexCoord = inTexCoord;
    gl_Position = mvpMatrix * vec4(inVertex, 1.0);
}
)";

// A fragment is in shadow when it faces the light, lies within the map, and the map holds something nearer.
const char* const kFragmentSource = QEX_GLSL_FRAGMENT_PRECISION QEX_GLSL_ALPHA QEX_GLSL_SURFACE R"(
uniform sampler2D shadowTexture;
uniform mediump float shadowIntensity;
varying mediump vec3 fDiffuse;
varying vec3 fShadow;
varying mediump float fFacing;
void main() {
    float depth = texture2D(shadowTexture, fShadow.xy).r;
    bool inMap = fShadow.x >= 0.0 && fShadow.x <= 1.0 && fShadow.y >= 0.0 && fShadow.y <= 1.0;
    float shadow = 1.0;
    if (depth < 1.0 && inMap && fFacing > 0.0 && depth < fShadow.z)
        shadow = shadowIntensity;
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
