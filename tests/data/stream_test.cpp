#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <numeric>

#include "Qex.h"
#include "support/Capture.h"

namespace {

// A stream over a heap block of the exact size that holds 1, 2, 3 and so on.
struct Stream : QexSourceStream {
    explicit Stream(uint32_t size) : block(new uint8_t[size]) {
        std::iota(block.get(), block.get() + size, uint8_t{1});
        EXPECT_EQ(QexSourceStream_CreateFromMemory(this, block.get(), size), 1);
    }
    ~Stream() { QexSourceStream_Release(this); }

    std::unique_ptr<uint8_t[]> block;
};

TEST(SourceStream, WordsAreLittleEndianAndBounded) {
    Stream stream(7);
    uint16_t word16 = 0;
    uint32_t word32 = 0;
    uint8_t byte = 0;
    EXPECT_EQ(QexSourceStream_Read16(&stream, &word16), 1);
    EXPECT_EQ(QexSourceStream_Read32(&stream, &word32), 1);
    EXPECT_EQ(word16 + (uint64_t{word32} << 16), 0x060504030201u);
    Capture errors(STDERR_FILENO);
    EXPECT_EQ(QexSourceStream_Read16(&stream, &word16), 0);
    EXPECT_EQ(QexSourceStream_Read32(&stream, &word32), 0);
    EXPECT_EQ(QexSourceStream_Read(&stream, &byte, UINT32_MAX), 0) << "the sum wraps around";
    EXPECT_EQ(stream.position, 6u);
    EXPECT_EQ(QexSourceStream_Read(&stream, &byte, 1), 1);
    EXPECT_EQ(byte, 7);
    EXPECT_EQ(QexSourceStream_Read(&stream, &byte, 1), 0);
    EXPECT_EQ(QexSourceStream_Read(&stream, nullptr, 0), 1);
    EXPECT_EQ(errors.Text(), "E/Qex: <QexSourceStream_ReadMarker> read WORD fail\n");
}

TEST(SourceStream, ArraysAreReadAsFarAsTheyGo) {
    for (const uint32_t count : {0u, 1u, 2u, 3u, 0x40000001u, UINT32_MAX}) {
        Stream words(10), halves(5);
        uint32_t array32[3] = {0, 0, 0};
        uint16_t array16[3] = {0, 0, 0};
        Capture errors(STDERR_FILENO);
        // Room for three: a longer array fails at its third element and is not written from there on.
        EXPECT_EQ(QexSourceStream_ReadArray32(&words, array32, count), count <= 2);
        EXPECT_EQ(errors.Text(), count <= 2 ? "" : "E/Qex: <QexSourceStream_Read> read array fail\n");
        EXPECT_EQ(array32[0], count >= 1 ? 0x04030201u : 0);
        EXPECT_EQ(array32[1], count >= 2 ? 0x08070605u : 0);
        EXPECT_EQ(array32[2], 0u);
        EXPECT_EQ(words.position, 4 * std::min(count, 2u));

        Capture errors16(STDERR_FILENO);
        EXPECT_EQ(QexSourceStream_ReadArray16(&halves, array16, count), count <= 2);
        const std::string text = errors16.Text();
        EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), count <= 2 ? 0 : std::min(count - 2, 32u))
            << "one for each missing element";
        EXPECT_EQ(array16[1], count >= 2 ? 0x0403 : 0);
        EXPECT_EQ(array16[2], 0);
    }
}

TEST(SourceStream, MarkersAndSkips) {
    Stream stream(12);
    uint32_t identifier = 0, length = 0;
    EXPECT_EQ(QexSourceStream_ReadMarker(&stream, &identifier, &length), 1);
    EXPECT_EQ(identifier, 0x04030201u);
    EXPECT_EQ(length, 0x08070605u);
    Capture errors(STDERR_FILENO);
    EXPECT_EQ(QexSourceStream_Skip(&stream, 5), 0);
    EXPECT_EQ(QexSourceStream_Skip(&stream, UINT32_MAX), 0);
    EXPECT_EQ(stream.position, 8u);
    EXPECT_EQ(QexSourceStream_ReadMarker(&stream, &identifier, &length), 0) << "cut after its identifier";
    EXPECT_EQ(QexSourceStream_Skip(&stream, 0), 1);
    EXPECT_EQ(QexSourceStream_ReadMarker(&stream, &identifier, &length), 0) << "at the end, silently";
    Stream whole(3);
    EXPECT_EQ(QexSourceStream_Skip(&whole, 3), 1);
    EXPECT_EQ(whole.position, 3u);
    EXPECT_EQ(errors.Text(),
              "I/Qex: <QexSourceStream_Skip> pass beyond end of stream\n"
              "I/Qex: <QexSourceStream_Skip> pass beyond end of stream\n"
              "E/Qex: <QexSourceStream_ReadMarker> read marker fail\n");
}

}  // namespace
