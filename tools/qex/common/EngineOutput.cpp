// The log is taken by a sink of the innermost output.
#include "common/EngineOutput.h"

#include <cstdio>
#include <cstdlib>

#include "common/Talk.h"
#include "Qex.h"

namespace {

void Show(int32_t weight, const std::string& tag, const std::string& text) {
    const char letter = weight == QEX_LOG_ERROR ? 'E' : weight == QEX_LOG_WARNING ? 'W' : 'I';
    fprintf(stderr, "%c/%s: %s\n", letter, tag.c_str(), text.c_str());
}

std::string FirstLine(const std::string& text) {
    return text.substr(0, text.find('\n'));
}

// "<Function> text" to "text".
std::string Strip(const std::string& line) {
    const size_t end = line.find("> ");
    return line[0] == '<' && end != std::string::npos ? line.substr(end + 2) : line;
}

}  // namespace

EngineOutput* EngineOutput::s_innermost;

void EngineOutput::Take(void* output, int32_t weight, const char* tag, const char* text) {
    if (GetTalk().verbose) Show(weight, tag, text);
    static_cast<EngineOutput*>(output)->messages_.push_back({weight, tag, text});
}

// The process ends inside the engine: say why.
void EngineOutput::ShowErrorsAtExit() {
    for (; s_innermost && !GetTalk().verbose; s_innermost = s_innermost->outer_)
        for (const Message& message : s_innermost->messages_)
            if (message.weight == QEX_LOG_ERROR) Show(message.weight, message.tag, message.text);
}

EngineOutput::EngineOutput() : outer_(s_innermost) {
    static const bool registered = atexit(ShowErrorsAtExit) == 0;
    (void)registered;
    s_innermost = this;
    QexLog_SetSink(Take, this);
}

EngineOutput::~EngineOutput() {
    Stop();
}

void EngineOutput::Stop() {
    if (!active_) return;
    active_ = false;
    s_innermost = outer_;
    QexLog_SetSink(outer_ ? Take : nullptr, outer_);
}

std::string EngineOutput::FirstError() const {
    for (const Message& message : messages_)
        if (message.weight == QEX_LOG_ERROR) return Strip(FirstLine(message.text));
    return "";
}

std::vector<std::string> EngineOutput::Messages(const std::string& part) const {
    std::vector<std::string> found;
    for (const Message& message : messages_) {
        const std::string line = FirstLine(message.text);
        if (line.find(part) != std::string::npos) found.push_back(Strip(line));
    }
    return found;
}
