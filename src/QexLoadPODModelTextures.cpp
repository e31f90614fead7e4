#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "QexGL.h"
#include "QexMemory.h"
#include "QexTexture.h"

#ifndef GL_ETC1_RGB8_OES
#define GL_ETC1_RGB8_OES 0x8D64
#endif

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

// A file image and what is known of its length.
struct Image {
    const uint8_t* bytes;
    uint64_t size;
};
constexpr uint64_t kUnknownSize = UINT64_MAX;

uint32_t ReadLE32(const uint8_t* bytes) {
    return bytes[0] | static_cast<uint32_t>(bytes[1]) << 8 | static_cast<uint32_t>(bytes[2]) << 16 |
           static_cast<uint32_t>(bytes[3]) << 24;
}

int32_t Refuse(const char* function, const char* format, ...) QEX_PRINTF(2, 3);
int32_t Refuse(const char* function, const char* format, ...) {
    char text[160];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    QexSystem_Printf("ERROR:<%s> %s\n", function, text);
    return -1;
}

uint32_t Half(uint32_t size) {
    return size > 1 ? size / 2 : 1;
}

uint32_t ChainLength(uint32_t width, uint32_t height) {
    uint32_t levels = 1;
    for (uint32_t size = width > height ? width : height; size > 1; size /= 2) ++levels;
    return levels;
}

// Sizes that the GL takes: anything else would end the process at the upload.
bool CheckSize(const char* function, uint32_t width, uint32_t height, bool cube) {
    if (QexTexture_IsPossibleSize(width, height, cube)) return true;
    Refuse(function, "%u x %u pixels are not possible here.", width, height);
    return false;
}

// Makes the GL texture that the levels go into.
void BeginTexture(QexTexture* texture, uint32_t* name, bool cube) {
    texture->pixels = nullptr;
    texture->rowBytes = texture->bytesPerPixel * static_cast<uint32_t>(texture->width);
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    QEX_GL(glGenTextures(1, name));
    texture->flags = cube ? QEX_TEXFLAG_CUBEMAP : 0;
    QexRenderState_Bind(QexTexture_Target(texture), *name);
}

void SetWrap(GLenum target, uint32_t width, uint32_t height) {
    const bool repeats = util_number_is_power_2(width) && util_number_is_power_2(height);
    const GLint wrap = repeats ? GL_REPEAT : GL_CLAMP_TO_EDGE;
    glTexParameteri(target, GL_TEXTURE_WRAP_S, wrap);
    glTexParameteri(target, GL_TEXTURE_WRAP_T, wrap);
}

// ---- PVR ----

constexpr char kPVRFunction[] = "QexTexture_LoadPVRFromMem";
constexpr uint32_t kPVRHeaderSize = 52;
constexpr uint32_t kPVROldHeaderSize = 44;
constexpr uint32_t kPVRTag = 0x21525650;
constexpr uint32_t kPVRMipmaps = 0x100;
constexpr uint32_t kPVRTwiddled = 0x200;
constexpr uint32_t kPVRCubeMap = 0x1000;

// Pixel types. One without a GL format is refused with its line.
struct PVRType {
    uint8_t type;
    uint8_t bits;
    GLenum format;  // of glTexImage2D, or internal format of a compressed one
    GLenum dataType;
    int8_t bytesPerPixel;  // -1: the record's stay as they are
    uint8_t code;
    bool twiddled;  // may be
    const char* refusal;
};

