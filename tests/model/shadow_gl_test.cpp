// Shadows and planar reflection: what is in the map, what the pictures show, and the state left behind.
#include <GLES2/gl2.h>

#include "support/RenderScenes.h"

namespace {

// A floor at y = 0 from -20 to 20, and a square of side 8 at height 10 whose centre is `place`. Where it is
// skinned, all of it follows nodes 2 to 5.
struct Square {
    pod::Vec3 place;
    bool facesDown = false, skinned = false;
};
constexpr std::array<uint8_t, 4> kWeights = {100, 60, 80, 15};

pod::Scene FloorAndSquare(const Square& wanted) {
    const auto square = [](float half) {
        pod::MeshArrays arrays;
        arrays.positions = {{-half, 0, half}, {half, 0, half}, {-half, 0, -half}, {half, 0, -half}};
        arrays.normals.assign(4, {0, 1, 0});
        arrays.uvs = {{0, 0}, {1, 0}, {0, 1}, {1, 1}};
        arrays.indices = {0, 1, 2, 2, 1, 3};
        return arrays;
    };
    pod::MeshArrays caster = square(4);
    if (wanted.facesDown) caster.indices = {0, 2, 1, 2, 3, 1};
    if (wanted.skinned) caster.boneIndices.assign(4, {0, 1, 2, 3});
    if (wanted.skinned) caster.boneWeights.assign(4, kWeights);
    pod::Scene scene = SceneOf(pod::BuildMesh(square(20)));
    scene.meshes.push_back(wanted.skinned ? SkinnedMesh(caster, 4, pod::kUint8Norm, {2, 3, 4, 5})
                                          : pod::BuildMesh(caster));
    scene.nodes.push_back(pod::BuildNode("square", {{wanted.place}, {}, {}, {}}, -1, 1, 0));
    for (int i = 0; i < 4; ++i) scene.nodes.push_back(pod::BuildNode("bone", {}));
    scene.meshNodeCount = 2;
    scene.materials[0].ambient = {0, 0, 0};
    return scene;
}

// Looks at the origin.
QexCamera CameraAt(QexVec3 eye, QexVec3 up, float near, float far) {
    QexCamera camera;
    const QexVec3 target = {0, 0, 0};
    QexCamera_Create(&camera, 0);
    QexCamera_LookAt(&camera, &eye, &target, &up);
    QexCamera_Project(&camera, 0.8f, float{kWidth} / kHeight, near, far);
    return camera;
}

class ShadowTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        module_ = QexShaders_CreateShaderProgram(QEX_SHADER_GOURAUD_SHADOW);
        // Straight down; north is -z, and one unit two pixels and more.
        camera_ = CameraAt({0, 50, 0}, {0, 0, -1}, 5, 60);
    }
    void TearDown() override {
        QexShaders_ReleaseShaderProgram(module_, QEX_SHADER_GOURAUD_SHADOW);
        RenderTest::TearDown();
    }
    // The floor in white light, its node alone, under the shadow of the nodes listed.
    Picture Floor(LoadedModel& model, QexVec3 direction, std::vector<int32_t> casters) {
        const QexShadowCaster request = {&model.model, 0, casters.data(),
                                         static_cast<uint32_t>(casters.size())};
        QexLightSet lights = {1, {{1, {direction.x, direction.y, direction.z}, {2, 2, 2, 1}}}};
        QexRenderer_SetDrawing(drawing_);
        QexModel_UpdateModelBoundingBox(&model.model, nullptr);
        QexShadowInfo* info = QexModel_InitShadowInfo(&camera_, &direction, &request, 1, 0.25f, 0.01f);
        drawn_ = info->casters[0].nodeCount;
        QexModel_RenderShadow(&runtime_, nullptr, info);
        model.model.bindTextureHook = nullptr;  // which is for the map alone
        glDisable(GL_SCISSOR_TEST);
        QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
        Clear();
        model.Node().shader = module_;
        QexModel_RenderNodeFromViewPerspectiveWithShadow(
            &model.model, 0, &lights, nullptr, &camera_.viewMatrix, &camera_.projectionMatrix, info);
        QexModel_ReleaseShadowInfo(info);
        QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
        return Read();
    }
    Rgba At(const Picture& picture, glm::vec3 point) const {
        const glm::vec3 p =
            glm::project(point, glm::make_mat4(camera_.viewMatrix.m),
                         glm::make_mat4(camera_.projectionMatrix.m), glm::vec4(0, 0, kWidth, kHeight));
        return picture.Pixel(int(p.x), int(float{kHeight} - p.y));
    }

    QexShaderModule* module_;
    QexCamera camera_;
    uint32_t drawn_ = 0;
    int32_t drawing_ = QEX_DRAWING_DESCRIBED;
};

const Rgba kLit = {255, 255, 255, 255};

