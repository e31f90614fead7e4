#include "RenderCommand.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include <GLES2/gl2.h>
#include <sys/resource.h>
#include <unistd.h>

#include "EngineOutput.h"
#include "gltap.h"
#include "Headless.h"
#include "ImageFile.h"
#include "RenderDiagnosis.h"
#include "RenderFloor.h"
#include "RenderSky.h"
#include "RenderTextures.h"
#include "SceneBounds.h"
#include "TextureFiles.h"

namespace {

constexpr size_t kFramingPoints = 200000;  // of each mesh node over all frames, about

using Clock = std::chrono::steady_clock;

double Milliseconds(Clock::time_point since) {
    return std::chrono::duration<double, std::milli>(Clock::now() - since).count();
}

// Everything that lives while pictures are drawn.
class Renderer {
  public:
    explicit Renderer(const RenderOptions& options) : options_(options) {}
    ~Renderer();

    int Run();

  private:
    bool Start();
    bool Load();
    void Frame();
    float SceneSize() const;
    void PlaceCamera(float turned);
    void Draw(double frame, float turned);
    void Clear(uint32_t colour);
    void DrawScene(const QexCamera& camera);
    void DrawOpaque(const QexCamera& camera);
    void DrawBlended(const QexCamera& camera);
    bool LoadSurroundings(std::string* problem);
    void DrawDepth(QexShaderModule* module, QexShaderModule* skinned);
    void DrawBothEyes();
    bool Save(const std::string& path);
    void SetFrame(double frame);
    void DrawText();
    void ReportProgress(size_t done, size_t count) const;
    void ReportStats(size_t pictures) const;
    std::vector<double> Frames() const;

    int Fail(const std::string& text, int status) const {
        fprintf(stderr, "qex render: %s\n", text.c_str());
        return status;
    }

