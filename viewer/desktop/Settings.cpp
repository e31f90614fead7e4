// A JSON object.
#include "desktop/Settings.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>

#include <nlohmann/json.hpp>

#include "common/OutputFile.h"

namespace {

using Json = nlohmann::json;

constexpr size_t kMostRecent = 12;

int Side(const Json& json, const char* name, int otherwise) {
    const auto found = json.find(name);
    return found != json.end() && found->is_number_integer() ? std::clamp(found->get<int>(), 64, 16384)
                                                             : otherwise;
}

}  // namespace

void Settings::Remember(const std::string& path) {
    std::error_code error;
    const std::string whole = std::filesystem::absolute(path, error).string();
    if (error) return;
    recent.erase(std::remove(recent.begin(), recent.end(), whole), recent.end());
    recent.insert(recent.begin(), whole);
    if (recent.size() > kMostRecent) recent.resize(kMostRecent);
}

std::string SettingsPath() {
    const char* config = getenv("XDG_CONFIG_HOME");
    const char* home = getenv("HOME");
    if (config && config[0] == '/') return std::string(config) + "/qex/view.json";
    return home && *home ? std::string(home) + "/.config/qex/view.json" : "";
}

Settings LoadSettings(const std::string& path, std::string* problem) {
    Settings settings;
    std::ifstream file(path);
    if (path.empty() || !file) return settings;
    const Json json = Json::parse(file, nullptr, false);
    if (!json.is_object()) {
        *problem = path + ": is no JSON object and is not used";
        return settings;
    }
    settings.width = Side(json, "width", settings.width);
    settings.height = Side(json, "height", settings.height);
    const auto inspector = json.find("inspector"), recent = json.find("recent");
    if (inspector != json.end() && inspector->is_boolean()) settings.inspector = inspector->get<bool>();
    if (recent == json.end() || !recent->is_array()) return settings;
    for (const Json& one : *recent)
        if (one.is_string() && settings.recent.size() < kMostRecent)
            settings.recent.push_back(one.get<std::string>());
    return settings;
}

bool SaveSettings(const Settings& settings, const std::string& path, std::string* problem) {
    if (path.empty()) return true;
    std::error_code ignored;
    std::filesystem::create_directories(std::filesystem::path(path).parent_path(), ignored);
    const Json json = {{"width", settings.width},
                       {"height", settings.height},
                       {"inspector", settings.inspector},
                       {"recent", settings.recent}};
    const std::string text = json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
    return WriteOutput(path, text.data(), text.size(), problem);
}
