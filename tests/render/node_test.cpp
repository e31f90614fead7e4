// A model's nodes by index and by name: moving, aiming, switching, and where they are on the screen.
#include "Scenes.h"
#include "support/Glm.h"
#include "support/PodScenes.h"

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

// Where the calls of the table below put their results, and all that they may change.
std::array<float, 16> g_out;

std::vector<float> Snapshot(QexModel* model) {
    std::vector<float> values(g_out.begin(), g_out.end());
    g_out = {};
    for (uint32_t i = 0; i < model->scene.nodeCount; ++i) {
        QexPODNode& node = model->scene.nodes[i];
        QexMatrix world;
        QexPODModel_GetWorldMatrix(&model->scene, &world, &node);
        values.insert(values.end(), world.m, world.m + 16);
        values.push_back(static_cast<float>(node.stateFlags));
        values.push_back(static_cast<float>(node.frame) + node.frameFraction);
    }
    return values;
}

struct Pair {
    std::function<int64_t(QexModel*, uint32_t)> plain;
    std::function<int64_t(QexModel*, const char*)> byName;
    int64_t outOfRange, unknown;
};

template <class Function, class... Args>
int64_t Call(Function function, Args... args) {
    if constexpr (std::is_void_v<decltype(function(args...))>)
        return function(args...), 0;
    else
        return function(args...);
}

template <class Plain, class ByName, class... Args>
Pair Both(int64_t outOfRange, int64_t unknown, Plain plain, ByName byName, Args... args) {
    return {[=](QexModel* model, uint32_t index) { return Call(plain, model, index, args...); },
            [=](QexModel* model, const char* name) { return Call(byName, model, name, args...); }, outOfRange,
            unknown};
}

TEST_F(NodeTest, ByNameDoesWhatByIndexDoes) {
    const QexMatrix matrix = FromGlm(glm::rotate(glm::mat4(2), 1.0f, {1, 2, 3}));
    const QexVec3 target = {5, 6, 7};
    void* const out = g_out.data();
    const Pair pairs[] = {
        Both(0, 0, QexModel_SetNodePosition, QexModel_SetNodePositionByName, 1.f, 2.f, 3.f),
        Both(0, 0, QexModel_SetNodeRotation, QexModel_SetNodeRotationByName, 10.f, 20.f, 30.f),
        Both(0, 0, QexModel_SetNodeScale, QexModel_SetNodeScaleByName, 4.f, 5.f, 6.f),
        Both(-12, -1, QexModel_SetNodeMatrix, QexModel_SetNodeMatrixByName, &matrix),
        Both(0, 0, QexModel_SetNodeFaceTo, QexModel_SetNodeFaceToByName, &target),
        Both(-12, -11, QexModel_SetNodeAnimationFrame, QexModel_SetNodeAnimationFrameByName, 1.5f),
        Both(-12, -11, QexModel_SetMeshNodeBoneAnimationFrame, QexModel_SetMeshNodeBoneAnimationFrameByName,
             1.5f),
        Both(0, 0, QexModel_EnableNodeRendering, QexModel_EnableNodeRenderingByName, 0u),
        Both(0, 0, QexModel_EnableNodeAnimation, QexModel_EnableNodeAnimationByName, 0u),
        Both(-12, -1, QexModel_GetNodeWorldMatrix, QexModel_GetNodeWorldMatrixByName,
             static_cast<QexMatrix*>(out)),
        Both(-12, -1, QexModel_GetNodeWorldPos, QexModel_GetNodeWorldPosByName, static_cast<QexVec3*>(out)),
    };
    pod::Scene scene = everything::Scene();
    scene.nodes[everything::kHip].name = "skinned";
    for (const Pair& pair : pairs) {
        const ptrdiff_t row = &pair - pairs;
        LoadedModel plain(scene), byName(scene);
        const auto before = Snapshot(&byName.model);
        for (const char* name : {"nobody", "Skinned", static_cast<const char*>(nullptr)})
            EXPECT_EQ(pair.byName(&byName.model, name), pair.unknown) << row;
        for (const uint32_t index : {uint32_t{everything::kNodes}, ~0u})
            EXPECT_EQ(pair.plain(&byName.model, index), pair.outOfRange) << row;
        EXPECT_EQ(Snapshot(&byName.model), before) << row;
        const int64_t result = pair.plain(&plain.model, everything::kSkinned);
        const auto after = Snapshot(&plain.model);
        EXPECT_EQ(pair.byName(&byName.model, "skinned"), result) << row;
        EXPECT_EQ(Snapshot(&byName.model), after) << row;
        EXPECT_NE(after, before) << row;
    }
    LoadedModel model(scene);
    EXPECT_EQ(QexModel_SetNodeAnimationSpeed(&model.model, "knee", 0.5f), &model.Node(everything::kKnee));
    EXPECT_EQ(model.Node(everything::kKnee).speed, 0.5f);
    EXPECT_EQ(QexModel_SetNodeAnimationSpeed(&model.model, nullptr, 0.5f), nullptr);
    EXPECT_STREQ(QexModel_GetNodeName(&model.model, everything::kKnee), "knee");
    EXPECT_EQ(QexModel_GetNodeName(&model.model, everything::kNodes), nullptr);
    // Of the first two materials only the first has a texture, the second of the scene.
    EXPECT_STREQ(QexModel_GetNodeTextureName(&model.model, everything::kSkinned), "stone.pvr");
    for (const uint32_t node : {everything::kPlain, everything::kStrips, everything::kNodes})
        EXPECT_EQ(QexModel_GetNodeTextureName(&model.model, node), nullptr) << node;
}

