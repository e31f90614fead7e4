// Text: strings are laid out as quads of glyphs, kept or drawn at once.
#include "overlay/Font.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"
#include "gl/Program.h"
#include "overlay/FontLatin.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/math.h"
#include "Qex/overlay.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexFont"

namespace {

constexpr int32_t kGlyphWidth = 8;
constexpr int32_t kGlyphHeight = 16;
constexpr int32_t kSheetWidth = 256;
constexpr int32_t kSheetHeight = 48;
constexpr uint32_t kSheetColumns = 32;
constexpr uint32_t kFirstCharacter = 32;
constexpr uint32_t kLastCharacter = 127;
constexpr uint32_t kFirstLatin = 160;
constexpr uint32_t kLastLatin = 255;
constexpr uint32_t kInitialCapacity = 80;
constexpr uint32_t kTemporaryCapacity = 16;
constexpr uint32_t kStripGlyphs = 64;  // that byte indices reach
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

struct Colour {
    float r, g, b, a;
};

// Vertices of a text: four a glyph. The strip joins as many as one draw can show; further ones are drawn by
// further strips of the same indices.
struct Glyphs {
    float (*positions)[4][3];
    float (*texCoords)[4][2];
    Colour (*colours)[4];
    uint8_t* sheets;  // which sheet each is on
    uint8_t* indices;
    uint32_t capacity;
    uint32_t count;
};

// The sheets: the font's own and, made when the first text asks for it, that of Latin-1.
enum Sheet : uint8_t { kPlainSheet, kLatinSheet, kSheets };

bool s_Created;
bool s_ToldNoProgram;
float s_Scale = 1;
Glyphs s_Text;
Glyphs s_Temporary;
QexTexture s_Sheets[kSheets];
QexFontProgram s_Program;
QexMatrix s_Projection;

uint32_t IndexCount(uint32_t glyphs) {
    return glyphs * 6 - 2;
}

uint32_t FirstStrip(uint32_t glyphs) {
    return glyphs < kStripGlyphs ? glyphs : kStripGlyphs;
}

// Makes room for that many glyphs, and some more: texts are often added piece by piece. False when memory
// runs out.
bool Reserve(Glyphs* glyphs, uint32_t count) {
    if (count <= glyphs->capacity) return true;
    const uint32_t grown = glyphs->capacity + glyphs->capacity / 2;
    if (count < grown) count = grown;
    if (!QexMemory_Resize(glyphs->positions, uint64_t{count} * sizeof *glyphs->positions) ||
        !QexMemory_Resize(glyphs->texCoords, uint64_t{count} * sizeof *glyphs->texCoords) ||
        !QexMemory_Resize(glyphs->colours, uint64_t{count} * sizeof *glyphs->colours) ||
        !QexMemory_Resize(glyphs->sheets, count) ||
        !QexMemory_Resize(glyphs->indices, IndexCount(FirstStrip(count))))
        return false;
    glyphs->capacity = count;
    return true;
}

void FreeGlyphs(Glyphs* glyphs) {
    QexMemory_Free(glyphs->positions);
    QexMemory_Free(glyphs->texCoords);
    QexMemory_Free(glyphs->colours);
    QexMemory_Free(glyphs->sheets);
    QexMemory_Free(glyphs->indices);
    *glyphs = {};
}

// The strip: each further glyph repeats the last vertex and its own first, which joins the quads by triangles
// without area.
void BuildIndices(Glyphs* glyphs) {
    uint8_t* out = glyphs->indices;
    for (uint32_t glyph = 0; glyph < FirstStrip(glyphs->count); ++glyph) {
        const uint8_t first = static_cast<uint8_t>(4 * glyph);
        if (glyph) {
            *out++ = static_cast<uint8_t>(first - 1);
            *out++ = first;
        }
        for (uint8_t i = 0; i < 4; ++i) *out++ = static_cast<uint8_t>(first + i);
    }
}

// Takes the next character of UTF-8 text. A byte that starts none stands for itself, as a character that no
// sheet has.
uint32_t NextCharacter(const char** text) {
    const uint8_t* bytes = reinterpret_cast<const uint8_t*>(*text);
    const uint32_t follow = bytes[0] >= 0xF0 ? 3 : bytes[0] >= 0xE0 ? 2 : bytes[0] >= 0xC0 ? 1 : 0;
    uint32_t character = follow ? bytes[0] & (0x3Fu >> follow) : bytes[0];
    for (uint32_t i = 1; i <= follow; ++i) {
        if ((bytes[i] & 0xC0) != 0x80) {
            *text += 1;
            return UINT32_MAX;
        }
        character = character << 6 | (bytes[i] & 0x3Fu);
    }
    *text += follow + 1;
    return character >= 0x80 && !follow ? UINT32_MAX : character;
}

uint32_t CountGlyphs(const char* string) {
    uint32_t count = 0;
    while (*string)
        if (NextCharacter(&string) != '\n') ++count;
    return count;
}

// Where a character's glyph lies, in cells of its sheet.
struct Cell {
    Sheet sheet;
    int32_t column, row;
};
Cell FindCell(uint32_t character) {
    const bool latin = character >= kFirstLatin && character <= kLastLatin;
    const bool plain = character >= kFirstCharacter && character <= kLastCharacter;
    const uint32_t cell =
        latin ? character - kFirstLatin : (plain ? character : kLastCharacter) - kFirstCharacter;
    return {latin ? kLatinSheet : kPlainSheet, static_cast<int32_t>(cell % kSheetColumns),
            static_cast<int32_t>(cell / kSheetColumns)};
}

// Vertex i of a quad lies right for odd i and up for i > 1.
void WriteGlyph(Glyphs* glyphs, uint32_t slot, float left, float bottom, const Cell& cell,
                const Colour& colour) {
    // Enlarged, the filter would reach into the next cells.
    const float inset = s_Scale > 1 ? 0.5f - 0.5f / s_Scale : 0;
    const float s[2] = {static_cast<float>(cell.column * kGlyphWidth) + inset,
                        static_cast<float>((cell.column + 1) * kGlyphWidth) - inset};
    const float t[2] = {static_cast<float>((cell.row + 1) * kGlyphHeight) - inset,
                        static_cast<float>(cell.row * kGlyphHeight) + inset};
    glyphs->sheets[slot] = cell.sheet;
    for (int i = 0; i < 4; ++i) {
        const int32_t right = i & 1, up = i >> 1;
        float* position = glyphs->positions[slot][i];
        position[0] = left + static_cast<float>(right * kGlyphWidth) * s_Scale;
        position[1] = bottom + static_cast<float>(up * kGlyphHeight) * s_Scale;
        position[2] = 0;
        glyphs->texCoords[slot][i][0] = s[right] / kSheetWidth;
        glyphs->texCoords[slot][i][1] = t[up] / kSheetHeight;
        glyphs->colours[slot][i] = colour;
    }
}

// A text's upper edge is two lines above its y, whatever its scale.
void WriteString(Glyphs* glyphs, uint32_t slot, const QexRuntimeContext* context, int32_t x, int32_t y,
                 const char* string, const Colour& colour) {
    const float lineHeight = kGlyphHeight * s_Scale, advance = kGlyphWidth * s_Scale;
    float bottom =
        static_cast<float>(context->height) + 2 * kGlyphHeight - static_cast<float>(y) - lineHeight;
    float column = 0;
    while (*string) {
        const uint32_t character = NextCharacter(&string);
        if (character == '\n') {
            bottom -= lineHeight;
            column = 0;
            continue;
        }
        WriteGlyph(glyphs, slot++, static_cast<float>(x) + column * advance, bottom, FindCell(character),
                   colour);
        ++column;
    }
}

Colour FromBytes(int32_t r, int32_t g, int32_t b, int32_t a) {
    return {static_cast<float>(r) / 255.0f, static_cast<float>(g) / 255.0f, static_cast<float>(b) / 255.0f,
            static_cast<float>(a) / 255.0f};
}

void PointAt(int32_t location, GLint size, const void* data) {
    QEX_GL(glVertexAttribPointer(static_cast<GLuint>(location), size, GL_FLOAT, GL_FALSE, 0, data));
}

void SetState() {
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    QexRenderState_UseProgram(s_Program.program);
}

void BindSheet(Sheet sheet) {
    QexTexture_Set(&s_Sheets[sheet], kDiffuseUnit);
    QexTexture_SetFilter(&s_Sheets[sheet], QEX_FILTER_LINEAR);
}

void CreateSheet(Sheet sheet, const uint8_t* pixels) {
    QexTexture* texture = &s_Sheets[sheet];
    // The pixels are only read; the record has no pointer to constant ones.
    QexTexture_CreateFromPixels(texture, kSheetWidth, kSheetHeight, QEX_TEXFMT_RGBA8888, 0, 0,
                                QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, const_cast<uint8_t*>(pixels));
    texture->pixels = nullptr;
    QEX_GL(glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE));
    QEX_GL(glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE));
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

