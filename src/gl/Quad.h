// Quads: four vertices each, upper left, upper right, lower left, lower right, drawn as strips.
#pragma once

#include <cstdint>

// What feeds an attribute: `components` floats a vertex, one vertex behind the other.
struct QexQuadArray {
    int32_t location;
    int32_t components;
    const float* data;
};

// Draws one with the current program and textures. GL errors are reported under `module`; null looks for
// none, for what is drawn by the hundred. `count` is at most kQuadArrays.
constexpr int32_t kQuadArrays = 3;
void QexQuad_Draw(const char* module, const QexQuadArray* arrays, int32_t count);
template <int32_t count>
void QexQuad_Draw(const char* module, const QexQuadArray (&arrays)[count]) {
    static_assert(count <= kQuadArrays, "what lean drawing packs");
    QexQuad_Draw(module, arrays, count);
}

// ---- Lean drawing ----
// Of each quad two triangles, the first three vertices of the strip and the last three.

constexpr uint32_t kStreamedQuads = 64;
struct QexQuads {
    QexQuadArray arrays[kQuadArrays];
    uint32_t count;
    const uint8_t* strip;  // the four vertices of a quad in the order of a strip
};

// Draws quads from number `first`, at most kStreamedQuads, sent for this draw alone.
void QexQuads_Stream(const QexQuads& quads, uint32_t first, uint32_t count);

// Sends all quads to a buffer of their own, and draws from there, at most kQuadsOfADraw.
void QexQuads_Send(const QexQuads& quads, uint32_t buffer);
void QexQuads_DrawSent(const QexQuads& quads, uint32_t buffer, uint32_t first, uint32_t count);
