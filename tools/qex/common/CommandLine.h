// What the command lines of the verbs have in common.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
class Validator;
}  // namespace CLI

// How much the command says.
struct Talk {
    bool quiet = false;    // nothing but warnings and errors
    bool verbose = false;  // also what the engine and the importer log
};
Talk& GetTalk();

// The long names of an app's options, each with its dashes.
std::vector<std::string> OptionNames(const CLI::App& app);

// "; did you mean NAME?" where one of the names is much like the word, else nothing.
std::string Suggestion(const std::string& word, const std::vector<std::string>& names);

// Numbers with `separator` between them; none when a part of the text is no finite number.
std::vector<double> ParseNumbers(const std::string& text, char separator = ',');

// A check for options that take a number.
CLI::Validator NumberFrom(double least, double most);

// Reads RRGGBB in hexadecimal.
bool ParseHexColour(const std::string& text, unsigned* colour);

// An option whose text is read by `parse`, which returns what is wrong with it, or an empty text. May be
// given up to `most` times.
CLI::Option* AddParsed(CLI::App* app, const std::string& name, const std::string& help,
                       const std::function<std::string(const std::string& text)>& parse, int most = 1);

// Texts, one each time that the option is given.
CLI::Option* AddTexts(CLI::App* app, const std::string& name, std::vector<std::string>* texts,
                      const std::string& help);
