// Math against cglm, whose functions are inlined into one call each. It has no inverse for affine matrices
// with scale, so the general one stands against Qex's.
#include <cglm/cglm.h>

#include "Math.h"

namespace {

struct Cglm {
    struct Matrix {
        mat4 m;
    };
    struct Quaternion {
        versor q;
    };
    // cglm takes what it only reads as pointers to what it may write.
    static float (*In(const Matrix* m))[4] { return const_cast<Matrix*>(m)->m; }
    static float* In(const Quaternion* q) { return const_cast<Quaternion*>(q)->q; }

    __attribute__((noinline)) static void Multiply(Matrix* out, const Matrix* a, const Matrix* b) {
        glm_mat4_mul(In(a), In(b), out->m);
    }
    __attribute__((noinline)) static void Inverse(Matrix* out, const Matrix* m) {
        glm_mat4_inv(In(m), out->m);
    }
    __attribute__((noinline)) static void ToMatrix(Matrix* out, const Quaternion* q) {
        glm_quat_mat4(In(q), out->m);
    }
    __attribute__((noinline)) static void Slerp(Quaternion* out, const Quaternion* a, const Quaternion* b,
                                                float t) {
        glm_quat_slerp(In(a), In(b), t, out->q);
    }
};

}  // namespace

int main(int argc, char** argv) {
    return MathComparison<Cglm>().Run(&argc, argv, "cglm");
}
