#include <algorithm>
#include <cstdio>
#include <cstring>

#include "texture/Container.h"

namespace {

constexpr uint32_t kSwappedEndianness = 0x01020304;  // anything else counts as little-endian
const uint8_t kIdentifier[12] = {0xAB, 'K', 'T', 'X', ' ', '1', '1', 0xBB, '\r', '\n', 0x1A, '\n'};
constexpr uint32_t kRgb = 0x1907, kRgba = 0x1908;

const struct {
    uint32_t value;
    const char* name;
} kGlNames[] = {
    {0x1401, "GL_UNSIGNED_BYTE"},
    {0x1403, "GL_UNSIGNED_SHORT"},
    {0x1405, "GL_UNSIGNED_INT"},
    {0x1406, "GL_FLOAT"},
    {0x140B, "GL_HALF_FLOAT"},
    {0x1903, "GL_RED"},
    {0x1906, "GL_ALPHA"},
    {0x1907, "GL_RGB"},
    {0x1908, "GL_RGBA"},
    {0x1909, "GL_LUMINANCE"},
    {0x190A, "GL_LUMINANCE_ALPHA"},
    {0x8033, "GL_UNSIGNED_SHORT_4_4_4_4"},
    {0x8034, "GL_UNSIGNED_SHORT_5_5_5_1"},
    {0x8051, "GL_RGB8"},
    {0x8056, "GL_RGBA4"},
    {0x8057, "GL_RGB5_A1"},
    {0x8058, "GL_RGBA8"},
    {0x80E1, "GL_BGRA"},
    {0x8227, "GL_RG"},
    {0x8229, "GL_R8"},
    {0x83F0, "GL_COMPRESSED_RGB_S3TC_DXT1"},
    {0x83F1, "GL_COMPRESSED_RGBA_S3TC_DXT1"},
    {0x83F2, "GL_COMPRESSED_RGBA_S3TC_DXT3"},
    {0x83F3, "GL_COMPRESSED_RGBA_S3TC_DXT5"},
    {0x8363, "GL_UNSIGNED_SHORT_5_6_5"},
    {0x8C00, "GL_COMPRESSED_RGB_PVRTC_4BPPV1"},
    {0x8C01, "GL_COMPRESSED_RGB_PVRTC_2BPPV1"},
    {0x8C02, "GL_COMPRESSED_RGBA_PVRTC_4BPPV1"},
    {0x8C03, "GL_COMPRESSED_RGBA_PVRTC_2BPPV1"},
    {0x8C40, "GL_SRGB"},
    {0x8C41, "GL_SRGB8"},
    {0x8C43, "GL_SRGB8_ALPHA8"},
    {0x8D62, "GL_RGB565"},
    {0x8D64, "GL_ETC1_RGB8_OES"},
    {0x9274, "GL_COMPRESSED_RGB8_ETC2"},
    {0x9278, "GL_COMPRESSED_RGBA8_ETC2_EAC"},
};

uint32_t Swapped(uint32_t word) {
    return word >> 24 | (word >> 8 & 0xFF00) | (word << 8 & 0xFF0000) | word << 24;
}

// Bytes of a row in a level of `bytes` bytes: rows padded to 4 bytes, as the format asks, or tight, as some
// writers have it. 0 when the level is neither, and for blocks that are not of their size.
uint64_t RowBytes(const PixelFormat& format, uint32_t width, uint32_t height, uint32_t bytes) {
    const uint64_t tight = uint64_t{width} * format.bits / 8, padded = (tight + 3) / 4 * 4;
    if (format.Compressed()) return bytes == LevelBytes(format, width, height) ? 1 : 0;
    return bytes == padded * height ? padded : bytes == tight * height ? tight : 0;
}

// What is wrong with a file whatever reads it.
std::string KtxFault(const KtxFile& ktx) {
    if (ktx.faces != 1 && ktx.faces != 6) return std::to_string(ktx.faces) + " faces instead of 1 or 6";
    if (!ktx.width || !ktx.height) return "it has no pixels of two dimensions";
    return SizeFault(ktx.format, ktx.width, ktx.height, ktx.faces == 6, std::max(ktx.levels, 1u));
}

// Turns 16-bit pixels into the order of this machine.
void SwapPixels(const Texture& texture, TextureBytes* file) {
    for (const TextureLevel& level : texture.levels)
        for (const uint64_t face : level.faces)
            for (uint64_t at = face; at + 1 < face + level.bytes; at += 2)
                std::swap((*file)[static_cast<size_t>(at)], (*file)[static_cast<size_t>(at + 1)]);
}

}  // namespace

std::string GlName(uint32_t value) {
    char text[64];
    if (!value) return "0";
    for (const auto& known : kGlNames) {
        if (known.value != value) continue;
        snprintf(text, sizeof text, "%s (0x%04X)", known.name, value);
        return text;
    }
    snprintf(text, sizeof text, "0x%04X", value);
    return text;
}

