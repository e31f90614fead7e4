// A printf text of any length, made on the stack where it is short.
#pragma once

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "base/Memory.h"

class QexFormatted {
  public:
    QexFormatted(const char* format, va_list arguments) {
        va_list copy;
        va_copy(copy, arguments);
        const int needed = vsnprintf(short_, sizeof short_, format, copy);
        va_end(copy);
        failed_ = needed < 0;
        if (failed_) short_[0] = 0;
        // Without memory the text is cut.
        if (needed < static_cast<int>(sizeof short_) || !long_.Alloc(static_cast<uint64_t>(needed) + 1))
            return;
        vsnprintf(long_.Get(), static_cast<size_t>(needed) + 1, format, arguments);
    }

    bool Failed() const { return failed_; }
    char* Text() { return long_ ? long_.Get() : short_; }

    // Takes a newline at the end away.
    void TrimNewline() {
        char* text = Text();
        const size_t length = strlen(text);
        if (length && text[length - 1] == '\n') text[length - 1] = 0;
    }

  private:
    char short_[512];
    QexScratch<char> long_;
    bool failed_;
};
