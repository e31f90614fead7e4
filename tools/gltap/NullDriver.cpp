// Answers of a driver that draws nothing: names of objects, locations, texts that a program asks for.
#include "NullDriver.h"

#include <algorithm>
#include <cstring>
#include <unordered_map>
#include <vector>

namespace gltap {
namespace {

// Locations of one program. A name keeps the location of its first look-up, as in a linked program.
struct NullProgram {
    std::unordered_map<std::string, GLint> uniforms;
    std::unordered_map<std::string, GLint> attributes;
};

// Never destroyed: programs may still be used by other static destructors.
std::unordered_map<GLuint, NullProgram>& Programs() {
    static auto* programs = new std::unordered_map<GLuint, NullProgram>;
    return *programs;
}

struct Limit {
    GLenum name;
    int value;
};

// What a small current GPU offers. A limit that exceeds the minimum of the standard is a usual one.
constexpr Limit kLimits[] = {
    {GL_MAX_TEXTURE_SIZE, 4096},
    {GL_MAX_CUBE_MAP_TEXTURE_SIZE, 4096},
    {GL_MAX_RENDERBUFFER_SIZE, 4096},
    {GL_MAX_TEXTURE_IMAGE_UNITS, 8},
    {GL_MAX_VERTEX_TEXTURE_IMAGE_UNITS, 0},
    {GL_MAX_COMBINED_TEXTURE_IMAGE_UNITS, 8},
    {GL_MAX_VERTEX_ATTRIBS, 16},
    {GL_MAX_VARYING_VECTORS, 8},
    {GL_MAX_VERTEX_UNIFORM_VECTORS, 128},
    {GL_MAX_FRAGMENT_UNIFORM_VECTORS, 64},
    {GL_SUBPIXEL_BITS, 4},
    {GL_RED_BITS, 8},
    {GL_GREEN_BITS, 8},
    {GL_BLUE_BITS, 8},
    {GL_ALPHA_BITS, 8},
    {GL_DEPTH_BITS, 24},
    {GL_STENCIL_BITS, 8},
    {GL_SHADER_COMPILER, 1},
    {GL_NUM_COMPRESSED_TEXTURE_FORMATS, 0},
    {GL_NUM_SHADER_BINARY_FORMATS, 0},
    {GL_IMPLEMENTATION_COLOR_READ_FORMAT, GL_RGBA},
    {GL_IMPLEMENTATION_COLOR_READ_TYPE, GL_UNSIGNED_BYTE},
};

constexpr size_t kMaxAttributes = 16;

}  // namespace

void NullNames(gltapObject kind, GLsizei count, GLuint* names) {
    static GLuint last[GLTAP_OBJECT_KINDS];
    for (GLsizei i = 0; i < count; ++i) names[i] = ++last[kind];
}

void NullForgetPrograms() {
    Programs().clear();
}
void NullDeleteProgram(GLuint program) {
    Programs().erase(program);
}

void NullBindAttribute(GLuint program, GLuint index, const GLchar* name) {
    if (index < kMaxAttributes) Programs()[program].attributes[name] = static_cast<GLint>(index);
}

GLint NullAttributeLocation(GLuint program, const GLchar* name) {
    auto& attributes = Programs()[program].attributes;
    const auto found = attributes.find(name);
    if (found != attributes.end()) return found->second;
    bool used[kMaxAttributes] = {};
    for (const auto& attribute : attributes) used[attribute.second] = true;
    const auto free = std::find(std::begin(used), std::end(used), false);
    if (free == std::end(used)) return -1;
    return attributes[name] = static_cast<GLint>(free - used);
}

GLint NullUniformLocation(GLuint program, const GLchar* name) {
    auto& uniforms = Programs()[program].uniforms;
    const GLint next = static_cast<GLint>(uniforms.size());
    return uniforms.emplace(name, next).first->second;
}

const GLubyte* NullString(GLenum name) {
    const char* text = nullptr;
    switch (name) {
        case GL_VENDOR: text = "gltap"; break;
        case GL_RENDERER: text = "gltap null driver"; break;
        case GL_VERSION: text = "OpenGL ES 2.0 gltap"; break;
        case GL_SHADING_LANGUAGE_VERSION: text = "OpenGL ES GLSL ES 1.00 gltap"; break;
        case GL_EXTENSIONS:
            text = "GL_OES_rgb8_rgba8 GL_OES_depth24 GL_OES_packed_depth_stencil GL_OES_vertex_array_object";
            break;
        default: break;
    }
    return reinterpret_cast<const GLubyte*>(text);
}

size_t NullQuery(GLenum name, double values[4]) {
    if (const size_t count = QueryState(name, values)) return count;
    if (name == GL_MAX_VIEWPORT_DIMS) {
        values[0] = values[1] = 4096;
        return 2;
    }
    if (name == GL_ALIASED_POINT_SIZE_RANGE || name == GL_ALIASED_LINE_WIDTH_RANGE) {
        values[0] = 1;
        values[1] = 64;
        return 2;
    }
    for (const Limit& limit : kLimits) {
        if (limit.name != name) continue;
        values[0] = limit.value;
        return 1;
    }
    // Lists of formats are empty: their counts are 0.
    if (name == GL_COMPRESSED_TEXTURE_FORMATS || name == GL_SHADER_BINARY_FORMATS) return 0;
    values[0] = 0;
    return 1;
}

// Full precision in both stages: IEEE floats, 24-bit integers held in floats.
void NullPrecision(GLenum precision, GLint* range, GLint* bits) {
    const bool isFloat =
        precision == GL_LOW_FLOAT || precision == GL_MEDIUM_FLOAT || precision == GL_HIGH_FLOAT;
    range[0] = range[1] = isFloat ? 127 : 24;
    *bits = isFloat ? 23 : 0;
}

void NullReadPixels(GLsizei width, GLsizei height, GLenum format, GLenum type, void* pixels) {
    if (pixels) std::memset(pixels, 0, ImageBytes(width, height, format, type, tap.state.packAlignment));
}

}  // namespace gltap
