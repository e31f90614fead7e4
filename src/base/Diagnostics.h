// Diagnostics for the engine's own modules: what ends the process or goes to its handler.
//
// The printing functions themselves are public (Qex.h). This header adds the two reports that carry a
// source location: a GL error, which is fatal, and memory that could not be had; and the lines of standard
// streams alone. A source file names the module that it belongs to by defining QEX_MODULE, the module's path
// without extension; a module may span several files.
#pragma once

#include <cstdint>
#include <cstdio>

#include "Qex/base.h"

// Logs the GL error with its place, in a second line the source file, as a module may have several, at any
// level. Ends the process with exit status 255 where the application has set no handler; else that one is
// called.
void QexDiagnostics_GLError(uint32_t error, const char* module, const char* file, int line);

// What the GL refused without an error, QEX_ERROR_..., told to the handler alone. It is in the log already.
void QexDiagnostics_Refused(uint32_t code, const char* module, const char* file, int line,
                            const char* message);
bool QexDiagnostics_HasHandler();

// Tells the handler of an allocation that failed; the allocator does.
void QexDiagnostics_NoMemory(uint32_t bytes, const char* module, const char* file, int line);

// Prints the out-of-memory line. The caller decides how to go on.
void QexDiagnostics_OutOfMemory(const char* module, int line);

// Counts what was found and did not end the process: whoever makes something compares before and after.
extern uint32_t g_QexFaults;

// Prints on a standard stream; once the program has asked for a log level or sink, to the log instead, as
// information.
void QexDiagnostics_Print(FILE* stream, const char* format, ...) QEX_PRINTF(2, 3);

#define QEX_TAG "Qex"
