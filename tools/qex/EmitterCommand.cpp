#include "EmitterCommand.h"

#include <cstdio>
#include <memory>

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
