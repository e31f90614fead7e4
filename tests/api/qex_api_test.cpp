// The shared library as an application sees it: a run from start-up to shutdown.
#include <gtest/gtest.h>

#include "gltap.h"
#include "Qex.h"
#include "support/Capture.h"

namespace {

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
