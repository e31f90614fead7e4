// A scene as it is shown: a model, what is around it, and how both are drawn into the framebuffer that is
// bound. Everything can be changed between two drawings. Needs a current GL context and an engine that is
// started.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "Qex.h"
#include "scene/Floor.h"
#include "scene/Options.h"
#include "scene/Shading.h"
#include "scene/Sky.h"

class SceneView {
  public:
    explicit SceneView(QexRuntimeContext* engine, EmitterLoader loadEmitter = LoadEmitterFile);
    ~SceneView();
    SceneView(const SceneView&) = delete;
    SceneView& operator=(const SceneView&) = delete;

    // Begins to load a scene; the one that is shown stays until the other is there. `path` is the same file,
    // for what exporters write before the scene. False, and what is wrong, when it cannot begin.
    bool BeginLoad(const std::string& directory, const std::string& file, const std::string& path,
                   std::string* problem);
    enum class LoadState { kNone, kGoesOn, kDone, kFailed };
    // Goes on for about so long. Once it is done the scene is shown with the options as they are, and
    // `warnings` gets a line for what could not be used; when it fails `problem` says why.
    LoadState ContinueLoad(float milliseconds, std::vector<std::string>* warnings, std::string* problem);
    bool IsLoading() const { return loading_ != nullptr; }
    float Progress() const { return progress_; }
    void Unload();

    // Shows the scene in another way from the next drawing on. What is wrong with options that name parts of
    // the scene or files; these are left out then, all else is as it was asked for.
    std::string SetOptions(const SceneOptions& options, std::vector<std::string>* warnings);
    const SceneOptions& Options() const { return options_; }

    // What the automatic camera, the floor and the sky are made for: the scene at these frames.
    void FitTo(const std::vector<double>& frames);
    // Makes them for the scene as it is. Returns as SetOptions.
    std::string Refit(std::vector<std::string>* warnings);

    void SetFrame(double frame);
    double Frame() const { return frame_; }
    // The surface, of which `scale` x `scale` pixels are one of the picture.
    void SetScale(int scale) { scale_ = scale; }
    // Clears and draws, the camera `turned` degrees about the scene.
    void Draw(float turned = 0);
    // Puts the camera where Draw does.
    void PlaceCamera(float turned);
    void Clear(uint32_t colour);

    // The mesh nodes whose boxes are under a pixel of the last picture.
    std::vector<uint32_t> Pick(float x, float y);
    // A material as the file has it and as it was changed, without what a way of shading makes of it.
    const QexPODMaterial& MaterialOf(uint32_t index) const { return changed_[index]; }

    QexModel* Model() { return model_.get(); }
    const QexModel* Model() const { return model_.get(); }
    const QexCamera& Camera() const { return camera_; }
    const std::vector<QexVec3>& Points() const { return points_; }
    float Size() const { return size_; }  // the points' longest edge
    Emitters* Particles() { return emitters_.get(); }
    QexRuntimeContext* Engine() { return engine_; }
    bool UsesAutoCamera() const { return autoCamera || options_.autoCamera; }

    bool autoCamera = false;  // as the scene's own shows nothing

  private:
    void GiveUpLoad();
    void Adopt(std::vector<std::string>* warnings);
    void Restore();
    std::string Apply(std::vector<std::string>* warnings);
    void DrawScene(const QexCamera& camera);
    void DrawOpaque(const QexCamera& camera);
    void DrawBlended(const QexCamera& camera);
    void DrawDepth(QexShaderModule* module, QexShaderModule* skinned);
    void DrawBothEyes();

    QexRuntimeContext* const engine_;
    const EmitterLoader loadEmitter_;
    SceneOptions options_;
    std::unique_ptr<QexModel> model_, loading_;
    std::vector<std::string> loadLines_;  // the engine's, about the load
    float progress_ = 0;
    // As they were before options changed them.
    std::vector<QexPODMaterial> materials_, changed_;  // and as changes left them
    std::vector<QexPODNode> nodes_;
    std::vector<bool> lit_;                 // materials
    std::vector<MaterialChange> coloured_;  // that textures show
    SceneShaders shaders_;
    std::unique_ptr<Floor> floor_;
    std::unique_ptr<Sky> sky_;
    std::unique_ptr<Emitters> emitters_;
    EmitterScene loadedEmitters_;
    bool depthOfField_ = false, normalMaps_ = false;
    QexCamera camera_ = {};
    double frame_ = 0;
    int scale_ = 1;
    std::vector<double> frames_ = {0};
    std::vector<QexVec3> points_;  // that the automatic camera frames
    float size_ = 1;
    std::vector<TransparentSPODNodeInfo> transparent_;
    uint32_t transparentCount_ = 0;
};
