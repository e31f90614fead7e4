// The village's textures, painted in code: noise, stones, tiles, beams. With mipmaps, in 16 bits.
#include <algorithm>
#include <cmath>
#include <functional>

#include "PodBuild.h"
#include "PvrWriter.h"
#include "SceneFiles.h"

namespace {

struct Rgb {
    float r, g, b;
};
using Painter = std::function<Rgb(float s, float t)>;

Rgb Hex(uint32_t colour) {
    const auto channel = [colour](int shift) { return static_cast<float>(colour >> shift & 255) / 255; };
    return {channel(16), channel(8), channel(0)};
}

Rgb Mix(const Rgb& a, const Rgb& b, float share) {
    const float k = std::clamp(share, 0.0f, 1.0f);
    return {a.r + (b.r - a.r) * k, a.g + (b.g - a.g) * k, a.b + (b.b - a.b) * k};
}

Rgb Times(const Rgb& a, float factor) {
    return {a.r * factor, a.g * factor, a.b * factor};
}

// 0 to 1, the same for the same numbers.
float Hash(int x, int y) {
    uint32_t h = static_cast<uint32_t>(x) * 374761393u + static_cast<uint32_t>(y) * 668265263u;
    h = (h ^ h >> 13) * 1274126177u;
    return static_cast<float>((h ^ h >> 16) & 0xFFFF) / 65535;
}

// Smooth noise of `cells` cells to the texture, which repeats with it.
float Noise(float s, float t, int across, int up) {
    const float x = s * static_cast<float>(across), y = t * static_cast<float>(up);
    const int x0 = static_cast<int>(std::floor(x)), y0 = static_cast<int>(std::floor(y));
    const auto at = [&](int i, int j) {
        return Hash(((i % across) + across) % across, ((j % up) + up) % up + 57 * up);
    };
    const auto smooth = [](float f) { return f * f * (3 - 2 * f); };
    const float u = smooth(x - static_cast<float>(x0)), v = smooth(y - static_cast<float>(y0));
    const float low = at(x0, y0) + (at(x0 + 1, y0) - at(x0, y0)) * u;
    const float high = at(x0, y0 + 1) + (at(x0 + 1, y0 + 1) - at(x0, y0 + 1)) * u;
    return low + (high - low) * v;
}

// Several octaves of it.
float Rough(float s, float t, int cells) {
    return 0.5f * Noise(s, t, cells, cells) + 0.3f * Noise(s, t, 2 * cells, 2 * cells) +
           0.2f * Noise(s, t, 4 * cells, 4 * cells);
}

// Rows of stones, each second one shifted by half a stone: the stone's number, and how far its middle is, 0
// to 1.
struct Stone {
    int column, row;
    float edge;
};
Stone StoneAt(float s, float t, int columns, int rows) {
    const float y = t * static_cast<float>(rows);
    const int row = static_cast<int>(std::floor(y));
    const float x = s * static_cast<float>(columns) + (row % 2 ? 0.5f : 0);
    const int column = static_cast<int>(std::floor(x));
    const float dx = std::fabs(x - static_cast<float>(column) - 0.5f) * 2,
                dy = std::fabs(y - static_cast<float>(row) - 0.5f) * 2;
    return {((column % columns) + columns) % columns, row, std::max(dx, dy)};
}

Rgb Stones(const Rgb& dark, const Rgb& light, const Rgb& joint, float s, float t, int columns, int rows) {
    const float bend = 0.12f * (Rough(s, t, 8) - 0.5f);
    const Stone stone =
        StoneAt(s + bend / static_cast<float>(columns), t + bend / static_cast<float>(rows), columns, rows);
    const Rgb face =
        Mix(dark, light, 0.75f * Hash(stone.column + 7, stone.row + 3) + 0.4f * (Rough(s, t, 16) - 0.3f));
    const float rim = std::clamp((stone.edge - 0.72f) / 0.2f, 0.0f, 1.0f);
    return Mix(face, joint, rim * rim);
}

Rgb Grass(float s, float t) {
    const Rgb green = Mix(Hex(0x54702C), Hex(0x86A044), Rough(s, t, 6));
    return Times(Mix(green, Hex(0xA8AC5C), 0.5f * std::max(0.0f, Noise(s, t, 5, 5) - 0.5f)),
                 0.85f + 0.3f * Noise(s, t, 64, 48));
}

Rgb Cobbles(float s, float t) {
    return Stones(Hex(0x8A8078), Hex(0xC4BAA8), Hex(0x5C5448), s, t, 6, 8);
}

Rgb Blocks(float s, float t) {
    return Stones(Hex(0xA09484), Hex(0xDAD0BC), Hex(0x746A5C), s, t, 4, 8);
}

Rgb Tiles(float s, float t) {
    const float y = t * 8;
    const int row = static_cast<int>(y);
    const float x = s * 8 + (row % 2 ? 0.5f : 0), down = y - static_cast<float>(row);
    const float aside = std::fabs(x - std::floor(x) - 0.5f) * 2;
    const Rgb clay = Mix(Hex(0x9C4428), Hex(0xD0703C),
                         Hash(static_cast<int>(std::floor(x)) % 8, row) * 0.8f + 0.2f * Noise(s, t, 32, 32));
    // Round at their lower ends, in the shade of those above.
    const float round = down < 0.35f * aside * aside ? 0.5f : 1;
    return Times(clay, round * (0.75f + 0.25f * (1 - down)) * (1 - 0.2f * aside * aside));
}

Rgb Planks(float s, float t) {
    const float y = t * 6, board = y - std::floor(y);
    const Rgb wood =
        Mix(Hex(0x6E4A2A), Hex(0xA8794A), 0.5f * Hash(static_cast<int>(y), 5) + 0.5f * Noise(s, t, 4, 64));
    return Times(wood, board < 0.08f ? 0.45f : 1);
}

// Bark in the left quarter, leaves beside it.
Rgb Tree(float s, float t) {
    if (s < 0.26f) return Mix(Hex(0x4A3424), Hex(0x7E6044), Noise(s, t, 48, 6));
    const float light = 0.6f * Rough(s, t, 12) + 0.5f * Noise(s, t, 40, 40);
    return Times(Mix(Mix(Hex(0x345C20), Hex(0x5C8C30), light), Hex(0xA0BC58), 2.2f * (light - 0.55f)),
                 0.6f + 0.55f * t);
}

bool Inside(float s, float t, float left, float low, float right, float high) {
    return s > left && s < right && t > low && t < high;
}

// A window: frame, bars, panes that mirror the sky.
bool Window(float s, float t, float x, float y, Rgb* colour) {
    const float w = 0.09f, h = 0.15f;
    if (!Inside(s, t, x - w, y - h, x + w, y + h)) return false;
    const bool pane = Inside(s, t, x - w + 0.02f, y - h + 0.03f, x + w - 0.02f, y + h - 0.03f);
    const bool bar = std::fabs(s - x) < 0.008f || std::fabs(t - y) < 0.012f;
    *colour = pane && !bar
                  ? Mix(Hex(0x283848), Hex(0x90B0C8), (t - y + h) / (2 * h) - 0.4f * (s - x + w) / (2 * w))
                  : Hex(0xE8E0CC);
    return true;
}

// A timbered wall, the front with a door in the left half, a side in the right one.
Rgb Walls(float s, float t) {
    const bool front = s < 0.5f;
    const float x = std::fmod(2 * s, 1.0f);
    Rgb colour =
        Times(Mix(Hex(0xE8DCC0), Hex(0xF8F0DC), Rough(s, t, 10)), 0.8f + 0.2f * std::min(1.0f, 3 * t + 0.2f));
    const Rgb beam = Mix(Hex(0x4A3020), Hex(0x6A4A30), Noise(s, t, 64, 16));
    const float width = 0.025f;
    for (const float upright : {0.0f, 0.35f, 0.65f, 1.0f})
        if (std::fabs(x - upright) < width) colour = beam;
    for (const float level : {0.04f, 0.5f, 0.97f})
        if (std::fabs(t - level) < 1.6f * width) colour = beam;
    if (t < 0.5f && (x < 0.35f || x > 0.65f)) {
        const float along = x < 0.35f ? x / 0.35f : (1 - x) / 0.35f;
        if (std::fabs(t - 0.04f - 0.46f * along) < 0.045f) colour = beam;
    }
    if (t < 0.07f) colour = Stones(Hex(0x888074), Hex(0xB0A898), Hex(0x605848), s, t, 24, 32);
    for (const float place : {0.17f, 0.5f, 0.83f})
        if (!front || place != 0.5f || t > 0.6f) Window(x, t, place, 0.74f, &colour);
    if (front && Inside(x, t, 0.39f, 0.0f, 0.61f, 0.48f)) {
        const bool frame = !Inside(x, t, 0.41f, 0.0f, 0.59f, 0.45f);
        colour = frame ? beam
                       : Times(Mix(Hex(0x7A3A24), Hex(0x9A5030), Noise(s, t, 96, 8)),
                               std::fmod(x * 30, 1.0f) < 0.12f ? 0.6f : 1);
    }
    return colour;
}

// Blue above, pale at the horizon in the middle of its height, clouds between.
Rgb Sky(float s, float t) {
    const float up = std::clamp((t - 0.5f) * 2, 0.0f, 1.0f);
    const Rgb blue = Mix(Hex(0xD8E8F0), Hex(0x4080C0), std::pow(up, 0.6f));
    const float cloud =
        0.55f * Noise(s, t, 10, 16) + 0.3f * Noise(s, t, 22, 36) + 0.15f * Noise(s, t, 48, 72);
    const float cover =
        std::clamp((cloud - 0.5f) * 4, 0.0f, 1.0f) * std::clamp(8 * up, 0.0f, 1.0f) * (1 - up * 0.7f);
    return Mix(blue, Mix(Hex(0xC8D0DC), Hex(0xFFFFFF), 3 * (cloud - 0.45f)), cover);
}

Rgb Lamp(float, float t) {
    return Mix(Hex(0xFFC860), Hex(0xFFF4C0), t);
}

// Clay with dark bands, a meander and figures' stripes.
Rgb Amphora(float s, float t) {
    const Rgb clay = Mix(Hex(0xC86838), Hex(0xE08848), Rough(s, t, 6)), black = Hex(0x241C18);
    const auto meander = [](float x, float y) {
        x -= std::floor(x);
        return y < 0.14f || y > 0.86f || (x < 0.14f) || (x > 0.28f && x < 0.86f && y > 0.58f && y < 0.72f) ||
               (x > 0.72f && x < 0.86f && y > 0.3f && y < 0.72f) ||
               (x > 0.42f && x < 0.86f && y > 0.28f && y < 0.42f);
    };
    if (t < 0.16f || t > 0.86f) return black;
    if (std::fabs(t - 0.2f) < 0.012f || std::fabs(t - 0.76f) < 0.012f || std::fabs(t - 0.42f) < 0.01f)
        return black;
    if (t > 0.44f && t < 0.56f) return meander(12 * s, (t - 0.44f) / 0.12f) ? black : clay;
    if (t > 0.2f && t < 0.42f)
        return std::fabs(std::fmod(16 * s, 1.0f) - 0.5f) < 0.45f * (0.42f - t) / 0.22f ? black : clay;
    if (t > 0.6f && t < 0.74f)
        return std::hypot((std::fmod(14 * s, 1.0f) - 0.5f), (t - 0.67f) * 8) < 0.32f ? black : clay;
    return clay;
}

// White with blue bands and flowers.
Rgb Porcelain(float s, float t) {
    const Rgb white = Hex(0xF4F4EE), blue = Hex(0x2848A0);
    if (std::fabs(t - 0.12f) < 0.015f || std::fabs(t - 0.55f) < 0.012f || std::fabs(t - 0.9f) < 0.02f)
        return blue;
    const float x = std::fmod(6 * s, 1.0f) - 0.5f, y = (t - 0.33f) * 3, radius = std::hypot(x, y);
    const float petals = 0.24f + 0.12f * std::cos(6 * std::atan2(y, x));
    if (radius < 0.07f) return Hex(0xE0B040);
    if (radius < petals) return Mix(blue, Hex(0x7090D8), 2 * radius);
    return std::fabs(t - 0.33f - 0.05f * std::sin(37.699f * s)) < 0.008f ? Mix(white, blue, 0.7f) : white;
}

Rgb Fruit(float s, float t) {
    const float streak = Noise(s, t, 40, 3);
    const Rgb skin = Mix(Hex(0xB02818), Hex(0xE0B048), 0.9f * (1 - t) * streak + 0.25f * Noise(s, t, 6, 4));
    return t > 0.97f ? Hex(0x503818) : skin;
}

Rgb Table(float s, float t) {
    const float x = s * 3, board = x - std::floor(x);
    const float rings = std::sin(40 * (board + 0.25f * Noise(s, t, 6, 2)) + 9 * Hash(static_cast<int>(x), 3));
    const Rgb wood = Mix(Hex(0x7A4A26), Hex(0xB07C48),
                         0.45f + 0.2f * rings + 0.35f * (Noise(s, t, 96, 6) - 0.5f) +
                             0.25f * (Hash(static_cast<int>(x), 8) - 0.5f));
    return Times(wood, board < 0.015f ? 0.4f : 1);
}

// The stones of Blocks as normals: x in green, y in red, z in blue.
Rgb BlockNormals(float s, float t) {
    const auto height = [](float x, float y) {
        const Stone stone = StoneAt(x, y, 4, 8);
        const float rim = std::clamp((1 - stone.edge) / 0.3f, 0.0f, 1.0f);
        return 0.02f * std::sqrt(1 - (1 - rim) * (1 - rim)) +
               0.008f * Rough(x - std::floor(x), y - std::floor(y), 16);
    };
    constexpr float kStep = 1 / 256.0f;
    const float x = (height(s - kStep, t) - height(s + kStep, t)) / (2 * kStep),
                y = (height(s, t - kStep) - height(s, t + kStep)) / (2 * kStep);
    const float length = std::sqrt(x * x + y * y + 1);
    return {0.5f + 0.5f * y / length, 0.5f + 0.5f * x / length, 0.5f + 0.5f / length};
}

// Land, seas, ice and clouds.
Rgb Globe(float s, float t) {
    const float land = 0.55f * Noise(s, t, 6, 4) + 0.3f * Noise(s, t, 14, 8) + 0.15f * Noise(s, t, 36, 20),
                pole = std::fabs(t - 0.5f) * 2;
    Rgb colour = Mix(Hex(0x103060), Hex(0x2868A8), land * 1.6f);
    if (land > 0.52f) colour = Mix(Hex(0x4C8038), Hex(0xB89858), 6 * (land - 0.55f) + 0.5f * (0.4f - pole));
    if (pole + 0.3f * (land - 0.5f) > 0.82f) colour = Hex(0xF0F4F8);
    return Mix(colour, Hex(0xFFFFFF), 3 * (0.5f * Noise(s, t, 10, 12) + 0.5f * Noise(s, t, 24, 30) - 0.58f));
}

// Boards in a frame, with nails.
Rgb Crate(float s, float t) {
    const float edge = std::min({s, t, 1 - s, 1 - t}), across = std::fabs(s - t);
    const bool frame = edge < 0.12f, brace = across < 0.085f;
    const bool upright = frame && std::min(s, 1 - s) < 0.12f;
    const float grain =
        frame || brace ? (upright ? Noise(s, t, 48, 5) : Noise(s, t, 5, 48)) : Noise(s, t, 4, 64);
    const float board = std::fmod(5 * t, 1.0f);
    Rgb wood = frame || brace ? Mix(Hex(0x8A5C30), Hex(0xB8844C), grain)
                              : Mix(Hex(0x9C6C3C), Hex(0xD8A868),
                                    0.7f * grain + 0.3f * Hash(static_cast<int>(5 * t), 2));
    if (!frame && !brace && board < 0.07f) wood = Times(wood, 0.4f);
    // The shade of the frame on the boards, and its own edges.
    if (!frame) wood = Times(wood, std::clamp(0.55f + 8 * (edge - 0.12f), 0.55f, 1.0f));
    if (!frame && !brace) wood = Times(wood, std::clamp(0.6f + 8 * (across - 0.085f), 0.6f, 1.0f));
    if (std::fabs(edge - 0.12f) < 0.006f || (!frame && std::fabs(across - 0.085f) < 0.006f))
        wood = Times(wood, 0.6f);
    for (const float x : {0.06f, 0.94f})
        for (const float y : {0.06f, 0.2f, 0.5f, 0.8f, 0.94f})
            if (std::hypot(s - x, t - y) < 0.013f) wood = Hex(0x403830);
    return wood;
}

Rgb Scales(float s, float t) {
    const Stone scale = StoneAt(s, t, 6, 6);
    const float x = std::fmod(6 * s + (scale.row % 2 ? 0.5f : 0), 1.0f) - 0.5f, y = std::fmod(6 * t, 1.0f);
    const float round = std::hypot(x * 1.7f, y);
    return Times(Mix(Hex(0x40784C), Hex(0xA8C060), 0.6f * Hash(scale.column, scale.row) + 0.5f * (1 - y)),
                 round > 0.95f ? 0.55f : 1.1f - 0.35f * round);
}

// By the boat's own height and length: planks, a white line, red below it.
Rgb Hull(float s, float t) {
    const float board = std::fmod(12 * t, 1.0f);
    const Rgb wood = Mix(Hex(0x8C5830), Hex(0xC08850), Noise(s, t, 6, 64));
    return Times(wood, board < 0.12f ? 0.55f : 1);
}

Rgb Sail(float s, float t) {
    const float seam = std::fmod(4 * t, 1.0f);
    const Rgb cloth = Mix(Hex(0xF4ECD8), Hex(0xFFFAF0), Noise(s, t, 32, 32));
    const Rgb stripe =
        std::fmod(2 * t, 1.0f) < 0.5f ? cloth : Mix(Hex(0xC84838), Hex(0xD85C48), Noise(s, t, 32, 32));
    return Times(stripe, seam < 0.04f ? 0.8f : 1);
}

// A level half as large in each direction that is larger than one.
std::vector<Rgb> Halve(const std::vector<Rgb>& from, uint32_t* width, uint32_t* height) {
    const uint32_t w = std::max(*width / 2, 1u), h = std::max(*height / 2, 1u);
    std::vector<Rgb> to;
    for (uint32_t y = 0; y < h; ++y)
        for (uint32_t x = 0; x < w; ++x) {
            Rgb sum = {0, 0, 0};
            for (uint32_t k = 0; k < 4; ++k) {
                const Rgb& c =
                    from[std::min(2 * y + k / 2, *height - 1) * *width + std::min(2 * x + k % 2, *width - 1)];
                sum = {sum.r + c.r / 4, sum.g + c.g / 4, sum.b + c.b / 4};
            }
            to.push_back(sum);
        }
    *width = w;
    *height = h;
    return to;
}

void Write(const std::string& path, uint32_t width, uint32_t height, const Painter& paint) {
    std::vector<Rgb> level;
    for (uint32_t y = 0; y < height; ++y)
        for (uint32_t x = 0; x < width; ++x)
            level.push_back(paint((static_cast<float>(x) + 0.5f) / static_cast<float>(width),
                                  (static_cast<float>(y) + 0.5f) / static_cast<float>(height)));
    pod::PvrImage image;
    image.type = pod::kPvrRgb565;
    image.width = width;
    image.height = height;
    image.flags = pod::kPvrFlipped;
    image.surfaces.emplace_back();
    for (;;) {
        std::vector<uint8_t> words;
        for (const Rgb& c : level) {
            const auto bits = [](float value, uint32_t most) {
                return static_cast<uint32_t>(std::clamp(value, 0.0f, 1.0f) * static_cast<float>(most) + 0.5f);
            };
            const uint32_t word = bits(c.r, 31) << 11 | bits(c.g, 63) << 5 | bits(c.b, 31);
            words.push_back(static_cast<uint8_t>(word));
            words.push_back(static_cast<uint8_t>(word >> 8));
        }
        image.surfaces[0].push_back(words);
        if (width == 1 && height == 1) break;
        level = Halve(level, &width, &height);
    }
    WriteFile(path, pod::WritePvr(image));
}

}  // namespace

