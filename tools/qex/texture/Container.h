// PVR and KTX files: what their headers say, whether the engine takes them, and where their pixels lie.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "texture/Formats.h"

using TextureBytes = std::vector<uint8_t>;

struct TextureLevel {
    uint32_t width, height;
    uint64_t bytes;               // of a face
    uint64_t rowBytes;            // of uncompressed pixels
    std::vector<uint64_t> faces;  // where each begins in the file
};

// ---- PVR with the legacy header ----

struct PvrFile {
    const PixelFormat* format;  // null: not known
    uint32_t headerBytes, typeCode, width, height, levels, surfaces, surfaceBytes, bitsPerPixel;
    bool cube, twiddled;
    uint64_t pixelBytes;  // behind the header

    uint64_t LevelsBytes() const;  // of a surface with all its levels
    uint64_t Stride() const;       // from one surface to the next
};

bool IsPvr(const TextureBytes& start);

// False when the file is shorter than its header.
bool ReadPvrHeader(const TextureBytes& file, PvrFile* pvr);

// Why the engine does not take the file; empty when it does.
std::string PvrRefusal(const PvrFile& pvr);

// ---- KTX 1.1 ----

struct KtxFile {
    bool swapped;  // the header is in the other byte order
    uint32_t glType, glTypeSize, glFormat, glInternalFormat, glBaseInternalFormat;
    uint32_t width, height, depth, arrayElements, faces, levels, keyValueBytes;
    const PixelFormat* format;  // null: not known

    bool Compressed() const { return !glType || !glFormat; }
};

constexpr size_t kKtxHeaderBytes = 64;

bool IsKtx(const TextureBytes& start);

// False when the file is shorter than its header.
bool ReadKtxHeader(const TextureBytes& file, KtxFile* ktx);

// A word of the file in the order of its header.
uint32_t KtxWord(const TextureBytes& file, const KtxFile& ktx, uint64_t at);

// Adds the levels that are there and returns what is wrong with them. The header is one that KtxRefusal lets
// through.
std::string FindKtxLevels(const TextureBytes& file, const KtxFile& ktx, std::vector<TextureLevel>* levels);

// Why the engine does not take the file, judged by its header; empty when it may.
std::string KtxRefusal(const KtxFile& ktx);

// "GL_RGBA (0x1908)"; "0" for 0.
std::string GlName(uint32_t value);

// ---- both ----

struct Texture {
    const PixelFormat* format = nullptr;
    std::vector<TextureLevel> levels;  // at least one, of at least one face
    TextureBytes file;
};

// One of the two containers, for ReadTexture; a KTX file's pixels are put into the order of this machine.
bool ReadPvr(const TextureBytes& file, Texture* texture, std::string* error);
bool ReadKtx(TextureBytes* file, Texture* texture, std::string* error);

// Takes what DecodeFace can decode, more than the engine does. False, with the reason, for anything else.
bool ReadTexture(TextureBytes file, Texture* texture, std::string* error);

Image DecodeFace(const Texture& texture, size_t level, size_t face);

uint32_t ReadLE32(const TextureBytes& bytes, size_t at);

// Levels of a whole mipmap chain.
uint32_t FullChain(uint32_t width, uint32_t height);

// GL ES 2.0 has mipmaps for powers of two alone.
bool MipmapsFit(uint32_t width, uint32_t height, uint32_t levels);

// What is wrong with the size of a texture; empty when nothing is.
std::string SizeFault(const PixelFormat* format, uint32_t width, uint32_t height, bool cube, uint32_t levels);
