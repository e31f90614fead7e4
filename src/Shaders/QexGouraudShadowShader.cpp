// Light per vertex, with a shadow map.
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr const char* kVertexSource = QEX_GLSL_STATIC_VERTEX QEX_GLSL_NORMAL("highp")
    QEX_GLSL_LIGHT_VECTOR QEX_GLSL_DIFFUSE("3", "highp") QEX_GLSL_SHADOW_VERTEX;

constexpr const char* kFragmentSource =
    QEX_GLSL_FRAGMENT_PRECISION QEX_GLSL_ALPHA QEX_GLSL_SURFACE QEX_GLSL_SHADOW_DEPTH R"(
void main() {
    float shadow = shadowDepth() > 0.0 ? shadowIntensity : 1.0;
    gl_FragColor = surfaceColour(shadow * sceneDiffuse * fDiffuse);
}
)";

constexpr QexLitShaderType kType =
    QexLitShader_Describe("src/Shaders/QexGouraudShadowShader", kVertexSource, kFragmentSource,
                          QexGouraudShadowShader_Render, kTraitStatic | kTraitShadow);

}  // namespace

extern "C" {

QEX_LIT_SHADER(QexGouraudShadowShader, &kType)

}  // extern "C"
