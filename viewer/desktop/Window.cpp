// SDL2 opens the window, Dear ImGui the panel in it; the loop between them and the viewer.
#include "desktop/Window.h"

#define SDL_MAIN_HANDLED
#include <GLES2/gl2.h>
#include <imgui.h>
#include <imgui_impl_sdl.h>
#include <SDL.h>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <memory>
#include <random>
#include <sstream>

#include "common/ImageFile.h"
#include "common/OutputFile.h"
#include "common/Talk.h"
#include "common/TextureFiles.h"
#include "desktop/Conversion.h"
#include "desktop/GuiDraw.h"
#include "desktop/Inspector.h"
#include "desktop/Settings.h"
#include "desktop/Watch.h"
#include "emitter/Description.h"
#include "gltap.h"

namespace {

constexpr int kBatchFrames = 4;
constexpr int kTurntable = 36;  // pictures of a turn
constexpr float kMessageSeconds = 8;

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

unsigned ModifiersOf(SDL_Keymod mod) {
    return (mod & KMOD_SHIFT ? kShift : 0u) | (mod & KMOD_CTRL ? kControl : 0u) |
           (mod & KMOD_ALT ? kAlt : 0u);
}

class Window {
  public:
    explicit Window(const ViewOptions& options) : options_(options) {}
    ~Window();
    bool Start(std::string* problem);
    int Run();

  private:
    bool OpenContext(int samples);
    int PictureWidth() const;
    void Open(const std::string& file);
    void Page(int by);
    void Poll(double seconds);
    void Take(const SDL_Event& event);
    void Frame(double seconds);
    void ShowMessages(double seconds);
    void WatchFiles();
    bool Busy() const { return conversion_.AtWork() || viewer_->IsLoading(); }
    void Settle();
    bool Screenshot(const std::string& path);
    void Turntable();
    std::string Line(const std::string& output);
    bool SaveWindow(const std::string& path);
    int RunScript();
    bool RunLine(const std::string& line);
    int RunRandom();
    int RunBatch();

    const ViewOptions options_;
    SDL_Window* window_ = nullptr;
    SDL_GLContext context_ = nullptr;
    bool gui_ = false, ends_ = false, keep_ = false;
    int width_ = 0, height_ = 0, samples_ = 0;
    Settings settings_;
    std::unique_ptr<Viewer> viewer_;
    std::unique_ptr<GuiDraw> draw_;
    std::unique_ptr<Inspector> inspector_;
    Conversion conversion_;
    Watch watch_;
    std::string wanted_, shownPath_;
    std::vector<std::string> files_;
    size_t page_ = 0, said_ = 0, loads_ = 0;
    float sayFor_ = 0;
};

Window::~Window() {
    std::string ignored;
    if (viewer_ && !options_.batch && options_.script.empty() && !options_.randomEvents)
        SaveSettings(settings_, SettingsPath(), &ignored);
    inspector_.reset();
    draw_.reset();
    viewer_.reset();
    if (gui_) ImGui_ImplSDL2_Shutdown();
    if (gui_) ImGui::DestroyContext();
    if (context_) SDL_GL_DeleteContext(context_);
    if (window_) SDL_DestroyWindow(window_);
    SDL_Quit();
}

bool Window::OpenContext(int samples) {
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_PROFILE_MASK, SDL_GL_CONTEXT_PROFILE_ES);
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_MAJOR_VERSION, 2);
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_MINOR_VERSION, 0);
    SDL_GL_SetAttribute(SDL_GL_DEPTH_SIZE, 24);
    SDL_GL_SetAttribute(SDL_GL_STENCIL_SIZE, 8);
    SDL_GL_SetAttribute(SDL_GL_MULTISAMPLEBUFFERS, samples > 1);
    SDL_GL_SetAttribute(SDL_GL_MULTISAMPLESAMPLES, samples > 1 ? samples : 0);
    const Uint32 flags = SDL_WINDOW_OPENGL | SDL_WINDOW_RESIZABLE | SDL_WINDOW_ALLOW_HIGHDPI;
    window_ = SDL_CreateWindow("qex view", SDL_WINDOWPOS_CENTERED, SDL_WINDOWPOS_CENTERED, settings_.width,
                               settings_.height, flags);
    context_ = window_ ? SDL_GL_CreateContext(window_) : nullptr;
    if (context_) return true;
    if (window_) SDL_DestroyWindow(window_);
    window_ = nullptr;
    return false;
}

