// Keeps the engine's own output out of the command's: while an EngineOutput lives, what is written to
// standard output and standard error is collected, and its lines can be asked for afterwards. One may live
// within another; the inner one keeps its lines to itself.
//
// The engine prints progress lines on standard output, and messages on standard error with "I/TAG: " or
// "E/TAG: " in front. When the process ends meanwhile (a GL error is fatal), the error lines still reach
// standard error. With --verbose all lines go there once they are collected.
#pragma once

#include <string>
#include <vector>

class EngineOutput {
  public:
    EngineOutput();
    ~EngineOutput();
    EngineOutput(const EngineOutput&) = delete;
    EngineOutput& operator=(const EngineOutput&) = delete;

    // Stops collecting; the lines stay.
    void Stop();

    // The first error line without its tag and without "<Function> ", or an empty text.
    std::string FirstError() const;

    // The messages (not the progress lines) that contain `part`, likewise without tag and function.
    std::vector<std::string> Messages(const std::string& part) const;

  private:
    std::string text_;
    bool active_ = false;
};
