// Short ways to fill a pod::Scene: interleaved float meshes from plain arrays, nodes from transforms.
#pragma once

#include "PodWriter.h"

namespace pod {

using Vec2 = std::array<float, 2>;
using Vec3 = std::array<float, 3>;
using Vec4 = std::array<float, 4>;
using Mat4 = std::array<float, 16>;  // column-major, translation in elements 12 to 14

// One entry per vertex in every array that is not empty; three indices a triangle.
struct MeshArrays {
    std::vector<Vec3> positions, normals, tangents, binormals;
    std::vector<Vec2> uvs;
    std::vector<std::array<uint8_t, 4>> colours;                   // red, green, blue, alpha
    std::vector<std::array<uint8_t, 4>> boneIndices, boneWeights;  // within the batch; shares of 255
    std::vector<uint32_t> indices;
};

// A floor in the XZ plane, `size` across, its texture repeated once a unit.
MeshArrays FloorMesh(float size);

// A mesh of interleaved elements in the order position, normal, tangent, binormal, uv, colour, bone
// indices, bone weights. Indices take 16 bits unless `wideIndices`; the vertex count must fit them.
Mesh BuildMesh(const MeshArrays& arrays, bool wideIndices = false);

// Element over `count` values stored by themselves (not interleaved), `components` to a vertex.
Element FloatElement(const float* values, size_t count, uint32_t components);
Element IndexElement(const std::vector<uint32_t>& indices, bool wide = false);

// Keys of one node: one entry for a fixed value, one per frame for an animated channel, none to leave
// the channel out. Rotations are plain unit quaternions (x, y, z, w) that turn counter-clockwise about
// their axis; the sign that the file wants on w is put in here. Matrices replace the other three.
struct Transform {
    std::vector<Vec3> positions;
    std::vector<Vec4> rotations;
    std::vector<Vec3> scales;
    std::vector<Mat4> matrices;
};

Node BuildNode(const std::string& name, const Transform& transform, int32_t parent = -1, int32_t object = -1,
               int32_t material = -1);

}  // namespace pod
