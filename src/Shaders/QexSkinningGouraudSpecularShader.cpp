#include "QexGLSL.h"
#include "QexLitShader.h"

namespace {

const char* const kVertexSource =
    QEX_GLSL_SKIN QEX_GLSL_SKIN_VECTOR QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("4", "mediump") R"(
attribute mediump vec3 inNormal;
attribute mediump vec2 inTexCoord;
uniform highp mat4 viewProjMatrix;
uniform mediump vec3 cameraPos;
varying mediump vec3 fHalf[4];
varying mediump vec3 fNormal;
varying mediump vec3 fDiffuse;
varying mediump vec2 fTexCoord;
void main() {
    highp vec4 position = skinPosition();
    highp vec3 point = position.xyz;
    highp vec3 normal = normalize(skinVector(inNormal));
    fDiffuse = diffuseLight(point, normal);
    highp vec3 toCamera = normalize(cameraPos - point);
    for (int i = 0; i < 4; ++i)
        if (i < lightCount) fHalf[i] = normalize(toCamera + lightVector(i, point));
    fNormal = normal;
    fTexCoord = inTexCoord;
    gl_Position = viewProjMatrix * position;
}
)";

// Shininess reaches 256, more than low precision holds.
const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE R"(
uniform mediump int lightCount;
uniform mediump vec4 lightColor[4];
uniform lowp vec3 sceneSpecular;
uniform mediump float shininess;
varying mediump vec3 fDiffuse;
varying mediump vec3 fHalf[4];
varying mediump vec3 fNormal;
void main() {
    mediump vec3 highlight = vec3(0.0);
    for (int i = 0; i < 4; ++i)
        if (i < lightCount)
            highlight += pow(clamp(dot(fNormal, fHalf[i]), 0.0, 1.0), shininess) * lightColor[i].rgb;
    gl_FragColor = surfaceColour(sceneSpecular * highlight + sceneDiffuse * fDiffuse);
}
)";

const QexLitShaderType kType = {{"src/Shaders/QexSkinningGouraudSpecularShader",
                                 kVertexSource,
                                 kFragmentSource,
                                 QexSkinningGouraudSpecularShader_Render,
                                 {{"inVertex", QEX_ELEMENT_POSITION},
                                  {"inNormal", QEX_ELEMENT_NORMAL},
                                  {"inTexCoord", QEX_ELEMENT_UV0},
                                  {"inBoneIndex", QEX_ELEMENT_BONE_INDEX},
                                  {"inBoneWeight", QEX_ELEMENT_BONE_WEIGHT}},
                                 {QEX_SKINNED_UNIFORMS, "cameraPos", QEX_LIGHT_UNIFORMS, "sceneSpecular",
                                  "shininess", "opacity", "alphaThreshold"},
                                 {{"sTexture", kDiffuseUnit}, {"alphaTexture", kAlphaUnit}},
                                 true,
                                 15},
                                true,
                                false,
                                false,
                                false};

}  // namespace

extern "C" {

QEX_SKINNED_LIT_SHADER(QexSkinningGouraudSpecularShader, &kType)

}  // extern "C"
