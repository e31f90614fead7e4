// Math against GLM, both compiled with the same flags and both behind a function call: Qex's through the
// shared library as an application calls it, GLM's in this program.
#include <cmath>
#include <cstdlib>
#include <glm/glm.hpp>
#include <glm/gtc/matrix_inverse.hpp>
#include <glm/gtc/quaternion.hpp>
#include <glm/gtc/type_ptr.hpp>
#include <vector>

#include "Qex.h"
#include "Ratio.h"

namespace {

constexpr size_t kItems = 256;  // small enough for the first-level cache

float Random() {
    return static_cast<float>(drand48() * 2 - 1);
}

struct Inputs {
    std::vector<QexMatrix> qexMatrices;
    std::vector<glm::mat4> glmMatrices;
    std::vector<QexQuaternion> qexQuaternions;
    std::vector<glm::quat> glmQuaternions;

    Inputs() {
        srand48(1);
        for (size_t i = 0; i <= kItems; ++i) {
            QexMatrix m;
            QexMatrix_RotateXYZ(&m, 180 * Random(), 90 * Random(), 180 * Random());
            for (int k = 12; k < 15; ++k) m.m[k] = 100 * Random();
            qexMatrices.push_back(m);
            const glm::mat4 g = glm::make_mat4(m.m);
            glmMatrices.push_back(g);
            QexQuaternion q = {Random(), Random(), Random(), Random()};
            QexQuaternion_Normalize(&q);
            qexQuaternions.push_back(q);
            glmQuaternions.push_back(glm::quat(q.w, q.x, q.y, q.z));
        }
    }
};

__attribute__((noinline)) void GlmMultiply(glm::mat4* out, const glm::mat4* a, const glm::mat4* b) {
    *out = *a * *b;
}
__attribute__((noinline)) void GlmAffineInverse(glm::mat4* out, const glm::mat4* m) {
    *out = glm::affineInverse(*m);
}
__attribute__((noinline)) void GlmInverse(glm::mat4* out, const glm::mat4* m) {
    *out = glm::inverse(*m);
}
__attribute__((noinline)) void GlmToMatrix(glm::mat4* out, const glm::quat* q) {
    *out = glm::mat4_cast(*q);
}
__attribute__((noinline)) void GlmSlerp(glm::quat* out, const glm::quat* a, const glm::quat* b, float t) {
    *out = glm::slerp(*a, *b, t);
}

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    const Inputs in;
    struct {
        QexMatrix qexMatrix;
        glm::mat4 glmMatrix;
        QexQuaternion qexQuaternion;
        glm::quat glmQuaternion;
    } out;
    const auto forAll = [&out](auto operation) {
        return [&out, operation] {
            for (size_t i = 0; i < kItems; ++i) {
                operation(i);
                KeepValue(out);
            }
        };
    };
    const auto compare = [&](const char* name, double limit, auto qex, auto reference) {
        bench.Compare(name, limit, forAll(qex), forAll(reference), kItems);
    };

    const auto qexMultiply = [&](size_t i) {
        QexMatrix_Multiply(&out.qexMatrix, &in.qexMatrices[i], &in.qexMatrices[i + 1]);
    };
    const auto glmMultiply = [&](size_t i) {
        GlmMultiply(&out.glmMatrix, &in.glmMatrices[i], &in.glmMatrices[i + 1]);
    };
    compare("QexMatrix_Multiply / mat4 * mat4", 1.1, qexMultiply, glmMultiply);

    const auto qexInverse = [&](size_t i) { QexMatrix_Inverse(&out.qexMatrix, &in.qexMatrices[i]); };
    const auto glmAffine = [&](size_t i) { GlmAffineInverse(&out.glmMatrix, &in.glmMatrices[i]); };
    const auto glmInverse = [&](size_t i) { GlmInverse(&out.glmMatrix, &in.glmMatrices[i]); };
    // GLM's affine inverse makes no test for singular matrices and has its determinant in single precision.
    compare("QexMatrix_Inverse / affineInverse", 1.5, qexInverse, glmAffine);
    compare("QexMatrix_Inverse / inverse", 1.0, qexInverse, glmInverse);

    const auto qexToMatrix = [&](size_t i) {
        QexQuaternion_ToRotationMatrix(&out.qexMatrix, &in.qexQuaternions[i]);
    };
    const auto glmToMatrix = [&](size_t i) { GlmToMatrix(&out.glmMatrix, &in.glmQuaternions[i]); };
    compare("QexQuaternion_ToRotationMatrix / mat4_cast", 1.1, qexToMatrix, glmToMatrix);

    const auto qexSlerp = [&](size_t i) {
        const float t = static_cast<float>(i) / kItems;
        QexQuaternion_Slerp(&out.qexQuaternion, &in.qexQuaternions[i], &in.qexQuaternions[i + 1], t);
    };
    const auto glmSlerp = [&](size_t i) {
        const float t = static_cast<float>(i) / kItems;
        GlmSlerp(&out.glmQuaternion, &in.glmQuaternions[i], &in.glmQuaternions[i + 1], t);
    };
    compare("QexQuaternion_Slerp / slerp", 1.5, qexSlerp, glmSlerp);
    return bench.Result();
}
