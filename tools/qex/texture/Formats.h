// The pixel formats of textures as qex names and converts them, and one level of pixels made of a picture and
// back.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "common/ImageFile.h"
#include "image/Format.h"

// Bits of a pixel's little-endian word. No bits: not stored, and read as 255.
struct PixelChannel {
    uint8_t shift, bits;
};

// A row of the engine's table, and what qex adds to it.
struct PixelFormat : QexPixelFormat {
    const char* name;   // null: is not written
    const char* title;  // for people
    bool alpha;
    PixelChannel channels[4];  // red, green, blue, alpha; luminance is all of the first three
    const char* refusal;       // why the engine does not take it from a PVR; null: it does

    bool Compressed() const { return coding == kQexETC1 || coding == kQexPVRTC; }
};

// Null when there is none.
const PixelFormat* FindFormat(const std::string& name);

// The format of a row of the engine's table.
const PixelFormat& FormatOf(const QexPixelFormat* row);

// "etc1, rgba4444, ...": all that FindFormat knows.
std::string FormatNames();

// The level's bytes, rows not padded. Channels are rounded to the nearest value of their bits. `format` is
// one that has a name.
std::vector<uint8_t> EncodeLevel(const PixelFormat& format, const Image& image);

// The picture in a level of `bytes` bytes per row, which blocks do not need. All of its bytes are there.
Image DecodeLevel(const PixelFormat& format, const uint8_t* data, uint32_t width, uint32_t height,
                  uint64_t rowBytes);
