// A level and its pixels in blocks of the exact size: whoever leaves them is noticed.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>

#include "Qex.h"

struct LevelToDecode {
    // The bytes there are, over and over, or zeros.
    LevelToDecode(const uint8_t* data, size_t size, size_t sourceSize, int32_t width, int32_t height)
        : source(new uint8_t[sourceSize]()),
          pixelBytes(size_t{4} * static_cast<uint32_t>(width) * static_cast<uint32_t>(height)),
          pixels(new uint8_t[pixelBytes]) {
        for (size_t i = 0; size && i < sourceSize; ++i) source[i] = data[i % size];
        std::fill_n(pixels.get(), pixelBytes, uint8_t{0x5A});
    }

    bool IsOpaque() const {
        for (size_t i = 3; i < pixelBytes; i += 4)
            if (pixels[i] != 255) return false;
        return true;
    }
    bool IsZero() const {
        return std::all_of(pixels.get(), pixels.get() + pixelBytes, [](uint8_t byte) { return byte == 0; });
    }

    const std::unique_ptr<uint8_t[]> source;
    const size_t pixelBytes;
    const std::unique_ptr<uint8_t[]> pixels;
};
