#include "emitter/Command.h"

#include <cstdio>
#include <memory>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/EngineOutput.h"
#include "common/OutputFile.h"
#include "common/TextureFiles.h"
#include "emitter/Description.h"

namespace {

int Fail(const std::string& text, int status) {
    fprintf(stderr, "qex emitter: %s\n", text.c_str());
    return status;
}

// The engine writes emitters to files alone.
bool EncodeEmitter(const QexParticleEmitter* emitter, std::vector<uint8_t>* bytes) {
    EngineOutput quiet;
    std::string ignored;
    const std::string path = NewTemporaryFile();
    const bool read = QexParticleEmitter_WriteToBinFile(emitter, path.c_str()) == 0 &&
                      ReadFileBytes(path, SIZE_MAX, bytes, &ignored);
    remove(path.c_str());
    return read;
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
    std::string problem = WhyNotOutput(options.output, {options.input});
    if (!problem.empty()) return Fail(options.output + ": " + problem, 2);
    const InputFile input(options.input);
    QexParticleEmitter* loaded = options.input.empty() ? NewEmitter() : LoadEmitter(input.Path(), &problem);
    if (!loaded) return Fail(input.Name() + ": " + problem, 1);
    const std::unique_ptr<QexParticleEmitter, void (*)(QexParticleEmitter*)> emitter(
        loaded, QexParticleEmitter_Release);
    if (!problem.empty())
        fprintf(stderr, "qex emitter: warning: %s: %s\n", input.Name().c_str(), problem.c_str());
    for (const std::string& setting : options.settings)
        if (!SetEmitterField(setting, loaded, &problem)) return Fail("--set: " + problem, 2);
    const std::string extension = Extension(options.output);
    const bool json = options.json || extension == "json";
    const std::string text = json ? EmitterJson(*loaded) : EmitterText(*loaded);
    if (options.output.empty()) {
        fputs(text.c_str(), stdout);
        return 0;
    }
    std::vector<uint8_t> bytes(text.begin(), text.end());
    const bool description = extension == "json" || extension == "txt";
    if (!description && !EncodeEmitter(loaded, &bytes))
        return Fail(options.output + ": cannot be written: no room for a temporary file", 2);
    if (WriteOutput(options.output, bytes, &problem)) return 0;
    return Fail(options.output + ": " + problem, 2);
}
