// The geometry of a mesh as it goes to GL: its own interleaved block where that will do, laid out anew where
// not.
#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"
#include "model/Geometry.h"
#include "pod/BoneBoxes.h"
#include "pod/Rebatch.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

#define QEX_MODULE "src/QexModel"

namespace {

// How GL takes a POD data type. One without a GL type is converted to floats.
struct GLType {
    GLenum type;
    bool normalised;
};

GLType ToGLType(uint32_t podType) {
    static const GLenum types[] = {
        0,                  // none
        GL_FLOAT,           // float
        0,                  // 32 bits
        0,                  // 32 bits, unsigned
        GL_SHORT,           // 16 bits
        GL_UNSIGNED_SHORT,  // 16 bits, unsigned
        GL_BYTE,            // 8 bits
        GL_UNSIGNED_BYTE,   // 8 bits, unsigned
        GL_FIXED,           // 16.16
        0,                  // colour word
        0,                  // three 10-bit fields
    };
    static_assert(sizeof types / sizeof *types == kPODStorages, "a GL type, or none, for every storage");
    const QexPODType& type = QexPODType_Of(podType);
    return {types[type.storage], type.plain != podType};
}

using Element = QexMeshUploadElement;

// Where a mesh lacks an element.
const CPODData kNoData = {};
// Binormals that were made.
const CPODData kMadeData = {QEX_POD_FLOAT, 3, sizeof(QexVec3), nullptr};

// The elements that are uploaded, in the order of QexVertexElement.
void ListElements(Element* elements, const QexPODMesh& mesh) {
    for (int i = 0; i < QEX_ELEMENT_COUNT; ++i) elements[i] = {&kNoData, nullptr, false, 0};
    const uint32_t count = QexPODMesh_ElementCount(&mesh);
    for (uint32_t i = kPODVertices; i < count && i <= kPODUVWs; ++i) {
        const CPODData& data = *QexPODMesh_Element(&mesh, i);
        const int32_t attribute = kPODElements[i].attribute;
        if (attribute < 0 || !data.componentCount) continue;
        // Positions are always floats: the mesh's box comes from them, and its unpack matrix goes into them.
        const bool asFloats = i == kPODVertices ? data.type != QEX_POD_FLOAT : !ToGLType(data.type).type;
        const uint32_t bytes = asFloats ? QexPODData_Components(data) * 4 : QexPODData_ElementSize(data);
        elements[attribute] = {&data, QexPODMesh_ElementData(&mesh, data), asFloats, (bytes + 3) / 4 * 4};
    }
}

bool IsIdentity(const QexMatrix& matrix) {
    return memcmp(&matrix, &g_sMatIdentity, sizeof matrix) == 0;
}

// Whether the interleaved block can go to GL as it is: one stride, everything within it and aligned.
bool UploadsAsIs(const QexPODMesh& mesh, const Element* elements) {
    const uint32_t stride = mesh.vertices.stride;
    if (!mesh.interleaved || !mesh.vertices.componentCount || !IsIdentity(mesh.unpackMatrix)) return false;
    if (uint64_t{stride} * mesh.vertexCount > mesh.interleavedBytes || stride > INT32_MAX) return false;
    for (int i = 0; i < QEX_ELEMENT_COUNT; ++i) {
        const Element& element = elements[i];
        const CPODData& data = *element.data;
        if (!data.componentCount) continue;
        const uint32_t unit = QexPODType_Of(data.type).componentSize;
        const uint64_t offset = reinterpret_cast<uintptr_t>(data.data);
        if (element.asFloats || data.stride != stride || offset % unit || stride % unit) return false;
        if (offset + QexPODData_ElementSize(data) > stride) return false;
    }
    return true;
}

QexVertexAttribute Describe(QexVertexElement element, const CPODData& data, bool asFloats, uint32_t stride,
                            uint32_t offset) {
    GLType gl = asFloats ? GLType{GL_FLOAT, false} : ToGLType(data.type);
    // Bone indices count, weights are shares of 1, whatever the file calls its bytes.
    if (element == QEX_ELEMENT_BONE_INDEX) gl.normalised = false;
    if (element == QEX_ELEMENT_BONE_WEIGHT) gl.normalised = gl.type != GL_FLOAT && gl.type != GL_FIXED;
    if (!data.componentCount) return {};
    const int32_t components = static_cast<int32_t>(QexPODData_Components(data));
    return {components, gl.type, gl.normalised ? 1u : 0u, stride, offset};
}

// An element as floats; bytes are signed here, as GL takes them.
void Decode(float* out, const uint8_t* source, const CPODData& data) {
    QexPODVertex_ReadVec(out, source, data.type, static_cast<int32_t>(data.componentCount));
    const QexPODType& type = QexPODType_Of(data.type);
    if (type.storage != kPODInt8) return;
    for (uint32_t i = 0; i < data.componentCount; ++i)
        if (source[i] > 127) out[i] -= 256.0f / type.divisor;
}

void PackElement(uint8_t* out, const QexPODMesh& mesh, const Element& element, bool position,
                 uint32_t vertex) {
    const CPODData& data = *element.data;
    const uint8_t* source = element.source + uint64_t{vertex} * data.stride;
    if (!element.asFloats && !position) {
        memcpy(out, source, QexPODData_ElementSize(data));
        return;
    }
    QexVec4 value;
    Decode(&value.x, source, data);
    if (position) {
        value.w = 1;
        QexMatrix_TransformVec4(&mesh.unpackMatrix, &value, &value);
    }
    memcpy(out, &value, QexPODData_Components(data) * sizeof(float));
}

// Some exporters write tangents alone.
bool LacksBinormals(const QexPODMesh& mesh) {
    return mesh.tangents.componentCount >= 3 && mesh.normals.componentCount >= 3 &&
           !mesh.binormals.componentCount && mesh.vertexCount;
}

QexVec4 ReadElement(const Element& element, uint32_t vertex) {
    QexVec4 value;
    Decode(&value.x, element.source + uint64_t{vertex} * element.data->stride, *element.data);
    return value;
}

uint32_t CountCorners(const QexPODMesh& mesh) {
    return QexPODMesh_CountTriangles(mesh) * 3;
}

// Room for the binormals of a mesh that lacks them.
bool BeginBinormals(QexMeshUpload* upload, const QexPODMesh& mesh) {
    upload->madeBinormals = QexMemory_AllocArray<QexVec3>(mesh.vertexCount);
    if (upload->elements[QEX_ELEMENT_UV0].size) {
        upload->corners = QexMemory_AllocArray<uint32_t>(CountCorners(mesh));
        upload->turned = QexMemory_AllocZeroed<uint8_t>(mesh.vertexCount);
        if (!upload->corners || !upload->turned) return false;
    }
    upload->elements[QEX_ELEMENT_BINORMAL] = {
        &kMadeData, reinterpret_cast<const uint8_t*>(upload->madeBinormals), false, sizeof(QexVec3)};
    return upload->madeBinormals != nullptr;
}

// Describes vertices that are to be laid out anew, interleaved and aligned, and finds room for them.
bool BeginPack(QexMeshUpload* upload, QexPODMesh* mesh) {
    uint32_t offset = 0;
    for (const Element& element : upload->elements) upload->stride += element.size;
    for (int i = 0; i < QEX_ELEMENT_COUNT; ++i) {
        const Element& element = upload->elements[i];
        mesh->attributes[i] = Describe(static_cast<QexVertexElement>(i), *element.data, element.asFloats,
                                       upload->stride, offset);
        offset += element.size;
    }
    const uint64_t bytes = uint64_t{upload->stride} * mesh->vertexCount;
    if (bytes <= INT32_MAX) upload->packedVertices = QexMemory_AllocArray<uint8_t>(bytes);
    upload->vertices = upload->packedVertices;
    upload->vertexBytes = static_cast<uint32_t>(bytes);
    return upload->packedVertices != nullptr;
}

// ---- Laying out, in phases over vertices or triangles from `first` to `end` ----

// Binormals are normal x tangent, turned round where the texture is mirrored: where its coordinates run
// clockwise around a triangle.
void CrossNormals(QexMeshUpload* upload, const QexPODMesh&, uint32_t first, uint32_t end) {
    for (uint32_t v = first; v < end; ++v) {
        const QexVec4 n = ReadElement(upload->elements[QEX_ELEMENT_NORMAL], v);
        const QexVec4 t = ReadElement(upload->elements[QEX_ELEMENT_TANGENT], v);
        upload->madeBinormals[v] = {n.y * t.z - n.z * t.y, n.z * t.x - n.x * t.z, n.x * t.y - n.y * t.x};
    }
}

void ListCorners(QexMeshUpload* upload, const QexPODMesh& mesh, uint32_t, uint32_t) {
    QexPODMesh_ListCorners(mesh, upload->corners);
}

void FindMirrored(QexMeshUpload* upload, const QexPODMesh&, uint32_t first, uint32_t end) {
    const Element& uv = upload->elements[QEX_ELEMENT_UV0];
    for (uint32_t triangle = first; triangle < end; ++triangle) {
        const uint32_t* corners = upload->corners + uint64_t{triangle} * 3;
        const QexVec4 a = ReadElement(uv, corners[0]), b = ReadElement(uv, corners[1]);
        const QexVec4 c = ReadElement(uv, corners[2]);
        const bool mirrored = (b.x - a.x) * (c.y - a.y) < (c.x - a.x) * (b.y - a.y);
        for (int corner = 0; mirrored && corner < 3; ++corner) upload->turned[corners[corner]] = 1;
    }
}

void TurnMirrored(QexMeshUpload* upload, const QexPODMesh&, uint32_t first, uint32_t end) {
    for (uint32_t v = first; v < end; ++v)
        if (upload->turned[v]) QexVec3_Scale(&upload->madeBinormals[v], &upload->madeBinormals[v], -1);
}

void Pack(QexMeshUpload* upload, const QexPODMesh& mesh, uint32_t first, uint32_t end) {
    const uint32_t stride = upload->stride;
    uint8_t* out = upload->packedVertices + uint64_t{first} * stride;
    memset(out, 0, static_cast<size_t>(uint64_t{end - first} * stride));
    for (int i = 0; i < QEX_ELEMENT_COUNT; ++i) {
        const Element& element = upload->elements[i];
        for (uint32_t v = first; element.size && v < end; ++v)
            PackElement(out + uint64_t{v - first} * stride, mesh, element, i == QEX_ELEMENT_POSITION, v);
        out += element.size;
    }
}

bool PrepareIndices(QexMeshUpload* upload, const QexPODMesh& mesh, uint32_t meshIndex) {
    if (!mesh.faces.data) return true;
    upload->indexCount = QexPODModel_CountIndices(&mesh);
    if (mesh.faces.type == QEX_POD_UNSIGNED_SHORT) {
        upload->indices = reinterpret_cast<const uint16_t*>(mesh.faces.data);
        return true;
    }
    if (mesh.vertexCount > 65536) {
        QexError(QEX_TAG,
                 "<QexModel_DownloadGeometry> mesh %u has %u vertices, more than 16-bit indices reach",
                 meshIndex, mesh.vertexCount);
        return false;
    }
    const uint32_t bytes = upload->indexCount * static_cast<uint32_t>(sizeof(uint16_t));
    upload->packedIndices = static_cast<uint16_t*>(QexMemory_Alloc(bytes ? bytes : 1));
    if (!upload->packedIndices) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return false;
    }
    const uint32_t* wide = reinterpret_cast<const uint32_t*>(mesh.faces.data);
    for (uint32_t i = 0; i < upload->indexCount; ++i)
        upload->packedIndices[i] = static_cast<uint16_t>(wide[i]);
    upload->indices = upload->packedIndices;
    return true;
}

