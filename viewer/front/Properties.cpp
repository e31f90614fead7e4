// A row a property: how it is read, and how it is set.
#include "front/Properties.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include <nlohmann/json.hpp>

#include "common/SceneBounds.h"
#include "common/TextureFiles.h"
#include "emitter/Description.h"
#include "front/Viewer.h"

namespace {

using json = nlohmann::ordered_json;

constexpr double kMost = 1e9;  // of any number

const char* const kMaterialFields[] = {"diffuse", "specular", "shininess", "opacity"};  // as changes' What

bool ReadNumber(const json& value, double* number) {
    if (value.is_number()) *number = std::clamp(value.get<double>(), -kMost, kMost);
    return value.is_number();
}

// Numbers into an array of floats, all or none.
bool ReadNumbers(const json& value, float* numbers, size_t count) {
    if (!value.is_array() || value.size() != count) return false;
    std::vector<double> read(count);
    for (size_t i = 0; i < count; ++i)
        if (!ReadNumber(value[i], &read[i])) return false;
    for (size_t i = 0; i < count; ++i) numbers[i] = static_cast<float>(read[i]);
    return true;
}

bool ReadFlag(const json& value, bool* flag) {
    if (value.is_boolean()) *flag = value.get<bool>();
    return value.is_boolean();
}

json Numbers(const float* numbers, size_t count) {
    return std::vector<float>(numbers, numbers + count);
}

// Changes a copy of the options, which the viewer takes if `read` could use the value.
template <class Read>
bool Alter(Viewer* v, Read read) {
    SceneOptions options = v->Options();
    if (!read(&options)) return false;
    v->SetOptions(options);
    return true;
}

json Height(const std::optional<float>& height) {
    return height ? json(*height) : json();
}

// A number, true for the scene's lower edge, or null.
bool SetHeight(Viewer* v, const json& value, std::optional<float> EffectOptions::*height) {
    double number = 0;
    const bool isNumber = ReadNumber(value, &number), on = value.is_boolean() && value.get<bool>();
    if (!isNumber && !value.is_boolean() && !value.is_null()) return false;
    const Bounds box = BoundsOf(v->View().Points());
    if (on && !box.empty) number = static_cast<double>(box.low.y);
    return Alter(v, [&](SceneOptions* o) {
        o->effects.*height = isNumber || on ? std::optional<float>(static_cast<float>(number)) : std::nullopt;
        return true;
    });
}

json Background(Viewer* v) {
    char text[16];
    snprintf(text, sizeof text, "#%06x", v->Options().background & 0xFFFFFF);
    return text;
}

bool SetBackground(Viewer* v, const json& value) {
    const std::string text = value.is_string() ? value.get<std::string>() : "";
    if (text.size() != 7 || text[0] != '#' ||
        text.find_first_not_of("0123456789abcdefABCDEF", 1) != text.npos)
        return false;
    return Alter(v, [&](SceneOptions* o) {
        o->background = static_cast<uint32_t>(strtoul(&text[1], nullptr, 16));
        return true;
    });
}

bool IsShader(const json& value) {
    const std::vector<std::string> names = ShaderNames();
    return value.is_string() &&
           (value == "" || std::find(names.begin(), names.end(), value.get<std::string>()) != names.end());
}

bool SetSceneShader(Viewer* v, const json& value) {
    if (!IsShader(value)) return false;
    return Alter(v, [&](SceneOptions* o) {
        o->effects.shader = value.get<std::string>();
        return true;
    });
}

bool SetUp(Viewer* v, const json& value) {
    for (int i = 0; i < 6; ++i) {
        if (value != kUpAxisNames[i]) continue;
        v->Camera().SetUp(static_cast<UpAxis>(i));
        v->FrameAll();
        return true;
    }
    return false;
}

json Blur(Viewer* v) {
    const auto& d = v->Options().effects.depthOfField;
    return d ? json{{"focus", d->focus}, {"range", d->range}, {"sigma", d->sigma}} : json();
}

bool SetBlur(Viewer* v, const json& value) {
    DepthOfField blur = {0.5f, 3, 5, 9};
    double number = 0;
    const std::pair<const char*, float*> fields[] = {
        {"focus", &blur.focus}, {"range", &blur.range}, {"sigma", &blur.sigma}};
    for (const auto& [name, field] : fields) {
        if (!value.is_object() || !value.contains(name)) continue;
        if (!ReadNumber(value[name], &number)) return false;
        *field = static_cast<float>(number);
    }
    if (!value.is_object() && !value.is_null()) return false;
    blur.sigma = std::clamp(blur.sigma, 0.1f, 20.0f);
    return Alter(v, [&](SceneOptions* o) {
        o->effects.depthOfField = value.is_object() ? std::optional(blur) : std::nullopt;
        return true;
    });
}

json Lights(Viewer* v) {
    json lights = json::array();
    for (const QexLight& light : v->Options().effects.lights)
        lights.push_back({{"place", Numbers(light.vector, 3)}, {"colour", Numbers(light.colour, 3)}});
    return lights;
}

bool SetLights(Viewer* v, const json& value) {
    if (!value.is_array() || value.size() > QEX_MAX_LIGHTS) return false;
    std::vector<QexLight> lights;
    for (const json& row : value) {
        QexLight light = {QEX_LIGHT_POINT, {0, 0, 0}, {1, 1, 1, 1}};
        if (!row.is_object() || !row.contains("place") || !ReadNumbers(row["place"], light.vector, 3))
            return false;
        if (row.contains("colour") && !ReadNumbers(row["colour"], light.colour, 3)) return false;
        lights.push_back(light);
    }
    return Alter(v, [&](SceneOptions* o) {
        o->effects.lights = lights;
        return true;
    });
}

json Hidden(Viewer* v) {
    json names = json::array();
    for (const NodeChange& change : v->Options().effects.nodes)
        if (change.what == NodeChange::kHide) names.push_back(change.node);
    return names;
}

bool SetHidden(Viewer* v, const json& value) {
    if (!value.is_array() ||
        !std::all_of(value.begin(), value.end(), [](const json& name) { return name.is_string(); }))
        return false;
    return Alter(v, [&](SceneOptions* o) {
        TakeBack(&o->effects.nodes, NodeChange::kHide);
        for (const json& name : value)
            o->effects.nodes.push_back({name.get<std::string>(), NodeChange::kHide, {0, 0, 0}});
        return true;
    });
}

json Overlays(Viewer* v) {
    json on = json::object();
    for (size_t i = 0; i < static_cast<size_t>(Overlay::kCount); ++i)
        on[kOverlayNames[i]] = v->Shows(static_cast<Overlay>(i));
    return on;
}

bool SetOverlays(Viewer* v, const json& value) {
    if (!value.is_object()) return false;
    for (size_t i = 0; i < static_cast<size_t>(Overlay::kCount); ++i) {
        bool on = false;
        if (!value.contains(kOverlayNames[i])) continue;
        if (!ReadFlag(value[kOverlayNames[i]], &on)) return false;
        v->Show(static_cast<Overlay>(i), on);
    }
    return true;
}

bool SetMaterial(Viewer* v, const json& value) {
    const QexModel* model = v->View().Model();
    double index = -1;
    if (!model || !value.is_object() || !value.contains("index") || !ReadNumber(value["index"], &index) ||
        index < 0 || index >= static_cast<double>(model->scene.materialCount))
        return false;
    const std::string material = MaterialWord(model->scene, static_cast<uint32_t>(index));
    return Alter(v, [&](SceneOptions* o) {
        for (int what = 0; what < 4; ++what) {
            const char* const word = kMaterialFields[what];
            const size_t count = kMaterialChanges[what].numbers;
            if (!value.contains(word)) continue;
            float numbers[3] = {0, 0, 0};
            if (!ReadNumbers(count == 1 ? json::array({value[word]}) : value[word], numbers, count))
                return false;
            SetChange(
                &o->effects.materials,
                {material, static_cast<MaterialChange::What>(what), {numbers[0], numbers[1], numbers[2]}});
        }
        return true;
    });
}

// Of the node that is selected.
json Node(Viewer* v) {
    const QexModel* model = v->View().Model();
    if (!model || v->Selected() < 0) return {};
    const auto index = static_cast<uint32_t>(v->Selected());
    const std::string name = NodeWord(model->scene, index);
    const std::vector<NodeChange>& nodes = v->Options().effects.nodes;
    const auto place = [&](NodeChange::What what) {
        const NodeChange* change = FindChange(nodes, name, what);
        return change ? Numbers(&change->value.x, 3) : json({0, 0, 0});
    };
    const NodeChange* shader = FindChange(nodes, name, NodeChange::kShader);
    return {{"name", name},
            {"mesh", index < model->scene.meshNodeCount},
            {"move", place(NodeChange::kMove)},
            {"turn", place(NodeChange::kRotate)},
            {"shader", shader ? shader->shader : ""}};
}

bool SetNode(Viewer* v, const json& value) {
    const QexModel* model = v->View().Model();
    if (!model || v->Selected() < 0 || !value.is_object()) return false;
    const std::string name = NodeWord(model->scene, static_cast<uint32_t>(v->Selected()));
    return Alter(v, [&](SceneOptions* o) {
        std::vector<NodeChange>& nodes = o->effects.nodes;
        for (const auto& [word, what] :
             {std::pair("move", NodeChange::kMove), {"turn", NodeChange::kRotate}}) {
            float n[3];
            if (!value.contains(word)) continue;
            if (!ReadNumbers(value[word], n, 3)) return false;
            SetChange(&nodes, {name, what, {n[0], n[1], n[2]}});
        }
        if (!value.contains("shader")) return true;
        if (!IsShader(value["shader"])) return false;
        SetShader(&nodes, name, value["shader"].get<std::string>());
        return true;
    });
}

// Paths of one picture or six, as KeepBytes gives them.
bool SetSky(Viewer* v, const json& value) {
    if (!value.is_array() || !(value.empty() || value.size() == 1 || value.size() == 6) ||
        !std::all_of(value.begin(), value.end(), [](const json& file) { return file.is_string(); }))
        return false;
    return Alter(v, [&](SceneOptions* o) {
        o->effects.sky = value.get<std::vector<std::string>>();
        if (value.empty()) o->effects.water.reset();
        return true;
    });
}

json EmitterNames(Viewer* v) {
    json names = json::array();
    for (const std::string& file : v->Options().effects.emitters.emitters) names.push_back(FileName(file));
    return names;
}

// Keeps those that are named.
bool SetEmitterNames(Viewer* v, const json& value) {
    if (!value.is_array()) return false;
    return Alter(v, [&](SceneOptions* o) {
        std::vector<std::string>& files = o->effects.emitters.emitters;
        const auto unnamed = [&](const std::string& file) {
            return std::find(value.begin(), value.end(), FileName(file)) == value.end();
        };
        files.erase(std::remove_if(files.begin(), files.end(), unnamed), files.end());
        return true;
    });
}

bool SetEmitter(Viewer* v, const json& value) {
    double index = -1;
    Emitters* particles = v->View().Particles();
    if (!particles || !value.is_object() || !value.contains("index") || !ReadNumber(value["index"], &index) ||
        !value.contains("fields") || index < 0 || index >= static_cast<double>(particles->All().size()))
        return false;
    const std::string problem =
        SetFields(value["fields"].dump(), particles->All()[static_cast<size_t>(index)]);
    if (!problem.empty()) v->Say(problem);
    return problem.empty();
}

bool SetRange(Viewer* v, const json& value) {
    float range[2];
    if (!ReadNumbers(value, range, 2)) return false;
    v->Play().SetRange(static_cast<double>(range[0]), static_cast<double>(range[1]));
    return true;
}

// For numbers and flags, which are set by one call.
template <class Apply>
bool WithNumber(const json& value, Apply apply) {
    double number = 0;
    if (!ReadNumber(value, &number)) return false;
    apply(number);
    return true;
}

template <class Apply>
bool WithFlag(const json& value, Apply apply) {
    bool flag = false;
    if (!ReadFlag(value, &flag)) return false;
    apply(flag);
    return true;
}

using V = Viewer*;
using J = const json&;

const struct {
    const char* name;
    json (*get)(Viewer*);  // null for what is only done
    bool (*set)(Viewer*, const json&);
} kProperties[] = {
    {"selected", [](V v) { return json(v->Selected()); },
     [](V v, J j) { return WithNumber(j, [v](double n) { v->Select(static_cast<int>(n)); }); }},
    {"frame", [](V v) { return json(v->Play().Frame()); },
     [](V v, J j) { return WithNumber(j, [v](double n) { v->Play().Scrub(n); }); }},
    {"plays", [](V v) { return json(v->Play().Plays()); },
     [](V v, J j) { return WithFlag(j, [v](bool on) { v->Play().Play(on); }); }},
    {"speed", [](V v) { return json(v->Play().Speed()); },
     [](V v, J j) { return WithNumber(j, [v](double n) { v->Play().SetSpeed(n); }); }},
    {"range",
     [](V v) {
         return json({v->Play().First(), v->Play().Until()});
     },
     SetRange},
    {"shader", [](V v) { return json(v->Options().effects.shader); }, SetSceneShader},
    {"lean", [](V v) { return json(v->Options().lean); },
     [](V v, J j) { return Alter(v, [&](SceneOptions* o) { return ReadFlag(j, &o->lean); }); }},
    {"shadow", [](V v) { return json(v->Options().effects.shadow); },
     [](V v, J j) { return Alter(v, [&](SceneOptions* o) { return ReadFlag(j, &o->effects.shadow); }); }},
    {"background", Background, SetBackground},
    {"floor", [](V v) { return Height(v->Options().effects.floor); },
     [](V v, J j) { return SetHeight(v, j, &EffectOptions::floor); }},
    {"mirror", [](V v) { return Height(v->Options().effects.mirror); },
     [](V v, J j) { return SetHeight(v, j, &EffectOptions::mirror); }},
    {"stereo", [](V v) { return json(v->Options().effects.stereo); },
     [](V v, J j) {
         return WithNumber(j, [v](double n) {
             Alter(v, [n](SceneOptions* o) {
                 o->effects.stereo = static_cast<uint32_t>(std::clamp(n, 0.0, 3.0));
                 return true;
             });
         });
     }},
    {"depthOfField", Blur, SetBlur},
    {"sky", [](V v) { return json(v->Options().effects.sky); }, SetSky},
    {"water", [](V v) { return Height(v->Options().effects.water); },
     [](V v, J j) { return SetHeight(v, j, &EffectOptions::water); }},
    {"lights", Lights, SetLights},
    {"sceneLights", nullptr, [](V v, J) { return v->TakeSceneLights(), true; }},
    {"node", Node, SetNode},
    {"hidden", Hidden, SetHidden},
    {"overlays", Overlays, SetOverlays},
    {"up", [](V v) { return json(kUpAxisNames[static_cast<int>(v->Camera().Up())]); }, SetUp},
    {"frameAll", nullptr, [](V v, J) { return v->FrameAll(), true; }},
    {"camera", nullptr,
     [](V v, J j) { return WithNumber(j, [v](double n) { v->SetSceneCamera(static_cast<int>(n)); }); }},
    {"material", nullptr, SetMaterial},
    {"emitters", EmitterNames, SetEmitterNames},
    {"emitter", nullptr, SetEmitter},
};

// Names in files may be of any encoding; what is no UTF-8 is replaced.
std::string Text(const json& value) {
    return value.dump(-1, ' ', false, json::error_handler_t::replace);
}

}  // namespace

