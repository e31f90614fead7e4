// The engine's effects with the figures that suit a scene of any size.
#include "scene/Effects.h"

#include <cstring>

#include <GLES2/gl2.h>

#include "scene/Shading.h"

namespace {

constexpr float kShadowIntensity = 0.4f, kShadowBias = 0.01f;
constexpr float kMirrorOpacity = 0.6f;  // of the plane over its image

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

bool NeedsLargerDrawing(const EffectOptions& options) {
    return options.shadow || options.depthOfField || options.stereo;
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
