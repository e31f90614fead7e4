// KTX 1.1 files.
#pragma once

#include "image/Image.h"

constexpr uint32_t kQexKtxHeaderSize = 64;

// The header's words behind its byte order.
struct QexKtxHeader {
    uint32_t glType, glTypeSize, glFormat, glInternalFormat, glBaseInternalFormat;
    uint32_t width, height, depth, arrayElements, faces, levels, keyValueBytes;
};

struct QexKtx {
    QexImage image;
    QexKtxHeader header;
    bool swapped;         // words, and 16-bit pixels, are in the other byte order
    uint32_t faultLevel;  // the level that is cut or not of its size

    bool IsCompressed() const { return !header.glType || !header.glFormat; }
    bool HasSwappedPixels() const { return swapped && image.format && image.format->pixelType > kQexGLByte; }
};

bool QexKtx_Is(const QexImageBytes& file);

// False when the file, which is one, is shorter than its header.
bool QexKtx_ReadHeader(QexKtx* ktx, const QexImageBytes& file);

// Finds the first `wanted` levels, at least one; the header is one without faults. Some writers pad the rows
// of RGB pictures without counting the padding, so that from the small levels on nothing is where it should
// be: what lies before stays, and kQexFaultLevelSize says that it ends early. False when not even the first
// level is sound or the file is cut. A format that is not in the table may have levels of any size.
bool QexKtx_FindLevels(QexKtx* ktx, const QexImageBytes& file, uint32_t wanted);

// A key, which ends with a 0, and its value.
struct QexKtxPair {
    const char* key;
    const char* value;
    uint64_t valueBytes;
};

// The pair at `*at`, which begins at kQexKtxHeaderSize and moves on. False when no whole one is left.
bool QexKtx_ReadPair(const QexKtx& ktx, const QexImageBytes& file, uint64_t* at, QexKtxPair* pair);

// Files that say nothing begin with the upper edge, as pictures do.
bool QexKtx_IsTopFirst(const QexKtx& ktx, const QexImageBytes& file);
