/* Images in files: codes of their pixels, the PVR header, decoders. No GL context needed on this page. */
#ifndef QEX_IMAGES_H
#define QEX_IMAGES_H

#include "Qex/base.h"

QEX_BEGIN

/** Format codes of texture records. */
#define QEX_TEXFMT_RGBA8888 1
#define QEX_TEXFMT_RGB888 2
#define QEX_TEXFMT_RGBA4444 3
#define QEX_TEXFMT_RGBA5551 4

/** The legacy PVR header, as QexTexture_LoadPVRFromMem gives it back. */
typedef struct QexPVRHeader {
    uint32_t headerSize;  /* 52, or 44 for the oldest files */
    uint32_t height;      /* pixels */
    uint32_t width;       /* pixels */
    uint32_t mipmapCount; /* levels below level 0 */
    uint32_t flags;       /* bits 0..7 pixel type; 0x100 mipmaps, 0x200 twiddled, 0x1000 cube map */
    uint32_t dataSize;    /* bytes of one surface with all its levels */
    uint32_t bitsPerPixel;
    uint32_t redMask;
    uint32_t greenMask;
    uint32_t blueMask;
    uint32_t alphaMask;
    uint32_t tag; /* "PVR!" */
    uint32_t numSurfaces;
} QexPVRHeader;

/** Decodes one level of ETC1 to RGBA. A width or height that is no multiple of 4, 1 and 2 among them, takes
 * the upper left pixels of its last blocks, and a temporary image from QexMemory_Alloc; nothing else
 * allocates. In a block whose second base colour is out of range, which ETC1 leaves undefined, that one wraps
 * (modulo 32).
 *  @param source       blocks of 8 bytes, row by row: ceil(width / 4) * ceil(height / 4) of them
 *  @param width        pixels
 *  @param height       pixels
 *  @param destination  out, width * height pixels of R, G, B, A bytes, first row first, rows not padded; A is
 * 255
 *  @param unused       not read
 *  @return the bytes of source that were used; 0, and nothing written, when a size is below 1; -1, and
 * nothing written, when memory runs out, a pointer is null, or the level has 2 GiB or more. */
QEX_API int32_t QexDecompressETC(const void* source, int32_t width, int32_t height, void* destination,
                                 int32_t unused);

/** Decodes one level of PVRTC, the first version, to RGBA. A level of less than two words a side is the upper
 *  left part of one of two words a side. Allocates nothing.
 *  @param source       words of 8 bytes, in the interleaved order of PVRTC: max(width, 8) * max(height, 8) /
 * 2 bytes, or max(width, 16) * max(height, 8) / 4 with 2 bits a pixel
 *  @param twoBits      0: 4 bits a pixel; else 2
 *  @param width        pixels, a power of two
 *  @param height       pixels, a power of two
 *  @param destination  out, width * height pixels of R, G, B, A bytes, first row first, rows not padded. All
 * are 0 when source is null or a size is no power of two. Nothing is written when it is null or a size is
 * below 1. */
QEX_API void QexDecompressPVRTC(const void* source, int32_t twoBits, int32_t width, int32_t height,
                                void* destination);

QEX_END

#endif
