// Drawing models: mesh nodes with their modules, in passes; blending, boxes, and what the scene says of light
// and camera.
#include <cstdlib>
#include <cstring>

#include "base/Diagnostics.h"
#include "gl/LeanState.h"
#include "model/LeanRender.h"
#include "model/SharedShaders.h"
#include "pod/Animation.h"
#include "pod/BoneBoxes.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/models.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Qex/shadows.h"

namespace {

// Of an outdated model that was said to be one.
constexpr uint32_t kToldGeneration = UINT32_MAX;

void SetEye(const QexCamera* camera) {
    g_VecEyePos = camera->eye;
}

// The material of any node, or null.
QexPODMaterial* MaterialOf(QexModel* model, uint32_t node) {
    if (node >= model->scene.nodeCount) return nullptr;
    const uint32_t index = static_cast<uint32_t>(model->scene.nodes[node].materialIndex);
    return index < model->scene.materialCount ? &model->scene.materials[index] : nullptr;
}

bool InPass(const QexModel* model, uint32_t node, uint32_t pass) {
    return QexPODModel_MeshOf(&model->scene, node)->passID == pass;
}

// Whether the modules that the model's nodes were given went with an earlier start of the engine; a line the
// first time.
bool IsGone(QexModel* model) {
    if (!QexModel_IsOutdated(model)) return false;
    if (model->sharedGeneration != kToldGeneration)
        QexError(QEX_TAG,
                 "<QexModel_Render> a model from before the engine was ended is not drawn; load it again");
    model->sharedGeneration = kToldGeneration;
    return true;
}

// Draws a mesh node through its module, if it has one.
void DrawNode(QexModel* model, uint32_t node, const QexLightSet* lights, const QexMatrix* modelMatrix,
              const QexMatrix* view, const QexMatrix* projection, const QexShadowInfo* shadow = nullptr) {
    QexShaderModule* module = model->scene.nodes[node].shader;
    if (!module || IsGone(model)) return;
    if (QexLeanState_IsLean())
        QexModel_DrawNodeLean(model, node, {lights, modelMatrix, view, projection, shadow});
    else
        module->render(module, model, node, lights, modelMatrix, view, projection, shadow);
}

bool ModeAllows(const QexPODNode& node, uint32_t mode) {
    const bool opaque = node.blendFlags & QEX_NODE_OPAQUE;
    return mode == QEX_RENDER_ALL || (mode == QEX_RENDER_OPAQUE && opaque) ||
           (mode == QEX_RENDER_ALPHA_NODES && !opaque);
}

bool IsOpaque(QexModel* model, uint32_t node) {
    const QexPODMaterial* material = MaterialOf(model, node);
    return (!material || material->opacity >= 1.0f) && g_fQexGlobalAlpha >= 1.0f;
}

// Whether a call that draws nodes of a mode draws this one, and lists it for later otherwise.
bool IsDrawnNow(QexModel* model, uint32_t node, uint32_t mode) {
    return IsOpaque(model, node) && ModeAllows(model->scene.nodes[node], mode);
}

// Whether a node's name is one of those given.
bool IsNamed(const QexPODNode& node, const char* const* names, int32_t count) {
    for (int32_t i = 0; node.name && i < count; ++i)
        if (names[i] && strcmp(node.name, names[i]) == 0) return true;
    return false;
}

float SquaredDistance(TransparentSPODNodeInfo* entry) {
    QexPODModel* scene = &entry->model->scene;
    const float* m = QexPODAnimation_WorldMatrix(scene, &scene->nodes[entry->nodeIndex])->m;
    const QexVec3 position = {m[12], m[13], m[14]};
    QexVec3 delta;
    QexVec3_Subtract(&delta, &position, &entry->eye);
    return QexVec3_DotProduct(&delta, &delta);
}

}  // namespace

