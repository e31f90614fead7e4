// Light per fragment, with a normal map.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource =
    QEX_GLSL_STATIC_VERTEX QEX_GLSL_LIGHT_VECTOR QEX_GLSL_NORMAL_MAP_VERTEX("3");

constexpr const char* kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_NORMAL_MAP_FRAGMENT("3");

constexpr QexLitShaderType kType =
    QexLitShader_Describe("src/Shaders/QexGouraudNormalMapShader", kVertexSource, kFragmentSource,
                          QexGouraudNormalMapShader_Render, kTraitStatic | kTraitNormalMap);

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudNormalMapShader, &kType)

}  // extern "C"
