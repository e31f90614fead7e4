/* Whole files in memory, the bounded reading cursor, caches.
 *
 * Records belong to the caller; what a Create function allocates is released by the matching Release. No GL
 * context needed on this page.
 */
#ifndef QEX_RESOURCES_H
#define QEX_RESOURCES_H

#include "Qex/base.h"

QEX_BEGIN

/** A whole file in memory: read from disk into a block of its own, or a view of the caller's bytes. */
typedef struct QexResFile {
    uint32_t open;       /* 1 when the record holds data */
    uint32_t memoryFile; /* 1 when the data is the caller's and is not released */
    uint32_t size;       /* data bytes */
    uint8_t* data;       /* the bytes; those read from disk are followed by one extra 0 byte */
    char path[64];       /* the first 63 characters of the path; "" for a memory file */
} QexResFile;

/** Reads a whole file. Test QexResFile_IsOpen afterwards: a file that opens and cannot be read in full (a
 *  directory, 2 GiB or more, no memory) gives 0 with the record closed and no message.
 *  @param record  out; what it held is overwritten, not released
 *  @param path    path of the file; the record keeps its first 63 characters; null counts as missing
 *  @return 0 when the file could be opened, -1 when it could not or is a pipe (logged with the path). */
QEX_API int32_t QexResFile_Create(QexResFile* record, const char* path);

/** Opens a view of a block. The block is not copied and stays the caller's.
 *  @param record  out; what it held is overwritten, not released
 *  @param data    the bytes, alive until the record is closed; null with a size above 0 leaves it closed
 *  @param size    number of bytes
 *  @return always 0. */
QEX_API int32_t QexResFile_CreateFromMemory(QexResFile* record, const void* data, uint32_t size);

/** @return 1 when the record holds data, else 0. */
QEX_API uint32_t QexResFile_IsOpen(const QexResFile* record);

/** @return 1 when the data belongs to the caller of QexResFile_CreateFromMemory, else 0. */
QEX_API uint32_t QexResFile_IsMemoryFile(const QexResFile* record);

/** @return the number of data bytes, 0 for a closed record. */
QEX_API uint32_t QexResFile_GetSize(const QexResFile* record);

/** @return the data, null for a closed record; it stays the record's, valid until it is closed. */
QEX_API uint8_t* QexResFile_DataPtr(const QexResFile* record);

/** The data as text. Only a file read from disk is sure to end in a 0 byte.
 *  @return the data, null for a closed record; it stays the record's, valid until it is closed. */
QEX_API char* QexResFile_StringPtr(const QexResFile* record);

/** @return the record's path field, at most 63 characters, never null; kept when the record is closed. */
QEX_API const char* QexResFile_GetReadPath(const QexResFile* record);

/** Replaces the record's path field. Nothing is read.
 *  @param record  record, not null
 *  @param path    new path, of which the first 63 characters are kept, or null for an empty one */
QEX_API void QexResFile_SetReadPath(QexResFile* record, const char* path);

/** Closes a record: releases the data unless it is the caller's. The path is kept. A closed record is left
 *  as it is.
 *  @param record  created record, not null */
QEX_API void QexResFile_Close(QexResFile* record);

/** The same as QexResFile_Close.
 *  @param record  created record, not null */
QEX_API void QexResFile_Release(QexResFile* record);

/** @param path  path of a file; null counts as missing
 *  @return 1 when the file can be opened for reading, else 0; 0 for a pipe. */
QEX_API int32_t QexResFile_Exists(const char* path);

/** A forward-reading cursor over a whole file. Words are little-endian in the data on every host. Nothing is
 *  read past the end; every read of a stream that is not open fails. */
typedef struct QexSourceStream {
    QexResFile* file;  /* the stream's own; null when it is not open */
    uint32_t position; /* offset of the next byte, 0 to the file's size */
} QexSourceStream;

/** Opens a file from disk.
 *  @param stream  out; what it held is overwritten, not released
 *  @param path    path of the file
 *  @return 1, or 0 with the stream not open (logged). Release with QexSourceStream_Release. */
QEX_API int32_t QexSourceStream_Create(QexSourceStream* stream, const char* path);

/** Opens a view of a block. The block is not copied and stays the caller's.
 *  @param stream  out; what it held is overwritten, not released
 *  @param data    the bytes, alive until the stream is released
 *  @param size    number of bytes
 *  @return 1, or 0 with the stream not open (logged): no memory, or null data with a size above 0. */
