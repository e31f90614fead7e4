// Puts right what is odd in a scene. What it leads to is left out of the picture or stands still; the rest of
// the scene is as good as ever.
#include "pod/Repair.h"

#include <cstdio>

#include "base/Diagnostics.h"
#include "pod/Rebatch.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"

#define QEX_READING "<QexPODModel_ReadFromSourceStream> "

namespace {

using Reference = QexPODReference;
using Repair = QexPODRepair;

// Makes an index that names nothing -1, and counts it.
void Settle(Repair* repair, Reference reference, int32_t* index, uint32_t count) {
    if (*index == -1 || static_cast<uint32_t>(*index) < count) return;
    *index = -1;
    ++repair->dangling[reference];
}

void ReportDangling(const Repair& repair) {
    static const char* const lines[kReferences] = {
        "%u node(s) name a material that is not there and are drawn without one",
        "%u texture(s) that materials name are not there",
        "%u camera(s) have a target that is not there",
        "%u light(s) have a target that is not there",
        "%u bone(s) of batches are not there; what follows them moves with its mesh",
    };
    for (int i = 0; i < kReferences; ++i) {
        if (!repair.dangling[i]) continue;
        char text[128];
        snprintf(text, sizeof text, lines[i], repair.dangling[i]);
        QexLog(QEX_TAG, QEX_READING "%s", text);
    }
}

// ---- Meshes ----

// The first vertex that follows what is no node, in a mesh without batches; the vertex count when none does.
uint32_t FirstStrayVertex(const QexPODMesh& mesh, uint32_t nodeCount) {
    for (uint32_t vertex = 0; vertex < mesh.vertexCount; ++vertex) {
        float bone[4], weight[4];
        QexPODMesh_ReadInfluences(&mesh, vertex, bone, weight);
        for (uint32_t i = 0; i < QexPODData_Components(mesh.boneIndices); ++i)
            if (weight[i] != 0 && !(bone[i] >= 0 && bone[i] < static_cast<float>(nodeCount))) return vertex;
    }
    return mesh.vertexCount;
}

// Where bones have no batches, vertices name nodes, and the batches are made here.
void MakeBatches(QexPODMesh* mesh, uint32_t index, uint32_t nodeCount) {
    const uint32_t stray = FirstStrayVertex(*mesh, nodeCount);
    char text[64] = "";
    const char* fault = text;
    if (stray < mesh->vertexCount)
        snprintf(text, sizeof text, "vertex %u follows what is no node", stray);
    else
        fault = QexPODMesh_MakeBatches(mesh, QEX_MAX_BATCH_BONES);
    mesh->skinned = !fault;
    if (fault)
        QexLog(QEX_TAG,
               QEX_READING "mesh %u: follows bones, but has no bone batches, and %s; it stands still", index,
               fault);
}

// A bone of weight 0 may be anything in the file. Where it is not in the batch it becomes 0, so that no
// shader reads past its matrices.
void SettleBones(QexPODMesh* mesh, uint32_t vertex, int32_t bones) {
    const CPODData& indices = mesh->boneIndices;
    const int32_t n = static_cast<int32_t>(QexPODData_Components(indices));
    float bone[4], weight[4];
    QexPODMesh_ReadInfluences(mesh, vertex, bone, weight);
    bool changed = false;
    for (int32_t i = 0; i < n; ++i) {
        if (bone[i] >= 0 && bone[i] < static_cast<float>(bones)) continue;
        bone[i] = 0;
        changed = true;
    }
    if (changed)
        QexVertexWriteVec(QexPODMesh_ElementData(mesh, indices) + uint64_t{vertex} * indices.stride,
                          QexPODType_Of(indices.type).plain, n, bone);
}

void RepairBatches(Repair* repair, QexPODMesh* mesh) {
    const QexBoneBatches& b = mesh->boneBatches;
    for (int64_t batch = 0; batch < b.batchCount; ++batch)
        for (int32_t i = 0; i < b.bonesPerBatch[batch]; ++i)
            Settle(repair, kBoneOfBatch, &b.boneTable[batch * b.maxBones + i], repair->scene->nodeCount);
    QexPODMesh_VisitBatches(*mesh, [mesh](uint32_t vertex, uint32_t batch) {
        SettleBones(mesh, vertex, mesh->boneBatches.bonesPerBatch[batch]);
        return true;
    });
    mesh->skinned = 1;
}

// A mesh follows bones when it has bone indices, weights, and batches that say which bones those are.
void RepairSkin(Repair* repair, uint32_t index) {
    QexPODMesh* mesh = &repair->scene->meshes[index];
    mesh->skinned = 0;
    if (!QexPODMesh_HasBones(*mesh)) return;
    if (!mesh->boneBatches.batchCount)
        MakeBatches(mesh, index, repair->scene->nodeCount);
    else if (QexPODMesh_IsIndexedList(*mesh))
        RepairBatches(repair, mesh);
    else
        QexLog(QEX_TAG,
               QEX_READING "mesh %u: follows bones, but is not a list of indexed triangles; it stands still",
               index);
}

// ---- Nodes ----

// How many frames have keys of their own, of a channel that has one key at least; later frames hold the last.
// Key indices that lead beyond the keys become the last key's.
uint32_t CountKeyFrames(const QexPODChannel& channel, uint32_t* index, uint32_t indexCount, uint32_t floats,
                        uint32_t frames, const char** fault) {
    // The last key may be cut short behind what is read of it.
    const uint32_t keys = (floats - channel.keyFloats) / channel.stride + 1;
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

void RepairKeys(const Repair& repair, uint32_t nodeIndex, uint32_t number, const uint32_t* extents) {
    const QexPODChannel& channel = kPODChannelTable[number];
    QexPODNode* node = &repair.scene->nodes[nodeIndex];
    const uint32_t frames = repair.scene->frameCount ? repair.scene->frameCount : 1;
    const uint32_t floats = extents[kExtentKeys + number];
    const char* fault = nullptr;
    if (!(node->*channel.keys)) return;
    if (floats < channel.keyFloats) {
        fault = "not even one key";
        QexPODNode_FreeKeys(node, channel);
        node->animationFlags &= ~channel.animated;
    } else if (node->animationFlags & channel.animated) {
        const uint32_t keyed = CountKeyFrames(channel, node->*channel.index, extents[kExtentIndex + number],
                                              floats, frames, &fault);
        if (keyed < frames) node->keyFrames[number] = keyed;
    }
    if (fault && frames > 1)
        QexLog(QEX_TAG, QEX_READING "node %u: %s has %s; %s", nodeIndex, channel.name, fault,
               node->*channel.keys ? "it holds the last key" : "it stands still");
}

void RepairNode(Repair* repair, uint32_t index, const uint32_t* extents) {
    QexPODNode& node = repair->scene->nodes[index];
    const uint32_t materials = repair->scene->materialCount;
    // A node without the block, in a scene without materials.
    if (!materials && !node.materialIndex) node.materialIndex = -1;
    if (index < repair->scene->meshNodeCount)
        Settle(repair, kMaterialOfNode, &node.materialIndex, materials);
    else if (static_cast<uint32_t>(node.materialIndex) >= materials)
        node.materialIndex = -1;  // lights, cameras and plain nodes draw nothing
    for (uint32_t i = 0; i < kPODChannels; ++i) RepairKeys(*repair, index, i, extents);
}

// ---- The rest ----

void RepairMaterial(Repair* repair, QexPODMaterial* material) {
    for (int32_t* index = &material->diffuseTexture; index <= &material->refractionTexture; ++index)
        Settle(repair, kTextureOfMaterial, index, repair->scene->textureCount);
}

void RepairCamera(Repair* repair, uint32_t index, uint32_t fovCount) {
    QexPODCamera& camera = repair->scene->cameras[index];
    Settle(repair, kTargetOfCamera, &camera.targetIndex, repair->scene->nodeCount);
    if (!camera.animatedFov || fovCount >= (repair->scene->frameCount ? repair->scene->frameCount : 1))
        return;
    QexLog(QEX_TAG, QEX_READING "camera %u: fewer fields of view than frames; it keeps one", index);
    QexMemory_FreeArray(camera.animatedFov);
}

void RepairRest(Repair* repair, QexPODExtents* const extents[kPODKinds]) {
    QexPODModel* scene = repair->scene;
    for (uint32_t i = 0; i < scene->materialCount; ++i) RepairMaterial(repair, &scene->materials[i]);
    for (uint32_t i = 0; i < scene->cameraCount; ++i)
        RepairCamera(repair, i, extents[kPODCamera][i][kExtentFov]);
    for (uint32_t i = 0; i < scene->lightCount; ++i)
        Settle(repair, kTargetOfLight, &scene->lights[i].targetIndex, scene->nodeCount);
    ReportDangling(*repair);
}

}  // namespace

void QexPODScene_Repair(QexPODRepair* repair, QexPODExtents* const extents[kPODKinds], uint32_t part) {
    const uint32_t meshes = repair->scene->meshCount;
    if (part < meshes)
        RepairSkin(repair, part);
    else if (part - meshes < repair->scene->nodeCount)
        RepairNode(repair, part - meshes, extents[kPODNode][part - meshes]);
    else
        RepairRest(repair, extents);
}
