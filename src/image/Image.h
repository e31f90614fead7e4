// What the parsers of texture files share: the bytes that they read, and what they find in them. None of them
// writes to the log: whoever asks says what a fault means to him.
#pragma once

#include <cstring>

#include "image/Format.h"

// A file image and what is known of its length.
struct QexImageBytes {
    const uint8_t* bytes;
    uint64_t size;
};
constexpr uint64_t kQexUnknownSize = UINT64_MAX;

struct QexImageLevel {
    uint32_t width, height;
    uint64_t offset;    // of its first face: in a PVR behind the header, in a KTX in the file
    uint64_t stride;    // from one face to the next
    uint64_t bytes;     // of a face
    uint64_t rowBytes;  // of pixels
};

// Faults of a file, in bits, since readers differ in which matters first.
enum QexImageFault : uint32_t {
    kQexFaultTwiddled = 1,     // pixels of a format that never is
    kQexFaultBits = 2,         // a pixel, other than the format's
    kQexFaultFaces = 4,        // a number that no cube map has
    kQexFaultSides = 8,        // of PVRTC, no powers of two
    kQexFaultLevelCount = 16,  // none, or more than the size has
    kQexFaultOverlap = 32,     // surfaces that begin before the one in front of them ends
    kQexFaultCut = 64,         // the file ends before its levels do
    kQexFaultLevelSize = 128,  // a level is not of its size
};

constexpr uint32_t kQexMostLevels = 32;

struct QexImage {
    const QexPixelFormat* format;  // null: none of the table
    uint32_t width, height;
    uint32_t faces;       // or surfaces
    uint32_t levelCount;  // that the header counts; once they are looked for, those that are sound
    uint32_t faults;      // QexImageFault
    QexImageLevel levels[kQexMostLevels];
};

inline uint32_t QexImage_ReadWord(const uint8_t* bytes) {
    uint32_t word;
    memcpy(&word, bytes, sizeof word);
    return word;
}

// One side of a level.
inline uint32_t QexImage_SideAtLevel(uint32_t side, uint32_t level) {
    return side >> level ? side >> level : 1;
}

// Levels from this size down to one pixel.
uint32_t QexImage_ChainLength(uint32_t width, uint32_t height);

// Whether both sides are powers of two, of which every GL has mipmaps.
bool QexImage_IsPowerOfTwo(uint32_t width, uint32_t height);

// Notes what is wrong with the size and the count of levels of a header.
void QexImage_JudgeSize(QexImage* image);