// clang-format off
const PVRType kPVRTypes[] = {
    {0x10, 16, GL_RGBA, GL_UNSIGNED_SHORT_4_4_4_4, 2, QEX_TEXFMT_RGBA4444, false, nullptr},
    {0x11, 16, GL_RGBA, GL_UNSIGNED_SHORT_5_5_5_1, 2, QEX_TEXFMT_RGBA5551, false, nullptr},
    {0x12, 32, GL_RGBA, GL_UNSIGNED_BYTE, 4, QEX_TEXFMT_RGBA8888, false, nullptr},
    {0x13, 16, GL_RGB, GL_UNSIGNED_SHORT_5_6_5, 2, 0, false, nullptr},
    {0x15, 24, GL_RGB, GL_UNSIGNED_BYTE, 3, QEX_TEXFMT_RGB888, false, nullptr},
    {0x16, 8, GL_LUMINANCE, GL_UNSIGNED_BYTE, -1, 0, false, nullptr},
    {0x17, 16, GL_LUMINANCE_ALPHA, GL_UNSIGNED_BYTE, -1, 0, false, nullptr},
    {0x1B, 8, GL_ALPHA, GL_UNSIGNED_BYTE, -1, 0, false, nullptr},
    {0x36, 4, GL_ETC1_RGB8_OES, 0, -1, 0, false, nullptr},
    {0x0C, 2, 0, 0, 0, 0, false, "PVRTC2 not supported."},
    {0x18, 2, 0, 0, 0, 0, true, "PVRTC2 not supported."},
    {0x0D, 4, 0, 0, 0, 0, false, "PVRTC4 not supported."},
    {0x19, 4, 0, 0, 0, 0, true, "PVRTC4 not supported."},
    {0x14, 16, 0, 0, 0, 0, false, "pixel type OGL_RGB_555 not supported."},
    {0x1A, 32, 0, 0, 0, 0, false,
     "Unable to load GL_BGRA texture as extension GL_IMG_texture_format_BGRA8888 is unsupported."},
};
// clang-format on

const PVRType kUnknownPVRType = {0, 0, 0, 0, 0, 0, false, "pixel type not supported."};

const PVRType& FindPVRType(uint32_t flags) {
    for (const PVRType& type : kPVRTypes)
        if (type.type == (flags & 0xFF)) return type;
    return kUnknownPVRType;
}

// What the header says, in its current form, and what follows from it.
struct PVR {
    QexPVRHeader header;
    PVRType type;
    uint32_t surfaces;
    uint32_t levels;
    bool cube;
    const uint8_t* data;
    uint64_t dataSize;  // bytes at data, or kUnknownSize
};

uint64_t LevelSize(const PVRType& type, uint32_t width, uint32_t height) {
    if (type.format == GL_ETC1_RGB8_OES) return uint64_t{(width + 3) / 4} * ((height + 3) / 4) * 8;
    return (uint64_t{width} * height * type.bits + 7) / 8;
}

uint64_t SurfaceSize(const PVR& pvr) {
    uint64_t size = 0;
    uint32_t width = pvr.header.width, height = pvr.header.height;
    for (uint32_t level = 0; level < pvr.levels; ++level, width = Half(width), height = Half(height))
        size += LevelSize(pvr.type, width, height);
    return size;
}

// Reads the header; false when it is not one.
bool ReadPVRHeader(PVR* pvr, const Image& image) {
    uint32_t words[kPVRHeaderSize / 4] = {};
    const uint32_t headerSize = image.size >= 4 ? ReadLE32(image.bytes) : 0;
    if ((headerSize != kPVRHeaderSize && headerSize != kPVROldHeaderSize) || image.size < headerSize) {
        Refuse(kPVRFunction, "failed: not a valid pvr.");
        return false;
    }
    for (uint32_t i = 0; i < headerSize / 4; ++i) words[i] = ReadLE32(image.bytes + 4 * i);
    memcpy(&pvr->header, words, sizeof words);
    pvr->cube = pvr->header.flags & kPVRCubeMap;
    pvr->surfaces = pvr->header.numSurfaces ? pvr->header.numSurfaces : pvr->cube ? 6 : 1;
    if (headerSize == kPVROldHeaderSize)
        QexSystem_Printf(
            "WARNING:<QexTexture_LoadPVRFromMem> this is an old pvr format. You can use PVRTexTool to update "
            "its "
            "header.\n");
    pvr->header.tag = kPVRTag;
    pvr->header.numSurfaces = pvr->surfaces;
    return true;
}

