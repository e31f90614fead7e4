// What qex render can do with a scene beyond drawing it as it is: other shader modules, lights, moved nodes,
// shadow, mirror, stereo, picking.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "Qex.h"
#include "RenderEmitters.h"

struct NodeChange {
    std::string node;
    std::string what;  // hide, move, rotate or face
    QexVec3 value;     // a place, or degrees
};

struct DepthOfField {
    float focus, range;  // as QexPostProcessing_DrawDOF takes them
    float sigma = 5, samples = 9;
};

struct EffectOptions {
    std::string shader;            // a name of ShaderNames, or empty: the engine's choice
    std::vector<QexLight> lights;  // instead of the scene's own
    std::vector<NodeChange> nodes;
    std::vector<QexVec2> picks;  // pixels
    bool shadow = false;
    std::optional<float> mirror;  // height of the plane
    std::optional<float> floor;   // its height
    std::string mirrorNode;
    uint32_t stereo = 0;  // QexRenderer_EnableStereo3D's mode
    float separation = 0;
    std::optional<DepthOfField> depthOfField;
    std::vector<std::string> sky;  // one picture or six, see Sky
    std::optional<float> water;    // its height
    EmitterScene emitters;
    bool fullBlur = false;  // depth of field blurs at full resolution, not at half
};

// The names of the shader modules, ", " between them.
std::string ShaderNames();
bool IsShaderName(const std::string& name);

// The modules that draw a model instead of the engine's choice.
class SceneShaders {
  public:
    SceneShaders() = default;
    ~SceneShaders() { Release(); }
    SceneShaders(const SceneShaders&) = delete;
    SceneShaders& operator=(const SceneShaders&) = delete;

    // Gives them to the nodes, static or skinned to match.
    void Use(QexModel* model, const std::string& name);
    void Release();

  private:
    size_t row_ = 0;
    QexShaderModule* static_ = nullptr;
    QexShaderModule* skinned_ = nullptr;
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

// Carries the changes out. Returns a line that says which node there is not, or nothing.
std::string ChangeNodes(QexModel* model, const std::vector<NodeChange>& changes);

// The index of a node of that name; when there is none it is -1 and `problem` names those that there are.
int32_t FindNode(const QexModel& model, const std::string& name, std::string* problem);

// The lights of the options, else the scene's own, else one that shines from the camera.
QexLightSet ChooseLights(QexModel* model, const EffectOptions& options, const QexCamera& camera);

// Draws all nodes of a floor, which may be null, and of the model. Those with shadow-receiving modules show
// the shadows of the model's nodes.
void DrawWithShadow(QexRuntimeContext* engine, QexModel* floor, QexModel* model, const QexLightSet& lights,
                    const QexCamera& camera);

// Draws the scene's mirror image in the plane that the options name.
void DrawMirrored(QexModel* model, const EffectOptions& options, const QexLightSet& lights,
                  const QexCamera& camera);

// Draws a scene with the depth of field of the options, which there is. `draw` clears and draws it: once with
// null, once with the modules that show depth, on white. Between QexPostProcessing_Initialize and
// ..._Finalize.
using DrawPass = std::function<void(QexShaderModule* module, QexShaderModule* skinned)>;
void DrawWithDepthOfField(QexRuntimeContext* engine, const EffectOptions& options, const DrawPass& draw);

// Prints the mesh nodes under each point, one line a point.
void PrintPicked(QexRuntimeContext* engine, QexModel* model, const QexCamera& camera,
                 const std::vector<QexVec2>& points);
