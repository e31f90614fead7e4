#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

const char* const kVertexSource =
    QEX_GLSL_STATIC_VERTEX QEX_GLSL_LIGHT_VECTOR QEX_GLSL_NORMAL_MAP_VERTEX("3");

const char* const kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_NORMAL_MAP_FRAGMENT("3");

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
