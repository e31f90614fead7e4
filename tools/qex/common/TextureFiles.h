// Which file stands for a texture name of a scene, and what is in a file.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

struct TextureFile {
    enum Kind { kMissing, kContainer, kPicture };  // container: PVR or KTX, which the engine loads itself
    Kind kind = kMissing;
    std::string path;  // of the file that was found
};

// Looks for a scene's texture with the extension pvr, then ktx, then as it is called, then with the extension
// of another picture format; first at its path below the directory, then, by the last part of that, in the
// directory itself. Paths may have either slash, and case does not count.
TextureFile FindTexture(const std::string& directory, const std::string& name);

// The regular file at a path below a directory ("" for the working one), whatever the case of its parts;
// empty when there is none.
std::string FindFile(const std::string& directory, const std::string& relative);

// "_a" before the last four characters, as the engine names alpha textures.
std::string AlphaPath(const std::string& path);

std::string FileName(const std::string& path);
std::string Directory(const std::string& path);  // with its separator; empty for a bare name
std::string Extension(const std::string& path);  // lower case, without the dot
std::string Lower(std::string text);             // of ASCII letters
std::string SlashedPath(std::string path);       // backslashes become slashes
std::string WithoutExtension(const std::string& path);
bool IsRegularFile(const std::string& path);

// The first `most` bytes of a file; false, with the reason, when it cannot be read.
bool ReadFileBytes(const std::string& path, size_t most, std::vector<uint8_t>* bytes, std::string* error);
