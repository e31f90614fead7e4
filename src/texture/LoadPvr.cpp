#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"
#include "texture/Upload.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr char kFunction[] = "QexTexture_LoadPVRFromMem";
constexpr uint32_t kHeaderSize = 52;
constexpr uint32_t kOldHeaderSize = 44;
constexpr uint32_t kTag = 0x21525650;
constexpr uint32_t kMipmaps = 0x100;
constexpr uint32_t kTwiddled = 0x200;
constexpr uint32_t kCubeMap = 0x1000;

enum class Storage : uint8_t { kPlain, kETC1, kPVRTC, kRefused };

// Pixel types.
struct Type {
    uint8_t type;
    Storage storage;
    uint8_t bits;
    GLenum format;  // of glTexImage2D
    GLenum dataType;
    int8_t bytesPerPixel;  // -1: the record's stay as they are
    uint8_t code;
    bool twiddled;     // may be
    const char* line;  // of those that are refused, or not taken as they are
};

constexpr char kPVRTC2[] = "PVRTC2 not supported.";
constexpr char kPVRTC4[] = "PVRTC4 not supported.";

// clang-format off
const Type kTypes[] = {
    {0x10, Storage::kPlain, 16, GL_RGBA, GL_UNSIGNED_SHORT_4_4_4_4, 2, QEX_TEXFMT_RGBA4444, false, nullptr},
    {0x11, Storage::kPlain, 16, GL_RGBA, GL_UNSIGNED_SHORT_5_5_5_1, 2, QEX_TEXFMT_RGBA5551, false, nullptr},
    {0x12, Storage::kPlain, 32, GL_RGBA, GL_UNSIGNED_BYTE, 4, QEX_TEXFMT_RGBA8888, false, nullptr},
    {0x13, Storage::kPlain, 16, GL_RGB, GL_UNSIGNED_SHORT_5_6_5, 2, 0, false, nullptr},
    {0x15, Storage::kPlain, 24, GL_RGB, GL_UNSIGNED_BYTE, 3, QEX_TEXFMT_RGB888, false, nullptr},
    {0x16, Storage::kPlain, 8, GL_LUMINANCE, GL_UNSIGNED_BYTE, -1, 0, false, nullptr},
    {0x17, Storage::kPlain, 16, GL_LUMINANCE_ALPHA, GL_UNSIGNED_BYTE, -1, 0, false, nullptr},
    {0x1B, Storage::kPlain, 8, GL_ALPHA, GL_UNSIGNED_BYTE, -1, 0, false, nullptr},
    {0x36, Storage::kETC1, 4, 0, 0, -1, 0, false, nullptr},
    {0x0C, Storage::kPVRTC, 2, GL_RGBA, GL_UNSIGNED_BYTE, 4, QEX_TEXFMT_RGBA8888, false, kPVRTC2},
    {0x18, Storage::kPVRTC, 2, GL_RGBA, GL_UNSIGNED_BYTE, 4, QEX_TEXFMT_RGBA8888, true, kPVRTC2},
    {0x0D, Storage::kPVRTC, 4, GL_RGBA, GL_UNSIGNED_BYTE, 4, QEX_TEXFMT_RGBA8888, false, kPVRTC4},
    {0x19, Storage::kPVRTC, 4, GL_RGBA, GL_UNSIGNED_BYTE, 4, QEX_TEXFMT_RGBA8888, true, kPVRTC4},
    {0x14, Storage::kRefused, 16, 0, 0, 0, 0, false, "pixel type OGL_RGB_555 not supported."},
    {0x1A, Storage::kRefused, 32, 0, 0, 0, 0, false,
     "Unable to load GL_BGRA texture as extension GL_IMG_texture_format_BGRA8888 is unsupported."},
};
// clang-format on

const Type kUnknownType = {0, Storage::kRefused, 0, 0, 0, 0, 0, false, "pixel type not supported."};

const Type& FindType(uint32_t flags) {
    for (const Type& type : kTypes)
        if (type.type == (flags & 0xFF)) return type;
    return kUnknownType;
}

