// The scene-node tree: its links, its matrices, and walks over wide and deep trees.
#include "support/Glm.h"
#include "support/RenderScenes.h"

namespace {

std::string Children(const QexNode& parent) {
    std::string names;
    for (QexNode* at = parent.firstChild; at; at = at->next) names += at->name;
    return names;
}

TEST(SceneNode, LinksAreMadeAndTakenAway) {
    QexNode root, nodes[3];
    QexNode_Create(&root, "a name beyond the field", nullptr, nullptr);
    EXPECT_STREQ(root.name, "a name beyond t");
    QexNode_Create(&nodes[0], "a", &root, nullptr);
    QexNode_Create(&nodes[1], "b", &root, nullptr);
    QexNode_Create(&nodes[2], "c", &root, nullptr);
    EXPECT_EQ(Children(root), "abc");
    EXPECT_EQ(QexNode_GetPreviousSibling(&nodes[2]), &nodes[1]);
    EXPECT_EQ(QexNode_GetPreviousSibling(&nodes[0]), nullptr);
    EXPECT_EQ(QexNode_Remove(&nodes[1]), 0);
    EXPECT_EQ(Children(root), "ac");
    EXPECT_EQ(QexNode_GetPreviousSibling(&nodes[1]), nullptr);
    // The second removal finds nothing to unlink.
    for (int i = 0; i < 2; ++i) EXPECT_EQ(QexNode_Remove(&nodes[0]), 0);
    EXPECT_EQ(Children(root), "c");
    EXPECT_EQ(QexNode_Remove(&root), -1);
    QexNode_Release(&root, QEX_SCENE_NODE_CLEAR);
    EXPECT_EQ(Children(root) + nodes[2].name, "");
}

glm::mat4 Placed(glm::vec3 position, glm::vec3 degrees, glm::vec3 scale) {
    const glm::vec3 r = glm::radians(degrees);
    glm::mat4 m = glm::rotate(glm::translate(glm::mat4(1), position), r.z, {0, 0, 1});
    m = glm::rotate(glm::rotate(m, r.y, {0, 1, 0}), r.x, {1, 0, 0});
    return glm::scale(m, scale);
}

std::vector<std::pair<float, uint32_t>> g_drawn;  // X of the model matrix, number of lights

void NoteDraw(QexShaderModule*, QexModel*, uint32_t, const QexLightSet* lights, const QexMatrix* modelMatrix,
              const QexMatrix*, const QexMatrix*, const QexShadowInfo*) {
    g_drawn.push_back({modelMatrix->m[12], lights->count});
}

class SceneNodeTest : public NullRenderTest {};

TEST_F(SceneNodeTest, MatricesFollowTheTreeAndModelsDrawWithThem) {
    pod::Scene scene = SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8)));
    scene.lights.resize(1);
    scene.nodes.push_back(pod::BuildNode("light", {}, -1, 0));
    LoadedModel model(scene);
    QexShaderModule module = {};
    module.render = NoteDraw;
    QexModel_SetShaderProgram(&model.model, 0, &module);
    const glm::mat4 given = Placed({7, 8, 9}, {20, 30, 40}, {2, 3, 4});
    const QexMatrix matrix = FromGlm(given);
    const QexVec3 place = {1, 2, 3};
    QexNode root, child, fixed, none;
    QexNode_Create(&root, "root", nullptr, nullptr);
    QexModelNode_Create(&child, "child", &root, &model.model);
    QexModelNode_Create(&none, "none", &root, nullptr);
    QexNode_Create(&fixed, "fixed", &child, &matrix);
    QexNode_SetPosVec3(&root, &place);
    QexNode_SetRotation(&root, 10, 20, 30);
    QexNode_SetPosition(&child, 4, 5, 6);
    QexNode_SetScale(&child, 1, 2, 1);
    EXPECT_EQ(child.nodeFlags, QEX_SCENE_NODE_CHANGED | QEX_SCENE_NODE_HAS_MESH);
    const glm::mat4 rootWorld = Placed({1, 2, 3}, {10, 20, 30}, glm::vec3(1));
    const glm::mat4 childWorld = rootWorld * Placed({4, 5, 6}, {}, {1, 2, 1});
    for (int i = 0; i < 2; ++i) {
        QexNode_Update(nullptr, &root, 0);
        ExpectNear(root.worldMatrix, rootWorld, 1e-5f, "root");
        ExpectNear(child.worldMatrix, childWorld, 1e-5f, "child");
        ExpectNear(fixed.worldMatrix, childWorld * given, 1e-5f, "fixed");
        ExpectNear(none.worldMatrix, rootWorld, 1e-5f, "none");
        EXPECT_EQ(child.nodeFlags, QEX_SCENE_NODE_HAS_MESH);
    }
    QexCamera camera = {};
    g_drawn.clear();
    QexNode_RenderWithCamera(&root, &camera);
    EXPECT_EQ(g_drawn, (std::vector<std::pair<float, uint32_t>>{{child.worldMatrix.m[12], 1}}));
    // A setter takes the other parts from the matrix; an update below the root leaves the root as it is.
    QexNode_SetPosition(&fixed, -1, 0, 1);
    QexNode_SetScale(&root, 9, 9, 9);
    QexNode_Update(nullptr, &child, 0);
    ExpectNear(fixed.worldMatrix, childWorld * Placed({-1, 0, 1}, {20, 30, 40}, {2, 3, 4}), 1e-4f, "set");
    ExpectNear(root.worldMatrix, rootWorld, 1e-5f, "root");
}

TEST(SceneNode, WideAndDeepTreesAreVisitedAndFreedOnce) {
    // Each node is 1 along X from its parent; its model's frame counts the updates that it gets.
    static constexpr uint32_t kMany = 200000;
    const auto visit = [](bool deep) {
        QexModel counter;
        QexModel_Create(&counter);
        counter.scene.framesPerSecond = 1;
        counter.scene.frameCount = 10 * kMany;
        QexNode root, *last = &root;
        QexNode_Create(&root, "root", nullptr, nullptr);
        for (uint32_t i = 0; i < kMany; ++i) {
            auto* node = static_cast<QexNode*>(QexMemory_Alloc(sizeof(QexNode)));
            QexModelNode_Create(node, "n", deep || !i ? last : nullptr, &counter);
            QexNode_SetPosition(node, 1, 0, 0);
            // Siblings are linked here, as finding the end of their list takes time.
            node->parent = deep ? last : &root;
            if (!deep && i) last->next = node;
            last = node;
        }
        QexNode_Update(nullptr, &root, 1);
        EXPECT_EQ(counter.currentFrame, kMany) << deep;
        EXPECT_EQ(last->worldMatrix.m[12], deep ? kMany : 1) << deep;
        QexNode_Release(&root, QEX_SCENE_NODE_FREE);
        EXPECT_EQ(root.firstChild, nullptr);
    };
    for (const bool deep : {false, true}) visit(deep);
}

}  // namespace
