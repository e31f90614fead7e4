// The words of a command line as CLI11 wants them, and what is said of wrong ones.
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
class ParseError;
}  // namespace CLI

// The last word first, without the command's own name.
std::vector<std::string> Words(int argc, char** argv);

// One line on standard error that says what is wrong, and what may have been meant. Returns the exit
// status, 2.
int ReportUsage(const CLI::App& app, const CLI::ParseError& error, int argc, char** argv);