// What the header says, in its current form, and what follows from it.
struct PVR {
    QexPVRHeader header;
    Type type;
    uint32_t surfaces;
    uint32_t levels;    // that the file holds
    uint32_t uploaded;  // those that the GL gets of them, from `firstLevel` on
    uint32_t firstLevel;
    uint32_t width, height;  // of the first level
    bool mipmaps;            // its filter asks for them
    bool cube;
    bool decodesETC;  // the GL does not take the ETC1 data
    const uint8_t* data;
    uint64_t dataSize;  // bytes at data, or kQexUnknownSize
};

uint64_t LevelSize(const Type& type, uint32_t width, uint32_t height) {
    const uint32_t words = type.bits == 2 ? 16 : 8;  // two of them across
    switch (type.storage) {
        case Storage::kETC1: return QexTextureLoad_ETCSize(width, height);
        case Storage::kPVRTC:
            return uint64_t{width > words ? width : words} * (height > 8 ? height : 8) * type.bits / 8;
        default: return (uint64_t{width} * height * type.bits + 7) / 8;
    }
}

uint64_t SurfaceSize(const PVR& pvr) {
    uint64_t size = 0;
    uint32_t width = pvr.header.width, height = pvr.header.height;
    for (uint32_t level = 0; level < pvr.levels; ++level) {
        size += LevelSize(pvr.type, width, height);
        width = QexTextureLoad_Half(width);
        height = QexTextureLoad_Half(height);
    }
    return size;
}

// Reads the header; false when it is not one.
bool ReadHeader(PVR* pvr, const QexTextureBytes& image) {
    uint32_t words[kHeaderSize / 4] = {};
    const uint32_t headerSize = image.size >= 4 ? QexTextureLoad_ReadLE32(image.bytes) : 0;
    if ((headerSize != kHeaderSize && headerSize != kOldHeaderSize) || image.size < headerSize) {
        QexTextureLoad_Refuse(kFunction, "failed: not a valid pvr.");
        return false;
    }
    for (uint32_t i = 0; i < headerSize / 4; ++i) words[i] = QexTextureLoad_ReadLE32(image.bytes + 4 * i);
    memcpy(&pvr->header, words, sizeof words);
    pvr->cube = pvr->header.flags & kCubeMap;
    pvr->surfaces = pvr->header.numSurfaces ? pvr->header.numSurfaces : pvr->cube ? 6 : 1;
    if (headerSize == kOldHeaderSize)
        QexSystem_Printf(
            "WARNING:<QexTexture_LoadPVRFromMem> this is an old pvr format. You can use PVRTexTool to update "
            "its header.\n");
    pvr->header.tag = kTag;
    pvr->header.numSurfaces = pvr->surfaces;
    return true;
}

// Checks that the format can be loaded.
bool CheckType(PVR* pvr, bool decode) {
    const QexPVRHeader& header = pvr->header;
    const Type& type = pvr->type = FindType(header.flags);
    const char* refusal = nullptr;
    if (header.flags & kTwiddled && !type.twiddled)
        refusal = "texture should be untwiddled.";
    else if (type.storage == Storage::kRefused || (type.storage == Storage::kPVRTC && !decode))
        refusal = type.line;
    else if (header.bitsPerPixel != type.bits)
        refusal = "bits per pixel do not fit the pixel type.";
    else if (pvr->cube && pvr->surfaces > 6)
        refusal = "a cube map of more than 6 faces.";
    else if (type.storage == Storage::kPVRTC &&
             !(util_number_is_power_2(header.width) && util_number_is_power_2(header.height)))
        refusal = "PVRTC of a size that is no power of two.";
    if (refusal) {
        QexTextureLoad_Refuse(kFunction, "%s", refusal);
        return false;
    }
    if (type.storage == Storage::kPVRTC)
        QexSystem_Printf("WARNING:<%s> %s Converting to RGBA8888 instead.\n", kFunction, type.line);
    return QexTextureLoad_CheckSize(kFunction, header.width, header.height, pvr->cube);
}

