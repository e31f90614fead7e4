#include "QexFont.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "QexGL.h"
#include "QexMemory.h"
#include "QexShader.h"

#define QEX_MODULE "src/QexFont"

namespace {

constexpr int32_t kGlyphWidth = 8;
constexpr int32_t kGlyphHeight = 16;
constexpr int32_t kSheetWidth = 256;
constexpr int32_t kSheetHeight = 48;
constexpr uint32_t kSheetColumns = 32;
constexpr uint32_t kFirstCharacter = 32;
constexpr uint32_t kLastCharacter = 127;
constexpr uint32_t kInitialCapacity = 80;
constexpr uint32_t kTemporaryCapacity = 16;
constexpr uint32_t kStripGlyphs = 64;  // that byte indices reach

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
    uint8_t* indices;
    uint32_t capacity;
    uint32_t count;
};

bool s_Created;
Glyphs s_Text;
Glyphs s_Temporary;
QexTexture s_Texture;
QexFontProgram s_Program;
QexMatrix s_Projection;

uint32_t IndexCount(uint32_t glyphs) {
    return glyphs * 6 - 2;
}

uint32_t FirstStrip(uint32_t glyphs) {
    return glyphs < kStripGlyphs ? glyphs : kStripGlyphs;
}

// Makes room for that many glyphs; false when memory runs out.
bool Reserve(Glyphs* glyphs, uint32_t count) {
    if (count <= glyphs->capacity) return true;
    if (!QexMemory_Resize(glyphs->positions, uint64_t{count} * sizeof *glyphs->positions) ||
        !QexMemory_Resize(glyphs->texCoords, uint64_t{count} * sizeof *glyphs->texCoords) ||
        !QexMemory_Resize(glyphs->colours, uint64_t{count} * sizeof *glyphs->colours) ||
        !QexMemory_Resize(glyphs->indices, IndexCount(FirstStrip(count))))
        return false;
    glyphs->capacity = count;
    return true;
}

void FreeGlyphs(Glyphs* glyphs) {
    QexMemory_Free(glyphs->positions);
    QexMemory_Free(glyphs->texCoords);
    QexMemory_Free(glyphs->colours);
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

// Vertex i of a quad lies right for odd i and up for i > 1.
void WriteGlyph(Glyphs* glyphs, uint32_t slot, float left, float bottom, uint8_t character,
                const Colour& colour) {
    const uint32_t known =
        character >= kFirstCharacter && character <= kLastCharacter ? character : kLastCharacter;
    const uint32_t cell = known - kFirstCharacter;
    const int32_t s = static_cast<int32_t>(cell % kSheetColumns) * kGlyphWidth;
    const int32_t t = static_cast<int32_t>(cell / kSheetColumns) * kGlyphHeight;
    for (int i = 0; i < 4; ++i) {
        const int32_t right = i & 1, up = i >> 1;
        float* position = glyphs->positions[slot][i];
        position[0] = left + static_cast<float>(right * kGlyphWidth);
        position[1] = bottom + static_cast<float>(up * kGlyphHeight);
        position[2] = 0;
        glyphs->texCoords[slot][i][0] = static_cast<float>(s + right * kGlyphWidth) / kSheetWidth;
        glyphs->texCoords[slot][i][1] = static_cast<float>(t + (1 - up) * kGlyphHeight) / kSheetHeight;
        glyphs->colours[slot][i] = colour;
    }
}

void WriteString(Glyphs* glyphs, uint32_t slot, const QexRuntimeContext* context, int32_t x, int32_t y,
                 const char* string, const Colour& colour) {
    const float bottom = static_cast<float>(context->height) + kGlyphHeight - static_cast<float>(y);
    for (uint32_t i = 0; slot + i < glyphs->count; ++i)
        WriteGlyph(glyphs, slot + i, static_cast<float>(x) + static_cast<float>(i) * kGlyphWidth, bottom,
                   static_cast<uint8_t>(string[i]), colour);
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

void BindTextures() {
    QexTexture_Set(&s_Texture, kDiffuseUnit);
    QexTexture_SetFilter(&s_Texture, QEX_FILTER_LINEAR);
    QexTexture_Set(nullptr, kAlphaUnit);
}

void DrawGlyphs(const Glyphs& glyphs) {
    const int32_t arrays[] = {s_Program.position, s_Program.colour, s_Program.texCoord};
    for (const int32_t array : arrays) QEX_GL(glEnableVertexAttribArray(static_cast<GLuint>(array)));
    for (uint32_t first = 0; first < glyphs.count; first += kStripGlyphs) {
        PointAt(s_Program.position, 3, glyphs.positions + first);
        PointAt(s_Program.colour, 4, glyphs.colours + first);
        PointAt(s_Program.texCoord, 2, glyphs.texCoords + first);
        QEX_GL(glDrawElements(GL_TRIANGLE_STRIP,
                              static_cast<GLsizei>(IndexCount(FirstStrip(glyphs.count - first))),
                              GL_UNSIGNED_BYTE, glyphs.indices));
    }
    for (const int32_t array : arrays) QEX_GL(glDisableVertexAttribArray(static_cast<GLuint>(array)));
}

void CreateTexture() {
    // The sheet is only read; the record has no pointer to constant pixels.
    QexTexture_CreateFromPixels(&s_Texture, kSheetWidth, kSheetHeight, QEX_TEXFMT_RGBA8888, 0, 0,
                                QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, const_cast<uint8_t*>(fontdata));
    QEX_GL(glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE));
    QEX_GL(glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE));
}

