// What qex render is at work with.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "common/CommandLine.h"
#include "common/OutputFile.h"
#include "Headless.h"
#include "render/Command.h"
#include "scene/SceneView.h"

// Everything that lives while pictures are drawn.
class Renderer {
  public:
    explicit Renderer(const RenderOptions& options) : options_(options), input_(options.input) {}
    ~Renderer();

    int Run();

  private:
    bool Start();
    bool CreateContext(std::string* error);
    bool Load();
    std::string WrongOutput() const;
    std::string OutputPath(size_t index) const;
    size_t PictureCount() const;
    double FrameAt(size_t picture) const;
    void WarnOfFrames() const;
    std::string CheckOptions() const;
    std::vector<double> Frames() const;
    void ChooseCamera();
    int DrawAll();
    bool Save(const std::string& path, const std::vector<uint8_t>& pixels) const;

    // In Drawing.cpp.
    void DrawNumber(size_t index);
    uint64_t CallsOfOtherDrawing();
    void DrawText();
    std::vector<uint8_t> Pixels(bool text);
    void PrintPicked();

    void Warn(const std::string& text) const { Say("render", "warning: " + text); }
    int Fail(const std::string& text, int status) const { return ::Fail("render", text, status); }

    const RenderOptions& options_;
    const InputFile input_;
    int scale_ = 1;  // of the drawing to the picture, along each side
    std::unique_ptr<qex::HeadlessContext> context_;
    QexRuntimeContext engine_ = {};
    bool engineStarted_ = false;
    std::unique_ptr<SceneView> view_;
    std::string unusable_;  // what is wrong with files around the scene
    double loadTime_ = 0;
    double drawTime_ = 0;
};