// Checks that the format can be loaded and that the levels are all there.
bool CheckPVR(PVR* pvr, uint32_t firstLevel) {
    const QexPVRHeader& header = pvr->header;
    pvr->type = FindPVRType(header.flags);
    pvr->levels = header.flags & kPVRMipmaps ? header.mipmapCount + 1 : 1;
    const char* refusal = nullptr;
    if (header.flags & kPVRTwiddled && !pvr->type.twiddled)
        refusal = "texture should be untwiddled.";
    else if (pvr->type.refusal)
        refusal = pvr->type.refusal;
    else if (header.bitsPerPixel != pvr->type.bits)
        refusal = "bits per pixel do not fit the pixel type.";
    else if (pvr->cube && pvr->surfaces > 6)
        refusal = "a cube map of more than 6 faces.";
    if (refusal) {
        Refuse(kPVRFunction, "%s", refusal);
        return false;
    }
    if (!CheckSize(kPVRFunction, header.width, header.height, pvr->cube)) return false;
    if (!pvr->levels || pvr->levels > ChainLength(header.width, header.height) || firstLevel >= pvr->levels) {
        Refuse(kPVRFunction, "%u mipmaps of %u x %u pixels, first level %u.", header.mipmapCount,
               header.width, header.height, firstLevel);
        return false;
    }
    const uint64_t surface = SurfaceSize(*pvr);
    // Surfaces that overlapped could be billions in a file of a few bytes.
    if (pvr->surfaces > 1 && header.dataSize < surface) {
        Refuse(kPVRFunction, "%u surfaces of %u bytes, whose levels take %llu.", pvr->surfaces,
               header.dataSize, static_cast<unsigned long long>(surface));
        return false;
    }
    const uint64_t needed = uint64_t{pvr->surfaces - 1} * header.dataSize + surface;
    if (pvr->dataSize == kUnknownSize || needed <= pvr->dataSize) return true;
    Refuse(kPVRFunction, "the file is cut short: %llu bytes of pixels instead of %llu.",
           static_cast<unsigned long long>(pvr->dataSize), static_cast<unsigned long long>(needed));
    return false;
}

void UploadLevel(const PVRType& type, GLenum target, GLint level, uint32_t width, uint32_t height,
                 const uint8_t* data) {
    const GLsizei w = static_cast<GLsizei>(width), h = static_cast<GLsizei>(height);
    if (type.dataType)
        QEX_GL(glTexImage2D(target, level, static_cast<GLint>(type.format), w, h, 0, type.format,
                            type.dataType, data));
    else
        QEX_GL(glCompressedTexImage2D(target, level, type.format, w, h, 0,
                                      static_cast<GLsizei>(LevelSize(type, width, height)), data));
}

// Uploads the levels of one surface from the first wanted one on; false on a GL error.
bool UploadSurface(const PVR& pvr, uint32_t surface, uint32_t firstLevel) {
    const GLenum target = pvr.cube ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + surface : GL_TEXTURE_2D;
    const uint8_t* data = pvr.data + uint64_t{surface} * pvr.header.dataSize;
    uint32_t width = pvr.header.width, height = pvr.header.height;
    for (uint32_t level = 0; level < pvr.levels; ++level) {
        if (level >= firstLevel)
            UploadLevel(pvr.type, target, static_cast<GLint>(level - firstLevel), width, height, data);
        data += LevelSize(pvr.type, width, height);
        width = Half(width);
        height = Half(height);
#if QEX_GL_CHECKS
        if (glGetError() != GL_NO_ERROR) return false;
#endif
    }
    return true;
}

// ---- KTX ----

