// Keeps the engine's log out of the command's output: while an EngineOutput lives, the messages go to it and
// can be asked for afterwards. One may live within another; the inner one keeps its messages to itself.
//
// When the process ends meanwhile (a GL error is fatal), the errors still reach standard error. With
// --verbose all messages go there as they come.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

class EngineOutput {
  public:
    EngineOutput();
    ~EngineOutput();
    EngineOutput(const EngineOutput&) = delete;
    EngineOutput& operator=(const EngineOutput&) = delete;

    // Stops collecting; the messages stay.
    void Stop();

    // The first line of the first error, without "<Function> ", or an empty text.
    std::string FirstError() const;

    // The first lines of the messages that contain `part` there, likewise without function.
    std::vector<std::string> Messages(const std::string& part) const;

  private:
    struct Message {
        int32_t weight;  // QEX_LOG_...
        std::string tag, text;
    };

    static void Take(void* output, int32_t weight, const char* tag, const char* text);
    static void ShowErrorsAtExit();

    static EngineOutput* s_innermost;

    EngineOutput* outer_;
    std::vector<Message> messages_;
    bool active_ = true;
};