bool Window::Start(std::string* problem) {
    std::string fault;
    settings_ = LoadSettings(SettingsPath(), &fault);
    if (!fault.empty()) ::Say("view", "warning: " + fault);
    if (options_.width) settings_.width = options_.width;
    if (options_.height) settings_.height = options_.height;
    SDL_SetMainReady();
    SDL_SetHint(SDL_HINT_OPENGL_ES_DRIVER, "1");
    SDL_SetHint(SDL_HINT_VIDEO_X11_FORCE_EGL, "1");
    // Without one SDL's drivers would say so, each in its own way.
    const bool display = getenv("DISPLAY") || getenv("WAYLAND_DISPLAY") || getenv("SDL_VIDEODRIVER");
    const char* driver = display && SDL_Init(SDL_INIT_VIDEO) == 0 ? SDL_GetCurrentVideoDriver() : nullptr;
    if (!driver || strcmp(driver, "offscreen") == 0 || strcmp(driver, "dummy") == 0) {
        *problem = "there is no display; qex render draws pictures without one";
        return false;
    }
    if (!OpenContext(4) && !OpenContext(0)) {
        *problem = std::string("no window with OpenGL ES 2.0: ") + SDL_GetError();
        return false;
    }
    SDL_GL_SetSwapInterval(options_.batch || !options_.script.empty() || options_.randomEvents ? 0 : 1);
    SDL_GL_GetDrawableSize(window_, &width_, &height_);
    glGetIntegerv(GL_SAMPLES, &samples_);
    QexRenderer_SetGetProcAddress([](const char* name) { return SDL_GL_GetProcAddress(name); });
    viewer_ = std::make_unique<Viewer>(PictureWidth(), height_, LoadEmitter, gltapCountAll);
    IMGUI_CHECKVERSION();
    ImGui::CreateContext();
    ImGui::GetIO().IniFilename = nullptr;
    ImGui::StyleColorsDark();
    ImGui::GetStyle().WindowRounding = 0;
    gui_ = ImGui_ImplSDL2_InitForOpenGL(window_, context_);
    draw_ = std::make_unique<GuiDraw>();
    inspector_ = std::make_unique<Inspector>(viewer_.get());
    return true;
}

// The picture is what the panel leaves of the window, if that is more than half of it.
int Window::PictureWidth() const {
    int points = 0;
    SDL_GetWindowSize(window_, &points, nullptr);
    const int panel = points > 0 ? Inspector::kWidth * width_ / points : 0;
    return settings_.inspector && panel * 2 < width_ ? width_ - panel : width_;
}

// Emitters are shown with the scene that is there; what is no POD file is converted first.
void Window::Open(const std::string& file) {
    const std::string extension = Extension(file);
    std::string problem;
    if (extension == "emitter" || extension == "json") {
        SceneOptions options = viewer_->Options();
        options.effects.emitters.emitters.push_back(file);
        viewer_->SetOptions(options);
        return WatchFiles();
    }
    wanted_ = file;
    keep_ = false;
    if (extension == "pod" || !IsRegularFile(file)) return viewer_->Open(file);
    if (!conversion_.Start(file, &problem)) viewer_->Say(file + ": " + problem);
}

void Window::Page(int by) {
    if (files_.size() < 2) return;
    page_ =
        (page_ + files_.size() + static_cast<size_t>(by + static_cast<int>(files_.size()))) % files_.size();
    Open(files_[page_]);
}

void Window::WatchFiles() {
    std::vector<std::string> files = viewer_->Options().effects.emitters.emitters;
    if (!shownPath_.empty()) files.push_back(viewer_->Name());
    if (viewer_->View().Model() && viewer_->Name() == viewer_->Path())
        for (const std::string& file : TextureFilesOf(viewer_->View().Model())) files.push_back(file);
    watch_.Set(files);
}

// What goes on beside the picture: conversions, loads that end, files that change.
void Window::Poll(double seconds) {
    std::string problem;
    const Conversion::State state = conversion_.Poll(&problem);
    if (state == Conversion::State::kFailed) viewer_->Fail(problem);
    if (state == Conversion::State::kDone)
        keep_ ? viewer_->Reload(conversion_.Output())
              : viewer_->Open(conversion_.Output(), conversion_.Input());
    if (viewer_->Loads() != loads_) {
        loads_ = viewer_->Loads();
        shownPath_ = viewer_->Path();
        settings_.Remember(viewer_->Name());
        SDL_SetWindowTitle(window_, (FileName(viewer_->Name()) + " - qex view").c_str());
        WatchFiles();
    }
    if (Busy() || !watch_.Changed(seconds)) return;
    const SceneOptions options = viewer_->Options();
    SceneOptions without = options;
    without.effects.emitters = {};
    viewer_->SetOptions(without);
    viewer_->SetOptions(options);
    if (shownPath_.empty()) return;
    keep_ = true;
    if (viewer_->Name() == viewer_->Path())
        viewer_->Reload(viewer_->Path());
    else if (!conversion_.Start(viewer_->Name(), &problem))
        viewer_->Say(viewer_->Name() + ": " + problem);
}

