// The system's events as the viewer takes them.
#pragma once

#include <optional>

#include "front/Viewer.h"

union SDL_Event;

// Null for what means nothing to the viewer. `scale`: pixels of a point.
std::optional<ViewerEvent> TranslateEvent(const SDL_Event& event, float scale);

// The modifier keys that are held.
unsigned HeldModifiers();
