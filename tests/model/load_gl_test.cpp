// Loading in parts against loading at once: the same records, buffers, textures, hooks and lines, whatever
// others do with the GL in between.
#include <GLES2/gl2.h>

#include <cstring>
#include <map>

#include "scenes/Scenes.h"
#include "support/Capture.h"
#include "support/ImageFiles.h"
#include "support/RenderScenes.h"

namespace {

const std::string kFolder = OutputPath("");
constexpr uint32_t kFrames = 9000;  // whose rotations are more than one piece

pod::MeshArrays Ball(uint32_t segments) {
    pod::MeshArrays sphere = scenes::Sphere(segments);
    for (pod::Vec3& p : sphere.positions) p = {64 + 40 * p[0], 48 + 40 * p[1], 0.5f * p[2]};
    return sphere;
}

// Meshes of several pieces, as they lie, laid out anew and with indices to be narrowed; keys of several
// pieces; textures that are uploaded as they are, decoded in bands, completed, missing or broken.
pod::Scene Rich() {
    pod::MeshArrays bare = Ball(100);
    bare.binormals.clear();
    pod::Scene scene = SceneOf(pod::BuildMesh(Ball(100)));
    scene.meshes.insert(scene.meshes.end(),
                        {pod::BuildMesh(bare), pod::Mesh(), pod::BuildMesh(Ball(20), true)});
    pod::Transform moving;
    for (uint32_t i = 0; i < kFrames; ++i) {
        const float turn = 0.0001f * static_cast<float>(i);
        moving.positions.push_back({turn, 0, 0});
        moving.rotations.push_back({0, 0, turn, 1 - turn});
    }
    scene.frameCount = kFrames;
    scene.nodes = {pod::BuildNode("moving", moving, -1, 0, 0), pod::BuildNode("bare", {}, -1, 1, 1),
                   pod::BuildNode("empty", {}, -1, 2, 2), pod::BuildNode("wide", {}, -1, 3, 3)};
    scene.meshNodeCount = 4;
    scene.textures = {"rgb.pvr", "pvrtc.pvr", "etc.pvr", "swapped.ktx", "none.pvr", "cut.pvr"};
    scene.materials.resize(scene.textures.size());
    for (uint32_t i = 0; i < scene.textures.size(); ++i)
        scene.materials[i].diffuseTexture = static_cast<int32_t>(i);
    return scene;
}

void WriteTextures() {
    const Bytes rgb = pod::WritePvr(PvrNoise(pod::kPvrRgb888, 512, 256, 10, 1));
    Ktx ktx;
    ktx.type = GL_UNSIGNED_SHORT_5_6_5;
    ktx.format = ktx.base = ktx.internal = GL_RGB;
    ktx.width = ktx.height = 32;
    ktx.levels = {{Noise(2048)}};
    pod::WriteFile(kFolder + "rgb.pvr", rgb);
    pod::WriteFile(kFolder + "rgb_a.pvr", pod::WritePvr(PvrNoise(pod::kPvrAlpha8, 8, 8, 1, 1)));
    pod::WriteFile(kFolder + "pvrtc.pvr", pod::WritePvr(PvrNoise(pod::kPvrtc4, 512, 512, 2, 1)));
    pod::WriteFile(kFolder + "etc.pvr", pod::WritePvr(PvrNoise(pod::kPvrEtc1, 301, 299, 1, 1)));
    pod::WriteFile(kFolder + "swapped.ktx", SwappedFile(ktx));
    pod::WriteFile(kFolder + "cut.pvr", {rgb.begin(), rgb.begin() + 1000});
}

// What the GL was given, by objects in the order in which they are first used.
struct Contents {
    std::vector<Bytes> buffers;
    std::string textures;

