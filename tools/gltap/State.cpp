// The followed state as a table of fields: it answers the null driver's queries and tells two states apart.

#include <cstdio>
#include <cstring>
#include <map>

#include "Tap.h"

namespace gltap {
namespace {

enum class Show : uint8_t { kNumber, kSigned, kEnum, kBits, kFloat };

struct StateField {
    const char* name;
    GLenum query;  // for glGetIntegerv and its kin, 0 where the field is no query by itself
    uint16_t offset;
    uint8_t count;
    Show show;
};

#define FIELD(member, query, show)                                                            \
    {                                                                                         \
#member, query, static_cast < uint16_t>(offsetof(gltapState, member)),                \
            static_cast < uint8_t>(sizeof(gltapState::member) / sizeof(uint32_t)), Show::show \
    }

// Every member is made of 32-bit words. RGB and alpha, or front and back, are queried by two names: the
// first is here, the second in kSecondQueries.
constexpr StateField kFields[] = {
    FIELD(program, GL_CURRENT_PROGRAM, kNumber),
    FIELD(activeUnit, 0, kNumber),
    FIELD(texture2D, 0, kNumber),
    FIELD(textureCube, 0, kNumber),
    FIELD(vertexArray, GL_VERTEX_ARRAY_BINDING_OES, kNumber),
    FIELD(arrayBuffer, GL_ARRAY_BUFFER_BINDING, kNumber),
    FIELD(elementBuffer, GL_ELEMENT_ARRAY_BUFFER_BINDING, kNumber),
    FIELD(framebuffer, GL_FRAMEBUFFER_BINDING, kNumber),
    FIELD(renderbuffer, GL_RENDERBUFFER_BINDING, kNumber),
    FIELD(attributeArrays, 0, kBits),
    FIELD(blend, GL_BLEND, kNumber),
    FIELD(cullFace, GL_CULL_FACE, kNumber),
    FIELD(depthTest, GL_DEPTH_TEST, kNumber),
    FIELD(dither, GL_DITHER, kNumber),
    FIELD(polygonOffsetFill, GL_POLYGON_OFFSET_FILL, kNumber),
    FIELD(sampleAlphaToCoverage, GL_SAMPLE_ALPHA_TO_COVERAGE, kNumber),
    FIELD(sampleCoverage, GL_SAMPLE_COVERAGE, kNumber),
    FIELD(scissorTest, GL_SCISSOR_TEST, kNumber),
    FIELD(stencilTest, GL_STENCIL_TEST, kNumber),
    FIELD(blendSource, GL_BLEND_SRC_RGB, kEnum),
    FIELD(blendDestination, GL_BLEND_DST_RGB, kEnum),
    FIELD(blendEquation, GL_BLEND_EQUATION_RGB, kEnum),
    FIELD(blendColor, GL_BLEND_COLOR, kFloat),
    FIELD(colorMask, GL_COLOR_WRITEMASK, kNumber),
    FIELD(cullFaceMode, GL_CULL_FACE_MODE, kEnum),
    FIELD(frontFace, GL_FRONT_FACE, kEnum),
    FIELD(depthMask, GL_DEPTH_WRITEMASK, kNumber),
    FIELD(depthFunc, GL_DEPTH_FUNC, kEnum),
    FIELD(depthRange, GL_DEPTH_RANGE, kFloat),
    FIELD(polygonOffset, GL_POLYGON_OFFSET_FACTOR, kFloat),
    FIELD(lineWidth, GL_LINE_WIDTH, kFloat),
    FIELD(stencilFunc, GL_STENCIL_FUNC, kEnum),
    FIELD(stencilValueMask, GL_STENCIL_VALUE_MASK, kBits),
    FIELD(stencilWriteMask, GL_STENCIL_WRITEMASK, kBits),
    FIELD(stencilReference, GL_STENCIL_REF, kSigned),
    FIELD(stencilFail, GL_STENCIL_FAIL, kEnum),
    FIELD(stencilDepthFail, GL_STENCIL_PASS_DEPTH_FAIL, kEnum),
    FIELD(stencilPass, GL_STENCIL_PASS_DEPTH_PASS, kEnum),
    FIELD(viewport, GL_VIEWPORT, kSigned),
    FIELD(scissor, GL_SCISSOR_BOX, kSigned),
    FIELD(clearColor, GL_COLOR_CLEAR_VALUE, kFloat),
    FIELD(clearDepth, GL_DEPTH_CLEAR_VALUE, kFloat),
    FIELD(clearStencil, GL_STENCIL_CLEAR_VALUE, kSigned),
    FIELD(packAlignment, GL_PACK_ALIGNMENT, kNumber),
    FIELD(unpackAlignment, GL_UNPACK_ALIGNMENT, kNumber),
};
#undef FIELD

constexpr GLenum kSecondQueries[][2] = {
    {GL_BLEND_SRC_ALPHA, GL_BLEND_SRC_RGB},
    {GL_BLEND_DST_ALPHA, GL_BLEND_DST_RGB},
    {GL_BLEND_EQUATION_ALPHA, GL_BLEND_EQUATION_RGB},
    {GL_POLYGON_OFFSET_UNITS, GL_POLYGON_OFFSET_FACTOR},
    {GL_STENCIL_BACK_FUNC, GL_STENCIL_FUNC},
    {GL_STENCIL_BACK_VALUE_MASK, GL_STENCIL_VALUE_MASK},
    {GL_STENCIL_BACK_WRITEMASK, GL_STENCIL_WRITEMASK},
    {GL_STENCIL_BACK_REF, GL_STENCIL_REF},
    {GL_STENCIL_BACK_FAIL, GL_STENCIL_FAIL},
    {GL_STENCIL_BACK_PASS_DEPTH_FAIL, GL_STENCIL_PASS_DEPTH_FAIL},
    {GL_STENCIL_BACK_PASS_DEPTH_PASS, GL_STENCIL_PASS_DEPTH_PASS},
};

constexpr gltapState InitialState() {
    gltapState s = {};
    s.dither = 1;
    for (int i = 0; i < 2; ++i) {
        s.blendSource[i] = GL_ONE;
        s.blendDestination[i] = GL_ZERO;
        s.blendEquation[i] = GL_FUNC_ADD;
        s.stencilFunc[i] = GL_ALWAYS;
        s.stencilValueMask[i] = s.stencilWriteMask[i] = ~0u;
        s.stencilFail[i] = s.stencilDepthFail[i] = s.stencilPass[i] = GL_KEEP;
    }
    for (int i = 0; i < 4; ++i) s.colorMask[i] = 1;
    s.cullFaceMode = GL_BACK;
    s.frontFace = GL_CCW;
    s.depthMask = 1;
    s.depthFunc = GL_LESS;
    s.depthRange[1] = 1;
    s.lineWidth = 1;
    s.clearDepth = 1;
    s.packAlignment = s.unpackAlignment = 4;
    return s;
}

const void* WordAt(const gltapState& state, const StateField& field, size_t index) {
    return reinterpret_cast<const char*>(&state) + field.offset + index * sizeof(uint32_t);
}

template <typename T>
T Read(const void* word) {
    static_assert(sizeof(T) == sizeof(uint32_t), "fields are made of words");
    T value;
    std::memcpy(&value, word, sizeof(value));
    return value;
}

double NumberAt(const gltapState& state, const StateField& field, size_t index) {
    const void* word = WordAt(state, field, index);
    if (field.show == Show::kFloat) return static_cast<double>(Read<float>(word));
    // Masks are read back as signed integers: all bits set is -1.
    if (field.show == Show::kSigned || field.show == Show::kBits)
        return static_cast<double>(Read<int32_t>(word));
    return static_cast<double>(Read<uint32_t>(word));
}

std::string TextAt(const gltapState& state, const StateField& field, size_t index) {
    const void* word = WordAt(state, field, index);
    char text[32];
    switch (field.show) {
        case Show::kEnum: return EnumText(Read<uint32_t>(word));
        case Show::kBits: std::snprintf(text, sizeof(text), "0x%x", Read<uint32_t>(word)); break;
        default: std::snprintf(text, sizeof(text), "%.9g", NumberAt(state, field, index)); break;
    }
    return text;
}

std::string DiffText(const gltapState& before, const gltapState& after) {
    std::string text;
    for (const StateField& field : kFields) {
        for (size_t i = 0; i < field.count; ++i) {
            const size_t bytes = sizeof(uint32_t);
            if (std::memcmp(WordAt(before, field, i), WordAt(after, field, i), bytes) == 0) continue;
            text += field.name;
            if (field.count > 1) text += '[' + std::to_string(i) + ']';
            text += ": " + TextAt(before, field, i) + " -> " + TextAt(after, field, i) + '\n';
        }
    }
    return text;
}

// What vertex array objects hold while they are not bound. Never destroyed, as live objects are not.
struct VertexArray {
    uint32_t elementBuffer, attributeArrays;
};
std::map<GLuint, VertexArray>& VertexArrays() {
    static auto* arrays = new std::map<GLuint, VertexArray>;
    return *arrays;
}

}  // namespace

void BindVertexArray(GLuint name) {
    gltapState& s = tap.state;
    VertexArrays()[s.vertexArray] = {s.elementBuffer, s.attributeArrays};
    const VertexArray& bound = VertexArrays()[name];
    s.vertexArray = name;
    s.elementBuffer = bound.elementBuffer;
    s.attributeArrays = bound.attributeArrays;
}

void DeleteVertexArrays(GLsizei count, const GLuint* names) {
    for (GLsizei i = 0; i < count; ++i) {
        if (names[i] && names[i] == tap.state.vertexArray) BindVertexArray(0);
        if (names[i]) VertexArrays().erase(names[i]);
    }
}

Tap tap = {GLTAP_FORWARD, 0, GL_NO_ERROR, {}, {}, InitialState()};

void ResetState() {
    tap.state = InitialState();
    VertexArrays().clear();
}

size_t QueryState(GLenum name, double values[4]) {
    const gltapState& s = tap.state;
    switch (name) {
        case 0: return 0;
        case GL_ACTIVE_TEXTURE: values[0] = GL_TEXTURE0 + s.activeUnit; return 1;
        case GL_TEXTURE_BINDING_2D: values[0] = s.texture2D[s.activeUnit]; return 1;
        case GL_TEXTURE_BINDING_CUBE_MAP: values[0] = s.textureCube[s.activeUnit]; return 1;
        default: break;
    }
    size_t first = 0;
    for (const GLenum(&second)[2] : kSecondQueries) {
        if (second[0] != name) continue;
        name = second[1];
        first = 1;
    }
    for (const StateField& field : kFields) {
        if (field.query != name) continue;
        // Four values, or a pair that has one name; other pairs give the value asked for.
        const size_t count = field.count == 4 || name == GL_DEPTH_RANGE ? field.count : 1;
        for (size_t i = 0; i < count; ++i) values[i] = NumberAt(s, field, first + i);
        return count;
    }
    return 0;
}

}  // namespace gltap

void gltapGetState(gltapState* state) {
    *state = gltap::tap.state;
}

size_t gltapDiffState(const gltapState* before, const gltapState* after, char* text, size_t size) {
    return gltap::CopyText(gltap::DiffText(*before, *after), text, size);
}
