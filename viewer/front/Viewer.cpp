// Loading, events and time.
#include "front/Viewer.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>

#include "common/EngineOutput.h"
#include "common/SceneBounds.h"
#include "common/TextureFiles.h"

namespace {

constexpr float kLoadStep = 8;   // milliseconds of a frame that a load may take
constexpr float kTurn = 0.4f;    // degrees a pixel
constexpr float kNotch = 0.88f;  // of the distance
constexpr float kClick = 4;      // pixels that a click may move
constexpr int kFineMap = 2048;   // pixels of a shadow map's side
constexpr size_t kMostMessages = 100;
constexpr double kLongestTick = 0.25;  // seconds: a window that stood still does not leap

uint64_t CountTriangles(const QexPODModel& scene) {
    uint64_t count = 0;
    for (uint32_t i = 0; i < scene.meshNodeCount; ++i) {
        const QexPODMesh& mesh = scene.meshes[scene.nodes[i].objectIndex];
        if (!mesh.stripCount) count += mesh.faceCount;
        for (uint32_t s = 0; s < mesh.stripCount; ++s) count += mesh.stripLengths[s];
    }
    return count;
}

}  // namespace

Viewer::Viewer(int width, int height, EmitterLoader loadEmitter, uint64_t (*calls)()) : calls_(calls) {
    EngineOutput quiet;
    QexEngineConfig config = {};
    config.width = std::max(width, 1);
    config.height = std::max(height, 1);
    QexModel_SetShadowMapSize(kFineMap, kFineMap);
    QexEngine_Init(&engine_, sizeof config, &config);
    view_ = std::make_unique<SceneView>(&engine_, loadEmitter);
    camera_.FrameAll({{-1, 0, -1}, {1, 0.5f, 1}}, Aspect());
    SetOptions(options_);
}

Viewer::~Viewer() {
    EngineOutput quiet;
    view_.reset();
    QexEngine_Shutdown(&engine_);
    std::error_code ignored;
    if (!folder_.empty()) std::filesystem::remove_all(folder_, ignored);
}

void Viewer::Say(const std::string& text) {
    if (messages_.size() == kMostMessages) messages_.erase(messages_.begin());
    messages_.push_back(text);
    ++said_;
}

void Viewer::Fail(const std::string& text) {
    ++failed_;
    Say(text);
}

void Viewer::Open(const std::string& path, const std::string& name) {
    std::string problem;
    keep_ = false;
    loadingPath_ = path;
    loadingName_ = name.empty() ? path : name;
    std::error_code error;
    const auto status = std::filesystem::status(path, error);
    if (!std::filesystem::exists(status))
        problem = "no such file";
    else if (!std::filesystem::is_regular_file(status))
        problem = "is not a regular file";
    else if (view_->BeginLoad(Directory(path), FileName(path), path, &problem))
        return;
    Fail(loadingName_ + ": " + problem);
}

void Viewer::Reload(const std::string& path) {
    const std::string name = name_;
    Open(path, name);
    keep_ = true;
}

void Viewer::ContinueLoad() {
    std::vector<std::string> warnings;
    std::string problem;
    const SceneView::LoadState state = view_->ContinueLoad(kLoadStep, &warnings, &problem);
    for (const std::string& line : warnings) Say("warning: " + line);
    if (state == SceneView::LoadState::kFailed) Fail(loadingName_ + ": " + problem);
    if (state != SceneView::LoadState::kDone) return;
    if (!problem.empty()) Say(problem);
    Loaded();
}

