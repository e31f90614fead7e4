#include <algorithm>

#include "texture/Container.h"

namespace {

constexpr uint32_t kHeader = 52, kOldHeader = 44;
constexpr uint32_t kMipmaps = 0x100, kTwiddled = 0x200, kCubeMap = 0x1000;

// What is wrong with a file whatever reads it.
std::string PvrFault(const PvrFile& pvr) {
    if (!pvr.format) return "its pixel type " + std::to_string(pvr.typeCode) + " is not known";
    if (pvr.twiddled && pvr.format->coding != PixelFormat::kPvrtc) return "its pixels are twiddled";
    if (pvr.bitsPerPixel != pvr.format->bits)
        return std::to_string(pvr.bitsPerPixel) + " bits per pixel do not fit " + pvr.format->title;
    if (pvr.cube && pvr.surfaces > 6) return "a cube map of more than 6 faces";
    const std::string fault = SizeFault(pvr.format, pvr.width, pvr.height, pvr.cube, pvr.levels);
    if (!fault.empty()) return fault;
    const uint64_t levelsBytes = pvr.LevelsBytes(), stride = pvr.Stride();
    if (pvr.surfaces > 1 && stride < levelsBytes)
        return "surfaces of " + std::to_string(stride) + " bytes, whose levels take " +
               std::to_string(levelsBytes);
    const uint64_t needed = (pvr.surfaces - 1) * stride + levelsBytes;
    if (needed <= pvr.pixelBytes) return "";
    return "cut short: " + std::to_string(pvr.pixelBytes) + " bytes of pixels instead of " +
           std::to_string(needed);
}

}  // namespace

uint64_t PvrFile::LevelsBytes() const {
    uint64_t bytes = 0;
    for (uint32_t level = 0; level < levels; ++level)
        bytes += LevelBytes(*format, std::max(width >> level, 1u), std::max(height >> level, 1u));
    return bytes;
}

// Some writers count all surfaces where others count one.
uint64_t PvrFile::Stride() const {
    const uint64_t levelsBytes = LevelsBytes();
    return surfaceBytes == surfaces * levelsBytes ? levelsBytes : surfaceBytes;
}

bool IsPvr(const TextureBytes& start) {
    return start.size() >= 4 && (ReadLE32(start, 0) == kHeader || ReadLE32(start, 0) == kOldHeader);
}

bool ReadPvrHeader(const TextureBytes& file, PvrFile* pvr) {
    const uint32_t headerBytes = ReadLE32(file, 0);
    if (file.size() < headerBytes) return false;
    const uint32_t flags = ReadLE32(file, 16);
    pvr->headerBytes = headerBytes;
    pvr->height = ReadLE32(file, 4);
    pvr->width = ReadLE32(file, 8);
    pvr->typeCode = flags & 0xFF;
    pvr->format = FindPvrFormat(pvr->typeCode);
    pvr->levels = flags & kMipmaps ? ReadLE32(file, 12) + 1 : 1;
    pvr->surfaceBytes = ReadLE32(file, 20);
    pvr->bitsPerPixel = ReadLE32(file, 24);
    pvr->cube = flags & kCubeMap;
    pvr->twiddled = flags & kTwiddled;
    const uint32_t stored = headerBytes == kHeader ? ReadLE32(file, 48) : 0;
    pvr->surfaces = stored ? stored : pvr->cube ? 6 : 1;
    pvr->pixelBytes = file.size() - headerBytes;
    return true;
}

std::string PvrRefusal(const PvrFile& pvr) {
    if (pvr.twiddled && pvr.typeCode != 0x18 && pvr.typeCode != 0x19) return "its pixels are twiddled";
    if (pvr.format && pvr.format->refusal)
        return std::string(pvr.format->title) + " pixels: " + pvr.format->refusal;
    const std::string fault = PvrFault(pvr);
    if (!fault.empty() || pvr.surfaces == 1 || pvr.Stride() == pvr.surfaceBytes) return fault;
    return "its header counts the bytes of all surfaces instead of one";
}

bool ReadPvr(const TextureBytes& file, Texture* texture, std::string* error) {
    PvrFile pvr;
    if (!ReadPvrHeader(file, &pvr)) {
        *error = "is cut short in the header of a PVR texture";
        return false;
    }
    *error = PvrFault(pvr);
    if (error->empty() && pvr.format->coding == PixelFormat::kUnread)
        *error = std::string(pvr.format->title) + " pixels are not read";
    if (!error->empty()) return false;
    texture->format = pvr.format;
    uint64_t at = pvr.headerBytes;
    for (uint32_t i = 0; i < pvr.levels; ++i) {
        TextureLevel level = {std::max(pvr.width >> i, 1u), std::max(pvr.height >> i, 1u), 0, 0, {}};
        level.bytes = LevelBytes(*pvr.format, level.width, level.height);
        level.rowBytes = uint64_t{level.width} * pvr.format->bits / 8;
        // Surfaces beyond six are no faces of anything.
        for (uint32_t face = 0; face < std::min(pvr.surfaces, 6u); ++face)
            level.faces.push_back(at + face * pvr.Stride());
        texture->levels.push_back(level);
        at += level.bytes;
    }
    return true;
}