void WriteVillageTextures(const std::string& folder) {
    const struct {
        const char* name;
        uint32_t width, height;
        Rgb (*paint)(float, float);
    } textures[] = {{"dome.pvr", 256, 128, Sky},
                    {"grass.pvr", 128, 128, Grass},
                    {"cobbles.pvr", 128, 128, Cobbles},
                    {"walls.pvr", 256, 128, Walls},
                    {"roof.pvr", 128, 128, Tiles},
                    {"tree.pvr", 128, 128, Tree},
                    {"stones.pvr", 128, 128, Blocks},
                    {"planks.pvr", 64, 64, Planks},
                    {"lamp.pvr", 8, 8, Lamp},
                    {"stones_n.pvr", 128, 128, BlockNormals},
                    {"globe.pvr", 256, 128, Globe},
                    {"crate.pvr", 128, 128, Crate},
                    {"rings.pvr", 128, 128, Scales},
                    {"hull.pvr", 64, 64, Hull},
                    {"sails.pvr", 64, 64, Sail},
                    {"amphora.pvr", 256, 256, Amphora},
                    {"porcelain.pvr", 256, 128, Porcelain},
                    {"fruit.pvr", 64, 64, Fruit},
                    {"table.pvr", 256, 128, Table}};
    for (const auto& t : textures) Write(folder + t.name, t.width, t.height, t.paint);
}