// Gives the mesh batches that the shaders can hold, if it has larger ones.
bool FitBatches(QexPODMesh* mesh, uint32_t meshIndex) {
    int32_t most = 0;
    for (int32_t i = 0; mesh->skinned && i < mesh->boneBatches.batchCount; ++i)
        if (mesh->boneBatches.bonesPerBatch[i] > most) most = mesh->boneBatches.bonesPerBatch[i];
    if (most <= QEX_MAX_BATCH_BONES) return true;
    const char* fault = QexPODMesh_MakeBatches(mesh, QEX_MAX_BATCH_BONES);
    if (!fault) return true;
    QexError(QEX_TAG,
             "<QexModel_DownloadGeometry> mesh %u has a bone batch of %d bones, at most %d are drawn, and "
             "cannot be cut into smaller ones: %s",
             meshIndex, most, QEX_MAX_BATCH_BONES, fault);
    return false;
}

struct Phase {
    void (*run)(QexMeshUpload* upload, const QexPODMesh& mesh, uint32_t first, uint32_t end);
    uint32_t (*items)(const QexMeshUpload& upload, const QexPODMesh& mesh);
};

const Phase kPhases[] = {
    {CrossNormals,
     [](const QexMeshUpload& u, const QexPODMesh& mesh) { return u.madeBinormals ? mesh.vertexCount : 0; }},
    {ListCorners, [](const QexMeshUpload& u, const QexPODMesh&) { return u.corners ? 1u : 0u; }},
    {FindMirrored,
     [](const QexMeshUpload& u, const QexPODMesh& mesh) { return u.corners ? CountCorners(mesh) / 3 : 0; }},
    {TurnMirrored,
     [](const QexMeshUpload& u, const QexPODMesh& mesh) { return u.turned ? mesh.vertexCount : 0; }},
    {Pack,
     [](const QexMeshUpload& u, const QexPODMesh& mesh) { return u.packedVertices ? mesh.vertexCount : 0; }},
};
constexpr uint32_t kPhaseCount = sizeof kPhases / sizeof *kPhases;
constexpr uint32_t kItemBytes = 32;  // that one is taken for

