// SDL2 opens the window, Dear ImGui the panel in it; the loop between them and the viewer.
#include "desktop/Window.h"

#define SDL_MAIN_HANDLED
#include <GLES2/gl2.h>
#include <imgui.h>
#include <imgui_impl_sdl.h>
#include <SDL.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "common/OutputFile.h"
#include "common/Talk.h"
#include "common/TextureFiles.h"
#include "desktop/Keys.h"
#include "emitter/Description.h"
#include "gltap.h"

namespace {

constexpr float kMessageSeconds = 8;

// NAME-0000.png or the first number after it that is not taken.
std::string FreeName(const std::string& path) {
    size_t number = 0;
    while (number < 9999 && IsRegularFile(NumberedOutput(path, number))) ++number;
    return NumberedOutput(path, number);
}

}  // namespace

// What the window does itself; the viewer has the other keys.
struct Window::Key {
    SDL_Keycode code;
    unsigned modifiers;
    const char *label, *help;
    void (*run)(Window*);
};

const std::vector<Window::Key>& Window::Keys() {
    static const std::vector<Key> keys = {
        {SDLK_TAB, 0, "Tab", "inspector",
         [](Window* w) {
             w->settings_.inspector = !w->settings_.inspector;
             w->Resized();
         }},
        {SDLK_PAGEDOWN, 0, "Page Down", "the next file", [](Window* w) { w->Page(1); }},
        {SDLK_PAGEUP, 0, "Page Up", "the file before", [](Window* w) { w->Page(-1); }},
        {SDLK_s, kControl, "Ctrl+S", "screenshot",
         [](Window* w) { w->Screenshot(FreeName("qex-view.png")); }},
        {SDLK_c, kControl, "Ctrl+C", "copy the command that draws this", [](Window* w) { w->CopyLine(); }},
        {SDLK_q, kControl, "Ctrl+Q", "quit", [](Window* w) { w->ends_ = true; }},
    };
    return keys;
}

Window::~Window() {
    std::string ignored;
    if (viewer_ && !options_.IsDriven()) SaveSettings(settings_, SettingsPath(), &ignored);
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
    SDL_GL_SetSwapInterval(options_.IsDriven() ? 0 : 1);
    SDL_GL_GetDrawableSize(window_, &width_, &height_);
    SDL_GetWindowSize(window_, &settings_.width, &settings_.height);
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
    const int panel = Inspector::kWidth * width_ / std::max(settings_.width, 1);
    return settings_.inspector && panel * 2 < width_ ? width_ - panel : width_;
}

// Whether a file is made into a POD file first.
bool Window::IsConverted(const std::string& file) {
    const std::string extension = Extension(file);
    return extension != "pod" && extension != "emitter" && extension != "json" && IsRegularFile(file);
}

void Window::Expect(const std::string& file) {
    std::string problem;
    if (IsConverted(file) && conversion_.Start(file, {}, &problem)) expected_ = file;
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
    keep_ = false;
    const bool begun = file == expected_;
    expected_.clear();
    if (begun) return;
    if (!IsConverted(file)) return viewer_->Open(file);
    if (!conversion_.Start(file, {}, &problem)) viewer_->Say(file + ": " + problem);
}

void Window::Page(int by) {
    const int count = static_cast<int>(files_.size());
    if (count < 2) return;
    page_ = static_cast<size_t>((static_cast<int>(page_) + by + count) % count);
    Open(files_[page_]);
}

void Window::WatchFiles() {
    std::vector<std::string> files = viewer_->Options().effects.emitters.emitters;
    if (!shownPath_.empty()) files.push_back(viewer_->Name());
    if (viewer_->View().Model() && !IsConversionShown())
        for (const std::string& file : TextureFilesOf(viewer_->View().Model())) files.push_back(file);
    watch_.Set(files);
}

// What goes on beside the picture: conversions, loads that end, files that change.
void Window::Poll(double seconds) {
    std::string problem;
    const Conversion::State state = conversion_.Poll(&problem);
    if (state == Conversion::State::kFailed) viewer_->Fail(problem);
    if (state == Conversion::State::kDone) {
        clips_ = conversion_.Clips();
        if (!keep_) clip_.reset();
        keep_ ? viewer_->Reload(conversion_.Output())
              : viewer_->Open(conversion_.Output(), conversion_.Input());
    }
    viewer_->SetWaiting(conversion_.AtWork());
    if (viewer_->Loads() != loads_) {
        loads_ = viewer_->Loads();
        shownPath_ = viewer_->Path();
        settings_.Remember(viewer_->Name());
        SDL_SetWindowTitle(window_, (FileName(viewer_->Name()) + " - qex view").c_str());
        WatchFiles();
    }
    if (!Busy() && watch_.Changed(seconds)) ReloadChanged();
}

