// What the parts of the tap share: the numbering and the types of the GL functions, and the state that every
// entry point reads.
//
// `tap` is constant-initialised and holds no containers, since GL may be called before this library's
// constructors have run and after its destructors. Objects, recordings and injections live on the heap.
#pragma once

#define GL_APICALL __attribute__((visibility("default")))
#define GL_GLEXT_PROTOTYPES
#include <GLES2/gl2.h>
#include <GLES2/gl2ext.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <type_traits>

#include "gltap.h"

namespace gltap {

enum class Fn : uint16_t {
#define GL(result, name, parameters, arguments) name,
#include "GLFunctions.inc"
#undef GL
    kCount
};
constexpr size_t kFunctionCount = static_cast<size_t>(Fn::kCount);
constexpr size_t Index(Fn function) {
    return static_cast<size_t>(function);
}

// Selects the overload for one function where functions need code of their own.
template <Fn function>
struct Tag {};

template <Fn function>
struct Function;
#define GL(result, name, parameters, arguments)   \
    template <>                                   \
    struct Function<Fn::name> {                   \
        using Result = result;                    \
        using Pointer = decltype(&::name);        \
        static constexpr Pointer entry = &::name; \
    };
#include "GLFunctions.inc"
#undef GL

enum class Kind : uint8_t { kInteger, kFloat, kInput, kOutput };

template <typename T>
constexpr Kind KindOf() {
    if constexpr (std::is_floating_point_v<T>) return Kind::kFloat;
    if constexpr (!std::is_pointer_v<T>) return Kind::kInteger;
    return std::is_const_v<std::remove_pointer_t<T>> ? Kind::kInput : Kind::kOutput;
}

constexpr size_t kMaxArguments = 9;

struct FunctionInfo {
    const char* name;
    const char* parameters;  // "(GLenum target, GLuint texture)"
    const char* result;      // "void"
    uint8_t arity;
    Kind kinds[kMaxArguments];
};
extern const FunctionInfo kFunctions[kFunctionCount];

// Reasons for an entry point to leave its short path.
enum Watch : uint32_t { kRecord = 1, kLog = 2, kInject = 4, kReads = 8 };

struct Tap {
    gltapMode mode;
    uint32_t watch;
    GLenum pendingError;
    uint64_t counts[kFunctionCount];
    void* driver[kFunctionCount];  // looked up at the first forwarded call
    gltapState state;
};
extern Tap tap;

// Objects.cpp
void AddObjects(gltapObject kind, GLsizei count, const GLuint* names);
void RemoveObjects(gltapObject kind, GLsizei count, const GLuint* names);
bool IsLive(gltapObject kind, GLuint name);
void ForgetObjects();
std::string LiveObjectsText();

// Recorder.cpp
void Observe(Fn function, const gltapValue* arguments, gltapValue result);
bool TakeInjection(Fn function);
void ForgetRecording();
void ForgetInjections();
size_t ImageBytes(int64_t width, int64_t height, int64_t format, int64_t type, int64_t alignment);

// Reads.cpp: looks at a call before it is made.
void CheckRead(Fn function, const gltapValue* arguments);
void ForgetReads();

// Poorer.cpp: changes the answer of glGetIntegerv and of glGetString, where it is to.
void MakePoorer(GLenum name, GLint* out);
const GLubyte* MakePoorer(GLenum name, const GLubyte* text);
void ForgetPoorer();

// Text.cpp
std::string EnumText(uint32_t value);
std::string CallText(const gltapCall& call);
std::string CountsText();
size_t CopyText(const std::string& from, char* text, size_t size);
void LogCall(const gltapCall& call);
void LogLine(const std::string& line);

// State.cpp
void ResetState();
void BindVertexArray(GLuint name);
void DeleteVertexArrays(GLsizei count, const GLuint* names);
// The values of a state query, as doubles; 0 when the tap does not follow that state.
size_t QueryState(GLenum name, double values[4]);

}  // namespace gltap
