#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "pod/Reader.h"
#include "pod/Scene.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

// Indices that may name what the scene does not have: they count as none. What they lead to is left out of
// the picture; the rest of the scene is as good as ever.
enum Reference {
    kMaterialOfNode,
    kTextureOfMaterial,
    kTargetOfCamera,
    kTargetOfLight,
    kBoneOfBatch,
    kReferences
};

struct Check {
    QexPODModel* scene;
    const char* kind;  // the record being checked
    uint32_t index;
    uint32_t* dangling;  // how many indices of each Reference name nothing
};

bool Fail(const Check& at, const char* format, ...) QEX_PRINTF(2, 3);
bool Fail(const Check& at, const char* format, ...) {
    char text[192];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    QexError(QEX_TAG, "<QexPODModel_ReadFromSourceStream> %s %u: %s", at.kind, at.index, text);
    return false;
}

// An index that may be -1 for none.
bool InRange(int32_t index, uint32_t count) {
    return index == -1 || static_cast<uint32_t>(index) < count;
}

// Makes an index that names nothing -1, and counts it.
void Settle(const Check& at, Reference reference, int32_t* index, uint32_t count) {
    if (InRange(*index, count)) return;
    *index = -1;
    ++at.dangling[reference];
}

void ReportDangling(const uint32_t* dangling) {
    static const char* const lines[kReferences] = {
        "%u node(s) name a material that is not there and are drawn without one",
        "%u texture(s) that materials name are not there",
        "%u camera(s) have a target that is not there",
        "%u light(s) have a target that is not there",
        "%u bone(s) of batches are not there; what follows them moves with its mesh",
    };
    for (int i = 0; i < kReferences; ++i) {
        if (!dangling[i]) continue;
        char text[128];
        snprintf(text, sizeof text, lines[i], dangling[i]);
        QexLog(QEX_TAG, "<QexPODModel_ReadFromSourceStream> %s", text);
    }
}

// ---- Meshes ----

bool CheckElement(const Check& at, const char* name, CPODData* element, uint32_t ownBytes) {
    const QexPODMesh& mesh = at.scene->meshes[at.index];
    const uint64_t offset = mesh.interleaved ? reinterpret_cast<uintptr_t>(element->data) : 0;
    const uint64_t bytes = mesh.interleaved ? mesh.interleavedBytes : ownBytes;
    if (!element->componentCount || !mesh.vertexCount) return true;
    if (!mesh.interleaved && !element->data) {
        element->componentCount = 0;  // declared, but without data
        return true;
    }
    if (!QexPODData_ComponentSize(element->type))
        return Fail(at, "%s of unknown type %u", name, element->type);
    if (element->componentCount > 4) return Fail(at, "%s of %u components", name, element->componentCount);
    const uint32_t size = QexPODData_ElementSize(element->type, element->componentCount);
    if (!element->stride && !mesh.interleaved) element->stride = size;
    if (element->stride < size && mesh.vertexCount > 1)
        return Fail(at, "%s of %u bytes with a stride of %u", name, size, element->stride);
    const uint64_t end = offset + uint64_t{mesh.vertexCount - 1} * element->stride + size;
    if (end <= bytes) return true;
    return Fail(at, "%s of %u vertices reach byte %llu of %llu", name, mesh.vertexCount,
                static_cast<unsigned long long>(end), static_cast<unsigned long long>(bytes));
}

bool CheckElements(const Check& at, const uint32_t* extents) {
    QexPODMesh& mesh = at.scene->meshes[at.index];
    const struct {
        const char* name;
        CPODData* element;
        uint32_t extent;
    } elements[] = {
        {"positions", &mesh.vertices, kExtentVertices},
        {"normals", &mesh.normals, kExtentNormals},
        {"tangents", &mesh.tangents, kExtentTangents},
        {"binormals", &mesh.binormals, kExtentBinormals},
        {"colours", &mesh.colours, kExtentColours},
        {"bone indices", &mesh.boneIndices, kExtentBoneIndices},
        {"bone weights", &mesh.boneWeights, kExtentBoneWeights},
    };
    for (const auto& e : elements)
        if (!CheckElement(at, e.name, e.element, extents[e.extent])) return false;
    for (uint32_t i = 0; i < mesh.uvwChannelCount; ++i)
        if (!CheckElement(at, "texture coordinates", &mesh.uvws[i], extents[kExtentUVWs + i])) return false;
    return true;
}

