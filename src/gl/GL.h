// The GL interface as the engine's GL modules see it, and the check that follows nearly every call.
//
// QEX_GL(call) issues the call and reads glGetError once; an error ends the process. The file that uses it
// defines QEX_MODULE first. Lean drawing reads no errors; a build with QEX_GL_CHECKS=0 never does.
#pragma once

#include <GLES2/gl2.h>

#include "base/Diagnostics.h"

extern uint32_t g_QexReadsErrors;

#if QEX_GL_CHECKS
#define QEX_GL_CHECK()                                                             \
    do {                                                                           \
        const GLenum qexError = g_QexReadsErrors ? glGetError() : GL_NO_ERROR;     \
        if (__builtin_expect(qexError != GL_NO_ERROR, 0))                          \
            QexDiagnostics_FatalGLError(qexError, QEX_MODULE, __FILE__, __LINE__); \
    } while (0)
#else
#define QEX_GL_CHECK() ((void)QEX_MODULE)
#endif

#define QEX_GL(call)    \
    do {                \
        call;           \
        QEX_GL_CHECK(); \
    } while (0)

// The same where errors are not always looked for.
#define QEX_GL_IF(checked, call)     \
    do {                             \
        call;                        \
        if (checked) QEX_GL_CHECK(); \
    } while (0)

// A surface size as the GL takes it: what an application gave below 0 counts as 0.
inline GLsizei QexGL_Size(int32_t pixels) {
    return pixels > 0 ? pixels : 0;
}

// Texture units, the same in every module.
enum { kDiffuseUnit = 0, kNormalMapUnit = 1, kShadowMapUnit = 2, kAlphaUnit = 3 };
