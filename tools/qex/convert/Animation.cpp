// Channels sampled frame by frame, and matrices taken apart into what a node's keys hold.
#include "convert/Animation.h"

#include <assimp/scene.h>
#include <algorithm>
#include <cmath>
#include <cstdio>

namespace {

constexpr uint32_t kMaxFrames = 65536;
constexpr double kDefaultTicksPerSecond = 25;  // for files that leave the rate open

// Index of the last key at or before the time; 0 when the time lies before every key.
template <class Key>
unsigned LastKeyAt(const Key* keys, unsigned count, double ticks) {
    const Key* after = std::upper_bound(keys, keys + count, ticks,
                                        [](double time, const Key& key) { return time < key.mTime; });
    return after == keys ? 0 : static_cast<unsigned>(after - keys) - 1;
}

aiVector3D Blend(const aiVector3D& a, const aiVector3D& b, float t) {
    return a + (b - a) * t;
}

aiQuaternion Blend(const aiQuaternion& a, const aiQuaternion& b, float t) {
    aiQuaternion out;
    aiQuaternion::Interpolate(out, a, b, t);
    return out.Normalize();
}

template <class Key>
auto SampleKeys(const Key* keys, unsigned count, double ticks) {
    const unsigned i = LastKeyAt(keys, count, ticks);
    if (i + 1 >= count || ticks <= keys[i].mTime) return keys[i].mValue;
    // Positive for keys in order, which a broken file need not have.
    const double span = std::max(keys[i + 1].mTime - keys[i].mTime, 1e-9);
    return Blend(keys[i].mValue, keys[i + 1].mValue,
                 static_cast<float>(std::min((ticks - keys[i].mTime) / span, 1.0)));
}

template <class Key>
double LastTime(const Key* keys, unsigned count) {
    return count ? keys[count - 1].mTime : 0.0;
}

aiVector3D Column(const aiMatrix4x4& m, unsigned c) {
    return {m[0][c], m[1][c], m[2][c]};
}

float MaxEntry(const aiMatrix4x4& m) {
    float largest = 0;
    for (unsigned r = 0; r < 3; ++r) {
        for (unsigned c = 0; c < 3; ++c) largest = std::max(largest, std::fabs(m[r][c]));
    }
    return largest;
}

float Finite(float value, float otherwise) {
    return std::isfinite(value) ? value : otherwise;
}

pod::Vec3 ToVec3(const aiVector3D& v, float otherwise) {
    return {Finite(v.x, otherwise), Finite(v.y, otherwise), Finite(v.z, otherwise)};
}

double TicksPerSecond(const aiAnimation& animation) {
    return animation.mTicksPerSecond > 0 ? animation.mTicksPerSecond : kDefaultTicksPerSecond;
}

// In ticks; a key behind the end that the file gives counts too.
double Duration(const aiAnimation& animation) {
    double duration = std::max(animation.mDuration, 0.0);
    for (unsigned i = 0; i < animation.mNumChannels; ++i) {
        const aiNodeAnim& c = *animation.mChannels[i];
        duration = std::max({duration, LastTime(c.mPositionKeys, c.mNumPositionKeys),
                             LastTime(c.mRotationKeys, c.mNumRotationKeys),
                             LastTime(c.mScalingKeys, c.mNumScalingKeys)});
    }
    return duration;
}

// Names come from files: nothing in them breaks a line.
std::string OnOneLine(std::string text) {
    for (char& c : text) {
        if (static_cast<unsigned char>(c) < 32) c = '?';
    }
    return text;
}

// The attachment is a camera or a light: where it stands and faces counts, a scale does not.
Pose Attach(const Pose& pose, const Pose& attachment) {
    Pose out;
    aiVector3D offset = attachment.position;
    out.position = pose.position + pose.rotation.Rotate(offset.SymMul(pose.scale));
    out.rotation = pose.rotation * attachment.rotation;
    out.rotation.Normalize();
    return out;
}

template <size_t N>
bool NeverChanges(const std::vector<std::array<float, N>>& keys) {
    for (const auto& key : keys) {
        for (size_t i = 0; i < N; ++i) {
            const float tolerance = 1e-6f * std::max(1.0f, std::fabs(keys[0][i]));
            if (std::fabs(key[i] - keys[0][i]) > tolerance) return false;
        }
    }
    return true;
}

template <size_t N>
void DropRepeats(std::vector<std::array<float, N>>* keys) {
    if (keys->size() > 1 && NeverChanges(*keys)) keys->resize(1);
}

void AddKey(const Pose& pose, pod::Transform* transform) {
    pod::Vec4 q{pose.rotation.x, pose.rotation.y, pose.rotation.z, pose.rotation.w};
    if (!std::isfinite(q[0] + q[1] + q[2] + q[3])) q = {0, 0, 0, 1};
    // q and -q are the same rotation; neighbours on the same side keep the channel free of jumps.
    if (!transform->rotations.empty()) {
        const pod::Vec4& last = transform->rotations.back();
        if (q[0] * last[0] + q[1] * last[1] + q[2] * last[2] + q[3] * last[3] < 0) {
            for (float& component : q) component = -component;
        }
    }
    transform->positions.push_back(ToVec3(pose.position, 0));
    transform->rotations.push_back(q);
    transform->scales.push_back(ToVec3(pose.scale, 1));
}

}  // namespace

aiMatrix4x4 Compose(const Pose& pose) {
    return aiMatrix4x4(pose.scale, pose.rotation, pose.position);
}

