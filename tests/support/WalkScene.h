// Reads a loaded scene as drawing would.
#pragma once

#include <cmath>
#include <initializer_list>

#include "Qex.h"

// An element's value at a vertex, wherever the mesh keeps it.
inline QexVec4 VertexValue(const QexPODMesh& mesh, const CPODData& element, uint64_t vertex) {
    const uint8_t* first =
        mesh.interleaved ? mesh.interleaved + reinterpret_cast<uintptr_t>(element.data) : element.data;
    QexVec4 value;
    QexPODVertex_ReadVec(&value.x, first + vertex * element.stride, element.type,
                         static_cast<int32_t>(element.componentCount));
    return value;
}

// The vertex of the i-th corner of a mesh's triangles or strips.
inline uint32_t VertexOfCorner(const QexPODMesh& mesh, uint32_t i) {
    uint32_t index = i;
    if (mesh.faces.data)
        QexPODVertex_ReadInt(&index,
                             mesh.faces.data + (mesh.faces.type == QEX_POD_UNSIGNED_INT ? 4u : 2u) * i,
                             mesh.faces.type);
    return index;
}

inline int32_t BatchOfTriangle(const QexBoneBatches& batches, uint32_t triangle) {
    int32_t batch = 0;
    while (batch + 1 < batches.batchCount && batches.offsets[batch + 1] <= static_cast<int32_t>(triangle))
        ++batch;
    return batch;
}

// Uses everything in a scene that drawing would use, so that whatever the reader let through shows: world
// matrices at frames in and beyond the animation, cameras, lights, planes, boxes, every element of every
// vertex, every index and every bone.
class SceneWalk {
  public:
    // Null when all is well, else what a frame would have stumbled over.
    const char* fault = nullptr;
    // Of all that was read; keeps the reading from being optimised away.
    double sum = 0;

    explicit SceneWalk(QexPODModel* scene) : scene_(scene) {
        const auto frames = static_cast<float>(scene->frameCount);
        for (const float frame : {0.0f, 0.5f, 1.0f, frames - 1, frames + 0.25f, 3e9f}) {
            QexPODModel_SetFrame(scene, frame);
            WalkNodes();
            for (uint32_t i = 0; i < scene->nodeCount; ++i)
                QexPODModel_SetNodeAnimationFrameA(scene, &scene->nodes[i], frame);
            WalkNodes();
        }
        for (uint32_t i = 0; i < scene->meshCount; ++i) WalkMesh(scene->meshes[i]);
        for (uint32_t i = 0; i < scene->meshNodeCount; ++i) WalkMeshNode(i);
        for (uint32_t i = 0; i < scene->nodeCount; ++i) WalkIndices(scene->nodes[i]);
        for (uint32_t i = 0; i < scene->materialCount; ++i) WalkMaterial(scene->materials[i]);
        for (uint32_t i = 0; i < scene->textureCount; ++i) AddText(scene->textures[i].name);
        QexPODModel_SetFrame(scene, 0);
    }

  private:
    void Add(const float* values, int count) {
        for (int i = 0; i < count; ++i) sum += static_cast<double>(values[i]);
    }
    void AddText(const char* text) {
        for (; text && *text; ++text) sum += *text;
    }
    void Require(bool holds, const char* what) {
        if (!holds && !fault) fault = what;
    }

    void WalkNodes() {
        QexMatrix m;
        float a[4] = {}, b[4] = {}, c[4] = {};
        for (uint32_t i = 0; i < scene_->nodeCount; ++i) {
            QexPODModel_GetWorldMatrix(scene_, &m, &scene_->nodes[i]);
            Add(m.m, 16);
        }
        for (uint32_t i = 0; i < scene_->cameraCount; ++i) {
            a[0] += QexPODModel_GetCameraPos(scene_, a, b, i);
            a[0] += QexPODModel_GetCameraPosEx(scene_, a, b, c, i);
            Add(a, 3);
        }
        for (uint32_t i = 0; i < scene_->lightCount; ++i) {
            QexPODModel_GetLight(scene_, a, b, i);
            QexPODModel_GetLightDirection(scene_, i, c);
            Add(c, 4);
        }
    }