constexpr char kKTXFunction[] = "QexTexture_LoadKTXFromMem";
constexpr uint32_t kKTXHeaderSize = 64;
constexpr uint32_t kKTXNativeEndianness = 0x04030201;
const uint8_t kKTXIdentifier[12] = {0xAB, 'K', 'T', 'X', ' ', '1', '1', 0xBB, '\r', '\n', 0x1A, '\n'};

struct KTX {
    uint32_t type;
    uint32_t format;
    uint32_t internalFormat;
    uint32_t baseInternalFormat;
    uint32_t width;
    uint32_t height;
    uint32_t faces;
    uint32_t levels;
    uint32_t keyValueBytes;
    uint32_t pixelSize;  // bytes a pixel, 0 for compressed data

    bool Compressed() const { return type == 0 || format == 0; }
};

// Bytes of a pixel of the uncompressed formats that GL ES 2.0 takes, 0 for others.
uint32_t PixelSize(uint32_t format, uint32_t type) {
    if (type == GL_UNSIGNED_BYTE) return format == GL_RGBA ? 4 : 3;
    if (type == GL_UNSIGNED_SHORT_5_6_5) return format == GL_RGB ? 2 : 0;
    return (type == GL_UNSIGNED_SHORT_4_4_4_4 || type == GL_UNSIGNED_SHORT_5_5_5_1) && format == GL_RGBA ? 2
                                                                                                         : 0;
}

KTX ReadKTXHeader(const uint8_t* bytes) {
    KTX ktx = {};
    ktx.type = ReadLE32(bytes + 16);
    ktx.format = ReadLE32(bytes + 24);
    ktx.internalFormat = ReadLE32(bytes + 28);
    ktx.baseInternalFormat = ReadLE32(bytes + 32);
    ktx.width = ReadLE32(bytes + 36);
    ktx.height = ReadLE32(bytes + 40);
    ktx.faces = ReadLE32(bytes + 52);
    ktx.levels = ReadLE32(bytes + 56);
    ktx.keyValueBytes = ReadLE32(bytes + 60);
    return ktx;
}

// Bytes of an uncompressed level: rows padded to 4 bytes, as the format asks, or tight, as some writers have
// it. 0 when imageSize is neither.
uint32_t RowAlignment(const KTX& ktx, uint32_t width, uint32_t height, uint32_t imageSize) {
    const uint64_t tight = uint64_t{width} * ktx.pixelSize;
    if ((tight + 3) / 4 * 4 * height == imageSize) return 4;
    return tight * height == imageSize ? 1 : 0;
}

bool CheckKTX(const KTX& ktx, const Image& image) {
    if (image.size != kUnknownSize && ReadLE32(image.bytes + 12) != kKTXNativeEndianness) {
        Refuse(kKTXFunction, "the file is in the other byte order.");
        return false;
    }
    if (ktx.faces != 1 && ktx.faces != 6) {
        Refuse(kKTXFunction, "%u faces instead of 1 or 6.", ktx.faces);
        return false;
    }
    if (!CheckSize(kKTXFunction, ktx.width, ktx.height, ktx.faces == 6)) return false;
    if (ktx.levels > ChainLength(ktx.width, ktx.height)) {
        Refuse(kKTXFunction, "%u levels of %u x %u pixels.", ktx.levels, ktx.width, ktx.height);
        return false;
    }
    if (!ktx.Compressed() || QexTexture_IsCompressedFormat(ktx.internalFormat)) return true;
    Refuse(kKTXFunction, "the GL does not take the compressed format 0x%X.", ktx.internalFormat);
    return false;
}

