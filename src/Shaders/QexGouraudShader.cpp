// Light per vertex.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource = QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") QEX_GLSL_GOURAUD_VERTEX;

constexpr const char* kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_GOURAUD_FRAGMENT;

constexpr QexLitShaderType kType = QexLitShader_Describe(
    "src/Shaders/QexGouraudShader", kVertexSource, kFragmentSource, QexGouraudShader_Render, kTraitStatic);

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudShader, &kType)

}  // extern "C"
