// Reading POD files: what the reader and its checks share.
//
// The reader fills the scene's records block by block and notes how long each array in the file was. When the
// scene block ends, the checks compare every count, index and offset with those lengths, once, so that
// nothing later has to. Lengths live as long as the read.
#pragma once

#include "Qex.h"

// The record kinds of a scene, in the order of the reader's tables.
enum QexPODKind { kPODCamera, kPODLight, kPODMesh, kPODNode, kPODTexture, kPODMaterial, kPODKinds };

constexpr uint32_t kPODMaxUVChannels = 8;
constexpr uint32_t kPODMaxParents = 1000;  // the world matrix of a node is found by recursion

// What the reader notes about each record: lengths of its arrays. The names are indices into a row of words.
enum QexPODExtent {
    kExtentFov = 0,            // camera: floats
    kExtentPositionIndex = 0,  // node: words, then floats of the key arrays in the same order
    kExtentRotationIndex,
    kExtentScaleIndex,
    kExtentMatrixIndex,
    kExtentPosition,
    kExtentRotation,
    kExtentScale,
    kExtentMatrix,
    kExtentStrips = 0,  // mesh: words
    kExtentBoneTable,
    kExtentBonesPerBatch,
    kExtentBatchOffsets,
    kExtentFaces,  // mesh: bytes of an element's own data, from here on
    kExtentVertices,
    kExtentNormals,
    kExtentTangents,
    kExtentBinormals,
    kExtentColours,
    kExtentBoneIndices,
    kExtentBoneWeights,
    kExtentUVWs,
    kExtentCount = kExtentUVWs + kPODMaxUVChannels
};

typedef uint32_t QexPODExtents[kExtentCount];

// Checks a scene that was read whole, and marks its skinned meshes. What is broken fails with one line in the
// log; what is merely odd (keys for fewer frames than the scene has) is put right with a line.
bool QexLoadPODModel_Check(QexPODModel* scene, QexPODExtents* const extents[kPODKinds]);

// Bytes of one component (or of the one word) of a data type, 0 for a type that does not exist.
uint32_t QexPODData_ComponentSize(uint32_t type);

// Components of an element as the shaders get them: packed types of a fixed number ignore the count declared.
uint32_t QexPODData_Components(const CPODData& element);

// Bytes of a whole element; packed types are one word whatever the component count.
uint32_t QexPODData_ElementSize(uint32_t type, uint32_t componentCount);
