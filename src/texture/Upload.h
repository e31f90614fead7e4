// What the loaders of texture files share: the GL texture that they fill, and levels that the GL takes only
// after they were decoded.
#pragma once

#include "image/Image.h"
#include "Qex/base.h"
#include "Qex/textures.h"
#include "texture/Texture.h"

#ifndef GL_ETC1_RGB8_OES
#define GL_ETC1_RGB8_OES 0x8D64
#endif

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

// The target of the uploads of a face.
uint32_t QexTextureLoad_FaceTarget(bool cube, uint32_t face);

// Repeats what powers of two allow to.
void QexTextureLoad_SetWrap(uint32_t target, uint32_t width, uint32_t height);

// Decodes a level of ETC1 to RGB or one of PVRTC, whose sides are powers of two, to RGBA and uploads it.
// False when memory runs out.
bool QexTextureLoad_UploadDecoded(uint32_t target, int32_t index, const QexPixelFormat& format,
                                  const QexImageLevel& level, const uint8_t* data);

// Whether the GL takes textures of that compressed internal format.
bool QexTexture_IsCompressedFormat(uint32_t internalFormat);
