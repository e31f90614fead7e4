// PVR and KTX files: whether the engine takes them, what is wrong with them, and pictures of their pixels.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "image/Ktx.h"
#include "image/Pvr.h"
#include "texture/Formats.h"

using TextureBytes = std::vector<uint8_t>;

inline QexImageBytes BytesOf(const TextureBytes& file) {
    return {file.data(), file.size()};
}

// Why the engine does not take a file of that header; empty when it does, or with KTX when it may. Levels are
// looked for where the header allows it.
std::string PvrRefusal(QexPvr* pvr, const TextureBytes& file);
std::string KtxRefusal(QexKtx* ktx, const TextureBytes& file);

// "GL_RGBA (0x1908)"; "0" for 0.
std::string GlName(uint32_t value);

struct Texture {
    const PixelFormat* format = nullptr;
    uint32_t faces = 0;
    std::vector<QexImageLevel> levels;  // at least one, with offsets in the file
    TextureBytes file;

    uint64_t FaceOffset(size_t level, size_t face) const {
        return levels[level].offset + face * levels[level].stride;
    }
};

// One of the two containers, for ReadTexture; the pixels of a KTX file are put into little-endian order.
bool ReadPvr(const TextureBytes& file, Texture* texture, std::string* error);
bool ReadKtx(TextureBytes* file, Texture* texture, std::string* error);

// Takes what DecodeFace can decode, more than the engine does. False, with the reason, for anything else.
bool ReadTexture(TextureBytes file, Texture* texture, std::string* error);

Image DecodeFace(const Texture& texture, size_t level, size_t face);

// GL ES 2.0 has mipmaps for powers of two alone.
bool MipmapsFit(uint32_t width, uint32_t height, uint32_t levels);

// What is wrong with the size of a texture; empty when nothing is.
std::string SizeFault(const QexImage& image, bool cube);
