// Functions beyond OpenGL ES 2.0 that the current GL may have.
#pragma once

#include "gl/GL.h"

struct QexExtensions {
    // GL_OES_vertex_array_object; null where the GL lacks it.
    void (*genVertexArrays)(GLsizei count, GLuint* names);
    void (*deleteVertexArrays)(GLsizei count, const GLuint* names);
    void (*bindVertexArray)(GLuint name);
};

// Looked up at the first call after QexExtensions_Forget. A GL context is current.
const QexExtensions* QexExtensions_Get();
void QexExtensions_Forget();

// Whether the GL names an extension.
bool QexExtensions_Has(const char* name);
