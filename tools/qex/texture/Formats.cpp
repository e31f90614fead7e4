// The table of formats, and the pixels of a level in each of them.
#include "texture/Formats.h"

#include <ETC1/etc1.h>
#include <algorithm>

#include "Qex.h"

namespace {

constexpr char kNo555[] = "GL ES 2.0 has no RGB 555";
constexpr char kNoBgra[] = "GL ES 2.0 has no BGRA without an extension";

constexpr const QexPixelFormat* kRows = kQexPixelFormats;

// In the order of the engine's table.
// clang-format off
const PixelFormat kFormats[] = {
    {kRows[kQexFormatETC1], "etc1", "ETC1", false, {}, nullptr},
    {kRows[kQexFormatRGBA8888], "rgba8888", "RGBA 8888", true, {{0, 8}, {8, 8}, {16, 8}, {24, 8}}, nullptr},
    {kRows[kQexFormatRGB888], "rgb888", "RGB 888", false, {{0, 8}, {8, 8}, {16, 8}, {}}, nullptr},
    {kRows[kQexFormatRGBA4444], "rgba4444", "RGBA 4444", true, {{12, 4}, {8, 4}, {4, 4}, {0, 4}}, nullptr},
    {kRows[kQexFormatRGBA5551], "rgba5551", "RGBA 5551", true, {{11, 5}, {6, 5}, {1, 5}, {0, 1}}, nullptr},
    {kRows[kQexFormatRGB565], "rgb565", "RGB 565", false, {{11, 5}, {5, 6}, {0, 5}, {}}, nullptr},
    {kRows[kQexFormatL8], "l8", "luminance 8", false, {{0, 8}, {0, 8}, {0, 8}, {}}, nullptr},
    {kRows[kQexFormatLA88], "la88", "luminance-alpha 88", true, {{0, 8}, {0, 8}, {0, 8}, {8, 8}}, nullptr},
    {kRows[kQexFormatA8], "a8", "alpha 8", true, {{}, {}, {}, {0, 8}}, nullptr},
    {kRows[kQexFormatBGRA8888], nullptr, "BGRA 8888", true, {{16, 8}, {8, 8}, {0, 8}, {24, 8}}, kNoBgra},
    {kRows[kQexFormatRGB555], nullptr, "RGB 555", false, {}, kNo555},
    {kRows[kQexFormatPVRTC2Plain], nullptr, "PVRTC, 2 bits", true, {}, nullptr},
    {kRows[kQexFormatPVRTC4Plain], nullptr, "PVRTC, 4 bits", true, {}, nullptr},
    {kRows[kQexFormatPVRTC2], nullptr, "PVRTC, 2 bits", true, {}, nullptr},
    {kRows[kQexFormatPVRTC4], nullptr, "PVRTC, 4 bits", true, {}, nullptr},
    {kRows[kQexFormatPVRTC2RGB], nullptr, "PVRTC without alpha, 2 bits", false, {}, nullptr},
    {kRows[kQexFormatPVRTC4RGB], nullptr, "PVRTC without alpha, 4 bits", false, {}, nullptr},
};
// clang-format on
static_assert(sizeof kFormats / sizeof *kFormats == kQexFormatCount);

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

const PixelFormat& FormatOf(const QexPixelFormat* row) {
    return kFormats[row - kQexPixelFormats];
}

std::string FormatNames() {
    std::string names;
    for (const PixelFormat& format : kFormats)
        if (format.name) names += (names.empty() ? "" : ", ") + std::string(format.name);
    return names;
}

std::vector<uint8_t> EncodeLevel(const PixelFormat& format, const Image& image) {
    return format.coding == kQexETC1 ? EncodeEtc1(image) : EncodePixels(format, image);
}

Image DecodeLevel(const PixelFormat& format, const uint8_t* data, uint32_t width, uint32_t height,
                  uint64_t rowBytes) {
    Image image;
    image.width = static_cast<int>(width);
    image.height = static_cast<int>(height);
    image.pixels.resize(size_t{width} * height * 4);
    if (format.coding == kQexETC1)
        QexDecompressETC(data, image.width, image.height, image.pixels.data(), 0);
    else if (format.coding == kQexPVRTC)
        QexDecompressPVRTC(data, format.bits == 2, image.width, image.height, image.pixels.data());
    else
        DecodePixels(format, data, rowBytes, &image);
    if (!format.alpha)
        for (size_t i = 3; i < image.pixels.size(); i += 4) image.pixels[i] = 255;
    UpdateHasAlpha(&image);
    return image;
}
