// Scenes built in code, for samples, tests and benchmarks alike.
#pragma once

#include "PodBuild.h"

namespace scenes {

// A textured-to-be unit quad in the XY plane, v = 0 at its lower edge.
pod::MeshArrays Quad();

// A cube of edge 2 around the origin, each face its own quad.
pod::MeshArrays Cube();

// A sphere of radius 1 with tangents and binormals; u goes once around, v = 0 is the lower pole.
pod::MeshArrays Sphere(uint32_t segments);

// A scene of mesh nodes that stand where they are given, each with its own mesh and its own
// white material.
struct Object {
    const char* name;
    pod::MeshArrays mesh;
    pod::Vec3 position;
};
pod::Scene Still(const std::vector<Object>& objects);

// A boat of about 2.4 along X, afloat at y = 0: the nodes "hull" and "sails", a material each.
pod::Scene Boat();

// Two mesh nodes: "floor", 8 across, and "worm", a tube of `bones` bones that stands on it and bends with
// them over `frames` frames; frame 0 is its bind pose. Its vertices follow two bones each and name them as
// nodes: it has no batches.
pod::Scene Worm(uint32_t bones, uint32_t frames);

// A figure 1.8 high that faces +Z and walks on the spot, a step of both legs from frame 1 to the last. Frame
// 0 is its bind pose. Its texture has four bands, from below: shoes, trousers, shirt, skin.
pod::Scene Walker(uint32_t frames);

// `count` mesh nodes on a square grid in the XY plane, one apart, all drawing the same cube at a quarter of
// its size.
pod::Scene Grid(uint32_t count);

// `chains` chains of `length` nodes, each moving, turning and scaling over `frames` frames on top of its
// parent. The nodes draw one cube.
pod::Scene Chains(uint32_t chains, uint32_t length, uint32_t frames);

// A scene of about `bytes` bytes in the proportions of exported ones: mostly vertex blocks and indices, the
// rest keys.
pod::Scene Large(size_t bytes);

}  // namespace scenes
