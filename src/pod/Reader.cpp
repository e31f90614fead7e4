#include "pod/Reader.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

constexpr uint32_t kEndMark = 0x80000000u;
constexpr uint32_t kVersionBlock = 1000;
constexpr uint32_t kSceneBlock = 1001;
constexpr uint32_t kSwappedVersionBlock = 0xE8030000u;
constexpr char kVersion[] = "AB.POD.2.0";

// What a block holds and how it is stored.
enum class Kind : uint8_t {
    Words,    // `unit` 32-bit words into the record
    String,   // text into a new allocation
    Array,    // 32-bit words into a new allocation; `unit` bytes make one item of the progress line
    Keys,     // as Array, but may stay in the source memory (`flag` marks it then)
    Bytes,    // the mesh's interleaved block
    Element,  // a CPODData container
    UVWCount,
    UVW,
    Static  // an older file's static transform: `unit` words, kept until the node ends
};

struct Field {
    uint32_t id;
    Kind kind;
    uint16_t unit;
    uint16_t offset;   // in the record, or in the static transform
    int8_t extent;     // which length to note, -1 none
    uint32_t flag;     // ownership flag of Keys
    const char* line;  // progress line, or null
    const char* sharedLine;
};

struct StaticTransform {
    float position[3] = {0, 0, 0};
    float rotation[4] = {0, 0, 0, 1};
    float scale[7] = {1, 1, 1, 0, 0, 0, 0};
    bool given = false;
};

struct Reader;
struct RecordKind {
    uint32_t countId;
    uint32_t blockId;
    const char* name;
    uint32_t size;
    uint16_t countOffset;  // in QexPODModel
    uint16_t arrayOffset;
    const char* countLine;
    const char* title;  // null: none
    const Field* fields;
    uint32_t fieldCount;
    void (*begin)(void* record);
    bool (*end)(Reader& reader, void* record, uint32_t* extents);
};

struct Reader {
    QexSourceStream* stream;
    QexPODModel* scene;
    bool shareKeys;
    bool versionRead = false;
    bool sceneRead = false;
    uint32_t declared[kPODKinds] = {};
    uint32_t capacity[kPODKinds] = {};
    bool counted[kPODKinds] = {};
    QexPODExtents* extents[kPODKinds] = {};
    StaticTransform fixed;
    uint32_t uvwRead = 0;

    uint32_t Remaining() const { return stream->file->size - stream->position; }
};

bool Fail(const Reader& reader, const char* format, ...) QEX_PRINTF(2, 3);
bool Fail(const Reader& reader, const char* format, ...) {
    char text[192];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    QexError(QEX_TAG, "<QexPODModel_ReadFromSourceStream> %s (at byte %u of %u)", text,
             reader.stream->position, reader.stream->file->size);
    return false;
}

bool OutOfMemory(int line) {
    QexDiagnostics_OutOfMemory(QEX_MODULE, line);
    return false;
}

template <class T>
T& At(void* record, uint32_t offset) {
    return *reinterpret_cast<T*>(static_cast<uint8_t*>(record) + offset);
}

#define WORDS(id, count, type, member, line) \
    { id, Kind::Words, count, offsetof(type, member), -1, 0, line, nullptr }
#define STRING(id, type, member, line) \
    { id, Kind::String, 0, offsetof(type, member), -1, 0, line, nullptr }
#define ARRAY(id, unit, type, member, extent, line) \
    { id, Kind::Array, unit, offsetof(type, member), extent, 0, line, nullptr }
#define KEYS(id, unit, member, extent, flag, line, sharedLine) \
    { id, Kind::Keys, unit, offsetof(QexPODNode, member), extent, flag, line, sharedLine }
#define ELEMENT(id, member, extent) \
    { id, Kind::Element, 0, offsetof(QexPODMesh, member), extent, 0, nullptr, nullptr }
#define STATIC(id, count, member) \
    { id, Kind::Static, count, offsetof(StaticTransform, member), -1, 0, nullptr, nullptr }

// clang-format off
const Field kSceneFields[] = {
    WORDS(2000, 3, QexPODModel, backgroundColour, "  - background color %f %f %f\n"),
    WORDS(2001, 3, QexPODModel, ambientColour, "  - background color %f %f %f\n"),
    WORDS(2006, 1, QexPODModel, meshNodeCount, "  - %d node(s) are actually meshes.\n"),
    WORDS(2009, 1, QexPODModel, frameCount, "  - %d frame(s) found.\n"),
    WORDS(2016, 1, QexPODModel, flags, nullptr),
    WORDS(2017, 1, QexPODModel, framesPerSecond, "  - Frames per second = %d\n"),
};

