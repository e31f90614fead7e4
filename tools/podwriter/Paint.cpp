// The textures that are worked out, texel by texel.
#include "Paint.h"

#include <algorithm>
#include <cmath>

namespace pod {

PvrImage SkyCube(uint32_t size, const SkyPaint& paint) {
    // The directions of a face's middle, its columns and its rows, as cube maps have them.
    constexpr struct {
        Vec3 normal, u, v;
    } kFaces[6] = {{{1, 0, 0}, {0, 0, -1}, {0, -1, 0}}, {{-1, 0, 0}, {0, 0, 1}, {0, -1, 0}},
                   {{0, 1, 0}, {1, 0, 0}, {0, 0, 1}},   {{0, -1, 0}, {1, 0, 0}, {0, 0, -1}},
                   {{0, 0, 1}, {1, 0, 0}, {0, -1, 0}},  {{0, 0, -1}, {-1, 0, 0}, {0, -1, 0}}};
    PvrImage image;
    image.width = image.height = size;
    for (const auto& face : kFaces) {
        std::vector<uint8_t> texels;
        for (uint32_t i = 0; i < size * size; ++i) {
            const auto along = [size](uint32_t at) {
                return (2 * static_cast<float>(at) + 1) / static_cast<float>(size) - 1;
            };
            const float s = along(i % size), t = along(i / size);
            Vec3 look;  // the texel opposite is shown
            for (size_t axis = 0; axis < 3; ++axis)
                look[axis] = -(face.normal[axis] + s * face.u[axis] + t * face.v[axis]);
            const auto colour = paint(look);
            texels.insert(texels.end(), colour.begin(), colour.end());
        }
        image.surfaces.push_back({texels});
    }
    return image;
}

std::vector<uint8_t> Spot(uint32_t size, const std::array<uint8_t, 3>& colour) {
    const float radius = static_cast<float>(size) / 2;
    std::vector<uint8_t> pixels;
    for (uint32_t i = 0; i < size * size; ++i) {
        const float x = static_cast<float>(i % size) + 0.5f, y = static_cast<float>(i / size) + 0.5f;
        const float inside = std::max(0.0f, 1 - std::hypot(x - radius, y - radius) / radius);
        pixels.insert(pixels.end(), colour.begin(), colour.end());
        pixels.push_back(static_cast<uint8_t>(255 * inside * inside * (3 - 2 * inside)));
    }
    return pixels;
}

std::vector<uint8_t> Waves(uint32_t size) {
    // Whole waves along s and t, so that they repeat.
    constexpr struct {
        float s, t, across, along;
    } kWaves[] = {{23, 5, 18, 0}, {7, -19, 0, 18}, {11, 13, 12, 12}};
    std::vector<uint8_t> pixels;
    for (uint32_t i = 0; i < size * size; ++i) {
        const float s = static_cast<float>(i % size) / static_cast<float>(size);
        const float t = static_cast<float>(i / size) / static_cast<float>(size);
        float x = 128, z = 128;
        for (const auto& wave : kWaves) {
            const float slope = std::sin(6.2831853f * (wave.s * s + wave.t * t));
            x += wave.across * slope;
            z += wave.along * slope;
        }
        pixels.insert(pixels.end(), {static_cast<uint8_t>(x), 255, static_cast<uint8_t>(z), 255});
    }
    return pixels;
}

}  // namespace pod
