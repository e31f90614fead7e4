// How the engine opens files, and reads large ones without a copy of the whole.
#pragma once

#include <cstdio>

#include "Qex/resources.h"

// Opens a file that can be read to an end, in binary; null when it cannot, or for a pipe, which would wait
// for somebody to write into it.
FILE* QexResFile_OpenForReading(const char* path);

// An open file whose bytes stay on the disk until they are asked for: its record has a size, but no data.
struct QexUnreadFile : QexResFile {
    FILE* handle;
    uint32_t position;  // of the handle
    char buffer[16384];
};

// As QexResFile_Create. QexResFile_Close closes it.
int32_t QexResFile_CreateUnread(QexUnreadFile* file, const char* path);

// Copies bytes that are within the size of an open record, unread or not. False, logged and the file closed,
// when they cannot be read.
bool QexResFile_Copy(QexResFile* record, uint32_t position, void* destination, uint32_t count);