QEX_API int32_t QexSourceStream_CreateFromMemory(QexSourceStream* stream, const void* data, uint32_t size);

/** Closes a stream and releases its file. A stream that is not open is left as it is.
 *  @param stream  created stream, not null */
QEX_API void QexSourceStream_Release(QexSourceStream* stream);

/** Copies the next bytes and advances.
 *  @param stream       stream, not null
 *  @param destination  out, count bytes; not written on failure
 *  @param count        number of bytes
 *  @return 1, or 0 when fewer bytes are left: the position stays, nothing is logged. */
QEX_API int32_t QexSourceStream_Read(QexSourceStream* stream, uint8_t* destination, uint32_t count);

/** Reads one 16-bit word.
 *  @param stream       stream, not null
 *  @param destination  out; not written on failure
 *  @return 1, or 0 when fewer than 2 bytes are left (logged): the position stays. */
QEX_API int32_t QexSourceStream_Read16(QexSourceStream* stream, uint16_t* destination);

/** Reads one 32-bit word.
 *  @param stream       stream, not null
 *  @param destination  out; not written on failure
 *  @return 1, or 0 when fewer than 4 bytes are left: the position stays, nothing is logged. */
QEX_API int32_t QexSourceStream_Read32(QexSourceStream* stream, uint32_t* destination);

/** Reads 16-bit words. When the data ends early, the elements that are there are read, and each missing one
 *  is logged, up to 32 of them.
 *  @param stream       stream, not null
 *  @param destination  out, count words
 *  @param count        number of words; 0 succeeds
 *  @return 1 when all were read, else 0. */
QEX_API int32_t QexSourceStream_ReadArray16(QexSourceStream* stream, uint16_t* destination, uint32_t count);

/** Reads 32-bit words. When the data ends early, the elements that are there are read, and one line is
 *  logged.
 *  @param stream       stream, not null
 *  @param destination  out, count words
 *  @param count        number of words; 0 succeeds
 *  @return 1 when all were read, else 0. */
QEX_API int32_t QexSourceStream_ReadArray32(QexSourceStream* stream, uint32_t* destination, uint32_t count);

/** Reads a block marker of the POD format: the identifier, then the block's length in bytes.
 *  @param stream      stream, not null
 *  @param identifier  out
 *  @param length      out
 *  @return 1, or 0 at the end of the data: silently when no identifier is left, logged when the marker is
 *          cut after its identifier (which is then read). */
QEX_API int32_t QexSourceStream_ReadMarker(QexSourceStream* stream, uint32_t* identifier, uint32_t* length);

/** Advances without copying.
 *  @param stream  stream, not null
 *  @param count   number of bytes
 *  @return 1, or 0 when fewer bytes are left (logged): the position stays. */
QEX_API int32_t QexSourceStream_Skip(QexSourceStream* stream, uint32_t count);

/** Cache results. */
#define QEX_CACHE_NO_MEMORY (-6) /* allocation failed, or no cache */
#define QEX_CACHE_PRESENT (-5)   /* the name is in the cache already */
#define QEX_CACHE_NO_ENTRY (-2)  /* no entry at that index */

/** A growable array of elements of one size, stored by value. */
typedef struct QexDataCache {
    void* data;           /* the elements; the cache's own */
    uint32_t elementSize; /* bytes of an element */
    uint32_t capacity;    /* elements that the block can hold */
    uint32_t count;       /* elements that it holds */
} QexDataCache;

/** Bytes of a name in a QexNameCache. A longer name is cut; one of 32 bytes has no terminating 0. */
#define QEX_CACHE_NAME_SIZE 32

/** Elements found by name. Entry i of one cache belongs to entry i of the other. */
typedef struct QexNameCache {
    QexDataCache names;    /* slots of QEX_CACHE_NAME_SIZE bytes */
    QexDataCache elements; /* the elements */
} QexNameCache;

/** Prepares a cache.
 *  @param cache        out; what it held is overwritten, not released
 *  @param capacity     elements to make room for at once; 0 allocates nothing yet
 *  @param elementSize  bytes of an element
 *  @return 0, or QEX_CACHE_NO_MEMORY with an empty cache. Release with QexDataCache_Release. */
QEX_API int32_t QexDataCache_Create(QexDataCache* cache, uint32_t capacity, uint32_t elementSize);