    explicit Contents(const GLCalls& calls) {
        std::map<int64_t, size_t> number;  // of buffers
        std::map<int64_t, int64_t> bound;  // by target
        std::map<int64_t, size_t> texture = {{0, 0}};
        int64_t alignment = 4;
        for (const gltapCall* call :
             calls.Of({"glBindBuffer", "glBufferData", "glBufferSubData", "glBindTexture", "glPixelStorei",
                       "glTexImage2D", "glCompressedTexImage2D", "glTexParameteri", "glGenerateMipmap"})) {
            const std::string name = gltapFunctionName(call->function);
            const auto* data = static_cast<const char*>(call->data);
            const int64_t first = call->argument[0].i, second = call->argument[1].i;
            if (name == "glBindBuffer" || name == "glBindTexture") {
                bound[first] = second;
            } else if (name == "glPixelStorei") {
                alignment = second;
            } else if (name == "glBufferData" || name == "glBufferSubData") {
                const bool whole = name == "glBufferData";
                const auto [at, made] = number.emplace(bound[first], buffers.size());
                if (made) buffers.emplace_back();
                Bytes& bytes = buffers[at->second];
                if (whole) bytes.assign(static_cast<size_t>(second), 0);
                if (data) std::memcpy(bytes.data() + (whole ? 0 : second), data, call->dataSize);
            } else {
                textures +=
                    name + " of " +
                    std::to_string(texture.emplace(bound[GL_TEXTURE_2D], texture.size()).first->second);
                const int numbers = name == "glCompressedTexImage2D" ? 7 : 8;  // before the address
                for (int i = 0; i < call->argumentCount && i < numbers; ++i)
                    textures += " " + std::to_string(call->argument[i].i);
                textures += name == "glTexImage2D" ? " by " + std::to_string(alignment) + " " : " ";
                textures += std::string(data, data + call->dataSize) + "\n";
            }
        }
    }
};

std::string g_hooks;

int32_t TextureHook(QexModel* model, char* path, int32_t) {
    uint32_t records = 0;
    for (uint32_t i = 0; i < model->scene.materialCount; ++i) records += model->textures[i] != nullptr;
    g_hooks += std::string(path).substr(kFolder.size()) + " of " + std::to_string(records) + " ";
    return 0;
}

int32_t NodeHook(QexModel* model, QexPODMesh* mesh, uint32_t node) {
    g_hooks += std::to_string(node) + ">" + std::to_string(mesh - model->scene.meshes) + " ";
    return 0;
}

std::string Keys(const QexPODModel& scene) {
    std::string keys;
    for (uint32_t i = 0; i < scene.meshCount; ++i)
        keys.append(reinterpret_cast<const char*>(scene.meshes[i].attributes),
                    sizeof scene.meshes[i].attributes)
            .append(reinterpret_cast<const char*>(&scene.meshes[i].localBox),
                    sizeof scene.meshes[i].localBox);
    for (uint32_t i = 0; i < scene.nodeCount; ++i)
        if (scene.nodes[i].rotation && scene.nodes[i].animationFlags)
            keys.append(reinterpret_cast<const char*>(scene.nodes[i].position), kFrames * 12)
                .append(reinterpret_cast<const char*>(scene.nodes[i].rotation), kFrames * 16);
    return keys;
}

using Load = std::function<int32_t(QexModel*)>;

class LoadTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        WriteTextures();
        file_ = pod::WritePod(Rich());
        pod::WriteFile(kFolder + "rich.pod", file_);
        other_ = std::make_unique<LoadedModel>(SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8))));
        QexModel_Create(&model_);
        model_.loadTextureHook = TextureHook;
        model_.meshNodeLoadedHook = NodeHook;
        live_ = LiveObjects();
    }
    void TearDown() override {
        QexModel_Unload(&model_);
        EXPECT_EQ(LiveObjects(), live_);
        other_.reset();
        RenderTest::TearDown();
    }

    static int32_t AtOnce(QexModel* model) {
        return QexModel_LoadContent(model, kFolder.c_str(), "rich.pod");
    }
    // Leaves other bindings than the load's, and sees that the model is not there.
    void Interfere() {
        other_->Draw();
        QexTexture_SetBlankNormalMap(0);
        glPixelStorei(GL_UNPACK_ALIGNMENT, 8);
        const uint64_t calls = gltapCount("glDrawElements");
        QexModel_RenderWithViewProjection(&model_, nullptr, nullptr, &g_sMatIdentity, &g_sMatIdentity, 0);
        QexModel_Update(nullptr, &model_, 1);
        QexModel_UpdateModelBoundingBox(&model_, nullptr);
        QexModel_DownloadGeometry(&model_);  // which goes when the load is done
        EXPECT_EQ(QexModel_SetOpacity(&model_, 0, 0.5f), 0);
        EXPECT_EQ(gltapCount("glDrawElements"), calls);
    }
    // Goes on with a load that has begun, if it has, to its end.
    int32_t Continue(int32_t begun, float milliseconds) {
        float before = 0, progress = 0;
        int32_t result = begun == 0 ? 1 : begun;
        for (calls_ = 0; result == 1; before = progress, ++calls_) {
            if (calls_) Interfere();
            result = QexModel_ContinueLoad(&model_, milliseconds, &progress);
            if (result < 0) break;
            EXPECT_LE(before, progress);
            EXPECT_EQ(progress == 1, result == 0) << progress;
        }
        glPixelStorei(GL_UNPACK_ALIGNMENT, 4);
        return result;
    }
    // The result and everything that was said, and what the GL got.
    std::pair<std::string, std::unique_ptr<Contents>> Run(const Load& load) {
        std::string said;
        int32_t result = 0;
        g_hooks.clear();
        const GLCalls calls([&] {
            BothOutputs outputs;
            result = load(&model_);
            said = outputs.Out() + outputs.Errors();
        });
        return {std::to_string(result) + " " + g_hooks + "\n" + said, std::make_unique<Contents>(calls)};
    }
    void ExpectSame(const Load& atOnce, const std::function<int32_t()>& begin) {
        const auto [said, contents] = Run(atOnce);
        const std::string keys = Keys(model_.scene);
        Clear();
        QexModel_RenderWithViewProjection(&model_, nullptr, nullptr, &g_sMatIdentity, &projection_, 0);
        const Picture picture = Read();
        for (const float milliseconds : {0.0f, 1.0f, HUGE_VALF}) {
            SCOPED_TRACE(milliseconds);
            const auto [parts, made] = Run([&](QexModel*) { return Continue(begin(), milliseconds); });
            EXPECT_EQ(parts, said);
            EXPECT_TRUE(made->buffers == contents->buffers);
            EXPECT_TRUE(made->textures == contents->textures);
            EXPECT_TRUE(Keys(model_.scene) == keys);
            EXPECT_EQ(calls_ > 100, milliseconds == 0);
            EXPECT_EQ(calls_ == 1, milliseconds > 1);
            Clear();
            QexModel_RenderWithViewProjection(&model_, nullptr, nullptr, &g_sMatIdentity, &projection_, 0);
            EXPECT_TRUE(SamePicture(Read(), picture));
        }
    }

    QexModel model_;
    std::unique_ptr<LoadedModel> other_;
    std::vector<uint8_t> file_;
    std::string live_;
    const QexMatrix projection_ = PixelProjection();
    int calls_ = 0;
};

