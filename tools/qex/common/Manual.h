// Manual pages and shell completion, made from the options that --help shows.
#pragma once

#include <string>

namespace CLI {
class App;
}

// A script for bash that completes verbs, options, their values where there is a choice, and file names.
std::string BashCompletion(const CLI::App& command);

// Prints the page of the command, or of a verb, as roff for man. Returns the exit status, 2 for an unknown
// verb.
int PrintManual(const CLI::App& command, const std::string& verb);

// Prints a text on standard output. Returns 0.
int Print(const std::string& text);
