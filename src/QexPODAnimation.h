// World matrices for the engine's own modules: the cached matrix itself instead of a copy.
//
// The pointer is good until a frame or an override changes; drawing code uses it at once.
#pragma once

#include "Qex.h"

const QexMatrix* QexPODAnimation_WorldMatrix(QexPODModel* scene, QexPODNode* node);
