// The one quad drawer.
#include "gl/Quad.h"

#include <cstring>

#include "gl/GL.h"
#include "gl/LeanState.h"
#include "Qex/renderer.h"

#define QEX_MODULE module

namespace {

constexpr int32_t kMostFloats = 9;  // of a vertex
constexpr uint8_t kStrip[4] = {0, 2, 1, 3};

uint32_t BytesOfAVertex(const QexQuads& quads) {
    int32_t floats = 0;
    for (const QexQuadArray& array : quads.arrays) floats += array.components;
    return static_cast<uint32_t>(floats) * sizeof(float);
}

// Copies vertices, one array's part of each behind the other's. Returns the end.
uint8_t* Pack(uint8_t* out, const QexQuads& quads, uint32_t first, uint32_t count) {
    for (uint32_t i = 4 * first; i < 4 * (first + count); ++i)
        for (const QexQuadArray& array : quads.arrays) {
            const uint32_t vertex = (i & ~3u) + quads.strip[i & 3];
            const uint32_t components = static_cast<uint32_t>(array.components);
            if (components) memcpy(out, array.data + components * vertex, components * sizeof(float));
            out += components * sizeof(float);
        }
    return out;
}

}  // namespace

void QexQuad_Draw(const char* module, const QexQuadArray* arrays, int32_t count) {
    if (QexLeanState_IsLean()) {
        QexQuads quads = {{}, 1, kStrip};
        for (int32_t i = 0; i < count; ++i) quads.arrays[i] = arrays[i];
        QexQuads_Stream(quads, 0, 1);
        return;
    }
    for (int32_t i = 0; i < count; ++i)
        QEX_GL_IF(module, glEnableVertexAttribArray(static_cast<GLuint>(arrays[i].location)));
    for (int32_t i = 0; i < count; ++i)
        QEX_GL_IF(module, glVertexAttribPointer(static_cast<GLuint>(arrays[i].location), arrays[i].components,
                                                GL_FLOAT, GL_FALSE, 0, arrays[i].data));
    QEX_GL_IF(module, glDrawElements(GL_TRIANGLE_STRIP, 4, GL_UNSIGNED_BYTE, kStrip));
    for (int32_t i = 0; i < count; ++i)
        QEX_GL_IF(module, glDisableVertexAttribArray(static_cast<GLuint>(arrays[i].location)));
}

void QexQuads_Stream(const QexQuads& quads, uint32_t first, uint32_t count) {
    uint8_t packed[kStreamedQuads * 4 * kMostFloats * sizeof(float)];
    const uint8_t* end = Pack(packed, quads, first, count);
    const GLuint buffer = QexLeanState_StreamBuffer();
    QexLeanState_Fill(buffer, packed, static_cast<size_t>(end - packed), GL_STREAM_DRAW);
    QexQuads_DrawSent(quads, buffer, 0, count);
}

void QexQuads_Send(const QexQuads& quads, uint32_t buffer) {
    uint8_t packed[kStreamedQuads * 4 * kMostFloats * sizeof(float)];
    size_t at = 0;
    QexLeanState_Fill(buffer, nullptr, size_t{4} * quads.count * BytesOfAVertex(quads), GL_DYNAMIC_DRAW);
    for (uint32_t first = 0; first < quads.count; first += kStreamedQuads) {
        const uint32_t rest = quads.count - first;
        const uint8_t* end = Pack(packed, quads, first, rest < kStreamedQuads ? rest : kStreamedQuads);
        QexLeanState_FillPart(buffer, at, packed, static_cast<size_t>(end - packed));
        at += static_cast<size_t>(end - packed);
    }
}

void QexQuads_DrawSent(const QexQuads& quads, uint32_t buffer, uint32_t first, uint32_t count) {
    const uint32_t stride = BytesOfAVertex(quads), indices = QexLeanState_QuadIndices();
    if (!indices) return;
    QexFloatAttribute attributes[kQuadArrays];
    uint32_t offset = 4 * first * stride;
    for (int32_t i = 0; i < kQuadArrays; ++i) {
        const QexQuadArray& array = quads.arrays[i];
        attributes[i] = {array.components ? array.location : -1, array.components, offset};
        offset += static_cast<uint32_t>(array.components) * sizeof(float);
    }
    QexLeanState_BindFloats({buffer, indices, stride, attributes, kQuadArrays});
    glDrawElements(GL_TRIANGLES, static_cast<GLsizei>(6 * count), GL_UNSIGNED_SHORT, nullptr);
}
