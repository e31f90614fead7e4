// The GL's state in lean drawing: textures by unit, vertices, buffers.
#include "gl/LeanState.h"

#include "gl/Extensions.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexRuntimeContext"

namespace {

constexpr uint32_t kUnits = 8;  // that every GL has; further ones are not followed
constexpr GLuint kUnknown = UINT32_MAX;

struct {
    GLuint texture2D[kUnits], textureCube[kUnits];
    GLuint vertexArray;   // 0: the vertices are those below
    GLuint vertexBuffer;  // of the attribute pointers
    GLuint indexBuffer;
    GLuint streamed;     // the buffer that QexLeanState_Stream has left bound, 0: none
    uint32_t pointed;    // attributes that point there
    uint32_t enabled;    // arrays
    uint32_t constants;  // attributes whose value, where there is no array, is (0, 0, 0, 1)
    const QexVertexAttribute* attributes;
} s_State;

bool s_VertexArrays = true;  // allowed
uint32_t s_DepthFunction = QEX_DEPTH_LESS;

void Enable(uint32_t wanted) {
    const uint32_t changed = s_State.enabled ^ wanted;
    for (GLuint i = 0; changed >> i; ++i) {
        if (!(changed >> i & 1)) continue;
        if (wanted >> i & 1)
            glEnableVertexAttribArray(i);
        else
            glDisableVertexAttribArray(i);
    }
    s_State.enabled = wanted;
}

void SetPointers(const QexVertexAttribute* attributes, uint32_t elements) {
    for (GLuint i = 0; elements >> i; ++i) {
        if (!(elements >> i & 1)) continue;
        const QexVertexAttribute& a = attributes[i];
        glVertexAttribPointer(i, a.componentCount, a.glType, a.normalised ? GL_TRUE : GL_FALSE,
                              static_cast<GLsizei>(a.stride),
                              reinterpret_cast<const void*>(static_cast<uintptr_t>(a.offset)));
    }
}

void SetConstants(uint32_t elements) {
    const uint32_t missing = elements & ~s_State.constants;
    for (GLuint i = 0; missing >> i; ++i)
        if (missing >> i & 1) glVertexAttrib4f(i, 0, 0, 0, 1);
    s_State.constants |= missing;
}

uint32_t ElementsOf(const QexMeshBuffers& mesh) {
    uint32_t elements = 0;
    for (uint32_t i = 0; i < mesh.attributeCount; ++i)
        if (mesh.attributes[i].componentCount) elements |= 1u << i;
    return elements;
}

void BindVertexArray(const QexMeshBuffers& mesh, uint32_t elements) {
    if (*mesh.vertexArray) {
        if (s_State.vertexArray != *mesh.vertexArray) QexExtensions_Get()->bindVertexArray(*mesh.vertexArray);
    } else {
        QexExtensions_Get()->genVertexArrays(1, mesh.vertexArray);
        QexExtensions_Get()->bindVertexArray(*mesh.vertexArray);
        glBindBuffer(GL_ARRAY_BUFFER, mesh.vertexBuffer);
        glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, mesh.indexBuffer);
        for (GLuint i = 0; elements >> i; ++i)
            if (elements >> i & 1) glEnableVertexAttribArray(i);
        SetPointers(mesh.attributes, elements);
        // The array buffer is no part of the object.
        glBindBuffer(GL_ARRAY_BUFFER, 0);
        s_State.streamed = 0;
    }
    s_State.vertexArray = *mesh.vertexArray;
}

void BindBuffers(const QexMeshBuffers& mesh, uint32_t elements) {
    Enable(elements);
    if (s_State.attributes != mesh.attributes || s_State.vertexBuffer != mesh.vertexBuffer)
        s_State.pointed = 0;
    if (elements & ~s_State.pointed) {
        glBindBuffer(GL_ARRAY_BUFFER, mesh.vertexBuffer);
        s_State.streamed = 0;
        SetPointers(mesh.attributes, elements & ~s_State.pointed);
        s_State.attributes = mesh.attributes;
        s_State.vertexBuffer = mesh.vertexBuffer;
        s_State.pointed |= elements;
    }
    if (s_State.indexBuffer != mesh.indexBuffer) {
        glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, mesh.indexBuffer);
        s_State.indexBuffer = mesh.indexBuffer;
    }
}

}  // namespace

uint32_t g_QexLean = 0;
uint32_t g_QexReadsErrors = 1;