extern "C" {

QexVec3 g_VecEyePos = {0, 0, 0};

// ---- Drawing ----

void QexModel_RenderWithCamera(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                               const QexMatrix* modelMatrix, uint32_t pass) {
    SetEye(camera);
    QexModel_RenderWithViewProjection(model, lights, modelMatrix, &camera->viewMatrix,
                                      &camera->projectionMatrix, pass);
}

void QexModel_RenderWithViewProjection(QexModel* model, const QexLightSet* lights,
                                       const QexMatrix* modelMatrix, const QexMatrix* view,
                                       const QexMatrix* projection, uint32_t pass) {
    QexModel_RenderFromViewPerspectiveWithShadow(model, lights, modelMatrix, view, projection, nullptr, pass);
}

void QexModel_RenderNodeWithCamera(QexModel* model, uint32_t nodeIndex, const QexLightSet* lights,
                                   const QexCamera* camera, const QexMatrix* modelMatrix) {
    SetEye(camera);
    QexModel_RenderNodeWithViewProjection(model, nodeIndex, lights, modelMatrix, &camera->viewMatrix,
                                          &camera->projectionMatrix);
}

void QexModel_RenderNodeWithViewProjection(QexModel* model, uint32_t nodeIndex, const QexLightSet* lights,
                                           const QexMatrix* modelMatrix, const QexMatrix* view,
                                           const QexMatrix* projection) {
    if (nodeIndex < model->scene.meshNodeCount)
        DrawNode(model, nodeIndex, lights, modelMatrix, view, projection);
}

void QexModel_RenderFromCameraWithShadow(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                                         const QexMatrix* modelMatrix, const QexShadowInfo* info,
                                         uint32_t pass) {
    SetEye(camera);
    QexModel_RenderFromViewPerspectiveWithShadow(model, lights, modelMatrix, &camera->viewMatrix,
                                                 &camera->projectionMatrix, info, pass);
}

void QexModel_RenderFromViewPerspectiveWithShadow(QexModel* model, const QexLightSet* lights,
                                                  const QexMatrix* modelMatrix, const QexMatrix* view,
                                                  const QexMatrix* projection, const QexShadowInfo* info,
                                                  uint32_t pass) {
    if (QexLeanState_IsLean()) {
        if (!IsGone(model)) QexModel_DrawLean(model, {lights, modelMatrix, view, projection, info, pass});
        return;
    }
    const uint32_t faults = g_QexFaults;
    for (uint32_t i = 0; i < model->scene.meshNodeCount && g_QexFaults == faults; ++i)
        if (InPass(model, i, pass)) DrawNode(model, i, lights, modelMatrix, view, projection, info);
}

void QexModel_RenderNodeFromViewPerspectiveWithShadow(QexModel* model, uint32_t nodeIndex,
                                                      const QexLightSet* lights, const QexMatrix* modelMatrix,
                                                      const QexMatrix* view, const QexMatrix* projection,
                                                      const QexShadowInfo* info) {
    if (nodeIndex < model->scene.meshNodeCount)
        DrawNode(model, nodeIndex, lights, modelMatrix, view, projection, info);
}

void QexModel_RenderWithCameraEx(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                                 const QexMatrix* modelMatrix, uint32_t pass, uint32_t mode,
                                 TransparentSPODNodeInfo* list, uint32_t* count) {
    SetEye(camera);
    QexModel_RenderWithViewProjectionEx(model, lights, modelMatrix, &camera->eye, &camera->viewMatrix,
                                        &camera->projectionMatrix, pass, mode, list, count);
}

void QexModel_RenderWithViewProjectionEx(QexModel* model, const QexLightSet* lights,
                                         const QexMatrix* modelMatrix, const QexVec3* eye,
                                         const QexMatrix* view, const QexMatrix* projection, uint32_t pass,
                                         uint32_t mode, TransparentSPODNodeInfo* list, uint32_t* count) {
    const uint32_t faults = g_QexFaults;
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i) {
        if (!InPass(model, i, pass)) continue;
        if (IsDrawnNow(model, i, mode)) {
            if (!QexLeanState_IsLean() && g_QexFaults == faults)
                DrawNode(model, i, lights, modelMatrix, view, projection);
            continue;
        }
        if (!list || !count) continue;
        TransparentSPODNodeInfo* entry = &list[(*count)++];
        entry->model = model;
        entry->nodeIndex = i;
        if (lights)
            entry->lights = *lights;
        else
            entry->lights.count = 0;
        entry->modelMatrix = modelMatrix ? *modelMatrix : g_sMatIdentity;
        entry->eye = *eye;
        entry->view = *view;
        entry->projection = *projection;
        entry->passID = static_cast<int32_t>(pass);
    }
    if (QexLeanState_IsLean() && !IsGone(model))
        QexModel_DrawLean(model, {lights, modelMatrix, view, projection, nullptr, pass, IsDrawnNow, mode});
}

