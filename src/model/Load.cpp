// Loading a model whole: the same stages at once or a few milliseconds at a time.
//
// A load works on the application's record. Between the calls for a load in parts the record stands empty,
// as if nothing had been loaded, and what there is of the model waits in the load.
#include "model/Load.h"

#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "base/Time.h"
#include "data/SourceStream.h"
#include "gl/GL.h"
#include "model/Buffers.h"
#include "model/Model.h"
#include "model/SharedShaders.h"
#include "model/Textures.h"
#include "pod/Reader.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/models.h"
#include "Qex/pod.h"
#include "Qex/renderer.h"
#include "Qex/resources.h"

#define QEX_MODULE "src/QexModel"

namespace {

constexpr size_t kPathSize = kQexPathSize;

struct Load {
    Load* next = nullptr;
    QexModel* model = nullptr;
    QexModel other = {};  // what the record holds when the load does not run, or does
    bool fromCache = false;
    char directory[kPathSize] = {};
    QexNameCache* cache = nullptr;
    uint32_t piece = kQexWhole;
    uint32_t stage = 0;
    uint32_t context = 0;  // in which it began
    uint32_t node = 0;     // whose hook is called next
    QexSourceStream stream = {};
    QexPODReader reader = {};
    QexBufferLoad buffers = {};
    QexMaterialLoad materials = {};
};

// Those that do not run now, and those that do: more than one where a hook loads another model.
Load *s_Loads, *s_Running;

// ---- Stages ----

QexStep Result(bool succeeded) {
    return succeeded ? QexStep::kDone : QexStep::kFailed;
}

float Share(uint32_t done, uint32_t all) {
    return all ? static_cast<float>(done) / static_cast<float>(all) : 1;
}

QexStep Read(Load* load) {
    const QexStep step = QexPODReader_Step(&load->reader);
    if (step == QexStep::kMore) return step;
    QexPODReader_End(&load->reader);
    QexSourceStream_Release(&load->stream);
    return step;
}

float ReadShare(const Load& load) {
    return Share(load.stream.position - load.reader.pendingBytes, load.stream.file->size);
}

// From here on the model holds a share of the shaders.
QexStep ShareShaders(Load* load) {
    if (QexModel_CreateDefaultShader() != 0) return QexStep::kFailed;
    load->model->flags &= ~QEX_MODEL_NO_SHADERS;
    load->model->sharedGeneration = QexModel_GetSharedGeneration();
    return QexStep::kDone;
}

QexStep MakeBuffers(Load* load) {
    return Result(QexBufferLoad_Begin(&load->buffers, load->model, load->piece));
}

QexStep FillBuffers(Load* load) {
    const QexStep step = QexBufferLoad_Step(&load->buffers, load->model);
    if (step != QexStep::kMore) QexBufferLoad_Pause(&load->buffers);
    return step;
}

float FilledShare(const Load& load) {
    return Share(load.buffers.mesh, load.model->scene.meshCount);
}

void PauseBuffers(Load* load) {
    QexBufferLoad_Pause(&load->buffers);
}

void ResumeBuffers(Load*) {
    QexRenderState_Restore();
}

QexStep MakeTextures(Load* load) {
    return Result(QexMaterialLoad_Begin(&load->materials, load->model,
                                        load->fromCache ? nullptr : load->directory, load->cache,
                                        load->piece));
}

QexStep LoadTextures(Load* load) {
    return QexMaterialLoad_Step(&load->materials, load->model);
}

float TexturedShare(const Load& load) {
    return Share(3 * load.materials.material + load.materials.phase, 3 * load.model->scene.materialCount);
}

void ResumeTextures(Load* load) {
    QexMaterialLoad_Resume(&load->materials);
}

QexStep MakeBoxes(Load* load) {
    QexModel* model = load->model;
    model->nodeBoxes = QexMemory_AllocZeroed<QexBoundingBox>(model->scene.meshNodeCount);
    model->screenBoxes = QexMemory_AllocZeroed<QexBoundingBox>(model->scene.meshNodeCount);
    if (model->nodeBoxes && model->screenBoxes) return QexStep::kDone;
    QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return QexStep::kFailed;
}

QexStep CallHooks(Load* load) {
    QexModel* model = load->model;
    QexPODModel& scene = model->scene;
    const uint32_t node = load->node++;
    if (!model->meshNodeLoadedHook || node >= scene.meshNodeCount) return QexStep::kDone;
    model->meshNodeLoadedHook(model, &scene.meshes[scene.nodes[node].objectIndex], node);
    return QexStep::kMore;
}

QexStep GiveModules(Load* load) {
    const QexModelSharedShaders* shared = QexModel_GetSharedShaders();
    QexModel_SetShaderProgramForAllNode(load->model, shared->texture, shared->skinning);
    return QexStep::kDone;
}

struct Stage {
    QexStep (*step)(Load*);
    const char* fault[2];         // of a failure, from a file and from memory
    float weight;                 // in the progress; about its time
    float (*share)(const Load&);  // of it that is done, null: nothing
    void (*pause)(Load*);         // before others call the GL, or null
    void (*resume)(Load*);        // after that, or null
};

constexpr char kGeometryFault[] = "download geometry failed!", kTextureFault[] = "model texture load failed!",
               kMemoryFault[] = "out of memory";

const Stage kStages[] = {
    {Read,
     {"QexModel_LoadFromFile error.", "QexModel_LoadFromMemory failed!"},
     0.5f,
     ReadShare,
     nullptr,
     nullptr},
    {ShareShaders, {"create default shader error!", kMemoryFault}, 0, nullptr, nullptr, nullptr},
    {MakeBuffers, {kGeometryFault, kGeometryFault}, 0, nullptr, nullptr, nullptr},
    {FillBuffers, {kGeometryFault, kGeometryFault}, 0.2f, FilledShare, PauseBuffers, ResumeBuffers},
    {MakeTextures, {kTextureFault, kMemoryFault}, 0, nullptr, nullptr, nullptr},
    {LoadTextures, {kTextureFault, kMemoryFault}, 0.29f, TexturedShare, nullptr, ResumeTextures},
    {MakeBoxes, {kMemoryFault, kMemoryFault}, 0, nullptr, nullptr, nullptr},
    {CallHooks, {nullptr, nullptr}, 0, nullptr, nullptr, nullptr},
    {GiveModules, {nullptr, nullptr}, 0.01f, nullptr, nullptr, nullptr},
};
constexpr uint32_t kStageCount = sizeof kStages / sizeof *kStages;

float Progress(const Load& load) {
    float progress = 0;
    for (uint32_t i = 0; i < load.stage; ++i) progress += kStages[i].weight;
    const Stage& stage = kStages[load.stage];
    return progress + (stage.share ? stage.weight * stage.share(load) : 0);
}

// ---- Loads ----

// Frees what loading needed, and nothing of the model.
void Close(Load* load, QexModel* model) {
    QexPODReader_End(&load->reader);
    QexSourceStream_Release(&load->stream);
    QexBufferLoad_End(&load->buffers);
    QexMaterialLoad_End(&load->materials, model);
}

// The model holds nothing any more, and unloading it will give no shaders back.
int32_t Abandon(Load* load) {
    QexError(QEX_TAG, "<QexModel_LoadContent%s> %s", load->fromCache ? "FromCache" : "",
             kStages[load->stage].fault[load->fromCache]);
    Close(load, load->model);
    QexModel_Unload(load->model);
    load->model->flags |= QEX_MODEL_NO_SHADERS;
    return -1;
}

// Joins directory and name; false when they do not fit.
bool JoinPath(char (&path)[kPathSize], const char* directory, const char* name) {
    const int length = snprintf(path, kPathSize, "%s%s", directory, name);
    if (length >= 0 && static_cast<size_t>(length) < kPathSize) return true;
    QexError(QEX_TAG, "<QexModel_LoadFromFile> the path %s%s is longer than %zu characters", directory, name,
             kPathSize - 1);
    return false;
}

void BeginRead(Load* load, QexModel* model) {
    memset(&model->scene, 0, sizeof model->scene);
    QexPODReader_Begin(&load->reader, &load->stream, &model->scene, false, load->piece);
}

// Opens a scene to be read into the model. False, with a line in the log, when that fails.
bool OpenFile(Load* load, QexModel* model, const char* directory, const char* file) {
    char path[kPathSize];
    if (!JoinPath(path, directory, file) || !QexSourceStream_CreateUnread(&load->stream, path)) return false;
    BeginRead(load, model);
    return true;
}

bool OpenMemory(Load* load, QexModel* model, const void* data, uint32_t size) {
    if (!QexSourceStream_CreateFromMemory(&load->stream, data, size)) return false;
    BeginRead(load, model);
    return true;
}

// Reads the scene alone. What does not end in a whole scene leaves nothing behind.
int32_t ReadAll(Load* load, QexModel* model, bool opened) {
    if (opened && QexStep_Run(load, Read)) return 0;
    Close(load, model);
    QexPODModel_Release(&model->scene);
    return -1;
}

// Empties a model for a load.
void Begin(Load* load, QexModel* model) {
    QexModel_Unload(model);
    load->model = model;
    load->context = g_QexContexts;
    load->other = *model;
    model->flags |= QEX_MODEL_NO_SHADERS;
}

int32_t BeginFile(Load* load, QexModel* model, const char* directory, const char* file) {
    if (QexModelLoad_Runs(model, "QexModel_LoadContent")) return -1;
    Begin(load, model);
    if (!OpenFile(load, model, directory, file)) return Abandon(load);
    snprintf(load->directory, kPathSize, "%s", directory);
    return 0;
}

int32_t BeginMemory(Load* load, QexModel* model, const void* data, uint32_t size, QexNameCache* cache) {
    if (QexModelLoad_Runs(model, "QexModel_LoadContentFromCache")) return -1;
    Begin(load, model);
    load->fromCache = true;
    load->cache = cache;
    return OpenMemory(load, model, data, size) ? 0 : Abandon(load);
}

// At least one step, and others until that time.
QexStep RunUntil(Load* load, uint64_t end) {
    QexStep step;
    load->next = s_Running;
    s_Running = load;
    do {
        step = kStages[load->stage].step(load);
        if (step == QexStep::kDone && ++load->stage < kStageCount) step = QexStep::kMore;
    } while (step == QexStep::kMore && (end == kQexNever || QexTime_Monotonic() < end));
    s_Running = load->next;
    return step;
}

int32_t Finish(Load* load, QexStep step) {
    if (step == QexStep::kFailed) return Abandon(load);
    Close(load, load->model);
    return 0;
}

// ---- Loads in parts ----

// What there is of the model and what the record holds change places. Hooks and frame are the application's
// at any time.
void Exchange(Load* load) {
    QexModel* model = load->model;
    const QexModel held = *model;
    *model = load->other;
    load->other = held;
    model->currentFrame = held.currentFrame;
    model->bindTextureHook = held.bindTextureHook;
    model->loadTextureHook = held.loadTextureHook;
    model->meshNodeLoadedHook = held.meshNodeLoadedHook;
}

// Takes a model's load from those that do not run; null where there is none.
Load* Take(const QexModel* model) {
    for (Load** link = &s_Loads; *link; link = &(*link)->next) {
        Load* const load = *link;
        if (load->model != model) continue;
        *link = load->next;
        return load;
    }
    return nullptr;
}

void PutBack(Load* load) {
    Exchange(load);
    load->next = s_Loads;
    s_Loads = load;
}

Load* NewLoad() {
    Load* load = QexMemory_AllocArray<Load>(1);
    if (!load) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return nullptr;
    }
    *load = Load();
    load->piece = kQexPiece;
    return load;
}

