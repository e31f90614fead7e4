// Vertex colours become squares of a texture, one for each colour.
#include "convert/Colours.h"

#include <assimp/mesh.h>
#include <algorithm>
#include <cmath>

#include "convert/Meshes.h"

namespace {

constexpr size_t kMostSquares = 2048;  // a side

uint8_t ToByte(float value) {
    return static_cast<uint8_t>(
        std::lround(std::clamp(std::isfinite(value) ? value : 0.0f, 0.0f, 1.0f) * 255.0f));
}

Texel ToTexel(const aiColor4D& c, const ColourRules& rules) {
    const float channels[3] = {c.r, c.g, c.b};
    Texel texel;
    for (size_t i = 0; i < 3; ++i)
        texel[i] = ToByte((rules.linear ? EncodeSrgb(channels[i]) : channels[i]) * rules.tint[i]);
    texel[3] = rules.alpha ? ToByte(c.a) : 255;
    return texel;
}

// The corner opposite to the first one of a square in which a plane runs through the three others.
Texel Fourth(const std::array<Texel, 3>& c) {
    Texel texel;
    for (size_t i = 0; i < 4; ++i)
        texel[i] = static_cast<uint8_t>(std::clamp(c[1][i] + c[2][i] - c[0][i], 0, 255));
    return texel;
}

}  // namespace

float EncodeSrgb(float linear) {
    if (!(linear > 0)) return 0;
    return linear <= 0.0031308f ? 12.92f * linear : 1.055f * std::pow(linear, 1 / 2.4f) - 0.055f;
}

bool HasColours(const aiMesh& mesh, bool blackIsMeant) {
    const aiColor4D* colours = mesh.mColors[0];
    if (!colours) return false;
    const aiColor4D* end = colours + mesh.mNumVertices;
    const bool anyLight =
        std::any_of(colours, end, [](const aiColor4D& c) { return c.r > 0 || c.g > 0 || c.b > 0; });
    const bool anyDark = std::any_of(
        colours, end, [](const aiColor4D& c) { return c.r < 1 || c.g < 1 || c.b < 1 || c.a < 1; });
    return anyDark && (anyLight || blackIsMeant);
}

void ColourAtlas::Add(unsigned mesh, const aiMesh& source, const ColourRules& rules) {
    const std::vector<uint32_t> corners = TrianglesOf(source);
    std::vector<uint32_t>& squares = squares_[mesh];
    for (size_t i = 0; i < corners.size(); i += 3) {
        Corners colours;
        for (size_t k = 0; k < 3; ++k) colours[k] = ToTexel(source.mColors[0][corners[i + k]], rules);
        const auto [entry, isNew] = known_.emplace(colours, static_cast<uint32_t>(colours_.size()));
        if (isNew) colours_.push_back(colours);
        squares.push_back(entry->second);
    }
}

size_t ColourAtlas::Width() const {
    size_t width = 1;
    while (width * width < colours_.size()) width *= 2;
    return width;
}

size_t ColourAtlas::Height() const {
    const size_t width = Width();
    return width > 1 && width * width / 2 >= colours_.size() ? width / 2 : width;
}

bool ColourAtlas::Fits() const {
    return Width() <= kMostSquares;
}

Image ColourAtlas::Draw() const {
    const size_t width = Width();
    Image image;
    image.width = static_cast<int>(2 * width);
    image.height = static_cast<int>(2 * Height());
    image.pixels.assign(4 * width * 2 * Height() * 2, 255);
    for (size_t i = 0; i < colours_.size(); ++i) {
        const Texel texels[4] = {colours_[i][0], colours_[i][1], colours_[i][2], Fourth(colours_[i])};
        for (size_t k = 0; k < 4; ++k) {
            const size_t x = i % width * 2 + k % 2, y = i / width * 2 + k / 2;
            std::copy_n(texels[k].data(), 4, &image.pixels[4 * (y * 2 * width + x)]);
        }
    }
    UpdateHasAlpha(&image);
    return image;
}

std::vector<std::array<float, 2>> ColourAtlas::Uvs(unsigned mesh) const {
    const size_t width = Width();
    std::vector<std::array<float, 2>> uvs;
    for (const uint32_t square : squares_.at(mesh)) {
        for (size_t k = 0; k < 3; ++k) {
            const auto x = static_cast<float>(square % width * 2 + k % 2) + 0.5f;
            const auto y = static_cast<float>(square / width * 2 + k / 2) + 0.5f;
            // V runs up the picture.
            uvs.push_back({x / static_cast<float>(2 * width), 1 - y / static_cast<float>(2 * Height())});
        }
    }
    return uvs;
}
