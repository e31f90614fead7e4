// Losing the GL context and having another one.
#include "gl/Context.h"

#include "base/Diagnostics.h"
#include "base/Time.h"
#include "gl/Extensions.h"
#include "gl/LeanState.h"
#include "Qex/base.h"
#include "Qex/renderer.h"

#if defined(__EMSCRIPTEN__)
#include <emscripten.h>
#endif

#define QEX_MODULE "src/QexRuntimeContext"

namespace {

// Of GL_KHR_robustness, and of WebGL.
constexpr GLenum kContextLost = 0x0507, kContextLostWebGL = 0x9242;

constexpr int kMostErrors = 16;

QexContextPart* s_Parts;
QexContextPart* s_Restoring;  // the part that a restore in parts has come to
bool s_Whole;                 // all that it has come to is there

void ForgetAll() {
    for (QexContextPart* part = s_Parts; part; part = part->next) part->forget();
    QexRenderState_Reset(nullptr);
    QexExtensions_Forget();
}

// In a browser a name stands for an object in a table: it gets a new one.
#if defined(__EMSCRIPTEN__)
EM_JS(void, RenewName, (int kind, int name), {
    const tables = [ GL.textures, GL.buffers, GL.framebuffers, GL.renderbuffers ];
    const makers = [ 'createTexture', 'createBuffer', 'createFramebuffer', 'createRenderbuffer' ];
    const object = GLctx[makers[kind]]();
    if (object) object.name = name;
    tables[kind][name] = object;
});
#else
void RenewName(int, GLuint) {}
#endif

}  // namespace

bool g_QexContextLost;
uint32_t g_QexContexts;

void QexContext_Register(QexContextPart* part) {
    if (part->registered) return;
    part->registered = true;
    QexContextPart** at = &s_Parts;
    while (*at && (*at)->rank <= part->rank) at = &(*at)->next;
    part->next = *at;
    *at = part;
}

bool QexContext_IsLoss(uint32_t error) {
    if (g_QexContextLost) return true;
    if (error != kContextLost && error != kContextLostWebGL) return false;
    QexLog(QEX_TAG, "<QexEngine> the GL context is lost");
    g_QexContextLost = true;
    return true;
}

void QexContext_ReserveTexture(GLenum target, GLuint name) {
    RenewName(0, name);
    glBindTexture(target, name);
}

void QexContext_ReserveBuffer(GLuint name) {
    RenewName(1, name);
#if !defined(__EMSCRIPTEN__)
    // There it exists now, and holds no other kind of data than that of the target it is first bound to.
    glBindBuffer(GL_ARRAY_BUFFER, name);
#endif
}

void QexContext_ReserveFramebuffer(GLuint name) {
    RenewName(2, name);
    glBindFramebuffer(GL_FRAMEBUFFER, name);
}

void QexContext_ReserveRenderbuffer(GLuint name) {
    RenewName(3, name);
    glBindRenderbuffer(GL_RENDERBUFFER, name);
}

bool QexContext_IsRestoring() {
    return s_Restoring;
}

namespace {

// The first things in a new context: the names of old are the engine's.
void Begin() {
    GLint framebuffer = 0;
    ForgetAll();  // a loss that an error told of
    g_QexContextLost = false;
    ++g_QexContexts;
    s_Whole = true;
    s_Restoring = s_Parts;
    // What the context comes with is not the engine's; one that is lost again has no end of errors.
    for (int i = 0; i < kMostErrors && glGetError() != GL_NO_ERROR; ++i) continue;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &framebuffer);
    for (QexContextPart* part = s_Parts; part; part = part->next)
        if (part->reserve) part->reserve();
    glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(framebuffer));
}

// Something of the part that the restore has come to, or all of it.
void RestoreSome(uint32_t piece) {
    const QexStep step = s_Restoring->step ? s_Restoring->step(piece) : QexStep::kDone;
    s_Whole &= step != QexStep::kFailed;
    if (s_Restoring->restore) s_Whole &= s_Restoring->restore();
    if (step == QexStep::kDone) s_Restoring = s_Restoring->next;
}

float RestoredShare() {
    uint32_t done = 0, all = 0;
    for (const QexContextPart* part = s_Parts; part; part = part->next) {
        if (part == s_Restoring) done = all;
        ++all;
    }
    return s_Restoring ? static_cast<float>(done) / static_cast<float>(all) : 1;
}

void LeaveUnbound(GLint framebuffer) {
    QexRenderState_Restore();
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(framebuffer));
    glUseProgram(0);
    glActiveTexture(GL_TEXTURE0);
    QexRenderState_Reset(nullptr);
    QEX_GL_CHECK();
}

// Restores until that time: 1 when there is more, else the end's result.
int32_t Restore(uint64_t end, uint32_t piece, float* progress) {
    if (progress) *progress = 1;
    if (!g_QexContextLost && !s_Restoring) return 0;
    const QexMaking making;
    GLint framebuffer = 0;
    if (!s_Restoring) Begin();
    QexRenderState_Reset(nullptr);
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &framebuffer);
    while (s_Restoring && !g_QexContextLost) {
        RestoreSome(piece);
        if (end != kQexNever && QexTime_Monotonic() >= end) break;
    }
    LeaveUnbound(framebuffer);
    s_Whole &= !making.Failed();
    if (progress) *progress = g_QexContextLost ? 0 : RestoredShare();
    if (s_Restoring && !g_QexContextLost) return 1;
    s_Restoring = nullptr;
    if (s_Whole) return 0;
    QexError(QEX_TAG, "<QexEngine_ContextRestored> %s",
             g_QexContextLost ? "the context was lost again" : "not everything could be made again");
    return -1;
}

}  // namespace

extern "C" {

void QexEngine_ContextLost(void) {
    g_QexContextLost = true;
    s_Restoring = nullptr;
    ForgetAll();
}

int32_t QexEngine_ContextRestored(void) {
    return Restore(kQexNever, kQexWhole, nullptr);
}

int32_t QexEngine_ContinueRestore(float milliseconds, float* progress) {
    return Restore(QexTime_In(milliseconds), kQexPiece, progress);
}

uint32_t QexEngine_IsContextLost(void) {
    return g_QexContextLost || s_Restoring;
}

}  // extern "C"
