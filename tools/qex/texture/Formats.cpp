#include "texture/Formats.h"

#include <ETC1/etc1.h>
#include <algorithm>

#include "Qex.h"

namespace {

constexpr auto kPixels = PixelFormat::kPixels;
constexpr auto kPvrtc = PixelFormat::kPvrtc;

constexpr uint32_t kByte = 0x1401, k4444 = 0x8033, k5551 = 0x8034, k565 = 0x8363;
constexpr uint32_t kAlpha = 0x1906, kRgb = 0x1907, kRgba = 0x1908, kLuminance = 0x1909,
                   kLuminanceAlpha = 0x190A, kBgra = 0x80E1;

constexpr char kNo555[] = "GL ES 2.0 has no RGB 555";
constexpr char kNoBgra[] = "GL ES 2.0 has no BGRA without an extension";

// clang-format off
const PixelFormat kFormats[] = {
    {"etc1", "ETC1", 0x36, 4, PixelFormat::kEtc1, false, {}, 0, 0, 0x8D64, nullptr},
    {"rgba8888", "RGBA 8888", 0x12, 32, kPixels, true, {{0, 8}, {8, 8}, {16, 8}, {24, 8}}, kRgba, kByte, 0x8058, nullptr},
    {"rgb888", "RGB 888", 0x15, 24, kPixels, false, {{0, 8}, {8, 8}, {16, 8}, {}}, kRgb, kByte, 0x8051, nullptr},
    {"rgba4444", "RGBA 4444", 0x10, 16, kPixels, true, {{12, 4}, {8, 4}, {4, 4}, {0, 4}}, kRgba, k4444, 0x8056, nullptr},
    {"rgba5551", "RGBA 5551", 0x11, 16, kPixels, true, {{11, 5}, {6, 5}, {1, 5}, {0, 1}}, kRgba, k5551, 0x8057, nullptr},
    {"rgb565", "RGB 565", 0x13, 16, kPixels, false, {{11, 5}, {5, 6}, {0, 5}, {}}, kRgb, k565, 0x8D62, nullptr},
    {"l8", "luminance 8", 0x16, 8, kPixels, false, {{0, 8}, {0, 8}, {0, 8}, {}}, kLuminance, kByte, kLuminance, nullptr},
    {"la88", "luminance-alpha 88", 0x17, 16, kPixels, true, {{0, 8}, {0, 8}, {0, 8}, {8, 8}}, kLuminanceAlpha, kByte, kLuminanceAlpha, nullptr},
    {"a8", "alpha 8", 0x1B, 8, kPixels, true, {{}, {}, {}, {0, 8}}, kAlpha, kByte, kAlpha, nullptr},
    {nullptr, "BGRA 8888", 0x1A, 32, kPixels, true, {{16, 8}, {8, 8}, {0, 8}, {24, 8}}, kBgra, kByte, kBgra, kNoBgra},
    {nullptr, "RGB 555", 0x14, 16, PixelFormat::kUnread, false, {}, 0, 0, 0, kNo555},
    {nullptr, "PVRTC, 2 bits", 0x0C, 2, kPvrtc, true, {}, 0, 0, 0, nullptr},
    {nullptr, "PVRTC, 4 bits", 0x0D, 4, kPvrtc, true, {}, 0, 0, 0, nullptr},
    {nullptr, "PVRTC, 2 bits", 0x18, 2, kPvrtc, true, {}, 0, 0, 0x8C03, nullptr},
    {nullptr, "PVRTC, 4 bits", 0x19, 4, kPvrtc, true, {}, 0, 0, 0x8C02, nullptr},
    {nullptr, "PVRTC without alpha, 2 bits", kNoPvrType, 2, kPvrtc, false, {}, 0, 0, 0x8C01, nullptr},
    {nullptr, "PVRTC without alpha, 4 bits", kNoPvrType, 4, kPvrtc, false, {}, 0, 0, 0x8C00, nullptr},
};
// clang-format on

uint32_t Rounded(uint32_t value, uint32_t from, uint32_t to) {
    return (value * to + from / 2) / from;
}

bool IsLuminance(const PixelFormat& format) {
    return format.channels[0].bits && format.channels[0].shift == format.channels[1].shift;
}

// Rec. 601; what is grey stays as it is.
uint8_t Luminance(const uint8_t* rgba) {
    return static_cast<uint8_t>((299 * rgba[0] + 587 * rgba[1] + 114 * rgba[2] + 500) / 1000);
}

std::vector<uint8_t> EncodePixels(const PixelFormat& format, const Image& image) {
    std::vector<uint8_t> bytes;
    bytes.reserve(image.pixels.size() / 4 * (format.bits / 8));
    for (size_t i = 0; i < image.pixels.size(); i += 4) {
        const uint8_t* rgba = &image.pixels[i];
        uint32_t word = 0;
        for (int c = 0; c < 4; ++c) {
            const auto [shift, bits] = format.channels[c];
            const uint32_t value = c < 3 && IsLuminance(format) ? Luminance(rgba) : rgba[c];
            word |= Rounded(value, 255, (1u << bits) - 1) << shift;
        }
        for (uint32_t shift = 0; shift < format.bits; shift += 8)
            bytes.push_back(static_cast<uint8_t>(word >> shift));
    }
    return bytes;
}

// Blocks that reach beyond the picture repeat its edge: etc1_encode_image takes what it finds there into
// their colours.
std::vector<uint8_t> EncodeEtc1(const Image& image) {
    const int width = (image.width + 3) / 4 * 4, height = (image.height + 3) / 4 * 4;
    std::vector<uint8_t> rgb;
    rgb.reserve(static_cast<size_t>(width) * static_cast<size_t>(height) * 3);
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
            const uint8_t* pixel = image.Pixel(std::min(x, image.width - 1), std::min(y, image.height - 1));
            rgb.insert(rgb.end(), pixel, pixel + 3);
        }
    const auto w = static_cast<etc1_uint32>(width), h = static_cast<etc1_uint32>(height);
    std::vector<uint8_t> blocks(etc1_get_encoded_data_size(w, h));
    etc1_encode_image(rgb.data(), w, h, 3, w * 3, blocks.data());
    return blocks;
}