void Window::Take(const SDL_Event& event) {
    ImGui_ImplSDL2_ProcessEvent(&event);
    const ImGuiIO& io = ImGui::GetIO();
    ViewerEvent out = {};
    int pointWidth = 1, pointHeight = 1;
    SDL_GetWindowSize(window_, &pointWidth, &pointHeight);
    const float scale = static_cast<float>(width_) / static_cast<float>(std::max(pointWidth, 1));
    out.modifiers = ModifiersOf(SDL_GetModState());
    switch (event.type) {
        case SDL_QUIT: ends_ = true; return;
        case SDL_WINDOWEVENT:
            if (event.window.event != SDL_WINDOWEVENT_SIZE_CHANGED) return;
            SDL_GL_GetDrawableSize(window_, &width_, &height_);
            SDL_GetWindowSize(window_, &settings_.width, &settings_.height);
            out.kind = ViewerEvent::kResize;
            out.x = static_cast<float>(PictureWidth());
            out.y = static_cast<float>(height_);
            break;
        case SDL_DROPFILE: {
            const std::string file = event.drop.file;
            SDL_free(event.drop.file);
            Open(file);
            return;
        }
        case SDL_KEYDOWN:
            if (io.WantTextInput) return;
            if (event.key.keysym.sym == SDLK_PAGEDOWN || event.key.keysym.sym == SDLK_PAGEUP)
                return Page(event.key.keysym.sym == SDLK_PAGEDOWN ? 1 : -1);
            if (event.key.keysym.sym == SDLK_q && out.modifiers & kControl) ends_ = true;
            if (event.key.keysym.sym == SDLK_TAB) settings_.inspector = !settings_.inspector;
            out.kind = ViewerEvent::kKey;
            out.text = NameOf(event.key.keysym);
            if (out.text == "?") out.modifiers = 0;
            break;
        case SDL_MOUSEBUTTONDOWN:
        case SDL_MOUSEBUTTONUP:
            out.kind =
                event.type == SDL_MOUSEBUTTONDOWN ? ViewerEvent::kPointerDown : ViewerEvent::kPointerUp;
            if (out.kind == ViewerEvent::kPointerDown && io.WantCaptureMouse) return;
            out.button = event.button.button;
            out.x = static_cast<float>(event.button.x) * scale;
            out.y = static_cast<float>(event.button.y) * scale;
            break;
        case SDL_MOUSEMOTION:
            out.kind = ViewerEvent::kPointerMove;
            out.x = static_cast<float>(event.motion.x) * scale;
            out.y = static_cast<float>(event.motion.y) * scale;
            break;
        case SDL_MOUSEWHEEL:
            if (io.WantCaptureMouse) return;
            out.kind = ViewerEvent::kWheel;
            out.amount = static_cast<float>(event.wheel.y);
            break;
        case SDL_MULTIGESTURE:
            out.kind = ViewerEvent::kPinch;
            out.amount = 1 + event.mgesture.dDist * 4;
            break;
        default: return;
    }
    viewer_->Handle(out);
}

void Window::ShowMessages(double seconds) {
    const std::vector<std::string>& messages = viewer_->Messages();
    if (viewer_->Said() != said_) sayFor_ = kMessageSeconds;
    said_ = viewer_->Said();
    sayFor_ -= static_cast<float>(seconds);
    const bool help = viewer_->ShowsHelp(), busy = Busy();
    if (!help && !busy && sayFor_ <= 0) return;
    ImGui::SetNextWindowPos({12, 12});
    ImGui::Begin("##messages", nullptr,
                 ImGuiWindowFlags_NoDecoration | ImGuiWindowFlags_AlwaysAutoResize |
                     ImGuiWindowFlags_NoInputs | ImGuiWindowFlags_NoSavedSettings);
    if (busy) ImGui::Text("%s ...", conversion_.AtWork() ? "converting" : "loading");
    if (viewer_->IsLoading()) ImGui::ProgressBar(viewer_->View().Progress(), {200, 0});
    const size_t first = messages.size() > 6 ? messages.size() - 6 : 0;
    for (size_t i = first; sayFor_ > 0 && i < messages.size(); ++i)
        ImGui::TextUnformatted(messages[i].c_str());
    if (help) {
        ImGui::TextUnformatted(Viewer::HelpText().c_str());
        ImGui::TextUnformatted("Tab          inspector\nPage Down    the next file\nCtrl+Q       quit");
    }
    ImGui::End();
}

