#include "EmitterCommand.h"

#include <cstdio>
#include <memory>

#include <CLI/CLI.hpp>

#include "CommandLine.h"
#include "EmitterDescription.h"
#include "EngineOutput.h"
#include "TextureFiles.h"

namespace {

int Fail(const std::string& text, int status) {
    fprintf(stderr, "qex emitter: %s\n", text.c_str());
    return status;
}

bool WriteText(const std::string& path, const std::string& text) {
    FILE* file = fopen(path.c_str(), "w");
    if (!file) return false;
    const bool written = fwrite(text.data(), 1, text.size(), file) == text.size();
    return fclose(file) == 0 && written;
}

bool WriteEmitter(const QexParticleEmitter* emitter, const std::string& path) {
    EngineOutput quiet;
    return QexParticleEmitter_WriteToBinFile(emitter, path.c_str()) == 0;
}

}  // namespace

void SetUpEmitter(CLI::App* app, EmitterOptions* options) {
    app->add_option("FILE", options->input,
                    "emitter file, or description as text or JSON (the engine's defaults)");
    CLI::Option* output =
        app->add_option("-o,--output", options->output,
                        "emitter file, or, ending in .txt or .json, description (text on standard output)");
    AddTexts(app, "--set", &options->settings, "FIELD=VALUE, values with commas between them, rows with ';'");
    app->add_flag("--json", options->json, "show as JSON")->excludes(output);
    app->footer(
        "A description names the fields that differ from the defaults, one a line; what this command shows "
        "is\n"
        "one, with all fields and their units. Particles that live in an emitter file are not taken over.");
}

int RunEmitter(const EmitterOptions& options) {
    std::string problem;
    QexParticleEmitter* loaded = options.input.empty() ? NewEmitter() : LoadEmitter(options.input, &problem);
    if (!loaded) return Fail(options.input + ": " + problem, 1);
    const std::unique_ptr<QexParticleEmitter, void (*)(QexParticleEmitter*)> emitter(
        loaded, QexParticleEmitter_Release);
    if (!problem.empty())
        fprintf(stderr, "qex emitter: warning: %s: %s\n", options.input.c_str(), problem.c_str());
    for (const std::string& setting : options.settings)
        if (!SetEmitterField(setting, loaded, &problem)) return Fail("--set: " + problem, 2);
    const std::string extension = Extension(options.output);
    const bool json = options.json || extension == "json";
    const std::string text = json ? EmitterJson(*loaded) : EmitterText(*loaded);
    if (options.output.empty()) {
        fputs(text.c_str(), stdout);
        return 0;
    }
    const bool description = extension == "json" || extension == "txt";
    if (description ? WriteText(options.output, text) : WriteEmitter(loaded, options.output)) return 0;
    return Fail(options.output + ": cannot be written", 2);
}
