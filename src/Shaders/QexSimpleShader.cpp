// Flat white: a mask.
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderModule.h"

#define QEX_MODULE (kType.path)

namespace {

const char* const kVertexSource = R"(
attribute highp vec3 inVertex;
uniform highp mat4 mvpMatrix;
void main() {
    gl_Position = mvpMatrix * vec4(inVertex, 1.0);
}
)";

const char* const kFragmentSource = R"(
void main() {
    gl_FragColor = vec4(1.0, 1.0, 1.0, 1.0);
}
)";

enum { kMvpMatrix };

const QexShaderModuleType kType = {
    "src/Shaders/QexSimpleShader",
    kVertexSource,
    kFragmentSource,
    QexSimpleShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION),
    QexShaderList_Of(kUniform_mvpMatrix),
    {},
    false,
    0,
};

}  // namespace

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexSimpleShader, &kType)
QEX_SHADER_MODULE_DRAW_MESH(QexSimpleShader, &kType)

void QexSimpleShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex, const QexLightSet*,
                            const QexMatrix* modelMatrix, const QexMatrix* view, const QexMatrix* projection,
                            const QexShadowInfo*) {
    QexShaderDraw draw;
    QexMatrix mvp;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexShaderModule_ModelViewProjection(draw, &mvp, modelMatrix, view, projection);
    QEX_GL(glUniformMatrix4fv(QexShaderModule_Location(module, kMvpMatrix), 1, GL_FALSE, mvp.m));
    QexSimpleShader_DrawMesh(module, model, nodeIndex);
}

}  // extern "C"
