#include <cstring>

#include "QexGL.h"
#include "QexMemory.h"
#include "QexTextureLoad.h"

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
    bool swapped;        // words, and 16-bit pixels, are in the other byte order
    bool decodesETC;     // the GL does not take the ETC1 data

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

// Bytes of an uncompressed level: rows padded to 4 bytes, as the format asks, or tight, as some writers have
// it. 0 when imageSize is neither.
uint32_t RowAlignment(const KTX& ktx, uint32_t width, uint32_t height, uint32_t imageSize) {
    const uint64_t tight = uint64_t{width} * ktx.pixelSize;
    if ((tight + 3) / 4 * 4 * height == imageSize) return 4;
    return tight * height == imageSize ? 1 : 0;
}

bool CheckHeader(KTX* ktx) {
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
    if (!ktx->Compressed() || QexTexture_IsCompressedFormat(ktx->internalFormat)) return true;
    ktx->decodesETC = ktx->internalFormat == GL_ETC1_RGB8_OES;
    if (!ktx->decodesETC)
        QexTextureLoad_Refuse(kFunction, "the GL does not take the compressed format 0x%X.",
                              ktx->internalFormat);
    return ktx->decodesETC;
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

// Uploads one image of a level. Null, or what is wrong with it.
const char* UploadFace(const KTX& ktx, uint32_t face, uint32_t level, const uint8_t* data,
                       uint32_t imageSize) {
    static const char* const wrongSize = "is not of its size";
    static const char* const noMemory = "does not fit into memory";
    const GLenum target = ktx.faces == 6 ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + face : GL_TEXTURE_2D;
    const uint32_t width = ktx.width >> level ? ktx.width >> level : 1;
    const uint32_t height = ktx.height >> level ? ktx.height >> level : 1;
    const GLint l = static_cast<GLint>(level);
    const GLsizei w = static_cast<GLsizei>(width), h = static_cast<GLsizei>(height);
    if (ktx.decodesETC) {
        if (imageSize != QexTextureLoad_ETCSize(width, height)) return wrongSize;
        return QexTextureLoad_UploadDecodedETC(target, l, width, height, data) ? nullptr : noMemory;
    }
    if (ktx.Compressed()) {
        glCompressedTexImage2D(target, l, ktx.internalFormat, w, h, 0, static_cast<GLsizei>(imageSize), data);
        return glGetError() == GL_NO_ERROR ? nullptr : wrongSize;
    }
    const uint32_t alignment = RowAlignment(ktx, width, height, imageSize);
    if (!alignment) return wrongSize;
    QexScratch<uint8_t> swapped;
    if (ktx.swapped && ktx.pixelSize == 2) {
        swapped.Own(CopySwapped(data, imageSize));
        if (!swapped) return noMemory;
        data = swapped.Get();
    }
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, static_cast<GLint>(alignment)));
    QEX_GL(glTexImage2D(target, l, static_cast<GLint>(ktx.baseInternalFormat), w, h, 0, ktx.format, ktx.type,
                        data));
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    return nullptr;
}

// Uploads the levels that the GL takes; false, with a line, when one is not there or not of its size. Where
// some are missing at the end, the GL makes them from level 0, as no filter is set that could do without.
bool UploadLevels(const KTX& ktx, const QexTextureBytes& image) {
    const bool mipmaps = QexTextureLoad_TakesMipmaps(ktx.width, ktx.height);
    const uint32_t levels = ktx.levels && mipmaps ? ktx.levels : 1;
    const bool generate = mipmaps && levels < QexTextureLoad_ChainLength(ktx.width, ktx.height) &&
                          (!ktx.Compressed() || ktx.decodesETC);
    uint64_t at = kHeaderSize + uint64_t{ktx.keyValueBytes};
    for (uint32_t level = 0; level < levels; ++level) {
        const uint64_t left = at < image.size ? image.size - at : 0;
        const uint32_t imageSize = left >= 4 ? ktx.ReadWord(image.bytes + at) : 0;
        const uint64_t padded = (uint64_t{imageSize} + 3) / 4 * 4;
        at += 4;
        for (uint32_t face = 0; face < ktx.faces; ++face, at += padded) {
            if (left < 4 || at + imageSize > image.size || imageSize > INT32_MAX) {
                QexTextureLoad_Refuse(kFunction, "the file is cut short in level %u.", level);
                return false;
            }
            const char* fault = UploadFace(ktx, face, level, image.bytes + at, imageSize);
            if (!fault) continue;
            QexTextureLoad_Refuse(kFunction, "level %u of %u bytes %s.", level, imageSize, fault);
            return false;
        }
        if (level == 0 && generate)
            QexTextureLoad_GenerateMipmaps(ktx.faces == 6 ? GL_TEXTURE_CUBE_MAP : GL_TEXTURE_2D);
    }
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
    if (!ktx.Compressed()) {
        ktx.pixelSize = ktx.baseInternalFormat == ktx.format ? PixelSize(ktx.format, ktx.type) : 0;
        texture->bytesPerPixel = !ktx.pixelSize ? 0 : ktx.format == GL_RGB ? 3 : 4;
        if (!ktx.pixelSize) return -4;
        texture->format = ktx.format == GL_RGB ? QEX_TEXFMT_RGB888 : QEX_TEXFMT_RGBA8888;
    }
    if (!CheckHeader(&ktx)) return -1;
    texture->width = static_cast<int32_t>(ktx.width);
    texture->height = ktx.height;
    QexTextureLoad_Begin(texture, &texture->glName, ktx.faces == 6);
    if (!UploadLevels(ktx, image)) {
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
