// The values of a record's blocks: words, texts, arrays, keys.
#include "pod/Values.h"

#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "data/ResFile.h"
#include "pod/Elements.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/resources.h"

namespace {

using Kind = QexPODFieldKind;

void PrintWords(const QexPODField& field, const void* value) {
    if (!field.line) return;
    if (strchr(field.line, 'f') && strstr(field.line, "%f")) {
        float f[3] = {0, 0, 0};
        memcpy(f, value, (field.unit < 3 ? field.unit : 3) * sizeof(float));
        QexSystem_Printf(field.line, static_cast<double>(f[0]), static_cast<double>(f[1]),
                         static_cast<double>(f[2]));
        return;
    }
    int32_t i;
    memcpy(&i, value, sizeof i);
    QexSystem_Printf(field.line, i);
}

bool ReadString(QexPODReader& reader, const QexPODField& field, uint32_t length, char*& target) {
    if (!QexPODReader_CheckLength(reader, field.id, length)) return false;
    QexMemory_Free(target);
    target = static_cast<char*>(QexMemory_Alloc(length + 1));
    if (!target) return QexPODReader_OutOfMemory(__LINE__);
    target[length] = 0;
    if (!QexSourceStream_Read(reader.stream, reinterpret_cast<uint8_t*>(target), length)) return false;
    if (field.line) QexSystem_Printf(field.line, target);
    return true;
}

// A block of words into a new allocation. Bytes beyond the last whole word are passed over.
bool ReadArray(QexPODReader& reader, const QexPODField& field, uint32_t length, uint32_t*& target,
               uint32_t* extents) {
    if (!QexPODReader_CheckLength(reader, field.id, length)) return false;
    QexMemory_Free(target);
    target = nullptr;
    const uint32_t words = length / 4;
    if (words) {
        target = static_cast<uint32_t*>(QexMemory_Alloc(words * 4));
        if (!target) return QexPODReader_OutOfMemory(__LINE__);
        // The files hold rotations with the opposite sense.
        const bool rotations = field.extent == kExtentKeys + kPODRotation;
        if (!QexPODReader_ReadBytes(reader, target, words * 4, rotations)) return false;
    }
    extents[field.extent] = words;
    if (field.line) QexSystem_Printf(field.line, length / field.unit);
    return QexSourceStream_Skip(reader.stream, length % 4) != 0;
}

// A node's keys: left in the source memory where that is allowed, copied otherwise.
bool ReadKeys(QexPODReader& reader, const QexPODField& field, uint32_t length, QexPODNode* node,
              uint32_t* extents) {
    uint32_t*& target = QexPODReader_At<uint32_t*>(node, field.offset);
    if (node->ownershipFlags & field.flag) target = nullptr;
    node->ownershipFlags &= ~field.flag;
    if (reader.shareKeys && field.flag && length >= 4) {
        if (!QexPODReader_CheckLength(reader, field.id, length)) return false;
        QexMemory_Free(target);
        target = reinterpret_cast<uint32_t*>(reader.stream->file->data + reader.stream->position);
        node->ownershipFlags |= field.flag;
        extents[field.extent] = length / 4;
        QexSystem_Printf(field.sharedLine, length / field.unit);
        return QexSourceStream_Skip(reader.stream, length) != 0;
    }
    return ReadArray(reader, field, length, target, extents);
}

}  // namespace

bool QexPODReader_CheckLength(QexPODReader& reader, uint32_t id, uint32_t length) {
    if (length <= reader.Remaining()) return true;
    return QexPODReader_Fail(reader, "block %u needs %u bytes, but %u are left", id, length,
                             reader.Remaining());
}

bool QexPODReader_Skip(QexPODReader& reader, uint32_t id, uint32_t length) {
    return QexPODReader_CheckLength(reader, id, length) && QexSourceStream_Skip(reader.stream, length);
}

bool QexPODReader_ReadBytes(QexPODReader& reader, void* target, uint32_t count, bool rotations) {
    reader.pending = static_cast<uint8_t*>(target);
    reader.pendingPosition = reader.stream->position;
    reader.pendingBytes = count;
    reader.pendingRotations = rotations;
    reader.stream->position += count;
    return QexPODReader_ReadPending(reader);
}

bool QexPODReader_ReadPending(QexPODReader& reader) {
    const uint32_t count = reader.pendingBytes < reader.piece ? reader.pendingBytes : reader.piece;
    if (count && !QexResFile_Copy(reader.stream->file, reader.pendingPosition, reader.pending, count))
        return false;
    if (reader.pendingRotations) {
        float* keys = reinterpret_cast<float*>(reader.pending);
        for (uint32_t i = 3; i < count / 4; i += 4) keys[i] = -keys[i];
    }
    reader.pending += count;
    reader.pendingPosition += count;
    reader.pendingBytes -= count;
    return true;
}

bool QexPODReader_ReadWords(QexPODReader& reader, const QexPODField& field, uint32_t length, void* target) {
    const uint32_t bytes = field.unit * 4u;
    if (!QexPODReader_CheckLength(reader, field.id, length)) return false;
    if (length < bytes)
        return QexPODReader_Fail(reader, "block %u holds %u bytes instead of %u", field.id, length, bytes);
    if (!QexSourceStream_ReadArray32(reader.stream, static_cast<uint32_t*>(target), field.unit)) return false;
    PrintWords(field, target);
    return QexSourceStream_Skip(reader.stream, length - bytes) != 0;
}

bool QexPODReader_ReadField(QexPODReader& reader, const QexPODField& field, uint32_t length, void* record,
                            uint32_t* extents) {
    QexPODMesh* mesh = static_cast<QexPODMesh*>(record);
    switch (field.kind) {
        case Kind::Words:
            return QexPODReader_ReadWords(reader, field, length,
                                          &QexPODReader_At<uint8_t>(record, field.offset));
        case Kind::String:
            return ReadString(reader, field, length, QexPODReader_At<char*>(record, field.offset));
        case Kind::Array:
            return ReadArray(reader, field, length, QexPODReader_At<uint32_t*>(record, field.offset),
                             extents);
        case Kind::Keys: return ReadKeys(reader, field, length, static_cast<QexPODNode*>(record), extents);
        case Kind::Bytes: return QexPODReader_ReadInterleaved(reader, field, length, mesh, extents);
        case Kind::UVWCount: return QexPODReader_ReadUVWCount(reader, field, length, mesh);
        case Kind::Static:
            reader.fixed.given = true;
            return QexPODReader_ReadWords(reader, field, length,
                                          &QexPODReader_At<uint8_t>(&reader.fixed, field.offset));
    }
    return false;
}
