// A scene of another format, converted by a process of its own while the window lives on.
#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

class Conversion {
  public:
    Conversion() = default;
    ~Conversion();
    Conversion(const Conversion&) = delete;
    Conversion& operator=(const Conversion&) = delete;

    // Starts, with the animation of that index or the first; one that is at work is ended. False, and why,
    // when it cannot.
    bool Start(const std::string& input, std::optional<size_t> clip, std::string* problem);
    enum class State { kNone, kAtWork, kDone, kFailed };
    // Asks how it goes. kDone: Output() is there until the next start; kFailed: what was said about it.
    State Poll(std::string* problem);
    bool AtWork() const { return child_ > 0; }
    std::string Output() const { return folder_ + "/scene.pod"; }
    const std::string& Input() const { return input_; }
    // The names of the animations that the input has, once it is done.
    std::vector<std::string> Clips() const;

  private:
    void Stop();

    std::string input_, folder_;
    pid_t child_ = 0;
};
