// Records calls with what their pointers point at, compares recordings, and injects errors.

#include "Recording.h"
#include "Tap.h"

#include <GLES2/gl2ext.h>

#include <algorithm>
#include <cstring>
#include <vector>

namespace gltap {
namespace {

// How to find the bytes behind a pointer argument.
enum class Copy : uint8_t {
    kNothing,   // keep the address
    kElements,  // `count` argument times `bytes`
    kVector,    // `bytes`
    kString,    // up to the zero
    kImage,     // width at argument `count`, height after it, format and type before the pointer
    kIndices,   // glDrawElements without an element buffer
    kSource,    // glShaderSource
    kBinary,    // glShaderBinary
};

struct CopyRule {
    Fn function;
    Copy copy;
    uint8_t pointer;  // argument number
    uint8_t count;    // argument number
    uint8_t bytes;
};

// clang-format off
constexpr CopyRule kCopyRules[] = {
    {Fn::glUniform1fv, Copy::kElements, 2, 1, 4},         {Fn::glUniform1iv, Copy::kElements, 2, 1, 4},
    {Fn::glUniform2fv, Copy::kElements, 2, 1, 8},         {Fn::glUniform2iv, Copy::kElements, 2, 1, 8},
    {Fn::glUniform3fv, Copy::kElements, 2, 1, 12},        {Fn::glUniform3iv, Copy::kElements, 2, 1, 12},
    {Fn::glUniform4fv, Copy::kElements, 2, 1, 16},        {Fn::glUniform4iv, Copy::kElements, 2, 1, 16},
    {Fn::glUniformMatrix2fv, Copy::kElements, 3, 1, 16},
    {Fn::glUniformMatrix3fv, Copy::kElements, 3, 1, 36},
    {Fn::glUniformMatrix4fv, Copy::kElements, 3, 1, 64},
    {Fn::glVertexAttrib1fv, Copy::kVector, 1, 0, 4},      {Fn::glVertexAttrib2fv, Copy::kVector, 1, 0, 8},
    {Fn::glVertexAttrib3fv, Copy::kVector, 1, 0, 12},     {Fn::glVertexAttrib4fv, Copy::kVector, 1, 0, 16},
    {Fn::glTexParameterfv, Copy::kVector, 2, 0, 4},       {Fn::glTexParameteriv, Copy::kVector, 2, 0, 4},
    {Fn::glBufferData, Copy::kElements, 2, 1, 1},         {Fn::glBufferSubData, Copy::kElements, 3, 2, 1},
    {Fn::glCompressedTexImage2D, Copy::kElements, 7, 6, 1},
    {Fn::glCompressedTexSubImage2D, Copy::kElements, 8, 7, 1},
    {Fn::glTexImage2D, Copy::kImage, 8, 3, 0},            {Fn::glTexSubImage2D, Copy::kImage, 8, 4, 0},
    {Fn::glGenTextures, Copy::kElements, 1, 0, 4},        {Fn::glDeleteTextures, Copy::kElements, 1, 0, 4},
    {Fn::glGenVertexArraysOES, Copy::kElements, 1, 0, 4}, {Fn::glDeleteVertexArraysOES, Copy::kElements, 1, 0, 4},
    {Fn::glGenBuffers, Copy::kElements, 1, 0, 4},         {Fn::glDeleteBuffers, Copy::kElements, 1, 0, 4},
    {Fn::glGenFramebuffers, Copy::kElements, 1, 0, 4},    {Fn::glDeleteFramebuffers, Copy::kElements, 1, 0, 4},
    {Fn::glGenRenderbuffers, Copy::kElements, 1, 0, 4},   {Fn::glDeleteRenderbuffers, Copy::kElements, 1, 0, 4},
    {Fn::glBindAttribLocation, Copy::kString, 2, 0, 0},
    {Fn::glGetAttribLocation, Copy::kString, 1, 0, 0},    {Fn::glGetUniformLocation, Copy::kString, 1, 0, 0},
    {Fn::glDrawElements, Copy::kIndices, 3, 1, 0},
    {Fn::glShaderSource, Copy::kSource, 2, 1, 0},
    {Fn::glShaderBinary, Copy::kBinary, 1, 0, 4},
};
// clang-format on

constexpr CopyRule RuleOf(size_t function) {
    for (const CopyRule& rule : kCopyRules) {
        if (Index(rule.function) == function) return rule;
    }
    return {static_cast<Fn>(function), Copy::kNothing, 0, 0, 0};
}

using Bytes = std::vector<uint8_t>;

void Append(Bytes& out, const void* from, size_t size) {
    const auto* bytes = static_cast<const uint8_t*>(from);
    out.insert(out.end(), bytes, bytes + size);
}

size_t Size(const gltapValue& value) {
    return value.i > 0 ? static_cast<size_t>(value.i) : 0;
}

size_t IndexBytes(int64_t type) {
    return type == GL_UNSIGNED_BYTE ? 1 : type == GL_UNSIGNED_SHORT ? 2 : 4;
}

// Joins the pieces of a source; a null or negative length means up to the zero.
void AppendSource(Bytes& out, const gltapValue* a) {
    const auto* pieces = static_cast<const GLchar* const*>(a[2].p);
    const auto* lengths = static_cast<const GLint*>(a[3].p);
    for (size_t i = 0; i < Size(a[1]); ++i) {
        const bool counted = lengths && lengths[i] >= 0;
        Append(out, pieces[i], counted ? static_cast<size_t>(lengths[i]) : std::strlen(pieces[i]));
    }
    out.push_back(0);
}

void AppendPointed(Bytes& out, const CopyRule& rule, const gltapValue* a) {
    const void* from = a[rule.pointer].p;
    if (rule.copy == Copy::kNothing || !from) return;
    switch (rule.copy) {
        case Copy::kNothing: break;
        case Copy::kElements: Append(out, from, Size(a[rule.count]) * rule.bytes); break;
        case Copy::kVector: Append(out, from, rule.bytes); break;
        case Copy::kString: Append(out, from, std::strlen(static_cast<const char*>(from)) + 1); break;
        case Copy::kImage:
            Append(out, from,
                   ImageBytes(a[rule.count].i, a[rule.count + 1].i, a[rule.pointer - 2].i,
                              a[rule.pointer - 1].i, tap.state.unpackAlignment));
            break;
        case Copy::kIndices:
            if (tap.state.elementBuffer == 0) Append(out, from, Size(a[1]) * IndexBytes(a[2].i));
            break;
        case Copy::kSource: AppendSource(out, a); break;
        case Copy::kBinary:
            Append(out, from, Size(a[0]) * rule.bytes);
            if (a[3].p) Append(out, a[3].p, Size(a[4]));
            break;
    }
}

// Points the arguments at the copy of what they pointed at.
void PointAtData(gltapCall& call, const CopyRule& rule) {
    if (call.dataSize == 0) return;
    gltapValue* a = call.argument;
    a[rule.pointer].p = call.data;
    if (rule.copy == Copy::kSource) {
        a[1].i = 1;
        a[3].p = nullptr;
    }
    if (rule.copy == Copy::kBinary && a[3].p)
        a[3].p = static_cast<const uint8_t*>(call.data) + Size(a[0]) * rule.bytes;
}

// Bytes that GL may write through the pointers of a replayed call.
size_t OutputBytes(const gltapCall& call) {
    const gltapValue* a = call.argument;
    switch (static_cast<Fn>(call.function)) {
        case Fn::glReadPixels: return ImageBytes(a[2].i, a[3].i, a[4].i, a[5].i, 8);
        case Fn::glGenTextures:
        case Fn::glGenVertexArraysOES:
        case Fn::glGenBuffers:
        case Fn::glGenFramebuffers:
        case Fn::glGenRenderbuffers: return Size(a[0]) * sizeof(GLuint);
        case Fn::glGetAttachedShaders: return Size(a[1]) * sizeof(GLuint);
        case Fn::glGetShaderInfoLog:
        case Fn::glGetProgramInfoLog:
        case Fn::glGetShaderSource: return Size(a[1]);
        case Fn::glGetActiveAttrib:
        case Fn::glGetActiveUniform: return Size(a[2]);
        default: return 0;
    }
}

// More than the longest list that a query returns.
constexpr size_t kLeastScratch = 4096;
constexpr size_t kDataAlignment = 8;

gltapRecording* g_recording = nullptr;

struct Injection {
    Fn function;
    uint32_t remaining;
    GLenum error;
};

std::vector<Injection>& Injections() {
    static auto* injections = new std::vector<Injection>;
    return *injections;
}

bool SameCall(const gltapCall& a, const gltapCall& b) {
    if (a.function != b.function || a.dataSize != b.dataSize) return false;
    if (a.dataSize != 0 && std::memcmp(a.data, b.data, a.dataSize) != 0) return false;
    const FunctionInfo& info = kFunctions[a.function];
    for (size_t i = 0; i < info.arity; ++i) {
        const gltapValue &x = a.argument[i], &y = b.argument[i];
        bool same = true;
        switch (info.kinds[i]) {
            case Kind::kInteger: same = x.i == y.i; break;
            case Kind::kFloat: same = std::memcmp(&x.f, &y.f, sizeof(x.f)) == 0; break;
            case Kind::kInput: same = a.dataSize != 0 || x.p == y.p; break;
            case Kind::kOutput: break;
        }
        if (!same) return false;
    }
    return true;
}

std::string FirstDifference(const gltapRecording& a, const gltapRecording& b) {
    const size_t common = std::min(a.calls.size(), b.calls.size());
    for (size_t i = 0; i < common; ++i) {
        if (SameCall(a.calls[i], b.calls[i])) continue;
        return "call " + std::to_string(i) + ": " + CallText(a.calls[i]) + " | " + CallText(b.calls[i]);
    }
    if (a.calls.size() == b.calls.size()) return std::string();
    const auto& longer = a.calls.size() > common ? a : b;
    return std::to_string(a.calls.size()) + " calls | " + std::to_string(b.calls.size()) +
           " calls, the first more: " + CallText(longer.calls[common]);
}

}  // namespace

static size_t PixelBytes(int64_t format, int64_t type) {
    size_t channels = 4;
    switch (format) {
        case GL_ALPHA:
        case GL_LUMINANCE:
        case GL_DEPTH_COMPONENT:
        case GL_RED_EXT: channels = 1; break;
        case GL_LUMINANCE_ALPHA:
        case GL_RG_EXT: channels = 2; break;
        case GL_RGB: channels = 3; break;
        default: break;
    }
    switch (type) {
        case GL_UNSIGNED_SHORT_5_6_5:
        case GL_UNSIGNED_SHORT_4_4_4_4:
        case GL_UNSIGNED_SHORT_5_5_5_1: return 2;
        case GL_UNSIGNED_INT_24_8_OES: return 4;
        case GL_UNSIGNED_SHORT:
        case GL_HALF_FLOAT_OES: return channels * 2;
        case GL_UNSIGNED_INT:
        case GL_FLOAT: return channels * 4;
        default: return channels;
    }
}

size_t ImageBytes(int64_t width, int64_t height, int64_t format, int64_t type, int64_t alignment) {
    if (width <= 0 || height <= 0) return 0;
    const size_t pixel = PixelBytes(format, type);
    const size_t row = static_cast<size_t>(width) * pixel;
    const size_t align = static_cast<size_t>(std::max<int64_t>(alignment, 1));
    const size_t padded = (row + align - 1) / align * align;
    // The last row is not padded: reading past it would leave the caller's image.
    return padded * static_cast<size_t>(height - 1) + row;
}

void Observe(Fn function, const gltapValue* arguments, gltapValue result) {
    gltapCall call = {};
    call.function = static_cast<uint16_t>(function);
    call.argumentCount = kFunctions[Index(function)].arity;
    std::copy_n(arguments, call.argumentCount, call.argument);
    call.result = result;

    Bytes data;
    const CopyRule rule = RuleOf(Index(function));
    AppendPointed(data, rule, arguments);
    call.dataSize = static_cast<uint32_t>(data.size());

    if (tap.watch & kLog) {
        gltapCall logged = call;
        logged.data = data.data();
        PointAtData(logged, rule);
        LogCall(logged);
    }
    if (!(tap.watch & kRecord)) return;
    // The data moves while it grows: offsets become addresses when the recording ends.
    data.resize((data.size() + kDataAlignment - 1) / kDataAlignment * kDataAlignment);
    g_recording->offsets.push_back(g_recording->data.size());
    g_recording->data.insert(g_recording->data.end(), data.begin(), data.end());
    g_recording->scratchSize = std::max(g_recording->scratchSize, OutputBytes(call));
    g_recording->calls.push_back(call);
}

bool TakeInjection(Fn function) {
    auto& waiting = Injections();
    GLenum error = GL_NO_ERROR;
    for (size_t i = 0; i < waiting.size();) {
        if (waiting[i].function != function || --waiting[i].remaining > 0) {
            ++i;
            continue;
        }
        error = waiting[i].error;
        waiting.erase(waiting.begin() + static_cast<std::ptrdiff_t>(i));
    }
    if (waiting.empty()) tap.watch &= ~static_cast<uint32_t>(kInject);
    if (error == GL_NO_ERROR) return false;
    // GL keeps the first error until it is read.
    if (tap.pendingError == GL_NO_ERROR) tap.pendingError = error;
    if (tap.watch & kLog)
        LogLine(std::string(kFunctions[Index(function)].name) + ": not carried out, injected " +
                EnumText(error));
    return true;
}

void ForgetRecording() {
    delete g_recording;
    g_recording = nullptr;
    tap.watch &= ~static_cast<uint32_t>(kRecord);
}

void ForgetInjections() {
    Injections().clear();
    tap.watch &= ~static_cast<uint32_t>(kInject);
    tap.pendingError = GL_NO_ERROR;
}

}  // namespace gltap