const Field kCameraFields[] = {
    WORDS(8000, 1, QexPODCamera, targetIndex, "    - target index = %d\n"),
    WORDS(8001, 1, QexPODCamera, fov, "    - field of view = %f\n"),
    WORDS(8002, 1, QexPODCamera, farPlane, "    - far plane = %f\n"),
    WORDS(8003, 1, QexPODCamera, nearPlane, "    - near plane = %f\n"),
    ARRAY(8004, 4, QexPODCamera, animatedFov, kExtentFov, "    - animated FOV: %d\n"),
};

const Field kLightFields[] = {
    WORDS(7000, 1, QexPODLight, targetIndex, "    - light target index = %d\n"),
    WORDS(7001, 3, QexPODLight, colour, "    - light color = %f,%f,%f\n"),
    WORDS(7002, 1, QexPODLight, type, "    - light type = %d\n"),
    WORDS(7003, 1, QexPODLight, constantAttenuation, nullptr),
    WORDS(7004, 1, QexPODLight, linearAttenuation, nullptr),
    WORDS(7005, 1, QexPODLight, quadraticAttenuation, nullptr),
    WORDS(7006, 1, QexPODLight, fallOffAngle, "    - light fall off angle = %f\n"),
    WORDS(7007, 1, QexPODLight, fallOffExponent, "    - light fall off exponent = %f\n"),
};

const Field kMaterialFields[] = {
    STRING(3000, QexPODMaterial, name, "    - material name = %s\n"),
    WORDS(3001, 1, QexPODMaterial, diffuseTexture, "    - diffuse texture index = %d\n"),
    WORDS(3002, 1, QexPODMaterial, opacity, "    - opacity = %f\n"),
    WORDS(3003, 3, QexPODMaterial, ambient, nullptr),
    WORDS(3004, 3, QexPODMaterial, diffuse, nullptr),
    WORDS(3005, 3, QexPODMaterial, specular, nullptr),
    WORDS(3006, 1, QexPODMaterial, shininess, "    - shininess = %f\n"),
    STRING(3007, QexPODMaterial, effectFile, "    - material effect file = %s\n"),
    STRING(3008, QexPODMaterial, effectName, "    - material effect name = %s\n"),
    WORDS(3009, 1, QexPODMaterial, ambientTexture, nullptr),
    WORDS(3010, 1, QexPODMaterial, specularColourTexture, nullptr),
    WORDS(3011, 1, QexPODMaterial, specularLevelTexture, nullptr),
    WORDS(3012, 1, QexPODMaterial, bumpTexture, nullptr),
    WORDS(3013, 1, QexPODMaterial, emissiveTexture, nullptr),
    WORDS(3014, 1, QexPODMaterial, glossinessTexture, nullptr),
    WORDS(3015, 1, QexPODMaterial, opacityTexture, nullptr),
    WORDS(3016, 1, QexPODMaterial, reflectionTexture, nullptr),
    WORDS(3017, 1, QexPODMaterial, refractionTexture, nullptr),
    WORDS(3018, 1, QexPODMaterial, blendSrcColour, nullptr),
    WORDS(3019, 1, QexPODMaterial, blendSrcAlpha, nullptr),
    WORDS(3020, 1, QexPODMaterial, blendDstColour, nullptr),
    WORDS(3021, 1, QexPODMaterial, blendDstAlpha, nullptr),
    WORDS(3022, 1, QexPODMaterial, blendOpColour, nullptr),
    WORDS(3023, 1, QexPODMaterial, blendOpAlpha, nullptr),
    WORDS(3024, 4, QexPODMaterial, blendColour, nullptr),
    WORDS(3025, 4, QexPODMaterial, blendFactor, nullptr),
    WORDS(3026, 1, QexPODMaterial, flags, nullptr),
};

const Field kTextureFields[] = {
    STRING(4000, QexPODTexture, name, "    - texture name = %s\n"),
};

