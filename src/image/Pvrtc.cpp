// A word of PVRTC is 64 bits: two colours, A and B, and a weight for each of its 4 x 4 or 8 x 4 pixels. The
// colours stand at the words' centres and are interpolated between them; a pixel is a mixture of both by its
// weight. So the image is decoded in cells between the centres of four words: a cell begins half a word right
// of and below the upper left one, and takes a quarter of the weights of each.
#include "image/Pvrtc.h"

#include "image/Image.h"
#include "image/Lanes.h"
#include "Qex/images.h"
#include "Qex/math.h"

namespace {

struct Word {
    // Red and blue of A, green and alpha of A, the same of B, for four pixels. Colours have 5 bits; alpha is
    // twice its 4 bits, so that all four shift alike later.
    Lanes pairs[4];
    // The weights of rows 0 and 1, and of 2 and 3, in eighths: 8 bytes a row, two for each of 4 pixels or one
    // for each of 8. A lane of 4 pixels is negative where the pixel is transparent, beside a weight of 4.
    Lanes rows[2];
    // With 8 pixels a row, where only every other weight is stored: how many quarters of each neighbour the
    // others are, of those left and right and of those above and below. 0 where all are stored.
    Lanes sides, ends;
    uint32_t mode;
};

// Two words, one above the other.
struct Column {
    Word upper, lower;
};

// The words of an image. Bits of the index of a word that count columns, and those that count rows.
struct Grid {
    const uint8_t* words;
    size_t columnBits, rowBits;
};

// The bits of rows and columns take turns, as many as the shorter side has; the rest of the longer one comes
// above.
Grid MakeGrid(const uint8_t* words, size_t across, size_t down) {
    const size_t shorter = across < down ? across : down, square = shorter * shorter - 1;
    const size_t all = across * down - 1, rest = all ^ square;
    const size_t columnBits = (SIZE_MAX / 3 * 2 & square) | (across > down ? rest : 0);
    return {words, columnBits, all ^ columnBits};
}

// One on among the bits of a mask, from the last to the first.
size_t Next(size_t index, size_t mask) {
    return (index - mask) & mask;
}

// Components of 4 and 3 bits to 5.
uint32_t From4(uint32_t component) {
    return component << 1 | component >> 3;
}
uint32_t From3(uint32_t component) {
    return component << 2 | component >> 1;
}

// Colour A has one bit of blue less than B: its lowest bit is the word's mode.
void UnpackColour(uint32_t bits, bool isA, Lanes pairs[2]) {
    uint32_t redBlue, greenAlpha;
    if (bits & 0x8000) {
        const uint32_t blue = isA ? From4(bits >> 1 & 15) : bits & 31;
        redBlue = (bits >> 10 & 31) | blue << 16;
        greenAlpha = (bits >> 5 & 31) | 30u << 16;
    } else {
        const uint32_t blue = isA ? From3(bits >> 1 & 7) : From4(bits & 15);
        redBlue = From4(bits >> 8 & 15) | blue << 16;
        greenAlpha = From4(bits >> 4 & 15) | (bits >> 12 & 7) << 18;
    }
    pairs[0] = QexLanes_Splat(redBlue);
    pairs[1] = QexLanes_Splat(greenAlpha);
}

// What a field of two bits adds to its lane: `once` for each of its values 0 to 3, `upper` for its upper bit.
struct Worth {
    uint16_t once[8], upper[8];
    // Of each bit; fields of the odd row count `odd` times as much.
    constexpr Worth(int low, int high, int odd) : once(), upper() {
        for (int i = 0; i < 8; ++i) {
            once[i] = static_cast<uint16_t>(low * (i < 4 ? 1 : odd));
            upper[i] = static_cast<uint16_t>((high - 2 * low) * (i < 4 ? 1 : odd));
        }
    }
};

// By pixels a row, 4 or 8, and mode. With 4 a field is one of 0, 3, 5, 8 or of 0, 4, 4 and transparent, 8;
// the latter are 0, 16 + 4, 4 - 16, 8. With 8 each bit is 0 or 8, of two pixels, or it is one of 0, 3, 5, 8
// for every other pixel: the first of two, and in odd rows the second.
constexpr Worth kWorths[2][2] = {{{3, 5, 1}, {20, -12, 1}}, {{8, 8 << 8, 1}, {3, 5, 1 << 8}}};

// The weights of two rows, from 16 bits.
QEX_INLINE Lanes UnpackRows(uint32_t bits, const Worth& worth) {
    const Lanes toTop = {1 << 14, 1 << 12, 1 << 10, 1 << 8, 1 << 6, 1 << 4, 1 << 2, 1};
    const Lanes fields = (QexLanes_Splat(bits * 0x10001) * toTop) >> 14;
    return fields * QexLanes_Load(worth.once) + (fields >> 1) * QexLanes_Load(worth.upper);
}

template <uint32_t kWidth>
void UnpackWeights(uint32_t bits, Word* word) {
    if (kWidth == 8) {
        uint32_t sides = 0, ends = 0;
        if (word->mode) {
            // Bit 0 and, where it is set, bit 20 say which neighbours count. The pixels that lend these bits
            // have their other bit twice.
            sides = !(bits & 1) ? 1 : bits >> 20 & 1 ? 0 : 2;
            ends = 2 - sides;
            const uint32_t lent = bits & 1 ? 1u << 20 | 1 : 1;
            bits = (bits & ~lent) | (bits >> 1 & lent);
        }
        word->sides = QexLanes_Splat(sides * 0x10001);
        word->ends = QexLanes_Splat(ends * 0x10001);
    }
    const Worth& worth = kWorths[kWidth == 8][word->mode];
    word->rows[0] = UnpackRows(bits & 0xFFFF, worth);
    word->rows[1] = UnpackRows(bits >> 16, worth);
}

template <uint32_t kWidth>
void Fetch(const uint8_t* bytes, Word* word) {
    const uint32_t colours = QexImage_ReadWord(bytes + 4);
    UnpackColour(colours & 0xFFFF, true, word->pairs);
    UnpackColour(colours >> 16, false, word->pairs + 2);
    word->mode = colours & 1;
    UnpackWeights<kWidth>(QexImage_ReadWord(bytes), word);
}

template <uint32_t kWidth>
void FetchColumn(const Grid& grid, size_t upper, size_t lower, Column* column) {
    Fetch<kWidth>(grid.words + 8 * upper, &column->upper);
    Fetch<kWidth>(grid.words + 8 * lower, &column->lower);
}

// A cell lies between four words. Its rows 0 and 1 are rows 2 and 3 of the upper words, its left half is the
// right half of the left ones. Its weights, two rows each; a pixel's in two lanes.
QEX_INLINE Lanes TwoRows(const Word& left, const Word& right, uint32_t half) {
    return QexLanes_Join<4>(left.rows[half], right.rows[half]);
}
QEX_INLINE Lanes FirstTwice(Lanes a) {
    return QexLanes_Pick<0, 0, 1, 1, 2, 2, 3, 3>(a, a);
}
QEX_INLINE Lanes LastTwice(Lanes a) {
    return QexLanes_Pick<4, 4, 5, 5, 6, 6, 7, 7>(a, a);
}

QEX_INLINE void CellWeightsOf4(const Column& left, const Column& right, Lanes weights[4]) {
    const Lanes upper = TwoRows(left.upper, right.upper, 1), lower = TwoRows(left.lower, right.lower, 0);
    weights[0] = FirstTwice(upper);
    weights[1] = LastTwice(upper);
    weights[2] = FirstTwice(lower);
    weights[3] = LastTwice(lower);
}

// The second row of two, and the first of the next two.
QEX_INLINE Lanes RowsBetween(Lanes before, Lanes after) {
    return QexLanes_Pick<4, 5, 6, 7, 8, 9, 10, 11>(before, after);
}

// Two rows of 8 pixels, of one byte each, between two others above and below: means of neighbours are put in
// where words ask for them.
QEX_INLINE void TwoRowWeights(const Word& left, const Word& right, uint32_t half, const Lanes* rows,
                              Lanes first[2], Lanes second[2]) {
    const Lanes averaged = {0x0F00, 0x0F00, 0x0F00, 0x0F00, 0x0F, 0x0F, 0x0F, 0x0F};
    const auto &l = left.rows[half], &r = right.rows[half];
    const Lanes sides = QexLanes_Join<3>(l, r) + QexLanes_Join<5>(l, r);
    const Lanes ends = RowsBetween(rows[-1], rows[0]) + RowsBetween(rows[0], rows[1]);
    const Lanes sum =
        sides * QexLanes_Join<4>(left.sides, right.sides) + ends * QexLanes_Join<4>(left.ends, right.ends);
    const Lanes all = rows[0] | (((sum + 0x0202) >> 2) & averaged);
    const Lanes even = all & 0xFF, odd = all >> 8;
    const Lanes row0 = QexLanes_Pick<0, 8, 1, 9, 2, 10, 3, 11>(even, odd);
    const Lanes row1 = QexLanes_Pick<4, 12, 5, 13, 6, 14, 7, 15>(even, odd);
    first[0] = FirstTwice(row0);
    first[1] = FirstTwice(row1);
    second[0] = LastTwice(row0);
    second[1] = LastTwice(row1);
}

// Neighbours of an average are stored ones, and all in these four words.
QEX_INLINE void CellWeightsOf8(const Column& left, const Column& right, Lanes weights[2][4]) {
    const Lanes rows[4] = {TwoRows(left.upper, right.upper, 0), TwoRows(left.upper, right.upper, 1),
                           TwoRows(left.lower, right.lower, 0), TwoRows(left.lower, right.lower, 1)};
    TwoRowWeights(left.upper, right.upper, 1, rows + 1, weights[0], weights[1]);
    TwoRowWeights(left.lower, right.lower, 0, rows + 2, weights[0] + 2, weights[1] + 2);
}

// One pair of components in four columns of a cell: its sums in the current row, and what a row adds.
struct Slope {
    Lanes sum, step;
};

// Columns at distances `fromLeft` and `fromRight` of the words' centres.
QEX_INLINE Slope MakeSlope(const Column& left, const Column& right, uint32_t pair, Lanes fromLeft,
                           Lanes fromRight) {
    const Lanes l = left.upper.pairs[pair], r = right.upper.pairs[pair];
    const Lanes top = l * fromRight + r * fromLeft;
    return {top * 4, left.lower.pairs[pair] * fromRight + right.lower.pairs[pair] * fromLeft - top};
}

// The current row with 8 bits a component, and on to the next one. `shift` leaves 8 bits of colour and 8 of
// alpha's 4; adding a 32nd or a 16th spreads them over 0 to 255: `factor` is 33 or 34.
QEX_INLINE Lanes NextRow(Slope* slope, uint16_t shift, Lanes factor) {
    const Lanes row = ((slope->sum >> shift) * factor) >> 5;
    slope->sum = slope->sum + slope->step;
    return row;
}

// A cell, four columns at a time.
template <uint32_t kWidth>
void DecodeCell(uint8_t* pixels, size_t rowBytes, const Column& left, const Column& right) {
    constexpr uint16_t kShift = kWidth == 8 ? 2 : 1;
    const Lanes colour = QexLanes_Splat(33 | 33 << 16), alpha = QexLanes_Splat(33 | 34 << 16);
    const bool transparent =
        kWidth == 4 && (left.upper.mode | left.lower.mode | right.upper.mode | right.lower.mode);
    Lanes weights[kWidth / 4][4];
    if constexpr (kWidth == 4)
        CellWeightsOf4(left, right, weights[0]);
    else
        CellWeightsOf8(left, right, weights);
    Lanes fromLeft = {0, 0, 1, 1, 2, 2, 3, 3};
    for (uint32_t column = 0; column < kWidth / 4; ++column, fromLeft = fromLeft + 4) {
        const Lanes fromRight = static_cast<uint16_t>(kWidth) - fromLeft;
        Slope a0 = MakeSlope(left, right, 0, fromLeft, fromRight);
        Slope a1 = MakeSlope(left, right, 1, fromLeft, fromRight);
        Slope b0 = MakeSlope(left, right, 2, fromLeft, fromRight);
        Slope b1 = MakeSlope(left, right, 3, fromLeft, fromRight);
        for (uint32_t row = 0; row < 4; ++row) {
            const Lanes weight = weights[column][row];
            const Lanes ofB = kWidth == 4 ? weight & 15 : weight, ofA = 8 - ofB;
            const Lanes redBlue = NextRow(&a0, kShift, colour) * ofA + NextRow(&b0, kShift, colour) * ofB;
            const Lanes greenAlpha = NextRow(&a1, kShift, alpha) * ofA + NextRow(&b1, kShift, alpha) * ofB;
            Lanes upper = (greenAlpha << 5) & 0xFF00;
            if (transparent) upper = upper & ~(QexLanes_Negative(weight) & QexLanes_Splat(0xFFFF0000));
            const Lanes bytes = redBlue >> 3 | upper;
            memcpy(pixels + row * rowBytes + 16 * column, &bytes, sizeof bytes);
        }
    }
}

struct Image {
    uint8_t* pixels;
    int64_t width, height;

