// qex thumbnail: a small picture of any scene, for file managers.
#pragma once

#include <string>

namespace CLI {
class App;
}

struct ThumbnailOptions {
    std::string input, output;
    int size = 256;  // pixels of the longer side
};

void SetUpThumbnail(CLI::App* app, ThumbnailOptions* options);

// Returns the exit status, as those of qex convert and qex render.
int RunThumbnail(const ThumbnailOptions& options);