void QexModel_RenderAlphaBlendingNodes(TransparentSPODNodeInfo* list, uint32_t count, uint32_t pass) {
    if (!list) return;
    for (uint32_t i = 0; i < count; ++i) {
        list[i].distance = 0;
        if (!list[i].model) continue;
        g_VecEyePos = list[i].eye;
        const float distance = SquaredDistance(&list[i]);
        // Numbers only, or the order would not be one.
        if (distance == distance) list[i].distance = distance;
    }
    qsort(list, count, sizeof *list, TransparentSPODNodeInfo_Compare);
    const uint32_t faults = g_QexFaults;
    for (uint32_t i = count; i-- > 0 && g_QexFaults == faults;) {
        const TransparentSPODNodeInfo& entry = list[i];
        if (entry.model && entry.passID == static_cast<int32_t>(pass))
            QexModel_RenderNodeWithViewProjection(entry.model, entry.nodeIndex, &entry.lights,
                                                  &entry.modelMatrix, &entry.view, &entry.projection);
    }
}

int TransparentSPODNodeInfo_Compare(const void* a, const void* b) {
    const float x = static_cast<const TransparentSPODNodeInfo*>(a)->distance;
    const float y = static_cast<const TransparentSPODNodeInfo*>(b)->distance;
    return x < y ? -1 : x > y ? 1 : 0;
}

// ---- Animation and state ----

void QexModel_Update(void*, QexModel* model, float dt) {
    QexPODModel* scene = &model->scene;
    const float last = scene->frameCount ? static_cast<float>(scene->frameCount - 1) : 0.0f;
    float frame = model->currentFrame + static_cast<float>(scene->framesPerSecond) * dt;
    if (!(frame <= last))
        frame = 0;
    else if (frame < 0)
        frame = last;
    model->currentFrame = frame;
    QexPODModel_SetFrame(scene, frame);
}

float QexModel_SetOpacity(QexModel* model, uint32_t nodeIndex, float opacity) {
    QexPODMaterial* material = MaterialOf(model, nodeIndex);
    if (!material) return 0;
    const float previous = material->opacity;
    material->opacity = opacity;
    return previous;
}

void QexModel_SetOpacityR(QexModel* model, uint32_t nodeIndex, float opacity) {
    if (nodeIndex >= model->scene.nodeCount) return;
    for (uint32_t i = 0; i < model->scene.nodeCount; ++i) {
        if (model->scene.nodes[i].parentIndex != static_cast<int32_t>(nodeIndex)) continue;
        QexModel_SetOpacity(model, i, opacity);
        QexModel_SetOpacityR(model, i, opacity);
    }
}

void QexModel_SetAlphaBlendingNodes(QexModel* model, const char* const* names, int32_t count) {
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i) {
        QexPODNode& node = model->scene.nodes[i];
        node.blendFlags |= QEX_NODE_OPAQUE;
        if (names && IsNamed(node, names, count)) node.blendFlags &= static_cast<uint8_t>(~QEX_NODE_OPAQUE);
    }
}

void QexModel_SetAlphaBlendingNodesWithOrder(QexModel* model, const char* const* names, const int32_t* orders,
                                             int32_t count) {
    if (!names || count <= 0) return;
    for (uint32_t i = 0; i < model->scene.nodeCount; ++i) {
        QexPODNode& node = model->scene.nodes[i];
        if (!IsNamed(node, names, count)) continue;
        node.blendFlags &= static_cast<uint8_t>(~QEX_NODE_OPAQUE);
        if (orders) node.blendOrder = orders[i];
    }
}

void QexModel_SetShaderProgram(QexModel* model, uint32_t nodeIndex, QexShaderModule* module) {
    if (nodeIndex < model->scene.nodeCount) model->scene.nodes[nodeIndex].shader = module;
}

