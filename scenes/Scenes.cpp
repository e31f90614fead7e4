// What the scenes share, and those that are built of it.
#include "Scenes.h"

#include <algorithm>
#include <cmath>

#include "Shapes.h"

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

// A closed tube along +Y of radius 0.25, four rings to a bone, that tapers towards its end. A vertex follows
// the bone beside it, node 2 and on, and the next one, the more the nearer it is.
pod::MeshArrays Tube(uint32_t bones, float length) {
    constexpr uint32_t kRings = 4, kAround = 24;
    pod::MeshArrays arrays;
    for (uint32_t ring = 0; ring <= kRings * bones; ++ring) {
        const float along = static_cast<float>(ring) / kRings;  // in bones
        const float rest = 1 - along / static_cast<float>(bones);
        const float radius = 0.25f * std::sqrt(rest);
        const uint32_t bone = std::min(ring / kRings, bones - 1);
        const auto share =
            static_cast<uint8_t>(255.0f * std::min(along - static_cast<float>(bone), 1.0f) / 2);
        for (uint32_t i = 0; i <= kAround; ++i) {
            const float u = static_cast<float>(i) / kAround, angle = 6.2831853f * u;
            const pod::Vec3 out = {std::sin(angle), 0, std::cos(angle)};
            arrays.positions.push_back({radius * out[0], along * length, radius * out[2]});
            arrays.normals.push_back(out);
            arrays.tangents.push_back({out[2], 0, -out[0]});
            arrays.binormals.push_back({0, 1, 0});
            arrays.uvs.push_back({2 * u, along * length});
            const uint32_t next = std::min(bone + 1, bones - 1);
            arrays.boneIndices.push_back(
                {static_cast<uint8_t>(bone + 2), static_cast<uint8_t>(next + 2), 0, 0});
            arrays.boneWeights.push_back({static_cast<uint8_t>(255 - share), share, 0, 0});
        }
    }
    shapes::AddGridIndices(0, kAround + 1, kRings * bones + 1, &arrays);
    return arrays;
}

// A flat polygon, counter-clockwise from the side that is seen.
void AddPolygon(const std::vector<pod::Vec3>& corners, pod::MeshArrays* arrays) {
    const pod::Vec3 normal = shapes::NormalOf(corners[0], corners[1], corners[2]);
    const auto first = static_cast<uint32_t>(arrays->positions.size());
    for (const pod::Vec3& corner : corners) {
        arrays->positions.push_back(corner);
        arrays->normals.push_back(normal);
        arrays->uvs.push_back({corner[0], corner[1]});
    }
    for (uint32_t i = 2; i < corners.size(); ++i)
        for (uint32_t index : {0u, i - 1, i}) arrays->indices.push_back(first + index);
}

// Both sides, port first, ribs from stern to bow: upper edge and keel of each side.
pod::MeshArrays Hull() {
    const struct {
        float x, top, keel, halfTop, halfKeel;
    } ribs[] = {{-1, 0.3f, -0.2f, 0.45f, 0.2f},
                {0.2f, 0.25f, -0.25f, 0.5f, 0.25f},
                {1.4f, 0.4f, -0.05f, 0.02f, 0.01f}};
    std::vector<pod::Vec3> port, portKeel, keel, starboard;
    for (const auto& r : ribs) {
        port.push_back({r.x, r.top, -r.halfTop});
        portKeel.push_back({r.x, r.keel, -r.halfKeel});
        keel.push_back({r.x, r.keel, r.halfKeel});
        starboard.push_back({r.x, r.top, r.halfTop});
    }
    pod::MeshArrays arrays;
    AddPolygon({port[0], portKeel[0], keel[0], starboard[0]}, &arrays);
    for (size_t i = 0, j = 1; j < 3; ++i, ++j) {
        AddPolygon({portKeel[j], portKeel[i], port[i], port[j]}, &arrays);
        AddPolygon({keel[i], keel[j], starboard[j], starboard[i]}, &arrays);
        AddPolygon({portKeel[i], portKeel[j], keel[j], keel[i]}, &arrays);
        AddPolygon({port[i], starboard[i], starboard[j], port[j]}, &arrays);
    }
    return arrays;
}

