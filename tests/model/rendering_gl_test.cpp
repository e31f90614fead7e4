// Drawing a model's nodes: which, in what order, with what; animation, lights, boxes.
#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

class RenderingTest : public RenderTest {};

// A module that draws nothing and notes what it was asked to draw: "A", "B", ... for nodes 0, 1, ...
std::string g_noted;

void NoteDraw(QexShaderModule*, QexModel*, uint32_t node, const QexLightSet*, const QexMatrix*,
              const QexMatrix*, const QexMatrix*, const QexShadowInfo*) {
    g_noted += static_cast<char>('A' + node);
}

std::string Noted(const std::function<void()>& draw) {
    g_noted.clear();
    draw();
    return g_noted;
}

// Nodes A, B, ... at the given heights above z = 0, each with a mesh and a material of its own.
pod::Scene Row(std::initializer_list<float> heights) {
    pod::Scene scene = SceneOf(pod::BuildMesh(Rectangle(20, 20, 60, 60)));
    scene.nodes.clear();
    for (const float z : heights) {
        const auto i = static_cast<int32_t>(scene.nodes.size());
        scene.nodes.push_back(
            pod::BuildNode(std::string(1, static_cast<char>('A' + i)), {{{0, 0, z}}, {}, {}, {}}, -1, i, i));
    }
    scene.meshes.resize(scene.nodes.size(), scene.meshes[0]);
    scene.materials.resize(scene.nodes.size(), scene.materials[0]);
    scene.meshNodeCount = static_cast<uint32_t>(scene.nodes.size());
    return scene;
}

// A row whose nodes are noted.
struct NotedModel : LoadedModel {
    explicit NotedModel(std::initializer_list<float> heights) : LoadedModel(Row(heights)) {
        module.render = NoteDraw;
        QexModel_SetShaderProgramForAllNode(&model, &module, nullptr);
    }
    QexShaderModule module = {};
};

std::string NodesOf(const TransparentSPODNodeInfo* list, uint32_t count) {
    std::string nodes;
    for (uint32_t i = 0; i < count; ++i) nodes += static_cast<char>('A' + list[i].nodeIndex);
    return nodes;
}

TEST_F(RenderingTest, WhatIsDrawnAndWhatIsPutOff) {
    NotedModel model({0, 0, 0, 0});
    // A is opaque, B translucent, C in the blend list, D without a material.
    EXPECT_EQ(QexModel_SetOpacity(&model.model, 1, 0.95f), 1.0f);
    const char* const names[] = {"C", "nobody"};
    QexModel_SetAlphaBlendingNodes(&model.model, names, 2);
    model.Node(3).materialIndex = -1;
    const struct {
        uint32_t mode;
        float globalAlpha;
        const char *drawn, *putOff;
    } cases[] = {{0, 1, "ACD", "B"}, {1, 1, "AD", "BC"},    {2, 1, "C", "ABD"},
                 {3, 1, "", "ABCD"}, {0, 0.9f, "", "ABCD"}, {0, 2, "ACD", "B"}};
    const QexMatrix view = ToQex(glm::mat4(2)), projection = PixelProjection(), placed = ToQex(glm::mat4(3));
    const QexVec3 eye = {1, 2, 3};
    QexLightSet lights = {};
    lights.count = 3;
    for (const auto& c : cases) {
        QexRenderer_SetGlobalAlpha(c.globalAlpha);
        for (const bool given : {true, false}) {
            TransparentSPODNodeInfo list[5] = {}, &put = list[1];
            uint32_t count = 1;
            const auto draw = [&](TransparentSPODNodeInfo* into) {
                QexModel_RenderWithViewProjectionEx(&model.model, given ? &lights : nullptr,
                                                    given ? &placed : nullptr, &eye, &view, &projection, 0,
                                                    c.mode, into, into ? &count : nullptr);
            };
            EXPECT_EQ(Noted([&] { draw(list); }), c.drawn) << c.mode;
            EXPECT_EQ(NodesOf(list + 1, count - 1), c.putOff) << c.mode;
            EXPECT_EQ(Noted([&] { draw(nullptr); }), c.drawn);
            EXPECT_EQ(list[0].model, nullptr);
            EXPECT_EQ(put.lights.count, given ? 3u : 0u);
            EXPECT_TRUE(SameMatrix(&put.modelMatrix, glm::mat4(given ? 3 : 1)));
            EXPECT_TRUE(SameMatrix(&put.view, glm::mat4(2)));
            EXPECT_TRUE(SameMatrix(&put.projection, glm::make_mat4(projection.m)));
        }
    }
    QexRenderer_SetGlobalAlpha(1);
}

