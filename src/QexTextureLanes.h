// Four pixels at a time for the texture decoders, in eight lanes of 16 bits: red and blue of pixels 0 to 3 in
// one Lanes (R0 B0 R1 B1 ...), green and alpha in another (G0 A0 G1 A1 ...). One register on SSE2 and NEON;
// the compiler makes words of it where there is neither. The bytes of both interleave to RGBA without
// shuffling, on little-endian hosts, which all of GL ES 2.0 are.
#pragma once

#include <cstdint>
#include <cstring>

typedef uint16_t Lanes __attribute__((vector_size(16)));
typedef int16_t SignedLanes __attribute__((vector_size(16)));

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "pixels are put together from 16-bit lanes");

// Always inline: without SIMD registers there is no convention to pass lanes by.
#define QEX_INLINE inline __attribute__((always_inline))

// Red and blue, or green and alpha, of one colour, for four pixels.
QEX_INLINE Lanes QexLanes_Splat(uint32_t pair) {
    typedef uint32_t Pairs __attribute__((vector_size(16)));
    return reinterpret_cast<Lanes>(Pairs{pair, pair, pair, pair});
}

// Every lane shifted by its sign: all ones where it is negative, else zero.
QEX_INLINE Lanes QexLanes_Negative(Lanes lanes) {
    return reinterpret_cast<Lanes>(reinterpret_cast<SignedLanes>(lanes) >> 15);
}

// Writes 16 bytes, R G B A of four pixels. All lanes are 0 to 255.
QEX_INLINE void QexLanes_Store(void* pixels, Lanes redBlue, Lanes greenAlpha) {
    const Lanes bytes = redBlue | (greenAlpha << 8);
    memcpy(pixels, &bytes, sizeof bytes);
}
