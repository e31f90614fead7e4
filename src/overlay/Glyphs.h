// Texts as quads of glyphs: UTF-8 to cells of the font's sheets, and the vertices of a text.
#pragma once

#include <cstdint>

// Cells of a sheet, in pixels.
constexpr int32_t kGlyphWidth = 8;
constexpr int32_t kGlyphHeight = 16;
constexpr int32_t kSheetWidth = 256;
constexpr int32_t kSheetHeight = 48;
constexpr uint32_t kStripGlyphs = 64;  // that byte indices reach

// The sheets: the font's own and, made when the first text asks for it, that of Latin-1.
enum QexSheet : uint8_t { kPlainSheet, kLatinSheet, kSheets };

struct QexGlyphColour {
    float r, g, b, a;
};

// Vertices of a text: four a glyph. The strip joins as many as one draw can show; further ones are drawn by
// further strips of the same indices.
struct QexGlyphs {
    float (*positions)[4][3];
    float (*texCoords)[4][2];
    QexGlyphColour (*colours)[4];
    uint8_t* sheets;  // which sheet each is on
    uint8_t* indices;
    uint32_t capacity;
    uint32_t count;
    uint32_t buffer;  // GL buffer of lean drawing, for what is kept; 0: none yet
    bool sent;        // whether the buffer holds the glyphs
};

// How many indices join so many glyphs.
uint32_t QexGlyphs_IndexCount(uint32_t glyphs);

// Makes room for that many glyphs, and some more: texts are often added piece by piece. False when memory
// runs out.
bool QexGlyphs_Reserve(QexGlyphs* glyphs, uint32_t count);
void QexGlyphs_Free(QexGlyphs* glyphs);

// Takes the next character of UTF-8 text. A byte that starts none stands for itself, as a character that no
// sheet has.
uint32_t QexGlyphs_NextCharacter(const char** text);

// Glyphs of a text.
uint32_t QexGlyphs_Count(const char* string);

// A text and where it stands.
struct QexGlyphText {
    const char* string;
    float x, upper;  // its left edge, and the line above it, counted from below
    float scale;
    QexGlyphColour colour;
};

// Writes a text's glyphs from `slot` on; the glyphs are that many and those of the text.
void QexGlyphs_Write(QexGlyphs* glyphs, uint32_t slot, const QexGlyphText& text);