std::string DescribeScene(Viewer* viewer) {
    const QexModel* model = viewer->View().Model();
    if (!model) return "null";
    const QexPODModel& scene = model->scene;
    json nodes = json::array(), materials = json::array();
    for (uint32_t i = 0; i < scene.nodeCount; ++i)
        nodes.push_back({{"name", NodeWord(scene, i)},
                         {"parent", scene.nodes[i].parentIndex},
                         {"mesh", i < scene.meshNodeCount}});
    for (uint32_t i = 0; i < scene.materialCount; ++i) {
        const QexPODMaterial& m = viewer->View().MaterialOf(i);
        json texture;
        const QexTexture* t = model->textures[i];
        if (HasTexture(model, i))
            texture = {
                {"name", t->name}, {"width", t->width}, {"height", t->height}, {"format", FormatName(*t)}};
        materials.push_back({{"name", MaterialWord(scene, i)},
                             {"diffuse", Numbers(m.diffuse, 3)},
                             {"specular", Numbers(m.specular, 3)},
                             {"shininess", m.shininess},
                             {"opacity", m.opacity},
                             {"texture", texture}});
    }
    return Text({{"name", viewer->Name()},
                 {"frames", scene.frameCount},
                 {"perSecond", scene.framesPerSecond},
                 {"triangles", viewer->Statistics().triangles},
                 {"cameras", scene.cameraCount},
                 {"nodes", nodes},
                 {"materials", materials}});
}