// Glyphs from `first` on that one draw can show: on one sheet, and no more than the strip joins.
uint32_t RunLength(const Glyphs& glyphs, uint32_t first) {
    uint32_t run = 1;
    while (run < kStripGlyphs && first + run < glyphs.count &&
           glyphs.sheets[first + run] == glyphs.sheets[first])
        ++run;
    return run;
}

// The sheet of the first glyph; the others are made now, if they are needed and not there.
void BindTextures(const Glyphs& glyphs) {
    if (memchr(glyphs.sheets, kLatinSheet, glyphs.count) && !s_Sheets[kLatinSheet].glName) CreateLatinSheet();
    BindSheet(static_cast<Sheet>(glyphs.sheets[0]));
    QexTexture_Set(nullptr, kAlphaUnit);
}

// Draws what BindTextures was called for.
void DrawGlyphs(const Glyphs& glyphs) {
    const int32_t arrays[] = {s_Program.position, s_Program.colour, s_Program.texCoord};
    uint8_t bound = glyphs.sheets[0];
    QexRenderState_Restore();
    for (const int32_t array : arrays) QEX_GL(glEnableVertexAttribArray(static_cast<GLuint>(array)));
    for (uint32_t first = 0, run; first < glyphs.count; first += run) {
        run = RunLength(glyphs, first);
        if (bound != glyphs.sheets[first]) BindSheet(static_cast<Sheet>(bound = glyphs.sheets[first]));
        PointAt(s_Program.position, 3, glyphs.positions + first);
        PointAt(s_Program.colour, 4, glyphs.colours + first);
        PointAt(s_Program.texCoord, 2, glyphs.texCoords + first);
        QEX_GL(glDrawElements(GL_TRIANGLE_STRIP, static_cast<GLsizei>(IndexCount(run)), GL_UNSIGNED_BYTE,
                              glyphs.indices));
    }
    for (const int32_t array : arrays) QEX_GL(glDisableVertexAttribArray(static_cast<GLuint>(array)));
}

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
}

