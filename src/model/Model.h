// What a model holds.
#pragma once

#include "Qex/shader_modules.h"

// Lets go of all that a model holds and of a load that has begun, but not of its share of the shaders.
void QexModel_Discard(QexModel* model);
