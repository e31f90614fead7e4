// Finds textures that a command line gives to materials.
#include "texture/Overrides.h"

#include <algorithm>

namespace {

constexpr size_t kMostListed = 20;

}  // namespace

std::string OverrideOf(const TextureOverrides& overrides, const std::string& material) {
    const auto found = std::find_if(overrides.rbegin(), overrides.rend(),
                                    [&](const auto& one) { return one.first == material; });
    return found == overrides.rend() ? "" : found->second;
}

std::string UnknownMaterial(const TextureOverrides& overrides, const std::vector<std::string>& known) {
    for (const auto& [material, file] : overrides) {
        if (std::find(known.begin(), known.end(), material) != known.end()) continue;
        std::string list;
        for (size_t i = 0; i < std::min(known.size(), kMostListed); ++i) list += (i ? ", " : "") + known[i];
        if (known.size() > kMostListed)
            list += " and " + std::to_string(known.size() - kMostListed) + " more";
        return "no material '" + material + "'; the scene has " + (known.empty() ? "none" : list);
    }
    return "";
}
