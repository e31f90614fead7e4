// The hooks through which the engine asks for a model's textures, and what they find.
#include "scene/Textures.h"

#include <cstdio>
#include <cstring>
#include <map>

#include <GLES2/gl2.h>

#include "common/TextureFiles.h"
#include "info/Exporter.h"

namespace {

constexpr uint32_t kNormalMapUnit = 1;  // of the normal-mapped modules

// Where a model's textures come from; the engine's hook takes no pointer of ours.
struct Lookup {
    std::string directory;
    TextureOverrides overrides;
    bool vRunsDown = false;
    std::vector<std::string> problems;
    std::vector<bool> coloured;          // by material: with a texture of its colour
    std::vector<QexTexture> normalMaps;  // by material
};

std::map<const QexModel*, Lookup>& Lookups() {
    static std::map<const QexModel*, Lookup> lookups;
    return lookups;
}

Lookup& LookupOf(const QexModel* model) {
    return Lookups()[model];
}

// A record that the model will release and free.
QexTexture* NewTexture() {
    QexTexture* texture = static_cast<QexTexture*>(QexMemory_Alloc(sizeof(QexTexture)));
    if (texture) memset(texture, 0, sizeof *texture);
    return texture;
}

// The record that the engine has just made for the material whose texture it wants.
uint32_t CurrentMaterial(const QexModel* model) {
    uint32_t material = model->scene.materialCount;
    while (material-- > 0)
        if (model->textures[material]) return material;
    return 0;
}

int NextPowerOfTwo(int size) {
    int power = 1;
    while (power < size) power *= 2;
    return power;
}

void ReleaseNormalMaps(Lookup* lookup) {
    for (QexTexture& texture : lookup->normalMaps)
        if (texture.glName) QexTexture_Release(&texture);
    lookup->normalMaps.clear();
}

// Uploads pixels with mipmaps, repeating; GL ES 2.0 wants powers of two for that.
void Upload(QexTexture* texture, Image image, const std::string& name) {
    GLint most = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &most);
    int width = NextPowerOfTwo(image.width), height = NextPowerOfTwo(image.height);
    while (width > most) width /= 2;
    while (height > most) height /= 2;
    if (width != image.width || height != image.height) image = ResizeImage(image, width, height);
    QexTexture_CreateFromPixels(texture, width, height, QEX_TEXFMT_RGBA8888, 0, 0, QEX_FILTER_LINEAR,
                                QEX_WRAP_REPEAT, image.pixels.data());
    texture->pixels = nullptr;
    glGenerateMipmap(GL_TEXTURE_2D);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_LINEAR_MIPMAP_LINEAR);
    QexTexture_SetName(texture, name.c_str());
}

// Reads a picture with the row first that lies at V = 0.
bool ReadPicture(Lookup* lookup, const char* what, const std::string& path, Image* image) {
    std::string error;
    if (!LoadImage(path, image, &error)) {
        lookup->problems.push_back(std::string(what) + " " + path + ": " + error);
        return false;
    }
    if (!lookup->vRunsDown) *image = FlipRows(*image);
    return true;
}

// Reads a picture into the model's texture of a material.
bool LoadPicture(QexModel* model, uint32_t material, const std::string& path) {
    Image image;
    if (!ReadPicture(&LookupOf(model), "texture", path, &image)) return false;
    Upload(model->textures[material], image, FileName(path));
    if (!image.hasAlpha) return true;
    model->alphaTextures[material] = NewTexture();
    if (model->alphaTextures[material])
        Upload(model->alphaTextures[material], AlphaAsGrey(image), FileName(path));
    return true;
}

// Pictures hold a normal's x in red and y in green; the engine reads them the other way round.
bool LoadNormalPicture(Lookup* lookup, QexTexture* texture, const std::string& path) {
    Image image;
    if (!ReadPicture(lookup, "normal map", path, &image)) return false;
    for (size_t i = 0; i < image.pixels.size(); i += 4) std::swap(image.pixels[i], image.pixels[i + 1]);
    Upload(texture, image, FileName(path));
    return true;
}

// A PVR or KTX file into an empty record.
bool LoadContainer(QexTexture* texture, const std::string& path) {
    const auto load = Extension(path) == "ktx" ? QexTexture_LoadKTXFromFile : QexTexture_LoadPVRFromFile;
    return load(texture, path.c_str(), nullptr, 1, 0) == 0;
}

// The file given for a material in place of its own texture; empty when none is.
std::string Chosen(const QexModel* model, uint32_t material) {
    const char* name = model->scene.materials[material].name;
    return OverrideOf(LookupOf(model).overrides, name ? name : "");
}

