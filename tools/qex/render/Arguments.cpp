// The command line of qex render.
#include <algorithm>
#include <cfloat>
#include <cstring>
#include <optional>
#include <string>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "render/Command.h"
#include "scene/Shading.h"

namespace {

constexpr double kAboveZero = 1e-300;
constexpr NumberRange kAny = {}, kColour = {NumberRange::kColour}, kSide = {NumberRange::kWhole, 1, 8192};

const NumberShape kSize = {'x', {kSide, kSide}, 2, "is no size; expected WIDTHxHEIGHT, 1 to 8192 each"};
const NumberShape kFrames = {
    ':',
    {{NumberRange::kAny, 0}, {NumberRange::kAny, 0}, {NumberRange::kAny, kAboveZero, DBL_MAX, 1}},
    2,
    "are no frames; expected FIRST:LAST:STEP with 0 <= FIRST <= LAST and STEP > 0",
    [](const Numbers& n) { return n[1] >= n[0] && (n[1] - n[0]) / n[2] < 100000; }};
const NumberShape kCamera = {
    ',', {{NumberRange::kWhole, 0, 1e6}}, 1, "is no camera; expected a number from 0 on, or auto"};
const NumberShape kOrbit = {',',
                            {{NumberRange::kAny, -3600, 3600}, {NumberRange::kAny, -89, 89, 15}},
                            1,
                            "is no direction; expected YAW[,PITCH] in degrees, PITCH from -89 to 89"};
const NumberShape kLook = {',',
                           {kAny, kAny, kAny, kAny, kAny, kAny, {NumberRange::kAny, 1, 170, 45}},
                           6,
                           "is no view; expected EX,EY,EZ,TX,TY,TZ[,FOV]: eye, target and 1 to 170 degrees",
                           [](const Numbers& n) { return n[0] != n[3] || n[1] != n[4] || n[2] != n[5]; }};
const NumberShape kBackground = {',', {kColour}, 1, "is no colour; expected RRGGBB in hexadecimal"};
const NumberShape kLight = {',',
                            {kAny, kAny, kAny, {NumberRange::kColour, 0, DBL_MAX, 0xFFFFFF}},
                            3,
                            "is no light; expected X,Y,Z or X,Y,Z,RRGGBB, at most 4 of them"};
const char kNoNodeChange[] =
    "is no change; expected NAME=hide, NAME=move:X,Y,Z, rotate: (degrees), face: or "
    "shader:MODULE";
const char kNoMaterialChange[] =
    "is no change; expected NAME=diffuse:R,G,B, specular:R,G,B, shininess:N or opacity:N, all but shininess "
    "0 to 1";
const NumberShape kPick = {
    ',', {kAny, kAny}, 2, "is no point; expected X,Y in pixels from the upper left corner"};
const NumberShape kStereo = {
    ',',
    {{NumberRange::kWhole, 1, 3}, kAny},
    2,
    "is no stereo; expected MODE,SEPARATION: 1 red-blue, 2 red-cyan, 3 side by side; pixels"};
const NumberShape kDepthOfField = {',',
                                   {{NumberRange::kAny, 0, 1},
                                    {NumberRange::kAny, 0, 1e6},
                                    {NumberRange::kAny, kAboveZero, 100, 5},
                                    {NumberRange::kWhole, 3, 9, 9}},
                                   2,
                                   "is no depth of field; expected FOCUS,RANGE[,SIGMA,SAMPLES]: FOCUS 0 to "
                                   "1, RANGE from 0 on, SIGMA above 0 "
                                   "and up to 100, SAMPLES 3, 5, 7 or 9",
                                   [](const Numbers& n) { return static_cast<int>(n[3]) % 2 == 1; }};
const NumberShape kHeight = {',', {kAny}, 1, "is no height; expected a number"};

float Float(double number) {
    return static_cast<float>(number);
}

std::string ParseCamera(const std::string& text, RenderOptions* options) {
    Numbers n;
    options->autoCamera = text == "auto";
    if (options->autoCamera) return "";
    const std::string problem = ReadNumbers(text, kCamera, &n);
    if (problem.empty()) options->camera = static_cast<int>(n[0]);
    return problem;
}

QexLight PointLight(const Numbers& n) {
    QexLight light = {QEX_LIGHT_POINT, {Float(n[0]), Float(n[1]), Float(n[2])}, {1, 1, 1, 1}};
    const auto colour = static_cast<unsigned>(n[3]);
    for (int i = 0; i < 3; ++i) light.colour[i] = static_cast<float>(colour >> (16 - 8 * i) & 255) / 255.0f;
    return light;
}

std::string ParseLight(const std::string& text, std::vector<QexLight>* lights) {
    Numbers n;
    std::string problem = ReadNumbers(text, kLight, &n);
    if (problem.empty() && lights->size() == QEX_MAX_LIGHTS) problem = "'" + text + "' " + kLight.fault;
    if (problem.empty()) lights->push_back(PointLight(n));
    return problem;
}

// NAME=CHANGE, which may be NAME=CHANGE:X,Y,Z; a name may hold '='. `ranges`: of the numbers of each kind.
template <class Change, size_t kKinds>
std::string ParseChange(const std::string& text, const ChangeWord (&words)[kKinds], const char* fault,
                        const NumberRange (&ranges)[kKinds], std::vector<Change>* changes) {
    const size_t equals = std::min(text.rfind('='), text.size());
    const std::string change = text.substr(std::min(equals + 1, text.size()));
    for (size_t kind = 0; kind < kKinds; ++kind) {
        const auto& [word, count] = words[kind];
        if (change.compare(0, strlen(word), word) != 0) continue;
        const NumberShape numbers = {',', std::vector<NumberRange>(count, ranges[kind]), count, fault};
        Numbers n;
        if (count ? !ReadNumbers(change.substr(strlen(word)), numbers, &n).empty() : change != word) continue;
        n.resize(3);
        changes->push_back({text.substr(0, equals),
                            static_cast<typename Change::What>(kind),
                            {Float(n[0]), Float(n[1]), Float(n[2])}});
        return "";
    }
    return "'" + text + "' " + fault;
}

std::string ParseNodeChange(const std::string& text, std::vector<NodeChange>* changes) {
    static const NumberRange kRanges[] = {kAny, kAny, kAny, kAny, kAny};
    const std::string word = std::string("=") + kNodeChanges[NodeChange::kShader].word;
    const size_t at = text.rfind(word);
    if (at == text.npos) return ParseChange(text, kNodeChanges, kNoNodeChange, kRanges, changes);
    const std::string shader = text.substr(at + word.size());
    const std::vector<std::string> names = ShaderNames();
    if (std::find(names.begin(), names.end(), shader) == names.end())
        return "'" + shader + "' is no module; expected one of those of --shader";
    changes->push_back({text.substr(0, at), NodeChange::kShader, {0, 0, 0}, shader});
    return "";
}

CLI::Option* AddHeight(CLI::App* app, const char* name, const std::string& help,
                       std::optional<float>* height) {
    return AddNumbers(app, name, help, kHeight, [=](const Numbers& n) { *height = Float(n[0]); });
}

void AddPicture(CLI::App* app, RenderOptions* options) {
    AddNumbers(app, "--size", "WxH in pixels (800x600)", kSize, [=](const Numbers& n) {
        options->width = static_cast<int>(n[0]);
        options->height = static_cast<int>(n[1]);
    });
    app->add_option("--antialias", options->antialias, "samples of a pixel at least: 1, 2 or 4 (4)")
        ->check(CLI::IsMember({1, 2, 4}));
    app->add_option("--frame", options->frame, "animation frame (0)")->check(NumberFrom(0.0, 1e6));
    AddNumbers(app, "--frames", "FIRST:LAST:STEP, a numbered picture each", kFrames, [=](const Numbers& n) {
        options->frames = FrameRange{n[0], n[1], n[2]};
    });
    AddParsed(app, "--camera", "scene camera N, or auto to frame the whole scene (0 if there is one)",
              [=](const std::string& text) { return ParseCamera(text, options); });
    AddNumbers(app, "--orbit", "YAW[,PITCH] of the automatic camera in degrees (30,15)", kOrbit,
               [=](const Numbers& n) {
                   options->autoCamera = options->view.given = true;
                   options->view.yaw = Float(n[0]);
                   options->view.pitch = Float(n[1]);
               });
    AddNumbers(app, "--look",
               "EX,EY,EZ,TX,TY,TZ[,FOV], a camera at a place that looks at another (45 degrees)", kLook,
               [=](const Numbers& n) {
                   options->look = LookView{{Float(n[0]), Float(n[1]), Float(n[2])},
                                            {Float(n[3]), Float(n[4]), Float(n[5])},
                                            Float(n[6])};
               })
        ->excludes(app->get_option("--camera"))
        ->excludes(app->get_option("--orbit"));
    AddUpAxis(app, "the scene's vertical axis (y)", &options->view.up);
    app->add_option("--turn", options->turn, "N pictures of one turn around the scene")
        ->check(WholeNumberFrom(1, 10000))
        ->excludes(app->get_option("--look"));
    AddNumbers(app, "--background", "RRGGBB (404858)", kBackground,
               [=](const Numbers& n) { options->background = static_cast<uint32_t>(n[0]); });
    app->add_option("--text", options->text, "line of text on the picture");
}

// Shaders, lights, shadow and mirrors.
void AddShading(CLI::App* app, EffectOptions* effects) {
    const std::vector<std::string> shaders = ShaderNames();
    AddChoice(app, "--shader", "module to draw with (lit where there are normals)", "shader", shaders,
              [=](size_t index) { effects->shader = shaders[index]; });
    AddParsed(
        app, "--light", "X,Y,Z[,RRGGBB], a point light instead of the scene's; up to 4",
        [=](const std::string& text) { return ParseLight(text, &effects->lights); }, kMostRepeats);
    app->add_flag("--shadow", effects->shadow, "nodes throw shadows on each other and on the floor");
    AddHeight(app, "--mirror", "Y, the height of a mirror under the scene", &effects->mirror);
    AddHeight(app, "--floor", "Y, the height of a floor; it takes shadows and mirrors", &effects->floor);
    app->add_option("--mirror-node", effects->mirrorNode, "flat node that mirrors the others");
}

// What takes a whole picture, and what it does not go with.
void AddEffects(CLI::App* app, EffectOptions* effects) {
    AddNumbers(app, "--stereo", "MODE,SEPARATION: 1 red-blue, 2 red-cyan, 3 side by side; pixels", kStereo,
               [=](const Numbers& n) {
                   effects->stereo = static_cast<uint32_t>(n[0]);
                   effects->separation = Float(n[1]);
               });
    CLI::Option* dof =
        AddNumbers(app, "--dof",
                   "FOCUS,RANGE[,SIGMA,SAMPLES], depth of field: FOCUS 0 to 1 as --shader depth shows it, "
                   "blur per unit of depth (sigma 5, 9 samples)",
                   kDepthOfField, [=](const Numbers& n) {
                       effects->depthOfField = {Float(n[0]), Float(n[1]), Float(n[2]), Float(n[3])};
                   });
    app->add_flag("--dof-full", effects->fullBlur, "blur at full resolution instead of half")->needs(dof);
    CLI::Option* sky = AddTexts(app, "--sky", &effects->sky,
                                "picture of a cross of 4x3 or 3x4 squares, its middle towards -Z; or six "
                                "times a square: towards +X, -X, +Y, -Y, +Z, -Z");
    app->parse_complete_callback([effects] {
        const size_t count = effects->sky.size();
        if (count > 1 && count != 6) throw CLI::ValidationError("--sky", "expected one picture, or six");
    });
    // The shadow map's end sets the viewport of the screen.
    AddHeight(app, "--water", "Y, the height of still water, with --sky; mirrors what is opaque",
              &effects->water)
        ->needs(sky)
        ->excludes(app->get_option("--shadow"));
    // The pictures that depth of field is made from have no stencil, and one eye.
    for (CLI::Option* effect : {dof, sky})
        for (const char* other : {"--mirror", "--mirror-node", "--stereo"})
            effect->excludes(app->get_option(other));
    sky->excludes(dof);
}

void AddEmitters(CLI::App* app, EmitterScene* emitters) {
    CLI::Option* emitter = AddTexts(app, "--emitter", &emitters->emitters,
                                    "particles of an emitter file or a description of one");
    AddTexts(app, "--emitter-texture", &emitters->textures,
             "picture of a frame of their animations, in order (a soft spot); 1 unit a pixel at scale 1")
        ->needs(emitter);
    app->add_option("--emitter-time", emitters->time, "seconds that they have run, 60 updates each (3)")
        ->check(NumberFrom(0.0, 3600.0))
        ->needs(emitter);
}

void AddTextureChoices(CLI::App* app, TextureChoices* choices) {
    AddTextureOption(app, &choices->overrides);
    app->add_option(
           "--flip-textures", choices->flipped,
           "whether V runs down the pictures beside the scene: yes or no (as its export options say, "
           "else no)")
        ->transform(CLI::CheckedTransformer(std::map<std::string, bool>{{"yes", true}, {"no", false}},
                                            CLI::ignore_case));
}

}  // namespace

