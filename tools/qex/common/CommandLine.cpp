#include "common/CommandLine.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include <CLI/CLI.hpp>

namespace {

constexpr int kMostTexts = 1000;

// The least number of letters to insert, leave out or replace, or of neighbours to swap.
size_t Distance(const std::string& a, const std::string& b) {
    std::vector<std::vector<size_t>> least(a.size() + 1, std::vector<size_t>(b.size() + 1));
    for (size_t i = 0; i <= a.size(); ++i)
        for (size_t k = 0; k <= b.size(); ++k) {
            if (i == 0 || k == 0) {
                least[i][k] = i + k;
                continue;
            }
            least[i][k] = std::min(
                {least[i - 1][k] + 1, least[i][k - 1] + 1, least[i - 1][k - 1] + (a[i - 1] != b[k - 1])});
            if (i > 1 && k > 1 && a[i - 1] == b[k - 2] && a[i - 2] == b[k - 1])
                least[i][k] = std::min(least[i][k], least[i - 2][k - 2] + 1);
        }
    return least[a.size()][b.size()];
}

}  // namespace

Talk& GetTalk() {
    static Talk talk;
    return talk;
}

std::vector<std::string> OptionNames(const CLI::App& app) {
    std::vector<std::string> names;
    for (const CLI::Option* option : app.get_options())
        for (const std::string& name : option->get_lnames()) names.push_back("--" + name);
    return names;
}

std::string Suggestion(const std::string& word, const std::vector<std::string>& names) {
    const std::string name = word.substr(0, word.find('='));
    std::string nearest;
    size_t least = std::max<size_t>(1, name.size() / 3) + 1;
    for (const std::string& candidate : names) {
        const size_t distance = Distance(name, candidate);
        if (distance < least) least = distance, nearest = candidate;
    }
    return nearest.empty() ? "" : "; did you mean " + nearest + "?";
}

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

CLI::Validator NumberFrom(double least, double most) {
    char range[64];
    snprintf(range, sizeof range, "%.10g to %.10g", least, most);
    const std::string words = range;
    return CLI::Validator(
        [=](std::string& text) -> std::string {
            const std::vector<double> n = ParseNumbers(text);
            if (n.size() == 1 && n[0] >= least && n[0] <= most) return "";
            return "'" + text + "' is no number from " + words;
        },
        words);
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
