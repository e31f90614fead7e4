// The log of hosts that are not Android: lines on standard error.
#include "base/AndroidLog.h"

#if !defined(__ANDROID__)
#include "base/Formatted.h"

namespace {

// Indexed by priority, as in the one-letter form of the platform's own log viewer.
constexpr char kPriorityLetters[] = "??VDIWEF";

char PriorityLetter(int priority) {
    return priority >= 0 && priority < 8 ? kPriorityLetters[priority] : '?';
}

}  // namespace

// One call per line, so that lines of several writers to the same terminal do not mix.
extern "C" int __android_log_vprint(int priority, const char* tag, const char* format, va_list arguments) {
    QexFormatted text(format, arguments);
    if (text.Failed()) return -1;
    text.TrimNewline();
    const int written = fprintf(stderr, "%c/%s: %s\n", PriorityLetter(priority), tag ? tag : "", text.Text());
    return written < 0 ? -1 : 1;
}
#endif
