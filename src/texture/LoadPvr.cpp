// PVR textures with the legacy header: all levels of a file, from one of them on, as they are or decoded.
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "image/Ktx.h"
#include "image/Pvr.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/resources.h"
#include "Qex/textures.h"
#include "texture/Kept.h"
#include "texture/LoadKtx.h"
#include "texture/Upload.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr char kFunction[] = "QexTexture_LoadPVRFromMem";

// A file, and what the GL gets of it.
struct PVR {
    QexPvr file;
    const uint8_t* data;  // of the pixels
    uint32_t firstLevel;
    uint32_t uploaded;  // levels, from the first one on
    bool mipmaps;       // its filter asks for them
    bool decodes;       // the GL does not take the data

    const QexImageLevel& First() const { return file.image.levels[firstLevel]; }
    bool IsPartial() const {
        return mipmaps && uploaded < QexImage_ChainLength(First().width, First().height);
    }
};

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
void ChooseLevels(PVR* pvr) {
    const QexImageLevel& first = pvr->First();
    const QexPixelCoding coding = pvr->file.image.format->coding;
    pvr->uploaded = pvr->file.image.levelCount - pvr->firstLevel;
    pvr->mipmaps = pvr->file.header.mipmapCount > 0;
    if (pvr->mipmaps && !QexTextureLoad_TakesMipmaps(first.width, first.height)) {
        pvr->mipmaps = false;
        pvr->uploaded = 1;
        QexSystem_Printf("WARNING:<%s> no mipmaps of %u x %u pixels here.\n", kFunction, first.width,
                         first.height);
    }
    // Of a chain that ends early the GL can make the rest from pixels only.
    pvr->decodes =
        coding == kQexPVRTC ||
        (coding == kQexETC1 && (pvr->IsPartial() || !QexTexture_IsCompressedFormat(GL_ETC1_RGB8_OES)));
}

// False when memory runs out.
bool UploadLevel(const PVR& pvr, GLenum target, GLint index, const QexImageLevel& level,
                 const uint8_t* data) {
    const QexPixelFormat& format = *pvr.file.image.format;
    const GLsizei w = static_cast<GLsizei>(level.width), h = static_cast<GLsizei>(level.height);
    if (pvr.decodes) return QexTextureLoad_UploadDecoded(target, index, format, level, data);
    if (format.coding == kQexETC1)
        QEX_GL(glCompressedTexImage2D(target, index, GL_ETC1_RGB8_OES, w, h, 0,
                                      static_cast<GLsizei>(level.bytes), data));
    else
        QEX_GL(glTexImage2D(target, index, format.pixelOrder, w, h, 0, format.pixelOrder, format.pixelType,
                            data));
    return true;
}

enum class Upload { kDone, kGLError, kOutOfMemory };

// Uploads levels `from` to `end` of one surface.
Upload UploadSurface(const PVR& pvr, uint32_t surface, uint32_t from, uint32_t end) {
    const GLenum target = QexTextureLoad_FaceTarget(pvr.file.IsCube(), surface);
    for (uint32_t i = 0; i < end; ++i) {
        const QexImageLevel& level = pvr.file.image.levels[i];
        const uint8_t* data = pvr.data + surface * level.stride + level.offset;
        if (i >= from && !UploadLevel(pvr, target, static_cast<GLint>(i - pvr.firstLevel), level, data))
            return Upload::kOutOfMemory;
#if QEX_GL_CHECKS
        if (glGetError() != GL_NO_ERROR) return Upload::kGLError;
#endif
    }
    return Upload::kDone;
}

Upload UploadSurfaces(const PVR& pvr, uint32_t from, uint32_t end) {
    Upload result = Upload::kDone;
    const uint32_t surfaces = pvr.file.image.faces;
    for (uint32_t surface = 0; surface < surfaces && result == Upload::kDone && from < end; ++surface)
        result = UploadSurface(pvr, surface, from, end);
    return result;
}

// Uploads everything that was chosen. Levels that the filter asks for and the file lacks are made from the
// first one, before those of the file that follow it.
Upload UploadAll(const PVR& pvr, GLenum target) {
    const uint32_t first = pvr.firstLevel, end = first + pvr.uploaded;
    if (!pvr.IsPartial()) return UploadSurfaces(pvr, first, end);
    const Upload result = UploadSurfaces(pvr, first, first + 1);
    if (result != Upload::kDone) return result;
    QexTextureLoad_GenerateMipmaps(target);
    return UploadSurfaces(pvr, first + 1, end);
}

int32_t Load(QexTexture* texture, const QexImageBytes& file, QexPVRHeader* header, bool decode,
             uint32_t firstLevel, const void* pixelData) {
    if (QexKtx_Is(file)) return QexTextureLoad_KTX(texture, file);
    PVR pvr;
    const QexPVRHeader& read = pvr.file.header;
    const QexMaking making;
    texture->glName = 0;
    if (!ReadHeader(&pvr.file, file)) return -1;
    const bool known = !pixelData && file.size != kQexUnknownSize;
    const uint64_t size = known ? file.size - read.headerSize : kQexUnknownSize;
    pvr.data = pixelData ? static_cast<const uint8_t*>(pixelData) : file.bytes + read.headerSize;
    pvr.firstLevel = firstLevel;
    if (!CheckFormat(pvr.file, decode) || !CheckLevels(&pvr.file, firstLevel, size)) return -1;
    ChooseLevels(&pvr);
    const QexPixelFormat& format = *pvr.file.image.format;
    if (format.recordBytes >= 0) {
        texture->bytesPerPixel = static_cast<uint8_t>(format.recordBytes);
        texture->format = format.recordCode;
    }
    texture->width = static_cast<int32_t>(read.width);
    texture->height = read.height;
    uint32_t name = 0;
    QexTextureLoad_Begin(texture, &name, pvr.file.IsCube());
    const GLenum target = QexTexture_Target(texture);
    const Upload result = UploadAll(pvr, target);
    if (result != Upload::kDone || making.Failed()) {
        QEX_GL(glDeleteTextures(1, &name));
        QexLeanState_ForgetTextures();
        return QexTextureLoad_Refuse(
            kFunction, result == Upload::kOutOfMemory ? "out of memory." : "glTexImage2D() failed.");
    }
    texture->glName = name;
    if (!QexKeptTexture_Note(
            name, target,
            {kKeptImage, known ? file.bytes : nullptr, file.size, 0, 0, 0, decode, firstLevel})) {
        QexTexture_Release(texture);
        return -1;
    }
    if (header) *header = read;
    glTexParameteri(target, GL_TEXTURE_MIN_FILTER, pvr.mipmaps ? GL_LINEAR_MIPMAP_NEAREST : GL_LINEAR);
    glTexParameteri(target, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
    QexTextureLoad_SetWrap(target, read.width, read.height);
    return 0;
}

}  // namespace

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
    QexResFile file;
    int32_t result = -1;
    if (!QexResFile_Exists(path)) return -1;
    const QexKeptPath kept(path);
    QexResFile_Create(&file, path);
    if (QexResFile_IsOpen(&file))
        result = Load(texture, {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)}, header, decode,
                      firstLevel, nullptr);
    QexResFile_Release(&file);
    return result;
}

}  // extern "C"
