#include "Scenes.h"

#include <cmath>

namespace scenes {

namespace {

// One face of a cube: outward normal, and the directions of u and v.
struct Face {
    pod::Vec3 normal, u, v;
};

void AddFace(const Face& face, pod::MeshArrays* arrays) {
    const uint32_t first = static_cast<uint32_t>(arrays->positions.size());
    for (int corner = 0; corner < 4; ++corner) {
        const float s = corner & 1 ? 1.0f : -1.0f, t = corner & 2 ? 1.0f : -1.0f;
        pod::Vec3 position;
        for (size_t i = 0; i < 3; ++i) position[i] = face.normal[i] + s * face.u[i] + t * face.v[i];
        arrays->positions.push_back(position);
        arrays->normals.push_back(face.normal);
        arrays->uvs.push_back({(s + 1) / 2, (t + 1) / 2});
    }
    for (uint32_t index : {0u, 1u, 2u, 2u, 1u, 3u}) arrays->indices.push_back(first + index);
}

pod::Vec4 AboutZ(float angle) {
    return {0, 0, std::sin(angle / 2), std::cos(angle / 2)};
}

// Keys that differ from frame to frame in all three channels.
pod::Transform Wave(uint32_t frames, float phase) {
    pod::Transform keys;
    for (uint32_t i = 0; i < frames; ++i) {
        const float t = static_cast<float>(i) * 0.1f + phase;
        keys.positions.push_back({1, 0.1f * std::sin(t), 0.1f * std::cos(t)});
        keys.rotations.push_back(AboutZ(0.3f * std::sin(t * 0.7f)));
        keys.scales.push_back({1 + 0.05f * std::sin(t), 1, 1 - 0.05f * std::sin(t)});
    }
    return keys;
}

pod::Material White() {
    pod::Material material;
    material.name = "white";
    return material;
}

// A bumpy sheet of size x size vertices.
pod::MeshArrays Sheet(uint32_t size) {
    pod::MeshArrays arrays;
    for (uint32_t y = 0; y < size; ++y)
        for (uint32_t x = 0; x < size; ++x) {
            const float u = static_cast<float>(x) / static_cast<float>(size - 1);
            const float v = static_cast<float>(y) / static_cast<float>(size - 1);
            arrays.positions.push_back({u, v, 0.05f * std::sin(20 * u) * std::cos(20 * v)});
            arrays.normals.push_back({0, 0, 1});
            arrays.uvs.push_back({u, v});
        }
    for (uint32_t y = 0; y + 1 < size; ++y)
        for (uint32_t x = 0; x + 1 < size; ++x) {
            const uint32_t i = y * size + x;
            for (uint32_t index : {i, i + 1, i + size, i + size, i + 1, i + size + 1})
                arrays.indices.push_back(index);
        }
    return arrays;
}

}  // namespace

pod::MeshArrays Quad() {
    pod::MeshArrays arrays;
    arrays.positions = {{-0.5f, -0.5f, 0}, {0.5f, -0.5f, 0}, {-0.5f, 0.5f, 0}, {0.5f, 0.5f, 0}};
    arrays.normals.assign(4, {0, 0, 1});
    arrays.uvs = {{0, 0}, {1, 0}, {0, 1}, {1, 1}};
    arrays.indices = {0, 1, 2, 2, 1, 3};
    return arrays;
}

pod::MeshArrays Cube() {
    const Face faces[] = {{{1, 0, 0}, {0, 0, -1}, {0, 1, 0}}, {{-1, 0, 0}, {0, 0, 1}, {0, 1, 0}},
                          {{0, 1, 0}, {1, 0, 0}, {0, 0, -1}}, {{0, -1, 0}, {1, 0, 0}, {0, 0, 1}},
                          {{0, 0, 1}, {1, 0, 0}, {0, 1, 0}},  {{0, 0, -1}, {-1, 0, 0}, {0, 1, 0}}};
    pod::MeshArrays arrays;
    for (const Face& face : faces) AddFace(face, &arrays);
    return arrays;
}

pod::Scene Grid(uint32_t count) {
    pod::Scene scene;
    scene.meshes.push_back(pod::BuildMesh(Cube()));
    scene.materials.push_back(White());
    scene.meshNodeCount = count;
    const uint32_t side = static_cast<uint32_t>(std::ceil(std::sqrt(static_cast<double>(count))));
    for (uint32_t i = 0; i < count; ++i) {
        pod::Transform place;
        place.positions = {{static_cast<float>(i % side), static_cast<float>(i / side), 0}};
        place.scales = {{0.25f, 0.25f, 0.25f}};
        scene.nodes.push_back(pod::BuildNode("node" + std::to_string(i), place, -1, 0, 0));
    }
    return scene;
}

pod::Scene Chains(uint32_t chains, uint32_t length, uint32_t frames) {
    pod::Scene scene;
    scene.meshes.push_back(pod::BuildMesh(Cube()));
    scene.materials.push_back(White());
    scene.meshNodeCount = chains * length;
    scene.frameCount = frames;
    for (uint32_t i = 0; i < chains * length; ++i) {
        const int32_t parent = i % length ? static_cast<int32_t>(i) - 1 : -1;
        scene.nodes.push_back(
            pod::BuildNode("link" + std::to_string(i), Wave(frames, static_cast<float>(i)), parent, 0, 0));
    }
    return scene;
}

pod::Scene Large(size_t bytes) {
    constexpr uint32_t kFrames = 200;
    const pod::Mesh mesh = pod::BuildMesh(Sheet(160));
    const size_t each = mesh.vertexBlock.size() + mesh.faces.data.size() + kFrames * 14 * sizeof(float);
    pod::Scene scene;
    scene.frameCount = kFrames;
    scene.materials.push_back(White());
    for (size_t size = 0; size < bytes; size += each) {
        const int32_t index = static_cast<int32_t>(scene.meshes.size());
        scene.meshes.push_back(mesh);
        scene.nodes.push_back(pod::BuildNode("sheet" + std::to_string(index),
                                             Wave(kFrames, static_cast<float>(index)), -1, index, 0));
    }
    scene.meshNodeCount = static_cast<uint32_t>(scene.nodes.size());
    return scene;
}

}  // namespace scenes
