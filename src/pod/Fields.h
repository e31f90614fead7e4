// What the blocks of a scene's records hold, and where in the records it is stored.
#pragma once

#include <cstddef>

#include "pod/Extents.h"

// How a block is stored.
enum class QexPODFieldKind : uint8_t {
    Words,   // `unit` 32-bit words into the record
    String,  // text into a new allocation
    Array,   // 32-bit words into a new allocation; `unit` bytes make one item of the progress line
    Keys,    // as Array, but may stay in the source memory (`flag` marks it then)
    Bytes,   // the mesh's interleaved block
    UVWCount,
    Static  // an older file's static transform: `unit` words, kept until the node ends
};

struct QexPODField {
    uint32_t id;
    QexPODFieldKind kind;
    uint16_t unit;
    uint16_t offset;   // in the record, or in the static transform
    int8_t extent;     // which length to note, -1 none
    uint32_t flag;     // ownership flag of Keys
    const char* line;  // progress line, or null
    const char* sharedLine;
};

struct QexPODFields {
    const QexPODField* fields;
    uint32_t count;
};
extern const QexPODFields kPODSceneFields;
extern const QexPODFields kPODRecordFields[kPODKinds];

// The field of an identifier, null when there is none.
const QexPODField* QexPODFields_Find(const QexPODFields& fields, uint32_t id);

// The transform of a node in older files.
struct QexPODStaticTransform {
    float position[3] = {0, 0, 0};
    float rotation[4] = {0, 0, 0, 1};
    float scale[7] = {1, 1, 1, 0, 0, 0, 0};
    bool given = false;
};
