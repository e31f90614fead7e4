// PVRTC, some rows of an image at a time.
#pragma once

#include <cstdint>

// Decodes what QexDecompressPVRTC does of `rows` rows from `row` on, both multiples of 4 but at the end, into
// the whole image's pixels. The last two rows come with those that follow. Sides are powers of two.
void QexPvrtc_DecodeRows(const uint8_t* source, bool twoBits, int32_t width, int32_t height, int32_t row,
                         int32_t rows, uint8_t* pixels);
