// What a draw reads: indices and vertices lie within their buffers, or in memory of the program.
#include <algorithm>
#include <cstring>
#include <map>
#include <vector>

#include "Tap.h"

namespace gltap {
namespace {

constexpr size_t kAttributes = 16;

struct Pointer {
    GLuint buffer;
    size_t bytes, stride, offset;
    const uint8_t* address;
};
using Pointers = Pointer[kAttributes];

// What was uploaded, and where attributes point, by vertex array object. Never destroyed, as live objects
// are not.
struct Reads {
    std::map<GLuint, std::vector<uint8_t>> buffers;
    std::map<GLuint, Pointers> arrays;
    size_t faults;
    std::string first;
    uint8_t seen;  // keeps reading from being optimised away
};
Reads& All() {
    static auto* reads = new Reads();
    return *reads;
}

size_t Size(const gltapValue& value) {
    return value.i > 0 ? static_cast<size_t>(value.i) : 0;
}

void Fault(const std::string& line) {
    if (All().faults++ == 0) All().first = line;
}

// Sanitizers see who reads too far.
void Touch(const void* from, size_t bytes) {
    for (size_t i = 0; from && i < bytes; ++i) All().seen ^= static_cast<const volatile uint8_t*>(from)[i];
}

size_t BytesOf(int64_t type) {
    switch (type) {
        case GL_BYTE:
        case GL_UNSIGNED_BYTE: return 1;
        case GL_SHORT:
        case GL_UNSIGNED_SHORT: return 2;
        default: return 4;
    }
}

std::vector<uint8_t>* Bound(int64_t target) {
    const gltapState& s = tap.state;
    const GLuint name = target == GL_ELEMENT_ARRAY_BUFFER ? s.elementBuffer : s.arrayBuffer;
    return name ? &All().buffers[name] : nullptr;
}

void Upload(const gltapValue* a) {
    std::vector<uint8_t>* buffer = Bound(a[0].i);
    if (!buffer) return Fault("glBufferData without a buffer");
    const auto* from = static_cast<const uint8_t*>(a[2].p);
    buffer->assign(Size(a[1]), 0);
    if (from) std::copy_n(from, Size(a[1]), buffer->begin());
}

void UploadPart(const gltapValue* a) {
    std::vector<uint8_t>* buffer = Bound(a[0].i);
    if (!buffer || a[1].i < 0 || Size(a[1]) + Size(a[2]) > buffer->size())
        return Fault("glBufferSubData beyond its buffer");
    std::copy_n(static_cast<const uint8_t*>(a[3].p), Size(a[2]),
                buffer->begin() + static_cast<std::ptrdiff_t>(a[1].i));
}

void Point(const gltapValue* a) {
    if (a[0].i < 0 || Size(a[0]) >= kAttributes) return Fault("glVertexAttribPointer of no attribute");
    const size_t bytes = Size(a[1]) * BytesOf(a[2].i);
    All().arrays[tap.state.vertexArray][a[0].i] = {tap.state.arrayBuffer, bytes, a[4].i ? Size(a[4]) : bytes,
                                                   reinterpret_cast<uintptr_t>(a[5].p),
                                                   static_cast<const uint8_t*>(a[5].p)};
}

void CheckVertices(size_t most) {
    if (!tap.state.program) Fault("a draw without a program");
    for (size_t i = 0; i < kAttributes; ++i) {
        if (!(tap.state.attributeArrays >> i & 1)) continue;
        const Pointer& p = All().arrays[tap.state.vertexArray][i];
        const size_t end = p.stride * most + p.bytes;
        if (!p.buffer) {
            if (!p.address) Fault("attribute " + std::to_string(i) + " points nowhere");
            for (size_t vertex = 0; p.address && vertex <= most; ++vertex)
                Touch(p.address + p.stride * vertex, p.bytes);
            continue;
        }
        const auto found = All().buffers.find(p.buffer);
        if (found == All().buffers.end() || p.offset + end > found->second.size())
            Fault("attribute " + std::to_string(i) + " of vertex " + std::to_string(most) +
                  " lies behind its buffer's end");
    }
}

void CheckElements(const gltapValue* a) {
    const size_t count = Size(a[1]), width = BytesOf(a[2].i);
    const auto* from = static_cast<const uint8_t*>(a[3].p);
    if (!count) return;
    if (tap.state.elementBuffer) {
        const std::vector<uint8_t>& buffer = All().buffers[tap.state.elementBuffer];
        const size_t offset = reinterpret_cast<uintptr_t>(a[3].p);
        if (offset > buffer.size() || count * width > buffer.size() - offset)
            return Fault("indices lie behind their buffer's end");
        from = buffer.data() + offset;
    }
    if (!from) return Fault("a draw without indices");
    size_t most = 0;
    for (size_t i = 0; i < count; ++i) {
        uint32_t index = 0;
        std::memcpy(&index, from + i * width, width);  // little-endian, as all hosts of the tests
        most = std::max<size_t>(most, index);
    }
    CheckVertices(most);
}

}  // namespace

void CheckRead(Fn function, const gltapValue* a) {
    switch (function) {
        case Fn::glBufferData: return Upload(a);
        case Fn::glBufferSubData: return UploadPart(a);
        case Fn::glVertexAttribPointer: return Point(a);
        case Fn::glDrawElements: return CheckElements(a);
        case Fn::glDrawArrays:
            if (Size(a[2])) CheckVertices(Size(a[1]) + Size(a[2]) - 1);
            return;
        case Fn::glDeleteBuffers:
            for (size_t i = 0; i < Size(a[0]); ++i)
                All().buffers.erase(static_cast<const GLuint*>(a[1].p)[i]);
            return;
        case Fn::glDeleteVertexArraysOES:
            for (size_t i = 0; i < Size(a[0]); ++i) All().arrays.erase(static_cast<const GLuint*>(a[1].p)[i]);
            return;
        case Fn::glTexImage2D:
            return Touch(a[8].p, ImageBytes(a[3].i, a[4].i, a[6].i, a[7].i, tap.state.unpackAlignment));
        case Fn::glTexSubImage2D:
            return Touch(a[8].p, ImageBytes(a[4].i, a[5].i, a[6].i, a[7].i, tap.state.unpackAlignment));
        case Fn::glCompressedTexImage2D: return Touch(a[7].p, Size(a[6]));
        default: return;
    }
}

void ForgetReads() {
    All() = Reads();
    tap.watch &= ~static_cast<uint32_t>(kReads);
}

}  // namespace gltap

using namespace gltap;

void gltapBeginReads(void) {
    ForgetReads();
    tap.watch |= kReads;
}

size_t gltapReadFaults(char* text, size_t size) {
    CopyText(All().first, text, size);
    return All().faults;
}