template <class Index>
uint32_t Highest(const uint8_t* data, uint64_t count) {
    const Index* indices = reinterpret_cast<const Index*>(data);
    Index highest = 0;
    for (uint64_t i = 0; i < count; ++i) highest = indices[i] > highest ? indices[i] : highest;
    return highest;
}

bool CheckFaces(const Check& at, const uint32_t* extents) {
    QexPODMesh& mesh = at.scene->meshes[at.index];
    uint64_t count = uint64_t{mesh.faceCount} * 3;
    if (mesh.stripCount) {
        if (mesh.stripCount > extents[kExtentStrips])
            return Fail(at, "%u strips, but %u strip lengths", mesh.stripCount, extents[kExtentStrips]);
        count = 0;
        for (uint32_t i = 0; i < mesh.stripCount; ++i) count += uint64_t{mesh.stripLengths[i]} + 2;
    }
    if (count > INT32_MAX) return Fail(at, "more faces than can be drawn");
    if (!mesh.faces.data) {
        // Only positions show that the vertices counted are really there.
        const uint32_t vertices = mesh.vertices.componentCount ? mesh.vertexCount : 0;
        if (count <= vertices) return true;
        return Fail(at, "its faces need %u vertices, it has %u", static_cast<uint32_t>(count), vertices);
    }
    const bool wide = mesh.faces.type == QEX_POD_UNSIGNED_INT;
    if (!wide && mesh.faces.type != QEX_POD_UNSIGNED_SHORT)
        return Fail(at, "face indices of type %u", mesh.faces.type);
    if (count > extents[kExtentFaces] / (wide ? 4 : 2))
        return Fail(at, "its faces need %u indices, it has %u", static_cast<uint32_t>(count),
                    extents[kExtentFaces] / (wide ? 4 : 2));
    if (!count) return true;
    const uint32_t highest =
        wide ? Highest<uint32_t>(mesh.faces.data, count) : Highest<uint16_t>(mesh.faces.data, count);
    if (highest < mesh.vertexCount) return true;
    return Fail(at, "a face uses vertex %u of %u", highest, mesh.vertexCount);
}

// Bone indices count even where the file calls them normalised: the shaders get them as they are.
uint32_t BoneIndexType(uint32_t type) {
    switch (type) {
        case QEX_POD_SHORT_NORM: return QEX_POD_SHORT;
        case QEX_POD_BYTE_NORM: return QEX_POD_BYTE;
        case QEX_POD_UNSIGNED_BYTE_NORM: return QEX_POD_UNSIGNED_BYTE;
        case QEX_POD_UNSIGNED_SHORT_NORM: return QEX_POD_UNSIGNED_SHORT;
        default: return type;
    }
}

// Every bone that a vertex really follows lies in its batch. A bone of weight 0 may be anything in the file;
// it becomes 0, so that no shader reads past its matrices.
bool CheckBoneIndices(const Check& at, uint32_t vertex, int32_t bones) {
    QexPODMesh& mesh = at.scene->meshes[at.index];
    const int32_t n = static_cast<int32_t>(QexPODData_Components(mesh.boneIndices));
    float bone[4], weight[4];
    QexPODMesh_ReadInfluences(&mesh, vertex, bone, weight);
    bool changed = false;
    for (int32_t i = 0; i < n; ++i) {
        if (bone[i] >= 0 && bone[i] < static_cast<float>(bones)) continue;
        if (weight[i] != 0)
            return Fail(at, "vertex %u follows bone %g of a batch of %d", vertex,
                        static_cast<double>(bone[i]), bones);
        bone[i] = 0;
        changed = true;
    }
    if (changed)
        QexVertexWriteVec(
            QexPODMesh_ElementData(&mesh, mesh.boneIndices) + uint64_t{vertex} * mesh.boneIndices.stride,
            BoneIndexType(mesh.boneIndices.type), n, bone);
    return true;
}

