#include <gtest/gtest.h>

#include <string>

#include "Qex.h"
#include "support/Capture.h"

namespace {

TEST(Diagnostics, PrioritiesAndTagsAreToldApartAndTextsArriveWhole) {
    const std::string text(100000, 'x');
    Capture errors(STDERR_FILENO);
    Capture output(STDOUT_FILENO);
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

}  // namespace
