// What the unlit modules for meshes without bones have in common: vertex stage, uniforms and how they are
// set.
#pragma once

#include "Qex/math.h"
#include "Shaders/QexShaderModule.h"

extern const char* const kQexTextureVertexSource;

// Texture colour, alpha from the alpha texture; the skinned texture module ends in it too.
extern const char* const kQexTextureFragmentSource;

// Texture colour, alpha from the texture itself.
extern const char* const kQexTextureNoAlphaFragmentSource;

// Slots of the texture modules.
enum { kTextureMvpMatrix, kTextureOpacity, kTextureAlphaThreshold, kTextureThreshold };

// Sets opacity, threshold and matrix.
void QexTextureShader_SetUniforms(const QexShaderDraw& draw, const QexMatrix* modelMatrix,
                                  const QexMatrix* view, const QexMatrix* projection);
