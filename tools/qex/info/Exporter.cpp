// Reads the blocks before the scene; options are NAME=VALUE lines.
#include "info/Exporter.h"

#include <cstdio>
#include <filesystem>
#include <memory>
#include <vector>

#include "image/Image.h"

namespace {

constexpr uint32_t kSceneBlock = 1001, kOptionsBlock = 1002, kHistoryBlock = 1003;

}  // namespace

std::optional<bool> ExporterText::FlipsTextureV() const {
    // At the beginning of a line.
    const std::string name = "\nbFlipTextureV=", lines = "\n" + options.value_or("");
    const size_t at = lines.find(name);
    return at == lines.npos ? std::nullopt : std::optional<bool>(lines[at + name.size()] != '0');
}

ExporterText ReadExporterText(const std::string& path) {
    ExporterText found;
    const std::unique_ptr<FILE, int (*)(FILE*)> file(fopen(path.c_str(), "rb"), fclose);
    std::error_code error;
    const uint64_t size = std::filesystem::file_size(path, error);
    std::vector<uint8_t> marker(8);
    while (file && !error && fread(marker.data(), 1, 8, file.get()) == 8) {
        const uint32_t id = QexImage_ReadWord(&marker[0]), length = QexImage_ReadWord(&marker[4]);
        if (id == kSceneBlock || length > size) break;
        if (id != kOptionsBlock && id != kHistoryBlock) {
            if (fseek(file.get(), static_cast<long>(length), SEEK_CUR) != 0) break;
            continue;
        }
        std::string text(length, '\0');
        if (fread(&text[0], 1, length, file.get()) != length) break;
        (id == kHistoryBlock ? found.history : found.options) = text.substr(0, text.find('\0'));
    }
    return found;
}
