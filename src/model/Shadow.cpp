// The shadow pass: what casts a shadow into the camera's view, and its depth as the light sees it.
#include "base/Memory.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "model/Casters.h"
#include "model/LeanRender.h"
#include "model/SharedShaders.h"
#include "pod/Animation.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/models.h"
#include "Qex/pod.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Qex/shadows.h"
#include "Qex/textures.h"
#include "Shaders/QexShaderModule.h"

#define QEX_MODULE "src/QexModel"

namespace {

// The axis-aligned box of a box seen through a matrix.
QexAABB TransformedBox(const QexMatrix* matrix, const QexBoundingBox* box) {
    QexBoundingBox transformed;
    QexAABB aabb;
    QexBoundingBox_TransformBoundingBox(matrix, box, &transformed);
    QexBoundingBox_GetAABBNative(&transformed, &aabb);
    return aabb;
}

// The light looks along its direction; depth grows against -Z.
void LightView(QexMatrix* out, const QexVec3* direction) {
    QexVec3 up;
    QexMatrix_GetPerpendicularVector(&up, direction);
    QexMatrix_LookUp(out, direction, &up);
}

// The camera's view volume in light space.
QexAABB ViewVolume(const QexCamera* camera, const QexMatrix* lightView) {
    QexBoundingBox corners = {};
    QexMatrix toLight;
    QexCamera_GetFrustumVerticesInObjectSpace(camera, corners.corners);
    QexMatrix_Inverse(&toLight, &camera->viewMatrix);
    QexMatrix_Multiply(&toLight, lightView, &toLight);
    return TransformedBox(&toLight, &corners);
}

uint32_t CandidateCount(const QexShadowCaster& request) {
    if (!request.model) return 0;
    if (request.allMeshNodes) return request.model->scene.meshNodeCount;
    return request.nodeIndices ? request.nodeCount : 0;
}

// Fills the list of one caster with the candidates that may throw a shadow into the view, and widens `box` by
// them.
bool ListCasters(QexShadowCaster* caster, const QexShadowCaster& request, const QexMatrix* lightView,
                 const QexAABB& view, QexAABB* box) {
    const uint32_t candidates = CandidateCount(request);
    *caster = {request.model, request.allMeshNodes, QexMemory_AllocArray<int32_t>(candidates), 0};
    if (!caster->nodeIndices) return false;
    for (uint32_t i = 0; i < candidates; ++i) {
        const uint32_t node = request.allMeshNodes ? i : static_cast<uint32_t>(request.nodeIndices[i]);
        if (node >= request.model->scene.meshNodeCount || !request.model->nodeBoxes) continue;
        const QexAABB nodeBox = TransformedBox(lightView, &request.model->nodeBoxes[node]);
        if (!QexBoundingBox_isAABBIntersectedXY(&nodeBox, &view)) continue;
        caster->nodeIndices[caster->nodeCount++] = static_cast<int32_t>(node);
        QexBoundingBox_UnionAAABB(box, box, &nodeBox);
    }
    return true;
}

// The box that the map shows: casters within the view. With none it is the whole view, and where all of them
// lie in front of it, or are flat, it reaches down to the end of the view, so that it always has a volume.
QexAABB MapBox(const QexAABB& casters, const QexAABB& view) {
    if (!(casters.min.x <= casters.max.x)) return view;
    QexAABB box;
    QexBoundingBox_IntersectionAABB(&box, &casters, &view);
    if (!(box.min.z < box.max.z)) box.min.z = view.min.z;
    return box;
}

void SetMatrices(QexShadowInfo* info, const QexAABB& box, const QexMatrix* lightView) {
    QexMatrix projection, scale, bias;
    QexMatrix_Orthographic(&projection, box.min.x, box.max.x, box.min.y, box.max.y, box.max.z, box.min.z);
    QexMatrix_Multiply(&info->lightViewProj, &projection, lightView);
    QexMatrix_Scale(&scale, 0.5f, 0.5f, 0.5f);
    QexMatrix_Translate(&bias, 0.5f, 0.5f, 0.5f);
    QexMatrix_Multiply(&bias, &bias, &scale);
    QexMatrix_Multiply(&info->shadowSpaceMatrix, &bias, &info->lightViewProj);
}

// No texture on the alpha unit, unless the application binds one.
void BindAlpha(QexModel* model, uint32_t node) {
    QexTexture_Set(nullptr, kAlphaUnit);
    if (model->bindTextureHook) model->bindTextureHook(model, node);
}

QexMatrix LightSpaceMatrix(QexModel* model, uint32_t node, const QexMatrix* modelMatrix,
                           const QexMatrix* lightViewProj) {
    const QexMatrix* world = QexPODAnimation_WorldMatrix(&model->scene, &model->scene.nodes[node]);
    QexMatrix placed, mvp;
    if (modelMatrix) {
        QexMatrix_Multiply(&placed, modelMatrix, world);
        world = &placed;
    }
    QexMatrix_Multiply(&mvp, lightViewProj, world);
    return mvp;
}

void DrawStatic(QexModel* model, uint32_t node, const QexMatrix* modelMatrix,
                const QexMatrix* lightViewProj) {
    const QexMatrix mvp = LightSpaceMatrix(model, node, modelMatrix, lightViewProj);
    QexRenderState_UseProgram(m_uModelShadowShaderProgram.program);
    QEX_GL(glUniformMatrix4fv(m_uModelShadowShaderProgram.mvpMatrixLoc, 1, GL_FALSE, mvp.m));
    BindAlpha(model, node);
    QexModel_DrawShadowMesh(model, node);
}

void DrawSkinned(QexModel* model, uint32_t node, const QexMatrix* lightViewProj) {
    QexRenderState_UseProgram(m_SkinShadowShaderProgram.program);
    QEX_GL(glUniformMatrix4fv(m_SkinShadowShaderProgram.viewProjMatrixLoc, 1, GL_FALSE, lightViewProj->m));
    BindAlpha(model, node);
    QexModel_DrawSkinShadowMesh(model, node);
}

bool CanDraw(const QexModel* model, uint32_t node) {
    return model->vertexBuffers && node < model->scene.meshNodeCount;
}

bool IsDrawn(const QexModel* model, uint32_t node) {
    return CanDraw(model, node) && model->scene.nodes[node].stateFlags & QEX_NODE_RENDERING_ENABLED;
}

void DrawDescribed(const QexShadowCaster& caster, const QexMatrix* modelMatrix,
                   const QexMatrix* lightViewProj) {
    QexModel* model = caster.model;
    for (uint32_t i = 0; i < caster.nodeCount; ++i) {
        const uint32_t node = static_cast<uint32_t>(caster.nodeIndices[i]);
        if (!IsDrawn(model, node)) continue;
        if (QexPODModel_MeshOf(&model->scene, node)->skinned)
            DrawSkinned(model, node, lightViewProj);
        else
            DrawStatic(model, node, modelMatrix, lightViewProj);
    }
}

// Without alpha textures, which only a hook could bind. False where the variants cannot be had.
bool DrawLean(const QexShadowCaster& caster, const QexMatrix* modelMatrix, const QexMatrix* lightViewProj) {
    QexModel* model = caster.model;
    if (model->bindTextureHook) return false;
    const uint32_t bare = kVariantNoTexture | kVariantConstantAlpha;
    const QexShaderModuleType* types[] = {QexModel_CasterType(false), QexModel_CasterType(true)};
    QexShaderVariant* variants[] = {QexShaderVariant_Get(types[0], bare),
                                    QexShaderVariant_Get(types[1], bare)};
    if (!variants[0] || !variants[1] || !QexModel_KeepDrawing(model)) return false;
    const QexShaderFrame* frame = QexShaderFrame_Set(&g_sMatIdentity, lightViewProj, nullptr, nullptr);
    for (uint32_t i = 0; i < caster.nodeCount; ++i) {
        const uint32_t node = static_cast<uint32_t>(caster.nodeIndices[i]);
        if (!IsDrawn(model, node)) continue;
        const uint32_t mesh = static_cast<uint32_t>(model->scene.nodes[node].objectIndex);
        const uint32_t skinned = model->scene.meshes[mesh].skinned ? 1 : 0;
        const int32_t* at = variants[skinned]->locations;
        QexShaderVariant_Use(variants[skinned], frame, {});
        QexModel_BindMeshLean(model, mesh, variants[skinned]->elements);
        if (skinned) {
            QexShaderModule_DrawBatches(
                types[1], model, node,
                {at[kUniform_boneCount], at[kUniform_boneMatrixArray], false, 0, nullptr});
        } else {
            const QexMatrix mvp = LightSpaceMatrix(model, node, modelMatrix, lightViewProj);
            glUniformMatrix4fv(at[kUniform_mvpMatrix], 1, GL_FALSE, mvp.m);
            QexShaderModule_DrawFaces(types[0], model, mesh);
        }
    }
    return true;
}

}  // namespace

