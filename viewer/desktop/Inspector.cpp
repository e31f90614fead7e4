// A section a subject; what is edited becomes the viewer's options at the end.
#include "desktop/Inspector.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include <imgui.h>
#include <unistd.h>

#include "common/OutputFile.h"
#include "common/SceneBounds.h"
#include "common/TextureFiles.h"
#include "emitter/Description.h"

namespace {

// A switch for a value that may be left out, and the value.
bool Optional(const char* label, std::optional<float>* value, float otherwise, float speed) {
    bool on = value->has_value(), changed = ImGui::Checkbox(label, &on);
    if (changed) *value = on ? std::optional<float>(otherwise) : std::nullopt;
    if (!on) return changed;
    ImGui::SameLine(120);
    ImGui::PushID(label);
    ImGui::SetNextItemWidth(-1);
    changed |= ImGui::DragFloat("##value", &**value, speed);
    ImGui::PopID();
    return changed;
}

// A module by its name, or none, which is called `otherwise`.
bool ChooseShader(const char* label, const char* otherwise, std::string* shader) {
    if (!ImGui::BeginCombo(label, shader->empty() ? otherwise : shader->c_str())) return false;
    bool changed = ImGui::Selectable(otherwise, shader->empty());
    if (changed) shader->clear();
    for (const std::string& name : ShaderNames())
        if (ImGui::Selectable(name.c_str(), name == *shader)) {
            *shader = name;
            changed = true;
        }
    ImGui::EndCombo();
    return changed;
}

double MegabytesInUse() {
    unsigned long pages = 0, resident = 0;
    if (FILE* file = fopen("/proc/self/statm", "r")) {
        if (fscanf(file, "%lu %lu", &pages, &resident) != 2) resident = 0;
        fclose(file);
    }
    return static_cast<double>(resident) * static_cast<double>(sysconf(_SC_PAGESIZE)) / (1 << 20);
}

int MipLevels(const QexTexture& texture) {
    int levels = 1;
    for (uint32_t side = std::max(static_cast<uint32_t>(texture.width), texture.height); side > 1; side /= 2)
        ++levels;
    return levels;
}

bool IsHidden(const SceneOptions& options, const std::string& name) {
    const auto& nodes = options.effects.nodes;
    return std::any_of(nodes.begin(), nodes.end(),
                       [&](const NodeChange& c) { return c.what == NodeChange::kHide && c.node == name; });
}

}  // namespace

void Inspector::ShowPlayback() {
    Playback& play = viewer_->Play();
    if (play.Last() <= 0) return ImGui::TextDisabled("no animation");
    if (ImGui::Button(play.Plays() ? "Pause" : "Play")) play.Play(!play.Plays());
    ImGui::SameLine();
    if (ImGui::Button("<")) play.Step(-1);
    ImGui::SameLine();
    if (ImGui::Button(">")) play.Step(1);
    ImGui::SameLine();
    float frame = static_cast<float>(play.Frame());
    ImGui::SetNextItemWidth(-1);
    if (ImGui::SliderFloat("##frame", &frame, 0, static_cast<float>(play.Last()), "frame %.1f"))
        play.Scrub(static_cast<double>(frame));
    float range[2] = {static_cast<float>(play.First()), static_cast<float>(play.Until())};
    if (ImGui::DragFloat2("range", range, 0.5f, 0, static_cast<float>(play.Last()), "%.0f"))
        play.SetRange(static_cast<double>(range[0]), static_cast<double>(range[1]));
    float speed = static_cast<float>(play.Speed());
    if (ImGui::SliderFloat("speed", &speed, -4, 4, "%.2f")) play.SetSpeed(static_cast<double>(speed));
}

std::optional<size_t> Inspector::ChooseClip(const std::vector<std::string>& clips, size_t clip) {
    const auto name = [&](size_t i) {
        return clips[i].empty() ? "animation " + std::to_string(i) : clips[i];
    };
    std::optional<size_t> chosen;
    if (!ImGui::BeginCombo("clip", name(std::min(clip, clips.size() - 1)).c_str())) return chosen;
    for (size_t i = 0; i < clips.size(); ++i) {
        ImGui::PushID(static_cast<int>(i));
        if (ImGui::Selectable(name(i).c_str(), i == clip)) chosen = i;
        ImGui::PopID();
    }
    ImGui::EndCombo();
    return chosen;
}

