// The steps of a conversion, from the file to the report.
#include "convert/Command.h"

#include <algorithm>
#include <exception>
#include <filesystem>

#include <assimp/config.h>
#include <assimp/postprocess.h>
#include <assimp/scene.h>
#include <assimp/Importer.hpp>
#include <CLI/CLI.hpp>

#include "common/OutputFile.h"
#include "common/TextureFiles.h"
#include "convert/Animation.h"
#include "convert/Gltf.h"
#include "convert/Log.h"
#include "convert/Process.h"
#include "convert/Scene.h"
#include "PodWriter.h"
#include "Qex.h"

namespace fs = std::filesystem;

namespace {

// What is particular about the importer of a file type.
struct FileType {
    const char* extension;
    bool textureReplacesColour;
    bool linearColours;
    CameraQuirks cameras;
};

constexpr FileType kFileTypes[] = {
    {"dae", true, false, {}},
    {"zae", true, false, {}},
    {"fbx", true, false, {}},
    {"3ds", true, false, {false, false, true}},
    {"ase", true, false, {false, true, false}},
    {"gltf", false, true, {true, false, false}},
    {"glb", false, true, {true, false, false}},
};

SceneSettings SettingsFor(const ConvertOptions& options) {
    SceneSettings settings;
    settings.fps = options.fps;
    settings.maxBones = options.maxBones;
    const std::string extension = Extension(options.input);
    for (const FileType& type : kFileTypes) {
        if (extension != type.extension) continue;
        settings.materials = {type.textureReplacesColour, type.linearColours, {}};
        settings.cameras = type.cameras;
    }
    return settings;
}

int BadArgument(const std::string& subject, const std::string& text) {
    return Fail("convert", subject + ": " + text, kBadArgument);
}

std::string OutputDirectory(const ConvertOptions& options) {
    const std::string directory = fs::path(options.output).parent_path().string();
    return directory.empty() ? "." : directory;
}

// kDone, or the status to end with after a message.
int CheckArguments(const ConvertOptions& options) {
    std::error_code ec;
    if (options.input == "-" || options.output == "-") {
        return BadArgument("-", "no file; a scene and its textures lie side by side in a folder");
    }
    if (options.listClips) return kDone;
    if (options.output.empty() || fs::is_directory(options.output, ec)) {
        return BadArgument(options.output.empty() ? "--output" : options.output,
                           "no file name; the name of the POD file to write is expected");
    }
    if (!fs::is_directory(OutputDirectory(options), ec)) {
        return BadArgument(options.output, "cannot be written; its folder does not exist");
    }
    std::vector<std::string> inputs = {options.input};
    for (const auto& [material, file] : options.textures) inputs.push_back(file);
    const std::string problem = WhyNotOutput(options.output, inputs);
    return problem.empty() ? kDone : BadArgument(options.output, problem);
}

const aiScene* Import(const std::string& path, Assimp::Importer* importer) {
    // Degenerate triangles are told by their shape: an area limit would drop small models whole.
    importer->SetPropertyBool(AI_CONFIG_PP_FD_CHECKAREA, false);
    const aiScene* scene = importer->ReadFile(path, aiProcess_Triangulate | aiProcess_GenSmoothNormals |
                                                        aiProcess_CalcTangentSpace | aiProcess_SortByPType |
                                                        aiProcess_FindDegenerates | aiProcess_GenUVCoords |
                                                        aiProcess_TransformUVCoords);
    // Its joining of vertices does not look at their colours and the bones that they follow.
    if (!scene || std::any_of(scene->mMeshes, scene->mMeshes + scene->mNumMeshes,
                              [](const aiMesh* mesh) { return mesh->HasBones() || mesh->mColors[0]; })) {
        return scene;
    }
    return importer->ApplyPostProcessing(aiProcess_JoinIdenticalVertices | aiProcess_ImproveCacheLocality);
}

std::vector<std::string> MaterialNames(const aiScene& scene) {
    std::vector<std::string> names;
    for (unsigned i = 0; i < scene.mNumMaterials; ++i)
        names.push_back(scene.mMaterials[i]->GetName().C_Str());
    return names;
}

void PrintSummary(const ConvertOptions& options, const pod::Scene& scene, const TextureSet& textures,
                  const ConvertLog& log) {
    unsigned long vertices = 0, triangles = 0;
    int batches = 0;
    for (const pod::Mesh& mesh : scene.meshes) {
        batches += mesh.batchCount;
        vertices += mesh.vertexCount;
        triangles += mesh.faceCount;
    }
    std::printf("%s: meshes %zu, vertices %lu, triangles %lu, nodes %zu, mesh nodes %u, materials %zu, ",
                options.output.c_str(), scene.meshes.size(), vertices, triangles, scene.nodes.size(),
                scene.meshNodeCount, scene.materials.size());
    std::printf("cameras %zu, lights %zu, frames %u at %u per second, ", scene.cameras.size(),
                scene.lights.size(), scene.frameCount, scene.fps.value_or(0));
    if (batches) std::printf("bone batches %d, ", batches);
    if (batches && scene.frameCount) std::printf("bind pose at frame 0, animation from frame 1, ");
    std::printf("textures %zu in %d files beside it, warnings %d\n", textures.Names().size(),
                textures.FilesWritten(), log.Warnings());
}

// Null after a message.
const aiScene* ReadScene(const std::string& path, Assimp::Importer* importer, ConvertLog* log) {
    std::string error;
    if (!IsRegularFile(path)) {
        log->Error("cannot be read; an existing scene file is expected");
        return nullptr;
    }
    if (!CheckGltf(path, &error)) {
        log->Error(error);
        return nullptr;
    }
    const aiScene* scene = Import(path, importer);
    if (scene && scene->mRootNode) return scene;
    std::string reason = scene ? "it holds no nodes" : importer->GetErrorString();
    reason.resize(std::min(reason.size(), reason.find('\n')));
    if (reason.find("bad_alloc") != std::string::npos) throw std::bad_alloc();
    log->Error("cannot be read as a scene; glTF, FBX, Collada, OBJ, 3DS or X is expected (" + reason + ")");
    return nullptr;
}

// The settings that name parts of the scene. kDone, or the status to end with after a message.
int ChooseParts(const ConvertOptions& options, const aiScene& source, SceneSettings* settings) {
    std::string error;
    if (!options.clip.empty()) {
        const int clip = FindClip(source, options.clip, &error);
        if (clip < 0) return BadArgument("--clip", error);
        settings->clip = clip;
    }
    settings->materials.overrides = options.textures;
    error = UnknownMaterial(options.textures, MaterialNames(source));
    return error.empty() ? kDone : BadArgument("--texture", error);
}

int ConvertFile(const ConvertOptions& options) {
    ConvertLog log(options.input);
    Assimp::Importer importer;
    const aiScene* source = ReadScene(options.input, &importer, &log);
    if (!source) return kBadInput;
    if (options.listClips) {
        ListClips(*source);
        if (!source->mNumAnimations) log.Error("has no animations");
        return kDone;
    }
    std::string error;
    const std::string names = ClipNames(*source);
    if (!options.clipsTo.empty() && !WriteOutput(options.clipsTo, names.data(), names.size(), &error))
        return BadArgument(options.clipsTo, error);
    SceneSettings settings = SettingsFor(options);
    int status = ChooseParts(options, *source, &settings);
    if (status != kDone) return status;
    TextureSet textures(source, options.input, OutputDirectory(options), options.textureFormat, &log);
    pod::Scene scene;
    status = ConvertScene(*source, settings, &textures, &log, &scene, &error);
    if (status != kDone) {
        log.Error(error);
        return status;
    }
    if (!textures.WriteError().empty()) return Fail("convert", textures.WriteError(), kBadArgument);
    if (!PlaceScene(options.placement, &scene)) log.Warn("has no size that could be made to fit");
    if (!WriteOutput(options.output, pod::WritePod(scene), &error)) return BadArgument(options.output, error);
    if (!options.quiet) PrintSummary(options, scene, textures, log);
    return kDone;
}

}  // namespace

