// Meshes go into GL buffers one after the other: laid out, then uploaded, in pieces where there is little
// time.
#include "model/Buffers.h"

#include <algorithm>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "model/LeanRender.h"
#include "Qex/models.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexModel"

namespace {

uint32_t* AllocNames(uint32_t count) {
    uint32_t* names = QexMemory_AllocZeroed<uint32_t>(count);
    if (!names) QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return names;
}

// The buffers of a model, beside it: its arrays of names and its meshes lie where they are, wherever the
// record goes.
struct Kept {
    Kept* next;
    uint32_t *vertex, *index;
    QexPODMesh* meshes;
    uint32_t count;
    uint32_t context;  // that they are of
};
Kept* s_Kept;
Kept* s_Filling;  // those that are being made again
QexBufferLoad s_Load;

bool Note(const QexModel& model);
void Drop(const uint32_t* vertex);
void DropOutdated(const QexModel& model);

// Uploads to the buffer all at once, or the next piece.
QexStep Fill(QexBufferLoad* load, GLenum target, uint32_t buffer, const void* data, uint64_t bytes) {
    if (!load->bound) QEX_GL(glBindBuffer(target, buffer));
    load->bound = true;
    const GLsizeiptr all = static_cast<GLsizeiptr>(bytes);
    if (bytes <= load->piece) {
        QEX_GL(glBufferData(target, all, data, GL_STATIC_DRAW));
        return QexStep::kDone;
    }
    if (!load->sent) QEX_GL(glBufferData(target, all, nullptr, GL_STATIC_DRAW));
    const uint64_t left = bytes - load->sent;
    const uint32_t count = left < load->piece ? static_cast<uint32_t>(left) : load->piece;
    QEX_GL(glBufferSubData(target, static_cast<GLintptr>(load->sent), static_cast<GLsizeiptr>(count),
                           static_cast<const uint8_t*>(data) + load->sent));
    load->sent += count;
    return load->sent < bytes ? QexStep::kMore : QexStep::kDone;
}

// ---- The phases of a mesh ----

QexStep Begin(QexBufferLoad* load, QexModel* model) {
    QexPODMesh* mesh = &model->scene.meshes[load->mesh];
    return QexModelGeometry_Begin(&load->upload, mesh, load->mesh) ? QexStep::kDone : QexStep::kFailed;
}

QexStep LayOut(QexBufferLoad* load, QexModel* model) {
    return QexModelGeometry_LayOut(&load->upload, &model->scene.meshes[load->mesh], load->piece);
}

QexStep FillVertices(QexBufferLoad* load, QexModel* model) {
    return Fill(load, GL_ARRAY_BUFFER, model->vertexBuffers[load->mesh], load->upload.vertices,
                load->upload.vertexBytes);
}

QexStep FillIndices(QexBufferLoad* load, QexModel* model) {
    uint32_t* buffer = &model->indexBuffers[load->mesh];
    if (!load->upload.indices) return QexStep::kDone;
    if (!*buffer) QEX_GL(glGenBuffers(1, buffer));
    return Fill(load, GL_ELEMENT_ARRAY_BUFFER, *buffer, load->upload.indices,
                uint64_t{load->upload.indexCount} * 2);
}

QexStep (*const kPhases[])(QexBufferLoad*, QexModel*) = {Begin, LayOut, FillVertices, FillIndices};
constexpr uint32_t kPhaseCount = sizeof kPhases / sizeof *kPhases;

}  // namespace

bool QexBufferLoad_Begin(QexBufferLoad* load, QexModel* model, uint32_t piece) {
    const uint32_t count = model->scene.meshCount;
    *load = {};
    load->piece = piece;
    QexModel_UnloadGeometry(model);
    QexRenderState_Restore();
    model->vertexBuffers = AllocNames(count);
    model->indexBuffers = AllocNames(count);
    const QexMaking making;
    if (!model->vertexBuffers || !model->indexBuffers || !Note(*model)) return false;
    QEX_GL(glGenBuffers(static_cast<GLsizei>(count), model->vertexBuffers));
    DropOutdated(*model);
    return !making.Failed();
}

QexStep QexBufferLoad_Step(QexBufferLoad* load, QexModel* model) {
    const uint32_t count = model->scene.meshCount;
    while (load->mesh < count && !model->scene.meshes[load->mesh].vertexCount) ++load->mesh;
    if (load->mesh == count) return QexStep::kDone;
    const QexMaking making;
    const QexStep step = kPhases[load->phase](load, model);
    if (making.Failed()) return QexStep::kFailed;
    if (step != QexStep::kDone) return step;
    load->sent = 0;
    load->bound = false;
    if (++load->phase < kPhaseCount) return QexStep::kMore;
    QexModelGeometry_Release(&load->upload);
    load->phase = 0;
    ++load->mesh;
    return QexStep::kMore;
}

