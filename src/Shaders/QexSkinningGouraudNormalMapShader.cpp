#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

const char* const kVertexSource =
    QEX_GLSL_SKINNED_VERTEX QEX_GLSL_SKINNED_VECTOR QEX_GLSL_LIGHT_VECTOR QEX_GLSL_NORMAL_MAP_VERTEX("4");

const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_NORMAL_MAP_FRAGMENT("4");

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
