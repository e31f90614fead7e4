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

// Puts vertex array object, attribute arrays and buffers where described drawing has them.
void QexLeanState_Leave();

// Nothing is known any more; the GL's vertex arrays are as QexLeanState_Leave leaves them.
void QexLeanState_Forget();

// Gives a buffer new contents, for one draw.
void QexLeanState_Stream(GLuint buffer, const void* data, size_t bytes);

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
