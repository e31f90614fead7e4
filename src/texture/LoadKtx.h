// KTX images, for the loader of PVR images, which takes them as well.
#pragma once

#include "texture/Upload.h"

// The first step of loading a KTX image; what QexTexture_LoadKTXFromMem and its siblings do.
QexStep QexTextureLoad_KTX(QexTextureLoad* load);
