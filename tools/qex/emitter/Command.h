// qex emitter: particle emitter files from descriptions, and descriptions of them.
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}

struct EmitterOptions {
    std::string input;   // emitter file or description; empty: the engine's defaults
    std::string output;  // .json or .txt: a description, else an emitter file; empty: text on standard output
    std::vector<std::string> settings;  // FIELD=VALUE
    bool json = false;
};

void SetUpEmitter(CLI::App* app, EmitterOptions* options);

// Returns the exit status: 0, 1 when the input cannot be used, 2 for a setting or an output that cannot be
// written.
int RunEmitter(const EmitterOptions& options);
