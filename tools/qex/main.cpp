// The qex command: looks into scenes and textures, draws scenes to pictures, converts other formats to POD.
#include <cstdio>
#include <functional>
#include <string>

#include <assimp/DefaultLogger.hpp>
#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/Manual.h"
#include "common/OutputFile.h"
#include "common/Usage.h"
#include "convert/Command.h"
#include "emitter/Command.h"
#include "info/Command.h"
#include "render/Command.h"
#include "sheet/Command.h"
#include "texture/Command.h"
#include "thumbnail/Command.h"
#ifdef QEX_VIEWER
#include "view/Command.h"
#endif

namespace {

constexpr char kExitStatus[] =
    "Exit status: 0 done, warnings included; 1 a file cannot be used; 2 a wrong option or an output that\n"
    "cannot be written. \"-\" as a file is standard input or output.";

struct Verb {
    const char* name;
    const char* help;
    std::function<void(CLI::App*)> setUp;
    std::function<int()> run;
    bool hidden = false;
};

void SetUpVerb(CLI::App* app, const Verb& verb) {
    CLI::App* sub = app->add_subcommand(verb.name, verb.help);
    verb.setUp(sub);
    if (verb.hidden) {
        sub->group("");
        return;
    }
    if (!sub->get_option_no_throw("--quiet"))
        sub->add_flag("-q,--quiet", GetTalk().quiet, "say nothing but warnings and errors");
    sub->add_flag("-v,--verbose", GetTalk().verbose, "show the log of the engine, or of the importer");
    const std::string footer = sub->get_footer();
    sub->footer((footer.empty() ? "" : footer + "\n") + kExitStatus);
}

int RunVerb(int argc, char** argv) {
    CLI::App app("Qex: looks into, draws and converts 3D scenes for OpenGL ES 2.0", "qex");
    app.require_subcommand(1);
    app.set_version_flag("--version", "qex " QEX_VERSION);
    InfoOptions info;
    RenderOptions render;
    ConvertOptions convert;
    TextureOptions texture;
    EmitterOptions emitter;
    SheetOptions sheet;
    ThumbnailOptions thumbnail;
#ifdef QEX_VIEWER
    ViewOptions view;
#endif
    std::string shell, page;
    const Verb verbs[] = {
        {"info", "what is in a POD, PVR, KTX or TGA file", [&](CLI::App* a) { SetUpInfo(a, &info); },
         [&] { return RunInfo(info); }},
        {"render", "draw a POD scene to PNG", [&](CLI::App* a) { SetUpRender(a, &render); },
         [&] { return RunRender(render); }},
#ifdef QEX_VIEWER
        {"view", "show scenes in a window", [&](CLI::App* a) { SetUpView(a, &view); },
         [&] { return RunView(view); }},
#endif
        {"convert", "make a POD scene from another format", [&](CLI::App* a) { SetUpConvert(a, &convert); },
         [&] { return RunConvert(convert); }},
        {"texture", "make a texture of a picture, or a picture of one",
         [&](CLI::App* a) { SetUpTexture(a, &texture); }, [&] { return RunTexture(texture); }},
        {"emitter", "show, edit or write a particle emitter", [&](CLI::App* a) { SetUpEmitter(a, &emitter); },
         [&] { return RunEmitter(emitter); }},
        {"sheet", "put several pictures into one", [&](CLI::App* a) { SetUpSheet(a, &sheet); },
         [&] { return RunSheet(sheet); }},
        {"thumbnail", "draw a small picture of any scene",
         [&](CLI::App* a) { SetUpThumbnail(a, &thumbnail); }, [&] { return RunThumbnail(thumbnail); }},
        {"completion", "print what a shell needs to complete the command line",
         [&](CLI::App* a) {
             a->add_option("SHELL", shell, "bash")->required()->check(CLI::IsMember({"bash"}));
         },
         [&] { return Print(BashCompletion(app)); }, true},
        {"man", "print the manual page of the command or of a verb, as roff",
         [&](CLI::App* a) { a->add_option("VERB", page, "verb"); }, [&] { return PrintManual(app, page); },
         true},
    };
    for (const Verb& verb : verbs) SetUpVerb(&app, verb);
    app.footer(std::string("\"qex VERB --help\" lists a verb's options.\n") + kExitStatus);
    try {
        app.parse(Words(argc, argv));
    } catch (const CLI::ParseError& error) {
        if (error.get_exit_code() == 0) return app.exit(error);
        return ReportUsage(app, error, argc, argv);
    }
    if (GetTalk().verbose)
        Assimp::DefaultLogger::create("", Assimp::Logger::NORMAL, aiDefaultLogStream_STDERR);
    for (const Verb& verb : verbs)
        if (app.got_subcommand(verb.name)) return verb.run();
    return 2;
}

}  // namespace

int main(int argc, char** argv) {
    const int status = RunVerb(argc, argv);
    std::string problem;
    if (FinishStandardOutput(&problem)) return status;
    fprintf(stderr, "qex: %s\n", problem.c_str());
    return status ? status : 2;
}
