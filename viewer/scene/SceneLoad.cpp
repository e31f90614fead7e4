// What a scene is shown with: its model, loaded in parts, the changes that options make, and what is around
// it.
#include <algorithm>

#include "common/EngineOutput.h"
#include "scene/SceneView.h"

SceneView::SceneView(QexRuntimeContext* engine, EmitterLoader loadEmitter)
    : engine_(engine), loadEmitter_(loadEmitter) {}

SceneView::~SceneView() {
    EngineOutput quiet;
    Unload();
    GiveUpLoad();
    shaders_.Release();
    if (depthOfField_) QexPostProcessing_Finalize();
}

void SceneView::GiveUpLoad() {
    if (!loading_) return;
    ForgetTextures(loading_.get());
    QexModel_Unload(loading_.get());
    loading_.reset();
}

void SceneView::Unload() {
    EngineOutput quiet;
    floor_.reset();
    sky_.reset();
    emitters_.reset();
    points_.clear();
    size_ = 1;
    transparentCount_ = 0;
    if (!model_) return;
    ForgetTextures(model_.get());
    QexModel_Unload(model_.get());
    model_.reset();
}

bool SceneView::BeginLoad(const std::string& directory, const std::string& file, const std::string& path,
                          std::string* problem) {
    EngineOutput output;
    GiveUpLoad();
    loadLines_.clear();
    progress_ = 0;
    loading_ = std::make_unique<QexModel>();
    QexModel_Create(loading_.get());
    SetTextureHook(loading_.get(), directory, path, options_.textures);
    if (QexModel_BeginLoad(loading_.get(), directory.c_str(), file.c_str()) == 0) return true;
    *problem = output.FirstError();
    GiveUpLoad();
    return false;
}

SceneView::LoadState SceneView::ContinueLoad(float milliseconds, std::vector<std::string>* warnings,
                                             std::string* problem) {
    if (!loading_) return LoadState::kNone;
    EngineOutput output;
    const int32_t result = QexModel_ContinueLoad(loading_.get(), milliseconds, &progress_);
    // Whatever of a scene that was read had to be put right.
    for (const char* part : {"<QexPODModel_ReadFromSourceStream>", "ERROR:"})
        for (const std::string& line : output.Messages(part)) loadLines_.push_back(line);
    if (result == 1) return LoadState::kGoesOn;
    if (result != 0) {
        *problem = output.FirstError();
        GiveUpLoad();
        return LoadState::kFailed;
    }
    Adopt(warnings);
    *problem = Apply(warnings);
    return LoadState::kDone;
}

// The loaded model takes the place of the one before.
void SceneView::Adopt(std::vector<std::string>* warnings) {
    Unload();
    model_ = std::move(loading_);
    const QexPODModel& scene = model_->scene;
    lit_ = LitMaterials(*model_, options_.effects);
    for (const std::string& line : CompleteTextures(model_.get(), lit_)) warnings->push_back(line);
    warnings->insert(warnings->end(), loadLines_.begin(), loadLines_.end());
    materials_.assign(scene.materials, scene.materials + scene.materialCount);
    nodes_.assign(scene.nodes, scene.nodes + scene.nodeCount);
    transparent_.assign(scene.meshNodeCount + size_t{1}, {});
    coloured_.clear();
    normalMaps_ = false;
    autoCamera = false;
}

// Undoes what options have changed.
void SceneView::Restore() {
    QexPODModel& scene = model_->scene;
    for (uint32_t i = 0; i < scene.materialCount; ++i) scene.materials[i] = materials_[i];
    for (uint32_t i = 0; i < scene.nodeCount; ++i) {
        QexModel_ResetNodeTransform(model_.get(), i);
        scene.nodes[i].shader = nodes_[i].shader;
        scene.nodes[i].stateFlags = nodes_[i].stateFlags;
    }
}

