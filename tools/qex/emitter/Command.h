// qex emitter: particle emitter files from descriptions, and descriptions of them.
#pragma once

#include <string>
#include <vector>

#include "emitter/Fields.h"

namespace CLI {
class App;
}

struct EmitterOptions {
    std::string input;  // emitter file or description; empty: the engine's defaults
    std::string
        output;  // .json: a description, else an emitter file; empty: a description on standard output
    std::vector<FieldValues> settings;
};

void SetUpEmitter(CLI::App* app, EmitterOptions* options);

// Returns the exit status: 0, 1 when the input cannot be used, 2 for a setting or an output that cannot be
// written.
int RunEmitter(const EmitterOptions& options);