bool UploadKTXFace(const KTX& ktx, uint32_t face, uint32_t level, const uint8_t* data, uint32_t imageSize) {
    const GLenum target = ktx.faces == 6 ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + face : GL_TEXTURE_2D;
    const uint32_t width = ktx.width >> level ? ktx.width >> level : 1;
    const uint32_t height = ktx.height >> level ? ktx.height >> level : 1;
    const GLsizei w = static_cast<GLsizei>(width), h = static_cast<GLsizei>(height);
    if (ktx.Compressed()) {
        glCompressedTexImage2D(target, static_cast<GLint>(level), ktx.internalFormat, w, h, 0,
                               static_cast<GLsizei>(imageSize), data);
        return glGetError() == GL_NO_ERROR;
    }
    const uint32_t alignment = RowAlignment(ktx, width, height, imageSize);
    if (!alignment) return false;
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, static_cast<GLint>(alignment)));
    QEX_GL(glTexImage2D(target, static_cast<GLint>(level), static_cast<GLint>(ktx.baseInternalFormat), w, h,
                        0, ktx.format, ktx.type, data));
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    return true;
}

// Uploads all levels; false, with a line, when one is not there or not of its size.
bool UploadKTXLevels(const KTX& ktx, const Image& image) {
    uint64_t at = kKTXHeaderSize + uint64_t{ktx.keyValueBytes};
    for (uint32_t level = 0; level < (ktx.levels ? ktx.levels : 1); ++level) {
        const uint64_t left = at < image.size ? image.size - at : 0;
        const uint32_t imageSize = left >= 4 ? ReadLE32(image.bytes + at) : 0;
        const uint64_t padded = (uint64_t{imageSize} + 3) / 4 * 4;
        at += 4;
        for (uint32_t face = 0; face < ktx.faces; ++face, at += padded) {
            if (left < 4 || at + imageSize > image.size || imageSize > INT32_MAX) {
                Refuse(kKTXFunction, "the file is cut short in level %u.", level);
                return false;
            }
            if (UploadKTXFace(ktx, face, level, image.bytes + at, imageSize)) continue;
            Refuse(kKTXFunction, "level %u of %u bytes is not of its size.", level, imageSize);
            return false;
        }
    }
    return true;
}

int32_t LoadKTX(QexTexture* texture, const Image& image) {
    if (image.size < kKTXHeaderSize || memcmp(image.bytes, kKTXIdentifier, sizeof kKTXIdentifier) != 0)
        return -3;
    KTX ktx = ReadKTXHeader(image.bytes);
    if (!ktx.Compressed()) {
        const bool known = ktx.format == GL_RGB || ktx.format == GL_RGBA;
        texture->format = !known ? 0u : ktx.format == GL_RGB ? QEX_TEXFMT_RGB888 : QEX_TEXFMT_RGBA8888;
        texture->bytesPerPixel = !known ? 0 : ktx.format == GL_RGB ? 3 : 4;
        ktx.pixelSize = known ? PixelSize(ktx.format, ktx.type) : 0;
        if (!ktx.pixelSize || ktx.baseInternalFormat != ktx.format) {
            texture->format = 0;
            texture->bytesPerPixel = 0;
            return -4;
        }
    } else {
        texture->format = 0;
        texture->bytesPerPixel = 3;
    }
    if (!CheckKTX(ktx, image)) return -1;
    texture->width = static_cast<int32_t>(ktx.width);
    texture->height = ktx.height;
    BeginTexture(texture, &texture->glName, ktx.faces == 6);
    if (!UploadKTXLevels(ktx, image)) {
        QEX_GL(glDeleteTextures(1, &texture->glName));
        texture->glName = 0;
        return -1;
    }
    const GLenum target = QexTexture_Target(texture);
    if (!ktx.levels && !ktx.Compressed()) {
        glGenerateMipmap(target);
        glGetError();  // of a GL that knows mipmaps of powers of two only; level 0 is there
    }
    SetWrap(target, ktx.width, ktx.height);
    return 0;
}

