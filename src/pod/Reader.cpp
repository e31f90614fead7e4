// Reading POD files: markers, the scene, its records one after the other. A step reads a marker of the level
// that it finds itself in, and what belongs to it.
#include "pod/Reader.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "data/SourceStream.h"
#include "pod/Check.h"
#include "pod/Elements.h"
#include "pod/Repair.h"
#include "pod/Scene.h"
#include "pod/Values.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/resources.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr uint32_t kVersionBlock = 1000;
constexpr uint32_t kSceneBlock = 1001;
constexpr uint32_t kSwappedVersionBlock = 0xE8030000u;
constexpr char kVersion[] = "AB.POD.2.0";

struct RecordKind {
    uint32_t countId;
    uint32_t blockId;
    const char* name;
    uint32_t size;
    uint16_t countOffset;  // in QexPODModel
    uint16_t arrayOffset;
    const char* countLine;
    const char* title;  // null: none
};

#define KIND(countId, blockId, name, type, counter, array, countLine, title)                                \
    {                                                                                                       \
        countId, blockId, name, sizeof(type), offsetof(QexPODModel, counter), offsetof(QexPODModel, array), \
            countLine, title                                                                                \
    }
const RecordKind kKinds[kPODKinds] = {
    KIND(2002, 2010, "camera", QexPODCamera, cameraCount, cameras, "  - %d camera(s) found.\n",
         "  - [Camera]\n"),
    KIND(2003, 2011, "light", QexPODLight, lightCount, lights, "  - %d light(s) found.\n", nullptr),
    KIND(2004, 2012, "mesh", QexPODMesh, meshCount, meshes, "  - %d mesh(es) found.\n", "  - [Mesh]\n"),
    KIND(2005, 2013, "node", QexPODNode, nodeCount, nodes, "  - %d node(s) found.\n", "  - [Node]\n"),
    KIND(2007, 2014, "texture", QexPODTexture, textureCount, textures, "  - %d texture(s) found.\n",
         "  - [Texture]\n"),
    KIND(2008, 2015, "material", QexPODMaterial, materialCount, materials, "  - %d material(s) found.\n",
         "  - [Material]\n"),
};

// ---- Records ----

// Gives a channel of a node of the older layout one key from its static value where it has no keys.
bool CompleteStatic(QexPODNode* node, QexPODChannelNumber number, const float* value, uint32_t* extents) {
    const QexPODChannel& channel = kPODChannelTable[number];
    float*& keys = node->*channel.keys;
    if (keys) {
        node->animationFlags |= channel.animated;
        return true;
    }
    keys = QexMemory_AllocArray<float>(channel.stride);
    if (!keys) return QexPODReader_OutOfMemory(__LINE__);
    memcpy(keys, value, channel.stride * sizeof(float));
    extents[kExtentKeys + number] = channel.stride;
    return true;
}

void SetDefaults(int kind, void* record) {
    if (kind == kPODMaterial) QexPODMaterial_SetDefaults(static_cast<QexPODMaterial*>(record));
    if (kind == kPODMesh) QexPODMesh_SetDefaults(static_cast<QexPODMesh*>(record));
}

bool EndNode(QexPODReader& reader, QexPODNode* node, uint32_t* extents) {
    const QexPODStaticTransform fixed = reader.fixed;
    reader.fixed = QexPODStaticTransform();
    QexPODNode_SetDefaults(node);
    return !fixed.given || (CompleteStatic(node, kPODPosition, fixed.position, extents) &&
                            CompleteStatic(node, kPODRotation, fixed.rotation, extents) &&
                            CompleteStatic(node, kPODScale, fixed.scale, extents));
}

bool EndRecord(QexPODReader& reader, int kind, void* record, uint32_t* extents) {
    if (kind == kPODMesh) QexPODMesh_CompleteElements(static_cast<QexPODMesh*>(record));
    return kind != kPODNode || EndNode(reader, static_cast<QexPODNode*>(record), extents);
}

