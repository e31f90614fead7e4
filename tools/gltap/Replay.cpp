// Replays a recording: one generated function for each GL function turns a record back into a call.

#include <utility>

#include "Recording.h"
#include "Tap.h"

namespace gltap {
namespace {

template <typename T>
inline T FromValue(const gltapValue& value, void* scratch) {
    if constexpr (KindOf<T>() == Kind::kFloat) {
        return static_cast<T>(value.f);
    } else if constexpr (KindOf<T>() == Kind::kInteger) {
        return static_cast<T>(value.i);
    } else if constexpr (KindOf<T>() == Kind::kInput) {
        return static_cast<T>(value.p);
    } else {
        return value.p ? static_cast<T>(scratch) : nullptr;
    }
}

using Replayer = void (*)(const gltapCall& call, void* scratch);

template <Fn function, typename Pointer>
struct Thunk;

template <Fn function, typename R, typename... A>
struct Thunk<function, R (*)(A...)> {
    static void Run(const gltapCall& call, void* scratch) {
        Unpack(call, scratch, std::index_sequence_for<A...>());
    }
    template <size_t... i>
    static void Unpack([[maybe_unused]] const gltapCall& call, [[maybe_unused]] void* scratch,
                       std::index_sequence<i...>) {
        Function<function>::entry(FromValue<A>(call.argument[i], scratch)...);
    }
};

// The record holds the joined source, GL wants an array of pieces.
template <>
struct Thunk<Fn::glShaderSource, Function<Fn::glShaderSource>::Pointer> {
    static void Run(const gltapCall& call, void*) {
        const auto* source = static_cast<const GLchar*>(call.argument[2].p);
        glShaderSource(static_cast<GLuint>(call.argument[0].i), source ? 1 : 0, &source, nullptr);
    }
};

constexpr Replayer kReplayers[kFunctionCount] = {
#define GL(result, name, parameters, arguments) Thunk<Fn::name, Function<Fn::name>::Pointer>::Run,
#include "GLFunctions.inc"
#undef GL
};

}  // namespace
}  // namespace gltap

void gltapReplay(const gltapRecording* recording) {
    void* scratch = recording->scratch.data();
    for (const gltapCall& call : recording->calls) gltap::kReplayers[call.function](call, scratch);
}
