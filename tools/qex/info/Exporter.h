// Text blocks that exporters put before the scene of a POD file.
#pragma once

#include <optional>
#include <string>

struct ExporterText {
    std::optional<std::string> options;  // lines of NAME=VALUE
    std::optional<std::string> history;  // which exporter it was

    // Whether the exporter turned V over, so that it runs down the pictures; empty when it does not say.
    std::optional<bool> FlipsTextureV() const;
};

ExporterText ReadExporterText(const std::string& path);