void Viewer::Loaded() {
    const QexPODModel& scene = view_->Model()->scene;
    path_ = loadingPath_;
    name_ = loadingName_;
    statistics_.triangles = CountTriangles(scene);
    ++loads_;
    if (keep_) {
        playback_.Keep(scene.frameCount, scene.framesPerSecond);
        if (selected_ >= static_cast<int>(scene.nodeCount)) selected_ = -1;
        CameraMoved();
        return;
    }
    playback_.Start(scene.frameCount, scene.framesPerSecond);
    selected_ = -1;
    view_->SetFrame(0);
    view_->FitTo({0});
    // What was meant for the parts and the place of another scene.
    SceneOptions options = options_;
    options.effects.nodes.clear();
    options.effects.materials.clear();
    options.effects.lights.clear();
    options.effects.mirrorNode.clear();
    const Bounds box = BoundsOf(view_->Points());
    for (std::optional<float>* height :
         {&options.effects.floor, &options.effects.mirror, &options.effects.water})
        if (*height) *height = box.empty ? 0 : box.low.y;
    SetOptions(options);
    FrameAll();
}

float Viewer::Aspect() const {
    return static_cast<float>(engine_.width) / static_cast<float>(engine_.height);
}

void Viewer::CameraMoved() {
    options_.camera.reset();
    options_.autoCamera = false;
    options_.look = camera_.View();
    options_.view.up = camera_.Up();
    SetOptions(options_);
}

void Viewer::SetOptions(const SceneOptions& options) {
    options_ = options;
    // A command line has colours of 8 bits.
    for (QexLight& light : options_.effects.lights)
        for (float& c : light.colour) c = std::round(std::clamp(c, 0.0f, 1.0f) * 255) / 255;
    std::vector<std::string> warnings;
    const std::string problem = view_->SetOptions(options_, &warnings);
    for (const std::string& line : warnings) Say("warning: " + line);
    if (!problem.empty()) Say(problem);
}

void Viewer::FrameAll() {
    camera_.FrameAll(view_->Points(), Aspect());
    CameraMoved();
}

void Viewer::Turn(float yaw) {
    camera_.Orbit(yaw, 0);
    CameraMoved();
}

void Viewer::SetSceneCamera(int index) {
    QexModel* model = view_->Model();
    if (!model || index < 0 || static_cast<uint32_t>(index) >= model->scene.cameraCount) return;
    options_.look.reset();
    options_.camera = index;
    SetOptions(options_);
    view_->PlaceCamera(0);
    camera_.Follow(view_->Camera(), view_->Size());
}

void Viewer::Select(int node) {
    const QexModel* model = view_->Model();
    selected_ = model && node >= 0 && static_cast<uint32_t>(node) < model->scene.nodeCount ? node : -1;
}

void Viewer::Resize(int width, int height) {
    if (width < 1 || height < 1 || (width == engine_.width && height == engine_.height)) return;
    EngineOutput quiet;
    QexEngine_Resize(&engine_, width, height);
}

// Of the nodes under the pointer the nearest; with Shift the whole scene is let go of.
void Viewer::Click(float x, float y, unsigned modifiers) {
    const QexModel* model = view_->Model();
    if (!model || modifiers & kShift) {
        Select(-1);
        return;
    }
    int nearest = -1;
    for (const uint32_t node : view_->Pick(x, y))
        if (nearest < 0 || model->screenBoxes[node].centre.z < model->screenBoxes[nearest].centre.z)
            nearest = static_cast<int>(node);
    Select(nearest);
}

void Viewer::Drag(const ViewerEvent& event) {
    if (touches_.empty()) return;
    Touch& touch = touches_.back();
    const float dx = event.x - touch.x, dy = event.y - touch.y;
    touch.x = event.x;
    touch.y = event.y;
    touch.moved += std::fabs(dx) + std::fabs(dy);
    if (touch.moved < kClick) return;
    if (touch.held != kNothing) return MoveHeld(touch.held, dx, dy);
    const float height = static_cast<float>(engine_.height);
    if (touch.button == 3 || touch.modifiers & kControl)
        camera_.Dolly(std::pow(2.0f, std::clamp(dy / height * 4, -8.0f, 8.0f)));
    else if (touch.button == 2 || touch.modifiers & kShift)
        camera_.Pan(-dx / height, dy / height);
    else
        camera_.Orbit(-dx * kTurn, dy * kTurn);
    CameraMoved();
}

