// Parts of paths, and files looked up whatever the case of their names.
#include "common/TextureFiles.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>

namespace fs = std::filesystem;

namespace {

// The entry of a folder called `name`, whatever its case; an exact match goes first.
fs::path FindEntry(const fs::path& directory, const std::string& name) {
    std::error_code ec;
    if (fs::exists(directory / name, ec)) return directory / name;
    const std::string wanted = Lower(name);
    fs::directory_iterator entries(directory, ec);
    for (; !ec && entries != fs::directory_iterator(); entries.increment(ec))
        if (Lower(entries->path().filename().string()) == wanted) return entries->path();
    return {};
}

TextureFile FindInFolder(const std::string& directory, const std::string& name) {
    const std::string base = WithoutExtension(name);
    for (const char* extension : {".pvr", ".ktx", "", ".png", ".jpg", ".jpeg", ".tga", ".bmp"}) {
        const std::string found = FindFile(directory, *extension ? base + extension : name);
        if (found.empty()) continue;
        const std::string kind = Extension(found);
        const bool container = kind == "pvr" || kind == "ktx";
        return {container ? TextureFile::kContainer : TextureFile::kPicture, found};
    }
    return {};
}

}  // namespace

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
    return Lower(extension);
}

std::string AlphaPath(const std::string& path) {
    if (path.size() < 4) return "";
    return path.substr(0, path.size() - 4) + "_a." + path.substr(path.size() - 3);
}

std::string Lower(std::string text) {
    for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

std::string SlashedPath(std::string path) {
    std::replace(path.begin(), path.end(), '\\', '/');
    return path;
}

std::string FindFile(const std::string& directory, const std::string& relative) {
    fs::path found = directory.empty() ? "." : directory;
    for (const fs::path& part : fs::path(relative).relative_path()) {
        if (part.empty() || part == ".") continue;
        found = part == ".." ? found / ".." : FindEntry(found, part.string());
        if (found.empty()) return "";
    }
    if (!IsRegularFile(found.string())) return "";
    return directory.empty() ? found.string().substr(2) : found.string();
}

TextureFile FindTexture(const std::string& directory, const std::string& name) {
    const std::string path = SlashedPath(name);
    const TextureFile found = FindInFolder(directory, path);
    return found.kind == TextureFile::kMissing ? FindInFolder(directory, FileName(path)) : found;
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
