// POD 2.0 scenes, written block by block.
//
// A Scene is plain data: fill it, call WritePod. Nothing is checked or repaired on the way, and every
// count can be overridden, so files that lie about themselves can be written as easily as sound ones.
// PodBuild.h has the short ways to make a mesh or a node; PvrWriter.h writes the textures.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace pod {

// Vertex data types by their number in the file.
enum DataType : uint32_t {
    kFloat32 = 1,
    kInt32 = 2,
    kUint16 = 3,
    kRgba32 = 4,
    kArgb32 = 5,
    kD3dColour = 6,
    kUbyte4 = 7,
    kDec3N = 8,
    kFixed16_16 = 9,
    kUint8 = 10,
    kInt16 = 11,
    kInt16Norm = 12,
    kInt8 = 13,
    kInt8Norm = 14,
    kUint8Norm = 15,
    kUint16Norm = 16,
    kUint32 = 17,
};

// Bytes of one component of a data type (of the whole element for the packed types); 0 when unknown.
uint32_t DataTypeSize(uint32_t type);

// One vertex element: an offset into the mesh's interleaved block, or bytes of its own.
// With 0 components the element is left out of the file.
struct Element {
    uint32_t type = kFloat32;
    uint32_t components = 0;
    uint32_t stride = 0;
    uint32_t offset = 0;
    std::vector<uint8_t> data;
};

struct Mesh {
    uint32_t vertexCount = 0;
    uint32_t faceCount = 0;
    std::optional<uint32_t> uvwCount;  // uvw.size() unless set
    Element faces;
    std::vector<uint32_t> stripLengths;
    Element vertices, normals, tangents, binormals, colours, boneIndices, boneWeights;
    std::vector<Element> uvw;

    bool interleaved = false;  // elements are offsets into `vertexBlock`
    std::vector<uint8_t> vertexBlock;

    // Bone batches: `batchBones` has `batchBoneMax` entries per batch.
    std::vector<int32_t> batchBones, bonesPerBatch, batchOffsets;
    int32_t batchBoneMax = 0;
    int32_t batchCount = 0;

    std::optional<std::array<float, 16>> unpackMatrix;
};

enum AnimationFlags : uint32_t {
    kPositionAnimated = 1,
    kRotationAnimated = 2,
    kScaleAnimated = 4,
    kMatrixAnimated = 8,
};

// Keys as the file holds them: rotations are (x, y, z, -w), scales are 7 floats each. The index arrays
// hold, per frame, the float offset of that frame's key.
struct Node {
    int32_t object = -1;
    std::string name;
    int32_t material = -1;
    int32_t parent = -1;
    std::vector<float> positions, rotations, scales, matrices;
    std::vector<uint32_t> positionIndex, rotationIndex, scaleIndex, matrixIndex;
    std::optional<uint32_t> animationFlags;  // the block is left out unless set

    // The older layout's fixed transform; here w keeps its sign.
    std::optional<std::array<float, 3>> staticPosition, staticScale;
    std::optional<std::array<float, 4>> staticRotation;
};

struct Camera {
    int32_t target = -1;
    float fov = 0.785f;
    float farPlane = 1000.0f;
    float nearPlane = 1.0f;
    std::vector<float> animatedFov;
};

enum LightType : uint32_t { kPointLight = 0, kDirectionalLight = 1, kSpotLight = 2 };

struct Light {
    int32_t target = -1;
    std::array<float, 3> colour{1, 1, 1};
    uint32_t type = kPointLight;
    float constantAttenuation = 1.0f;
    float linearAttenuation = 0.0f;
    float quadraticAttenuation = 0.0f;
    float falloffAngle = 3.14159265f;
    float falloffExponent = 0.0f;
};

struct Material {
    std::string name;
    int32_t diffuseTexture = -1, ambientTexture = -1, specularColourTexture = -1, specularLevelTexture = -1,
            bumpTexture = -1, emissiveTexture = -1, glossinessTexture = -1, opacityTexture = -1,
            reflectionTexture = -1, refractionTexture = -1;
    float opacity = 1.0f;
    std::array<float, 3> ambient{1, 1, 1}, diffuse{1, 1, 1}, specular{0, 0, 0};
    float shininess = 0.0f;  // specular exponent / 256
    std::string effectFile, effectName;
    uint32_t blendSourceRgb = 1, blendSourceAlpha = 1, blendDestRgb = 0, blendDestAlpha = 0;
    uint32_t blendOpRgb = 0x8006, blendOpAlpha = 0x8006;
    std::array<float, 4> blendColour{}, blendFactor{};
    uint32_t flags = 0;
};

struct Scene {
    std::string version = "AB.POD.2.0";
    std::string exportOptions, history;  // text blocks before the scene, left out when empty
    std::array<float, 3> background{}, ambient{};
    std::vector<Camera> cameras;
    std::vector<Light> lights;
    std::vector<Mesh> meshes;
    std::vector<Node> nodes;  // mesh nodes, light nodes, camera nodes, others
    std::vector<std::string> textures;
    std::vector<Material> materials;
    uint32_t meshNodeCount = 0;
    uint32_t frameCount = 0;
    std::optional<uint32_t> fps = 30;
    uint32_t flags = 0;

    // Counts to write in place of the true ones.
    struct Counts {
        std::optional<uint32_t> cameras, lights, meshes, nodes, textures, materials;
    } counts;
};

std::vector<uint8_t> WritePod(const Scene& scene);

// Writes `bytes` to `path`, replacing what is there. False when the file cannot be written whole.
bool WriteFile(const std::string& path, const std::vector<uint8_t>& bytes);

}  // namespace pod
