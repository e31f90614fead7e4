#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cstring>
#include <string>

#include "Qex.h"
#include "support/Capture.h"

namespace {

TEST(ResFile, HoldsTheWholeFileAndAClosingZero) {
    const std::string bytes("a\0b\nc", 5);
    for (const std::string& content : {bytes, std::string(), std::string(100000, '\x80')}) {
        const MemoryFile file(std::vector<uint8_t>(content.begin(), content.end()));
        // Longer than the record's copy of it.
        const std::string path = std::string(file.Path()).insert(14, std::string(60, '/'));
        QexResFile record;
        memset(&record, 0xEE, sizeof record);
        ASSERT_EQ(QexResFile_Create(&record, path.c_str()), 0);
        EXPECT_EQ(QexResFile_IsMemoryFile(&record), 0u);
        ASSERT_EQ(QexResFile_GetSize(&record), content.size());
        EXPECT_EQ(memcmp(QexResFile_DataPtr(&record), content.data(), content.size()), 0);
        EXPECT_EQ(QexResFile_StringPtr(&record)[content.size()], 0);
        EXPECT_EQ(QexResFile_GetReadPath(&record), path.substr(0, 63));
        EXPECT_EQ(QexResFile_Exists(path.c_str()), 1);
        QexResFile_Close(&record);
        QexResFile_Close(&record);
        EXPECT_EQ(QexResFile_IsOpen(&record), 0u);
        EXPECT_EQ(QexResFile_DataPtr(&record), nullptr);
    }
    char block[] = "block";
    QexResFile view;
    EXPECT_EQ(QexResFile_CreateFromMemory(&view, block, 5), 0);
    EXPECT_EQ(QexResFile_IsMemoryFile(&view), 1u);
    EXPECT_EQ(QexResFile_StringPtr(&view), block);
    QexResFile_Release(&view);
    EXPECT_STREQ(block, "block");
    EXPECT_EQ(QexResFile_CreateFromMemory(&view, nullptr, 5), 0);
    EXPECT_EQ(QexResFile_IsOpen(&view), 0u);
}

TEST(ResFile, WhatCannotBeReadWholeStaysClosed) {
    int pipeEnds[2];
    ASSERT_EQ(pipe(pipeEnds), 0);
    const std::string pipePath = "/dev/fd/" + std::to_string(pipeEnds[0]);
    const std::string fifo = testing::TempDir() + "resfile_test." + std::to_string(getpid());
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    // To open the FIFO, without a writer, for reading would wait for ever.
    for (const char* path :
         {"/nonexistent", static_cast<const char*>(nullptr), "/", pipePath.c_str(), fifo.c_str()}) {
        const std::string name = path ? path : "",
                          line = "E/Qex: <QexResFile_Create> opening file '" + name + "' failed\n";
        QexResFile record;
        Capture errors(STDERR_FILENO);
        EXPECT_EQ(QexResFile_Create(&record, path), name == "/" ? 0 : -1) << name;
        EXPECT_EQ(errors.Text(), name == "/" ? "" : line);
        EXPECT_EQ(QexResFile_IsOpen(&record), 0u);
        EXPECT_EQ(QexResFile_GetSize(&record), 0u);
        EXPECT_EQ(QexResFile_DataPtr(&record), nullptr);
        QexResFile_Release(&record);
    }
    EXPECT_EQ(QexResFile_Exists("/nonexistent"), 0);
    EXPECT_EQ(QexResFile_Exists(fifo.c_str()), 0);
    remove(fifo.c_str());
    close(pipeEnds[0]);
    close(pipeEnds[1]);
}

}  // namespace
