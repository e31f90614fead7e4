#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <vector>

#include "Qex.h"

namespace {

using Bytes = std::vector<uint8_t>;

struct Conversion {
    uint32_t type;
    int32_t count;
    Bytes bytes;
    float value[4];
};

// One row for each data type: its bytes and what they mean. Read and written at an odd address.
TEST(PodVertex, EveryTypeBothWays) {
    const float n = 1.0f / 255;
    const Conversion rows[] = {
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
        {QEX_POD_SHORT_NORM, 3, {0xFF, 0x7F, 0x01, 0x80, 0, 0}, {1, -1, 0, 1}},
        {QEX_POD_BYTE, 2, {200, 5}, {200, 5, 0, 1}},
        {QEX_POD_BYTE_NORM, 3, {127, 254, 0}, {1, 2, 0, 1}},
        {QEX_POD_UNSIGNED_BYTE_NORM, 2, {255, 51}, {1, 0.2f, 0, 1}},
        {QEX_POD_UNSIGNED_SHORT_NORM, 2, {0xFF, 0xFF, 0x33, 0x33}, {1, 0.2f, 0, 1}},
        {QEX_POD_UNSIGNED_INT, 1, {0, 0, 0, 0x80}, {2147483648.0f, 0, 0, 1}},
    };
    for (const Conversion& row : rows) {
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

// Writing truncates, and still what was read comes back the same for every value of a type.
TEST(PodVertex, WritingUndoesReading) {
    const struct {
        uint32_t type, size, lowest, highest;
    } rows[] = {
        {QEX_POD_BYTE_NORM, 1, 0, 255},     {QEX_POD_UNSIGNED_BYTE_NORM, 1, 0, 255},
        {QEX_POD_SHORT_NORM, 2, 0, 65535},  {QEX_POD_UNSIGNED_SHORT_NORM, 2, 0, 65535},
        {QEX_POD_FIXED16_16, 4, 0, 0xFFFF}, {QEX_POD_RGBA, 4, 0xFF00FF00, 0xFF00FFFF},
        {QEX_POD_ARGB, 4, 0, 0xFFFF},       {QEX_POD_DEC3N, 4, 0x100400, 0x1007FF},
    };
    for (const auto& row : rows) {
        uint32_t wrong = 0;
        for (uint64_t k = row.lowest; k <= row.highest; ++k) {
            const auto word = static_cast<uint32_t>(k);
            uint32_t written = 0;
            float value[4];
            QexPODVertex_ReadVec(value, &word, row.type, 1);
            QexVertexWriteVec(&written, row.type, 1, value);
            wrong += std::memcmp(&word, &written, row.size) != 0;
        }
        EXPECT_EQ(wrong, 0u) << "type " << row.type;
    }
}

TEST(PodVertex, WritingClampsToTheType) {
    const float inf = std::numeric_limits<float>::infinity(), nan = std::nanf("");
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
