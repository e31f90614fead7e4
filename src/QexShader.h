// Programs with the two shaders that each is made of. Names are 0 where there is no object.
#pragma once

#include "Qex.h"

// Compiles both sources and links them; nothing is left when one step fails. See QexShader_CreateProgram for
// the attributes.
bool QexShader_BuildProgram(uint32_t* program, uint32_t* vertexShader, uint32_t* fragmentShader,
                            const char* vertexSource, const char* fragmentSource,
                            const char* const* attributes, int32_t attributeCount);

// Deletes what there is of them and makes the names 0. No program is in use afterwards.
void QexShader_DeleteProgram(uint32_t* program, uint32_t* vertexShader, uint32_t* fragmentShader);