void Measure(const QexMeshUpload& upload, QexPODMesh* mesh) {
    const QexVertexAttribute& position = mesh->attributes[QEX_ELEMENT_POSITION];
    const bool whole = position.componentCount >= 3;
    QexBoundingBox_ComputeInterleaved(&mesh->localBox, upload.vertices,
                                      whole ? static_cast<int32_t>(mesh->vertexCount) : 0, position.offset,
                                      position.stride);
    if (whole) QexPODMesh_MeasureBones(mesh, upload.vertices + position.offset, position.stride);
}

}  // namespace

bool QexModelGeometry_Begin(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t meshIndex) {
    memset(upload, 0, sizeof *upload);
    if (!FitBatches(mesh, meshIndex) || !PrepareIndices(upload, *mesh, meshIndex)) return false;
    Element* elements = upload->elements;
    ListElements(elements, *mesh);
    const bool lacking = LacksBinormals(*mesh);
    if (!lacking && UploadsAsIs(*mesh, elements)) {
        for (int i = 0; i < QEX_ELEMENT_COUNT; ++i) {
            const CPODData& data = *elements[i].data;
            mesh->attributes[i] = Describe(static_cast<QexVertexElement>(i), data, false, data.stride,
                                           static_cast<uint32_t>(reinterpret_cast<uintptr_t>(data.data)));
        }
        upload->vertices = mesh->interleaved;
        upload->vertexBytes = mesh->vertices.stride * mesh->vertexCount;
        return true;
    }
    if ((!lacking || BeginBinormals(upload, *mesh)) && BeginPack(upload, mesh)) return true;
    QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return false;
}

