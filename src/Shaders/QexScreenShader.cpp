#include "Shaders/QexScreenShader.h"

#define QEX_MODULE (type->path)

void QexScreenShader_Setup(const QexShaderModuleType* type, QexShaderModule* module,
                           const QexMatrix* projection) {
    QexShaderModule_Setup(type, module);
    QexShaderSlot* slots = module->slots;
    QEX_GL(slots[kScreenPosition].location = glGetAttribLocation(module->program, "a_v4Position"));
    QEX_GL(slots[kScreenTexCoord].location = glGetAttribLocation(module->program, "a_v2TexCoord"));
    QEX_GL(glUniformMatrix4fv(slots[kScreenProjection].location, 1, GL_FALSE, projection->m));
}
