// The engine's effects with the figures that suit a scene of any size.
#include "scene/Effects.h"

#include <cstring>

#include <GLES2/gl2.h>

#include "scene/Shading.h"

namespace {

constexpr float kShadowIntensity = 0.4f, kShadowBias = 0.01f;
constexpr float kMirrorOpacity = 0.6f;  // of the plane over its image

// The names of the scene's nodes, as many as a line may hold.
std::string NodeNames(const QexPODModel& scene) {
    std::string names;
    for (uint32_t i = 0; i < scene.nodeCount; ++i) {
        if (!scene.nodes[i].name) continue;
        if (names.size() > 400) return names + ", ...";
        names += (names.empty() ? "" : ", ") + std::string(scene.nodes[i].name);
    }
    return names.empty() ? "none with a name" : names;
}

// What draws the passes of a frame: the depth pass gets no arguments of its caller.
const DrawPass* s_drawPass;

int32_t CallDrawPass(QexRuntimeContext*, void*, void*, void*, QexShaderModule* module,
                     QexShaderModule* skinned, const float*) {
    (*s_drawPass)(module, skinned);
    return 0;
}

// Where the shadow's light shines: the first directional light, or from the first point light to the target.
QexVec3 ShadowDirection(const QexLightSet& lights, const QexCamera& camera) {
    for (uint32_t i = 0; i < lights.count; ++i) {
        const float* v = lights.lights[i].vector;
        if (lights.lights[i].type == QEX_LIGHT_DIRECTIONAL) return {v[0], v[1], v[2]};
    }
    QexVec3 direction = {0, -1, 0};
    if (lights.count) {
        const float* v = lights.lights[0].vector;
        const QexVec3 from = {v[0], v[1], v[2]};
        QexVec3_Subtract(&direction, &camera.target, &from);
    }
    return direction;
}

}  // namespace

int32_t FindNode(const QexModel& model, const std::string& name, std::string* problem) {
    const int32_t index = QexModel_FindNodeIdxByName(&model, name.c_str());
    if (index < 0) *problem = "no node '" + name + "'; the scene has " + NodeNames(model.scene);
    return index;
}

std::string ChangeNodes(QexModel* model, const std::vector<NodeChange>& changes) {
    std::string problem;
    for (const NodeChange& change : changes) {
        const int32_t found = FindNode(*model, change.node, &problem);
        if (found < 0) return problem;
        const uint32_t node = static_cast<uint32_t>(found);
        const QexVec3& v = change.value;
        if (change.what == NodeChange::kHide) QexModel_EnableNodeRenderingR(model, node, 0);
        if (change.what == NodeChange::kMove) QexModel_SetNodePosition(model, node, v.x, v.y, v.z);
        if (change.what == NodeChange::kRotate) QexModel_SetNodeRotation(model, node, v.x, v.y, v.z);
        if (change.what == NodeChange::kFace) QexModel_SetNodeFaceTo(model, node, &v);
    }
    return "";
}

void DrawWithShadow(QexRuntimeContext* engine, QexModel* floor, QexModel* model, const QexLightSet& lights,
                    const QexCamera& camera) {
    const QexShadowCaster all = {model, 1, nullptr, 0};
    const QexVec3 direction = ShadowDirection(lights, camera);
    GLfloat clear[4];
    glGetFloatv(GL_COLOR_CLEAR_VALUE, clear);
    // Lean drawing's boxes hold all bones.
    const int32_t drawing = QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    QexModel_UpdateModelBoundingBox(model, nullptr);
    QexRenderer_SetDrawing(drawing);
    QexShadowInfo* info =
        QexModel_InitShadowInfo(&camera, &direction, &all, 1, kShadowIntensity, kShadowBias);
    QexModel_RenderShadow(engine, nullptr, info);
    glDisable(GL_SCISSOR_TEST);
    glClearColor(clear[0], clear[1], clear[2], clear[3]);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    if (floor) QexModel_RenderFromCameraWithShadow(floor, &lights, &camera, nullptr, info, 0);
    for (uint32_t pass = 0; pass <= model->scene.highestPass; ++pass)
        QexModel_RenderFromCameraWithShadow(model, &lights, &camera, nullptr, info, pass);
    QexModel_ReleaseShadowInfo(info);
}

void DrawMirrored(QexModel* model, const EffectOptions& options, const QexLightSet& lights,
                  const QexCamera& camera) {
    const QexShadowCaster all = {model, 1, nullptr, 0};
    // An empty name is that of every node without one.
    const int32_t node =
        options.mirrorNode.empty() ? -1 : QexModel_FindNodeIdxByName(model, options.mirrorNode.c_str());
    QexReflection* reflection = nullptr;
    if (options.mirror) {
        const QexVec3 normal = {0, 1, 0}, point = {0, *options.mirror, 0};
        reflection = QexReflection_InitReflectionInfoInfinite(model, &normal, &point, &all, 1);
    } else if (node >= 0) {
        QexModel_SetOpacity(model, static_cast<uint32_t>(node), kMirrorOpacity);
        reflection = QexReflection_InitReflectionInfo(model, static_cast<uint32_t>(node), &all, 1, 1);
    }
    if (!reflection) return;
    glClearStencil(0);
    glClear(GL_STENCIL_BUFFER_BIT);
    QexReflection_RenderReflection(reflection, &lights, &camera);
    QexReflection_Release(reflection);
}

void DrawWithDepthOfField(QexRuntimeContext* engine, const EffectOptions& options, int scale,
                          const DrawPass& draw) {
    const DepthOfField& effect = *options.depthOfField;
    // Steps of a pixel of the targets, as they are shown.
    const float step = (options.fullBlur ? 1.0f : 2.0f) * static_cast<float>(scale);
    const float stepX = step / static_cast<float>(engine->width),
                stepY = step / static_cast<float>(engine->height);
    for (uint32_t half : {0, 1})
        QexTexture_SetFilter(&QexPP_GetRenderTarget(half)->colorTexture, QEX_FILTER_LINEAR);
    s_drawPass = &draw;
    QexPostProcessing_DrawDOF(engine, nullptr, nullptr, nullptr, CallDrawPass, effect.focus, effect.range,
                              stepX, stepY, effect.sigma, effect.samples, options.fullBlur ? 2 : 0,
                              kNearDepth, kFarDepth);
    s_drawPass = nullptr;
}
