// Files that come as bytes, and contexts that come and go.
#include <algorithm>
#include <cstdio>
#include <filesystem>

#include "common/EngineOutput.h"
#include "common/ImageFile.h"
#include "common/TextureFiles.h"
#include "front/Viewer.h"
#include "PodBuild.h"

namespace {

// What is taken for a texture.
const char* const kTextures[] = {"pvr", "ktx", "tga", "png", "jpg", "jpeg", "bmp"};

}  // namespace

std::string Viewer::KeepBytes(const std::string& name, const void* bytes, size_t size) {
    const std::filesystem::path temporary = std::filesystem::temp_directory_path();
    std::error_code error;
    for (int i = 0; folder_.empty() && i < 1000; ++i) {
        const std::string folder = (temporary / ("qex-view-" + std::to_string(i))).string();
        if (std::filesystem::create_directory(folder, error)) folder_ = folder + "/";
    }
    // A name from elsewhere leads nowhere else.
    const std::string path = folder_ + FileName(SlashedPath(name));
    FILE* file = folder_.empty() ? nullptr : fopen(path.c_str(), "wb");
    const bool whole = file && fwrite(bytes, 1, size, file) == size;
    if (file) fclose(file);
    if (whole) return path;
    Fail(name + ": there is no room for it among the temporary files");
    return "";
}

void Viewer::OpenBytes(const std::string& name, const void* bytes, size_t size) {
    const std::string path = KeepBytes(name, bytes, size), extension = Extension(path);
    if (path.empty()) return;
    if (extension == "pod") {
        addedScene_ = path;
    } else if (extension == "emitter" || extension == "json") {
        SceneOptions options = options_;
        options.effects.emitters.emitters.push_back(path);
        SetOptions(options);
    } else if (std::find(std::begin(kTextures), std::end(kTextures), extension) != std::end(kTextures)) {
        addedTexture_ = path;
    } else {
        Fail(name + ": is no POD scene, texture or emitter; qex convert makes scenes of other files");
    }
}

void Viewer::OpenAdded() {
    const std::string scene = addedScene_, texture = addedTexture_;
    addedScene_.clear();
    addedTexture_.clear();
    if (!scene.empty()) return Open(scene, FileName(scene));
    if (texture.empty()) return;
    const QexModel* model = view_->Model();
    const std::string name = FileName(texture);
    bool shown = false;
    for (uint32_t i = 0; model && i < model->scene.textureCount; ++i)
        if (const char* known = model->scene.textures[i].name)
            shown |= Lower(WithoutExtension(FileName(SlashedPath(known)))) == Lower(WithoutExtension(name));
    shown ? Reload(path_) : ShowTexture(name);
}

// A texture of the folder on an upright rectangle of its shape.
void Viewer::ShowTexture(const std::string& name) {
    const std::string path = folder_ + name, extension = Extension(name);
    float width = 1, height = 1;
    Image image;
    std::string ignored;
    QexTexture texture = {};
    const bool container = extension == "pvr" || extension == "ktx";
    const auto load = extension == "ktx" ? QexTexture_LoadKTXFromFile : QexTexture_LoadPVRFromFile;
    if (container ? load(&texture, path.c_str(), nullptr, 1, 0) == 0 : LoadImage(path, &image, &ignored)) {
        width = static_cast<float>(container ? texture.width : image.width);
        height = static_cast<float>(container ? static_cast<int>(texture.height) : image.height);
    }
    if (texture.glName) QexTexture_Release(&texture);
    const float longest = std::max({width, height, 1.0f});
    const float x = width / longest, y = height / longest;
    pod::MeshArrays mesh;
    mesh.positions = {{-x, -y, 0}, {x, -y, 0}, {x, y, 0}, {-x, y, 0}};
    mesh.uvs = {{0, 0}, {1, 0}, {1, 1}, {0, 1}};
    mesh.indices = {0, 1, 2, 0, 2, 3};
    pod::Scene scene;
    scene.materials.resize(1);
    scene.materials[0].diffuseTexture = 0;
    scene.textures = {name};
    scene.meshes = {pod::BuildMesh(mesh)};
    scene.nodes = {pod::BuildNode(name, {}, -1, 0, 0)};
    scene.meshNodeCount = 1;
    const std::string file = folder_ + "texture.pod";
    if (!pod::WriteFile(file, pod::WritePod(scene)))
        return Fail(name + ": there is no room for it among the temporary files");
    Open(file, name);
    camera_.Look(0, 0);
}

void Viewer::ContextLost() {
    EngineOutput quiet;
    QexEngine_ContextLost();
}

void Viewer::ContextRestored() {
    EngineOutput output;
    if (QexEngine_ContextRestored() != 0) Say(output.FirstError());
    inside_.Forget();
    over_.Forget();
    const std::string loading = loadingPath_, name = loadingName_;
    if (view_->IsLoading())
        Open(loading, name);
    else if (!path_.empty())
        Reload(path_);
}
