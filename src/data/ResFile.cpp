// Files read whole into memory, or memory that looks like one.
#include "data/ResFile.h"

#include <sys/stat.h>

#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "Qex/base.h"
#include "Qex/resources.h"

namespace {

// Room for the closing 0 byte within the largest block that QexMemory_Alloc gives.
constexpr long kMaxFileSize = INT32_MAX - 1;

// The size of an open file, -1 where it has none. A directory opens for reading, too; its size is absurd, or
// reading it fails. A pipe cannot be sought.
long FindSize(FILE* file) {
    if (fseek(file, 0, SEEK_END) != 0) return -1;
    const long size = ftell(file);
    return size <= kMaxFileSize && fseek(file, 0, SEEK_SET) == 0 ? size : -1;
}

// Reads all of an open file into the record, which stays closed when that fails.
void ReadAll(QexResFile* record, FILE* file) {
    const long size = FindSize(file);
    if (size < 0) return;
    const size_t count = static_cast<size_t>(size);
    QexScratch<uint8_t> data(uint64_t{count} + 1);
    if (!data) return;
    data[count] = 0;
    if (fread(data.Get(), 1, count, file) != count || ferror(file)) return;
    record->data = data.Take();
    record->size = static_cast<uint32_t>(size);
    record->open = 1;
}

void ClearData(QexResFile* record) {
    record->open = 0;
    record->memoryFile = 0;
    record->size = 0;
    record->data = nullptr;
}

// Opens a file for a closed record that keeps its path; null, logged, when there is none.
FILE* Open(QexResFile* record, const char* path) {
    // Opened first, since the path may be the record's own.
    FILE* const file = QexResFile_OpenForReading(path);
    QexResFile_SetReadPath(record, path);
    ClearData(record);
    if (!file) QexError(QEX_TAG, "<QexResFile_Create> opening file '%s' failed", path ? path : "");
    return file;
}

// Null for a record without a file of its own that is still open.
QexUnreadFile* AsUnread(QexResFile* record) {
    return record->open && record->size && !record->data ? static_cast<QexUnreadFile*>(record) : nullptr;
}

}  // namespace

FILE* QexResFile_OpenForReading(const char* path) {
    struct stat status;
    if (!path || (stat(path, &status) == 0 && S_ISFIFO(status.st_mode))) return nullptr;
    return fopen(path, "rb");
}

int32_t QexResFile_Create(QexResFile* record, const char* path) {
    FILE* const file = Open(record, path);
    if (!file) return -1;
    ReadAll(record, file);
    fclose(file);
    return 0;
}

int32_t QexResFile_CreateUnread(QexUnreadFile* file, const char* path) {
    FILE* const handle = Open(file, path);
    if (!handle) return -1;
    setvbuf(handle, file->buffer, _IOFBF, sizeof file->buffer);
    const long size = FindSize(handle);
    // The first byte shows whether it can be read at all.
    const bool readable = size == 0 || (size > 0 && ungetc(getc(handle), handle) != EOF);
    if (readable) {
        file->open = 1;
        file->size = static_cast<uint32_t>(size);
        file->handle = handle;
        file->position = 0;
    }
    if (!AsUnread(file)) fclose(handle);
    return 0;
}

bool QexResFile_Copy(QexResFile* record, uint32_t position, void* destination, uint32_t count) {
    if (record->data) {
        memcpy(destination, record->data + position, count);
        return true;
    }
    QexUnreadFile* const file = AsUnread(record);
    if (!file) return false;
    const bool there =
        file->position == position || fseek(file->handle, static_cast<long>(position), SEEK_SET) == 0;
    file->position = position + count;
    if (there && fread(destination, 1, count, file->handle) == count) return true;
    QexError(QEX_TAG, "<QexResFile_Copy> reading file '%s' failed", file->path);
    fclose(file->handle);
    file->open = 0;
    return false;
}

int32_t QexResFile_CreateFromMemory(QexResFile* record, const void* data, uint32_t size) {
    QexResFile_SetReadPath(record, nullptr);
    ClearData(record);
    if (!data && size != 0) return 0;
    record->open = 1;
    record->memoryFile = 1;
    record->size = size;
    record->data = const_cast<uint8_t*>(static_cast<const uint8_t*>(data));
    return 0;
}

uint32_t QexResFile_IsOpen(const QexResFile* record) {
    return record->open;
}

uint32_t QexResFile_IsMemoryFile(const QexResFile* record) {
    return record->memoryFile;
}

uint32_t QexResFile_GetSize(const QexResFile* record) {
    return record->size;
}

uint8_t* QexResFile_DataPtr(const QexResFile* record) {
    return record->data;
}

char* QexResFile_StringPtr(const QexResFile* record) {
    return reinterpret_cast<char*>(record->data);
}

const char* QexResFile_GetReadPath(const QexResFile* record) {
    return record->path;
}

void QexResFile_SetReadPath(QexResFile* record, const char* path) {
    const size_t length = path ? strnlen(path, sizeof record->path - 1) : 0;
    if (length) memmove(record->path, path, length);
    record->path[length] = 0;
}

void QexResFile_Close(QexResFile* record) {
    if (!record->open) return;
    if (QexUnreadFile* const file = AsUnread(record)) fclose(file->handle);
    if (!record->memoryFile) QexMemory_Free(record->data);
    ClearData(record);
}

void QexResFile_Release(QexResFile* record) {
    QexResFile_Close(record);
}

int32_t QexResFile_Exists(const char* path) {
    FILE* const file = QexResFile_OpenForReading(path);
    if (!file) return 0;
    fclose(file);
    return 1;
}

#if UINTPTR_MAX == UINT32_MAX
static_assert(sizeof(QexResFile) == 80, "four words and a path of 64 characters");
#endif
