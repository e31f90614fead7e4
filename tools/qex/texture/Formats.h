// The pixel formats of textures, and one level of pixels made of a picture and back.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "common/ImageFile.h"

// Bits of a pixel's little-endian word. No bits: not stored, and read as 255.
struct PixelChannel {
    uint8_t shift, bits;
};

struct PixelFormat {
    enum Coding { kPixels, kEtc1, kPvrtc, kUnread };
    const char* name;   // null: is not written
    const char* title;  // for people
    uint32_t pvrType;   // of a PVR header; kNoPvrType: KTX alone has it
    uint32_t bits;      // a pixel
    Coding coding;
    bool alpha;
    PixelChannel channels[4];  // red, green, blue, alpha; luminance is all of the first three
    uint32_t glFormat, glType,
        glInternalFormat;  // of a KTX header; an internal format of 0: PVR alone has it
    const char* refusal;   // why the engine does not take it from a PVR; null: it does

    bool Compressed() const { return coding == kEtc1 || coding == kPvrtc; }
};

constexpr uint32_t kNoPvrType = 0x100;

// Null when there is none.
const PixelFormat* FindFormat(const std::string& name);
const PixelFormat* FindPvrFormat(uint32_t pvrType);
const PixelFormat* FindKtxFormat(uint32_t glFormat, uint32_t glType, uint32_t glInternalFormat);

// "etc1, rgba4444, ...": all that FindFormat knows.
std::string FormatNames();

// Bytes of a level whose rows are not padded. Sides below 65,536.
uint64_t LevelBytes(const PixelFormat& format, uint32_t width, uint32_t height);

// The level's bytes, rows not padded. Channels are rounded to the nearest value of their bits. `format` is
// one that has a name.
std::vector<uint8_t> EncodeLevel(const PixelFormat& format, const Image& image);

// The picture in a level of `bytes` bytes per row, which blocks do not need. All of LevelBytes are there.
Image DecodeLevel(const PixelFormat& format, const uint8_t* data, uint32_t width, uint32_t height,
                  uint64_t rowBytes);