void Window::Frame(double seconds) {
    Poll(seconds);
    viewer_->Tick(seconds);
    if (width_ < 1 || height_ < 1) return SDL_Delay(50);
    ImGui_ImplSDL2_NewFrame();
    ImGui::NewFrame();
    InspectorWishes wishes;
    if (settings_.inspector) wishes = inspector_->Show(settings_.recent);
    ShowMessages(seconds);
    ImGui::Render();
    if (wishes.screenshot) Screenshot("qex-view.png");
    if (wishes.turntable) Turntable();
    if (wishes.copyLine) SDL_SetClipboardText(Line("picture.png").c_str());
    if (!wishes.open.empty()) Open(wishes.open);
    viewer_->Draw(PictureWidth(), height_);
    draw_->Draw(ImGui::GetDrawData());
    SDL_GL_SwapWindow(window_);
}

std::string Window::Line(const std::string& output) {
    RenderOptions options = viewer_->AsRenderOptions(PictureWidth(), height_);
    options.output = output;
    options.antialias = samples_ > 1 ? 4 : 1;
    std::string line;
    if (viewer_->Name() != viewer_->Path()) {
        options.input = WithoutExtension(FileName(viewer_->Name())) + ".pod";
        line = "qex " + ShellLine({"convert", viewer_->Name(), "-o", options.input}) + " && ";
    }
    return line + "qex " + ShellLine(RenderWords(options));
}

bool Window::Screenshot(const std::string& path) {
    std::string problem;
    const std::vector<uint8_t> pixels = viewer_->Picture(PictureWidth(), height_, samples_);
    const bool saved = SavePicture(path, PictureWidth(), height_, pixels.data(), &problem);
    viewer_->Say(path + (saved ? ": saved" : ": " + problem));
    return saved;
}

void Window::Turntable() {
    for (int i = 0; i < kTurntable; ++i) {
        if (!Screenshot(NumberedOutput("qex-view-turn.png", static_cast<size_t>(i)))) return;
        viewer_->Turn(360.0f / kTurntable);
    }
}

bool Window::SaveWindow(const std::string& path) {
    Frame(0);
    // Drawn once more into the buffer that is read.
    viewer_->Draw(PictureWidth(), height_);
    draw_->Draw(ImGui::GetDrawData());
    const size_t row = static_cast<size_t>(width_) * 4;
    std::vector<uint8_t> pixels(row * static_cast<size_t>(height_)), turned(pixels.size());
    glReadPixels(0, 0, width_, height_, GL_RGBA, GL_UNSIGNED_BYTE, pixels.data());
    for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 255;
    for (size_t y = 0; y < static_cast<size_t>(height_); ++y)
        memcpy(&turned[y * row], &pixels[(static_cast<size_t>(height_) - 1 - y) * row], row);
    std::string problem;
    return SavePicture(path, width_, height_, turned.data(), &problem);
}

// Until nothing is converted or loaded any more.
void Window::Settle() {
    do {
        Frame(1.0 / 60);
        if (conversion_.AtWork()) SDL_Delay(10);
    } while (Busy());
    Frame(0);
}

