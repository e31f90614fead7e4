// The shared library as an application sees it: its symbols, and a run from start-up to shutdown.
#include <dlfcn.h>
#include <gtest/gtest.h>

#include <fstream>
#include <set>

#include "gltap.h"
#include "support/PodScenes.h"

namespace {

std::set<std::string> Exports() {
    std::ifstream file(QEX_EXPORTS);
    std::set<std::string> names;
    for (std::string line; std::getline(file, line);)
        if (!line.empty() && line[0] != '#') names.insert(line);
    return names;
}

TEST(QexApi, EveryExportIsTheLibrarys) {
    const auto names = Exports();
    ASSERT_GT(names.size(), 300u);
    void* library = dlopen(QEX_LIBRARY, RTLD_NOW);
    ASSERT_NE(library, nullptr) << dlerror();
    for (const std::string& name : names) {
        void* symbol = dlsym(library, name.c_str());
        Dl_info info = {};
        ASSERT_TRUE(symbol && dladdr(symbol, &info)) << name;
        EXPECT_NE(std::string(info.dli_fname).find("libqex"), std::string::npos)
            << name << " in " << info.dli_fname;
    }
    // What the library keeps to itself cannot be found by the name that C would give it.
    EXPECT_EQ(dlsym(library, "QexLoadPODModel_Check"), nullptr);
    EXPECT_EQ(dlsym(library, "QexTexture_Target"), nullptr);
    dlclose(library);
}

// Without a driver: the tap answers, and counts what is made and deleted.
class QexRun : public testing::Test {
  protected:
    QexRun() : memory_(1 << 16) {
        gltapReset();
        gltapSetMode(GLTAP_NULL);
        config_.width = 320;
        config_.height = 200;
        config_.memory = memory_.data();
        config_.memorySize = static_cast<uint32_t>(memory_.size());
    }
    std::string LiveObjects() const {
        std::string text(gltapDescribeObjects(nullptr, 0), '\0');
        gltapDescribeObjects(text.data(), text.size() + 1);
        return text;
    }

    std::vector<uint8_t> memory_;
    QexEngineConfig config_ = {};
    QexRuntimeContext context_;
    Capture log_{STDERR_FILENO};
};

TEST_F(QexRun, LeavesNothingBehind) {
    for (int round = 0; round < 2; ++round) {
        ASSERT_EQ(QexEngine_InitForOwnerDraw(&context_, QEX_ENGINE_CONFIG_SIZE, &config_), 0);
        EXPECT_EQ(QexEngine_IsOwnerDrawInitialized(), 1u);
        EXPECT_EQ(context_.width, config_.width);
        EXPECT_NE(Qextexture_GetDefault()->glName, 0u);
        QexEngine_ShutdownForOwnerDraw(&context_);
        EXPECT_EQ(QexEngine_IsOwnerDrawInitialized(), 0u);
        EXPECT_EQ(LiveObjects(), "");
    }
    EXPECT_EQ(QexEngine_InitForOwnerDraw(&context_, 43, &config_), -1);
    EXPECT_EQ(QexEngine_InitForOwnerDraw(nullptr, QEX_ENGINE_CONFIG_SIZE, &config_), -1);
}

}  // namespace
