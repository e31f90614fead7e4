// Loading models: the scene, its geometry, textures and modules, and what unloading gives back.
#include "model/Geometry.h"
#include "model/LeanRender.h"
#include "model/SharedShaders.h"

#include <cstdio>
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/models.h"
#include "Qex/pod.h"
#include "Qex/renderer.h"
#include "Qex/resources.h"
#include "Qex/shader_modules.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexModel"

namespace {

constexpr size_t kPathSize = 256;

template <class T>
T* AllocZeroed(uint32_t count) {
    T* array = QexMemory_AllocZeroed<T>(count);
    if (!array) QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return array;
}

// Joins directory and name; false when they do not fit.
bool JoinPath(char (&path)[kPathSize], const char* directory, const char* name) {
    const int length = snprintf(path, kPathSize, "%s%s", directory, name);
    if (length >= 0 && static_cast<size_t>(length) < kPathSize) return true;
    QexError(QEX_TAG, "<QexModel_LoadFromFile> the path %s%s is longer than %zu characters", directory, name,
             kPathSize - 1);
    return false;
}

// Lets go of what a former load left in the model, all but its share of the shaders.
void Discard(QexModel* model) {
    QexMemory_FreeArray(model->screenBoxes);
    QexMemory_FreeArray(model->nodeBoxes);
    QexModel_UnloadTextures(model);
    QexModel_UnloadGeometry(model);
    QexPODModel_Release(&model->scene);
}

// A read that did not end in a whole scene leaves nothing behind.
int32_t CheckRead(QexModel* model, int32_t result) {
    if (result == 0 && model->scene.runtime) return 0;
    QexPODModel_Release(&model->scene);
    return -1;
}

// Gives up a load: everything that it made so far goes, and unloading will give no shaders back.
int32_t Abandon(QexModel* model, int32_t result, bool shadersCreated, const char* message) {
    QexError(QEX_TAG, "%s", message);
    Discard(model);
    if (shadersCreated) QexModel_ReleaseShader(0);
    model->flags |= QEX_MODEL_NO_SHADERS;
    return result;
}

// The last steps of both ways to load: boxes, hook, modules.
bool Complete(QexModel* model) {
    QexPODModel& scene = model->scene;
    model->nodeBoxes = AllocZeroed<QexBoundingBox>(scene.meshNodeCount);
    model->screenBoxes = AllocZeroed<QexBoundingBox>(scene.meshNodeCount);
    if (!model->nodeBoxes || !model->screenBoxes) return false;
    for (uint32_t i = 0; model->meshNodeLoadedHook && i < scene.meshNodeCount; ++i)
        model->meshNodeLoadedHook(model, &scene.meshes[scene.nodes[i].objectIndex], i);
    const QexModelSharedShaders* shared = QexModel_GetSharedShaders();
    QexModel_SetShaderProgramForAllNode(model, shared->texture, shared->skinning);
    model->sharedGeneration = QexModel_GetSharedGeneration();
    return true;
}

// The buffers of a model, beside it: its arrays of names and its meshes lie where they are, wherever the
// record goes.
struct Buffers {
    Buffers* next;
    uint32_t *vertex, *index;
    QexPODMesh* meshes;
    uint32_t count;
};
Buffers* s_Buffers;

bool DownloadMesh(const Buffers& buffers, uint32_t index) {
    QexMeshUpload upload;
    if (!QexModelGeometry_Prepare(&upload, &buffers.meshes[index], index)) {
        QexModelGeometry_Release(&upload);
        return false;
    }
    QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, buffers.vertex[index]));
    QEX_GL(glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(upload.vertexBytes), upload.vertices,
                        GL_STATIC_DRAW));
    if (upload.indices) {
        if (!buffers.index[index]) QEX_GL(glGenBuffers(1, &buffers.index[index]));
        QEX_GL(glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, buffers.index[index]));
        QEX_GL(glBufferData(GL_ELEMENT_ARRAY_BUFFER, static_cast<GLsizeiptr>(uint64_t{upload.indexCount} * 2),
                            upload.indices, GL_STATIC_DRAW));
    }
    QexModelGeometry_Release(&upload);
    return true;
}

