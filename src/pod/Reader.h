// The state of reading a POD file, for the sources that share the work.
#pragma once

#include "pod/Fields.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/resources.h"

// Set in the identifier of the marker that closes a block.
constexpr uint32_t kPODEndMark = 0x80000000u;

struct QexPODReader {
    QexSourceStream* stream;
    QexPODModel* scene;
    bool shareKeys;
    bool versionRead = false;
    bool sceneRead = false;
    uint32_t declared[kPODKinds] = {};
    uint32_t capacity[kPODKinds] = {};
    bool counted[kPODKinds] = {};
    QexPODExtents* extents[kPODKinds] = {};
    QexPODStaticTransform fixed;  // of the node being read
    uint32_t uvwRead = 0;         // of the mesh being read

    uint32_t Remaining() const { return stream->file->size - stream->position; }
};

// Logs what is wrong with the file, and where. Always false.
bool QexPODReader_Fail(const QexPODReader& reader, const char* format, ...) QEX_PRINTF(2, 3);

// Prints the out-of-memory line. Always false.
bool QexPODReader_OutOfMemory(int line);

// A field of a record, by its place.
template <class T>
T& QexPODReader_At(void* record, uint32_t offset) {
    return *reinterpret_cast<T*>(static_cast<uint8_t*>(record) + offset);
}
