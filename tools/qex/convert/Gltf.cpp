// What the importer would crash on is found in the JSON part of the file beforehand.
#include "convert/Gltf.h"

#include <fstream>
#include <iterator>

#include <nlohmann/json.hpp>

#include "common/TextureFiles.h"

namespace {

// Of a .glb file: magic "glTF", version, length, and of its JSON length and type.
constexpr size_t kBinaryHeader = 20;

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
    const std::string extension = Extension(path);
    if (extension != "gltf" && extension != "glb") return true;
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
