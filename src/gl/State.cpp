// The state cache, and the renderer's settings.
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexRuntimeContext"

namespace {

constexpr uint32_t kUnknown = 0xFFFFFFFFu;

// Blend factors by mode, from QEX_BLEND_ALPHA on.
const struct {
    GLenum source;
    GLenum destination;
} kBlendFactors[] = {{GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA}, {GL_SRC_ALPHA, GL_ONE}, {GL_ONE, GL_ONE}};

void SetBlending(int32_t mode, GLenum alphaSource, GLenum alphaDestination) {
    if (mode == QEX_BLEND_NONE) {
        QEX_GL(glDisable(GL_BLEND));
        return;
    }
    if (mode < 1 || mode > 3) return;
    QEX_GL(glEnable(GL_BLEND));
    QEX_GL(glBlendFuncSeparate(kBlendFactors[mode - 1].source, kBlendFactors[mode - 1].destination,
                               alphaSource, alphaDestination));
}

}  // namespace

extern "C" {

QexRenderState g_QexCachedRenderStates = {0, kUnknown, kUnknown};
float g_fQexGlobalAlpha = 1.0f;
float g_fAlphaTestCmpValue = 0.95f;
uint32_t g_bSpecularOn = 0;

void QexRenderState_Reset(QexRuntimeContext*) {
    g_QexCachedRenderStates = {0, kUnknown, kUnknown};
    QexLeanState_Forget();
}

void QexRenderState_UseProgram(uint32_t program) {
    if (program == g_QexCachedRenderStates.currentProgram) return;
    QEX_GL(glUseProgram(program));
    g_QexCachedRenderStates.currentProgram = program;
}

void QexRenderState_ActiveTexture(uint32_t unit) {
    if (unit == g_QexCachedRenderStates.activeTexture) return;
    QEX_GL(glActiveTexture(unit));
    g_QexCachedRenderStates.activeTexture = unit;
    g_QexCachedRenderStates.boundTexture = kUnknown;
}

void QexRenderState_Bind(uint32_t target, uint32_t name) {
    if (QexLeanState_IsLean() && QexLeanState_HasTexture(target, name)) return;
    QEX_GL(glBindTexture(target, name));
}

void QexRenderer_SetZTestFunc(uint32_t mode) {
    glEnable(GL_DEPTH_TEST);
    // GL_NEVER to GL_ALWAYS are consecutive, in the order of the modes.
    if (mode > QEX_DEPTH_ALWAYS) return;
    glDepthFunc(GL_NEVER + mode);
    QexLeanState_SetDepthFunction(mode);
}

void QexRenderer_SetZWrite(int32_t flag) {
    glDepthMask(flag ? GL_TRUE : GL_FALSE);
}

void QexRenderer_SetBackFaceCulling(int32_t mode) {
    static const GLenum faces[] = {GL_BACK, GL_FRONT, GL_FRONT_AND_BACK};
    if (mode == QEX_CULL_NONE) {
        QEX_GL(glDisable(GL_CULL_FACE));
    } else if (mode >= QEX_CULL_BACK && mode <= QEX_CULL_BOTH) {
        QEX_GL(glEnable(GL_CULL_FACE));
        QEX_GL(glCullFace(faces[mode - 1]));
    }
}

void QexRenderer_SetBlendFactor(uint32_t source, uint32_t destination) {
    glBlendFunc(source, destination);
}

void QexRenderer_SetAlphaBlendMode(int32_t mode) {
    const bool blends = mode >= 1 && mode <= 3;
    const auto& factors = kBlendFactors[blends ? mode - 1 : 0];
    SetBlending(mode, factors.source, factors.destination);
}

void QexRenderer_SetAlphaBlendModeSeparate(int32_t mode, uint32_t alphaMode) {
    const bool blends = alphaMode >= 1 && alphaMode <= 3;
    SetBlending(mode, blends ? kBlendFactors[alphaMode - 1].source : GL_ZERO,
                blends ? kBlendFactors[alphaMode - 1].destination : GL_ONE);
}

float QexRenderer_SetGlobalAlpha(float alpha) {
    const float previous = g_fQexGlobalAlpha;
    g_fQexGlobalAlpha = alpha;
    return previous;
}

void QexRenderer_SetAlphaTestCmpValue(float value) {
    g_fAlphaTestCmpValue = value;
}

void QexRenderer_EnableSpecular(uint32_t flag) {
    g_bSpecularOn = flag;
}

void QexRenderer_Draw(uint32_t, int32_t count) {
    QEX_GL(glDrawElements(GL_TRIANGLES, count, GL_UNSIGNED_SHORT, nullptr));
}

}  // extern "C"
