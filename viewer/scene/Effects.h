// What can be done with a scene beyond drawing it as it is: moved nodes, shadow, mirror, stereo,
// picking.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "Qex.h"
#include "scene/Emitters.h"

struct NodeChange {
    enum What { kHide, kMove, kRotate, kFace };

    std::string node;
    What what;
    QexVec3 value;  // a place, or degrees

    bool operator==(const NodeChange& o) const {
        return node == o.node && what == o.what && value.x == o.value.x && value.y == o.value.y &&
               value.z == o.value.z;
    }
};

struct DepthOfField {
    float focus, range, sigma, samples;  // as QexPostProcessing_DrawDOF takes them

    bool operator==(const DepthOfField& o) const {
        return focus == o.focus && range == o.range && sigma == o.sigma && samples == o.samples;
    }
};

struct EffectOptions {
    std::string shader;            // a name of ShaderNames, or empty: the default look
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

// Carries the changes out. Returns a line that says which node there is not, or nothing.
std::string ChangeNodes(QexModel* model, const std::vector<NodeChange>& changes);

// The index of a node of that name; when there is none it is -1 and `problem` names those that there are.
int32_t FindNode(const QexModel& model, const std::string& name, std::string* problem);

// Draws all nodes of a floor, which may be null, and of the model. Those with shadow-receiving modules show
// the shadows of the model's nodes.
void DrawWithShadow(QexRuntimeContext* engine, QexModel* floor, QexModel* model, const QexLightSet& lights,
                    const QexCamera& camera);

// Draws the scene's mirror image in the plane that the options name.
void DrawMirrored(QexModel* model, const EffectOptions& options, const QexLightSet& lights,
                  const QexCamera& camera);

// Draws a scene with the depth of field of the options, which there is, in a picture that is `scale` times as
// large as it will be shown. `draw` clears and draws it: once with null, once with the modules that show
// depth, on white. Between QexPostProcessing_Initialize and ..._Finalize.
using DrawPass = std::function<void(QexShaderModule* module, QexShaderModule* skinned)>;
void DrawWithDepthOfField(QexRuntimeContext* engine, const EffectOptions& options, int scale,
                          const DrawPass& draw);
