// qex view: a window that shows scenes.
#pragma once

#include "desktop/View.h"

namespace CLI {
class App;
}

void SetUpView(CLI::App* app, ViewOptions* options);
