// The command line of qex render.
#include <algorithm>
#include <cctype>
#include <iterator>
#include <optional>
#include <string>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "render/Command.h"
#include "render/Shading.h"

namespace {

constexpr int kMaxSize = 8192;  // pixels a side
constexpr int kMostRepeats = 1000;

// What is wrong with an option's text; empty when nothing is.
std::string Problem(bool good, const std::string& text, const std::string& is) {
    return good ? "" : "'" + text + "' " + is;
}

bool IsWhole(double number, double least, double most) {
    return number >= least && number <= most && number == static_cast<int>(number);
}

QexVec3 ToVec3(const std::vector<double>& n) {
    return {static_cast<float>(n[0]), static_cast<float>(n[1]), static_cast<float>(n[2])};
}

std::string ParseSize(const std::string& text, RenderOptions* options) {
    const std::vector<double> n = ParseNumbers(text, 'x');
    const bool good = n.size() == 2 && IsWhole(n[0], 1, kMaxSize) && IsWhole(n[1], 1, kMaxSize);
    if (good) options->width = static_cast<int>(n[0]), options->height = static_cast<int>(n[1]);
    return Problem(good, text,
                   "is no size; expected WIDTHxHEIGHT, 1 to " + std::to_string(kMaxSize) + " each");
}

std::string ParseFrames(const std::string& text, RenderOptions* options) {
    std::vector<double> n = ParseNumbers(text, ':');
    if (n.size() == 2) n.push_back(1);
    const bool good = n.size() == 3 && n[0] >= 0 && n[1] >= n[0] && n[2] > 0 && (n[1] - n[0]) / n[2] < 100000;
    options->sequence = true;
    if (good) options->first = n[0], options->last = n[1], options->step = n[2];
    return Problem(good, text,
                   "are no frames; expected FIRST:LAST:STEP with 0 <= FIRST <= LAST and STEP > 0");
}

std::string ParseCamera(const std::string& text, RenderOptions* options) {
    options->autoCamera = text == "auto";
    const std::vector<double> n = ParseNumbers(text);
    const bool good = n.size() == 1 && IsWhole(n[0], 0, 1e6);
    if (good) options->camera = static_cast<int>(n[0]);
    return Problem(good || options->autoCamera, text, "is no camera; expected a number from 0 on, or auto");
}

std::string ParseOrbit(const std::string& text, RenderOptions* options) {
    const std::vector<double> n = ParseNumbers(text);
    const double pitch = n.size() == 2 ? n[1] : 0;
    const bool good =
        (n.size() == 1 || n.size() == 2) && std::abs(n[0]) <= 3600 && pitch >= -89 && pitch <= 89;
    options->autoCamera = options->view.given = true;
    if (good) options->view.yaw = static_cast<float>(n[0]);
    if (good && n.size() == 2) options->view.pitch = static_cast<float>(pitch);
    return Problem(good, text, "is no direction; expected YAW[,PITCH] in degrees, PITCH from -89 to 89");
}

std::string ParseUp(const std::string& text, RenderOptions* options) {
    // In the order of UpAxis.
    const char* const axes[] = {"x", "y", "z", "-x", "-y", "-z"};
    std::string lower = text;
    for (char& c : lower) c = static_cast<char>(tolower(static_cast<unsigned char>(c)));
    const auto found = std::find(std::begin(axes), std::end(axes), lower);
    options->view.up = static_cast<UpAxis>(found - std::begin(axes));
    return Problem(found != std::end(axes), text, "is no axis; expected x, y, z, -x, -y or -z");
}

std::string ParseColour(const std::string& text, RenderOptions* options) {
    return Problem(ParseHexColour(text, &options->background), text,
                   "is no colour; expected RRGGBB in hexadecimal");
}

std::string ParseShader(const std::string& text, RenderOptions* options) {
    options->effects.shader = text;
    return Problem(IsShaderName(text), text, "is no shader; expected one of " + ShaderNames());
}

std::string ParseLight(const std::string& text, RenderOptions* options) {
    size_t comma = 0;
    for (int i = 0; i < 3 && comma != std::string::npos; ++i) comma = text.find(',', comma + (i > 0));
    const std::vector<double> n = ParseNumbers(text.substr(0, comma));
    unsigned colour = 0xFFFFFF;
    std::vector<QexLight>& lights = options->effects.lights;
    const bool good = n.size() == 3 && lights.size() < QEX_MAX_LIGHTS &&
                      (comma == std::string::npos || ParseHexColour(text.substr(comma + 1), &colour));
    if (good) {
        const QexVec3 v = ToVec3(n);
        lights.push_back({QEX_LIGHT_POINT, {v.x, v.y, v.z}, {1, 1, 1, 1}});
        for (int i = 0; i < 3; ++i)
            lights.back().colour[i] = static_cast<float>(colour >> (16 - 8 * i) & 255) / 255.0f;
    }
    return Problem(good, text, "is no light; expected X,Y,Z or X,Y,Z,RRGGBB, at most 4 of them");
}

std::string ParseNode(const std::string& text, RenderOptions* options) {
    const size_t equals = text.rfind('='), colon = text.find(':', equals == std::string::npos ? 0 : equals);
    NodeChange change = {text.substr(0, equals), "", {0, 0, 0}};
    std::vector<double> n;
    if (equals != std::string::npos) change.what = text.substr(equals + 1, colon - equals - 1);
    if (colon != std::string::npos) n = ParseNumbers(text.substr(colon + 1));
    const bool hide = change.what == "hide" && colon == std::string::npos;
    const bool moves = change.what == "move" || change.what == "rotate" || change.what == "face";
    const bool good = hide || (moves && n.size() == 3);
    if (good && moves) change.value = ToVec3(n);
    if (good) options->effects.nodes.push_back(change);
    return Problem(good, text,
                   "is no change; expected NAME=hide, NAME=move:X,Y,Z, rotate: (degrees) or face:");
}

std::string ParsePick(const std::string& text, RenderOptions* options) {
    const std::vector<double> n = ParseNumbers(text);
    const bool good = n.size() == 2;
    if (good) options->effects.picks.push_back({static_cast<float>(n[0]), static_cast<float>(n[1])});
    return Problem(good, text, "is no point; expected X,Y in pixels from the upper left corner");
}

std::string ParseStereo(const std::string& text, RenderOptions* options) {
    const std::vector<double> n = ParseNumbers(text);
    const bool good = n.size() == 2 && IsWhole(n[0], 1, 3);
    if (good) {
        options->effects.stereo = static_cast<uint32_t>(n[0]);
        options->effects.separation = static_cast<float>(n[1]);
    }
    return Problem(good, text,
                   "is no stereo; expected MODE,SEPARATION: 1 red-blue, 2 red-cyan, 3 side by side; pixels");
}

std::string ParseDepthOfField(const std::string& text, RenderOptions* options) {
    std::vector<double> n = ParseNumbers(text);
    if (n.size() == 2) n.insert(n.end(), {5, 9});
    const bool good = n.size() == 4 && n[0] >= 0 && n[0] <= 1 && n[1] >= 0 && n[1] <= 1e6 && n[2] > 0 &&
                      n[2] <= 100 && IsWhole(n[3], 3, 9) && static_cast<int>(n[3]) % 2 == 1;
    if (good)
        options->effects.depthOfField = {static_cast<float>(n[0]), static_cast<float>(n[1]),
                                         static_cast<float>(n[2]), static_cast<float>(n[3])};
    return Problem(good, text,
                   "is no depth of field; expected FOCUS,RANGE[,SIGMA,SAMPLES]: FOCUS 0 to 1, RANGE from 0 "
                   "on, SIGMA above 0 and up to 100, SAMPLES 3, 5, 7 or 9");
}

CLI::Option* AddHeight(CLI::App* app, const char* name, std::optional<float>* height,
                       const std::string& help) {
    return AddParsed(app, name, help, [height](const std::string& text) {
        const std::vector<double> n = ParseNumbers(text);
        if (n.size() == 1) *height = static_cast<float>(n[0]);
        return Problem(n.size() == 1, text, "is no height; expected a number");
    });
}

// Adds the verb's options, whose texts go through the functions above.
class Adder {
  public:
    Adder(CLI::App* app, RenderOptions* options) : app_(app), options_(options) {}
    CLI::Option* operator()(const char* name, const std::string& help,
                            std::string (*parse)(const std::string&, RenderOptions*), int most = 1) const {
        RenderOptions* options = options_;
        return AddParsed(
            app_, name, help, [=](const std::string& text) { return parse(text, options); }, most);
    }

