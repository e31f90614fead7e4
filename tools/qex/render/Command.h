// qex render: pictures of a POD scene, drawn by the engine without a window.
#pragma once

#include "scene/Options.h"

namespace CLI {
class App;
}

void SetUpRender(CLI::App* app, RenderOptions* options);

// Returns the exit status: 0, 1 when the scene cannot be drawn, 2 for an output that cannot be written.
int RunRender(const RenderOptions& options);
