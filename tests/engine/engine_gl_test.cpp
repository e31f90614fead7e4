#include <cstring>

#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

using Init = int32_t (*)(QexRuntimeContext*, uint32_t, QexEngineConfig*);

class EngineTest : public ContextTest {};

std::string Flags() {
    return std::to_string(QexEngine_IsInitialized()) + std::to_string(QexEngine_IsOwnerDrawInitialized());
}

// Shutdown goes backwards and ends the models' shared shaders, however often they were asked for.
TEST_F(EngineTest, FlagsAndLogOfEachWayThroughTheStates) {
    const std::string begun =
        "I/Qex: <QexTexture_CreateDefault> Created.\n"
        "I/Qex: <QexFont_Create> Font initialize ok\n"
        "I/Qex: <QexEngine_InitForOwnerDraw> Owner draw initialized ok\n";
    const std::string ended =
        "I/Qex: <QexFont_Release> Font released!\n"
        "I/Qex: <QexTexture_ReleaseDefault> Released.\n"
        "I/Qex: <QexEngine_ShutdownForOwnerDraw> Shutdown ok.\n";
    const std::string full = "I/Qex: <QexEngine_Init> Engine initialization success.\n";
    const struct {
        Init init;
        uint32_t size;
        const char* flags;
        void (*shutdown)(QexRuntimeContext*);
        std::string log;
    } ways[] = {
        {QexEngine_InitForOwnerDraw, 44, "01", QexEngine_ShutdownForOwnerDraw, begun + ended},
        {QexEngine_Init, sizeof(QexEngineConfig), "11", QexEngine_Shutdown,
         begun + full + ended + "I/Qex: <QexEngine_Shutdown> Engine shutdown.\n"},
        {QexEngine_Init, 44, "11", QexEngine_ShutdownForOwnerDraw, begun + full + ended},
    };
    for (const auto& way : ways) {
        QexRuntimeContext runtime;
        QexEngineConfig config = SurfaceConfig();
        const uint64_t calls = gltapCountAll();
        Capture log(STDERR_FILENO);
        for (const uint32_t size : {0u, 45u, uint32_t{sizeof config + 1}})
            EXPECT_EQ(way.init(&runtime, size, &config), -1) << size;
        EXPECT_EQ(way.init(&runtime, way.size, nullptr), -1);
        EXPECT_EQ(gltapCountAll(), calls);
        EXPECT_EQ(way.init(&runtime, way.size, &config), 0);
        EXPECT_EQ(Flags(), way.flags);
        QexModel_CreateDefaultShader();
        QexModel_CreateDefaultShader();
        way.shutdown(&runtime);
        EXPECT_EQ(Flags(), "00");
        EXPECT_EQ(LiveObjects(), "");
        EXPECT_EQ(log.Text(), way.log);
    }
}

TEST_F(EngineTest, ContextTakesTheConfigurationAndRoundsThePool) {
    alignas(16) static uint8_t memory[4096];
    for (const uint32_t offset : {0u, 1u, 3u}) {
        QexEngineConfig config = {9, 1, 2, 3, 4, kWidth, kHeight, 7, 8, memory + offset, 4000};
        QexRuntimeContext runtime;
        memset(static_cast<void*>(&runtime), 0xFF, sizeof runtime);
        Capture log(STDERR_FILENO);
        ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
        const uint32_t skipped = offset ? 4 - offset : 0;
        EXPECT_EQ(runtime.poolBlock, memory + offset);
        EXPECT_EQ(runtime.poolBase, memory + offset + skipped);
        EXPECT_EQ(runtime.poolSize, 4000 - skipped);
        EXPECT_EQ(runtime.windowWord4 * 10 + runtime.windowWord8, 48u);
        EXPECT_EQ(runtime.stereoMode, 0u);
        const std::string live = LiveObjects();
        EXPECT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
        EXPECT_EQ(LiveObjects(), live) << "made twice";
        QexEngine_Shutdown(&runtime);
        QexEngine_Shutdown(&runtime);
    }
}

TEST(Engine, NeedsAContext) {
    QexRuntimeContext runtime = {};
    QexEngineConfig config = SurfaceConfig();
    Capture log(STDERR_FILENO);
    EXPECT_EQ(QexEngine_Init(&runtime, sizeof config, &config), -1);
    EXPECT_EQ(QexEngine_InitForOwnerDraw(&runtime, sizeof config, &config), -1);
    EXPECT_EQ(log.Text(),
              "E/Qex: <QexEngine_Init> no GL context is current on this thread\n"
              "E/Qex: <QexEngine_InitForOwnerDraw> no GL context is current on this thread\n");
    EXPECT_EQ(Flags(), "00");
}

// A model that outlives the engine takes nothing from the next start, and is not drawn.
TEST_F(EngineTest, ModelsOfAnEarlierStart) {
    QexRuntimeContext runtime = {};
    QexEngineConfig config = SurfaceConfig();
    Capture log(STDERR_FILENO);
    ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
    auto old = std::make_unique<LoadedModel>(SceneOf(pod::BuildMesh(Rectangle(0, 0, 8, 8))));
    QexEngine_Shutdown(&runtime);
    ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
    LoadedModel fresh(SceneOf(pod::BuildMesh(Rectangle(20, 0, 30, 8))));
    const std::string before = LiveObjects();
    Clear();
    old->Draw();
    old->Draw();
    EXPECT_EQ(Read().Pixel(4, kHeight - 4), (Rgba{0, 0, 0, 0}));
    // With modules of the application's own it can be drawn again.
    QexShaderModule* own = QexSimpleShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&old->model, own, own);
    old->Draw();
    EXPECT_EQ(Read().Pixel(4, kHeight - 4), (Rgba{255, 255, 255, 255}));
    old.reset();
    QexSimpleShader_Release(&own);
    fresh.Draw();
    EXPECT_EQ(Read().Pixel(25, kHeight - 4), (Rgba{255, 255, 255, 255}));
    QexModel_Unload(&fresh.model);
    QexEngine_Shutdown(&runtime);
    EXPECT_EQ(LiveObjects(), "");
    const std::string text = log.Text(), line = "a model from before the engine was ended is not drawn";
    EXPECT_NE(text.find(line), std::string::npos);
    EXPECT_EQ(text.find(line), text.rfind(line)) << "once";
}

}  // namespace
