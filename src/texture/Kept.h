// What is kept of each GL texture, so that it can be made again in another context: where its image came from
// and how it is filtered. Records stay as they are; a texture is known by its GL name.
#pragma once

#include <cstddef>
#include <cstdint>

#include "Qex/textures.h"

enum QexKeptKind : uint8_t {
    kKeptImage,  // a PVR or KTX image
    kKeptTga,
    kKeptPixels,
    kKeptTarget,   // drawn into: without contents
    kKeptNormals,  // the cube map of normals
};

struct QexKeptSource {
    QexKeptKind kind;
    const void* bytes;  // an image, null where it is not one block of known size
    uint64_t size;
    int32_t width, height;  // of pixels, targets and normals
    uint32_t format;        // of pixels
    int32_t decode;         // of an image
    uint32_t firstLevel;
};

// A name for a texture: a new one, or that of the one that is being made again.
uint32_t QexKeptTexture_NewName();

// Notes where a texture's image came from: the file that is being loaded, or memory, of which a copy is kept
// where the application wants that. False when memory runs out.
bool QexKeptTexture_Note(uint32_t name, uint32_t target, const QexKeptSource& source);
// Forgets a texture that goes, or that its owner makes again itself.
void QexKeptTexture_Drop(uint32_t name);
// New pixels for a texture that was made from pixels, in the record's size and format.
void QexKeptTexture_Replace(const QexTexture& texture, const void* pixels, uint64_t size);
// A filter or wrap code that was set; 0 leaves the other as it is.
void QexKeptTexture_SetCodes(uint32_t name, uint8_t filter, uint8_t wrap);

// Copies of memory are kept from now on, or not. The setting before.
bool QexKeptTexture_SetKeeping(bool keeps);

// The path of the file that is being loaded, while it lives.
class QexKeptPath {
  public:
    explicit QexKeptPath(const char* path);
    ~QexKeptPath();
    QexKeptPath(const QexKeptPath&) = delete;
    QexKeptPath& operator=(const QexKeptPath&) = delete;

  private:
    const char* before_;
};

// Loads a texture of that name again into an empty record, as its owner's hook did, which was given that
// path. 0, or another value when the owner has no such texture any more.
using QexKeptLoader = int32_t (*)(void* owner, uint32_t name, const char* path, QexTexture* texture);

struct QexKeptHook {
    QexKeptLoader loader;
    void* owner;
    const char* path;
};

// While it lives, textures from memory of which no copy is kept are the owner's to load again.
class QexKeptOwner {
  public:
    explicit QexKeptOwner(const QexKeptHook& hook);
    ~QexKeptOwner();
    QexKeptOwner(const QexKeptOwner&) = delete;
    QexKeptOwner& operator=(const QexKeptOwner&) = delete;

  private:
    QexKeptHook before_;
};
// An owner that goes.
void QexKeptOwner_Forget(const void* owner);