void Inspector::ShowView() {
    if (ImGui::Button("Frame all")) viewer_->FrameAll();
    const QexModel* model = viewer_->View().Model();
    for (uint32_t i = 0; model && i < model->scene.cameraCount; ++i) {
        ImGui::SameLine();
        if (ImGui::Button(("Camera " + std::to_string(i)).c_str()))
            viewer_->SetSceneCamera(static_cast<int>(i));
    }
    edited_ = viewer_->Options();
    int up = static_cast<int>(viewer_->Camera().Up());
    if (ImGui::Combo("up", &up, kUpAxisNames, 6)) {
        viewer_->Camera().SetUp(static_cast<UpAxis>(up));
        viewer_->FrameAll();
        edited_ = viewer_->Options();
    }
    float colour[3];
    for (int i = 0; i < 3; ++i)
        colour[i] = static_cast<float>(edited_.background >> (16 - 8 * i) & 255) / 255;
    if (ImGui::ColorEdit3("background", colour)) {
        edited_.background = 0;
        for (const float c : colour)
            edited_.background = edited_.background << 8 | static_cast<uint32_t>(c * 255 + 0.5f);
    }
    int drawing = edited_.lean ? 0 : 1;
    if (ImGui::Combo("drawing", &drawing, "lean\0described\0")) edited_.lean = drawing == 0;
    ChooseShader("shader", "default look", &edited_.effects.shader);
    for (int i = 0; i < static_cast<int>(Overlay::kCount); ++i) {
        bool on = viewer_->Shows(static_cast<Overlay>(i));
        if (i % 3) ImGui::SameLine(static_cast<float>(i % 3) * 110);
        if (ImGui::Checkbox(kOverlayNames[i], &on)) viewer_->Show(static_cast<Overlay>(i), on);
    }
}

void Inspector::ShowNode(uint32_t index) {
    const std::string& name = nodeWords_[index];
    ImGui::PushID(static_cast<int>(index));
    bool shown = !IsHidden(edited_, name);
    if (ImGui::Checkbox("##shown", &shown)) {
        auto& nodes = edited_.effects.nodes;
        if (!shown)
            nodes.push_back({name, NodeChange::kHide, {0, 0, 0}});
        else
            TakeBack(&nodes, NodeChange::kHide, name);
    }
    ImGui::SameLine();
    ImGuiTreeNodeFlags flags =
        ImGuiTreeNodeFlags_DefaultOpen | ImGuiTreeNodeFlags_OpenOnArrow | ImGuiTreeNodeFlags_SpanAvailWidth;
    if (children_[index].empty()) flags |= ImGuiTreeNodeFlags_Leaf;
    if (viewer_->Selected() == static_cast<int>(index)) flags |= ImGuiTreeNodeFlags_Selected;
    const bool open = ImGui::TreeNodeEx(name.c_str(), flags);
    if (ImGui::IsItemClicked()) viewer_->Select(static_cast<int>(index));
    if (open) {
        for (const uint32_t child : children_[index]) ShowNode(child);
        ImGui::TreePop();
    }
    ImGui::PopID();
}

void Inspector::ShowNodes() {
    const QexPODModel& scene = viewer_->View().Model()->scene;
    if (loads_ != viewer_->Loads()) {
        loads_ = viewer_->Loads();
        nodeWords_.clear();
        children_.assign(scene.nodeCount, {});
        for (uint32_t i = 0; i < scene.nodeCount; ++i) {
            nodeWords_.push_back(NodeWord(scene, i));
            const int32_t parent = scene.nodes[i].parentIndex;
            if (parent >= 0) children_[static_cast<size_t>(parent)].push_back(i);
        }
    }
    for (uint32_t i = 0; i < scene.nodeCount; ++i)
        if (scene.nodes[i].parentIndex < 0) ShowNode(i);
}