TEST_F(RenderingTest, PutOffNodesAreDrawnFarthestFirstPassByPass) {
    NotedModel model({2, 5, 3, 1});
    QexPODModel_SetPassID(&model.model.scene, &model.model.scene.meshes[3], 7);
    const QexVec3 eye = {0, 0, 0};
    const QexMatrix projection = PixelProjection();
    TransparentSPODNodeInfo list[6] = {};
    uint32_t count = 0;
    for (const uint32_t pass : {0u, 7u, 9u})
        QexModel_RenderWithViewProjectionEx(&model.model, nullptr, nullptr, &eye, &g_sMatIdentity,
                                            &projection, pass, 3, list, &count);
    EXPECT_EQ(NodesOf(list, count), "ABCD");
    const auto drawn = [&](uint32_t pass) {
        return Noted([&] { QexModel_RenderAlphaBlendingNodes(list, count + 1, pass); });
    };
    EXPECT_EQ(drawn(0), "BCA");
    EXPECT_EQ(drawn(7), "D");
    EXPECT_EQ(drawn(1), "");
    EXPECT_EQ(list[count].distance, 25.0f);
    // From an eye on the other side the order turns round.
    for (TransparentSPODNodeInfo& entry : list) entry.eye = {0, 0, 10};
    EXPECT_EQ(drawn(0), "ACB");
    EXPECT_EQ(g_VecEyePos.z, 10.0f);

    QexModel* m = &model.model;
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    const QexVec3 place = {4, 5, 6};
    QexCamera_LookAt(&camera, &place, &eye, &place);
    EXPECT_EQ(Noted([&] { QexModel_RenderWithCamera(m, nullptr, &camera, nullptr, 7); }), "D");
    EXPECT_EQ(g_VecEyePos.z, 6.0f);
    QexModel_SetShaderProgram(m, 0, nullptr);
    EXPECT_EQ(Noted([&] { QexModel_RenderWithCamera(m, nullptr, &camera, nullptr, 0); }), "BC");
    EXPECT_EQ(Noted([&] { QexModel_RenderNodeWithCamera(m, 3, nullptr, &camera, nullptr); }), "D");
    EXPECT_EQ(Noted([&] { QexModel_RenderNodeWithCamera(m, 4, nullptr, &camera, nullptr); }), "");
}

TEST_F(RenderingTest, UpdateAdvancesAndTurnsRound) {
    pod::Scene scene = Row({0});
    scene.frameCount = 10;
    scene.fps = 30;
    LoadedModel model(scene), still(Row({0}));
    const float cases[][3] = {{8.5f, 0.1f, 0}, {6, 0.1f, 9}, {1, -0.1f, 9}, {4, -0.1f, 1}, {2, 0.02f, 2.6f}};
    for (const auto& [from, dt, frame] : cases) {
        model.model.currentFrame = from;
        QexModel_Update(nullptr, &model.model, dt);
        EXPECT_NEAR(model.model.currentFrame, frame, 1e-5f) << from << " " << dt;
        EXPECT_NEAR(model.model.scene.runtime->frame, frame, 1e-5f);
    }
    QexModel_Update(nullptr, &still.model, 0.5f);
    EXPECT_EQ(still.model.currentFrame, 0.0f);
}

TEST_F(RenderingTest, FourLightsOfTheScene) {
    pod::Scene scene = Row({0});
    for (int i = 0; i < 6; ++i)
        scene.nodes.push_back(pod::BuildNode("n", {{{static_cast<float>(10 + i), 2, 3}}, {}, {}, {}}, -1, i));
    scene.lights.resize(6);
    scene.lights[0].colour = {0.25f, 0.5f, 0.75f};
    scene.lights[1].type = pod::kDirectionalLight;
    scene.lights[2].type = pod::kSpotLight;
    LoadedModel model(scene);
    QexLightSet lights = {};
    lights.lights[2].type = 42;
    QexModel_GetLight(&model.model, &lights);
    EXPECT_EQ(lights.count, 4u);
    EXPECT_EQ(glm::make_vec3(lights.lights[0].vector), glm::vec3(10, 2, 3));
    EXPECT_EQ(glm::make_vec4(lights.lights[0].colour), glm::vec4(0.25f, 0.5f, 0.75f, 1));
    EXPECT_EQ(glm::make_vec3(lights.lights[1].vector), glm::vec3(0, 0, -1));
    EXPECT_EQ(lights.lights[2].type, 42u) << "a spot light is left as it is";
}

