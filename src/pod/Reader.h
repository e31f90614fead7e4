// Reading a POD file step by step, a block or a piece of one at a time, and the state of it that several
// sources share.
#pragma once

#include "base/Step.h"
#include "pod/Fields.h"
#include "pod/Repair.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/resources.h"

// Set in the identifier of the marker that closes a block.
constexpr uint32_t kPODEndMark = 0x80000000u;

// What the next marker belongs to, or what follows the scene's last one.
enum class QexPODLevel : uint8_t { File, Scene, Record, Element, Check, Repair };

struct QexPODReader {
    QexSourceStream* stream;
    QexPODModel* scene;
    uint32_t piece = kQexWhole;  // bytes of a block that a step reads at most
    bool anyway;                 // a file without version or scene will do
    bool shareKeys;
    bool versionRead = false;
    bool sceneRead = false;
    QexPODLevel level = QexPODLevel::File;
    uint32_t part = 0;  // of checking or mending the scene
    QexPODRepair repair = {};

    // The record that is being read.
    int kind = 0;
    void* record = nullptr;
    uint32_t* recordExtents = nullptr;

    // The element of a mesh that is being read.
    uint32_t elementBlock = 0;
    CPODData* element = nullptr;
    bool elementInterleaved = false;
    uint32_t* elementExtent = nullptr;

    // The rest of a block's bytes.
    uint8_t* pending = nullptr;
    uint32_t pendingPosition = 0, pendingBytes = 0;
    bool pendingRotations = false;

    uint32_t declared[kPODKinds] = {};
    uint32_t capacity[kPODKinds] = {};
    bool counted[kPODKinds] = {};
    QexPODExtents* extents[kPODKinds] = {};
    QexPODStaticTransform fixed;  // of the node being read
    uint32_t uvwRead = 0;         // of the mesh being read

    uint32_t Remaining() const { return stream->file->size - stream->position; }
};

// Begins to read a file. The stream stays where it is until QexPODReader_End, as does the scene.
void QexPODReader_Begin(QexPODReader* reader, QexSourceStream* stream, QexPODModel* scene, bool anyway,
                        uint32_t piece);

// A block, a piece of one, or a record checked or mended; the last step leaves a scene that can be drawn.
QexStep QexPODReader_Step(QexPODReader* reader);

// Frees what reading needed, whether it came to its end or not. The scene stays.
void QexPODReader_End(QexPODReader* reader);

// Logs what is wrong with the file, and where. Always false.
bool QexPODReader_Fail(const QexPODReader& reader, const char* format, ...) QEX_PRINTF(2, 3);

// Prints the out-of-memory line. Always false.
bool QexPODReader_OutOfMemory(int line);

// A field of a record, by its place.
template <class T>
T& QexPODReader_At(void* record, uint32_t offset) {
    return *reinterpret_cast<T*>(static_cast<uint8_t*>(record) + offset);
}
