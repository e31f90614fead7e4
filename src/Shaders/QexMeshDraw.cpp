// Meshes drawn with a module: buffers and attributes, triangles and strips, bone batches with their matrices.
#include "pod/Animation.h"
#include "pod/Scene.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderModule.h"

#define QEX_MODULE (type->path)

// The meshes of the pass from the light are set up without checks.
#define QEX_GL_UNLESS_CASTER(call) QEX_GL_IF(!type->isCaster, call)

namespace {

uint32_t MeshIndexOf(const QexModel* model, uint32_t nodeIndex) {
    return static_cast<uint32_t>(model->scene.nodes[nodeIndex].objectIndex);
}

const void* BufferOffset(uint64_t bytes) {
    return reinterpret_cast<const void*>(static_cast<uintptr_t>(bytes));
}

// Draws `count` vertices from number `first`, by index where the mesh has indices.
void DrawRange(const QexShaderModuleType* type, bool indexed, GLenum mode, uint32_t first, uint32_t count) {
    if (indexed)
        QEX_GL(glDrawElements(mode, static_cast<GLsizei>(count), GL_UNSIGNED_SHORT,
                              BufferOffset(uint64_t{first} * 2)));
    else
        QEX_GL(glDrawArrays(mode, static_cast<GLint>(first), static_cast<GLsizei>(count)));
}

}  // namespace

void QexShaderModule_BeginMesh(const QexShaderModuleType* type, const QexModel* model, uint32_t meshIndex) {
    const QexPODMesh& mesh = model->scene.meshes[meshIndex];
    QexRenderState_Restore();
    QEX_GL_UNLESS_CASTER(glBindBuffer(GL_ARRAY_BUFFER, model->vertexBuffers[meshIndex]));
    QEX_GL_UNLESS_CASTER(glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, model->indexBuffers[meshIndex]));
    const QexShaderList& elements = type->attributes;
    for (GLuint i = 0; i < elements.count; ++i) {
        if (mesh.attributes[elements.items[i]].componentCount)
            QEX_GL_UNLESS_CASTER(glEnableVertexAttribArray(i));
        else
            QEX_GL(glVertexAttrib4f(i, 0, 0, 0, 1));
    }
    for (GLuint i = 0; i < elements.count; ++i) {
        const QexVertexAttribute& a = mesh.attributes[elements.items[i]];
        if (a.componentCount)
            QEX_GL(glVertexAttribPointer(i, a.componentCount, a.glType, a.normalised ? GL_TRUE : GL_FALSE,
                                         static_cast<GLsizei>(a.stride), BufferOffset(a.offset)));
    }
}

void QexShaderModule_EndMesh(const QexShaderModuleType* type, const QexModel* model, uint32_t meshIndex) {
    const QexPODMesh& mesh = model->scene.meshes[meshIndex];
    for (GLuint i = 0; i < type->attributes.count; ++i)
        if (mesh.attributes[type->attributes.items[i]].componentCount) QEX_GL(glDisableVertexAttribArray(i));
    QEX_GL_UNLESS_CASTER(glBindBuffer(GL_ARRAY_BUFFER, 0));
    QEX_GL_UNLESS_CASTER(glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0));
}

void QexShaderModule_DrawFaces(const QexShaderModuleType* type, const QexModel* model, uint32_t meshIndex) {
    const QexPODMesh* mesh = &model->scene.meshes[meshIndex];
    const bool indexed = model->indexBuffers[meshIndex] != 0;
    if (!mesh->stripCount) DrawRange(type, indexed, GL_TRIANGLES, 0, mesh->faceCount * 3);
    uint32_t first = 0;
    for (uint32_t i = 0; i < mesh->stripCount; ++i) {
        const uint32_t count = mesh->stripLengths[i] + 2;
        DrawRange(type, indexed, GL_TRIANGLE_STRIP, first, count);
        first += count;
    }
}

int32_t QexShaderModule_DrawMesh(const QexShaderModuleType* type, QexModel* model, uint32_t nodeIndex) {
    const uint32_t meshIndex = MeshIndexOf(model, nodeIndex);
    QexShaderModule_BeginMesh(type, model, meshIndex);
    QexShaderModule_DrawFaces(type, model, meshIndex);
    QexShaderModule_EndMesh(type, model, meshIndex);
    return 0;
}

void QexShaderModule_DrawBatches(const QexShaderModuleType* type, QexModel* model, uint32_t nodeIndex,
                                 const QexShaderBones& bones) {
    QexPODModel* scene = &model->scene;
    QexPODNode* node = &scene->nodes[nodeIndex];
    const QexPODMesh* mesh = QexPODModel_MeshOf(&model->scene, nodeIndex);
    const QexBoneBatches& batches = mesh->boneBatches;
    QexMatrix matrices[QEX_MAX_BATCH_BONES];
    for (int32_t batch = 0; batch < batches.batchCount; ++batch) {
        const int32_t* bone = batches.boneTable + static_cast<int64_t>(batch) * batches.maxBones;
        const int32_t count = batches.bonesPerBatch[batch];
        const uint32_t first = static_cast<uint32_t>(batches.offsets[batch]);
        const uint32_t end = batch + 1 < batches.batchCount
                                 ? static_cast<uint32_t>(batches.offsets[batch + 1])
                                 : mesh->faceCount;
        QEX_GL(glUniform1i(bones.boneCountLocation, mesh->attributes[QEX_ELEMENT_BONE_INDEX].componentCount));
        for (int32_t j = 0; j < count; ++j) {
            const QexMatrix* matrix =
                QexPODAnimation_BoneMatrix(scene, node, QexPODAnimation_BoneNode(scene, node, bone[j]));
            if (bones.modelMatrix)
                QexMatrix_Multiply(&matrices[j], bones.modelMatrix, matrix);
            else
                matrices[j] = *matrix;
        }
        QEX_GL(glUniformMatrix4fv(bones.boneMatrixLocation, count, GL_FALSE, matrices[0].m));
        if (bones.hasVectors) {
            QexMatrix3 vectors[QEX_MAX_BATCH_BONES];
            for (int32_t j = 0; j < count; ++j) QexShaderModule_NormalMatrix(&vectors[j], &matrices[j]);
            QEX_GL(glUniformMatrix3fv(bones.boneVectorLocation, count, GL_FALSE, vectors[0].m));
        }
        DrawRange(type, true, GL_TRIANGLES, first * 3, (end - first) * 3);
    }
}

int32_t QexShaderModule_DrawSkinnedMesh(const QexShaderModuleType* type, QexModel* model, uint32_t nodeIndex,
                                        const QexShaderBones& bones) {
    const uint32_t meshIndex = MeshIndexOf(model, nodeIndex);
    if (!model->scene.meshes[meshIndex].skinned) return 0;
    QexShaderModule_BeginMesh(type, model, meshIndex);
    QexShaderModule_DrawBatches(type, model, nodeIndex, bones);
    QexShaderModule_EndMesh(type, model, meshIndex);
    return 0;
}
