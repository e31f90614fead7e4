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

#endif

// Red and blue, or green and alpha, of one colour, for four pixels; the second one in the upper half.
QEX_INLINE Lanes QexLanes_Splat(uint32_t pair) {
    const uint32_t pairs[4] = {pair, pair, pair, pair};
    Lanes lanes;
    memcpy(&lanes, pairs, sizeof lanes);
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
