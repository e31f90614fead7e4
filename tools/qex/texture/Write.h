// Pictures to whole PVR and KTX files.
#pragma once

#include <vector>

#include "common/ImageFile.h"
#include "texture/Formats.h"

// One picture, or six square ones for a cube map in the order +X -X +Y -Y +Z -Z; all of one size. `mipmaps`
// adds the whole chain. `flipped` says in the header that the first row is the lower edge; no row is moved.
std::vector<uint8_t> EncodePvrFile(const std::vector<Image>& faces, const PixelFormat& format, bool mipmaps,
                                   bool flipped);
std::vector<uint8_t> EncodeKtxFile(const std::vector<Image>& faces, const PixelFormat& format, bool mipmaps,
                                   bool flipped);
