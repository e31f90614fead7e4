#include "TextureFiles.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>

bool IsRegularFile(const std::string& path) {
    std::error_code error;
    return std::filesystem::is_regular_file(path, error);
}

std::string Directory(const std::string& path) {
    const size_t slash = path.find_last_of('/');
    return slash == std::string::npos ? "" : path.substr(0, slash + 1);
}

std::string FileName(const std::string& path) {
    return path.substr(Directory(path).size());
}

std::string WithoutExtension(const std::string& path) {
    const size_t dot = path.find_last_of('.');
    return dot == std::string::npos || dot < Directory(path).size() ? path : path.substr(0, dot);
}

std::string Extension(const std::string& path) {
    std::string extension = path.substr(WithoutExtension(path).size());
    if (!extension.empty()) extension.erase(0, 1);
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return extension;
}

std::string AlphaPath(const std::string& path) {
    if (path.size() < 4) return "";
    return path.substr(0, path.size() - 4) + "_a." + path.substr(path.size() - 3);
}

TextureFile FindTexture(const std::string& path) {
    const std::string base = WithoutExtension(path);
    for (const char* container : {".pvr", ".ktx"})
        if (IsRegularFile(base + container)) return {TextureFile::kContainer, base + container};
    if (IsRegularFile(path)) return {TextureFile::kPicture, path};
    for (const char* picture : {".png", ".jpg", ".jpeg", ".tga", ".bmp"})
        if (IsRegularFile(base + picture)) return {TextureFile::kPicture, base + picture};
    return {};
}

bool ReadFileBytes(const std::string& path, size_t most, std::vector<uint8_t>* bytes, std::string* error) {
    bytes->clear();
    if (!IsRegularFile(path)) {
        *error = "is not a file that can be read";
        return false;
    }
    const std::unique_ptr<FILE, int (*)(FILE*)> file(fopen(path.c_str(), "rb"), fclose);
    if (!file) {
        *error = std::string("cannot be opened: ") + strerror(errno);
        return false;
    }
    uint8_t chunk[65536];
    while (bytes->size() < most) {
        const size_t got = fread(chunk, 1, std::min(sizeof chunk, most - bytes->size()), file.get());
        if (!got) break;
        bytes->insert(bytes->end(), chunk, chunk + got);
    }
    if (!ferror(file.get())) return true;
    *error = std::string("cannot be read: ") + strerror(errno);
    return false;
}
