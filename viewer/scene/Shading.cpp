// The table of the shader modules, and the default look.
#include "scene/Shading.h"

#include <iterator>
#include <utility>

namespace {

// Of the default look: what of a surface's colour shows where no light falls, and what a white light adds
// where it falls straight. Together they are the whole colour.
constexpr float kAmbient = 0.3f, kDirect = 1 - kAmbient;

using Create = QexShaderModule* (*)(void);
using ReleaseModule = void (*)(QexShaderModule**);
using SetParameters = void (*)(QexShaderModule*, float, float);

// Modules by their short names. What has no skinned sister leaves skinned nodes to the engine's choice.
struct ShaderRow {
    const char* name;
    Create create;
    ReleaseModule release;
    Create createSkinned;
    ReleaseModule releaseSkinned;
    SetParameters setDepth, setSkinnedDepth;
    bool lit;  // its colours are those of the material times those of the texture
};

#define PAIR(Name, Skinned) Name##_CreateProgram, Name##_Release, Skinned##_CreateProgram, Skinned##_Release

const ShaderRow kShaders[] = {
    {"texture", PAIR(QexTextureShader, QexSkinningTextureShader), nullptr, nullptr, false},
    {"texture-noalpha", PAIR(QexTextureNoAlphaShader, QexSkinningTextureNoAlphaShader), nullptr, nullptr,
     false},
    {"gouraud", PAIR(QexGouraudShader, QexSkinningGouraudShader), nullptr, nullptr, true},
    {"specular", PAIR(QexGouraudSpecularShader, QexSkinningGouraudSpecularShader), nullptr, nullptr, true},
    {"normalmap", PAIR(QexGouraudNormalMapShader, QexSkinningGouraudNormalMapShader), nullptr, nullptr, true},
    {"shadow", PAIR(QexGouraudShadowShader, QexSkinningGouraudShader), nullptr, nullptr, true},
    {"shadow-ext", PAIR(QexGouraudShadowExtShader, QexSkinningGouraudShader), nullptr, nullptr, true},
    {"uv", PAIR(QexUVDisplacementShader, QexSkinningTextureShader), nullptr, nullptr, false},
    {"simple", QexSimpleShader_CreateProgram, QexSimpleShader_Release, nullptr, nullptr, nullptr, nullptr,
     false},
    {"depth", PAIR(QexDepthShader, QexSkinningDepthShader), QexDepthShader_SetParameters,
     QexSkinningDepthShader_SetParameters, false},
};

const ShaderRow* FindShader(const std::string& name) {
    for (const ShaderRow& row : kShaders)
        if (name == row.name) return &row;
    return nullptr;
}

bool HasNormals(const QexPODModel& scene, uint32_t meshNode) {
    return scene.meshes[scene.nodes[meshNode].objectIndex].attributes[QEX_ELEMENT_NORMAL].componentCount != 0;
}

bool IsLit(const QexPODModel& scene, uint32_t meshNode, const std::vector<bool>& lit) {
    const int32_t material = scene.nodes[meshNode].materialIndex;
    return material < 0 ? HasNormals(scene, meshNode) : lit[static_cast<size_t>(material)];
}

// The mesh nodes that changes give modules to, but for lit ones where there are no normals.
std::vector<std::pair<uint32_t, const ShaderRow*>> ChangedShaders(const QexModel& model,
                                                                  const std::vector<NodeChange>& changes) {
    std::vector<std::pair<uint32_t, const ShaderRow*>> nodes;
    std::string ignored;
    for (const NodeChange& change : changes) {
        const ShaderRow* row = change.what == NodeChange::kShader ? FindShader(change.shader) : nullptr;
        const int32_t found = row ? FindNode(model, change.node, &ignored) : -1;
        const uint32_t node = static_cast<uint32_t>(found);
        if (found < 0 || node >= model.scene.meshNodeCount) continue;
        if (!row->lit || HasNormals(model.scene, node)) nodes.emplace_back(node, row);
    }
    return nodes;
}

bool Shines(const QexLightSet& set) {
    for (uint32_t i = 0; i < set.count; ++i)
        for (int c = 0; c < 3; ++c)
            if (set.lights[i].colour[c] > 0) return true;
    return false;
}

}  // namespace

std::vector<std::string> ShaderNames() {
    std::vector<std::string> names;
    for (const ShaderRow& row : kShaders) names.emplace_back(row.name);
    return names;
}

