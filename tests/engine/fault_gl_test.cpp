// GL errors and memory that runs out, at every place where they can be met, with and without a handler.
#include <GLES2/gl2.h>
#include <sys/wait.h>
#include <unistd.h>

#include <map>

#include "support/Capture.h"
#include "support/Everything.h"

namespace {

// Calls that are left out of long rows of the same.
constexpr uint32_t kStep = QEX_SANITIZED ? 29 : 7;

struct Reports {
    Reports() { QexEngine_SetErrorHandler(Take, this); }
    ~Reports() { QexEngine_SetErrorHandler(nullptr, nullptr); }
    static void Take(void* user, uint32_t code, const char* module, const char* file, int32_t line,
                     const char* message) {
        auto* self = static_cast<Reports*>(user);
        EXPECT_TRUE(module && strchr(file, '/') && line > 0 && message && *message) << module << file << line;
        self->codes[self->count++ % 8] = code;
        snprintf(self->place, sizeof self->place, "%s:%d", file, line);
        snprintf(self->message, sizeof self->message, "%s", message);
    }
    // Nothing here allocates.
    uint32_t count = 0, codes[8] = {};
    char place[80] = "", message[160] = "";
};

class FaultTest : public ContextTest {
  protected:
    FaultTest() : ContextTest(GLTAP_NULL), all_(OutputPath("")) {}
    void Run() {
        all_.Load();
        all_.Draw();
        QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
        all_.Draw();
        QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
        all_.Release();
    }
    // The balance of allocations of a run whose output is thrown away.
    long RunQuietly() {
        Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
        return CountAllocations([&] { Run(); }).balance;
    }
    // How often each function is called in a run.
    std::map<std::string, uint32_t> Counts() {
        std::map<std::string, uint32_t> counts;
        gltapResetCounts();
        RunQuietly();
        for (int f = 0; f < gltapFunctionCount(); ++f)
            counts[gltapFunctionName(f)] = static_cast<uint32_t>(gltapCount(gltapFunctionName(f)));
        counts.erase("glGetError");
        return counts;
    }
    Everything all_;
};

// Out of memory at every call in turn: reported, nothing left behind, and the next run is whole.
TEST_F(FaultTest, EveryCallMayFailWithAHandler) {
    uint32_t runs = 0, reported = 0;
    std::string faults;
    const auto counts = Counts();
    EXPECT_EQ(RunQuietly(), 0);
    for (const auto& [function, count] : counts) {
        const bool deletes = function.rfind("glDelete", 0) == 0;  // what is not deleted stays
        for (uint32_t nth = 1; nth <= count; nth += nth < 12 ? 1 : kStep) {
            Reports reports;
            gltapInjectError(function.c_str(), nth, GL_OUT_OF_MEMORY);
            const long balance = RunQuietly();
            // The tap, begun anew, keeps something of its own.
            if (!deletes && (balance > 1 || LiveObjects() != ""))
                faults += function + " " + std::to_string(nth) + " " + reports.place + ": " +
                          std::to_string(reports.count) + " reports, " + std::to_string(balance) + " " +
                          LiveObjects() + "\n";
            ++runs;
            reported += reports.count > 0;
            gltapReset();
        }
    }
    EXPECT_EQ(faults, "");
    Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
    Reports none;
    const bool whole = all_.Load();
    all_.Release();
    printf("%u runs, %u reported\n", runs, reported);
    EXPECT_GT(reported, runs / 2);
    EXPECT_TRUE(whole) << none.place << none.message;
}

// A handler releases what is not being drawn, asks, and meets an error of its own, which it is not called
// for.
TEST_F(FaultTest, AHandlerMayReleaseAndAsk) {
    struct Owner {
        QexModel spare, drawn;
        QexTexture texture;
        uint32_t calls;
    } owner = {};
    QexRuntimeContext runtime;
    QexEngineConfig config = SurfaceConfig();
    const QexCamera camera = {};
    Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
    ASSERT_EQ(QexEngine_Init(&runtime, sizeof config, &config), 0);
    for (QexModel* model : {&owner.spare, &owner.drawn}) {
        QexModel_Create(model);
        ASSERT_EQ(QexModel_LoadContent(model, OutputPath("").c_str(), "worm.pod"), 0);
    }
    owner.texture = SolidTexture({1, 2, 3, 255});
    QexEngine_SetErrorHandler(
        [](void* user, uint32_t, const char*, const char*, int32_t, const char*) {
            auto* self = static_cast<Owner*>(user);
            ++self->calls;
            gltapInjectError("glDeleteBuffers", 1, GL_INVALID_OPERATION);
            QexModel_Unload(&self->spare);
            QexTexture_Release(&self->texture);
            EXPECT_EQ(QexEngine_IsContextLost(), 0u);
        },
        &owner);
    const auto draws = [&] {
        gltapResetCounts();
        QexModel_RenderWithCamera(&owner.drawn, nullptr, &camera, nullptr, 0);
        return gltapCount("glDrawElements");
    };
    const uint64_t all = draws();
    gltapInjectError("glDrawElements", 1, GL_OUT_OF_MEMORY);
    draws();
    EXPECT_EQ(owner.calls, 1u);
    EXPECT_EQ(owner.spare.vertexBuffers, nullptr);
    EXPECT_EQ(owner.texture.glName, 0u);
    EXPECT_EQ(draws(), all);
    QexEngine_SetErrorHandler(nullptr, nullptr);
    QexModel_Unload(&owner.drawn);
    QexEngine_Shutdown(&runtime);
    EXPECT_EQ(gltapLiveObjects(GLTAP_BUFFER, nullptr, 0), 1u);  // whose deletion failed
    gltapReset();
}

// Without a handler each ends the process.
TEST_F(FaultTest, WithoutAHandlerEachErrorEndsTheProcess) {
    for (const auto& [function, count] : Counts()) {
        if (!count) continue;
        const pid_t child = fork();
        if (child == 0) {
            gltapInjectError(function.c_str(), (count + 1) / 2, GL_OUT_OF_MEMORY);
            RunQuietly();
            gltapResetCounts();
            _exit(0);
        }
        int status = 0;
        ASSERT_EQ(waitpid(child, &status, 0), child);
        // Some are not followed by a check before the end.
        EXPECT_TRUE(WIFEXITED(status) && (WEXITSTATUS(status) == 255 || WEXITSTATUS(status) == 0))
            << function;
        if (function == "glTexImage2D" || function == "glBufferData" || function == "glDrawElements") {
            EXPECT_EQ(WEXITSTATUS(status), 255) << function;
        }
    }
}

// Each allocation of the engine's fails in turn, alone or with all that follow.
TEST_F(FaultTest, EveryAllocationMayFail) {
    if (!kAllocationsAreCounted) GTEST_SKIP() << "the sanitizer's allocator";
    RunQuietly();
    const long count = EngineAllocations([&] { RunQuietly(); }, 0, false);
    EXPECT_GT(count, 100);
    EngineAllocations([&] { RunQuietly(); }, 1, false);  // the tap has met what a failed start calls
    std::string faults;
    for (const bool handled : {true, false})
        for (const bool following : {false, true})
            for (long nth = 1; nth <= count; nth += handled && !following ? 1 : 5) {
                Reports reports;
                if (!handled) QexEngine_SetErrorHandler(nullptr, nullptr);
                long balance = 0;
                EngineAllocations([&] { balance = RunQuietly(); }, nth, following);
                if (balance != 0 || LiveObjects() != "" || (handled && !reports.count))
                    faults += std::to_string(nth) + (following ? " and more " : " ") + reports.place + ": " +
                              std::to_string(reports.count) + " reports, " + std::to_string(balance) + " " +
                              LiveObjects() + "\n";
            }
    EXPECT_EQ(faults, "");
}

class FaultPicture : public ContextTest {
  protected:
    FaultPicture() : all_(OutputPath("")) {}
    // The frame after `code`, whose lines are thrown away.
    Picture After(const std::function<void()>& code) {
        Capture quiet(STDERR_FILENO), silent(STDOUT_FILENO);
        code();
        all_.Draw();
        return Read();
    }
    Everything all_;
};

// An error in a frame spoils that one alone; an error in loading leaves what is loaded next whole.
TEST_F(FaultPicture, TheNextFrameIsRight) {
    bool loaded = false;
    const Picture expected = After([&] { loaded = all_.Load(); });
    EXPECT_TRUE(loaded);
    Reports reports;
    uint32_t met = 0;
    for (const char* function : {"glDrawElements", "glUniformMatrix4fv", "glBindTexture", "glUseProgram",
                                 "glVertexAttribPointer", "glBindFramebuffer", "glClear", "glDrawArrays"})
        for (const uint32_t nth : {1u, 3u, 6u}) {
            gltapInjectError(function, nth, GL_OUT_OF_MEMORY);
            const Picture picture = After([&] { all_.Draw(); });
            EXPECT_TRUE(SamePicture(picture, expected)) << function << nth;
            met += gltapPendingInjections() == 0;
        }
    EXPECT_GT(met, 16u);
    EXPECT_GE(reports.count, met);
    After([&] { all_.Release(); });
    for (const char* function : {"glTexImage2D", "glBufferData", "glLinkProgram", "glRenderbufferStorage"}) {
        const uint32_t before = reports.count;
        gltapInjectError(function, 3, GL_OUT_OF_MEMORY);
        After([&] { loaded = all_.Load(); });
        EXPECT_FALSE(loaded) << function;
        EXPECT_GT(reports.count, before);
        EXPECT_EQ(reports.codes[before % 8], uint32_t{GL_OUT_OF_MEMORY});
        After([&] { all_.Release(); });
        EXPECT_EQ(LiveObjects(), "");
    }
    EXPECT_TRUE(SamePicture(After([&] { all_.Load(); }), expected));
    After([&] { all_.Release(); });
}

}  // namespace