void Viewer::Handle(const ViewerEvent& event) {
    for (const float number : {event.x, event.y, event.amount})
        if (!std::isfinite(number)) return;
    switch (event.kind) {
        case ViewerEvent::kPointerDown:
            touches_.push_back({event.x, event.y, 0, event.button, event.modifiers,
                                event.button == 1 && touches_.empty()
                                    ? HeldAt(event.x, event.y, event.modifiers)
                                    : kNothing});
            break;
        case ViewerEvent::kPointerMove: Drag(event); break;
        case ViewerEvent::kPointerUp:
            if (touches_.size() == 1 && touches_[0].button == 1 && touches_[0].moved < kClick)
                Click(event.x, event.y, event.modifiers);
            touches_.clear();
            break;
        case ViewerEvent::kWheel:
            camera_.Dolly(std::pow(kNotch, std::clamp(event.amount, -50.0f, 50.0f)));
            CameraMoved();
            break;
        case ViewerEvent::kPinch:
            if (event.amount > 0.01f && event.amount < 100) camera_.Dolly(1 / event.amount);
            CameraMoved();
            break;
        case ViewerEvent::kKey:
            for (const Key& key : Keys())
                if (event.text == key.key && event.modifiers == key.modifiers) key.run(this);
            break;
        case ViewerEvent::kDrop: Open(event.text); break;
        case ViewerEvent::kResize: Resize(static_cast<int>(event.x), static_cast<int>(event.y)); break;
    }
}

void Viewer::Tick(double seconds) {
    statistics_.frameTimes[statistics_.next] = static_cast<float>(seconds * 1000);
    statistics_.next = (statistics_.next + 1) % statistics_.frameTimes.size();
    if (QexEngine_IsContextLost()) return;
    OpenAdded();
    ContinueLoad();
    const double step = std::clamp(seconds, 0.0, kLongestTick);
    playback_.Tick(step);
    if (view_->Model() && view_->Frame() != playback_.Frame()) view_->SetFrame(playback_.Frame());
    if (view_->Particles()) view_->Particles()->Run(static_cast<float>(step));
}

namespace {

using V = Viewer;

void Toggle(V* v, Overlay overlay) {
    v->Show(overlay, !v->Shows(overlay));
}

template <class Change>
void Alter(V* v, Change change) {
    SceneOptions options = v->Options();
    change(&options);
    v->SetOptions(options);
}

void Face(V* v, float yaw, float pitch) {
    v->Camera().Look(yaw, pitch);
    v->FrameAll();
}

void NextShader(V* v) {
    std::vector<std::string> names = ShaderNames();
    names.insert(names.begin(), "");
    Alter(v, [&](SceneOptions* o) {
        const auto found = std::find(names.begin(), names.end(), o->effects.shader);
        o->effects.shader = names[static_cast<size_t>(found - names.begin() + 1) % names.size()];
        v->Say("shader: " + (o->effects.shader.empty() ? "default look" : o->effects.shader));
    });
}

void NextCamera(V* v) {
    const QexModel* model = v->View().Model();
    if (!model || !model->scene.cameraCount) return v->Say("the scene has no camera");
    const int next = v->Options().camera ? *v->Options().camera + 1 : 0;
    v->SetSceneCamera(next % static_cast<int>(model->scene.cameraCount));
}

void ToggleFloor(V* v) {
    Alter(v, [v](SceneOptions* o) {
        const Bounds box = BoundsOf(v->View().Points());
        if (o->effects.floor)
            o->effects.floor.reset();
        else
            o->effects.floor = box.empty ? 0 : box.low.y;
    });
}

void NextUp(V* v) {
    v->Camera().SetUp(static_cast<UpAxis>((static_cast<int>(v->Camera().Up()) + 1) % 6));
    v->FrameAll();
}

void HideSelected(V* v) {
    const QexModel* model = v->View().Model();
    if (!model || v->Selected() < 0) return;
    const std::string node = NodeWord(model->scene, static_cast<uint32_t>(v->Selected()));
    Alter(v, [&](SceneOptions* o) { SetChange(&o->effects.nodes, {node, NodeChange::kHide, {0, 0, 0}}); });
}

void ShowAllNodes(V* v) {
    Alter(v, [](SceneOptions* o) { TakeBack(&o->effects.nodes, NodeChange::kHide); });
}

}  // namespace