TEST_F(NodeTest, SubtreesAreWalkedDepthFirst) {
    // Below A are B (with D) and E (with C, with G); F is a root of its own.
    LoadedModel model(Boxes({-1, 0, 4, 1, 0, -1, 2}));
    QexModel* m = &model.model;
    const auto rendered = [&] {
        std::string text;
        for (uint32_t i = 0; i < 7; ++i)
            if (model.Node(i).stateFlags & QEX_NODE_RENDERING_ENABLED) text += *model.Node(i).name;
        return text;
    };
    EXPECT_EQ(QexModel_EnableNodeRenderingR(m, 4, 0), 1u);
    EXPECT_EQ(rendered(), "ABDF");
    QexModel_EnableNodeRendering(m, 6, 1);
    EXPECT_EQ(QexModel_EnableNodeRenderingR(m, 0, 0), 1u);  // what G, the last, was
    EXPECT_EQ(rendered(), "F");
    EXPECT_EQ(QexModel_EnableNodeRenderingR(m, ~0u, 0), 0u);
    EXPECT_EQ(rendered(), "F");

    std::vector<int32_t> parents(1000);
    for (int32_t i = 0; i < 1000; ++i) parents[static_cast<size_t>(i)] = i - 1;
    pod::Scene deep = Boxes(parents);
    deep.frameCount = 9;
    LoadedModel chain(deep), skinned(everything::Scene());
    EXPECT_EQ(QexModel_SetNodeAnimationFrameR(&chain.model, 10, 2.5f), 0);
    EXPECT_EQ(chain.Node(9).frame, 0u);
    EXPECT_EQ(chain.Node(999).frameFraction, 0.5f);
    QexModel_EnableNodeAnimationR(&chain.model, 10, 0);
    EXPECT_EQ(chain.Node(999).stateFlags, QEX_NODE_RENDERING_ENABLED);
    // The lamp, the last below the skinned node, draws no mesh.
    EXPECT_EQ(QexModel_SetMeshNodeBoneAnimationFrameR(&skinned.model, everything::kSkinned, 2), -12);
    EXPECT_EQ(skinned.Node(everything::kKnee).frame, 2u);
}