std::vector<bool> LitMaterials(const QexModel& model, const EffectOptions& effects) {
    const QexPODModel& scene = model.scene;
    const ShaderRow* row = FindShader(effects.shader);
    std::vector<bool> lit(scene.materialCount, !row || row->lit);
    for (uint32_t i = 0; !row && i < scene.meshNodeCount; ++i) {
        const int32_t material = scene.nodes[i].materialIndex;
        if (material >= 0 && !HasNormals(scene, i)) lit[static_cast<size_t>(material)] = false;
    }
    for (const auto& [node, own] : ChangedShaders(model, effects.nodes)) {
        const int32_t material = scene.nodes[node].materialIndex;
        if (material >= 0) lit[static_cast<size_t>(material)] = own->lit;
    }
    return lit;
}

void SceneShaders::Give(QexModel* model, uint32_t meshNode, size_t index) {
    made_.resize(std::size(kShaders));
    const ShaderRow& row = kShaders[index];
    Pair& made = made_[index];
    const auto need = [](QexShaderModule** module, Create create, SetParameters set) {
        if (*module || !create) return *module;
        *module = create();
        if (*module && set) {
            QexRenderState_UseProgram((*module)->program);
            set(*module, kNearDepth, kFarDepth);
        }
        return *module;
    };
    QexPODNode& node = model->scene.nodes[meshNode];
    QexShaderModule* module = model->scene.meshes[node.objectIndex].skinned == 1
                                  ? need(&made.skinned, row.createSkinned, row.setSkinnedDepth)
                                  : need(&made.still, row.create, row.setDepth);
    if (module) node.shader = module;
}

void SceneShaders::Use(QexModel* model, const std::string& name, const std::vector<bool>& lit) {
    const ShaderRow* row = FindShader(name);
    for (uint32_t i = 0; row && i < model->scene.meshNodeCount; ++i)
        if (!row->lit || IsLit(model->scene, i, lit)) Give(model, i, static_cast<size_t>(row - kShaders));
}

void SceneShaders::Use(QexModel* model, const std::vector<NodeChange>& changes) {
    for (const auto& [node, row] : ChangedShaders(*model, changes))
        Give(model, node, static_cast<size_t>(row - kShaders));
}

void SceneShaders::UseDefault(QexModel* model, bool shadow, const std::vector<bool>& lit) {
    Use(model, shadow ? "shadow" : "gouraud", lit);
    for (uint32_t i = 0; i < model->scene.materialCount; ++i) {
        QexPODMaterial& material = model->scene.materials[i];
        float* d = material.diffuse;
        // Exporters leave it black where a texture takes its place.
        if (material.diffuseTexture >= 0 && d[0] + d[1] + d[2] == 0) d[0] = d[1] = d[2] = 1;
        for (int c = 0; c < 3; ++c) material.ambient[c] = kAmbient * material.diffuse[c];
    }
}

void SceneShaders::Release() {
    for (size_t i = 0; i < made_.size(); ++i) {
        if (made_[i].still) kShaders[i].release(&made_[i].still);
        if (made_[i].skinned) kShaders[i].releaseSkinned(&made_[i].skinned);
    }
    made_.clear();
}

ShaderOverride::ShaderOverride(QexModel* model, QexShaderModule* module, QexShaderModule* skinned)
    : model_(model) {
    if (!model) return;
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i) own_.push_back(model->scene.nodes[i].shader);
    QexModel_SetShaderProgramForAllNode(model, module, skinned);
}

ShaderOverride::~ShaderOverride() {
    for (size_t i = 0; i < own_.size(); ++i) model_->scene.nodes[i].shader = own_[i];
}

QexLightSet ChooseLights(QexModel* model, const EffectOptions& options, const QexCamera& camera) {
    QexLightSet set = {};
    for (const QexLight& light : options.lights)
        if (set.count < QEX_MAX_LIGHTS) set.lights[set.count++] = light;
    if (!set.count) QexModel_GetLight(model, &set);
    if (!set.count || (options.lights.empty() && !Shines(set))) {
        QexVec3 d;
        QexVec3_Subtract(&d, &camera.target, &camera.eye);
        set.count = 2;
        set.lights[0] = {QEX_LIGHT_DIRECTIONAL, {d.x, d.y, d.z}, {1, 1, 1, 1}};
        // The sides of open surfaces that their normals point away from are lit like the others.
        set.lights[1] = {QEX_LIGHT_DIRECTIONAL, {-d.x, -d.y, -d.z}, {1, 1, 1, 1}};
    }
    for (uint32_t i = 0; options.shader.empty() && i < set.count; ++i)
        for (int c = 0; c < 3; ++c) set.lights[i].colour[c] *= kDirect;
    return set;
}
