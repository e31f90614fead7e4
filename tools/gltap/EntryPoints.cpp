// The 142 functions of OpenGL ES 2.0 and the four of vertex array objects, generated from the list, and the
// way of a call through the tap.
//
// A call counts itself, goes to the driver or the null driver, and lets the state tracker see it. Recording,
// logging and errors to inject hide behind one branch on `tap.watch`.

#include <dlfcn.h>

#include <cstdio>
#include <utility>

#include "NullDriver.h"
#include "StateTracker.h"
#include "Tap.h"

namespace gltap {

namespace {

template <Fn function, typename R, typename... A>
constexpr FunctionInfo Describe(const char* name, const char* parameters, const char* result, R (*)(A...)) {
    static_assert(sizeof...(A) <= kMaxArguments, "a call record holds nine arguments");
    return {name, parameters, result, sizeof...(A), {KindOf<A>()...}};
}

}  // namespace

const FunctionInfo kFunctions[kFunctionCount] = {
#define GL(result, name, parameters, arguments) \
    Describe<Fn::name>(#name, #parameters, #result, Function<Fn::name>::Pointer()),
#include "GLFunctions.inc"
#undef GL
};

namespace {

// Functions of extensions are asked for by name.
void* FindExtension(const char* name) {
    static void* library = dlopen("libEGL.so.1", RTLD_NOW | RTLD_LOCAL);
    void* find = library ? dlsym(library, "eglGetProcAddress") : nullptr;
    return find ? reinterpret_cast<void* (*)(const char*)>(find)(name) : nullptr;
}

// Looks a function up in the driver's library. Without one every call goes to the null driver, and one line
// says so.
void* FindInDriver(Fn function) {
    static void* library = dlopen("libGLESv2.so.2", RTLD_NOW | RTLD_LOCAL);
    const char* name = kFunctions[Index(function)].name;
    void* found = library ? dlsym(library, name) : nullptr;
    if (!found && library) found = FindExtension(name);
    tap.driver[Index(function)] = found;
    if (found) return found;
    std::fprintf(stderr, "gltap: %s is not in libGLESv2.so.2 (%s); using the null driver\n", name,
                 library ? "no such symbol" : "library not found");
    tap.mode = GLTAP_NULL;
    return nullptr;
}

template <Fn function, typename... A>
inline typename Function<function>::Result Answer(A... arguments) {
    if constexpr (function == Fn::glGetError) {
        if (tap.pendingError != GL_NO_ERROR) return std::exchange(tap.pendingError, GL_NO_ERROR);
    }
    if (tap.mode == GLTAP_NULL) return Null(Tag<function>(), arguments...);
    void* driver = tap.driver[Index(function)];
    if (__builtin_expect(!driver, 0)) {
        driver = FindInDriver(function);
        if (!driver) return Null(Tag<function>(), arguments...);
    }
    return reinterpret_cast<typename Function<function>::Pointer>(driver)(arguments...);
}

template <typename T>
gltapValue ToValue(T value) {
    gltapValue out;
    out.i = 0;
    if constexpr (std::is_pointer_v<T>) {
        out.p = static_cast<const void*>(value);
    } else if constexpr (std::is_floating_point_v<T>) {
        out.f = static_cast<double>(value);
    } else {
        out.i = static_cast<int64_t>(value);
    }
    return out;
}

template <Fn function, typename... A>
inline typename Function<function>::Result Perform(A... arguments) {
    if constexpr (std::is_void_v<typename Function<function>::Result>) {
        Answer<function>(arguments...);
        if constexpr (function == Fn::glGetIntegerv) MakePoorer(arguments...);
        Track(Tag<function>(), arguments...);
    } else {
        auto result = Answer<function>(arguments...);
        if constexpr (function == Fn::glGetString) result = MakePoorer(arguments..., result);
        Track(Tag<function>(), arguments..., result);
        return result;
    }
}

template <Fn function, typename... A>
__attribute__((noinline)) typename Function<function>::Result Watched(A... arguments) {
    using Result = typename Function<function>::Result;
    if ((tap.watch & kInject) && TakeInjection(function)) return Result();
    // The extra element keeps the array from being empty.
    const gltapValue values[] = {ToValue(arguments)..., ToValue(0)};
    if (tap.watch & kReads) CheckRead(function, values);
    if constexpr (std::is_void_v<Result>) {
        Perform<function>(arguments...);
        Observe(function, values, ToValue(0));
    } else {
        const Result result = Perform<function>(arguments...);
        Observe(function, values, ToValue(result));
        return result;
    }
}

template <Fn function, typename... A>
inline typename Function<function>::Result Call(A... arguments) {
    ++tap.counts[Index(function)];
    if (__builtin_expect(tap.watch != 0, 0)) return Watched<function>(arguments...);
    return Perform<function>(arguments...);
}

}  // namespace
}  // namespace gltap

extern "C" {
#define GL(result, name, parameters, arguments)        \
    result name parameters {                           \
        return gltap::Call<gltap::Fn::name> arguments; \
    }
#include "GLFunctions.inc"
#undef GL
}