TEST_F(NodeTest, NodesFaceAndTouch) {
    LoadedModel model(Boxes({-1, 0}));
    QexModel* m = &model.model;
    QexMatrix world;
    const glm::vec3 place(1, -2, 3);
    QexModel_SetNodePosition(m, 0, place.x, place.y, place.z);
    for (const glm::vec3& to : {glm::vec3{4, 0, 0},
                                {-2, 0, 0},
                                {0, 5, 0},
                                {0, -1, 0},
                                {0, 0, 2},
                                {1, 2, 3},
                                {3, 1, -9},
                                {0.001f, 0, 1},
                                {0, 0, -7}}) {
        const glm::vec3 across = glm::cross({0, 0, 1}, to);
        const glm::vec3 axis = across == glm::vec3(0) ? glm::vec3(0, 1, 0) : across;
        const glm::mat4 faces =
            glm::rotate(glm::translate(glm::mat4(1), place), std::atan2(glm::length(across), to.z), axis);
        // Its own position, the second target, changes nothing.
        for (const QexVec3& target : {FromGlm(place + to), FromGlm(place)}) {
            QexModel_SetNodeFaceTo(m, 0, &target);
            QexModel_GetNodeWorldMatrix(m, 0, &world);
            ExpectNear(world, faces, 2e-6f, std::to_string(to.z));
        }
    }
    QexModel_ResetNodeTransform(m, 0);
    QexModel_ResetNodeTransform(m, 2);
    QexModel_GetNodeWorldMatrix(m, 1, &world);
    ExpectNear(world, glm::mat4(1), 0, "reset");
    QexVec3 overlap;
    for (const float y : {1.5f, 2.5f}) {
        QexModel_SetNodePosition(m, 1, 0, y, 0);
        QexModel_UpdateModelBoundingBox(m, nullptr);
        EXPECT_EQ(QexModel_TestNodes(m, 0, m, 1, &overlap), y < 2);
        EXPECT_EQ(QexModel_TestNodesByName(m, "A", m, "B", nullptr), y < 2);
        EXPECT_EQ(overlap.y, y < 2 ? 0.5f : 0);
    }
    EXPECT_EQ(QexModel_TestNodes(m, 0, m, 2, nullptr) + QexModel_TestNodesByName(m, "Z", m, "A", nullptr), 0);
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
        {{90, 0, 0}, {1, 1, 1}, true, false},            // beside the screen
        {{1, 1, 15}, {1, 1, 1}, false, false},           // behind the eye
        {{-1, -1, 8}, {2, 2, 5}, false, false},          // on both sides of the eye
        {{0, 0, -80}, {1, 1, 9}, false, false},          // across the far plane
        {{0.5f, 1, 9.6f}, {1, 1, 0.03f}, false, false},  // close before the eye
        {{0, 0, 0}, {1, 1, 1}, false, true},             // hidden
    };
    constexpr uint32_t kCount = 10, kHidden = 9;
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
    std::vector<glm::vec4> rects;  // left, top, right, bottom
    for (uint32_t i = 0; i < kCount; ++i) {
        const auto& [place, scale, shown, whole] = cases[i];
        QexModel_SetNodePosition(m, i, place.x, place.y, place.z);
        QexModel_SetNodeRotation(m, i, 0, 0, 20);
        QexModel_SetNodeScale(m, i, scale.x, scale.y, scale.z);
        const glm::mat4 turned = glm::rotate(glm::translate(seen, place), glm::radians(20.f), {0, 0, 1});
        rects.push_back(shown ? glm::vec4(1e9f, 1e9f, -1e9f, -1e9f) : glm::vec4(0));
        for (int corner = 0; shown && corner < 8; ++corner) {
            const glm::vec3 local(corner & 4 ? 1 : 0, corner & 2 ? 2 : 0, corner & 1 ? 3 : 0);
            const glm::vec4 clip = turned * glm::vec4(scale * local, 1);
            const glm::vec2 p(kWidth * (0.5f + clip.x / clip.w / 2), kHeight * (0.5f - clip.y / clip.w / 2));
            rects[i] = {glm::min(glm::vec2(rects[i]), p), glm::max(glm::vec2(rects[i].z, rects[i].w), p)};
        }
    }
    QexModel_EnableNodeRendering(m, kHidden, 0);
    QexModel_UpdateModelBoundingBox(m, nullptr);
    QexModel_CalcScreenBBox(&runtime_, m, &camera);
    for (uint32_t i = 0; i < kCount; ++i) {
        const QexVec3 &low = m->screenBoxes[i].corners[2], &high = m->screenBoxes[i].corners[5];
        const glm::vec4 rect(low.x, low.y, high.x, high.y);
        EXPECT_LT(glm::distance(rect, rects[i]), 1e-4f * (1 + glm::length(rects[i]))) << i;
        EXPECT_EQ(QexModel_IsNodeInScreen(&runtime_, m, i), cases[i].whole) << i;
    }
    EXPECT_LT(m->screenBoxes[0].centre.z, m->screenBoxes[1].centre.z);
    size_t most = 0;
    for (float y = 0; y < kHeight; y += 5)
        for (float x = 0; x < kWidth; x += 5)
            for (const int32_t capacity : {-1, 0, 1, 2, 10}) {
                std::vector<uint32_t> expected;
                for (uint32_t i = 0; i < kCount && static_cast<int32_t>(expected.size()) < capacity; ++i)
                    if (rects[i].x < x && x < rects[i].z && rects[i].y < y && y < rects[i].w)
                        expected.push_back(i);
                int32_t count = 99;
                uint32_t hits[10];
                const QexVec2 point = {x, y};
                QexModel_Pick(m, nullptr, &point, &count, hits, capacity);
                EXPECT_EQ(std::vector<uint32_t>(hits, hits + count), expected) << x << " " << y;
                most = std::max(most, expected.size());
            }
    EXPECT_GE(most, 2u);
}

}  // namespace
