// Arrays laid out as interleaved vertices, keys as a node's floats.
#include "PodBuild.h"

#include <cstring>
#include <tuple>
#include <type_traits>

namespace pod {
namespace {

void PutLittleEndian(uint8_t* out, uint32_t value, uint32_t size) {
    for (uint32_t i = 0; i < size; ++i) out[i] = static_cast<uint8_t>(value >> (8 * i));
}

void PutFloat(uint8_t* out, float value) {
    uint32_t word;
    std::memcpy(&word, &value, 4);
    PutLittleEndian(out, word, 4);
}

// Gives `element` its place in the vertex when the array is there; returns the vertex size after it.
template <class T>
uint32_t Place(Element* element, const std::vector<T>& array, uint32_t type, uint32_t offset) {
    if (array.empty()) return offset;
    element->type = type;
    element->components = static_cast<uint32_t>(std::tuple_size<T>::value);
    element->offset = offset;
    return offset + element->components * DataTypeSize(type);
}

template <class T>
void Fill(Mesh* mesh, const Element& element, const std::vector<T>& array) {
    for (size_t v = 0; v < array.size(); ++v) {
        uint8_t* out = mesh->vertexBlock.data() + v * element.stride + element.offset;
        for (const auto component : array[v]) {
            if constexpr (std::is_same_v<typename T::value_type, float>) {
                PutFloat(out, component);
                out += 4;
            } else {
                *out++ = component;
            }
        }
    }
}

uint32_t FlagIf(bool animated, uint32_t flag) {
    return animated ? flag : 0;
}

}  // namespace

Element FloatElement(const float* values, size_t count, uint32_t components) {
    Element e;
    e.components = components;
    e.stride = components * 4;
    e.data.resize(count * 4);
    for (size_t i = 0; i < count; ++i) PutFloat(e.data.data() + i * 4, values[i]);
    return e;
}

Element IndexElement(const std::vector<uint32_t>& indices, bool wide) {
    Element e;
    e.type = wide ? kUint32 : kUint16;
    e.components = 3;
    const uint32_t size = DataTypeSize(e.type);
    e.stride = 3 * size;
    e.data.resize(indices.size() * size);
    for (size_t i = 0; i < indices.size(); ++i) PutLittleEndian(e.data.data() + i * size, indices[i], size);
    return e;
}

MeshArrays FloorMesh(float size) {
    const float half = size / 2;
    MeshArrays arrays;
    arrays.positions = {{-half, 0, half}, {half, 0, half}, {-half, 0, -half}, {half, 0, -half}};
    arrays.normals.assign(4, {0, 1, 0});
    arrays.uvs = {{0, 0}, {size, 0}, {0, size}, {size, size}};
    arrays.indices = {0, 1, 2, 2, 1, 3};
    return arrays;
}

Mesh BuildMesh(const MeshArrays& a, bool wideIndices) {
    Mesh mesh;
    mesh.interleaved = true;
    mesh.vertexCount = static_cast<uint32_t>(a.positions.size());
    mesh.faceCount = static_cast<uint32_t>(a.indices.size() / 3);
    mesh.faces = IndexElement(a.indices, wideIndices);
    if (!a.uvs.empty()) mesh.uvw.resize(1);

    Element none;
    Element* uv = a.uvs.empty() ? &none : &mesh.uvw[0];
    uint32_t stride = Place(&mesh.vertices, a.positions, kFloat32, 0);
    stride = Place(&mesh.normals, a.normals, kFloat32, stride);
    stride = Place(&mesh.tangents, a.tangents, kFloat32, stride);
    stride = Place(&mesh.binormals, a.binormals, kFloat32, stride);
    stride = Place(uv, a.uvs, kFloat32, stride);
    stride = Place(&mesh.colours, a.colours, kUint8Norm, stride);
    stride = Place(&mesh.boneIndices, a.boneIndices, kUint8, stride);
    stride = Place(&mesh.boneWeights, a.boneWeights, kUint8Norm, stride);
    for (Element* e : {&mesh.vertices, &mesh.normals, &mesh.tangents, &mesh.binormals, uv, &mesh.colours,
                       &mesh.boneIndices, &mesh.boneWeights}) {
        e->stride = e->components ? stride : 0;
    }

    mesh.vertexBlock.resize(static_cast<size_t>(stride) * mesh.vertexCount);
    Fill(&mesh, mesh.vertices, a.positions);
    Fill(&mesh, mesh.normals, a.normals);
    Fill(&mesh, mesh.tangents, a.tangents);
    Fill(&mesh, mesh.binormals, a.binormals);
    Fill(&mesh, *uv, a.uvs);
    Fill(&mesh, mesh.colours, a.colours);
    Fill(&mesh, mesh.boneIndices, a.boneIndices);
    Fill(&mesh, mesh.boneWeights, a.boneWeights);
    return mesh;
}

Node BuildNode(const std::string& name, const Transform& t, int32_t parent, int32_t object,
               int32_t material) {
    Node node;
    node.name = name;
    node.parent = parent;
    node.object = object;
    node.material = material;
    for (const Vec3& p : t.positions) node.positions.insert(node.positions.end(), p.begin(), p.end());
    for (const Vec4& q : t.rotations) node.rotations.insert(node.rotations.end(), {q[0], q[1], q[2], -q[3]});
    // The last four floats of a scale key are the stretch axis, which stays unused.
    for (const Vec3& s : t.scales) node.scales.insert(node.scales.end(), {s[0], s[1], s[2], 0, 0, 0, 0});
    for (const Mat4& m : t.matrices) node.matrices.insert(node.matrices.end(), m.begin(), m.end());
    node.animationFlags = FlagIf(t.positions.size() > 1, kPositionAnimated) |
                          FlagIf(t.rotations.size() > 1, kRotationAnimated) |
                          FlagIf(t.scales.size() > 1, kScaleAnimated) |
                          FlagIf(t.matrices.size() > 1, kMatrixAnimated);
    return node;
}

}  // namespace pod
