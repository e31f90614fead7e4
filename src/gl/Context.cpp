// Losing the GL context and having another one.
#include "gl/Context.h"

#include "base/Diagnostics.h"
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
#if !defined( \
    __EMSCRIPTEN__)  // there it exists now, and takes no other kind of data than that of its first target
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

extern "C" {

void QexEngine_ContextLost(void) {
    g_QexContextLost = true;
    ForgetAll();
}

int32_t QexEngine_ContextRestored(void) {
    if (!g_QexContextLost) return 0;
    GLint framebuffer = 0;
    ForgetAll();  // a loss that an error told of
    g_QexContextLost = false;
    ++g_QexContexts;
    const QexMaking making;
    bool whole = true;
    // What the context comes with is not the engine's; one that is lost again has no end of errors.
    for (int i = 0; i < kMostErrors && glGetError() != GL_NO_ERROR; ++i) continue;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &framebuffer);
    for (QexContextPart* part = s_Parts; part; part = part->next)
        if (part->reserve) part->reserve();
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(framebuffer));
    for (QexContextPart* part = s_Parts; part && !g_QexContextLost; part = part->next)
        if (part->restore) whole &= part->restore();
    QexRenderState_Restore();
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(framebuffer));
    glUseProgram(0);
    glActiveTexture(GL_TEXTURE0);
    QexRenderState_Reset(nullptr);
    QEX_GL_CHECK();
    if (whole && !making.Failed() && !g_QexContextLost) return 0;
    QexError(QEX_TAG, "<QexEngine_ContextRestored> %s",
             g_QexContextLost ? "the context was lost again" : "not everything could be made again");
    return -1;
}

uint32_t QexEngine_IsContextLost(void) {
    return g_QexContextLost;
}

}  // extern "C"
