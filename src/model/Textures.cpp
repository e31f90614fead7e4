// The textures that the materials of a model name.
#include "model/Textures.h"

#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "Qex/base.h"
#include "Qex/models.h"
#include "Qex/resources.h"
#include "Qex/shader_modules.h"
#include "Qex/textures.h"
#include "texture/Kept.h"

#define QEX_MODULE "src/QexModel"

namespace {

constexpr size_t kPathSize = kQexPathSize;

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

// The texture of that name: caches hold records, or pointers to them.
QexTexture* FindInCache(QexNameCache* cache, const char* name) {
    void* slot = nullptr;
    if (!cache || QexNameCache_Find(cache, name, &slot) < 0) return nullptr;
    if (cache->elements.elementSize == sizeof(QexTexture*)) return *static_cast<QexTexture**>(slot);
    return static_cast<QexTexture*>(slot);
}

// Has a model's hook load a texture again. It finds its record as it did before: the last one in the array.
int32_t LoadByHook(void* owner, uint32_t name, const char* path, QexTexture* texture) {
    QexModel* model = static_cast<QexModel*>(owner);
    uint32_t material = 0;
    const uint32_t count = model->textures ? model->scene.materialCount : 0;
    while (material < count && !(model->textures[material] && model->textures[material]->glName == name))
        ++material;
    QexScratch<QexTexture*> entries;
    if (material == count || !model->loadTextureHook || !entries.Alloc(count)) return -1;
    for (uint32_t i = 0; i < count; ++i) entries[i] = i < material ? model->textures[i] : nullptr;
    entries[material] = texture;
    char rewritten[kPathSize];
    snprintf(rewritten, kPathSize, "%s", path);
    QexTexture** textures = model->textures;
    model->textures = entries.Get();
    const int32_t dealt = model->loadTextureHook(model, rewritten, kPathSize - 1);
    model->textures = textures;
    return dealt && texture->glName ? 0 : -1;
}

bool AskHook(QexModel* model, char* path) {
    if (!model->loadTextureHook) return false;
    char given[kPathSize];
    snprintf(given, kPathSize, "%s", path);
    const QexKeptOwner owner({LoadByHook, model, given});
    const bool dealt = model->loadTextureHook(model, path, kPathSize - 1) != 0;
    path[kPathSize - 1] = 0;
    return dealt;
}

// Asks the hook, then the cache.
QexStep TakeFromCache(QexMaterialLoad* load, QexModel* model) {
    char* path = load->paths[0];
    if (AskHook(model, path)) return QexStep::kDone;
    model->textures[load->material] = FindInCache(load->cache, path);
    model->alphaTextures[load->material] = FindInCache(load->cache, load->paths[1]);
    return QexStep::kDone;
}

// Names the files and asks the hook. Done with the material where there is nothing to load.
QexStep NameFiles(QexMaterialLoad* load, QexModel* model) {
    const char* name = DiffuseName(model, load->material);
    if (!name || !MakePaths(load->paths[0], load->paths[1], load->directory ? load->directory : "", name))
        return QexStep::kDone;
    if (!load->directory) return TakeFromCache(load, model);
    QexTexture*& texture = model->textures[load->material];
    texture = NewTexture();
    if (!texture) return QexStep::kDone;
    return AskHook(model, load->paths[0]) ? QexStep::kDone : QexStep::kMore;
}

// The entry of the file that the load has come to: the diffuse texture's first.
QexTexture*& EntryOf(const QexMaterialLoad& load, QexModel* model) {
    return (load.phase == 1 ? model->textures : model->alphaTextures)[load.material];
}

// Opens the file of a record. A file that cannot be loaded leaves no record.
bool Open(QexMaterialLoad* load, QexTexture*& texture) {
    const char* path = load->paths[load->phase - 1];
    if (!path[0]) return false;
    if (!texture) texture = NewTexture();
    if (!texture) return false;
    load->opened =
        QexTextureFile_Begin(&load->file, {texture, {}, nullptr, true, 0, nullptr, load->piece}, path);
    if (!load->opened) FreeTexture(texture, false);
    return load->opened;
}

void Close(QexMaterialLoad* load, QexTexture*& texture) {
    QexTextureFile_End(&load->file);
    load->opened = false;
    if (load->file.result != 0) FreeTexture(texture, false);
}

// A part of one of a material's two files; done behind the last one.
QexStep LoadFile(QexMaterialLoad* load, QexModel* model) {
    QexTexture*& texture = EntryOf(*load, model);
    if (!load->opened && Open(load, texture)) return QexStep::kMore;
    if (load->opened && QexTextureLoad_Step(&load->file) == QexStep::kMore) return QexStep::kMore;
    if (load->opened) Close(load, texture);
    return ++load->phase == 3 ? QexStep::kDone : QexStep::kMore;
}

int32_t LoadAll(QexModel* model, const char* directory, QexNameCache* cache) {
    QexMaterialLoad load;
    if (!QexMaterialLoad_Begin(&load, model, directory, cache, kQexWhole)) return -1;
    QexStep_Run(&load, [model](QexMaterialLoad* l) { return QexMaterialLoad_Step(l, model); });
    return 0;
}

}  // namespace

bool QexMaterialLoad_Begin(QexMaterialLoad* load, QexModel* model, const char* directory, QexNameCache* cache,
                           uint32_t piece) {
    load->piece = piece;
    load->directory = directory;
    load->cache = cache;
    load->material = load->phase = 0;
    load->opened = false;
    if (!AllocArrays(model)) return false;
    if (directory) model->flags |= QEX_MODEL_OWNS_TEXTURES;
    return true;
}

QexStep QexMaterialLoad_Step(QexMaterialLoad* load, QexModel* model) {
    if (load->material == model->scene.materialCount) return QexStep::kDone;
    if (load->phase == 0 && NameFiles(load, model) == QexStep::kMore)
        load->phase = 1;
    else if (load->phase == 0 || LoadFile(load, model) == QexStep::kDone) {
        load->phase = 0;
        ++load->material;
    }
    return QexStep::kMore;
}

void QexMaterialLoad_Resume(const QexMaterialLoad* load) {
    if (load->opened) QexTextureLoad_Resume(&load->file);
}

void QexMaterialLoad_End(QexMaterialLoad* load, QexModel* model) {
    if (load->opened) Close(load, EntryOf(*load, model));
}

extern "C" {

int32_t QexModel_LoadTextureFromFile(QexModel* model, const char* directory) {
    return LoadAll(model, directory ? directory : "", nullptr);
}

int32_t QexModel_LoadTextureFromCache(QexModel* model, QexNameCache* cache) {
    return LoadAll(model, nullptr, cache);
}

void QexModel_UnloadTextures(QexModel* model) {
    const bool owned = model->flags & QEX_MODEL_OWNS_TEXTURES;
    for (uint32_t i = 0; owned && i < model->scene.materialCount; ++i) {
        if (model->textures) FreeTexture(model->textures[i], true);
        if (model->alphaTextures) FreeTexture(model->alphaTextures[i], true);
    }
    model->flags &= ~QEX_MODEL_OWNS_TEXTURES;
    if (model->textures) QexKeptOwner_Forget(model);
    QexMemory_Free(model->textures);
    QexMemory_Free(model->alphaTextures);
    model->textures = nullptr;
    model->alphaTextures = nullptr;
}

}  // extern "C"
