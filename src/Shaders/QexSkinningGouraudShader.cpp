// Light per vertex, on bones.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource =
    QEX_GLSL_SKINNED_VERTEX QEX_GLSL_SKINNED_VECTOR QEX_GLSL_NORMAL("mediump")
        QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") QEX_GLSL_GOURAUD_VERTEX;

constexpr const char* kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_GOURAUD_FRAGMENT;

constexpr QexLitShaderType kType =
    QexLitShader_Describe("src/Shaders/QexSkinningGouraudShader", kVertexSource, kFragmentSource,
                          QexSkinningGouraudShader_Render, kTraitSkinned);

}  // namespace

extern "C" {

QEX_SKINNED_LIT_SHADER(QexSkinningGouraudShader, &kType)

}  // extern "C"
