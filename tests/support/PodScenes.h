// POD scenes for tests: one that has everything in it, files built block by block, and the reading of both
// from memory blocks of the exact size.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstring>
#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include "PodBuild.h"
#include "Qex.h"
#include "support/Capture.h"

// A POD file written marker by marker, for what the writer of whole scenes would never write.
class PodBlocks {
  public:
    PodBlocks& Marker(uint32_t id, uint32_t length) { return Word(id).Word(length); }
    PodBlocks& Begin(uint32_t id) { return Marker(id, 0); }
    PodBlocks& End(uint32_t id) { return Marker(id | 0x80000000u, 0); }
    PodBlocks& Bytes(uint32_t id, const void* data, size_t size) {
        Marker(id, static_cast<uint32_t>(size));
        const auto* from = static_cast<const uint8_t*>(data);
        bytes.insert(bytes.end(), from, from + size);
        return *this;
    }
    PodBlocks& Words(uint32_t id, std::initializer_list<uint32_t> words) {
        Marker(id, static_cast<uint32_t>(4 * words.size()));
        for (const uint32_t word : words) Word(word);
        return *this;
    }
    PodBlocks& Floats(uint32_t id, const std::vector<float>& values) {
        return Bytes(id, values.data(), 4 * values.size());
    }
    PodBlocks& Version() { return Bytes(1000, "AB.POD.2.0", 11); }

    std::vector<uint8_t> bytes;

  private:
    PodBlocks& Word(uint32_t word) {
        for (int shift = 0; shift < 32; shift += 8) bytes.push_back(static_cast<uint8_t>(word >> shift));
        return *this;
    }
};

// A scene read from a heap block of the exact size, so that a sanitizer sees every byte read beyond it.
struct LoadedPod {
    explicit LoadedPod(const std::vector<uint8_t>& file, uint32_t optionA = 0, uint32_t optionB = 0)
        : size(file.size()), block(new uint8_t[file.size()]) {
        std::copy(file.begin(), file.end(), block.get());
        BothOutputs outputs;
        QexSourceStream stream;
        QexSourceStream_CreateFromMemory(&stream, block.get(), static_cast<uint32_t>(size));
        result = QexPODModel_ReadFromSourceStream(&scene, &stream, optionA, 0, optionB, 0);
        QexSourceStream_Release(&stream);
        out = outputs.Out();
        log = outputs.Errors();
    }
    explicit LoadedPod(const pod::Scene& written) : LoadedPod(pod::WritePod(written)) {}
    ~LoadedPod() { QexPODModel_Release(&scene); }
    LoadedPod(const LoadedPod&) = delete;
    LoadedPod& operator=(const LoadedPod&) = delete;

    bool Holds(const void* address) const {
        const auto* at = static_cast<const uint8_t*>(address);
        return at >= block.get() && at < block.get() + size;
    }
    // The first line of the log's errors, without its prefix.
    std::string Error() const {
        const std::string prefix = "E/Qex: <QexPODModel_ReadFromSourceStream> ";
        const size_t at = log.find(prefix);
        if (at == std::string::npos) return "";
        return log.substr(at + prefix.size(), log.find('\n', at) - at - prefix.size());
    }

    size_t size;
    std::unique_ptr<uint8_t[]> block;
    QexPODModel scene;
    int32_t result;
    std::string out, log;
};

// Where the words of a file lie: the markers, and the words of the data behind them.
inline std::vector<size_t> WordOffsets(const std::vector<uint8_t>& file) {
    std::vector<size_t> offsets;
    for (size_t at = 0; at + 8 <= file.size();) {
        uint32_t length;
        std::memcpy(&length, &file[at + 4], 4);
        for (size_t word = 0; word < 2 + length / 4; ++word) offsets.push_back(at + 4 * word);
        at += 8 + length;
    }
    return offsets;
}

