// The textures that the materials of a model name.
#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "Qex/base.h"
#include "Qex/models.h"
#include "Qex/resources.h"
#include "Qex/shader_modules.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexModel"

namespace {

constexpr size_t kPathSize = 256;

QexTexture** AllocEntries(uint32_t count) {
    QexScratch<QexTexture*> entries(count ? count : 1);
    for (uint32_t i = 0; entries && i < count; ++i) entries[i] = nullptr;
    return entries.Take();
}

bool AllocArrays(QexModel* model) {
    QexModel_UnloadTextures(model);
    model->textures = AllocEntries(model->scene.materialCount);
    model->alphaTextures = AllocEntries(model->scene.materialCount);
    if (model->textures && model->alphaTextures) return true;
    QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return false;
}

// The name of a material's diffuse texture, or null.
const char* DiffuseName(const QexModel* model, uint32_t material) {
    const int32_t index = model->scene.materials[material].diffuseTexture;
    return index < 0 ? nullptr : model->scene.textures[index].name;
}

// Puts prefix and name together, and the same with "_a" before the last four characters; false when they do
// not fit. Paths of fewer than four characters have no alpha path.
bool MakePaths(char (&path)[kPathSize], char (&alphaPath)[kPathSize], const char* prefix, const char* name) {
    const int written = snprintf(path, kPathSize, "%s%s", prefix, name);
    const size_t length = written < 0 ? kPathSize : static_cast<size_t>(written);
    if (length + 2 >= kPathSize) {
        QexError(QEX_TAG, "<QexModel_LoadTextureFromFile> the path %s%s is too long", prefix, name);
        return false;
    }
    alphaPath[0] = 0;
    if (length >= 4)
        snprintf(alphaPath, kPathSize, "%.*s_a.%s", static_cast<int>(length - 4), path, path + length - 3);
    return true;
}

void FreeTexture(QexTexture*& texture, bool release) {
    if (texture && release) QexTexture_Release(texture);
    QexMemory_Free(texture);
    texture = nullptr;
}

// Allocates an empty record.
QexTexture* NewTexture() {
    QexTexture* texture = QexMemory_AllocZeroed<QexTexture>(1);
    if (!texture) QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return texture;
}

// Loads a file into a new record; null when that fails.
QexTexture* LoadTexture(QexTexture* texture, const char* path) {
    if (texture && QexTexture_LoadPVRFromFile(texture, path, nullptr, 1, 0) != 0) FreeTexture(texture, false);
    return texture;
}

void LoadMaterial(QexModel* model, const char* directory, uint32_t material) {
    char path[kPathSize], alphaPath[kPathSize];
    const char* name = DiffuseName(model, material);
    if (!name || !MakePaths(path, alphaPath, directory, name)) return;
    model->textures[material] = NewTexture();
    if (!model->textures[material]) return;
    if (model->loadTextureHook && model->loadTextureHook(model, path, kPathSize - 1)) return;
    path[kPathSize - 1] = 0;
    model->textures[material] = LoadTexture(model->textures[material], path);
    if (alphaPath[0]) model->alphaTextures[material] = LoadTexture(NewTexture(), alphaPath);
}

// The texture of that name: caches hold records, or pointers to them.
QexTexture* FindInCache(QexNameCache* cache, const char* name) {
    void* slot = nullptr;
    if (!cache || QexNameCache_Find(cache, name, &slot) < 0) return nullptr;
    if (cache->elements.elementSize == sizeof(QexTexture*)) return *static_cast<QexTexture**>(slot);
    return static_cast<QexTexture*>(slot);
}

}  // namespace

extern "C" {

int32_t QexModel_LoadTextureFromFile(QexModel* model, const char* directory) {
    if (!AllocArrays(model)) return -1;
    model->flags |= QEX_MODEL_OWNS_TEXTURES;
    for (uint32_t i = 0; i < model->scene.materialCount; ++i) LoadMaterial(model, directory, i);
    return 0;
}

int32_t QexModel_LoadTextureFromCache(QexModel* model, QexNameCache* cache) {
    char path[kPathSize], alphaPath[kPathSize];
    if (!AllocArrays(model)) return -1;
    for (uint32_t i = 0; i < model->scene.materialCount; ++i) {
        const char* name = DiffuseName(model, i);
        if (!name || !MakePaths(path, alphaPath, "", name)) continue;
        if (model->loadTextureHook && model->loadTextureHook(model, path, kPathSize - 1)) continue;
        path[kPathSize - 1] = 0;
        model->textures[i] = FindInCache(cache, path);
        model->alphaTextures[i] = FindInCache(cache, alphaPath);
    }
    return 0;
}

void QexModel_UnloadTextures(QexModel* model) {
    const bool owned = model->flags & QEX_MODEL_OWNS_TEXTURES;
    for (uint32_t i = 0; owned && i < model->scene.materialCount; ++i) {
        if (model->textures) FreeTexture(model->textures[i], true);
        if (model->alphaTextures) FreeTexture(model->alphaTextures[i], true);
    }
    model->flags &= ~QEX_MODEL_OWNS_TEXTURES;
    QexMemory_Free(model->textures);
    QexMemory_Free(model->alphaTextures);
    model->textures = nullptr;
    model->alphaTextures = nullptr;
}

}  // extern "C"
