// KTX 1.1 textures: everything that is sound of a file is uploaded, natively or decoded, and made complete.
#include "texture/LoadKtx.h"

#include "base/Memory.h"
#include "gl/GL.h"
#include "image/Ktx.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/resources.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr char kFunction[] = "QexTexture_LoadKTXFromMem";
constexpr char kNoMemory[] = "does not fit into memory";

// Whether a file has all levels down to one pixel.
bool IsComplete(const QexImage& image) {
    return image.levelCount == QexImage_ChainLength(image.width, image.height);
}

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

// Uploads pixels of an image as they are. Null, or what is wrong with them.
const char* UploadPixels(const QexKtx& ktx, GLenum target, GLint index, const QexImageLevel& level,
                         const uint8_t* data) {
    QexScratch<uint8_t> swapped;
    if (ktx.HasSwappedPixels()) {
        swapped.Own(CopySwapped(data, level.bytes));
        if (!swapped) return kNoMemory;
        data = swapped.Get();
    }
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, level.rowBytes % 4 ? 1 : 4));
    QEX_GL(glTexImage2D(target, index, static_cast<GLint>(ktx.header.glBaseInternalFormat),
                        static_cast<GLsizei>(level.width), static_cast<GLsizei>(level.height), 0,
                        ktx.header.glFormat, ktx.header.glType, data));
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    return nullptr;
}

// Uploads the image of a level that the load has come to, or decodes a band of it; what is wrong with it.
QexStep UploadFace(QexTextureLoad* load, const char** fault) {
    const QexKtx& ktx = load->ktx;
    const QexImageLevel& level = ktx.image.levels[load->level];
    const GLenum target = QexTextureLoad_FaceTarget(ktx.image.faces == 6, load->face);
    const GLint l = static_cast<GLint>(load->level);
    const uint8_t* data = load->file.bytes + level.offset + load->face * level.stride;
    if (load->decodes) {
        *fault = kNoMemory;
        return QexTextureLoad_UploadDecoded(load, target, *ktx.image.format, level, l, data);
    }
    if (ktx.IsCompressed()) {
        glCompressedTexImage2D(target, l, ktx.header.glInternalFormat, static_cast<GLsizei>(level.width),
                               static_cast<GLsizei>(level.height), 0, static_cast<GLsizei>(level.bytes),
                               data);
        *fault = QexGL_TakeError() == GL_NO_ERROR ? nullptr : "is not of its size";
    } else {
        *fault = UploadPixels(ktx, target, l, level, data);
    }
    return *fault ? QexStep::kFailed : QexStep::kDone;
}

// Finds the levels that the GL takes and that are made from others; false, with a line, when one is not there
// or not of its size.
bool ChooseLevels(QexTextureLoad* load) {
    QexKtx* ktx = &load->ktx;
    const QexImage& image = ktx->image;
    const bool mipmaps = QexTextureLoad_TakesMipmaps(image.width, image.height);
    if (!FindLevels(ktx, load->file, mipmaps ? image.levelCount : 1)) return false;
    const bool complete = IsComplete(image);
    if (!complete && image.levelCount > 1 && ktx->IsCompressed() && image.format) load->decodes = true;
    load->generates = mipmaps && !complete && (!ktx->IsCompressed() || load->decodes);
    return true;
}

// The filter that a GL texture starts with asks for all levels: those that are missing at the end were made
// from level 0, or, of one compressed level, are not asked for.
QexStep Finish(QexTextureLoad* load) {
    const QexImage& image = load->ktx.image;
    const GLenum target = QexTexture_Target(load->texture);
    if (!IsComplete(image) && !load->generates) glTexParameteri(target, GL_TEXTURE_MIN_FILTER, GL_LINEAR);
    QexTextureLoad_SetWrap(target, image.width, image.height);
    return QexTextureLoad_Complete(load);
}

QexStep Upload(QexTextureLoad* load) {
    const QexImage& image = load->ktx.image;
    const char* fault = nullptr;
    const QexStep step = UploadFace(load, &fault);
    if (step == QexStep::kFailed)
        QexTextureLoad_Refuse(kFunction, "level %u of %u bytes %s.", load->level,
                              static_cast<uint32_t>(image.levels[load->level].bytes), fault);
    if (step != QexStep::kDone) return step;
    if (++load->face < image.faces) return QexStep::kMore;
    load->face = 0;
    if (load->level == 0 && load->generates) QexTextureLoad_GenerateMipmaps(QexTexture_Target(load->texture));
    return ++load->level < image.levelCount ? QexStep::kMore : Finish(load);
}

QexStep Refuse(QexTextureLoad* load, int32_t result) {
    load->result = result;
    return QexStep::kFailed;
}

int32_t Load(QexTexture* texture, const QexImageBytes& file, const char* path = nullptr) {
    QexTextureLoad load = {texture, file, nullptr, true, 0, nullptr, kQexWhole};
    load.path = path;
    return QexTextureLoad_Run(&load, QexTextureLoad_KTX);
}

}  // namespace

QexStep QexTextureLoad_KTX(QexTextureLoad* load) {
    QexTexture* texture = load->texture;
    QexKtx& ktx = load->ktx;
    const QexImage& image = ktx.image;
    load->decodes = false;
    if (!QexKtx_Is(load->file)) return Refuse(load, -3);
    if (!QexKtx_ReadHeader(&ktx, load->file))
        return Refuse(load, QexTextureLoad_Refuse(kFunction, "the file is cut short in its header."));
    if (!SetFormat(texture, ktx)) return Refuse(load, -4);
    if (!CheckHeader(ktx, &load->decodes)) return Refuse(load, -1);
    if (load->decodes && image.format->coding == kQexPVRTC) {
        texture->format = QEX_TEXFMT_RGBA8888;
        texture->bytesPerPixel = 4;
    }
    texture->width = static_cast<int32_t>(image.width);
    texture->height = image.height;
    texture->glName = 0;
    load->result = -1;
    QexTextureLoad_Begin(load, image.faces == 6);
    if (!ChooseLevels(load)) return QexStep::kFailed;
    load->step = Upload;
    return QexStep::kMore;
}

extern "C" {

int32_t QexTexture_LoadKTXFromMem(QexTexture* texture, const void* file, QexPVRHeader*, int32_t, uint32_t,
                                  const void*) {
    return Load(texture, {static_cast<const uint8_t*>(file), kQexUnknownSize});
}

int32_t QexTexture_LoadKTXFromMemSized(QexTexture* texture, const void* file, uint32_t size, QexPVRHeader*,
                                       int32_t, uint32_t, const void*) {
    return Load(texture, {static_cast<const uint8_t*>(file), file ? size : 0});
}

int32_t QexTexture_LoadKTXFromFile(QexTexture* texture, const char* path, QexPVRHeader*, int32_t, uint32_t) {
    QexResFile file;
    int32_t result = -1;
    QexResFile_Create(&file, path);
    if (QexResFile_IsOpen(&file))
        result = Load(texture, {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)}, path);
    QexResFile_Release(&file);
    return result;
}

}  // extern "C"
