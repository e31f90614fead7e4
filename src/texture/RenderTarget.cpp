// Framebuffers that a scene is drawn into, with a colour texture and a depth buffer.
#include <cstdio>
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "Qex/base.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/Kept.h"
#include "texture/RenderTarget.h"

#define QEX_MODULE "src/QexRenderTarget"

namespace {

struct KeptTarget {
    KeptTarget* next;
    QexTargetNames names;
};
KeptTarget* s_Targets;

void Reserve() {
    for (const KeptTarget* target = s_Targets; target; target = target->next) {
        QexContext_ReserveRenderbuffer(target->names.depth);
        QexContext_ReserveFramebuffer(target->names.framebuffer);
    }
}

void Attach(const QexTargetNames& names) {
    QEX_GL(glBindRenderbuffer(GL_RENDERBUFFER, names.depth));
    QEX_GL(glRenderbufferStorage(GL_RENDERBUFFER, GL_DEPTH_COMPONENT16, names.width, names.height));
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, names.framebuffer));
    QEX_GL(glFramebufferRenderbuffer(GL_FRAMEBUFFER, GL_DEPTH_ATTACHMENT, GL_RENDERBUFFER, names.depth));
    QEX_GL(glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, names.texture, 0));
}

// Their colour textures are there again. Contents are gone.
bool Restore() {
    GLint framebuffer = 0;
    QEX_GL(glGetIntegerv(GL_FRAMEBUFFER_BINDING, &framebuffer));
    for (const KeptTarget* target = s_Targets; target; target = target->next) Attach(target->names);
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(framebuffer)));
    return true;
}

// Takes a target from the list. The name of its texture, or 0.
GLuint Forget(GLuint framebuffer) {
    KeptTarget** at = &s_Targets;
    while (*at && (*at)->names.framebuffer != framebuffer) at = &(*at)->next;
    KeptTarget* kept = *at;
    if (!kept) return 0;
    const GLuint texture = kept->names.texture;
    *at = kept->next;
    QexMemory_Free(kept);
    return texture;
}

void ForgetNothing() {}

QexContextPart s_Part = {kRankTargets, ForgetNothing, Reserve, Restore, nullptr, false};

}  // namespace

bool QexRenderTarget_Note(const QexTargetNames& names) {
    Forget(names.framebuffer);  // one of an earlier start that was never released
    KeptTarget* kept = QexMemory_AllocZeroed<KeptTarget>(1);
    if (!kept) return false;
    QexContext_Register(&s_Part);
    *kept = {s_Targets, names};
    s_Targets = kept;
    return QexKeptTexture_Note(names.texture, GL_TEXTURE_2D,
                               {kKeptTarget, nullptr, 0, names.width, names.height, 0, 0, 0});
}

void QexRenderTarget_DropNote(uint32_t framebuffer) {
    QexKeptTexture_Drop(Forget(framebuffer));
}

void QexRenderTarget_CreateColourTexture(QexTexture* texture, int32_t width, int32_t height) {
    QexRenderState_ActiveTexture(GL_TEXTURE0);
    texture->glName = QexKeptTexture_NewName();
    QexRenderState_Bind(GL_TEXTURE_2D, texture->glName);
    QEX_GL(glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, width, height, 0, GL_RGBA, GL_UNSIGNED_BYTE, nullptr));
    glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
    glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
    glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE);
    glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE);
    texture->bytesPerPixel = 4;
    texture->filter = QEX_FILTER_NEAREST;
    texture->wrap = QEX_WRAP_CLAMP;
    texture->flags = 1;
    texture->format = GL_RGBA;
    texture->width = width;
    texture->height = static_cast<uint32_t>(height);
}

namespace {

void SetViewport(const int32_t* viewport) {
    glViewport(viewport[0], viewport[1], viewport[2], viewport[3]);
}

}  // namespace

int32_t QexRenderTarget_MaxSize() {
    GLint texture = 0, renderbuffer = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &texture);
    glGetIntegerv(GL_MAX_RENDERBUFFER_SIZE, &renderbuffer);
    const GLint least = texture < renderbuffer ? texture : renderbuffer;
    return least > 0 ? least : INT32_MAX;
}

