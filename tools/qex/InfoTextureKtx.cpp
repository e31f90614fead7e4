#include <algorithm>
#include <cstdio>
#include <cstring>

#include "Info.h"

namespace {

constexpr size_t kHeader = 64;
constexpr size_t kMostPairs = 1000;  // key and value pairs that are listed
constexpr uint32_t kNativeEndianness = 0x04030201;
const uint8_t kIdentifier[12] = {0xAB, 'K', 'T', 'X', ' ', '1', '1', 0xBB, '\r', '\n', 0x1A, '\n'};

constexpr uint32_t kUnsignedByte = 0x1401, kRgb = 0x1907, kRgba = 0x1908;
constexpr uint32_t k4444 = 0x8033, k5551 = 0x8034, k565 = 0x8363, kEtc1 = 0x8D64;

const struct {
    uint32_t value;
    const char* name;
} kGlNames[] = {
    {kUnsignedByte, "GL_UNSIGNED_BYTE"},
    {0x1403, "GL_UNSIGNED_SHORT"},
    {0x1405, "GL_UNSIGNED_INT"},
    {0x1406, "GL_FLOAT"},
    {0x140B, "GL_HALF_FLOAT"},
    {0x1903, "GL_RED"},
    {0x1906, "GL_ALPHA"},
    {kRgb, "GL_RGB"},
    {kRgba, "GL_RGBA"},
    {0x1909, "GL_LUMINANCE"},
    {0x190A, "GL_LUMINANCE_ALPHA"},
    {k4444, "GL_UNSIGNED_SHORT_4_4_4_4"},
    {k5551, "GL_UNSIGNED_SHORT_5_5_5_1"},
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
    {k565, "GL_UNSIGNED_SHORT_5_6_5"},
    {0x8C00, "GL_COMPRESSED_RGB_PVRTC_4BPPV1"},
    {0x8C01, "GL_COMPRESSED_RGB_PVRTC_2BPPV1"},
    {0x8C02, "GL_COMPRESSED_RGBA_PVRTC_4BPPV1"},
    {0x8C03, "GL_COMPRESSED_RGBA_PVRTC_2BPPV1"},
    {0x8C40, "GL_SRGB"},
    {0x8C41, "GL_SRGB8"},
    {0x8C43, "GL_SRGB8_ALPHA8"},
    {0x8D62, "GL_RGB565"},
    {kEtc1, "GL_ETC1_RGB8_OES"},
    {0x9274, "GL_COMPRESSED_RGB8_ETC2"},
    {0x9278, "GL_COMPRESSED_RGBA8_ETC2_EAC"},
};

// "GL_RGBA (0x1908)"; "0" for 0.
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

struct Ktx {
    const std::vector<uint8_t>& file;
    bool swapped;
    uint32_t glType, glTypeSize, glFormat, glInternalFormat, glBaseInternalFormat;
    uint32_t width, height, depth, arrayElements, faces, levels, keyValueBytes;

