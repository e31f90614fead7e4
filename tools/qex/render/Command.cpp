// The course of a rendering: context, scene, checks, pictures. Drawing.cpp draws them.
#include "render/Command.h"

#include <algorithm>
#include <cfloat>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <set>
#include <string>
#include <vector>

#include "common/EngineOutput.h"
#include "common/ImageFile.h"
#include "common/TextureFiles.h"
#include "emitter/Description.h"
#include "gltap.h"
#include "render/Diagnosis.h"
#include "render/Renderer.h"
#include "render/Report.h"

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
    view_.reset();
    if (engineStarted_) QexEngine_Shutdown(&engine_);
}

// Everything is drawn larger, too, where the GL has no multisampling.
bool Renderer::CreateContext(std::string* error) {
    const auto create = [&](int scale, int samples) {
        scale_ = scale;
        context_ = qex::HeadlessContext::Create(options_.width * scale, options_.height * scale, error,
                                                qex::HeadlessGL::kContext, samples);
        return context_ != nullptr;
    };
    if (options_.antialias == 1) return create(1, 1);
    if (!NeedsLargerDrawing(options_.effects) && create(1, options_.antialias) &&
        context_->Samples() >= options_.antialias)
        return true;
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
    if (!engineStarted_) return false;
    view_ = std::make_unique<SceneView>(&engine_, LoadEmitter);
    view_->SetScale(scale_);
    std::vector<std::string> warnings;
    SceneOptions options = options_;
    options.autoCamera |= options_.turn != 0;
    view_->SetOptions(options, &warnings);
    return true;
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
    view_->FitTo(Frames());
    std::vector<std::string> warnings;
    std::string failure;
    using State = SceneView::LoadState;
    State state =
        view_->BeginLoad(directory, file, input_.Path(), &failure) ? State::kGoesOn : State::kFailed;
    while (state == State::kGoesOn) state = view_->ContinueLoad(FLT_MAX, &warnings, &failure);
    unusable_ = failure;
    loadTime_ = Milliseconds(start);
    if (state == State::kDone)
        for (const std::string& line : warnings) Warn(line);
    if (state == State::kDone) return true;
    Fail(input_.Name() + ": " + failure, 1);
    return false;
}

std::vector<double> Renderer::Frames() const {
    std::vector<double> frames = {FrameAt(0)};
    for (size_t i = 1; options_.frames && i < PictureCount(); ++i) frames.push_back(FrameAt(i));
    return frames;
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
    for (uint32_t i = 0; i < view_->Model()->scene.textureCount; ++i)
        if (view_->Model()->scene.textures[i].name)
            inputs.push_back(
                FindTexture(Directory(options_.input), view_->Model()->scene.textures[i].name).path);
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
std::string Renderer::CheckOptions() const {
    const QexModel& model = *view_->Model();
    const int camera = options_.camera.value_or(0);
    const uint32_t cameras = model.scene.cameraCount;
    if (camera > 0 && !options_.autoCamera && static_cast<uint32_t>(camera) >= cameras)
        return "no camera " + std::to_string(camera) + ", the scene has " + std::to_string(cameras);
    std::string problem = CheckTextureChoices(&model);
    for (const NodeChange& change : options_.effects.nodes)
        if (problem.empty()) FindNode(model, change.node, &problem);
    for (const MaterialChange& change : options_.effects.materials)
        if (problem.empty()) FindMaterial(model, change.material, &problem);
    if (!options_.effects.mirrorNode.empty() && problem.empty())
        FindNode(model, options_.effects.mirrorNode, &problem);
    return problem;
}

void Renderer::WarnOfFrames() const {
    const uint32_t count = view_->Model()->scene.frameCount;
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
    if (options_.camera || options_.look || view_->UsesAutoCamera() || !view_->Model()->scene.cameraCount)
        return;
    const size_t count = PictureCount();
    std::string reason;
    const auto blank = [&](size_t index) {
        EngineOutput quiet;
        DrawNumber(index);
        if (!ShowsOnly(options_.background, Pixels(false))) return false;
        if (reason.empty()) reason = WhyNothingShows(*view_->Model(), view_->Camera(), view_->Points());
        return true;
    };
    for (size_t index : std::set<size_t>{0, count / 2, count - 1})
        if (!blank(index)) return;
    view_->autoCamera = true;
    const bool helps = !blank(0);
    view_->autoCamera = helps;
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
    WarnOfFrames();
    if (!unusable_.empty()) return Fail(unusable_, 1);
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
            if (view_->Particles() && options_.frames && i > 0)
                view_->Particles()->Run(
                    static_cast<float>(options_.frames->step) /
                    static_cast<float>(std::max(view_->Model()->scene.framesPerSecond, 1u)));
            DrawNumber(i);
            pixels = Pixels(false);
            if (ShowsOnly(options_.background, pixels) && blank++ == 0)
                reason = WhyNothingShows(*view_->Model(), view_->Camera(), view_->Points());
            if (!options_.text.empty()) pixels = Pixels(true);
        }
        drawTime_ += Milliseconds(start);
        if (!reason.empty()) Warn(OutputPath(i) + ": nothing of the scene shows: " + reason);
        if (!Save(OutputPath(i), pixels)) return 2;
        PrintPicked();
        if (!options_.quiet) ReportProgress(i + 1, count);
    }
    if (blank > 1)
        Warn(std::to_string(blank) + " of " + std::to_string(count) + " pictures show nothing of the scene");
    if (options_.stats) {
        const uint64_t draws = gltapCount("glDrawElements") + gltapCount("glDrawArrays");
        const uint64_t calls = gltapCountAll();
        ReportStats({*view_->Model(), *context_, count, loadTime_, drawTime_, draws, calls, options_.lean,
                     CallsOfOtherDrawing()});
    }
    return 0;
}

// Prints the mesh nodes under each point, one line a point.
void Renderer::PrintPicked() {
    for (const QexVec2& point : options_.effects.picks) {
        printf("%g,%g:", static_cast<double>(point.x), static_cast<double>(point.y));
        for (const uint32_t node : view_->Pick(point.x, point.y)) {
            const char* name = QexModel_GetNodeName(view_->Model(), node);
            printf(" %s", name ? name : "(no name)");
        }
        printf("\n");
    }
}

int RunRender(const RenderOptions& options) {
    return Renderer(options).Run();
}
