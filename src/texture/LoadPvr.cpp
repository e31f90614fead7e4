// PVR textures with the legacy header: all levels of a file, from one of them on, as they are or decoded.
#include "texture/LoadPvr.h"

#include "base/Memory.h"
#include "gl/GL.h"
#include "image/Ktx.h"
#include "image/Pvr.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/resources.h"
#include "Qex/textures.h"
#include "texture/LoadKtx.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr char kFunction[] = "QexTexture_LoadPVRFromMem";

const QexImageLevel& First(const QexTextureLoad& load) {
    return load.pvr.image.levels[load.firstLevel];
}

// Whether the filter asks for levels that the file lacks.
bool IsPartial(const QexTextureLoad& load) {
    const QexImageLevel& first = First(load);
    return load.mipmaps && load.uploaded < QexImage_ChainLength(first.width, first.height);
}

// Reads the header; false when it is not one.
bool ReadHeader(QexPvr* pvr, const QexImageBytes& file) {
    if (!QexPvr_ReadHeader(pvr, file)) {
        QexTextureLoad_Refuse(kFunction, "failed: not a valid pvr.");
        return false;
    }
    if (pvr->header.headerSize == kQexPvrOldHeaderSize)
        QexSystem_Printf(
            "WARNING:<QexTexture_LoadPVRFromMem> this is an old pvr format. You can use PVRTexTool to update "
            "its header.\n");
    return true;
}

// Why pixels of a format are not taken, or not as they are.
const char* FormatLine(const QexPixelFormat* format) {
    if (!format) return "pixel type not supported.";
    if (format->coding == kQexPVRTC)
        return format->bits == 2 ? "PVRTC2 not supported." : "PVRTC4 not supported.";
    if (format->coding == kQexUnread) return "pixel type OGL_RGB_555 not supported.";
    return "Unable to load GL_BGRA texture as extension GL_IMG_texture_format_BGRA8888 is unsupported.";
}

// Checks that the format can be loaded.
bool CheckFormat(const QexPvr& pvr, bool decode) {
    const QexImage& image = pvr.image;
    const bool pvrtc = image.format && image.format->coding == kQexPVRTC;
    const char* refusal = nullptr;
    if (image.faults & kQexFaultTwiddled)
        refusal = "texture should be untwiddled.";
    else if (!image.format || !image.format->recordBytes || (pvrtc && !decode))
        refusal = FormatLine(image.format);
    else if (image.faults & kQexFaultBits)
        refusal = "bits per pixel do not fit the pixel type.";
    else if (image.faults & kQexFaultFaces)
        refusal = "a cube map of more than 6 faces.";
    else if (image.faults & kQexFaultSides)
        refusal = "PVRTC of a size that is no power of two.";
    if (refusal) {
        QexTextureLoad_Refuse(kFunction, "%s", refusal);
        return false;
    }
    if (pvrtc)
        QexSystem_Printf("WARNING:<%s> %s Converting to RGBA8888 instead.\n", kFunction,
                         FormatLine(image.format));
    return QexTextureLoad_CheckSize(kFunction, image.width, image.height, pvr.IsCube());
}

// Checks that the levels are all there, in `size` bytes of pixels.
bool CheckLevels(QexPvr* pvr, uint32_t firstLevel, uint64_t size) {
    const QexImage& image = pvr->image;
    const bool found = QexPvr_FindLevels(pvr, pvr->header.dataSize, size);
    if (image.faults & kQexFaultLevelCount || firstLevel >= image.levelCount) {
        QexTextureLoad_Refuse(kFunction, "%u mipmaps of %u x %u pixels, first level %u.",
                              pvr->header.mipmapCount, image.width, image.height, firstLevel);
        return false;
    }
    if (image.faults & kQexFaultOverlap)
        QexTextureLoad_Refuse(kFunction, "%u surfaces of %u bytes, whose levels take %llu.", image.faces,
                              pvr->header.dataSize, static_cast<unsigned long long>(pvr->surfaceBytes));
    else if (image.faults & kQexFaultCut)
        QexTextureLoad_Refuse(kFunction, "the file is cut short: %llu bytes of pixels instead of %llu.",
                              static_cast<unsigned long long>(size),
                              static_cast<unsigned long long>(pvr->NeededBytes()));
    return found;
}