// Whether a mesh has what a normal map is laid on.
bool HasTangents(const QexPODMesh& mesh) {
    return mesh.attributes[QEX_ELEMENT_TANGENT].componentCount &&
           mesh.attributes[QEX_ELEMENT_BINORMAL].componentCount;
}

int32_t BindNormalMap(QexModel* model, uint32_t nodeIndex) {
    const QexPODNode& node = model->scene.nodes[nodeIndex];
    const size_t material = static_cast<size_t>(node.materialIndex);
    std::vector<QexTexture>& maps = LookupOf(model).normalMaps;
    if (node.materialIndex >= 0 && material < maps.size() && maps[material].glName &&
        HasTangents(model->scene.meshes[node.objectIndex]))
        QexTexture_Set(&maps[material], kNormalMapUnit);
    return 0;
}

int32_t LoadTextureHook(QexModel* model, char* path, int32_t capacity) {
    // Those that are given come later, as materials without a texture get them, too.
    if (!Chosen(model, CurrentMaterial(model)).empty()) return 1;
    const TextureFile found = FindTexture(LookupOf(model).directory, path + LookupOf(model).directory.size());
    if (found.kind == TextureFile::kMissing) {
        LookupOf(model).problems.push_back("texture " + std::string(path) +
                                           " is missing (no .pvr, .ktx or picture of that name)");
        return 0;
    }
    if (found.kind == TextureFile::kPicture)
        return LoadPicture(model, CurrentMaterial(model), found.path) ? 1 : 0;
    if (static_cast<int32_t>(found.path.size()) <= capacity)
        snprintf(path, static_cast<size_t>(capacity) + 1, "%s", found.path.c_str());
    return 0;
}

// A texture of one texel for a material that has none.
QexTexture* ColourTexture(const QexPODMaterial& material, bool white) {
    QexTexture* texture = NewTexture();
    if (!texture) return nullptr;
    uint8_t texel[4] = {0, 0, 0, 255};
    for (int i = 0; i < 3; ++i) {
        const float c = white ? 1 : material.diffuse[i];
        texel[i] = static_cast<uint8_t>((c > 0 ? c < 1 ? c : 1.0f : 0.0f) * 255.0f + 0.5f);
    }
    QexTexture_CreateFromPixels(texture, 1, 1, QEX_TEXFMT_RGBA8888, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_REPEAT,
                                texel);
    texture->pixels = nullptr;
    return texture;
}

// The file that a material's colour comes from; empty when there is none.
std::string FileOf(const QexModel* model, uint32_t material) {
    const std::string given = Chosen(model, material);
    const int32_t index = model->scene.materials[material].diffuseTexture;
    if (!given.empty() || index < 0 || !model->scene.textures[index].name) return given;
    return FindTexture(LookupOf(model).directory, model->scene.textures[index].name).path;
}

void LoadGiven(QexModel* model, uint32_t material, const std::string& path) {
    if (!model->textures[material]) QexModel_ReplaceTextureByIdx(model, NewTexture(), material);
    const std::string extension = Extension(path);
    if (extension != "pvr" && extension != "ktx")
        LoadPicture(model, material, path);
    else if (!LoadContainer(model->textures[material], path))
        LookupOf(model).problems.push_back("texture " + path + " cannot be loaded");
}

// The alpha texture of a material, where the engine has looked for it under another name.
void FindAlpha(QexModel* model, uint32_t material, const std::string& file) {
    const int32_t index = model->scene.materials[material].diffuseTexture;
    if (file.empty() || model->alphaTextures[material]) return;
    const bool given = !Chosen(model, material).empty();
    const TextureFile found =
        given ? FindTexture(Directory(file), AlphaPath(FileName(file)))
              : FindTexture(LookupOf(model).directory, AlphaPath(model->scene.textures[index].name));
    if (found.kind != TextureFile::kContainer) return;
    QexTexture* texture = NewTexture();
    if (texture && LoadContainer(texture, found.path)) {
        model->alphaTextures[material] = texture;
        return;
    }
    QexMemory_Free(texture);
}

}  // namespace

