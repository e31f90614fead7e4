// The GL's state in lean drawing: textures by unit, vertices, buffers.
#include "gl/LeanState.h"

#include <cstring>

#include "gl/Context.h"
#include "gl/Extensions.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexRuntimeContext"

namespace {

constexpr uint32_t kUnits = 8;  // that every GL has; further ones are not followed
constexpr GLuint kUnknown = UINT32_MAX;

struct {
    GLuint texture2D[kUnits], textureCube[kUnits];
    GLuint arrayBuffer;
    GLuint vertexArray;   // 0: the vertices are those below
    GLuint vertexBuffer;  // of the attribute pointers
    GLuint indexBuffer;
    uint32_t pointed;    // attributes that point there
    uint32_t enabled;    // arrays
    uint32_t constants;  // attributes whose value, where there is no array, is (0, 0, 0, 1)
    const QexVertexAttribute* attributes;
} s_State;

constexpr int32_t kLocations = 16;  // of float attributes
QexVertexAttribute s_Floats[kLocations];
GLuint s_StreamBuffer, s_QuadIndices;

bool s_VertexArrays = true;  // allowed
uint32_t s_DepthFunction = QEX_DEPTH_LESS;

void BindArrayBuffer(GLuint buffer) {
    if (s_State.arrayBuffer != buffer) glBindBuffer(GL_ARRAY_BUFFER, buffer);
    s_State.arrayBuffer = buffer;
}

void BindVertexArray(GLuint name) {
    if (s_State.vertexArray != name) QexExtensions_Get()->bindVertexArray(name);
    s_State.vertexArray = name;
}

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

// Makes the mesh's vertex array object and leaves it bound.
void MakeVertexArray(const QexMeshBuffers& mesh, uint32_t elements) {
    const QexMaking making;
    QexExtensions_Get()->genVertexArrays(1, mesh.vertexArray);
    BindVertexArray(*mesh.vertexArray);
    BindArrayBuffer(mesh.vertexBuffer);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, mesh.indexBuffer);
    for (GLuint i = 0; elements >> i; ++i)
        if (elements >> i & 1) glEnableVertexAttribArray(i);
    SetPointers(mesh.attributes, elements);
    QEX_GL_CHECK();
}

void BindBuffers(const QexMeshBuffers& mesh, uint32_t elements) {
    Enable(elements);
    if (s_State.attributes != mesh.attributes || s_State.vertexBuffer != mesh.vertexBuffer)
        s_State.pointed = 0;
    if (elements & ~s_State.pointed) {
        BindArrayBuffer(mesh.vertexBuffer);
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

// Both buffers are made when they are needed next.
void LoseBuffers() {
    s_StreamBuffer = s_QuadIndices = 0;
}
QexContextPart s_Part = {kRankOthers, LoseBuffers, nullptr, nullptr, nullptr, false};

}  // namespace

uint32_t g_QexLean = 0;
uint32_t g_QexReadsErrors = 1;

uint32_t QexGL_TakeError() {
    const GLenum error = glGetError();
    if (error != GL_NO_ERROR && QexContext_IsLoss(error)) ++g_QexFaults;
    return error;
}

void QexGL_Check(const char* module, const char* file, int line) {
    const uint32_t error = QexGL_TakeError();
    if (error != GL_NO_ERROR && !g_QexContextLost) QexDiagnostics_GLError(error, module, file, line);
}

void QexLeanState_BindMesh(const QexMeshBuffers& mesh, uint32_t needed) {
    const uint32_t elements = ElementsOf(mesh);
    SetConstants(needed & ~elements);
    if (!s_VertexArrays || !QexExtensions_Get()->bindVertexArray)
        BindBuffers(mesh, needed & elements);
    else if (*mesh.vertexArray)
        BindVertexArray(*mesh.vertexArray);
    else
        MakeVertexArray(mesh, elements);
}

void QexLeanState_BindFloats(const QexFloatVertices& vertices) {
    QexVertexAttribute layout[kLocations] = {};
    uint32_t elements = 0;
    for (int32_t i = 0; i < vertices.count; ++i) {
        const QexFloatAttribute& a = vertices.attributes[i];
        if (a.location < 0 || a.location >= kLocations) continue;
        layout[a.location] = {a.components, GL_FLOAT, 0, vertices.stride, a.offset};
        elements |= 1u << a.location;
    }
    if (memcmp(layout, s_Floats, sizeof layout) != 0) {
        memcpy(s_Floats, layout, sizeof layout);
        if (s_State.attributes == s_Floats) s_State.attributes = nullptr;
    }
    BindVertexArray(0);
    BindBuffers({vertices.buffer, vertices.indexBuffer, s_Floats, kLocations, nullptr}, elements);
}

GLuint QexLeanState_StreamBuffer() {
    QexContext_Register(&s_Part);
    if (!s_StreamBuffer) glGenBuffers(1, &s_StreamBuffer);
    return s_StreamBuffer;
}

GLuint QexLeanState_QuadIndices() {
    QexContext_Register(&s_Part);
    if (s_QuadIndices) return s_QuadIndices;
    uint16_t indices[kQuadsOfADraw][6];
    for (uint32_t i = 0; i < kQuadsOfADraw; ++i) {
        static const uint16_t corners[] = {0, 1, 2, 2, 1, 3};
        for (int c = 0; c < 6; ++c) indices[i][c] = static_cast<uint16_t>(4 * i + corners[c]);
    }
    const QexMaking making;
    glGenBuffers(1, &s_QuadIndices);
    BindVertexArray(0);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, s_QuadIndices);
    QEX_GL(glBufferData(GL_ELEMENT_ARRAY_BUFFER, sizeof indices, indices, GL_STATIC_DRAW));
    if (making.Failed()) {
        if (!g_QexContextLost) glDeleteBuffers(1, &s_QuadIndices);
        s_QuadIndices = 0;
    }
    return s_State.indexBuffer = s_QuadIndices;
}

void QexLeanState_Fill(GLuint buffer, const void* data, size_t bytes, GLenum usage) {
    BindArrayBuffer(buffer);
    glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(bytes), data, usage);
}

void QexLeanState_FillPart(GLuint buffer, size_t offset, const void* data, size_t bytes) {
    BindArrayBuffer(buffer);
    glBufferSubData(GL_ARRAY_BUFFER, static_cast<GLintptr>(offset), static_cast<GLsizeiptr>(bytes), data);
}

void QexLeanState_Leave() {
    BindVertexArray(0);
    Enable(0);
    BindArrayBuffer(0);
    if (s_State.indexBuffer) glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    s_State.vertexBuffer = s_State.indexBuffer = 0;
    s_State.attributes = nullptr;
}

void QexLeanState_Forget() {
    s_State.arrayBuffer = s_State.vertexArray = s_State.vertexBuffer = s_State.indexBuffer = 0;
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

void QexLeanState_Release() {
    QexLeanState_Leave();
    if (s_StreamBuffer) glDeleteBuffers(1, &s_StreamBuffer);
    if (s_QuadIndices) glDeleteBuffers(1, &s_QuadIndices);
    s_StreamBuffer = s_QuadIndices = 0;
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
    QexLeanState_Release();
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
    QexGL_Check(QEX_MODULE, __FILE__, __LINE__);
}

}  // extern "C"
