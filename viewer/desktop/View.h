// qex view: the desktop viewer as a program.
#pragma once

#include <string>
#include <vector>

struct ViewOptions {
    std::vector<std::string> files;
    bool batch = false;  // opens each, draws some frames, ends with the number of those that failed
    std::string script;  // events from a file, then ends
    unsigned randomEvents = 0, seed = 1;
    int width = 0, height = 0;  // 0: as the last time

    bool IsDriven() const { return batch || !script.empty() || randomEvents; }
};

// Returns the exit status: 0; 1 and a line when there is no display or no OpenGL ES 2.0; in a batch the
// number of files that failed.
int RunView(const ViewOptions& options);
