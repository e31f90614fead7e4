// The textures of the samples, painted in code. Their first row is the lower edge, and they say so.
#include <algorithm>
#include <cmath>
#include <functional>

#include "Paint.h"
#include "SceneFiles.h"

namespace {

using Colour = std::array<float, 4>;  // red, green, blue, alpha, 0 to 1
// The colour at (s, t), counted from the left and from the lower edge, 0 to 1.
using Painter = std::function<Colour(float s, float t)>;

uint8_t ToByte(float value) {
    return static_cast<uint8_t>(255 * std::clamp(value, 0.0f, 1.0f) + 0.5f);
}

void WritePixels(const std::string& path, uint32_t width, uint32_t height, std::vector<uint8_t> rgba) {
    pod::PvrImage image;
    image.width = width;
    image.height = height;
    image.flags = pod::kPvrFlipped;
    image.surfaces = {{std::move(rgba)}};
    WriteFile(path, pod::WritePvr(image));
}

void WritePainted(const std::string& path, uint32_t width, uint32_t height, const Painter& paint) {
    std::vector<uint8_t> pixels;
    for (uint32_t y = 0; y < height; ++y)
        for (uint32_t x = 0; x < width; ++x)
            for (const float channel : paint((static_cast<float>(x) + 0.5f) / static_cast<float>(width),
                                             (static_cast<float>(y) + 0.5f) / static_cast<float>(height)))
                pixels.push_back(ToByte(channel));
    WritePixels(path, width, height, std::move(pixels));
}

Colour Rgb(uint32_t colour) {
    const auto channel = [colour](int shift) { return static_cast<float>(colour >> shift & 255) / 255; };
    return {channel(16), channel(8), channel(0), 1};
}

// Squares of two colours, 2 x 2 to a repetition.
Painter Chequers(uint32_t first, uint32_t second) {
    return [=](float s, float t) { return Rgb((s < 0.5f) == (t < 0.5f) ? first : second); };
}

// Segments from red to green.
Colour Gauge(float s, float) {
    const float segment = std::floor(s * 16), bright = s * 16 - segment < 0.8f ? 1 : 0.2f;
    return {bright * (1 - segment / 16), bright * segment / 16, 0.1f * bright, 1};
}

// A sky over hills, with the sun on the right: upside-down or mirrored it would show.
Colour View(float s, float t) {
    if (std::hypot(s - 0.7f, t - 0.7f) < 0.15f) return {1, 0.9f, 0.3f, 1};
    return t > 0.35f + 0.1f * std::sin(9 * s) ? Colour{0.4f, 0.6f, 1, 1} : Colour{0.2f, 0.5f, 0.2f, 1};
}

Colour Disc(float s, float t) {
    return {(0.5f - std::hypot(s - 0.5f, t - 0.5f)) * 32, 0, 0, 1};
}

// It points up and is red at its left edge.
Colour Arrow(float s, float t) {
    const float aside = std::fabs(s - 0.5f);
    if (s < 0.08f) return {0.9f, 0.2f, 0.2f, 1};
    const bool inside = t > 0.5f ? aside < 0.8f * (0.95f - t) : aside < 0.12f && t > 0.1f;
    return inside ? Colour{1, 1, 1, 1} : Colour{0.2f, 0.5f, 0.8f, 0.7f};
}

// The red of a second texture that gives sparks their shape.
Colour Star(float s, float t) {
    const float x = std::fabs(s - 0.5f), y = std::fabs(t - 0.5f);
    return {1.2f - 6 * std::min(x, y) - 2 * std::max(x, y), 0, 0, 1};
}

// The bands of scenes::Walker, the face with two eyes.
Colour Clothes(float s, float t) {
    if (t < 0.25f) return Rgb(0x503020);
    if (t < 0.5f) return Rgb(0x304880);
    if (t < 0.75f) return Rgb(std::fmod(40 * t, 1.0f) < 0.5f ? 0xC84030 : 0xE8D8C0);
    const bool eye = std::fabs(std::fabs(s - 0.5f) - 0.07f) < 0.025f && std::fabs(t - 0.885f) < 0.006f;
    return Rgb(eye ? 0x202020 : t > 0.9f ? 0x604028 : 0xE0B090);
}

// Blue above, bright at the horizon, with a sun that is low in the west and clouds around it.
std::array<uint8_t, 4> Sky(const pod::Vec3& direction) {
    const float length = std::hypot(direction[0], direction[1], direction[2]);
    const float x = direction[0] / length, y = direction[1] / length, z = direction[2] / length;
    const float up = std::max(y, 0.0f);
    const float sun = -0.74f * x + 0.18f * y - 0.65f * z;
    const float glow = std::pow(std::max(sun, 0.0f), 40.0f), disc = sun > 0.995f ? 1.0f : 0.0f;
    const float cloud = 0.12f * std::max(0.0f, std::sin(9 * x + 3 * z) * std::sin(14 * up + 2 * x) + 0.1f);
    const float sky[] = {0.75f - 0.55f * up, 0.8f - 0.4f * up, 0.9f - 0.15f * up};
    const float warm[] = {0.5f, 0.25f, 0};
    std::array<uint8_t, 4> colour = {0, 0, 0, 255};
    for (size_t i = 0; i < 3; ++i)
        colour[i] = static_cast<uint8_t>(255 * std::min(1.0f, sky[i] + glow * warm[i] + cloud + disc));
    return colour;
}

}  // namespace

void WriteTextures(const std::string& folder) {
    const struct {
        const char* name;
        uint32_t width, height;
        Painter paint;
    } painted[] = {
        {"blue.pvr", 64, 64, Chequers(0xF0D890, 0x3070A0)},
        {"red.pvr", 64, 64, Chequers(0xF0D890, 0xC05030)},
        {"wood.pvr", 64, 64, Chequers(0xE0C080, 0xB08040)},
        {"floor.pvr", 64, 64, Chequers(0xE0E0E0, 0xA0B0C0)},
        {"plain.pvr", 4, 4, Chequers(0xD06050, 0xD06050)},
        {"walker.pvr", 128, 256, Clothes},
        {"gauge.pvr", 128, 16, Gauge},
        {"view.pvr", 64, 64, View},
        {"view_a.pvr", 64, 64, Disc},
        {"arrow.pvr", 64, 64, Arrow},
        {"star.pvr", 32, 32, Star},
    };
    for (const auto& p : painted) WritePainted(folder + p.name, p.width, p.height, p.paint);
    const struct {
        const char* name;
        std::array<uint8_t, 3> colour;
    } spots[] = {{"drop.pvr", {153, 204, 255}},  {"smoke.pvr", {140, 140, 153}},
                 {"flame1.pvr", {255, 204, 77}}, {"flame2.pvr", {255, 115, 26}},
                 {"flame3.pvr", {179, 31, 13}},  {"spark.pvr", {255, 255, 255}}};
    for (const auto& spot : spots) WritePixels(folder + spot.name, 32, 32, pod::Spot(32, spot.colour));
    WritePixels(folder + "waves.pvr", 256, 256, pod::Waves(256));
    WriteFile(folder + "sky.pvr", pod::WritePvr(pod::SkyCube(64, Sky)));
}