// Chooses the levels to upload. A GL that has no mipmaps of this size gets the first one alone.
void ChooseLevels(QexTextureLoad* load) {
    const QexImageLevel& first = First(*load);
    const QexPixelCoding coding = load->pvr.image.format->coding;
    load->uploaded = load->pvr.image.levelCount - load->firstLevel;
    load->mipmaps = load->pvr.header.mipmapCount > 0;
    if (load->mipmaps && !QexTextureLoad_TakesMipmaps(first.width, first.height)) {
        load->mipmaps = false;
        load->uploaded = 1;
        QexSystem_Printf("WARNING:<%s> no mipmaps of %u x %u pixels here.\n", kFunction, first.width,
                         first.height);
    }
    // Of a chain that ends early the GL can make the rest from pixels only.
    load->decodes =
        coding == kQexPVRTC ||
        (coding == kQexETC1 && (IsPartial(*load) || !QexTexture_IsCompressedFormat(GL_ETC1_RGB8_OES)));
}

// The level that the load has come to. Fails when memory runs out.
QexStep UploadLevel(QexTextureLoad* load) {
    const QexPixelFormat& format = *load->pvr.image.format;
    const QexImageLevel& level = load->pvr.image.levels[load->level];
    const GLenum target = QexTextureLoad_FaceTarget(load->pvr.IsCube(), load->face);
    const GLint index = static_cast<GLint>(load->level - load->firstLevel);
    const uint8_t* data = load->pixels + load->face * level.stride + level.offset;
    const GLsizei w = static_cast<GLsizei>(level.width), h = static_cast<GLsizei>(level.height);
    if (load->decodes) return QexTextureLoad_UploadDecoded(load, target, format, level, index, data);
    if (format.coding == kQexETC1)
        QEX_GL(glCompressedTexImage2D(target, index, GL_ETC1_RGB8_OES, w, h, 0,
                                      static_cast<GLsizei>(level.bytes), data));
    else
        QEX_GL(glTexImage2D(target, index, format.pixelOrder, w, h, 0, format.pixelOrder, format.pixelType,
                            data));
    return QexStep::kDone;
}

QexStep Finish(QexTextureLoad* load) {
    const QexPVRHeader& read = load->pvr.header;
    const GLenum target = QexTexture_Target(load->texture);
    if (load->header) *load->header = read;
    glTexParameteri(target, GL_TEXTURE_MIN_FILTER, load->mipmaps ? GL_LINEAR_MIPMAP_NEAREST : GL_LINEAR);
    glTexParameteri(target, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
    QexTextureLoad_SetWrap(target, read.width, read.height);
    return QexTextureLoad_Complete(load);
}

// On to the next level, surface or pass. Levels that the filter asks for and the file lacks are made from the
// first one, before those of the file that follow it: these are a second pass then.
QexStep Advance(QexTextureLoad* load) {
    const uint32_t first = load->firstLevel, last = first + load->uploaded;
    const bool partial = IsPartial(*load);
    const uint32_t end = partial && load->pass == 0 ? first + 1 : last;
    if (++load->level < end) return QexStep::kMore;
    load->level = 0;
    if (++load->face < load->pvr.image.faces) return QexStep::kMore;
    load->face = 0;
    if (!partial || load->pass++) return Finish(load);
    QexTextureLoad_GenerateMipmaps(QexTexture_Target(load->texture));
    return first + 1 < last ? QexStep::kMore : Finish(load);
}

// A level, a band of one, or nothing of a level that is passed over.
QexStep Upload(QexTextureLoad* load) {
    if (load->level >= load->firstLevel + load->pass) {
        const QexStep step = UploadLevel(load);
        if (step == QexStep::kFailed) QexTextureLoad_Refuse(kFunction, "out of memory.");
        if (step != QexStep::kDone) return step;
    }
#if QEX_GL_CHECKS
    if (QexGL_TakeError() != GL_NO_ERROR) {
        QexTextureLoad_Refuse(kFunction, "glTexImage2D() failed.");
        return QexStep::kFailed;
    }
#endif
    return Advance(load);
}

QexStep Begin(QexTextureLoad* load) {
    QexTexture* texture = load->texture;
    QexPvr* pvr = &load->pvr;
    const QexPVRHeader& read = pvr->header;
    if (QexKtx_Is(load->file)) return QexTextureLoad_KTX(load);
    texture->glName = 0;
    if (!ReadHeader(pvr, load->file)) return QexStep::kFailed;
    const bool known = !load->pixelData && load->file.size != kQexUnknownSize;
    const uint64_t size = known ? load->file.size - read.headerSize : kQexUnknownSize;
    load->pixels =
        load->pixelData ? static_cast<const uint8_t*>(load->pixelData) : load->file.bytes + read.headerSize;
    if (!CheckFormat(*pvr, load->decode) || !CheckLevels(pvr, load->firstLevel, size))
        return QexStep::kFailed;
    ChooseLevels(load);
    const QexPixelFormat& format = *pvr->image.format;
    if (format.recordBytes >= 0) {
        texture->bytesPerPixel = static_cast<uint8_t>(format.recordBytes);
        texture->format = format.recordCode;
    }
    texture->width = static_cast<int32_t>(read.width);
    texture->height = read.height;
    QexTextureLoad_Begin(load, pvr->IsCube());
    load->step = Upload;
    return QexStep::kMore;
}

int32_t Load(QexTexture* texture, const QexImageBytes& file, QexPVRHeader* header, bool decode,
             uint32_t firstLevel, const void* pixelData) {
    QexTextureLoad load = {texture, file, header, decode, firstLevel, pixelData, kQexWhole};
    return QexTextureLoad_Run(&load, Begin);
}

// A piece of the file; all of it is loaded from the next step on.
QexStep ReadFile(QexTextureLoad* load) {
    QexTextureFile* file = static_cast<QexTextureFile*>(load);
    const uint32_t size = QexResFile_GetSize(&file->unread), left = size - file->read;
    const uint32_t count = left < load->piece ? left : load->piece;
    if (count && !QexResFile_Copy(&file->unread, file->read, file->contents + file->read, count))
        return QexStep::kFailed;
    file->read += count;
    if (file->read < size) return QexStep::kMore;
    QexResFile_Close(&file->unread);
    load->file = {file->contents, size};
    load->step = Begin;
    return QexStep::kMore;
}

}  // namespace

