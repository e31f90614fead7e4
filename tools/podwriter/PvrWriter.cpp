// The sizes of levels by pixel type, the header and the surfaces of a PVR file.
#include "PvrWriter.h"

#include <cstddef>

namespace pod {
namespace {

struct PixelTypeInfo {
    uint32_t type, bitsPerPixel, unitWidth, unitHeight;  // levels are whole units
};

constexpr PixelTypeInfo kTypes[] = {
    {kPvrRgba4444, 16, 1, 1},  {kPvrRgba5551, 16, 1, 1},         {kPvrRgba8888, 32, 1, 1},
    {kPvrRgb565, 16, 1, 1},    {kPvrRgb555, 16, 1, 1},           {kPvrRgb888, 24, 1, 1},
    {kPvrLuminance8, 8, 1, 1}, {kPvrLuminanceAlpha88, 16, 1, 1}, {kPvrtc2, 2, 16, 8},
    {kPvrtc4, 4, 8, 8},        {kPvrBgra8888, 32, 1, 1},         {kPvrAlpha8, 8, 1, 1},
    {kPvrEtc1, 4, 4, 4},
};

PixelTypeInfo TypeInfo(uint32_t type) {
    for (const PixelTypeInfo& info : kTypes) {
        if (info.type == type) return info;
    }
    return {type, 0, 1, 1};
}

}  // namespace

uint32_t PvrBitsPerPixel(uint32_t type) {
    return TypeInfo(type).bitsPerPixel;
}

uint32_t PvrLevelSize(uint32_t type, uint32_t width, uint32_t height) {
    const PixelTypeInfo info = TypeInfo(type);
    const auto whole = [](uint32_t size, uint32_t unit) { return (size + unit - 1) / unit * unit; };
    return (whole(width, info.unitWidth) * whole(height, info.unitHeight) * info.bitsPerPixel + 7) / 8;
}

std::vector<uint8_t> WritePvr(const PvrImage& image) {
    const size_t surfaceCount = image.surfaces.size();
    const size_t levelCount = surfaceCount ? image.surfaces[0].size() : 0;
    size_t surfaceBytes = 0;
    if (surfaceCount) {
        for (const auto& level : image.surfaces[0]) surfaceBytes += level.size();
    }
    uint32_t flags = image.type | image.flags;
    if (levelCount > 1) flags |= kPvrMipmaps;
    if (surfaceCount == 6) flags |= kPvrCubeMap;

    const uint32_t header[13] = {52,
                                 image.height,
                                 image.width,
                                 static_cast<uint32_t>(levelCount ? levelCount - 1 : 0),
                                 flags,
                                 static_cast<uint32_t>(surfaceBytes),
                                 PvrBitsPerPixel(image.type),
                                 0,
                                 0,
                                 0,
                                 0,
                                 0x21525650,  // "PVR!"
                                 static_cast<uint32_t>(surfaceCount)};
    std::vector<uint8_t> bytes;
    bytes.reserve(sizeof(header) + surfaceBytes * surfaceCount);
    for (const uint32_t word : header) {
        for (int shift = 0; shift < 32; shift += 8) bytes.push_back(static_cast<uint8_t>(word >> shift));
    }
    for (const auto& surface : image.surfaces) {
        for (const auto& level : surface) bytes.insert(bytes.end(), level.begin(), level.end());
    }
    return bytes;
}

}  // namespace pod
