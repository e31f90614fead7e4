// Laying out text.
#include "overlay/Glyphs.h"

#include "base/Memory.h"
#include "gl/GL.h"
#include "Qex/renderer.h"

namespace {

constexpr uint32_t kSheetColumns = 32;
constexpr uint32_t kFirstCharacter = 32;
constexpr uint32_t kLastCharacter = 127;
constexpr uint32_t kFirstLatin = 160;
constexpr uint32_t kLastLatin = 255;

uint32_t FirstStrip(uint32_t glyphs) {
    return glyphs < kStripGlyphs ? glyphs : kStripGlyphs;
}

// The strip: each further glyph repeats the last vertex and its own first, which joins the quads by triangles
// without area.
void BuildIndices(QexGlyphs* glyphs) {
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

// Where a character's glyph lies, in cells of its sheet.
struct Cell {
    QexSheet sheet;
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
void WriteGlyph(QexGlyphs* glyphs, uint32_t slot, const QexGlyphText& text, float left, float bottom,
                const Cell& cell) {
    // Enlarged, the filter would reach into the next cells.
    const float inset = text.scale > 1 ? 0.5f - 0.5f / text.scale : 0;
    const float s[2] = {static_cast<float>(cell.column * kGlyphWidth) + inset,
                        static_cast<float>((cell.column + 1) * kGlyphWidth) - inset};
    const float t[2] = {static_cast<float>((cell.row + 1) * kGlyphHeight) - inset,
                        static_cast<float>(cell.row * kGlyphHeight) + inset};
    glyphs->sheets[slot] = cell.sheet;
    for (int i = 0; i < 4; ++i) {
        const int32_t right = i & 1, up = i >> 1;
        float* position = glyphs->positions[slot][i];
        position[0] = left + static_cast<float>(right * kGlyphWidth) * text.scale;
        position[1] = bottom + static_cast<float>(up * kGlyphHeight) * text.scale;
        position[2] = 0;
        glyphs->texCoords[slot][i][0] = s[right] / kSheetWidth;
        glyphs->texCoords[slot][i][1] = t[up] / kSheetHeight;
        glyphs->colours[slot][i] = text.colour;
    }
}

}  // namespace

uint32_t QexGlyphs_IndexCount(uint32_t glyphs) {
    return glyphs * 6 - 2;
}

bool QexGlyphs_Reserve(QexGlyphs* glyphs, uint32_t count) {
    if (count <= glyphs->capacity) return true;
    const uint32_t grown = glyphs->capacity + glyphs->capacity / 2;
    if (count < grown) count = grown;
    if (!QexMemory_Resize(glyphs->positions, uint64_t{count} * sizeof *glyphs->positions) ||
        !QexMemory_Resize(glyphs->texCoords, uint64_t{count} * sizeof *glyphs->texCoords) ||
        !QexMemory_Resize(glyphs->colours, uint64_t{count} * sizeof *glyphs->colours) ||
        !QexMemory_Resize(glyphs->sheets, count) ||
        !QexMemory_Resize(glyphs->indices, QexGlyphs_IndexCount(FirstStrip(count))))
        return false;
    glyphs->capacity = count;
    return true;
}

void QexGlyphs_Free(QexGlyphs* glyphs) {
    QexMemory_Free(glyphs->positions);
    QexMemory_Free(glyphs->texCoords);
    QexMemory_Free(glyphs->colours);
    QexMemory_Free(glyphs->sheets);
    QexMemory_Free(glyphs->indices);
    if (glyphs->buffer) {
        QexRenderState_Restore();
        glDeleteBuffers(1, &glyphs->buffer);
    }
    *glyphs = {};
}

uint32_t QexGlyphs_NextCharacter(const char** text) {
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

uint32_t QexGlyphs_Count(const char* string) {
    uint32_t count = 0;
    while (*string)
        if (QexGlyphs_NextCharacter(&string) != '\n') ++count;
    return count;
}

void QexGlyphs_Write(QexGlyphs* glyphs, uint32_t slot, const QexGlyphText& text) {
    const char* string = text.string;
    float bottom = text.upper - kGlyphHeight * text.scale, column = 0;
    glyphs->sent = false;
    BuildIndices(glyphs);
    while (*string) {
        const uint32_t character = QexGlyphs_NextCharacter(&string);
        if (character == '\n') {
            bottom -= kGlyphHeight * text.scale;
            column = 0;
            continue;
        }
        const float left = text.x + column * (kGlyphWidth * text.scale);
        WriteGlyph(glyphs, slot++, text, left, bottom, FindCell(character));
        ++column;
    }
}
