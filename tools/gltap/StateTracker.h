// Follows the GL state: Track(Tag<function>, arguments..., result) runs after each call.
//
// Functions that change nothing which is followed take the empty template. An overload has to match the
// function's parameter types exactly, or the template is the better match.
#pragma once

#include <algorithm>
#include <iterator>

#include "Tap.h"

namespace gltap {

template <typename... Any>
inline void Track(Any...) {}

#define TRACK(name, ...) inline void Track(Tag<Fn::name>, __VA_ARGS__)

template <size_t n>
inline void Forget(uint32_t (&bindings)[n], GLuint name) {
    std::replace(std::begin(bindings), std::end(bindings), name, 0u);
}

inline void Forget(uint32_t& binding, GLuint name) {
    if (binding == name) binding = 0;
}

// Deleting a bound object unbinds it; names[i] = 0 is harmless in all of these.
TRACK(glGenTextures, GLsizei n, GLuint* names) {
    AddObjects(GLTAP_TEXTURE, n, names);
}
TRACK(glGenBuffers, GLsizei n, GLuint* names) {
    AddObjects(GLTAP_BUFFER, n, names);
}
TRACK(glGenFramebuffers, GLsizei n, GLuint* names) {
    AddObjects(GLTAP_FRAMEBUFFER, n, names);
}
TRACK(glGenRenderbuffers, GLsizei n, GLuint* names) {
    AddObjects(GLTAP_RENDERBUFFER, n, names);
}
TRACK(glCreateShader, GLenum, GLuint name) {
    AddObjects(GLTAP_SHADER, 1, &name);
}
TRACK(glCreateProgram, GLuint name) {
    AddObjects(GLTAP_PROGRAM, 1, &name);
}
TRACK(glDeleteShader, GLuint name) {
    RemoveObjects(GLTAP_SHADER, 1, &name);
}
TRACK(glDeleteProgram, GLuint name) {
    RemoveObjects(GLTAP_PROGRAM, 1, &name);
}

TRACK(glDeleteTextures, GLsizei n, const GLuint* names) {
    RemoveObjects(GLTAP_TEXTURE, n, names);
    for (GLsizei i = 0; i < n; ++i) {
        Forget(tap.state.texture2D, names[i]);
        Forget(tap.state.textureCube, names[i]);
    }
}
TRACK(glDeleteBuffers, GLsizei n, const GLuint* names) {
    RemoveObjects(GLTAP_BUFFER, n, names);
    for (GLsizei i = 0; i < n; ++i) {
        Forget(tap.state.arrayBuffer, names[i]);
        Forget(tap.state.elementBuffer, names[i]);
    }
}
TRACK(glDeleteFramebuffers, GLsizei n, const GLuint* names) {
    RemoveObjects(GLTAP_FRAMEBUFFER, n, names);
    for (GLsizei i = 0; i < n; ++i) Forget(tap.state.framebuffer, names[i]);
}
TRACK(glDeleteRenderbuffers, GLsizei n, const GLuint* names) {
    RemoveObjects(GLTAP_RENDERBUFFER, n, names);
    for (GLsizei i = 0; i < n; ++i) Forget(tap.state.renderbuffer, names[i]);
}

TRACK(glGenVertexArraysOES, GLsizei n, GLuint* names) {
    AddObjects(GLTAP_VERTEX_ARRAY, n, names);
}
TRACK(glDeleteVertexArraysOES, GLsizei n, const GLuint* names) {
    RemoveObjects(GLTAP_VERTEX_ARRAY, n, names);
    DeleteVertexArrays(n, names);
}
TRACK(glBindVertexArrayOES, GLuint name) {
    BindVertexArray(name);
}

TRACK(glUseProgram, GLuint program) {
    tap.state.program = program;
}
TRACK(glActiveTexture, GLenum unit) {
    if (unit - GL_TEXTURE0 < GLTAP_UNITS) tap.state.activeUnit = unit - GL_TEXTURE0;
}
TRACK(glBindTexture, GLenum target, GLuint texture) {
    if (target == GL_TEXTURE_2D) tap.state.texture2D[tap.state.activeUnit] = texture;
    if (target == GL_TEXTURE_CUBE_MAP) tap.state.textureCube[tap.state.activeUnit] = texture;
}
TRACK(glBindBuffer, GLenum target, GLuint buffer) {
    if (target == GL_ARRAY_BUFFER) tap.state.arrayBuffer = buffer;
    if (target == GL_ELEMENT_ARRAY_BUFFER) tap.state.elementBuffer = buffer;
}
TRACK(glBindFramebuffer, GLenum, GLuint framebuffer) {
    tap.state.framebuffer = framebuffer;
}
TRACK(glBindRenderbuffer, GLenum, GLuint renderbuffer) {
    tap.state.renderbuffer = renderbuffer;
}
TRACK(glEnableVertexAttribArray, GLuint index) {
    if (index < 32) tap.state.attributeArrays |= 1u << index;
}
TRACK(glDisableVertexAttribArray, GLuint index) {
    if (index < 32) tap.state.attributeArrays &= ~(1u << index);
}

inline uint32_t* Capability(GLenum capability) {
    gltapState& s = tap.state;
    switch (capability) {
        case GL_BLEND: return &s.blend;
        case GL_CULL_FACE: return &s.cullFace;
        case GL_DEPTH_TEST: return &s.depthTest;
        case GL_DITHER: return &s.dither;
        case GL_POLYGON_OFFSET_FILL: return &s.polygonOffsetFill;
        case GL_SAMPLE_ALPHA_TO_COVERAGE: return &s.sampleAlphaToCoverage;
        case GL_SAMPLE_COVERAGE: return &s.sampleCoverage;
        case GL_SCISSOR_TEST: return &s.scissorTest;
        case GL_STENCIL_TEST: return &s.stencilTest;
        default: return nullptr;
    }
}
TRACK(glEnable, GLenum capability) {
    if (uint32_t* value = Capability(capability)) *value = 1;
}
TRACK(glDisable, GLenum capability) {
    if (uint32_t* value = Capability(capability)) *value = 0;
}

template <typename T>
inline void Set(T (&pair)[2], T first, T second) {
    pair[0] = first;
    pair[1] = second;
}
template <typename T, typename U>
inline void Set(T (&four)[4], U a, U b, U c, U d) {
    four[0] = a;
    four[1] = b;
    four[2] = c;
    four[3] = d;
}
template <typename T>
inline void SetFaces(T (&pair)[2], GLenum face, T value) {
    if (face != GL_BACK) pair[0] = value;
    if (face != GL_FRONT) pair[1] = value;
}

TRACK(glBlendFuncSeparate, GLenum sourceRGB, GLenum destRGB, GLenum sourceAlpha, GLenum destAlpha) {
    Set(tap.state.blendSource, sourceRGB, sourceAlpha);
    Set(tap.state.blendDestination, destRGB, destAlpha);
}
TRACK(glBlendFunc, GLenum source, GLenum destination) {
    Track(Tag<Fn::glBlendFuncSeparate>(), source, destination, source, destination);
}
TRACK(glBlendEquationSeparate, GLenum rgb, GLenum alpha) {
    Set(tap.state.blendEquation, rgb, alpha);
}
TRACK(glBlendEquation, GLenum mode) {
    Set(tap.state.blendEquation, mode, mode);
}
TRACK(glBlendColor, GLfloat r, GLfloat g, GLfloat b, GLfloat a) {
    Set(tap.state.blendColor, r, g, b, a);
}
TRACK(glColorMask, GLboolean r, GLboolean g, GLboolean b, GLboolean a) {
    Set(tap.state.colorMask, r != 0, g != 0, b != 0, a != 0);
}
TRACK(glCullFace, GLenum mode) {
    tap.state.cullFaceMode = mode;
}
TRACK(glFrontFace, GLenum mode) {
    tap.state.frontFace = mode;
}
TRACK(glDepthMask, GLboolean flag) {
    tap.state.depthMask = flag != 0;
}
TRACK(glDepthFunc, GLenum func) {
    tap.state.depthFunc = func;
}
TRACK(glDepthRangef, GLfloat n, GLfloat f) {
    Set(tap.state.depthRange, n, f);
}
TRACK(glPolygonOffset, GLfloat factor, GLfloat units) {
    Set(tap.state.polygonOffset, factor, units);
}
TRACK(glLineWidth, GLfloat width) {
    tap.state.lineWidth = width;
}
TRACK(glViewport, GLint x, GLint y, GLsizei w, GLsizei h) {
    Set(tap.state.viewport, x, y, w, h);
}
TRACK(glScissor, GLint x, GLint y, GLsizei w, GLsizei h) {
    Set(tap.state.scissor, x, y, w, h);
}
TRACK(glClearColor, GLfloat r, GLfloat g, GLfloat b, GLfloat a) {
    Set(tap.state.clearColor, r, g, b, a);
}
TRACK(glClearDepthf, GLfloat depth) {
    tap.state.clearDepth = depth;
}
TRACK(glClearStencil, GLint value) {
    tap.state.clearStencil = value;
}

TRACK(glStencilFuncSeparate, GLenum face, GLenum func, GLint reference, GLuint mask) {
    SetFaces(tap.state.stencilFunc, face, func);
    SetFaces(tap.state.stencilReference, face, reference);
    SetFaces(tap.state.stencilValueMask, face, mask);
}
TRACK(glStencilFunc, GLenum func, GLint reference, GLuint mask) {
    Track(Tag<Fn::glStencilFuncSeparate>(), GLenum(GL_FRONT_AND_BACK), func, reference, mask);
}
TRACK(glStencilOpSeparate, GLenum face, GLenum fail, GLenum depthFail, GLenum pass) {
    SetFaces(tap.state.stencilFail, face, fail);
    SetFaces(tap.state.stencilDepthFail, face, depthFail);
    SetFaces(tap.state.stencilPass, face, pass);
}
TRACK(glStencilOp, GLenum fail, GLenum depthFail, GLenum pass) {
    Track(Tag<Fn::glStencilOpSeparate>(), GLenum(GL_FRONT_AND_BACK), fail, depthFail, pass);
}
TRACK(glStencilMaskSeparate, GLenum face, GLuint mask) {
    SetFaces(tap.state.stencilWriteMask, face, mask);
}
TRACK(glStencilMask, GLuint mask) {
    Set(tap.state.stencilWriteMask, mask, mask);
}
TRACK(glPixelStorei, GLenum name, GLint value) {
    if (name == GL_PACK_ALIGNMENT) tap.state.packAlignment = static_cast<uint32_t>(value);
    if (name == GL_UNPACK_ALIGNMENT) tap.state.unpackAlignment = static_cast<uint32_t>(value);
}

#undef TRACK

}  // namespace gltap
