// Scenes built in code, for samples, tests and benchmarks alike.
#pragma once

#include "PodBuild.h"

namespace scenes {

// A textured-to-be unit quad in the XY plane, v = 0 at its lower edge.
pod::MeshArrays Quad();

// A cube of edge 2 around the origin, each face its own quad.
pod::MeshArrays Cube();

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
