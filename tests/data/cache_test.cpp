#include <gtest/gtest.h>

#include <string>

#include "Qex.h"

namespace {

TEST(DataCache, GrowsByDoublingThenByAFifth) {
    struct Element {
        uint32_t words[4];
    };
    QexDataCache cache;
    ASSERT_EQ(QexDataCache_Create(&cache, 2, sizeof(Element)), 0);
    const uint32_t capacities[] = {2, 4, 8, 16, 32, 64, 128, 153, 183};
    size_t step = 0;
    for (uint32_t i = 0; i < 180; ++i) {
        const Element element = {{i, i + 1, i + 2, i + 3}};
        ASSERT_EQ(QexDataCache_Add(&cache, &element), 0);
        step += cache.capacity != capacities[step];
        ASSERT_EQ(cache.capacity, capacities[step]) << "at " << i;
    }
    EXPECT_EQ(step, 8u);
    for (uint32_t i = 0; i < 180; ++i)
        EXPECT_EQ(static_cast<Element*>(QexDataCache_Get(&cache, i))->words[3], i + 3);
    EXPECT_EQ(QexDataCache_Get(&cache, 183), nullptr);
    QexDataCache_Release(&cache);
    EXPECT_EQ(QexDataCache_Create(&cache, 0x10000, 0x10001), QEX_CACHE_NO_MEMORY);
}

TEST(DataCache, CopiesItsOwnElementsAndRemovesInOrder) {
    QexDataCache cache;
    ASSERT_EQ(QexDataCache_Create(&cache, 3, 2000), 0);
    for (const char letter : {'a', 'b', 'c'})
        EXPECT_EQ(QexDataCache_Add(&cache, std::string(2000, letter).data()), 0);
    ASSERT_EQ(cache.count, cache.capacity);
    // The block is full and moves while one of its own elements is copied.
    ASSERT_EQ(QexDataCache_Add(&cache, QexDataCache_Get(&cache, 0)), 0);
    QexDataCache_Remove(&cache, 1);
    QexDataCache_Remove(&cache, 4);  // is not there
    ASSERT_EQ(QexDataCache_GetSize(&cache), 3u);
    for (uint32_t i = 0; i < 3; ++i)
        EXPECT_EQ(std::string(static_cast<char*>(QexDataCache_Get(&cache, i)), 2000),
                  std::string(2000, "aca"[i]));
    QexDataCache_Release(&cache);
}

TEST(NameCache, FindsAndRemovesByName) {
    QexNameCache cache;
    ASSERT_EQ(QexNameCache_Create(&cache, 1, sizeof(int)), 0);
    const std::string base(32, 'n');  // names count up to 32 bytes
    const std::string names[] = {"stone", "wood", "stone_a", base + "first"};
    for (int i = 0; i < 4; ++i) EXPECT_EQ(QexNameCache_Add(&cache, names[i].c_str(), &i), 0);
    const int other = 9;
    for (const std::string& name : {names[1], base + "second"})
        EXPECT_EQ(QexNameCache_Add(&cache, name.c_str(), &other), QEX_CACHE_PRESENT);
    ASSERT_EQ(QexNameCache_GetSize(&cache), 4u);
    void* element = nullptr;
    EXPECT_EQ(QexNameCache_Find(&cache, "stone_a", &element), 2);
    EXPECT_EQ(*static_cast<int*>(element), 2);
    EXPECT_EQ(QexNameCache_Find(&cache, base.c_str(), nullptr), 3);
    EXPECT_EQ(QexNameCache_Find(&cache, base.substr(1).c_str(), nullptr), -1);
    EXPECT_EQ(QexNameCache_Find(&cache, "woo", &element), -1);
    EXPECT_EQ(element, nullptr);

    QexNameCache_RemoveByName(&cache, "iron");
    QexNameCache_RemoveByName(&cache, "stone");
    EXPECT_EQ(QexNameCache_Find(&cache, "stone_a", nullptr), 1);
    EXPECT_EQ(*static_cast<int*>(QexNameCache_GetDataByName(&cache, "wood")), 1);
    char name[33] = "untouched";
    EXPECT_EQ(QexNameCache_GetName(&cache, 3, name), QEX_CACHE_NO_ENTRY);
    EXPECT_STREQ(name, "untouched");
    EXPECT_EQ(QexNameCache_GetName(&cache, 2, name), 0);
    EXPECT_EQ(name, base);
    QexNameCache_Release(&cache);
}

}  // namespace