// Checks that the levels are all there.
bool CheckLevels(PVR* pvr) {
    const QexPVRHeader& header = pvr->header;
    pvr->levels = header.flags & kMipmaps ? header.mipmapCount + 1 : 1;
    if (!pvr->levels || pvr->levels > QexTextureLoad_ChainLength(header.width, header.height) ||
        pvr->firstLevel >= pvr->levels) {
        QexTextureLoad_Refuse(kFunction, "%u mipmaps of %u x %u pixels, first level %u.", header.mipmapCount,
                              header.width, header.height, pvr->firstLevel);
        return false;
    }
    const uint64_t surface = SurfaceSize(*pvr);
    // Surfaces that overlapped could be billions in a file of a few bytes.
    if (pvr->surfaces > 1 && header.dataSize < surface) {
        QexTextureLoad_Refuse(kFunction, "%u surfaces of %u bytes, whose levels take %llu.", pvr->surfaces,
                              header.dataSize, static_cast<unsigned long long>(surface));
        return false;
    }
    const uint64_t needed = uint64_t{pvr->surfaces - 1} * header.dataSize + surface;
    if (pvr->dataSize == kQexUnknownSize || needed <= pvr->dataSize) return true;
    QexTextureLoad_Refuse(kFunction, "the file is cut short: %llu bytes of pixels instead of %llu.",
                          static_cast<unsigned long long>(pvr->dataSize),
                          static_cast<unsigned long long>(needed));
    return false;
}

// Chooses the levels to upload. A GL that has no mipmaps of this size gets the first one alone.
void ChooseLevels(PVR* pvr) {
    pvr->width = pvr->header.width;
    pvr->height = pvr->header.height;
    for (uint32_t level = 0; level < pvr->firstLevel; ++level) {
        pvr->width = QexTextureLoad_Half(pvr->width);
        pvr->height = QexTextureLoad_Half(pvr->height);
    }
    pvr->uploaded = pvr->levels - pvr->firstLevel;
    pvr->mipmaps = pvr->header.mipmapCount > 0;
    if (pvr->mipmaps && !QexTextureLoad_TakesMipmaps(pvr->width, pvr->height)) {
        pvr->mipmaps = false;
        pvr->uploaded = 1;
        QexSystem_Printf("WARNING:<%s> no mipmaps of %u x %u pixels here.\n", kFunction, pvr->width,
                         pvr->height);
    }
    // Of a chain that ends early the GL can make the rest from pixels only.
    const bool partial = pvr->mipmaps && pvr->uploaded < QexTextureLoad_ChainLength(pvr->width, pvr->height);
    if (pvr->type.storage == Storage::kETC1)
        pvr->decodesETC = partial || !QexTexture_IsCompressedFormat(GL_ETC1_RGB8_OES);
}

// False when memory runs out.
bool UploadLevel(const PVR& pvr, GLenum target, GLint level, uint32_t width, uint32_t height,
                 const uint8_t* data) {
    const Type& type = pvr.type;
    const GLsizei w = static_cast<GLsizei>(width), h = static_cast<GLsizei>(height);
    if (type.storage == Storage::kETC1) {
        if (pvr.decodesETC) return QexTextureLoad_UploadDecodedETC(target, level, width, height, data);
        QEX_GL(glCompressedTexImage2D(target, level, GL_ETC1_RGB8_OES, w, h, 0,
                                      static_cast<GLsizei>(LevelSize(type, width, height)), data));
        return true;
    }
    if (type.storage == Storage::kPVRTC)
        return QexTextureLoad_UploadDecodedPVRTC(target, level, width, height, type.bits == 2, data);
    QEX_GL(glTexImage2D(target, level, static_cast<GLint>(type.format), w, h, 0, type.format, type.dataType,
                        data));
    return true;
}

enum class Upload { kDone, kGLError, kOutOfMemory };

