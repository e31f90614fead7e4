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
#include "render/Floor.h"
#include "render/Shading.h"
#include "render/Sky.h"

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
    std::string CheckOptions();
    size_t PictureCount() const;
    double FrameAt(size_t picture) const;
    void WarnOfFrames() const;
    bool LoadSurroundings(std::string* problem);
    void ChooseCamera();
    int DrawAll();
    bool Save(const std::string& path, const std::vector<uint8_t>& pixels) const;

    // In Drawing.cpp.
    void SetFrame(double frame);
    void Frame();
    float SceneSize() const;
    void PlaceCamera(float turned);
    void DrawNumber(size_t index);
    void Draw(double frame, float turned);
    void Clear(uint32_t colour);
    void DrawScene(const QexCamera& camera);
    void DrawOpaque(const QexCamera& camera);
    void DrawBlended(const QexCamera& camera);
    void DrawDepth(QexShaderModule* module, QexShaderModule* skinned);
    void DrawBothEyes();
    uint64_t CallsOfOtherDrawing();
    void DrawText();
    std::vector<uint8_t> Pixels(bool text);
    bool UsesAutoCamera() const { return autoCamera_ || options_.autoCamera || options_.turn; }

    void Warn(const std::string& text) const { Say("render", "warning: " + text); }
    int Fail(const std::string& text, int status) const { return ::Fail("render", text, status); }

    const RenderOptions& options_;
    const InputFile input_;
    int scale_ = 1;            // of the drawing to the picture, along each side
    bool autoCamera_ = false;  // as the scene's own shows nothing
    std::unique_ptr<qex::HeadlessContext> context_;
    QexRuntimeContext engine_ = {};
    QexModel model_ = {};
    bool engineStarted_ = false;
    bool modelLoaded_ = false;
    QexCamera camera_ = {};
    std::vector<bool> lit_;  // materials
    SceneShaders shaders_;
    std::unique_ptr<Floor> floor_;
    std::unique_ptr<Sky> sky_;
    std::unique_ptr<Emitters> emitters_;
    std::vector<QexVec3> points_;  // that the automatic camera frames
    std::vector<TransparentSPODNodeInfo> transparent_;
    uint32_t transparentCount_ = 0;
    double loadTime_ = 0;
    double drawTime_ = 0;
};
