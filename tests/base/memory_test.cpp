#include <gtest/gtest.h>

#include <cstring>
#include <memory>

#include "Qex.h"

namespace {

uint32_t Word(const void* pool, uint32_t offset) {
    uint32_t word;
    memcpy(&word, static_cast<const char*>(pool) + offset, sizeof word);
    return word;
}

// A heap block of the exact size, so that a sanitizer sees every byte too many.
std::unique_ptr<char[]> Block(uint32_t size) {
    auto block = std::make_unique<char[]>(size);
    memset(block.get(), 0x5A, size);
    return block;
}

TEST(MemoryPool, RefusesUnusableBlocksAndLeavesThemAlone) {
    auto block = Block(4096);
    char* p = block.get();
    for (const auto& [start, size] :
         {std::pair<char*, uint32_t>{nullptr, 4096}, {p, 0}, {p, 3251}, {p + 1, 4000}, {p + 2, 4000}}) {
        EXPECT_EQ(QexMemory_Init(start, size), 0);
        EXPECT_EQ(QexMemory_GetIsInitialized(), 0u);
    }
    for (int i = 0; i < 4096; ++i) ASSERT_EQ(block[i], 0x5A);
}

TEST(MemoryPool, LaysOutTheControlStructureAndOneFreeBlock) {
    constexpr uint32_t kSize = 1048576;
    auto block = Block(kSize);
    char* pool = block.get();
    QexMemory_Init(pool, kSize);
    ASSERT_EQ(QexMemory_GetIsInitialized(), 1u);
    EXPECT_EQ(QexMemory_GetUsed(pool), 3224u);
    EXPECT_EQ(QexMemory_GetMaxSize(pool), 3224u);

    const uint32_t base = sizeof(void*) == 4 ? static_cast<uint32_t>(reinterpret_cast<uintptr_t>(pool)) : 0;
    constexpr uint32_t kFree = 1045352;
    // 2^19 <= kFree < 2^20: first-level class 13; second-level class floor(kFree / 2^14) - 32 = 31.
    const uint32_t words[][2] = {{0, 0x2A59FA59},
                                 {12, base + 3200},
                                 {16, 1u << 13},
                                 {20 + 4 * 13, 1u << 31},
                                 {116 + 4 * (13 * 32 + 31), base + 3208},
                                 {3196, 8},
                                 {3200, base + 3216 + kFree},
                                 {3204, 0},
                                 {3208, 0},
                                 {3212, kFree | 1},
                                 {3216 + kFree, base + 3208},
                                 {3220 + kFree, 2}};
    for (const auto& [offset, value] : words) EXPECT_EQ(Word(pool, offset), value) << "offset " << offset;
    QexMemory_Shutdown(pool);
    EXPECT_EQ(QexMemory_GetIsInitialized(), 0u);
    EXPECT_EQ(Word(pool, 0), 0u);
    // Smallest pools, of every remainder.
    for (uint32_t size = 3252; size < 3252 + 17; ++size) {
        block = Block(size);
        QexMemory_Init(block.get(), size);
        EXPECT_EQ(QexMemory_GetUsed(block.get()), size - ((size - 3188) / 8 * 8 - 32));
        QexMemory_Shutdown(block.get());
    }
}

TEST(Memory, AbsurdSizesAreRefusedAndLeaveTheOldBlock) {
    char* block = static_cast<char*>(QexMemory_Alloc(4));
    memcpy(block, "Qex", 4);
    block = static_cast<char*>(QexMemory_ReAlloc(block, 100000));
    EXPECT_EQ(QexMemory_ReAlloc(block, UINT32_MAX), nullptr);
    EXPECT_STREQ(block, "Qex");
    block = static_cast<char*>(QexMemory_ReAlloc(block, 0));
    EXPECT_NE(block, nullptr);
    QexMemory_Free(block);
    EXPECT_EQ(QexMemory_Alloc(0x80000000u), nullptr);
    EXPECT_EQ(QexMemory_ReAlloc(nullptr, 16), nullptr);
}

}  // namespace
