// Bone batches of a converted mesh: runs of triangles that need few bones each.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

// The bones that a vertex follows, by their number in the scene, largest weight first. The weights add up to
// 255; the bone of a weight of 0 is 0 and counts for nothing.
struct VertexBones {
    std::array<uint32_t, 4> bones{};
    std::array<uint8_t, 4> weights{};
};

// A mesh cut out of a skinned one, its triangles in batches.
struct SkinPiece {
    std::vector<uint32_t> sources;                    // each vertex: which one of the whole mesh it is,
    std::vector<std::array<uint8_t, 4>> boneIndices;  // and its bones, counted within the batch
    std::vector<uint32_t> indices;
    std::vector<std::vector<int32_t>> batchBones;  // the bones of each batch,
    std::vector<int32_t> batchOffsets;             // and its first triangle
};

// The most bones that one triangle follows.
int MostBonesOfATriangle(const std::vector<VertexBones>& vertices, const std::vector<uint32_t>& indices);

// Cuts a mesh into batches of at most `maxBones` bones, as few as a greedy search finds, and into pieces of
// at most `maxVertices` vertices (3 or more). Every triangle comes out once, its corners in their order. A
// vertex is repeated where its bones count differently, and on cuts.
std::vector<SkinPiece> BatchSkin(const std::vector<VertexBones>& vertices,
                                 const std::vector<uint32_t>& indices, int maxBones, uint32_t maxVertices);