std::string DescribeChoices() {
    return Text({{"shaders", ShaderNames()},
                 {"axes", kUpAxisNames},
                 {"overlays", kOverlayNames},
                 {"help", Viewer::HelpText()}});
}

std::string DescribeEmitters(Viewer* viewer) {
    json emitters = json::array();
    const json names = EmitterNames(viewer);
    Emitters* particles = viewer->View().Particles();
    for (size_t i = 0; particles && i < particles->All().size(); ++i)
        emitters.push_back({{"name", names[i]},
                            {"fields", json::parse(DescribeEmitter(*particles->All()[i]), nullptr, false)}});
    return Text(emitters);
}

std::string DescribeState(Viewer* viewer) {
    json state = {{"loads", viewer->Loads()},
                  {"failed", viewer->FailedLoads()},
                  {"said", viewer->Said()},
                  {"messages", viewer->Messages()},
                  {"help", viewer->ShowsHelp()},
                  {"moves", viewer->View().Particles() != nullptr},
                  {"loading", viewer->IsLoading() ? json(viewer->View().Progress()) : json()}};
    for (const auto& property : kProperties)
        if (property.get) state[property.name] = property.get(viewer);
    return Text(state);
}

bool SetProperties(Viewer* viewer, const std::string& text) {
    const json wanted = json::parse(text, nullptr, false);
    bool all = wanted.is_object();
    if (!all) viewer->Say("properties are a JSON object");
    for (auto entry = wanted.begin(); wanted.is_object() && entry != wanted.end(); ++entry) {
        const auto* found = std::find_if(std::begin(kProperties), std::end(kProperties),
                                         [&](const auto& p) { return entry.key() == p.name; });
        if (found != std::end(kProperties) && found->set(viewer, entry.value())) continue;
        viewer->Say(entry.key() +
                    (found == std::end(kProperties) ? ": no such property" : ": not such a value"));
        all = false;
    }
    return all;
}
