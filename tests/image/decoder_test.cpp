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

// ---- A plain PVRTC decoder: every pixel by itself, from the definition ----

class PvrtcModel {
  public:
    PvrtcModel(const Bytes& data, bool twoBits, int width, int height)
        : data_(data),
          bw_(twoBits ? 8 : 4),
          across_(std::max((width + bw_ - 1) / bw_, 2)),
          down_(std::max((height + 3) / 4, 2)) {}

    static size_t Size(bool twoBits, int width, int height) {
        const int pixels = std::max(width, twoBits ? 16 : 8) * std::max(height, 8);
        return static_cast<size_t>(pixels / (twoBits ? 4 : 2));
    }

    Pixel Decode(int x, int y) const {
        const Pixel a = Upscale(false, x, y), b = Upscale(true, x, y);
        const int weight = Weight(x, y);
        Pixel pixel;
        for (size_t i = 0; i < 4; ++i) pixel[i] = (a[i] * (8 - weight) + b[i] * weight) / 8;
        const uint64_t word = WordAt(x / bw_, y / 4);
        const bool noAlpha = bw_ == 4 && Bits(word, 32, 1) && Bits(word, 2 * (4 * (y % 4) + x % 4), 2) == 2;
        if (noAlpha) pixel[3] = 0;
        return pixel;
    }

  private:
    static int Bits(uint64_t word, int first, int count) {
        return static_cast<int>(word >> first & ((1u << count) - 1));
    }

    uint64_t WordAt(int x, int y) const {
        x = (x + across_) % across_;
        y = (y + down_) % down_;
        int index = 0, bit = 0;
        for (; 1 << bit < std::min(across_, down_); ++bit)
            index |= (y >> bit & 1) << (2 * bit) | (x >> bit & 1) << (2 * bit + 1);
        index |= (x >> bit | y >> bit) << (2 * bit);
        uint64_t word = 0;
        for (size_t i = 8; i-- > 0;) word = word << 8 | data_.at(static_cast<size_t>(index) * 8 + i);
        return word;
    }

    // R, G, B of 5 bits, A of 4.
    Pixel Colour(bool b, int x, int y) const {
        const int bits = Bits(WordAt(x, y), b ? 48 : 32, 16);
        const auto to5 = [](int value, int from) { return value << (5 - from) | value >> (2 * from - 5); };
        if (bits & 0x8000)
            return {bits >> 10 & 31, bits >> 5 & 31, b ? bits & 31 : to5(bits >> 1 & 15, 4), 15};
        return {to5(bits >> 8 & 15, 4), to5(bits >> 4 & 15, 4), b ? to5(bits & 15, 4) : to5(bits >> 1 & 7, 3),
                (bits >> 12 & 7) * 2};
    }

    Pixel Upscale(bool b, int x, int y) const {
        // Beginning a word further left and above keeps the divisions positive.
        const int left = (x - bw_ / 2 + bw_) / bw_ - 1, top = (y - 2 + 4) / 4 - 1;
        const int dx = x - bw_ / 2 - left * bw_, dy = y - 2 - top * 4;
        Pixel sum = {};
        for (int j = 0; j < 2; ++j)
            for (int i = 0; i < 2; ++i) {
                const Pixel colour = Colour(b, left + i, top + j);
                for (size_t k = 0; k < 4; ++k) sum[k] += colour[k] * (i ? dx : bw_ - dx) * (j ? dy : 4 - dy);
            }
        for (size_t k = 0; k < 3; ++k)
            sum[k] = bw_ == 4 ? sum[k] / 2 + sum[k] / 64 : sum[k] / 4 + sum[k] / 128;
        sum[3] = bw_ == 4 ? sum[3] + sum[3] / 16 : sum[3] / 2 + sum[3] / 32;
        return sum;
    }

    int Weight(int x, int y) const {
        const int width = across_ * bw_, height = down_ * 4;
        x = (x + width) % width;
        y = (y + height) % height;
        const uint64_t word = WordAt(x / bw_, y / 4);
        const int i = x % bw_, j = y % 4;
        const bool mode = Bits(word, 32, 1);
        static const int standard[] = {0, 3, 5, 8}, punchThrough[] = {0, 4, 4, 8};
        if (bw_ == 4) return (mode ? punchThrough : standard)[Bits(word, 2 * (4 * j + i), 2)];
        if (!mode) return 8 * Bits(word, 8 * j + i, 1);
        const bool oneWay = Bits(word, 0, 1), vertical = Bits(word, 20, 1);
        if ((i + j) % 2 == 0) {
            const int at = 2 * (4 * j + i / 2);
            if (at == 0 || (at == 20 && oneWay)) return 8 * Bits(word, at + 1, 1);
            return standard[Bits(word, at, 2)];
        }
        const int sides = oneWay && vertical ? 0 : Weight(x - 1, y) + Weight(x + 1, y);
        const int ends = oneWay && !vertical ? 0 : Weight(x, y - 1) + Weight(x, y + 1);
        return oneWay ? (sides + ends + 1) / 2 : (sides + ends + 2) / 4;
    }

    const Bytes& data_;
    int bw_, across_, down_;
};

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

TEST_P(Decoder, PvrtcIsWhatThePlainModelDecodes) {
    for (const bool twoBits : {false, true})
        for (int width = 1; width <= 64; width *= 2)
            for (int height = 1; height <= 64; height *= 2) {
                const size_t size = PvrtcModel::Size(twoBits, width, height);
                const Bytes words = Random(size, static_cast<uint32_t>(1000 * width + height));
                const Bytes pixels = Pvrtc(words, twoBits, width, height);
                const PvrtcModel model(words, twoBits, width, height);
                for (int y = 0; y < height; ++y)
                    for (int x = 0; x < width; ++x)
                        ASSERT_EQ(At(pixels, width, x, y), model.Decode(x, y))
                            << (twoBits ? "2" : "4") << " bits, " << width << " x " << height << " at " << x
                            << ", " << y;
            }
}

TEST_P(Decoder, SizesAndPointersThatCannotBe) {
    const Decoders& decode = GetParam();
    const Bytes block(8, 0xFF), untouched(64, 0x5A);
    Bytes pixels = untouched;
    const struct {
        const void* source;
        int32_t width, height;
        void* destination;
        int32_t result;
    } cases[] = {
        {block.data(), 0, 4, pixels.data(), 0},
        {block.data(), 4, -4, pixels.data(), 0},
        {nullptr, 4, 4, pixels.data(), -1},
        {block.data(), 4, 4, nullptr, -1},
        {block.data(), INT32_MAX, INT32_MAX, pixels.data(), -1},
        {block.data(), 65536, 65536, pixels.data(), -1},
        {block.data(), 3, 1 << 28, pixels.data(), -1},  // a temporary image of 4 GiB
    };
    for (const auto& c : cases)
        EXPECT_EQ(decode.etc(c.source, c.width, c.height, c.destination, 0), c.result) << c.width;
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
