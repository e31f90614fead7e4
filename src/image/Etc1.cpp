// ETC1 is blocks of 4 x 4 pixels: two halves, each with a base colour and a row of four distances from it.
#include "base/Memory.h"
#include "image/Lanes.h"
#include "Qex/images.h"

namespace {

// Both modifiers of a table row, for the pixel indices 0 and 1; 2 and 3 are their negatives.
const uint8_t kModifiers[8][2] = {{2, 8},   {5, 17},  {9, 29},   {13, 42},
                                  {18, 60}, {24, 80}, {33, 106}, {47, 183}};

// Which of a row's four pixels belong to the second half of the block, as bit 2 of their nibbles; by
// [flip][row].
const uint32_t kSecondHalf[2][4] = {{0x4400, 0x4400, 0x4400, 0x4400}, {0, 0, 0x4444, 0x4444}};

uint32_t ReadBE32(const uint8_t* bytes) {
    return static_cast<uint32_t>(bytes[0]) << 24 | static_cast<uint32_t>(bytes[1]) << 16 |
           static_cast<uint32_t>(bytes[2]) << 8 | bytes[3];
}

QEX_INLINE Lanes Clamp(Lanes lanes) {
    return ((lanes & ~QexLanes_Negative(lanes)) | QexLanes_Negative(255 - lanes)) & 255;
}

// The four colours of one half of a block, from its base colour, 8 bits a component, and its table row.
QEX_INLINE void MakeColours(uint32_t* colours, const uint32_t base[3], uint32_t row) {
    const uint16_t a = kModifiers[row][0], b = kModifiers[row][1];
    const uint16_t minusA = static_cast<uint16_t>(-a), minusB = static_cast<uint16_t>(-b);
    const Lanes modifiers = {a, a, b, b, minusA, minusA, minusB, minusB};
    const Lanes notAlpha = QexLanes_Splat(0x0000FFFF);
    QexLanes_Store(colours, Clamp(QexLanes_Splat(base[0] | base[2] << 16) + modifiers),
                   Clamp(QexLanes_Splat(base[1] | 255u << 16) + (modifiers & notAlpha)));
}

QEX_INLINE void DecodeBlock(const uint8_t* block, uint8_t* pixels, size_t rowBytes) {
    const uint32_t control = block[3];
    uint32_t bases[2][3];
    for (uint32_t c = 0; c < 3; ++c) {
        const uint32_t value = block[c];
        if (control & 2) {
            // The difference is a signed number of 3 bits. A sum below 0 or above 31 wraps.
            const uint32_t first = value >> 3, second = (first + ((value & 7) ^ 4) - 4) & 31;
            bases[0][c] = first << 3 | first >> 2;
            bases[1][c] = second << 3 | second >> 2;
        } else {
            bases[0][c] = (value >> 4) * 17;
            bases[1][c] = (value & 15) * 17;
        }
    }
    uint32_t colours[8];
    MakeColours(colours, bases[0], control >> 5);
    MakeColours(colours + 4, bases[1], control >> 2 & 7);

    // Bits 31 to 16 hold the high bits of the pixels' indices, 15 to 0 the low ones, column by column.
    const uint32_t indices = ReadBE32(block + 4);
    for (uint32_t y = 0; y < 4; ++y, pixels += rowBytes) {
        const uint32_t row = indices >> y & 0x11111111;
        const uint32_t nibbles = row | row >> 15 | kSecondHalf[control & 1][y];
        uint32_t out[4];
        for (uint32_t x = 0; x < 4; ++x) out[x] = colours[nibbles >> (4 * x) & 7];
        memcpy(pixels, out, sizeof out);
    }
}

// Whole blocks into an image that has room for them.
void DecodeBlocks(const uint8_t* blocks, uint32_t across, uint32_t down, uint8_t* pixels) {
    const size_t rowBytes = size_t{across} * 16;
    for (uint32_t y = 0; y < down; ++y, pixels += rowBytes * 4)
        for (uint32_t x = 0; x < across; ++x, blocks += 8)
            DecodeBlock(blocks, pixels + 16 * size_t{x}, rowBytes);
}

}  // namespace

int32_t QexDecompressETC(const void* source, int32_t width, int32_t height, void* destination, int32_t) {
    if (width < 1 || height < 1) return 0;
    const uint32_t across = (static_cast<uint32_t>(width) + 3) / 4,
                   down = (static_cast<uint32_t>(height) + 3) / 4;
    const uint64_t sourceBytes = uint64_t{across} * down * 8, pixelBytes = sourceBytes * 8;
    if (!source || !destination || sourceBytes > INT32_MAX || pixelBytes > SIZE_MAX) return -1;
    const auto* blocks = static_cast<const uint8_t*>(source);
    auto* pixels = static_cast<uint8_t*>(destination);
    if (width % 4 == 0 && height % 4 == 0) {
        DecodeBlocks(blocks, across, down, pixels);
        return static_cast<int32_t>(sourceBytes);
    }
    QexScratch<uint8_t> whole(pixelBytes);
    if (!whole) return -1;
    DecodeBlocks(blocks, across, down, whole.Get());
    const size_t rowBytes = size_t{4} * static_cast<uint32_t>(width);
    for (size_t y = 0; y < static_cast<uint32_t>(height); ++y)
        memcpy(pixels + y * rowBytes, whole.Get() + y * across * 16, rowBytes);
    return static_cast<int32_t>(sourceBytes);
}
