// qex texture: pictures to PVR and KTX textures, and back.
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}

struct TextureOptions {
    std::string input;               // picture or texture; empty when there are faces
    std::vector<std::string> faces;  // six for a cube map: +X -X +Y -Y +Z -Z
    std::string output;              // its extension tells what is written: png, pvr or ktx
    std::string format;              // empty: RGBA 8888 with alpha, RGB 888 without
    bool mipmaps = false;
    bool flip = false;
    int level = -1, face = -1;  // of a texture that is read; -1: not given
};

void SetUpTexture(CLI::App* app, TextureOptions* options);

// Returns the exit status: 0, 1 when a file cannot be used, 2 for options that do not go together or an
// output that cannot be written.
int RunTexture(const TextureOptions& options);