bool DecomposeMatrix(const aiMatrix4x4& m, Pose* pose) {
    pose->position = {m.a4, m.b4, m.c4};
    aiVector3D axis[3];
    float length[3];
    for (unsigned c = 0; c < 3; ++c) {
        axis[c] = Column(m, c);
        length[c] = axis[c].Length();
    }
    // A mirrored matrix becomes a rotation by turning one axis around.
    if (((axis[0] ^ axis[1]) * axis[2]) < 0) length[0] = -length[0];
    pose->scale = {length[0], length[1], length[2]};
    for (unsigned c = 0; c < 3; ++c) {
        if (length[c] == 0 || !std::isfinite(length[c])) return false;
        axis[c] /= length[c];
    }
    pose->rotation = aiQuaternion(aiMatrix3x3(axis[0].x, axis[1].x, axis[2].x, axis[0].y, axis[1].y,
                                              axis[2].y, axis[0].z, axis[1].z, axis[2].z));
    pose->rotation.Normalize();

    const aiMatrix4x4 again = Compose(*pose);
    const float tolerance = 1e-4f * MaxEntry(m);
    for (unsigned r = 0; r < 3; ++r) {
        for (unsigned c = 0; c < 3; ++c) {
            if (!(std::fabs(again[r][c] - m[r][c]) <= tolerance)) return false;
        }
    }
    return true;
}

pod::Mat4 ToMat4(const aiMatrix4x4& m) {
    pod::Mat4 out;
    for (unsigned r = 0; r < 4; ++r) {
        for (unsigned c = 0; c < 4; ++c) out[4 * c + r] = m[r][c];
    }
    return out;
}

double FrameTimes::Ticks(uint32_t frame) const {
    const uint32_t inClip = frame > lead ? frame - lead : 0;
    return std::min(inClip / fps * ticksPerSecond, duration);
}

FrameTimes PlanFrames(const aiAnimation& animation, double fps, bool* truncated) {
    FrameTimes frames;
    frames.clip = &animation;
    frames.fps = fps;
    frames.ticksPerSecond = TicksPerSecond(animation);
    frames.duration = Duration(animation);
    const double exact = frames.duration / frames.ticksPerSecond * fps;
    // The allowance keeps 2.0000001 frames of rounding from becoming a third one.
    const double steps = std::ceil(exact - 1e-3);
    *truncated = !(steps < kMaxFrames);
    if (*truncated) {
        frames.count = kMaxFrames;
    } else {
        frames.count = steps > 0 ? static_cast<uint32_t>(steps) + 1 : 0;
    }
    return frames;
}

Pose SampleChannel(const aiNodeAnim& c, double ticks, const Pose& rest) {
    Pose pose = rest;
    if (c.mNumPositionKeys) pose.position = SampleKeys(c.mPositionKeys, c.mNumPositionKeys, ticks);
    if (c.mNumRotationKeys) pose.rotation = SampleKeys(c.mRotationKeys, c.mNumRotationKeys, ticks);
    if (c.mNumScalingKeys) pose.scale = SampleKeys(c.mScalingKeys, c.mNumScalingKeys, ticks);
    return pose;
}

aiMatrix4x4 FirstMatrix(const aiMatrix4x4& local, const aiNodeAnim* channel, const FrameTimes& frames) {
    Pose rest;
    const bool isPose = DecomposeMatrix(local, &rest);
    if (!channel || frames.count == 0 || (isPose && frames.lead > 0)) return local;
    return Compose(SampleChannel(*channel, frames.Ticks(0), rest));
}

pod::Transform BuildTransform(const aiMatrix4x4& local, const aiNodeAnim* channel, const FrameTimes& frames,
                              const TransformExtras& extras) {
    pod::Transform transform;
    const Pose* attachment = extras.attachment;
    Pose rest;
    const bool isPose = DecomposeMatrix(local, &rest);
    if (!isPose && (!channel || frames.count == 0)) {
        transform.matrices.push_back(ToMat4(attachment ? local * Compose(*attachment) : local));
        return transform;
    }
    const Pose* lead = extras.lead ? extras.lead : isPose ? &rest : nullptr;
    const uint32_t count = channel || extras.lead ? std::max(frames.count, 1u) : 1;
    for (uint32_t f = 0; f < count; ++f) {
        const Pose pose = f < frames.lead && lead ? *lead
                          : channel               ? SampleChannel(*channel, frames.Ticks(f), rest)
                                                  : rest;
        AddKey(attachment ? Attach(pose, *attachment) : pose, &transform);
    }
    DropRepeats(&transform.positions);
    DropRepeats(&transform.rotations);
    DropRepeats(&transform.scales);
    return transform;
}

void ListClips(const aiScene& scene) {
    for (unsigned i = 0; i < scene.mNumAnimations; ++i) {
        const aiAnimation& clip = *scene.mAnimations[i];
        std::printf("%u\t%s\t%.3f\t%u\n", i, OnOneLine(clip.mName.C_Str()).c_str(),
                    Duration(clip) / TicksPerSecond(clip), clip.mNumChannels);
    }
}

std::string ClipNames(const aiScene& scene) {
    std::string names;
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
        names += OnOneLine(scene.mAnimations[i]->mName.C_Str()) + "\n";
    return names;
}

int FindClip(const aiScene& scene, const std::string& wanted, std::string* error) {
    std::string names;
    for (unsigned i = 0; i < scene.mNumAnimations; ++i) {
        const std::string name = scene.mAnimations[i]->mName.C_Str();
        if (name == wanted) return static_cast<int>(i);
        names += (i ? ", " : "") + std::to_string(i) + (name.empty() ? "" : " " + OnOneLine(name));
    }
    for (unsigned i = 0; i < scene.mNumAnimations; ++i) {
        if (wanted == std::to_string(i)) return static_cast<int>(i);
    }
    *error = "no animation '" + OnOneLine(wanted) + "'; " +
             (names.empty() ? "the scene has none" : "expected one of: " + names);
    return -1;
}
