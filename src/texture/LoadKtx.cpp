// KTX 1.1 textures: everything that is sound of a file is uploaded, natively or decoded, and made complete.
#include "texture/LoadKtx.h"

#include "base/Memory.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "image/Ktx.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/resources.h"
#include "Qex/textures.h"
#include "texture/Kept.h"
#include "texture/Upload.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr char kFunction[] = "QexTexture_LoadKTXFromMem";

// Sets what the record says of the pixels. Of those that are not compressed the GL takes RGB and RGBA, kept
// as what they are.
bool SetFormat(QexTexture* texture, const QexKtx& ktx) {
    const QexKtxHeader& header = ktx.header;
    const bool rgb = header.glFormat == GL_RGB;
    texture->format = 0;
    texture->bytesPerPixel = 3;
    if (ktx.IsCompressed()) return true;
    texture->bytesPerPixel = 0;
    if (!ktx.image.format || !(rgb || header.glFormat == GL_RGBA) ||
        header.glBaseInternalFormat != header.glFormat) {
        QexTextureLoad_Refuse(kFunction, "pixels of format 0x%X and type 0x%X, kept as 0x%X.",
                              header.glFormat, header.glType, header.glBaseInternalFormat);
        return false;
    }
    texture->bytesPerPixel = rgb ? 3 : 4;
    texture->format = rgb ? QEX_TEXFMT_RGB888 : QEX_TEXFMT_RGBA8888;
    return true;
}

// `*decodes`: the compressed data goes to the GL as pixels.
bool CheckHeader(const QexKtx& ktx, bool* decodes) {
    const QexImage& image = ktx.image;
    if (image.faults & kQexFaultFaces) {
        QexTextureLoad_Refuse(kFunction, "%u faces instead of 1 or 6.", image.faces);
        return false;
    }
    if (!QexTextureLoad_CheckSize(kFunction, image.width, image.height, image.faces == 6)) return false;
    if (image.faults & kQexFaultLevelCount) {
        QexTextureLoad_Refuse(kFunction, "%u levels of %u x %u pixels.", image.levelCount, image.width,
                              image.height);
        return false;
    }
    if (image.faults & kQexFaultSides) {
        QexTextureLoad_Refuse(kFunction, "PVRTC of a size that is no power of two.");
        return false;
    }
    if (!ktx.IsCompressed() || QexTexture_IsCompressedFormat(ktx.header.glInternalFormat)) return true;
    *decodes = image.format != nullptr;
    if (!image.format)
        QexTextureLoad_Refuse(kFunction, "the GL does not take the compressed format 0x%X.",
                              ktx.header.glInternalFormat);
    return *decodes;
}

// Finds the levels, the first `wanted` of which are asked for. False, with a line, when there is none that
// is sound or the file is cut.
bool FindLevels(QexKtx* ktx, const QexImageBytes& file, uint32_t wanted) {
    const QexImage& image = ktx->image;
    const bool found = QexKtx_FindLevels(ktx, file, wanted);
    const uint32_t level = ktx->faultLevel, bytes = static_cast<uint32_t>(image.levels[level].bytes);
    if (image.faults & kQexFaultCut)
        QexTextureLoad_Refuse(kFunction, "the file is cut short in level %u.", level);
    else if (!found)
        QexTextureLoad_Refuse(kFunction, "level %u of %u bytes is not of its size.", level, bytes);
    else if (image.faults & kQexFaultLevelSize)
        QexSystem_Printf("WARNING:<%s> level %u of %u bytes is not of its size. It is made from level 0.\n",
                         kFunction, level, bytes);
    return found;
}

// The bytes of 16-bit pixels exchanged, in a copy; null when memory runs out.
uint8_t* CopySwapped(const uint8_t* data, uint64_t size) {
    uint8_t* copy = QexMemory_AllocArray<uint8_t>(size);
    for (uint64_t i = 0; copy && i + 1 < size; i += 2) {
        copy[i] = data[i + 1];
        copy[i + 1] = data[i];
    }
    return copy;
}

// Uploads one image of a level. Null, or what is wrong with it.
const char* UploadFace(const QexKtx& ktx, bool decodes, uint32_t face, uint32_t index, const uint8_t* data) {
    static const char* const noMemory = "does not fit into memory";
    const QexImage& image = ktx.image;
    const QexImageLevel& level = image.levels[index];
    const GLenum target = QexTextureLoad_FaceTarget(image.faces == 6, face);
    const GLint l = static_cast<GLint>(index);
    const GLsizei w = static_cast<GLsizei>(level.width), h = static_cast<GLsizei>(level.height);
    if (decodes)
        return QexTextureLoad_UploadDecoded(target, l, *image.format, level, data) ? nullptr : noMemory;
    if (ktx.IsCompressed()) {
        glCompressedTexImage2D(target, l, ktx.header.glInternalFormat, w, h, 0,
                               static_cast<GLsizei>(level.bytes), data);
        return glGetError() == GL_NO_ERROR ? nullptr : "is not of its size";
    }
    QexScratch<uint8_t> swapped;
    if (ktx.HasSwappedPixels()) {
        swapped.Own(CopySwapped(data, level.bytes));
        if (!swapped) return noMemory;
        data = swapped.Get();
    }
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, level.rowBytes % 4 ? 1 : 4));
    QEX_GL(glTexImage2D(target, l, static_cast<GLint>(ktx.header.glBaseInternalFormat), w, h, 0,
                        ktx.header.glFormat, ktx.header.glType, data));
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    return nullptr;
}

