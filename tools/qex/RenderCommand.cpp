#include "RenderCommand.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include <GLES2/gl2.h>

#include "EngineOutput.h"
#include "gltap.h"
#include "Headless.h"
#include "ImageFile.h"
#include "OutputFile.h"
#include "RenderDiagnosis.h"
#include "RenderFloor.h"
#include "RenderReport.h"
#include "RenderShading.h"
#include "RenderSky.h"
#include "RenderTextures.h"
#include "SceneBounds.h"
#include "TextureFiles.h"
#include "TextureOverrides.h"

namespace {

constexpr int kLarger = 2;                 // times as wide and high, so that a pixel has four samples
constexpr int kFineMap = 2048;             // pixels of a shadow map's side
constexpr size_t kFramingPoints = 200000;  // of each mesh node over all frames, about

using Clock = std::chrono::steady_clock;

double Milliseconds(Clock::time_point since) {
    return std::chrono::duration<double, std::milli>(Clock::now() - since).count();
}

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
    int DrawAll();
    std::string CheckOptions();
    void Frame();
    void ChooseCamera();
    void WarnOfFrames() const;
    float SceneSize() const;
    void PlaceCamera(float turned);
    void Draw(double frame, float turned);
    void DrawNumber(size_t index);
    std::vector<uint8_t> Pixels(bool text);
    void Clear(uint32_t colour);
    void DrawScene(const QexCamera& camera);
    void DrawOpaque(const QexCamera& camera);
    void DrawBlended(const QexCamera& camera);
    bool LoadSurroundings(std::string* problem);
    void DrawDepth(QexShaderModule* module, QexShaderModule* skinned);
    void DrawBothEyes();
    std::string WrongOutput() const;
    std::string OutputPath(size_t index) const;
    bool Save(const std::string& path, const std::vector<uint8_t>& pixels) const;
    void SetFrame(double frame);
    void DrawText();
    std::vector<double> Frames() const;
    bool UsesAutoCamera() const { return autoCamera_ || options_.autoCamera || options_.turn; }

    void Warn(const std::string& text) const { fprintf(stderr, "qex render: warning: %s\n", text.c_str()); }
    int Fail(const std::string& text, int status) const {
        fprintf(stderr, "qex render: %s\n", text.c_str());
        return status;
    }

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
    SetTextureHook(&model_, options_.input, options_.textures);
    const int32_t result = QexModel_LoadContent(&model_, directory.c_str(), file.c_str());
    modelLoaded_ = true;
    std::vector<std::string> warnings;
    if (result == 0) lit_ = LitMaterials(model_.scene, options_.effects.shader);
    if (result == 0) warnings = CompleteTextures(&model_, lit_);
    if (result == 0 && options_.effects.shader == "normalmap")
        for (const std::string& line : LoadNormalMaps(&model_)) warnings.push_back(line);
    output.Stop();
    loadTime_ = Milliseconds(start);
    for (const std::string& line : output.Messages("stands still")) warnings.push_back(line);
    for (const std::string& line : output.Messages("ERROR:")) warnings.push_back(line);
    for (const std::string& line : warnings) Warn(line);
    if (result == 0) return true;
    Fail(input_.Name() + ": " + output.FirstError(), 1);
    return false;
}

std::vector<double> Renderer::Frames() const {
    std::vector<double> frames;
    if (!options_.sequence)
        return std::vector<double>(static_cast<size_t>(std::max(options_.turn, 1)), options_.frame);
    const double count = std::floor((options_.last - options_.first) / options_.step + 1e-9) + 1;
    for (double i = 0; i < count; ++i) frames.push_back(options_.first + i * options_.step);
    return frames;
}

// The engine plays a loop, in which the last frame is the first again. A picture of the last frame shows its
// own keys.
void Renderer::SetFrame(double frame) {
    QexPODModel& scene = model_.scene;
    const float f = static_cast<float>(frame);
    QexPODModel_SetFrame(&scene, f);
    if (scene.frameCount < 2 || f != static_cast<float>(scene.frameCount - 1)) return;
    for (uint32_t i = 0; i < scene.nodeCount; ++i) QexPODModel_SetNodeAnimationFrame(&scene, i, f);
}

// Collects what the automatic camera has to show, over all frames, with its mirror image.
void Renderer::Frame() {
    std::vector<double> frames = Frames();
    frames.erase(std::unique(frames.begin(), frames.end()), frames.end());
    const size_t share = std::max<size_t>(1000, kFramingPoints / frames.size());
    for (double frame : frames) {
        SetFrame(frame);
        for (uint32_t i = 0; i < model_.scene.meshNodeCount; ++i)
            CollectPoints(&model_.scene, i, share, &points_);
    }
    const std::optional<float> mirror =
        options_.effects.mirror ? options_.effects.mirror : options_.effects.water;
    if (!mirror) return;
    for (size_t i = 0, seen = points_.size(); i < seen; ++i) {
        const QexVec3 p = points_[i];
        points_.push_back({p.x, 2 * *mirror - p.y, p.z});
    }
}