extern "C" {

int32_t QexFont_Create(int32_t width, int32_t height) {
    if (s_Created) {
        QexLog(QEX_TAG, "<QexFont_Create> already created.");
        return 0;
    }
    QexMatrix_Orthographic(&s_Projection, 0, static_cast<float>(width), 0, static_cast<float>(height), 0, 1);
    if (QexFont_CreateShader() != 0) return -1;
    if (!Reserve(&s_Text, kInitialCapacity) || !Reserve(&s_Temporary, kTemporaryCapacity)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        FreeGlyphs(&s_Text);
        FreeGlyphs(&s_Temporary);
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
    if (p.program) QexFont_ReleaseShader(1);
    ReleaseSheets();
    if (!QexProgram_Build({"QexFont_CreateShader", kVertexSource, kFragmentSource, nullptr, 0},
                          {&p.program, &p.vertexShader, &p.fragmentShader}))
        return -1;
    s_ToldNoProgram = false;
    const QexProgramLookup lookup = {QEX_MODULE, p.program};
    lookup.Attributes(
        {{&p.position, "a_v4Position"}, {&p.colour, "a_v4FontColor"}, {&p.texCoord, "a_v2TexCoord"}});
    p.projectionLocation = lookup.Uniform("u_m4Projection");
    QEX_GL(glUniformMatrix4fv(p.projectionLocation, 1, GL_FALSE, s_Projection.m));
    lookup.SetSampler({"u_s2dTexture", kDiffuseUnit});
    lookup.SetSampler({"u_s2dAlpha", kAlphaUnit});
    CreateSheet(kPlainSheet, fontdata);
    return 0;
}

void QexFont_ReleaseShader(int32_t) {
    QexProgram_Delete({&s_Program.program, &s_Program.vertexShader, &s_Program.fragmentShader});
}

int32_t QexFont_Release(void) {
    const bool created = s_Created;
    // A program that was made without a font goes as well.
    if (created) QexFont_ClearString();
    FreeGlyphs(&s_Temporary);
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
    const uint32_t count = slot + CountGlyphs(string);
    if (!Reserve(&s_Text, count)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        exit(1);
    }
    s_Text.count = count;
    BuildIndices(&s_Text);
    WriteString(&s_Text, slot, context, x, y, string, FromBytes(r, g, b, a));
    return static_cast<int32_t>(strlen(string));
}

int32_t QexFont_ReplaceString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                              int32_t r, int32_t g, int32_t b, int32_t a) {
    if (!CheckCreated("QexFont_ReplaceString")) return 0;
    const int32_t length = static_cast<int32_t>(strlen(string));
    const uint32_t count = CountGlyphs(string);
    s_Text.count = 0;
    if (!Reserve(&s_Text, count)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return length;
    }
    s_Text.count = count;
    BuildIndices(&s_Text);
    WriteString(&s_Text, 0, context, x, y, string, FromBytes(r, g, b, a));
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
        const bool ends = NextCharacter(&string) == '\n';
        columns = ends ? 0 : columns + 1;
        lines += ends;
        widest = columns > widest ? columns : widest;
    }
    if (width) *width = static_cast<float>(widest) * kGlyphWidth * s_Scale;
    if (height) *height = static_cast<float>(lines) * kGlyphHeight * s_Scale;
}

