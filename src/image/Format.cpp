// The table of pixel formats, and how many bytes their levels take.
#include "image/Format.h"

#include "Qex/images.h"

namespace {

constexpr uint16_t k4444 = 0x8033, k5551 = 0x8034, k565 = 0x8363;

}  // namespace

// clang-format off
const QexPixelFormat kQexPixelFormats[kQexFormatCount] = {
    {kQexETC1, 4, 0x36, false, -1, 0, 0, 0, 0x8D64},
    {kQexPixels, 32, 0x12, false, 4, QEX_TEXFMT_RGBA8888, kQexGLRGBA, kQexGLByte, 0x8058},
    {kQexPixels, 24, 0x15, false, 3, QEX_TEXFMT_RGB888, kQexGLRGB, kQexGLByte, 0x8051},
    {kQexPixels, 16, 0x10, false, 2, QEX_TEXFMT_RGBA4444, kQexGLRGBA, k4444, 0x8056},
    {kQexPixels, 16, 0x11, false, 2, QEX_TEXFMT_RGBA5551, kQexGLRGBA, k5551, 0x8057},
    {kQexPixels, 16, 0x13, false, 2, 0, kQexGLRGB, k565, 0x8D62},
    {kQexPixels, 8, 0x16, false, -1, 0, kQexGLLuminance, kQexGLByte, kQexGLLuminance},
    {kQexPixels, 16, 0x17, false, -1, 0, kQexGLLuminanceAlpha, kQexGLByte, kQexGLLuminanceAlpha},
    {kQexPixels, 8, 0x1B, false, -1, 0, kQexGLAlpha, kQexGLByte, kQexGLAlpha},
    {kQexPixels, 32, 0x1A, false, 0, 0, kQexGLBGRA, kQexGLByte, kQexGLBGRA},
    {kQexUnread, 16, 0x14, false, 0, 0, 0, 0, 0},
    {kQexPVRTC, 2, 0x0C, false, 4, QEX_TEXFMT_RGBA8888, 0, 0, 0},
    {kQexPVRTC, 4, 0x0D, false, 4, QEX_TEXFMT_RGBA8888, 0, 0, 0},
    {kQexPVRTC, 2, 0x18, true, 4, QEX_TEXFMT_RGBA8888, 0, 0, 0x8C03},
    {kQexPVRTC, 4, 0x19, true, 4, QEX_TEXFMT_RGBA8888, 0, 0, 0x8C02},
    {kQexPVRTC, 2, kQexNoPvrType, false, 4, QEX_TEXFMT_RGBA8888, 0, 0, 0x8C01},
    {kQexPVRTC, 4, kQexNoPvrType, false, 4, QEX_TEXFMT_RGBA8888, 0, 0, 0x8C00},
};
// clang-format on

const QexPixelFormat* QexFormat_FindPVR(uint32_t pvrType) {
    for (const QexPixelFormat& format : kQexPixelFormats)
        if (format.pvrType == pvrType && pvrType != kQexNoPvrType) return &format;
    return nullptr;
}

const QexPixelFormat* QexFormat_FindPixels(uint32_t order, uint32_t type) {
    for (const QexPixelFormat& format : kQexPixelFormats)
        if (format.coding == kQexPixels && format.pixelOrder == order && format.pixelType == type)
            return &format;
    return nullptr;
}

const QexPixelFormat* QexFormat_FindCompressed(uint32_t internalFormat) {
    for (const QexPixelFormat& format : kQexPixelFormats)
        if (format.coding != kQexPixels && format.glInternal && format.glInternal == internalFormat)
            return &format;
    return nullptr;
}

uint64_t QexFormat_LevelBytes(const QexPixelFormat& format, uint32_t width, uint32_t height) {
    const uint32_t words = format.bits == 2 ? 16 : 8;  // two of PVRTC's across
    switch (format.coding) {
        case kQexETC1: return (uint64_t{width} + 3) / 4 * ((uint64_t{height} + 3) / 4) * 8;
        case kQexPVRTC:
            return uint64_t{width > words ? width : words} * (height > 8 ? height : 8) * format.bits / 8;
        default: return uint64_t{width} * height * format.bits / 8;
    }
}