float Renderer::SceneSize() const {
    const Bounds bounds = BoundsOf(points_);
    const float edge = bounds.empty ? 0 : bounds.LongestEdge();
    return edge > 0 ? edge : 1;
}

void Renderer::DrawText() {
    // The first line: its glyphs touch the upper edge at 32.
    QexFont_ReplaceString(&engine_, 8, 40, options_.text.c_str(), 255, 255, 255, 255);
    QexFont_Draw();
}

// With the eyes side by side each has half the picture.
void Renderer::PlaceCamera(float turned) {
    const int width = options_.effects.stereo == 3 ? std::max(options_.width / 2, 1) : options_.width;
    const float aspect = static_cast<float>(width) / static_cast<float>(options_.height);
    QexCamera_Create(&camera_, 0);
    OrbitView view = ChooseView(points_, options_.view);
    view.yaw += turned;
    const uint32_t camera = static_cast<uint32_t>(options_.camera.value_or(0));
    if (UsesAutoCamera() || !UseSceneCamera(&model_, camera, aspect, &camera_))
        FramePoints(points_, view, aspect, &camera_);
}

void Renderer::Draw(double frame, float turned) {
    SetFrame(frame);
    PlaceCamera(turned);
    glViewport(0, 0, context_->Width(), context_->Height());
    if (options_.effects.depthOfField) {
        DrawWithDepthOfField(&engine_, options_.effects, scale_,
                             [this](QexShaderModule* module, QexShaderModule* skinned) {
                                 Clear(module ? 0xFFFFFF : options_.background);
                                 module ? DrawDepth(module, skinned) : DrawScene(camera_);
                             });
        return;
    }
    Clear(options_.background);
    if (sky_)
        sky_->Draw(
            &engine_, camera_, [this](const QexCamera& camera) { DrawOpaque(camera); },
            [this](const QexCamera& camera) { DrawBlended(camera); });
    else if (options_.effects.stereo)
        DrawBothEyes();
    else
        DrawScene(camera_);
}

