// Loading and unloading of models: textures, hooks, shared shaders, and loads that fail.
#include <cstring>

#include "PvrWriter.h"
#include "scenes/Scenes.h"
#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

const std::string kFolder = OutputPath("");

// wood.pvr is 4 x 4 and has an alpha texture of 2 x 2, stone.pvr is 8 x 8 and has none.
void WritePictures() {
    const std::pair<const char*, uint32_t> pictures[] = {
        {"wood.pvr", 4}, {"wood_a.pvr", 2}, {"stone.pvr", 8}};
    for (const auto& [name, size] : pictures) {
        pod::PvrImage image;
        image.width = image.height = size;
        image.surfaces = {{std::vector<uint8_t>(pod::PvrLevelSize(image.type, size, size), 200)}};
        pod::WriteFile(kFolder + name, pod::WritePvr(image));
    }
}

pod::Scene Materials(std::initializer_list<const char*> textures) {
    pod::Scene scene = SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8)));
    scene.textures.clear();
    scene.materials.clear();
    for (const char* texture : textures) {
        scene.materials.emplace_back();
        if (!texture) continue;
        scene.materials.back().diffuseTexture = static_cast<int32_t>(scene.textures.size());
        scene.textures.push_back(texture);
    }
    return scene;
}

// Loads a file; returns the result and the errors, "-1 E/Qex: ...".
std::string LoadFile(QexModel* model, const char* name, const std::string& directory = kFolder) {
    Capture out(STDOUT_FILENO), log(STDERR_FILENO);
    const int32_t result = QexModel_LoadContent(model, directory.c_str(), name);
    return std::to_string(result) + " " + ErrorLines(log.Text());
}

class ModelTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        WritePictures();
        pod::WriteFile(kFolder + "scene.pod",
                       pod::WritePod(Materials({"wood.pvr", "stone.pvr", nullptr, "none.pvr", "abc"})));
        QexModel_Create(&model_);
        before_ = LiveObjects();
    }
    void TearDown() override {
        QexModel_Unload(&model_);
        QexModel_Unload(&model_);
        EXPECT_EQ(LiveObjects(), before_);
        RenderTest::TearDown();
    }
    // Sizes of the materials' textures and alpha textures, "4/2 8/0 "; 0 for none.
    std::string Sizes() const {
        std::string text;
        for (uint32_t i = 0; i < model_.scene.materialCount; ++i) {
            const QexTexture *texture = model_.textures[i], *alpha = model_.alphaTextures[i];
            text += std::to_string(texture ? texture->width : 0) + "/" +
                    std::to_string(alpha ? alpha->width : 0) + " ";
        }
        return text;
    }

    QexModel model_;
    std::string before_;
};

TEST_F(ModelTest, TexturesByNameAndSuffix) {
    for (int i = 0; i < 2; ++i) {  // the second load takes the place of the first
        EXPECT_EQ(LoadFile(&model_, "scene.pod").substr(0, 2), "0 ");
        EXPECT_EQ(Sizes(), "4/2 8/0 0/0 0/0 0/0 ");
    }
    EXPECT_EQ(model_.scene.nodes[0].shader->render, QexTextureShader_Render);
    // From a cache the textures are borrowed, whether it holds pointers or records.
    QexTexture *wood = model_.textures[0], *alpha = model_.alphaTextures[0];
    const std::vector<uint8_t> file = pod::WritePod(Materials({"wood.pvr", "stone.pvr"}));
    for (const bool records : {false, true}) {
        QexNameCache cache;
        QexNameCache_Create(&cache, 2, records ? sizeof(QexTexture) : sizeof(QexTexture*));
        QexNameCache_Add(&cache, "wood.pvr", records ? static_cast<void*>(wood) : &wood);
        QexNameCache_Add(&cache, "wood_a.pvr", records ? static_cast<void*>(alpha) : &alpha);
        QexModel borrower;
        QexModel_Create(&borrower);
        Capture out(STDOUT_FILENO), log(STDERR_FILENO);
        QexModel_LoadContentFromCache(&borrower, file.data(), static_cast<uint32_t>(file.size()), &cache);
        ASSERT_TRUE(borrower.textures[0] && borrower.alphaTextures[0]);
        EXPECT_EQ(borrower.textures[0]->glName, wood->glName);
        EXPECT_EQ(borrower.textures[0] == wood, !records);
        EXPECT_EQ(borrower.textures[1], nullptr);
        EXPECT_EQ(borrower.alphaTextures[0]->glName, alpha->glName);
        EXPECT_EQ(GLCalls([&] { QexModel_UnloadTextures(&borrower); }).Size(), 0u);
        QexModel_Unload(&borrower);
        QexNameCache_Release(&cache);
    }
}

