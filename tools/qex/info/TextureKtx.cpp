// What KTX files hold.
#include "info/Info.h"

namespace {

constexpr size_t kMostPairs = 1000;  // key and value pairs that are listed

// Key and value pairs as far as they are whole; values that are no text are given by their length.
Json KeyValues(const std::vector<uint8_t>& file, const QexKtx& ktx) {
    Json pairs = Json::array();
    QexKtxPair pair;
    uint64_t at = kQexKtxHeaderSize;
    while (pairs.size() < kMostPairs && QexKtx_ReadPair(ktx, BytesOf(file), &at, &pair)) {
        std::string value(pair.value, pair.valueBytes);
        while (!value.empty() && value.back() == '\0') value.pop_back();
        if (value.find('\0') != std::string::npos) value = std::to_string(pair.valueBytes) + " bytes";
        pairs.push_back({{"key", CleanText(pair.key)}, {"value", CleanText(value)}});
    }
    return pairs;
}

// The sizes of the levels that are there; of a file that is refused, also of the one that is at fault.
Json LevelSizes(const QexImage& image, bool refused) {
    Json sizes = Json::array();
    for (uint32_t i = 0; i < image.levelCount + refused && image.levels[i].offset; ++i)
        sizes.push_back({{"width", image.levels[i].width},
                         {"height", image.levels[i].height},
                         {"bytes", image.levels[i].bytes}});
    return sizes;
}

}  // namespace

bool DescribeKtx(const std::vector<uint8_t>& file, Json* document, std::string* error) {
    QexKtx ktx;
    const QexKtxHeader& header = ktx.header;
    const QexImage& image = ktx.image;
    if (!QexKtx_ReadHeader(&ktx, BytesOf(file))) {
        *error = "is cut short in the header of a KTX texture";
        return false;
    }
    const std::string refusal = KtxRefusal(&ktx, file);
    document->update({{"format", "KTX"},
                      {"bytes", file.size()},
                      {"byteOrder", ktx.swapped ? "the other" : "little-endian"},
                      {"glType", GlName(header.glType)},
                      {"glTypeSize", header.glTypeSize},
                      {"glFormat", GlName(header.glFormat)},
                      {"glInternalFormat", GlName(header.glInternalFormat)},
                      {"glBaseInternalFormat", GlName(header.glBaseInternalFormat)},
                      {"width", header.width},
                      {"height", header.height},
                      {"depth", header.depth},
                      {"arrayElements", header.arrayElements},
                      {"cubeMap", image.faces == 6},
                      {"faces", image.faces},
                      {"levels", header.levels},
                      {"keyValueBytes", header.keyValueBytes},
                      {"keyValues", KeyValues(file, ktx)},
                      {"levelSizes", LevelSizes(image, !refusal.empty())},
                      {"loads", refusal.empty()},
                      {"problems", Json::array()}});
    Json& problems = (*document)["problems"];
    if (!refusal.empty()) {
        problems.push_back("the engine refuses it: " + refusal);
        return true;
    }
    if (ktx.IsCompressed() && !image.format)
        problems.push_back("only a GL with the extension takes " + GlName(header.glInternalFormat));
    const uint32_t chain = QexImage_ChainLength(header.width, header.height);
    if (!MipmapsFit(header.width, header.height, header.levels ? header.levels : chain))
        problems.push_back(kNoMipmaps);
    else if (image.format && ktx.IsCompressed() && image.levelCount > 1 && image.levelCount < chain)
        problems.push_back(kPartialChain);
    if (image.levelCount < header.levels)
        problems.push_back("level " + std::to_string(image.levelCount) +
                           " or the one behind it is not of its size: it is made from level 0");
    if (header.depth > 1 || header.arrayElements > 0)
        problems.push_back("only the first picture is read of a volume or an array");
    return true;
}
