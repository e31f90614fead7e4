// Wrong words are named, with the one among the right ones that is most like them.
#include "common/Usage.h"

#include <algorithm>
#include <cstdio>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"

namespace {

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

// "; did you mean NAME?" where one of the names is much like the word, else nothing.
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

// The long names of an app's options, each with its dashes.
std::vector<std::string> OptionNames(const CLI::App& app) {
    std::vector<std::string> names;
    for (const CLI::Option* option : app.get_options())
        for (const std::string& name : option->get_lnames()) names.push_back("--" + name);
    return names;
}

// The first word behind a verb that looks like an option and is none, with what may have been meant.
std::string UnknownOption(const CLI::App& verb) {
    for (const std::string& word : verb.remaining())
        if (word.size() > 1 && word[0] == '-')
            return "unknown option '" + word + "'" + Suggestion(word, OptionNames(verb));
    return "";
}

std::string UnknownVerb(const CLI::App& app, const std::string& word) {
    std::vector<std::string> verbs;
    for (const CLI::App* sub : app.get_subcommands([](const CLI::App* s) { return !s->get_group().empty(); }))
        verbs.push_back(sub->get_name());
    return (word[0] == '-' ? "unknown option '" : "unknown verb '") + word + "'; expected " +
           Alternatives(verbs) + Suggestion(word, verbs);
}

}  // namespace

// An axis behind --up would be taken for an option of one letter.
std::vector<std::string> Words(int argc, char** argv) {
    std::vector<std::string> words;
    for (int i = argc - 1; i > 0; --i) {
        const std::string word = argv[i];
        if (word == "--up" && !words.empty() && words.back().size() == 2 && words.back()[0] == '-')
            words.back() = word + "=" + words.back();
        else
            words.push_back(word);
    }
    return words;
}

// CLI11 asks first for what is missing, whatever stands in its place: an unknown word or option there is
// named instead of its own first line.
int ReportUsage(const CLI::App& app, const CLI::ParseError& error, int argc, char** argv) {
    std::string text = error.what(), verb;
    text = text.substr(0, text.find('\n'));
    if (dynamic_cast<const CLI::ConversionError*>(&error)) text += "; a number is expected";
    for (const CLI::App* used : app.get_subcommands()) {
        verb = " " + used->get_name();
        const std::string unknown = UnknownOption(*used);
        if (!unknown.empty()) text = unknown;
    }
    if (verb.empty() && argc > 1) text = UnknownVerb(app, argv[1]);
    fprintf(stderr, "qex%s: %s\n", verb.c_str(), text.c_str());
    return 2;
}