std::string g_hookLog;

int32_t LoadHook(QexModel* model, char* path, int32_t capacity) {
    g_hookLog += std::string(path).substr(kFolder.size()) + ":" + std::to_string(capacity) + " ";
    if (std::strstr(path, "stone.pvr")) return 0;
    if (!std::strstr(path, "none.pvr")) {
        std::strcpy(path, (kFolder + "stone.pvr").c_str());
        return 0;
    }
    *model->textures[2] = SolidTexture({1, 2, 3, 4});
    return 1;
}

int32_t NodeHook(QexModel* model, QexPODMesh* mesh, uint32_t node) {
    g_hookLog += std::to_string(node) + ">" + std::to_string(mesh - model->scene.meshes) + " ";
    return -1;
}

TEST_F(ModelTest, HooksOfLoading) {
    pod::Scene scene = Materials({"wood.pvr", "stone.pvr", "none.pvr", nullptr});
    scene.meshes.resize(2, scene.meshes[0]);
    scene.nodes[0].object = 1;
    pod::WriteFile(kFolder + "hooks.pod", pod::WritePod(scene));
    g_hookLog.clear();
    model_.loadTextureHook = LoadHook;
    model_.meshNodeLoadedHook = NodeHook;
    EXPECT_EQ(LoadFile(&model_, "hooks.pod").substr(0, 2), "0 ");
    EXPECT_EQ(g_hookLog, "wood.pvr:255 stone.pvr:255 none.pvr:255 0>1 ");
    EXPECT_EQ(Sizes(), "8/2 8/0 1/0 0/0 ");
}

TEST_F(ModelTest, SharedShadersLiveAsLongAsTheirModels) {
    LoadFile(&model_, "scene.pod");
    QexShaderModule* shared = model_.scene.nodes[0].shader;
    EXPECT_EQ(LoadedModel(Materials({nullptr})).Node().shader, shared);
    EXPECT_EQ(GLCalls([] { LoadedModel third(Materials({nullptr})); }).Text({"glCreateProgram"}), "");
    QexModel_SetAlphaTestCmpValue(0.125f);
    EXPECT_EQ(QexTextureShader_GetAlphaThreshold(shared), 0.125f);
    QexModel_SetAlphaTestCmpValue(0.5f);
    QexModel_CreateDefaultShader();
    EXPECT_NE(m_SkinShadowShaderProgram.program * m_uModelShadowShaderProgram.program, 0u);
    QexModel_ReleaseShader(1);
    EXPECT_EQ(m_SkinShadowShaderProgram.program + m_uModelShadowShaderProgram.program, 0u);
}