void SetUpRender(CLI::App* app, RenderOptions* options) {
    EffectOptions* effects = &options->effects;
    app->add_option("FILE", options->input, "POD scene, or - for standard input")->required();
    app->add_option("-o,--output", options->output,
                    "PNG, JPEG, BMP or TGA file, by its extension; a sequence numbers it: NAME-0000, or "
                    "where %04d stands")
        ->required();
    AddPicture(app, options);
    AddShading(app, effects);
    AddEffects(app, effects);
    AddEmitters(app, &effects->emitters);
    AddParsed(
        app, "--node", "NAME=hide, NAME=move:X,Y,Z, rotate:, face: or shader:MODULE",
        [=](const std::string& text) { return ParseNodeChange(text, &effects->nodes); }, kMostRepeats);
    AddParsed(
        app, "--material", "NAME=diffuse:R,G,B, specular:R,G,B, shininess:N or opacity:N",
        [=](const std::string& text) {
            static const NumberRange kShare = {NumberRange::kAny, 0, 1};
            static const NumberRange kRanges[] = {kShare, kShare, {NumberRange::kAny, 0, 1000}, kShare};
            return ParseChange(text, kMaterialChanges, kNoMaterialChange, kRanges, &effects->materials);
        },
        kMostRepeats);
    AddNumbers(
        app, "--pick", "X,Y, prints the nodes whose boxes are there", kPick,
        [=](const Numbers& n) {
            effects->picks.push_back({Float(n[0]), Float(n[1])});
        },
        kMostRepeats);
    AddTextureChoices(app, &options->textures);
    AddParsed(app, "--drawing", "lean, or described, with the GL's errors read after each call (lean)",
              [=](const std::string& text) {
                  options->lean = text == "lean";
                  return options->lean || text == "described" ? ""
                                                              : "'" + text + "' is not lean or described";
              });
    app->add_flag("--stats", options->stats, "print time, draw calls, GL calls, triangles and memory");
    app->add_flag("-q,--quiet", options->quiet, "no progress bar: nothing but warnings and errors");
}
