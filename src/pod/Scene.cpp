// The records of a scene: what they begin with, what releasing them frees, the runtime part, and what
// triangles and bones say.
#include "pod/Scene.h"

#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

#include <cstring>

namespace {

void ReleaseMesh(QexPODMesh* mesh) {
    // In an interleaved mesh only the faces have data of their own.
    const uint32_t own = mesh->interleaved ? kPODFaces + 1 : QexPODMesh_ElementCount(mesh);
    for (uint32_t i = 0; i < own; ++i) CPODData_Reset(QexPODMesh_Element(mesh, i));
    QexMemory_FreeArray(mesh->uvws);
    QexMemory_FreeArray(mesh->stripLengths);
    QexMemory_FreeArray(mesh->interleaved);
    QexBoneBatches_Release(&mesh->boneBatches);
    QexMemory_FreeArray(mesh->boneBoxes);
}

void ReleaseNode(QexPODNode* node) {
    QexMemory_FreeArray(node->name);
    for (const QexPODChannel& channel : kPODChannelTable) {
        QexMemory_FreeArray(node->*channel.index);
        QexPODNode_FreeKeys(node, channel);
    }
}

void ReleaseImpl(QexPODModel* scene) {
    if (!scene->runtime) return;
    SPVRTPODImpl_Destructor(scene->runtime);
    QexMemory_FreeArray(scene->runtime);
}

}  // namespace

void QexPODMaterial_SetDefaults(QexPODMaterial* material) {
    for (int32_t* index = &material->diffuseTexture; index <= &material->refractionTexture; ++index)
        *index = -1;
    material->blendSrcColour = material->blendSrcAlpha = 1;     // GL_ONE
    material->blendDstColour = material->blendDstAlpha = 0;     // GL_ZERO
    material->blendOpColour = material->blendOpAlpha = 0x8006;  // GL_FUNC_ADD
}

void QexPODMesh_SetDefaults(QexPODMesh* mesh) {
    QexMatrix_Identity(&mesh->unpackMatrix);
}

void QexPODNode_SetDefaults(QexPODNode* node) {
    node->speed = 1;
    node->stateFlags = QEX_NODE_ANIMATION_ENABLED | QEX_NODE_RENDERING_ENABLED;
    node->blendFlags = QEX_NODE_OPAQUE;
    QexPODModel_ResetNodeTransform(node);
}

void QexPODNode_FreeKeys(QexPODNode* node, const QexPODChannel& channel) {
    if (!(node->ownershipFlags & channel.shared)) QexMemory_Free(node->*channel.keys);
    node->ownershipFlags &= ~channel.shared;
    node->*channel.keys = nullptr;
}

uint32_t QexPODMesh_CountTriangles(const QexPODMesh& mesh) {
    return mesh.stripCount ? QexPODModel_CountIndices(&mesh) - 2 * mesh.stripCount : mesh.faceCount;
}

void QexPODMesh_ListCorners(const QexPODMesh& mesh, uint32_t* corners) {
    uint32_t n = 0;
    if (!mesh.stripCount)
        for (; n < mesh.faceCount * 3; ++n) corners[n] = n;
    uint32_t first = 0;
    for (uint32_t strip = 0; strip < mesh.stripCount; ++strip) {
        for (uint32_t i = first; i < first + mesh.stripLengths[strip]; ++i) {
            // Every second triangle of a strip is turned over.
            const uint32_t odd = (i - first) & 1;
            corners[n++] = i + odd;
            corners[n++] = i + 1 - odd;
            corners[n++] = i + 2;
        }
        first += mesh.stripLengths[strip] + 2;
    }
    const uint32_t size = QexPODData_ElementSize(mesh.faces.type, 1);
    for (uint32_t i = 0; mesh.faces.data && i < n; ++i)
        QexPODVertex_ReadInt(&corners[i], mesh.faces.data + uint64_t{corners[i]} * size, mesh.faces.type);
}

void QexPODMesh_ReadInfluences(const QexPODMesh* mesh, uint32_t vertex, float bones[4], float weights[4]) {
    const CPODData& index = mesh->boneIndices;
    const CPODData& weight = mesh->boneWeights;
    const int32_t n = static_cast<int32_t>(QexPODData_Components(index));
    // Bone indices count even where the file calls them normalised: the shaders get them as they are.
    QexPODVertex_ReadVec(bones, QexPODMesh_ElementData(mesh, index) + uint64_t{vertex} * index.stride,
                         QexPODType_Of(index.type).plain, n);
    QexPODVertex_ReadVec(weights, QexPODMesh_ElementData(mesh, weight) + uint64_t{vertex} * weight.stride,
                         weight.type, n);
    for (int32_t i = n; i < 4; ++i) bones[i] = weights[i] = 0;
}

