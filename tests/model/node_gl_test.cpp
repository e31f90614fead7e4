// A model's nodes by index and by name: moving, aiming, switching, and where they are on the screen.
#include "support/Glm.h"
#include "support/PodScenes.h"
#include "support/RenderScenes.h"

namespace {

class NodeTest : public NullRenderTest {};

// Mesh nodes "A", "B", ... of a box from (0, 0, 0) to (1, 2, 3).
pod::Scene Boxes(const std::vector<int32_t>& parents) {
    pod::MeshArrays box;
    box.positions = {{0, 0, 0}, {1, 2, 3}, {0, 2, 0}};
    box.indices = {0, 1, 2};
    pod::Scene scene = SceneOf(pod::BuildMesh(box));
    scene.nodes.clear();
    for (const int32_t parent : parents)
        scene.nodes.push_back(
            pod::BuildNode({static_cast<char>('A' + scene.nodes.size())}, {}, parent, 0, 0));
    scene.meshNodeCount = static_cast<uint32_t>(parents.size());
    return scene;
}

template <class Function, class... Args>
int64_t Call(Function function, Args... args) {
    if constexpr (!std::is_void_v<decltype(function(args...))>) return function(args...);
    return function(args...), 0;
}

TEST_F(NodeTest, ByNameDoesWhatByIndexDoes) {
    pod::Scene scene = everything::Scene();
    scene.nodes[everything::kHip].name = "skinned";
    LoadedModel model(scene);
    QexModel* m = &model.model;
    const QexMatrix matrix = FromGlm(glm::rotate(glm::mat4(2), 1.0f, {1, 2, 3}));
    const QexVec3 target = {5, 6, 7};
    struct {
        QexMatrix world;
        QexVec3 place;
    } out = {};
    // A function by index and by name, and what the two return for what is not there.
#define CALLS(name, ...)                                                  \
    [&](uint32_t i) { return Call(QexModel_##name, m, i, __VA_ARGS__); }, \
        [&](const char* n) { return Call(QexModel_##name##ByName, m, n, __VA_ARGS__); }
    using Row = std::tuple<std::function<int64_t(uint32_t)>, std::function<int64_t(const char*)>, int, int>;
    const Row rows[] = {
        {CALLS(SetNodePosition, 1.f, 2.f, 3.f), 0, 0},
        {CALLS(SetNodeRotation, 10.f, 20.f, 30.f), 0, 0},
        {CALLS(SetNodeScale, 4.f, 5.f, 6.f), 0, 0},
        {CALLS(SetNodeFaceTo, &target), 0, 0},
        {CALLS(SetNodeMatrix, &matrix), -12, -1},
        {CALLS(SetNodeAnimationFrame, 1.5f), -12, -11},
        {CALLS(SetMeshNodeBoneAnimationFrame, 1.5f), -12, -11},
        {CALLS(EnableNodeRendering, 0u), 0, 0},
        {CALLS(EnableNodeAnimation, 0u), 0, 0},
        {CALLS(GetNodeWorldMatrix, &out.world), -12, -1},
        {CALLS(GetNodeWorldPos, &out.place), -12, -1},
    };
    // All that these calls may change, as bytes.
    const size_t size = everything::kNodes * sizeof(QexPODNode);
    const auto state = [&] {
        return std::string(reinterpret_cast<char*>(m->scene.nodes), size) +
               std::string(reinterpret_cast<char*>(&out), sizeof out);
    };
    const std::string before = state();
    for (const auto& [plain, byName, outOfRange, unknown] : rows) {
        for (const char* name : {"nobody", "Skinned", static_cast<const char*>(nullptr)})
            EXPECT_EQ(byName(name), unknown);
        for (const uint32_t i : {uint32_t{everything::kNodes}, ~0u}) EXPECT_EQ(plain(i), outOfRange);
        EXPECT_TRUE(state() == before);
        std::string after[2];
        for (const int named : {0, 1}) {
            const int64_t result = named ? byName("skinned") : plain(everything::kSkinned);
            after[named] = state() + std::to_string(result);
            memcpy(m->scene.nodes, before.data(), size);
            out = {};
        }
        EXPECT_TRUE(after[0] == after[1]);
        EXPECT_NE(after[0].compare(0, before.size(), before), 0);
    }
    EXPECT_EQ(QexModel_SetNodeAnimationSpeed(m, "knee", 0.5f), &model.Node(everything::kKnee));
    EXPECT_EQ(model.Node(everything::kKnee).speed, 0.5f);
    // Of the first two materials only the first has a texture, the second of the scene.
    EXPECT_STREQ(QexModel_GetNodeTextureName(m, everything::kSkinned), "stone.pvr");
    for (const uint32_t i : {1u, 2u, ~0u}) EXPECT_EQ(QexModel_GetNodeTextureName(m, i), nullptr);
}

TEST_F(NodeTest, SubtreesAreWalkedDepthFirst) {
    // Below A are B (with D) and E (with C, with G); F is a root of its own.
    LoadedModel model(Boxes({-1, 0, 4, 1, 0, -1, 2})), skinned(everything::Scene());
    const auto hide = [&](uint32_t node, uint32_t before) {
        std::string rendered;
        EXPECT_EQ(QexModel_EnableNodeRenderingR(&model.model, node, 0), before) << node;
        for (uint32_t i = 0; i < 7; ++i)
            if (model.Node(i).stateFlags & QEX_NODE_RENDERING_ENABLED) rendered += model.Node(i).name;
        return rendered;
    };
    EXPECT_EQ(hide(4, 1), "ABDF");
    EXPECT_EQ(hide(0, 0), "F");  // G, the last, was hidden
    EXPECT_EQ(hide(~0u, 0), "F");
    // The lamp, the last below the skinned node, draws no mesh, which is no mistake.
    EXPECT_EQ(QexModel_SetMeshNodeBoneAnimationFrameR(&skinned.model, everything::kSkinned, 2), 0);
    EXPECT_EQ(QexModel_SetMeshNodeBoneAnimationFrame(&skinned.model, everything::kKnee, 3), 0);
    EXPECT_EQ(QexModel_SetMeshNodeBoneAnimationFrame(&skinned.model, 99, 3), -12);
    EXPECT_EQ(skinned.Node(everything::kKnee).frame, 2u);
    EXPECT_EQ(QexModel_SetNodeAnimationFrameR(&skinned.model, everything::kHip, 2.5f), 0);
    EXPECT_EQ(skinned.Node(everything::kKnee).frameFraction, 0.5f);
    EXPECT_EQ(QexModel_EnableNodeAnimationR(&skinned.model, everything::kHip, 0), 1u);
    EXPECT_EQ(skinned.Node(everything::kKnee).stateFlags, QEX_NODE_RENDERING_ENABLED);
}

TEST_F(NodeTest, NodesFaceAndTouch) {
    LoadedModel model(Boxes({-1, 0}));
    QexModel* m = &model.model;
    QexMatrix world;
    const glm::vec3 place(1, -2, 3);
    const glm::vec3 ways[] = {{4, 0, 0}, {1, 2, 3}, {.001f, 0, 1}, {0, 0, 2}, {0, 0, -7}};
    QexModel_SetNodePosition(m, 0, place.x, place.y, place.z);
    for (const glm::vec3& way : ways) {
        // Along the Z axis, half a turn or none about Y.
        const glm::vec3 across = glm::cross({0, 0, 1}, way),
                        axis = across == glm::vec3(0) ? glm::vec3(0, 1, 0) : across;
        const float angle = std::atan2(glm::length(across), way.z);
        // Its own position, the second target, changes nothing.
        for (const QexVec3& target : {FromGlm(place + way), FromGlm(place)}) {
            QexModel_SetNodeFaceTo(m, 0, &target);
            QexModel_GetNodeWorldMatrix(m, 1, &world);
            ExpectNear(world, glm::rotate(glm::translate(glm::mat4(1), place), angle, axis), 2e-6f);
        }
    }
    QexModel_ResetNodeTransform(m, 0);
    QexModel_GetNodeWorldMatrix(m, 1, &world);
    ExpectNear(world, glm::mat4(1), 0, "reset");
    QexVec3 overlap;
    QexModel_SetNodePosition(m, 1, 0, 1.5f, 0);
    QexModel_UpdateModelBoundingBox(m, nullptr);
    EXPECT_EQ(QexModel_TestNodes(m, 0, m, 1, &overlap), 1);
    EXPECT_EQ(overlap.y, 0.5f);
    EXPECT_EQ(QexModel_TestNodesByName(m, "A", m, "B", nullptr), 1);
    EXPECT_EQ(QexModel_TestNodesByName(m, "Z", m, "A", nullptr), 0);
}

// Where the corners of a box at `place`, turned by 20 degrees, fall: left, top, right, bottom.
glm::vec4 ScreenRect(const glm::mat4& seen, glm::vec3 place, glm::vec3 scale) {
    const glm::mat4 turned = glm::rotate(glm::translate(seen, place), glm::radians(20.f), {0, 0, 1});
    glm::vec4 r(1e9f, 1e9f, -1e9f, -1e9f);
    for (int corner = 0; corner < 8; ++corner) {
        const glm::vec3 local(corner & 4 ? 1 : 0, corner & 2 ? 2 : 0, corner & 1 ? 3 : 0);
        const glm::vec4 c = turned * glm::vec4(scale * local, 1);
        const glm::vec2 p(kWidth * (0.5f + c.x / c.w / 2), kHeight * (0.5f - c.y / c.w / 2));
        r = glm::vec4(glm::min({r.x, r.y}, p), glm::max({r.z, r.w}, p));
    }
    return r;
}

TEST_F(NodeTest, ScreenBoxesAndPicking) {
    const struct {
        glm::vec3 place, scale;
        bool shown, whole;
    } cases[] = {
        {{0, 0, 0}, {1, 1, 1}, true, true},              // in the middle
        {{0.2f, 0, -3}, {1, 1, 1}, true, true},          // behind it
        {{-5, 1, 0}, {2, 1, 1}, true, false},            // partly left of the screen
        {{1, -5, 0}, {1, 2, 1}, true, false},            // partly below
        {{1, 1, 15}, {1, 1, 1}, false, false},           // behind the eye
        {{-1, -1, 8}, {2, 2, 5}, false, false},          // on both sides of the eye
        {{0, 0, -80}, {1, 1, 9}, false, false},          // across the far plane
        {{0.5f, 1, 9.6f}, {1, 1, 0.03f}, false, false},  // close before the eye
        {{0, 0, 0}, {1, 1, 1}, false, true},             // hidden
    };
    constexpr uint32_t kCount = 9, kHidden = 8;
    LoadedModel model(Boxes(std::vector<int32_t>(kCount, -1)));
    QexModel* m = &model.model;
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    const QexVec3 eye = {0.5f, 1, 10}, target = {0.5f, 1, 0};
    const float aspect = float{kWidth} / kHeight, fov = 0.9f;
    QexCamera_LookAt(&camera, &eye, &target, nullptr);
    QexCamera_Project(&camera, fov, aspect, 1, 80);
    const glm::mat4 seen =
        glm::translate(glm::perspectiveRH_ZO(2 * std::atan(std::tan(fov / 2) / aspect), aspect, 1.f, 80.f),
                       {-0.5f, -1, -10});
    for (uint32_t i = 0; i < kCount; ++i) {
        const auto& [place, scale, shown, whole] = cases[i];
        QexModel_SetNodePosition(m, i, place.x, place.y, place.z);
        QexModel_SetNodeRotation(m, i, 0, 0, 20);
        QexModel_SetNodeScale(m, i, scale.x, scale.y, scale.z);
    }
    QexModel_EnableNodeRendering(m, kHidden, 0);
    QexModel_UpdateModelBoundingBox(m, nullptr);
    QexModel_CalcScreenBBox(&runtime_, m, &camera);
    glm::vec4 rects[kCount] = {};
    for (uint32_t i = 0; i < kCount; ++i) {
        if (cases[i].shown) rects[i] = ScreenRect(seen, cases[i].place, cases[i].scale);
        const QexVec3* box = m->screenBoxes[i].corners;
        const glm::vec4 rect(box[2].x, box[2].y, box[5].x, box[5].y);
        EXPECT_LT(glm::distance(rect, rects[i]), 1e-4f * (1 + glm::length(rect))) << i;
        EXPECT_EQ(QexModel_IsNodeInScreen(&runtime_, m, i), cases[i].whole) << i;
    }
    EXPECT_LT(m->screenBoxes[0].centre.z, m->screenBoxes[1].centre.z);
    for (int i = 0; i < 600; ++i) {
        const QexVec2 point = {static_cast<float>(i % 30 * 5), static_cast<float>(i / 30 * 5)};
        std::vector<uint32_t> expected, hits(kCount);
        for (uint32_t n = 0; n < kCount; ++n)
            if (rects[n].x < point.x && point.x < rects[n].z && rects[n].y < point.y && point.y < rects[n].w)
                expected.push_back(n);
        for (const size_t capacity : {size_t{kCount}, size_t{1}, size_t{0}}) {
            int32_t count = 99;
            QexModel_Pick(m, nullptr, &point, &count, hits.data(), static_cast<int32_t>(capacity));
            hits.resize(static_cast<size_t>(count));
            expected.resize(std::min(expected.size(), capacity));
            EXPECT_EQ(hits, expected) << point.x << " " << point.y;
        }
    }
}

}  // namespace
