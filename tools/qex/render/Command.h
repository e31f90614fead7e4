// qex render: pictures of a POD scene, drawn by the engine without a window.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "render/Camera.h"
#include "render/Effects.h"
#include "render/Textures.h"

namespace CLI {
class App;
}

struct FrameRange {
    double first, last, step;
};

struct RenderOptions {
    std::string input;
    std::string output;
    int width = 800;
    int height = 600;
    int antialias = 4;  // samples of a pixel: 1, 2 or 4
    double frame = 0;
    std::optional<FrameRange> frames;  // several, numbered
    int turn = 0;                      // pictures of one turn around the scene, 0 for none
    std::optional<int> camera;         // the first; with autoCamera or without cameras the scene is framed
    bool autoCamera = false;
    OrbitView view;
    uint32_t background = 0x404858;  // RRGGBB
    std::string text;
    EffectOptions effects;
    TextureChoices textures;
    bool lean = true;  // drawing, else the described one
    bool stats = false;
    bool quiet = false;
};

void SetUpRender(CLI::App* app, RenderOptions* options);

// Returns the exit status: 0, 1 when the scene cannot be drawn, 2 for an output that cannot be written.
int RunRender(const RenderOptions& options);
