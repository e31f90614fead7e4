// A scene as JSON: a function for each kind of record.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>
#include <set>

#include "common/ImageFile.h"
#include "common/SceneBounds.h"
#include "common/TextureFiles.h"
#include "info/Exporter.h"
#include "info/Info.h"

namespace {

// Vertices looked at for the bounds, of all nodes together: in frame 0, and in all other frames together.
constexpr size_t kBoundsPoints = 4u << 20;
constexpr size_t kAnimationPoints = 1u << 20;
constexpr uint32_t kMostFrames = 200;  // looked at for the bounds of an animation
constexpr double kDegrees = 180 / 3.14159265358979;

const char* const kDataTypes[] = {"unset",
                                  "float",
                                  "int",
                                  "unsigned short",
                                  "packed RGBA",
                                  "packed ARGB",
                                  "packed D3D colour",
                                  "four unsigned bytes",
                                  "three packed 10-bit fields",
                                  "16.16 fixed point",
                                  "unsigned byte",
                                  "short",
                                  "normalised short",
                                  "byte",
                                  "normalised byte",
                                  "normalised unsigned byte",
                                  "normalised unsigned short",
                                  "unsigned int"};

Json TextOrNull(const char* text) {
    return text ? Json(CleanText(text)) : Json();
}

template <size_t N>
Json Floats(const float (&values)[N]) {
    return Json(values);
}

Json BoundsJson(const Bounds& bounds) {
    if (bounds.empty) return nullptr;
    return {{"low", {bounds.low.x, bounds.low.y, bounds.low.z}},
            {"high", {bounds.high.x, bounds.high.y, bounds.high.z}}};
}

void DescribeExporter(const std::string& path, Json* document) {
    const ExporterText text = ReadExporterText(path);
    if (text.history) (*document)["exporter"] = CleanText(*text.history);
    if (text.options) (*document)["exportOptions"] = CleanText(*text.options);
    if (text.FlipsTextureV()) (*document)["flipTextureV"] = *text.FlipsTextureV();
}

// ---- Nodes ----

std::set<int32_t> BonesOf(const QexPODModel& scene) {
    std::set<int32_t> bones;
    for (uint32_t m = 0; m < scene.meshCount; ++m) {
        const QexBoneBatches& batches = scene.meshes[m].boneBatches;
        if (!scene.meshes[m].skinned) continue;
        for (int32_t b = 0; b < batches.batchCount; ++b) {
            const int32_t* row = batches.boneTable + static_cast<ptrdiff_t>(b) * batches.maxBones;
            bones.insert(row, row + batches.bonesPerBatch[b]);
        }
    }
    return bones;
}

const char* NodeKind(const QexPODModel& scene, uint32_t index, const std::set<int32_t>& bones) {
    if (index < scene.meshNodeCount) return "mesh";
    if (index < scene.meshNodeCount + scene.lightCount) return "light";
    if (index < scene.meshNodeCount + scene.lightCount + scene.cameraCount) return "camera";
    return bones.count(static_cast<int32_t>(index)) ? "bone" : "plain";
}

Json AnimatedChannels(const QexPODNode& node) {
    static const char* const names[] = {"position", "rotation", "scale", "matrix"};
    Json list = Json::array();
    for (uint32_t bit = 0; bit < 4; ++bit)
        if (node.animationFlags & 1u << bit) list.push_back(names[bit]);
    return list;
}

// The nodes in the order of the tree, each with its depth: parents come before their children.
Json DescribeNodes(const QexPODModel& scene) {
    const std::set<int32_t> bones = BonesOf(scene);
    std::vector<std::vector<uint32_t>> children(scene.nodeCount + size_t{1});  // the last: roots
    for (uint32_t i = scene.nodeCount; i-- > 0;) {
        const int32_t parent = scene.nodes[i].parentIndex;
        children[parent < 0 ? scene.nodeCount : static_cast<size_t>(parent)].push_back(i);
    }
    struct Open {
        uint32_t node, depth;
    };
    std::vector<Open> open;
    for (uint32_t root : children[scene.nodeCount]) open.push_back({root, 0});
    Json list = Json::array();
    while (!open.empty()) {
        const Open at = open.back();
        open.pop_back();
        const QexPODNode& node = scene.nodes[at.node];
        const char* kind = NodeKind(scene, at.node, bones);
        Json entry = {
            {"index", at.node}, {"name", TextOrNull(node.name)}, {"kind", kind}, {"depth", at.depth}};
        entry["parent"] = node.parentIndex;
        if (at.node < scene.meshNodeCount) {
            entry["mesh"] = node.objectIndex;
            entry["material"] = node.materialIndex;
        }
        if (node.animationFlags && scene.frameCount > 1) entry["animated"] = AnimatedChannels(node);
        list.push_back(std::move(entry));
        for (uint32_t child : children[at.node]) open.push_back({child, at.depth + 1});
    }
    return list;
}

// ---- Meshes ----

Json DescribeElements(const QexPODMesh& mesh) {
    Json list = Json::array();
    const auto add = [&](const std::string& name, const CPODData& element) {
        if (!element.componentCount) return;
        const size_t types = sizeof kDataTypes / sizeof kDataTypes[0];
        list.push_back({{"name", name},
                        {"type", element.type < types ? kDataTypes[element.type] : "unknown"},
                        {"components", element.componentCount},
                        {"stride", element.stride}});
    };
    add("positions", mesh.vertices);
    add("normals", mesh.normals);
    add("tangents", mesh.tangents);
    add("binormals", mesh.binormals);
    for (uint32_t i = 0; i < mesh.uvwChannelCount; ++i) add("UV " + std::to_string(i), mesh.uvws[i]);
    add("colours", mesh.colours);
    add("bone indices", mesh.boneIndices);
    add("bone weights", mesh.boneWeights);
    return list;
}

Json DescribeMesh(const QexPODMesh& mesh, uint32_t index) {
    Json entry = {{"index", index},
                  {"vertices", mesh.vertexCount},
                  {"faces", mesh.faceCount},
                  {"strips", mesh.stripCount},
                  {"indexBits", !mesh.faces.data                          ? 0
                                : mesh.faces.type == QEX_POD_UNSIGNED_INT ? 32
                                                                          : 16},
                  {"interleaved", mesh.interleaved != nullptr},
                  {"elements", DescribeElements(mesh)},
                  {"skinned", mesh.skinned != 0},
                  {"unpackMatrix", memcmp(&mesh.unpackMatrix, &g_sMatIdentity, sizeof(QexMatrix)) != 0}};
    const QexBoneBatches& batches = mesh.boneBatches;
    if (!batches.batchCount) return entry;
    const int32_t most = *std::max_element(batches.bonesPerBatch, batches.bonesPerBatch + batches.batchCount);
    entry["boneBatches"] = {{"count", batches.batchCount}, {"mostBones", most}};
    return entry;
}

// ---- Materials and textures ----

Json DescribeMaterial(const QexPODModel& scene, uint32_t index) {
    const QexPODMaterial& m = scene.materials[index];
    const struct {
        const char* name;
        int32_t texture;
    } slots[] = {{"diffuse", m.diffuseTexture},
                 {"ambient", m.ambientTexture},
                 {"specular", m.specularColourTexture},
                 {"specularLevel", m.specularLevelTexture},
                 {"bump", m.bumpTexture},
                 {"emissive", m.emissiveTexture},
                 {"glossiness", m.glossinessTexture},
                 {"opacity", m.opacityTexture},
                 {"reflection", m.reflectionTexture},
                 {"refraction", m.refractionTexture}};
    Json textures = Json::object();
    for (const auto& slot : slots)
        if (slot.texture >= 0)
            textures[slot.name] = {{"texture", slot.texture},
                                   {"name", TextOrNull(scene.textures[slot.texture].name)}};
    Json entry = {{"index", index},
                  {"name", TextOrNull(m.name)},
                  {"opacity", m.opacity},
                  {"ambient", Floats(m.ambient)},
                  {"diffuse", Floats(m.diffuse)},
                  {"specular", Floats(m.specular)},
                  {"shininess", m.shininess},
                  {"textures", textures}};
    if (m.effectFile) entry["effectFile"] = CleanText(m.effectFile);
    if (m.effectName) entry["effect"] = CleanText(m.effectName);
    return entry;
}

// Materials that let through what is behind them: by their opacity, or the alpha of their texture.
Json DescribeTranslucency(const QexPODModel& scene, const Json& textures) {
    Json list = Json::array();
    for (uint32_t i = 0; i < scene.materialCount; ++i) {
        const QexPODMaterial& m = scene.materials[i];
        Json entry = {{"index", i}, {"name", TextOrNull(m.name)}, {"opacity", m.opacity}};
        const Json texture = m.diffuseTexture < 0 ? Json() : textures[static_cast<size_t>(m.diffuseTexture)];
        if (texture.contains("alphaFile"))
            entry["alphaFile"] = texture["alphaFile"];
        else if (texture.contains("picture") && texture["picture"].value("alpha", false))
            entry["alphaFile"] = texture["file"];
        if (m.opacity < 1 || entry.contains("alphaFile")) list.push_back(std::move(entry));
    }
    return list;
}

// Which file stands for the texture, and whether it can be read.
Json DescribeTexture(const std::string& directory, const char* name, uint32_t index) {
    Json entry = {{"index", index}, {"name", TextOrNull(name)}, {"found", false}};
    if (!name) return entry;
    const TextureFile file = FindTexture(directory, name);
    std::string error;
    if (file.kind != TextureFile::kMissing) {
        entry["found"] = true;
        entry["file"] = CleanText(file.path);
    }
    if (file.kind == TextureFile::kContainer) {
        Json container;
        if (DescribeContainer(file.path, &container, &error)) {
            entry["content"] = std::move(container);
        } else {
            entry["content"] = {{"format", "unknown"}, {"loads", false}, {"problems", Json::array({error})}};
        }
    } else if (file.kind == TextureFile::kPicture) {
        // The engine reads no such pictures; qex render decodes them.
        Image image;
        const bool read = LoadImage(file.path, &image, &error);
        entry["picture"] = {{"loads", read}};
        if (read)
            entry["picture"].update(
                {{"width", image.width}, {"height", image.height}, {"alpha", image.hasAlpha}});
        else
            entry["picture"]["problem"] = error;
    }
    const std::string alphaName = AlphaPath(name);
    const TextureFile alpha = alphaName.empty() ? TextureFile() : FindTexture(directory, alphaName);
    if (alpha.kind == TextureFile::kContainer) entry["alphaFile"] = CleanText(alpha.path);
    return entry;
}

// ---- Lights and cameras ----

std::string LightType(uint32_t type) {
    static const char* const names[] = {"point", "directional", "spot"};
    return type < 3 ? names[type] : "unknown (" + std::to_string(type) + ")";
}

Json DescribeLights(const QexPODModel& scene) {
    Json list = Json::array();
    for (uint32_t i = 0; i < scene.lightCount; ++i) {
        const QexPODLight& light = scene.lights[i];
        list.push_back({{"index", i},
                        {"node", scene.meshNodeCount + i},
                        {"type", LightType(light.type)},
                        {"colour", Floats(light.colour)},
                        {"target", light.targetIndex}});
    }
    return list;
}

Json DescribeCameras(const QexPODModel& scene) {
    Json list = Json::array();
    for (uint32_t i = 0; i < scene.cameraCount; ++i) {
        const QexPODCamera& camera = scene.cameras[i];
        list.push_back({{"index", i},
                        {"node", scene.meshNodeCount + scene.lightCount + i},
                        {"fovDegrees", static_cast<double>(camera.fov) * kDegrees},
                        {"animatedFov", camera.animatedFov != nullptr},
                        {"near", camera.nearPlane},
                        {"far", camera.farPlane},
                        {"target", camera.targetIndex}});
    }
    return list;
}

// ---- Bounds ----

void DescribeBounds(QexPODModel* scene, Json* document) {
    const std::vector<float> frames = SampleFrames(*scene);
    std::vector<QexVec3> points;
    Bounds all;
    for (float frame : frames) {
        QexPODModel_SetFrame(scene, frame);
        const size_t budget = frame > 0 ? kAnimationPoints / frames.size() : kBoundsPoints;
        const size_t share = std::max<size_t>(budget / std::max(scene->meshNodeCount, 1u), 8);
        Bounds bounds;
        for (uint32_t i = 0; i < scene->meshNodeCount; ++i) {
            points.clear();
            CollectPoints(scene, i, share, &points);
            for (const QexVec3& point : points) bounds.Add(point);
        }
        if (!(frame > 0)) (*document)["bounds"] = BoundsJson(bounds);
        if (bounds.empty) continue;
        all.Add(bounds.low);
        all.Add(bounds.high);
    }
    QexPODModel_SetFrame(scene, 0);
    if (frames.size() > 1) (*document)["boundsOverFrames"] = BoundsJson(all);
}

template <class Describer>
Json List(uint32_t count, Describer describe) {
    Json list = Json::array();
    for (uint32_t i = 0; i < count; ++i) list.push_back(describe(i));
    return list;
}

void DescribeContent(const std::string& path, QexPODModel* scene, Json* document) {
    const std::string directory = Directory(path);
    (*document)["counts"] = {{"cameras", scene->cameraCount},     {"lights", scene->lightCount},
                             {"meshes", scene->meshCount},        {"nodes", scene->nodeCount},
                             {"meshNodes", scene->meshNodeCount}, {"textures", scene->textureCount},
                             {"materials", scene->materialCount}};
    (*document)["frames"] = scene->frameCount;
    (*document)["framesPerSecond"] = scene->framesPerSecond;
    (*document)["backgroundColour"] = Floats(scene->backgroundColour);
    (*document)["ambientColour"] = Floats(scene->ambientColour);
    DescribeBounds(scene, document);
    (*document)["nodes"] = DescribeNodes(*scene);
    (*document)["meshes"] =
        List(scene->meshCount, [&](uint32_t i) { return DescribeMesh(scene->meshes[i], i); });
    (*document)["materials"] =
        List(scene->materialCount, [&](uint32_t i) { return DescribeMaterial(*scene, i); });
    (*document)["textures"] = List(scene->textureCount, [&](uint32_t i) {
        return DescribeTexture(directory, scene->textures[i].name, i);
    });
    (*document)["translucent"] = DescribeTranslucency(*scene, (*document)["textures"]);
    (*document)["lights"] = DescribeLights(*scene);
    (*document)["cameras"] = DescribeCameras(*scene);
}

}  // namespace