void QexLeanState_BindMesh(const QexMeshBuffers& mesh, uint32_t needed) {
    const uint32_t elements = ElementsOf(mesh);
    SetConstants(needed & ~elements);
    if (s_VertexArrays && QexExtensions_Get()->bindVertexArray)
        BindVertexArray(mesh, elements);
    else
        BindBuffers(mesh, needed & elements);
}

void QexLeanState_Stream(GLuint buffer, const void* data, size_t bytes) {
    if (s_State.streamed != buffer) glBindBuffer(GL_ARRAY_BUFFER, buffer);
    glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(bytes), data, GL_STREAM_DRAW);
    s_State.streamed = buffer;
}

void QexLeanState_Leave() {
    if (s_State.vertexArray) QexExtensions_Get()->bindVertexArray(0);
    Enable(0);
    if (s_State.vertexBuffer || s_State.streamed) glBindBuffer(GL_ARRAY_BUFFER, 0);
    if (s_State.indexBuffer) glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    s_State.vertexArray = s_State.vertexBuffer = s_State.indexBuffer = s_State.streamed = 0;
    s_State.attributes = nullptr;
}

void QexLeanState_Forget() {
    s_State.vertexArray = s_State.vertexBuffer = s_State.indexBuffer = s_State.streamed = 0;
    s_State.attributes = nullptr;
    s_State.enabled = s_State.constants = 0;
    QexLeanState_ForgetTextures();
}

void QexLeanState_ForgetTextures() {
    for (uint32_t i = 0; i < kUnits; ++i) s_State.texture2D[i] = s_State.textureCube[i] = kUnknown;
}

bool QexLeanState_HasTexture(GLenum target, GLuint name) {
    const uint32_t unit = g_QexCachedRenderStates.activeTexture - GL_TEXTURE0;
    if (unit >= kUnits || (target != GL_TEXTURE_2D && target != GL_TEXTURE_CUBE_MAP)) return false;
    GLuint* bound = target == GL_TEXTURE_2D ? &s_State.texture2D[unit] : &s_State.textureCube[unit];
    const bool has = *bound == name;
    *bound = name;
    return has;
}

void QexLeanState_BindTexture(uint32_t unit, GLenum target, GLuint name) {
    if ((target == GL_TEXTURE_2D ? s_State.texture2D : s_State.textureCube)[unit] == name) return;
    QexRenderState_ActiveTexture(GL_TEXTURE0 + unit);
    QexRenderState_Bind(target, name);
}

bool QexLeanState_NearerIsSeen() {
    return s_DepthFunction == QEX_DEPTH_LESS || s_DepthFunction == QEX_DEPTH_LESS_EQUAL;
}

void QexLeanState_SetDepthFunction(uint32_t mode) {
    s_DepthFunction = mode;
}

void QexLeanState_DeleteVertexArrays(uint32_t count, GLuint* names) {
    for (uint32_t i = 0; i < count; ++i)
        if (names[i] && QexExtensions_Get()->deleteVertexArrays)
            QexExtensions_Get()->deleteVertexArrays(1, &names[i]);
}

extern "C" {

int32_t QexRenderer_SetDrawing(int32_t drawing) {
    const int32_t previous = g_QexLean ? QEX_DRAWING_LEAN : QEX_DRAWING_DESCRIBED;
    if (drawing == previous || (drawing != QEX_DRAWING_LEAN && drawing != QEX_DRAWING_DESCRIBED))
        return previous;
    QexRenderState_Restore();
    QexRenderState_Reset(nullptr);
    g_QexLean = drawing == QEX_DRAWING_LEAN;
    g_QexReadsErrors = !g_QexLean;
    return previous;
}

int32_t QexRenderer_GetDrawing(void) {
    return g_QexLean ? QEX_DRAWING_LEAN : QEX_DRAWING_DESCRIBED;
}

void QexRenderer_AllowVertexArrays(int32_t allowed) {
    QexRenderState_Restore();
    s_VertexArrays = allowed != 0;
}

void QexRenderState_Restore(void) {
    if (g_QexLean) QexLeanState_Leave();
}

void QexRenderer_CheckErrors(void) {
    const GLenum error = glGetError();
    if (error != GL_NO_ERROR) QexDiagnostics_FatalGLError(error, QEX_MODULE, __FILE__, __LINE__);
}

}  // extern "C"
