// The tables that the reader walks: one row a block.
#include "pod/Fields.h"

#include "Qex/pod.h"

namespace {

using Kind = QexPODFieldKind;

#define WORDS(id, count, type, member, line) \
    { id, Kind::Words, count, offsetof(type, member), -1, 0, line, nullptr }
#define STRING(id, type, member, line) \
    { id, Kind::String, 0, offsetof(type, member), -1, 0, line, nullptr }
#define ARRAY(id, unit, type, member, extent, line) \
    { id, Kind::Array, unit, offsetof(type, member), extent, 0, line, nullptr }
#define KEYS(id, unit, member, extent, flag, line, sharedLine) \
    { id, Kind::Keys, unit, offsetof(QexPODNode, member), extent, flag, line, sharedLine }
#define STATIC(id, count, member) \
    { id, Kind::Static, count, offsetof(QexPODStaticTransform, member), -1, 0, nullptr, nullptr }

// clang-format off
const QexPODField kSceneFields[] = {
    WORDS(2000, 3, QexPODModel, backgroundColour, "  - background color %f %f %f\n"),
    WORDS(2001, 3, QexPODModel, ambientColour, "  - background color %f %f %f\n"),
    WORDS(2006, 1, QexPODModel, meshNodeCount, "  - %d node(s) are actually meshes.\n"),
    WORDS(2009, 1, QexPODModel, frameCount, "  - %d frame(s) found.\n"),
    WORDS(2016, 1, QexPODModel, flags, nullptr),
    WORDS(2017, 1, QexPODModel, framesPerSecond, "  - Frames per second = %d\n"),
};

const QexPODField kCameraFields[] = {
    WORDS(8000, 1, QexPODCamera, targetIndex, "    - target index = %d\n"),
    WORDS(8001, 1, QexPODCamera, fov, "    - field of view = %f\n"),
    WORDS(8002, 1, QexPODCamera, farPlane, "    - far plane = %f\n"),
    WORDS(8003, 1, QexPODCamera, nearPlane, "    - near plane = %f\n"),
    ARRAY(8004, 4, QexPODCamera, animatedFov, kExtentFov, "    - animated FOV: %d\n"),
};

const QexPODField kLightFields[] = {
    WORDS(7000, 1, QexPODLight, targetIndex, "    - light target index = %d\n"),
    WORDS(7001, 3, QexPODLight, colour, "    - light color = %f,%f,%f\n"),
    WORDS(7002, 1, QexPODLight, type, "    - light type = %d\n"),
    WORDS(7003, 1, QexPODLight, constantAttenuation, nullptr),
    WORDS(7004, 1, QexPODLight, linearAttenuation, nullptr),
    WORDS(7005, 1, QexPODLight, quadraticAttenuation, nullptr),
    WORDS(7006, 1, QexPODLight, fallOffAngle, "    - light fall off angle = %f\n"),
    WORDS(7007, 1, QexPODLight, fallOffExponent, "    - light fall off exponent = %f\n"),
};

const QexPODField kMaterialFields[] = {
    STRING(3000, QexPODMaterial, name, "    - material name = %s\n"),
    WORDS(3001, 1, QexPODMaterial, diffuseTexture, "    - diffuse texture index = %d\n"),
    WORDS(3002, 1, QexPODMaterial, opacity, "    - opacity = %f\n"),
    WORDS(3003, 3, QexPODMaterial, ambient, nullptr),
    WORDS(3004, 3, QexPODMaterial, diffuse, nullptr),
    WORDS(3005, 3, QexPODMaterial, specular, nullptr),
    WORDS(3006, 1, QexPODMaterial, shininess, "    - shininess = %f\n"),
    STRING(3007, QexPODMaterial, effectFile, "    - material effect file = %s\n"),
    STRING(3008, QexPODMaterial, effectName, "    - material effect name = %s\n"),
    WORDS(3009, 1, QexPODMaterial, ambientTexture, nullptr),
    WORDS(3010, 1, QexPODMaterial, specularColourTexture, nullptr),
    WORDS(3011, 1, QexPODMaterial, specularLevelTexture, nullptr),
    WORDS(3012, 1, QexPODMaterial, bumpTexture, nullptr),
    WORDS(3013, 1, QexPODMaterial, emissiveTexture, nullptr),
    WORDS(3014, 1, QexPODMaterial, glossinessTexture, nullptr),
    WORDS(3015, 1, QexPODMaterial, opacityTexture, nullptr),
    WORDS(3016, 1, QexPODMaterial, reflectionTexture, nullptr),
    WORDS(3017, 1, QexPODMaterial, refractionTexture, nullptr),
    WORDS(3018, 1, QexPODMaterial, blendSrcColour, nullptr),
    WORDS(3019, 1, QexPODMaterial, blendSrcAlpha, nullptr),
    WORDS(3020, 1, QexPODMaterial, blendDstColour, nullptr),
    WORDS(3021, 1, QexPODMaterial, blendDstAlpha, nullptr),
    WORDS(3022, 1, QexPODMaterial, blendOpColour, nullptr),
    WORDS(3023, 1, QexPODMaterial, blendOpAlpha, nullptr),
    WORDS(3024, 4, QexPODMaterial, blendColour, nullptr),
    WORDS(3025, 4, QexPODMaterial, blendFactor, nullptr),
    WORDS(3026, 1, QexPODMaterial, flags, nullptr),
};

const QexPODField kTextureFields[] = {
    STRING(4000, QexPODTexture, name, "    - texture name = %s\n"),
};

const QexPODField kNodeFields[] = {
    WORDS(5000, 1, QexPODNode, objectIndex, "    - node idx = %d\n"),
    STRING(5001, QexPODNode, name, "    - node name = %s\n"),
    WORDS(5002, 1, QexPODNode, materialIndex, "    - node material idx = %d\n"),
    WORDS(5003, 1, QexPODNode, parentIndex, "    - node parent idx = %d\n"),
    STATIC(5004, 3, position),
    STATIC(5005, 4, rotation),
    STATIC(5006, 3, scale),
    KEYS(5007, 12, position, kExtentKeys + kPODPosition, QEX_NODE_SHARED_POSITION,
         "    - %d node animation position data\n", "    - %d node animation position data from ROM\n"),
    KEYS(5008, 16, rotation, kExtentKeys + kPODRotation, 0, "    - %d node animation rotation data\n", nullptr),
    KEYS(5009, 28, scale, kExtentKeys + kPODScale, QEX_NODE_SHARED_SCALE,
         "    - %d node animation scale data\n", "    - %d node animation scale data from ROM\n"),
    KEYS(5011, 64, matrix, kExtentKeys + kPODMatrix, QEX_NODE_SHARED_MATRIX,
         "    - read %d node animation matrix\n", "    - point directly to %d node animation matrix \n"),
    WORDS(5012, 1, QexPODNode, animationFlags, "    - node animation flags = %d\n"),
    ARRAY(5013, 4, QexPODNode, positionIndex, kExtentIndex + kPODPosition, "    - %d node animation position idx\n"),
    ARRAY(5014, 4, QexPODNode, rotationIndex, kExtentIndex + kPODRotation, "    - %d node animation rotation idx\n"),
    ARRAY(5015, 4, QexPODNode, scaleIndex, kExtentIndex + kPODScale, "    - %d node animation scale idx\n"),
    ARRAY(5016, 4, QexPODNode, matrixIndex, kExtentIndex + kPODMatrix, "    - %d node animation matrix idx\n"),
};

const QexPODField kMeshFields[] = {
    WORDS(6000, 1, QexPODMesh, vertexCount, "    - mesh vertice = %d\n"),
    WORDS(6001, 1, QexPODMesh, faceCount, "    - mesh faces = %d\n"),
    {6002, Kind::UVWCount, 1, 0, -1, 0, "    - mesh number of UVW = %d\n", nullptr},
    ARRAY(6004, 4, QexPODMesh, stripLengths, kExtentStrips, "    - mesh number of strip length = %d\n"),
    WORDS(6005, 1, QexPODMesh, stripCount, "    - mesh number of strips = %d\n"),
    {6014, Kind::Bytes, 1, 0, -1, 0, "    - interleaved vertex data length = %d\n", nullptr},
    ARRAY(6015, 4, QexPODMesh, boneBatches.boneTable, kExtentBoneTable, "    - number of batches count= %d\n"),
    ARRAY(6016, 4, QexPODMesh, boneBatches.bonesPerBatch, kExtentBonesPerBatch,
          "    - number of bones per batch= %d\n"),
    ARRAY(6017, 4, QexPODMesh, boneBatches.offsets, kExtentBatchOffsets,
          "    - number of bone batche offsets= %d\n"),
    WORDS(6018, 1, QexPODMesh, boneBatches.maxBones, "    - batch bone maximum = %d\n"),
    WORDS(6019, 1, QexPODMesh, boneBatches.batchCount, "    - batch count = %d\n"),
    WORDS(6020, 16, QexPODMesh, unpackMatrix, "    - mesh unpack matrix found\n"),
};
// clang-format on

template <uint32_t N>
constexpr QexPODFields List(const QexPODField (&fields)[N]) {
    return {fields, N};
}

}  // namespace

const QexPODFields kPODSceneFields = List(kSceneFields);
const QexPODFields kPODRecordFields[kPODKinds] = {List(kCameraFields),  List(kLightFields),
                                                  List(kMeshFields),    List(kNodeFields),
                                                  List(kTextureFields), List(kMaterialFields)};

const QexPODField* QexPODFields_Find(const QexPODFields& fields, uint32_t id) {
    for (uint32_t i = 0; i < fields.count; ++i)
        if (fields.fields[i].id == id) return &fields.fields[i];
    return nullptr;
}
