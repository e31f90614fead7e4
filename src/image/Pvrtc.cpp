// A word of PVRTC is 64 bits: two colours, A and B, and a weight for each of its 4 x 4 or 8 x 4 pixels. The
// colours stand at the words' centres and are interpolated between them; a pixel is a mixture of both by its
// weight. So the image is decoded in cells between the centres of four words: a cell begins half a word right
// of and below the upper left one, and takes a quarter of the weights of each.
#include "image/Image.h"
#include "image/Lanes.h"
#include "Qex/images.h"
#include "Qex/math.h"

namespace {

struct Word {
    // Red and blue of A, green and alpha of A, the same of B: the second one of each pair in the upper half.
    // Colours have 5 bits; alpha is twice its 4 bits, so that all four shift alike later.
    uint32_t pairs[4];
    uint32_t modulation;
    uint32_t mode;
    // With 8 pixels a row: a byte for each weight that is stored, by row; 0 for one that is an average of its
    // neighbours', and masks of how: left and right, above and below, all four.
    uint64_t rows[4];
    uint32_t horizontal, vertical, both;
};

// The words of an image, a power of two of them each way.
struct Grid {
    const uint8_t* words;
    uint32_t across, down;
};

struct Image {
    uint8_t* pixels;
    int64_t width, height;
};

// A zero above each bit.
uint32_t SpreadBits(uint32_t bits) {
    bits = (bits | bits << 8) & 0x00FF00FF;
    bits = (bits | bits << 4) & 0x0F0F0F0F;
    bits = (bits | bits << 2) & 0x33333333;
    return (bits | bits << 1) & 0x55555555;
}

// The bits of y and x interleaved, as many as the shorter side has, and the rest of the longer one above.
size_t WordIndex(const Grid& grid, uint32_t x, uint32_t y) {
    const uint32_t shorter = grid.across < grid.down ? grid.across : grid.down, mask = shorter - 1;
    const size_t square = SpreadBits(y & mask) | SpreadBits(x & mask) << 1;
    return square + size_t{(x | y) & ~mask} * shorter;
}

// Components of 4 and 3 bits to 5.
uint32_t From4(uint32_t component) {
    return component << 1 | component >> 3;
}
uint32_t From3(uint32_t component) {
    return component << 2 | component >> 1;
}

// Colour A has one bit of blue less than B: its lowest bit is the word's mode.
void UnpackColour(uint32_t bits, bool isA, uint32_t pairs[2]) {
    if (bits & 0x8000) {
        const uint32_t blue = isA ? From4(bits >> 1 & 15) : bits & 31;
        pairs[0] = (bits >> 10 & 31) | blue << 16;
        pairs[1] = (bits >> 5 & 31) | 30u << 16;
    } else {
        const uint32_t blue = isA ? From3(bits >> 1 & 7) : From4(bits & 15);
        pairs[0] = From4(bits >> 8 & 15) | blue << 16;
        pairs[1] = From4(bits >> 4 & 15) | (bits >> 12 & 7) << 18;
    }
}

// Eight weights of one bit each, 0 or 8.
uint64_t DirectRow(uint32_t bits) {
    const uint64_t spread = bits * 0x0101010101010101u & 0x8040201008040201u;
    return (spread + 0x7F7F7F7F7F7F7F7Fu) >> 4 & 0x0808080808080808u;
}

// Four weights of two bits each, in the even bytes: 0, 3, 5 and 8 for 0 to 3.
uint64_t PairRow(uint32_t bits) {
    uint64_t spread = (bits | uint64_t{bits} << 28) & 0x0000000F0000000Fu;
    spread = (spread | spread << 14) & 0x0003000300030003u;
    return spread * 3 - (spread >> 1 & 0x0001000100010001u);
}

void UnpackRows(Word* word) {
    uint32_t bits = word->modulation;
    word->horizontal = word->vertical = word->both = 0;
    if (!word->mode) {
        for (uint32_t y = 0; y < 4; ++y) word->rows[y] = DirectRow(bits >> (8 * y) & 255);
        return;
    }
    // Bit 0 and, where it is set, bit 20 say which average it is. The pixels that lend these bits have their
    // other bit twice.
    uint32_t* average = !(bits & 1) ? &word->both : bits >> 20 & 1 ? &word->vertical : &word->horizontal;
    *average = UINT32_MAX;
    const uint32_t lent = bits & 1 ? 1u << 20 | 1 : 1;
    bits = (bits & ~lent) | (bits >> 1 & lent);
    for (uint32_t y = 0; y < 4; ++y) word->rows[y] = PairRow(bits >> (8 * y) & 255) << (y & 1) * 8;
}

template <uint32_t kWidth>
void Fetch(const Grid& grid, uint32_t x, uint32_t y, Word* word) {
    const uint8_t* bytes = grid.words + 8 * WordIndex(grid, x & (grid.across - 1), y & (grid.down - 1));
    const uint32_t colours = QexImage_ReadWord(bytes + 4);
    UnpackColour(colours & 0xFFFF, true, word->pairs);
    UnpackColour(colours >> 16, false, word->pairs + 2);
    word->modulation = QexImage_ReadWord(bytes);
    word->mode = colours & 1;
    if (kWidth == 8) UnpackRows(word);
}

// Two weights, each in two lanes of 16 bits.
constexpr uint64_t InLanes(uint64_t first, uint64_t second) {
    return (first | second << 32) * 0x10001;
}

// The weights of two pixels of two bits each, by mode, in eighths. Mode 1 has kNoAlpha beside one of them:
// that pixel is transparent.
constexpr uint16_t kNoAlpha = 0x80;
struct PairTable {
    uint64_t weights[2][16];
    constexpr PairTable() : weights() {
        const uint16_t single[2][4] = {{0, 3, 5, 8}, {0, 4, 4 | kNoAlpha, 8}};
        for (uint32_t mode = 0; mode < 2; ++mode)
            for (uint32_t bits = 0; bits < 16; ++bits)
                weights[mode][bits] = InLanes(single[mode][bits & 3], single[mode][bits >> 2]);
    }
};
constexpr PairTable kPairTable;

// A cell lies between four words: upper left and right, lower left and right. Its rows 0 and 1 are rows 2 and
// 3 of the upper words, its left half is the right half of the left ones. The weights of its rows:
QEX_INLINE void CellWeights(const Word words[4], uint64_t weights[4][2]) {
    for (uint32_t y = 0; y < 4; ++y) {
        const Word *left = words + (y & 2), *right = left + 1;
        const uint32_t shift = (y ^ 2) * 8;
        weights[y][0] = kPairTable.weights[left->mode][left->modulation >> shift >> 4 & 15];
        weights[y][1] = kPairTable.weights[right->mode][right->modulation >> shift & 15];
    }
}

// One byte for each pixel of a row: the mean of its neighbours where the word asks for one.
QEX_INLINE uint64_t Averages(const Word* words, uint64_t left, uint64_t right, uint64_t above,
                             uint64_t below) {
    constexpr uint64_t kOnes = 0x0101010101010101;
    const auto mask = [&](uint32_t Word::*average) {
        return words[0].*average | uint64_t{words[1].*average} << 32;
    };
    const uint64_t sides = left + right, ends = above + below;
    const uint64_t average = ((sides + kOnes) >> 1 & mask(&Word::horizontal)) |
                             ((ends + kOnes) >> 1 & mask(&Word::vertical)) |
                             ((sides + ends + 2 * kOnes) >> 2 & mask(&Word::both));
    return average & 15 * kOnes;
}

// The same with 8 pixels a row. Neighbours of an average are stored ones, and all in these four words.
QEX_INLINE void CellWeights(const Word words[4], uint64_t weights[4][4]) {
    // The cell's rows, the one above and the one below; and each moved by a pixel.
    uint64_t left[6], own[6], right[6];
    for (uint32_t y = 0; y < 6; ++y) {
        const Word* pair = y < 3 ? words : words + 2;
        const uint64_t first = pair[0].rows[(y + 1) & 3], second = pair[1].rows[(y + 1) & 3];
        left[y] = first >> 24 | second << 40;
        own[y] = first >> 32 | second << 32;
        right[y] = first >> 40 | second << 24;
    }
    for (uint32_t y = 0; y < 4; ++y) {
        const uint64_t stored = y & 1 ? 0xFF00FF00FF00FF00u : 0x00FF00FF00FF00FFu;
        const uint64_t averages = Averages(words + (y & 2), left[y + 1], right[y + 1], own[y], own[y + 2]);
        const uint64_t row = own[y + 1] | (averages & ~stored);
        for (uint32_t x = 0; x < 4; ++x)
            weights[y][x] = InLanes(row >> (16 * x) & 255, row >> (16 * x + 8) & 255);
    }
}

// One pair of components in four columns of a cell: its sums in the current row, and what a row adds.
struct Slope {
    Lanes sum, step;
};

// `right` is the columns' distance from the left words, of `width`.
QEX_INLINE Slope MakeSlope(const Word words[4], uint32_t pair, uint16_t width, Lanes right) {
    const Lanes above = QexLanes_Splat(words[0].pairs[pair]), below = QexLanes_Splat(words[2].pairs[pair]);
    const Lanes top = above * width + (QexLanes_Splat(words[1].pairs[pair]) - above) * right;
    const Lanes bottom = below * width + (QexLanes_Splat(words[3].pairs[pair]) - below) * right;
    return {top * 4, bottom - top};
}

// The current row with 8 bits a component, and on to the next one. `shift` leaves 8 bits of colour and 8 of
// alpha's 4; adding a 32nd or a 16th spreads them over 0 to 255: `factor` is 33 or 34.
QEX_INLINE Lanes NextRow(Slope* slope, uint16_t shift, Lanes factor) {
    const Lanes row = ((slope->sum >> shift) * factor) >> 5;
    slope->sum = slope->sum + slope->step;
    return row;
}

QEX_INLINE Lanes Mix(Lanes a, Lanes b, Lanes weights) {
    return (a * 8 + (b - a) * weights) >> 3;
}

// Four pixels of a row, those that are in the image.
QEX_INLINE void StoreRow(const Image& image, int64_t x, int64_t y, Lanes redBlue, Lanes greenAlpha) {
    if (y < 0 || y >= image.height) return;
    uint8_t* row = image.pixels + 4 * static_cast<size_t>(y * image.width);
    if (x >= 0 && x + 4 <= image.width) {
        QexLanes_Store(row + 4 * x, redBlue, greenAlpha);
        return;
    }
    uint8_t pixels[16];
    QexLanes_Store(pixels, redBlue, greenAlpha);
    for (int64_t i = 0; i < 4; ++i)
        if (x + i >= 0 && x + i < image.width) memcpy(row + 4 * (x + i), pixels + 4 * i, 4);
}

// A cell whose first pixel is (x, y), four columns at a time.
template <uint32_t kWidth>
void DecodeCell(const Image& image, int64_t x, int64_t y, const Word words[4]) {
    constexpr uint16_t kShift = kWidth == 8 ? 2 : 1;
    const Lanes columns = {0, 0, 1, 1, 2, 2, 3, 3};
    const Lanes alphaOnly = QexLanes_Splat(0xFFFF0000u);
    const Lanes colour = QexLanes_Splat(33 | 33 << 16), alpha = QexLanes_Splat(33 | 34 << 16);
    uint64_t weights[4][kWidth / 2];
    CellWeights(words, weights);
    for (uint16_t column = 0; column < kWidth; column = static_cast<uint16_t>(column + 4)) {
        Slope slopes[4];
        for (uint32_t i = 0; i < 4; ++i) slopes[i] = MakeSlope(words, i, kWidth, columns + column);
        for (uint32_t row = 0; row < 4; ++row) {
            Lanes weight;
            memcpy(&weight, &weights[row][column / 2], sizeof weight);
            const Lanes a0 = NextRow(&slopes[0], kShift, colour), a1 = NextRow(&slopes[1], kShift, alpha);
            const Lanes b0 = NextRow(&slopes[2], kShift, colour), b1 = NextRow(&slopes[3], kShift, alpha);
            Lanes greenAlpha = Mix(a1, b1, weight & 15);
            if (kWidth == 4) greenAlpha = greenAlpha & ~(QexLanes_Negative(weight << 8) & alphaOnly);
            StoreRow(image, x + column, y + row, Mix(a0, b0, weight & 15), greenAlpha);
        }
    }
}

template <uint32_t kWidth>
void Decode(const Grid& grid, const Image& image) {
    // The first row and column of cells hang half over the image's edge. Their outer words are those of the
    // opposite edge.
    for (uint32_t y = 0; y <= grid.down; ++y) {
        Word words[4];
        Fetch<kWidth>(grid, 0u - 1, y - 1, &words[1]);
        Fetch<kWidth>(grid, 0u - 1, y, &words[3]);
        for (uint32_t x = 0; x <= grid.across; ++x) {
            words[0] = words[1];
            words[2] = words[3];
            Fetch<kWidth>(grid, x, y - 1, &words[1]);
            Fetch<kWidth>(grid, x, y, &words[3]);
            DecodeCell<kWidth>(image, int64_t{x} * kWidth - kWidth / 2, int64_t{y} * 4 - 2, words);
        }
    }
}

}  // namespace

void QexDecompressPVRTC(const void* source, int32_t twoBits, int32_t width, int32_t height,
                        void* destination) {
    if (width < 1 || height < 1 || !destination) return;
    const uint64_t bytes = uint64_t{4} * static_cast<uint32_t>(width) * static_cast<uint32_t>(height);
    if (bytes > SIZE_MAX) return;
    const bool ordered = util_number_is_power_2(static_cast<uint32_t>(width)) &&
                         util_number_is_power_2(static_cast<uint32_t>(height));
    if (!source || !ordered) {
        memset(destination, 0, static_cast<size_t>(bytes));
        return;
    }
    const auto blocks = [](int32_t size, int32_t block) {
        return size > 2 * block ? static_cast<uint32_t>(size / block) : 2u;
    };
    const Grid grid = {static_cast<const uint8_t*>(source), blocks(width, twoBits ? 8 : 4),
                       blocks(height, 4)};
    const Image image = {static_cast<uint8_t*>(destination), width, height};
    if (twoBits)
        Decode<8>(grid, image);
    else
        Decode<4>(grid, image);
}
