// Text, kept or drawn at once: the font's program and sheets, and what goes to GL.
#include "overlay/Font.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "gl/Program.h"
#include "gl/Quad.h"
#include "overlay/FontLatin.h"
#include "overlay/Glyphs.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/math.h"
#include "Qex/overlay.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/Kept.h"

#define QEX_MODULE "src/QexFont"

namespace {

constexpr uint32_t kInitialCapacity = 80;
constexpr uint32_t kTemporaryCapacity = 16;
constexpr float kMaxScale = 1000;

const char* const kVertexSource = R"(#version 100
attribute highp vec4 a_v4Position;
attribute mediump vec4 a_v4FontColor;
attribute mediump vec2 a_v2TexCoord;
uniform highp mat4 u_m4Projection;
varying mediump vec4 v_v4FontColor;
varying mediump vec2 v_v2TexCoord;
void main() {
    v_v4FontColor = a_v4FontColor;
    v_v2TexCoord = a_v2TexCoord;
    gl_Position = u_m4Projection * a_v4Position;
}
)";

const char* const kFragmentSource = R"(#version 100
precision mediump float;
uniform sampler2D u_s2dTexture;
uniform sampler2D u_s2dAlpha;
varying vec4 v_v4FontColor;
varying vec2 v_v2TexCoord;
void main() {
    vec4 texel = texture2D(u_s2dTexture, v_v2TexCoord);
    float alpha = texture2D(u_s2dAlpha, v_v2TexCoord).r;
    gl_FragColor = v_v4FontColor * vec4(texel.rgb, texel.a * alpha);
}
)";

bool s_Created;
bool s_ToldNoProgram;
float s_Scale = 1;
QexGlyphs s_Text;
QexGlyphs s_Temporary;
QexTexture s_Sheets[kSheets];
QexFontProgram s_Program;
QexMatrix s_Projection;

QexGlyphColour FromBytes(int32_t r, int32_t g, int32_t b, int32_t a) {
    return {static_cast<float>(r) / 255.0f, static_cast<float>(g) / 255.0f, static_cast<float>(b) / 255.0f,
            static_cast<float>(a) / 255.0f};
}

// A text's upper edge is two lines above its y, whatever its scale.
void Write(QexGlyphs* glyphs, uint32_t slot, const QexRuntimeContext& context, int32_t x, int32_t y,
           const char* string, const QexGlyphColour& colour) {
    const float upper = static_cast<float>(context.height) + 2 * kGlyphHeight - static_cast<float>(y);
    QexGlyphs_Write(glyphs, slot, {string, static_cast<float>(x), upper, s_Scale, colour});
}

void PointAt(int32_t location, GLint size, const void* data) {
    QEX_GL(glVertexAttribPointer(static_cast<GLuint>(location), size, GL_FLOAT, GL_FALSE, 0, data));
}

void SetState() {
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    QexRenderState_UseProgram(s_Program.program);
}

void BindSheet(QexSheet sheet) {
    QexTexture_Set(&s_Sheets[sheet], kDiffuseUnit);
    if (!QexLeanState_IsLean()) QexTexture_SetFilter(&s_Sheets[sheet], QEX_FILTER_LINEAR);
}

bool CreateSheet(QexSheet sheet, const uint8_t* pixels) {
    QexTexture* texture = &s_Sheets[sheet];
    // The pixels are only read; the record has no pointer to constant ones.
    const int32_t result =
        QexTexture_CreateFromPixels(texture, kSheetWidth, kSheetHeight, QEX_TEXFMT_RGBA8888, 0, 0,
                                    QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, const_cast<uint8_t*>(pixels));
    texture->pixels = nullptr;
    QexKeptTexture_Drop(texture->glName);  // made again from here
    if (result != 0) return false;
    QEX_GL(glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE));
    QEX_GL(glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE));
    return true;
}

void CreateLatinSheet() {
    QexScratch<uint8_t> pixels(kSheetWidth * kSheetHeight * 4);
    if (!pixels) return QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    QexFontLatin_Paint(pixels.Get());
    CreateSheet(kLatinSheet, pixels.Get());
}

