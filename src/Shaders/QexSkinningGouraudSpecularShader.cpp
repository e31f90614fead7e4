// Light per vertex and highlights per fragment, on bones.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource =
    QEX_GLSL_SKINNED_VERTEX QEX_GLSL_SKINNED_VECTOR QEX_GLSL_NORMAL("mediump")
        QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("4", "mediump") QEX_GLSL_SPECULAR_VERTEX("4");

// Unlike that of static modules, the highlight is in the colours of the texture.
constexpr const char* kFragmentSource = QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_HIGHLIGHT("4") R"(
void main() {
    gl_FragColor = surfaceColour(highlight() + sceneDiffuse * fDiffuse);
}
)";

constexpr QexLitShaderType kType =
    QexLitShader_Describe("src/Shaders/QexSkinningGouraudSpecularShader", kVertexSource, kFragmentSource,
                          QexSkinningGouraudSpecularShader_Render, kTraitSkinned | kTraitSpecular);

}  // namespace

extern "C" {

QEX_SKINNED_LIT_SHADER(QexSkinningGouraudSpecularShader, &kType)

}  // extern "C"
