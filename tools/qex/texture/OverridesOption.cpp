// The command line's textures for materials.
#include "common/CommandLine.h"
#include "common/TextureFiles.h"
#include "texture/Overrides.h"

namespace {

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
