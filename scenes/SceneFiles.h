// The files that samples load, as artists' tools would have written them.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

// Writes a file; the program ends where it cannot.
void WriteFile(const std::string& path, const std::vector<uint8_t>& bytes);

// Each writes its kind of files; `folder` ends with a slash.
void WriteTextures(const std::string& folder);
void WriteVillageTextures(const std::string& folder);
void WriteEmitters(const std::string& folder);
