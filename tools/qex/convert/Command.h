// qex convert: any scene that assimp reads, to a POD scene with PVR textures beside it.
#pragma once

#include <string>

#include "convert/Placement.h"
#include "convert/Textures.h"
#include "texture/Overrides.h"

namespace CLI {
class App;
}

struct ConvertOptions {
    std::string input;
    std::string output;
    TextureFormat textureFormat = TextureFormat::kEtc1;
    int fps = 30;               // of the sampled animation
    int maxBones = 16;          // in a bone batch of a skinned mesh, 1 to 16
    std::string clip;           // name or index of the animation; the first when empty
    TextureOverrides textures;  // in place of the materials' own
    Placement placement;
    int memory = 4096;       // megabytes that the conversion may take
    std::string clipsTo;     // a file that gets the animations' names, a line each; none when empty
    bool listClips = false;  // print the animations and convert nothing
    bool quiet = false;      // no summary; warnings and errors still show
};

// Gives the verb its options.
void SetUpConvert(CLI::App* app, ConvertOptions* options);

// Returns the exit status: 0, 1 when the input cannot be read or holds nothing to draw, 2 for a bad
// argument or an output that cannot be written. Errors are one line on standard error.
int RunConvert(const ConvertOptions& options);
