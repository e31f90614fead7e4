// Calls, enums and counts as text, and the log of calls.

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <string_view>
#include <vector>

#include "Tap.h"

namespace gltap {
namespace {

struct NamedValue {
    uint32_t value;
    const char* name;
};

// One name for each value. 0 and 1 are left out: which of their many names is meant depends on the argument.
constexpr NamedValue kEnums[] = {
#define ENUM(name) {name, #name},
#include "GLEnums.inc"
#undef ENUM
};

constexpr NamedValue kPrimitives[] = {
    {GL_POINTS, "GL_POINTS"},
    {GL_LINES, "GL_LINES"},
    {GL_LINE_LOOP, "GL_LINE_LOOP"},
    {GL_LINE_STRIP, "GL_LINE_STRIP"},
    {GL_TRIANGLES, "GL_TRIANGLES"},
    {GL_TRIANGLE_STRIP, "GL_TRIANGLE_STRIP"},
    {GL_TRIANGLE_FAN, "GL_TRIANGLE_FAN"},
};

constexpr NamedValue kClearBits[] = {
    {GL_COLOR_BUFFER_BIT, "GL_COLOR_BUFFER_BIT"},
    {GL_DEPTH_BUFFER_BIT, "GL_DEPTH_BUFFER_BIT"},
    {GL_STENCIL_BUFFER_BIT, "GL_STENCIL_BUFFER_BIT"},
};

std::string Hex(uint32_t value) {
    char text[16];
    std::snprintf(text, sizeof(text), "0x%x", value);
    return text;
}

std::string Number(double value) {
    char text[32];
    std::snprintf(text, sizeof(text), "%.9g", value);
    return text;
}

template <size_t n>
const char* Find(const NamedValue (&names)[n], uint32_t value) {
    for (const NamedValue& named : names) {
        if (named.value == value) return named.name;
    }
    return nullptr;
}

std::string BitsText(uint32_t bits) {
    std::string text;
    for (const NamedValue& bit : kClearBits) {
        if (!(bits & bit.value)) continue;
        text += (text.empty() ? "" : " | ") + std::string(bit.name);
        bits &= ~bit.value;
    }
    if (bits != 0 || text.empty()) text += (text.empty() ? "" : " | ") + Hex(bits);
    return text;
}

std::string_view Parameter(const FunctionInfo& info, size_t index) {
    std::string_view list(info.parameters);
    list = list.substr(1, list.size() - 2);
    for (size_t i = 0; i < index; ++i) list.remove_prefix(list.find(',') + 1);
    list = list.substr(0, list.find(','));
    list.remove_prefix(std::min(list.find_first_not_of(' '), list.size()));
    return list;
}

bool Contains(std::string_view text, std::string_view part) {
    return text.find(part) != std::string_view::npos;
}

std::string Quoted(const char* bytes, size_t size) {
    constexpr size_t kLongest = 60;
    std::string text = "\"";
    const size_t length = strnlen(bytes, size);
    for (size_t i = 0; i < std::min(length, kLongest); ++i) {
        const char c = bytes[i];
        if (c == '\n') {
            text += "\\n";
        } else {
            if (c == '"' || c == '\\') text += '\\';
            text += c >= ' ' && c < 127 ? c : '?';
        }
    }
    return text + (length > kLongest ? "...\"" : "\"");
}

template <typename T>
std::string ListText(const gltapCall& call) {
    constexpr size_t kMost = 16;
    const size_t count = call.dataSize / sizeof(T);
    std::string text = "{";
    for (size_t i = 0; i < std::min(count, kMost); ++i) {
        T value;
        std::memcpy(&value, static_cast<const char*>(call.data) + i * sizeof(T), sizeof(T));
        text += (i ? ", " : "") + Number(static_cast<double>(value));
    }
    return text + (count > kMost ? ", ...}" : "}");
}

// A pointer by what is known of its target: the type in the parameter list, and the copied data.
std::string PointerText(const gltapCall& call, const gltapValue& value, std::string_view parameter) {
    if (!value.p) return "NULL";
    if (value.p == call.data && call.dataSize != 0) {
        if (Contains(parameter, "GLchar")) return Quoted(static_cast<const char*>(call.data), call.dataSize);
        if (Contains(parameter, "GLfloat")) return ListText<float>(call);
        if (Contains(parameter, "GLint")) return ListText<int32_t>(call);
        if (Contains(parameter, "GLuint")) return ListText<uint32_t>(call);
        return '<' + std::to_string(call.dataSize) + " bytes>";
    }
    char text[32];
    std::snprintf(text, sizeof(text), "%p", value.p);
    return text;
}

std::string EnumArgument(std::string_view function, std::string_view parameter, uint32_t value) {
    if (function.substr(0, 6) == "glDraw" && parameter == "GLenum mode") {
        if (const char* name = Find(kPrimitives, value)) return name;
    }
    if (function.substr(0, 11) == "glBlendFunc" && value <= 1) return value ? "GL_ONE" : "GL_ZERO";
    if (function.substr(0, 11) == "glStencilOp" && value == 0) return "GL_ZERO";
    if (function == "glGetError" && value == 0) return "GL_NO_ERROR";
    return EnumText(value);
}

std::string ArgumentText(const gltapCall& call, size_t index) {
    const FunctionInfo& info = kFunctions[call.function];
    const std::string_view parameter = Parameter(info, index);
    const gltapValue& value = call.argument[index];
    if (info.kinds[index] == Kind::kFloat) return Number(value.f);
    if (info.kinds[index] != Kind::kInteger) return PointerText(call, value, parameter);
    const auto bits = static_cast<uint32_t>(value.i);
    if (Contains(parameter, "GLenum")) return EnumArgument(info.name, parameter, bits);
    if (Contains(parameter, "GLbitfield")) return BitsText(bits);
    if (Contains(parameter, "GLboolean")) return value.i ? "GL_TRUE" : "GL_FALSE";
    if (Contains(parameter, "mask")) return Hex(bits);
    // Texture parameters and the internal format are enums in integer clothes.
    if (parameter == "GLint param" || parameter == "GLint internalformat") return EnumText(bits);
    return std::to_string(value.i);
}

std::string ResultText(const gltapCall& call) {
    const FunctionInfo& info = kFunctions[call.function];
    const std::string_view type(info.result);
    if (type == "void") return "";
    std::string text = " = ";
    if (type == "GLenum") return text + EnumArgument(info.name, "", static_cast<uint32_t>(call.result.i));
    if (type == "GLboolean") return text + (call.result.i ? "GL_TRUE" : "GL_FALSE");
    if (type != "const GLubyte*") return text + std::to_string(call.result.i);
    const auto* string = static_cast<const char*>(call.result.p);
    return text + (string ? Quoted(string, std::strlen(string)) : "NULL");
}

}  // namespace

std::string EnumText(uint32_t value) {
    if (const char* name = Find(kEnums, value)) return name;
    if (value - GL_TEXTURE0 < GLTAP_UNITS) return "GL_TEXTURE" + std::to_string(value - GL_TEXTURE0);
    return value < 16 ? std::to_string(value) : Hex(value);
}

std::string CallText(const gltapCall& call) {
    std::string text = kFunctions[call.function].name;
    text += '(';
    for (size_t i = 0; i < call.argumentCount; ++i) text += (i ? ", " : "") + ArgumentText(call, i);
    return text + ')' + ResultText(call);
}

std::string CountsText() {
    std::vector<size_t> called;
    for (size_t i = 0; i < kFunctionCount; ++i) {
        if (tap.counts[i] != 0) called.push_back(i);
    }
    std::stable_sort(called.begin(), called.end(),
                     [](size_t a, size_t b) { return tap.counts[a] > tap.counts[b]; });
    std::string text;
    for (const size_t i : called) {
        char count[32];
        std::snprintf(count, sizeof(count), "%10llu ", static_cast<unsigned long long>(tap.counts[i]));
        text += count + std::string(kFunctions[i].name) + '\n';
    }
    return text;
}

size_t CopyText(const std::string& from, char* text, size_t size) {
    if (size == 0) return from.size();
    const size_t length = std::min(from.size(), size - 1);
    std::memcpy(text, from.data(), length);
    text[length] = 0;
    return from.size();
}

}  // namespace gltap

size_t gltapDescribeCall(const gltapCall* call, char* text, size_t size) {
    return gltap::CopyText(gltap::CallText(*call), text, size);
}

size_t gltapDescribeCounts(char* text, size_t size) {
    return gltap::CopyText(gltap::CountsText(), text, size);
}
