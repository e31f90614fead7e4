// What the verbs say on standard error, and how much.
#pragma once

#include <string>

// How much the command says.
struct Talk {
    bool quiet = false;    // nothing but warnings and errors
    bool verbose = false;  // also what the engine and the importer log
};
Talk& GetTalk();

// "qex VERB: TEXT" on standard error. Fail returns the status.
void Say(const std::string& verb, const std::string& text);
int Fail(const std::string& verb, const std::string& text, int status);
