// Legacy PVR textures: the 52-byte header and the surfaces behind it.
#pragma once

#include <cstdint>
#include <vector>

namespace pod {

enum PvrPixelType : uint32_t {
    kPvrRgba4444 = 0x10,
    kPvrRgba5551 = 0x11,
    kPvrRgba8888 = 0x12,
    kPvrRgb565 = 0x13,
    kPvrRgb555 = 0x14,
    kPvrRgb888 = 0x15,
    kPvrLuminance8 = 0x16,
    kPvrLuminanceAlpha88 = 0x17,
    kPvrtc2 = 0x18,
    kPvrtc4 = 0x19,
    kPvrBgra8888 = 0x1A,
    kPvrAlpha8 = 0x1B,
    kPvrEtc1 = 0x36,
};

enum PvrFlags : uint32_t {
    kPvrMipmaps = 0x100,
    kPvrTwiddled = 0x200,
    kPvrCubeMap = 0x1000,
    kPvrAlpha = 0x8000,
    kPvrFlipped = 0x10000,  // the first row is the picture's lower edge
};

uint32_t PvrBitsPerPixel(uint32_t type);  // 0 when unknown

// Bytes of one level: whole blocks of 4 x 4 for ETC1, whole units of 16 x 8 and 8 x 8 for PVRTC.
uint32_t PvrLevelSize(uint32_t type, uint32_t width, uint32_t height);

struct PvrImage {
    uint32_t type = kPvrRgba8888;
    uint32_t width = 0;
    uint32_t height = 0;
    uint32_t flags = 0;  // further flags; mipmaps and cube map are set by need
    std::vector<std::vector<std::vector<uint8_t>>> surfaces;  // [surface][level] pixel data, six for a cube
};

// The header's figures come from the image as it is given; nothing is checked.
std::vector<uint8_t> WritePvr(const PvrImage& image);

}  // namespace pod
