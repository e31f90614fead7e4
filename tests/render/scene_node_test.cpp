// The scene-node tree: its links, its matrices, and walks over wide and deep trees.
#include "Scenes.h"
#include "support/Glm.h"

namespace {

// The names of a node's children; each must know the one before it.
std::string Children(const QexNode& parent) {
    std::string names;
    const QexNode* previous = nullptr;
    for (QexNode* at = parent.firstChild; at; previous = at, at = at->next) {
        names += at->name;
        EXPECT_EQ(QexNode_GetPreviousSibling(at), previous) << at->name;
    }
    return names;
}

TEST(SceneNode, LinksAreMadeAndTakenAway) {
    QexNode root, nodes[3];
    EXPECT_EQ(QexNode_Create(&root, "a name beyond the field", nullptr, nullptr), 0);
    EXPECT_STREQ(root.name, "a name beyond t");
    for (const size_t i : {0, 1, 2}) QexNode_Create(&nodes[i], i ? i == 1 ? "b" : "c" : "a", &root, nullptr);
    EXPECT_EQ(Children(root), "abc");
    // A second removal finds nothing to unlink.
    for (int i = 0; i < 2; ++i) EXPECT_EQ(QexNode_Remove(&nodes[1]), 0);
    EXPECT_EQ(Children(root), "ac");
    for (int i = 0; i < 2; ++i) EXPECT_EQ(QexNode_Remove(&nodes[0]), 0);
    EXPECT_EQ(Children(root), "c");
    EXPECT_EQ(QexNode_Remove(&root), -1);
    EXPECT_EQ(root.firstChild, &nodes[2]);

    const Allocations allocations = CountAllocations([&] {
        QexNode* parents[40] = {&root};
        root.firstChild = nullptr;
        for (uint32_t i = 1; i < 40; ++i) {
            parents[i] = static_cast<QexNode*>(QexMemory_Alloc(sizeof(QexNode)));
            QexNode_Create(parents[i], nullptr, parents[(i - 1) / 3], nullptr);
        }
        EXPECT_EQ(QexNode_Release(&root, QEX_SCENE_NODE_FREE), 0);
        EXPECT_EQ(root.firstChild, nullptr);
    });
    EXPECT_EQ(allocations.balance, 0);
}

glm::mat4 Placed(glm::vec3 position, glm::vec3 degrees, glm::vec3 scale) {
    const glm::vec3 r = glm::radians(degrees);
    glm::mat4 m = glm::rotate(glm::translate(glm::mat4(1), position), r.z, {0, 0, 1});
    m = glm::rotate(glm::rotate(m, r.y, {0, 1, 0}), r.x, {1, 0, 0});
    return glm::scale(m, scale);
}

TEST(SceneNode, MatricesFollowTheTree) {
    const glm::mat4 given = Placed({7, 8, 9}, {20, 30, 40}, {2, 3, 4});
    const QexMatrix matrix = FromGlm(given), flat = FromGlm(glm::scale(glm::mat4(1), {1, 0, 1}));
    const QexVec3 place = {1, 2, 3};
    QexNode root, child, fixed, flattened;
    QexNode_Create(&root, "root", nullptr, nullptr);
    QexNode_Create(&child, "child", &root, nullptr);
    QexNode_Create(&fixed, "fixed", &child, &matrix);
    QexNode_Create(&flattened, "flattened", &child, &flat);
    QexNode_SetPosVec3(&root, &place);
    QexNode_SetRotation(&root, 10, 20, 30);
    QexNode_SetPosition(&child, 4, 5, 6);
    QexNode_SetScale(&child, 1, 2, 1);
    EXPECT_EQ(root.nodeFlags & QEX_SCENE_NODE_CHANGED, 1u);
    const glm::mat4 rootWorld = Placed({1, 2, 3}, {10, 20, 30}, glm::vec3(1));
    const glm::mat4 childWorld = rootWorld * Placed({4, 5, 6}, {}, {1, 2, 1});
    for (int i = 0; i < 2; ++i) {
        QexNode_Update(nullptr, &root, 0);
        ExpectNear(root.worldMatrix, rootWorld, 1e-5f, "root");
        ExpectNear(child.worldMatrix, childWorld, 1e-5f, "child");
        ExpectNear(fixed.worldMatrix, childWorld * given, 1e-5f, "fixed");
        EXPECT_EQ((root.nodeFlags | fixed.nodeFlags) & QEX_SCENE_NODE_CHANGED, 0u);
    }
    // A setter takes the other parts from the matrix; an update below the root leaves the root as it is.
    QexNode_SetPosition(&fixed, -1, 0, 1);
    QexNode_SetPosition(&flattened, 3, 0, 0);
    QexNode_SetScale(&root, 9, 9, 9);
    QexNode_Update(nullptr, &child, 0);
    ExpectNear(fixed.worldMatrix, childWorld * Placed({-1, 0, 1}, {20, 30, 40}, {2, 3, 4}), 1e-4f, "set");
    ExpectNear(flattened.localMatrix, Placed({3, 0, 0}, {}, {1, 0, 1}), 1e-5f, "flattened");
    ExpectNear(root.worldMatrix, rootWorld, 1e-5f, "root");
}

TEST(SceneNode, WideAndDeepTreesAreVisitedOnce) {
    constexpr uint32_t kMany = 200000;
    for (const bool deep : {false, true}) {
        // Its frame counts the updates of one second that it gets.
        QexModel counter;
        QexModel_Create(&counter);
        counter.scene.framesPerSecond = 1;
        counter.scene.frameCount = 10 * kMany;
        QexNode root;
        std::vector<QexNode> nodes(kMany);
        QexNode_Create(&root, "root", nullptr, nullptr);
        for (uint32_t i = 0; i < kMany; ++i) {
            QexModelNode_Create(&nodes[i], "n", i == 0 ? &root : deep ? &nodes[i - 1] : nullptr, &counter);
            QexNode_SetPosition(&nodes[i], 1, 0, 0);
            // Siblings are linked here, as finding the end of their list takes time.
            if (deep || !i) continue;
            nodes[i].parent = &root;
            nodes[i - 1].next = &nodes[i];
        }
        QexNode_Update(nullptr, &root, 1);
        EXPECT_EQ(counter.currentFrame, kMany) << deep;
        for (const uint32_t i : {0u, 1u, kMany - 1})
            EXPECT_EQ(nodes[i].worldMatrix.m[12], deep ? i + 1 : 1) << deep << " " << i;
        QexNode_Update(nullptr, &nodes[kMany - 5], 1);
        EXPECT_EQ(counter.currentFrame, kMany + 5) << deep;
        QexNode_Release(&nodes[kMany - 3], QEX_SCENE_NODE_KEEP);
        QexNode_Release(&root, QEX_SCENE_NODE_CLEAR);
        uint32_t cleared = 0;
        for (const QexNode& node : nodes) cleared += !node.model;
        EXPECT_EQ(cleared, deep ? kMany - 3 : kMany - 1);
    }
}

std::vector<std::pair<float, uint32_t>> g_drawn;  // X of the model matrix, number of lights

void NoteDraw(QexShaderModule*, QexModel*, uint32_t, const QexLightSet* lights, const QexMatrix* modelMatrix,
              const QexMatrix*, const QexMatrix*, const QexShadowInfo*) {
    g_drawn.push_back({modelMatrix->m[12], lights->count});
}

class SceneNodeRenderTest : public NullRenderTest {};

TEST_F(SceneNodeRenderTest, ModelNodesDrawWithTheirWorldMatrixAndLights) {
    pod::Scene scene = SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8)));
    LoadedModel unlit(scene);
    scene.lights.resize(2);
    for (const int light : {0, 1}) scene.nodes.push_back(pod::BuildNode("light", {}, -1, light));
    LoadedModel lit(scene);
    QexShaderModule module = {};
    module.render = NoteDraw;
    QexNode root, a, b, none;
    QexNode_Create(&root, "root", nullptr, nullptr);
    QexModelNode_Create(&a, "a", &root, &lit.model);
    QexModelNode_Create(&b, "b", &a, &unlit.model);
    QexModelNode_Create(&none, "none", &root, nullptr);
    EXPECT_EQ((a.nodeFlags & ~none.nodeFlags), QEX_SCENE_NODE_HAS_MESH);
    for (QexNode* node : {&root, &a, &b}) QexNode_SetPosition(node, 5, 0, 0);
    for (LoadedModel* model : {&lit, &unlit}) QexModel_SetShaderProgram(&model->model, 0, &module);
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    QexNode_Update(nullptr, &root, 0);
    g_drawn.clear();
    QexNode_RenderWithCamera(&root, &camera);
    const std::vector<std::pair<float, uint32_t>> expected = {{10, 2}, {15, 0}};
    EXPECT_EQ(g_drawn, expected);
}

}  // namespace
