// Transforms of converted nodes: decomposition, sampling of animation channels, keys for the POD file.
#pragma once

#include <assimp/anim.h>
#include <assimp/matrix4x4.h>
#include <assimp/quaternion.h>
#include <assimp/vector3.h>

#include "PodBuild.h"

// Translation, rotation and scale; as a matrix T * R * S.
struct Pose {
    aiVector3D position;
    aiQuaternion rotation;  // w first in memory, identity by default
    aiVector3D scale{1, 1, 1};
};

// False when no pose makes the matrix: it shears, or an axis has no length. `pose` then holds the nearest
// that could be had.
bool DecomposeMatrix(const aiMatrix4x4& matrix, Pose* pose);

// Column-major, as the POD file has it.
pod::Mat4 ToMat4(const aiMatrix4x4& m);

// When the frames are: frame f shows the time f / fps.
struct FrameTimes {
    uint32_t count = 0;  // 0 without animation
    double fps = 30;
    double ticksPerSecond = 25;
    double duration = 0;  // in ticks; the last frame never lies behind it

    double Ticks(uint32_t frame) const;
};

// The frames that cover the animation; at most 65,536, which `truncated` tells.
FrameTimes PlanFrames(const aiAnimation& animation, double fps, bool* truncated);

// The channel at a time: linear between keys, rotations on the shorter arc, held before the first key and
// after the last. What the channel has no keys for comes from `rest`.
Pose SampleChannel(const aiNodeAnim& channel, double ticks, const Pose& rest);

// Keys of a node whose own matrix is `local`, moved by `channel` (may be null), and within which the thing it
// carries is turned and moved by `attachment` (may be null). Values that never change become one key.
pod::Transform BuildTransform(const aiMatrix4x4& local, const aiNodeAnim* channel, const FrameTimes& frames,
                              const Pose* attachment);
