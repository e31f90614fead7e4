// How the engine opens files to read.
#pragma once

#include <cstdio>

// Opens a file that can be read to an end, in binary; null when it cannot, or for a pipe, which would wait
// for somebody to write into it.
FILE* QexResFile_OpenForReading(const char* path);