bool ReadCount(QexPODReader& reader, int kind, uint32_t length) {
    const RecordKind& k = kKinds[kind];
    if (reader.counted[kind])
        return QexPODReader_Fail(reader, "the scene counts its %s records twice", k.name);
    reader.counted[kind] = true;
    const QexPODField field = {k.countId, QexPODFieldKind::Words, 1, 0, -1, 0, k.countLine, nullptr};
    if (!QexPODReader_ReadWords(reader, field, length, &reader.declared[kind])) return false;
    // The shortest record is a pair of markers.
    if (reader.declared[kind] <= reader.Remaining() / 16) return true;
    return QexPODReader_Fail(reader, "the scene counts %u %s records, more than the file can hold",
                             reader.declared[kind], k.name);
}

// The next zeroed record of a kind. Arrays grow with the records that are really there, so that a count alone
// takes no memory.
void* NextRecord(QexPODReader& reader, int kind) {
    const RecordKind& k = kKinds[kind];
    uint32_t& used = QexPODReader_At<uint32_t>(reader.scene, k.countOffset);
    void*& array = QexPODReader_At<void*>(reader.scene, k.arrayOffset);
    if (used == reader.capacity[kind]) {
        uint32_t capacity = used ? used * 2 : 16;
        if (capacity > reader.declared[kind]) capacity = reader.declared[kind];
        if (!QexMemory_Resize(array, uint64_t{capacity} * k.size) ||
            !QexMemory_Resize(reader.extents[kind], uint64_t{capacity} * sizeof(QexPODExtents))) {
            QexPODReader_OutOfMemory(__LINE__);
            return nullptr;
        }
        reader.capacity[kind] = capacity;
    }
    void* record = static_cast<uint8_t*>(array) + uint64_t{used} * k.size;
    memset(record, 0, k.size);
    memset(reader.extents[kind][used], 0, sizeof(QexPODExtents));
    ++used;
    return record;
}

// A block within a record, or its end.
bool ReadRecordBlock(QexPODReader& reader, uint32_t id, uint32_t length) {
    const int kind = reader.kind;
    void* record = reader.record;
    uint32_t* extents = reader.recordExtents;
    if (id == (kKinds[kind].blockId | kPODEndMark)) {
        reader.level = QexPODLevel::Scene;
        return QexPODReader_Skip(reader, id, length) && EndRecord(reader, kind, record, extents);
    }
    const QexPODField* field = QexPODFields_Find(kPODRecordFields[kind], id);
    if (field) return QexPODReader_ReadField(reader, *field, length, record, extents);
    const uint32_t element = kind == kPODMesh ? QexPODElement_Find(id) : kPODMaxElements;
    if (element < kPODMaxElements)
        return QexPODReader_BeginElement(reader, element, static_cast<QexPODMesh*>(record), extents);
    if (kind == kPODMaterial && !(id & kPODEndMark))
        QexLog(QEX_TAG, "<QexPODFile_ReadMaterial> skip unknown block");
    return QexPODReader_Skip(reader, id, length);
}

bool BeginRecord(QexPODReader& reader, int kind) {
    const RecordKind& k = kKinds[kind];
    const uint32_t index = QexPODReader_At<uint32_t>(reader.scene, k.countOffset);
    if (index >= reader.declared[kind])
        return QexPODReader_Fail(reader, "the scene holds more %s records than the %u it counts", k.name,
                                 reader.declared[kind]);
    void* record = NextRecord(reader, kind);
    if (!record) return false;
    reader.level = QexPODLevel::Record;
    reader.kind = kind;
    reader.record = record;
    reader.recordExtents = reader.extents[kind][index];
    reader.uvwRead = 0;
    if (k.title) QexSystem_Printf("%s", k.title);
    SetDefaults(kind, record);
    return true;
}

// ---- The scene ----

bool EndScene(QexPODReader& reader) {
    for (int kind = 0; kind < kPODKinds; ++kind) {
        const uint32_t found = QexPODReader_At<uint32_t>(reader.scene, kKinds[kind].countOffset);
        if (found != reader.declared[kind])
            return QexPODReader_Fail(reader, "the scene counts %u %s records but holds %u",
                                     reader.declared[kind], kKinds[kind].name, found);
    }
    reader.sceneRead = true;
    reader.level = QexPODLevel::Check;
    reader.part = 0;
    return true;
}

