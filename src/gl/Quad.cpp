// The one quad drawer.
#include "gl/Quad.h"

#include "gl/GL.h"
#include "Qex/renderer.h"

#define QEX_MODULE module

void QexQuad_Draw(const char* module, const QexQuadArray* arrays, int32_t count) {
    QexRenderState_Restore();
    static const uint8_t indices[4] = {0, 2, 1, 3};
    for (int32_t i = 0; i < count; ++i)
        QEX_GL_IF(module, glEnableVertexAttribArray(static_cast<GLuint>(arrays[i].location)));
    for (int32_t i = 0; i < count; ++i)
        QEX_GL_IF(module, glVertexAttribPointer(static_cast<GLuint>(arrays[i].location), arrays[i].components,
                                                GL_FLOAT, GL_FALSE, 0, arrays[i].data));
    QEX_GL_IF(module, glDrawElements(GL_TRIANGLE_STRIP, 4, GL_UNSIGNED_BYTE, indices));
    for (int32_t i = 0; i < count; ++i)
        QEX_GL_IF(module, glDisableVertexAttribArray(static_cast<GLuint>(arrays[i].location)));
}