// "key NAME", "drag X Y X Y", "click X Y", "wheel N", "frames N", "wait SECONDS", "open FILE", "select",
// "size W H", "screenshot FILE", "window FILE", "line OUTPUT", "messages": the last four write to files and
// standard output.
bool Window::RunLine(const std::string& line) {
    std::istringstream words(line);
    std::string verb, text;
    float x = 0, y = 0, toX = 0, toY = 0;
    words >> verb;
    const auto send = [&](ViewerEvent::Kind kind, float atX, float atY) {
        ViewerEvent event = {};
        event.kind = kind;
        event.x = atX;
        event.y = atY;
        event.button = 1;
        viewer_->Handle(event);
    };
    if (verb == "drag" || verb == "click") {
        words >> x >> y;
        if (!(words >> toX >> toY)) toX = x, toY = y;
        send(ViewerEvent::kPointerDown, x, y);
        send(ViewerEvent::kPointerMove, (x + toX) / 2, (y + toY) / 2);
        send(ViewerEvent::kPointerMove, toX, toY);
        send(ViewerEvent::kPointerUp, toX, toY);
    } else if (verb == "key") {
        ViewerEvent event = {};
        event.kind = ViewerEvent::kKey;
        words >> event.text;
        viewer_->Handle(event);
    } else if (verb == "wheel") {
        ViewerEvent event = {};
        event.kind = ViewerEvent::kWheel;
        words >> event.amount;
        viewer_->Handle(event);
    } else if (verb == "frames") {
        words >> x;
        for (int i = 0; i < static_cast<int>(x); ++i) Frame(1.0 / 60);
    } else if (verb == "scrub") {
        words >> x;
        viewer_->Play().Play(false);
        viewer_->Play().Scrub(static_cast<double>(x));
        Frame(0);
    } else if (verb == "wait") {
        words >> x;
        for (int i = 0; i < static_cast<int>(x * 50); ++i) {
            SDL_Delay(20);
            Frame(0.02);
        }
        Settle();
    } else if (verb == "size") {
        words >> x >> y;
        SDL_SetWindowSize(window_, static_cast<int>(x), static_cast<int>(y));
        for (int i = 0; i < 10; ++i) {
            SDL_Event event;
            SDL_Delay(20);
            while (SDL_PollEvent(&event)) Take(event);
        }
    } else if (verb == "select") {
        const QexModel* model = viewer_->View().Model();
        const char* name =
            model ? QexModel_GetNodeName(model, static_cast<uint32_t>(viewer_->Selected())) : nullptr;
        printf("selected %s\n", name ? name : "nothing");
    } else if (verb == "messages") {
        for (const std::string& message : viewer_->Messages()) printf("%s\n", message.c_str());
    } else {
        std::getline(words >> std::ws, text);
        if (verb == "open") {
            Open(text);
            Settle();
        } else if (verb == "line") {
            printf("%s\n", Line(text).c_str());
        } else if (verb == "screenshot") {
            return Screenshot(text);
        } else if (verb == "window") {
            return SaveWindow(text);
        } else {
            return false;
        }
    }
    return true;
}

int Window::RunScript() {
    std::ifstream script(options_.script);
    Settle();
    for (std::string line; std::getline(script, line);)
        if (!line.empty() && !RunLine(line)) return Fail("view", "script: " + line + ": failed", 1);
    return 0;
}

// Presses, drags, turns and resizes at random; whatever comes, the window lives.
int Window::RunRandom() {
    Settle();
    std::mt19937 random(options_.seed);
    const auto below = [&](size_t n) { return static_cast<size_t>(random()) % n; };
    for (unsigned i = 0; i < options_.randomEvents; ++i) {
        ViewerEvent event = {};
        static const ViewerEvent::Kind kKinds[] = {ViewerEvent::kPointerDown, ViewerEvent::kPointerMove,
                                                   ViewerEvent::kPointerUp,   ViewerEvent::kWheel,
                                                   ViewerEvent::kPinch,       ViewerEvent::kKey};
        event.kind = kKinds[below(6)];
        event.x = static_cast<float>(below(3000)) - 500;
        event.y = static_cast<float>(below(2000)) - 500;
        event.button = static_cast<int>(below(4));
        event.amount = static_cast<float>(below(40)) / 4 - 5;
        event.modifiers = static_cast<unsigned>(below(8));
        const Viewer::Key& key = Viewer::Keys()[below(Viewer::Keys().size())];
        if (event.kind == ViewerEvent::kKey) event.modifiers = key.modifiers;
        event.text = key.key;
        viewer_->Handle(event);
        if (i % 50 == 0) viewer_->Draw(static_cast<int>(below(40)), static_cast<int>(below(40)));
        if (i % 25 == 0) Frame(static_cast<double>(below(100)) / 1000);
    }
    return 0;
}

int Window::RunBatch() {
    for (const std::string& file : files_) {
        Open(file);
        Settle();
        for (int i = 0; i < kBatchFrames; ++i) Frame(1.0 / 60);
    }
    for (const std::string& message : viewer_->Messages()) ::Say("view", message);
    return static_cast<int>(std::min<size_t>(viewer_->FailedLoads(), 99));
}

int Window::Run() {
    files_ = options_.files;
    if (options_.batch) return RunBatch();
    if (!files_.empty()) Open(files_[0]);
    if (!options_.script.empty()) return RunScript();
    if (options_.randomEvents) return RunRandom();
    Uint64 last = SDL_GetPerformanceCounter();
    while (!ends_) {
        SDL_Event event;
        while (SDL_PollEvent(&event)) Take(event);
        const Uint64 now = SDL_GetPerformanceCounter();
        Frame(static_cast<double>(now - last) / static_cast<double>(SDL_GetPerformanceFrequency()));
        last = now;
    }
    return 0;
}

}  // namespace

int RunWindow(const ViewOptions& options) {
    Window window(options);
    std::string problem;
    return window.Start(&problem) ? window.Run() : Fail("view", problem, 1);
}
