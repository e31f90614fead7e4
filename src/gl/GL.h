// The GL interface as the engine's GL modules see it, and the check that follows nearly every call.
//
// QEX_GL(call) issues the call and reads glGetError once; an error ends the process, or is the application's
// handler's. The file that uses it defines QEX_MODULE first. Lean drawing reads errors where objects are made
// and nowhere else; a build with QEX_GL_CHECKS=0 never does.
#pragma once

#include <GLES2/gl2.h>

#include "base/Diagnostics.h"

extern uint32_t g_QexReadsErrors;

// Reads the GL's error, and reports one with its place.
void QexGL_Check(const char* module, const char* file, int line);

// Reads the GL's error where one is no fault; a lost context is found there, too.
uint32_t QexGL_TakeError();

#if QEX_GL_CHECKS
#define QEX_GL_CHECK()                                                     \
    do {                                                                   \
        if (g_QexReadsErrors) QexGL_Check(QEX_MODULE, __FILE__, __LINE__); \
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

// Between the loss of the context and its restoring: there is nothing to delete, and nothing can be made.
extern bool g_QexContextLost;
extern uint32_t g_QexContexts;  // that were restored

// A span in which GL objects are made: errors are read in either way of drawing. When one was found, and the
// application's handler came back, nothing half-made is to be kept.
class QexMaking {
  public:
    QexMaking() : faults_(g_QexFaults), read_(g_QexReadsErrors) { g_QexReadsErrors = 1; }
    ~QexMaking() { g_QexReadsErrors = read_; }
    QexMaking(const QexMaking&) = delete;
    QexMaking& operator=(const QexMaking&) = delete;
    bool Failed() const { return g_QexFaults != faults_ || g_QexContextLost; }

  private:
    uint32_t faults_, read_;
};
