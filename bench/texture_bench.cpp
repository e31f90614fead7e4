// Decoding textures in software against libETC1's decoder, which makes RGB of an ETC1 picture of the same
// size. The picture is crate-base.png of the package glmark2-data, resized to 512 and repeated; its ETC1 is
// made by libETC1, its PVRTC by the simple encoder below.
#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

#include <ETC1/etc1.h>

#include "common/ImageFile.h"
#include "Qex.h"
#include "Ratio.h"

namespace {

using Bytes = std::vector<uint8_t>;

constexpr int kTile = 512;
constexpr int kSizes[] = {256, 1024, 2048};

Bytes EncodeEtc(const Image& image) {
    Bytes rgb, blocks(kTile * kTile / 2);
    for (size_t i = 0; i < image.pixels.size(); i += 4)
        rgb.insert(rgb.end(), image.pixels.begin() + static_cast<long>(i),
                   image.pixels.begin() + static_cast<long>(i) + 3);
    etc1_encode_image(rgb.data(), kTile, kTile, 3, 3 * kTile, blocks.data());
    return blocks;
}

// ETC1 of a larger or smaller picture: the tile's blocks over and over.
Bytes RepeatEtc(const Bytes& tile, int size) {
    Bytes blocks;
    for (int y = 0; y < size / 4; ++y)
        for (int x = 0; x < size / 4; ++x) {
            const long block = 8 * (y % (kTile / 4) * (kTile / 4) + x % (kTile / 4));
            blocks.insert(blocks.end(), tile.begin() + block, tile.begin() + block + 8);
        }
    return blocks;
}

// Each word has the smallest and the largest components of its pixels as colours; a pixel's weight is its
// brightness between them.
uint64_t PvrtcWord(const Image& image, int left, int top, int width) {
    std::array<int, 3> low = {255, 255, 255}, high = {0, 0, 0};
    const auto pixel = [&](int x, int y) { return image.Pixel((left + x) % kTile, (top + y) % kTile); };
    for (int y = 0; y < 4; ++y)
        for (int x = 0; x < width; ++x)
            for (size_t c = 0; c < 3; ++c) {
                low[c] = std::min<int>(low[c], pixel(x, y)[c]);
                high[c] = std::max<int>(high[c], pixel(x, y)[c]);
            }
    const auto colour = [](const std::array<int, 3>& c) {
        return static_cast<uint64_t>(0x8000 | c[0] >> 3 << 10 | c[1] >> 3 << 5 | c[2] >> 3);
    };
    const int dark = low[0] + low[1] + low[2], range = std::max(high[0] + high[1] + high[2] - dark, 1);
    const bool interpolated = width == 8;  // the dearer way of storing 2 bits a pixel
    uint64_t word = colour(high) << 48 | (colour(low) & ~uint64_t{1}) << 32 | uint64_t{interpolated} << 32;
    int bit = 0;
    for (int y = 0; y < 4; ++y)
        for (int x = interpolated ? y % 2 : 0; x < width; x += interpolated ? 2 : 1, bit += 2) {
            const uint8_t* p = pixel(x, y);
            word |= static_cast<uint64_t>((3 * (p[0] + p[1] + p[2] - dark) + range / 2) / range) << bit;
        }
    if (!interpolated) return word;
    // Bit 0 chooses one direction or both, as the picture changes; bit 20 which one.
    return (word & ~uint64_t{1}) | ((left / 8 + top / 4) & 1);
}

Bytes EncodePvrtc(const Image& image, int size, bool twoBits) {
    const int width = twoBits ? 8 : 4, across = size / width, down = size / 4;
    Bytes words(static_cast<size_t>(8 * across * down));
    for (int y = 0; y < down; ++y)
        for (int x = 0; x < across; ++x) {
            size_t index = 0;
            int shift = 0;
            for (; 1 << shift < std::min(across, down); ++shift)
                index |= static_cast<size_t>((y >> shift & 1) | (x >> shift & 1) << 1) << (2 * shift);
            index |= static_cast<size_t>((x | y) >> shift) << (2 * shift);
            const uint64_t word = PvrtcWord(image, x * width, y * 4, width);
            memcpy(&words[8 * index], &word, 8);
        }
    return words;
}

// A square of words is repeated by its bytes alone, as the words of each aligned square lie together.
Bytes RealPvrtc(int size) {
    const char* folder = std::getenv("QEX_REAL_FILES");
    std::ifstream stream(
        std::string(folder ? folder : "") + "/textures/decoded/real_sparrow_pvrtc_image_L0.blk",
        std::ios::binary);
    const Bytes level((std::istreambuf_iterator<char>(stream)), {});
    Bytes words;
    while (level.size() == 64 * 64 / 2 && words.size() < static_cast<size_t>(size * size / 2))
        words.insert(words.end(), level.begin(), level.end());
    return words;
}

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    Image picture;
    std::string error;
    if (!LoadImage("/usr/share/glmark2/textures/crate-base.png", &picture, &error)) {
        fprintf(stderr, "texture_bench: %s\n", error.c_str());
        return 2;
    }
    picture = ResizeImage(picture, kTile, kTile);
    const Bytes tile = EncodeEtc(picture);
    for (const int size : kSizes) {
        const auto pixels = static_cast<size_t>(size * size);
        const auto decoded = std::make_shared<Bytes>(4 * pixels);
        const auto edge = static_cast<etc1_uint32>(size);
        const auto libEtc1 = [=, etc = RepeatEtc(tile, size)] {
            etc1_decode_image(etc.data(), decoded->data(), edge, edge, 3, 3 * edge);
            KeepValue(*decoded->data());
        };
        const std::string name = " " + std::to_string(size) + " / libETC1 to RGB";
        const double items = static_cast<double>(pixels);
        bench.Compare(
            "ETC1" + name, 0.5,
            [=, etc = RepeatEtc(tile, size)] {
                QexDecompressETC(etc.data(), size, size, decoded->data(), 0);
                KeepValue(*decoded->data());
            },
            libEtc1, items);
        for (const bool twoBits : {false, true}) {
            Bytes words = twoBits ? Bytes() : RealPvrtc(size);
            if (words.empty()) words = EncodePvrtc(picture, size, twoBits);
            bench.Compare(
                std::string("PVRTC ") + (twoBits ? "2" : "4") + " bits" + name, twoBits ? 0.6 : 1.0,
                [=] {
                    QexDecompressPVRTC(words.data(), twoBits, size, size, decoded->data());
                    KeepValue(*decoded->data());
                },
                libEtc1, items);
        }
    }
    return bench.Result();
}