// Logs that the font is missing; true when it is there.
bool CheckCreated(const char* function) {
    if (!s_Created) QexLog(QEX_TAG, "<%s> Font not initialized yet!", function);
    return s_Created;
}

}  // namespace

const QexFontProgram* QexFont_GetProgram() {
    return &s_Program;
}

void QexFont_Resize(int32_t width, int32_t height, int32_t heightBefore) {
    if (!s_Created) return;
    QexMatrix_Orthographic(&s_Projection, 0, static_cast<float>(width), 0, static_cast<float>(height), 0, 1);
    QexRenderState_UseProgram(s_Program.program);
    QEX_GL(glUniformMatrix4fv(s_Program.projectionLocation, 1, GL_FALSE, s_Projection.m));
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
    if (QexFont_CreateShader() != 0) {
        QexFont_ReleaseShader(1);
        return -1;
    }
    if (!Reserve(&s_Text, kInitialCapacity) || !Reserve(&s_Temporary, kTemporaryCapacity)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        FreeGlyphs(&s_Text);
        FreeGlyphs(&s_Temporary);
        QexTexture_Release(&s_Texture);
        QexFont_ReleaseShader(1);
        return -1;
    }
    s_Created = true;
    QexLog(QEX_TAG, "<QexFont_Create> Font initialize ok");
    return 0;
}

int32_t QexFont_CreateShader(void) {
    QexFontProgram& p = s_Program;
    if (QexShader_Create(&p.vertexShader, kVertexSource, GL_VERTEX_SHADER) != 0) return -1;
    if (QexShader_Create(&p.fragmentShader, kFragmentSource, GL_FRAGMENT_SHADER) != 0) return -1;
    QexShader_CreateProgram(&p.program, p.vertexShader, p.fragmentShader, nullptr, 0, nullptr);
    QEX_GL(p.position = glGetAttribLocation(p.program, "a_v4Position"));
    QEX_GL(p.colour = glGetAttribLocation(p.program, "a_v4FontColor"));
    QEX_GL(p.texCoord = glGetAttribLocation(p.program, "a_v2TexCoord"));
    QEX_GL(p.projectionLocation = glGetUniformLocation(p.program, "u_m4Projection"));
    QEX_GL(glUniformMatrix4fv(p.projectionLocation, 1, GL_FALSE, s_Projection.m));
    QEX_GL(p.textureLocation = glGetUniformLocation(p.program, "u_s2dTexture"));
    QEX_GL(glUniform1i(p.textureLocation, kDiffuseUnit));
    QEX_GL(p.alphaLocation = glGetUniformLocation(p.program, "u_s2dAlpha"));
    QEX_GL(glUniform1i(p.alphaLocation, kAlphaUnit));
    CreateTexture();
    return 0;
}

void QexFont_ReleaseShader(int32_t) {
    QexShader_DeleteProgram(&s_Program.program, &s_Program.vertexShader, &s_Program.fragmentShader);
}

int32_t QexFont_Release(void) {
    if (!s_Created) return QexLog(QEX_TAG, "<QexFont_Release> Already released!");
    QexFont_ClearString();
    FreeGlyphs(&s_Temporary);
    QexTexture_Release(&s_Texture);
    QexFont_ReleaseShader(1);
    s_Created = false;
    return QexLog(QEX_TAG, "<QexFont_Release> Font released!");
}

int32_t QexFont_AddString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                          int32_t r, int32_t g, int32_t b, int32_t a) {
    if (!CheckCreated("QexFont_AddString")) return 0;
    const uint32_t length = static_cast<uint32_t>(strlen(string));
    const uint32_t slot = s_Text.count;
    const uint32_t count = slot + length;
    if (!Reserve(&s_Text, count)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        exit(1);
    }
    s_Text.count = count;
    BuildIndices(&s_Text);
    WriteString(&s_Text, slot, context, x, y, string, FromBytes(r, g, b, a));
    return static_cast<int32_t>(length);
}

int32_t QexFont_ReplaceString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                              int32_t r, int32_t g, int32_t b, int32_t a) {
    if (!CheckCreated("QexFont_ReplaceString")) return 0;
    const uint32_t length = static_cast<uint32_t>(strlen(string));
    s_Text.count = 0;
    if (!Reserve(&s_Text, length)) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return static_cast<int32_t>(length);
    }
    s_Text.count = length;
    BuildIndices(&s_Text);
    WriteString(&s_Text, 0, context, x, y, string, FromBytes(r, g, b, a));
    return static_cast<int32_t>(length);
}

void QexFont_ClearString(void) {
    s_Text.count = 0;
    if (CheckCreated("QexFont_ClearString")) FreeGlyphs(&s_Text);
}

void QexFont_Draw(void) {
    if (!CheckCreated("QexFont_Draw") || !s_Text.count) return;
    SetState();
    BindTextures();
    glDepthFunc(GL_ALWAYS);
    DrawGlyphs(s_Text);
    glDepthFunc(GL_LEQUAL);
}

void QexFont_DrawTempString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                            uint32_t colour) {
    if (!CheckCreated("QexFont_DrawTempString")) return;
    s_Temporary.count = static_cast<uint32_t>(strlen(string));
    if (!s_Temporary.count) return;
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
    BindTextures();
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
