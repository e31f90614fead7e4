// The modules that draw quads over the screen and not nodes: blur and depth of field. They have no render
// function; post-processing feeds them its own vertices. Their linker places the attributes, so the locations
// are read afterwards.
#pragma once

#include "Qex/math.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderModule.h"

// The first slots of such a module. Its description leaves the names of the two attributes empty.
enum { kScreenPosition, kScreenProjection, kScreenTexCoord, kScreenSlots };

// Compiles, links, fills the slots and sets the projection; the program stays current. The module's samplers
// come first behind the first slots, for the units 0, 1, ... 0, or -1 and no program after an error that was
// handled.
int32_t QexScreenShader_Setup(const QexShaderModuleType* type, QexShaderModule* module,
                              const QexMatrix* projection, int32_t samplers);
// The module, or null and the record freed where its set-up gave no 0.
QexShaderModule* QexScreenShader_Finish(QexShaderModule* module, int32_t result);
