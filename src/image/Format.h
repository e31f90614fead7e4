// The pixel formats of texture files: one table for the loaders and for the tools.
#pragma once

#include <cstdint>

enum QexPixelCoding : uint8_t { kQexPixels, kQexETC1, kQexPVRTC, kQexUnread };

struct QexPixelFormat {
    QexPixelCoding coding;
    uint8_t bits;         // a pixel
    uint8_t pvrType;      // of a PVR header; kQexNoPvrType: KTX alone has it
    bool twiddled;        // may be, in a PVR
    int8_t recordBytes;   // a pixel, as texture records have it; -1: what was there stays; 0: is not taken
    uint8_t recordCode;   // QEX_TEXFMT_... of the record, or 0
    uint16_t pixelOrder;  // GL's name of it: GL_RGBA, ...
    uint16_t pixelType;   // GL's name of it: GL_UNSIGNED_BYTE, ...
    uint16_t glInternal;  // of a KTX header; 0: PVR alone has it
};

constexpr uint8_t kQexNoPvrType = 0;

// GL's names of the parts of a pixel, as the table and the headers of KTX files have them.
constexpr uint16_t kQexGLByte = 0x1401, kQexGLAlpha = 0x1906, kQexGLRGB = 0x1907, kQexGLRGBA = 0x1908,
                   kQexGLLuminance = 0x1909, kQexGLLuminanceAlpha = 0x190A, kQexGLBGRA = 0x80E1;

// The rows of the table.
enum QexFormatIndex : uint8_t {
    kQexFormatETC1,
    kQexFormatRGBA8888,
    kQexFormatRGB888,
    kQexFormatRGBA4444,
    kQexFormatRGBA5551,
    kQexFormatRGB565,
    kQexFormatL8,
    kQexFormatLA88,
    kQexFormatA8,
    kQexFormatBGRA8888,
    kQexFormatRGB555,
    kQexFormatPVRTC2Plain,  // of the type that is never twiddled
    kQexFormatPVRTC4Plain,
    kQexFormatPVRTC2,
    kQexFormatPVRTC4,
    kQexFormatPVRTC2RGB,
    kQexFormatPVRTC4RGB,
    kQexFormatCount
};

extern const QexPixelFormat kQexPixelFormats[kQexFormatCount];

// Null when the table has none. The format of KTX pixels is that of their order and type, the format of
// compressed data, which has neither, its internal one.
const QexPixelFormat* QexFormat_FindPVR(uint32_t pvrType);
const QexPixelFormat* QexFormat_FindPixels(uint32_t order, uint32_t type);
const QexPixelFormat* QexFormat_FindCompressed(uint32_t internalFormat);

// Bytes of a level whose rows are not padded; of blocks, whole ones. Sides below 65,536.
uint64_t QexFormat_LevelBytes(const QexPixelFormat& format, uint32_t width, uint32_t height);
