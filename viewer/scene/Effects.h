// What can be done with a scene beyond drawing it as it is: shadow, mirror, stereo, depth of field.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "Qex.h"
#include "scene/Changes.h"
#include "scene/Emitters.h"

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
    std::vector<MaterialChange> materials;
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

// Whether multisampling does not smooth everything in the picture: within shadows and in the targets of
// effects edges stay as they are, so that all is drawn larger.
bool NeedsLargerDrawing(const EffectOptions& options);

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
