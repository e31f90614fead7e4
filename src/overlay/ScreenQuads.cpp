// Textures on the screen, drawn with the font's program.
#include "gl/GL.h"
#include "gl/Quad.h"
#include "overlay/Font.h"
#include "Qex/base.h"
#include "Qex/overlay.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexFont"

namespace {

constexpr float kNoTextureSize = 64;

// One quad, written anew by each call.
float s_Positions[4][3];
float s_TexCoords[4][2];
float s_Colours[4][4];

// The part of a texture that is shown, in texture coordinates, and the size of its picture in texels.
struct Span {
    float left, right, top, bottom, width, height;
};

Span FindSpan(const QexTexture* texture, const QexRect* rectangle) {
    const float w = texture ? static_cast<float>(texture->width) : kNoTextureSize;
    const float h = texture ? static_cast<float>(texture->height) : kNoTextureSize;
    if (!texture || !rectangle) return {0, 1, 1, 0, w + 1, h + 1};
    const float left = static_cast<float>(rectangle->left), right = static_cast<float>(rectangle->right);
    const float top = h - static_cast<float>(rectangle->top);
    const float bottom = h - static_cast<float>(rectangle->bottom);
    return {left / w, right / w, top / h, bottom / h, right + 1 - left, top + 1 - bottom};
}

void WriteQuad(const QexRuntimeContext* context, const QexTexture* texture, const QexRect* rectangle, float x,
               float y, float scaleX, float scaleY, uint32_t colour) {
    const Span span = FindSpan(texture, rectangle);
    if (!texture) {
        scaleX /= kNoTextureSize;
        scaleY /= kNoTextureSize;
    }
    const float up = static_cast<float>(context->height) - y;
    const float right = x + span.width * scaleX, down = up - span.height * scaleY;
    for (int i = 0; i < 4; ++i) {
        s_Positions[i][0] = i & 1 ? right : x;
        s_Positions[i][1] = i > 1 ? down : up;
        s_Positions[i][2] = 0;
        s_TexCoords[i][0] = i & 1 ? span.right : span.left;
        s_TexCoords[i][1] = i > 1 ? span.bottom : span.top;
        for (int c = 0; c < 4; ++c) {
            const int shift = c == 3 ? 24 : 16 - 8 * c;
            s_Colours[i][c] = static_cast<float>(colour >> shift & 0xFF) / 255.0f;
        }
    }
}

// Creates the font where there is none yet; false, with a line, when that fails or its program is gone.
bool NeedFont(const QexRuntimeContext* context, const char* function, int32_t* result) {
    if (QexFont_IsCreated()) return QexFont_CanDraw(function);
    QexLog(QEX_TAG, "<%s> Call texture draw before font created!", function);
    if (QexFont_Create(context->width, context->height) == 0) return true;
    *result = QexLog(QEX_TAG, "<%s> Try to initialize font failed", function);
    return false;
}

void DrawQuad() {
    const QexFontProgram& program = *QexFont_GetProgram();
    const QexQuadArray arrays[] = {{program.position, 3, s_Positions[0]},
                                   {program.colour, 4, s_Colours[0]},
                                   {program.texCoord, 2, s_TexCoords[0]}};
    QexQuad_Draw(QEX_MODULE, arrays);
}

}  // namespace

extern "C" {

int32_t QexTexture_Draw(const QexRuntimeContext* context, QexTexture* texture, float x, float y,
                        const QexRect* rectangle, float scaleX, float scaleY, uint32_t colour) {
    int32_t result = 0;
    if (!NeedFont(context, "QexTexture_Draw", &result)) return result;
    WriteQuad(context, texture, rectangle, x, y, scaleX, scaleY, colour);
    QexRenderState_UseProgram(QexFont_GetProgram()->program);
    if (texture) {
        QexRenderState_ActiveTexture(GL_TEXTURE0);
        QexRenderState_Bind(GL_TEXTURE_2D, texture->glName);
    } else {
        QexTexture_Set(nullptr, kDiffuseUnit);
    }
    QexTexture_Set(nullptr, kAlphaUnit);
    DrawQuad();
    return 0;
}

int32_t QexTexture_Draw2(const QexRuntimeContext* context, QexTexture* texture, QexTexture* alphaTexture,
                         float x, float y, const QexRect* rectangle, float scaleX, float scaleY,
                         uint32_t colour) {
    int32_t result = 0;
    if (!NeedFont(context, "QexTexture_Draw2", &result)) return result;
    WriteQuad(context, texture, rectangle, x, y, scaleX, scaleY, colour);
    QexRenderState_UseProgram(QexFont_GetProgram()->program);
    QexTexture_Set(texture, kDiffuseUnit);
    if (texture) QexTexture_SetFilter(texture, QEX_FILTER_LINEAR);
    QexTexture_Set(alphaTexture, kAlphaUnit);
    DrawQuad();
    return 0;
}

}  // extern "C"
