// What a conversion has to say: warnings on standard error as they arise, counted for the summary; and
// how it ends.
#pragma once

#include <string>

#include "common/CommandLine.h"

enum ExitStatus { kDone = 0, kBadInput = 1, kBadArgument = 2 };

class ConvertLog {
  public:
    explicit ConvertLog(std::string file) : file_(std::move(file)) {}

    void Warn(const std::string& text) {
        ++warnings_;
        Say("convert", file_ + ": warning: " + text);
    }
    void Error(const std::string& text) const { Say("convert", file_ + ": " + text); }
    int Warnings() const { return warnings_; }

  private:
    std::string file_;
    int warnings_ = 0;
};

inline std::string NeedsMoreMemory(int megabytes) {
    return "needs more than " + std::to_string(megabytes) + " MB of memory; --memory allows more";
}
