// Two pictures in one: colour masks or halves of the screen.
#include "gl/GL.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexRuntimeContext"

namespace {

// Whole pixels of the separation; what is no sensible shift counts as 0.
GLint Shift(const QexRuntimeContext* context) {
    const float shift = context->stereoSeparation;
    return shift > -65536 && shift < 65536 ? static_cast<GLint>(shift) : 0;
}

GLsizei HalfWidth(const QexRuntimeContext* context) {
    return QexGL_Size(context->width) >> 1;
}

void BeginAnaglyphEye(const QexRuntimeContext* context, GLint x, GLboolean red, GLboolean green,
                      GLboolean blue) {
    QEX_GL(glColorMask(red, green, blue, GL_TRUE));
    QEX_GL(glViewport(x, 0, QexGL_Size(context->width), QexGL_Size(context->height)));
}

}  // namespace

extern "C" {

int32_t QexRenderer_EnableStereo3D(QexRuntimeContext* context, uint32_t mode, float separation) {
    context->stereoMode = mode;
    context->stereoSeparation = separation;
    return 0;
}

void QexRenderer_SetDepthSeperation(QexRuntimeContext* context, float separation) {
    context->stereoSeparation = separation;
}

void QexRenderer_DisableStereo3D(QexRuntimeContext* context) {
    context->stereoMode = QEX_STEREO_OFF;
}

void QexRenderer_PrepareLeft(const QexRuntimeContext* context) {
    QEX_GL(glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT));
    switch (context->stereoMode) {
        case QEX_STEREO_RED_BLUE:
        case QEX_STEREO_RED_CYAN:
            BeginAnaglyphEye(context, -Shift(context), GL_TRUE, GL_FALSE, GL_FALSE);
            break;
        case QEX_STEREO_SIDE_BY_SIDE:
            QEX_GL(glViewport(0, 0, HalfWidth(context), QexGL_Size(context->height)));
            break;
        default: break;
    }
}

void QexRenderer_PrepareRight(const QexRuntimeContext* context) {
    const uint32_t mode = context->stereoMode;
    if (mode < QEX_STEREO_RED_BLUE || mode > QEX_STEREO_SIDE_BY_SIDE) return;
    QEX_GL(glClear(GL_DEPTH_BUFFER_BIT));
    if (mode == QEX_STEREO_SIDE_BY_SIDE)
        QEX_GL(glViewport(HalfWidth(context), 0, HalfWidth(context), QexGL_Size(context->height)));
    else
        BeginAnaglyphEye(context, Shift(context), GL_FALSE, mode == QEX_STEREO_RED_CYAN, GL_TRUE);
}

void QexRenderer_FinishStereo3D(const QexRuntimeContext* context) {
    QEX_GL(glColorMask(GL_TRUE, GL_TRUE, GL_TRUE, GL_TRUE));
    QEX_GL(glViewport(0, 0, QexGL_Size(context->width), QexGL_Size(context->height)));
}

}  // extern "C"
