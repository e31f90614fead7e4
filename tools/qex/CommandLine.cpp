#include "CommandLine.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>

#include <CLI/CLI.hpp>

namespace {

constexpr int kMostTexts = 1000;

}  // namespace

std::vector<double> ParseNumbers(const std::string& text, char separator) {
    std::vector<double> numbers;
    for (size_t start = 0; start <= text.size();) {
        const size_t end = std::min(text.find(separator, start), text.size());
        const std::string part = text.substr(start, end - start);
        char* behind = nullptr;
        numbers.push_back(strtod(part.c_str(), &behind));
        if (part.empty() || *behind || !std::isfinite(numbers.back())) return {};
        start = end + 1;
    }
    return numbers;
}

bool ParseHexColour(const std::string& text, unsigned* colour) {
    if (text.size() != 6 || text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos)
        return false;
    *colour = static_cast<unsigned>(std::stoul(text, nullptr, 16));
    return true;
}

CLI::Option* AddParsed(CLI::App* app, const std::string& name, const std::string& help,
                       const std::function<std::string(const std::string& text)>& parse, int most) {
    return app
        ->add_option_function<std::vector<std::string>>(
            name,
            [=](const std::vector<std::string>& texts) {
                for (const std::string& text : texts) {
                    const std::string problem = parse(text);
                    if (!problem.empty()) throw CLI::ValidationError(name, problem);
                }
            },
            help)
        ->type_size(1)
        ->expected(1, most)
        ->allow_extra_args(false);
}

CLI::Option* AddTexts(CLI::App* app, const std::string& name, std::vector<std::string>* texts,
                      const std::string& help) {
    return app->add_option(name, *texts, help)
        ->type_size(1)
        ->expected(1, kMostTexts)
        ->allow_extra_args(false);
}