  private:
    CLI::App* app_;
    RenderOptions* options_;
};

void AddPicture(CLI::App* app, RenderOptions* options) {
    const Adder add(app, options);
    add("--size", "WxH in pixels (800x600)", ParseSize);
    app->add_option("--antialias", options->antialias, "samples of a pixel at least: 1, 2 or 4 (4)")
        ->check(CLI::IsMember({1, 2, 4}));
    app->add_option("--frame", options->frame, "animation frame (0)")->check(NumberFrom(0.0, 1e6));
    add("--frames", "FIRST:LAST:STEP, a numbered picture each", ParseFrames);
    add("--camera", "scene camera N, or auto to frame the whole scene (0 if there is one)", ParseCamera);
    add("--orbit", "YAW[,PITCH] of the automatic camera in degrees (30,15)", ParseOrbit);
    add("--up", "the scene's vertical axis (y)", ParseUp)->type_name("{x,y,z,-x,-y,-z}");
    app->add_option("--turn", options->turn, "N pictures of one turn around the scene")
        ->check(NumberFrom(1, 10000));
    add("--background", "RRGGBB (404858)", ParseColour);
    app->add_option("--text", options->text, "line of text on the picture");
}

void AddEffects(CLI::App* app, RenderOptions* options) {
    const Adder add(app, options);
    EffectOptions& effects = options->effects;
    std::string choices = ShaderNames();
    choices.erase(std::remove(choices.begin(), choices.end(), ' '), choices.end());
    add("--shader", "module to draw with (lit where there are normals)", ParseShader)
        ->type_name("{" + choices + "}");
    add("--light", "X,Y,Z[,RRGGBB], a point light instead of the scene's; up to 4", ParseLight, kMostRepeats);
    CLI::Option* shadow =
        app->add_flag("--shadow", effects.shadow, "nodes throw shadows on each other and on the floor");
    CLI::Option* mirror =
        AddHeight(app, "--mirror", &effects.mirror, "Y, the height of a mirror under the scene");
    AddHeight(app, "--floor", &effects.floor, "Y, the height of a floor; it takes shadows and mirrors");
    CLI::Option* mirrorNode =
        app->add_option("--mirror-node", effects.mirrorNode, "flat node that mirrors the others");
    CLI::Option* stereo =
        add("--stereo", "MODE,SEPARATION: 1 red-blue, 2 red-cyan, 3 side by side; pixels", ParseStereo);
    // The pictures that it is made from have no stencil, and one eye.
    CLI::Option* dof =
        add("--dof",
            "FOCUS,RANGE[,SIGMA,SAMPLES], depth of field: FOCUS 0 to 1 as --shader depth shows it, blur per "
            "unit of depth (sigma 5, 9 samples)",
            ParseDepthOfField)
            ->excludes(mirror)
            ->excludes(mirrorNode)
            ->excludes(stereo);
    app->add_flag("--dof-full", effects.fullBlur, "blur at full resolution instead of half")->needs(dof);
    CLI::Option* sky = AddTexts(app, "--sky", &effects.sky,
                                "picture of a cross of 4x3 or 3x4 squares, its middle towards -Z; or six "
                                "times a square: towards +X, -X, +Y, -Y, +Z, -Z")
                           ->excludes(mirror)
                           ->excludes(mirrorNode)
                           ->excludes(stereo)
                           ->excludes(dof);
    app->parse_complete_callback([&effects] {
        const size_t count = effects.sky.size();
        if (count > 1 && count != 6) throw CLI::ValidationError("--sky", "expected one picture, or six");
    });
    // The shadow map's end sets the viewport of the screen.
    AddHeight(app, "--water", &effects.water,
              "Y, the height of still water, with --sky; mirrors what is opaque")
        ->needs(sky)
        ->excludes(shadow);
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

}  // namespace

void SetUpRender(CLI::App* app, RenderOptions* options) {
    app->add_option("FILE", options->input, "POD scene, or - for standard input")->required();
    app->add_option("-o,--output", options->output,
                    "PNG, JPEG, BMP or TGA file, by its extension; a sequence numbers it: NAME-0000, or "
                    "where %04d stands")
        ->required();
    AddPicture(app, options);
    AddEffects(app, options);
    AddEmitters(app, &options->effects.emitters);
    const Adder add(app, options);
    add("--node", "NAME=hide, NAME=move:X,Y,Z, rotate: or face:", ParseNode, kMostRepeats);
    add("--pick", "X,Y, prints the nodes whose boxes are there", ParsePick, kMostRepeats);
    SetUpTextureChoices(app, &options->textures);
    app->add_flag("--stats", options->stats, "print time, draw calls, GL calls, triangles and memory");
    app->add_flag("-q,--quiet", options->quiet, "no progress bar: nothing but warnings and errors");
}