    // Whether an index is -1 or that of one of a number of records.
    static bool IsNoneOrOf(int32_t index, uint32_t count) {
        return index >= -1 && index < static_cast<int64_t>(count);
    }
    void WalkIndices(const QexPODNode& node) {
        AddText(node.name);
        Require(IsNoneOrOf(node.materialIndex, scene_->materialCount), "a node's material");
        Require(IsNoneOrOf(node.parentIndex, scene_->nodeCount), "a node's parent");
    }
    void WalkMaterial(const QexPODMaterial& material) {
        for (const char* text : {material.name, material.effectFile, material.effectName}) AddText(text);
        for (const int32_t* i = &material.diffuseTexture; i <= &material.refractionTexture; ++i)
            Require(IsNoneOrOf(*i, scene_->textureCount), "a material's texture");
    }

    void WalkElement(const QexPODMesh& mesh, const CPODData& element) {
        for (uint32_t v = 0; element.componentCount && v < mesh.vertexCount; ++v) {
            const QexVec4 value = VertexValue(mesh, element, v);
            Add(&value.x, 4);
        }
    }

    void WalkMesh(const QexPODMesh& mesh) {
        for (const CPODData* e = &mesh.vertices; e <= &mesh.binormals; ++e) WalkElement(mesh, *e);
        for (const CPODData* e = &mesh.colours; e <= &mesh.boneWeights; ++e) WalkElement(mesh, *e);
        for (uint32_t i = 0; i < mesh.uvwChannelCount; ++i) WalkElement(mesh, mesh.uvws[i]);
        const uint32_t count = QexPODModel_CountIndices(&mesh);
        for (uint32_t i = 0; i < count; ++i)
            Require(VertexOfCorner(mesh, i) < mesh.vertexCount, "an index of a mesh");
        if (mesh.interleaved && mesh.vertices.type == QEX_POD_FLOAT && mesh.vertices.componentCount == 3) {
            QexBoundingBox box;
            QexBoundingBox_ComputeInterleaved(
                &box, mesh.interleaved, static_cast<int32_t>(mesh.vertexCount),
                static_cast<uint32_t>(reinterpret_cast<uintptr_t>(mesh.vertices.data)), mesh.vertices.stride);
            Add(&box.centre.x, 3);
        }
    }

    void WalkMeshNode(uint32_t index) {
        QexPODNode& node = scene_->nodes[index];
        Require(static_cast<uint32_t>(node.objectIndex) < scene_->meshCount, "a mesh node's mesh");
        if (fault) return;
        QexPODModel_SetMeshNodeBoneAnimationFrame(scene_, index, 0.5f);
        const QexPODMesh& mesh = scene_->meshes[node.objectIndex];
        float at[3] = {};
        // Without these elements the two have a line to write instead.
        if (mesh.interleaved && mesh.vertices.componentCount)
            QexPODModel_GetNodePlanePoint(scene_, index, at);
        if (mesh.interleaved && mesh.normals.componentCount)
            QexPODModel_GetNodePlaneNormal(scene_, index, at);
        Add(at, 3);
        if (mesh.skinned) WalkBones(&node, mesh);
    }

    void WalkBones(QexPODNode* node, const QexPODMesh& mesh) {
        const QexBoneBatches& b = mesh.boneBatches;
        for (int32_t batch = 0; batch < b.batchCount; ++batch)
            for (int32_t i = 0; i < b.bonesPerBatch[batch]; ++i) {
                QexMatrix m;
                const int32_t bone = b.boneTable[batch * b.maxBones + i];
                QexPODModel_GetBoneWorldMatrix(scene_, &m, node, bone < 0 ? node : &scene_->nodes[bone]);
                Add(m.m, 16);
            }
        for (uint32_t i = 0; i < 3 * mesh.faceCount; ++i) {
            const auto bones = static_cast<float>(b.bonesPerBatch[BatchOfTriangle(b, i / 3)]);
            const QexVec4 indices = VertexValue(mesh, mesh.boneIndices, VertexOfCorner(mesh, i));
            for (uint32_t c = 0; c < mesh.boneIndices.componentCount; ++c)
                Require((&indices.x)[c] >= 0 && (&indices.x)[c] < bones, "a vertex's bone");
        }
    }

    QexPODModel* scene_;
};
