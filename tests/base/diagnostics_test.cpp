#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <tuple>
#include <vector>

#include "Qex.h"
#include "support/Capture.h"

namespace {

TEST(Diagnostics, PrioritiesAndTagsAreToldApartAndTextsArriveWhole) {
    const std::string text(100000, 'x');
    Capture errors(STDERR_FILENO), output(STDOUT_FILENO);
    EXPECT_GT(QexLog("Qex", "%s %d", "loaded", 7), 0);
    EXPECT_GT(QexError("Emitter", "own newline\n"), 0);
    QexLog(nullptr, "no tag");
    EXPECT_EQ(QexSystem_Printf("%s: %i of %.1f\n", "mesh", 3, 4.5), 1);
    std::string expected = "I/Qex: loaded 7\nE/Emitter: own newline\nI/: no tag\nI/Qex: mesh: 3 of 4.5\n";
    for (const size_t length : {511u, 512u, 513u, 100000u}) {
        QexError("Qex", "%s", text.c_str() + text.size() - length);
        expected += "E/Qex: " + text.substr(0, length) + "\n";
    }
    EXPECT_EQ(output.Text(), "mesh: 3 of 4.5\n");
    EXPECT_EQ(errors.Text(), expected);
}

using Message = std::tuple<int32_t, std::string, std::string>;  // weight, tag, text

void Keep(void* user, int32_t weight, const char* tag, const char* text) {
    static_cast<std::vector<Message>*>(user)->emplace_back(weight, tag, text);
}

// In a process of its own, as a program that has chosen its log keeps it.
TEST(DiagnosticsDeathTest, LevelAndSinkTakeAllThatIsWritten) {
    const auto run = [] {
        const std::string text(2000, 'x');
        std::vector<Message> kept;
        Capture errors(STDERR_FILENO), output(STDOUT_FILENO);
        const auto writeAll = [&] {
            QexLog("Emitter", "one");
            QexError(nullptr, "%s\n", text.c_str());
            QexSystem_Printf("progress %d\n", 7);
            QexSystem_Printf("WARNING:<Load> odd\n");
            QexSystem_Printf("ERROR:<Load> broken\n");
        };
        QexLog_SetSink(Keep, &kept);
        writeAll();
        std::vector<Message> expected = {{QEX_LOG_INFO, "Emitter", "one"},
                                         {QEX_LOG_ERROR, "", text},
                                         {QEX_LOG_INFO, "Qex", "progress 7"},
                                         {QEX_LOG_WARNING, "Qex", "WARNING:<Load> odd"},
                                         {QEX_LOG_ERROR, "Qex", "ERROR:<Load> broken"}};
        bool good = kept == expected;
        for (const int32_t level : {QEX_LOG_WARNING, QEX_LOG_ERROR, QEX_LOG_NONE}) {
            kept.clear();
            QexLog_SetLevel(level);
            writeAll();
            const auto below = [level](const Message& m) { return std::get<0>(m) < level; };
            expected.erase(std::remove_if(expected.begin(), expected.end(), below), expected.end());
            good = good && kept == expected;
        }
        good = good && QexLog_SetLevel(QEX_LOG_WARNING) == QEX_LOG_NONE && QexLog("Qex", "not written") == 0;
        QexLog_SetSink(nullptr, nullptr);
        QexSystem_Printf("WARNING: once\n");
        good = good && output.Text().empty() && errors.Text() == "I/Qex: WARNING: once\n";
        exit(good ? 0 : 1);
    };
    EXPECT_EXIT(run(), testing::ExitedWithCode(0), "");
}

}  // namespace
