// Events at random: what nobody would do, and a window has to live through.
#pragma once

#include "desktop/Window.h"

// Presses, drags, drops damaged copies of the first file, resizes and hides the window. Returns 0.
int DriveRandomly(Window* window, const ViewOptions& options);
