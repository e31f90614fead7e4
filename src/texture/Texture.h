// Textures for the engine's own modules.
//
// A record belongs to its caller; its GL object lives from a create or load function to QexTexture_Release.
#pragma once

#include "Qex/textures.h"

// The GL target that every bind of the record uses.
uint32_t QexTexture_Target(const QexTexture* texture);

// The built-in flat normal map.
QexTexture* QexTexture_GetBlankNormalMap();

// Whether the GL takes textures of that many pixels: the upload of any other would end the process.
bool QexTexture_IsPossibleSize(uint32_t width, uint32_t height, bool cube);
