#include <algorithm>
#include <cstdio>

#include "Info.h"

namespace {

constexpr uint32_t kPvrHeader = 52, kPvrOldHeader = 44;
constexpr uint32_t kPvrMipmaps = 0x100, kPvrTwiddled = 0x200, kPvrCubeMap = 0x1000;
constexpr size_t kTgaHeader = 18;

struct PvrType {
    uint32_t code;
    const char* name;
    uint32_t bits;
    const char* refusal;  // null: the engine takes it
};

constexpr char kNoPvrtc[] = "PVRTC is not supported yet";

const PvrType kPvrTypes[] = {
    {0x0C, "PVRTC, 2 bits", 2, kNoPvrtc},
    {0x0D, "PVRTC, 4 bits", 4, kNoPvrtc},
    {0x10, "RGBA 4444", 16, nullptr},
    {0x11, "RGBA 5551", 16, nullptr},
    {0x12, "RGBA 8888", 32, nullptr},
    {0x13, "RGB 565", 16, nullptr},
    {0x14, "RGB 555", 16, "GL ES 2.0 has no RGB 555"},
    {0x15, "RGB 888", 24, nullptr},
    {0x16, "luminance 8", 8, nullptr},
    {0x17, "luminance-alpha 88", 16, nullptr},
    {0x18, "PVRTC, 2 bits", 2, kNoPvrtc},
    {0x19, "PVRTC, 4 bits", 4, kNoPvrtc},
    {0x1A, "BGRA 8888", 32, "GL ES 2.0 has no BGRA without an extension"},
    {0x1B, "alpha 8", 8, nullptr},
    {0x36, "ETC1", 4, nullptr},
};

PvrType FindPvrType(uint32_t code) {
    for (const PvrType& type : kPvrTypes)
        if (type.code == code) return type;
    return {code, "unknown", 0, "the engine has no such pixel type"};
}

// Bytes of a surface with all its levels.
uint64_t SurfaceBytes(const PvrType& type, uint32_t width, uint32_t height, uint32_t levels) {
    uint64_t bytes = 0;
    for (uint32_t i = 0; i < levels; ++i) {
        if (type.code == 0x36)
            bytes += uint64_t{(width + 3) / 4} * ((height + 3) / 4) * 8;
        else
            bytes += (uint64_t{width} * height * type.bits + 7) / 8;
        width = std::max(width / 2, 1u);
        height = std::max(height / 2, 1u);
    }
    return bytes;
}

struct Pvr {
    PvrType type;
    uint32_t width, height, flags, levels, surfaceBytes, bitsPerPixel, surfaces;
    uint64_t pixelBytes;  // behind the header
};

// Why the engine does not take the file; empty when it does.
std::string PvrRefusal(const Pvr& pvr) {
    const bool cube = pvr.flags & kPvrCubeMap;
    if (pvr.flags & kPvrTwiddled && pvr.type.code != 0x18 && pvr.type.code != 0x19)
        return "its pixels are twiddled";
    if (pvr.type.refusal) return std::string(pvr.type.name) + " pixels: " + pvr.type.refusal;
    if (pvr.bitsPerPixel != pvr.type.bits)
        return std::to_string(pvr.bitsPerPixel) + " bits per pixel do not fit " + pvr.type.name;
    if (cube && pvr.surfaces > 6) return "a cube map of more than 6 faces";
    if (!pvr.width || !pvr.height) return "it has no pixels";
    if (cube && pvr.width != pvr.height) return "the faces of its cube map are not square";
    if (!pvr.levels || pvr.levels > FullChain(pvr.width, pvr.height))
        return "more mipmap levels than its size has";
    const uint64_t needed = uint64_t{pvr.surfaces - 1} * pvr.surfaceBytes +
                            SurfaceBytes(pvr.type, pvr.width, pvr.height, pvr.levels);
    if (needed <= pvr.pixelBytes) return "";
    return "cut short: " + std::to_string(pvr.pixelBytes) + " bytes of pixels instead of " +
           std::to_string(needed);
}

void AddVerdict(const std::string& refusal, Json* document) {
    (*document)["loads"] = refusal.empty();
    (*document)["problems"] = Json::array();
    if (!refusal.empty()) (*document)["problems"].push_back("the engine refuses it: " + refusal);
}

struct TgaType {
    uint32_t code;
    const char* name;
};

const TgaType kTgaTypes[] = {{0, "no picture"},
                             {1, "colour-mapped"},
                             {2, "true colour"},
                             {3, "greyscale"},
                             {9, "colour-mapped, run-length encoded"},
                             {10, "true colour, run-length encoded"},
                             {11, "greyscale, run-length encoded"}};

const char* TgaTypeName(uint32_t code) {
    for (const TgaType& type : kTgaTypes)
        if (type.code == code) return type.name;
    return "unknown";
}

const char* const kOrigins[] = {"lower left", "lower right", "upper left", "upper right"};

}  // namespace