/** Appends a copy of an element. A full block of at most 1024 bytes doubles, a larger one grows by a fifth
 *  (by one element at least), which may move it.
 *  @param cache    cache; null gives QEX_CACHE_NO_MEMORY
 *  @param element  elementSize bytes; may be an element of the same cache
 *  @return 0, or QEX_CACHE_NO_MEMORY with the cache as it was. */
QEX_API int32_t QexDataCache_Add(QexDataCache* cache, const void* element);

/** @param cache  cache, not null
 *  @param index  slot, 0 to capacity - 1; slots from count on hold undefined bytes
 *  @return the slot, valid until the cache grows or is released; null when the index is not below the
 *          capacity. */
QEX_API void* QexDataCache_Get(const QexDataCache* cache, uint32_t index);

/** @return the number of elements that the cache holds. */
QEX_API uint32_t QexDataCache_GetSize(const QexDataCache* cache);

/** Removes an element; those after it move down by one slot.
 *  @param cache  cache, not null
 *  @param index  element, 0 to count - 1; others are ignored */
QEX_API void QexDataCache_Remove(QexDataCache* cache, uint32_t index);

/** Forgets all elements and keeps the block.
 *  @param cache  cache, not null */
QEX_API void QexDataCache_Clear(QexDataCache* cache);

/** Releases the block. The cache is empty afterwards, with capacity 0, and may be added to again.
 *  @param cache  cache, not null */
QEX_API void QexDataCache_Release(QexDataCache* cache);

/** Prepares a name cache.
 *  @param cache        out; what it held is overwritten, not released
 *  @param capacity     entries to make room for at once; 0 allocates nothing yet
 *  @param elementSize  bytes of an element
 *  @return 0, or QEX_CACHE_NO_MEMORY with an empty cache. Release with QexNameCache_Release. */
QEX_API int32_t QexNameCache_Create(QexNameCache* cache, uint32_t capacity, uint32_t elementSize);

/** Appends an entry under a name that is not in the cache yet.
 *  @param cache    cache; null gives QEX_CACHE_NO_MEMORY
 *  @param name     name, of which the first 32 bytes count; null counts as ""
 *  @param element  elementSize bytes, copied
 *  @return 0, QEX_CACHE_PRESENT, or QEX_CACHE_NO_MEMORY; the cache is as it was after both failures. */
QEX_API int32_t QexNameCache_Add(QexNameCache* cache, const char* name, const void* element);

/** Looks an entry up by name, in order.
 *  @param cache    cache, not null
 *  @param name     name, of which the first 32 bytes count; null counts as ""
 *  @param element  out, the element's slot, or null when there is no such entry; may be null
 *  @return the entry's index, or -1. */
QEX_API int32_t QexNameCache_Find(const QexNameCache* cache, const char* name, void** element);

/** @param cache  cache, not null
 *  @param name   name, of which the first 32 bytes count
 *  @return the element under that name, valid until the cache grows or changes, or null. */
QEX_API void* QexNameCache_GetDataByName(const QexNameCache* cache, const char* name);

/** @param cache  cache, not null
 *  @param index  slot, 0 to the elements' capacity - 1
 *  @return the element's slot, valid until the cache grows or changes, or null. */
QEX_API void* QexNameCache_GetData(const QexNameCache* cache, uint32_t index);

/** Copies an entry's name, always with a terminating 0.
 *  @param cache        cache, not null
 *  @param index        entry, 0 to count - 1
 *  @param destination  out, at least 33 bytes; not written on failure
 *  @return 0, or QEX_CACHE_NO_ENTRY. */
QEX_API int32_t QexNameCache_GetName(const QexNameCache* cache, uint32_t index, char* destination);

/** @return the number of entries. */
QEX_API uint32_t QexNameCache_GetSize(const QexNameCache* cache);

/** Removes an entry; those after it move down by one.
 *  @param cache  cache, not null
 *  @param index  entry, 0 to count - 1; others are ignored */
QEX_API void QexNameCache_Remove(QexNameCache* cache, uint32_t index);

/** Removes the entry under a name; an unknown name changes nothing.
 *  @param cache  cache, not null
 *  @param name   name, of which the first 32 bytes count */
QEX_API void QexNameCache_RemoveByName(QexNameCache* cache, const char* name);

/** Forgets all entries and keeps the blocks.
 *  @param cache  cache, not null */
QEX_API void QexNameCache_Clear(QexNameCache* cache);

/** Releases both blocks. The cache is empty afterwards and may be added to again.
 *  @param cache  cache, not null */
QEX_API void QexNameCache_Release(QexNameCache* cache);

QEX_END

#endif