bool CheckBatch(const Check& at, int32_t batch) {
    const QexPODMesh& mesh = at.scene->meshes[at.index];
    const QexBoneBatches& b = mesh.boneBatches;
    const int32_t bones = b.bonesPerBatch[batch];
    const uint32_t first = static_cast<uint32_t>(b.offsets[batch]);
    const uint32_t end =
        batch + 1 < b.batchCount ? static_cast<uint32_t>(b.offsets[batch + 1]) : mesh.faceCount;
    if (bones < 0 || bones > b.maxBones)
        return Fail(at, "batch %d has %d bones of %d", batch, bones, b.maxBones);
    for (int32_t i = 0; i < bones; ++i)
        Settle(at, kBoneOfBatch, &b.boneTable[int64_t{batch} * b.maxBones + i], at.scene->nodeCount);
    if (first > end || end > mesh.faceCount || (batch == 0 && first != 0))
        return Fail(at, "batch %d covers faces %u to %u of %u", batch, first, end, mesh.faceCount);
    const uint32_t size = mesh.faces.type == QEX_POD_UNSIGNED_INT ? 4 : 2;
    for (uint64_t i = uint64_t{first} * 3; i < uint64_t{end} * 3; ++i) {
        uint32_t vertex = 0;
        QexPODVertex_ReadInt(&vertex, mesh.faces.data + i * size, mesh.faces.type);
        if (!CheckBoneIndices(at, vertex, bones)) return false;
    }
    return true;
}

// The first vertex that follows what is no node, in a mesh without batches; the vertex count when none does.
uint32_t FirstStrayVertex(const Check& at) {
    const QexPODMesh& mesh = at.scene->meshes[at.index];
    const float nodes = static_cast<float>(at.scene->nodeCount);
    for (uint32_t vertex = 0; vertex < mesh.vertexCount; ++vertex) {
        float bone[4], weight[4];
        QexPODMesh_ReadInfluences(&mesh, vertex, bone, weight);
        for (uint32_t i = 0; i < QexPODData_Components(mesh.boneIndices); ++i)
            if (weight[i] != 0 && !(bone[i] >= 0 && bone[i] < nodes)) return vertex;
    }
    return mesh.vertexCount;
}

// Where bones have no batches, vertices name nodes, and the batches are made here.
void MakeBatches(const Check& at) {
    QexPODMesh& mesh = at.scene->meshes[at.index];
    const uint32_t stray = FirstStrayVertex(at);
    char text[64] = "";
    const char* fault = text;
    if (stray < mesh.vertexCount)
        snprintf(text, sizeof text, "vertex %u follows what is no node", stray);
    else
        fault = QexPODMesh_MakeBatches(&mesh, QEX_MAX_BATCH_BONES);
    mesh.skinned = !fault;
    if (fault)
        QexLog(
            QEX_TAG,
            "<QexPODModel_ReadFromSourceStream> mesh %u: follows bones, but has no bone batches, and %s; it "
            "stands still",
            at.index, fault);
}

// A mesh follows bones when it has bone indices, weights, and batches that say which bones those are.
bool CheckSkin(const Check& at, const uint32_t* extents) {
    QexPODMesh& mesh = at.scene->meshes[at.index];
    const QexBoneBatches& b = mesh.boneBatches;
    if (b.batchCount < 0 || b.maxBones < 0)
        return Fail(at, "%d batches of %d bones", b.batchCount, b.maxBones);
    const uint64_t table = static_cast<uint64_t>(b.batchCount) * static_cast<uint64_t>(b.maxBones);
    const uint32_t count = static_cast<uint32_t>(b.batchCount);
    if (table > extents[kExtentBoneTable] || count > extents[kExtentBonesPerBatch] ||
        count > extents[kExtentBatchOffsets])
        return Fail(at, "%d batches of %d bones, but shorter tables", b.batchCount, b.maxBones);
    mesh.skinned = 0;
    if (!mesh.boneIndices.componentCount || !mesh.boneWeights.componentCount || !mesh.vertexCount)
        return true;
    const uint32_t indices = QexPODData_Components(mesh.boneIndices);
    const uint32_t weights = QexPODData_Components(mesh.boneWeights);
    if (indices != weights) return Fail(at, "%u bone indices, but %u weights a vertex", indices, weights);
    if (!b.batchCount) {
        MakeBatches(at);
        return true;
    }
    if (mesh.stripCount || !mesh.faces.data) {
        QexLog(QEX_TAG,
               "<QexPODModel_ReadFromSourceStream> mesh %u: follows bones, but is not a list of indexed "
               "triangles; it stands still",
               at.index);
        return true;
    }
    for (int32_t batch = 0; batch < b.batchCount; ++batch)
        if (!CheckBatch(at, batch)) return false;
    mesh.skinned = 1;
    return true;
}

// ---- Nodes ----

struct Channel {
    const char* name;
    uint32_t bit;
    uint32_t keyFloats;  // that are read of a key
    uint32_t stride;     // floats from key to key
    uint32_t** index;
    float** keys;
    uint32_t shared;
};

