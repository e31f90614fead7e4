// How a scene is shaded: the modules that draw its nodes, and the lights.
#pragma once

#include <string>
#include <vector>

#include "Qex.h"
#include "scene/Effects.h"

// The clip-space z of a camera's near and far plane.
constexpr float kNearDepth = 0, kFarDepth = 1;

// The short names of the shader modules.
std::vector<std::string> ShaderNames();

// By material, whether the modules that draw it multiply its colour with that of the texture. In the default
// look, which has no name, those are lit whose meshes all have normals. Where nodes of one material have
// modules of both kinds the last of those that were changed counts.
std::vector<bool> LitMaterials(const QexModel& model, const EffectOptions& effects);

// The modules that draw a model instead of the engine's choice. Each is made when a model first needs it.
class SceneShaders {
  public:
    SceneShaders() = default;
    ~SceneShaders() { Release(); }
    SceneShaders(const SceneShaders&) = delete;
    SceneShaders& operator=(const SceneShaders&) = delete;

    // Gives the modules of that name to the nodes, static or skinned to match; lit ones where the material,
    // or without one the mesh, is lit.
    void Use(QexModel* model, const std::string& name, const std::vector<bool>& lit);
    // Lit from the scene's lights or the camera; what files say about ambient light, which is rarely meant,
    // is replaced by a share of the colour.
    void UseDefault(QexModel* model, bool shadow, const std::vector<bool>& lit);
    // Gives nodes the modules that changes name, but for lit ones where there are no normals.
    void Use(QexModel* model, const std::vector<NodeChange>& changes);
    void Release();

  private:
    struct Pair {
        QexShaderModule *still = nullptr, *skinned = nullptr;
    };
    // `row`: of the table of modules.
    void Give(QexModel* model, uint32_t meshNode, size_t row);

    std::vector<Pair> made_;  // by row
};

// Gives all nodes of a model, which may be null, other modules for as long as it lives.
class ShaderOverride {
  public:
    ShaderOverride(QexModel* model, QexShaderModule* module, QexShaderModule* skinned);
    ~ShaderOverride();
    ShaderOverride(const ShaderOverride&) = delete;
    ShaderOverride& operator=(const ShaderOverride&) = delete;

  private:
    QexModel* model_;
    std::vector<QexShaderModule*> own_;
};

// The lights of the options, else the scene's own, else one that shines from the camera; dimmed in the
// default look, which has ambient light.
QexLightSet ChooseLights(QexModel* model, const EffectOptions& options, const QexCamera& camera);
