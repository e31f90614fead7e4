// Loads that an application goes on with from time to time.
#pragma once

#include "Qex/shader_modules.h"

// Ends a model's load that has begun and is not done, with all that there is of the model; nothing where
// there is none.
void QexModelLoad_Drop(const QexModel* model);
