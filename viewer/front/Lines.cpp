// One program, lines from a buffer that is filled for each drawing.
#include "front/Lines.h"

#include <cmath>
#include <cstddef>
#include <cstdlib>

#include <GLES2/gl2.h>

namespace {

const char kVertex[] =
    "attribute vec3 place; attribute vec4 colour; uniform mat4 matrix; varying lowp vec4 seen;"
    "void main() { gl_Position = matrix * vec4(place, 1.0); seen = colour; }";
const char kFragment[] = "varying lowp vec4 seen; void main() { gl_FragColor = seen; }";

}  // namespace

Lines::~Lines() {
    if (!program_) return;
    QexRenderState_Restore();
    glDeleteProgram(program_);
    glDeleteBuffers(1, &buffer_);
    for (const uint32_t shader : shaders_) glDeleteShader(shader);
    QexRenderState_Reset(nullptr);
}

bool Lines::Prepare() {
    if (program_) return true;
    const char* const names[] = {"place", "colour"};
    QexShader_Create(&shaders_[0], kVertex, GL_VERTEX_SHADER);
    QexShader_Create(&shaders_[1], kFragment, GL_FRAGMENT_SHADER);
    if (QexShader_CreateProgram(&program_, shaders_[0], shaders_[1], names, 2, nullptr) != 0) return false;
    matrix_ = glGetUniformLocation(program_, "matrix");
    glGenBuffers(1, &buffer_);
    return true;
}

void Lines::Add(const QexVec3& from, const QexVec3& to, uint32_t colour) {
    Point point = {from,
                   {static_cast<uint8_t>(colour >> 16), static_cast<uint8_t>(colour >> 8),
                    static_cast<uint8_t>(colour), 255}};
    points_.push_back(point);
    point.place = to;
    points_.push_back(point);
}

void Lines::AddBox(const QexVec3 corners[8], uint32_t colour) {
    // Corners whose numbers differ in one bit are the ends of an edge.
    for (int corner = 0; corner < 8; ++corner)
        for (int bit = 1; bit < 8; bit *= 2)
            if (!(corner & bit)) Add(corners[corner], corners[corner | bit], colour);
}

void Lines::AddMark(const QexVec3& middle, float radius, uint32_t colour) {
    // Each axis' two corners are joined with the next axis'.
    for (int axis = 0; axis < 3; ++axis)
        for (int signs = 0; signs < 4; ++signs) {
            float from[3] = {middle.x, middle.y, middle.z}, to[3] = {middle.x, middle.y, middle.z};
            from[axis] += signs & 1 ? radius : -radius;
            to[(axis + 1) % 3] += signs & 2 ? radius : -radius;
            Add({from[0], from[1], from[2]}, {to[0], to[1], to[2]}, colour);
        }
}

void Lines::AddGrid(float size, int squares, const QexVec3& up) {
    const bool x = up.x != 0, z = up.z != 0;
    const QexVec3 first = x ? QexVec3{0, 1, 0} : QexVec3{1, 0, 0},
                  second = z ? QexVec3{0, 1, 0} : QexVec3{0, 0, 1};
    const float step = size / static_cast<float>(squares), half = size / 2;
    for (int i = 0; i <= squares; ++i) {
        const float at = step * static_cast<float>(i) - half;
        const bool middle = i * 2 == squares;
        const auto place = [&](float a, float b) {
            return QexVec3{first.x * a + second.x * b, first.y * a + second.y * b,
                           first.z * a + second.z * b};
        };
        Add(place(-half, at), place(half, at), middle ? 0xB05050 : 0x606878);
        Add(place(at, -half), place(at, half), middle ? 0x5070B0 : 0x606878);
    }
}

void Lines::Draw(const QexCamera& camera, bool hidden) {
    if (points_.empty() || !Prepare()) return;
    QexMatrix matrix;
    QexMatrix_Multiply(&matrix, &camera.projectionMatrix, &camera.viewMatrix);
    QexRenderer_SetZWrite(hidden);
    QexRenderer_SetZTestFunc(hidden ? QEX_DEPTH_LESS_EQUAL : QEX_DEPTH_ALWAYS);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_NONE);
    QexRenderState_Restore();
    glBindBuffer(GL_ARRAY_BUFFER, buffer_);
    glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(points_.size() * sizeof(Point)), points_.data(),
                 GL_STREAM_DRAW);
    glUseProgram(program_);
    glUniformMatrix4fv(matrix_, 1, GL_FALSE, matrix.m);
    glVertexAttribPointer(0, 3, GL_FLOAT, GL_FALSE, sizeof(Point), nullptr);
    glVertexAttribPointer(1, 4, GL_UNSIGNED_BYTE, GL_TRUE, sizeof(Point),
                          reinterpret_cast<const void*>(offsetof(Point, colour)));
    glEnableVertexAttribArray(0);
    glEnableVertexAttribArray(1);
    glDrawArrays(GL_LINES, 0, static_cast<GLsizei>(points_.size()));
    glDisableVertexAttribArray(0);
    glDisableVertexAttribArray(1);
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    QexRenderState_Reset(nullptr);
    QexRenderer_SetZWrite(1);
}
