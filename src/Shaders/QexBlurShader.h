// The blur module, for what feeds it.
#pragma once

#include "Qex/math.h"
#include "Qex/shader_modules.h"

// What QexBlurShader_SetParameters uploads from now on.
void QexBlurShader_SetProjection(QexShaderModule* module, const QexMatrix* projection);
