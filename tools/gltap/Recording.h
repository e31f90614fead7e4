// A finished or growing sequence of calls. While it grows, offsets[i] is the place of call i's data.
#pragma once

#include <vector>

#include "gltap.h"

struct gltapRecording {
    std::vector<gltapCall> calls;
    std::vector<uint8_t> data;
    std::vector<size_t> offsets;
    // What GL writes through pointers during a replay lands here.
    mutable std::vector<uint64_t> scratch;
    size_t scratchSize = 0;
};