const Field kNodeFields[] = {
    WORDS(5000, 1, QexPODNode, objectIndex, "    - node idx = %d\n"),
    STRING(5001, QexPODNode, name, "    - node name = %s\n"),
    WORDS(5002, 1, QexPODNode, materialIndex, "    - node material idx = %d\n"),
    WORDS(5003, 1, QexPODNode, parentIndex, "    - node parent idx = %d\n"),
    STATIC(5004, 3, position),
    STATIC(5005, 4, rotation),
    STATIC(5006, 3, scale),
    KEYS(5007, 12, position, kExtentPosition, QEX_NODE_SHARED_POSITION,
         "    - %d node animation position data\n", "    - %d node animation position data from ROM\n"),
    KEYS(5008, 16, rotation, kExtentRotation, 0, "    - %d node animation rotation data\n", nullptr),
    KEYS(5009, 28, scale, kExtentScale, QEX_NODE_SHARED_SCALE,
         "    - %d node animation scale data\n", "    - %d node animation scale data from ROM\n"),
    KEYS(5011, 64, matrix, kExtentMatrix, QEX_NODE_SHARED_MATRIX,
         "    - read %d node animation matrix\n", "    - point directly to %d node animation matrix \n"),
    WORDS(5012, 1, QexPODNode, animationFlags, "    - node animation flags = %d\n"),
    ARRAY(5013, 4, QexPODNode, positionIndex, kExtentPositionIndex, "    - %d node animation position idx\n"),
    ARRAY(5014, 4, QexPODNode, rotationIndex, kExtentRotationIndex, "    - %d node animation rotation idx\n"),
    ARRAY(5015, 4, QexPODNode, scaleIndex, kExtentScaleIndex, "    - %d node animation scale idx\n"),
    ARRAY(5016, 4, QexPODNode, matrixIndex, kExtentMatrixIndex, "    - %d node animation matrix idx\n"),
};

const Field kMeshFields[] = {
    WORDS(6000, 1, QexPODMesh, vertexCount, "    - mesh vertice = %d\n"),
    WORDS(6001, 1, QexPODMesh, faceCount, "    - mesh faces = %d\n"),
    {6002, Kind::UVWCount, 1, 0, -1, 0, "    - mesh number of UVW = %d\n", nullptr},
    ELEMENT(6003, faces, kExtentFaces),
    ARRAY(6004, 4, QexPODMesh, stripLengths, kExtentStrips, "    - mesh number of strip length = %d\n"),
    WORDS(6005, 1, QexPODMesh, stripCount, "    - mesh number of strips = %d\n"),
    ELEMENT(6006, vertices, kExtentVertices),
    ELEMENT(6007, normals, kExtentNormals),
    ELEMENT(6008, tangents, kExtentTangents),
    ELEMENT(6009, binormals, kExtentBinormals),
    {6010, Kind::UVW, 0, 0, kExtentUVWs, 0, nullptr, nullptr},
    ELEMENT(6011, colours, kExtentColours),
    ELEMENT(6012, boneIndices, kExtentBoneIndices),
    ELEMENT(6013, boneWeights, kExtentBoneWeights),
    {6014, Kind::Bytes, 1, 0, -1, 0, "    - interleaved vertex data length = %d\n", nullptr},
    ARRAY(6015, 4, QexPODMesh, boneBatches.boneTable, kExtentBoneTable, "    - number of batches count= %d\n"),
    ARRAY(6016, 4, QexPODMesh, boneBatches.bonesPerBatch, kExtentBonesPerBatch,
          "    - number of bones per batch= %d\n"),
    ARRAY(6017, 4, QexPODMesh, boneBatches.offsets, kExtentBatchOffsets,
          "    - number of bone batche offsets= %d\n"),
    WORDS(6018, 1, QexPODMesh, boneBatches.maxBones, "    - batch bone maximum = %d\n"),
    WORDS(6019, 1, QexPODMesh, boneBatches.batchCount, "    - batch count = %d\n"),
    WORDS(6020, 16, QexPODMesh, unpackMatrix, "    - mesh unpack matrix found\n"),
};
// clang-format on

template <uint32_t N>
constexpr uint32_t Count(const Field (&)[N]) {
    return N;
}

const Field* Find(const Field* fields, uint32_t count, uint32_t id) {
    for (uint32_t i = 0; i < count; ++i)
        if (fields[i].id == id) return &fields[i];
    return nullptr;
}

// ---- Values ----