TEST_F(LoadTest, PartsMakeWhatIsMadeAtOnce) {
    gltapSetInteger(GL_NUM_COMPRESSED_TEXTURE_FORMATS, 0);  // so that ETC1 is decoded
    ExpectSame(AtOnce, [&] {
        model_.loadTextureHook = nullptr;
        const int32_t begun = QexModel_BeginLoad(&model_, kFolder.c_str(), "rich.pod");
        model_.loadTextureHook = TextureHook;
        return begun;
    });
    EXPECT_NE(model_.textures[1], nullptr);
    QexNameCache cache;
    QexNameCache_Create(&cache, 2, sizeof(QexTexture*));
    ScopedTexture colour({9, 99, 200, 255});
    QexTexture* texture = &colour;
    QexNameCache_Add(&cache, "etc.pvr", &texture);
    model_.loadTextureHook = nullptr;  // takes a folder for granted
    const auto size = static_cast<uint32_t>(file_.size());
    ExpectSame([&](QexModel* m) { return QexModel_LoadContentFromCache(m, file_.data(), size, &cache); },
               [&] { return QexModel_BeginLoadFromCache(&model_, file_.data(), size, &cache); });
    EXPECT_EQ(model_.textures[2], texture);
    QexNameCache_Release(&cache);
}