bool IsKtx(const TextureBytes& start) {
    return start.size() >= sizeof kIdentifier && memcmp(start.data(), kIdentifier, sizeof kIdentifier) == 0;
}

uint32_t KtxWord(const TextureBytes& file, const KtxFile& ktx, uint64_t at) {
    const uint32_t word = ReadLE32(file, static_cast<size_t>(at));
    return ktx.swapped ? Swapped(word) : word;
}

bool ReadKtxHeader(const TextureBytes& file, KtxFile* ktx) {
    if (file.size() < kKtxHeaderBytes) return false;
    uint32_t* const fields[] = {
        &ktx->glType, &ktx->glTypeSize,   &ktx->glFormat, &ktx->glInternalFormat, &ktx->glBaseInternalFormat,
        &ktx->width,  &ktx->height,       &ktx->depth,    &ktx->arrayElements,    &ktx->faces,
        &ktx->levels, &ktx->keyValueBytes};
    ktx->swapped = ReadLE32(file, 12) == kSwappedEndianness;
    uint64_t at = 16;
    for (uint32_t* field : fields) {
        *field = KtxWord(file, *ktx, at);
        at += 4;
    }
    if (!ktx->faces) ktx->faces = 1;  // a picture of no faces is a picture
    ktx->format = FindKtxFormat(ktx->glFormat, ktx->glType, ktx->glInternalFormat);
    return true;
}

// As the engine does it: where a level is not of its size, those before it stay, but one whose rows may have
// been read shifted.
std::string FindKtxLevels(const TextureBytes& file, const KtxFile& ktx, std::vector<TextureLevel>* levels) {
    uint64_t at = kKtxHeaderBytes + uint64_t{ktx.keyValueBytes};
    const uint64_t size = file.size();
    for (uint32_t i = 0; i < std::max(ktx.levels, 1u); ++i) {
        if (at + 4 > size) return "cut short in level " + std::to_string(i);
        const uint32_t width = std::max(ktx.width >> i, 1u), height = std::max(ktx.height >> i, 1u);
        const uint32_t bytes = KtxWord(file, ktx, at);
        TextureLevel level = {width, height, bytes, 0, {}};
        const uint64_t padded = (uint64_t{bytes} + 3) / 4 * 4;
        for (uint32_t face = 0; face < ktx.faces; ++face) level.faces.push_back(at + 4 + face * padded);
        if (ktx.format) level.rowBytes = RowBytes(*ktx.format, width, height, bytes);
        if (i > 0 && ktx.format && !level.rowBytes) {
            const bool shifted = !ktx.Compressed() && levels->back().width * ktx.format->bits / 8 % 4;
            if (shifted && i > 1) levels->pop_back();
            return "";
        }
        levels->push_back(level);
        // The padding behind the last face may be missing.
        if (level.faces.back() + bytes > size) return "cut short in level " + std::to_string(i);
        if (ktx.format && !level.rowBytes)
            return "level " + std::to_string(i) + " of " + std::to_string(bytes) +
                   " bytes is not of its size";
        at += 4 + ktx.faces * padded;
    }
    return "";
}

std::string KtxRefusal(const KtxFile& ktx) {
    const bool takesPixels = ktx.format && (ktx.glFormat == kRgb || ktx.glFormat == kRgba) &&
                             ktx.glBaseInternalFormat == ktx.glFormat;
    if (!ktx.Compressed() && !takesPixels)
        return "it takes RGB and RGBA pixels of bytes or of 16 bits, not " + GlName(ktx.glFormat) + " of " +
               GlName(ktx.glType) +
               (ktx.glBaseInternalFormat == ktx.glFormat ? "" : " as " + GlName(ktx.glBaseInternalFormat));
    return KtxFault(ktx);
}

bool ReadKtx(TextureBytes* file, Texture* texture, std::string* error) {
    KtxFile ktx;
    if (!ReadKtxHeader(*file, &ktx)) {
        *error = "is cut short in the header of a KTX texture";
        return false;
    }
    if (!ktx.format)
        *error = ktx.Compressed()
                     ? "the compressed format " + GlName(ktx.glInternalFormat) + " is not read"
                     : "pixels of " + GlName(ktx.glFormat) + " and " + GlName(ktx.glType) + " are not read";
    else if (ktx.depth > 1 || ktx.arrayElements > 0)
        *error = "volumes and arrays are not read";
    else
        *error = KtxFault(ktx);
    if (error->empty()) *error = FindKtxLevels(*file, ktx, &texture->levels);
    if (!error->empty()) return false;
    texture->format = ktx.format;
    if (ktx.swapped && ktx.glTypeSize == 2) SwapPixels(*texture, file);
    return true;
}
