// Lean drawing: the same pictures, and what it takes from applications.
#include <GLES2/gl2.h>

#include "Scenes.h"
#include "support/Capture.h"
#include "support/LeanDrawing.h"
#include "support/RenderScenes.h"

namespace {

constexpr uint32_t kLastKind = QEX_SHADER_GOURAUD_SHADOW_EXT;

// A mesh whose vertices have everything, over a rectangle, on one bone where it is to be skinned.
pod::Mesh RichMesh(float left, float bottom, bool skinned) {
    pod::MeshArrays arrays = Rectangle(left, bottom, left + 60, bottom + 50);
    const size_t count = arrays.positions.size();
    arrays.tangents.assign(count, {1, 0, 0});
    arrays.binormals.assign(count, {0, 1, 0});
    for (size_t i = 0; i < count; ++i) arrays.normals.push_back({0.1f * static_cast<float>(i), 0, 1});
    if (!skinned) return pod::BuildMesh(arrays);
    arrays.boneIndices.assign(count, {0, 0, 0, 0});
    arrays.boneWeights.assign(count, {255, 0, 0, 0});
    return SkinnedMesh(arrays, 1, pod::kUint8Norm, {0});
}

// Four nodes of two meshes that lie over each other, each with a material of its own.
pod::Scene Overlapping(bool skinned) {
    pod::Scene scene = SceneOf(RichMesh(8, 8, skinned));
    scene.meshes.push_back(RichMesh(40, 30, skinned));
    scene.materials.resize(4, scene.materials[0]);
    scene.nodes.clear();
    for (int i = 0; i < 4; ++i) {
        const float f = static_cast<float>(i);
        scene.materials[static_cast<size_t>(i)].diffuse = {0.2f + 0.2f * f, 0.8f, 0.5f};
        scene.nodes.push_back(pod::BuildNode("n", {{{4 * f, 3, f}}, {}, {}, {}}, -1, i / 2, i));
    }
    scene.meshNodeCount = 4;
    return scene;
}

class LeanTest : public RenderTest {
  protected:
    // What is drawn in the described way, and in lean drawing with and without vertex array objects, twice
    // each, since what is kept shows in the second frame.
    void ExpectSamePictures(const std::function<void()>& draw, const std::string& what) {
        const auto picture = [&] {
            for (int i = 0; i < 2; ++i) {
                Clear(0.1f, 0.2f, 0.3f);
                draw();
            }
            return Read();
        };
        const Picture described = picture();
        const Lean lean;
        for (const int32_t vertexArrays : {0, 1}) {
            QexRenderer_AllowVertexArrays(vertexArrays);
            EXPECT_TRUE(SamePicture(picture(), described, 1)) << what << ", vertex arrays " << vertexArrays;
        }
        EXPECT_EQ(glGetError(), GLenum(GL_NO_ERROR));
        // GL reads no memory of the application's during a draw.
        const GLCalls calls(draw);
        for (const gltapCall* call : calls.Of({"glVertexAttribPointer"}))
            EXPECT_LT(reinterpret_cast<uintptr_t>(call->argument[5].p), 65536u) << "an offset";
        for (const gltapCall* call : calls.Of({"glDrawElements"}))
            EXPECT_LT(reinterpret_cast<uintptr_t>(call->argument[3].p), 65536u) << "an offset";
    }
};

TEST_F(LeanTest, EveryModuleDrawsTheSame) {
    const uint8_t texels[] = {255, 80, 30, 255, 90, 250, 20, 120, 10, 90, 255, 200, 255, 255, 90, 30};
    ScopedTexture diffuse(2, 2, texels), alpha(2, 2, texels), shadowMap({90, 90, 90, 255});
    const QexLightSet lights = TwoLights();
    const QexMatrix projection = PixelProjection(), placed = ToQex(glm::scale(glm::mat4(1), {1.1f, 0.9f, 1}));
    QexShadowInfo shadow = {};
    shadow.lightDir = {0, 0, -1};
    shadow.shadowSpaceMatrix = ToQex(glm::scale(glm::mat4(1), {0.01f, 0.01f, 0.5f}));
    shadow.shadowIntensity = 0.4f;
    shadow.shadowTexture = shadowMap.glName;
    for (uint32_t kind = 1; kind <= kLastKind; ++kind) {
        const Module module(kind);
        if (!module.module) continue;
        LoadedModel model(
            Overlapping(kind >= QEX_SHADER_SKINNING_TEXTURE && kind != QEX_SHADER_GOURAUD_SHADOW_EXT));
        QexModel_SetShaderProgramForAllNode(&model.model, module.module, module.module);
        QexShaders_SetShaderUVDisplacement(module.module, kind, 0.3f, 0.1f);
        // A bare node, one with a texture, one with an alpha texture, one with both, which is translucent.
        model.model.textures[1] = model.model.textures[3] = &diffuse;
        model.model.alphaTextures[2] = model.model.alphaTextures[3] = &alpha;
        model.Material(3).opacity = 0.9f;
        QexShaders_SetShaderAlphaThreshold(module.module, kind, 0.4f);
        for (const bool blends : {true, false}) {
            if (!blends && kind != QEX_SHADER_GOURAUD) continue;
            QexRenderer_SetZTestFunc(blends ? QEX_DEPTH_LESS_EQUAL : QEX_DEPTH_ALWAYS);
            model.Material(0).opacity = blends ? 1.0f : 0.3f;
            QexRenderer_SetAlphaBlendMode(blends ? QEX_BLEND_ALPHA : QEX_BLEND_NONE);
            ExpectSamePictures(
                [&] {
                    QexModel_RenderFromViewPerspectiveWithShadow(&model.model, &lights, &placed,
                                                                 &g_sMatIdentity, &projection,
                                                                 blends ? &shadow : nullptr, 0);
                },
                "module " + std::to_string(kind) + (blends ? ", blending" : ""));
        }
        for (int i = 0; i < 4; ++i) model.model.textures[i] = model.model.alphaTextures[i] = nullptr;
    }
}

// Everything else that the engine draws, between nodes, in the same frame.
TEST_F(LeanTest, TextQuadsAndBillboardsAmongNodes) {
    Capture log(STDERR_FILENO);
    ScopedTexture blue({20, 40, 250, 255});
    LoadedModel model(Overlapping(false));
    QexBillboard* billboard = QexBillboard_Create(&blue);
    billboard->position = {90, 20, 5};
    billboard->scale = {20, 20, 1};
    QexParticleEmitter* emitter = QexParticleEmitter_Create();
    emitter->animations[0].frames[0] = &blue;
    emitter->animations[1] = {{nullptr}, 1, 1, 0};
    emitter->animations[1].frames[0] = Qextexture_GetDefault();
    emitter->animationCount = 2;
    emitter->positionSpread = {40, 40, 10};
    emitter->position = {60, 50, 0};
    emitter->scaleMin = emitter->scaleMax = {9, 6, 1};
    emitter->startOpacity = 0.8f;
    emitter->currentRate = 20;
    QexParticleEmitter_Update(emitter, 0, nullptr);
    const QexCamera camera = PixelCamera();
    // More glyphs than a draw shows, and those of another sheet behind them.
    const std::string kept = std::string(310, '.') + "\n\xC3\xA9t\xC3\xA9", brief(70, 'a');
    QexFont_AddString(&runtime_, 2, 50, kept.c_str(), 255, 255, 0, 255);
    ExpectSamePictures(
        [&] {
            model.Draw();
            QexFont_Draw();
            QexFont_DrawTempString(&runtime_, 5, 60, "lean", 0xFF20FF20u);
            QexFont_DrawTempString(&runtime_, 0, 90, brief.c_str(), 0xFF20FF20u);
            model.DrawNode(model.Node().shader, 1);
            QexTexture_Draw(&runtime_, &blue, 100, 90, nullptr, 20, 20, ~0u);
            QexBillboard_Draw(billboard, &camera);
            QexParticleEmitter_Draw(emitter, &camera);
            glEnable(GL_CULL_FACE);
            model.Draw();
            glDisable(GL_CULL_FACE);
        },
        "a frame of many things");
    QexFont_ClearString();
    QexBillboard_Release(billboard);
    QexParticleEmitter_Release(emitter);
}

TEST_F(LeanTest, EffectsAmongNodes) {
    Capture log(STDERR_FILENO), waves(STDOUT_FILENO);
    ScopedTexture blue({20, 40, 250, 255});
    LoadedModel model(Overlapping(false));
    QexTexture cube = {};
    QexTexture_GenerateNormalisationCubeMap(&cube, 8);
    const QexVec3 from = {30, 22, 60}, to = {0, 5, 0};
    QexCamera camera = PixelCamera(), eye = {};
    QexCamera_LookAt(&eye, &from, &to, nullptr);
    QexCamera_Project(&eye, 0.9f, float{kWidth} / kHeight, 1, 200);
    QexSkyBox sky = {};
    sky.skyTexture = &cube;
    sky.size = 200;
    sky.waterEnabled = 1;
    sky.camera = &eye;
    ASSERT_EQ(QexSkyBox_Create(&sky), 0);
    QexParticleSet set;
    ASSERT_EQ(QexParticleSet_Create(&set, &blue, nullptr, 2, 12, 4), 0);
    set.buffer[0] = {3, {0, 0, 0}, {20, 80, 0}};
    set.buffer[1] = {2, {5, 0, 0}, {50, 80, 0}};
    QexParticleSet_Trigger(&set);
    QexParticleSet_Update(&set, 1, &camera, nullptr);
    ASSERT_EQ(QexPostProcessing_Initialize(&runtime_), 0);
    static LoadedModel* s_model;
    s_model = &model;
    const auto drawNodes = [](QexRuntimeContext*, void*, void*, void*, QexShaderModule* depth,
                              QexShaderModule*, const float*) -> int32_t {
        QexShaderModule* lit = s_model->Node().shader;
        for (uint32_t i = 0; i < 2; ++i) s_model->DrawNode(depth ? depth : lit, i);
        return 0;
    };
    ExpectSamePictures(
        [&] {
            QexPostProcessing_DrawDOF(&runtime_, nullptr, nullptr, nullptr, drawNodes, 0.3f, 4, 1, 1, 2, 5, 1,
                                      1, 100);
            QexSkyBox_Update(&runtime_, &sky, 0);
            model.Draw();
            QexParticleSet_Draw(&set);
        },
        "a frame of effects");
    QexPostProcessing_Finalize();
    QexSkyBox_Release();
    QexTexture_Release(&cube);
    QexParticleSet_Release(&set);
}

// What an application changes between frames, in records that are its own.
TEST_F(LeanTest, ChangesOfTheSceneAreSeen) {
    ScopedTexture red({250, 20, 20, 255});
    const Module lit(QEX_SHADER_GOURAUD), other(QEX_SHADER_GOURAUD);
    QexLightSet lights = TwoLights();
    const QexMatrix projection = PixelProjection();
    LoadedModel model(Overlapping(false));
    QexShaders_SetShaderAlphaThreshold(other.module, other.kind, 0.95f);
    QexPODModel& scene = model.model.scene;
    const std::function<void()> changes[] = {
        [&] { model.Node(1).shader = lit.module; },
        [&] { lights.lights[1].colour[2] = 0.1f; },
        [&] { lights.count = 1; },
        [&] { model.Material(2).opacity = 0.75f; },
        [&] { QexRenderer_SetGlobalAlpha(0.8f); },
        [&] { QexRenderer_SetGlobalAlpha(1); },
        [&] { QexModel_ReplaceTextureByIdx(&model.model, &red, 0); },
        [&] { QexModel_ReplaceAlphaTextureByIdx(&model.model, &red, 1); },
        [&] { QexModel_SetNodePosition(&model.model, 0, 30, -2, 0); },
        [&] { model.Node(2).materialIndex = 1; },
        [&] { model.Material(1).opacity = 0.92f; },
        [&] { model.Node(2).shader = other.module; },
        [&] { model.Node(3).objectIndex = 0; },
        [&] { scene.nodes[1].stateFlags &= ~QEX_NODE_RENDERING_ENABLED; },
        [&] { QexShaders_SetShaderAlphaThreshold(lit.module, lit.kind, 0.9f); },
        [&] { QexPODModel_SetPassID(&scene, &scene.meshes[1], 3); },
        [&] { model.Node(0).shader = nullptr; },
    };
    int number = 0;
    const Lean lean;
    for (const auto& change : changes) {
        change();
        const auto draw = [&] {
            Clear();
            QexModel_RenderWithViewProjection(&model.model, &lights, nullptr, &g_sMatIdentity, &projection,
                                              0);
            return Read();
        };
        draw();
        const Picture picture = draw();
        QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
        EXPECT_TRUE(SamePicture(picture, draw(), 1)) << "change " << number;
        QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
        draw();
        ++number;
    }
    model.model.textures[0] = model.model.alphaTextures[1] = nullptr;
}

// Modules that go take their programs along, whatever is made in their place.
TEST_F(LeanTest, ModulesComeAndGo) {
    LoadedModel model(Overlapping(false));
    QexShaderModule* const own = model.Node().shader;
    for (int round = 0; round < 3; ++round) {
        const Module lit(QEX_SHADER_GOURAUD);
        QexModel_SetShaderProgramForAllNode(&model.model, lit.module, lit.module);
        ExpectSamePictures([&] { model.Draw(); }, "round " + std::to_string(round));
        QexModel_SetShaderProgramForAllNode(&model.model, own, own);
    }
}

// Another model goes, or is made anew, while a mesh and text of this one are bound.
TEST_F(LeanTest, ModelsComeAndGo) {
    LoadedModel model(Overlapping(false));
    ExpectSamePictures(
        [&] {
            LoadedModel other(Overlapping(true));
            model.Draw();
            QexModel_DownloadGeometry(&other.model);
            model.Draw();
            QexFont_DrawTempString(&runtime_, 5, 60, "before", 0xFF20FF20u);
            QexModel_Unload(&other.model);
            QexFont_DrawTempString(&runtime_, 5, 90, "behind", 0xFF20FF20u);
            model.Draw();
        },
        "beside another");
}

// Translucent nodes are drawn where they stand in the scene; the opaque ones around them may change places.
TEST_F(LeanTest, TranslucentNodesKeepTheirPlaces) {
    pod::Scene scene = Overlapping(false);
    while (scene.nodes.size() < 8) scene.nodes.push_back(scene.nodes[scene.nodes.size() - 4]);
    scene.meshNodeCount = 8;
    LoadedModel model(scene);
    model.Material(1).opacity = 0.6f;
    QexModel_SetAlphaTestCmpValue(0.1f);
    glEnable(GL_BLEND);
    glBlendFunc(GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    ExpectSamePictures([&] { model.Draw(); }, "translucent nodes between opaque ones");
    glDisable(GL_BLEND);
    QexModel_SetAlphaTestCmpValue(0.5f);
}

// A hook and a module of the application that leave GL in disorder.
TEST_F(LeanTest, ApplicationsMayCallGL) {
    ScopedTexture green({20, 250, 20, 255});
    static GLuint s_texture;
    s_texture = green.glName;
    const auto disorder = [] {
        glUseProgram(0);
        glActiveTexture(GL_TEXTURE5);
        glBindBuffer(GL_ARRAY_BUFFER, 0);
        glBindTexture(GL_TEXTURE_2D, s_texture);
    };
    LoadedModel hooked(Overlapping(false)), own(Overlapping(false)), plain(Overlapping(false));
    hooked.model.bindTextureHook = [](QexModel*, uint32_t node) {
        if (node % 2) return 0;
        QexRenderState_ActiveTexture(GL_TEXTURE0);
        glBindTexture(GL_TEXTURE_2D, s_texture);
        return 1;
    };
    QexShaderModule module = {};
    static void (*s_disorder)();
    s_disorder = disorder;
    module.render = [](QexShaderModule*, QexModel*, uint32_t, const QexLightSet*, const QexMatrix*,
                       const QexMatrix*, const QexMatrix*, const QexShadowInfo*) { s_disorder(); };
    own.Node(1).shader = &module;
    ExpectSamePictures(
        [&] {
            plain.Draw();
            hooked.Draw();
            if (QexRenderer_GetDrawing() == QEX_DRAWING_LEAN) own.Draw();
            plain.Draw();
            QexRenderState_Restore();
            disorder();
            QexRenderState_Reset(nullptr);
            own.DrawNode(own.Node().shader, 0);
        },
        "hooks and modules");
}

// Turned, mirrored, squeezed and out of the view, against one call for each.
TEST_F(LeanTest, InstancesAreTheModelAtEachMatrix) {
    const glm::mat4 one(1);
    const std::vector<QexMatrix> places = {
        ToQex(glm::scale(one, {0.3f, 0.3f, 1})),
        ToQex(glm::scale(glm::translate(one, {120, 20, 3}), {-0.5f, 0.4f, 1})),
        ToQex(glm::rotate(glm::scale(glm::translate(one, {60, 50, 6}), {0.3f, 0.2f, 2}), 0.5f, {0, 1, 1})),
        ToQex(glm::translate(one, {500, 0, 0})),
    };
    const QexLightSet lights = TwoLights();
    const QexCamera camera = PixelCamera();
    const uint8_t texels[] = {255, 80, 30, 255, 90, 250, 20, 120, 10, 90, 255, 200, 255, 255, 90, 30};
    ScopedTexture diffuse(2, 2, texels);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    for (const uint32_t kind :
         {QEX_SHADER_TEXTURE, QEX_SHADER_UV_DISPLACEMENT, QEX_SHADER_GOURAUD, QEX_SHADER_GOURAUD_NORMALMAP,
          QEX_SHADER_GOURAUD_SPECULAR, QEX_SHADER_GOURAUD_SHADOW, QEX_SHADER_SKINNING_TEXTURE}) {
        const Module module(kind);
        LoadedModel model(Overlapping(kind == QEX_SHADER_SKINNING_TEXTURE));
        QexModel_SetShaderProgramForAllNode(&model.model, module.module, module.module);
        QexShaders_SetShaderUVDisplacement(module.module, kind, 0.3f, 0.1f);
        model.model.textures[1] = &diffuse;
        Clear();
        for (const QexMatrix& place : places)
            QexModel_RenderWithCamera(&model.model, &lights, &camera, &place, 0);
        const Picture single = Read();
        for (const int32_t vertexArrays : {1, 0}) {
            QexRenderer_AllowVertexArrays(vertexArrays);
            Clear();
            QexModel_RenderInstances(&model.model, &lights, &camera, places.data(), nullptr, 4, 0);
            EXPECT_TRUE(SamePicture(Read(), single, 1)) << "module " << kind;
        }
        model.model.textures[1] = nullptr;
    }
    QexRenderer_AllowVertexArrays(1);
    EXPECT_EQ(glGetError(), GLenum(GL_NO_ERROR));
}

TEST_F(LeanTest, InstancesHaveColours) {
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(0, 0, 10, 10))));
    const QexCamera camera = PixelCamera();
    const QexMatrix places[] = {ToQex(glm::mat4(1)), ToQex(glm::translate(glm::mat4(1), {50, 20, 0}))};
    const float colours[][4] = {{1, 0.4f, 0.2f, 1}, {0.2f, 0.6f, 0.8f, 0.8f}};
    model.Material().opacity = 0.75f;
    Clear();
    QexModel_RenderInstances(&model.model, nullptr, &camera, places, colours, 2, 0);
    EXPECT_TRUE(Near(Read().Pixel(5, 90), {255, 102, 51, 191}, 1));
    EXPECT_TRUE(Near(Read().Pixel(55, 70), {51, 153, 204, 153}, 1));
    EXPECT_EQ(QexRenderer_GetDrawing(), QEX_DRAWING_DESCRIBED);
    QexModel_RenderInstances(&model.model, nullptr, &camera, nullptr, nullptr, 2, 0);
}

}  // namespace
