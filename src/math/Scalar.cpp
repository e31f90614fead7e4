// Square root, arc functions from series, and small helpers.
#include <cfloat>
#include <cmath>

#include "math/Pi.h"
#include "Qex/math.h"

namespace {

constexpr float kPi = static_cast<float>(kQexPi), kTwoPi = static_cast<float>(2 * kQexPi);
constexpr float kHalfPi = static_cast<float>(kQexPi / 2), kSixthPi = static_cast<float>(kQexPi / 6);
constexpr float kSqrt3 = 1.7320508f;

// Arc tangent of t >= 0: folded into 0..tan(15 degrees), where `terms` terms of the series are enough.
float FoldedArcTan(float t, int terms) {
    const bool inverted = t > 1;
    if (inverted) t = 1 / t;
    const bool reduced = t > 0.268f;
    if (reduced) t = (t * kSqrt3 - 1) / (t + kSqrt3);

    const float square = t * t;
    float power = t, result = t;
    for (int i = 1; i < terms; ++i) {
        power *= -square;
        result += power / static_cast<float>(2 * i + 1);
    }
    if (reduced) result += kSixthPi;
    return inverted ? kHalfPi - result : result;
}

}  // namespace

float Qex_Sign(float a) {
    return a > 1e-7f ? 1.0f : a < -1e-7f ? -1.0f : 0.0f;
}

float Qex_Sqrt(float a) {
    if (a < FLT_MIN) return 0;  // half of the least numbers would be 0
    if (a == 1) return 1;
    if (!(a <= FLT_MAX)) return a;
    // A large root can swing between two neighbours that are further apart than the limit, so the steps are
    // bounded; the widest range of exponents needs about 70.
    float x = a / 2;
    for (int step = 0; step < 80; ++step) {
        const float next = x / 2 + a / (2 * x);
        const bool close = std::fabs(next - x) <= 1e-6f;
        x = next;
        if (close) break;
    }
    return x;
}

float Qex_ArcTan(float t) {
    return FoldedArcTan(t, 3);
}

float Qex_ArcTan2(float x, float y) {
    if (x == 0) return y > 0 ? kHalfPi : y < 0 ? -kHalfPi : 0.0f;
    float angle = FoldedArcTan(std::fabs(y / x), 4);
    if (x < 0 && y > 0)
        angle = kPi - angle;
    else if (x < 0 && y < 0)
        angle += kPi;
    else if (x > 0 && y < 0)
        angle = kTwoPi - angle;
    while (angle < 0) angle += kTwoPi;
    while (angle >= kTwoPi) angle -= kTwoPi;
    return angle;
}

float Qex_ArcSin(float a) {
    return Qex_ArcTan(a / sqrtf(1 - a * a));
}

float Qex_ArcCos(float a) {
    return Qex_ArcTan(sqrtf(1 - a * a) / a);
}

float QexMath_ClampFloat(float v, float a, float b) {
    const float low = a < b ? a : b;
    const float high = a < b ? b : a;
    const float raised = v >= low ? v : low;
    return high >= raised ? raised : high;
}

uint32_t util_number_is_power_2(uint32_t n) {
    return n != 0 && (n & (n - 1)) == 0;
}

int32_t QexIsLittleEndian() {
    static int32_t littleEndian = -1;
    if (littleEndian < 0) {
        const uint32_t word = 1;
        littleEndian = *reinterpret_cast<const uint8_t*>(&word);
    }
    return littleEndian;
}
