// Counts heap calls by standing before the C library's allocator. A sanitizer brings an allocator of its own;
// nothing can be counted then.
#include <cstddef>

#include "RenderFixture.h"

static thread_local bool t_counting;
static thread_local long t_made;

long CountAllocations(const std::function<void()>& code) {
    t_made = 0;
    t_counting = true;
    code();
    t_counting = false;
    return t_made;
}

#if !QEX_SANITIZED

extern "C" {

// The C library's own, under the names that it exports for this purpose.
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* block, size_t size);

void* malloc(size_t size) {
    t_made += t_counting;
    return __libc_malloc(size);
}

void* calloc(size_t count, size_t size) {
    t_made += t_counting;
    return __libc_calloc(count, size);
}

void* realloc(void* block, size_t size) {
    t_made += t_counting;
    return __libc_realloc(block, size);
}

}  // extern "C"

#endif
