#include "QexGLSL.h"
#include "QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "mediump") R"(
attribute highp vec3 inVertex;
attribute highp vec3 inNormal;
attribute mediump vec2 inTexCoord;
uniform highp mat4 transMatrix;
uniform highp mat3 normalMatrix;
uniform highp mat4 mvpMatrix;
uniform mediump vec3 cameraPos;
varying mediump vec3 fHalf[3];
varying mediump vec3 fNormal;
varying mediump vec3 fDiffuse;
varying mediump vec2 fTexCoord;
void main() {
    highp vec3 point = (transMatrix * vec4(inVertex, 1.0)).xyz;
    highp vec3 normal = normalize(normalMatrix * inNormal);
    fDiffuse = diffuseLight(point, normal);
    highp vec3 toCamera = normalize(cameraPos - point);
    for (int i = 0; i < 3; ++i)
        if (i < lightCount) fHalf[i] = normalize(toCamera + lightVector(i, point));
    fNormal = normal;
    fTexCoord = inTexCoord;
    gl_Position = mvpMatrix * vec4(inVertex, 1.0);
}
)";

// Shininess reaches 256, more than low precision holds.
const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE R"(
uniform mediump int lightCount;
uniform mediump vec4 lightColor[4];
uniform lowp vec3 sceneSpecular;
uniform mediump float shininess;
varying mediump vec3 fDiffuse;
varying mediump vec3 fHalf[3];
varying mediump vec3 fNormal;
void main() {
    mediump vec3 highlight = vec3(0.0);
    for (int i = 0; i < 3; ++i)
        if (i < lightCount)
            highlight += pow(clamp(dot(fNormal, fHalf[i]), 0.0, 1.0), shininess) * lightColor[i].rgb;
    gl_FragColor = surfaceColour(sceneDiffuse * fDiffuse) + vec4(sceneSpecular * highlight, 0.0);
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
