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
};

// A bar on standard error, if that is a terminal.
void ReportProgress(size_t done, size_t count);

// On standard output, with what the GL tap has counted.
void ReportStats(const RenderStats& stats);
