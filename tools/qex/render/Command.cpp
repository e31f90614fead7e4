// The course of a rendering: context, scene, checks, pictures. Drawing.cpp draws them.
#include "render/Command.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <set>
#include <string>
#include <vector>

#include "common/EngineOutput.h"
#include "common/ImageFile.h"
#include "common/TextureFiles.h"
#include "gltap.h"
#include "render/Diagnosis.h"
#include "render/Renderer.h"
#include "render/Report.h"
#include "render/Textures.h"

namespace {

constexpr int kLarger = 2;      // times as wide and high, so that a pixel has four samples
constexpr int kFineMap = 2048;  // pixels of a shadow map's side

using Clock = std::chrono::steady_clock;

double Milliseconds(Clock::time_point since) {
    return std::chrono::duration<double, std::milli>(Clock::now() - since).count();
}

}  // namespace

Renderer::~Renderer() {
    EngineOutput quiet;
    shaders_.Release();
    floor_.reset();
    sky_.reset();
    emitters_.reset();
    ReleaseNormalMaps();
    if (modelLoaded_) QexModel_Unload(&model_);
    if (engineStarted_ && options_.effects.depthOfField) QexPostProcessing_Finalize();
    if (engineStarted_) QexEngine_Shutdown(&engine_);
}

// Multisampling smooths the edges of what is drawn to the screen. Within shadows and in the targets of
// effects it does not: these are drawn larger, as everything is where the GL has no multisampling.
bool Renderer::CreateContext(std::string* error) {
    const EffectOptions& effects = options_.effects;
    const auto create = [&](int scale, int samples) {
        scale_ = scale;
        context_ = qex::HeadlessContext::Create(options_.width * scale, options_.height * scale, error,
                                                qex::HeadlessGL::kContext, samples);
        return context_ != nullptr;
    };
    if (options_.antialias == 1) return create(1, 1);
    const bool targets = effects.shadow || effects.depthOfField || effects.stereo;
    if (!targets && create(1, options_.antialias) && context_->Samples() >= options_.antialias) return true;
    if (create(kLarger, 1)) return true;
    Warn("no room for antialiasing: " + *error);
    return create(1, 1);
}

bool Renderer::Start() {
    std::string error;
    if (!CreateContext(&error)) {
        Fail(error, 1);
        return false;
    }
    EngineOutput output;
    QexEngineConfig config = {};
    config.width = context_->Width();
    config.height = context_->Height();
    if (options_.effects.shadow && options_.antialias > 1) QexModel_SetShadowMapSize(kFineMap, kFineMap);
    engineStarted_ = QexEngine_Init(&engine_, sizeof config, &config) == 0;
    if (options_.lean) QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    if (options_.effects.depthOfField) QexPostProcessing_Initialize(&engine_);
    return engineStarted_;
}

bool Renderer::Load() {
    // Textures of what comes from standard input lie in the working directory.
    const bool stream = input_.Path() != options_.input;
    const std::string directory = stream ? "" : Directory(options_.input);
    const std::string file = stream ? input_.Path() : FileName(options_.input);
    const std::string problem = WhyNotPod(input_.Path());
    if (!problem.empty()) {
        Fail(input_.Name() + ": " + problem, 1);
        return false;
    }
    const auto start = Clock::now();
    EngineOutput output;
    QexModel_Create(&model_);
    SetTextureHook(&model_, directory, input_.Path(), options_.textures);
    const int32_t result = QexModel_LoadContent(&model_, directory.c_str(), file.c_str());
    modelLoaded_ = true;
    std::vector<std::string> warnings;
    if (result == 0) lit_ = LitMaterials(model_.scene, options_.effects.shader);
    if (result == 0) warnings = CompleteTextures(&model_, lit_);
    if (result == 0 && options_.effects.shader == "normalmap")
        for (const std::string& line : LoadNormalMaps(&model_)) warnings.push_back(line);
    output.Stop();
    loadTime_ = Milliseconds(start);
    // Whatever of a scene that was read had to be put right.
    for (const char* part : {"<QexPODModel_ReadFromSourceStream>", "ERROR:"})
        for (const std::string& line : output.Messages(part))
            if (result == 0) warnings.push_back(line);
    for (const std::string& line : warnings) Warn(line);
    if (result == 0) return true;
    Fail(input_.Name() + ": " + output.FirstError(), 1);
    return false;
}

