// qex info: what is in a POD, PVR, KTX or TGA file, and what of it would draw wrong.
#pragma once

#include <string>

namespace CLI {
class App;
}

struct InfoOptions {
    std::string input;
    bool json = false;
};

// Gives the verb its options.
void SetUpInfo(CLI::App* app, InfoOptions* options);

// Returns the exit status: 0, or 1 for a file that cannot be read as any of the formats.
int RunInfo(const InfoOptions& options);
