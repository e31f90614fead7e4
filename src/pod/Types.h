// The tables of what a POD scene is made of: types of vertex data, elements of a mesh, channels of a node.
#pragma once

#include "Qex/pod.h"

// ---- Data types ----

// How the components of a type lie in memory.
enum QexPODStorage : uint8_t {
    kPODNoStorage,
    kPODFloat,
    kPODInt32,
    kPODUint32,
    kPODInt16,
    kPODUint16,
    kPODInt8,  // GL counts it from -128, QexPODVertex_ReadVec from 0
    kPODUint8,
    kPODFixed,
    kPODColour,  // four bytes of one word
    kPODFields,  // three signed 10-bit fields of one word
    kPODStorages
};

struct QexPODType {
    QexPODStorage storage;
    uint8_t componentSize;  // bytes of a component or of a packed element's word; 0: there is no such type
    bool packed;            // an element is one word whatever the component count
    uint8_t components;     // of every element, whatever its count says; 0: as many as it says
    uint8_t plain;          // the type of the same bytes that is not normalised
    float divisor;          // of stored numbers
};

// The row of a data type; that of type 0 for one that does not exist.
const QexPODType& QexPODType_Of(uint32_t type);

// Components of an element as the shaders get them.
uint32_t QexPODData_Components(const CPODData& element);

// Bytes of a whole element.
uint32_t QexPODData_ElementSize(uint32_t type, uint32_t componentCount);
inline uint32_t QexPODData_ElementSize(const CPODData& element) {
    return QexPODData_ElementSize(element.type, element.componentCount);
}

// ---- Elements of a mesh ----

constexpr uint32_t kPODMaxUVChannels = 8;

// Elements are numbered: the faces, what a mesh has one of for its vertices, then its UV channels.
enum QexPODElementNumber : uint32_t {
    kPODFaces,
    kPODVertices,
    kPODNormals,
    kPODTangents,
    kPODBinormals,
    kPODColours,
    kPODBoneIndices,
    kPODBoneWeights,
    kPODUVWs,
    kPODMaxElements = kPODUVWs + kPODMaxUVChannels
};

struct QexPODElement {
    uint32_t block;                // identifier in the file
    char name[20];                 // no pointer, which the loader would have to set
    CPODData QexPODMesh::*member;  // null: a UV channel
    int32_t attribute;  // QexVertexElement that it is uploaded as, the first UV channel alone; -1: none
};
extern const QexPODElement kPODElements[kPODUVWs + 1];

// The number of the element in a block of the file, that of the first channel for all UV channels;
// kPODMaxElements when no element has such blocks.
uint32_t QexPODElement_Find(uint32_t block);

inline const QexPODElement& QexPODElement_Of(uint32_t number) {
    return kPODElements[number < kPODUVWs ? number : kPODUVWs];
}
inline uint32_t QexPODMesh_ElementCount(const QexPODMesh* mesh) {
    return kPODUVWs + mesh->uvwChannelCount;
}
inline CPODData* QexPODMesh_Element(QexPODMesh* mesh, uint32_t number) {
    return number < kPODUVWs ? &(mesh->*kPODElements[number].member) : &mesh->uvws[number - kPODUVWs];
}
inline const CPODData* QexPODMesh_Element(const QexPODMesh* mesh, uint32_t number) {
    return QexPODMesh_Element(const_cast<QexPODMesh*>(mesh), number);
}

// ---- Channels of a node ----

// In the order of QexPODNode::keyFrames.
enum QexPODChannelNumber : uint32_t { kPODPosition, kPODRotation, kPODScale, kPODMatrix, kPODChannels };

struct QexPODChannel {
    char name[12];
    uint32_t animated;   // flag of a node whose keys change from frame to frame
    uint32_t shared;     // flag of a node whose keys lie in the memory that the scene was read from; 0: never
    uint32_t keyFloats;  // that are read of a key
    uint32_t stride;     // floats from key to key
    float* QexPODNode::*keys;
    uint32_t* QexPODNode::*index;
};
// clang-format off
inline constexpr QexPODChannel kPODChannelTable[kPODChannels] = {
    {"position", QEX_NODE_POSITION_ANIMATED, QEX_NODE_SHARED_POSITION, 3, 3,
     &QexPODNode::position, &QexPODNode::positionIndex},
    {"rotation", QEX_NODE_ROTATION_ANIMATED, 0, 4, 4, &QexPODNode::rotation, &QexPODNode::rotationIndex},
    // Some exporters cut the last key behind its first three floats, which are all that is read.
    {"scale", QEX_NODE_SCALE_ANIMATED, QEX_NODE_SHARED_SCALE, 3, 7, &QexPODNode::scale, &QexPODNode::scaleIndex},
    {"matrix", QEX_NODE_MATRIX_ANIMATED, QEX_NODE_SHARED_MATRIX, 16, 16,
     &QexPODNode::matrix, &QexPODNode::matrixIndex},
};
// clang-format on