void ReleaseSheets() {
    for (QexTexture& sheet : s_Sheets)
        if (sheet.glName) QexTexture_Release(&sheet);
}

// Glyphs from `first` on that one draw can show: on one sheet, and no more than so many.
uint32_t RunLength(const QexGlyphs& glyphs, uint32_t first, uint32_t most = kStripGlyphs) {
    uint32_t run = 1;
    while (run < most && first + run < glyphs.count && glyphs.sheets[first + run] == glyphs.sheets[first])
        ++run;
    return run;
}

// The sheet of the first glyph; the others are made now, if they are needed and not there.
void BindTextures(const QexGlyphs& glyphs) {
    if (memchr(glyphs.sheets, kLatinSheet, glyphs.count) && !s_Sheets[kLatinSheet].glName) CreateLatinSheet();
    BindSheet(static_cast<QexSheet>(glyphs.sheets[0]));
    QexTexture_Set(nullptr, kAlphaUnit);
}

// Draws through buffers; what is kept is sent once.
void DrawLean(QexGlyphs* glyphs) {
    static const uint8_t kStrip[4] = {0, 1, 2, 3};
    const bool keeps = glyphs == &s_Text;
    const uint32_t most = keeps ? kQuadsOfADraw : kStreamedQuads;
    const QexQuads quads = {{{s_Program.position, 3, glyphs->positions[0][0]},
                             {s_Program.colour, 4, &glyphs->colours[0][0].r},
                             {s_Program.texCoord, 2, glyphs->texCoords[0][0]}},
                            glyphs->count,
                            kStrip};
    if (keeps && !glyphs->buffer) glGenBuffers(1, &glyphs->buffer);
    if (keeps && !glyphs->sent) QexQuads_Send(quads, glyphs->buffer);
    glyphs->sent = keeps;
    for (uint32_t first = 0, run; first < glyphs->count; first += run) {
        run = RunLength(*glyphs, first, most);
        if (first && glyphs->sheets[first] != glyphs->sheets[first - 1])
            BindSheet(static_cast<QexSheet>(glyphs->sheets[first]));
        if (keeps)
            QexQuads_DrawSent(quads, glyphs->buffer, first, run);
        else
            QexQuads_Stream(quads, first, run);
    }
}

// Draws what BindTextures was called for.
void DrawGlyphs(QexGlyphs* text) {
    if (QexLeanState_IsLean()) {
        DrawLean(text);
        return;
    }
    const QexGlyphs& glyphs = *text;
    const int32_t arrays[] = {s_Program.position, s_Program.colour, s_Program.texCoord};
    uint8_t bound = glyphs.sheets[0];
    for (const int32_t array : arrays) QEX_GL(glEnableVertexAttribArray(static_cast<GLuint>(array)));
    for (uint32_t first = 0, run; first < glyphs.count; first += run) {
        run = RunLength(glyphs, first);
        if (bound != glyphs.sheets[first]) BindSheet(static_cast<QexSheet>(bound = glyphs.sheets[first]));
        PointAt(s_Program.position, 3, glyphs.positions + first);
        PointAt(s_Program.colour, 4, glyphs.colours + first);
        PointAt(s_Program.texCoord, 2, glyphs.texCoords + first);
        QEX_GL(glDrawElements(GL_TRIANGLE_STRIP, static_cast<GLsizei>(QexGlyphs_IndexCount(run)),
                              GL_UNSIGNED_BYTE, glyphs.indices));
    }
    for (const int32_t array : arrays) QEX_GL(glDisableVertexAttribArray(static_cast<GLuint>(array)));
}

bool s_HadProgram;  // when the context was lost

void Forget() {
    s_HadProgram |= s_Program.program != 0;
    s_Program.program = s_Program.vertexShader = s_Program.fragmentShader = 0;
    for (QexTexture& sheet : s_Sheets) sheet.glName = 0;
    s_Text.buffer = 0;
    s_Text.sent = false;
}
bool Restore() {
    if (!s_HadProgram) return true;
    s_HadProgram = QexFont_CreateShader() != 0;
    return !s_HadProgram;
}
QexContextPart s_Part = {kRankPrograms, Forget, nullptr, Restore, nullptr, false};