TEST_F(LoadTest, FailuresSayTheSameAndLeaveNothing) {
    pod::MeshArrays many;
    many.positions.resize(65537);
    many.indices = {0, 1, 65536};
    const Bytes large = pod::WritePod(SceneOf(pod::BuildMesh(many, true)));
    pod::WriteFile(kFolder + "large.pod", large);
    const auto fail = [&](const Load& atOnce, const std::function<int32_t()>& begin, const char* line) {
        const std::string said = Run(atOnce).first;
        EXPECT_NE(said.find(line), std::string::npos) << said;
        std::string parts = Run([&](QexModel*) { return Continue(begin(), 0); }).first;
        EXPECT_EQ(parts.substr(0, 3), "-1 ");
        EXPECT_EQ(parts.substr(parts.find('\n')), said.substr(said.find('\n')));
        EXPECT_EQ(LiveObjects(), live_);
        EXPECT_TRUE(model_.flags & QEX_MODEL_NO_SHADERS && !model_.scene.meshes);
    };
    for (const char* name : {"none.pod", "large.pod", "cut.pvr"})
        fail([&](QexModel* m) { return QexModel_LoadContent(m, kFolder.c_str(), name); },
             [&] { return QexModel_BeginLoad(&model_, kFolder.c_str(), name); }, "<QexModel_LoadContent> ");
    for (size_t size = 100; size < file_.size(); size += file_.size() / 12) {
        const Bytes cut(file_.begin(), file_.begin() + static_cast<long>(size));
        const auto bytes = static_cast<uint32_t>(size);
        fail([&](QexModel* m) { return QexModel_LoadContentFromCache(m, cut.data(), bytes, nullptr); },
             [&] { return QexModel_BeginLoadFromCache(&model_, cut.data(), bytes, nullptr); },
             "QexModel_LoadFromMemory failed!");
    }
    const auto idle = Run([](QexModel* m) { return QexModel_ContinueLoad(m, 1, nullptr); });
    EXPECT_EQ(idle.first, "-1 \nE/Qex: <QexModel_ContinueLoad> the model is not being loaded\n");
}

TEST_F(LoadTest, GivingUpLeavesNothingAtAnyPoint) {
    pod::WriteFile(kFolder + "small.pod", pod::WritePod(SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8)))));
    const std::function<void()> ends[] = {
        [&] { QexModel_Unload(&model_); },
        [&] {
            QexModel_LoadFromMemory(&model_, file_.data(), static_cast<uint32_t>(file_.size()));
            model_.flags |= QEX_MODEL_NO_SHADERS;
        },
        [&] { QexModel_BeginLoad(&model_, kFolder.c_str(), "rich.pod"); },
        [&] { QexModel_DownloadGeometry(&model_); },
    };
    // Its own hook does not end a load, nor begin another.
    model_.meshNodeLoadedHook = [](QexModel* model, QexPODMesh*, uint32_t) -> int32_t {
        QexModel_Unload(model);
        EXPECT_EQ(QexModel_LoadContent(model, kFolder.c_str(), "small.pod"), -1);
        return QexModel_ContinueLoad(model, 0, nullptr);
    };
    {
        BothOutputs outputs;
        EXPECT_EQ(QexModel_LoadContent(&model_, kFolder.c_str(), "small.pod"), 0);
    }
    EXPECT_NE(model_.vertexBuffers, nullptr);
    QexModel_Unload(&model_);
    for (const auto& [name, stride] : {std::pair("small.pod", 1), std::pair("rich.pod", 29)})
        for (int32_t steps = 0, result = 1; result == 1; steps += stride) {
            BothOutputs outputs;
            QexModel_Create(&model_);
            QexModel_BeginLoad(&model_, kFolder.c_str(), name);
            for (int32_t i = 0; i < steps && result == 1; ++i)
                result = QexModel_ContinueLoad(&model_, 0, nullptr);
            ends[steps % 4]();
            QexModel_Unload(&model_);
            ASSERT_EQ(LiveObjects(), live_) << name << " " << steps;
        }
}

}  // namespace
