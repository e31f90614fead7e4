// What the window writes: screenshots, turns, and the commands that draw them.
#define SDL_MAIN_HANDLED
#include <GLES2/gl2.h>
#include <imgui.h>
#include <SDL.h>

#include <cstring>
#include <filesystem>

#include "common/ImageFile.h"
#include "common/OutputFile.h"
#include "common/TextureFiles.h"
#include "desktop/Child.h"
#include "desktop/Window.h"

namespace {

constexpr int kTurntable = 36;  // pictures of a turn

}  // namespace

std::string Window::Line(const std::string& output) const {
    RenderOptions options = viewer_->AsRenderOptions(PictureWidth(), height_);
    options.output = output;
    std::string line;
    if (IsConversionShown()) {
        options.input = WithoutExtension(FileName(viewer_->Name())) + ".pod";
        std::vector<std::string> words = {"convert", viewer_->Name(), "-o", options.input};
        if (clip_) words.push_back("--clip=" + std::to_string(*clip_));
        line = "qex " + ShellLine(words) + " && ";
    }
    return line + "qex " + ShellLine(RenderWords(options));
}

void Window::CopyLine() {
    if (!viewer_->View().Model()) return viewer_->Say("there is no scene to draw");
    const bool copied = SDL_SetClipboardText(Line("picture.png").c_str()) == 0;
    viewer_->Say(copied ? "copied: a command that draws this" : SDL_GetError());
    SayWhatIsLeftOut();
}

void Window::SayWhatIsLeftOut() {
    const std::string text = inspector_->LeftOut();
    if (!text.empty()) viewer_->Say(text);
}

// qex render draws it: samples and rounding of a window's surface are not those of one without a window.
bool Window::Screenshot(const std::string& path) {
    if (!viewer_->View().Model()) return SaveFront(path);
    RenderOptions options = viewer_->AsRenderOptions(PictureWidth(), height_);
    options.input = std::filesystem::absolute(viewer_->Path()).string();
    options.output = path;
    options.quiet = true;
    const std::string problem = RunQex(RenderWords(options));
    viewer_->Say(path + (problem.empty() ? ": saved" : ": " + problem));
    SayWhatIsLeftOut();
    return problem.empty();
}

// As the window has it.
bool Window::SaveFront(const std::string& path) {
    std::string problem;
    const std::vector<uint8_t> pixels = viewer_->Picture(PictureWidth(), height_, samples_);
    const bool saved = SavePicture(path, PictureWidth(), height_, pixels.data(), &problem);
    viewer_->Say(path + (saved ? ": saved" : ": " + problem));
    return saved;
}

void Window::Turntable() {
    for (int i = 0; i < kTurntable; ++i) {
        if (!SaveFront(NumberedOutput("qex-view-turn.png", static_cast<size_t>(i)))) return;
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