    bool Compressed() const { return !glType || !glFormat; }
    uint32_t Word(uint64_t at) const {
        const uint32_t word = ReadLE32(file, static_cast<size_t>(at));
        if (!swapped) return word;
        return word >> 24 | (word >> 8 & 0xFF00) | (word << 8 & 0xFF0000) | word << 24;
    }
};

Ktx ReadHeader(const std::vector<uint8_t>& file) {
    Ktx ktx = {file, ReadLE32(file, 12) != kNativeEndianness, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};
    uint32_t* const fields[] = {
        &ktx.glType, &ktx.glTypeSize,   &ktx.glFormat, &ktx.glInternalFormat, &ktx.glBaseInternalFormat,
        &ktx.width,  &ktx.height,       &ktx.depth,    &ktx.arrayElements,    &ktx.faces,
        &ktx.levels, &ktx.keyValueBytes};
    uint64_t at = 16;
    for (uint32_t* field : fields) {
        *field = ktx.Word(at);
        at += 4;
    }
    return ktx;
}

// Bytes of a pixel as the engine takes them, 0 for a format that it does not take.
uint32_t PixelBytes(const Ktx& ktx) {
    if (ktx.glBaseInternalFormat != ktx.glFormat) return 0;
    if (ktx.glFormat == kRgb) return ktx.glType == kUnsignedByte ? 3 : ktx.glType == k565 ? 2 : 0;
    if (ktx.glFormat != kRgba) return 0;
    return ktx.glType == kUnsignedByte ? 4 : ktx.glType == k4444 || ktx.glType == k5551 ? 2 : 0;
}

// Whether a level's bytes are those of its size; rows may be padded to 4 bytes or not.
bool RightSize(const Ktx& ktx, uint32_t width, uint32_t height, uint32_t bytes) {
    if (ktx.Compressed())
        return ktx.glInternalFormat != kEtc1 || bytes == uint64_t{(width + 3) / 4} * ((height + 3) / 4) * 8;
    const uint64_t row = uint64_t{width} * PixelBytes(ktx);
    return bytes == row * height || bytes == (row + 3) / 4 * 4 * height;
}

// Adds the levels that are there and returns what is wrong with them.
std::string DescribeLevels(const Ktx& ktx, Json* list) {
    uint64_t at = kHeader + uint64_t{ktx.keyValueBytes};
    const uint64_t size = ktx.file.size();
    const uint32_t count = std::max(ktx.levels, 1u);
    for (uint32_t level = 0; level < count && level < 32; ++level) {
        if (at + 4 > size) return "cut short in level " + std::to_string(level);
        const uint32_t width = std::max(ktx.width >> level, 1u), height = std::max(ktx.height >> level, 1u);
        const uint32_t bytes = ktx.Word(at);
        list->push_back({{"width", width}, {"height", height}, {"bytes", bytes}});
        // The padding behind the last face may be missing.
        const uint64_t padded = (uint64_t{bytes} + 3) / 4 * 4;
        if (at + 4 + (ktx.faces - 1) * padded + bytes > size)
            return "cut short in level " + std::to_string(level);
        if (!RightSize(ktx, width, height, bytes))
            return "level " + std::to_string(level) + " of " + std::to_string(bytes) +
                   " bytes is not of its size";
        at += 4 + ktx.faces * padded;
    }
    return "";
}

// Why the engine does not take the file, judged by its header; empty when it may.
std::string Refusal(const Ktx& ktx) {
    if (!ktx.Compressed() && !PixelBytes(ktx))
        return "it takes RGB and RGBA pixels of bytes or of 16 bits, not " + GlName(ktx.glFormat) + " of " +
               GlName(ktx.glType);
    if (ktx.swapped) return "it is in the other byte order";
    if (ktx.faces != 1 && ktx.faces != 6) return std::to_string(ktx.faces) + " faces instead of 1 or 6";
    if (!ktx.width || !ktx.height) return "it has no pixels of two dimensions";
    if (ktx.faces == 6 && ktx.width != ktx.height) return "the faces of its cube map are not square";
    if (ktx.levels > FullChain(ktx.width, ktx.height)) return "more mipmap levels than its size has";
    return "";
}

// Key and value pairs as far as they are whole; values that are no text are given by their length.
Json KeyValues(const Ktx& ktx) {
    Json pairs = Json::array();
    const uint64_t end = std::min<uint64_t>(ktx.file.size(), kHeader + uint64_t{ktx.keyValueBytes});
    for (uint64_t at = kHeader; at + 4 <= end && pairs.size() < kMostPairs;) {
        const uint64_t length = ktx.Word(at);
        at += 4;
        if (length > end - at) break;
        const std::string pair(ktx.file.begin() + static_cast<long>(at),
                               ktx.file.begin() + static_cast<long>(at + length));
        const size_t zero = pair.find('\0');
        if (zero == std::string::npos) break;
        std::string value = pair.substr(zero + 1);
        while (!value.empty() && value.back() == '\0') value.pop_back();
        if (value.find('\0') != std::string::npos) value = std::to_string(length - zero - 1) + " bytes";
        pairs.push_back({{"key", CleanText(pair.substr(0, zero))}, {"value", CleanText(value)}});
        at += (length + 3) / 4 * 4;
    }
    return pairs;
}

}  // namespace

bool IsKtx(const std::vector<uint8_t>& start) {
    return start.size() >= sizeof kIdentifier && memcmp(start.data(), kIdentifier, sizeof kIdentifier) == 0;
}

bool DescribeKtx(const std::vector<uint8_t>& file, Json* document, std::string* error) {
    if (file.size() < kHeader) {
        *error = "is cut short in the header of a KTX texture";
        return false;
    }
    const Ktx ktx = ReadHeader(file);
    Json levels = Json::array();
    std::string refusal = Refusal(ktx);
    if (refusal.empty()) refusal = DescribeLevels(ktx, &levels);
    document->update({{"format", "KTX"},
                      {"bytes", file.size()},
                      {"byteOrder", ktx.swapped ? "the other" : "little-endian"},
                      {"glType", GlName(ktx.glType)},
                      {"glTypeSize", ktx.glTypeSize},
                      {"glFormat", GlName(ktx.glFormat)},
                      {"glInternalFormat", GlName(ktx.glInternalFormat)},
                      {"glBaseInternalFormat", GlName(ktx.glBaseInternalFormat)},
                      {"width", ktx.width},
                      {"height", ktx.height},
                      {"depth", ktx.depth},
                      {"arrayElements", ktx.arrayElements},
                      {"cubeMap", ktx.faces == 6},
                      {"faces", ktx.faces},
                      {"levels", ktx.levels},
                      {"keyValueBytes", ktx.keyValueBytes},
                      {"keyValues", KeyValues(ktx)},
                      {"levelSizes", levels},
                      {"loads", refusal.empty()},
                      {"problems", Json::array()}});
    Json& problems = (*document)["problems"];
    if (!refusal.empty()) problems.push_back("the engine refuses it: " + refusal);
    if (refusal.empty() && ktx.Compressed() && ktx.glInternalFormat != kEtc1)
        problems.push_back("only a GL with the extension takes " + GlName(ktx.glInternalFormat));
    if (ktx.depth > 1 || ktx.arrayElements > 0)
        problems.push_back("only the first picture is read of a volume or an array");
    return true;
}
