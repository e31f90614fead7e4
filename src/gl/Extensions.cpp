// Which functions beyond OpenGL ES 2.0 there are, and where.
#include "gl/Extensions.h"

#include <cstring>

#if defined(__EMSCRIPTEN__)
#define GL_GLEXT_PROTOTYPES
#include <GLES2/gl2ext.h>
#else
#include <dlfcn.h>
#endif

#include "Qex/renderer.h"

namespace {

QexExtensions s_Extensions;
bool s_Known;
QexGetProcAddress s_GetProcAddress;

#if defined(__EMSCRIPTEN__)

void FindVertexArrays() {
    s_Extensions.genVertexArrays = glGenVertexArraysOES;
    s_Extensions.deleteVertexArrays = glDeleteVertexArraysOES;
    s_Extensions.bindVertexArray = glBindVertexArrayOES;
}

#else

// Where the application says, in the libraries that it is linked with, or where its EGL says.
void* Find(const char* name) {
    void* found = s_GetProcAddress ? s_GetProcAddress(name) : dlsym(RTLD_DEFAULT, name);
    if (found || s_GetProcAddress) return found;
    void* egl = dlsym(RTLD_DEFAULT, "eglGetProcAddress");
    return egl ? reinterpret_cast<void* (*)(const char*)>(egl)(name) : nullptr;
}

template <class Function>
void Find(const char* name, Function* function) {
    *function = reinterpret_cast<Function>(Find(name));
}

void FindVertexArrays() {
    Find("glGenVertexArraysOES", &s_Extensions.genVertexArrays);
    Find("glDeleteVertexArraysOES", &s_Extensions.deleteVertexArrays);
    Find("glBindVertexArrayOES", &s_Extensions.bindVertexArray);
    if (!s_Extensions.genVertexArrays || !s_Extensions.deleteVertexArrays)
        s_Extensions.bindVertexArray = nullptr;
}

#endif

}  // namespace

bool QexExtensions_Has(const char* name) {
    const char* at = reinterpret_cast<const char*>(glGetString(GL_EXTENSIONS));
    const size_t length = strlen(name);
    for (; at && (at = strstr(at, name)); at += length)
        if (at[length] == ' ' || !at[length]) return true;
    return false;
}

const QexExtensions* QexExtensions_Get() {
    if (s_Known) return &s_Extensions;
    s_Known = true;
    s_Extensions = {};
    if (QexExtensions_Has("GL_OES_vertex_array_object")) FindVertexArrays();
    return &s_Extensions;
}

void QexExtensions_Forget() {
    s_Known = false;
}

extern "C" {

void QexRenderer_SetGetProcAddress(QexGetProcAddress function) {
    QexRenderState_Restore();
    s_GetProcAddress = function;
    QexExtensions_Forget();
}

}  // extern "C"