extern "C" {

void CPODData_Reset(CPODData* element) {
    QexMemory_Free(element->data);
    *element = {QEX_POD_FLOAT, 0, 0, nullptr};
}

void SPVRTPODImpl_Contructor(SPVRTPODImpl* impl) {
    memset(impl, 0, sizeof *impl);
}

void SPVRTPODImpl_Destructor(SPVRTPODImpl* impl) {
    QexMemory_FreeArray(impl->cacheKeys);
    QexMemory_FreeArray(impl->cachedMatrices);
    QexMemory_FreeArray(impl->bindPose);
    QexMemory_FreeArray(impl->inverseBindPose);
    QexMemory_FreeArray(impl->boneMatrices);
    QexMemory_FreeArray(impl->boneMeshNodes);
    QexMemory_FreeArray(impl->meshToBone);
    QexMemory_FreeArray(impl->bindMeshNodes);
}

int32_t QexPODModel_InitImpl(QexPODModel* scene) {
    ReleaseImpl(scene);
    SPVRTPODImpl* impl = QexMemory_AllocZeroed<SPVRTPODImpl>(1);
    if (!impl) return -1;
    SPVRTPODImpl_Contructor(impl);
    scene->runtime = impl;
    impl->cacheKeys = QexMemory_AllocZeroed<float>(scene->nodeCount);
    impl->cachedMatrices = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->bindPose = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->inverseBindPose = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->boneMatrices = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->boneMeshNodes = QexMemory_AllocZeroed<int32_t>(scene->nodeCount);
    impl->meshToBone = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->bindMeshNodes = QexMemory_AllocZeroed<int32_t>(scene->nodeCount);
    if (!impl->cacheKeys || !impl->cachedMatrices || !impl->bindPose || !impl->inverseBindPose ||
        !impl->boneMatrices || !impl->boneMeshNodes || !impl->meshToBone || !impl->bindMeshNodes) {
        ReleaseImpl(scene);
        return -1;
    }
    QexPODModel_FlushCache(scene);
    return 0;
}

void QexPODModel_Release(QexPODModel* scene) {
    for (uint32_t i = 0; i < scene->cameraCount; ++i) QexMemory_FreeArray(scene->cameras[i].animatedFov);
    QexMemory_FreeArray(scene->cameras);
    for (uint32_t i = 0; i < scene->materialCount; ++i) {
        QexMemory_FreeArray(scene->materials[i].name);
        QexMemory_FreeArray(scene->materials[i].effectFile);
        QexMemory_FreeArray(scene->materials[i].effectName);
    }
    QexMemory_FreeArray(scene->materials);
    for (uint32_t i = 0; i < scene->meshCount; ++i) ReleaseMesh(&scene->meshes[i]);
    QexMemory_FreeArray(scene->meshes);
    for (uint32_t i = 0; i < scene->nodeCount; ++i) ReleaseNode(&scene->nodes[i]);
    QexMemory_FreeArray(scene->nodes);
    for (uint32_t i = 0; i < scene->textureCount; ++i) QexMemory_FreeArray(scene->textures[i].name);
    QexMemory_FreeArray(scene->textures);
    QexMemory_FreeArray(scene->lights);
    ReleaseImpl(scene);
    scene->cameraCount = scene->lightCount = scene->meshCount = scene->nodeCount = 0;
    scene->meshNodeCount = scene->textureCount = scene->materialCount = 0;
}

uint32_t QexPODModel_CountIndices(const QexPODMesh* mesh) {
    if (!mesh->stripCount) return mesh->faceCount * 3;
    uint32_t count = 0;
    for (uint32_t i = 0; i < mesh->stripCount; ++i) count += mesh->stripLengths[i] + 2;
    return count;
}

void QexPODModel_SetPassID(QexPODModel* scene, QexPODMesh* mesh, uint32_t passID) {
    mesh->passID = passID;
    if (passID > scene->highestPass) scene->highestPass = passID;
}

}  // extern "C"