std::vector<float> SampleFrames(const QexPODModel& scene) {
    std::vector<float> frames = {0};
    if (scene.frameCount < 2) return frames;
    const uint32_t last = scene.frameCount - 1, count = std::min(scene.frameCount, kMostFrames);
    for (uint32_t i = 1; i < count; ++i)
        frames.push_back(static_cast<float>(uint64_t{last} * i / (count - 1)));
    // An animation starts over when it comes to its last frame: just before it is as near as it gets.
    frames.back() = std::nextafter(frames.back(), 0.0f);
    return frames;
}

bool DescribeScene(const std::string& path, Json* document, std::string* error) {
    QexPODModel scene = {};
    EngineOutput output;
    QexPODModel_ReadFromFile(&scene, path.c_str(), 0, 0, 0, 0);
    output.Stop();
    const bool read = scene.runtime != nullptr;
    if (read) {
        std::error_code ignored;
        (*document)["format"] = "POD";
        (*document)["bytes"] = std::filesystem::file_size(path, ignored);
        DescribeExporter(path, document);
        DescribeContent(path, &scene, document);
        (*document)["problems"] = FindSceneProblems(&scene, (*document)["textures"], output);
    } else {
        *error = output.FirstError();
        if (error->empty()) *error = "is cut short or no POD scene";
    }
    QexPODModel_Release(&scene);
    return read;
}
