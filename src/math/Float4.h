// Four floats at a time, for the parts of the math that every node of every frame runs through. The compiler
// keeps a Float4 in one SIMD register where the target has them, and splits it where not.
#pragma once

#include <cstring>

#include "Qex/base.h"

typedef float Floats __attribute__((vector_size(16)));
typedef double Double2 __attribute__((vector_size(16)));
typedef int32_t Int4 __attribute__((vector_size(16)));
typedef int64_t Long2 __attribute__((vector_size(16)));

#if defined(__ARM_NEON) && !defined(__aarch64__) && !defined(__clang__)
#define QEX_NEON32 1
#else
#define QEX_NEON32 0
#endif

#if QEX_NEON32

#include <arm_neon.h>

// GCC splits the arithmetic of floats here, since NEON flushes denormal ones to 0, unless it is told by name.
// There is no division in NEON: it is the lanes' own.
struct Float4 {
    float32x4_t lanes;

    Float4() = default;
    Float4(float32x4_t all) : lanes(all) {}
    Float4(float all) : lanes(vdupq_n_f32(all)) {}
    Float4(float x, float y, float z, float w) : lanes(float32x4_t{x, y, z, w}) {}
    float operator[](int lane) const { return lanes[lane]; }
};

inline Float4 operator+(Float4 a, Float4 b) {
    return vaddq_f32(a.lanes, b.lanes);
}
inline Float4 operator-(Float4 a, Float4 b) {
    return vsubq_f32(a.lanes, b.lanes);
}
inline Float4 operator*(Float4 a, Float4 b) {
    return vmulq_f32(a.lanes, b.lanes);
}
inline Float4 operator/(Float4 a, Float4 b) {
    return a.lanes / b.lanes;
}
inline Float4& operator*=(Float4& a, Float4 b) {
    return a = a * b;
}
inline Floats Raw(Float4 a) {
    return a.lanes;
}

#else

typedef Floats Float4;

inline Floats Raw(Float4 a) {
    return a;
}

#endif

inline Float4 FromBits(Int4 bits) {
    return reinterpret_cast<Floats>(bits);
}
inline Int4 Bits(Float4 a) {
    return reinterpret_cast<Int4>(Raw(a));
}

inline Float4 Load4(const float* from) {
    Float4 value;
    memcpy(&value, from, sizeof value);
    return value;
}

inline void Store4(float* to, Float4 value) {
    memcpy(to, &value, sizeof value);
}

// Any four lanes of a and b: 0 to 3 are a's, 4 to 7 are b's.
template <int i, int j, int k, int l>
inline Float4 Shuffle(Float4 a, Float4 b) {
#if defined(__clang__)
    return __builtin_shufflevector(a, b, i, j, k, l);
#else
    return __builtin_shuffle(Raw(a), Raw(b), Int4{i, j, k, l});
#endif
}
// As integers, since SSE2 shuffles those into another register.
template <int i, int j, int k, int l>
inline Float4 Shuffle(Float4 a) {
#if defined(__clang__)
    return __builtin_shufflevector(a, a, i, j, k, l);
#else
    return FromBits(__builtin_shuffle(Bits(a), Int4{i, j, k, l}));
#endif
}

// One lane in all four.
template <int lane>
inline Float4 Splat(Float4 a) {
#if QEX_NEON32
    const float32x2_t half = lane < 2 ? vget_low_f32(a.lanes) : vget_high_f32(a.lanes);
    return vdupq_lane_f32(half, lane % 2);
#else
    return Shuffle<lane, lane, lane, lane>(a);
#endif
}

// The lanes without their signs.
inline Float4 Magnitude(Float4 a) {
    return FromBits(Bits(a) & INT32_MAX);
}
inline Double2 Magnitude(Double2 a) {
    return reinterpret_cast<Double2>(reinterpret_cast<Long2>(a) & INT64_MAX);
}

// The first three lanes, and 0.
inline Float4 FirstThree(Float4 a) {
    return FromBits(Bits(a) & Int4{-1, -1, -1, 0});
}

// The first two lanes.
inline Double2 Widen(Float4 a) {
#if defined(__SSE2__)
    typedef double Double4 __attribute__((vector_size(32)));
    const Double4 wide = __builtin_convertvector(a, Double4);
    return Double2{wide[0], wide[1]};
#else
    return Double2{a[0], a[1]};
#endif
}

// c0 * v.x + c1 * v.y + c2 * v.z
inline Float4 Combine3(Float4 c0, Float4 c1, Float4 c2, Float4 v) {
    return c0 * Splat<0>(v) + c1 * Splat<1>(v) + c2 * Splat<2>(v);
}

// A matrix by its columns.
struct Float4x4 {
    Float4 x, y, z, w;
};

inline Float4x4 Load4x4(const float* m) {
    return {Load4(m), Load4(m + 4), Load4(m + 8), Load4(m + 12)};
}

inline void Store4x4(float* to, const Float4x4& m) {
    Store4(to, m.x);
    Store4(to + 4, m.y);
    Store4(to + 8, m.z);
    Store4(to + 12, m.w);
}

inline Float4 Transform(const Float4x4& m, Float4 v) {
    return Combine3(m.x, m.y, m.z, v) + m.w * Splat<3>(v);
}

inline Float4x4 Product(const Float4x4& a, const Float4x4& b) {
    return {Transform(a, b.x), Transform(a, b.y), Transform(a, b.z), Transform(a, b.w)};
}
