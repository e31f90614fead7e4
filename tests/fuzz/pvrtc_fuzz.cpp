// One PVRTC level of any bytes: a byte of the bits a pixel (its lowest bit) and the width, a byte of the
// height, both as powers of two up to 256 or as any other number, then the words.
#include <algorithm>

#include "DecoderFuzz.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size < 2) return 0;
    // Bit 7 set: a size that is mostly no power of two.
    const auto side = [](uint8_t byte) {
        return byte & 0x80 ? byte & 0x7F : 1 << std::min(byte >> 1 & 15, 8);
    };
    const int32_t twoBits = data[0] & 1, width = side(data[0]), height = side(data[1]);
    const auto isPower = [](int32_t number) { return number > 0 && (number & (number - 1)) == 0; };
    const auto pixels = static_cast<size_t>(std::max(width, twoBits ? 16 : 8) * std::max(height, 8));
    const size_t words = isPower(width) && isPower(height) ? pixels / (twoBits ? 4 : 2) : 0;
    const LevelToDecode level(data + 2, size - 2, words, width, height);
    QexDecompressPVRTC(level.source.get(), twoBits, width, height, level.pixels.get());
    if (words || level.IsZero()) return 0;
    fprintf(stderr, "%d x %d pixels were decoded\n", width, height);
    abort();
}
