// The process heap, and the pool whose statistics alone are kept.
#include "base/Memory.h"

#include "base/Diagnostics.h"
#include "Qex/base.h"

#include <cstdlib>
#include <cstring>

#define QEX_MODULE "src/QexMemory"

namespace {

// One limit for every host: what a 32-bit heap could give at most. A size that wrapped below 0 is above it.
constexpr uint32_t kMaxBlock = INT32_MAX;

constexpr uint32_t kSignature = 0x2A59FA59u;
constexpr uint32_t kFirstClasses = 24, kSecondClasses = 32;

// The control structure at the start of a formatted block: 32-bit words on every host. A link is the address
// of a block header where addresses have 32 bits, else its byte offset from the start of the pool.
struct PoolControl {
    uint32_t signature;
    uint32_t used;
    uint32_t maximum;
    uint32_t areaList;
    uint32_t firstBitmap;
    uint32_t secondBitmaps[kFirstClasses];
    uint32_t freeLists[kFirstClasses][kSecondClasses];
};
static_assert(sizeof(PoolControl) == 3188, "the pool's layout is fixed");

constexpr uint32_t kHeaderSize = 8;
constexpr uint32_t kMinPool = sizeof(PoolControl) + 8 * kHeaderSize;
constexpr uint32_t kAreaBlock = 3192, kAreaDescriptor = 3200, kFreeBlock = 3208;
constexpr uint32_t kBlockFree = 1, kPreviousFree = 2;  // flags in a header's size word

char* g_poolStart = nullptr;
char* g_poolEnd = nullptr;

struct SizeClass {
    uint32_t first, second;
};

// Class 0 holds sizes below 128 in steps of 4; from there each power of two is cut into 32 steps. Blocks of
// a gigabyte and more share the last list.
SizeClass ClassOf(uint32_t size) {
    if (size < 128) return {0, size / 4};
    const uint32_t log2 = 31 - static_cast<uint32_t>(__builtin_clz(size));
    if (log2 - 6 >= kFirstClasses) return {kFirstClasses - 1, kSecondClasses - 1};
    return {log2 - 6, (size >> (log2 - 5)) - kSecondClasses};
}

uint32_t Link(const char* start, uint32_t offset) {
#if UINTPTR_MAX == UINT32_MAX
    return static_cast<uint32_t>(reinterpret_cast<uintptr_t>(start)) + offset;
#else
    (void)start;
    return offset;
#endif
}

// Two words at an offset: a header (previous block, size) or an area descriptor (end block, next area).
void PutPair(char* start, uint32_t size, uint32_t offset, uint32_t word0, uint32_t word1) {
    const uint32_t words[2] = {word0, word1};
    const uint32_t room = size - offset;
    memcpy(start + offset, words, room < sizeof words ? room : sizeof words);
}

PoolControl ReadControl(const void* start) {
    PoolControl control;
    memcpy(&control, start, sizeof control);
    return control;
}

}  // namespace

int32_t QexMemory_Init(void* start, uint32_t size) {
    if (!start || size < kMinPool || reinterpret_cast<uintptr_t>(start) % 4 != 0) return 0;
    char* const pool = static_cast<char*>(start);
    g_poolStart = pool;
    g_poolEnd = pool + size;
    memset(pool, 0, size);

    const uint32_t freeSize = ((size - static_cast<uint32_t>(sizeof(PoolControl))) & ~7u) - 32;
    const uint32_t sentinel = kFreeBlock + kHeaderSize + freeSize;
    PutPair(pool, size, kAreaBlock, 0, kHeaderSize);
    PutPair(pool, size, kAreaDescriptor, Link(pool, sentinel), 0);
    PutPair(pool, size, kFreeBlock, 0, freeSize | kBlockFree);
    // The sentinel's size word (0, with a flag) lies past the end of some block sizes; PutPair leaves out
    // what has no room.
    PutPair(pool, size, sentinel, Link(pool, kFreeBlock), kPreviousFree);

    PoolControl control{};
    control.signature = kSignature;
    control.used = size - freeSize;
    control.maximum = control.used;
    control.areaList = Link(pool, kAreaDescriptor);
    const SizeClass freeClass = ClassOf(freeSize);
    control.firstBitmap = 1u << freeClass.first;
    control.secondBitmaps[freeClass.first] = 1u << freeClass.second;
    control.freeLists[freeClass.first][freeClass.second] = Link(pool, kFreeBlock);
    memcpy(pool, &control, sizeof control);
    return 0;
}

void QexMemory_Shutdown(void* start) {
    if (!start) return;
    memset(start, 0, sizeof(uint32_t));
    // The block may be released now, so it is not looked at again.
    if (start == g_poolStart) g_poolStart = g_poolEnd = nullptr;
}

uint32_t QexMemory_GetIsInitialized() {
    return g_poolStart && ReadControl(g_poolStart).signature == kSignature;
}

uint32_t QexMemory_GetUsed(const void* start) {
    return start ? ReadControl(start).used : 0;
}

uint32_t QexMemory_GetMaxSize(const void* start) {
    return start ? ReadControl(start).maximum : 0;
}

void* QexMemory_Alloc(uint32_t size) {
    void* const block = size > kMaxBlock ? nullptr : malloc(size ? size : 1);
    if (!block) QexDiagnostics_NoMemory(size, QEX_MODULE, __FILE__, __LINE__);
    return block;
}

void* QexMemory_ReAlloc(void* block, uint32_t size) {
    if (!block) return nullptr;
    // A size of 0 would release the block.
    void* const resized = size > kMaxBlock ? nullptr : realloc(block, size ? size : 1);
    if (!resized) QexDiagnostics_NoMemory(size, QEX_MODULE, __FILE__, __LINE__);
    return resized;
}

void QexMemory_Free(void* block) {
    free(block);
}
