// What the command lines of the verbs have in common: options whose texts are checked and turned into values
// where they are declared.
#pragma once

#include <cfloat>
#include <functional>
#include <string>
#include <vector>

#include "common/Talk.h"
#include "common/UpAxis.h"

namespace CLI {
class App;
class Option;
class Validator;
}  // namespace CLI

constexpr int kMostRepeats = 1000;  // of an option that may be given several times

using Numbers = std::vector<double>;

struct NumberRange {
    enum Kind { kAny, kWhole, kColour };  // the last is RRGGBB in hexadecimal

    Kind kind = kAny;
    double least = -DBL_MAX, most = DBL_MAX;
    double otherwise = 0;  // taken where the number is left out
};

// The numbers in an option's text: all of them, or the first `needed` ones.
struct NumberShape {
    char separator;
    std::vector<NumberRange> ranges;
    size_t needed;
    const char* fault;                       // behind a text of another shape: "is no size; expected ..."
    bool (*fits)(const Numbers&) = nullptr;  // whether they go together; null: always
};

// Reads as many numbers as the shape has. Returns what is wrong with the text, or an empty text.
std::string ReadNumbers(const std::string& text, const NumberShape& shape, Numbers* numbers);

// Checks for options that take one number.
CLI::Validator NumberFrom(double least, double most);
CLI::Validator WholeNumberFrom(double least, double most);

// An option whose text is read by `parse`, which returns what is wrong with it, or an empty text. May be
// given up to `most` times.
CLI::Option* AddParsed(CLI::App* app, const std::string& name, const std::string& help,
                       const std::function<std::string(const std::string& text)>& parse, int most = 1);

// An option whose text is numbers.
CLI::Option* AddNumbers(CLI::App* app, const std::string& name, const std::string& help,
                        const NumberShape& shape, const std::function<void(const Numbers&)>& take,
                        int most = 1);

// An option whose text is one of some names, in any case; `take` gets its index. `what` they are is said of
// other texts.
CLI::Option* AddChoice(CLI::App* app, const std::string& name, const std::string& help,
                       const std::string& what, const std::vector<std::string>& names,
                       const std::function<void(size_t)>& take);

// "a, b or c".
std::string Alternatives(const std::vector<std::string>& names);

// Texts, one each time that the option is given.
CLI::Option* AddTexts(CLI::App* app, const std::string& name, std::vector<std::string>* texts,
                      const std::string& help);

// --up, which names an axis.
CLI::Option* AddUpAxis(CLI::App* app, const std::string& help, UpAxis* up);
