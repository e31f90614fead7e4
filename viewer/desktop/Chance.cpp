// The same ways that people's events take.
#include "desktop/Chance.h"

#define SDL_MAIN_HANDLED
#include <SDL.h>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>

#include <unistd.h>

namespace {

constexpr unsigned kFrames = 250;

// Events that nobody would make, and files that nobody could read, in a folder of their own.
class Chance {
  public:
    Chance(Window* window, const ViewOptions& options);
    ~Chance();
    void Run(unsigned events);

  private:
    unsigned Below(unsigned n) { return static_cast<unsigned>(random_()) % n; }
    void Key();
    void Text();
    void Button();
    void Move();
    void Wheel();
    void Drop();
    void Resize();
    void Hide();

    Window* const window_;
    std::mt19937 random_;
    std::string file_, folder_;
    std::vector<char> bytes_;
};

Chance::Chance(Window* window, const ViewOptions& options) : window_(window), random_(options.seed) {
    namespace fs = std::filesystem;
    std::error_code error;
    if (!options.files.empty()) file_ = fs::absolute(options.files[0], error).string();
    std::ifstream in(file_, std::ios::binary);
    bytes_.assign(std::istreambuf_iterator<char>(in), {});
    // Where screenshots go, too.
    folder_ = (fs::temp_directory_path(error) / "qex-view-XXXXXX").string();
    if (!mkdtemp(folder_.data()) || chdir(folder_.c_str()) != 0) folder_.clear();
    if (!file_.empty()) window->Open(file_);
    window->Settle();
}

Chance::~Chance() {
    std::error_code ignored;
    if (!folder_.empty()) std::filesystem::remove_all(folder_, ignored);
}

void Chance::Key() {
    const auto& keys = Viewer::Keys();
    SDL_Event event = {};
    event.type = SDL_KEYDOWN;
    static const SDL_Keycode kOthers[] = {SDLK_TAB,       SDLK_PAGEDOWN, SDLK_PAGEUP, SDLK_RETURN,
                                          SDLK_BACKSPACE, SDLK_DELETE,   SDLK_SPACE,  SDLK_HOME,
                                          SDLK_END,       SDLK_F1};
    const bool letter = Below(3) != 0;
    const auto& key = keys[Below(static_cast<unsigned>(keys.size()))];
    event.key.keysym.sym = letter ? tolower(key.key[0]) : kOthers[Below(std::size(kOthers))];
    static const SDL_Keymod kHeld[] = {KMOD_NONE,
                                       KMOD_NONE,
                                       KMOD_NONE,
                                       KMOD_SHIFT,
                                       KMOD_CTRL,
                                       KMOD_ALT,
                                       static_cast<SDL_Keymod>(KMOD_CTRL | KMOD_SHIFT)};
    SDL_SetModState(kHeld[Below(std::size(kHeld))]);
    event.key.keysym.mod = static_cast<Uint16>(SDL_GetModState());
    window_->Take(event);
    event.type = SDL_KEYUP;
    window_->Take(event);
}

void Chance::Text() {
    SDL_Event event = {};
    event.type = SDL_TEXTINPUT;
    snprintf(event.text.text, sizeof event.text.text, "%d", static_cast<int>(Below(2000)) - 1000);
    window_->Take(event);
}

void Chance::Move() {
    SDL_Event event = {};
    event.type = SDL_MOUSEMOTION;
    int width = 0, height = 0;
    SDL_GetWindowSize(window_->Handle(), &width, &height);
    event.motion.x = static_cast<int>(Below(static_cast<unsigned>(width) + 100)) - 50;
    event.motion.y = static_cast<int>(Below(static_cast<unsigned>(height) + 100)) - 50;
    window_->Take(event);
}

void Chance::Button() {
    SDL_Event event = {};
    event.type = Below(2) ? SDL_MOUSEBUTTONDOWN : SDL_MOUSEBUTTONUP;
    event.button.button = static_cast<Uint8>(1 + Below(5));
    int width = 0, height = 0;
    SDL_GetWindowSize(window_->Handle(), &width, &height);
    event.button.x = static_cast<int>(Below(static_cast<unsigned>(width) + 1));
    event.button.y = static_cast<int>(Below(static_cast<unsigned>(height) + 1));
    window_->Take(event);
}

void Chance::Wheel() {
    SDL_Event event = {};
    event.type = SDL_MOUSEWHEEL;
    event.wheel.y = static_cast<int>(Below(200)) - 100;
    window_->Take(event);
    event.type = SDL_MULTIGESTURE;
    event.mgesture.dDist = static_cast<float>(Below(100)) / 50 - 1;
    window_->Take(event);
}

// A copy with wrong bytes, a part of it, under one of several extensions; or what is no file.
void Chance::Drop() {
    static const char* const kNames[] = {"a.pod",  "a.pod", "a.pod", "a.pod", "a.obj", "a.emitter",
                                         "a.json", "a.png", "a.tga", "a",     ".",     "nowhere.pod"};
    const std::string name = kNames[Below(std::size(kNames))];
    std::vector<char> bytes = bytes_;
    for (unsigned i = Below(6); i > 0 && !bytes.empty(); --i)
        bytes[Below(static_cast<unsigned>(bytes.size()))] = static_cast<char>(Below(256));
    if (Below(3) == 0) bytes.resize(Below(static_cast<unsigned>(bytes.size()) + 1));
    if (name[0] == 'a')
        std::ofstream(name, std::ios::binary).write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    SDL_Event event = {};
    event.type = SDL_DROPFILE;
    event.drop.file = SDL_strdup(Below(4) ? name.c_str() : file_.c_str());
    window_->Take(event);
}

void Chance::Resize() {
    const bool tiny = Below(4) == 0;
    SDL_SetWindowSize(window_->Handle(), tiny ? 1 : static_cast<int>(1 + Below(700)),
                      tiny ? 1 : static_cast<int>(1 + Below(500)));
    window_->TakeAll();
}

void Chance::Hide() {
    SDL_Event event = {};
    event.type = SDL_WINDOWEVENT;
    for (const SDL_WindowEventID what : {SDL_WINDOWEVENT_MINIMIZED, SDL_WINDOWEVENT_RESTORED}) {
        (what == SDL_WINDOWEVENT_MINIMIZED ? SDL_MinimizeWindow : SDL_RestoreWindow)(window_->Handle());
        event.window.event = static_cast<Uint8>(what);
        window_->Take(event);
        window_->TakeAll();
        window_->Frame(1.0 / 60);
    }
}

void Chance::Run(unsigned events) {
    // The common ones come more often.
    static const struct {
        unsigned weight;
        void (Chance::*happen)();
    } kKinds[] = {{30, &Chance::Move}, {25, &Chance::Button}, {25, &Chance::Key},   {8, &Chance::Wheel},
                  {6, &Chance::Text},  {3, &Chance::Drop},    {2, &Chance::Resize}, {1, &Chance::Hide}};
    // Some hundred frames, however many events: a software GL takes a while for each.
    const unsigned burst = std::max(10u, events / kFrames);
    for (unsigned i = 0; i < events; ++i) {
        unsigned at = Below(100);
        for (const auto& kind : kKinds) {
            if (at < kind.weight) {
                (this->*kind.happen)();
                break;
            }
            at -= kind.weight;
        }
        if (i % burst == 0) window_->Frame(static_cast<double>(Below(100)) / 1000);
    }
    window_->Settle();
}

}  // namespace

int DriveRandomly(Window* window, const ViewOptions& options) {
    Chance(window, options).Run(options.randomEvents);
    return 0;
}
