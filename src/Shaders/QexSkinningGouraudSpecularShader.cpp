#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

const char* const kVertexSource = QEX_GLSL_SKINNED_VERTEX QEX_GLSL_SKINNED_VECTOR QEX_GLSL_NORMAL("mediump")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("4", "mediump") QEX_GLSL_SPECULAR_VERTEX("4");

// Unlike that of static modules, the highlight is in the colours of the texture.
const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_HIGHLIGHT("4") R"(
void main() {
    gl_FragColor = surfaceColour(highlight() + sceneDiffuse * fDiffuse);
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
