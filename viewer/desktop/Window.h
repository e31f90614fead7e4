// The desktop window of the viewer: the picture, the panel beside it, and what goes on while they are shown.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "desktop/Conversion.h"
#include "desktop/GuiDraw.h"
#include "desktop/Inspector.h"
#include "desktop/Settings.h"
#include "desktop/View.h"
#include "desktop/Watch.h"

union SDL_Event;
struct SDL_Window;

class Window {
  public:
    explicit Window(const ViewOptions& options) : options_(options), files_(options.files) {}
    ~Window();
    Window(const Window&) = delete;
    Window& operator=(const Window&) = delete;

    // A file that will be opened: if it is to be converted, that begins before there is a window.
    void Expect(const std::string& file);
    // False, and why, when there is no display or no OpenGL ES 2.0.
    bool Start(std::string* problem);
    // Until it is closed.
    void Run();

    void Open(const std::string& file);
    // Another animation of the file that is shown; false when it has no such one.
    bool ChooseClip(size_t clip);
    void Take(const SDL_Event& event);
    void TakeAll();  // that wait
    void Frame(double seconds);
    // Frames until nothing is converted or loaded any more.
    void Settle();

    bool Screenshot(const std::string& path);
    void Turntable();
    bool SaveFront(const std::string& path);
    bool SaveWindow(const std::string& path);  // with the panel
    // The command that draws the picture into a file.
    std::string Line(const std::string& output) const;

    Viewer& Front() { return *viewer_; }
    SDL_Window* Handle() { return window_; }

  private:
    bool OpenContext(int samples);
    int PictureWidth() const;
    static bool IsConverted(const std::string& file);
    void Page(int by);
    void Resized();
    void Poll(double seconds);
    void ReloadChanged();
    void ConvertAgain();
    bool IsConversionShown() const { return viewer_->Name() != viewer_->Path(); }
    void ShowMessages(double seconds);
    void Grant(const InspectorWishes& wishes);
    void CopyLine();
    void SayWhatIsLeftOut();
    void WatchFiles();
    bool Busy() const { return conversion_.AtWork() || viewer_->IsLoading(); }

    struct Key;
    static const std::vector<Key>& Keys();

    const ViewOptions options_;
    SDL_Window* window_ = nullptr;
    void* context_ = nullptr;
    bool gui_ = false, ends_ = false, keep_ = false, hidden_ = false;
    int width_ = 0, height_ = 0, samples_ = 0;
    Settings settings_;
    std::unique_ptr<Viewer> viewer_;
    std::unique_ptr<GuiDraw> draw_;
    std::unique_ptr<Inspector> inspector_;
    Conversion conversion_;
    Watch watch_;
    std::string shownPath_, expected_;
    // Of what is converted: its animations, and the one that was chosen.
    std::vector<std::string> clips_;
    std::optional<size_t> clip_;
    std::vector<std::string> files_;
    size_t page_ = 0, said_ = 0, loads_ = 0;
    float sayFor_ = 0;
};
