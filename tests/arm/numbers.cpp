// Works out matrices, rotations and textures from a fixed row of numbers and prints checksums of their bits:
// the same program on another processor has to print the same lines.
#include <cstdio>
#include <cstring>
#include <vector>

#include "math/Rotation.h"
#include "Qex/images.h"
#include "Qex/math.h"

namespace {

struct Numbers {
    uint32_t state = 1;

    uint32_t Next() { return state = state * 1664525 + 1013904223; }
    float Signed() { return static_cast<float>(static_cast<int32_t>(Next())) / 2147483648.0f; }
};

struct Sum {
    const char* name;
    uint32_t value = 0x811C9DC5;

    explicit Sum(const char* what) : name(what) {}
    ~Sum() { printf("%-12s %08X\n", name, value); }
    void Add(const void* bytes, size_t count) {
        for (size_t i = 0; i < count; ++i)
            value = (value ^ static_cast<const uint8_t*>(bytes)[i]) * 0x01000193;
    }
};

// As a bone's matrix is made: slerp, rotation, parent * local, world * bind.
void PrintMatrices() {
    Numbers numbers;
    Sum products("products"), inverses("inverses"), rotations("rotations"), skins("skins");
    QexMatrix world = g_sMatIdentity;
    for (int i = 0; i < 2000; ++i) {
        QexMatrix m = g_sMatIdentity, inverse = m, product;
        for (int k = 0; k < 15; ++k) m.m[k] = k % 4 == 3 ? 0 : numbers.Signed() * (k < 12 ? 1.0f : 50.0f);
        if (QexMatrix_Inverse(&inverse, &m)) inverses.Add(&inverse, sizeof inverse);
        QexMatrix_Multiply(&product, &m, &world);
        products.Add(&product, sizeof product);
        QexQuaternion ends[2];
        for (QexQuaternion& q : ends) {
            q = {numbers.Signed(), numbers.Signed(), numbers.Signed(), numbers.Signed()};
            QexQuaternion_Normalize(&q);
        }
        const float t = static_cast<float>(i) / 2000;
        const Float4x4 local = QexRotation_Matrix(QexRotation_Slerp(Load4(&ends[0].x), Load4(&ends[1].x), t));
        Store4x4(world.m, local);
        rotations.Add(&world, sizeof world);
        Store4x4(product.m, Product(Product(Load4x4(m.m), local), Load4x4(inverse.m)));
        skins.Add(&product, sizeof product);
    }
}

void PrintTextures() {
    Numbers numbers;
    std::vector<uint8_t> source(128 * 64 / 2), pixels(4 * 128 * 64);
    for (uint8_t& byte : source) byte = static_cast<uint8_t>(numbers.Next() >> 24);
    Sum etc("ETC1"), four("PVRTC 4"), two("PVRTC 2");
    QexDecompressETC(source.data(), 128, 64, pixels.data(), 0);
    etc.Add(pixels.data(), pixels.size());
    QexDecompressPVRTC(source.data(), 0, 128, 64, pixels.data());
    four.Add(pixels.data(), pixels.size());
    QexDecompressPVRTC(source.data(), 1, 128, 64, pixels.data());
    two.Add(pixels.data(), pixels.size());
}

}  // namespace

int main() {
    PrintMatrices();
    PrintTextures();
}
