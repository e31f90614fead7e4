// Checks and finds textures that a command line gives to materials.
#include "texture/Overrides.h"

#include <algorithm>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/TextureFiles.h"

namespace {

constexpr size_t kMostListed = 20;

// Names of materials may hold '='; the names of files seldom do.
std::string Parse(const std::string& text, TextureOverrides* overrides) {
    const size_t at = text.rfind('=');
    if (at == std::string::npos || at + 1 == text.size())
        return "'" + text + "' is no texture; expected MATERIAL=FILE";
    const std::string file = text.substr(at + 1);
    overrides->emplace_back(text.substr(0, at), file);
    return IsRegularFile(file) ? "" : file + ": no such file";
}

}  // namespace

void AddTextureOption(CLI::App* app, TextureOverrides* overrides) {
    AddParsed(
        app, "--texture", "MATERIAL=FILE, a texture for a material, in place of its own; repeatable",
        [=](const std::string& text) { return Parse(text, overrides); }, kMostRepeats);
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
