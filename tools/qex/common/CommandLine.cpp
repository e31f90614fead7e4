// Options with typed values.
#include "common/CommandLine.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include <CLI/CLI.hpp>

#include "common/TextureFiles.h"

namespace {

// What CLI11 knows an option by that is read here: one text each time that it is given.
CLI::Option* OneText(CLI::Option* option, int most) {
    return option->type_size(1)->expected(1, most)->allow_extra_args(false);
}

std::vector<std::string> Split(const std::string& text, char separator) {
    std::vector<std::string> parts;
    for (size_t start = 0; start <= text.size();) {
        const size_t end = std::min(text.find(separator, start), text.size());
        parts.push_back(text.substr(start, end - start));
        start = end + 1;
    }
    return parts;
}

bool ReadNumber(const std::string& text, const NumberRange& range, double* number) {
    const bool colour = range.kind == NumberRange::kColour;
    if (colour && (text.size() != 6 || text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos))
        return false;
    char* behind = nullptr;
    *number =
        colour ? static_cast<double>(strtoul(text.c_str(), &behind, 16)) : strtod(text.c_str(), &behind);
    if (text.empty() || *behind || !(*number >= range.least && *number <= range.most)) return false;
    return range.kind != NumberRange::kWhole || *number == std::floor(*number);
}

CLI::Validator OneNumber(const char* kind, const NumberRange& range) {
    char words[64];
    snprintf(words, sizeof words, "%.10g to %.10g", range.least, range.most);
    const std::string fault = std::string("' is no ") + kind + " from " + words;
    return CLI::Validator(
        [=](std::string& text) -> std::string {
            double number;
            return ReadNumber(text, range, &number) ? "" : "'" + text + fault;
        },
        words);
}

}  // namespace

std::string ReadNumbers(const std::string& text, const NumberShape& shape, Numbers* numbers) {
    const std::vector<std::string> parts = Split(text, shape.separator);
    bool good = parts.size() == shape.needed || parts.size() == shape.ranges.size();
    numbers->clear();
    for (size_t i = 0; good && i < shape.ranges.size(); ++i) {
        numbers->push_back(shape.ranges[i].otherwise);
        if (i < parts.size()) good = ReadNumber(parts[i], shape.ranges[i], &numbers->back());
    }
    good = good && (!shape.fits || shape.fits(*numbers));
    return good ? "" : "'" + text + "' " + shape.fault;
}

CLI::Validator NumberFrom(double least, double most) {
    return OneNumber("number", {NumberRange::kAny, least, most});
}

CLI::Validator WholeNumberFrom(double least, double most) {
    return OneNumber("whole number", {NumberRange::kWhole, least, most});
}

CLI::Option* AddParsed(CLI::App* app, const std::string& name, const std::string& help,
                       const std::function<std::string(const std::string& text)>& parse, int most) {
    const auto parseAll = [=](const std::vector<std::string>& texts) {
        for (const std::string& text : texts) {
            const std::string problem = parse(text);
            if (!problem.empty()) throw CLI::ValidationError(name, problem);
        }
    };
    return OneText(app->add_option_function<std::vector<std::string>>(name, parseAll, help), most);
}

CLI::Option* AddNumbers(CLI::App* app, const std::string& name, const std::string& help,
                        const NumberShape& shape, const std::function<void(const Numbers&)>& take, int most) {
    const auto parse = [=](const std::string& text) {
        Numbers numbers;
        const std::string problem = ReadNumbers(text, shape, &numbers);
        if (problem.empty()) take(numbers);
        return problem;
    };
    return AddParsed(app, name, help, parse, most);
}

CLI::Option* AddChoice(CLI::App* app, const std::string& name, const std::string& help,
                       const std::string& what, const std::vector<std::string>& names,
                       const std::function<void(size_t)>& take) {
    const auto parse = [=](const std::string& text) -> std::string {
        const auto found = std::find(names.begin(), names.end(), Lower(text));
        if (found == names.end()) return "'" + text + "' is no " + what + "; expected " + Alternatives(names);
        take(static_cast<size_t>(found - names.begin()));
        return "";
    };
    std::string braced;
    for (const std::string& choice : names) braced += (braced.empty() ? "{" : ",") + choice;
    return AddParsed(app, name, help, parse)->type_name(braced + "}");
}

CLI::Option* AddTexts(CLI::App* app, const std::string& name, std::vector<std::string>* texts,
                      const std::string& help) {
    return OneText(app->add_option(name, *texts, help), kMostRepeats);
}

std::string Alternatives(const std::vector<std::string>& names) {
    std::string text;
    for (size_t i = 0; i < names.size(); ++i)
        text += (i == 0 ? "" : i + 1 == names.size() ? " or " : ", ") + names[i];
    return text;
}

CLI::Option* AddUpAxis(CLI::App* app, const std::string& help, UpAxis* up) {
    return AddChoice(app, "--up", help, "axis", {std::begin(kUpAxisNames), std::end(kUpAxisNames)},
                     [up](size_t index) { *up = static_cast<UpAxis>(index); });
}