// Where the selected node is moved, how it is turned, which module draws it, and whether the scene is
// mirrored in it.
void Inspector::ShowSelected() {
    const QexPODModel& scene = viewer_->View().Model()->scene;
    if (viewer_->Selected() < 0) return;
    const uint32_t index = static_cast<uint32_t>(viewer_->Selected());
    const std::string& name = nodeWords_[index];
    EffectOptions& e = edited_.effects;
    const struct {
        const char* label;
        NodeChange::What what;
        float step;
    } kinds[] = {{"move", NodeChange::kMove, viewer_->View().Size() / 200}, {"turn", NodeChange::kRotate, 1}};
    for (const auto& kind : kinds) {
        const NodeChange* change = FindChange(e.nodes, name, kind.what);
        const QexVec3 now = change ? change->value : QexVec3{0, 0, 0};
        float value[3] = {now.x, now.y, now.z};
        if (ImGui::DragFloat3(kind.label, value, kind.step))
            SetChange(&e.nodes, {name, kind.what, {value[0], value[1], value[2]}});
    }
    if (index < scene.meshNodeCount) {
        const NodeChange* own = FindChange(e.nodes, name, NodeChange::kShader);
        std::string shader = own ? own->shader : "";
        if (ChooseShader("module", "that of the scene", &shader)) SetShader(&e.nodes, name, shader);
    }
    bool mirrors = e.mirrorNode == name;
    if (index < scene.meshNodeCount && !e.depthOfField && e.sky.empty() &&
        ImGui::Checkbox("mirrors", &mirrors))
        e.mirrorNode = mirrors ? name : "";
}

// What differs becomes a change.
void Inspector::ChangeMaterial(const std::string& name, const QexPODMaterial& before,
                               const QexPODMaterial& after) {
    const float* const values[][2] = {{before.diffuse, after.diffuse},
                                      {before.specular, after.specular},
                                      {&before.shininess, &after.shininess},
                                      {&before.opacity, &after.opacity}};
    for (int what = 0; what < 4; ++what) {
        const auto& [old, now] = values[what];
        const bool colour = kMaterialChanges[what].numbers == 3;
        if (std::equal(old, old + (colour ? 3 : 1), now)) continue;
        const QexVec3 value = colour ? QexVec3{now[0], now[1], now[2]} : QexVec3{now[0], 0, 0};
        SetChange(&edited_.effects.materials, {name, static_cast<MaterialChange::What>(what), value});
    }
}

void Inspector::ShowMaterials() {
    QexModel* model = viewer_->View().Model();
    for (uint32_t i = 0; i < model->scene.materialCount; ++i) {
        ImGui::PushID(static_cast<int>(i));
        if (ImGui::TreeNode(MaterialWord(model->scene, i).c_str())) {
            QexPODMaterial material = viewer_->View().MaterialOf(i);
            bool changed = ImGui::ColorEdit3("diffuse", material.diffuse);
            changed |= ImGui::ColorEdit3("specular", material.specular);
            changed |= ImGui::DragFloat("shininess", &material.shininess, 0.5f, 0, 1000);
            changed |= ImGui::SliderFloat("opacity", &material.opacity, 0, 1);
            if (changed)
                ChangeMaterial(MaterialWord(model->scene, i), viewer_->View().MaterialOf(i), material);
            if (HasTexture(model, i)) {
                const QexTexture* texture = model->textures[i];
                ImGui::Text("%s: %d x %u, %s, up to %d levels", texture->name, texture->width,
                            texture->height, FormatName(*texture), MipLevels(*texture));
                // The first row is the lower edge.
                ImGui::Image(reinterpret_cast<ImTextureID>(static_cast<uintptr_t>(texture->glName)),
                             {160, 160}, {0, 1}, {1, 0});
            }
            ImGui::TreePop();
        }
        ImGui::PopID();
    }
}

void Inspector::ShowLights() {
    std::vector<QexLight>& lights = edited_.effects.lights;
    const float size = viewer_->View().Size();
    for (size_t i = 0; i < lights.size(); ++i) {
        ImGui::PushID(static_cast<int>(i));
        ImGui::DragFloat3("place", lights[i].vector, size / 100);
        ImGui::ColorEdit3("colour", lights[i].colour);
        const bool gone = ImGui::Button("Remove");
        ImGui::PopID();
        if (gone) lights.erase(lights.begin() + static_cast<std::ptrdiff_t>(i--));
    }
    if (lights.empty() && ImGui::Button("Take the scene's")) {
        viewer_->TakeSceneLights();
        lights = viewer_->Options().effects.lights;
    }
    if (lights.size() < QEX_MAX_LIGHTS && ImGui::Button("Add a light")) {
        const QexVec3 eye = viewer_->View().Camera().eye;
        lights.push_back({QEX_LIGHT_POINT, {eye.x, eye.y + size / 2, eye.z}, {1, 1, 1, 1}});
    }
}