size_t Renderer::PictureCount() const {
    const auto& frames = options_.frames;
    if (!frames) return static_cast<size_t>(std::max(options_.turn, 1));
    return static_cast<size_t>((frames->last - frames->first) / frames->step + 1e-9) + 1;
}

double Renderer::FrameAt(size_t picture) const {
    const auto& frames = options_.frames;
    return frames ? frames->first + static_cast<double>(picture) * frames->step : options_.frame;
}

bool Renderer::Save(const std::string& path, const std::vector<uint8_t>& pixels) const {
    std::string error;
    if (SavePicture(path, options_.width, options_.height, pixels.data(), &error)) return true;
    Fail(path + ": " + error, 2);
    return false;
}

// Floor, sky and emitters. False, and what is wrong, when one of their files cannot be used.
bool Renderer::LoadSurroundings(std::string* problem) {
    const EffectOptions& effects = options_.effects;
    EngineOutput quiet;
    if (effects.floor) {
        floor_ = std::make_unique<Floor>();
        floor_->Create(points_, *effects.floor, effects.mirror.has_value());
    }
    if (!effects.sky.empty()) {
        SetFrame(FrameAt(0));
        PlaceCamera(0);
        sky_ = std::make_unique<Sky>();
        if (!sky_->Load(effects.sky, camera_, SceneSize(), effects.water, problem)) return false;
    }
    if (effects.emitters.emitters.empty()) return true;
    emitters_ = std::make_unique<Emitters>();
    std::vector<std::string> warnings;
    if (!emitters_->Load(effects.emitters, &warnings, problem)) return false;
    quiet.Stop();
    for (const std::string& line : warnings) Warn(line);
    return true;
}

// What is wrong with the names of the pictures to write; empty when nothing is.
std::string Renderer::WrongOutput() const {
    const std::string problem = WhyNoPictureName(options_.output);
    if (!problem.empty()) return options_.output + ": " + problem;
    if (options_.output == "-" && (options_.frames || options_.turn))
        return "several pictures do not go to standard output; a file name is expected";
    const EffectOptions& effects = options_.effects;
    std::vector<std::string> inputs = {options_.input};
    for (const auto* more : {&effects.sky, &effects.emitters.emitters, &effects.emitters.textures})
        inputs.insert(inputs.end(), more->begin(), more->end());
    for (const auto& [material, file] : options_.textures.overrides) inputs.push_back(file);
    for (uint32_t i = 0; i < model_.scene.textureCount; ++i)
        if (model_.scene.textures[i].name)
            inputs.push_back(FindTexture(Directory(options_.input), model_.scene.textures[i].name).path);
    for (size_t i = 0, count = PictureCount(); i < count; ++i) {
        const std::string path = OutputPath(i), overwrites = WhyNotOutput(path, inputs);
        if (!overwrites.empty()) return path + ": " + overwrites;
    }
    return "";
}

std::string Renderer::OutputPath(size_t index) const {
    return options_.frames || options_.turn ? NumberedOutput(options_.output, index) : options_.output;
}

// What is wrong with options that name parts of the scene; empty when nothing is.
std::string Renderer::CheckOptions() {
    const int camera = options_.camera.value_or(0);
    const uint32_t cameras = model_.scene.cameraCount;
    if (camera > 0 && !options_.autoCamera && static_cast<uint32_t>(camera) >= cameras)
        return "no camera " + std::to_string(camera) + ", the scene has " + std::to_string(cameras);
    std::string problem = CheckTextureChoices(&model_);
    if (problem.empty()) problem = ChangeNodes(&model_, options_.effects.nodes);
    if (!options_.effects.mirrorNode.empty() && problem.empty())
        FindNode(model_, options_.effects.mirrorNode, &problem);
    return problem;
}

