#include "convert/Gltf.h"

#include <algorithm>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <vector>

namespace {

constexpr size_t kBinaryHeader =
    20;  // of a .glb file: magic "glTF", version, length, and of its JSON length and type

uint32_t Word(const std::string& bytes, size_t offset) {
    uint32_t word = 0;
    for (size_t i = 4; i-- > 0;) word = word << 8 | static_cast<uint8_t>(bytes[offset + i]);
    return word;
}

// The file's JSON; discarded when there is none.
nlohmann::json ReadJson(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::string bytes(std::istreambuf_iterator<char>(file), {});
    if (bytes.size() > kBinaryHeader && bytes.compare(0, 4, "glTF") == 0) {
        bytes = bytes.substr(kBinaryHeader, Word(bytes, 12));
    }
    return nlohmann::json::parse(bytes, nullptr, false);
}

}  // namespace

bool CheckGltf(const std::string& path, std::string* error) {
    const size_t dot = path.rfind('.');
    std::string extension = dot == std::string::npos ? "" : path.substr(dot);
    for (char& c : extension) c = static_cast<char>(c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c);
    if (extension != ".gltf" && extension != ".glb") return true;
    const nlohmann::json json = ReadJson(path);
    if (!json.is_object() || !json.contains("skins") || !json["skins"].is_array()) return true;
    const nlohmann::json& skins = json["skins"];
    for (size_t i = 0; i < skins.size(); ++i) {
        if (skins[i].is_object() && skins[i].contains("inverseBindMatrices")) continue;
        *error =
            "skin " + std::to_string(i) + " has no inverse bind matrices; one for each joint is expected";
        return false;
    }
    return true;
}
