#include "QexDiagnostics.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "Platform/AndroidLog.h"

int32_t QexLog(const char* tag, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const int result = __android_log_vprint(ANDROID_LOG_INFO, tag, format, arguments);
    va_end(arguments);
    return result;
}

int32_t QexError(const char* tag, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const int result = __android_log_vprint(ANDROID_LOG_ERROR, tag, format, arguments);
    va_end(arguments);
    return result;
}

int32_t QexSystem_Printf(const char* format, ...) {
    va_list arguments, copy;
    va_start(arguments, format);
    va_copy(copy, arguments);
    vprintf(format, copy);
    va_end(copy);
    __android_log_vprint(ANDROID_LOG_INFO, QEX_TAG, format, arguments);
    va_end(arguments);
    return 1;
}

void QexDiagnostics_FatalGLError(uint32_t error, const char* module, const char* file, int line) {
    const char* const slash = strrchr(file, '/');
    __android_log_print(ANDROID_LOG_ERROR, "QexEngine", "glGetError() = %i (0x%.8x) at %s:%i\n",
                        static_cast<int>(error), error, module, line);
    __android_log_print(ANDROID_LOG_ERROR, "QexEngine", "in %s, line %i", slash ? slash + 1 : file, line);
    exit(-1);
}

void QexDiagnostics_OutOfMemory(const char* module, int line) {
    QexSystem_Printf("Error: Out of memory at %s:%i\n", module, line);
}
