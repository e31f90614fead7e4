// What qex render says about its work.
#pragma once

#include <cstddef>

#include "Headless.h"
#include "Qex.h"

struct RenderStats {
    const QexModel& model;
    const qex::HeadlessContext& context;
    size_t pictures;
    double loadTime, drawTime;  // milliseconds
    uint64_t draws, calls;      // of GL, in all pictures
    bool lean;
    uint64_t otherCalls;  // in one picture of the other way of drawing
};

// A bar on standard error, if that is a terminal.
void ReportProgress(size_t done, size_t count);

// On standard output.
void ReportStats(const RenderStats& stats);
