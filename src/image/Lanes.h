// Four pixels at a time for the texture decoders, in eight lanes of 16 bits: red and blue of pixels 0 to 3 in
// one Lanes (R0 B0 R1 B1 ...), green and alpha in another (G0 A0 G1 A1 ...). The bytes of both interleave to
// RGBA without shuffling, on little-endian hosts, which all of GL ES 2.0 are.
//
// The compiler makes one register of a Lanes with SSE2, NEON or WebAssembly's SIMD. Elsewhere, and where
// QEX_PORTABLE_LANES asks for it, it is an array with the same arithmetic (modulo 2^16).
#pragma once

#include <cstdint>
#include <cstring>

#include "Qex/base.h"

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "pixels are put together from 16-bit lanes");

#define QEX_INLINE inline __attribute__((always_inline))

#if !defined(QEX_PORTABLE_LANES) && (defined(__SSE2__) || defined(__ARM_NEON) || defined(__wasm_simd128__))

typedef uint16_t Lanes __attribute__((vector_size(16)));

// Red and blue, or green and alpha, of one colour, for four pixels; the second one in the upper half.
QEX_INLINE Lanes QexLanes_Splat(uint32_t pair) {
    typedef uint32_t Pairs __attribute__((vector_size(16)));
    return reinterpret_cast<Lanes>(Pairs{pair, pair, pair, pair});
}

// Any eight lanes of a and b: 0 to 7 are a's, 8 to 15 are b's.
template <int... from>
QEX_INLINE Lanes QexLanes_Pick(Lanes a, Lanes b) {
#if defined(__clang__)
    return __builtin_shufflevector(a, b, from...);
#else
    return __builtin_shuffle(a, b, Lanes{from...});
#endif
}

// In each half of 8 bytes: those of `left` from byte `first` on, then the first ones of `right`.
template <int first>
QEX_INLINE Lanes QexLanes_Join(Lanes left, Lanes right) {
    typedef uint64_t Halves __attribute__((vector_size(16)));
    const Halves head = reinterpret_cast<Halves>(left) >> 8 * first;
    const Halves tail = reinterpret_cast<Halves>(right) << (64 - 8 * first);
    return reinterpret_cast<Lanes>(head | tail);
}

#else

struct Lanes {
    uint16_t lane[8];

    Lanes() = default;
    QEX_INLINE Lanes(uint16_t all) : Lanes(all, all, all, all, all, all, all, all) {}
    QEX_INLINE Lanes(uint16_t a, uint16_t b, uint16_t c, uint16_t d, uint16_t e, uint16_t f, uint16_t g,
                     uint16_t h)
        : lane{a, b, c, d, e, f, g, h} {}
};

#define QEX_LANES_OPERATOR(op)                                                   \
    QEX_INLINE Lanes operator op(Lanes a, Lanes b) {                             \
        for (uint32_t i = 0; i < 8; ++i)                                         \
            a.lane[i] = static_cast<uint16_t>(uint32_t{a.lane[i]} op b.lane[i]); \
        return a;                                                                \
    }
QEX_LANES_OPERATOR(+)
QEX_LANES_OPERATOR(-)
QEX_LANES_OPERATOR(*)
QEX_LANES_OPERATOR(&)
QEX_LANES_OPERATOR(|)
QEX_LANES_OPERATOR(^)
QEX_LANES_OPERATOR(<<)
QEX_LANES_OPERATOR(>>)
#undef QEX_LANES_OPERATOR

QEX_INLINE Lanes operator~(Lanes a) {
    return a ^ 0xFFFF;
}

QEX_INLINE Lanes QexLanes_Splat(uint32_t pair) {
    const auto first = static_cast<uint16_t>(pair), second = static_cast<uint16_t>(pair >> 16);
    return {first, second, first, second, first, second, first, second};
}

template <int... from>
QEX_INLINE Lanes QexLanes_Pick(Lanes a, Lanes b) {
    return {(from < 8 ? a.lane[from & 7] : b.lane[from & 7])...};
}

template <int first>
QEX_INLINE Lanes QexLanes_Join(Lanes left, Lanes right) {
    uint64_t halves[2], next[2];
    memcpy(halves, &left, sizeof halves);
    memcpy(next, &right, sizeof next);
    for (uint32_t i = 0; i < 2; ++i) halves[i] = halves[i] >> 8 * first | next[i] << (64 - 8 * first);
    memcpy(&left, halves, sizeof left);
    return left;
}

#endif

QEX_INLINE Lanes QexLanes_Load(const uint16_t from[8]) {
    Lanes lanes;
    memcpy(&lanes, from, sizeof lanes);
    return lanes;
}

// All ones where the lane is negative, else zero.
QEX_INLINE Lanes QexLanes_Negative(Lanes lanes) {
    return 0 - (lanes >> 15);
}

// Writes 16 bytes, R G B A of four pixels. All lanes are 0 to 255.
QEX_INLINE void QexLanes_Store(void* pixels, Lanes redBlue, Lanes greenAlpha) {
    const Lanes bytes = redBlue | (greenAlpha << 8);
    memcpy(pixels, &bytes, sizeof bytes);
}