TEST_F(RenderingTest, BoxesFollowNodesAndModelMatrix) {
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(2, 4, 6, 10)), {{{10, 0, 0}}, {}, {{2, 2, 2}}, {}}));
    const QexMatrix placed = ToQex(glm::translate(glm::mat4(1), {0, 100, 5}));
    QexModel_UpdateModelBoundingBox(&model.model, &placed);
    const QexVec3 *corners = model.model.nodeBoxes[0].corners, &low = corners[0], &high = corners[7];
    EXPECT_EQ(glm::vec3(low.x, low.y, low.z), glm::vec3(14, 108, 5));
    EXPECT_EQ(glm::vec3(high.x, high.y, high.z), glm::vec3(22, 120, 5));
}

class SteadyFrameTest : public NullRenderTest {};

TEST_F(SteadyFrameTest, AllocatesAndCreatesNothing) {
    pod::Scene scene = Row({0, 1, 2, 3});
    for (pod::Node& node : scene.nodes) {
        node.positions.insert(node.positions.end(), {9, 9, 9, 8, 8, 8});
        node.animationFlags = pod::kPositionAnimated;
    }
    scene.frameCount = 3;
    LoadedModel model(scene);
    model.Material(1).opacity = model.Material(2).opacity = 0.5f;
    QexFont_AddString(&runtime_, 0, 32, "steady", 255, 255, 255, 255);
    const QexVec3 eye = {0, 0, 50};
    const QexMatrix projection = PixelProjection();
    const auto frame = [&] {
        TransparentSPODNodeInfo list[4];
        QexLightSet lights;
        uint32_t count = 0;
        QexModel_Update(nullptr, &model.model, 0.02f);
        QexModel_GetLight(&model.model, &lights);
        QexModel_UpdateModelBoundingBox(&model.model, nullptr);
        QexModel_RenderWithViewProjectionEx(&model.model, &lights, nullptr, &eye, &g_sMatIdentity,
                                            &projection, 0, 1, list, &count);
        QexModel_RenderAlphaBlendingNodes(list, count, 0);
        QexFont_Draw();
        QexFont_DrawNum(&runtime_, 0, 50, 60, ~0u);
    };
    frame();
    const std::string live = LiveObjects();
    gltapResetCounts();
    EXPECT_EQ(CountAllocations(frame).made, 0);
    EXPECT_EQ(LiveObjects(), live);
    EXPECT_EQ(gltapCount("glDrawElements"), 6u);
    for (const char* name : {"glBufferData", "glTexImage2D", "glGetUniformLocation", "glGetIntegerv"})
        EXPECT_EQ(gltapCount(name), 0u) << name;
}

TEST_F(SteadyFrameTest, EffectsAllocateNothing) {
    Capture out(STDOUT_FILENO), log(STDERR_FILENO);
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    QexSkyBox sky = {};
    sky.skyTexture = Qextexture_GetDefault();
    sky.camera = &camera;
    sky.waterEnabled = 1;
    QexSkyBox_Create(&sky);
    QexPostProcessing_Initialize(&runtime_);
    QexParticleSet set;
    QexParticleSet_Create(&set, nullptr, nullptr, 10, 1, 9);
    QexParticleSet_Trigger(&set);
    QexParticleEmitter* emitter = QexParticleEmitter_Create();
    emitter->currentRate = 3;
    QexParticleEmitter_Update(emitter, 0, nullptr);
    emitter->emitting = 0;
    const auto frame = [&] {
        QexSkyBox_Update(&runtime_, &sky, 0);
        const QexSceneCallback nothing = [](QexRuntimeContext*, void*, void*, void*, QexShaderModule*,
                                            QexShaderModule*, const float*) { return 0; };
        for (const int mode : {0, 2})
            QexPostProcessing_DrawDOF(&runtime_, nullptr, nullptr, nullptr, nothing, 0, 1, 0.1f, 0.1f, 5, 9,
                                      mode, 0, 1);
        QexParticleEmitter_Update(emitter, 1, nullptr);
        QexParticleEmitter_Draw(emitter, &camera);
        QexParticleSet_Update(&set, 0.5f, &camera, nullptr);
        QexParticleSet_Draw(&set);
    };
    frame();
    EXPECT_EQ(CountAllocations(frame).made, 0);
    EXPECT_EQ(emitter->particleCount, 3);
    QexParticleEmitter_Release(emitter);
    QexParticleSet_Release(&set);
    QexPostProcessing_Finalize();
    QexSkyBox_Release();
}

}  // namespace