extern "C" {

QexShadowInfo* QexModel_InitShadowInfo(const QexCamera* camera, const QexVec3* lightDir,
                                       const QexShadowCaster* casters, uint32_t casterCount,
                                       float shadowIntensity, float biasValue) {
    QexShadowInfo* info = QexMemory_AllocZeroed<QexShadowInfo>(1);
    if (info) info->casters = QexMemory_AllocZeroed<QexShadowCaster>(casterCount);
    QexMatrix lightView;
    LightView(&lightView, lightDir);
    const QexAABB view = ViewVolume(camera, &lightView);
    QexAABB box;
    QexBoundingBox_InitAABB(&box);
    bool complete = info && info->casters;
    for (uint32_t i = 0; complete && i < casterCount; ++i) {
        complete = ListCasters(&info->casters[i], casters[i], &lightView, view, &box);
        ++info->casterCount;
    }
    if (!complete) {
        QexModel_ReleaseShadowInfo(info);
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return nullptr;
    }
    SetMatrices(info, MapBox(box, view), &lightView);
    info->lightDir = *lightDir;
    info->shadowTexture = QexModel_GetSharedShaders()->shadowTexture;
    info->shadowIntensity = shadowIntensity;
    info->biasValue = biasValue;
    return info;
}

void QexModel_ReleaseShadowInfo(QexShadowInfo* info) {
    if (!info) return;
    QexModel_FreeCasters(info->casters, info->casterCount);
    QexMemory_Free(info);
}

void QexModel_RenderShadow(const QexRuntimeContext* context, const QexMatrix* modelMatrix,
                           const QexShadowInfo* info) {
    const QexModelSharedShaders* shared = QexModel_GetSharedShaders();
    GLint framebuffer = 0;
    if (!info || !shared->shadowFramebuffer) return;
    QEX_GL(glGetIntegerv(GL_FRAMEBUFFER_BINDING, &framebuffer));
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, shared->shadowFramebuffer));
    QEX_GL(glDisable(GL_SCISSOR_TEST));
    QEX_GL(glViewport(0, 0, shared->shadowWidth, shared->shadowHeight));
    QexRenderer_SetZWrite(1);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QEX_GL(glClearColor(1, 1, 1, 1));
    QEX_GL(glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT));
    QexModel_RenderFromShadowCamera(modelMatrix, info);
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(framebuffer)));
    QEX_GL(glViewport(0, 0, QexGL_Size(context->width), QexGL_Size(context->height)));
    QEX_GL(glEnable(GL_SCISSOR_TEST));
}

void QexModel_RenderFromShadowCamera(const QexMatrix* modelMatrix, const QexShadowInfo* info) {
    for (uint32_t c = 0; info && c < info->casterCount; ++c) {
        const QexShadowCaster& caster = info->casters[c];
        if (!QexLeanState_IsLean() || !DrawLean(caster, modelMatrix, &info->lightViewProj))
            DrawDescribed(caster, modelMatrix, &info->lightViewProj);
    }
    if (QexLeanState_IsLean()) return;
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
}

void QexModel_DrawShadowMesh(QexModel* model, uint32_t nodeIndex) {
    if (CanDraw(model, nodeIndex)) QexShaderModule_DrawMesh(QexModel_CasterType(false), model, nodeIndex);
}

void QexModel_DrawSkinShadowMesh(QexModel* model, uint32_t nodeIndex) {
    const QexShaderBones bones = {m_SkinShadowShaderProgram.boneCountLoc,
                                  m_SkinShadowShaderProgram.boneMatrixArrayLoc, false, 0, nullptr};
    if (CanDraw(model, nodeIndex))
        QexShaderModule_DrawSkinnedMesh(QexModel_CasterType(true), model, nodeIndex, bones);
}

}  // extern "C"