// Uploads levels `from` to `end` of one surface.
Upload UploadSurface(const PVR& pvr, uint32_t surface, uint32_t from, uint32_t end) {
    const GLenum target = pvr.cube ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + surface : GL_TEXTURE_2D;
    const uint8_t* data = pvr.data + uint64_t{surface} * pvr.header.dataSize;
    uint32_t width = pvr.header.width, height = pvr.header.height;
    for (uint32_t level = 0; level < end; ++level) {
        if (level >= from &&
            !UploadLevel(pvr, target, static_cast<GLint>(level - pvr.firstLevel), width, height, data))
            return Upload::kOutOfMemory;
        data += LevelSize(pvr.type, width, height);
        width = QexTextureLoad_Half(width);
        height = QexTextureLoad_Half(height);
#if QEX_GL_CHECKS
        if (glGetError() != GL_NO_ERROR) return Upload::kGLError;
#endif
    }
    return Upload::kDone;
}

Upload UploadSurfaces(const PVR& pvr, uint32_t from, uint32_t end) {
    Upload result = Upload::kDone;
    for (uint32_t surface = 0; surface < pvr.surfaces && result == Upload::kDone && from < end; ++surface)
        result = UploadSurface(pvr, surface, from, end);
    return result;
}

// Uploads everything that was chosen. Levels that the filter asks for and the file lacks are made from the
// first one, before those of the file that follow it.
Upload UploadAll(const PVR& pvr, GLenum target) {
    const uint32_t first = pvr.firstLevel, end = first + pvr.uploaded;
    if (!pvr.mipmaps || pvr.uploaded >= QexTextureLoad_ChainLength(pvr.width, pvr.height))
        return UploadSurfaces(pvr, first, end);
    const Upload result = UploadSurfaces(pvr, first, first + 1);
    if (result != Upload::kDone) return result;
    QexTextureLoad_GenerateMipmaps(target);
    return UploadSurfaces(pvr, first + 1, end);
}

int32_t Load(QexTexture* texture, const QexTextureBytes& image, QexPVRHeader* header, bool decode,
             uint32_t firstLevel, const void* pixelData) {
    if (QexTextureLoad_IsKTX(image)) return QexTextureLoad_KTX(texture, image);
    PVR pvr = {};
    texture->glName = 0;
    if (!ReadHeader(&pvr, image)) return -1;
    const bool known = !pixelData && image.size != kQexUnknownSize;
    pvr.data = pixelData ? static_cast<const uint8_t*>(pixelData) : image.bytes + pvr.header.headerSize;
    pvr.dataSize = known ? image.size - pvr.header.headerSize : kQexUnknownSize;
    pvr.firstLevel = firstLevel;
    if (!CheckType(&pvr, decode) || !CheckLevels(&pvr)) return -1;
    ChooseLevels(&pvr);
    if (pvr.type.bytesPerPixel >= 0) {
        texture->bytesPerPixel = static_cast<uint8_t>(pvr.type.bytesPerPixel);
        texture->format = pvr.type.code;
    }
    texture->width = static_cast<int32_t>(pvr.header.width);
    texture->height = pvr.header.height;
    uint32_t name = 0;
    QexTextureLoad_Begin(texture, &name, pvr.cube);
    const GLenum target = QexTexture_Target(texture);
    const Upload result = UploadAll(pvr, target);
    if (result == Upload::kGLError) return QexTextureLoad_Refuse(kFunction, "glTexImage2D() failed.");
    if (result == Upload::kOutOfMemory) {
        QEX_GL(glDeleteTextures(1, &name));
        return QexTextureLoad_Refuse(kFunction, "out of memory.");
    }
    texture->glName = name;
    if (header) *header = pvr.header;
    glTexParameteri(target, GL_TEXTURE_MIN_FILTER, pvr.mipmaps ? GL_LINEAR_MIPMAP_NEAREST : GL_LINEAR);
    glTexParameteri(target, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
    QexTextureLoad_SetWrap(target, pvr.header.width, pvr.header.height);
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
    QexResFile_Create(&file, path);
    if (QexResFile_IsOpen(&file))
        result = Load(texture, {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)}, header, decode,
                      firstLevel, nullptr);
    QexResFile_Release(&file);
    return result;
}

}  // extern "C"
