// The log, its level and its sink, and the two reports that name a place in the source.
#include "base/Diagnostics.h"

#include <cstdarg>
#include <cstdlib>
#include <cstring>

#include <strings.h>

#include "base/AndroidLog.h"
#include "base/Formatted.h"
#include "Qex/base.h"

namespace {

QexLogSink s_Sink;
void* s_SinkUser;
int32_t s_Level = QEX_LOG_INFO;
// The program has asked for a level or a sink: what the engine prints goes to the log alone.
bool s_LogAlone;

int32_t Deliver(int32_t weight, int priority, const char* tag, const char* format, va_list arguments) {
    if (!s_Sink) return __android_log_vprint(priority, tag, format, arguments);
    QexFormatted text(format, arguments);
    if (text.Failed()) return -1;
    text.TrimNewline();
    s_Sink(s_SinkUser, weight, tag ? tag : "", text.Text());
    return 1;
}

// The weight of a printed line: loaders begin theirs with what they are.
int32_t WeightOf(const char* format) {
    if (strncasecmp(format, "error:", 6) == 0) return QEX_LOG_ERROR;
    return strncasecmp(format, "warning:", 8) == 0 ? QEX_LOG_WARNING : QEX_LOG_INFO;
}

}  // namespace

int32_t QexLog_SetLevel(int32_t level) {
    const int32_t before = s_Level;
    s_Level = level;
    s_LogAlone = true;
    return before;
}

void QexLog_SetSink(QexLogSink sink, void* user) {
    s_Sink = sink;
    s_SinkUser = user;
    s_LogAlone = true;
}

int32_t QexLog(const char* tag, const char* format, ...) {
    if (s_Level > QEX_LOG_INFO) return 0;
    va_list arguments;
    va_start(arguments, format);
    const int32_t result = Deliver(QEX_LOG_INFO, ANDROID_LOG_INFO, tag, format, arguments);
    va_end(arguments);
    return result;
}

int32_t QexError(const char* tag, const char* format, ...) {
    if (s_Level > QEX_LOG_ERROR) return 0;
    va_list arguments;
    va_start(arguments, format);
    const int32_t result = Deliver(QEX_LOG_ERROR, ANDROID_LOG_ERROR, tag, format, arguments);
    va_end(arguments);
    return result;
}

int32_t QexSystem_Printf(const char* format, ...) {
    const int32_t weight = WeightOf(format);
    if (s_Level > weight) return 1;
    va_list arguments, copy;
    va_start(arguments, format);
    if (!s_LogAlone) {
        va_copy(copy, arguments);
        vprintf(format, copy);
        va_end(copy);
    }
    Deliver(weight, ANDROID_LOG_INFO, QEX_TAG, format, arguments);
    va_end(arguments);
    return 1;
}

void QexDiagnostics_Print(FILE* stream, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    if (!s_LogAlone)
        vfprintf(stream, format, arguments);
    else if (s_Level <= QEX_LOG_INFO)
        Deliver(QEX_LOG_INFO, ANDROID_LOG_INFO, QEX_TAG, format, arguments);
    va_end(arguments);
}

static void DeliverError(const char* tag, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    Deliver(QEX_LOG_ERROR, ANDROID_LOG_ERROR, tag, format, arguments);
    va_end(arguments);
}

namespace {

QexErrorHandler s_Handler;
void* s_HandlerUser;
bool s_InHandler;

// The folder of the engine and the file in it.
const char* ShortName(const char* file) {
    const char* name = file + strlen(file);
    for (int slashes = 0; name > file && (slashes += name[-1] == '/') < 2;) --name;
    return name;
}

// The application's turn. What its handler does wrong itself is counted, and not handed to it again.
void Handle(uint32_t code, const char* module, const char* file, int line, const char* message) {
    ++g_QexFaults;
    if (!s_Handler || s_InHandler) return;
    s_InHandler = true;
    s_Handler(s_HandlerUser, code, module, ShortName(file), line, message);
    s_InHandler = false;
}

}  // namespace

uint32_t g_QexFaults;

bool QexDiagnostics_HasHandler() {
    return s_Handler;
}

void QexDiagnostics_GLError(uint32_t error, const char* module, const char* file, int line) {
    char message[32];
    snprintf(message, sizeof message, "GL error 0x%.4x", error);
    DeliverError("QexEngine", "glGetError() = %i (0x%.8x) at %s:%i\n", static_cast<int>(error), error, module,
                 line);
    DeliverError("QexEngine", "in %s, line %i", ShortName(file), line);
    if (!s_Handler) exit(-1);
    Handle(error, module, file, line, message);
}

void QexDiagnostics_Refused(uint32_t code, const char* module, const char* file, int line,
                            const char* message) {
    if (s_Handler) Handle(code, module, file, line, message);
}

void QexDiagnostics_NoMemory(uint32_t bytes, const char* module, const char* file, int line) {
    char message[48];
    snprintf(message, sizeof message, "%u bytes are not to be had", bytes);
    if (s_Handler) Handle(QEX_ERROR_MEMORY, module, file, line, message);
}

void QexDiagnostics_OutOfMemory(const char* module, int line) {
    QexSystem_Printf("Error: Out of memory at %s:%i\n", module, line);
}

void QexEngine_SetErrorHandler(QexErrorHandler handler, void* user) {
    s_Handler = handler;
    s_HandlerUser = user;
}
