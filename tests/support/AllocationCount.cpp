// Counts heap calls by standing before the C library's allocator. A sanitizer brings an allocator of its own;
// nothing can be counted then.
#include <cstddef>

#include "support/RenderFixture.h"

const bool kAllocationsAreCounted = !QEX_SANITIZED;

static thread_local bool t_counting;
static thread_local Allocations t_counts;

Allocations CountAllocations(const std::function<void()>& code) {
    t_counts = {};
    t_counting = true;
    code();
    t_counting = false;
    return t_counts;
}

#if !QEX_SANITIZED

extern "C" {

// The C library's own, under the names that it exports for this purpose.
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* block, size_t size);
void __libc_free(void* block);

void* malloc(size_t size) {
    if (t_counting) ++t_counts.made, ++t_counts.balance;
    return __libc_malloc(size);
}

void* calloc(size_t count, size_t size) {
    if (t_counting) ++t_counts.made, ++t_counts.balance;
    return __libc_calloc(count, size);
}

void* realloc(void* block, size_t size) {
    if (t_counting) ++t_counts.made, t_counts.balance += block ? 0 : 1;
    return __libc_realloc(block, size);
}

void free(void* block) {
    if (t_counting && block) --t_counts.balance;
    __libc_free(block);
}

}  // extern "C"

#endif
