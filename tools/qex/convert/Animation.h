// Transforms of converted nodes: decomposition, sampling of animation channels, keys for the POD file.
#pragma once

#include <assimp/anim.h>
#include <assimp/matrix4x4.h>
#include <assimp/quaternion.h>
#include <assimp/vector3.h>
#include <string>

#include "PodBuild.h"

struct aiScene;

// Translation, rotation and scale; as a matrix T * R * S.
struct Pose {
    aiVector3D position;
    aiQuaternion rotation;  // w first in memory, identity by default
    aiVector3D scale{1, 1, 1};
};

// False when no pose makes the matrix: it shears, or an axis has no length. `pose` then holds the nearest
// that could be had.
bool DecomposeMatrix(const aiMatrix4x4& matrix, Pose* pose);

aiMatrix4x4 Compose(const Pose& pose);

// Column-major, as the POD file has it.
pod::Mat4 ToMat4(const aiMatrix4x4& m);

// When the frames of a clip are: frame f shows the time (f - lead) / fps.
struct FrameTimes {
    const aiAnimation* clip = nullptr;
    uint32_t count = 0;  // 0 without animation
    uint32_t lead = 0;   // frames before the clip, which show the nodes' own matrices
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

// A node's matrix at frame 0, unless that is given: its own where `frames` has a lead and it is a pose.
aiMatrix4x4 FirstMatrix(const aiMatrix4x4& local, const aiNodeAnim* channel, const FrameTimes& frames);

// What else there is to the keys of a node; null where there is nothing.
struct TransformExtras {
    const Pose* attachment = nullptr;  // turns and moves the thing that the node carries within it
    const Pose* lead = nullptr;        // in place of the node's own matrix in the frames before the clip
};

// Keys of a node whose own matrix is `local`, moved by `channel` (may be null). Values that never change
// become one key.
pod::Transform BuildTransform(const aiMatrix4x4& local, const aiNodeAnim* channel, const FrameTimes& frames,
                              const TransformExtras& extras);

// One line for each animation on standard output: index, name, seconds and number of channels, with tabs
// between.
void ListClips(const aiScene& scene);
// Their names, a line each.
std::string ClipNames(const aiScene& scene);

// Index of the animation that `wanted` names, or whose index it is; -1, with the reason in `error`, when
// there is none.
int FindClip(const aiScene& scene, const std::string& wanted, std::string* error);