TEST_F(ModelTest, FailedLoadsKeepNothingAndTakeNothing) {
    pod::MeshArrays many;
    many.positions.resize(65537);
    many.indices = {0, 1, 65536};
    const std::vector<uint8_t> whole = pod::WritePod(Materials({nullptr}));
    pod::WriteFile(kFolder + "large.pod", pod::WritePod(SceneOf(pod::BuildMesh(many, true))));
    pod::WriteFile(kFolder + "cut.pod", {whole.begin(), whole.begin() + static_cast<long>(whole.size() / 2)});
    const std::string read = "QexModel_LoadFromFile error.\n", geometry = "download geometry failed!\n";
    const struct {
        const char* file;
        std::string end, directory = kFolder;
    } cases[] = {{"missing.pod", read},
                 {"cut.pod", read},
                 {"large.pod", geometry},
                 {"a.pod", read, std::string(251, 'd')}};
    LoadedModel other(SceneOf(pod::BuildMesh(Rectangle(0, 0, 128, 96))));
    const std::string live = LiveObjects();
    for (const auto& c : cases) {
        QexModel failed;
        QexModel_Create(&failed);
        const std::string load = LoadFile(&failed, c.file, c.directory);
        EXPECT_EQ(load.substr(0, 3), "-1 ") << c.file;
        const std::string end = "E/Qex: <QexModel_LoadContent> " + c.end;
        EXPECT_EQ(load.substr(load.size() - std::min(load.size(), end.size())), end);
        EXPECT_EQ(LiveObjects(), live) << c.file;
        const GLCalls calls([&] {
            QexModel_RenderWithViewProjection(&failed, nullptr, nullptr, &g_sMatIdentity, &g_sMatIdentity, 0);
            QexModel_Update(nullptr, &failed, 1);
            QexModel_Unload(&failed);
            QexModel_Unload(&failed);
        });
        EXPECT_EQ(calls.Size(), 0u) << c.file;
    }
    Clear();
    other.Draw();
    EXPECT_EQ(Read().Pixel(60, 40), (Rgba{255, 255, 255, 255})) << "the other model lost its shaders";
}

// A normal map that leans everything towards the binormal, on a sphere in light from above, with and without
// a mirrored texture. Normals of a file's own binormals must give what those made for it give.
TEST_F(ModelTest, TangentsAloneGetBinormals) {
    static ScopedTexture* s_map;
    ScopedTexture leaning({128 + 76, 128, 128 + 102, 255}), straight({128, 128, 255, 255});
    const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {0, -1, -0.5f}, {1, 1, 1, 1}}}};
    const QexMatrix projection = PixelProjection();
    QexShaderModule* module = QexGouraudNormalMapShader_CreateProgram();
    const auto draw = [&](const pod::MeshArrays& arrays, ScopedTexture* map) {
        pod::Scene scene = SceneOf(pod::BuildMesh(arrays));
        scene.materials[0].ambient = {0, 0, 0};
        LoadedModel model(scene);
        model.Node().shader = module;
        s_map = map;
        model.model.bindTextureHook = [](QexModel*, uint32_t) { return QexTexture_Set(s_map, 1), 0; };
        Clear();
        QexModel_RenderWithViewProjection(&model.model, &lights, nullptr, &g_sMatIdentity, &projection, 0);
        return Read();
    };
    pod::MeshArrays sphere = scenes::Sphere(12);
    for (pod::Vec3& p : sphere.positions) p = {64 + 40 * p[0], 48 + 40 * p[1], 0.5f * p[2]};
    for (const float side : {1.0f, -1.0f}) {
        pod::MeshArrays tangents = sphere;
        for (auto& uv : tangents.uvs) uv[0] *= side;
        for (pod::Vec3& tangent : tangents.tangents)
            tangent = {side * tangent[0], side * tangent[1], side * tangent[2]};
        const Picture expected = draw(tangents, &leaning);
        tangents.binormals.clear();
        EXPECT_TRUE(SamePicture(draw(tangents, &leaning), expected, 1));
        EXPECT_FALSE(SamePicture(draw(tangents, &straight), expected, 1));
    }
    QexGouraudNormalMapShader_Release(&module);
}

class ModelMemoryTest : public NullRenderTest {};

TEST_F(ModelMemoryTest, LoadsLeaveNothing) {
    WritePictures();
    pod::WriteFile(kFolder + "again.pod", pod::WritePod(Materials({"wood.pvr", nullptr})));
    const auto load = [&] {
        QexModel model;
        QexModel_Create(&model);
        EXPECT_EQ(LoadFile(&model, "again.pod").substr(0, 2), "0 ");
        EXPECT_NE(model.textures[0], nullptr);
        EXPECT_NE(model.alphaTextures[0], nullptr);
        QexModel_Unload(&model);
    };
    load();
    const Allocations allocations = CountAllocations(load);
    EXPECT_EQ(allocations.balance, 0);
    EXPECT_EQ(allocations.made > 1, kAllocationsAreCounted);
}

}  // namespace