const std::vector<Viewer::Key>& Viewer::Keys() {
    static const std::vector<Key> keys = {
        {"Space", 0, "play or pause", [](V* v) { v->Play().Play(!v->Play().Plays()); }},
        {"Right", 0, "a frame on", [](V* v) { v->Play().Step(1); }},
        {"Left", 0, "a frame back", [](V* v) { v->Play().Step(-1); }},
        {"Home", 0, "first frame", [](V* v) { v->Play().Scrub(0); }},
        {"End", 0, "last frame", [](V* v) { v->Play().Scrub(v->Play().Last()); }},
        {"]", 0, "twice as fast", [](V* v) { v->Play().SetSpeed(v->Play().Speed() * 2); }},
        {"[", 0, "half as fast", [](V* v) { v->Play().SetSpeed(v->Play().Speed() / 2); }},
        {"F", 0, "everything in the picture", [](V* v) { v->FrameAll(); }},
        {"1", 0, "from the front", [](V* v) { Face(v, 0, 0); }},
        {"2", 0, "from the back", [](V* v) { Face(v, 180, 0); }},
        {"3", 0, "from the right", [](V* v) { Face(v, 90, 0); }},
        {"4", 0, "from the left", [](V* v) { Face(v, -90, 0); }},
        {"5", 0, "from above", [](V* v) { Face(v, 0, 89); }},
        {"6", 0, "from below", [](V* v) { Face(v, 0, -89); }},
        {"0", 0, "the scene's next camera", NextCamera},
        {"U", 0, "the next axis up", NextUp},
        {"Up", 0, "fly forward", [](V* v) { v->Camera().Fly(0.1f, 0, 0), v->SetOptions(v->Moved()); }},
        {"Down", 0, "fly back", [](V* v) { v->Camera().Fly(-0.1f, 0, 0), v->SetOptions(v->Moved()); }},
        {"M", 0, "the next shader module", NextShader},
        {"S", 0, "shadow",
         [](V* v) { Alter(v, [](SceneOptions* o) { o->effects.shadow = !o->effects.shadow; }); }},
        {"L", 0, "floor", ToggleFloor},
        {"D", 0, "lean or described drawing",
         [](V* v) { Alter(v, [](SceneOptions* o) { o->lean = !o->lean; }); }},
        {"G", 0, "grid", [](V* v) { Toggle(v, Overlay::kGrid); }},
        {"W", 0, "wireframe", [](V* v) { Toggle(v, Overlay::kWireframe); }},
        {"B", 0, "boxes", [](V* v) { Toggle(v, Overlay::kBoxes); }},
        {"K", 0, "bones", [](V* v) { Toggle(v, Overlay::kBones); }},
        {"N", 0, "normals", [](V* v) { Toggle(v, Overlay::kNormals); }},
        {"H", 0, "hide the selected node", HideSelected},
        {"H", kShift, "show all nodes", ShowAllNodes},
        {"Escape", 0, "select nothing", [](V* v) { v->Select(-1); }},
        {"?", 0, "this help", [](V* v) { v->help_ = !v->help_; }},
    };
    return keys;
}

std::string Viewer::HelpText() {
    std::string text =
        "drag         orbit\n"
        "Shift+drag   pan, as the middle button does\n"
        "Ctrl+drag    nearer, farther, as the right button does\n"
        "Ctrl+Shift+drag moves the selected node,\n"
        "drag on a light's mark moves that\n"
        "wheel        nearer, farther\n"
        "click        select\n";
    for (const Key& key : Keys()) {
        char line[80];
        snprintf(line, sizeof line, "%-12s %s\n",
                 (std::string(key.modifiers & kShift ? "Shift+" : "") + key.key).c_str(), key.help);
        text += line;
    }
    return text;
}

const SceneOptions& Viewer::Moved() {
    CameraMoved();
    return options_;
}
