// Files that others made. QEX_REAL_FILES names a folder with scenes/ and textures/; without it there are
// none.
#pragma once

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

// Those below a subfolder that have the extension, largest first.
inline std::vector<std::string> RealFilesIn(const std::string& subfolder, const std::string& extension) {
    std::vector<std::string> files;
    const char* root = std::getenv("QEX_REAL_FILES");
    std::error_code error;
    if (!root) return files;
    for (const auto& entry :
         std::filesystem::recursive_directory_iterator(std::filesystem::path(root) / subfolder, error))
        if (entry.path().extension() == extension) files.push_back(entry.path().string());
    std::sort(files.begin(), files.end(), [](const std::string& a, const std::string& b) {
        return std::filesystem::file_size(a) > std::filesystem::file_size(b);
    });
    return files;
}
