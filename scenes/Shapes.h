// Shapes that scenes are put together of. All lie outward, counter-clockwise from outside.
#pragma once

#include <array>
#include <vector>

#include "PodBuild.h"

namespace shapes {

// A part of a texture.
struct UvRect {
    float left, bottom, right, top;
};

// Of length 1, towards the side from which a, b and c are counter-clockwise; zeros where they are in line.
pod::Vec3 NormalOf(const pod::Vec3& a, const pod::Vec3& b, const pod::Vec3& c);
// Two triangles for each cell of a grid of vertices that begins at `first`, u first.
void AddGridIndices(uint32_t first, uint32_t across, uint32_t up, pod::MeshArrays* mesh);
// A flat quad; its corners are those of the rectangle from the lower left on, counter-clockwise.
void AddQuad(const std::array<pod::Vec3, 4>& corners, const UvRect& uv, pod::MeshArrays* mesh);
void AddTriangle(const std::array<pod::Vec3, 3>& corners, const std::array<pod::Vec2, 3>& uvs,
                 pod::MeshArrays* mesh);
// Its faces have `uv` each, those above and below a point of it.
void AddBox(const pod::Vec3& low, const pod::Vec3& high, const UvRect& uv, pod::MeshArrays* mesh);
// Upright around the Y axis, from one radius and height to another; closed above by a flat lid, unless it is
// a point. A radius within the first one turns it inside out.
struct Turned {
    float bottom, top, low, high;  // radii, heights
    int sides;
    bool flat;  // sides with an edge between them
};
void AddTurned(const Turned& shape, const pod::Vec3& place, const UvRect& uv, pod::MeshArrays* mesh);
// Smooth, turned from a profile of radii and heights, from below; u goes once around, v along the height. A
// curve through the profile's points has four steps between each two.
void AddLathe(const std::vector<pod::Vec2>& profile, int sides, const UvRect& uv, pod::MeshArrays* mesh);
// An ellipsoid.
void AddBlob(const pod::Vec3& centre, const pod::Vec3& radii, int sides, const UvRect& uv,
             pod::MeshArrays* mesh);

}  // namespace shapes
