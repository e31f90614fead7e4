#include "common/EngineOutput.h"

#include <cstdio>
#include <cstdlib>
#include <sstream>

#include <unistd.h>

#include "common/CommandLine.h"

namespace {

struct Capture {
    FILE* file;
    int savedOut, savedErr;
};

// The collections, one within the other; their file descriptors are kept here, where the exit handler finds
// them.
std::vector<Capture> g_captures;

// Ends the innermost one.
std::string ReadAndRestore() {
    const Capture capture = g_captures.back();
    g_captures.pop_back();
    fflush(stdout);
    fflush(stderr);
    dup2(capture.savedOut, STDOUT_FILENO);
    dup2(capture.savedErr, STDERR_FILENO);
    close(capture.savedOut);
    close(capture.savedErr);
    rewind(capture.file);
    std::string text;
    char buffer[4096];
    for (size_t n; (n = fread(buffer, 1, sizeof buffer, capture.file)) > 0;) text.append(buffer, n);
    fclose(capture.file);
    // Past the collections that this one lies in: they would show it once more.
    const int error = g_captures.empty() ? STDERR_FILENO : g_captures.front().savedErr;
    if (GetTalk().verbose) dprintf(error, "%s", text.c_str());
    return text;
}

// The process ends inside the engine: say why.
void ShowErrorsAtExit() {
    while (!g_captures.empty()) {
        std::istringstream lines(ReadAndRestore());
        for (std::string line; std::getline(lines, line);)
            if (line.rfind("E/", 0) == 0 && !GetTalk().verbose) fprintf(stderr, "%s\n", line.c_str());
    }
}

// "E/Qex: <Function> text" to "text".
std::string Strip(const std::string& line) {
    size_t at = line.find(": ");
    std::string text = at == std::string::npos ? line : line.substr(at + 2);
    if (!text.empty() && text[0] == '<' && (at = text.find("> ")) != std::string::npos)
        text = text.substr(at + 2);
    return text;
}

}  // namespace

EngineOutput::EngineOutput() {
    static const bool registered = atexit(ShowErrorsAtExit) == 0;
    (void)registered;
    fflush(stdout);
    fflush(stderr);
    FILE* file = tmpfile();
    if (!file) return;
    g_captures.push_back({file, dup(STDOUT_FILENO), dup(STDERR_FILENO)});
    dup2(fileno(file), STDOUT_FILENO);
    dup2(fileno(file), STDERR_FILENO);
    active_ = true;
}

EngineOutput::~EngineOutput() {
    Stop();
}

void EngineOutput::Stop() {
    if (!active_) return;
    active_ = false;
    text_ = ReadAndRestore();
}

std::string EngineOutput::FirstError() const {
    std::istringstream lines(text_);
    for (std::string line; std::getline(lines, line);)
        if (line.rfind("E/", 0) == 0) return Strip(line);
    return "";
}

std::vector<std::string> EngineOutput::Messages(const std::string& part) const {
    std::vector<std::string> found;
    std::istringstream lines(text_);
    for (std::string line; std::getline(lines, line);) {
        const bool message = line.rfind("I/", 0) == 0 || line.rfind("E/", 0) == 0;
        if (message && line.find(part) != std::string::npos) found.push_back(Strip(line));
    }
    return found;
}
