// Planes and the water's part of a frustum, systems of equations, random numbers.
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <ctime>

#include "Qex/geometry.h"
#include "Qex/math.h"

namespace {

// Signed distance of a point from a plane with a unit normal. The plane's own offset is added per component,
// which keeps the sum small for points near a plane far from the origin.
float PlaneDistance(const QexVec4& plane, const QexVec3& p) {
    return plane.x * (plane.x * plane.w + p.x) + plane.y * (plane.y * plane.w + p.y) +
           plane.z * (plane.z * plane.w + p.z);
}

constexpr int32_t kMaxPlaneVertices = 5;

// The polygon under construction: intersections with one plane, written at a stride.
struct PlanePolygon {
    const QexVec4* plane;
    char* out;
    int32_t stride;
    int32_t count;

    void Emit(const QexVec3& from, const QexVec3& to) {
        // A plane cuts four coplanar corners at most twice, so that five always do; rounding may see more.
        if (count == kMaxPlaneVertices) return;
        QexVec3 vertex;
        QexMath_CalcIntersectionLinePlane(&vertex, plane, &from, &to);
        memcpy(out, &vertex, sizeof vertex);
        out += stride;
        ++count;
    }
};

// Far corners of a view volume from the inverse view-projection, closed by the first corner again.
void FarCorners(QexVec3 corners[5], const QexMatrix& m, float farPlane) {
    constexpr float kSigns[5][2] = {{-1, -1}, {1, -1}, {1, 1}, {-1, 1}, {-1, -1}};
    for (int i = 0; i < 5; ++i) {
        const auto component = [&m, farPlane, sign = kSigns[i]](int r) {
            return (sign[0] * m.m[r] + sign[1] * m.m[4 + r] + m.m[8 + r] + m.m[12 + r]) * farPlane;
        };
        corners[i] = {component(0), component(1), component(2)};
    }
}

// Brings a row with a coefficient for unknown n into row n - 1. False when there is none.
bool BringPivot(float** rows, int32_t n) {
    int32_t pivot = n - 1;
    while (pivot >= 0 && rows[pivot][n] == 0) --pivot;
    if (pivot < 0) return false;
    for (int32_t k = 0; pivot != n - 1 && k <= n; ++k) {
        const float value = rows[pivot][k];
        rows[pivot][k] = rows[n - 1][k];
        rows[n - 1][k] = value;
    }
    return true;
}

}  // namespace

void QexMath_CalcIntersectionLinePlane(QexVec3* out, const QexVec4* plane, const QexVec3* p0,
                                       const QexVec3* p1) {
    const QexVec3 normal = {plane->x, plane->y, plane->z};
    QexVec3 along, step;
    QexVec3_Subtract(&along, p1, p0);
    const float t = -(QexVec3_DotProduct(&normal, p0) + plane->w) / QexVec3_DotProduct(&normal, &along);
    QexVec3_Add(out, p0, QexVec3_Scale(&step, &along, t));
}

int32_t QexMath_CalculateInfinitePlane(void* out, int32_t stride, const QexVec4* plane,
                                       const QexMatrix* matrix, const QexVec3* eye, float farPlane) {
    if (PlaneDistance(*plane, *eye) < 0) return 0;
    QexVec3 corners[5];
    FarCorners(corners, *matrix, farPlane);

    PlanePolygon polygon = {plane, static_cast<char*>(out), stride, 0};
    bool previousAbove = false;
    for (int k = 4; k >= 0; --k) {
        const bool above = !(PlaneDistance(*plane, corners[k]) < 0);
        if (k < 4 && above != previousAbove) polygon.Emit(corners[k + 1], corners[k]);
        if (k > 0 && !above) polygon.Emit(*eye, corners[k]);
        previousAbove = above;
    }
    return polygon.count;
}

void QexMath_LinearEqSolve(float* result, float** rows, int32_t n) {
    for (int32_t last = n; last > 1; --last) {
        if (!BringPivot(rows, last)) continue;
        const float* pivot = rows[last - 1];
        for (int32_t j = 0; j < last - 1; ++j) {
            const float factor = rows[j][last] / pivot[last];
            for (int32_t k = 0; k < last; ++k) rows[j][k] -= factor * pivot[k];
        }
    }
    for (int32_t i = 1; i <= n; ++i) {
        const float* row = rows[i - 1];
        float rest = row[0];
        for (int32_t k = 1; k < i; ++k) rest -= row[k] * result[k - 1];
        result[i - 1] = rest / row[i];
    }
}

int32_t GetRandomNumber() {
    static bool seeded = false;
    if (!seeded) {
        srand48(static_cast<long>(time(nullptr)));
        seeded = true;
    }
    return static_cast<int32_t>(lrand48());
}

float GetRandomFloat() {
    // The factor is a little above 2^-31, and the largest numbers would round to 1.
    constexpr float kBelowOne = 0.99999994f;
    const float value = static_cast<float>(GetRandomNumber()) * 4.656613e-10f;
    return value < kBelowOne ? value : kBelowOne;
}

float GetRandomFloatByRange(float min, float max) {
    return min + (max - min) * GetRandomFloat();
}

int32_t GetRandomInt(int32_t min, int32_t max) {
    const float f = GetRandomFloat();
    const float low = static_cast<float>(min);
    const float value = (static_cast<float>(max) - low + 1) * f + low;
    // Ranges near the ends of the type can round past it.
    if (value >= 2147483648.0f) return max;
    const int32_t cut = value < -2147483648.0f ? min : static_cast<int32_t>(value);
    // The sum rounds up to max + 1 now and then.
    return max >= 0 && cut > max ? max : cut;
}