void Renderer::Clear(uint32_t colour) {
    const auto channel = [&](int shift) { return static_cast<float>(colour >> shift & 0xFF) / 255.0f; };
    QexRenderer_SetZWrite(1);
    glClearColor(channel(16), channel(8), channel(0), 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
}

// Everything that can be seen, with modules that show its depth.
void Renderer::DrawDepth(QexShaderModule* module, QexShaderModule* skinned) {
    QexRenderer_SetZTestFunc(3);
    QexRenderer_SetBackFaceCulling(0);
    QexRenderer_SetAlphaBlendMode(0);
    QexModel* floor = floor_ ? floor_->Model() : nullptr;
    const ShaderOverride floorDepth(floor, module, skinned), modelDepth(&model_, module, skinned);
    if (floor) QexModel_RenderWithCamera(floor, nullptr, &camera_, nullptr, 0);
    for (uint32_t pass = 0; pass <= model_.scene.highestPass; ++pass)
        QexModel_RenderWithCamera(&model_, nullptr, &camera_, nullptr, pass);
}

// The eyes are a thirtieth of the way to the target apart.
void Renderer::DrawBothEyes() {
    QexVec3 forward, right;
    QexVec3_Subtract(&forward, &camera_.target, &camera_.eye);
    QexVec3_CrossProduct(&right, &forward, &camera_.up);
    QexVec3_Normalize(&right, &right);
    const float half = sqrtf(QexVec3_DotProduct(&forward, &forward)) / 60;
    QexRenderer_EnableStereo3D(&engine_, options_.effects.stereo,
                               options_.effects.separation * static_cast<float>(scale_));
    for (const float side : {-half, half}) {
        QexCamera eye = camera_;
        const QexVec3 place = {eye.eye.x + side * right.x, eye.eye.y + side * right.y,
                               eye.eye.z + side * right.z};
        QexCamera_LookAt(&eye, &place, &camera_.target, &camera_.up);
        (side < 0 ? QexRenderer_PrepareLeft : QexRenderer_PrepareRight)(&engine_);
        DrawScene(eye);
    }
    QexRenderer_FinishStereo3D(&engine_);
}

void Renderer::DrawScene(const QexCamera& camera) {
    DrawOpaque(camera);
    DrawBlended(camera);
}

void Renderer::DrawOpaque(const QexCamera& camera) {
    transparentCount_ = 0;
    const QexLightSet lights = ChooseLights(&model_, options_.effects, camera);
    QexRenderer_SetZTestFunc(3);
    QexRenderer_SetBackFaceCulling(0);
    QexRenderer_SetAlphaBlendModeSeparate(1, 0);
    QexModel* floor = floor_ ? floor_->Model() : nullptr;
    if (floor && options_.effects.mirror)
        floor_->DrawMirrorImage(&model_, lights, camera);
    else
        DrawMirrored(&model_, options_.effects, lights, camera);
    QexRenderer_SetBackFaceCulling(0);
    if (options_.effects.shadow) {
        DrawWithShadow(&engine_, floor, &model_, lights, camera);
        return;
    }
    if (floor) QexModel_RenderWithCamera(floor, &lights, &camera, nullptr, 0);
    for (uint32_t pass = 0; pass <= model_.scene.highestPass; ++pass)
        QexModel_RenderWithCameraEx(&model_, &lights, &camera, nullptr, pass, QEX_RENDER_OPAQUE,
                                    transparent_.data(), &transparentCount_);
}

// Draws what was put off, and the particles.
void Renderer::DrawBlended(const QexCamera& camera) {
    // The far sides of transparent bodies first, then the near ones.
    QexRenderer_SetZWrite(0);
    for (int32_t culled : {2, 1}) {
        QexRenderer_SetBackFaceCulling(culled);
        for (uint32_t pass = 0; pass <= model_.scene.highestPass; ++pass)
            QexModel_RenderAlphaBlendingNodes(transparent_.data(), transparentCount_, pass);
    }
    QexRenderer_SetBackFaceCulling(0);
    QexRenderer_SetZWrite(1);
    if (emitters_) emitters_->Draw(camera);
}

// The picture that was drawn, the line of text on it.
std::vector<uint8_t> Renderer::Pixels(bool text) {
    if (text && scale_ == 1) DrawText();
    std::vector<uint8_t> pixels = context_->ReadPixels();
    if (scale_ > 1) pixels = ShrinkPixels(pixels, options_.width, options_.height, scale_);
    for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 255;
    if (!text || scale_ == 1) return pixels;
    // Letters have the size that they have in other pictures: they are drawn by themselves and laid over it.
    Clear(0);
    DrawText();
    BlendWhite(context_->ReadPixels(), context_->Width(), &pixels, options_.width);
    return pixels;
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
        SetFrame(Frames().front());
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
    if (options_.output == "-" && (options_.sequence || options_.turn))
        return "several pictures do not go to standard output; a file name is expected";
    const EffectOptions& effects = options_.effects;
    std::vector<std::string> inputs = {options_.input};
    for (const auto* more : {&effects.sky, &effects.emitters.emitters, &effects.emitters.textures})
        inputs.insert(inputs.end(), more->begin(), more->end());
    for (const auto& [material, file] : SplitOverrides(options_.textures.overrides)) inputs.push_back(file);
    for (uint32_t i = 0; i < model_.scene.textureCount; ++i)
        if (model_.scene.textures[i].name)
            inputs.push_back(FindTexture(Directory(options_.input), model_.scene.textures[i].name).path);
    for (size_t i = 0, count = Frames().size(); i < count; ++i) {
        const std::string path = OutputPath(i), overwrites = WhyNotOutput(path, inputs);
        if (!overwrites.empty()) return path + ": " + overwrites;
    }
    return "";
}

std::string Renderer::OutputPath(size_t index) const {
    return options_.sequence || options_.turn ? NumberedOutput(options_.output, index) : options_.output;
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
    const double last = Frames().back();
    const char* asked = options_.sequence ? "--frames" : "--frame";
    if (count < 2 && (options_.sequence || last > 0))
        Warn(std::string(asked) + ": the scene has no animation; every frame is the same");
    else if (count > 1 && last > count - 1)
        Warn(std::string(asked) + ": the last frame is " + std::to_string(count - 1) +
             "; it is shown for those behind it");
}

// Frames the whole scene where its own camera, which nobody asked for, shows nothing at the start, in the
// middle and at the end.
void Renderer::ChooseCamera() {
    if (options_.camera || UsesAutoCamera() || !model_.scene.cameraCount) return;
    const size_t count = Frames().size();
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

void Renderer::DrawNumber(size_t index) {
    const double turns = options_.turn ? static_cast<double>(index) / options_.turn : 0;
    Draw(Frames()[index], static_cast<float>(360 * turns));
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

int Renderer::DrawAll() {
    const size_t count = Frames().size();
    size_t blank = 0;
    gltapResetCounts();
    for (size_t i = 0; i < count; ++i) {
        const auto start = Clock::now();
        std::vector<uint8_t> pixels;
        std::string reason;
        {
            EngineOutput quiet;
            if (emitters_ && options_.sequence && i > 0)
                emitters_->Run(static_cast<float>(options_.step) /
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
    if (options_.stats) ReportStats({model_, *context_, count, loadTime_, drawTime_});
    return 0;
}

}  // namespace

int RunRender(const RenderOptions& options) {
    return Renderer(options).Run();
}
