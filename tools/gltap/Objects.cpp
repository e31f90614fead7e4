// The names of live objects, by kind.

#include <set>

#include "Tap.h"

namespace gltap {
namespace {

using Names = std::set<GLuint>;

// Never destroyed: other libraries may delete objects in their destructors.
Names& LiveNames(gltapObject kind) {
    static Names* live = new Names[GLTAP_OBJECT_KINDS];
    return live[kind];
}

constexpr const char* kKindNames[GLTAP_OBJECT_KINDS] = {
    "textures", "buffers", "framebuffers", "renderbuffers", "shaders", "programs", "vertex arrays"};

}  // namespace

void AddObjects(gltapObject kind, GLsizei count, const GLuint* names) {
    for (GLsizei i = 0; i < count; ++i) {
        if (names[i] != 0) LiveNames(kind).insert(names[i]);
    }
}

void RemoveObjects(gltapObject kind, GLsizei count, const GLuint* names) {
    for (GLsizei i = 0; i < count; ++i) LiveNames(kind).erase(names[i]);
}

bool IsLive(gltapObject kind, GLuint name) {
    return LiveNames(kind).count(name) != 0;
}

void ForgetObjects() {
    for (int kind = 0; kind < GLTAP_OBJECT_KINDS; ++kind) LiveNames(static_cast<gltapObject>(kind)).clear();
}

std::string LiveObjectsText() {
    std::string text;
    for (int kind = 0; kind < GLTAP_OBJECT_KINDS; ++kind) {
        const Names& names = LiveNames(static_cast<gltapObject>(kind));
        if (names.empty()) continue;
        text += std::string(kKindNames[kind]) + ": " + std::to_string(names.size());
        const char* separator = " (";
        for (const GLuint name : names) {
            text += separator + std::to_string(name);
            separator = " ";
        }
        text += ")\n";
    }
    return text;
}

}  // namespace gltap

size_t gltapLiveObjects(gltapObject kind, uint32_t* names, size_t max) {
    if (kind < 0 || kind >= GLTAP_OBJECT_KINDS) return 0;
    size_t count = 0;
    for (const GLuint name : gltap::LiveNames(kind)) {
        if (count < max) names[count] = name;
        ++count;
    }
    return count;
}

size_t gltapDescribeObjects(char* text, size_t size) {
    return gltap::CopyText(gltap::LiveObjectsText(), text, size);
}