// Logs that the font is missing; true when it is there.
bool CheckCreated(const char* function) {
    if (!s_Created) QexLog(QEX_TAG, "<%s> Font not initialized yet!", function);
    return s_Created;
}

}  // namespace

bool QexFont_IsCreated() {
    return s_Created;
}

bool QexFont_CanDraw(const char* function) {
    if (s_Program.program) return true;
    if (!s_ToldNoProgram)
        QexError(QEX_TAG,
                 "<%s> the font's program was released: nothing is drawn before QexFont_CreateShader",
                 function);
    s_ToldNoProgram = true;
    return false;
}

const QexFontProgram* QexFont_GetProgram() {
    return &s_Program;
}

void QexFont_Resize(int32_t width, int32_t height, int32_t heightBefore) {
    if (!s_Created) return;
    QexMatrix_Orthographic(&s_Projection, 0, static_cast<float>(width), 0, static_cast<float>(height), 0, 1);
    // A program that is made later takes the projection then.
    if (s_Program.program) {
        QexRenderState_UseProgram(s_Program.program);
        QEX_GL(glUniformMatrix4fv(s_Program.projectionLocation, 1, GL_FALSE, s_Projection.m));
    }
    const float up = static_cast<float>(height - heightBefore);
    for (uint32_t glyph = 0; glyph < s_Text.count; ++glyph)
        for (float(&position)[3] : s_Text.positions[glyph]) position[1] += up;
    s_Text.sent = false;
}

extern "C" {

int32_t QexFont_Create(int32_t width, int32_t height) {
    if (s_Created) {
        QexLog(QEX_TAG, "<QexFont_Create> already created.");
        return 0;
    }
    QexMatrix_Orthographic(&s_Projection, 0, static_cast<float>(width), 0, static_cast<float>(height), 0, 1);
    if (QexFont_CreateShader() != 0) return -1;
    if (!QexGlyphs_Reserve(&s_Text, kInitialCapacity) ||
        !QexGlyphs_Reserve(&s_Temporary, kTemporaryCapacity)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        QexGlyphs_Free(&s_Text);
        QexGlyphs_Free(&s_Temporary);
        ReleaseSheets();
        QexFont_ReleaseShader(1);
        return -1;
    }
    s_Scale = 1;
    s_Created = true;
    QexLog(QEX_TAG, "<QexFont_Create> Font initialize ok");
    return 0;
}

int32_t QexFont_CreateShader(void) {
    QexFontProgram& p = s_Program;
    const QexMaking making;
    if (p.program) QexFont_ReleaseShader(1);
    ReleaseSheets();
    if (!QexProgram_Build({"QexFont_CreateShader", kVertexSource, kFragmentSource, nullptr, 0},
                          {&p.program, &p.vertexShader, &p.fragmentShader}))
        return -1;
    s_ToldNoProgram = false;
    QexContext_Register(&s_Part);
    const QexProgramLookup lookup = {QEX_MODULE, p.program};
    lookup.Attributes(
        {{&p.position, "a_v4Position"}, {&p.colour, "a_v4FontColor"}, {&p.texCoord, "a_v2TexCoord"}});
    p.projectionLocation = lookup.Uniform("u_m4Projection");
    QEX_GL(glUniformMatrix4fv(p.projectionLocation, 1, GL_FALSE, s_Projection.m));
    lookup.SetSampler({"u_s2dTexture", kDiffuseUnit});
    lookup.SetSampler({"u_s2dAlpha", kAlphaUnit});
    if (CreateSheet(kPlainSheet, fontdata) && !making.Failed()) return 0;
    ReleaseSheets();
    QexFont_ReleaseShader(1);
    return -1;
}

void QexFont_ReleaseShader(int32_t) {
    s_HadProgram = false;
    QexProgram_Delete({&s_Program.program, &s_Program.vertexShader, &s_Program.fragmentShader});
}

int32_t QexFont_Release(void) {
    const bool created = s_Created;
    // A program that was made without a font goes as well.
    if (created) QexFont_ClearString();
    QexGlyphs_Free(&s_Temporary);
    ReleaseSheets();
    if (created || s_Program.program) QexFont_ReleaseShader(1);
    s_Created = false;
    if (!created) return QexLog(QEX_TAG, "<QexFont_Release> Already released!");
    return QexLog(QEX_TAG, "<QexFont_Release> Font released!");
}

int32_t QexFont_AddString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                          int32_t r, int32_t g, int32_t b, int32_t a) {
    if (!CheckCreated("QexFont_AddString")) return 0;
    const uint32_t slot = s_Text.count;
    const uint32_t count = slot + QexGlyphs_Count(string);
    if (!QexGlyphs_Reserve(&s_Text, count)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        if (QexDiagnostics_HasHandler()) return 0;
        exit(1);
    }
    s_Text.count = count;
    Write(&s_Text, slot, *context, x, y, string, FromBytes(r, g, b, a));
    return static_cast<int32_t>(strlen(string));
}

