// qex sheet: several pictures side by side in one.
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}

struct SheetOptions {
    std::vector<std::string> inputs;
    std::string output;
    int columns = 4;
    int gap = 4;  // pixels between pictures
};

void SetUpSheet(CLI::App* app, SheetOptions* options);

// Returns the exit status: 0, 1 when a picture cannot be read, 2 for an output that cannot be written.
int RunSheet(const SheetOptions& options);