int32_t LoadPVR(QexTexture* texture, const Image& image, QexPVRHeader* header, uint32_t firstLevel,
                const void* pixelData) {
    if (image.size >= sizeof kKTXIdentifier &&
        memcmp(image.bytes, kKTXIdentifier, sizeof kKTXIdentifier) == 0)
        return LoadKTX(texture, image);
    PVR pvr = {};
    texture->glName = 0;
    if (!ReadPVRHeader(&pvr, image)) return -1;
    pvr.data = pixelData ? static_cast<const uint8_t*>(pixelData) : image.bytes + pvr.header.headerSize;
    pvr.dataSize =
        pixelData || image.size == kUnknownSize ? kUnknownSize : image.size - pvr.header.headerSize;
    if (!CheckPVR(&pvr, firstLevel)) return -1;
    uint32_t name = 0;
    if (pvr.type.bytesPerPixel >= 0) {
        texture->bytesPerPixel = static_cast<uint8_t>(pvr.type.bytesPerPixel);
        texture->format = pvr.type.code;
    }
    texture->width = static_cast<int32_t>(pvr.header.width);
    texture->height = pvr.header.height;
    BeginTexture(texture, &name, pvr.cube);
    for (uint32_t surface = 0; surface < pvr.surfaces; ++surface)
        if (!UploadSurface(pvr, surface, firstLevel)) return Refuse(kPVRFunction, "glTexImage2D() failed.");
    texture->glName = name;
    if (header) *header = pvr.header;
    const GLenum target = QexTexture_Target(texture);
    glTexParameteri(target, GL_TEXTURE_MIN_FILTER,
                    pvr.header.mipmapCount ? GL_LINEAR_MIPMAP_NEAREST : GL_LINEAR);
    glTexParameteri(target, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
    SetWrap(target, pvr.header.width, pvr.header.height);
    return 0;
}

}  // namespace

bool QexTexture_IsCompressedFormat(uint32_t internalFormat) {
    GLint count = 0;
    QEX_GL(glGetIntegerv(GL_NUM_COMPRESSED_TEXTURE_FORMATS, &count));
    QexScratch<GLint> formats(count > 0 ? static_cast<uint64_t>(count) : 1);
    if (!formats) return false;
    QEX_GL(glGetIntegerv(GL_COMPRESSED_TEXTURE_FORMATS, formats.Get()));
    for (GLint i = 0; i < count; ++i)
        if (static_cast<uint32_t>(formats[static_cast<uint64_t>(i)]) == internalFormat) return true;
    return false;
}

extern "C" {

int32_t QexTexture_LoadPVRFromMem(QexTexture* texture, const void* file, QexPVRHeader* header, int32_t,
                                  uint32_t firstLevel, const void* pixelData) {
    return LoadPVR(texture, {static_cast<const uint8_t*>(file), kUnknownSize}, header, firstLevel, pixelData);
}

int32_t QexTexture_LoadPVRFromFile(QexTexture* texture, const char* path, QexPVRHeader* header, int32_t,
                                   uint32_t firstLevel) {
    QexResFile file;
    int32_t result = -1;
    if (!QexResFile_Exists(path)) return -1;
    QexResFile_Create(&file, path);
    if (QexResFile_IsOpen(&file))
        result = LoadPVR(texture, {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)}, header, firstLevel,
                         nullptr);
    QexResFile_Release(&file);
    return result;
}

int32_t QexTexture_LoadKTXFromMem(QexTexture* texture, const void* file, QexPVRHeader*, int32_t, uint32_t,
                                  const void*) {
    return LoadKTX(texture, {static_cast<const uint8_t*>(file), kUnknownSize});
}

int32_t QexTexture_LoadKTXFromFile(QexTexture* texture, const char* path, QexPVRHeader*, int32_t, uint32_t) {
    QexResFile file;
    int32_t result = -1;
    QexResFile_Create(&file, path);
    if (QexResFile_IsOpen(&file))
        result = LoadKTX(texture, {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)});
    QexResFile_Release(&file);
    return result;
}

int32_t QexTexture_IsETCSupported(void) {
    return QexTexture_IsCompressedFormat(GL_ETC1_RGB8_OES) ? 1 : 0;
}

}  // extern "C"
