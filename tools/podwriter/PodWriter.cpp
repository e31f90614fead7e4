// The blocks of a POD file, one writer for each record.
#include "PodWriter.h"

#include <cstdio>
#include <cstring>

namespace pod {
namespace {

enum TopBlock : uint32_t { kVersion = 1000, kScene = 1001, kExportOptions = 1002, kHistory = 1003 };

enum SceneBlock : uint32_t {
    kBackground = 2000,
    kAmbient,
    kCameraCount,
    kLightCount,
    kMeshCount,
    kNodeCount,
    kMeshNodeCount,
    kTextureCount,
    kMaterialCount,
    kFrameCount,
    kCamera,
    kLight,
    kMesh,
    kNode,
    kTexture,
    kMaterial,
    kSceneFlags,
    kFps,
};

constexpr uint32_t kEndBit = 0x80000000u;

// Appends blocks to a byte vector; every block, container or value, is closed by its end marker.
class BlockWriter {
  public:
    explicit BlockWriter(std::vector<uint8_t>* out) : out_(out) {}

    void Begin(uint32_t id) { Marker(id, 0); }
    void End(uint32_t id) { Marker(id | kEndBit, 0); }

    void Bytes(uint32_t id, const void* data, size_t size) {
        Marker(id, static_cast<uint32_t>(size));
        const auto* bytes = static_cast<const uint8_t*>(data);
        out_->insert(out_->end(), bytes, bytes + size);
        End(id);
    }
    void U32(uint32_t id, uint32_t value) {
        Marker(id, 4);
        Word(value);
        End(id);
    }
    void I32(uint32_t id, int32_t value) { U32(id, static_cast<uint32_t>(value)); }
    void F32(uint32_t id, float value) { Words(id, &value, 1); }
    void Text(uint32_t id, const std::string& text) { Bytes(id, text.c_str(), text.size() + 1); }

    // 32-bit values of any kind, in the file's byte order whatever the host's.
    template <class T>
    void Words(uint32_t id, const T* values, size_t count) {
        static_assert(sizeof(T) == 4);
        Marker(id, static_cast<uint32_t>(count * 4));
        for (size_t i = 0; i < count; ++i) {
            uint32_t word;
            std::memcpy(&word, values + i, 4);
            Word(word);
        }
        End(id);
    }
    template <class List>
    void List32(uint32_t id, const List& list) {
        Words(id, list.data(), list.size());
    }
    template <class List>
    void List32IfAny(uint32_t id, const List& list) {
        if (!list.empty()) List32(id, list);
    }

  private:
    void Word(uint32_t v) {
        for (int shift = 0; shift < 32; shift += 8) out_->push_back(static_cast<uint8_t>(v >> shift));
    }
    void Marker(uint32_t id, uint32_t length) {
        Word(id);
        Word(length);
    }