// A load that has begun waits, one that has not goes.
int32_t Begun(Load* load, int32_t result) {
    if (result == 0)
        PutBack(load);
    else
        QexMemory_Free(load);
    return result;
}

}  // namespace

bool QexModelLoad_Runs(const QexModel* model, const char* function) {
    const Load* load = s_Running;
    while (load && load->model != model) load = load->next;
    if (load) QexError(QEX_TAG, "<%s> refused: the model's own load is calling a hook", function);
    return load;
}

void QexModelLoad_Drop(const QexModel* model) {
    Load* load = Take(model);
    if (!load) return;
    Close(load, &load->other);
    QexModel_Unload(&load->other);
    QexMemory_Free(load);
}

extern "C" {

int32_t QexModel_LoadFromFile(QexModel* model, const char* directory, const char* file) {
    Load load;
    if (QexModelLoad_Runs(model, "QexModel_LoadFromFile")) return -1;
    QexModel_Discard(model);
    return ReadAll(&load, model, OpenFile(&load, model, directory, file));
}

int32_t QexModel_LoadFromMemory(QexModel* model, const void* data, uint32_t size) {
    Load load;
    if (QexModelLoad_Runs(model, "QexModel_LoadFromMemory")) return -1;
    QexModel_Discard(model);
    return ReadAll(&load, model, OpenMemory(&load, model, data, size));
}

int32_t QexModel_LoadContent(QexModel* model, const char* directory, const char* file) {
    Load load;
    const int32_t result = BeginFile(&load, model, directory, file);
    return result ? result : Finish(&load, RunUntil(&load, kQexNever));
}

int32_t QexModel_LoadContentFromCache(QexModel* model, const void* data, uint32_t size, QexNameCache* cache) {
    Load load;
    if (BeginMemory(&load, model, data, size, cache) != 0) return 0;
    const int32_t result = Finish(&load, RunUntil(&load, kQexNever));
    return load.stage ? result : 0;
}

int32_t QexModel_BeginLoad(QexModel* model, const char* directory, const char* file) {
    Load* load = NewLoad();
    return load ? Begun(load, BeginFile(load, model, directory, file)) : -1;
}

int32_t QexModel_BeginLoadFromCache(QexModel* model, const void* data, uint32_t size, QexNameCache* cache) {
    Load* load = NewLoad();
    return load ? Begun(load, BeginMemory(load, model, data, size, cache)) : -1;
}

int32_t QexModel_ContinueLoad(QexModel* model, float milliseconds, float* progress) {
    const uint64_t end = QexTime_In(milliseconds);
    Load* load = Take(model);
    if (progress) *progress = 0;
    if (!load) {
        QexError(QEX_TAG, "<QexModel_ContinueLoad> the model is not being loaded");
        return -1;
    }
    Exchange(load);
    // What was being made when a context was lost cannot be gone on with in another.
    const bool same = load->context == g_QexContexts && !g_QexContextLost;
    if (same && kStages[load->stage].resume) kStages[load->stage].resume(load);
    const QexStep step = same ? RunUntil(load, end) : QexStep::kFailed;
    if (step == QexStep::kMore) {
        if (kStages[load->stage].pause) kStages[load->stage].pause(load);
        if (progress) *progress = Progress(*load);
        PutBack(load);
        return 1;
    }
    const int32_t result = Finish(load, step);
    if (progress && result == 0) *progress = 1;
    // What the record was given in the meantime.
    QexModel_Unload(&load->other);
    QexMemory_Free(load);
    return result;
}

}  // extern "C"