void QexModel_SetShaderProgramForAllNode(QexModel* model, QexShaderModule* staticModule,
                                         QexShaderModule* skinnedModule) {
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i) {
        QexShaderModule* module =
            QexPODModel_MeshOf(&model->scene, i)->skinned == 1 ? skinnedModule : staticModule;
        if (module) model->scene.nodes[i].shader = module;
    }
    // A model of an earlier start can be drawn again: none of its nodes has a module that is gone.
    if (staticModule && skinnedModule && QexModel_IsOutdated(model)) {
        model->flags |= QEX_MODEL_NO_SHADERS;
        model->sharedGeneration = 0;
    }
}

void QexModel_SetAnimatedUVUniform(QexModel*, float, float) {}

// ---- Boxes, lights, cameras ----

void QexModel_UpdateMeshNodeBoundingBox(QexModel* model, uint32_t meshNodeIndex,
                                        const QexMatrix* modelMatrix) {
    QexPODModel* scene = &model->scene;
    if (meshNodeIndex >= scene->meshNodeCount || !model->nodeBoxes) return;
    QexPODNode* node = &scene->nodes[meshNodeIndex];
    const QexPODMesh* mesh = QexPODModel_MeshOf(&model->scene, meshNodeIndex);
    QexMatrix world;
    QexAABB around;
    if (QexLeanState_IsLean() && QexPODAnimation_SkinnedBox(scene, meshNodeIndex, &around)) {
        QexBoundingBox_ComputeInterleaved(&model->nodeBoxes[meshNodeIndex], &around, 2, 0, sizeof around.min);
        return;
    }
    if (mesh->skinned && mesh->boneBatches.batchCount > 0 && mesh->boneBatches.bonesPerBatch[0] > 0) {
        QexPODNode* bone = QexPODAnimation_BoneNode(scene, node, mesh->boneBatches.boneTable[0]);
        QexPODModel_GetBoneWorldMatrix(scene, &world, node, bone);
    } else {
        QexPODModel_GetWorldMatrix(scene, &world, node);
        if (modelMatrix) QexMatrix_Multiply(&world, modelMatrix, &world);
    }
    QexBoundingBox_TransformBoundingBox(&world, &mesh->localBox, &model->nodeBoxes[meshNodeIndex]);
}

void QexModel_UpdateModelBoundingBox(QexModel* model, const QexMatrix* modelMatrix) {
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i)
        QexModel_UpdateMeshNodeBoundingBox(model, i, modelMatrix);
}

void QexModel_GetLight(QexModel* model, QexLightSet* set) {
    QexPODModel* scene = &model->scene;
    set->count = scene->lightCount < QEX_MAX_LIGHTS ? scene->lightCount : QEX_MAX_LIGHTS;
    for (uint32_t i = 0; i < set->count; ++i) {
        const QexPODLight& source = scene->lights[i];
        QexLight* light = &set->lights[i];
        float position[3], direction[3];
        if (source.type != QEX_POD_LIGHT_POINT && source.type != QEX_POD_LIGHT_DIRECTIONAL) continue;
        QexPODModel_GetLight(scene, position, direction, i);
        const bool point = source.type == QEX_POD_LIGHT_POINT;
        light->type = point ? QEX_LIGHT_POINT : QEX_LIGHT_DIRECTIONAL;
        memcpy(light->vector, point ? position : direction, sizeof light->vector);
        memcpy(light->colour, source.colour, sizeof source.colour);
        light->colour[3] = 1.0f;
    }
}

int32_t QexModel_UpdateCamera(QexModel* model, QexVec3* eye, QexVec3* target, QexVec3* up, float* fov,
                              uint32_t index) {
    QexPODModel* scene = &model->scene;
    *up = {0, 1, 0};
    if (index >= scene->cameraCount) {
        *fov = 0.785f;
        return 0;
    }
    if (scene->cameras[index].targetIndex == -1)
        *fov = QexPODModel_GetCameraPosEx(scene, &eye->x, &target->x, &up->x, index);
    else
        *fov = QexPODModel_GetCameraPos(scene, &eye->x, &target->x, index);
    return 1;
}

int32_t QexModel_GetCameraNearFar(const QexModel* model, float* zNear, float* zFar, uint32_t index) {
    if (index >= model->scene.cameraCount) return 0;
    QexPODModel_GetCameraNearFar(&model->scene, zNear, zFar, index);
    return 1;
}

}  // extern "C"
