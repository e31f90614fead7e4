// The engine's math beside glm's.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <glm/glm.hpp>
#include <glm/gtc/matrix_access.hpp>
#include <glm/gtc/matrix_transform.hpp>
#include <glm/gtc/quaternion.hpp>
#include <glm/gtc/type_ptr.hpp>
#include <random>
#include <string>

#include "Qex.h"

// The same numbers in every run, evenly between -limit and limit.
class Random {
  public:
    float operator()(float limit = 1) {
        return std::uniform_real_distribution<float>(-limit, limit)(engine_);
    }
    glm::vec3 Vec3(float limit = 1) { return {(*this)(limit), (*this)(limit), (*this)(limit)}; }

  private:
    std::mt19937 engine_{42};
};

inline QexMatrix FromGlm(const glm::mat4& g) {
    QexMatrix m;
    std::memcpy(m.m, glm::value_ptr(g), sizeof m);
    return m;
}
inline QexVec3 FromGlm(const glm::vec3& v) {
    return {v.x, v.y, v.z};
}
inline glm::mat4 ToGlm(const QexMatrix& m) {
    return glm::make_mat4(m.m);
}

// Within the tolerance, or that share of an element above 1.
inline void ExpectNear(const QexMatrix& actual, const glm::mat4& expected, float tolerance,
                       const std::string& what = "") {
    for (int i = 0; i < 16; ++i) {
        const float e = glm::value_ptr(expected)[i];
        EXPECT_NEAR(actual.m[i], e, tolerance * std::max(1.0f, std::fabs(e))) << what << " element " << i;
    }
}
inline void ExpectNear(const QexVec3& v, const glm::vec3& expected, float tolerance = 1e-5f) {
    for (int i = 0; i < 3; ++i) EXPECT_NEAR((&v.x)[i], expected[i], tolerance) << "component " << i;
}