// Light straight down, and light that moves a shadow of height 10 by 5 to the east.
TEST_F(ShadowTest, FallsWhereTheGeometrySays) {
    const glm::vec3 moves[] = {{6, 0, 3}, {-8, 0, 1}, {5, 0, -9}, {99, 0, 99}};  // of the bones
    const glm::vec3 bent =
        glm::vec3(1, 0, 2) + (100.0f * moves[0] + 60.0f * moves[1] + 80.0f * moves[2]) / 240.0f;
    const struct {
        QexVec3 direction;
        Square square;
        glm::vec3 centre;
        int32_t drawing = QEX_DRAWING_DESCRIBED;
    } cases[] = {
        {{0, -1, 0}, {{0, 10, 0}}, {0, 0, 0}, QEX_DRAWING_LEAN},
        {{1, -2, 0}, {{0, 10, 0}}, {5, 0, 0}},
        {{0, -2, 1}, {{-6, 10, -4}}, {-6, 0, 1}},
        // Above the camera, between the light and the view.
        {{0, -1, 0}, {{5, 70, 3}}, {5, 0, 3}},
        // Only the first three bones of a vertex count.
        {{0, -1, 0}, {{1, 10, 2}, false, true}, bent},
        {{0, -1, 0}, {{1, 10, 2}, false, true}, bent, QEX_DRAWING_LEAN},
    };
    for (const auto& c : cases) {
        LoadedModel model(FloorAndSquare(c.square));
        ASSERT_EQ(model.log, "");
        for (uint32_t i = 0; i < 4; ++i)
            QexModel_SetNodePosition(&model.model, 2 + i, moves[i].x, moves[i].y, moves[i].z);
        drawing_ = c.drawing;
        const Picture picture = Floor(model, c.direction, {0, 1});
        EXPECT_EQ(drawn_, 2u);
        const int grey =
            c.direction.x || c.direction.z ? 114 : 128;  // a quarter of light of 2, that may come askew
        for (const float x : {-1.0f, 1.0f})
            for (const float z : {-1.0f, 1.0f}) {
                EXPECT_TRUE(
                    Near(At(picture, c.centre + glm::vec3(3 * x, 0, 3 * z)), {grey, grey, grey, 255}, 2));
                EXPECT_EQ(At(picture, c.centre + glm::vec3(5 * x, 0, 3 * z)), kLit);
            }
    }
}

TEST_F(ShadowTest, WithoutCastersNothingIsDark) {
    LoadedModel model(FloorAndSquare({{0, 10, 0}}));
    const Picture plain = Floor(model, {0, -1, 0}, {0});
    EXPECT_EQ(At(plain, {0, 0, 0}), kLit) << "a surface does not shade itself";
    for (const auto& list : std::vector<std::vector<int32_t>>{{}, {7, -1}}) {
        EXPECT_TRUE(SamePicture(Floor(model, {0, -1, 0}, list), plain));
        EXPECT_EQ(drawn_, 0u);
    }
    // Out of the view to the side, and switched off.
    LoadedModel aside(FloorAndSquare({{400, 10, 0}}));
    EXPECT_TRUE(SamePicture(Floor(aside, {0, -1, 0}, {1}), plain));
    EXPECT_EQ(drawn_, 0u);
    model.Node(1).stateFlags &= ~QEX_NODE_RENDERING_ENABLED;
    EXPECT_TRUE(SamePicture(Floor(model, {0, -1, 0}, {0, 1}), plain));
}

TEST_F(ShadowTest, TheHookLeavesHoles) {
    const uint8_t texels[] = {255, 0, 0, 255, 0, 0, 0, 255};
    ScopedTexture half(2, 1, texels);
    static QexTexture* s_half;
    s_half = &half;
    LoadedModel model(FloorAndSquare({{0, 10, 0}}));
    for (const int32_t drawing : {QEX_DRAWING_DESCRIBED, QEX_DRAWING_LEAN}) {
        drawing_ = drawing;
        model.model.bindTextureHook = [](QexModel*, uint32_t) { return QexTexture_Set(s_half, 3), 0; };
        const Picture picture = Floor(model, {0, -1, 0}, {1});
        EXPECT_EQ(At(picture, {2, 0, 0}), kLit);
        EXPECT_TRUE(Near(At(picture, {-2, 0, 0}), {128, 128, 128, 255}, 1));
    }
}

