// The math that is compared: four operations on 256 inputs, Qex's through the shared library as an
// application calls it, a peer's behind a function call of this program.
#pragma once

#include <cmath>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include "Qex.h"
#include "Ratio.h"

// A peer has types Matrix (16 floats, column-major) and Quaternion (x, y, z, w), which its inputs are copied
// to, and Multiply, Inverse, ToMatrix and Slerp, which take pointers to them, the result's first.
template <class Peer>
class MathComparison {
  public:
    MathComparison() {
        static_assert(sizeof(typename Peer::Matrix) == sizeof(QexMatrix), "16 floats");
        static_assert(sizeof(typename Peer::Quaternion) == sizeof(QexQuaternion), "4 floats");
        srand48(1);
        for (size_t i = 0; i <= kItems; ++i) {
            QexMatrix_RotateXYZ(&matrices_[i], 180 * Random(), 90 * Random(), 180 * Random());
            for (int k = 12; k < 15; ++k) matrices_[i].m[k] = 100 * Random();
            quaternions_[i] = {Random(), Random(), Random(), Random()};
            QexQuaternion_Normalize(&quaternions_[i]);
        }
        memcpy(static_cast<void*>(peerMatrices_), matrices_, sizeof matrices_);
        memcpy(static_cast<void*>(peerQuaternions_), quaternions_, sizeof quaternions_);
    }

    int Run(int* argc, char** argv, const std::string& peer) {
        RatioBench bench(argc, argv);
        const auto compare = [&](const char* name, auto qex, auto reference) {
            qex(1);
            reference(1);
            RequireEqual();
            bench.Compare(name + (", " + peer), 1, ForAll(qex), ForAll(reference), kItems);
        };
        compare(
            "matrix product",
            [this](size_t i) { QexMatrix_Multiply(&matrix_, &matrices_[i], &matrices_[i + 1]); },
            [this](size_t i) { Peer::Multiply(&peerMatrix_, &peerMatrices_[i], &peerMatrices_[i + 1]); });
        compare(
            "matrix inverse", [this](size_t i) { QexMatrix_Inverse(&matrix_, &matrices_[i]); },
            [this](size_t i) { Peer::Inverse(&peerMatrix_, &peerMatrices_[i]); });
        compare(
            "quaternion to matrix",
            [this](size_t i) { QexQuaternion_ToRotationMatrix(&matrix_, &quaternions_[i]); },
            [this](size_t i) { Peer::ToMatrix(&peerMatrix_, &peerQuaternions_[i]); });
        compare(
            "slerp",
            [this](size_t i) {
                QexQuaternion_Slerp(&quaternion_, &quaternions_[i], &quaternions_[i + 1], Part(i));
            },
            [this](size_t i) {
                Peer::Slerp(&peerQuaternion_, &peerQuaternions_[i], &peerQuaternions_[i + 1], Part(i));
            });
        return bench.Result();
    }

  private:
    static constexpr size_t kItems = 256;  // small enough for the first-level cache

    static float Random() { return static_cast<float>(drand48() * 2 - 1); }
    static float Part(size_t i) { return static_cast<float>(i) / kItems; }

    template <class Operation>
    auto ForAll(Operation operation) {
        return [this, operation] {
            for (size_t i = 0; i < kItems; ++i) {
                operation(i);
                KeepValue(*this);
            }
        };
    }

    // Both sides have just worked on the same inputs. A quaternion and its negative are one rotation.
    void RequireEqual() const {
        float peer[20], own[20];
        memcpy(own, &matrix_, sizeof matrix_);
        memcpy(own + 16, &quaternion_, sizeof quaternion_);
        memcpy(peer, &peerMatrix_, sizeof peerMatrix_);
        memcpy(peer + 16, &peerQuaternion_, sizeof peerQuaternion_);
        const float sign = own[16] * peer[16] < 0 ? -1.0f : 1.0f;
        for (int i = 0; i < 20; ++i) {
            if (std::fabs(own[i] - (i < 16 ? 1 : sign) * peer[i]) <= 1e-3f) continue;
            fprintf(stderr, "the two sides differ in number %d: %g and %g\n", i, double(own[i]),
                    double(peer[i]));
            exit(1);
        }
    }

    QexMatrix matrices_[kItems + 1], matrix_ = {};
    QexQuaternion quaternions_[kItems + 1], quaternion_ = {};
    typename Peer::Matrix peerMatrices_[kItems + 1], peerMatrix_ = {};
    typename Peer::Quaternion peerQuaternions_[kItems + 1], peerQuaternion_ = {};
};
