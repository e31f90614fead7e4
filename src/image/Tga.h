// TGA images, of which the loaders take those that are neither packed nor mapped.
#pragma once

#include "image/Image.h"

constexpr uint32_t kQexTgaHeaderSize = 18;

struct QexTga {
    uint32_t identifierBytes;  // between the header and what follows it
    uint32_t mapBytes;         // of the colour map, behind the identifier
    uint32_t type;             // 2: pixels of their own colour, as they are
    uint32_t width, height, bits, alphaBits;
    bool mapped, rightFirst, topFirst;

    // 0 for a depth that is not whole bytes.
    uint32_t BytesPerPixel() const { return bits % 8 ? 0 : bits / 8; }
    uint64_t PixelBytes() const { return uint64_t{width} * height * BytesPerPixel(); }
};

// The header is all there.
QexTga QexTga_ReadHeader(const uint8_t* file);

// Whether the file has a header and all the pixels that the loaders would read.
bool QexTga_IsWhole(const QexImageBytes& file);
