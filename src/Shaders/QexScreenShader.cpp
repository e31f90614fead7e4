// Set-up of the modules that draw over the screen.
#include "Shaders/QexScreenShader.h"

#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/shader_modules.h"

#define QEX_MODULE (type->path)

int32_t QexScreenShader_Setup(const QexShaderModuleType* type, QexShaderModule* module,
                              const QexMatrix* projection, int32_t samplers) {
    const QexMaking making;
    if (QexShaderModule_Setup(type, module) != 0) return -1;
    QexShaderSlot* slots = module->slots;
    for (int32_t unit = 0; unit < samplers; ++unit)
        QEX_GL(glUniform1i(slots[kScreenSlots + unit].location, unit));
    const QexProgramLookup lookup = {type->path, module->program};
    slots[kScreenPosition].location = lookup.Attribute("a_v4Position");
    slots[kScreenTexCoord].location = lookup.Attribute("a_v2TexCoord");
    QEX_GL(glUniformMatrix4fv(slots[kScreenProjection].location, 1, GL_FALSE, projection->m));
    if (!making.Failed()) return 0;
    QexProgram_Delete({&module->program, &module->vertexShader, &module->fragmentShader}, false);
    return -1;
}

QexShaderModule* QexScreenShader_Finish(QexShaderModule* module, int32_t result) {
    if (result == 0) return module;
    QexShaderModule_Free(module);
    return nullptr;
}
