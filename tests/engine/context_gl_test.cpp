// Contexts that are lost, and all that comes back in the next one.
#include <GLES2/gl2.h>
#include <unistd.h>

#include <map>

#include "support/Capture.h"
#include "support/Everything.h"

namespace {

constexpr uint32_t kContextLost = 0x0507;
// Calls that are left out of long rows of the same.
constexpr uint32_t kStep = QEX_SANITIZED ? 37 : 9;

class LostContext : public ContextTest {
  protected:
    explicit LostContext(gltapMode mode = GLTAP_FORWARD) : ContextTest(mode), all_(OutputPath("")) {}
    void SetUp() override {
        ContextTest::SetUp();
        QexEngine_KeepTextures(1);
    }
    void TearDown() override {
        QexEngine_KeepTextures(0);
        ContextTest::TearDown();
    }
    // Another context in place of the one that is there.
    void Replace() {
        std::string error;
        if (mode_ == GLTAP_FORWARD) {
            context_.reset();
            context_ = qex::HeadlessContext::Create(kWidth, kHeight, &error);
            ASSERT_TRUE(context_) << error;
        }
        gltapReset();
    }
    // Without its lines.
    int32_t Restore() {
        Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
        return QexEngine_ContextRestored();
    }
    int32_t LoseAndRestore() {
        const uint64_t before = gltapCountAll();
        QexEngine_ContextLost();
        EXPECT_EQ(gltapCountAll(), before);
        Replace();
        return Restore();
    }
    int32_t RestorePart(float* progress = nullptr) {
        Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
        return QexEngine_ContinueRestore(0, progress);
    }
    Picture Frame() {
        Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
        all_.Draw();
        return context_ ? Read() : Picture();
    }
    bool Load() {
        Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
        return all_.Load();
    }
    void Release() {
        Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
        all_.Release();
    }
    Everything all_;
};

class LostNullContext : public LostContext {
  protected:
    LostNullContext() : LostContext(GLTAP_NULL) {}
};

// In both ways of drawing, and from one to the other.
TEST_F(LostContext, TheNextFrameIsTheSame) {
    ASSERT_TRUE(Load());
    const Picture described = Frame();
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    const Picture lean = Frame();
    for (int round = 0; round < 3; ++round) {
        EXPECT_EQ(LoseAndRestore(), 0);
        EXPECT_TRUE(SamePicture(Frame(), lean)) << round;
    }
    QexEngine_ContextLost();
    Replace();
    float progress = 0, before = 0;
    while (RestorePart(&progress) == 1) {
        EXPECT_GE(progress, before);
        before = progress;
    }
    EXPECT_EQ(progress, 1);
    EXPECT_TRUE(SamePicture(Frame(), lean));
    QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
    for (int round = 0; round < 2; ++round) {
        EXPECT_TRUE(SamePicture(Frame(), described)) << round;
        EXPECT_EQ(LoseAndRestore(), 0);
    }
    EXPECT_EQ(QexEngine_IsContextLost(), 0u);
    Release();
}

// What is released while there is no context takes nothing from the next one.
TEST_F(LostContext, RecordsMayGoMeanwhile) {
    ASSERT_TRUE(Load());
    const Picture expected = Frame();
    QexEngine_ContextLost();
    Replace();
    const auto deleted = [] {
        return gltapCount("glDeleteTextures") + gltapCount("glDeleteBuffers") + gltapCount("glDeleteProgram");
    };
    const uint64_t before = deleted();
    Release();
    EXPECT_EQ(deleted(), before);
    EXPECT_EQ(LiveObjects(), "");
    ASSERT_TRUE(Load());  // starts the engine, which ends the loss
    EXPECT_EQ(QexEngine_IsContextLost(), 0u);
    EXPECT_TRUE(SamePicture(Frame(), expected));
    Release();
}

// Memory that was not kept: the application is asked by name, or the texture has no image and a line says so.
TEST_F(LostContext, TheApplicationIsAskedForItsMemory) {
    QexEngine_KeepTextures(0);
    QexRuntimeContext runtime;
    QexEngineConfig config = SurfaceConfig();
    Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
    ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
    QexTexture texture = SolidTexture({10, 200, 30, 255});
    QexTexture_SetFilter(&texture, QEX_FILTER_LINEAR);
    static uint32_t asked;
    asked = 0;
    const auto draw = [&] {
        Clear();
        const QexRect whole = {0, 0, 1, 1};
        QexTexture_Draw(&runtime, &texture, 10, 20, &whole, 8, 8, 0xFFFFFFFF);
        return Read().Pixel(14, 30);
    };
    EXPECT_EQ(draw(), (Rgba{10, 200, 30, 255}));
    EXPECT_EQ(LoseAndRestore(), -1);
    EXPECT_NE(draw(), (Rgba{10, 200, 30, 255}));
    QexEngine_SetTextureSource(
        [](void* user, uint32_t name, QexTexture* record) -> int32_t {
            asked = name;
            *record = SolidTexture({10, 200, 30, 255});
            return user ? 0 : -1;
        },
        &texture);
    EXPECT_EQ(LoseAndRestore(), 0);
    EXPECT_EQ(asked, texture.glName);
    EXPECT_EQ(draw(), (Rgba{10, 200, 30, 255}));
    // A model's hook is asked before it, with the same path and for the same record.
    static std::string paths;
    paths.clear();
    QexModel model;
    QexModel_Create(&model);
    model.loadTextureHook = [](QexModel* of, char* path, int32_t) -> int32_t {
        uint32_t last = of->scene.materialCount;
        while (last > 0 && !of->textures[last - 1]) --last;
        paths += std::to_string(last) + path + " ";
        *of->textures[last - 1] = SolidTexture({1, 2, 3, 255});
        return 1;
    };
    ASSERT_EQ(QexModel_LoadContent(&model, OutputPath("").c_str(), "worm.pod"), 0);
    const std::string loaded = paths;
    EXPECT_NE(loaded, "");
    paths.clear();
    asked = 0;
    EXPECT_EQ(LoseAndRestore(), 0);
    EXPECT_EQ(paths, loaded);
    EXPECT_EQ(asked, texture.glName);
    QexModel_Unload(&model);
    GLint filter = 0;
    glBindTexture(GL_TEXTURE_2D, texture.glName);
    glGetTexParameteriv(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, &filter);
    EXPECT_EQ(filter, GL_LINEAR);
    QexEngine_SetTextureSource(nullptr, nullptr);
    QexTexture_Release(&texture);
    QexEngine_Shutdown(&runtime);
}

// What modules were told once; and the buffers of a model that an ended context left behind, which were under
// the names of a new one's.
TEST_F(LostContext, ValuesAndNamesOfOld) {
    QexRuntimeContext runtime;
    QexEngineConfig config = SurfaceConfig();
    Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
    QexModel models[2];
    QexVec3 corners[] = {{0, 0, 0}, {1, 0, 0}, {0, 1, 0}};
    QexMesh triangle = {};
    triangle.positions = corners;
    triangle.vertexCount = 3;
    ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
    ASSERT_EQ(QexModel_CreateFromMesh(&models[0], &triangle, nullptr), 0);
    QexEngine_Shutdown(&runtime);
    Replace();
    ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
    QexModel_Create(&models[1]);
    ASSERT_EQ(QexModel_LoadContent(&models[1], OutputPath("").c_str(), "worm.pod"), 0);
    ASSERT_EQ(models[0].vertexBuffers[0], models[1].vertexBuffers[0]);
    QexShaderModule* depth = QexDepthShader_CreateProgram();
    QexDepthShader_SetParameters(depth, 2, 30);
    EXPECT_EQ(LoseAndRestore(), 0);
    GLint bytes = 0;
    glBindBuffer(GL_ARRAY_BUFFER, models[1].vertexBuffers[0]);
    glGetBufferParameteriv(GL_ARRAY_BUFFER, GL_BUFFER_SIZE, &bytes);
    const QexPODMesh& mesh = models[1].scene.meshes[0];
    EXPECT_EQ(static_cast<uint32_t>(bytes), mesh.vertexCount * mesh.vertices.stride);
    float ends[2] = {};
    glGetUniformfv(depth->program, glGetUniformLocation(depth->program, "near"), &ends[0]);
    glGetUniformfv(depth->program, glGetUniformLocation(depth->program, "far"), &ends[1]);
    EXPECT_EQ(ends[0], 2);
    EXPECT_EQ(ends[1], 30);
    QexEngine_ContextLost();
    QexDepthShader_Release(&depth);
    for (QexModel& model : models) QexModel_Unload(&model);
    QexEngine_Shutdown(&runtime);
    Replace();
    EXPECT_EQ(QexEngine_ContextRestored(), 0);
}

// What was being made when the context went is given up by the next call.
TEST_F(LostContext, ALoadInPartsFails) {
    QexRuntimeContext runtime;
    QexEngineConfig config = SurfaceConfig();
    QexModel model;
    Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
    QexModel_Create(&model);
    ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
    for (int calls = 1;; ++calls) {
        int32_t result = QexModel_BeginLoad(&model, OutputPath("").c_str(), "worm.pod");
        for (int i = 0; result == 0 && i < calls; ++i) result = QexModel_ContinueLoad(&model, 0, nullptr) - 1;
        const bool under_way = result == 0;
        ASSERT_EQ(LoseAndRestore(), 0) << calls;
        EXPECT_EQ(QexModel_ContinueLoad(&model, 0, nullptr), -1) << calls;
        QexModel_Unload(&model);
        ASSERT_EQ(QexModel_LoadContent(&model, OutputPath("").c_str(), "worm.pod"), 0);
        QexModel_Unload(&model);
        if (!under_way) break;
        calls += calls / 4;
    }
    QexEngine_Shutdown(&runtime);
}

// In the middle of a restore things are drawn, as far as they are there, and released.
TEST_F(LostNullContext, InTheMiddleOfARestore) {
    int parts = 0;
    for (int32_t result = 1; result == 1; parts += 3) {
        gltapBeginReads();
        ASSERT_TRUE(Load());
        QexRenderer_SetDrawing(parts & 1 ? QEX_DRAWING_LEAN : QEX_DRAWING_DESCRIBED);
        Frame();
        QexEngine_ContextLost();
        gltapReset();
        gltapBeginReads();
        for (int i = 0; i < parts && result == 1; ++i) result = RestorePart();
        Frame();
        char text[200];
        EXPECT_EQ(gltapReadFaults(text, sizeof text), 0u) << parts << text;
        Release();
        EXPECT_EQ(LiveObjects(), "") << parts;
        EXPECT_EQ(Restore(), 0);
    }
    EXPECT_GT(parts, 60);
}

// Lost at every call of loading and drawing, as the GL says by an error: no end of the process, nothing left.
TEST_F(LostNullContext, AtEveryCall) {
    EXPECT_TRUE(Load());
    Frame();
    Release();
    gltapResetCounts();
    EXPECT_TRUE(Load());
    Frame();
    std::map<std::string, uint64_t> counts;
    for (int f = 0; f < gltapFunctionCount(); ++f)
        counts[gltapFunctionName(f)] = gltapCount(gltapFunctionName(f));
    Release();
    counts.erase("glGetError");
    uint32_t recognised = 0, again = 0;
    for (const auto& [function, count] : counts)
        for (uint32_t nth = 1; nth <= count; nth += nth < 10 ? 1 : kStep) {
            gltapInjectError(function.c_str(), nth, kContextLost);
            bool loaded = Load();
            if (!QexEngine_IsContextLost()) Frame();
            recognised += QexEngine_IsContextLost();
            const int32_t restored = LoseAndRestore();
            ASSERT_EQ(restored, 0) << function << nth;
            if (!loaded) {
                Release();
                loaded = Load();
                ++again;
            }
            ASSERT_TRUE(loaded) << function << nth;
            Frame();
            // Lost while it is restored.
            QexEngine_ContextLost();
            Replace();
            if (function.rfind("glDelete", 0) != 0)
                gltapInjectError(function.c_str(), (nth + 1) / 2, kContextLost);
            const bool failed = Restore() != 0;
            ASSERT_EQ(failed, QexEngine_IsContextLost() != 0) << function << nth;
            ASSERT_EQ(LoseAndRestore(), 0) << function << nth;
            Release();
            ASSERT_EQ(LiveObjects(), "") << function << nth;
        }
    EXPECT_GT(recognised, 200u);
    EXPECT_GT(again, 100u);
}

}  // namespace
