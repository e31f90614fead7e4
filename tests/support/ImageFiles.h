// Small KTX, TGA and PVR files.
#pragma once

#include <GLES2/gl2.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <optional>
#include <vector>

#include "PvrWriter.h"

constexpr GLenum kEtc1 = 0x8D64;

using Bytes = std::vector<uint8_t>;

// Bytes that are all different from their neighbours, so that a shift by any amount shows.
inline Bytes Noise(size_t count, uint32_t seed = 1) {
    Bytes bytes(count);
    for (uint8_t& byte : bytes) {
        seed = seed * 1664525 + 1013904223;
        byte = static_cast<uint8_t>(seed >> 24);
    }
    return bytes;
}

inline void PutWord(Bytes* file, size_t offset, uint32_t word) {
    if (file->size() < offset + 4) file->resize(offset + 4);
    std::memcpy(file->data() + offset, &word, 4);
}
inline uint32_t GetWord(const Bytes& file, size_t offset) {
    uint32_t word;
    std::memcpy(&word, file.data() + offset, 4);
    return word;
}

// A KTX file as its fields say, sound or not.
struct Ktx {
    uint32_t type = GL_UNSIGNED_BYTE, format = GL_RGBA, internal = GL_RGBA, base = GL_RGBA;
    uint32_t width = 4, height = 4, faces = 1;
    std::vector<std::vector<Bytes>> levels;  // [level][face], as they lie in the file
    std::optional<uint32_t> levelCount;
    Bytes keyValues;

    Bytes File() const {
        const auto count = levelCount.value_or(static_cast<uint32_t>(levels.size()));
        const auto extra = static_cast<uint32_t>(keyValues.size());
        Bytes file = {0xAB, 'K', 'T', 'X', ' ', '1', '1', 0xBB, '\r', '\n', 0x1A, '\n'};
        for (const uint32_t word : {0x04030201u, type, type > GL_UNSIGNED_BYTE ? 2u : 1u, format, internal,
                                    base, width, height, 0u, 0u, faces, count, extra})
            PutWord(&file, file.size(), word);
        file.insert(file.end(), keyValues.begin(), keyValues.end());
        for (const auto& level : levels) {
            PutWord(&file, file.size(), static_cast<uint32_t>(level[0].size()));
            for (const Bytes& face : level) {
                file.insert(file.end(), face.begin(), face.end());
                file.resize((file.size() + 3) / 4 * 4);
            }
        }
        return file;
    }
};

// The file in the other byte order: words turned round, and pixels of 16 bits, but no bytes.
inline Bytes SwappedFile(const Ktx& ktx) {
    Bytes file = ktx.File();
    const auto turn = [&](size_t at, size_t bytes) {
        std::reverse(file.begin() + static_cast<long>(at), file.begin() + static_cast<long>(at + bytes));
    };
    for (size_t at = 12; at < 64; at += 4) turn(at, 4);
    size_t at = 64 + ktx.keyValues.size();
    for (const auto& level : ktx.levels) {
        turn(at, 4);
        at += 4;
        for (const Bytes& face : level) {
            for (size_t i = 0; ktx.type > GL_UNSIGNED_BYTE && i + 1 < face.size(); i += 2) turn(at + i, 2);
            at += (face.size() + 3) / 4 * 4;
        }
    }
    return file;
}

// Three levels and key/value data.
inline Ktx SoundKtx() {
    Ktx ktx;
    ktx.levels = {{Noise(64, 1)}, {Noise(16, 2)}, {Noise(4, 3)}};
    ktx.keyValues = Noise(12, 9);
    return ktx;
}

inline Ktx CubeKtx() {
    Ktx ktx;
    ktx.faces = 6;
    ktx.width = ktx.height = 2;
    ktx.levels.resize(2);
    for (uint32_t face = 0; face < 6; ++face) {
        ktx.levels[0].push_back(Noise(16, 10 + face));
        ktx.levels[1].push_back(Noise(4, 20 + face));
    }
    return ktx;
}

inline Ktx Etc1Ktx() {
    Ktx ktx;
    ktx.type = ktx.format = 0;
    ktx.internal = kEtc1;
    ktx.base = GL_RGB;
    ktx.width = 8;
    ktx.levels = {{Noise(16, 1)}, {Noise(8, 2)}};
    return ktx;
}

// What follows a TGA header of the given size and depth is up to the caller.
inline Bytes TgaFile(uint32_t width, uint32_t height, uint32_t bits, const Bytes& pixels) {
    Bytes file(18 + pixels.size());
    file[2] = 2;
    PutWord(&file, 12, (width & 0xFFFF) | height << 16);
    file[16] = static_cast<uint8_t>(bits);
    std::copy(pixels.begin(), pixels.end(), file.begin() + 18);
    return file;
}

// Levels of noise, each half the size of the one before; the seeds tell surfaces and levels apart.
inline pod::PvrImage PvrNoise(uint32_t type, uint32_t width, uint32_t height, uint32_t levels,
                              uint32_t surfaces) {
    pod::PvrImage image;
    image.type = type;
    image.width = width;
    image.height = height;
    image.surfaces.resize(surfaces);
    for (uint32_t s = 0; s < surfaces; ++s)
        for (uint32_t l = 0; l < levels; ++l)
            image.surfaces[s].push_back(Noise(
                pod::PvrLevelSize(type, std::max(width >> l, 1u), std::max(height >> l, 1u)), 100 * s + l));
    return image;
}