uint32_t ReadLE32(const std::vector<uint8_t>& b, size_t at) {
    return b[at] | static_cast<uint32_t>(b[at + 1]) << 8 | static_cast<uint32_t>(b[at + 2]) << 16 |
           static_cast<uint32_t>(b[at + 3]) << 24;
}

uint32_t FullChain(uint32_t width, uint32_t height) {
    uint32_t levels = 1;
    for (uint32_t size = std::max(width, height); size > 1; size /= 2) ++levels;
    return levels;
}

bool IsPvr(const std::vector<uint8_t>& start) {
    return start.size() >= 4 && (ReadLE32(start, 0) == kPvrHeader || ReadLE32(start, 0) == kPvrOldHeader);
}

bool DescribePvr(const std::vector<uint8_t>& file, Json* document, std::string* error) {
    const uint32_t headerBytes = ReadLE32(file, 0);
    if (file.size() < headerBytes) {
        *error = "is cut short in the header of a PVR texture";
        return false;
    }
    Pvr pvr = {};
    pvr.height = ReadLE32(file, 4);
    pvr.width = ReadLE32(file, 8);
    pvr.flags = ReadLE32(file, 16);
    pvr.type = FindPvrType(pvr.flags & 0xFF);
    pvr.levels = pvr.flags & kPvrMipmaps ? ReadLE32(file, 12) + 1 : 1;
    pvr.surfaceBytes = ReadLE32(file, 20);
    pvr.bitsPerPixel = ReadLE32(file, 24);
    const bool cube = pvr.flags & kPvrCubeMap;
    const uint32_t stored = headerBytes == kPvrHeader ? ReadLE32(file, 48) : 0;
    pvr.surfaces = stored ? stored : cube ? 6 : 1;
    pvr.pixelBytes = file.size() - headerBytes;
    document->update({{"format", "PVR"},
                      {"bytes", file.size()},
                      {"header", headerBytes == kPvrHeader ? "52 bytes" : "44 bytes, the old one"},
                      {"pixelType", pvr.type.name},
                      {"pixelTypeCode", pvr.type.code},
                      {"width", pvr.width},
                      {"height", pvr.height},
                      {"levels", pvr.levels},
                      {"bitsPerPixel", pvr.bitsPerPixel},
                      {"cubeMap", cube},
                      {"surfaces", pvr.surfaces},
                      {"twiddled", (pvr.flags & kPvrTwiddled) != 0},
                      {"surfaceBytes", pvr.surfaceBytes},
                      {"pixelBytes", pvr.pixelBytes}});
    AddVerdict(PvrRefusal(pvr), document);
    return true;
}

bool DescribeTga(const std::vector<uint8_t>& file, Json* document, std::string* error) {
    if (file.size() < kTgaHeader) {
        *error = "is cut short in the header of a TGA image";
        return false;
    }
    const uint32_t type = file[2], bits = file[16];
    const uint32_t width = file[12] | static_cast<uint32_t>(file[13]) << 8;
    const uint32_t height = file[14] | static_cast<uint32_t>(file[15]) << 8;
    document->update({{"format", "TGA"},
                      {"bytes", file.size()},
                      {"imageType", TgaTypeName(type)},
                      {"imageTypeCode", type},
                      {"width", width},
                      {"height", height},
                      {"bitsPerPixel", bits},
                      {"alphaBits", file[17] & 15},
                      {"origin", kOrigins[file[17] >> 4 & 3]},
                      {"identifierBytes", file[0]},
                      {"colourMap", file[1] != 0}});
    std::string refusal;
    if (TgaTypeName(type) == std::string("unknown") || type == 0)
        refusal = "it is no TGA image with a picture";
    else if (type != 2 || file[1])
        refusal = std::string("it is ") + TgaTypeName(type) + "; only uncompressed true colour is read";
    else if (bits != 24 && bits != 32)
        refusal = std::to_string(bits) + " bits per pixel; only 24 and 32 are read";
    else if (!width || !height)
        refusal = "it has no pixels";
    else if (kTgaHeader + uint64_t{width} * height * (bits / 8) > file.size())
        refusal = "cut short: " + std::to_string(file.size() - kTgaHeader) + " bytes of pixels instead of " +
                  std::to_string(uint64_t{width} * height * (bits / 8));
    AddVerdict(refusal, document);
    Json& problems = (*document)["problems"];
    if (refusal.empty() && file[0])
        problems.push_back("the engine does not skip its identifier field, the picture is shifted");
    if (refusal.empty() && file[17] & 0x10)
        problems.push_back("it starts at the right, the picture is mirrored");
    return true;
}
