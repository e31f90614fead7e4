// The font's program, which the screen-space quads use as well.
//
// It lives from QexFont_Create to QexFont_Release; before and after, the names are 0.
#pragma once

#include <cstdint>

struct QexFontProgram {
    uint32_t program;  // GL names
    uint32_t vertexShader;
    uint32_t fragmentShader;
    int32_t position;  // attribute locations
    int32_t colour;
    int32_t texCoord;
    int32_t projectionLocation;  // of the uniform
};

const QexFontProgram* QexFont_GetProgram();

// Whether there is a font: between QexFont_Create and QexFont_Release.
bool QexFont_IsCreated();

// Whether the font's program is there, which an application may have released by itself. An error line in the
// function's name, once, when it is not.
bool QexFont_CanDraw(const char* function);

// Follows a screen of another size: the projection, and the standing text, which stays at its distance from
// the upper edge. Without a font nothing happens.
void QexFont_Resize(int32_t width, int32_t height, int32_t heightBefore);
