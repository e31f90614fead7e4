// The software decoders, as the library has them and once more without SIMD.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <random>
#include <vector>

#include <ETC1/etc1.h>

#include "Qex.h"

// The same sources, compiled with QEX_PORTABLE_LANES.
extern "C" int32_t PortableDecompressETC(const void*, int32_t, int32_t, void*, int32_t);
extern "C" void PortableDecompressPVRTC(const void*, int32_t, int32_t, int32_t, void*);

namespace {

using Bytes = std::vector<uint8_t>;
using Pixel = std::array<int, 4>;

struct Decoders {
    const char* name;
    decltype(&QexDecompressETC) etc;
    decltype(&QexDecompressPVRTC) pvrtc;
};

void PrintTo(const Decoders& decoders, std::ostream* stream) {
    *stream << decoders.name;
}

Bytes Random(size_t count, uint32_t seed) {
    std::minstd_rand random(seed + 1);
    Bytes bytes(count);
    for (uint8_t& byte : bytes) byte = static_cast<uint8_t>(random() >> 9);
    return bytes;
}

Pixel At(const Bytes& pixels, int width, int x, int y) {
    const uint8_t* pixel = &pixels[static_cast<size_t>(4 * (y * width + x))];
    return {pixel[0], pixel[1], pixel[2], pixel[3]};
}

size_t PixelBytes(int width, int height) {
    return static_cast<size_t>(4 * width * height);
}

class Decoder : public testing::TestWithParam<Decoders> {
  protected:
    Bytes Etc(const Bytes& blocks, int width, int height) {
        Bytes pixels(PixelBytes(width, height));
        const int32_t used = GetParam().etc(blocks.data(), width, height, pixels.data(), 0);
        EXPECT_EQ(used, static_cast<int32_t>(blocks.size()));
        return pixels;
    }
    Bytes Pvrtc(const Bytes& words, bool twoBits, int width, int height) {
        Bytes pixels(PixelBytes(width, height));
        GetParam().pvrtc(words.data(), twoBits, width, height, pixels.data());
        return pixels;
    }
};

INSTANTIATE_TEST_SUITE_P(, Decoder,
                         testing::Values(Decoders{"Library", QexDecompressETC, QexDecompressPVRTC},
                                         Decoders{"Portable", PortableDecompressETC,
                                                  PortableDecompressPVRTC}),
                         [](const auto& test) { return test.param.name; });

TEST_P(Decoder, EtcIsWhatLibETC1Decodes) {
    std::vector<std::pair<int, int>> sizes = {{128, 64}};
    for (int width = 1; width <= 12; ++width)
        for (int height = 1; height <= 12; ++height) sizes.push_back({width, height});
    for (const auto& [width, height] : sizes) {
        const auto blocks = static_cast<size_t>((width + 3) / 4 * ((height + 3) / 4));
        const Bytes source = Random(8 * blocks, static_cast<uint32_t>(100 * width + height));
        const Bytes pixels = Etc(source, width, height);
        Bytes rgb(static_cast<size_t>(3 * width * height)), expected;
        const auto w = static_cast<etc1_uint32>(width), h = static_cast<etc1_uint32>(height);
        ASSERT_EQ(etc1_decode_image(source.data(), rgb.data(), w, h, 3, 3 * w), 0);
        for (size_t i = 0; i < rgb.size(); i += 3)
            expected.insert(expected.end(), {rgb[i], rgb[i + 1], rgb[i + 2], 255});
        ASSERT_TRUE(pixels == expected) << width << " x " << height;
    }
}

TEST_P(Decoder, PvrtcExampleByHand) {
    const Bytes words = {0x9F, 0x12, 0x36, 0xB8, 0x84, 0x14, 0xCF, 0xB5, 0xBB, 0x16, 0xF9,
                         0x3C, 0x73, 0xA7, 0x8F, 0x13, 0x03, 0x86, 0x44, 0x4F, 0x4D, 0xEE,
                         0x4D, 0x07, 0x87, 0x84, 0xE8, 0x74, 0x1D, 0x10, 0x88, 0x4C};
    const Bytes pixels = Pvrtc(words, false, 8, 8);
    EXPECT_EQ(At(pixels, 8, 0, 0), (Pixel{119, 115, 185, 106}));
    EXPECT_EQ(At(pixels, 8, 1, 3), (Pixel{99, 125, 143, 142}));
    EXPECT_EQ(At(pixels, 8, 5, 2), (Pixel{148, 112, 145, 131}));
}

// Checksums (FNV-1a) of what a decoder made that works out every pixel by itself, from the definition: of
// noise, for each width the images of all heights.
TEST_P(Decoder, PvrtcIsWhatAPlainDecoderMade) {
    constexpr uint32_t kSums[2][7] = {
        {0x1C934B97, 0x6CF7211C, 0xC242C369, 0xA4D9DE0F, 0xC1DC8A4E, 0xC8897B4A, 0x8AC82DAA},
        {0x40F6109F, 0xD66CEDF7, 0x5C2EDCDF, 0x4740C5E7, 0xF79F11FC, 0x93B8F997, 0x844884B5}};
    for (const bool twoBits : {false, true})
        for (int i = 0; i < 7; ++i) {
            const int width = 1 << i;
            uint32_t sum = 0x811C9DC5;
            for (int height = 1; height <= 64; height *= 2) {
                const int pixels = std::max(width, twoBits ? 16 : 8) * std::max(height, 8);
                const Bytes words = Random(static_cast<size_t>(pixels / (twoBits ? 4 : 2)),
                                           static_cast<uint32_t>(1000 * width + height));
                for (const uint8_t byte : Pvrtc(words, twoBits, width, height))
                    sum = (sum ^ byte) * 0x01000193;
            }
            EXPECT_EQ(sum, kSums[twoBits][i]) << (twoBits ? "2" : "4") << " bits, width " << width;
        }
}

TEST_P(Decoder, SizesAndPointersThatCannotBe) {
    const Decoders& decode = GetParam();
    const Bytes block(8, 0xFF), untouched(64, 0x5A);
    Bytes pixels = untouched;
    const std::array<int32_t, 3> sizes[] = {{0, 4, 0},
                                            {4, -4, 0},
                                            {INT32_MAX, INT32_MAX, -1},
                                            {65536, 65536, -1},
                                            {3, 1 << 28, -1}};  // a temporary image of 4 GiB
    for (const auto& [width, height, result] : sizes)
        EXPECT_EQ(decode.etc(block.data(), width, height, pixels.data(), 0), result) << width;
    EXPECT_EQ(decode.etc(nullptr, 4, 4, pixels.data(), 0), -1);
    EXPECT_EQ(decode.etc(block.data(), 4, 4, nullptr, 0), -1);
    for (const int twoBits : {0, 1}) {
        decode.pvrtc(block.data(), twoBits, 0, 4, pixels.data());
        decode.pvrtc(block.data(), twoBits, 4, INT32_MIN, pixels.data());
        decode.pvrtc(block.data(), twoBits, 4, 4, nullptr);
    }
    EXPECT_EQ(pixels, untouched);
    decode.pvrtc(nullptr, 0, 4, 4, pixels.data());
    EXPECT_EQ(pixels, Bytes(64, 0));
    pixels = untouched;
    decode.pvrtc(block.data(), 1, 3, 5, pixels.data());  // a power of two is asked for
    EXPECT_TRUE(std::equal(pixels.begin(), pixels.begin() + 60, Bytes(60, 0).begin()));
    EXPECT_EQ(pixels[60], 0x5A);
}

}  // namespace
