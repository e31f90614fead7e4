// Checks and finds textures that a command line gives to materials.
#include "texture/Overrides.h"

#include <algorithm>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/TextureFiles.h"

namespace {

constexpr size_t kMostListed = 20;

// Names of materials may hold '='; the names of files seldom do.
size_t SplitPoint(const std::string& text) {
    return text.rfind('=');
}

// What is wrong with a text, or nothing.
std::string Check(const std::string& text) {
    const size_t at = SplitPoint(text);
    if (at == std::string::npos || at + 1 == text.size())
        return "'" + text + "' is no texture; expected MATERIAL=FILE";
    const std::string file = text.substr(at + 1);
    return IsRegularFile(file) ? "" : file + ": no such file";
}

}  // namespace

void AddTextureOption(CLI::App* app, std::vector<std::string>* texts) {
    AddTexts(app, "--texture", texts,
             "MATERIAL=FILE, a texture for a material, in place of its own; repeatable")
        ->check(Check);
}

TextureOverrides SplitOverrides(const std::vector<std::string>& texts) {
    TextureOverrides overrides;
    for (const std::string& text : texts) {
        const size_t at = SplitPoint(text);
        overrides.emplace_back(text.substr(0, at), text.substr(at + 1));
    }
    return overrides;
}

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
