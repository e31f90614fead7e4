#include <functional>

#include "support/Glm.h"
#include "support/PodScenes.h"

namespace {

using everything::Turn;
using glm::mat4;
using glm::vec3;

constexpr uint32_t kLastFrame = 10;

// A scene of 11 frames whose nodes have keys of their own.
class PodAnimation : public testing::Test {
  protected:
    enum Node { kMover, kLamp, kSun, kEye, kChild, kIndexed, kMatrices, kStill, kBone, kNodes };

    PodAnimation() : loaded_(Written()), scene_(&loaded_.scene) {
        EXPECT_EQ(loaded_.result, 0) << loaded_.log;
    }

    // The moving nodes' keys: what they hold at a frame, and what lies between two of them.
    static vec3 Position(uint32_t f) { return vec3(f, f * f, -2 * static_cast<float>(f)); }
    static vec3 Scale(uint32_t f) { return vec3(1 + f, 2, 3 - static_cast<float>(f) / 5); }
    static pod::Vec4 Key(uint32_t f) { return Turn(25 * static_cast<float>(f), f % 3 == 0 ? 1 : 2); }
    static glm::quat Rotation(uint32_t f) { return glm::quat(Key(f)[3], Key(f)[0], Key(f)[1], Key(f)[2]); }
    static mat4 Between(uint32_t a, uint32_t b, float t) {
        return glm::translate(mat4(1), glm::mix(Position(a), Position(b), t)) *
               glm::mat4_cast(glm::slerp(Rotation(a), Rotation(b), t)) *
               glm::scale(mat4(1), glm::mix(Scale(a), Scale(b), t));
    }
    static mat4 Still() {
        return glm::translate(mat4(1), vec3(5, 6, 7)) *
               glm::rotate(mat4(1), glm::radians(70.0f), vec3(1, 0, 0)) * glm::scale(mat4(1), vec3(1, 2, 1));
    }
    static mat4 Spin(uint32_t f) { return glm::rotate(mat4(1), 0.2f * static_cast<float>(f), vec3(0, 1, 0)); }

    static pod::Scene Written() {
        const pod::Transform still{{{5, 6, 7}}, {Turn(70, 0)}, {{1, 2, 1}}, {}};
        pod::Transform moving, spinning;
        pod::Scene scene;
        scene.meshes = {everything::SkinnedMesh()};
        scene.meshes[0].batchBones = {kBone, kChild, kChild, -1};
        scene.cameras = {{kChild, 0.5f, 100, 0.25f, {}}};
        for (uint32_t f = 0; f <= kLastFrame; ++f) {
            const vec3 position = Position(f), scale = Scale(f);
            moving.positions.push_back({position.x, position.y, position.z});
            moving.rotations.push_back(Key(f));
            moving.scales.push_back({scale.x, scale.y, scale.z});
            std::memcpy(spinning.matrices.emplace_back().data(), glm::value_ptr(Spin(f)), sizeof(mat4));
            scene.cameras[0].animatedFov.push_back(0.1f * static_cast<float>(f * f));
        }
        scene.lights = {{-1, {1, 1, 1}, pod::kPointLight, 1, 0, 0, 0, 0},
                        {-1, {1, 1, 1}, pod::kDirectionalLight, 1, 0, 0, 0, 0}};
        scene.nodes = {pod::BuildNode("mover", moving, -1, 0),  pod::BuildNode("lamp", still),
                       pod::BuildNode("sun", moving),           pod::BuildNode("eye", moving, kStill),
                       pod::BuildNode("child", moving, kStill), pod::BuildNode("indexed", moving),
                       pod::BuildNode("matrices", spinning),    pod::BuildNode("still", still),
                       pod::BuildNode("bone", moving, kMover)};
        // The moving node's keys in the order of their index: at frame f the key of frame f * 3 % 11.
        for (uint32_t f = 0; f <= kLastFrame; ++f) {
            scene.nodes[kIndexed].positionIndex.push_back(3 * (f * 3 % 11));
            scene.nodes[kIndexed].rotationIndex.push_back(4 * (f * 3 % 11));
            scene.nodes[kIndexed].scaleIndex.push_back(7 * (f * 3 % 11));
        }
        scene.meshNodeCount = 1;
        scene.frameCount = kLastFrame + 1;
        scene.fps = 20;
        return scene;
    }

