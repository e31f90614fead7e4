// What the command lines of the verbs have in common.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
}  // namespace CLI

// Numbers with `separator` between them; none when a part of the text is no finite number.
std::vector<double> ParseNumbers(const std::string& text, char separator = ',');

// Reads RRGGBB in hexadecimal.
bool ParseHexColour(const std::string& text, unsigned* colour);

// An option whose text is read by `parse`, which returns what is wrong with it, or an empty text. May be
// given up to `most` times.
CLI::Option* AddParsed(CLI::App* app, const std::string& name, const std::string& help,
                       const std::function<std::string(const std::string& text)>& parse, int most = 1);

// Texts, one each time that the option is given.
CLI::Option* AddTexts(CLI::App* app, const std::string& name, std::vector<std::string>* texts,
                      const std::string& help);