bool DownloadAll(const Buffers& buffers) {
    const QexMaking making;
    bool complete = true;
    for (uint32_t i = 0; complete && i < buffers.count && !making.Failed(); ++i)
        complete = !buffers.meshes[i].vertexCount || DownloadMesh(buffers, i);
    QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, 0));
    QEX_GL(glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0));
    return complete && !making.Failed();
}

void Forget() {}

void Reserve() {
    for (const Buffers* b = s_Buffers; b; b = b->next)
        for (uint32_t i = 0; i < b->count; ++i) {
            if (b->vertex[i]) QexContext_ReserveBuffer(b->vertex[i]);
            if (b->index[i]) QexContext_ReserveBuffer(b->index[i]);
        }
}

bool Restore() {
    bool whole = true;
    for (const Buffers* b = s_Buffers; b; b = b->next) whole &= DownloadAll(*b);
    return whole;
}

QexContextPart s_Part = {kRankGeometry, Forget, Reserve, Restore, nullptr, false};

bool NoteBuffers(const QexModel& model) {
    Buffers* buffers = AllocZeroed<Buffers>(1);
    if (!buffers) return false;
    QexContext_Register(&s_Part);
    *buffers = {s_Buffers, model.vertexBuffers, model.indexBuffers, model.scene.meshes,
                model.scene.meshCount};
    s_Buffers = buffers;
    return true;
}

void DropBuffers(const uint32_t* vertex) {
    Buffers** at = &s_Buffers;
    while (*at && (*at)->vertex != vertex) at = &(*at)->next;
    Buffers* buffers = *at;
    if (!buffers) return;
    *at = buffers->next;
    QexMemory_Free(buffers);
}

QexTexture* Exchange(QexTexture** textures, uint32_t count, QexTexture* texture, uint32_t index) {
    if (!textures || index >= count) return nullptr;
    QexTexture* previous = textures[index];
    textures[index] = texture;
    return previous;
}

}  // namespace