void DecodePixels(const PixelFormat& format, const uint8_t* data, uint64_t rowBytes, Image* image) {
    uint8_t* out = image->pixels.data();
    for (int y = 0; y < image->height; ++y, data += rowBytes) {
        const uint8_t* in = data;
        for (int x = 0; x < image->width; ++x) {
            uint32_t word = 0;
            for (uint32_t shift = 0; shift < format.bits; shift += 8) word |= uint32_t{*in++} << shift;
            for (const auto& [shift, bits] : format.channels) {
                const uint32_t most = (1u << bits) - 1;
                *out++ = static_cast<uint8_t>(bits ? Rounded(word >> shift & most, most, 255) : 255);
            }
        }
    }
}

}  // namespace

const PixelFormat* FindFormat(const std::string& name) {
    for (const PixelFormat& format : kFormats)
        if (format.name && name == format.name) return &format;
    return nullptr;
}

const PixelFormat* FindPvrFormat(uint32_t pvrType) {
    for (const PixelFormat& format : kFormats)
        if (format.pvrType == pvrType) return &format;
    return nullptr;
}

const PixelFormat* FindKtxFormat(uint32_t glFormat, uint32_t glType, uint32_t glInternalFormat) {
    const bool compressed = !glFormat || !glType;
    for (const PixelFormat& format : kFormats) {
        if (!format.glInternalFormat || format.Compressed() != compressed) continue;
        if (compressed ? format.glInternalFormat == glInternalFormat
                       : format.glFormat == glFormat && format.glType == glType)
            return &format;
    }
    return nullptr;
}

std::string FormatNames() {
    std::string names;
    for (const PixelFormat& format : kFormats)
        if (format.name) names += (names.empty() ? "" : ", ") + std::string(format.name);
    return names;
}

uint64_t LevelBytes(const PixelFormat& format, uint32_t width, uint32_t height) {
    if (format.coding == PixelFormat::kEtc1) return uint64_t{(width + 3) / 4} * ((height + 3) / 4) * 8;
    if (format.coding == kPvrtc)
        return uint64_t{std::max(width, format.bits == 2 ? 16u : 8u)} * std::max(height, 8u) * format.bits /
               8;
    return uint64_t{width} * height * format.bits / 8;
}

std::vector<uint8_t> EncodeLevel(const PixelFormat& format, const Image& image) {
    return format.coding == PixelFormat::kEtc1 ? EncodeEtc1(image) : EncodePixels(format, image);
}

Image DecodeLevel(const PixelFormat& format, const uint8_t* data, uint32_t width, uint32_t height,
                  uint64_t rowBytes) {
    Image image;
    image.width = static_cast<int>(width);
    image.height = static_cast<int>(height);
    image.pixels.resize(size_t{width} * height * 4);
    if (format.coding == PixelFormat::kEtc1)
        QexDecompressETC(data, image.width, image.height, image.pixels.data(), 0);
    else if (format.coding == kPvrtc)
        QexDecompressPVRTC(data, format.bits == 2, image.width, image.height, image.pixels.data());
    else
        DecodePixels(format, data, rowBytes, &image);
    if (!format.alpha)
        for (size_t i = 3; i < image.pixels.size(); i += 4) image.pixels[i] = 255;
    UpdateHasAlpha(&image);
    return image;
}