bool QexTextureFile_Begin(QexTextureFile* file, const QexTextureLoad& load, const char* path) {
    static_cast<QexTextureLoad&>(*file) = load;
    file->step = ReadFile;
    file->path = path;
    file->contents = nullptr;
    file->read = 0;
    if (!QexResFile_Exists(path)) return false;
    QexResFile_CreateUnread(&file->unread, path);
    if (!QexResFile_IsOpen(&file->unread)) return false;
    file->contents = QexMemory_AllocArray<uint8_t>(QexResFile_GetSize(&file->unread));
    if (file->contents) return true;
    QexResFile_Close(&file->unread);
    return false;
}

void QexTextureFile_BeginMemory(QexTextureFile* file, const QexTextureLoad& load) {
    static_cast<QexTextureLoad&>(*file) = load;
    file->step = Begin;
    file->unread = {};
    file->contents = nullptr;
}

void QexTextureFile_End(QexTextureFile* file) {
    QexTextureLoad_End(file);
    QexResFile_Close(&file->unread);
    QexMemory_FreeArray(file->contents);
}

extern "C" {

int32_t QexTexture_LoadPVRFromMem(QexTexture* texture, const void* file, QexPVRHeader* header, int32_t decode,
                                  uint32_t firstLevel, const void* pixelData) {
    return Load(texture, {static_cast<const uint8_t*>(file), kQexUnknownSize}, header, decode, firstLevel,
                pixelData);
}

int32_t QexTexture_LoadPVRFromMemSized(QexTexture* texture, const void* file, uint32_t size,
                                       QexPVRHeader* header, int32_t decode, uint32_t firstLevel,
                                       const void* pixelData) {
    return Load(texture, {static_cast<const uint8_t*>(file), file ? size : 0}, header, decode, firstLevel,
                pixelData);
}

int32_t QexTexture_LoadPVRFromFile(QexTexture* texture, const char* path, QexPVRHeader* header,
                                   int32_t decode, uint32_t firstLevel) {
    QexTextureFile file;
    if (!QexTextureFile_Begin(&file, {texture, {}, header, decode != 0, firstLevel, nullptr, kQexWhole},
                              path))
        return -1;
    QexTextureLoad_Run(&file, ReadFile);
    QexTextureFile_End(&file);
    return file.result;
}

}  // extern "C"