// Both sides, as far apart as a sail is thick, so that neither shows through the other.
void AddSail(const std::vector<pod::Vec3>& corners, pod::MeshArrays* arrays) {
    constexpr float kThickness = 0.02f;
    const pod::Vec3 normal = shapes::NormalOf(corners[0], corners[1], corners[2]);
    std::vector<pod::Vec3> back(corners.rbegin(), corners.rend());
    for (pod::Vec3& corner : back)
        for (size_t i = 0; i < 3; ++i) corner[i] -= kThickness * normal[i];
    AddPolygon(corners, arrays);
    AddPolygon(back, arrays);
}

pod::MeshArrays Sails() {
    const pod::Vec3 mast[] = {{0.15f, 0.4f, 0}, {0.15f, 2.2f, 0}}, boom = {-0.95f, 0.55f, 0.2f},
                    bow = {1.3f, 0.5f, 0};
    pod::MeshArrays arrays;
    AddSail({mast[0], mast[1], boom}, &arrays);
    AddSail({mast[0], bow, mast[1]}, &arrays);
    return arrays;
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
    shapes::AddGridIndices(0, size, size, &arrays);
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

pod::MeshArrays Sphere(uint32_t segments) {
    constexpr float kPi = 3.14159265f;
    pod::MeshArrays arrays;
    for (uint32_t i = 0; i <= segments; ++i)
        for (uint32_t j = 0; j <= 2 * segments; ++j) {
            const float v = static_cast<float>(i) / static_cast<float>(segments);
            const float u = static_cast<float>(j) / static_cast<float>(2 * segments);
            const float east = 2 * kPi * u, up = kPi * (v - 0.5f);
            const pod::Vec3 normal = {std::cos(up) * std::sin(east), std::sin(up),
                                      std::cos(up) * std::cos(east)};
            arrays.positions.push_back(normal);
            arrays.normals.push_back(normal);
            arrays.tangents.push_back({std::cos(east), 0, -std::sin(east)});
            arrays.binormals.push_back(
                {-std::sin(up) * std::sin(east), std::cos(up), -std::sin(up) * std::cos(east)});
            arrays.uvs.push_back({u, v});
        }
    shapes::AddGridIndices(0, 2 * segments + 1, segments + 1, &arrays);
    return arrays;
}

pod::Scene Still(const std::vector<Object>& objects) {
    pod::Scene scene;
    for (const Object& object : objects) {
        const int32_t index = static_cast<int32_t>(scene.meshes.size());
        scene.materials.push_back(White());
        pod::Transform place;
        place.positions.push_back(object.position);
        scene.meshes.push_back(pod::BuildMesh(object.mesh));
        scene.nodes.push_back(pod::BuildNode(object.name, place, -1, index, index));
    }
    scene.meshNodeCount = static_cast<uint32_t>(scene.nodes.size());
    return scene;
}

pod::Scene Worm(uint32_t bones, uint32_t frames) {
    const float length = 4.0f / static_cast<float>(bones);
    pod::Scene scene =
        Still({{"floor", pod::FloorMesh(8), {0, 0, 0}}, {"worm", Tube(bones, length), {0, 0, 0}}});
    scene.frameCount = frames;
    for (uint32_t bone = 0; bone < bones; ++bone) {
        pod::Transform keys;
        keys.positions.push_back({0, bone ? length : 0, 0});
        for (uint32_t i = 0; i < frames; ++i) {
            const float t = static_cast<float>(i) * 6.2831853f / static_cast<float>(frames);
            const float phase = 5 * static_cast<float>(bone) / static_cast<float>(bones);
            keys.rotations.push_back(AboutZ(i ? 3 * std::sin(t - phase) / static_cast<float>(bones) : 0));
        }
        scene.nodes.push_back(
            pod::BuildNode("bone" + std::to_string(bone), keys, bone ? static_cast<int32_t>(bone) + 1 : -1));
    }
    return scene;
}

pod::Scene Boat() {
    return Still({{"hull", Hull(), {0, 0, 0}}, {"sails", Sails(), {0, 0, 0}}});
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