// A part of the scene that was read; what follows it is the file's again.
bool CheckPart(QexPODReader& reader) {
    QexPODFault fault;
    if (const char* line = QexPODScene_Check(*reader.scene, reader.extents, reader.part, &fault)) {
        QexError(QEX_TAG, "<QexPODModel_ReadFromSourceStream> %s", line);
        return false;
    }
    if (++reader.part < QexPODScene_CheckParts(*reader.scene)) return true;
    reader.level = QexPODLevel::Repair;
    reader.part = 0;
    reader.repair = {reader.scene, {}};
    return true;
}

bool RepairPart(QexPODReader& reader) {
    QexPODScene_Repair(&reader.repair, reader.extents, reader.part);
    if (++reader.part == QexPODScene_RepairParts(*reader.scene)) reader.level = QexPODLevel::File;
    return true;
}

bool ReadSceneBlock(QexPODReader& reader, uint32_t id, uint32_t length) {
    if (id == (kSceneBlock | kPODEndMark)) return QexPODReader_Skip(reader, id, length) && EndScene(reader);
    const QexPODField* field = QexPODFields_Find(kPODSceneFields, id);
    if (field) return QexPODReader_ReadField(reader, *field, length, reader.scene, nullptr);
    for (int kind = 0; kind < kPODKinds; ++kind) {
        if (id == kKinds[kind].countId) return ReadCount(reader, kind, length);
        if (id == kKinds[kind].blockId) return BeginRecord(reader, kind);
    }
    return QexPODReader_Skip(reader, id, length);
}

bool BeginScene(QexPODReader& reader) {
    if (reader.sceneRead) return QexPODReader_Fail(reader, "the file holds two scenes");
    reader.scene->framesPerSecond = 30;
    reader.level = QexPODLevel::Scene;
    return true;
}

bool ReadVersion(QexPODReader& reader, uint32_t length) {
    char text[sizeof kVersion] = {};
    if (length != sizeof kVersion)
        return QexPODReader_Fail(reader, "the version block holds %u bytes instead of 11", length);
    if (!QexPODReader_CheckLength(reader, kVersionBlock, length)) return false;
    if (!QexSourceStream_Read(reader.stream, reinterpret_cast<uint8_t*>(text), length)) return false;
    if (memcmp(text, kVersion, sizeof kVersion) != 0)
        return QexPODReader_Fail(reader, "the version is not \"%s\"", kVersion);
    QexSystem_Printf("  - POD version string %s\n", text);
    reader.versionRead = true;
    return true;
}

bool ReadFileBlock(QexPODReader& reader, uint32_t id, uint32_t length) {
    if (id == kVersionBlock) return ReadVersion(reader, length);
    if (id == kSceneBlock && reader.scene) return BeginScene(reader);
    if (id == kSceneBlock) return true;  // its sub-blocks are passed over one by one
    if (id == kSwappedVersionBlock) {
        QexSystem_Printf("  - POD endianness mismatch!\n");
        return QexPODReader_Fail(reader, "the file is in the other byte order");
    }
    if (!reader.versionRead && !reader.sceneRead && length > reader.Remaining())
        return QexPODReader_Fail(reader, "not a POD file");
    return QexPODReader_Skip(reader, id, length);
}

bool Finish(QexPODReader& reader) {
    if (!reader.anyway && !reader.versionRead)
        return QexPODReader_Fail(reader, "not a POD file: no version block");
    if (!reader.anyway && !reader.sceneRead) return QexPODReader_Fail(reader, "no scene in the file");
    if (!reader.scene || QexPODModel_InitImpl(reader.scene) == 0) return true;
    return QexPODReader_OutOfMemory(__LINE__);
}

// The end of the file, where it may be.
QexStep EndFile(QexPODReader& reader) {
    const uint32_t index =
        reader.scene ? QexPODReader_At<uint32_t>(reader.scene, kKinds[reader.kind].countOffset) - 1 : 0;
    switch (reader.level) {
        case QexPODLevel::Scene: QexPODReader_Fail(reader, "the file ends inside the scene"); break;
        case QexPODLevel::Record:
            QexPODReader_Fail(reader, "the file ends inside %s %u", kKinds[reader.kind].name, index);
            break;
        case QexPODLevel::Element:
            QexPODReader_Fail(reader, "the file ends inside block %u", reader.elementBlock);
            break;
        default: return Finish(reader) ? QexStep::kDone : QexStep::kFailed;
    }
    return QexStep::kFailed;
}