bool CheckLength(Reader& reader, uint32_t id, uint32_t length) {
    if (length <= reader.Remaining()) return true;
    return Fail(reader, "block %u needs %u bytes, but %u are left", id, length, reader.Remaining());
}

bool Skip(Reader& reader, uint32_t id, uint32_t length) {
    return CheckLength(reader, id, length) && QexSourceStream_Skip(reader.stream, length);
}

void PrintWords(const Field& field, const void* value) {
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

// Words of a block into `target`; a longer block's rest is passed over.
bool ReadWords(Reader& reader, const Field& field, uint32_t length, void* target) {
    const uint32_t bytes = field.unit * 4u;
    if (!CheckLength(reader, field.id, length)) return false;
    if (length < bytes) return Fail(reader, "block %u holds %u bytes instead of %u", field.id, length, bytes);
    if (!QexSourceStream_ReadArray32(reader.stream, static_cast<uint32_t*>(target), field.unit)) return false;
    PrintWords(field, target);
    return QexSourceStream_Skip(reader.stream, length - bytes) != 0;
}

bool ReadString(Reader& reader, const Field& field, uint32_t length, char*& target) {
    if (!CheckLength(reader, field.id, length)) return false;
    QexMemory_Free(target);
    target = static_cast<char*>(QexMemory_Alloc(length + 1));
    if (!target) return OutOfMemory(__LINE__);
    target[length] = 0;
    if (!QexSourceStream_Read(reader.stream, reinterpret_cast<uint8_t*>(target), length)) return false;
    if (field.line) QexSystem_Printf(field.line, target);
    return true;
}

// A block of words into a new allocation. Bytes beyond the last whole word are passed over.
bool ReadArray(Reader& reader, const Field& field, uint32_t length, uint32_t*& target, uint32_t* extents) {
    if (!CheckLength(reader, field.id, length)) return false;
    QexMemory_Free(target);
    target = nullptr;
    const uint32_t words = length / 4;
    if (words) {
        target = static_cast<uint32_t*>(QexMemory_Alloc(words * 4));
        if (!target) return OutOfMemory(__LINE__);
        if (!QexSourceStream_ReadArray32(reader.stream, target, words)) return false;
    }
    extents[field.extent] = words;
    if (field.line) QexSystem_Printf(field.line, length / field.unit);
    return QexSourceStream_Skip(reader.stream, length % 4) != 0;
}

// A node's keys: left in the source memory where that is allowed, copied otherwise. The files hold rotations
// with the opposite sense, so w changes its sign.
bool ReadKeys(Reader& reader, const Field& field, uint32_t length, QexPODNode* node, uint32_t* extents) {
    uint32_t*& target = At<uint32_t*>(node, field.offset);
    if (node->ownershipFlags & field.flag) target = nullptr;
    node->ownershipFlags &= ~field.flag;
    if (reader.shareKeys && field.flag && length >= 4) {
        if (!CheckLength(reader, field.id, length)) return false;
        QexMemory_Free(target);
        target = reinterpret_cast<uint32_t*>(reader.stream->file->data + reader.stream->position);
        node->ownershipFlags |= field.flag;
        extents[field.extent] = length / 4;
        QexSystem_Printf(field.sharedLine, length / field.unit);
        return QexSourceStream_Skip(reader.stream, length) != 0;
    }
    if (!ReadArray(reader, field, length, target, extents)) return false;
    if (field.extent == kExtentRotation)
        for (uint32_t i = 3; i < extents[kExtentRotation]; i += 4) node->rotation[i] = -node->rotation[i];
    return true;
}

bool ReadInterleaved(Reader& reader, const Field& field, uint32_t length, QexPODMesh* mesh,
                     const uint32_t* extents) {
    if (!CheckLength(reader, field.id, length)) return false;
    if (mesh->interleaved) return Fail(reader, "a mesh has two interleaved blocks");
    for (uint32_t i = kExtentFaces + 1; i < kExtentCount; ++i)
        if (extents[i]) return Fail(reader, "a mesh's interleaved block comes after its elements");
    if (!length) return true;
    mesh->interleaved = static_cast<uint8_t*>(QexMemory_Alloc(length));
    if (!mesh->interleaved) return OutOfMemory(__LINE__);
    mesh->interleavedBytes = length;
    QexSystem_Printf(field.line, length);
    return QexSourceStream_Read(reader.stream, mesh->interleaved, length) != 0;
}

// An element's own bytes, as words of its type's size so that they come out in the host's byte order.
bool ReadElementData(Reader& reader, uint32_t length, CPODData* element, uint32_t& extent) {
    const uint32_t size = QexPODData_ComponentSize(element->type);
    if (!size || length < size) return Skip(reader, 9003, length);
    if (!CheckLength(reader, 9003, length)) return false;
    QexMemory_Free(element->data);
    element->data = static_cast<uint8_t*>(QexMemory_Alloc(length));
    if (!element->data) return OutOfMemory(__LINE__);
    extent = length / size * size;
    int32_t read;
    if (size == 1)
        read = QexSourceStream_Read(reader.stream, element->data, length);
    else if (size == 2)
        read = QexSourceStream_ReadArray16(reader.stream, reinterpret_cast<uint16_t*>(element->data),
                                           length / 2);
    else
        read = QexSourceStream_ReadArray32(reader.stream, reinterpret_cast<uint32_t*>(element->data),
                                           length / 4);
    return read && QexSourceStream_Skip(reader.stream, length % size);
}

bool ReadElement(Reader& reader, uint32_t id, CPODData* element, bool interleaved, uint32_t& extent) {
    uint32_t block, length;
    while (QexSourceStream_ReadMarker(reader.stream, &block, &length)) {
        uint32_t* word = block == 9000   ? &element->type
                         : block == 9001 ? &element->componentCount
                         : block == 9002 ? &element->stride
                                         : nullptr;
        const Field field = {block, Kind::Words, 1, 0, -1, 0, nullptr, nullptr};
        bool read;
        if (block == (id | kEndMark)) return Skip(reader, block, length);
        if (word) {
            read = ReadWords(reader, field, length, word);
        } else if (block == 9003 && interleaved) {
            uint32_t offset = 0;
            read = ReadWords(reader, field, length, &offset);
            element->data = reinterpret_cast<uint8_t*>(static_cast<uintptr_t>(offset));
        } else if (block == 9003) {
            read = ReadElementData(reader, length, element, extent);
        } else {
            read = Skip(reader, block, length);
        }
        if (!read) return false;
    }
    return Fail(reader, "the file ends inside block %u", id);
}

bool ReadUVWCount(Reader& reader, const Field& field, uint32_t length, QexPODMesh* mesh) {
    if (mesh->uvws) return Fail(reader, "a mesh counts its UV channels twice");
    uint32_t count = 0;
    if (!ReadWords(reader, field, length, &count)) return false;
    if (count > kPODMaxUVChannels)
        return Fail(reader, "a mesh has %u UV channels, at most %u are possible", count, kPODMaxUVChannels);
    if (!count) return true;
    mesh->uvws = static_cast<CPODData*>(QexMemory_Alloc(count * static_cast<uint32_t>(sizeof(CPODData))));
    if (!mesh->uvws) return OutOfMemory(__LINE__);
    memset(mesh->uvws, 0, count * sizeof(CPODData));
    mesh->uvwChannelCount = count;
    return true;
}

bool ReadField(Reader& reader, const Field& field, uint32_t length, void* record, uint32_t* extents) {
    QexPODMesh* mesh = static_cast<QexPODMesh*>(record);
    switch (field.kind) {
        case Kind::Words: return ReadWords(reader, field, length, &At<uint8_t>(record, field.offset));
        case Kind::String: return ReadString(reader, field, length, At<char*>(record, field.offset));
        case Kind::Array:
            return ReadArray(reader, field, length, At<uint32_t*>(record, field.offset), extents);
        case Kind::Keys: return ReadKeys(reader, field, length, static_cast<QexPODNode*>(record), extents);
        case Kind::Bytes: return ReadInterleaved(reader, field, length, mesh, extents);
        case Kind::UVWCount: return ReadUVWCount(reader, field, length, mesh);
        case Kind::Element: {
            const bool interleaved = mesh->interleaved && field.id != 6003;
            return ReadElement(reader, field.id, &At<CPODData>(record, field.offset), interleaved,
                               extents[field.extent]);
        }
        case Kind::UVW: {
            if (reader.uvwRead >= mesh->uvwChannelCount)
                return Fail(reader, "a mesh has more UV channels than the %u it counts",
                            mesh->uvwChannelCount);
            const uint32_t channel = reader.uvwRead++;
            return ReadElement(reader, field.id, &mesh->uvws[channel], mesh->interleaved != nullptr,
                               extents[kExtentUVWs + channel]);
        }
        case Kind::Static:
            reader.fixed.given = true;
            return ReadWords(reader, field, length, &At<uint8_t>(&reader.fixed, field.offset));
    }
    return false;
}

// ---- Records ----

void BeginMaterial(void* record) {
    QexPODMaterial* material = static_cast<QexPODMaterial*>(record);
    for (int32_t* index = &material->diffuseTexture; index <= &material->refractionTexture; ++index)
        *index = -1;
    material->blendSrcColour = material->blendSrcAlpha = 1;     // GL_ONE
    material->blendDstColour = material->blendDstAlpha = 0;     // GL_ZERO
    material->blendOpColour = material->blendOpAlpha = 0x8006;  // GL_FUNC_ADD
}

void BeginMesh(void* record) {
    QexMatrix_Identity(&static_cast<QexPODMesh*>(record)->unpackMatrix);
}

void SwapElement(QexPODMesh* mesh, const CPODData& element) {
    const uint32_t size = QexPODData_ComponentSize(element.type);
    if (size < 2) return;
    const uint64_t words = QexPODData_ElementSize(element.type, element.componentCount) / size;
    const uint64_t offset = reinterpret_cast<uintptr_t>(element.data);
    for (uint64_t v = 0; v < mesh->vertexCount; ++v)
        for (uint64_t c = 0; c < words; ++c) {
            const uint64_t at = offset + v * element.stride + c * size;
            if (at + size > mesh->interleavedBytes) return;
            uint8_t* bytes = mesh->interleaved + at;
            for (uint32_t i = 0; i < size / 2; ++i) {
                const uint8_t low = bytes[i];
                bytes[i] = bytes[size - 1 - i];
                bytes[size - 1 - i] = low;
            }
        }
}

bool EndMesh(Reader&, void* record, uint32_t*) {
    QexPODMesh* mesh = static_cast<QexPODMesh*>(record);
    if (QexIsLittleEndian() || !mesh->interleaved) return true;
    for (const CPODData* element = &mesh->vertices; element <= &mesh->binormals; ++element)
        SwapElement(mesh, *element);
    for (const CPODData* element = &mesh->colours; element <= &mesh->boneWeights; ++element)
        SwapElement(mesh, *element);
    for (uint32_t i = 0; i < mesh->uvwChannelCount; ++i) SwapElement(mesh, mesh->uvws[i]);
    return true;
}

// Gives a node of the older layout one key from its static value where it has no keys.
bool CompleteStatic(float*& keys, const float* value, uint32_t count, uint32_t bit, QexPODNode* node,
                    uint32_t& extent) {
    if (keys) {
        node->animationFlags |= bit;
        return true;
    }
    keys = static_cast<float*>(QexMemory_Alloc(count * 4));
    if (!keys) return OutOfMemory(__LINE__);
    memcpy(keys, value, count * sizeof(float));
    extent = count;
    return true;
}

bool EndNode(Reader& reader, void* record, uint32_t* extents) {
    QexPODNode* node = static_cast<QexPODNode*>(record);
    const StaticTransform fixed = reader.fixed;
    reader.fixed = StaticTransform();
    node->speed = 1;
    node->stateFlags = QEX_NODE_ANIMATION_ENABLED | QEX_NODE_RENDERING_ENABLED;
    node->blendFlags = QEX_NODE_OPAQUE;
    QexPODModel_ResetNodeTransform(node);
    if (!fixed.given) return true;
    return CompleteStatic(node->position, fixed.position, 3, QEX_NODE_POSITION_ANIMATED, node,
                          extents[kExtentPosition]) &&
           CompleteStatic(node->rotation, fixed.rotation, 4, QEX_NODE_ROTATION_ANIMATED, node,
                          extents[kExtentRotation]) &&
           CompleteStatic(node->scale, fixed.scale, 7, QEX_NODE_SCALE_ANIMATED, node, extents[kExtentScale]);
}

#define KIND(countId, blockId, name, type, counter, array, countLine, title, fields, begin, end)            \
    {                                                                                                       \
        countId, blockId, name, sizeof(type), offsetof(QexPODModel, counter), offsetof(QexPODModel, array), \
            countLine, title, fields, Count(fields), begin, end                                             \
    }
const RecordKind kKinds[kPODKinds] = {
    KIND(2002, 2010, "camera", QexPODCamera, cameraCount, cameras, "  - %d camera(s) found.\n",
         "  - [Camera]\n", kCameraFields, nullptr, nullptr),
    KIND(2003, 2011, "light", QexPODLight, lightCount, lights, "  - %d light(s) found.\n", nullptr,
         kLightFields, nullptr, nullptr),
    KIND(2004, 2012, "mesh", QexPODMesh, meshCount, meshes, "  - %d mesh(es) found.\n", "  - [Mesh]\n",
         kMeshFields, BeginMesh, EndMesh),
    KIND(2005, 2013, "node", QexPODNode, nodeCount, nodes, "  - %d node(s) found.\n", "  - [Node]\n",
         kNodeFields, nullptr, EndNode),
    KIND(2007, 2014, "texture", QexPODTexture, textureCount, textures, "  - %d texture(s) found.\n",
         "  - [Texture]\n", kTextureFields, nullptr, nullptr),
    KIND(2008, 2015, "material", QexPODMaterial, materialCount, materials, "  - %d material(s) found.\n",
         "  - [Material]\n", kMaterialFields, BeginMaterial, nullptr),
};

bool ReadCount(Reader& reader, int kind, uint32_t length) {
    const RecordKind& k = kKinds[kind];
    if (reader.counted[kind]) return Fail(reader, "the scene counts its %s records twice", k.name);
    reader.counted[kind] = true;
    const Field field = {k.countId, Kind::Words, 1, 0, -1, 0, k.countLine, nullptr};
    if (!ReadWords(reader, field, length, &reader.declared[kind])) return false;
    // The shortest record is a pair of markers.
    if (reader.declared[kind] <= reader.Remaining() / 16) return true;
    return Fail(reader, "the scene counts %u %s records, more than the file can hold", reader.declared[kind],
                k.name);
}

// The next zeroed record of a kind. Arrays grow with the records that are really there, so that a count alone
// takes no memory.
void* NextRecord(Reader& reader, int kind) {
    const RecordKind& k = kKinds[kind];
    uint32_t& used = At<uint32_t>(reader.scene, k.countOffset);
    void*& array = At<void*>(reader.scene, k.arrayOffset);
    if (used == reader.capacity[kind]) {
        uint32_t capacity = used ? used * 2 : 16;
        if (capacity > reader.declared[kind]) capacity = reader.declared[kind];
        if (!QexMemory_Resize(array, uint64_t{capacity} * k.size) ||
            !QexMemory_Resize(reader.extents[kind], uint64_t{capacity} * sizeof(QexPODExtents))) {
            OutOfMemory(__LINE__);
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

bool ReadRecord(Reader& reader, int kind) {
    const RecordKind& k = kKinds[kind];
    const uint32_t index = At<uint32_t>(reader.scene, k.countOffset);
    if (index >= reader.declared[kind])
        return Fail(reader, "the scene holds more %s records than the %u it counts", k.name,
                    reader.declared[kind]);
    void* record = NextRecord(reader, kind);
    if (!record) return false;
    uint32_t* extents = reader.extents[kind][index];
    reader.uvwRead = 0;
    if (k.title) QexSystem_Printf("%s", k.title);
    if (k.begin) k.begin(record);
    uint32_t id, length;
    while (QexSourceStream_ReadMarker(reader.stream, &id, &length)) {
        if (id == (k.blockId | kEndMark))
            return Skip(reader, id, length) && (!k.end || k.end(reader, record, extents));
        const Field* field = Find(k.fields, k.fieldCount, id);
        if (!field && kind == kPODMaterial && !(id & kEndMark))
            QexLog(QEX_TAG, "<QexPODFile_ReadMaterial> skip unknown block");
        if (!(field ? ReadField(reader, *field, length, record, extents) : Skip(reader, id, length)))
            return false;
    }
    return Fail(reader, "the file ends inside %s %u", k.name, index);
}

// ---- The scene ----

bool EndScene(Reader& reader) {
    for (int kind = 0; kind < kPODKinds; ++kind) {
        const uint32_t found = At<uint32_t>(reader.scene, kKinds[kind].countOffset);
        if (found != reader.declared[kind])
            return Fail(reader, "the scene counts %u %s records but holds %u", reader.declared[kind],
                        kKinds[kind].name, found);
    }
    reader.sceneRead = true;
    return QexLoadPODModel_Check(reader.scene, reader.extents);
}

bool ReadScene(Reader& reader) {
    reader.scene->framesPerSecond = 30;
    uint32_t id, length;
    while (QexSourceStream_ReadMarker(reader.stream, &id, &length)) {
        if (id == (kSceneBlock | kEndMark)) return Skip(reader, id, length) && EndScene(reader);
        const Field* field = Find(kSceneFields, Count(kSceneFields), id);
        int kind = 0;
        while (kind < kPODKinds && id != kKinds[kind].countId && id != kKinds[kind].blockId) ++kind;
        bool read;
        if (field)
            read = ReadField(reader, *field, length, reader.scene, nullptr);
        else if (kind < kPODKinds)
            read = id == kKinds[kind].countId ? ReadCount(reader, kind, length) : ReadRecord(reader, kind);
        else
            read = Skip(reader, id, length);
        if (!read) return false;
    }
    return Fail(reader, "the file ends inside the scene");
}

bool ReadVersion(Reader& reader, uint32_t length) {
    char text[sizeof kVersion] = {};
    if (length != sizeof kVersion)
        return Fail(reader, "the version block holds %u bytes instead of 11", length);
    if (!CheckLength(reader, kVersionBlock, length)) return false;
    if (!QexSourceStream_Read(reader.stream, reinterpret_cast<uint8_t*>(text), length)) return false;
    if (memcmp(text, kVersion, sizeof kVersion) != 0)
        return Fail(reader, "the version is not \"%s\"", kVersion);
    QexSystem_Printf("  - POD version string %s\n", text);
    reader.versionRead = true;
    return true;
}

bool ReadBlocks(Reader& reader) {
    uint32_t id, length;
    while (QexSourceStream_ReadMarker(reader.stream, &id, &length)) {
        bool read;
        if (id == kVersionBlock) {
            read = ReadVersion(reader, length);
        } else if (id == kSceneBlock && reader.scene) {
            read = reader.sceneRead ? Fail(reader, "the file holds two scenes") : ReadScene(reader);
        } else if (id == kSwappedVersionBlock) {
            QexSystem_Printf("  - POD endianness mismatch!\n");
            read = Fail(reader, "the file is in the other byte order");
        } else if (id == kSceneBlock) {
            read = true;  // its sub-blocks are passed over one by one
        } else if (!reader.versionRead && !reader.sceneRead && length > reader.Remaining()) {
            read = Fail(reader, "not a POD file");
        } else {
            read = Skip(reader, id, length);
        }
        if (!read) return false;
    }
    return true;
}

bool Finish(Reader& reader, bool anyway) {
    if (!anyway && !reader.versionRead) return Fail(reader, "not a POD file: no version block");
    if (!anyway && !reader.sceneRead) return Fail(reader, "no scene in the file");
    if (!reader.scene || QexPODModel_InitImpl(reader.scene) == 0) return true;
    return OutOfMemory(__LINE__);
}

}  // namespace

extern "C" {

int32_t QexPODModel_ReadFromSourceStream(QexPODModel* scene, QexSourceStream* stream, uint32_t optionA,
                                         uint32_t, uint32_t optionB, uint32_t) {
    if (scene) memset(scene, 0, sizeof *scene);
    if (!stream || !stream->file) return -1;
    Reader reader = {};
    reader.stream = stream;
    reader.scene = scene;
    // Keys can stay where they are only while their bytes are in the host's order.
    reader.shareKeys = QexResFile_IsMemoryFile(stream->file) && QexIsLittleEndian();
    const bool read = ReadBlocks(reader) && Finish(reader, optionA || optionB);
    for (QexPODExtents* extents : reader.extents) QexMemory_Free(extents);
    return read ? 0 : -1;
}

int32_t QexPODModel_ReadFromFile(QexPODModel* scene, const char* path, uint32_t optionA, uint32_t option2,
                                 uint32_t optionB, uint32_t option4) {
    QexSourceStream stream;
    if (scene) memset(scene, 0, sizeof *scene);
    if (!QexSourceStream_Create(&stream, path)) return -1;
    QexPODModel_ReadFromSourceStream(scene, &stream, optionA, option2, optionB, option4);
    QexSourceStream_Release(&stream);
    return 0;
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