std::vector<std::string> LoadNormalMaps(QexModel* model) {
    const QexPODModel& scene = model->scene;
    Lookup& lookup = LookupOf(model);
    ReleaseNormalMaps(&lookup);
    lookup.problems.clear();
    lookup.normalMaps.assign(scene.materialCount, {});
    for (uint32_t i = 0; i < scene.materialCount; ++i) {
        const int32_t index = scene.materials[i].bumpTexture;
        if (index < 0 || !scene.textures[index].name) continue;
        const TextureFile found = FindTexture(LookupOf(model).directory, scene.textures[index].name);
        if (found.kind == TextureFile::kMissing)
            LookupOf(model).problems.push_back("normal map " + LookupOf(model).directory +
                                               scene.textures[index].name + " is missing");
        else if (found.kind == TextureFile::kPicture)
            LoadNormalPicture(&lookup, &lookup.normalMaps[i], found.path);
        else if (!LoadContainer(&lookup.normalMaps[i], found.path))
            LookupOf(model).problems.push_back("normal map " + found.path + " cannot be loaded");
    }
    for (uint32_t i = 0; i < scene.meshNodeCount; ++i) {
        const QexPODNode& node = scene.nodes[i];
        if (node.materialIndex >= 0 && lookup.normalMaps[static_cast<size_t>(node.materialIndex)].glName &&
            !HasTangents(scene.meshes[node.objectIndex]))
            LookupOf(model).problems.push_back("mesh node " + std::to_string(i) +
                                               " has no tangents: its normal map is not used");
    }
    model->bindTextureHook = BindNormalMap;
    return lookup.problems;
}

const char* FormatName(const QexTexture& texture) {
    static const char* const kNames[] = {"compressed or other", "RGBA 8888", "RGBA 4444", "RGBA 5551",
                                         "RGB 565"};
    return kNames[texture.format < 5 ? texture.format : 0];
}

bool HasTexture(const QexModel* model, uint32_t material) {
    const std::vector<bool>& coloured = LookupOf(model).coloured;
    return model->textures[material] && material < coloured.size() && !coloured[material];
}

void RecolourTextures(QexModel* model, const std::vector<bool>& lit) {
    const std::vector<bool>& coloured = LookupOf(model).coloured;
    for (uint32_t i = 0; i < model->scene.materialCount && i < coloured.size(); ++i) {
        if (!coloured[i]) continue;
        QexTexture* before =
            QexModel_ReplaceTextureByIdx(model, ColourTexture(model->scene.materials[i], lit[i]), i);
        if (before) QexTexture_Release(before);
        QexMemory_Free(before);
    }
}

std::vector<std::string> TextureFilesOf(const QexModel* model) {
    std::vector<std::string> files;
    for (uint32_t i = 0; i < model->scene.materialCount; ++i) {
        const std::string file = FileOf(model, i);
        if (!file.empty()) files.push_back(file);
    }
    return files;
}

void ForgetTextures(QexModel* model) {
    ReleaseNormalMaps(&LookupOf(model));
    Lookups().erase(model);
}

QexTexture* NewPictureTexture(const Image& image, const std::string& name) {
    QexTexture* texture = NewTexture();
    if (texture) Upload(texture, image, name);
    return texture;
}

void SetTextureHook(QexModel* model, const std::string& directory, const std::string& scenePath,
                    const TextureChoices& choices) {
    Lookup& lookup = LookupOf(model);
    lookup = {};
    lookup.directory = directory;
    lookup.overrides = choices.overrides;
    lookup.vRunsDown = choices.flipped.value_or(ReadExporterText(scenePath).FlipsTextureV().value_or(false));
    model->loadTextureHook = LoadTextureHook;
}

std::string CheckTextureChoices(const QexModel* model) {
    std::vector<std::string> names;
    for (uint32_t i = 0; i < model->scene.materialCount; ++i) {
        const char* name = model->scene.materials[i].name;
        names.push_back(name ? name : "");
    }
    return UnknownMaterial(LookupOf(model).overrides, names);
}

std::vector<std::string> CompleteTextures(QexModel* model, const std::vector<bool>& lit) {
    QexPODModel& scene = model->scene;
    Lookup& lookup = LookupOf(model);
    for (uint32_t i = 0; i < scene.materialCount; ++i) {
        const std::string given = Chosen(model, i), file = FileOf(model, i);
        if (!given.empty()) LoadGiven(model, i, given);
        const QexTexture* texture = model->textures[i];
        if (texture && texture->glName == 0) {
            // The picture could not be read; the engine keeps an empty record for it.
            QexMemory_Free(QexModel_ReplaceTextureByIdx(model, nullptr, i));
            texture = nullptr;
        }
        lookup.coloured.push_back(!texture);
        if (!texture) QexModel_ReplaceTextureByIdx(model, ColourTexture(scene.materials[i], lit[i]), i);
        FindAlpha(model, i, file);
        // A KTX file sets no filter, and GL's own takes the nearest texel of each level.
        if (texture && Extension(file) == "ktx") QexTexture_SetFilter(model->textures[i], QEX_FILTER_LINEAR);
    }
    for (uint32_t i = 0; i < scene.meshNodeCount; ++i) {
        QexPODNode& node = scene.nodes[i];
        if (node.materialIndex >= 0 && model->alphaTextures[node.materialIndex])
            node.blendFlags &= static_cast<uint8_t>(~QEX_NODE_OPAQUE);
    }
    return lookup.problems;
}
