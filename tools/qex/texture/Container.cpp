// Textures in either container, and what holds for the sizes of both.
#include "texture/Container.h"

#include <algorithm>
#include <cstring>

namespace {

constexpr uint32_t kMaxSide = 8192;
constexpr uint32_t kImpossibleSide = 65536;  // for any GL; products of smaller ones do not overflow

std::string Pixels(uint32_t width, uint32_t height) {
    return std::to_string(width) + " x " + std::to_string(height) + " pixels";
}

}  // namespace

bool ReadTexture(TextureBytes file, Texture* texture, std::string* error) {
    *texture = Texture();
    if (QexKtx_Is(BytesOf(file))) {
        if (!ReadKtx(&file, texture, error)) return false;
    } else if (QexPvr_Is(BytesOf(file))) {
        if (!ReadPvr(file, texture, error)) return false;
    } else {
        *error = file.size() >= 4 && memcmp(file.data(), "PVR\x03", 4) == 0
                     ? "is of the newer PVR container; only the one with a header of 52 or 44 bytes is read"
                     : "is neither a PVR texture with the header of 52 or 44 bytes nor a KTX 1.1 texture";
        return false;
    }
    const QexImageLevel& top = texture->levels[0];
    if (std::max(top.width, top.height) > kMaxSide) {
        *error = "has " + Pixels(top.width, top.height) + "; at most 8192 a side are read";
        return false;
    }
    texture->file = std::move(file);
    return true;
}

Image DecodeFace(const Texture& texture, size_t level, size_t face) {
    const QexImageLevel& l = texture.levels[level];
    return DecodeLevel(*texture.format, texture.file.data() + texture.FaceOffset(level, face), l.width,
                       l.height, l.rowBytes);
}

bool MipmapsFit(uint32_t width, uint32_t height, uint32_t levels) {
    return levels < 2 || QexImage_IsPowerOfTwo(width, height);
}

std::string SizeFault(const QexImage& image, bool cube) {
    const uint32_t width = image.width, height = image.height;
    if (!width || !height) return "it has no pixels";
    if (std::max(width, height) >= kImpossibleSide) return Pixels(width, height) + " are too many";
    if (cube && width != height) return "the faces of its cube map are not square";
    if (image.faults & kQexFaultLevelCount) return "more mipmap levels than its size has";
    if (image.faults & kQexFaultSides)
        return Pixels(width, height) + "; the sides of PVRTC are powers of two";
    return "";
}