namespace everything {

constexpr uint32_t kFrames = 4;
enum Node { kSkinned, kPlain, kStrips, kSun, kLamp, kEye, kHip, kKnee, kMatrices, kIndexed, kOlder, kNodes };

// Two triangles of three vertices each, a batch to each. Vertex v follows bone 0 of its batch, and in the
// first batch half of it bone 1; the third bone index of a vertex has no weight and says 99.
inline pod::Mesh SkinnedMesh() {
    using Byte4 = std::array<uint8_t, 4>;
    pod::MeshArrays arrays;
    for (int v = 0; v < 6; ++v) {
        const auto f = static_cast<float>(v);
        arrays.positions.push_back({f, f * 2 - 3, 1 / (f + 1)});
        arrays.uvs.push_back({f / 6, 1 - f / 6});
        arrays.colours.push_back({static_cast<uint8_t>(v), 20, 30, 255});
        arrays.boneIndices.push_back({0, v < 3, 99, 0});
        arrays.boneWeights.push_back(v < 3 ? Byte4{128, 127, 0, 0} : Byte4{255, 0, 0, 0});
    }
    arrays.normals.assign(6, {0, 0, 1});
    arrays.tangents.assign(6, {1, 0, 0});
    arrays.binormals.assign(6, {0, 1, 0});
    arrays.indices = {0, 1, 2, 3, 4, 5};
    pod::Mesh mesh = pod::BuildMesh(arrays);
    mesh.batchBones = {kHip, kKnee, kKnee, -1};
    mesh.bonesPerBatch = {2, 1};
    mesh.batchOffsets = {0, 1};
    mesh.batchBoneMax = mesh.batchCount = 2;
    return mesh;
}

// Elements with their own data, 32-bit indices, two UV channels, an unpack matrix.
inline pod::Mesh PlainMesh() {
    const float positions[] = {0, 0, 0, 4, 0, 0, 4, 4, 0, 0, 4, -2};
    const float uvs[] = {0, 0, 1, 0, 1, 1, 0, 1};
    pod::Mesh mesh;
    mesh.vertexCount = 4;
    mesh.faceCount = 2;
    mesh.faces = pod::IndexElement({0, 1, 2, 0, 2, 3}, true);
    mesh.vertices = pod::FloatElement(positions, 12, 3);
    mesh.normals = {pod::kInt16Norm, 3, 6, 0, std::vector<uint8_t>(24, 0x40)};
    mesh.colours = {pod::kRgba32, 4, 4, 0, std::vector<uint8_t>(16, 0x80)};
    mesh.uvw = {pod::FloatElement(uvs, 8, 2), pod::FloatElement(uvs, 8, 2)};
    mesh.unpackMatrix = {2, 0, 0, 0, 0, 2, 0, 0, 0, 0, 2, 0, 1, 2, 3, 1};
    return mesh;
}

// Two strips, of one and of two triangles.
inline pod::Mesh StripMesh() {
    pod::MeshArrays arrays;
    arrays.positions = {{0, 0, 0}, {1, 0, 0}, {0, 1, 0}, {1, 1, 0}};
    arrays.indices = {0, 1, 2, 0, 1, 2, 3};
    pod::Mesh mesh = pod::BuildMesh(arrays);
    mesh.faceCount = 3;
    mesh.stripLengths = {1, 2};
    return mesh;
}

inline pod::Vec4 Turn(float degrees, int axis) {
    const float half = degrees * 3.14159265f / 360;
    pod::Vec4 q = {0, 0, 0, std::cos(half)};
    q[static_cast<size_t>(axis)] = std::sin(half);
    return q;
}

inline std::vector<pod::Node> Nodes() {
    const pod::Transform still{{{1, 2, 3}}, {Turn(30, 1)}, {{1, 1, 1}}, {}};
    const pod::Transform moving{{{0, 0, 0}, {2, 0, 0}, {4, 1, 0}, {4, 8, 0}},
                                {Turn(0, 2), Turn(40, 2), Turn(80, 2), Turn(120, 2)},
                                {{1, 1, 1}, {1, 2, 1}, {2, 2, 2}, {1, 1, 1}},
                                {}};
    pod::Transform matrices;
    for (int i = 0; i < 4; ++i) {
        const auto f = static_cast<float>(i);
        matrices.matrices.push_back({1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, f, 10 * f, -f, 1});
    }
    std::vector<pod::Node> nodes = {pod::BuildNode("skinned", still, -1, 0, 0),
                                    pod::BuildNode("plain", moving, kSkinned, 1, 1),
                                    pod::BuildNode("strips", still, kPlain, 2, -1),
                                    pod::BuildNode("sun", still, -1, 0),
                                    pod::BuildNode("lamp", moving, kPlain, 1),
                                    pod::BuildNode("eye", moving, -1, 0),
                                    pod::BuildNode("hip", moving),
                                    pod::BuildNode("knee", moving, kHip),
                                    pod::BuildNode("matrices", matrices)};
    pod::Node indexed;
    indexed.name = "indexed";
    indexed.parent = kMatrices;
    indexed.positions = {0, 0, 0, 6, 0, 0};
    indexed.positionIndex = {0, 3, 3, 0};
    indexed.rotations = {0, 0, 0, -1, 0, 1, 0, 0};
    indexed.rotationIndex = {0, 0, 4, 4};
    indexed.scales = {1, 1, 1, 0, 0, 0, 0, 3, 2, 1, 0, 0, 0, 0};
    indexed.scaleIndex = {7, 0, 7, 0};
    indexed.animationFlags = 7;
    pod::Node older;
    older.name = "older";
    older.staticPosition = {7, 8, 9};
    older.staticRotation = {0, 0, 1, 0};
    older.staticScale = {2, 3, 4};
    nodes.push_back(indexed);
    nodes.push_back(older);
    return nodes;
}

inline pod::Scene Scene() {
    pod::Scene scene;
    scene.exportOptions = "options";
    scene.history = "history";
    scene.background = {0.1f, 0.2f, 0.3f};
    scene.ambient = {0.4f, 0.5f, 0.6f};
    scene.cameras = {{kHip, 0.8f, 500, 0.5f, {0.5f, 0.7f, 0.9f, 1.1f}}};
    scene.lights = {{kHip, {1, 0.9f, 0.8f}, pod::kDirectionalLight, 1, 0.1f, 0.01f, 0.5f, 2},
                    {-1, {0.7f, 0.6f, 0.5f}, pod::kPointLight, 2, 0.2f, 0.02f, 0.25f, 3}};
    scene.meshes = {SkinnedMesh(), PlainMesh(), StripMesh()};
    scene.nodes = Nodes();
    scene.textures = {"wood.pvr", "stone.pvr"};
    scene.materials.resize(2);
    scene.materials[0].name = "first";
    scene.materials[0].diffuseTexture = 1;
    scene.materials[1].name = "second";
    scene.materials[1].effectFile = "effect.pfx";
    scene.materials[1].effectName = "shiny";
    scene.meshNodeCount = 3;
    scene.frameCount = kFrames;
    scene.fps = 24;
    scene.flags = 5;
    return scene;
}

}  // namespace everything
