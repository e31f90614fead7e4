// Lean drawing under the null driver: the calls that are left, what is left out, and what stays set.
#include <GLES2/gl2.h>

#include "Scenes.h"
#include "support/Capture.h"
#include "support/LeanDrawing.h"

namespace {

class LeanCallsTest : public NullRenderTest {
  protected:
    static QexCamera Camera() {
        QexCamera camera;
        const QexVec3 eye = {16, 16, 60}, target = {16, 16, 0};
        QexCamera_Create(&camera, 0);
        QexCamera_LookAt(&camera, &eye, &target, nullptr);
        QexCamera_Project(&camera, 0.785f, 4.0f / 3, 1, 100);
        return camera;
    }

    // GL calls of a steady frame.
    static uint64_t CallsOf(const std::function<void()>& draw) {
        draw();
        gltapResetCounts();
        draw();
        return gltapCountAll();
    }
};

constexpr uint32_t kNodes = 1000;

TEST_F(LeanCallsTest, OfAThousandNodes) {
    const QexCamera camera = Camera();
    const QexLightSet lights = TwoLights();
    const struct {
        uint32_t kind;
        bool ownMeshes, vertexArrays;
        uint64_t aNode;
    } cases[] = {
        {QEX_SHADER_TEXTURE, false, true, 2},  {QEX_SHADER_TEXTURE, true, true, 3},
        {QEX_SHADER_TEXTURE, false, false, 2}, {QEX_SHADER_TEXTURE, true, false, 5},
        {QEX_SHADER_GOURAUD, false, true, 4},  {QEX_SHADER_GOURAUD, true, true, 5},
    };
    for (const auto& c : cases) {
        pod::Scene scene = scenes::Grid(kNodes);
        if (c.ownMeshes) {
            scene.meshes.resize(kNodes, scene.meshes[0]);
            for (uint32_t i = 0; i < kNodes; ++i) scene.nodes[i].object = static_cast<int32_t>(i);
        }
        const Module module(c.kind);
        LoadedModel model(scene);
        QexModel_SetShaderProgramForAllNode(&model.model, module.module, module.module);
        const Lean lean;
        QexRenderer_AllowVertexArrays(c.vertexArrays);
        const auto draw = [&] { QexModel_RenderWithCamera(&model.model, &lights, &camera, nullptr, 0); };
        EXPECT_LE(CallsOf(draw), c.aNode * kNodes + 10) << c.kind << (c.ownMeshes ? ", own meshes" : "");
        EXPECT_EQ(gltapCount("glDrawElements"), kNodes);
        EXPECT_EQ(gltapCount("glGetError"), 0u);
        EXPECT_EQ(CountAllocations(draw).made, 0);
        QexRenderer_AllowVertexArrays(1);
    }
}

// Drawn by its matrix, and as instances.
TEST_F(LeanCallsTest, OneModelAThousandTimes) {
    const QexCamera camera = Camera();
    const QexLightSet lights = TwoLights();
    const Module module(QEX_SHADER_GOURAUD);
    LoadedModel model(scenes::Grid(1));
    QexModel_SetShaderProgramForAllNode(&model.model, module.module, module.module);
    std::vector<QexMatrix> places;
    for (uint32_t i = 0; i < kNodes; ++i)
        places.push_back(ToQex(glm::translate(glm::mat4(1), {i % 32, i / 32, 0})));
    const Lean lean;
    EXPECT_EQ(CallsOf([&] {
                  for (const QexMatrix& place : places)
                      QexModel_RenderWithCamera(&model.model, &lights, &camera, &place, 0);
              }),
              4 * kNodes);
    const auto draw = [&] {
        QexModel_RenderInstances(&model.model, &lights, &camera, places.data(), nullptr, kNodes, 0);
    };
    EXPECT_LE(CallsOf(draw), 100u);
    EXPECT_EQ(gltapCount("glDrawElements"), 40u) << "25 by 25 on a GL of 128 vectors";
    EXPECT_EQ(CountAllocations(draw).made, 0);
}

TEST_F(LeanCallsTest, BillboardsOfAnEmitter) {
    Capture log(STDERR_FILENO);
    const QexCamera camera = Camera();
    QexParticleEmitter* emitter = QexParticleEmitter_Create();
    emitter->currentRate = 299;
    QexParticleEmitter_Update(emitter, 0, nullptr);
    ASSERT_EQ(emitter->particleCount, 299);
    const Lean lean;
    EXPECT_LE(CallsOf([&] { QexParticleEmitter_Draw(emitter, &camera); }), 10u);
    EXPECT_EQ(gltapCount("glDrawElements"), 1u);
    QexParticleEmitter_Release(emitter);
}

TEST_F(LeanCallsTest, TextIsSentWhenItChanged) {
    const auto sent = [] { return gltapCount("glBufferData") + gltapCount("glBufferSubData"); };
    const Lean lean;
    QexFont_AddString(&runtime_, 0, 20, "kept", 255, 255, 255, 255);
    CallsOf([] { QexFont_Draw(); });
    EXPECT_EQ(sent(), 0u);
    QexFont_AddString(&runtime_, 0, 40, "more", 255, 255, 255, 255);
    QexFont_Draw();
    EXPECT_EQ(sent(), 2u) << "room, and the text";
    EXPECT_LE(CallsOf([this] { QexFont_DrawTempString(&runtime_, 0, 60, "12 fps", ~0u); }), 8u);
    EXPECT_LE(CallsOf([this] { QexTexture_Draw(&runtime_, nullptr, 0, 0, nullptr, 9, 9, ~0u); }), 6u);
    QexFont_ClearString();
}

TEST_F(LeanCallsTest, NodesOutsideTheViewAreNotDrawn) {
    const Lean lean;
    const QexMatrix projection = PixelProjection();
    pod::Scene scene = SceneOf(pod::BuildMesh(Rectangle(0, 0, 10, 10)));
    const QexVec3 places[] = {{50, 50, 0}, {-9, 50, 0}, {-12, 50, 0}, {127, 0, 0},  {129, 0, 0},
                              {0, -11, 0}, {0, 97, 0},  {0, 0, 101},  {0, 0, -101}, {0, 0, 99}};
    scene.nodes.clear();
    for (const QexVec3& at : places)
        scene.nodes.push_back(pod::BuildNode("n", {{{at.x, at.y, at.z}}, {}, {}, {}}, -1, 0, 0));
    scene.meshNodeCount = static_cast<uint32_t>(scene.nodes.size());
    LoadedModel model(scene);
    CallsOf([&] {
        QexModel_RenderWithViewProjection(&model.model, nullptr, nullptr, &g_sMatIdentity, &projection, 0);
    });
    EXPECT_EQ(gltapCount("glDrawElements"), 4u) << "of the ten";
}

TEST_F(LeanCallsTest, WhatIsLeftAndHowItIsRestored) {
    LoadedModel model(scenes::Grid(4));
    const QexMatrix projection = PixelProjection();
    const auto draw = [&] {
        QexModel_RenderWithViewProjection(&model.model, nullptr, nullptr, &g_sMatIdentity, &projection, 0);
    };
    for (const int32_t vertexArrays : {1, 0}) {
        const Lean lean;
        QexRenderer_AllowVertexArrays(vertexArrays);
        gltapState state;
        draw();
        gltapGetState(&state);
        EXPECT_EQ(state.vertexArray != 0, vertexArrays != 0);
        EXPECT_NE(state.elementBuffer, 0u);
        QexRenderState_Restore();
        gltapGetState(&state);
        EXPECT_EQ(state.vertexArray, 0u);
        EXPECT_EQ(state.attributeArrays, 0u);
        EXPECT_EQ(state.arrayBuffer, 0u);
        EXPECT_EQ(state.elementBuffer, 0u);
        QexRenderer_AllowVertexArrays(1);
    }
    EXPECT_EQ(QexRenderer_SetDrawing(7), QEX_DRAWING_DESCRIBED) << "there is no such way";
    EXPECT_EQ(QexRenderer_GetDrawing(), QEX_DRAWING_DESCRIBED);
}

}  // namespace
