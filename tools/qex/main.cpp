// The qex command: looks into scenes and textures, draws scenes to pictures, converts other formats to POD.
#include <cstdio>
#include <functional>
#include <string>
#include <vector>

#include <assimp/DefaultLogger.hpp>
#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/Manual.h"
#include "common/OutputFile.h"
#include "convert/Command.h"
#include "emitter/Command.h"
#include "info/Command.h"
#include "render/Command.h"
#include "sheet/Command.h"
#include "texture/Command.h"

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

// The first line of what CLI11 has to say. It asks first for what is missing, whatever stands in its place:
// an unknown word or option there is named instead.
int ReportUsage(const CLI::App& app, const CLI::ParseError& error, int argc, char** argv) {
    std::string text = error.what(), verb;
    text = text.substr(0, text.find('\n'));
    if (dynamic_cast<const CLI::ConversionError*>(&error)) text += "; a number is expected";
    std::vector<std::string> verbs;
    for (const CLI::App* sub : app.get_subcommands([](const CLI::App* s) { return !s->get_group().empty(); }))
        verbs.push_back(sub->get_name());
    for (const CLI::App* used : app.get_subcommands()) {
        verb = " " + used->get_name();
        for (const std::string& word : used->remaining())
            if (word.size() > 1 && word[0] == '-') {
                text = "unknown option '" + word + "'" + Suggestion(word, OptionNames(*used));
                break;
            }
    }
    if (verb.empty() && argc > 1) {
        text = (argv[1][0] == '-' ? "unknown option '" : "unknown verb '") + std::string(argv[1]) +
               "'; expected ";
        for (const std::string& name : verbs)
            text += name + (name == verbs.back() ? "" : name == verbs[verbs.size() - 2] ? " or " : ", ");
        text += Suggestion(argv[1], verbs);
    }
    fprintf(stderr, "qex%s: %s\n", verb.c_str(), text.c_str());
    return 2;
}

// The words of the command line, last one first, as CLI11 takes them. An axis behind --up would be taken for
// an option of one letter.
std::vector<std::string> Words(int argc, char** argv) {
    std::vector<std::string> words;
    for (int i = argc - 1; i > 0; --i) {
        const std::string word = argv[i];
        if (word == "--up" && !words.empty() && words.back().size() == 2 && words.back()[0] == '-')
            words.back() = word + "=" + words.back();
        else
            words.push_back(word);
    }
    return words;
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
    std::string shell, page;
    const Verb verbs[] = {
        {"info", "what is in a POD, PVR, KTX or TGA file", [&](CLI::App* a) { SetUpInfo(a, &info); },
         [&] { return RunInfo(info); }},
        {"render", "draw a POD scene to PNG", [&](CLI::App* a) { SetUpRender(a, &render); },
         [&] { return RunRender(render); }},
        {"convert", "make a POD scene from another format", [&](CLI::App* a) { SetUpConvert(a, &convert); },
         [&] { return RunConvert(convert); }},
        {"texture", "make a texture of a picture, or a picture of one",
         [&](CLI::App* a) { SetUpTexture(a, &texture); }, [&] { return RunTexture(texture); }},
        {"emitter", "show, edit or write a particle emitter", [&](CLI::App* a) { SetUpEmitter(a, &emitter); },
         [&] { return RunEmitter(emitter); }},
        {"sheet", "put several pictures into one", [&](CLI::App* a) { SetUpSheet(a, &sheet); },
         [&] { return RunSheet(sheet); }},
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
