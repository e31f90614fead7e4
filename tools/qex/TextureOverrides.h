// Textures that a command line gives to materials, as MATERIAL=FILE.
#pragma once

#include <string>
#include <utility>
#include <vector>

using TextureOverrides = std::vector<std::pair<std::string, std::string>>;  // material and file

constexpr char kOverrideHelp[] = "MATERIAL=FILE, a texture for a material, in place of its own; repeatable";

// What is wrong with a text that should be MATERIAL=FILE, FILE being there; empty when nothing is.
std::string CheckOverride(const std::string& text);

TextureOverrides SplitOverrides(const std::vector<std::string>& texts);

// The file for a material, the last one given; empty when there is none.
std::string OverrideOf(const TextureOverrides& overrides, const std::string& material);

// A line about the first override whose material is none of `known`, with those that are; else empty.
std::string UnknownMaterial(const TextureOverrides& overrides, const std::vector<std::string>& known);
