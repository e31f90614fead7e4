// What the loaders of texture files share: the bytes that they read, the GL texture that they fill, and
// levels that the GL takes only after they were decoded.
#pragma once

#include "texture/Texture.h"

#ifndef GL_ETC1_RGB8_OES
#define GL_ETC1_RGB8_OES 0x8D64
#endif

// A file image and what is known of its length.
struct QexTextureBytes {
    const uint8_t* bytes;
    uint64_t size;
};
constexpr uint64_t kQexUnknownSize = UINT64_MAX;

inline uint32_t QexTextureLoad_ReadLE32(const uint8_t* bytes) {
    return bytes[0] | static_cast<uint32_t>(bytes[1]) << 8 | static_cast<uint32_t>(bytes[2]) << 16 |
           static_cast<uint32_t>(bytes[3]) << 24;
}

// One size of the next smaller level.
inline uint32_t QexTextureLoad_Half(uint32_t size) {
    return size > 1 ? size / 2 : 1;
}

// Levels from this size down to one pixel.
uint32_t QexTextureLoad_ChainLength(uint32_t width, uint32_t height);

// Bytes of a level of ETC1: whole blocks of 4 x 4 pixels.
uint64_t QexTextureLoad_ETCSize(uint32_t width, uint32_t height);

// Writes the line "ERROR:<function> ..." and gives -1.
int32_t QexTextureLoad_Refuse(const char* function, const char* format, ...) QEX_PRINTF(2, 3);

// Whether the GL takes textures of that size; a line when it does not.
bool QexTextureLoad_CheckSize(const char* function, uint32_t width, uint32_t height, bool cube);

// Sets the record's fields that follow from its size, makes the GL texture that the levels go into, binds it.
// Levels then lie tightly packed.
void QexTextureLoad_Begin(QexTexture* texture, uint32_t* name, bool cube);

// Whether the GL takes mipmaps of that size: some know them for powers of two alone.
bool QexTextureLoad_TakesMipmaps(uint32_t width, uint32_t height);

// Lets the GL make the levels below level 0, for those that are not given and the filter asks for.
void QexTextureLoad_GenerateMipmaps(uint32_t target);

// Repeats what powers of two allow to.
void QexTextureLoad_SetWrap(uint32_t target, uint32_t width, uint32_t height);

// Decodes a level of ETC1 to RGB, for a GL without the format, and uploads it. False when memory runs out.
bool QexTextureLoad_UploadDecodedETC(uint32_t target, int32_t level, uint32_t width, uint32_t height,
                                     const uint8_t* data);

// Decodes a level of PVRTC, whose sizes are powers of two, to RGBA and uploads it. False when memory runs
// out.
bool QexTextureLoad_UploadDecodedPVRTC(uint32_t target, int32_t level, uint32_t width, uint32_t height,
                                       bool twoBits, const uint8_t* data);

// Loads a KTX image; what QexTexture_LoadKTXFromMem and its siblings do.
int32_t QexTextureLoad_KTX(QexTexture* texture, const QexTextureBytes& image);
bool QexTextureLoad_IsKTX(const QexTextureBytes& image);