// How many frames have keys of their own, of a channel that has one key at least; later frames hold the last.
// Key indices that lead beyond the keys become the last key's.
uint32_t CountKeyFrames(const Channel& channel, uint32_t indexCount, uint32_t floats, uint32_t frames,
                        const char** fault) {
    // The last key may be cut short behind what is read of it.
    const uint32_t keys = (floats - channel.keyFloats) / channel.stride + 1;
    uint32_t* index = *channel.index;
    if (!index) {
        if (keys < frames) *fault = "fewer keys than frames";
        return keys < frames ? keys : frames;
    }
    if (indexCount < frames) *fault = "fewer key indices than frames";
    const uint32_t indexed = indexCount < frames ? indexCount : frames;
    for (uint32_t i = 0; i < indexed; ++i) {
        if (uint64_t{index[i]} + channel.keyFloats <= floats) continue;
        index[i] = (keys - 1) * channel.stride;
        *fault = "key indices beyond its keys";
    }
    return indexed;
}

void CheckKeys(const Check& at, uint32_t number, const Channel& channel, uint32_t indexCount,
               uint32_t floats) {
    QexPODNode& node = at.scene->nodes[at.index];
    const uint32_t frames = at.scene->frameCount ? at.scene->frameCount : 1;
    const char* fault = nullptr;
    const bool animated = node.animationFlags & channel.bit;
    if (!*channel.keys) return;
    if (floats < channel.keyFloats) {
        fault = "not even one key";
        if (!(node.ownershipFlags & channel.shared)) QexMemory_Free(*channel.keys);
        node.ownershipFlags &= ~channel.shared;
        *channel.keys = nullptr;
        node.animationFlags &= ~channel.bit;
    } else if (animated) {
        const uint32_t keyed = CountKeyFrames(channel, indexCount, floats, frames, &fault);
        if (keyed < frames) node.keyFrames[number] = keyed;
    }
    if (fault && frames > 1)
        QexLog(QEX_TAG, "<QexPODModel_ReadFromSourceStream> node %u: %s has %s; %s", at.index, channel.name,
               fault, *channel.keys ? "it holds the last key" : "it stands still");
}

// Walks up the parents, which must end at a root.
bool CheckParents(const Check& at) {
    int32_t parent = at.scene->nodes[at.index].parentIndex;
    for (uint32_t steps = 0; parent != -1; ++steps) {
        if (!InRange(parent, at.scene->nodeCount))
            return Fail(at, "its parent is node %d of %u", parent, at.scene->nodeCount);
        if (steps > kPODMaxParents)
            return Fail(at, "its parents form a circle, or more than %u of them", kPODMaxParents);
        parent = at.scene->nodes[parent].parentIndex;
    }
    return true;
}

bool CheckNode(const Check& at, const uint32_t* extents) {
    QexPODNode& node = at.scene->nodes[at.index];
    if (at.index < at.scene->meshNodeCount && static_cast<uint32_t>(node.objectIndex) >= at.scene->meshCount)
        return Fail(at, "it draws mesh %d of %u", node.objectIndex, at.scene->meshCount);
    // A node without the block, in a scene without materials.
    if (!at.scene->materialCount && !node.materialIndex) node.materialIndex = -1;
    if (at.index < at.scene->meshNodeCount)
        Settle(at, kMaterialOfNode, &node.materialIndex, at.scene->materialCount);
    else if (!InRange(node.materialIndex, at.scene->materialCount))
        node.materialIndex = -1;  // lights, cameras and plain nodes draw nothing
    const Channel channels[] = {
        {"position", QEX_NODE_POSITION_ANIMATED, 3, 3, &node.positionIndex, &node.position,
         QEX_NODE_SHARED_POSITION},
        {"rotation", QEX_NODE_ROTATION_ANIMATED, 4, 4, &node.rotationIndex, &node.rotation, 0},
        // Some exporters cut the last key behind its first three floats, which are all that is read.
        {"scale", QEX_NODE_SCALE_ANIMATED, 3, 7, &node.scaleIndex, &node.scale, QEX_NODE_SHARED_SCALE},
        {"matrix", QEX_NODE_MATRIX_ANIMATED, 16, 16, &node.matrixIndex, &node.matrix, QEX_NODE_SHARED_MATRIX},
    };
    for (uint32_t i = 0; i < 4; ++i)
        CheckKeys(at, i, channels[i], extents[kExtentPositionIndex + i], extents[kExtentPosition + i]);
    return CheckParents(at);
}

