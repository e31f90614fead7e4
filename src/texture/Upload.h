// What the loaders of texture files share: the state of a load in steps, the GL texture that they fill, and
// levels that the GL takes only after they were decoded.
#pragma once

#include "base/Step.h"
#include "image/Ktx.h"
#include "image/Pvr.h"
#include "Qex/base.h"
#include "Qex/textures.h"
#include "texture/Texture.h"

#ifndef GL_ETC1_RGB8_OES
#define GL_ETC1_RGB8_OES 0x8D64
#endif

// A texture that is loaded from memory, a level or a band of one at a time.
struct QexTextureLoad {
    QexTexture* texture;
    QexImageBytes file;
    QexPVRHeader* header;  // out, or null
    bool decode;           // PVRTC is taken, too
    uint32_t firstLevel;
    const void* pixelData;  // of a PVR whose pixels do not follow the header, or null
    uint32_t piece;         // bytes of pixels that are decoded at once, at most

    QexStep (*step)(QexTextureLoad* load) = nullptr;  // the next one
    int32_t result = -1;                              // once the last step is done
    uint32_t name = 0;  // of the GL texture that is being filled; 0 once the record has it
    QexPvr pvr = {};    // one of the two
    QexKtx ktx = {};
    const uint8_t* pixels = nullptr;  // of a PVR
    uint32_t uploaded = 0;            // levels of a PVR, from the first one on
    bool mipmaps = false;             // a PVR's filter asks for them
    bool decodes = false;             // the GL does not take the data
    bool generates = false;           // of a KTX the GL makes the levels that are missing
    uint32_t pass = 0, face = 0, level = 0;
    uint8_t* decoded = nullptr;  // pixels of a level that is being decoded, owned
    uint32_t decodedRows = 0;
    const char* path = nullptr;  // of the file, while the load lasts; null: from memory
    uint32_t context = 0;        // that the GL texture is of
};

// All steps, from the first one on, and the end. Gives the result.
int32_t QexTextureLoad_Run(QexTextureLoad* load, QexStep (*first)(QexTextureLoad* load));

// The next step. Nothing is left of the texture after an error that was handled.
QexStep QexTextureLoad_Step(QexTextureLoad* load);

// Ends a load, in the middle as well: what it has not given to the record is freed.
void QexTextureLoad_End(QexTextureLoad* load);

// Binds the GL texture once more, after somebody else has called the GL.
void QexTextureLoad_Resume(const QexTextureLoad* load);

// The result of a load whose texture is complete.
QexStep QexTextureLoad_Complete(QexTextureLoad* load);

// Writes the line "ERROR:<function> ..." and gives -1.
int32_t QexTextureLoad_Refuse(const char* function, const char* format, ...) QEX_PRINTF(2, 3);

// Whether the GL takes textures of that size; a line when it does not.
bool QexTextureLoad_CheckSize(const char* function, uint32_t width, uint32_t height, bool cube);

// Sets the record's fields that follow from its size, makes the GL texture that the levels go into, binds it.
// Levels then lie tightly packed.
void QexTextureLoad_Begin(QexTextureLoad* load, bool cube);

// Whether the GL takes mipmaps of that size: some know them for powers of two alone.
bool QexTextureLoad_TakesMipmaps(uint32_t width, uint32_t height);

// Lets the GL make the levels below level 0, for those that are not given and the filter asks for.
void QexTextureLoad_GenerateMipmaps(uint32_t target);

// The target of the uploads of a face.
uint32_t QexTextureLoad_FaceTarget(bool cube, uint32_t face);

// Repeats what powers of two allow to.
void QexTextureLoad_SetWrap(uint32_t target, uint32_t width, uint32_t height);

// Decodes a band of a level of ETC1 to RGB or of one of PVRTC, whose sides are powers of two, to RGBA; the
// last one uploads it. Fails when memory runs out.
QexStep QexTextureLoad_UploadDecoded(QexTextureLoad* load, uint32_t target, const QexPixelFormat& format,
                                     const QexImageLevel& level, int32_t index, const uint8_t* data);

// Whether the GL takes textures of that compressed internal format.
bool QexTexture_IsCompressedFormat(uint32_t internalFormat);
