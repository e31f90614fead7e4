// Glyphs beyond the font's own 96 characters.
#pragma once

#include <cstdint>

// Paints the characters 160 to 255 in the grid of `fontdata`: 256 x 48 pixels, RGBA.
void QexFontLatin_Paint(uint8_t* rgba);
