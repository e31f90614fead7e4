// Four vertices drawn as a strip: upper left, upper right, lower left, lower right.
#pragma once

#include <cstdint>

// What feeds an attribute: `components` floats a vertex, one vertex behind the other.
struct QexQuadArray {
    int32_t location;
    int32_t components;
    const float* data;
};

// Draws with the current program and textures. GL errors are reported under `module`; null looks for none,
// for what is drawn by the hundred.
void QexQuad_Draw(const char* module, const QexQuadArray* arrays, int32_t count);
template <int32_t count>
void QexQuad_Draw(const char* module, const QexQuadArray (&arrays)[count]) {
    QexQuad_Draw(module, arrays, count);
}
