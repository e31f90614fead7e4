// Growable caches: entries of one size by index, and the same with names.
#include <cstring>

#include "Qex/base.h"
#include "Qex/resources.h"

namespace {

constexpr uint32_t kDoublingLimit = 1024;  // bytes up to which a block doubles

char* Slot(const QexDataCache* cache, uint32_t index) {
    return static_cast<char*>(cache->data) + size_t{index} * cache->elementSize;
}

// Allocates or resizes the block. False leaves the cache as it was.
bool Reserve(QexDataCache* cache, uint64_t capacity) {
    const uint64_t bytes = capacity * cache->elementSize;
    if (capacity > UINT32_MAX || bytes > UINT32_MAX) return false;
    const uint32_t size = static_cast<uint32_t>(bytes);
    void* block = cache->capacity ? QexMemory_ReAlloc(cache->data, size) : QexMemory_Alloc(size);
    if (!block) return false;
    cache->data = block;
    cache->capacity = static_cast<uint32_t>(capacity);
    return true;
}

uint64_t GrownCapacity(const QexDataCache* cache) {
    const uint64_t capacity = cache->capacity;
    if (capacity == 0) return 1;
    if (capacity * cache->elementSize <= kDoublingLimit) return capacity * 2;
    // A fifth of fewer than five elements is none.
    return capacity + (capacity < 5 ? 1 : capacity / 5);
}

struct Name {
    char text[QEX_CACHE_NAME_SIZE];
};

Name MakeName(const char* text) {
    Name name = {};
    if (text) memcpy(name.text, text, strnlen(text, sizeof name.text));
    return name;
}

}  // namespace

int32_t QexDataCache_Create(QexDataCache* cache, uint32_t capacity, uint32_t elementSize) {
    *cache = {nullptr, elementSize, 0, 0};
    return capacity == 0 || Reserve(cache, capacity) ? 0 : QEX_CACHE_NO_MEMORY;
}

int32_t QexDataCache_Add(QexDataCache* cache, const void* element) {
    if (!cache) return QEX_CACHE_NO_MEMORY;
    // An element of this very cache moves with the block.
    const uintptr_t offset = reinterpret_cast<uintptr_t>(element) - reinterpret_cast<uintptr_t>(cache->data);
    const bool own = cache->data && offset < uint64_t{cache->capacity} * cache->elementSize;
    if (cache->count >= cache->capacity && !Reserve(cache, GrownCapacity(cache))) return QEX_CACHE_NO_MEMORY;

    const void* source = own ? static_cast<char*>(cache->data) + offset : element;
    memmove(Slot(cache, cache->count), source, cache->elementSize);
    ++cache->count;
    return 0;
}

void* QexDataCache_Get(const QexDataCache* cache, uint32_t index) {
    return index < cache->capacity ? Slot(cache, index) : nullptr;
}

uint32_t QexDataCache_GetSize(const QexDataCache* cache) {
    return cache->count;
}

void QexDataCache_Remove(QexDataCache* cache, uint32_t index) {
    if (index >= cache->count) return;
    const uint32_t following = cache->count - 1 - index;
    if (following) {
        const size_t bytes = size_t{following} * cache->elementSize;
        memmove(Slot(cache, index), Slot(cache, index + 1), bytes);
    }
    --cache->count;
}

void QexDataCache_Clear(QexDataCache* cache) {
    cache->count = 0;
}

void QexDataCache_Release(QexDataCache* cache) {
    if (cache->capacity) QexMemory_Free(cache->data);
    *cache = {nullptr, cache->elementSize, 0, 0};
}

int32_t QexNameCache_Create(QexNameCache* cache, uint32_t capacity, uint32_t elementSize) {
    const int32_t names = QexDataCache_Create(&cache->names, capacity, QEX_CACHE_NAME_SIZE);
    const int32_t elements = QexDataCache_Create(&cache->elements, capacity, elementSize);
    if (names == 0 && elements == 0) return 0;
    QexNameCache_Release(cache);
    return names ? names : elements;
}

int32_t QexNameCache_Add(QexNameCache* cache, const char* name, const void* element) {
    if (!cache) return QEX_CACHE_NO_MEMORY;
    const Name slot = MakeName(name);
    if (QexNameCache_Find(cache, name, nullptr) >= 0) return QEX_CACHE_PRESENT;
    if (QexDataCache_Add(&cache->names, &slot) != 0) return QEX_CACHE_NO_MEMORY;
    if (QexDataCache_Add(&cache->elements, element) == 0) return 0;
    QexDataCache_Remove(&cache->names, cache->names.count - 1);
    return QEX_CACHE_NO_MEMORY;
}

int32_t QexNameCache_Find(const QexNameCache* cache, const char* name, void** element) {
    const Name wanted = MakeName(name);
    for (uint32_t i = 0; i < cache->names.count; ++i) {
        if (memcmp(Slot(&cache->names, i), wanted.text, sizeof wanted.text) != 0) continue;
        if (element) *element = QexDataCache_Get(&cache->elements, i);
        return static_cast<int32_t>(i);
    }
    if (element) *element = nullptr;
    return -1;
}

void* QexNameCache_GetDataByName(const QexNameCache* cache, const char* name) {
    void* element = nullptr;
    QexNameCache_Find(cache, name, &element);
    return element;
}

void* QexNameCache_GetData(const QexNameCache* cache, uint32_t index) {
    return QexDataCache_Get(&cache->elements, index);
}

int32_t QexNameCache_GetName(const QexNameCache* cache, uint32_t index, char* destination) {
    if (index >= cache->names.count) return QEX_CACHE_NO_ENTRY;
    const char* name = Slot(&cache->names, index);
    const size_t length = strnlen(name, QEX_CACHE_NAME_SIZE);
    memcpy(destination, name, length);
    destination[length] = 0;
    return 0;
}

uint32_t QexNameCache_GetSize(const QexNameCache* cache) {
    return cache->names.count;
}

void QexNameCache_Remove(QexNameCache* cache, uint32_t index) {
    QexDataCache_Remove(&cache->names, index);
    QexDataCache_Remove(&cache->elements, index);
}

void QexNameCache_RemoveByName(QexNameCache* cache, const char* name) {
    const int32_t index = QexNameCache_Find(cache, name, nullptr);
    if (index >= 0) QexNameCache_Remove(cache, static_cast<uint32_t>(index));
}

void QexNameCache_Clear(QexNameCache* cache) {
    QexDataCache_Clear(&cache->names);
    QexDataCache_Clear(&cache->elements);
}

void QexNameCache_Release(QexNameCache* cache) {
    QexDataCache_Release(&cache->names);
    QexDataCache_Release(&cache->elements);
}