void Renderer::WarnOfFrames() const {
    const uint32_t count = model_.scene.frameCount;
    const double last = FrameAt(PictureCount() - 1);
    const char* asked = options_.frames ? "--frames" : "--frame";
    if (count < 2 && (options_.frames || last > 0))
        Warn(std::string(asked) + ": the scene has no animation; every frame is the same");
    else if (count > 1 && last > count - 1)
        Warn(std::string(asked) + ": the last frame is " + std::to_string(count - 1) +
             "; it is shown for those behind it");
}

// Frames the whole scene where its own camera, which nobody asked for, shows nothing at the start, in the
// middle and at the end.
void Renderer::ChooseCamera() {
    if (options_.camera || UsesAutoCamera() || !model_.scene.cameraCount) return;
    const size_t count = PictureCount();
    std::string reason;
    const auto blank = [&](size_t index) {
        EngineOutput quiet;
        DrawNumber(index);
        if (!ShowsOnly(options_.background, Pixels(false))) return false;
        if (reason.empty()) reason = WhyNothingShows(model_, camera_, points_);
        return true;
    };
    for (size_t index : std::set<size_t>{0, count / 2, count - 1})
        if (!blank(index)) return;
    autoCamera_ = true;
    const bool helps = !blank(0);
    autoCamera_ = helps;
    if (helps)
        Warn("the scene's camera shows nothing: " + reason.substr(0, reason.find(';')) +
             "; the automatic camera is used (--camera 0 for the scene's)");
}

int Renderer::Run() {
    if (!Start() || !Load()) return 1;
    std::string problem = WrongOutput();
    if (!problem.empty()) return Fail(problem, 2);
    problem = CheckOptions();
    if (!problem.empty()) return Fail(input_.Name() + ": " + problem, 2);
    if (options_.effects.shader.empty())
        shaders_.UseDefault(&model_, options_.effects.shadow, lit_);
    else
        shaders_.Use(&model_, options_.effects.shader, lit_);
    transparent_.resize(model_.scene.meshNodeCount + size_t{1});
    Frame();
    WarnOfFrames();
    if (!LoadSurroundings(&problem)) return Fail(problem, 1);
    ChooseCamera();
    return DrawAll();
}

// GL calls of the first picture in the other way of drawing, once what it needs is made.
uint64_t Renderer::CallsOfOtherDrawing() {
    EngineOutput quiet;
    const int32_t drawing = QexRenderer_SetDrawing(options_.lean ? QEX_DRAWING_DESCRIBED : QEX_DRAWING_LEAN);
    DrawNumber(0);
    gltapResetCounts();
    DrawNumber(0);
    QexRenderer_SetDrawing(drawing);
    return gltapCountAll();
}

int Renderer::DrawAll() {
    const size_t count = PictureCount();
    size_t blank = 0;
    gltapResetCounts();
    for (size_t i = 0; i < count; ++i) {
        const auto start = Clock::now();
        std::vector<uint8_t> pixels;
        std::string reason;
        {
            EngineOutput quiet;
            if (emitters_ && options_.frames && i > 0)
                emitters_->Run(static_cast<float>(options_.frames->step) /
                               static_cast<float>(std::max(model_.scene.framesPerSecond, 1u)));
            DrawNumber(i);
            pixels = Pixels(false);
            if (ShowsOnly(options_.background, pixels) && blank++ == 0)
                reason = WhyNothingShows(model_, camera_, points_);
            if (!options_.text.empty()) pixels = Pixels(true);
        }
        drawTime_ += Milliseconds(start);
        if (!reason.empty()) Warn(OutputPath(i) + ": nothing of the scene shows: " + reason);
        if (!Save(OutputPath(i), pixels)) return 2;
        PrintPicked(&engine_, &model_, camera_, scale_, options_.effects.picks);
        if (!options_.quiet) ReportProgress(i + 1, count);
    }
    if (blank > 1)
        Warn(std::to_string(blank) + " of " + std::to_string(count) + " pictures show nothing of the scene");
    if (options_.stats) {
        const uint64_t draws = gltapCount("glDrawElements") + gltapCount("glDrawArrays");
        const uint64_t calls = gltapCountAll();
        ReportStats({model_, *context_, count, loadTime_, drawTime_, draws, calls, options_.lean,
                     CallsOfOtherDrawing()});
    }
    return 0;
}

int RunRender(const RenderOptions& options) {
    return Renderer(options).Run();
}