void QexFont_ClearString(void) {
    s_Text.count = 0;
    if (CheckCreated("QexFont_ClearString")) FreeGlyphs(&s_Text);
}

void QexFont_Draw(void) {
    if (!CheckCreated("QexFont_Draw") || !s_Text.count || !QexFont_CanDraw("QexFont_Draw")) return;
    SetState();
    BindTextures(s_Text);
    glDepthFunc(GL_ALWAYS);
    DrawGlyphs(s_Text);
    glDepthFunc(GL_LEQUAL);
}

void QexFont_DrawTempString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                            uint32_t colour) {
    if (!CheckCreated("QexFont_DrawTempString")) return;
    s_Temporary.count = CountGlyphs(string);
    if (!s_Temporary.count || !QexFont_CanDraw("QexFont_DrawTempString")) return;
    if (!Reserve(&s_Temporary, s_Temporary.count)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return;
    }
    BuildIndices(&s_Temporary);
    WriteString(&s_Temporary, 0, context, x, y, string,
                FromBytes(colour >> 16 & 0xFF, colour >> 8 & 0xFF, colour & 0xFF, colour >> 24 & 0xFF));
    glDepthFunc(GL_ALWAYS);
    SetState();
    QEX_GL(glUniformMatrix4fv(s_Program.projectionLocation, 1, GL_FALSE, s_Projection.m));
    BindTextures(s_Temporary);
    DrawGlyphs(s_Temporary);
    glDepthFunc(GL_LEQUAL);
}

void QexFont_DrawNum(const QexRuntimeContext* context, int32_t x, int32_t y, int32_t number,
                     uint32_t colour) {
    char text[16];
    snprintf(text, sizeof text, "%d", number);
    QexFont_DrawTempString(context, x, y, text, colour);
}

}  // extern "C"
