#include "texture/Container.h"

#include <algorithm>
#include <cstring>

namespace {

constexpr uint32_t kMaxSide = 8192;
constexpr uint32_t kImpossibleSide = 65536;  // for any GL; products of smaller ones do not overflow

bool IsPowerOfTwo(uint32_t value) {
    return (value & (value - 1)) == 0;
}

std::string Pixels(uint32_t width, uint32_t height) {
    return std::to_string(width) + " x " + std::to_string(height) + " pixels";
}

}  // namespace

bool ReadTexture(TextureBytes file, Texture* texture, std::string* error) {
    *texture = Texture();
    if (IsKtx(file)) {
        if (!ReadKtx(&file, texture, error)) return false;
    } else if (IsPvr(file)) {
        if (!ReadPvr(file, texture, error)) return false;
    } else {
        *error = file.size() >= 4 && memcmp(file.data(), "PVR\x03", 4) == 0
                     ? "is of the newer PVR container; only the one with a header of 52 or 44 bytes is read"
                     : "is neither a PVR texture with the header of 52 or 44 bytes nor a KTX 1.1 texture";
        return false;
    }
    const TextureLevel& top = texture->levels[0];
    if (std::max(top.width, top.height) > kMaxSide) {
        *error = "has " + Pixels(top.width, top.height) + "; at most 8192 a side are read";
        return false;
    }
    texture->file = std::move(file);
    return true;
}

Image DecodeFace(const Texture& texture, size_t level, size_t face) {
    const TextureLevel& l = texture.levels[level];
    return DecodeLevel(*texture.format, texture.file.data() + l.faces[face], l.width, l.height, l.rowBytes);
}

uint32_t ReadLE32(const TextureBytes& b, size_t at) {
    return b[at] | static_cast<uint32_t>(b[at + 1]) << 8 | static_cast<uint32_t>(b[at + 2]) << 16 |
           static_cast<uint32_t>(b[at + 3]) << 24;
}

uint32_t FullChain(uint32_t width, uint32_t height) {
    uint32_t levels = 1;
    for (uint32_t size = std::max(width, height); size > 1; size /= 2) ++levels;
    return levels;
}

bool MipmapsFit(uint32_t width, uint32_t height, uint32_t levels) {
    return levels < 2 || (IsPowerOfTwo(width) && IsPowerOfTwo(height));
}

std::string SizeFault(const PixelFormat* format, uint32_t width, uint32_t height, bool cube,
                      uint32_t levels) {
    if (!width || !height) return "it has no pixels";
    if (std::max(width, height) >= kImpossibleSide) return Pixels(width, height) + " are too many";
    if (cube && width != height) return "the faces of its cube map are not square";
    if (!levels || levels > FullChain(width, height)) return "more mipmap levels than its size has";
    const bool pvrtc = format && format->coding == PixelFormat::kPvrtc;
    if (pvrtc && !(IsPowerOfTwo(width) && IsPowerOfTwo(height)))
        return Pixels(width, height) + "; the sides of PVRTC are powers of two";
    return "";
}
