// Names of keys, and pixels of points.
#include "desktop/Keys.h"

#define SDL_MAIN_HANDLED
#include <SDL.h>

#include <cctype>

namespace {

struct KeyName {
    SDL_Keycode code;
    const char* name;
};
const KeyName kKeyNames[] = {{SDLK_SPACE, "Space"}, {SDLK_RIGHT, "Right"},  {SDLK_LEFT, "Left"},
                             {SDLK_UP, "Up"},       {SDLK_DOWN, "Down"},    {SDLK_HOME, "Home"},
                             {SDLK_END, "End"},     {SDLK_ESCAPE, "Escape"}};

std::string NameOf(const SDL_Keysym& key) {
    for (const KeyName& known : kKeyNames)
        if (known.code == key.sym) return known.name;
    if (key.sym == SDLK_SLASH && key.mod & KMOD_SHIFT) return "?";
    if (key.sym < 33 || key.sym > 126) return "";
    return std::string(1, static_cast<char>(toupper(key.sym)));
}

}  // namespace

unsigned HeldModifiers() {
    const SDL_Keymod mod = SDL_GetModState();
    return (mod & KMOD_SHIFT ? kShift : 0u) | (mod & KMOD_CTRL ? kControl : 0u) |
           (mod & KMOD_ALT ? kAlt : 0u);
}

std::optional<ViewerEvent> TranslateEvent(const SDL_Event& event, float scale) {
    ViewerEvent out = {};
    out.modifiers = HeldModifiers();
    const auto at = [&](ViewerEvent::Kind kind, int x, int y) {
        out.kind = kind;
        out.x = static_cast<float>(x) * scale;
        out.y = static_cast<float>(y) * scale;
    };
    switch (event.type) {
        case SDL_KEYDOWN:
            out.kind = ViewerEvent::kKey;
            out.text = NameOf(event.key.keysym);
            if (out.text == "?") out.modifiers = 0;
            return out;
        case SDL_MOUSEBUTTONDOWN:
        case SDL_MOUSEBUTTONUP:
            at(event.type == SDL_MOUSEBUTTONDOWN ? ViewerEvent::kPointerDown : ViewerEvent::kPointerUp,
               event.button.x, event.button.y);
            out.button = event.button.button;
            return out;
        case SDL_MOUSEMOTION: at(ViewerEvent::kPointerMove, event.motion.x, event.motion.y); return out;
        case SDL_MOUSEWHEEL:
            out.kind = ViewerEvent::kWheel;
            out.amount = static_cast<float>(event.wheel.y);
            return out;
        case SDL_MULTIGESTURE:
            out.kind = ViewerEvent::kPinch;
            out.amount = 1 + event.mgesture.dDist * 4;
            return out;
        default: return std::nullopt;
    }
}
