#include <algorithm>

#include "info/Info.h"

namespace {

constexpr size_t kMostPairs = 1000;  // key and value pairs that are listed

// Key and value pairs as far as they are whole; values that are no text are given by their length.
Json KeyValues(const std::vector<uint8_t>& file, const KtxFile& ktx) {
    Json pairs = Json::array();
    const uint64_t end = std::min<uint64_t>(file.size(), kKtxHeaderBytes + uint64_t{ktx.keyValueBytes});
    for (uint64_t at = kKtxHeaderBytes; at + 4 <= end && pairs.size() < kMostPairs;) {
        const uint64_t length = KtxWord(file, ktx, at);
        at += 4;
        if (length > end - at) break;
        const std::string pair(file.begin() + static_cast<long>(at),
                               file.begin() + static_cast<long>(at + length));
        const size_t zero = pair.find('\0');
        if (zero == std::string::npos) break;
        std::string value = pair.substr(zero + 1);
        while (!value.empty() && value.back() == '\0') value.pop_back();
        if (value.find('\0') != std::string::npos) value = std::to_string(length - zero - 1) + " bytes";
        pairs.push_back({{"key", CleanText(pair.substr(0, zero))}, {"value", CleanText(value)}});
        at += (length + 3) / 4 * 4;
    }
    return pairs;
}

}  // namespace

bool DescribeKtx(const std::vector<uint8_t>& file, Json* document, std::string* error) {
    KtxFile ktx;
    if (!ReadKtxHeader(file, &ktx)) {
        *error = "is cut short in the header of a KTX texture";
        return false;
    }
    std::vector<TextureLevel> levels;
    std::string refusal = KtxRefusal(ktx);
    if (refusal.empty()) refusal = FindKtxLevels(file, ktx, &levels);
    Json sizes = Json::array();
    for (const TextureLevel& level : levels)
        sizes.push_back({{"width", level.width}, {"height", level.height}, {"bytes", level.bytes}});
    document->update({{"format", "KTX"},
                      {"bytes", file.size()},
                      {"byteOrder", ktx.swapped ? "the other" : "little-endian"},
                      {"glType", GlName(ktx.glType)},
                      {"glTypeSize", ktx.glTypeSize},
                      {"glFormat", GlName(ktx.glFormat)},
                      {"glInternalFormat", GlName(ktx.glInternalFormat)},
                      {"glBaseInternalFormat", GlName(ktx.glBaseInternalFormat)},
                      {"width", ktx.width},
                      {"height", ktx.height},
                      {"depth", ktx.depth},
                      {"arrayElements", ktx.arrayElements},
                      {"cubeMap", ktx.faces == 6},
                      {"faces", ktx.faces},
                      {"levels", ktx.levels},
                      {"keyValueBytes", ktx.keyValueBytes},
                      {"keyValues", KeyValues(file, ktx)},
                      {"levelSizes", sizes},
                      {"loads", refusal.empty()},
                      {"problems", Json::array()}});
    Json& problems = (*document)["problems"];
    if (!refusal.empty()) {
        problems.push_back("the engine refuses it: " + refusal);
        return true;
    }
    if (ktx.Compressed() && !(ktx.format && ktx.format->Compressed()))
        problems.push_back("only a GL with the extension takes " + GlName(ktx.glInternalFormat));
    const uint32_t chain = FullChain(ktx.width, ktx.height);
    if (!MipmapsFit(ktx.width, ktx.height, ktx.levels ? ktx.levels : chain))
        problems.push_back(kNoMipmaps);
    else if (ktx.format && ktx.Compressed() && levels.size() > 1 && levels.size() < chain)
        problems.push_back(kPartialChain);
    if (levels.size() < ktx.levels)
        problems.push_back("level " + std::to_string(levels.size()) +
                           " or the one behind it is not of its size: it is made from level 0");
    if (ktx.depth > 1 || ktx.arrayElements > 0)
        problems.push_back("only the first picture is read of a volume or an array");
    return true;
}
