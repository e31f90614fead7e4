// Scenes and textures in memory for the tests that draw models. Units are pixels of the surface.
#pragma once

#include <string>
#include <vector>

#include "PodBuild.h"
#include "support/RenderFixture.h"

// Two triangles over a rectangle at z = 0 that faces the viewer; t = 0 at its lower edge.
pod::MeshArrays Rectangle(float left, float bottom, float right, float top);

// One mesh node "node" at `place` with the mesh, and one material of the texture "wood.pvr".
pod::Scene SceneOf(const pod::Mesh& mesh, const pod::Transform& place = {});

// An element by itself, its values given as numbers of a type of 1, 2 or 4 bytes.
pod::Element IntegerElement(uint32_t type, uint32_t components, const std::vector<double>& values);

// A mesh of arrays with four bones and weights a vertex, of which the first `influences` are kept, in one
// batch that has those scene nodes for bones.
pod::Mesh SkinnedMesh(const pod::MeshArrays& arrays, uint32_t influences, uint32_t weightType,
                      const std::vector<int32_t>& bones);

// An unfiltered texture of w x h texels of four bytes.
QexTexture MakeTexture(int w, int h, const uint8_t* rgba);
QexTexture SolidTexture(Rgba colour);

// One unit is one pixel of the surface, the origin at that pixel, counted from below.
QexCamera PixelCamera(glm::vec3 origin = glm::vec3(0));

// A texture that is released at the end of the scope.
struct ScopedTexture : QexTexture {
    explicit ScopedTexture(Rgba colour) : QexTexture(SolidTexture(colour)) {}
    ScopedTexture(int w, int h, const uint8_t* rgba) : QexTexture(MakeTexture(w, h, rgba)) {}
    ~ScopedTexture() { QexTexture_Release(this); }
    ScopedTexture(const ScopedTexture&) = delete;
    ScopedTexture& operator=(const ScopedTexture&) = delete;
};

// A model loaded from memory, without textures, and unloaded at the end of the scope.
struct LoadedModel {
    explicit LoadedModel(const pod::Scene& scene);
    ~LoadedModel() { QexModel_Unload(&model); }
    LoadedModel(const LoadedModel&) = delete;
    LoadedModel& operator=(const LoadedModel&) = delete;

    QexPODNode& Node(uint32_t index = 0) { return model.scene.nodes[index]; }
    QexPODMaterial& Material(uint32_t index = 0) { return model.scene.materials[index]; }
    // Draws all mesh nodes of pass 0 in pixel coordinates.
    void Draw(const QexMatrix* modelMatrix = nullptr);
    void DrawNode(QexShaderModule* module, uint32_t node = 0);

    std::vector<uint8_t> file;
    QexModel model;
    std::string log;  // the errors that loading reported
};
