// Reads the headers of KTX files and finds their levels, each of which says how long it is, and their pairs
// of keys and values.
#include "image/Ktx.h"

namespace {

constexpr uint32_t kSwappedEndianness = 0x01020304;  // anything else counts as little-endian
const uint8_t kIdentifier[12] = {0xAB, 'K', 'T', 'X', ' ', '1', '1', 0xBB, '\r', '\n', 0x1A, '\n'};

uint32_t ReadWord(const QexKtx& ktx, const uint8_t* bytes) {
    const uint32_t word = QexImage_ReadWord(bytes);
    return ktx.swapped ? __builtin_bswap32(word) : word;
}

uint64_t Padded(uint64_t bytes) {
    return (bytes + 3) / 4 * 4;
}

// Bytes of a row in a level of `bytes` bytes: rows padded to 4 bytes, as the format asks, or tight, as some
// writers have it. 0 when the level is neither, and for blocks that are not of their size.
uint64_t RowBytes(const QexPixelFormat& format, uint32_t width, uint32_t height, uint32_t bytes) {
    const uint64_t tight = uint64_t{width} * format.bits / 8;
    if (format.coding != kQexPixels) return bytes == QexFormat_LevelBytes(format, width, height);
    return bytes == Padded(tight) * height ? Padded(tight) : bytes == tight * height ? tight : 0;
}

// Reads a level's place; false when the file ends before its data does. The padding behind the last face may
// be missing.
bool FindLevel(QexKtx* ktx, const QexImageBytes& file, uint64_t at, uint32_t index) {
    QexImage& image = ktx->image;
    if (at > file.size || file.size - at < 4) return false;
    const uint32_t bytes = ReadWord(*ktx, file.bytes + at);
    const uint32_t width = QexImage_SideAtLevel(image.width, index),
                   height = QexImage_SideAtLevel(image.height, index);
    const uint64_t row = image.format ? RowBytes(*image.format, width, height, bytes) : 0;
    image.levels[index] = {width, height, at + 4, Padded(bytes), bytes, row};
    return bytes <= INT32_MAX && at + 4 + (image.faces - 1) * Padded(bytes) + bytes <= file.size;
}

}  // namespace

bool QexKtx_Is(const QexImageBytes& file) {
    return file.size >= sizeof kIdentifier && memcmp(file.bytes, kIdentifier, sizeof kIdentifier) == 0;
}

bool QexKtx_ReadHeader(QexKtx* ktx, const QexImageBytes& file) {
    memset(ktx, 0, sizeof *ktx);
    if (file.size < kQexKtxHeaderSize) return false;
    QexKtxHeader& header = ktx->header;
    QexImage& image = ktx->image;
    ktx->swapped = QexImage_ReadWord(file.bytes + 12) == kSwappedEndianness;
    uint32_t words[sizeof header / 4];
    for (uint32_t i = 0; i < sizeof header / 4; ++i) words[i] = ReadWord(*ktx, file.bytes + 16 + 4 * i);
    memcpy(&header, words, sizeof header);
    image.format = ktx->IsCompressed() ? QexFormat_FindCompressed(header.glInternalFormat)
                                       : QexFormat_FindPixels(header.glFormat, header.glType);
    image.width = header.width;
    image.height = header.height;
    // A picture of no faces is a picture, one of no levels has one.
    image.faces = header.faces ? header.faces : 1;
    image.levelCount = header.levels ? header.levels : 1;
    if (image.faces != 1 && image.faces != 6) image.faults |= kQexFaultFaces;
    QexImage_JudgeSize(&image);
    return true;
}

bool QexKtx_FindLevels(QexKtx* ktx, const QexImageBytes& file, uint32_t wanted) {
    QexImage& image = ktx->image;
    uint64_t at = kQexKtxHeaderSize + uint64_t{ktx->header.keyValueBytes};
    image.levelCount = 0;
    for (uint32_t i = 0; i < wanted; ++i) {
        const QexImageLevel& level = image.levels[i];
        const bool complete = FindLevel(ktx, file, at, i);
        const bool sound = !image.format || level.rowBytes;
        ktx->faultLevel = i;
        if (i > 0 && level.offset && !sound) {
            // The level before may have been read with its rows shifted.
            const bool shifted =
                !ktx->IsCompressed() && image.levels[i - 1].width * image.format->bits / 8 % 4;
            image.faults |= kQexFaultLevelSize;
            image.levelCount = shifted && i > 1 ? i - 1 : i;
            return true;
        }
        if (!complete || !sound) {
            image.faults |= complete ? kQexFaultLevelSize : kQexFaultCut;
            return false;
        }
        at = level.offset + image.faces * level.stride;
        image.levelCount = i + 1;
    }
    return true;
}

bool QexKtx_ReadPair(const QexKtx& ktx, const QexImageBytes& file, uint64_t* at, QexKtxPair* pair) {
    const uint64_t told = kQexKtxHeaderSize + uint64_t{ktx.header.keyValueBytes};
    const uint64_t end = told < file.size ? told : file.size;
    if (*at + 4 > end) return false;
    const uint64_t length = ReadWord(ktx, file.bytes + *at);
    const char* text = reinterpret_cast<const char*>(file.bytes) + *at + 4;
    if (length > end - *at - 4) return false;
    const uint64_t keyBytes = strnlen(text, static_cast<size_t>(length)) + 1;
    if (keyBytes > length) return false;
    *pair = {text, text + keyBytes, length - keyBytes};
    *at += 4 + Padded(length);
    return true;
}

bool QexKtx_IsTopFirst(const QexKtx& ktx, const QexImageBytes& file) {
    static const char up[] = "S=r,T=u";
    QexKtxPair pair;
    for (uint64_t at = kQexKtxHeaderSize; QexKtx_ReadPair(ktx, file, &at, &pair);)
        if (strcmp(pair.key, "KTXorientation") == 0 && pair.valueBytes >= sizeof up - 1 &&
            memcmp(pair.value, up, sizeof up - 1) == 0)
            return false;
    return true;
}
