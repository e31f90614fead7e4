// KTX images, for the loader of PVR images, which takes them as well.
#pragma once

#include "image/Image.h"
#include "Qex/textures.h"

// Loads a KTX image; what QexTexture_LoadKTXFromMem and its siblings do.
int32_t QexTextureLoad_KTX(QexTexture* texture, const QexImageBytes& file);