QexStep QexModelGeometry_LayOut(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t piece) {
    for (; upload->phase < kPhaseCount; ++upload->phase, upload->done = 0) {
        const uint32_t first = upload->done, left = kPhases[upload->phase].items(*upload, *mesh) - first;
        if (!left) continue;
        upload->done += left < piece / kItemBytes ? left : piece / kItemBytes;
        kPhases[upload->phase].run(upload, *mesh, first, upload->done);
        return QexStep::kMore;
    }
    Measure(*upload, mesh);
    return QexStep::kDone;
}

bool QexModelGeometry_Prepare(QexMeshUpload* upload, QexPODMesh* mesh, uint32_t meshIndex) {
    if (!QexModelGeometry_Begin(upload, mesh, meshIndex)) return false;
    return QexStep_Run(upload,
                       [mesh](QexMeshUpload* u) { return QexModelGeometry_LayOut(u, mesh, kQexWhole); });
}

void QexModelGeometry_Release(QexMeshUpload* upload) {
    QexMemory_Free(upload->packedVertices);
    QexMemory_Free(upload->packedIndices);
    QexMemory_Free(upload->madeBinormals);
    QexMemory_Free(upload->corners);
    QexMemory_Free(upload->turned);
    memset(upload, 0, sizeof *upload);
}
