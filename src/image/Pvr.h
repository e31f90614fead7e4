// PVR files with the legacy header: 52 bytes, or 44 in the oldest ones.
#pragma once

#include "image/Image.h"
#include "Qex/images.h"

constexpr uint32_t kQexPvrHeaderSize = 52, kQexPvrOldHeaderSize = 44;
constexpr uint32_t kQexPvrTag = 0x21525650;  // "PVR!"
constexpr uint32_t kQexPvrMipmaps = 0x100, kQexPvrTwiddled = 0x200, kQexPvrCubeMap = 0x1000,
                   kQexPvrFlipped = 0x10000;  // among the flags

struct QexPvr {
    QexImage image;
    QexPVRHeader header;    // in its current form, but for its own size
    uint64_t surfaceBytes;  // of a surface with all its levels, once they are looked for

    bool IsCube() const { return header.flags & kQexPvrCubeMap; }
    bool IsTopFirst() const { return !(header.flags & kQexPvrFlipped); }
    uint64_t NeededBytes() const { return (image.faces - 1) * image.levels[0].stride + surfaceBytes; }
};

bool QexPvr_Is(const QexImageBytes& file);

// False when the file is none, or shorter than its header.
bool QexPvr_ReadHeader(QexPvr* pvr, const QexImageBytes& file);

// Finds the levels in `size` bytes of pixels, kQexUnknownSize allowed, of surfaces that begin `stride` bytes
// after each other: the header's dataSize. The format is known and the sides are below 65,536. False, and a
// fault, when they are not all there.
bool QexPvr_FindLevels(QexPvr* pvr, uint64_t stride, uint64_t size);
