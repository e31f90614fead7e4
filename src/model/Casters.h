// Lists of what casts shadows or is mirrored, as shadow and reflection records own them.
#pragma once

#include "Qex/base.h"
#include "Qex/shader_modules.h"

// Frees an array of casters and their node lists.
inline void QexModel_FreeCasters(QexShadowCaster* casters, uint32_t count) {
    for (uint32_t i = 0; i < count; ++i) QexMemory_Free(casters[i].nodeIndices);
    QexMemory_Free(casters);
}
