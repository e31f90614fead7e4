// The qex command: looks into scenes and textures, draws scenes to pictures, converts other formats to POD.
#include <cstdio>
#include <string>

#include <CLI/CLI.hpp>

#include "ConvertCommand.h"
#include "EmitterCommand.h"
#include "InfoCommand.h"
#include "OutputFile.h"
#include "RenderCommand.h"
#include "SheetCommand.h"
#include "TextureCommand.h"

namespace {

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

int RunVerb(int argc, char** argv) {
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

}  // namespace

int main(int argc, char** argv) {
    const int status = RunVerb(argc, argv);
    std::string problem;
    if (FinishStandardOutput(&problem)) return status;
    fprintf(stderr, "qex: %s\n", problem.c_str());
    return status ? status : 2;
}
