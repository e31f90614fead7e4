// What lean drawing knows of the GL's state, so that a call which would change nothing is not made.
//
// Described drawing makes every call and unbinds what it has bound. Lean drawing leaves programs, textures,
// vertices and buffers as they are after a draw. What is drawn in the described way while lean drawing is on
// begins with QexLeanState_Leave, which puts vertex arrays and buffers where described drawing expects them.
#pragma once

#include "gl/GL.h"
#include "Qex/pod.h"

extern uint32_t g_QexLean;  // whether lean drawing is on

inline bool QexLeanState_IsLean() {
    return g_QexLean;
}

// A mesh's vertices in GL buffers. The elements of a mesh are the attributes of their own numbers.
struct QexMeshBuffers {
    GLuint vertexBuffer;
    GLuint indexBuffer;                    // 0: none
    const QexVertexAttribute* attributes;  // by number
    uint32_t attributeCount;
    GLuint* vertexArray;  // the object that holds all of it; made when first needed, 0 before
};

// Feeds the elements in `needed`, bits by number, from a mesh; those that it lacks are (0, 0, 0, 1).
void QexLeanState_BindMesh(const QexMeshBuffers& mesh, uint32_t needed);

// Vertices of floats in a buffer, without a vertex array object.
struct QexFloatAttribute {
    int32_t location;
    int32_t components;
    uint32_t offset;  // bytes
};
struct QexFloatVertices {
    GLuint buffer;
    GLuint indexBuffer;  // 0: none
    uint32_t stride;     // bytes
    const QexFloatAttribute* attributes;
    int32_t count;
};
void QexLeanState_BindFloats(const QexFloatVertices& vertices);

// The buffer for vertices that are good for one draw.
GLuint QexLeanState_StreamBuffer();

// Indices of as many quads as one draw shows, two triangles each: 0 1 2, 2 1 3.
constexpr uint32_t kQuadsOfADraw = 300;
GLuint QexLeanState_QuadIndices();  // 0 where they cannot be made

// Puts vertex array object, attribute arrays and buffers where described drawing has them.
void QexLeanState_Leave();

// Leaves and deletes what lean drawing shares, the buffers above.
void QexLeanState_Release();

// Nothing is known any more; the GL's vertex arrays are as QexLeanState_Leave leaves them.
void QexLeanState_Forget();

// Gives a buffer new contents; GL_STREAM_DRAW: for one draw.
void QexLeanState_Fill(GLuint buffer, const void* data, size_t bytes, GLenum usage);
void QexLeanState_FillPart(GLuint buffer, size_t offset, const void* data, size_t bytes);

// Whether a texture is bound on the active unit; if not, it is taken to be from now on.
bool QexLeanState_HasTexture(GLenum target, GLuint name);

// Binds a texture to a unit, unless it is bound there.
void QexLeanState_BindTexture(uint32_t unit, GLenum target, GLuint name);

// The same name may soon be another texture's.
void QexLeanState_ForgetTextures();

// Whether the depth function chosen last lets the nearer of two be seen.
bool QexLeanState_NearerIsSeen();
void QexLeanState_SetDepthFunction(uint32_t mode);

// Deletes the objects of a model that goes. Names are 0 where there is none.
void QexLeanState_DeleteVertexArrays(uint32_t count, GLuint* names);
