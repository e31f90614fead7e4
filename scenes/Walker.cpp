// A figure that walks: rounded parts that follow bones, with knees and elbows that bend.
#include <algorithm>
#include <cmath>

#include "Scenes.h"

namespace scenes {

namespace {

constexpr float kLeg = 0.45f;  // thigh, and shin
constexpr float kTurn = 6.2831853f;

enum Bone {
    kHips,
    kChest,
    kHead,
    kThigh,
    kShin = kThigh + 2,
    kArm = kShin + 2,
    kForearm = kArm + 2,
    kBones = kForearm + 2
};

// Where each bone's joint is in the bind pose, relative to its parent's. Of pairs the left one comes first.
const struct {
    const char* name;
    int parent;
    pod::Vec3 place;
} kSkeleton[kBones] = {{"hips", -1, {0, 2 * kLeg, 0}},
                       {"chest", kHips, {0, 0.22f, 0}},
                       {"head", kChest, {0, 0.36f, 0}},
                       {"left thigh", kHips, {0.11f, 0, 0}},
                       {"right thigh", kHips, {-0.11f, 0, 0}},
                       {"left shin", kThigh, {0, -kLeg, 0}},
                       {"right shin", kThigh + 1, {0, -kLeg, 0}},
                       {"left arm", kChest, {0.25f, 0.22f, 0}},
                       {"right arm", kChest, {-0.25f, 0.22f, 0}},
                       {"left forearm", kArm, {0, -0.3f, 0}},
                       {"right forearm", kArm + 1, {0, -0.3f, 0}}};

// A rounded part: an ellipsoid that follows the upper bone above `joint` and the lower one below it.
struct Part {
    pod::Vec3 centre, radii;
    int upper, lower;
    float joint;
    float band;  // of the texture, 0 to 1: shoes, trousers, shirt, skin
};

void AddPart(const Part& part, pod::MeshArrays* arrays) {
    constexpr float kBlend = 0.2f;  // height over which a joint bends
    const pod::MeshArrays ball = Sphere(10);
    const auto first = static_cast<uint32_t>(arrays->positions.size());
    for (size_t v = 0; v < ball.positions.size(); ++v) {
        pod::Vec3 position, normal;
        for (size_t i = 0; i < 3; ++i) {
            position[i] = part.centre[i] + part.radii[i] * ball.positions[v][i];
            normal[i] = ball.normals[v][i] / part.radii[i];
        }
        const float length = std::hypot(normal[0], normal[1], normal[2]);
        const float share = std::clamp(0.5f + (part.joint - position[1]) / kBlend, 0.0f, 1.0f);
        const auto weight = static_cast<uint8_t>(255 * share);
        arrays->positions.push_back(position);
        arrays->normals.push_back({normal[0] / length, normal[1] / length, normal[2] / length});
        arrays->uvs.push_back({ball.uvs[v][0], part.band + 0.1f * (ball.uvs[v][1] - 0.5f)});
        // Bones are nodes, behind the mesh's own.
        arrays->boneIndices.push_back(
            {static_cast<uint8_t>(1 + part.upper), static_cast<uint8_t>(1 + part.lower), 0, 0});
        arrays->boneWeights.push_back({static_cast<uint8_t>(255 - weight), weight, 0, 0});
    }
    for (const uint32_t index : ball.indices) arrays->indices.push_back(first + index);
}

pod::MeshArrays Body() {
    pod::MeshArrays body;
    AddPart({{0, 1.17f, 0}, {0.21f, 0.33f, 0.13f}, kChest, kHips, 1.0f, 0.625f}, &body);
    AddPart({{0, 1.64f, 0.01f}, {0.12f, 0.16f, 0.13f}, kHead, kHead, 0, 0.875f}, &body);
    for (int right = 0; right < 2; ++right) {
        const float side = right ? -1.0f : 1.0f;
        AddPart({{0.11f * side, 0.5f, 0}, {0.1f, 0.49f, 0.1f}, kThigh + right, kShin + right, kLeg, 0.375f},
                &body);
        AddPart(
            {{0.11f * side, 0.07f, 0.05f}, {0.075f, 0.07f, 0.15f}, kShin + right, kShin + right, 0, 0.125f},
            &body);
        AddPart({{0.25f * side, 1.07f, 0},
                 {0.065f, 0.32f, 0.065f},
                 kArm + right,
                 kForearm + right,
                 1.04f,
                 0.625f},
                &body);
        AddPart(
            {{0.25f * side, 0.74f, 0}, {0.05f, 0.07f, 0.06f}, kForearm + right, kForearm + right, 0, 0.875f},
            &body);
    }
    return body;
}

// How far a leg and an arm are turned about X, in radians, at a moment of the step: 0 to 1.
struct Pose {
    float thigh, shin, arm, forearm;
};

Pose PoseOf(float step) {
    const float swing = std::sin(kTurn * step), forward = std::max(0.0f, std::cos(kTurn * step));
    return {-0.5f * swing - 0.1f * forward, 0.12f + 0.85f * forward, 0.45f * swing, -0.35f + 0.25f * swing};
}

float Reach(const Pose& pose) {
    return kLeg * (std::cos(pose.thigh) + std::cos(pose.thigh + pose.shin));
}

pod::Transform KeysOf(int bone, uint32_t frames) {
    pod::Transform keys;
    for (uint32_t frame = 0; frame < frames; ++frame) {
        const float step = static_cast<float>(frame - 1) / static_cast<float>(frames - 1);
        const Pose left = PoseOf(step), right = PoseOf(step + 0.5f);
        const float angles[kBones] = {0,          0,        0,         left.thigh,   right.thigh,  left.shin,
                                      right.shin, left.arm, right.arm, left.forearm, right.forearm};
        const float angle = frame ? angles[bone] : 0;
        pod::Vec3 place = kSkeleton[bone].place;
        // The longer leg stands on the floor.
        if (bone == kHips && frame) place[1] = std::max(Reach(left), Reach(right));
        keys.positions.push_back(place);
        keys.rotations.push_back({std::sin(angle / 2), 0, 0, std::cos(angle / 2)});
    }
    return keys;
}

}  // namespace

pod::Scene Walker(uint32_t frames) {
    pod::Scene scene = Still({{"walker", Body(), {0, 0, 0}}});
    scene.frameCount = frames;
    for (int bone = 0; bone < kBones; ++bone) {
        const int parent = kSkeleton[bone].parent;
        scene.nodes.push_back(
            pod::BuildNode(kSkeleton[bone].name, KeysOf(bone, frames), parent < 0 ? -1 : 1 + parent));
    }
    return scene;
}

}  // namespace scenes
