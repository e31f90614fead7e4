// Depth as a grey level.
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexShaderModule.h"

#define QEX_MODULE (kType.path)

namespace {

const char* const kVertexSource = QEX_GLSL_DEPTH R"(
attribute highp vec4 inVertex;
uniform highp mat4 mvpMatrix;
void main() {
    gl_Position = mvpMatrix * inVertex;
    fDepth = depthValue(gl_Position.z);
}
)";

const char* const kFragmentSource = QEX_GLSL_FRAGMENT_PRECISION R"(
varying float fDepth;
void main() {
    gl_FragColor = vec4(fDepth, fDepth, fDepth, 1.0);
}
)";

enum { kNear, kFar, kMvpMatrix, kThreshold, kNearValue, kFarValue };  // there is no threshold

// Normals and texture coordinates are fed although the shaders read only positions.
const QexShaderModuleType kType = {
    "src/Shaders/QexDepthShader",
    kVertexSource,
    kFragmentSource,
    QexDepthShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_NORMAL, QEX_ELEMENT_UV0),
    QexShaderList_Of(kUniform_near, kUniform_far, kUniform_mvpMatrix),
    {},
    false,
    kThreshold,
    0,
    false,
    kTraitStatic | kTraitAlphaTexture | kTraitDepth | kTraitVariants,
};

}  // namespace

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexDepthShader, &kType)
QEX_SHADER_MODULE_DRAW_MESH(QexDepthShader, &kType)

void QexDepthShader_SetParameters(QexShaderModule* module, float zNear, float zFar) {
    QEX_GL(QexShaderModule_SetFloat(module, kNear, zNear));
    QEX_GL(QexShaderModule_SetFloat(module, kFar, zFar));
    module->slots[kNearValue].value = zNear;
    module->slots[kFarValue].value = zFar;
}

void QexDepthShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex, const QexLightSet*,
                           const QexMatrix* modelMatrix, const QexMatrix* view, const QexMatrix* projection,
                           const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexMatrix mvp;
    QexShaderModule_ModelViewProjection(draw, &mvp, modelMatrix, view, projection);
    QEX_GL(glUniformMatrix4fv(QexShaderModule_Location(module, kMvpMatrix), 1, GL_FALSE, mvp.m));
    QexShaderModule_BindMaterial(draw);
    QexDepthShader_DrawMesh(module, model, nodeIndex);
}

}  // extern "C"
