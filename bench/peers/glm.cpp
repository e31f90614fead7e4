// Math against GLM, with its inverse for affine matrices, which makes no test for singular ones.
#include <glm/glm.hpp>
#include <glm/gtc/matrix_inverse.hpp>
#include <glm/gtc/quaternion.hpp>

#include "Math.h"

namespace {

struct Glm {
    using Matrix = glm::mat4;
    using Quaternion = glm::quat;

    __attribute__((noinline)) static void Multiply(Matrix* out, const Matrix* a, const Matrix* b) {
        *out = *a * *b;
    }
    __attribute__((noinline)) static void Inverse(Matrix* out, const Matrix* m) {
        *out = glm::affineInverse(*m);
    }
    __attribute__((noinline)) static void ToMatrix(Matrix* out, const Quaternion* q) {
        *out = glm::mat4_cast(*q);
    }
    __attribute__((noinline)) static void Slerp(Quaternion* out, const Quaternion* a, const Quaternion* b,
                                                float t) {
        *out = glm::slerp(*a, *b, t);
    }
};

}  // namespace

int main(int argc, char** argv) {
    return MathComparison<Glm>().Run(&argc, argv, "GLM");
}
