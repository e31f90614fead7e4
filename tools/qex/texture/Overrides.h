// Textures that a command line gives to materials, as MATERIAL=FILE.
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace CLI {
class App;
}

using TextureOverrides = std::vector<std::pair<std::string, std::string>>;  // material and file

// Adds --texture, which may be given several times. The files have to be there.
void AddTextureOption(CLI::App* app, TextureOverrides* overrides);

// The file for a material, the last one given; empty when there is none.
std::string OverrideOf(const TextureOverrides& overrides, const std::string& material);

// A line about the first override whose material is none of `known`, with those that are; else empty.
std::string UnknownMaterial(const TextureOverrides& overrides, const std::vector<std::string>& known);
