// Models: what they hold, and what unloading them gives back.
#include "model/Model.h"

#include <cstring>

#include "base/Memory.h"
#include "model/Load.h"
#include "model/SharedShaders.h"
#include "Qex/base.h"
#include "Qex/models.h"
#include "Qex/pod.h"

namespace {

QexTexture* Exchange(QexTexture** textures, uint32_t count, QexTexture* texture, uint32_t index) {
    if (!textures || index >= count) return nullptr;
    QexTexture* previous = textures[index];
    textures[index] = texture;
    return previous;
}

}  // namespace

void QexModel_Discard(QexModel* model) {
    QexModelLoad_Drop(model);
    QexMemory_FreeArray(model->screenBoxes);
    QexMemory_FreeArray(model->nodeBoxes);
    QexModel_UnloadTextures(model);
    QexModel_UnloadGeometry(model);
    QexPODModel_Release(&model->scene);
}

extern "C" {

int32_t QexModel_Create(QexModel* model) {
    if (QexModelLoad_Runs(model, "QexModel_Create")) return -1;
    QexModelLoad_Drop(model);
    memset(model, 0, sizeof *model);
    return 0;
}

void QexModel_Unload(QexModel* model) {
    if (QexModelLoad_Runs(model, "QexModel_Unload")) return;
    const bool loaded = model->scene.runtime != nullptr;
    QexModel_Discard(model);
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
