#include <gtest/gtest.h>

#include <cmath>
#include <cstring>

#include "Qex.h"

namespace {

using Bytes = std::vector<uint8_t>;

// One row for each data type: its bytes and what they mean. Read and written at an odd address.
TEST(PodVertex, EveryTypeBothWays) {
    const float n = 1.0f / 255;
    const struct {
        uint32_t type;
        int32_t count;
        Bytes bytes;
        float value[4];
    } rows[] = {
        {QEX_POD_FLOAT, 3, {0, 0, 0x80, 0x3F, 0, 0, 0, 0xC0, 0, 0, 0, 0x3F}, {1, -2, 0.5f, 1}},
        {QEX_POD_INT, 2, {0xFE, 0xFF, 0xFF, 0xFF, 0, 0, 1, 0}, {-2, 65536, 0, 1}},
        {QEX_POD_UNSIGNED_SHORT, 2, {0xFF, 0xFF, 2, 1}, {65535, 258, 0, 1}},
        {QEX_POD_RGBA, 4, {0x44, 0x33, 0x22, 0x11}, {0x11 * n, 0x22 * n, 0x33 * n, 0x44 * n}},
        {QEX_POD_ARGB, 4, {0x44, 0x33, 0x22, 0x11}, {0x22 * n, 0x33 * n, 0x44 * n, 0x11 * n}},
        {QEX_POD_D3DCOLOR, 1, {0, 0, 0xFF, 0x80}, {1, 0, 0, 0x80 * n}},
        {QEX_POD_UBYTE4, 1, {1, 200, 3, 255}, {1, 200, 3, 255}},
        {QEX_POD_DEC3N, 3, {0xFF, 0xFD, 0xF7, 0x1F}, {1, 1, 1, 1}},
        {QEX_POD_DEC3N, 1, {0x01, 0x06, 0xF8, 0x3F}, {-511 / 511.0f, -511 / 511.0f, -1 / 511.0f, 1}},
        {QEX_POD_FIXED16_16, 2, {0, 0x80, 0xFF, 0xFF, 0, 0, 3, 0}, {-0.5f, 3, 0, 1}},
        {QEX_POD_UNSIGNED_BYTE, 4, {0, 1, 200, 255}, {0, 1, 200, 255}},
        {QEX_POD_SHORT, 2, {0xFF, 0xFF, 0, 0x80}, {-1, -32768, 0, 1}},
        {QEX_POD_SHORT_NORM, 3, {0xFF, 0x7F, 0x01, 0x80, 1, 0}, {1, -1, 1 / 32767.0f, 1}},
        {QEX_POD_BYTE, 2, {200, 5}, {200, 5, 0, 1}},
        {QEX_POD_BYTE_NORM, 3, {127, 254, 0}, {1, 2, 0, 1}},
        {QEX_POD_UNSIGNED_BYTE_NORM, 2, {255, 51}, {1, 0.2f, 0, 1}},
        {QEX_POD_UNSIGNED_SHORT_NORM, 2, {0xFF, 0xFF, 0x33, 0x33}, {1, 0.2f, 0, 1}},
        {QEX_POD_UNSIGNED_INT, 1, {0, 0, 0, 0x80}, {2147483648.0f, 0, 0, 1}},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE("type " + std::to_string(row.type));
        // The element alone behind an odd address: a sanitizer sees what is touched beyond it.
        Bytes memory(1 + row.bytes.size());
        memory.shrink_to_fit();
        std::memcpy(memory.data() + 1, row.bytes.data(), row.bytes.size());
        float read[4] = {9, 9, 9, 9};
        QexPODVertex_ReadVec(read, memory.data() + 1, row.type, row.count);
        for (int i = 0; i < 4; ++i) EXPECT_FLOAT_EQ(read[i], row.value[i]) << i;

        std::fill(memory.begin(), memory.end(), uint8_t{0xEE});
        QexVertexWriteVec(memory.data() + 1, row.type, row.count, read);
        EXPECT_EQ(Bytes(memory.begin() + 1, memory.end()), row.bytes);
        EXPECT_EQ(memory[0], 0xEE);
    }
}

TEST(PodVertex, UnknownTypesAreLeftAlone) {
    const float ones[4] = {1, 1, 1, 1};
    for (const uint32_t type : {0u, 18u, UINT32_MAX}) {
        uint32_t word = 77, index = 78;
        float value[4];
        QexPODVertex_ReadVec(value, &word, type, 4);
        EXPECT_EQ(std::vector<float>(value, value + 4), (std::vector<float>{0, 0, 0, 1}));
        QexVertexWriteVec(&word, type, 4, ones);
        QexPODVertex_ReadInt(&index, &word, type);
        EXPECT_EQ(word + index, 77u + 78u);
    }
    const uint8_t bytes[5] = {0xAA, 4, 3, 2, 0x81};
    uint32_t index16 = 0, index32 = 0;
    QexPODVertex_ReadInt(&index16, bytes + 1, QEX_POD_UNSIGNED_SHORT);
    QexPODVertex_ReadInt(&index32, bytes + 1, QEX_POD_UNSIGNED_INT);
    EXPECT_EQ(index16, 0x0304u);
    EXPECT_EQ(index32, 0x81020304u);
}

TEST(PodVertex, WritingClampsToTheType) {
    const float inf = INFINITY, nan = NAN;
    const struct {
        uint32_t type;
        float value[4];
        Bytes bytes;
    } rows[] = {
        {QEX_POD_UNSIGNED_BYTE, {-1, 256, 1.99f, nan}, {0, 255, 1, 0}},
        {QEX_POD_SHORT, {-1e9f, inf, -1.99f, 0}, {0, 0x80, 0xFF, 0x7F, 0xFF, 0xFF, 0, 0}},
        {QEX_POD_UNSIGNED_SHORT_NORM, {-0.1f, 1.5f, 0.5f, 1}, {0, 0, 0xFF, 0xFF, 0xFF, 0x7F, 0xFF, 0xFF}},
        {QEX_POD_INT, {inf, -inf, 0, 0}, {0xFF, 0xFF, 0xFF, 0x7F, 0, 0, 0, 0x80, 0, 0, 0, 0, 0, 0, 0, 0}},
        {QEX_POD_RGBA, {-1, 2, nan, 0.5f}, {127, 0, 255, 0}},
        {QEX_POD_ARGB, {1, -2, inf, 2}, {255, 0, 255, 255}},
        {QEX_POD_DEC3N, {-9, 9, 0, 0}, {0x00, 0xFE, 0x07, 0}},
    };
    for (const auto& row : rows) {
        Bytes written(row.bytes.size(), 0xEE);
        QexVertexWriteVec(written.data(), row.type, 4, row.value);
        EXPECT_EQ(written, row.bytes) << "type " << row.type;
    }
}

TEST(PodVertex, BoxesOfInterleavedPositions) {
    // Stride 20, position at 8.
    std::vector<float> block(15, 100);
    const float positions[3][3] = {{1, -2, 3}, {-4, 5, 0.5f}, {0, 0, 7}};
    for (size_t v = 0; v < 3; ++v) std::memcpy(&block[5 * v + 2], positions[v], 12);
    QexBoundingBox box;
    QexBoundingBox_ComputeInterleaved(&box, block.data(), 3, 8, 20);
    for (uint32_t i = 0; i < 8; ++i) {
        const QexVec3 corner = {i & 4 ? 1.0f : -4, i & 2 ? 5.0f : -2, i & 1 ? 7 : 0.5f};
        EXPECT_EQ(std::memcmp(&box.corners[i], &corner, sizeof corner), 0) << i;
    }
    const float centreAndHalf[6] = {-1.5f, 1.5f, 3.75f, 2.5f, 3.5f, 3.25f};
    EXPECT_EQ(std::memcmp(&box.centre, centreAndHalf, sizeof centreAndHalf), 0);
}

}  // namespace