bool ReadBlock(QexPODReader& reader, uint32_t id, uint32_t length) {
    switch (reader.level) {
        case QexPODLevel::Scene: return ReadSceneBlock(reader, id, length);
        case QexPODLevel::Record: return ReadRecordBlock(reader, id, length);
        case QexPODLevel::Element: return QexPODReader_ReadElementBlock(reader, id, length);
        default: return ReadFileBlock(reader, id, length);
    }
}

}  // namespace

bool QexPODReader_Fail(const QexPODReader& reader, const char* format, ...) {
    char text[192];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    QexError(QEX_TAG, "<QexPODModel_ReadFromSourceStream> %s (at byte %u of %u)", text,
             reader.stream->position, reader.stream->file->size);
    return false;
}

bool QexPODReader_OutOfMemory(int line) {
    QexDiagnostics_OutOfMemory(QEX_MODULE, line);
    return false;
}

void QexPODReader_Begin(QexPODReader* reader, QexSourceStream* stream, QexPODModel* scene, bool anyway,
                        uint32_t piece) {
    *reader = {};
    reader->stream = stream;
    reader->scene = scene;
    reader->anyway = anyway;
    reader->piece = piece;
    reader->shareKeys = QexResFile_IsMemoryFile(stream->file) != 0;
}

QexStep QexPODReader_Step(QexPODReader* reader) {
    uint32_t id, length;
    bool read;
    if (reader->pendingBytes)
        read = QexPODReader_ReadPending(*reader);
    else if (reader->level == QexPODLevel::Check)
        read = CheckPart(*reader);
    else if (reader->level == QexPODLevel::Repair)
        read = RepairPart(*reader);
    else if (!QexSourceStream_ReadMarker(reader->stream, &id, &length))
        return EndFile(*reader);
    else
        read = ReadBlock(*reader, id, length);
    return read ? QexStep::kMore : QexStep::kFailed;
}

void QexPODReader_End(QexPODReader* reader) {
    for (QexPODExtents*& extents : reader->extents) QexMemory_FreeArray(extents);
}

extern "C" {

int32_t QexPODModel_ReadFromSourceStream(QexPODModel* scene, QexSourceStream* stream, uint32_t optionA,
                                         uint32_t, uint32_t optionB, uint32_t) {
    if (scene) memset(scene, 0, sizeof *scene);
    if (!stream || !stream->file) return -1;
    QexPODReader reader;
    QexPODReader_Begin(&reader, stream, scene, optionA || optionB, kQexWhole);
    const bool read = QexStep_Run(&reader, QexPODReader_Step);
    QexPODReader_End(&reader);
    return read ? 0 : -1;
}

int32_t QexPODModel_ReadFromFile(QexPODModel* scene, const char* path, uint32_t optionA, uint32_t option2,
                                 uint32_t optionB, uint32_t option4) {
    QexSourceStream stream;
    if (scene) memset(scene, 0, sizeof *scene);
    if (!QexSourceStream_CreateUnread(&stream, path)) return -1;
    QexPODModel_ReadFromSourceStream(scene, &stream, optionA, option2, optionB, option4);
    const bool read = QexResFile_IsOpen(stream.file) != 0;
    QexSourceStream_Release(&stream);
    return read ? 0 : -1;
}

int32_t QexPODModel_ReadFromMemory(QexPODModel* scene, const void* data, uint32_t size, uint32_t optionA,
                                   uint32_t option2, uint32_t optionB, uint32_t option4) {
    QexSourceStream stream;
    if (scene) memset(scene, 0, sizeof *scene);
    if (!QexSourceStream_CreateFromMemory(&stream, data, size)) return -1;
    QexPODModel_ReadFromSourceStream(scene, &stream, optionA, option2, optionB, option4);
    QexSourceStream_Release(&stream);
    return 0;
}

}  // extern "C"
