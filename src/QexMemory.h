// Scratch memory that frees itself: a thin owner around QexMemory_Alloc for functions with early returns.
#pragma once

#include "Qex.h"

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
        block_ = nullptr;
        const uint64_t bytes = count * sizeof(T);
        if (count > UINT32_MAX || bytes > UINT32_MAX) return false;
        block_ = static_cast<T*>(QexMemory_Alloc(static_cast<uint32_t>(bytes ? bytes : 1)));
        return block_ != nullptr;
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
