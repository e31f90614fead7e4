// The same ways that people's events take.
#include "desktop/Drive.h"

#define SDL_MAIN_HANDLED
#include <SDL.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <sstream>
#include <utility>

#include "common/Talk.h"
#include "front/Properties.h"

namespace {

constexpr int kBatchFrames = 4;
constexpr double kFrame = 1.0 / 60;  // seconds

void SendPointer(Viewer* viewer, ViewerEvent::Kind kind, float x, float y, unsigned modifiers) {
    ViewerEvent event = {};
    event.kind = kind;
    event.x = x;
    event.y = y;
    event.button = 1;
    event.modifiers = modifiers;
    viewer->Handle(event);
}

// "X Y" or "X Y TO-X TO-Y", and "shift", "control" or "alt" behind it.
bool Drag(Window* window, std::istringstream& words) {
    float x = 0, y = 0, toX = 0, toY = 0;
    if (!(words >> x >> y)) return false;
    if (!(words >> toX >> toY)) {
        toX = x, toY = y;
        words.clear();
    }
    std::string held;
    words >> held;
    unsigned modifiers = 0;
    for (const auto& [name, modifier] : {std::pair("shift", kShift), {"control", kControl}, {"alt", kAlt}})
        if (held == name) modifiers = modifier;
    Viewer* viewer = &window->Front();
    SendPointer(viewer, ViewerEvent::kPointerDown, x, y, modifiers);
    SendPointer(viewer, ViewerEvent::kPointerMove, (x + toX) / 2, (y + toY) / 2, modifiers);
    SendPointer(viewer, ViewerEvent::kPointerMove, toX, toY, modifiers);
    SendPointer(viewer, ViewerEvent::kPointerUp, toX, toY, modifiers);
    return true;
}

bool PressKey(Window* window, std::istringstream& words) {
    ViewerEvent event = {};
    event.kind = ViewerEvent::kKey;
    if (!(words >> event.text)) return false;
    window->Front().Handle(event);
    return true;
}

bool Wheel(Window* window, std::istringstream& words) {
    ViewerEvent event = {};
    event.kind = ViewerEvent::kWheel;
    if (!(words >> event.amount)) return false;
    window->Front().Handle(event);
    return true;
}

bool Frames(Window* window, std::istringstream& words) {
    int count = 0;
    words >> count;
    for (int i = 0; i < count; ++i) window->Frame(kFrame);
    return count > 0;
}

bool Scrub(Window* window, std::istringstream& words) {
    double frame = 0;
    if (!(words >> frame)) return false;
    window->Front().Play().Play(false);
    window->Front().Play().Scrub(frame);
    window->Frame(0);
    return true;
}

bool Wait(Window* window, std::istringstream& words) {
    double seconds = 0;
    if (!(words >> seconds)) return false;
    for (int i = 0; i < static_cast<int>(seconds * 50); ++i) {
        SDL_Delay(20);
        window->Frame(0.02);
    }
    window->Settle();
    return true;
}

bool Resize(Window* window, std::istringstream& words) {
    int width = 0, height = 0;
    if (!(words >> width >> height)) return false;
    SDL_SetWindowSize(window->Handle(), width, height);
    for (int i = 0; i < 10; ++i) {
        SDL_Delay(20);
        window->TakeAll();
    }
    return true;
}

// The rest of a line.
std::string Rest(std::istringstream& words) {
    std::string text;
    std::getline(words >> std::ws, text);
    return text;
}

bool Drop(Window* window, std::istringstream& words) {
    SDL_Event event = {};
    event.type = SDL_DROPFILE;
    event.drop.file = SDL_strdup(Rest(words).c_str());
    window->Take(event);
    window->Settle();
    return true;
}

bool Clip(Window* window, std::istringstream& words) {
    size_t clip = 0;
    if (!(words >> clip) || !window->ChooseClip(clip)) return false;
    window->Settle();
    return true;
}

bool SayMessages(Window* window, std::istringstream&) {
    for (const std::string& message : window->Front().Messages()) printf("%s\n", message.c_str());
    return true;
}

bool SaySelected(Window* window, std::istringstream&) {
    const QexModel* model = window->Front().View().Model();
    const char* name =
        model ? QexModel_GetNodeName(model, static_cast<uint32_t>(window->Front().Selected())) : nullptr;
    printf("selected %s\n", name ? name : "nothing");
    return true;
}

const struct {
    const char* verb;
    bool (*run)(Window*, std::istringstream&);
} kVerbs[] = {
    {"drag", Drag},
    {"click", Drag},
    {"key", PressKey},
    {"wheel", Wheel},
    {"frames", Frames},
    {"scrub", Scrub},
    {"wait", Wait},
    {"size", Resize},
    {"open", Drop},
    {"clip", Clip},
    {"select", SaySelected},
    {"messages", SayMessages},
    {"set", [](Window* w, std::istringstream& s) { return SetProperties(&w->Front(), Rest(s)); }},
    {"line", [](Window* w, std::istringstream& s) { return printf("%s\n", w->Line(Rest(s)).c_str()) > 0; }},
    {"screenshot", [](Window* w, std::istringstream& s) { return w->Screenshot(Rest(s)); }},
    {"window", [](Window* w, std::istringstream& s) { return w->SaveWindow(Rest(s)); }},
};

bool RunLine(Window* window, const std::string& line) {
    std::istringstream words(line);
    std::string verb;
    words >> verb;
    for (const auto& known : kVerbs)
        if (verb == known.verb) return known.run(window, words);
    return false;
}

}  // namespace

int DriveBatch(Window* window, const std::vector<std::string>& files) {
    for (const std::string& file : files) {
        window->Open(file);
        window->Settle();
        for (int i = 0; i < kBatchFrames; ++i) window->Frame(kFrame);
    }
    for (const std::string& message : window->Front().Messages()) ::Say("view", message);
    return static_cast<int>(std::min<size_t>(window->Front().FailedLoads(), 99));
}

int DriveScript(Window* window, const std::string& path) {
    std::ifstream script(path);
    window->Settle();
    for (std::string line; std::getline(script, line);)
        if (!line.empty() && !RunLine(window, line)) return Fail("view", "script: " + line + ": failed", 1);
    return 0;
}
