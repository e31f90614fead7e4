// What the reader notes of a file beside the scene itself: how long each array in it was.
//
// The reader fills the scene's records block by block. When the scene block ends, every count, index and
// offset is compared with these lengths once, so that nothing later has to. They live as long as the read.
#pragma once

#include "pod/Types.h"

// The record kinds of a scene, in the order of the reader's tables.
enum QexPODKind { kPODCamera, kPODLight, kPODMesh, kPODNode, kPODTexture, kPODMaterial, kPODKinds };

// Of each record: indices into a row of words.
enum QexPODExtent {
    kExtentFov = 0,    // camera: floats
    kExtentIndex = 0,  // node: words of the index arrays, in the order of the channels
    kExtentKeys = kExtentIndex + kPODChannels,  // and floats of the key arrays
    kExtentStrips = 0,                          // mesh: words
    kExtentBoneTable,
    kExtentBonesPerBatch,
    kExtentBatchOffsets,
    kExtentElements,  // bytes of the own data of each element, by its number
    kExtentCount = kExtentElements + kPODMaxElements
};

typedef uint32_t QexPODExtents[kExtentCount];
