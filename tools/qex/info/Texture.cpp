// What PVR and TGA files hold.
#include "image/Tga.h"
#include "info/Info.h"

namespace {

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
    QexPvr pvr;
    if (!QexPvr_ReadHeader(&pvr, BytesOf(file))) {
        *error = "is cut short in the header of a PVR texture";
        return false;
    }
    const QexImage& image = pvr.image;
    const QexPVRHeader& header = pvr.header;
    document->update(
        {{"format", "PVR"},
         {"bytes", file.size()},
         {"header", header.headerSize == kQexPvrHeaderSize ? "52 bytes" : "44 bytes, the old one"},
         {"pixelType", image.format ? FormatOf(image.format).title : "unknown"},
         {"pixelTypeCode", header.flags & 0xFF},
         {"width", image.width},
         {"height", image.height},
         {"levels", image.levelCount},
         {"bitsPerPixel", header.bitsPerPixel},
         {"cubeMap", pvr.IsCube()},
         {"surfaces", image.faces},
         {"twiddled", (header.flags & kQexPvrTwiddled) != 0},
         {"surfaceBytes", header.dataSize},
         {"pixelBytes", file.size() - header.headerSize}});
    const std::string refusal = PvrRefusal(&pvr, file);
    AddVerdict(refusal, document);
    Json& problems = (*document)["problems"];
    if (refusal.empty() && !MipmapsFit(image.width, image.height, image.levelCount))
        problems.push_back(kNoMipmaps);
    else if (refusal.empty() && image.format->coding == kQexETC1 && image.levelCount > 1 &&
             image.levelCount < QexImage_ChainLength(image.width, image.height))
        problems.push_back(kPartialChain);
    if (refusal.empty() && !pvr.IsCube() && image.faces > 1)
        problems.push_back("it is no cube map: the last of its surfaces is what shows");
    if (refusal.empty() && pvr.IsCube() && image.faces < 6)
        problems.push_back("its cube map has " + std::to_string(image.faces) + " of 6 faces");
    return true;
}

bool DescribeTga(const std::vector<uint8_t>& file, Json* document, std::string* error) {
    if (file.size() < kQexTgaHeaderSize) {
        *error = "is cut short in the header of a TGA image";
        return false;
    }
    const QexTga tga = QexTga_ReadHeader(file.data());
    document->update({{"format", "TGA"},
                      {"bytes", file.size()},
                      {"imageType", TgaTypeName(tga.type)},
                      {"imageTypeCode", tga.type},
                      {"width", tga.width},
                      {"height", tga.height},
                      {"bitsPerPixel", tga.bits},
                      {"alphaBits", tga.alphaBits},
                      {"origin", kOrigins[2 * tga.topFirst + tga.rightFirst]},
                      {"identifierBytes", tga.identifierBytes},
                      {"colourMap", tga.mapped}});
    std::string refusal;
    if (TgaTypeName(tga.type) == std::string("unknown") || tga.type == 0)
        refusal = "it is no TGA image with a picture";
    else if (tga.type != 2 || tga.mapped)
        refusal = std::string("it is ") + TgaTypeName(tga.type) + "; only uncompressed true colour is read";
    else if (tga.bits != 24 && tga.bits != 32)
        refusal = std::to_string(tga.bits) + " bits per pixel; only 24 and 32 are read";
    else if (!tga.width || !tga.height)
        refusal = "it has no pixels";
    else if (!QexTga_IsWhole(BytesOf(file)))
        refusal = "cut short: " + std::to_string(file.size() - kQexTgaHeaderSize) +
                  " bytes of pixels instead of " + std::to_string(tga.PixelBytes());
    AddVerdict(refusal, document);
    Json& problems = (*document)["problems"];
    if (refusal.empty() && tga.identifierBytes)
        problems.push_back("the engine does not skip its identifier field, the picture is shifted");
    if (refusal.empty() && tga.rightFirst)
        problems.push_back("it starts at the right, the picture is mirrored");
    return true;
}
