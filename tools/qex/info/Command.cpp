// Tells the formats apart, and shows what was found.
#include "info/Command.h"

#include <cstdint>
#include <cstdio>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/OutputFile.h"
#include "common/TextureFiles.h"
#include "info/Info.h"
#include "render/Diagnosis.h"

namespace {

constexpr char kReadable[] = "a POD scene or a PVR, KTX or TGA texture";
constexpr size_t kStartBytes = 16;  // enough to tell the formats apart

// Whether the first block is one that POD files begin with, in either byte order.
bool IsPod(const std::vector<uint8_t>& start) {
    if (start.size() < 4) return false;
    const uint32_t id = QexImage_ReadWord(start.data());
    return (id >= 1000 && id <= 1003) || id == 0xE8030000u;
}

bool Describe(const std::string& path, Json* document, std::string* error) {
    std::vector<uint8_t> bytes;
    ReadFileBytes(path, kStartBytes, &bytes, error);
    if (IsPod(bytes)) return DescribeScene(path, document, error);
    if (QexKtx_Is(BytesOf(bytes)) || QexPvr_Is(BytesOf(bytes)))
        return DescribeContainer(path, document, error);
    *error = WhyNotPod(path, kReadable);
    if (!error->empty()) return false;
    if (Extension(path) == "tga")
        return ReadFileBytes(path, SIZE_MAX, &bytes, error) && DescribeTga(bytes, document, error);
    if (Extension(path) == "pod") return DescribeScene(path, document, error);
    *error = std::string("is not ") + kReadable;
    ReadFileBytes(path, QEX_EMITTER_FILE_SIZE + 1, &bytes, error);
    if (bytes.size() == QEX_EMITTER_FILE_SIZE) *error += "; if it is an emitter file, qex emitter shows it";
    return false;
}

}  // namespace

bool DescribeContainer(const std::string& path, Json* document, std::string* error) {
    std::vector<uint8_t> bytes;
    if (!ReadFileBytes(path, SIZE_MAX, &bytes, error)) return false;
    if (QexKtx_Is(BytesOf(bytes))) return DescribeKtx(bytes, document, error);
    if (QexPvr_Is(BytesOf(bytes))) return DescribePvr(bytes, document, error);
    *error = "is neither a PVR texture with the header of 52 or 44 bytes nor a KTX 1.1 texture";
    return false;
}

void SetUpInfo(CLI::App* app, InfoOptions* options) {
    app->add_option("FILES", options->inputs, "files to look into, - for standard input")->required();
    app->add_flag("-q,--quiet", GetTalk().quiet, "only what would draw wrong, a line each");
    app->add_flag("--json", options->json,
                  "as JSON, several files as an array, and nothing else on standard output");
}

int RunInfo(const InfoOptions& options) {
    Json documents = Json::array();
    int status = 0;
    for (const std::string& path : options.inputs) {
        const InputFile input(path);
        Json document = {{"file", CleanText(input.Name())}};
        std::string error;
        if (Describe(input.Path(), &document, &error)) {
            documents.push_back(document);
            continue;
        }
        Say("info", CleanText(input.Name()) + ": " + CleanText(error));
        status = 1;
    }
    if (options.json && !documents.empty())
        printf("%s\n", (options.inputs.size() == 1 ? documents[0] : documents).dump(2).c_str());
    if (options.json) return status;
    for (const Json& document : documents) {
        if (!GetTalk().quiet) {
            PrintInfo(document);
            if (&document != &documents.back()) printf("\n");
            continue;
        }
        for (const Json& problem : document["problems"])
            printf("%s: %s\n", document["file"].get<std::string>().c_str(),
                   problem.get<std::string>().c_str());
    }
    return status;
}
