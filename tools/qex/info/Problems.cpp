// One check for each thing that goes wrong with scenes.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <map>

#include "common/SceneBounds.h"
#include "info/Info.h"

namespace {

constexpr uint32_t kMostVertices = 65536;  // that 16-bit indices reach
constexpr float kThreshold = 0.5f;         // alpha that is not above it becomes 0

struct Finder {
    QexPODModel* scene;
    const Json& textures;
    std::vector<std::string> lines;

    void Add(const std::string& line) { lines.push_back(line); }
};

std::string Number(float value) {
    char text[32];
    snprintf(text, sizeof text, "%g", static_cast<double>(value));
    return text;
}

// "mesh node 3 (wheel)".
std::string Label(const char* kind, uint32_t index, const char* name) {
    std::string label = kind + (" " + std::to_string(index));
    if (name && *name) label += " (" + CleanText(name) + ")";
    return label;
}

uint32_t CountNonFinitePositions(const QexPODMesh& mesh) {
    uint32_t count = 0;
    if (!mesh.vertices.componentCount) return 0;
    for (uint32_t v = 0; v < mesh.vertexCount; ++v) {
        const QexVec4 p = ReadElement(mesh, mesh.vertices, v);
        count += !(std::isfinite(p.x) && std::isfinite(p.y) && std::isfinite(p.z));
    }
    return count;
}

void CheckTextures(Finder* finder) {
    const QexPODModel& scene = *finder->scene;
    std::vector<bool> diffuse(scene.textureCount), used(scene.textureCount);
    for (uint32_t i = 0; i < scene.materialCount; ++i) {
        const QexPODMaterial& m = scene.materials[i];
        if (m.diffuseTexture >= 0) diffuse[static_cast<size_t>(m.diffuseTexture)] = true;
        for (const int32_t* index = &m.diffuseTexture; index <= &m.refractionTexture; ++index)
            if (*index >= 0) used[static_cast<size_t>(*index)] = true;
    }
    for (uint32_t i = 0; i < scene.textureCount; ++i) {
        const Json& texture = finder->textures[i];
        const std::string label = Label("texture", i, scene.textures[i].name);
        if (!scene.textures[i].name)
            finder->Add(label + " has no name");
        else if (!texture["found"].get<bool>())
            finder->Add(label + " is missing: no .pvr, .ktx or picture of that name beside the scene" +
                        (diffuse[i] ? "" : " (no material draws its colour)"));
        else if (texture.contains("picture") && !texture["picture"]["loads"].get<bool>())
            finder->Add(label + ", file " + texture["file"].get<std::string>() + ": " +
                        texture["picture"]["problem"].get<std::string>());
        else if (texture.contains("picture"))
            finder->Add(label +
                        " is there as a picture only: qex render decodes it, the engine alone does not; " +
                        "qex texture makes a PVR of it");
        if (!used[i]) finder->Add(label + " belongs to no material: it is not drawn");
        if (!texture.contains("content")) continue;
        for (const Json& problem : texture["content"]["problems"])
            finder->Add(label + ", file " + texture["file"].get<std::string>() + ": " +
                        problem.get<std::string>());
    }
}

// What makes the engine refuse the whole scene or do work at each load, whether the mesh is drawn or not.
void CheckUpload(Finder* finder, const QexPODMesh& mesh, const std::string& label) {
    if (mesh.faces.data && mesh.faces.type == QEX_POD_UNSIGNED_INT && mesh.vertexCount > kMostVertices)
        finder->Add(label + " has 32-bit indices and " + std::to_string(mesh.vertexCount) +
                    " vertices, at most 65,536 can be drawn: the scene is refused");
    int32_t bones = 0;
    for (int32_t i = 0; mesh.skinned && i < mesh.boneBatches.batchCount; ++i)
        bones = std::max(bones, mesh.boneBatches.bonesPerBatch[i]);
    if (bones > QEX_MAX_BATCH_BONES)
        finder->Add(label + " has a batch of " + std::to_string(bones) +
                    " bones, at most 16 are drawn at once: each load makes new batches");
}

void CheckDrawnMesh(Finder* finder, const QexPODMesh& mesh, const std::string& label) {
    if (!mesh.vertices.componentCount || !mesh.vertexCount)
        finder->Add(label + " has no positions: it is not drawn");
    if (!mesh.faceCount && !mesh.stripCount) finder->Add(label + " has no faces: it is not drawn");
    if (!mesh.normals.componentCount)
        finder->Add(label + " has no normals: modules with lights cannot light it");
    const uint32_t wild = CountNonFinitePositions(mesh);
    if (wild)
        finder->Add(label + ": " + std::to_string(wild) + " of " + std::to_string(mesh.vertexCount) +
                    " positions are not finite numbers");
}

void CheckMaterials(Finder* finder, const std::vector<bool>& used) {
    for (uint32_t i = 0; i < finder->scene->materialCount; ++i) {
        const QexPODMaterial& material = finder->scene->materials[i];
        const char* effect = material.effectFile && *material.effectFile ? material.effectFile
                             : material.effectName                       ? material.effectName
                                                                         : "";
        if (*effect)
            finder->Add(Label("material", i, material.name) + " has an effect of its own, " +
                        CleanText(effect) + ": it is not read, a shader module of the engine draws instead");
        if (used[i] && !(material.opacity > kThreshold))
            finder->Add(Label("material", i, material.name) + " has an opacity of " +
                        Number(material.opacity) + ": what is not above 0.5 becomes 0 and is not drawn");
    }
}

// Whether a world matrix leaves nothing to see of a mesh: two of its axes at least have no length.
bool ShrinksToNothing(const QexMatrix& world) {
    int axes = 0;
    for (int column = 0; column < 3; ++column) {
        const float* m = &world.m[4 * column];
        axes += m[0] != 0 || m[1] != 0 || m[2] != 0;
    }
    return axes < 2;
}

void CheckScales(Finder* finder) {
    QexPODModel* scene = finder->scene;
    const std::vector<float> frames = SampleFrames(*scene);
    std::vector<size_t> shrunk(scene->meshNodeCount);
    std::vector<bool> atStart(scene->meshNodeCount);
    for (float frame : frames) {
        QexPODModel_SetFrame(scene, frame);
        for (uint32_t i = 0; i < scene->meshNodeCount; ++i) {
            QexMatrix world;
            QexPODModel_GetWorldMatrix(scene, &world, &scene->nodes[i]);
            // Bones place a skinned mesh, not its node.
            const bool now = !scene->meshes[scene->nodes[i].objectIndex].skinned && ShrinksToNothing(world);
            shrunk[i] += now;
            if (!(frame > 0)) atStart[i] = now;
        }
    }
    QexPODModel_SetFrame(scene, 0);
    for (uint32_t i = 0; i < scene->meshNodeCount; ++i) {
        const std::string label = Label("mesh node", i, scene->nodes[i].name);
        if (shrunk[i] == frames.size())
            finder->Add(label + " is scaled to 0: it is not drawn");
        else if (atStart[i])
            finder->Add(label + " is scaled to 0 at frame 0: it is not drawn there");
    }
}

bool IsOneTexel(const Json& texture) {
    return texture.contains("content") && texture["content"].value("width", 0u) == 1 &&
           texture["content"].value("height", 0u) == 1;
}

void CheckMeshNodes(Finder* finder) {
    const QexPODModel& scene = *finder->scene;
    std::vector<bool> meshes(scene.meshCount), materials(scene.materialCount);
    if (!scene.meshNodeCount) finder->Add("it has no mesh nodes: there is nothing to draw");
    for (uint32_t i = 0; i < scene.meshNodeCount; ++i) {
        const QexPODNode& node = scene.nodes[i];
        const std::string label = Label("mesh node", i, node.name);
        const QexPODMesh& mesh = scene.meshes[node.objectIndex];
        meshes[static_cast<size_t>(node.objectIndex)] = true;
        if (node.materialIndex < 0) {
            finder->Add(label + " has no material: it is drawn white");
            continue;
        }
        materials[static_cast<size_t>(node.materialIndex)] = true;
        const bool uvs = mesh.uvwChannelCount && mesh.uvws[0].componentCount;
        const int32_t texture = scene.materials[node.materialIndex].diffuseTexture;
        if (texture >= 0 && !uvs && !IsOneTexel(finder->textures[static_cast<size_t>(texture)]))
            finder->Add(label + ": its material has a texture, but mesh " + std::to_string(node.objectIndex) +
                        " has no UVs: it gets one colour");
    }
    CheckMaterials(finder, materials);
    for (uint32_t i = 0; i < scene.meshCount; ++i) {
        const std::string label = "mesh " + std::to_string(i);
        CheckUpload(finder, scene.meshes[i], label);
        if (meshes[i])
            CheckDrawnMesh(finder, scene.meshes[i], label);
        else
            finder->Add(label + " belongs to no mesh node: it is not drawn");
    }
}

void CheckLightsAndCameras(Finder* finder) {
    const QexPODModel& scene = *finder->scene;
    if (scene.lightCount > QEX_MAX_LIGHTS)
        finder->Add("it has " + std::to_string(scene.lightCount) + " lights: only the first 4 shine");
    for (uint32_t i = 0; i < scene.lightCount; ++i) {
        const uint32_t type = scene.lights[i].type;
        if (type == QEX_POD_LIGHT_POINT || type == QEX_POD_LIGHT_DIRECTIONAL) continue;
        finder->Add("light " + std::to_string(i) + " is " +
                    (type == QEX_POD_LIGHT_SPOT ? "a spot light" : "of an unknown type") +
                    ": the modules with lights do not draw it");
    }
    if (!scene.cameraCount) finder->Add("it has no camera: qex render frames the scene itself");
    for (uint32_t i = 0; i < scene.cameraCount; ++i) {
        const QexPODCamera& camera = scene.cameras[i];
        const std::string label = "camera " + std::to_string(i);
        if (!(camera.nearPlane > 0) || !(camera.farPlane > camera.nearPlane))
            finder->Add(label + " has its near plane at " + Number(camera.nearPlane) +
                        " and its far plane at " + Number(camera.farPlane) + "; expected 0 < near < far");
        if (!(camera.fov > 0) || !(camera.fov < 3.14159f))
            finder->Add(label + " has a field of view of " + Number(camera.fov) +
                        " radians; expected 0 to pi");
    }
}

// What the engine has put right at loading; of lines that differ in numbers only the first, with their count.
void AddRepairs(Finder* finder, const std::vector<std::string>& lines) {
    std::map<std::string, size_t> seen;
    std::vector<const std::string*> firsts;
    const auto kind = [](std::string line) {
        line.erase(std::remove_if(line.begin(), line.end(),
                                  [](char c) { return (c >= '0' && c <= '9') || c == '-'; }),
                   line.end());
        return line;
    };
    for (const std::string& line : lines)
        if (++seen[kind(line)] == 1) firsts.push_back(&line);
    for (const std::string* line : firsts) {
        const size_t more = seen[kind(*line)] - 1;
        finder->Add(*line + (more ? " (and " + std::to_string(more) + " more like this)" : ""));
    }
}

}  // namespace

std::vector<std::string> FindSceneProblems(QexPODModel* scene, const Json& textures,
                                           const EngineOutput& engine) {
    Finder finder = {scene, textures, {}};
    CheckTextures(&finder);
    CheckMeshNodes(&finder);
    CheckScales(&finder);
    CheckLightsAndCameras(&finder);
    AddRepairs(&finder, engine.Messages("<QexPODModel_ReadFromSourceStream>"));
    return finder.lines;
}