// ---- The rest ----

void CheckMaterial(const Check& at) {
    QexPODMaterial& material = at.scene->materials[at.index];
    for (int32_t* index = &material.diffuseTexture; index <= &material.refractionTexture; ++index)
        Settle(at, kTextureOfMaterial, index, at.scene->textureCount);
}

void CheckCamera(const Check& at, const uint32_t* extents) {
    QexPODCamera& camera = at.scene->cameras[at.index];
    Settle(at, kTargetOfCamera, &camera.targetIndex, at.scene->nodeCount);
    if (camera.animatedFov && extents[kExtentFov] < (at.scene->frameCount ? at.scene->frameCount : 1)) {
        QexLog(QEX_TAG,
               "<QexPODModel_ReadFromSourceStream> camera %u: fewer fields of view than frames; it keeps one",
               at.index);
        QexMemory_Free(camera.animatedFov);
        camera.animatedFov = nullptr;
    }
}

bool CheckCounts(QexPODModel* scene) {
    const uint64_t ordered = uint64_t{scene->meshNodeCount} + scene->lightCount + scene->cameraCount;
    if (ordered <= scene->nodeCount) return true;
    QexError(QEX_TAG,
             "<QexPODModel_ReadFromSourceStream> %u nodes, but %u mesh nodes, %u lights and %u cameras",
             scene->nodeCount, scene->meshNodeCount, scene->lightCount, scene->cameraCount);
    return false;
}

}  // namespace

uint32_t QexPODData_ComponentSize(uint32_t type) {
    static const uint8_t sizes[] = {0, 4, 4, 2, 4, 4, 4, 4, 4, 4, 1, 2, 2, 1, 1, 1, 2, 4};
    return type < sizeof sizes ? sizes[type] : 0;
}

uint32_t QexPODData_Components(const CPODData& element) {
    if (!element.componentCount) return 0;
    return element.type == QEX_POD_UBYTE4 ? 4 : element.type == QEX_POD_DEC3N ? 3 : element.componentCount;
}

uint32_t QexPODData_ElementSize(uint32_t type, uint32_t componentCount) {
    const bool packed = type >= QEX_POD_RGBA && type <= QEX_POD_DEC3N;
    return QexPODData_ComponentSize(type) * (packed ? 1 : componentCount);
}

void QexPODMesh_ReadInfluences(const QexPODMesh* mesh, uint32_t vertex, float bones[4], float weights[4]) {
    const CPODData& index = mesh->boneIndices;
    const CPODData& weight = mesh->boneWeights;
    const int32_t n = static_cast<int32_t>(QexPODData_Components(index));
    QexPODVertex_ReadVec(bones, QexPODMesh_ElementData(mesh, index) + uint64_t{vertex} * index.stride,
                         BoneIndexType(index.type), n);
    QexPODVertex_ReadVec(weights, QexPODMesh_ElementData(mesh, weight) + uint64_t{vertex} * weight.stride,
                         weight.type, n);
    for (int32_t i = n; i < 4; ++i) bones[i] = weights[i] = 0;
}

bool QexLoadPODModel_Check(QexPODModel* scene, QexPODExtents* const extents[kPODKinds]) {
    if (!CheckCounts(scene)) return false;
    uint32_t dangling[kReferences] = {};
    Check at = {scene, "mesh", 0, dangling};
    for (at.index = 0; at.index < scene->meshCount; ++at.index) {
        const uint32_t* lengths = extents[kPODMesh][at.index];
        if (!CheckElements(at, lengths) || !CheckFaces(at, lengths) || !CheckSkin(at, lengths)) return false;
    }
    at.kind = "node";
    for (at.index = 0; at.index < scene->nodeCount; ++at.index)
        if (!CheckNode(at, extents[kPODNode][at.index])) return false;
    at.kind = "material";
    for (at.index = 0; at.index < scene->materialCount; ++at.index) CheckMaterial(at);
    at.kind = "camera";
    for (at.index = 0; at.index < scene->cameraCount; ++at.index)
        CheckCamera(at, extents[kPODCamera][at.index]);
    for (uint32_t i = 0; i < scene->lightCount; ++i)
        Settle(at, kTargetOfLight, &scene->lights[i].targetIndex, scene->nodeCount);
    ReportDangling(dangling);
    return true;
}
