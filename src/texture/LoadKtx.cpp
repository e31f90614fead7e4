// KTX 1.1 textures: the header and the places of the levels are read and checked first, then everything that
// is sound is uploaded, natively or decoded, and made complete.
#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"
#include "texture/Upload.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr char kFunction[] = "QexTexture_LoadKTXFromMem";
constexpr uint32_t kHeaderSize = 64;
constexpr uint32_t kSwappedEndianness = 0x01020304;
const uint8_t kIdentifier[12] = {0xAB, 'K', 'T', 'X', ' ', '1', '1', 0xBB, '\r', '\n', 0x1A, '\n'};

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
    uint32_t pvrtcBits;  // a pixel of PVRTC, 0 for other formats
    uint32_t found;      // levels that are there and sound
    bool swapped;        // words, and 16-bit pixels, are in the other byte order
    bool decodes;        // compressed data goes to the GL as pixels

    bool IsETC() const { return Compressed() && internalFormat == GL_ETC1_RGB8_OES; }
    uint32_t Target(uint32_t face) const {
        return faces == 6 ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + face : GL_TEXTURE_2D;
    }
    bool Compressed() const { return type == 0 || format == 0; }
    uint32_t ReadWord(const uint8_t* bytes) const {
        const uint32_t word = QexTextureLoad_ReadLE32(bytes);
        if (!swapped) return word;
        return word << 24 | (word & 0xFF00) << 8 | (word >> 8 & 0xFF00) | word >> 24;
    }
};

// Bytes of a pixel of the uncompressed formats that GL ES 2.0 takes, 0 for others.
uint32_t PixelSize(uint32_t format, uint32_t type) {
    static const struct {
        GLenum format, type;
        uint32_t size;
    } sizes[] = {
        {GL_RGBA, GL_UNSIGNED_BYTE, 4},          {GL_RGB, GL_UNSIGNED_BYTE, 3},
        {GL_RGB, GL_UNSIGNED_SHORT_5_6_5, 2},    {GL_RGBA, GL_UNSIGNED_SHORT_4_4_4_4, 2},
        {GL_RGBA, GL_UNSIGNED_SHORT_5_5_5_1, 2},
    };
    for (const auto& row : sizes)
        if (row.format == format && row.type == type) return row.size;
    return 0;
}

// Bits a pixel of the PVRTC formats of GL, with and without alpha; 0 for others.
uint32_t PVRTCBits(uint32_t internalFormat) {
    switch (internalFormat) {
        case 0x8C00:
        case 0x8C02: return 4;
        case 0x8C01:
        case 0x8C03: return 2;
        default: return 0;
    }
}

KTX ReadHeader(const uint8_t* bytes) {
    KTX ktx = {};
    ktx.swapped = QexTextureLoad_ReadLE32(bytes + 12) == kSwappedEndianness;
    ktx.type = ktx.ReadWord(bytes + 16);
    ktx.format = ktx.ReadWord(bytes + 24);
    ktx.internalFormat = ktx.ReadWord(bytes + 28);
    ktx.baseInternalFormat = ktx.ReadWord(bytes + 32);
    ktx.width = ktx.ReadWord(bytes + 36);
    ktx.height = ktx.ReadWord(bytes + 40);
    ktx.faces = ktx.ReadWord(bytes + 52);
    ktx.levels = ktx.ReadWord(bytes + 56);
    ktx.keyValueBytes = ktx.ReadWord(bytes + 60);
    return ktx;
}

uint32_t AtLevel(uint32_t size, uint32_t level) {
    return size >> level ? size >> level : 1;
}

// How the rows of an uncompressed level lie: padded to 4 bytes, as the format asks, or tight, as some writers
// have it. 0 when imageSize is neither.
uint32_t RowAlignment(const KTX& ktx, uint32_t width, uint32_t height, uint32_t imageSize) {
    const uint64_t tight = uint64_t{width} * ktx.pixelSize;
    if ((tight + 3) / 4 * 4 * height == imageSize) return 4;
    return tight * height == imageSize ? 1 : 0;
}

uint64_t PVRTCSize(uint32_t bits, uint32_t width, uint32_t height) {
    const uint32_t least = bits == 2 ? 16 : 8;
    return uint64_t{width > least ? width : least} * (height > 8 ? height : 8) * bits / 8;
}

// Whether a level can be of that many bytes. What a format of the GL's own takes, the GL knows.
bool IsSizeOfLevel(const KTX& ktx, uint32_t level, uint32_t imageSize) {
    const uint32_t width = AtLevel(ktx.width, level), height = AtLevel(ktx.height, level);
    if (!ktx.Compressed()) return RowAlignment(ktx, width, height, imageSize) != 0;
    if (ktx.pvrtcBits) return imageSize == PVRTCSize(ktx.pvrtcBits, width, height);
    return !ktx.IsETC() || imageSize == QexTextureLoad_ETCSize(width, height);
}

bool IsPowerOfTwo(const KTX& ktx) {
    return util_number_is_power_2(ktx.width) && util_number_is_power_2(ktx.height);
}

