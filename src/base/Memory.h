// Memory for the engine's own modules, around QexMemory_Alloc: an owner that frees itself, zeroed arrays,
// resizing.
#pragma once

#include <cstring>

#include "Qex/base.h"

// An uninitialised block of `count` elements, one byte where that is none; null when it cannot be had.
template <class T>
T* QexMemory_AllocArray(uint64_t count) {
    if (count > UINT32_MAX || count * sizeof(T) > UINT32_MAX) return nullptr;
    return static_cast<T*>(QexMemory_Alloc(count ? static_cast<uint32_t>(count * sizeof(T)) : 1));
}

// The same, zeroed.
template <class T>
T* QexMemory_AllocZeroed(uint64_t count) {
    T* array = QexMemory_AllocArray<T>(count);
    if (array) memset(static_cast<void*>(array), 0, static_cast<size_t>(count * sizeof(T)));
    return array;
}

// Frees an array and forgets it.
template <class T>
void QexMemory_FreeArray(T*& array) {
    QexMemory_Free(array);
    array = nullptr;
}

// Resizes an array to that many bytes; a null one is allocated. False, and the array as it was, when memory
// runs out.
template <class T>
bool QexMemory_Resize(T*& array, uint64_t bytes) {
    if (bytes > UINT32_MAX) return false;
    void* resized = array ? QexMemory_ReAlloc(array, static_cast<uint32_t>(bytes))
                          : QexMemory_Alloc(static_cast<uint32_t>(bytes));
    if (resized) array = static_cast<T*>(resized);
    return resized != nullptr;
}

// Owns a block from QexMemory_Alloc until the end of its scope. Not copyable; Take hands the block over.
template <class T>
class QexScratch {
  public:
    explicit QexScratch(uint64_t count = 0) {
        if (count) Alloc(count);
    }
    ~QexScratch() { QexMemory_Free(block_); }
    QexScratch(const QexScratch&) = delete;
    QexScratch& operator=(const QexScratch&) = delete;

    // Replaces the block by one of `count` elements, uninitialised. False when it cannot be had.
    bool Alloc(uint64_t count) {
        QexMemory_Free(block_);
        block_ = QexMemory_AllocArray<T>(count);
        return block_ != nullptr;
    }

    // Takes a block over, in place of the one it had.
    void Own(T* block) {
        QexMemory_Free(block_);
        block_ = block;
    }
    T* Take() {
        T* block = block_;
        block_ = nullptr;
        return block;
    }
    T* Get() { return block_; }
    T& operator[](uint64_t i) { return block_[i]; }
    explicit operator bool() const { return block_ != nullptr; }

  private:
    T* block_ = nullptr;
};