void QexBufferLoad_Pause(QexBufferLoad* load) {
    load->bound = false;
    QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, 0));
    QEX_GL(glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0));
}

void QexBufferLoad_End(QexBufferLoad* load) {
    QexModelGeometry_Release(&load->upload);
}

namespace {

// The steps of a load that has begun, and its end.
bool FillAll(QexBufferLoad* load, QexModel* model) {
    const bool complete =
        QexStep_Run(load, [model](QexBufferLoad* l) { return QexBufferLoad_Step(l, model); });
    QexBufferLoad_Pause(load);
    QexBufferLoad_End(load);
    return complete;
}

void GiveUpFilling() {
    QexBufferLoad_End(&s_Load);
    s_Filling = nullptr;
}

void Reserve() {
    for (const Kept* kept = s_Kept; kept; kept = kept->next)
        for (uint32_t i = 0; i < kept->count; ++i) {
            if (kept->vertex[i]) QexContext_ReserveBuffer(kept->vertex[i]);
            if (kept->index[i]) QexContext_ReserveBuffer(kept->index[i]);
        }
}

QexStep Restore(uint32_t piece) {
    if (!s_Filling) {
        s_Filling = s_Kept;
        while (s_Filling && s_Filling->context == g_QexContexts) s_Filling = s_Filling->next;
        if (!s_Filling) return QexStep::kDone;
        s_Load = {};
        s_Filling->context = g_QexContexts;
    }
    QexModel model = {};
    model.scene.meshes = s_Filling->meshes;
    model.scene.meshCount = s_Filling->count;
    model.vertexBuffers = s_Filling->vertex;
    model.indexBuffers = s_Filling->index;
    s_Load.piece = piece;
    s_Load.bound = false;
    const QexStep step = QexBufferLoad_Step(&s_Load, &model);
    if (step == QexStep::kMore) return step;
    QexBufferLoad_Pause(&s_Load);
    GiveUpFilling();
    return step == QexStep::kDone ? QexStep::kMore : step;
}

QexContextPart s_Part = {kRankGeometry, GiveUpFilling, Reserve, nullptr, nullptr, false, Restore};

bool Note(const QexModel& model) {
    Kept* kept = QexMemory_AllocZeroed<Kept>(1);
    if (!kept) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return false;
    }
    QexContext_Register(&s_Part);
    *kept = {s_Kept,       model.vertexBuffers, model.indexBuffers, model.scene.meshes, model.scene.meshCount,
             g_QexContexts};
    s_Kept = kept;
    return true;
}

void Remove(Kept** at) {
    Kept* kept = *at;
    if (kept == s_Filling) GiveUpFilling();
    *at = kept->next;
    QexMemory_Free(kept);
}

void Drop(const uint32_t* vertex) {
    Kept** at = &s_Kept;
    while (*at && (*at)->vertex != vertex) at = &(*at)->next;
    if (*at) Remove(at);
}

bool Has(const Kept& kept, uint32_t name) {
    const uint32_t* end = kept.vertex + kept.count;
    return std::find(static_cast<const uint32_t*>(kept.vertex), end, name) != end;
}

// A GL gives out no name that is in use: who has one of the model's comes from an ended context.
void DropOutdated(const QexModel& model) {
    for (uint32_t i = 0; i < model.scene.meshCount; ++i)
        for (Kept **at = &s_Kept, *kept; (kept = *at);) {
            if (kept->vertex == model.vertexBuffers || !Has(*kept, model.vertexBuffers[i])) {
                at = &kept->next;
                continue;
            }
            Remove(at);
        }
}

}  // namespace

extern "C" {

int32_t QexModel_DownloadGeometry(QexModel* model) {
    QexBufferLoad load;
    const QexMaking making;
    if (QexBufferLoad_Begin(&load, model, kQexWhole) && FillAll(&load, model) && !making.Failed()) return 0;
    QexModel_UnloadGeometry(model);
    return -1;
}

void QexModel_UnloadGeometry(QexModel* model) {
    QexModel_ReleaseLean(model);
    if (model->vertexBuffers) Drop(model->vertexBuffers);
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

}  // extern "C"
