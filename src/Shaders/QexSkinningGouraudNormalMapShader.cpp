// Light per fragment with a normal map, on bones.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource =
    QEX_GLSL_SKINNED_VERTEX QEX_GLSL_SKINNED_VECTOR QEX_GLSL_LIGHT_VECTOR QEX_GLSL_NORMAL_MAP_VERTEX("4");

constexpr const char* kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_NORMAL_MAP_FRAGMENT("4");

constexpr QexLitShaderType kType =
    QexLitShader_Describe("src/Shaders/QexSkinningGouraudNormalMapShader", kVertexSource, kFragmentSource,
                          QexSkinningGouraudNormalMapShader_Render, kTraitSkinned | kTraitNormalMap);

}  // namespace

extern "C" {

QEX_SKINNED_LIT_SHADER(QexSkinningGouraudNormalMapShader, &kType)

}  // extern "C"
