// Options back to the words of a command line.
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include "common/UpAxis.h"
#include "scene/Options.h"

namespace {

// The fewest digits that are read as the same number.
std::string Number(double value, bool single = true) {
    char text[40];
    for (int digits = 6; digits <= 17; ++digits) {
        snprintf(text, sizeof text, "%.*g", digits, value);
        const double read = strtod(text, nullptr);
        if (single ? static_cast<float>(read) == static_cast<float>(value) : read == value) break;
    }
    return text;
}

std::string Join(const std::vector<double>& numbers) {
    std::string text;
    for (const double n : numbers) text += (text.empty() ? "" : ",") + Number(n);
    return text;
}

std::string Place(const QexVec3& v) {
    return Join({static_cast<double>(v.x), static_cast<double>(v.y), static_cast<double>(v.z)});
}

std::string Colour(uint32_t rgb) {
    char text[16];
    snprintf(text, sizeof text, "%06x", rgb & 0xFFFFFF);
    return text;
}

std::string ChangeText(const ChangeWord& kind, const QexVec3& value) {
    if (kind.numbers == 3) return kind.word + Place(value);
    return kind.word + (kind.numbers ? Number(static_cast<double>(value.x)) : "");
}

class Words {
  public:
    // "--name=value": a value may begin with a minus.
    void Add(const std::string& name, const std::string& value) { list.push_back("--" + name + "=" + value); }
    void AddFlag(const std::string& name, bool set) {
        if (set) list.push_back("--" + name);
    }
    void AddHeight(const std::string& name, const std::optional<float>& height) {
        if (height) Add(name, Number(static_cast<double>(*height)));
    }
    void AddAll(const std::string& name, const std::vector<std::string>& values) {
        for (const std::string& value : values) Add(name, value);
    }

    std::vector<std::string> list;
};

std::string LightText(const QexLight& light) {
    uint32_t rgb = 0;
    for (int i = 0; i < 3; ++i) rgb = rgb << 8 | static_cast<uint32_t>(std::lround(light.colour[i] * 255));
    const float* v = light.vector;
    return Place(QexVec3{v[0], v[1], v[2]}) + (rgb == 0xFFFFFF ? "" : "," + Colour(rgb));
}

void AddCamera(const RenderOptions& options, Words* words) {
    const OrbitView usual, &view = options.view;
    if (options.look) {
        const LookView& look = *options.look;
        words->Add("look",
                   Place(look.eye) + "," + Place(look.target) +
                       (look.fov == LookView().fov ? "" : "," + Number(static_cast<double>(look.fov))));
    }
    if (view.given)
        words->Add("orbit", Join({static_cast<double>(view.yaw), static_cast<double>(view.pitch)}));
    else if (options.autoCamera)
        words->Add("camera", "auto");
    if (options.camera) words->Add("camera", std::to_string(*options.camera));
    if (view.up != usual.up) words->Add("up", kUpAxisNames[static_cast<int>(view.up)]);
}

void AddEffects(const EffectOptions& effects, Words* words) {
    if (!effects.shader.empty()) words->Add("shader", effects.shader);
    for (const QexLight& light : effects.lights) words->Add("light", LightText(light));
    words->AddFlag("shadow", effects.shadow);
    words->AddHeight("mirror", effects.mirror);
    words->AddHeight("floor", effects.floor);
    if (!effects.mirrorNode.empty()) words->Add("mirror-node", effects.mirrorNode);
    if (effects.stereo)
        words->Add("stereo",
                   Join({static_cast<double>(effects.stereo), static_cast<double>(effects.separation)}));
    if (effects.depthOfField) {
        const DepthOfField& d = *effects.depthOfField;
        words->Add("dof", Join({static_cast<double>(d.focus), static_cast<double>(d.range),
                                static_cast<double>(d.sigma), static_cast<double>(d.samples)}));
    }
    words->AddFlag("dof-full", effects.fullBlur);
    words->AddAll("sky", effects.sky);
    words->AddHeight("water", effects.water);
    words->AddAll("emitter", effects.emitters.emitters);
    words->AddAll("emitter-texture", effects.emitters.textures);
    if (effects.emitters.time != EmitterScene().time)
        words->Add("emitter-time", Number(static_cast<double>(effects.emitters.time)));
    for (const NodeChange& change : effects.nodes)
        words->Add("node",
                   change.node + "=" + ChangeText(kNodeChanges[change.what], change.value) + change.shader);
    for (const MaterialChange& change : effects.materials)
        words->Add("material",
                   change.material + "=" + ChangeText(kMaterialChanges[change.what], change.value));
    for (const QexVec2& p : effects.picks)
        words->Add("pick", Join({static_cast<double>(p.x), static_cast<double>(p.y)}));
}

}  // namespace

std::vector<std::string> RenderWords(const RenderOptions& options) {
    const RenderOptions usual;
    Words words;
    words.list = {"render", options.input, "--output=" + options.output};
    if (options.width != usual.width || options.height != usual.height)
        words.Add("size", std::to_string(options.width) + "x" + std::to_string(options.height));
    if (options.antialias != usual.antialias) words.Add("antialias", std::to_string(options.antialias));
    if (options.frame != usual.frame) words.Add("frame", Number(options.frame, false));
    if (options.frames)
        words.Add("frames", Number(options.frames->first, false) + ":" + Number(options.frames->last, false) +
                                ":" + Number(options.frames->step, false));
    AddCamera(options, &words);
    if (options.turn) words.Add("turn", std::to_string(options.turn));
    if (options.background != usual.background) words.Add("background", Colour(options.background));
    if (!options.text.empty()) words.Add("text", options.text);
    AddEffects(options.effects, &words);
    for (const auto& [material, file] : options.textures.overrides)
        words.Add("texture", material + "=" + file);
    if (options.textures.flipped) words.Add("flip-textures", *options.textures.flipped ? "yes" : "no");
    if (!options.lean) words.Add("drawing", "described");
    words.AddFlag("stats", options.stats);
    words.AddFlag("quiet", options.quiet);
    return words.list;
}

std::string ShellLine(const std::vector<std::string>& words) {
    static const char kPlain[] = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_-+=./:,@%";
    std::string line;
    for (const std::string& word : words) {
        line += line.empty() ? "" : " ";
        if (!word.empty() && word.find_first_not_of(kPlain) == std::string::npos) {
            line += word;
            continue;
        }
        line += "'";
        for (const char c : word) line += c == '\'' ? std::string("'\\''") : std::string(1, c);
        line += "'";
    }
    return line;
}