void Inspector::ShowEffects() {
    EffectOptions& e = edited_.effects;
    const Bounds box = BoundsOf(viewer_->View().Points());
    const float low = box.empty ? 0 : box.low.y, speed = viewer_->View().Size() / 200;
    const bool wholePicture = e.depthOfField || !e.sky.empty();
    Optional("floor", &e.floor, low, speed);
    if (!e.water) ImGui::Checkbox("shadow", &e.shadow);
    if (!wholePicture) Optional("mirror", &e.mirror, low, speed);
    if (!e.mirror && e.mirrorNode.empty() && !e.stereo && !e.depthOfField) ShowSky();
    if (!e.sky.empty() && !e.shadow) Optional("water", &e.water, low, speed);
    bool blur = e.depthOfField.has_value();
    if (!e.mirror && !e.stereo && e.sky.empty() && ImGui::Checkbox("depth of field", &blur))
        e.depthOfField = blur ? std::optional<DepthOfField>({0.5f, 3, 5, 9}) : std::nullopt;
    if (e.depthOfField) {
        ImGui::SliderFloat("focus", &e.depthOfField->focus, 0, 1, "%.3f");
        ImGui::DragFloat("range", &e.depthOfField->range, 0.05f, 0, 100);
        ImGui::SliderFloat("sigma", &e.depthOfField->sigma, 0.1f, 20);
        ImGui::Checkbox("full resolution", &e.fullBlur);
    } else {
        e.fullBlur = false;
    }
    int stereo = static_cast<int>(e.stereo);
    if (!wholePicture && ImGui::Combo("stereo", &stereo, "off\0red, blue\0red, cyan\0side by side\0"))
        e.stereo = static_cast<uint32_t>(stereo);
    if (e.stereo) ImGui::DragFloat("separation", &e.separation, 0.1f, -100, 100);
}

// Files of one picture or six, with ";" between them.
void Inspector::ShowSky() {
    std::vector<std::string>& files = edited_.effects.sky;
    std::string joined;
    for (const std::string& file : files) joined += (joined.empty() ? "" : ";") + file;
    char text[2048];
    snprintf(text, sizeof text, "%s", joined.c_str());
    if (!ImGui::InputText("sky", text, sizeof text, ImGuiInputTextFlags_EnterReturnsTrue)) return;
    files.clear();
    const std::string entered = text;
    for (size_t at = 0; at < entered.size();) {
        const size_t end = std::min(entered.find(';', at), entered.size());
        if (end > at) files.push_back(entered.substr(at, end - at));
        at = end + 1;
    }
    if (files.empty()) edited_.effects.water.reset();
}

// From then on its description is shown.
void Inspector::SaveEmitter(size_t index, const QexParticleEmitter& emitter) {
    std::string& file = edited_.effects.emitters.emitters[index];
    const std::string to = WithoutExtension(file) + ".json", text = DescribeEmitter(emitter);
    std::string problem;
    const bool saved = WriteOutput(to, text.data(), text.size(), &problem);
    viewer_->Say(to + (saved ? ": saved" : ": " + problem));
    if (!saved) return;
    unsaved_.erase(file);
    file = to;
}

std::string Inspector::LeftOut() const {
    std::string text;
    const Emitters* particles = viewer_->View().Particles();
    const auto& files = viewer_->Options().effects.emitters.emitters;
    for (size_t i = 0; particles && i < std::min(particles->All().size(), files.size()); ++i) {
        const auto found = unsaved_.find(files[i]);
        if (found != unsaved_.end() && found->second == particles->All()[i])
            text += (text.empty() ? "" : ", ") + FileName(files[i]);
    }
    return text.empty() ? ""
                        : "the command draws emitters as they were saved; save the description of " + text;
}