using namespace gltap;

void gltapBeginRecording(void) {
    ForgetRecording();
    g_recording = new gltapRecording;
    g_recording->scratchSize = kLeastScratch;
    tap.watch |= kRecord;
}

gltapRecording* gltapEndRecording(void) {
    if (!g_recording) return nullptr;
    gltapRecording* recording = g_recording;
    g_recording = nullptr;
    tap.watch &= ~static_cast<uint32_t>(kRecord);
    for (size_t i = 0; i < recording->calls.size(); ++i) {
        gltapCall& call = recording->calls[i];
        call.data = call.dataSize != 0 ? recording->data.data() + recording->offsets[i] : nullptr;
        PointAtData(call, RuleOf(call.function));
    }
    recording->offsets = std::vector<size_t>();
    recording->scratch.resize(recording->scratchSize / sizeof(uint64_t) + 1);
    return recording;
}

void gltapReleaseRecording(gltapRecording* recording) {
    delete recording;
}

size_t gltapRecordingSize(const gltapRecording* recording) {
    return recording->calls.size();
}

const gltapCall* gltapRecordingCall(const gltapRecording* recording, size_t index) {
    return index < recording->calls.size() ? &recording->calls[index] : nullptr;
}

int gltapSameRecording(const gltapRecording* a, const gltapRecording* b, char* text, size_t size) {
    const std::string difference = FirstDifference(*a, *b);
    CopyText(difference, text, size);
    return difference.empty();
}

int gltapInjectError(const char* function, uint32_t nth, uint32_t error) {
    const int number = gltapFunctionNumber(function);
    if (number < 0 || number == static_cast<int>(Fn::glGetError) || nth == 0 || error == GL_NO_ERROR)
        return 0;
    Injections().push_back({static_cast<Fn>(number), nth, error});
    tap.watch |= kInject;
    return 1;
}

size_t gltapPendingInjections(void) {
    return Injections().size();
}