std::string SceneView::Apply(std::vector<std::string>* warnings) {
    const EffectOptions& effects = options_.effects;
    EngineOutput quiet;
    Restore();
    const bool normalMaps =
        effects.shader == "normalmap" || std::any_of(effects.nodes.begin(), effects.nodes.end(),
                                                     [](const auto& c) { return c.shader == "normalmap"; });
    if (normalMaps && !normalMaps_) {
        for (const std::string& line : LoadNormalMaps(model_.get())) warnings->push_back(line);
        normalMaps_ = true;
    }
    std::string problem = ChangeMaterials(model_.get(), effects.materials);
    const QexPODMaterial* materials = model_->scene.materials;
    changed_.assign(materials, materials + model_->scene.materialCount);
    const std::vector<bool> lit = LitMaterials(*model_, effects);
    if (lit != lit_ || effects.materials != coloured_) RecolourTextures(model_.get(), lit);
    lit_ = lit;
    coloured_ = effects.materials;
    SetFrame(frame_);
    const std::string wrongNode = ChangeNodes(model_.get(), effects.nodes);
    if (problem.empty()) problem = wrongNode;
    if (!effects.mirrorNode.empty() && problem.empty()) FindNode(*model_, effects.mirrorNode, &problem);
    if (effects.shader.empty())
        shaders_.UseDefault(model_.get(), effects.shadow, lit_);
    else
        shaders_.Use(model_.get(), effects.shader, lit_);
    shaders_.Use(model_.get(), effects.nodes);
    FitTo(frames_);
    const std::string fault = Refit(warnings);
    return problem.empty() ? fault : problem;
}

std::string SceneView::Refit(std::vector<std::string>* warnings) {
    floor_.reset();
    sky_.reset();
    if (!model_) return "";
    const EffectOptions& effects = options_.effects;
    std::string problem;
    EngineOutput quiet;
    if (effects.floor) {
        floor_ = std::make_unique<Floor>();
        floor_->Create(points_, *effects.floor, effects.mirror.has_value());
    }
    if (!effects.sky.empty()) {
        const double shown = frame_;
        SetFrame(frames_[0]);
        PlaceCamera(0);
        SetFrame(shown);
        sky_ = std::make_unique<Sky>();
        if (!sky_->Load(effects.sky, camera_, Size(), effects.water, &problem)) sky_.reset();
        if (!sky_) return problem;
    }
    if (effects.emitters.emitters.empty()) emitters_.reset();
    if (effects.emitters.emitters.empty() || (emitters_ && effects.emitters == loadedEmitters_)) return "";
    emitters_ = std::make_unique<Emitters>();
    loadedEmitters_ = effects.emitters;
    if (!emitters_->Load(effects.emitters, loadEmitter_, warnings, &problem)) emitters_.reset();
    return problem;
}

std::string SceneView::SetOptions(const SceneOptions& options, std::vector<std::string>* warnings) {
    const SceneOptions before = options_;
    options_ = options;
    EngineOutput quiet;
    QexRenderer_SetDrawing(options.lean ? QEX_DRAWING_LEAN : QEX_DRAWING_DESCRIBED);
    const bool depthOfField = options.effects.depthOfField.has_value();
    if (depthOfField != depthOfField_)
        depthOfField ? QexPostProcessing_Initialize(engine_) : QexPostProcessing_Finalize();
    depthOfField_ = depthOfField;
    if (options.effects.stereo != before.effects.stereo && !options.effects.stereo)
        QexRenderer_DisableStereo3D(engine_);
    if (!model_) return "";
    const EffectOptions &a = before.effects, &b = options.effects;
    const bool same = a.shader == b.shader && a.nodes == b.nodes && a.materials == b.materials &&
                      a.shadow == b.shadow && a.mirror == b.mirror && a.floor == b.floor &&
                      a.mirrorNode == b.mirrorNode && a.sky == b.sky && a.water == b.water &&
                      a.emitters == b.emitters;
    return same ? "" : Apply(warnings);
}
