// Rotations in registers: quaternions (x, y, z, w) as one Float4 each, for nodes that move every frame.
#pragma once

#include <cmath>

#include "math/Float4.h"
#include "Qex/math.h"

// Polynomials fitted at the Chebyshev points of the range; both are off by less than the last bit of a float.

// asin(sqrt(x)) / sqrt(x) for x in [0, 1/2]. Summed in pairs, since the terms do not wait for each other
// then.
inline float QexRotation_ArcSineRatio(float x) {
    const float x2 = x * x, x4 = x2 * x2;
    const float low = (1.0f + 0.166666142f * x) + (0.0750275732f + 0.0440916167f * x) * x2;
    const float high = (0.0358142393f - 0.00702057912f * x) + (0.107400021f - 0.135916271f * x) * x2;
    return low + (high + 0.123913495f * x4) * x4;
}

// sin(sqrt(x)) / sqrt(x) for x in [0, (pi / 2)^2].
inline Float4 QexRotation_SineRatio(Float4 x) {
    const Float4 x2 = x * x;
    const Float4 low = (1.0f - 0.166666666f * x) + (0.00833333097f - 0.000198408612f * x) * x2;
    return low + (2.75252698e-6f - 2.38892177e-8f * x) * (x2 * x2);
}

// See QexQuaternion_Slerp.
inline Float4 QexRotation_Slerp(Float4 a, Float4 b, float t) {
    // Written so that a NaN is refused too.
    if (!(t >= 0 && t <= 1)) return Float4{0, 0, 0, 1};
    const Float4 products = a * b;
    float c = products[3] + products[0] + products[1] + products[2];
    float sign = 1;
    if (c < 0) {
        c = -c;
        sign = -1;
    }
    if (!(c < 1)) return a;
    // With h = (1 - c) / 2, the angle is 2 sqrt(h) asin(sqrt(h)) / sqrt(h), so its square needs no root. What
    // sin(t * angle) and sin((1 - t) * angle) have in common goes with the normalisation.
    const float h = (1 - c) * 0.5f;
    const float ratio = QexRotation_ArcSineRatio(h);
    const float angle2 = 4 * h * ratio * ratio;
    const Float4 parts = {1 - t, t, 0, 0};
    const Float4 shares = parts * QexRotation_SineRatio(parts * parts * angle2);
    const Float4 sum = Splat<0>(shares) * a + Splat<1>(shares) * sign * b;
    const Float4 squares = sum * sum;
    const float length2 = (squares[0] + squares[1]) + (squares[2] + squares[3]);
    return length2 > 0 ? sum / sqrtf(length2) : sum;
}

// See QexQuaternion_ToRotationMatrix.
inline Float4x4 QexRotation_Matrix(Float4 q) {
    const Float4 one = {1, 1, 1, 0}, none = {0, 0, 0, 0};
    const Float4 xyz = Shuffle<0, 1, 2, 4>(q, none);
    const Float4 yzx = Shuffle<1, 2, 0, 3>(xyz), zxy = Shuffle<2, 0, 1, 3>(xyz), twice = zxy + zxy;
    const Float4 diagonal = one - (yzx + yzx) * yzx - twice * zxy;
    const Float4 products = (xyz + xyz) * yzx, turns = twice * Splat<3>(q);
    const Float4 sums = products + turns, differences = products - turns;
    return {Shuffle<0, 1, 6, 7>(Shuffle<0, 4, 1, 5>(diagonal, sums), differences),
            Shuffle<0, 3, 5, 7>(Shuffle<0, 4, 1, 5>(differences, diagonal), sums),
            Shuffle<0, 2, 6, 7>(Shuffle<2, 2, 5, 5>(sums, differences), diagonal), Float4{0, 0, 0, 1}};
}
