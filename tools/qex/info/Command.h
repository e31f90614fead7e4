// qex info: what is in a POD, PVR, KTX or TGA file, and what of it would draw wrong.
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}

struct InfoOptions {
    std::vector<std::string> inputs;
    bool json = false;
};

// Gives the verb its options.
void SetUpInfo(CLI::App* app, InfoOptions* options);

// Returns the exit status: 0, or 1 when a file cannot be read as any of the formats; the others are shown.
int RunInfo(const InfoOptions& options);