int32_t QexFont_ReplaceString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                              int32_t r, int32_t g, int32_t b, int32_t a) {
    if (!CheckCreated("QexFont_ReplaceString")) return 0;
    const int32_t length = static_cast<int32_t>(strlen(string));
    const uint32_t count = QexGlyphs_Count(string);
    s_Text.count = 0;
    if (!QexGlyphs_Reserve(&s_Text, count)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return length;
    }
    s_Text.count = count;
    Write(&s_Text, 0, *context, x, y, string, FromBytes(r, g, b, a));
    return length;
}

int32_t QexFont_SetScale(float scale) {
    if (!(scale > 0 && scale <= kMaxScale)) return -1;
    s_Scale = scale;
    return 0;
}

void QexFont_MeasureString(const char* string, float* width, float* height) {
    uint32_t columns = 0, widest = 0, lines = 1;
    while (*string) {
        const bool ends = QexGlyphs_NextCharacter(&string) == '\n';
        columns = ends ? 0 : columns + 1;
        lines += ends;
        widest = columns > widest ? columns : widest;
    }
    if (width) *width = static_cast<float>(widest) * kGlyphWidth * s_Scale;
    if (height) *height = static_cast<float>(lines) * kGlyphHeight * s_Scale;
}

void QexFont_ClearString(void) {
    s_Text.count = 0;
    if (CheckCreated("QexFont_ClearString")) QexGlyphs_Free(&s_Text);
}

void QexFont_Draw(void) {
    if (!CheckCreated("QexFont_Draw") || !s_Text.count || !QexFont_CanDraw("QexFont_Draw")) return;
    SetState();
    BindTextures(s_Text);
    glDepthFunc(GL_ALWAYS);
    DrawGlyphs(&s_Text);
    glDepthFunc(GL_LEQUAL);
}

void QexFont_DrawTempString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                            uint32_t colour) {
    if (!CheckCreated("QexFont_DrawTempString")) return;
    s_Temporary.count = QexGlyphs_Count(string);
    if (!s_Temporary.count || !QexFont_CanDraw("QexFont_DrawTempString")) return;
    if (!QexGlyphs_Reserve(&s_Temporary, s_Temporary.count)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return;
    }
    Write(&s_Temporary, 0, *context, x, y, string,
          FromBytes(colour >> 16 & 0xFF, colour >> 8 & 0xFF, colour & 0xFF, colour >> 24 & 0xFF));
    glDepthFunc(GL_ALWAYS);
    SetState();
    if (!QexLeanState_IsLean())
        QEX_GL(glUniformMatrix4fv(s_Program.projectionLocation, 1, GL_FALSE, s_Projection.m));
    BindTextures(s_Temporary);
    DrawGlyphs(&s_Temporary);
    glDepthFunc(GL_LEQUAL);
}

void QexFont_DrawNum(const QexRuntimeContext* context, int32_t x, int32_t y, int32_t number,
                     uint32_t colour) {
    char text[16];
    snprintf(text, sizeof text, "%d", number);
    QexFont_DrawTempString(context, x, y, text, colour);
}

}  // extern "C"