    mat4 World(uint32_t node) {
        QexMatrix m;
        QexPODModel_GetWorldMatrix(scene_, &m, &scene_->nodes[node]);
        return ToGlm(m);
    }
    // Entries reach some hundreds.
    static void ExpectNear(const mat4& actual, const mat4& expected, const std::string& what = "") {
        ::ExpectNear(FromGlm(actual), expected, 8e-5f, what);
    }
    void ExpectFrame(uint32_t node, uint32_t frame, float fraction) {
        EXPECT_EQ(scene_->nodes[node].frame, frame) << scene_->nodes[node].name;
        EXPECT_NEAR(scene_->nodes[node].frameFraction, fraction, 1e-5f) << scene_->nodes[node].name;
    }

    LoadedPod loaded_;
    QexPODModel* scene_;
};

TEST_F(PodAnimation, SetFrameWrapsAndSpeedsDiffer) {
    const struct {
        float frame;
        uint32_t sceneInteger;
        float sceneFraction;
        uint32_t nodeInteger;
    } cases[] = {{25, 5, 0, 5},       {3.25f, 3, 0.25f, 3}, {9.5f, 9, 0.5f, 9}, {10, 10, 0, 0},
                 {20, 10, 0, 0},      {10.5f, 0, 0.5f, 0},  {-3, 7, 0, 7},      {-13, 7, 0, 7},
                 {-0.5f, 9, 0.5f, 9}, {-10, 0, 0, 0},       {0, 0, 0, 0}};
    for (const auto& c : cases) {
        QexPODModel_SetFrame(scene_, c.frame);
        EXPECT_EQ(scene_->runtime->frameInteger, c.sceneInteger) << c.frame;
        EXPECT_EQ(scene_->runtime->frameFraction, c.sceneFraction) << c.frame;
        EXPECT_EQ(scene_->runtime->frame, c.frame);
        ExpectFrame(kMover, c.nodeInteger, c.sceneFraction);
    }
    const struct {
        float from, speed, to;
        uint32_t frame;
        float fraction;
    } speeds[] = {{2, 0.5f, 4, 3, 0},      {2, 2, 4, 6, 0},
                  {8, 0.5f, 2, 0, 0},                           // forward through the wrap
                  {8, 0.25f, 3, 9, 0.25f}, {4, 0.5f, 4, 9, 0},  // no way to go is a whole turn
                  {1, 0, 7, 1, 0},         {1, 3, 9, 5, 0}};
    for (const auto& s : speeds) {
        QexPODModel_SetNodeAnimationFrame(scene_, kMover, s.from);
        scene_->nodes[kMover].speed = s.speed;
        QexPODModel_SetFrame(scene_, s.to);
        ExpectFrame(kMover, s.frame, s.fraction);
    }
    EXPECT_EQ(QexPODModel_EnableNodeAnimation(scene_, kBone, 0), 1u);
    QexPODModel_SetFrame(scene_, 6);
    ExpectFrame(kBone, 9, 0);
    ExpectFrame(kChild, 6, 0);
}

TEST_F(PodAnimation, NodesAndBonesCanBeMovedAlone) {
    QexPODNode *child = &scene_->nodes[kChild], *mover = &scene_->nodes[kMover];
    const struct {
        std::function<int32_t()> move;
        uint32_t node, frame;
        float fraction;
    } cases[] = {
        // clang-format off
        {[&] { return QexPODModel_SetNodeAnimationFrame(scene_, kChild, 3.5f); }, kChild, 3, 0.5f},
        {[&] { return QexPODModel_SetNodeAnimationFrame(scene_, kChild, 10); }, kChild, 10, 0},
        {[&] { return QexPODModel_SetNodeAnimationFrame(scene_, kChild, 25); }, kChild, 3, 0},  // modulo the 11
        {[&] { return QexPODModel_SetNodeAnimationFrameByName(scene_, "child", 4); }, kChild, 4, 0},
        {[&] { return QexPODModel_SetNodeAnimationFrameA(scene_, child, 25.5f); }, kChild, 25, 0.5f},
        {[&] { return QexPODModel_SetNodeAnimationTime(scene_, kChild, 0.25f); }, kChild, 5, 0},  // at 20 a second
        {[&] { return QexPODModel_SetNodeAnimationTimeByName(scene_, "child", 0.125f); }, kChild, 2, 0.5f},
        {[&] { return QexPODModel_SetMeshNodeBoneAnimationFrame(scene_, kMover, 14.5f); }, kBone, 3, 0.5f},
        {[&] { return QexPODModel_SetMeshNodeBoneAnimationFrameA(scene_, mover, 14.5f); }, kBone, 3, 0.5f},
        {[&] { return QexPODModel_SetMeshNodeBoneAnimationFrameByName(scene_, "mover", 14.5f); }, kChild, 3, 0.5f},
        // clang-format on
    };
    for (const auto& c : cases) {
        QexPODModel_SetFrame(scene_, 0);
        scene_->cacheStale = 0;
        EXPECT_EQ(c.move(), 0);
        EXPECT_EQ(scene_->cacheStale, 1u);
        ExpectFrame(c.node, c.frame, c.fraction);
        ExpectFrame(kMover, 0, 0);
        ExpectFrame(kIndexed, 0, 0);
    }
    scene_->meshes[0].skinned = 0;
    EXPECT_EQ(QexPODModel_SetMeshNodeBoneAnimationFrame(scene_, kMover, 5), 0);
    ExpectFrame(kBone, 3, 0.5f);

    EXPECT_EQ(QexPODModel_SetNodeAnimationFrame(scene_, kNodes, 1), -12);
    EXPECT_EQ(QexPODModel_SetNodeAnimationFrameByName(scene_, "nobody", 1), -11);
    EXPECT_EQ(QexPODModel_SetNodeAnimationFrameA(scene_, nullptr, 1), 0);
    EXPECT_EQ(QexPODModel_SetNodeAnimationTimeByName(scene_, "nobody", 1), -11);
    EXPECT_EQ(QexPODModel_SetMeshNodeBoneAnimationFrame(scene_, kNodes, 1), -12);
    EXPECT_EQ(QexPODModel_SetMeshNodeBoneAnimationFrameA(nullptr, mover, 1), -9);
    EXPECT_EQ(QexPODModel_SetMeshNodeBoneAnimationFrameByName(scene_, "nobody", 1), -11);
    Capture log(STDERR_FILENO);
    EXPECT_EQ(QexPODModel_SetNodeAnimationTime(scene_, kNodes, 1), -1);
    EXPECT_EQ(log.Text(), "I/Qex: illegal node index 9\n");
}

TEST_F(PodAnimation, TransformsAreInterpolated) {
    for (const float frame : {0.0f, 0.25f, 1.0f, 2.5f, 6.9f, 9.5f, 9.99f}) {
        QexPODModel_SetFrame(scene_, frame);
        const auto f = static_cast<uint32_t>(frame);
        const float t = frame - static_cast<float>(f);
        SCOPED_TRACE(frame);
        ExpectNear(World(kMover), Between(f, f + 1, t));
        ExpectNear(World(kIndexed), Between(f * 3 % 11, (f + 1) * 3 % 11, t), "indexed");
        ExpectNear(World(kChild), Still() * Between(f, f + 1, t), "child");
        ExpectNear(World(kMatrices), Spin(f), "matrix keys are never interpolated");
        QexMatrix parts[3];
        const QexPODNode* node = &scene_->nodes[kMover];
        QexPODModel_GetTranslationMatrix(scene_, &parts[0], node);
        QexPODModel_GetRotationMatrix(scene_, &parts[1], node);
        QexPODModel_GetScalingMatrix(scene_, &parts[2], node);
        ExpectNear(ToGlm(parts[0]) * ToGlm(parts[1]) * ToGlm(parts[2]), Between(f, f + 1, t));
    }
    // Beyond the last key it holds.
    for (const float frame : {10.0f, 10.75f, 11.0f, 1e6f, 4e9f})
        for (const auto& [node, last] :
             {std::pair{kMover, Between(10, 10, 0)}, {kIndexed, Between(8, 8, 0)}, {kMatrices, Spin(10)}}) {
            QexPODModel_SetNodeAnimationFrameA(scene_, &scene_->nodes[node], frame);
            ExpectNear(World(node), last, std::to_string(frame));
        }
}

TEST_F(PodAnimation, OverridesComeBeforeTheAnimation) {
    QexPODModel_SetFrame(scene_, 3);
    const mat4 local = Between(3, 4, 0), scale = glm::scale(mat4(1), vec3(2, 3, 4)),
               move = glm::translate(mat4(1), vec3(-1, -2, -3));
    QexMatrix turn;
    QexMatrix_RotateXYZ(&turn, 10, 20, 30);
    // Translation, rotation, scale: set in any order, one at a time.
    QexPODModel_SetNodeScale(scene_, kChild, 2, 3, 4);
    ExpectNear(World(kChild), Still() * scale * local, "scale");
    QexPODModel_SetNodePosition(scene_, kChild, -1, -2, -3);
    QexPODModel_SetNodeRotation(scene_, kChild, 10, 20, 30);
    // A parent's override moves its children; a matrix is used as it is.
    QexPODModel_SetNodePosition(scene_, kStill, 0, 100, 0);
    ExpectNear(World(kChild),
               glm::translate(mat4(1), vec3(0, 100, 0)) * Still() * move * ToGlm(turn) * scale * local,
               "all");
    const QexMatrix shear = {{1, 0, 0, 0, 0.5f, 1, 0, 0, 0, 0, 1, 0, 4, 5, 6, 1}};
    QexPODModel_SetNodePosition(scene_, kMover, 9, 9, 9);
    QexPODModel_SetNodeMatrix(scene_, kMover, &shear);
    ExpectNear(World(kMover), ToGlm(shear) * local, "matrix");
    QexPODModel_SetNodeScale(scene_, kMatrices, 2, 2, 2);
    ExpectNear(World(kMatrices), glm::scale(Spin(3), vec3(2)), "matrix keys");

    for (const uint32_t node : {kMover, kStill, kChild}) QexPODModel_ResetNodeTransform(&scene_->nodes[node]);
    QexPODModel_SetFrame(scene_, 3);
    ExpectNear(World(kMover), local, "reset");
    ExpectNear(World(kChild), Still() * local, "reset");
    QexPODModel_SetNodePosition(scene_, kNodes, 1, 1, 1);
    QexPODModel_SetNodeMatrix(scene_, UINT32_MAX, &shear);
}

// The node's keys are the only thing that changes, so what is seen tells when they are looked at.
TEST_F(PodAnimation, WorldMatricesAreKeptUntilAFrameOrAnOverrideChanges) {
    float* key = scene_->nodes[kStill].rotation;  // a copy of the reader's
    QexPODModel_SetFrame(scene_, 2);
    const std::function<void()> changes[] = {
        [&] { QexPODModel_SetFrame(scene_, 2); },
        [&] { QexPODModel_SetNodePosition(scene_, kBone, 1, 2, 3); },
        [&] { QexPODModel_SetNodeAnimationFrame(scene_, kSun, 4); },
        [&] { scene_->cacheStale = 1; },
    };
    for (const auto& change : changes) {
        const mat4 last = World(kChild);
        std::swap(key[0], key[1]);
        EXPECT_EQ(World(kChild), last);
        QexMatrix fresh;
        QexPODModel_GetWorldMatrixNoCache(scene_, &fresh, &scene_->nodes[kStill]);
        EXPECT_NE(ToGlm(fresh), World(kStill));
        change();
        EXPECT_NE(World(kChild), last);
    }
}

TEST_F(PodAnimation, BonesMoveFromTheBindPose) {
    QexPODModel_SetFrame(scene_, 0);
    const mat4 boneBind = World(kBone), meshBind = World(kMover);
    QexPODModel_SetFrame(scene_, 4.5f);
    QexMatrix m;
    QexPODModel_GetBoneWorldMatrix(scene_, &m, &scene_->nodes[kMover], &scene_->nodes[kBone]);
    ExpectNear(ToGlm(m), Between(4, 5, 0.5f) * Between(4, 5, 0.5f) * glm::inverse(boneBind) * meshBind,
               "bone");
    QexPODModel_FlushCache(scene_);
    ExpectFrame(kBone, 0, 0);
    QexPODModel_GetBoneWorldMatrix(scene_, &m, &scene_->nodes[kMover], &scene_->nodes[kBone]);
    ExpectNear(ToGlm(m), meshBind, "at frame 0");
}

TEST_F(PodAnimation, CamerasLightsAndPlanes) {
    QexPODModel_SetFrame(scene_, 5.5f);
    const mat4 sun = Between(5, 6, 0.5f), eye = Still() * sun;
    float position[3], target[3], third[4];
    const float fov = (2.5f + 3.6f) / 2;
    const auto expect = [](const float* v, const vec3& expected) {
        ::ExpectNear(QexVec3{v[0], v[1], v[2]}, expected, 2e-4f);
    };
    EXPECT_NEAR(QexPODModel_GetCameraPos(scene_, position, target, 0), fov, 1e-6f);
    expect(position, vec3(eye[3]));
    expect(target, vec3(eye[3]));  // the child has the eye's keys
    EXPECT_NEAR(QexPODModel_GetCameraPosEx(scene_, position, target, third, 0), fov, 1e-6f);
    expect(position, vec3(eye[3]));
    expect(target, vec3(eye[3] - eye[1]));
    expect(third, -vec3(eye[2]));
    scene_->cameras[0].targetIndex = -1;
    target[0] = 77;
    QexPODModel_GetCameraPos(scene_, position, target, 0);
    EXPECT_EQ(target[0], 77) << "without a target it is not written";
    QexPODModel_GetLight(scene_, position, target, 1);
    expect(position, vec3(sun[3]));
    expect(target, -vec3(sun[2]));
    EXPECT_EQ(QexPODModel_GetLightDirection(scene_, 1, third), 0);
    expect(third, -vec3(sun[2]));
    EXPECT_EQ(third[3], 0.0f);
    EXPECT_EQ(QexPODModel_GetLightDirection(scene_, 0, third), -1);
    EXPECT_TRUE(third[0] == 0.5f && third[1] == 0 && third[2] == 0.5f && third[3] == 0);

    // The mesh node moves as the sun does.
    QexPODModel_GetNodePlanePoint(scene_, kMover, position);
    expect(position, vec3(sun * glm::vec4(0, -3, 1, 1)));
    QexPODModel_GetNodePlaneNormal(scene_, kMover, target);
    expect(target, glm::transpose(glm::inverse(glm::mat3(sun))) * vec3(0, 0, 1));
}

TEST(PodStillScenes, OneFrameIsFrameZeroAndPlanesNeedABlock) {
    for (const uint32_t frames : {0u, 1u}) {
        pod::Scene written = everything::Scene();
        written.frameCount = frames;
        LoadedPod loaded(written);
        ASSERT_EQ(loaded.result, 0) << loaded.log;
        QexPODModel* scene = &loaded.scene;
        for (const float frame : {0.0f, 0.5f, 7.0f}) {
            QexPODModel_SetFrame(scene, frame);
            EXPECT_EQ(scene->runtime->frameInteger + scene->runtime->frameFraction, 0);
            EXPECT_EQ(QexPODModel_SetNodeAnimationFrame(scene, everything::kLamp, frame), 0);
            const QexPODNode& lamp = scene->nodes[everything::kLamp];
            EXPECT_EQ(lamp.frame + lamp.frameFraction, 0);
        }
        float normal[3];
        Capture log(STDERR_FILENO);
        QexPODModel_GetNodePlaneNormal(scene, everything::kPlain, normal);
        EXPECT_TRUE(normal[0] == 0 && normal[1] == 1 && normal[2] == 0);
        EXPECT_EQ(log.Text(),
                  "I/Qex: <QexPODModel_GetNodePlaneNormal> unsupported vertex array format - must export "
                  "as interleaved data.\n");
    }
}

}  // namespace
