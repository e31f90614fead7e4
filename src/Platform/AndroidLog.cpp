#include "AndroidLog.h"

#if !defined(__ANDROID__)
#include <cstdio>

#include "QexMemory.h"

namespace {

// Indexed by priority, as in the one-letter form of the platform's own log viewer.
constexpr char kPriorityLetters[] = "??VDIWEF";

char PriorityLetter(int priority) {
    return priority >= 0 && priority < 8 ? kPriorityLetters[priority] : '?';
}

// One call per line, so that lines of several writers to the same terminal do not mix.
int WriteLine(int priority, const char* tag, const char* text, size_t length) {
    const bool ended = length > 0 && text[length - 1] == '\n';
    const int written =
        fprintf(stderr, "%c/%s: %s%s", PriorityLetter(priority), tag ? tag : "", text, ended ? "" : "\n");
    return written < 0 ? -1 : 1;
}

}  // namespace

extern "C" int __android_log_vprint(int priority, const char* tag, const char* format, va_list arguments) {
    char line[512];
    va_list copy;
    va_copy(copy, arguments);
    const int needed = vsnprintf(line, sizeof line, format, copy);
    va_end(copy);
    if (needed < 0) return -1;
    const size_t length = static_cast<size_t>(needed);
    if (length < sizeof line) return WriteLine(priority, tag, line, length);

    QexScratch<char> text(uint64_t{length} + 1);
    if (!text) return WriteLine(priority, tag, line, sizeof line - 1);
    vsnprintf(text.Get(), length + 1, format, arguments);
    return WriteLine(priority, tag, text.Get(), length);
}

extern "C" int __android_log_print(int priority, const char* tag, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const int result = __android_log_vprint(priority, tag, format, arguments);
    va_end(arguments);
    return result;
}
#endif
