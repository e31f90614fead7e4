// The qex command: looks into scenes and textures, draws scenes to pictures, converts other formats to POD.
#include <cstdio>
#include <map>
#include <string>

#include <CLI/CLI.hpp>

#include "ConvertCommand.h"
#include "EmitterCommand.h"
#include "InfoCommand.h"
#include "RenderCommand.h"
#include "SheetCommand.h"
#include "TextureCommand.h"
#include "TextureFormats.h"

namespace {

constexpr int kMaxSize = 8192;  // pixels a side

// Reads "WxH".
std::string ParseSize(const std::string& text, RenderOptions* options) {
    int consumed = 0;
    if (sscanf(text.c_str(), "%dx%d%n", &options->width, &options->height, &consumed) != 2 ||
        static_cast<size_t>(consumed) != text.size() || options->width < 1 || options->height < 1 ||
        options->width > kMaxSize || options->height > kMaxSize)
        return "'" + text + "' is no size; expected WIDTHxHEIGHT, 1 to " + std::to_string(kMaxSize) + " each";
    return "";
}

// Reads "FIRST:LAST:STEP" or "FIRST:LAST".
std::string ParseFrames(const std::string& text, RenderOptions* options) {
    int consumed = 0;
    options->sequence = true;
    const int count = sscanf(text.c_str(), "%lf:%lf%n:%lf%n", &options->first, &options->last, &consumed,
                             &options->step, &consumed);
    const bool whole = count >= 2 && static_cast<size_t>(consumed) == text.size();
    if (!whole || !(options->step > 0) || !(options->first >= 0) || !(options->last >= options->first) ||
        (options->last - options->first) / options->step >= 100000)
        return "'" + text + "' are no frames; expected FIRST:LAST:STEP with 0 <= FIRST <= LAST and STEP > 0";
    return "";
}

std::string ParseCamera(const std::string& text, RenderOptions* options) {
    int consumed = 0;
    options->autoCamera = text == "auto";
    if (options->autoCamera) return "";
    if (sscanf(text.c_str(), "%d%n", &options->camera, &consumed) != 1 ||
        static_cast<size_t>(consumed) != text.size() || options->camera < 0)
        return "'" + text + "' is no camera; expected a number from 0 on, or auto";
    return "";
}

std::string ParseColour(const std::string& text, RenderOptions* options) {
    if (text.size() != 6 || text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos)
        return "'" + text + "' is no colour; expected RRGGBB in hexadecimal";
    options->background = static_cast<uint32_t>(std::stoul(text, nullptr, 16));
    return "";
}

std::string ParseOrbit(const std::string& text, RenderOptions* options) {
    int consumed = 0;
    const int count =
        sscanf(text.c_str(), "%f%n,%f%n", &options->view.yaw, &consumed, &options->view.pitch, &consumed);
    options->autoCamera = options->view.given = true;
    if (count < 1 || static_cast<size_t>(consumed) != text.size() || !(options->view.pitch >= -89) ||
        !(options->view.pitch <= 89) || !(options->view.yaw >= -3600) || !(options->view.yaw <= 3600))
        return "'" + text + "' is no direction; expected YAW[,PITCH] in degrees, PITCH from -89 to 89";
    return "";
}

// Reads "X,Y,Z" as a whole text; false when it is not that.
bool ParsePoint(const std::string& text, QexVec3* point) {
    int consumed = 0;
    return sscanf(text.c_str(), "%f,%f,%f%n", &point->x, &point->y, &point->z, &consumed) == 3 &&
           static_cast<size_t>(consumed) == text.size();
}

std::string ParseShader(const std::string& text, RenderOptions* options) {
    options->effects.shader = text;
    return IsShaderName(text) ? "" : "'" + text + "' is no shader; expected one of " + ShaderNames();
}

std::string ParseLight(const std::string& text, RenderOptions* options) {
    QexLight light = {QEX_LIGHT_POINT, {0, 0, 0}, {1, 1, 1, 1}};
    float* v = light.vector;
    unsigned colour = 0xFFFFFF;
    int consumed = 0;
    const int count =
        sscanf(text.c_str(), "%f,%f,%f%n,%6x%n", v, v + 1, v + 2, &consumed, &colour, &consumed);
    for (int i = 0; i < 3; ++i) light.colour[i] = static_cast<float>(colour >> (16 - 8 * i) & 255) / 255.0f;
    options->effects.lights.push_back(light);
    if (count < 3 || static_cast<size_t>(consumed) != text.size() ||
        options->effects.lights.size() > QEX_MAX_LIGHTS)
        return "'" + text + "' is no light; expected X,Y,Z or X,Y,Z,RRGGBB, at most 4 of them";
    return "";
}

std::string ParseNode(const std::string& text, RenderOptions* options) {
    const size_t equals = text.rfind('='), colon = text.find(':', equals == std::string::npos ? 0 : equals);
    NodeChange change = {text.substr(0, equals), "", {0, 0, 0}};
    if (equals != std::string::npos) change.what = text.substr(equals + 1, colon - equals - 1);
    const bool hide = change.what == "hide" && colon == std::string::npos;
    const bool moves = change.what == "move" || change.what == "rotate" || change.what == "face";
    if (!hide && !(moves && colon != std::string::npos && ParsePoint(text.substr(colon + 1), &change.value)))
        return "'" + text + "' is no change; expected NAME=hide, NAME=move:X,Y,Z, rotate: (degrees) or face:";
    options->effects.nodes.push_back(change);
    return "";
}

std::string ParsePick(const std::string& text, RenderOptions* options) {
    QexVec2 point = {0, 0};
    int consumed = 0;
    if (sscanf(text.c_str(), "%f,%f%n", &point.x, &point.y, &consumed) != 2 ||
        static_cast<size_t>(consumed) != text.size())
        return "'" + text + "' is no point; expected X,Y in pixels from the upper left corner";
    options->effects.picks.push_back(point);
    return "";
}

std::string ParseStereo(const std::string& text, RenderOptions* options) {
    int consumed = 0;
    const int count =
        sscanf(text.c_str(), "%u,%f%n", &options->effects.stereo, &options->effects.separation, &consumed);
    if (count != 2 || static_cast<size_t>(consumed) != text.size() || options->effects.stereo < 1 ||
        options->effects.stereo > 3)
        return "'" + text +
               "' is no stereo; expected MODE,SEPARATION: 1 red-blue, 2 red-cyan, 3 side by side; pixels";
    return "";
}

std::string ParseSky(const std::string& text, RenderOptions* options) {
    options->effects.sky.push_back(text);
    return "";
}

std::string ParseDepthOfField(const std::string& text, RenderOptions* options) {
    DepthOfField dof = {};
    int consumed = 0, samples = 9;
    const int count = sscanf(text.c_str(), "%f,%f%n,%f,%d%n", &dof.focus, &dof.range, &consumed, &dof.sigma,
                             &samples, &consumed);
    dof.samples = static_cast<float>(samples);
    options->effects.depthOfField = dof;
    const bool whole = (count == 2 || count == 4) && static_cast<size_t>(consumed) == text.size();
    if (!whole || !(dof.focus >= 0 && dof.focus <= 1) || !(dof.range >= 0 && dof.range <= 1e6f) ||
        !(dof.sigma > 0 && dof.sigma <= 100) || samples < 3 || samples > 9 || samples % 2 == 0)
        return "'" + text +
               "' is no depth of field; expected FOCUS,RANGE[,SIGMA,SAMPLES]: FOCUS 0 to 1, RANGE from 0 on, "
               "SIGMA above 0 and up to 100, SAMPLES 3, 5, 7 or 9";
    return "";
}

template <std::optional<float> EffectOptions::*kHeight>
std::string ParseHeight(const std::string& text, RenderOptions* options) {
    float height = 0;
    int consumed = 0;
    if (sscanf(text.c_str(), "%f%n", &height, &consumed) != 1 || static_cast<size_t>(consumed) != text.size())
        return "'" + text + "' is no height; expected a number";
    options->effects.*kHeight = height;
    return "";
}

// An option whose text goes through one of the parsers above.
CLI::Option* AddParsed(CLI::App* app, const std::string& name, const std::string& help,
                       RenderOptions* options, std::string (*parse)(const std::string&, RenderOptions*)) {
    return app->add_option_function<std::string>(
        name,
        [=](const std::string& text) {
            const std::string problem = parse(text, options);
            if (!problem.empty()) throw CLI::ValidationError(name, problem);
        },
        help);
}

// The same for an option that may be given several times.
CLI::Option* AddRepeated(CLI::App* app, const std::string& name, const std::string& help,
                         RenderOptions* options, std::string (*parse)(const std::string&, RenderOptions*)) {
    return app
        ->add_option_function<std::vector<std::string>>(
            name,
            [=](const std::vector<std::string>& texts) {
                for (const std::string& text : texts) {
                    const std::string problem = parse(text, options);
                    if (!problem.empty()) throw CLI::ValidationError(name, problem);
                }
            },
            help)
        ->type_size(1)
        ->expected(1, 1000)
        ->allow_extra_args(false);
}

void SetUpRender(CLI::App* app, RenderOptions* options) {
    app->add_option("FILE", options->input, "POD scene")->required();
    app->add_option("-o,--output", options->output, "PNG file; a sequence numbers it")->required();
    AddParsed(app, "--size", "WxH in pixels (800x600)", options, ParseSize);
    app->add_option("--frame", options->frame, "animation frame (0)")->check(CLI::Range(0.0, 1e6));
    AddParsed(app, "--frames", "FIRST:LAST:STEP, a numbered picture each", options, ParseFrames);
    AddParsed(app, "--camera", "scene camera N, or auto to frame the whole scene (0 if there is one)",
              options, ParseCamera);
    AddParsed(app, "--orbit", "YAW[,PITCH] of the automatic camera in degrees (30,15)", options, ParseOrbit);
    app->add_option("--up", options->view.up, "the scene's vertical axis: x, y, z, -x, -y or -z (y)")
        ->transform(CLI::CheckedTransformer(std::map<std::string, UpAxis>{{"x", UpAxis::kX},
                                                                          {"y", UpAxis::kY},
                                                                          {"z", UpAxis::kZ},
                                                                          {"-x", UpAxis::kMinusX},
                                                                          {"-y", UpAxis::kMinusY},
                                                                          {"-z", UpAxis::kMinusZ}}));
    app->add_option("--turn", options->turn, "N pictures of one turn around the scene")
        ->check(CLI::Range(1, 10000));
    AddParsed(app, "--background", "RRGGBB (404858)", options, ParseColour);
    app->add_option("--text", options->text, "line of text on the picture");
    AddParsed(app, "--shader", "module to draw with: " + ShaderNames(), options, ParseShader);
    AddRepeated(app, "--light", "X,Y,Z[,RRGGBB], a point light instead of the scene's; up to 4", options,
                ParseLight);
    CLI::Option* shadow = app->add_flag("--shadow", options->effects.shadow,
                                        "nodes throw shadows on each other (with --shader shadow)");
    CLI::Option* mirror = AddParsed(app, "--mirror", "Y, the height of a mirror under the scene", options,
                                    ParseHeight<&EffectOptions::mirror>);
    AddParsed(app, "--floor", "Y, the height of a floor; it takes shadows and mirrors", options,
              ParseHeight<&EffectOptions::floor>);
    CLI::Option* mirrorNode =
        app->add_option("--mirror-node", options->effects.mirrorNode, "flat node that mirrors the others");
    CLI::Option* stereo =
        AddParsed(app, "--stereo", "MODE,SEPARATION: 1 red-blue, 2 red-cyan, 3 side by side; pixels", options,
                  ParseStereo);
    // The pictures that it is made from have no stencil, and one eye.
    CLI::Option* dof = AddParsed(
        app, "--dof",
        "FOCUS,RANGE[,SIGMA,SAMPLES], depth of field: FOCUS 0 to 1 as --shader depth shows it, blur per "
        "unit of depth (sigma 5, 9 samples)",
        options, ParseDepthOfField);
    dof->excludes(mirror)->excludes(mirrorNode)->excludes(stereo);
    app->add_flag("--dof-full", options->effects.fullBlur, "blur at full resolution instead of half")
        ->needs(dof);
    CLI::Option* sky = AddRepeated(app, "--sky",
                                   "picture of a cross of 4x3 or 3x4 squares, its middle towards -Z; or six "
                                   "times a square: towards +X, -X, +Y, -Y, +Z, -Z",
                                   options, ParseSky);
    sky->excludes(mirror)->excludes(mirrorNode)->excludes(stereo)->excludes(dof);
    // The shadow map's end sets the viewport of the screen.
    AddParsed(app, "--water", "Y, the height of still water, with --sky; mirrors what is opaque", options,
              ParseHeight<&EffectOptions::water>)
        ->needs(sky)
        ->excludes(shadow);
    const auto addFiles = [app](const char* name, std::vector<std::string>* files, const char* help) {
        return app->add_option(name, *files, help)->type_size(1)->expected(1, 1000)->allow_extra_args(false);
    };
    EmitterScene& emitters = options->effects.emitters;
    CLI::Option* emitter =
        addFiles("--emitter", &emitters.emitters, "particles of an emitter file or a description of one");
    addFiles("--emitter-texture", &emitters.textures,
             "picture of a frame of their animations, in order (a soft spot); 1 unit a pixel at scale 1")
        ->needs(emitter);
    app->add_option("--emitter-time", emitters.time, "seconds that they have run, 60 updates each (3)")
        ->check(CLI::Range(0.0, 3600.0))
        ->needs(emitter);
    AddRepeated(app, "--node", "NAME=hide, NAME=move:X,Y,Z, rotate: or face:", options, ParseNode);
    AddRepeated(app, "--pick", "X,Y, prints the nodes whose boxes are there", options, ParsePick);
    SetUpTextureChoices(app, &options->textures);
    app->add_flag("--stats", options->stats, "print time, draw calls, GL calls, triangles and memory");
    app->add_flag("-q,--quiet", options->quiet, "no progress bar");
}

void SetUpSheet(CLI::App* app, SheetOptions* options) {
    app->add_option("PICTURES", options->inputs, "pictures, row by row")->required();
    app->add_option("-o,--output", options->output, "PNG file")->required();
    app->add_option("--columns", options->columns, "pictures in a row (4)")->check(CLI::Range(1, 1000));
    app->add_option("--gap", options->gap, "pixels between pictures (4)")->check(CLI::Range(0, 1000));
}

void SetUpTexture(CLI::App* app, TextureOptions* options) {
    app->add_option("IN", options->input, "PNG, JPEG, TGA, ... picture, or PVR or KTX texture");
    app->add_option("-o,--output", options->output, "PNG picture, or PVR or KTX texture, by its extension")
        ->required();
    app->add_option("--format", options->format, FormatNames() + " (rgba8888 with alpha, rgb888 without)");
    app->add_flag("--mipmaps", options->mipmaps, "write the whole mipmap chain");
    app->add_flag("--flip", options->flip, "turn the rows over; else the first is the picture's top");
    app->add_option("--faces", options->faces, "instead of IN: squares +X -X +Y -Y +Z -Z of a cube map")
        ->expected(1, 100);
    app->add_option("--level", options->level, "mipmap level of the texture IN (0)")
        ->check(CLI::Range(0, 31));
    app->add_option("--face", options->face, "face of the cube map IN (PNG: 0; PVR and KTX: all)")
        ->check(CLI::Range(0, 5));
    app->footer(
        "ETC1 has no alpha: that of the picture goes into a second file, NAME_a. KTX files have no l8, la88\n"
        "and a8; those in etc1 are black until QexTexture_SetFilter is called, unless they have --mipmaps.\n"
        "PVRTC is read, not written. In a picture luminance is grey, and alpha 8 is white with alpha. From\n"
        "texture to texture blocks and mipmaps are made anew.");
}

void SetUpEmitter(CLI::App* app, EmitterOptions* options) {
    app->add_option("FILE", options->input,
                    "emitter file, or description as text or JSON (the engine's defaults)");
    CLI::Option* output =
        app->add_option("-o,--output", options->output,
                        "emitter file, or, ending in .txt or .json, description (text on standard output)");
    app->add_option("--set", options->settings, "FIELD=VALUE, values with commas between them, rows with ';'")
        ->type_size(1)
        ->expected(1, 1000)
        ->allow_extra_args(false);
    app->add_flag("--json", options->json, "show as JSON")->excludes(output);
    app->footer(
        "A description names the fields that differ from the defaults, one a line; what this command shows "
        "is\n"
        "one, with all fields and their units. Particles that live in an emitter file are not taken over.");
}

// The first line of what CLI11 has to say. It asks for a verb first, whatever stands in its place: an unknown
// word or option there is named instead.
int ReportUsage(const CLI::App& app, const CLI::ParseError& error, int argc, char** argv) {
    std::string verb;
    for (const CLI::App* used : app.get_subcommands()) verb = " " + used->get_name();
    std::string text = error.what();
    text = text.substr(0, text.find('\n'));
    if (verb.empty() && argc > 1)
        text = (argv[1][0] == '-' ? "unknown option '" : "unknown verb '") + std::string(argv[1]) +
               "'; expected info, render, convert, texture, emitter or sheet";
    fprintf(stderr, "qex%s: %s\n", verb.c_str(), text.c_str());
    return 2;
}

}  // namespace

