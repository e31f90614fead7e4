// The verb that turns emitter files into descriptions and back.
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
    app->add_option("FILE", options->input, "emitter file, or description as JSON (the engine's defaults)");
    app->add_option("-o,--output", options->output,
                    "emitter file, or, ending in .json, description (on standard output)");
    const auto set = [=](const std::string& text) {
        options->settings.emplace_back();
        return ReadSetting(text, &options->settings.back());
    };
    AddParsed(app, "--set", "FIELD=VALUE, values with commas between them, rows with ';'", set, kMostRepeats);
    // What is shown is JSON without it, too, but has not always been.
    app->add_flag("--json")->group("");
    app->footer(
        "A description names the fields that differ from the defaults; what this command shows is one, with\n"
        "all fields. Particles that live in an emitter file are not taken over. The fields, the numbers "
        "that\n"
        "each takes, and what these are:\n" +
        FieldHelp());
}

int RunEmitter(const EmitterOptions& options) {
    const std::string extension = Extension(options.output);
    std::string problem = WhyNotOutput(options.output, {options.input});
    if (problem.empty() && extension == "txt")
        problem = "is no emitter file; a description is JSON, and its name ends in .json";
    if (!problem.empty()) return Fail("emitter", options.output + ": " + problem, 2);
    const InputFile input(options.input);
    QexParticleEmitter* loaded = options.input.empty() ? NewEmitter() : LoadEmitter(input.Path(), &problem);
    if (!loaded) return Fail("emitter", input.Name() + ": " + problem, 1);
    const std::unique_ptr<QexParticleEmitter, void (*)(QexParticleEmitter*)> emitter(
        loaded, QexParticleEmitter_Release);
    if (!problem.empty()) Say("emitter", "warning: " + input.Name() + ": " + problem);
    for (const FieldValues& setting : options.settings) setting.Apply(loaded);
    const std::string text = DescribeEmitter(*loaded);
    if (options.output.empty()) {
        fputs(text.c_str(), stdout);
        return 0;
    }
    std::vector<uint8_t> bytes(text.begin(), text.end());
    if (extension != "json" && !EncodeEmitter(loaded, &bytes))
        return Fail("emitter", options.output + ": cannot be written: no room for a temporary file", 2);
    if (WriteOutput(options.output, bytes, &problem)) return 0;
    return Fail("emitter", options.output + ": " + problem, 2);
}
