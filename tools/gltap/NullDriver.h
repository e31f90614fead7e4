// The null driver: Null(Tag<function>, arguments...) answers a call without GL.
//
// A call that returns nothing does nothing, which is the template below. The overloads are the functions
// that hand something back; as in StateTracker.h they match the parameter types exactly.
#pragma once

#include "Tap.h"

namespace gltap {

template <Fn function, typename... Any>
inline typename Function<function>::Result Null(Tag<function>, Any...) {
    return typename Function<function>::Result();
}

// NullDriver.cpp
void NullNames(gltapObject kind, GLsizei count, GLuint* names);
void NullForgetPrograms();
void NullDeleteProgram(GLuint program);
void NullBindAttribute(GLuint program, GLuint index, const GLchar* name);
GLint NullAttributeLocation(GLuint program, const GLchar* name);
GLint NullUniformLocation(GLuint program, const GLchar* name);
const GLubyte* NullString(GLenum name);
size_t NullQuery(GLenum name, double values[4]);
void NullPrecision(GLenum precision, GLint* range, GLint* bits);
void NullReadPixels(GLsizei width, GLsizei height, GLenum format, GLenum type, void* pixels);

#define NULL_CALL(result, name, ...) inline result Null(Tag<Fn::name>, __VA_ARGS__)

inline GLuint NullName(gltapObject kind) {
    GLuint name = 0;
    NullNames(kind, 1, &name);
    return name;
}

NULL_CALL(void, glGenTextures, GLsizei n, GLuint* names) {
    NullNames(GLTAP_TEXTURE, n, names);
}
NULL_CALL(void, glGenBuffers, GLsizei n, GLuint* names) {
    NullNames(GLTAP_BUFFER, n, names);
}
NULL_CALL(void, glGenFramebuffers, GLsizei n, GLuint* names) {
    NullNames(GLTAP_FRAMEBUFFER, n, names);
}
NULL_CALL(void, glGenRenderbuffers, GLsizei n, GLuint* names) {
    NullNames(GLTAP_RENDERBUFFER, n, names);
}
NULL_CALL(GLuint, glCreateShader, GLenum) {
    return NullName(GLTAP_SHADER);
}
inline GLuint Null(Tag<Fn::glCreateProgram>) {
    return NullName(GLTAP_PROGRAM);
}
NULL_CALL(void, glDeleteProgram, GLuint program) {
    NullDeleteProgram(program);
}

NULL_CALL(void, glGenVertexArraysOES, GLsizei n, GLuint* names) {
    NullNames(GLTAP_VERTEX_ARRAY, n, names);
}
NULL_CALL(GLboolean, glIsVertexArrayOES, GLuint name) {
    return IsLive(GLTAP_VERTEX_ARRAY, name);
}
NULL_CALL(GLboolean, glIsTexture, GLuint name) {
    return IsLive(GLTAP_TEXTURE, name);
}
NULL_CALL(GLboolean, glIsBuffer, GLuint name) {
    return IsLive(GLTAP_BUFFER, name);
}
NULL_CALL(GLboolean, glIsFramebuffer, GLuint name) {
    return IsLive(GLTAP_FRAMEBUFFER, name);
}
NULL_CALL(GLboolean, glIsRenderbuffer, GLuint name) {
    return IsLive(GLTAP_RENDERBUFFER, name);
}
NULL_CALL(GLboolean, glIsShader, GLuint name) {
    return IsLive(GLTAP_SHADER, name);
}
NULL_CALL(GLboolean, glIsProgram, GLuint name) {
    return IsLive(GLTAP_PROGRAM, name);
}
NULL_CALL(GLboolean, glIsEnabled, GLenum capability) {
    double values[4] = {};
    QueryState(capability, values);
    return values[0] != 0;
}

NULL_CALL(void, glBindAttribLocation, GLuint program, GLuint index, const GLchar* name) {
    NullBindAttribute(program, index, name);
}
NULL_CALL(GLint, glGetAttribLocation, GLuint program, const GLchar* name) {
    return NullAttributeLocation(program, name);
}
NULL_CALL(GLint, glGetUniformLocation, GLuint program, const GLchar* name) {
    return NullUniformLocation(program, name);
}

NULL_CALL(GLenum, glCheckFramebufferStatus, GLenum) {
    return GL_FRAMEBUFFER_COMPLETE;
}
NULL_CALL(const GLubyte*, glGetString, GLenum name) {
    return NullString(name);
}

template <typename T>
inline void NullGet(GLenum name, T* out) {
    double values[4];
    const size_t count = NullQuery(name, values);
    for (size_t i = 0; i < count; ++i) out[i] = static_cast<T>(values[i]);
}
NULL_CALL(void, glGetIntegerv, GLenum name, GLint* out) {
    NullGet(name, out);
}
NULL_CALL(void, glGetFloatv, GLenum name, GLfloat* out) {
    NullGet(name, out);
}
NULL_CALL(void, glGetBooleanv, GLenum name, GLboolean* out) {
    double values[4];
    const size_t count = NullQuery(name, values);
    for (size_t i = 0; i < count; ++i) out[i] = values[i] != 0;
}

NULL_CALL(void, glGetShaderiv, GLuint, GLenum name, GLint* out) {
    *out = name == GL_COMPILE_STATUS;
}
NULL_CALL(void, glGetProgramiv, GLuint, GLenum name, GLint* out) {
    *out = name == GL_LINK_STATUS || name == GL_VALIDATE_STATUS;
}
NULL_CALL(void, glGetShaderPrecisionFormat, GLenum, GLenum precision, GLint* range, GLint* bits) {
    NullPrecision(precision, range, bits);
}

inline void NullText(GLsizei size, GLsizei* length, GLchar* text) {
    if (length) *length = 0;
    if (size > 0 && text) *text = 0;
}
NULL_CALL(void, glGetShaderInfoLog, GLuint, GLsizei size, GLsizei* length, GLchar* text) {
    NullText(size, length, text);
}
NULL_CALL(void, glGetProgramInfoLog, GLuint, GLsizei size, GLsizei* length, GLchar* text) {
    NullText(size, length, text);
}
NULL_CALL(void, glGetShaderSource, GLuint, GLsizei size, GLsizei* length, GLchar* text) {
    NullText(size, length, text);
}
// GL_ACTIVE_UNIFORMS and GL_ACTIVE_ATTRIBUTES are answered with 0, so any index here is out of range; a
// caller that asks all the same finds defined values.
inline void NullActive(GLsizei size, GLsizei* length, GLint* count, GLenum* type, GLchar* name) {
    NullText(size, length, name);
    *count = 0;
    *type = GL_FLOAT;
}
NULL_CALL(void, glGetActiveAttrib, GLuint, GLuint, GLsizei size, GLsizei* length, GLint* count, GLenum* type,
          GLchar* name) {
    NullActive(size, length, count, type, name);
}
NULL_CALL(void, glGetActiveUniform, GLuint, GLuint, GLsizei size, GLsizei* length, GLint* count, GLenum* type,
          GLchar* name) {
    NullActive(size, length, count, type, name);
}
NULL_CALL(void, glGetAttachedShaders, GLuint, GLsizei, GLsizei* count, GLuint*) {
    if (count) *count = 0;
}

NULL_CALL(void, glGetBufferParameteriv, GLenum, GLenum, GLint* out) {
    *out = 0;
}
NULL_CALL(void, glGetFramebufferAttachmentParameteriv, GLenum, GLenum, GLenum, GLint* out) {
    *out = 0;
}
NULL_CALL(void, glGetRenderbufferParameteriv, GLenum, GLenum, GLint* out) {
    *out = 0;
}
NULL_CALL(void, glGetTexParameterfv, GLenum, GLenum, GLfloat* out) {
    *out = 0;
}
NULL_CALL(void, glGetTexParameteriv, GLenum, GLenum, GLint* out) {
    *out = 0;
}
NULL_CALL(void, glGetUniformfv, GLuint, GLint, GLfloat* out) {
    *out = 0;
}
NULL_CALL(void, glGetUniformiv, GLuint, GLint, GLint* out) {
    *out = 0;
}
NULL_CALL(void, glGetVertexAttribfv, GLuint, GLenum, GLfloat* out) {
    *out = 0;
}
NULL_CALL(void, glGetVertexAttribiv, GLuint, GLenum, GLint* out) {
    *out = 0;
}
NULL_CALL(void, glGetVertexAttribPointerv, GLuint, GLenum, void** out) {
    *out = nullptr;
}
NULL_CALL(void, glReadPixels, GLint, GLint, GLsizei width, GLsizei height, GLenum format, GLenum type,
          void* pixels) {
    NullReadPixels(width, height, format, type, pixels);
}

#undef NULL_CALL

}  // namespace gltap
