#include "info/Info.h"

namespace {

constexpr size_t kTgaHeader = 18;

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

bool DescribePvr(const std::vector<uint8_t>& file, Json* document, std::string* error) {
    PvrFile pvr;
    if (!ReadPvrHeader(file, &pvr)) {
        *error = "is cut short in the header of a PVR texture";
        return false;
    }
    document->update({{"format", "PVR"},
                      {"bytes", file.size()},
                      {"header", pvr.headerBytes == 52 ? "52 bytes" : "44 bytes, the old one"},
                      {"pixelType", pvr.format ? pvr.format->title : "unknown"},
                      {"pixelTypeCode", pvr.typeCode},
                      {"width", pvr.width},
                      {"height", pvr.height},
                      {"levels", pvr.levels},
                      {"bitsPerPixel", pvr.bitsPerPixel},
                      {"cubeMap", pvr.cube},
                      {"surfaces", pvr.surfaces},
                      {"twiddled", pvr.twiddled},
                      {"surfaceBytes", pvr.surfaceBytes},
                      {"pixelBytes", pvr.pixelBytes}});
    const std::string refusal = PvrRefusal(pvr);
    AddVerdict(refusal, document);
    Json& problems = (*document)["problems"];
    if (refusal.empty() && !MipmapsFit(pvr.width, pvr.height, pvr.levels))
        problems.push_back(kNoMipmaps);
    else if (refusal.empty() && pvr.format->coding == PixelFormat::kEtc1 && pvr.levels > 1 &&
             pvr.levels < FullChain(pvr.width, pvr.height))
        problems.push_back(kPartialChain);
    if (refusal.empty() && !pvr.cube && pvr.surfaces > 1)
        problems.push_back("it is no cube map: the last of its surfaces is what shows");
    if (refusal.empty() && pvr.cube && pvr.surfaces < 6)
        problems.push_back("its cube map has " + std::to_string(pvr.surfaces) + " of 6 faces");
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
