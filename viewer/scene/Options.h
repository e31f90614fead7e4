// How a scene is shown, and what pictures are made of it: all that qex render can be told.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "scene/Camera.h"
#include "scene/Effects.h"
#include "scene/Textures.h"

struct SceneOptions {
    std::optional<int> camera;  // the first; with autoCamera or without cameras the scene is framed
    bool autoCamera = false;
    std::optional<LookView> look;  // instead of either
    OrbitView view;
    uint32_t background = 0x404858;  // RRGGBB
    EffectOptions effects;
    TextureChoices textures;
    bool lean = true;  // drawing, else the described one
};

struct FrameRange {
    double first, last, step;
};

struct RenderOptions : SceneOptions {
    std::string input;
    std::string output;
    int width = 800;
    int height = 600;
    int antialias = 4;  // samples of a pixel: 1, 2 or 4
    double frame = 0;
    std::optional<FrameRange> frames;  // several, numbered
    int turn = 0;                      // pictures of one turn around the scene, 0 for none
    std::string text;
    bool stats = false;
    bool quiet = false;
};

// The words behind "qex" of the command line that says just this; "render" is the first.
std::vector<std::string> RenderWords(const RenderOptions& options);

// Words as a shell takes them, in quotation marks where they need them.
std::string ShellLine(const std::vector<std::string>& words);