    std::vector<uint8_t>* out_;
};

void WriteElement(BlockWriter& w, uint32_t id, const Element& e, bool interleaved) {
    if (e.components == 0) return;
    w.Begin(id);
    w.U32(9000, e.type);
    w.U32(9001, e.components);
    w.U32(9002, e.stride);
    if (interleaved) {
        w.U32(9003, e.offset);
    } else {
        w.Bytes(9003, e.data.data(), e.data.size());
    }
    w.End(id);
}

void WriteMesh(BlockWriter& w, const Mesh& m) {
    w.Begin(kMesh);
    w.U32(6000, m.vertexCount);
    w.U32(6001, m.faceCount);
    w.U32(6002, m.uvwCount.value_or(static_cast<uint32_t>(m.uvw.size())));
    w.List32IfAny(6004, m.stripLengths);
    w.U32(6005, static_cast<uint32_t>(m.stripLengths.size()));
    // The vertex block has to come before the elements that point into it.
    if (m.interleaved) w.Bytes(6014, m.vertexBlock.data(), m.vertexBlock.size());
    WriteElement(w, 6003, m.faces, false);
    WriteElement(w, 6006, m.vertices, m.interleaved);
    WriteElement(w, 6007, m.normals, m.interleaved);
    WriteElement(w, 6008, m.tangents, m.interleaved);
    WriteElement(w, 6009, m.binormals, m.interleaved);
    for (const Element& channel : m.uvw) WriteElement(w, 6010, channel, m.interleaved);
    WriteElement(w, 6011, m.colours, m.interleaved);
    WriteElement(w, 6012, m.boneIndices, m.interleaved);
    WriteElement(w, 6013, m.boneWeights, m.interleaved);
    w.List32IfAny(6015, m.batchBones);
    w.List32IfAny(6016, m.bonesPerBatch);
    w.List32IfAny(6017, m.batchOffsets);
    if (m.batchCount != 0 || m.batchBoneMax != 0) {
        w.I32(6018, m.batchBoneMax);
        w.I32(6019, m.batchCount);
    }
    if (m.unpackMatrix) w.List32(6020, *m.unpackMatrix);
    w.End(kMesh);
}

void WriteNode(BlockWriter& w, const Node& n) {
    w.Begin(kNode);
    w.I32(5000, n.object);
    w.Text(5001, n.name);
    w.I32(5002, n.material);
    w.I32(5003, n.parent);
    if (n.staticPosition) w.List32(5004, *n.staticPosition);
    if (n.staticRotation) w.List32(5005, *n.staticRotation);
    if (n.staticScale) w.List32(5006, *n.staticScale);
    if (n.animationFlags) w.U32(5012, *n.animationFlags);
    w.List32IfAny(5013, n.positionIndex);
    w.List32IfAny(5007, n.positions);
    w.List32IfAny(5014, n.rotationIndex);
    w.List32IfAny(5008, n.rotations);
    w.List32IfAny(5015, n.scaleIndex);
    w.List32IfAny(5009, n.scales);
    w.List32IfAny(5016, n.matrixIndex);
    w.List32IfAny(5011, n.matrices);
    w.End(kNode);
}

void WriteCamera(BlockWriter& w, const Camera& c) {
    w.Begin(kCamera);
    w.I32(8000, c.target);
    w.F32(8001, c.fov);
    w.F32(8002, c.farPlane);
    w.F32(8003, c.nearPlane);
    w.List32IfAny(8004, c.animatedFov);
    w.End(kCamera);
}

void WriteLight(BlockWriter& w, const Light& l) {
    w.Begin(kLight);
    w.I32(7000, l.target);
    w.List32(7001, l.colour);
    w.U32(7002, l.type);
    w.F32(7003, l.constantAttenuation);
    w.F32(7004, l.linearAttenuation);
    w.F32(7005, l.quadraticAttenuation);
    w.F32(7006, l.falloffAngle);
    w.F32(7007, l.falloffExponent);
    w.End(kLight);
}

void WriteMaterial(BlockWriter& w, const Material& m) {
    w.Begin(kMaterial);
    w.Text(3000, m.name);
    w.I32(3001, m.diffuseTexture);
    w.F32(3002, m.opacity);
    w.List32(3003, m.ambient);
    w.List32(3004, m.diffuse);
    w.List32(3005, m.specular);
    w.F32(3006, m.shininess);
    if (!m.effectFile.empty()) w.Text(3007, m.effectFile);
    if (!m.effectName.empty()) w.Text(3008, m.effectName);
    const int32_t textures[] = {m.ambientTexture, m.specularColourTexture, m.specularLevelTexture,
                                m.bumpTexture,    m.emissiveTexture,       m.glossinessTexture,
                                m.opacityTexture, m.reflectionTexture,     m.refractionTexture};
    uint32_t id = 3009;
    for (const int32_t index : textures) w.I32(id++, index);
    const uint32_t blend[] = {m.blendSourceRgb, m.blendSourceAlpha, m.blendDestRgb,
                              m.blendDestAlpha, m.blendOpRgb,       m.blendOpAlpha};
    for (const uint32_t value : blend) w.U32(id++, value);
    w.List32(3024, m.blendColour);
    w.List32(3025, m.blendFactor);
    w.U32(3026, m.flags);
    w.End(kMaterial);
}

void WriteCounts(BlockWriter& w, const Scene& s) {
    const auto count = [&](uint32_t id, const std::optional<uint32_t>& forced, size_t actual) {
        w.U32(id, forced.value_or(static_cast<uint32_t>(actual)));
    };
    count(kCameraCount, s.counts.cameras, s.cameras.size());
    count(kLightCount, s.counts.lights, s.lights.size());
    count(kMeshCount, s.counts.meshes, s.meshes.size());
    count(kNodeCount, s.counts.nodes, s.nodes.size());
    w.U32(kMeshNodeCount, s.meshNodeCount);
    count(kTextureCount, s.counts.textures, s.textures.size());
    count(kMaterialCount, s.counts.materials, s.materials.size());
    w.U32(kFrameCount, s.frameCount);
}

void WriteScene(BlockWriter& w, const Scene& s) {
    w.Begin(kScene);
    w.List32(kBackground, s.background);
    w.List32(kAmbient, s.ambient);
    WriteCounts(w, s);
    if (s.fps) w.U32(kFps, *s.fps);
    w.U32(kSceneFlags, s.flags);
    for (const Camera& c : s.cameras) WriteCamera(w, c);
    for (const Light& l : s.lights) WriteLight(w, l);
    for (const Material& m : s.materials) WriteMaterial(w, m);
    for (const Mesh& m : s.meshes) WriteMesh(w, m);
    for (const Node& n : s.nodes) WriteNode(w, n);
    for (const std::string& name : s.textures) {
        w.Begin(kTexture);
        w.Text(4000, name);
        w.End(kTexture);
    }
    w.End(kScene);
}

}  // namespace

uint32_t DataTypeSize(uint32_t type) {
    static const uint8_t sizes[] = {0, 4, 4, 2, 4, 4, 4, 4, 4, 4, 1, 2, 2, 1, 1, 1, 2, 4};
    return type < sizeof(sizes) ? sizes[type] : 0;
}

std::vector<uint8_t> WritePod(const Scene& scene) {
    std::vector<uint8_t> bytes;
    BlockWriter w(&bytes);
    w.Text(kVersion, scene.version);
    if (!scene.exportOptions.empty()) w.Text(kExportOptions, scene.exportOptions);
    if (!scene.history.empty()) w.Text(kHistory, scene.history);
    WriteScene(w, scene);
    return bytes;
}

bool WriteFile(const std::string& path, const std::vector<uint8_t>& bytes) {
    std::FILE* file = std::fopen(path.c_str(), "wb");
    if (!file) return false;
    const bool whole = bytes.empty() || std::fwrite(bytes.data(), bytes.size(), 1, file) == 1;
    return std::fclose(file) == 0 && whole;
}

}  // namespace pod
