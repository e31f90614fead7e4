// Texture files that are read and loaded step by step.
#pragma once

#include "data/ResFile.h"
#include "texture/Upload.h"

// Its first steps read the file.
struct QexTextureFile : QexTextureLoad {
    QexUnreadFile unread;  // open while it is read
    uint8_t* contents;     // owned
    uint32_t read;         // bytes of it
};

// Opens a file for a load that says what the caller asks for. False, with nothing to end, when it cannot be
// opened or memory runs out.
bool QexTextureFile_Begin(QexTextureFile* file, const QexTextureLoad& load, const char* path);

// The same for a file in memory, whose bytes the load names.
void QexTextureFile_BeginMemory(QexTextureFile* file, const QexTextureLoad& load);

// Ends the load, in the middle as well.
void QexTextureFile_End(QexTextureFile* file);