bool CheckHeader(KTX* ktx) {
    // A picture of no faces is a picture.
    if (ktx->faces == 0) ktx->faces = 1;
    if (ktx->faces != 1 && ktx->faces != 6) {
        QexTextureLoad_Refuse(kFunction, "%u faces instead of 1 or 6.", ktx->faces);
        return false;
    }
    if (!QexTextureLoad_CheckSize(kFunction, ktx->width, ktx->height, ktx->faces == 6)) return false;
    if (ktx->levels > QexTextureLoad_ChainLength(ktx->width, ktx->height)) {
        QexTextureLoad_Refuse(kFunction, "%u levels of %u x %u pixels.", ktx->levels, ktx->width,
                              ktx->height);
        return false;
    }
    if (ktx->pvrtcBits && !IsPowerOfTwo(*ktx)) {
        QexTextureLoad_Refuse(kFunction, "PVRTC of a size that is no power of two.");
        return false;
    }
    if (!ktx->Compressed() || QexTexture_IsCompressedFormat(ktx->internalFormat)) return true;
    ktx->decodes = ktx->IsETC() || ktx->pvrtcBits;
    if (!ktx->decodes)
        QexTextureLoad_Refuse(kFunction, "the GL does not take the compressed format 0x%X.",
                              ktx->internalFormat);
    return ktx->decodes;
}

// The image data of a level.
struct Level {
    uint64_t offset;  // of its first face
    uint32_t imageSize;
    uint64_t FaceStride() const { return (uint64_t{imageSize} + 3) / 4 * 4; }
};

// Reads a level's place; false when the file ends before its data does.
bool FindLevel(const KTX& ktx, const QexTextureBytes& image, uint64_t at, Level* level) {
    if (at > image.size || image.size - at < 4) return false;
    *level = {at + 4, ktx.ReadWord(image.bytes + at)};
    const uint64_t end = level->offset + (ktx.faces - 1) * level->FaceStride() + level->imageSize;
    return level->imageSize <= INT32_MAX && end <= image.size;
}

// Finds the levels, the first `wanted` of which are asked for. Some writers pad the rows of RGB pictures
// without counting the padding, so that from the small levels on nothing is where it should be: what lies
// before stays. False, with a line, when not even the first level is sound or the file is cut.
bool FindLevels(KTX* ktx, const QexTextureBytes& image, uint32_t wanted, Level* levels) {
    uint64_t at = kHeaderSize + uint64_t{ktx->keyValueBytes};
    for (uint32_t i = 0; i < wanted; ++i) {
        const bool complete = FindLevel(*ktx, image, at, &levels[i]);
        const bool sound = IsSizeOfLevel(*ktx, i, levels[i].imageSize);
        if (i > 0 && !sound && at + 4 <= image.size) {
            // The level before may have been read with its rows shifted.
            const uint32_t before = AtLevel(ktx->width, i - 1) * ktx->pixelSize;
            ktx->found = before % 4 && i > 1 ? i - 1 : i;
            QexSystem_Printf(
                "WARNING:<%s> level %u of %u bytes is not of its size. It is made from level 0.\n", kFunction,
                i, levels[i].imageSize);
            return true;
        }
        if (!complete) {
            QexTextureLoad_Refuse(kFunction, "the file is cut short in level %u.", i);
            return false;
        }
        if (!sound) {
            QexTextureLoad_Refuse(kFunction, "level %u of %u bytes is not of its size.", i,
                                  levels[i].imageSize);
            return false;
        }
        at = levels[i].offset + ktx->faces * levels[i].FaceStride();
        ktx->found = i + 1;
    }
    return true;
}

// The bytes of 16-bit pixels exchanged, in a copy; null when memory runs out.
uint8_t* CopySwapped(const uint8_t* data, uint32_t size) {
    uint8_t* copy = QexMemory_AllocArray<uint8_t>(size);
    for (uint32_t i = 0; copy && i + 1 < size; i += 2) {
        copy[i] = data[i + 1];
        copy[i + 1] = data[i];
    }
    return copy;
}

bool UploadDecoded(const KTX& ktx, uint32_t face, uint32_t level, const uint8_t* data) {
    const uint32_t width = AtLevel(ktx.width, level), height = AtLevel(ktx.height, level);
    const GLint l = static_cast<GLint>(level);
    if (!ktx.pvrtcBits) return QexTextureLoad_UploadDecodedETC(ktx.Target(face), l, width, height, data);
    return QexTextureLoad_UploadDecodedPVRTC(ktx.Target(face), l, width, height, ktx.pvrtcBits == 2, data);
}