// All values of an emitter, written into it as they change; a description of them is saved on demand.
void Inspector::ShowEmitters() {
    Emitters* particles = viewer_->View().Particles();
    for (size_t i = 0; particles && i < particles->All().size(); ++i) {
        QexParticleEmitter* emitter = particles->All()[i];
        const std::string file = edited_.effects.emitters.emitters[i];
        ImGui::PushID(static_cast<int>(i));
        if (ImGui::TreeNodeEx(FileName(file).c_str(), ImGuiTreeNodeFlags_DefaultOpen)) {
            for (const Field& field : EmitterFields()) {
                std::vector<Row> rows = GetRows(*emitter, field);
                bool changed = false;
                for (Row& row : rows) {
                    ImGui::PushID(&row);
                    changed |=
                        ImGui::DragScalarN(field.name, ImGuiDataType_Double, row.data(),
                                           static_cast<int>(row.size()), 0.05f, nullptr, nullptr, "%.4g");
                    ImGui::PopID();
                }
                FieldValues values;
                if (changed && FaultOf(field, rows).empty() && values.Add(field.name, rows).empty()) {
                    values.Apply(emitter);
                    unsaved_[file] = emitter;
                }
            }
            if (ImGui::Button("Save the description")) SaveEmitter(i, *emitter);
            ImGui::TreePop();
        }
        ImGui::PopID();
    }
    if (!particles) ImGui::TextDisabled("none; drop an emitter file or a description of one");
}

void Inspector::ShowStatistics() {
    const ViewerStatistics& s = viewer_->Statistics();
    float sum = 0;
    int count = 0;
    for (const float time : s.frameTimes) {
        sum += time;
        count += time > 0;
    }
    const float mean = count ? sum / static_cast<float>(count) : 0;
    char words[32];
    snprintf(words, sizeof words, "%.1f ms", static_cast<double>(mean));
    ImGui::SetNextItemWidth(-1);
    ImGui::PlotLines("##times", s.frameTimes.data(), static_cast<int>(s.frameTimes.size()),
                     static_cast<int>(s.next), words, 0, mean * 3 + 1, {0, 50});
    ImGui::Text("%llu GL calls a picture", static_cast<unsigned long long>(s.calls));
    ImGui::Text("%llu triangles", static_cast<unsigned long long>(s.triangles));
    ImGui::Text("%.1f MB in use", MegabytesInUse());
}

InspectorWishes Inspector::Show(const std::vector<std::string>& recent, const std::vector<std::string>& clips,
                                size_t clip) {
    InspectorWishes wishes;
    const ImVec2 screen = ImGui::GetIO().DisplaySize;
    const float width = std::min(static_cast<float>(kWidth), screen.x);
    ImGui::SetNextWindowPos({screen.x - width, 0});
    ImGui::SetNextWindowSize({width, screen.y});
    ImGui::Begin("Inspector", nullptr,
                 ImGuiWindowFlags_NoMove | ImGuiWindowFlags_NoResize | ImGuiWindowFlags_NoCollapse |
                     ImGuiWindowFlags_NoSavedSettings);
    const auto section = [](const char* name, bool open) {
        return ImGui::CollapsingHeader(name, open ? ImGuiTreeNodeFlags_DefaultOpen : 0);
    };
    ImGui::PushItemWidth(-100);
    edited_ = viewer_->Options();
    const bool scene = viewer_->View().Model() != nullptr;
    if (section("File", true)) {
        wishes.screenshot = ImGui::Button("Screenshot");
        ImGui::SameLine();
        wishes.turntable = ImGui::Button("Turntable");
        ImGui::SameLine();
        wishes.copyLine = ImGui::Button("Copy command");
        if (!recent.empty() && ImGui::BeginCombo("recent", "...")) {
            for (const std::string& file : recent)
                if (ImGui::Selectable(file.c_str())) wishes.open = file;
            ImGui::EndCombo();
        }
    }
    if (scene && section("Animation", true)) {
        if (clips.size() > 1) wishes.clip = ChooseClip(clips, clip);
        ShowPlayback();
    }
    if (section("View", true)) ShowView();
    if (scene && section("Nodes", true)) {
        ShowNodes();
        ShowSelected();
    }
    if (scene && section("Materials", false)) ShowMaterials();
    if (scene && section("Lights", false)) ShowLights();
    if (scene && section("Effects", false)) ShowEffects();
    if (scene && section("Emitters", false)) ShowEmitters();
    if (section("Statistics", true)) ShowStatistics();
    ImGui::PopItemWidth();
    ImGui::End();
    viewer_->SetOptions(edited_);
    return wishes;
}
