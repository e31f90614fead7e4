// The Android log. On Android this is the platform's own header; elsewhere the one function that the engine
// uses is declared here with the same contract, and AndroidLog.cpp defines it over standard error.
#pragma once

#include "Qex/base.h"

#if defined(__ANDROID__)
#include <android/log.h>
#else
#include <cstdarg>

enum { ANDROID_LOG_INFO = 4, ANDROID_LOG_ERROR = 6 };

extern "C" __attribute__((visibility("hidden"), format(printf, 3, 0))) int __android_log_vprint(
    int priority, const char* tag, const char* format, va_list arguments);
#endif
