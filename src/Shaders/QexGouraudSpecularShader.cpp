// Light per vertex, highlights per fragment.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource = QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "mediump") QEX_GLSL_SPECULAR_VERTEX("3");

constexpr const char* kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_HIGHLIGHT("3") R"(
void main() {
    gl_FragColor = surfaceColour(sceneDiffuse * fDiffuse) + vec4(highlight(), 0.0);
}
)";

constexpr QexLitShaderType kType =
    QexLitShader_Describe("src/Shaders/QexGouraudSpecularShader", kVertexSource, kFragmentSource,
                          QexGouraudSpecularShader_Render, kTraitStatic | kTraitSpecular);

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudSpecularShader, &kType)

}  // extern "C"
