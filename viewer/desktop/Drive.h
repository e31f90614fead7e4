// Windows that nobody sits before: many files in a row, and scripts.
#pragma once

#include "desktop/Window.h"

// Opens each and draws some frames. Returns how many could not be shown, 99 at most.
int DriveBatch(Window* window, const std::vector<std::string>& files);

// A line an event or a question, see Drive.cpp. Returns the exit status: 1 for a line that fails.
int DriveScript(Window* window, const std::string& path);
