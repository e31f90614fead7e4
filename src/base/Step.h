// Work that is done in steps, so that somebody who has little time may stop between them.
#pragma once

#include <cstdint>

enum class QexStep : uint8_t {
    kMore,    // once more
    kDone,    // that was the last one
    kFailed,  // what is wrong has been said
};

// The most bytes that a step reads, decodes or uploads of what can be parted.
constexpr uint32_t kQexPiece = 128 << 10;
constexpr uint32_t kQexWhole = UINT32_MAX;  // no part of anything

// All steps at once.
template <class Work, class Step>
bool QexStep_Run(Work&& work, Step step) {
    QexStep result;
    do result = step(work);
    while (result == QexStep::kMore);
    return result == QexStep::kDone;
}