// Uploads one image of a level. Null, or what is wrong with it.
const char* UploadFace(const KTX& ktx, uint32_t face, uint32_t level, const uint8_t* data,
                       uint32_t imageSize) {
    static const char* const noMemory = "does not fit into memory";
    const GLint l = static_cast<GLint>(level);
    const uint32_t width = AtLevel(ktx.width, level), height = AtLevel(ktx.height, level);
    const GLsizei w = static_cast<GLsizei>(width), h = static_cast<GLsizei>(height);
    if (ktx.decodes) return UploadDecoded(ktx, face, level, data) ? nullptr : noMemory;
    if (ktx.Compressed()) {
        glCompressedTexImage2D(ktx.Target(face), l, ktx.internalFormat, w, h, 0,
                               static_cast<GLsizei>(imageSize), data);
        return glGetError() == GL_NO_ERROR ? nullptr : "is not of its size";
    }
    QexScratch<uint8_t> swapped;
    if (ktx.swapped && ktx.pixelSize == 2) {
        swapped.Own(CopySwapped(data, imageSize));
        if (!swapped) return noMemory;
        data = swapped.Get();
    }
    const uint32_t alignment = RowAlignment(ktx, width, height, imageSize);
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, static_cast<GLint>(alignment)));
    QEX_GL(glTexImage2D(ktx.Target(face), l, static_cast<GLint>(ktx.baseInternalFormat), w, h, 0, ktx.format,
                        ktx.type, data));
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    return nullptr;
}

bool UploadLevel(const KTX& ktx, const QexTextureBytes& image, uint32_t index, const Level& level) {
    for (uint32_t face = 0; face < ktx.faces; ++face) {
        const uint8_t* data = image.bytes + level.offset + face * level.FaceStride();
        const char* fault = UploadFace(ktx, face, index, data, level.imageSize);
        if (!fault) continue;
        QexTextureLoad_Refuse(kFunction, "level %u of %u bytes %s.", index, level.imageSize, fault);
        return false;
    }
    return true;
}

// Uploads the levels that the GL takes; false, with a line, when one is not there or not of its size. The
// filter that a GL texture starts with asks for all levels: those that are missing at the end are made from
// level 0, or, of one compressed level, not asked for.
bool UploadLevels(KTX* ktx, const QexTextureBytes& image) {
    Level levels[32] = {};
    const bool mipmaps = QexTextureLoad_TakesMipmaps(ktx->width, ktx->height);
    if (!FindLevels(ktx, image, ktx->levels && mipmaps ? ktx->levels : 1, levels)) return false;
    const GLenum target = ktx->faces == 6 ? GL_TEXTURE_CUBE_MAP : GL_TEXTURE_2D;
    const bool complete = ktx->found == QexTextureLoad_ChainLength(ktx->width, ktx->height);
    if (!complete && ktx->found > 1 && (ktx->IsETC() || ktx->pvrtcBits)) ktx->decodes = true;
    const bool generate = mipmaps && !complete && (!ktx->Compressed() || ktx->decodes);
    for (uint32_t i = 0; i < ktx->found; ++i) {
        if (!UploadLevel(*ktx, image, i, levels[i])) return false;
        if (i == 0 && generate) QexTextureLoad_GenerateMipmaps(target);
    }
    if (!complete && !generate) glTexParameteri(target, GL_TEXTURE_MIN_FILTER, GL_LINEAR);
    return true;
}

}  // namespace

bool QexTextureLoad_IsKTX(const QexTextureBytes& image) {
    return image.size >= sizeof kIdentifier && memcmp(image.bytes, kIdentifier, sizeof kIdentifier) == 0;
}

int32_t QexTextureLoad_KTX(QexTexture* texture, const QexTextureBytes& image) {
    if (!QexTextureLoad_IsKTX(image)) return -3;
    if (image.size < kHeaderSize)
        return QexTextureLoad_Refuse(kFunction, "the file is cut short in its header.");
    KTX ktx = ReadHeader(image.bytes);
    texture->format = 0;
    texture->bytesPerPixel = 3;
    if (ktx.Compressed()) {
        ktx.pvrtcBits = PVRTCBits(ktx.internalFormat);
    } else {
        ktx.pixelSize = ktx.baseInternalFormat == ktx.format ? PixelSize(ktx.format, ktx.type) : 0;
        texture->bytesPerPixel = !ktx.pixelSize ? 0 : ktx.format == GL_RGB ? 3 : 4;
        if (!ktx.pixelSize) {
            QexTextureLoad_Refuse(kFunction, "pixels of format 0x%X and type 0x%X, kept as 0x%X.", ktx.format,
                                  ktx.type, ktx.baseInternalFormat);
            return -4;
        }
        texture->format = ktx.format == GL_RGB ? QEX_TEXFMT_RGB888 : QEX_TEXFMT_RGBA8888;
    }
    if (!CheckHeader(&ktx)) return -1;
    if (ktx.pvrtcBits && ktx.decodes) {
        texture->format = QEX_TEXFMT_RGBA8888;
        texture->bytesPerPixel = 4;
    }
    texture->width = static_cast<int32_t>(ktx.width);
    texture->height = ktx.height;
    QexTextureLoad_Begin(texture, &texture->glName, ktx.faces == 6);
    if (!UploadLevels(&ktx, image)) {
        QEX_GL(glDeleteTextures(1, &texture->glName));
        texture->glName = 0;
        return -1;
    }
    QexTextureLoad_SetWrap(QexTexture_Target(texture), ktx.width, ktx.height);
    return 0;
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
    QexResFile_Create(&file, path);
    if (QexResFile_IsOpen(&file))
        result = QexTextureLoad_KTX(texture, {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)});
    QexResFile_Release(&file);
    return result;
}

}  // extern "C"