void SetUpConvert(CLI::App* app, ConvertOptions* options) {
    app->add_option("IN", options->input, "scene: glTF, FBX, Collada, OBJ, 3DS, X, ...")->required();
    app->add_option("-o,--output", options->output,
                    "POD scene, needed unless clips are listed; its textures are written beside it");
    app->add_option("--fps", options->fps, "frames per second of the sampled animation (30)")
        ->check(WholeNumberFrom(1, 1000));
    app->add_option("--clip", options->clip, "animation to convert, by name or index (the first)");
    app->add_option("--clips-to", options->clipsTo)->group("");
    app->add_flag("--list-clips", options->listClips,
                  "print index, name, seconds and channels of the animations; convert nothing");
    app->add_option("--max-bones", options->maxBones, "most bones in a batch of a skinned mesh (16)")
        ->check(WholeNumberFrom(1, QEX_MAX_BATCH_BONES));
    AddChoice(app, "--texture-format", "etc1, rgba8888 or rgb888 (etc1)", "texture format",
              TextureFormatNames(),
              [=](size_t index) { options->textureFormat = static_cast<TextureFormat>(index); });
    AddTextureOption(app, &options->textures);
    SetUpPlacement(app, &options->placement);
    app->add_option("--memory", options->memory, "megabytes of memory that it may take (4096)")
        ->check(WholeNumberFrom(64, 1 << 24));
    app->add_flag("-q,--quiet", options->quiet, "no summary");
}

int RunConvert(const ConvertOptions& options) {
    const int argumentStatus = CheckArguments(options);
    if (argumentStatus != kDone) return argumentStatus;
    return RunInProcess(options.input, options.memory, [&]() -> int {
        try {
            return ConvertFile(options);
        } catch (const std::bad_alloc&) {
            ConvertLog(options.input).Error(NeedsMoreMemory(options.memory));
        } catch (const std::exception& failure) {  // such as a folder that vanishes while it is read
            ConvertLog(options.input).Error(std::string("cannot be converted (") + failure.what() + ")");
        }
        return kBadInput;
    });
}