    uint8_t* Pixel(int64_t x, int64_t y) const { return pixels + 4 * static_cast<size_t>(y * width + x); }
};

// A cell whose first pixel is (x, y), or what is in the image of it.
template <uint32_t kWidth>
void DecodeCellAt(const Image& image, int64_t x, int64_t y, const Column& left, const Column& right) {
    if (x >= 0 && y >= 0 && x + kWidth <= image.width && y + 4 <= image.height)
        return DecodeCell<kWidth>(image.Pixel(x, y), 4 * static_cast<size_t>(image.width), left, right);
    uint8_t cell[4][kWidth][4];
    DecodeCell<kWidth>(cell[0][0], sizeof cell[0], left, right);
    for (int64_t row = 0; row < 4; ++row)
        for (int64_t column = 0; column < kWidth; ++column)
            if (x + column >= 0 && x + column < image.width && y + row >= 0 && y + row < image.height)
                memcpy(image.Pixel(x + column, y + row), cell[row][column], 4);
}

// The cells that begin up to two rows above `row` and above those of `end`.
template <uint32_t kWidth>
void Decode(const Grid& grid, const Image& image, int64_t row, int64_t end) {
    // The first row and column of cells hang half over the image's edge. Their outer words are those of the
    // opposite edge.
    size_t upper = grid.rowBits, lower = 0;
    for (int64_t y = 0; y < row; y += 4) {
        upper = lower;
        lower = Next(lower, grid.rowBits);
    }
    for (int64_t y = row - 2; y < end - 2; y += 4) {
        Column columns[2];
        size_t column = grid.columnBits;
        uint32_t right = 0;
        FetchColumn<kWidth>(grid, column | upper, column | lower, &columns[right]);
        for (int64_t x = -int64_t{kWidth / 2}; x < image.width; x += kWidth) {
            column = Next(column, grid.columnBits);
            right ^= 1;
            FetchColumn<kWidth>(grid, column | upper, column | lower, &columns[right]);
            DecodeCellAt<kWidth>(image, x, y, columns[right ^ 1], columns[right]);
        }
        upper = lower;
        lower = Next(lower, grid.rowBits);
    }
}

}  // namespace

void QexPvrtc_DecodeRows(const uint8_t* source, bool twoBits, int32_t width, int32_t height, int32_t row,
                         int32_t rows, uint8_t* pixels) {
    const auto blocks = [](int32_t size, int32_t block) {
        return size > 2 * block ? static_cast<uint32_t>(size / block) : 2u;
    };
    const Grid grid = MakeGrid(source, blocks(width, twoBits ? 8 : 4), blocks(height, 4));
    const Image image = {pixels, width, height};
    // The last cells hang over the lower edge.
    const int64_t end = int64_t{row} + rows < height ? int64_t{row} + rows : int64_t{height} + 2;
    if (twoBits)
        Decode<8>(grid, image, row, end);
    else
        Decode<4>(grid, image, row, end);
}

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
    QexPvrtc_DecodeRows(static_cast<const uint8_t*>(source), twoBits != 0, width, height, 0, height,
                        static_cast<uint8_t*>(destination));
}