bool UploadLevel(const QexKtx& ktx, bool decodes, const QexImageBytes& file, uint32_t index) {
    const QexImageLevel& level = ktx.image.levels[index];
    for (uint32_t face = 0; face < ktx.image.faces; ++face) {
        const uint8_t* data = file.bytes + level.offset + face * level.stride;
        const char* fault = UploadFace(ktx, decodes, face, index, data);
        if (!fault) continue;
        QexTextureLoad_Refuse(kFunction, "level %u of %u bytes %s.", index,
                              static_cast<uint32_t>(level.bytes), fault);
        return false;
    }
    return true;
}

// Uploads the levels that the GL takes; false, with a line, when one is not there or not of its size. The
// filter that a GL texture starts with asks for all levels: those that are missing at the end are made from
// level 0, or, of one compressed level, not asked for.
bool UploadLevels(QexKtx* ktx, bool decodes, const QexImageBytes& file) {
    const QexImage& image = ktx->image;
    const bool mipmaps = QexTextureLoad_TakesMipmaps(image.width, image.height);
    if (!FindLevels(ktx, file, mipmaps ? image.levelCount : 1)) return false;
    const GLenum target = image.faces == 6 ? GL_TEXTURE_CUBE_MAP : GL_TEXTURE_2D;
    const bool complete = image.levelCount == QexImage_ChainLength(image.width, image.height);
    if (!complete && image.levelCount > 1 && ktx->IsCompressed() && image.format) decodes = true;
    const bool generate = mipmaps && !complete && (!ktx->IsCompressed() || decodes);
    for (uint32_t i = 0; i < image.levelCount; ++i) {
        if (!UploadLevel(*ktx, decodes, file, i)) return false;
        if (i == 0 && generate) QexTextureLoad_GenerateMipmaps(target);
    }
    if (!complete && !generate) glTexParameteri(target, GL_TEXTURE_MIN_FILTER, GL_LINEAR);
    return true;
}

}  // namespace

int32_t QexTextureLoad_KTX(QexTexture* texture, const QexImageBytes& file) {
    QexKtx ktx;
    const QexImage& image = ktx.image;
    bool decodes = false;
    const QexMaking making;
    if (!QexKtx_Is(file)) return -3;
    if (!QexKtx_ReadHeader(&ktx, file))
        return QexTextureLoad_Refuse(kFunction, "the file is cut short in its header.");
    if (!SetFormat(texture, ktx)) return -4;
    if (!CheckHeader(ktx, &decodes)) return -1;
    if (decodes && image.format->coding == kQexPVRTC) {
        texture->format = QEX_TEXFMT_RGBA8888;
        texture->bytesPerPixel = 4;
    }
    texture->width = static_cast<int32_t>(image.width);
    texture->height = image.height;
    QexTextureLoad_Begin(texture, &texture->glName, image.faces == 6);
    if (!UploadLevels(&ktx, decodes, file) || making.Failed()) {
        QEX_GL(glDeleteTextures(1, &texture->glName));
        QexLeanState_ForgetTextures();
        texture->glName = 0;
        return -1;
    }
    QexTextureLoad_SetWrap(QexTexture_Target(texture), image.width, image.height);
    const bool known = file.size != kQexUnknownSize;
    if (QexKeptTexture_Note(texture->glName, QexTexture_Target(texture),
                            {kKeptImage, known ? file.bytes : nullptr, file.size, 0, 0, 0, 1, 0}))
        return 0;
    QexTexture_Release(texture);
    return -1;
}

extern "C" {

int32_t QexTexture_LoadKTXFromMem(QexTexture* texture, const void* file, QexPVRHeader*, int32_t, uint32_t,
                                  const void*) {
    return QexTextureLoad_KTX(texture, {static_cast<const uint8_t*>(file), kQexUnknownSize});
}

int32_t QexTexture_LoadKTXFromMemSized(QexTexture* texture, const void* file, uint32_t size, QexPVRHeader*,
                                       int32_t, uint32_t, const void*) {
    return QexTextureLoad_KTX(texture, {static_cast<const uint8_t*>(file), file ? size : 0});
}

int32_t QexTexture_LoadKTXFromFile(QexTexture* texture, const char* path, QexPVRHeader*, int32_t, uint32_t) {
    QexResFile file;
    int32_t result = -1;
    const QexKeptPath kept(path);
    QexResFile_Create(&file, path);
    if (QexResFile_IsOpen(&file))
        result = QexTextureLoad_KTX(texture, {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)});
    QexResFile_Release(&file);
    return result;
}

}  // extern "C"