    const RenderOptions& options_;
    std::unique_ptr<qex::HeadlessContext> context_;
    QexRuntimeContext engine_ = {};
    QexModel model_ = {};
    bool engineStarted_ = false;
    bool modelLoaded_ = false;
    QexCamera camera_ = {};
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

bool Renderer::Start() {
    std::string error;
    context_ = qex::HeadlessContext::Create(options_.width, options_.height, &error);
    if (!context_) {
        Fail(error, 1);
        return false;
    }
    EngineOutput output;
    QexEngineConfig config = {};
    config.width = options_.width;
    config.height = options_.height;
    engineStarted_ = QexEngine_Init(&engine_, sizeof config, &config) == 0;
    if (options_.effects.depthOfField) QexPostProcessing_Initialize(&engine_);
    return engineStarted_;
}

bool Renderer::Load() {
    const std::string directory = Directory(options_.input);
    const std::string problem = WhyNotPod(options_.input);
    if (!problem.empty()) {
        Fail(options_.input + ": " + problem, 1);
        return false;
    }
    const auto start = Clock::now();
    EngineOutput output;
    QexModel_Create(&model_);
    SetTextureHook(&model_);
    const int32_t result = QexModel_LoadContent(&model_, directory.c_str(), FileName(options_.input).c_str());
    modelLoaded_ = true;
    std::vector<std::string> warnings;
    if (result == 0) warnings = CompleteTextures(&model_, directory);
    if (result == 0 && options_.effects.shader == "normalmap")
        for (const std::string& line : LoadNormalMaps(&model_, directory)) warnings.push_back(line);
    output.Stop();
    loadTime_ = Milliseconds(start);
    for (const std::string& line : output.Messages("stands still")) warnings.push_back(line);
    for (const std::string& line : output.Messages("ERROR:")) warnings.push_back(line);
    for (const std::string& line : warnings) fprintf(stderr, "qex render: warning: %s\n", line.c_str());
    if (result == 0) return true;
    Fail(options_.input + ": " + output.FirstError(), 1);
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
    if (options_.text.empty()) return;
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
    if (options_.autoCamera || options_.turn ||
        !UseSceneCamera(&model_, static_cast<uint32_t>(options_.camera), aspect, &camera_))
        FramePoints(points_, view, aspect, &camera_);
}

void Renderer::Draw(double frame, float turned) {
    SetFrame(frame);
    PlaceCamera(turned);
    glViewport(0, 0, options_.width, options_.height);
    if (options_.effects.depthOfField) {
        DrawWithDepthOfField(&engine_, options_.effects,
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
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_NONE);
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
    QexRenderer_EnableStereo3D(&engine_, options_.effects.stereo, options_.effects.separation);
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
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetAlphaBlendModeSeparate(QEX_BLEND_ALPHA, QEX_BLEND_KEEP_ALPHA);
    QexModel* floor = floor_ ? floor_->Model() : nullptr;
    if (floor && options_.effects.mirror)
        floor_->DrawMirrorImage(&model_, lights, camera);
    else
        DrawMirrored(&model_, options_.effects, lights, camera);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
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
    for (const int32_t culled : {QEX_CULL_FRONT, QEX_CULL_BACK}) {
        QexRenderer_SetBackFaceCulling(culled);
        for (uint32_t pass = 0; pass <= model_.scene.highestPass; ++pass)
            QexModel_RenderAlphaBlendingNodes(transparent_.data(), transparentCount_, pass);
    }
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetZWrite(1);
    if (emitters_) emitters_->Draw(camera);
}

bool Renderer::Save(const std::string& path) {
    std::vector<uint8_t> pixels = context_->ReadPixels();
    for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 255;
    std::string error;
    if (SavePng(path, options_.width, options_.height, pixels.data(), &error)) return true;
    Fail(path + ": " + error, 2);
    return false;
}

void Renderer::ReportProgress(size_t done, size_t count) const {
    if (options_.quiet || count < 2 || !isatty(STDERR_FILENO)) return;
    const size_t width = 40, filled = width * done / count;
    fprintf(stderr, "\r[%s%s] %zu/%zu%s", std::string(filled, '=').c_str(),
            std::string(width - filled, ' ').c_str(), done, count, done == count ? "\n" : "");
}

void Renderer::ReportStats(size_t pictures) const {
    const double n = static_cast<double>(pictures);
    rusage usage = {};
    getrusage(RUSAGE_SELF, &usage);
    uint64_t triangles = 0;
    for (uint32_t i = 0; i < model_.scene.meshNodeCount; ++i) {
        const QexPODMesh& mesh = model_.scene.meshes[model_.scene.nodes[i].objectIndex];
        if (!mesh.stripCount) triangles += mesh.faceCount;
        for (uint32_t s = 0; s < mesh.stripCount; ++s) triangles += mesh.stripLengths[s];
    }
    const uint64_t draws = gltapCount("glDrawElements") + gltapCount("glDrawArrays");
    printf("load         %10.1f ms\n", loadTime_);
    printf("picture      %10.1f ms (drawing and reading back)\n", drawTime_ / n);
    printf("draw calls   %10.1f a picture\n", static_cast<double>(draws) / n);
    printf("GL calls     %10.1f a picture\n", static_cast<double>(gltapCountAll()) / n);
    printf("triangles    %10llu in the scene\n", static_cast<unsigned long long>(triangles));
    printf("memory       %10.1f MB at most\n", static_cast<double>(usage.ru_maxrss) / 1024);
    printf("renderer     %s, %s\n", context_->Renderer().c_str(), context_->Version().c_str());
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
    for (const std::string& line : warnings) fprintf(stderr, "qex render: warning: %s\n", line.c_str());
    return true;
}

int Renderer::Run() {
    if (!Start() || !Load()) return 1;
    if (options_.camera > 0 && !options_.autoCamera &&
        static_cast<uint32_t>(options_.camera) >= model_.scene.cameraCount)
        return Fail(options_.input + ": no camera " + std::to_string(options_.camera) + ", the scene has " +
                        std::to_string(model_.scene.cameraCount),
                    2);
    std::string problem = ChangeNodes(&model_, options_.effects.nodes);
    if (!options_.effects.mirrorNode.empty() && problem.empty())
        FindNode(model_, options_.effects.mirrorNode, &problem);
    if (!problem.empty()) return Fail(options_.input + ": " + problem, 2);
    shaders_.Use(&model_, options_.effects.shader);
    transparent_.resize(model_.scene.meshNodeCount + size_t{1});
    Frame();
    if (!LoadSurroundings(&problem)) return Fail(problem, 1);
    const std::vector<double> frames = Frames();
    const bool numbered = options_.sequence || options_.turn;
    gltapResetCounts();
    for (size_t i = 0; i < frames.size(); ++i) {
        const auto start = Clock::now();
        {
            EngineOutput quiet;
            if (emitters_ && options_.sequence && i > 0)
                emitters_->Run(static_cast<float>(options_.step) /
                               static_cast<float>(std::max(model_.scene.framesPerSecond, 1u)));
            Draw(frames[i],
                 options_.turn ? 360.0f * static_cast<float>(i) / static_cast<float>(options_.turn) : 0);
            const std::string reason =
                i == 0 ? WhyNothingShows(model_, camera_, *context_, options_.background, points_) : "";
            DrawText();
            quiet.Stop();
            if (!reason.empty()) fprintf(stderr, "qex render: warning: %s\n", reason.c_str());
        }
        drawTime_ += Milliseconds(start);
        char number[32] = "";
        if (numbered) snprintf(number, sizeof number, "-%04zu", i);
        const std::string path =
            numbered ? WithoutExtension(options_.output) + number + "." + Extension(options_.output)
                     : options_.output;
        if (!Save(path)) return 2;
        PrintPicked(&engine_, &model_, camera_, options_.effects.picks);
        ReportProgress(i + 1, frames.size());
    }
    if (options_.stats) ReportStats(frames.size());
    return 0;
}

}  // namespace

int RunRender(const RenderOptions& options) {
    return Renderer(options).Run();
}
