// Counts heap calls by standing before the C library's allocator. A sanitizer brings an allocator of its own;
// nothing can be counted then.
#include <dlfcn.h>

#include <cstddef>

#include "support/RenderFixture.h"

const bool kAllocationsAreCounted = !QEX_SANITIZED;

static thread_local bool t_counting;
static thread_local Allocations t_counts;
static thread_local const void* t_engine;  // where it is loaded, while its allocations are followed
static thread_local long t_asked, t_failing;
static thread_local bool t_following;

Allocations CountAllocations(const std::function<void()>& code) {
    t_counts = {};
    t_counting = true;
    code();
    t_counting = false;
    return t_counts;
}

long EngineAllocations(const std::function<void()>& code, long nth, bool following) {
    Dl_info engine = {};
    dladdr(reinterpret_cast<const void*>(QexEngine_Init), &engine);
    t_asked = 0;
    t_failing = nth;
    t_following = following;
    t_engine = engine.dli_fbase;
    code();
    t_engine = nullptr;
    return t_asked;
}

#if !QEX_SANITIZED

// Whether an allocation that was asked for from there fails.
static bool Fails(const void* caller) {
    Dl_info info = {};
    if (!t_engine || !dladdr(caller, &info) || info.dli_fbase != t_engine) return false;
    ++t_asked;
    return t_failing && (t_asked == t_failing || (t_following && t_asked > t_failing));
}

extern "C" {

// The C library's own, under the names that it exports for this purpose.
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* block, size_t size);
void __libc_free(void* block);

void* malloc(size_t size) {
    if (Fails(__builtin_return_address(0))) return nullptr;
    if (t_counting) ++t_counts.made, ++t_counts.balance;
    return __libc_malloc(size);
}

void* calloc(size_t count, size_t size) {
    if (t_counting) ++t_counts.made, ++t_counts.balance;
    return __libc_calloc(count, size);
}

void* realloc(void* block, size_t size) {
    if (Fails(__builtin_return_address(0))) return nullptr;
    if (t_counting) ++t_counts.made, t_counts.balance += block ? 0 : 1;
    return __libc_realloc(block, size);
}

void free(void* block) {
    if (t_counting && block) --t_counts.balance;
    __libc_free(block);
}

}  // extern "C"

#endif