extern "C" {

int32_t QexModel_Create(QexModel* model) {
    memset(model, 0, sizeof *model);
    return 0;
}

int32_t QexModel_LoadFromFile(QexModel* model, const char* directory, const char* file) {
    char path[kPathSize];
    Discard(model);
    if (!JoinPath(path, directory, file)) return -1;
    return CheckRead(model, QexPODModel_ReadFromFile(&model->scene, path, 0, 0, 0, 0));
}

int32_t QexModel_LoadFromMemory(QexModel* model, const void* data, uint32_t size) {
    Discard(model);
    return CheckRead(model, QexPODModel_ReadFromMemory(&model->scene, data, size, 0, 0, 0, 0));
}

int32_t QexModel_LoadContent(QexModel* model, const char* directory, const char* file) {
    QexModel_Unload(model);
    int32_t result = QexModel_LoadFromFile(model, directory, file);
    if (result != 0)
        return Abandon(model, result, false, "<QexModel_LoadContent> QexModel_LoadFromFile error.");
    result = QexModel_CreateDefaultShader();
    if (result != 0)
        return Abandon(model, result, false, "<QexModel_LoadContent> create default shader error!");
    result = QexModel_DownloadGeometry(model);
    if (result != 0) return Abandon(model, result, true, "<QexModel_LoadContent> download geometry failed!");
    result = QexModel_LoadTextureFromFile(model, directory);
    if (result != 0) return Abandon(model, result, true, "<QexModel_LoadContent> model texture load failed!");
    if (!Complete(model)) return Abandon(model, -1, true, "<QexModel_LoadContent> out of memory");
    model->flags &= ~QEX_MODEL_NO_SHADERS;
    return 0;
}

int32_t QexModel_LoadContentFromCache(QexModel* model, const void* data, uint32_t size, QexNameCache* cache) {
    QexModel_Unload(model);
    if (QexModel_LoadFromMemory(model, data, size) != 0) {
        Abandon(model, 0, false, "<QexModel_LoadContentFromCache> QexModel_LoadFromMemory failed!");
        return 0;
    }
    if (QexModel_CreateDefaultShader() != 0)
        return Abandon(model, -1, false, "<QexModel_LoadContentFromCache> create default shader error!");
    if (QexModel_DownloadGeometry(model) != 0)
        return Abandon(model, -1, true, "<QexModel_LoadContentFromCache> download geometry failed!");
    if (QexModel_LoadTextureFromCache(model, cache) != 0 || !Complete(model))
        return Abandon(model, -1, true, "<QexModel_LoadContentFromCache> out of memory");
    model->flags &= ~QEX_MODEL_NO_SHADERS;
    return 0;
}

int32_t QexModel_DownloadGeometry(QexModel* model) {
    const uint32_t count = model->scene.meshCount;
    const QexMaking making;
    QexModel_UnloadGeometry(model);
    QexRenderState_Restore();
    model->vertexBuffers = AllocZeroed<uint32_t>(count);
    model->indexBuffers = AllocZeroed<uint32_t>(count);
    if (!model->vertexBuffers || !model->indexBuffers || !NoteBuffers(*model)) return -1;
    QEX_GL(glGenBuffers(static_cast<GLsizei>(count), model->vertexBuffers));
    if (DownloadAll(*s_Buffers) && !making.Failed()) return 0;
    QexModel_UnloadGeometry(model);
    return -1;
}

void QexModel_UnloadGeometry(QexModel* model) {
    QexModel_ReleaseLean(model);
    if (model->vertexBuffers) DropBuffers(model->vertexBuffers);
    const bool there = !g_QexContextLost;
    if (there && (model->vertexBuffers || model->indexBuffers)) {
        QexRenderState_Restore();
        QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, 0));
        QEX_GL(glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0));
    }
    for (uint32_t i = 0; there && i < model->scene.meshCount; ++i) {
        if (model->indexBuffers && model->indexBuffers[i])
            QEX_GL(glDeleteBuffers(1, &model->indexBuffers[i]));
        if (model->vertexBuffers) QEX_GL(glDeleteBuffers(1, &model->vertexBuffers[i]));
    }
    QexMemory_FreeArray(model->vertexBuffers);
    QexMemory_FreeArray(model->indexBuffers);
}

void QexModel_Unload(QexModel* model) {
    const bool loaded = model->scene.runtime != nullptr;
    Discard(model);
    if (!loaded || model->flags & QEX_MODEL_NO_SHADERS) return;
    if (!QexModel_IsOutdated(model)) QexModel_ReleaseShader(0);
    model->flags |= QEX_MODEL_NO_SHADERS;
    model->sharedGeneration = 0;
}

QexTexture* QexModel_ReplaceTextureByIdx(QexModel* model, QexTexture* texture, uint32_t index) {
    return Exchange(model->textures, model->scene.materialCount, texture, index);
}

QexTexture* QexModel_ReplaceAlphaTextureByIdx(QexModel* model, QexTexture* texture, uint32_t index) {
    return Exchange(model->alphaTextures, model->scene.materialCount, texture, index);
}

uint32_t QexModel_GetNumFrames(const QexModel* model) {
    return model->scene.frameCount;
}
uint32_t QexModel_GetFPS(const QexModel* model) {
    return model->scene.framesPerSecond;
}
uint32_t QexModel_GetNumNodes(const QexModel* model) {
    return model->scene.nodeCount;
}
uint32_t QexModel_GetNumMeshNodes(const QexModel* model) {
    return model->scene.meshNodeCount;
}

}  // extern "C"
