// Reading little-endian words from the bytes of a file, never past their end.
#include <cstring>

#include "base/Diagnostics.h"
#include "data/ResFile.h"
#include "data/SourceStream.h"
#include "Qex/base.h"
#include "Qex/resources.h"

namespace {

constexpr uint32_t kMaxWordMessages = 32;

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "the data of files is used as it lies in memory");

uint32_t Remaining(const QexSourceStream* stream) {
    return stream->file ? QexResFile_GetSize(stream->file) - stream->position : 0;
}

// Gives the stream an empty, closed file record. False, logged, when there is no memory.
template <class File>
File* NewFile(QexSourceStream* stream, const char* function) {
    File* const file = static_cast<File*>(QexMemory_Alloc(sizeof(File)));
    stream->position = 0;
    stream->file = file;
    if (!file) QexError(QEX_TAG, "<%s> out of memory", function);
    return file;
}

// Whether the file is open; the stream is released, logged, where not.
int32_t CheckOpen(QexSourceStream* stream, const char* path) {
    if (QexResFile_IsOpen(stream->file)) return 1;
    QexSourceStream_Release(stream);
    QexError(QEX_TAG, "<QexSourceStream_Create> open file %s failed", path ? path : "");
    return 0;
}

// Reads all `count` words at once. False, where there are fewer, leaves the stream as it is.
template <class Word>
bool ReadBlock(QexSourceStream* stream, Word* destination, uint32_t count) {
    if (count > Remaining(stream) / sizeof(Word)) return false;
    const uint32_t bytes = count * static_cast<uint32_t>(sizeof(Word));
    return QexSourceStream_Read(stream, reinterpret_cast<uint8_t*>(destination), bytes) != 0;
}

}  // namespace

int32_t QexSourceStream_Create(QexSourceStream* stream, const char* path) {
    QexResFile* const file = NewFile<QexResFile>(stream, "QexSourceStream_Create");
    if (!file) return 0;
    QexResFile_Create(file, path);
    return CheckOpen(stream, path);
}

int32_t QexSourceStream_CreateUnread(QexSourceStream* stream, const char* path) {
    QexUnreadFile* const file = NewFile<QexUnreadFile>(stream, "QexSourceStream_Create");
    if (!file) return 0;
    QexResFile_CreateUnread(file, path);
    return CheckOpen(stream, path);
}

int32_t QexSourceStream_CreateFromMemory(QexSourceStream* stream, const void* data, uint32_t size) {
    if (!NewFile<QexResFile>(stream, "QexSourceStream_CreateFromMemory")) return 0;
    QexResFile_CreateFromMemory(stream->file, data, size);
    if (QexResFile_IsOpen(stream->file)) return 1;
    QexSourceStream_Release(stream);
    QexError(QEX_TAG, "<QexSourceStream_CreateFromMemory> open failed");
    return 0;
}

void QexSourceStream_Release(QexSourceStream* stream) {
    if (!stream->file) return;
    QexResFile_Release(stream->file);
    QexMemory_Free(stream->file);
    stream->file = nullptr;
}

int32_t QexSourceStream_Read(QexSourceStream* stream, uint8_t* destination, uint32_t count) {
    if (!stream->file || count > Remaining(stream)) return 0;
    if (count && !QexResFile_Copy(stream->file, stream->position, destination, count)) return 0;
    stream->position += count;
    return 1;
}

int32_t QexSourceStream_Read16(QexSourceStream* stream, uint16_t* destination) {
    if (QexSourceStream_Read(stream, reinterpret_cast<uint8_t*>(destination), sizeof *destination)) return 1;
    QexError(QEX_TAG, "<QexSourceStream_ReadMarker> read WORD fail");
    return 0;
}

int32_t QexSourceStream_Read32(QexSourceStream* stream, uint32_t* destination) {
    return QexSourceStream_Read(stream, reinterpret_cast<uint8_t*>(destination), sizeof *destination);
}

int32_t QexSourceStream_ReadArray16(QexSourceStream* stream, uint16_t* destination, uint32_t count) {
    if (count == 0 || ReadBlock(stream, destination, count)) return 1;
    // Every missing element is reported, but a count from a broken file may be in the billions.
    uint32_t missing = 0;
    for (uint32_t i = 0; i < count && missing < kMaxWordMessages; ++i)
        missing += !QexSourceStream_Read16(stream, &destination[i]);
    return missing == 0;
}

int32_t QexSourceStream_ReadArray32(QexSourceStream* stream, uint32_t* destination, uint32_t count) {
    if (count == 0 || ReadBlock(stream, destination, count)) return 1;
    for (uint32_t i = 0; i < count; ++i) {
        if (QexSourceStream_Read32(stream, &destination[i])) continue;
        QexError(QEX_TAG, "<QexSourceStream_Read> read array fail");
        return 0;
    }
    return 1;
}

int32_t QexSourceStream_ReadMarker(QexSourceStream* stream, uint32_t* identifier, uint32_t* length) {
    if (!QexSourceStream_Read32(stream, identifier)) return 0;
    if (QexSourceStream_Read32(stream, length)) return 1;
    QexError(QEX_TAG, "<QexSourceStream_ReadMarker> read marker fail");
    return 0;
}

int32_t QexSourceStream_Skip(QexSourceStream* stream, uint32_t count) {
    if (!stream->file || count > Remaining(stream)) {
        QexLog(QEX_TAG, "<QexSourceStream_Skip> pass beyond end of stream");
        return 0;
    }
    stream->position += count;
    return 1;
}
