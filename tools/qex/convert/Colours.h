// Colours of vertices, which no shader module reads, as a texture.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <vector>

#include "common/ImageFile.h"

struct aiMesh;

using Texel = std::array<uint8_t, 4>;

// The colour space that the engine's materials and textures are in, from linear light.
float EncodeSrgb(float linear);

// Whether the vertices have colours that show: not all white, nor, unless black is surely meant, all black,
// which some importers leave where a file has none.
bool HasColours(const aiMesh& mesh, bool blackIsMeant);

struct ColourRules {
    bool linear = false;                 // the file's colours are to be encoded
    bool alpha = false;                  // their alpha counts
    std::array<float, 3> tint{1, 1, 1};  // multiplies them
};

// A picture that gives each triangle a square of two by two texels: its corners lie in the middle of three of
// them, and the fourth is such that filtering makes the colours run evenly. Triangles of the same colours
// share a square. It is for a texture without mipmaps.
class ColourAtlas {
  public:
    void Add(unsigned mesh, const aiMesh& source, const ColourRules& rules);
    bool Has(unsigned mesh) const { return squares_.count(mesh) != 0; }
    bool Empty() const { return colours_.empty(); }
    bool Fits() const;  // in a texture

    Image Draw() const;

    // Three for each triangle of a mesh, in the order of TrianglesOf.
    std::vector<std::array<float, 2>> Uvs(unsigned mesh) const;

  private:
    using Corners = std::array<Texel, 3>;

    size_t Width() const;  // in squares, a power of two, like Height
    size_t Height() const;

    std::vector<Corners> colours_;  // of each square
    std::map<Corners, uint32_t> known_;
    std::map<unsigned, std::vector<uint32_t>> squares_;  // by mesh, for each triangle
};
