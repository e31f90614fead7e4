// Programs with the two shaders that each is made of. Names are 0 where there is no object.
#pragma once

#include "Qex.h"

// Logs why a program is not to be had: what the GL says of each shader that does not compile, and of the
// link. `name` is the program's in these lines.
void QexShader_LogFailure(const char* name, uint32_t vertexShader, uint32_t fragmentShader, uint32_t program);

// Compiles both sources and links them; when one step fails it says so and nothing is left. See
// QexShader_CreateProgram for the attributes.
bool QexShader_BuildProgram(const char* name, uint32_t* program, uint32_t* vertexShader,
                            uint32_t* fragmentShader, const char* vertexSource, const char* fragmentSource,
                            const char* const* attributes, int32_t attributeCount);

// Deletes what there is of them and makes the names 0. No program is in use afterwards.
void QexShader_DeleteProgram(uint32_t* program, uint32_t* vertexShader, uint32_t* fragmentShader);
