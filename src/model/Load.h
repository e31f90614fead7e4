// Loads that an application goes on with from time to time.
#pragma once

#include "Qex/shader_modules.h"

// Ends a model's load that has begun and is not done, with all that there is of the model; nothing where
// there is none.
void QexModelLoad_Drop(const QexModel* model);

// Whether a step of the model's load runs now: a hook is asking. The model is not to be unloaded then, nor
// loaded again; a line in the log, in the function's name, says so.
bool QexModelLoad_Runs(const QexModel* model, const char* function);