TEST_F(ShadowTest, StateAfterThePass) {
    LoadedModel model(FloorAndSquare({{0, 10, 0}}));
    QexModel_UpdateModelBoundingBox(&model.model, nullptr);
    const QexShadowCaster all = {&model.model, 1, nullptr, 0};
    const QexVec3 down = {0, -1, 0};
    QexShadowInfo* info = QexModel_InitShadowInfo(&camera_, &down, &all, 1, 0.5f, 0);
    const glm::mat4 half = glm::scale(glm::translate(glm::mat4(1), glm::vec3(0.5f)), glm::vec3(0.5f));
    EXPECT_TRUE(SameMatrix(&info->shadowSpaceMatrix, half * glm::make_mat4(info->lightViewProj.m)));
    ASSERT_EQ(info->casters[0].nodeCount, 2u);
    glViewport(3, 4, 5, 6);
    glDisable(GL_SCISSOR_TEST);
    const GLCalls calls([&] { QexModel_RenderShadow(&runtime_, nullptr, info); });
    EXPECT_EQ(calls.Of({"glDrawElements"}).size(), 2u);
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    QexModel_RenderShadow(&runtime_, nullptr, info);
    const GLCalls lean([&] { QexModel_RenderShadow(&runtime_, nullptr, info); });
    EXPECT_LE(lean.Size() + 12, calls.Size()) << "a matrix and a draw for each of the two";
    EXPECT_EQ(lean.Of({"glUniformMatrix4fv", "glDrawElements"}).size(), 4u);
    EXPECT_EQ(lean.Of({"glVertexAttribPointer", "glGetError"}).size(), 0u);
    QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
    EXPECT_EQ(GLCalls([&] { QexModel_RenderShadow(&runtime_, nullptr, nullptr); }).Size(), 0u);
    gltapState state;
    gltapGetState(&state);
    EXPECT_EQ(state.framebuffer, 0u);
    EXPECT_TRUE(state.scissorTest);
    EXPECT_EQ(glm::make_vec4(state.viewport), glm::ivec4(0, 0, kWidth, kHeight));
    QexModel_ReleaseShadowInfo(info);
    QexModel_ReleaseShadowInfo(nullptr);
    glDisable(GL_SCISSOR_TEST);
}

class ReflectionTest : public RenderTest {
  protected:
    void Begin() {
        glClearStencil(0);
        glClear(GL_STENCIL_BUFFER_BIT);
        Clear(0, 0, 1, 1);
        QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    }

    QexCamera camera_ = CameraAt({0, 24, 80}, {0, 1, 0}, 1, 200);  // low, looking north over the floor
};

// The square hangs over the middle of the floor, or its image lies partly beside the floor.
TEST_F(ReflectionTest, ShowsTheMirroredSceneWithinThePlane) {
    ScopedTexture green({0, 255, 0, 255});
    const glm::mat4 mirror = glm::scale(glm::mat4(1), {1, -1, 1});
    const QexMatrix mirrored = ToQex(mirror);
    int32_t square = 1;
    for (const bool aside : {false, true}) {
        LoadedModel model(FloorAndSquare({{aside ? 24.0f : 0, 6, 0}, true}));
        EXPECT_EQ(model.log, "");
        model.model.textures[0] = &green;
        const QexShadowCaster all = {&model.model, 1, nullptr, 0}, listed = {&model.model, 0, &square, 1};
        const auto drawn = [&](uint32_t node, const QexMatrix* matrix) {
            Begin();
            QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
            QexModel_RenderNodeWithViewProjection(&model.model, node, nullptr, matrix, &camera_.viewMatrix,
                                                  &camera_.projectionMatrix);
            return Read();
        };
        const Picture floor = drawn(0, nullptr), image = drawn(1, &mirrored);
        Picture within;
        int inside = 0, outside = 0;
        for (int i = 0; i < kWidth * kHeight; ++i) {
            const int x = i % kWidth, y = i / kWidth;
            const bool onFloor = floor.Pixel(x, y)[1] == 255;
            within.Fill(x, y, x + 1, y + 1, onFloor ? image.Pixel(x, y) : Rgba{0, 0, 255, 255});
            if (image.Pixel(x, y)[1] == 255) ++(onFloor ? inside : outside);
        }
        EXPECT_GT(inside, 20);
        EXPECT_EQ(outside > 20, aside);
        // The plane itself stays unseen here, so that the picture is that of the mirrored square alone.
        model.Node(0).shader = nullptr;
        for (const bool stencil : {false, true}) {
            QexReflection* reflection =
                QexReflection_InitReflectionInfo(&model.model, 0, aside ? &listed : &all, 1, stencil);
            ASSERT_TRUE(reflection);
            EXPECT_TRUE(SameMatrix(reflection->reflectionMatrix.m, mirror));
            Begin();
            QexReflection_RenderReflection(reflection, nullptr, &camera_);
            EXPECT_TRUE(SamePicture(Read(), stencil ? within : image)) << aside;
            EXPECT_FALSE(model.Node(0).stateFlags & QEX_NODE_RENDERING_ENABLED);
            EXPECT_FALSE(glIsEnabled(GL_STENCIL_TEST));
            QexReflection_Release(reflection);
        }
        const QexVec3 up = {0, 1, 0}, origin = {0, 0, 0};
        QexReflection* endless = QexReflection_InitReflectionInfoInfinite(nullptr, &up, &origin, &listed, 1);
        EXPECT_TRUE(SameMatrix(endless->reflectionMatrix.m, mirror));
        Begin();
        QexReflection_RenderReflection(endless, nullptr, &camera_);
        EXPECT_TRUE(SamePicture(Read(), image)) << "there is no plane node";
        QexReflection_Release(endless);
    }
    QexReflection_Release(nullptr);
}

}  // namespace