bool QexRenderTarget_CheckSize(const char* function, int32_t width, int32_t height) {
    const int32_t most = QexRenderTarget_MaxSize();
    if (width >= 1 && height >= 1 && width <= most && height <= most) return true;
    QexError(QEX_TAG, "<%s> %d x %d pixels; this GL takes 1 to %d each", function, width, height, most);
    return false;
}

void QexRenderTarget_CheckComplete() {
    if (!QexDiagnostics_HasHandler()) return;
    const GLenum status = glCheckFramebufferStatus(GL_FRAMEBUFFER);
    char message[64];
    if (status == GL_FRAMEBUFFER_COMPLETE) return;
    snprintf(message, sizeof message, "an incomplete framebuffer, status 0x%.4x", status);
    QexError(QEX_TAG, "%s", message);
    QexDiagnostics_Refused(QEX_ERROR_FRAMEBUFFER, QEX_MODULE, __FILE__, __LINE__, message);
}

extern "C" {

int32_t QexRenderTarget_Create(QexRenderTarget* target, int32_t width, int32_t height, int32_t) {
    memset(target, 0, sizeof *target);
    if (!QexRenderTarget_CheckSize("QexRenderTarget_Create", width, height)) return -1;
    const QexMaking making;
    target->created = 1;
    QEX_GL(glGetIntegerv(GL_FRAMEBUFFER_BINDING, &target->savedFramebuffer));
    QEX_GL(glGenFramebuffers(1, &target->framebuffer));
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, target->framebuffer));
    QexRenderTarget_CreateColourTexture(&target->colorTexture, width, height);
    QEX_GL(glGenRenderbuffers(1, &target->depthRenderbuffer));
    QEX_GL(glBindRenderbuffer(GL_RENDERBUFFER, target->depthRenderbuffer));
    QEX_GL(glRenderbufferStorage(GL_RENDERBUFFER, GL_DEPTH_COMPONENT16, width, height));
    QEX_GL(glFramebufferRenderbuffer(GL_FRAMEBUFFER, GL_DEPTH_ATTACHMENT, GL_RENDERBUFFER,
                                     target->depthRenderbuffer));
    QEX_GL(glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D,
                                  target->colorTexture.glName, 0));
    QexRenderTarget_CheckComplete();
    target->viewport[2] = width;
    target->viewport[3] = height;
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(target->savedFramebuffer)));
    QexRenderTarget_Note(
        {target->framebuffer, target->colorTexture.glName, target->depthRenderbuffer, width, height});
    if (!making.Failed()) return 0;
    QexRenderTarget_Release(target);
    return -1;
}

int32_t QexRenderTarget_CreateFromTexture(QexRenderTarget*, QexTexture*) {
    return 0;
}

int32_t QexRenderTarget_BeginScene(QexRenderTarget* target) {
    QEX_GL(glGetIntegerv(GL_FRAMEBUFFER_BINDING, &target->savedFramebuffer));
    glGetIntegerv(GL_VIEWPORT, target->savedViewport);
    glBindFramebuffer(GL_FRAMEBUFFER, target->framebuffer);
    SetViewport(target->viewport);
    return 0;
}

void QexRenderTarget_EndScene(QexRenderTarget* target) {
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(target->savedFramebuffer)));
    SetViewport(target->savedViewport);
}

int32_t QexRenderTarget_SetRenderTarget(const QexRuntimeContext* context, QexRenderTarget* target) {
    const int32_t screen[] = {0, 0, context ? QexGL_Size(context->width) : 0,
                              context ? QexGL_Size(context->height) : 0};
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, target ? target->framebuffer : 0));
    QEX_GL(SetViewport(target ? target->viewport : screen));
    return 0;
}

void QexRenderTarget_Release(QexRenderTarget* target) {
    if (!target) return;
    QexRenderTarget_DropNote(target->framebuffer);
    const bool there = !g_QexContextLost;
    if (there && target->colorTexture.glName) glDeleteTextures(1, &target->colorTexture.glName);
    QexLeanState_ForgetTextures();
    if (there && target->depthRenderbuffer) glDeleteRenderbuffers(1, &target->depthRenderbuffer);
    if (there && target->framebuffer) glDeleteFramebuffers(1, &target->framebuffer);
    target->colorTexture.glName = target->depthRenderbuffer = target->framebuffer = 0;
}

}  // extern "C"