void Window::ReloadChanged() {
    const SceneOptions options = viewer_->Options();
    SceneOptions without = options;
    without.effects.emitters = {};
    viewer_->SetOptions(without);
    viewer_->SetOptions(options);
    if (shownPath_.empty()) return;
    if (IsConversionShown()) return ConvertAgain();
    keep_ = true;
    viewer_->Reload(viewer_->Path());
}

bool Window::ChooseClip(size_t clip) {
    if (clip >= clips_.size() || !IsConversionShown()) return false;
    clip_ = clip;
    ConvertAgain();
    return true;
}

// The file that is shown, perhaps with another of its animations.
void Window::ConvertAgain() {
    std::string problem;
    keep_ = true;
    if (!conversion_.Start(viewer_->Name(), clip_, &problem)) viewer_->Say(viewer_->Name() + ": " + problem);
}

// The surface as it is now.
void Window::Resized() {
    SDL_GL_GetDrawableSize(window_, &width_, &height_);
    SDL_GetWindowSize(window_, &settings_.width, &settings_.height);
    ViewerEvent event = {};
    event.kind = ViewerEvent::kResize;
    event.x = static_cast<float>(PictureWidth());
    event.y = static_cast<float>(height_);
    viewer_->Handle(event);
}

void Window::Take(const SDL_Event& event) {
    ImGui_ImplSDL2_ProcessEvent(&event);
    const ImGuiIO& io = ImGui::GetIO();
    if (event.type == SDL_QUIT) ends_ = true;
    if (event.type == SDL_WINDOWEVENT) {
        const Uint8 what = event.window.event;
        if (what == SDL_WINDOWEVENT_MINIMIZED || what == SDL_WINDOWEVENT_HIDDEN) hidden_ = true;
        if (what == SDL_WINDOWEVENT_RESTORED || what == SDL_WINDOWEVENT_SHOWN) hidden_ = false;
        if (what == SDL_WINDOWEVENT_SIZE_CHANGED) Resized();
    }
    if (event.type == SDL_DROPFILE) {
        const std::string file = event.drop.file;
        SDL_free(event.drop.file);
        return Open(file);
    }
    if (event.type == SDL_KEYDOWN) {
        if (io.WantTextInput) return;
        for (const Key& key : Keys())
            if (key.code == event.key.keysym.sym && key.modifiers == HeldModifiers()) return key.run(this);
    }
    const bool pointing = event.type == SDL_MOUSEBUTTONDOWN || event.type == SDL_MOUSEWHEEL;
    if (pointing && io.WantCaptureMouse) return;
    const float points = static_cast<float>(std::max(settings_.width, 1));
    if (const auto translated = TranslateEvent(event, static_cast<float>(width_) / points))
        viewer_->Handle(*translated);
}

void Window::TakeAll() {
    SDL_Event event;
    while (SDL_PollEvent(&event)) Take(event);
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
        for (const Key& key : Keys()) ImGui::Text("%-12s %s", key.label, key.help);
    }
    ImGui::End();
}

void Window::Grant(const InspectorWishes& wishes) {
    if (wishes.screenshot) Screenshot(FreeName("qex-view.png"));
    if (wishes.turntable) Turntable();
    if (wishes.copyLine) CopyLine();
    if (!wishes.open.empty()) Open(wishes.open);
    if (wishes.clip) ChooseClip(*wishes.clip);
}

void Window::Frame(double seconds) {
    Poll(seconds);
    viewer_->Tick(seconds);
    if (hidden_ || width_ < 1 || height_ < 1) return SDL_Delay(options_.IsDriven() ? 0 : 50);
    ImGui_ImplSDL2_NewFrame();
    ImGui::NewFrame();
    const std::vector<std::string> none;
    InspectorWishes wishes;
    if (settings_.inspector)
        wishes = inspector_->Show(settings_.recent, IsConversionShown() ? clips_ : none, clip_.value_or(0));
    ShowMessages(seconds);
    ImGui::Render();
    Grant(wishes);
    viewer_->Draw(PictureWidth(), height_);
    draw_->Draw(ImGui::GetDrawData());
    SDL_GL_SwapWindow(window_);
}

void Window::Run() {
    Uint64 last = SDL_GetPerformanceCounter();
    while (!ends_) {
        TakeAll();
        const Uint64 now = SDL_GetPerformanceCounter();
        Frame(static_cast<double>(now - last) / static_cast<double>(SDL_GetPerformanceFrequency()));
        last = now;
    }
}

void Window::Settle() {
    do {
        Frame(1.0 / 60);
        if (conversion_.AtWork()) SDL_Delay(5);
    } while (Busy());
    Frame(0);
}
