// Mirror images in a plane: the casters drawn a second time through the reflection matrix, the plane over
// them.
#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"
#include "model/Casters.h"
#include "model/SharedShaders.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/models.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Qex/shadows.h"

#define QEX_MODULE "src/QexModel"

namespace {

bool CopyCaster(QexShadowCaster* copy, const QexShadowCaster& caster) {
    *copy = {caster.model, caster.allMeshNodes, nullptr, 0};
    if (caster.allMeshNodes || !caster.nodeIndices || !caster.nodeCount) return true;
    copy->nodeIndices = QexMemory_AllocArray<int32_t>(caster.nodeCount);
    if (!copy->nodeIndices) return false;
    copy->nodeCount = caster.nodeCount;
    memcpy(copy->nodeIndices, caster.nodeIndices, caster.nodeCount * sizeof *copy->nodeIndices);
    return true;
}

// A record with its own copy of the casters; null, with a line, when memory runs out.
QexReflection* Create(QexModel* model, const QexVec3& normal, const QexVec3& point,
                      const QexShadowCaster* casters, uint32_t casterCount) {
    QexReflection* reflection = QexMemory_AllocZeroed<QexReflection>(1);
    if (reflection) reflection->casters = QexMemory_AllocZeroed<QexShadowCaster>(casterCount);
    bool complete = reflection && reflection->casters;
    for (uint32_t i = 0; complete && i < casterCount; ++i) {
        complete = CopyCaster(&reflection->casters[i], casters[i]);
        ++reflection->casterCount;
    }
    if (!complete) {
        QexReflection_Release(reflection);
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return nullptr;
    }
    reflection->model = model;
    reflection->planeNormal = normal;
    reflection->planePoint = point;
    QexMatrix_CreateReflectionMatrix(&point, &normal, &reflection->reflectionMatrix);
    return reflection;
}

void DrawReflected(const QexReflection* reflection, const QexLightSet* lights, const QexCamera* camera) {
    for (uint32_t c = 0; c < reflection->casterCount; ++c) {
        const QexShadowCaster& caster = reflection->casters[c];
        const bool withPlane = caster.model == reflection->model && !reflection->infinite;
        const uint32_t count = !caster.model         ? 0
                               : caster.allMeshNodes ? caster.model->scene.meshNodeCount
                                                     : caster.nodeCount;
        for (uint32_t i = 0; i < count; ++i) {
            if (caster.allMeshNodes && withPlane && i == reflection->planeNode) continue;
            const uint32_t node = caster.allMeshNodes ? i : static_cast<uint32_t>(caster.nodeIndices[i]);
            QexModel_RenderNodeWithViewProjection(caster.model, node, lights, &reflection->reflectionMatrix,
                                                  &camera->viewMatrix, &camera->projectionMatrix);
        }
    }
}

}  // namespace

extern "C" {

QexReflection* QexReflection_InitReflectionInfo(QexModel* model, uint32_t planeNode,
                                                const QexShadowCaster* casters, uint32_t casterCount,
                                                uint8_t useStencil) {
    QexVec3 normal, point;
    QexPODModel_GetNodePlaneNormal(&model->scene, planeNode, &normal.x);
    QexPODModel_GetNodePlanePoint(&model->scene, planeNode, &point.x);
    QexReflection* reflection = Create(model, normal, point, casters, casterCount);
    if (!reflection) return nullptr;
    reflection->useStencil = useStencil;
    reflection->planeNode = planeNode;
    return reflection;
}

QexReflection* QexReflection_InitReflectionInfoInfinite(QexModel* model, const QexVec3* planeNormal,
                                                        const QexVec3* planePoint,
                                                        const QexShadowCaster* casters,
                                                        uint32_t casterCount) {
    QexReflection* reflection = Create(model, *planeNormal, *planePoint, casters, casterCount);
    if (reflection) reflection->infinite = 1;
    return reflection;
}

void QexReflection_Release(QexReflection* reflection) {
    if (!reflection) return;
    QexModel_FreeCasters(reflection->casters, reflection->casterCount);
    QexMemory_Free(reflection);
}

void QexReflection_RenderReflection(QexReflection* reflection, const QexLightSet* lights,
                                    const QexCamera* camera) {
    const QexMatrix *view = &camera->viewMatrix, *projection = &camera->projectionMatrix;
    const bool plane = !reflection->infinite;
    if (plane) QexPODModel_EnableNodeRendering(&reflection->model->scene, reflection->planeNode, 1);
    if (reflection->useStencil)
        QexModel_RenderReflectionPlaneStencil(reflection->model, reflection->planeNode, lights, nullptr, view,
                                              projection);
    QexRenderer_SetBackFaceCulling(QEX_CULL_FRONT);
    DrawReflected(reflection, lights, camera);
    if (reflection->useStencil) glDisable(GL_STENCIL_TEST);
    glClear(GL_DEPTH_BUFFER_BIT);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
    if (!plane) return;
    QexModel_RenderNodeWithViewProjection(reflection->model, reflection->planeNode, lights, nullptr, view,
                                          projection);
    QexPODModel_EnableNodeRendering(&reflection->model->scene, reflection->planeNode, 0);
}

void QexModel_RenderReflectionPlaneStencil(QexModel* model, uint32_t planeNode, const QexLightSet* lights,
                                           const QexMatrix* modelMatrix, const QexMatrix* view,
                                           const QexMatrix* projection) {
    glEnable(GL_STENCIL_TEST);
    glColorMask(GL_FALSE, GL_FALSE, GL_FALSE, GL_FALSE);
    glDisable(GL_DEPTH_TEST);
    glStencilFunc(GL_ALWAYS, 1, 1);
    glStencilOp(GL_KEEP, GL_KEEP, GL_REPLACE);
    if (planeNode < model->scene.meshNodeCount) {
        QexPODNode& node = model->scene.nodes[planeNode];
        QexShaderModule* const own = node.shader;
        node.shader = QexModel_GetSharedShaders()->simple;
        QexModel_RenderNodeWithViewProjection(model, planeNode, lights, modelMatrix, view, projection);
        node.shader = own;
    }
    glColorMask(GL_TRUE, GL_TRUE, GL_TRUE, GL_TRUE);
    glEnable(GL_DEPTH_TEST);
    glStencilFunc(GL_EQUAL, 1, 1);
    glStencilOp(GL_KEEP, GL_KEEP, GL_KEEP);
}

}  // extern "C"
