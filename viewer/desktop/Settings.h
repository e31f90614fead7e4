// What the viewer remembers from one time to the next.
#pragma once

#include <string>
#include <vector>

struct Settings {
    int width = 1280, height = 800;
    bool inspector = true;
    std::vector<std::string> recent;  // the newest first

    void Remember(const std::string& path);
};

// $XDG_CONFIG_HOME/qex/view.json, else below ~/.config; empty without a home.
std::string SettingsPath();
// The settings of a file, and `problem` if it is there and cannot be used.
Settings LoadSettings(const std::string& path, std::string* problem);
bool SaveSettings(const Settings& settings, const std::string& path, std::string* problem);