int main(int argc, char** argv) {
    CLI::App app("Qex: looks into, draws and converts 3D scenes for OpenGL ES 2.0");
    app.require_subcommand(1);
    app.set_version_flag("--version", "qex " QEX_VERSION);
    InfoOptions info;
    RenderOptions render;
    ConvertOptions convert;
    TextureOptions texture;
    EmitterOptions emitter;
    SheetOptions sheet;
    CLI::App* infoApp = app.add_subcommand("info", "what is in a POD, PVR, KTX or TGA file");
    SetUpInfo(infoApp, &info);
    CLI::App* renderApp = app.add_subcommand("render", "draw a POD scene to PNG");
    SetUpRender(renderApp, &render);
    CLI::App* convertApp = app.add_subcommand("convert", "make a POD scene from another format");
    SetUpConvert(convertApp, &convert);
    CLI::App* textureApp = app.add_subcommand("texture", "make a texture of a picture, or a picture of one");
    SetUpTexture(textureApp, &texture);
    CLI::App* emitterApp = app.add_subcommand("emitter", "show, edit or write a particle emitter");
    SetUpEmitter(emitterApp, &emitter);
    CLI::App* sheetApp = app.add_subcommand("sheet", "put several pictures into one");
    SetUpSheet(sheetApp, &sheet);
    renderApp->parse_complete_callback([&render] {
        const size_t count = render.effects.sky.size();
        if (count > 1 && count != 6) throw CLI::ValidationError("--sky", "expected one picture, or six");
    });
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        if (error.get_exit_code() == 0) return app.exit(error);
        return ReportUsage(app, error, argc, argv);
    }
    if (infoApp->parsed()) return RunInfo(info);
    if (renderApp->parsed()) return RunRender(render);
    if (textureApp->parsed()) return RunTexture(texture);
    if (emitterApp->parsed()) return RunEmitter(emitter);
    if (sheetApp->parsed()) return RunSheet(sheet);
    return RunConvert(convert);
}
