// Particle sets: points that the vertex shader moves, drawn in one call.
#include <cstddef>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "gl/Program.h"
#include "Qex/base.h"
#include "Qex/effects.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexParticle"

namespace {

const char* const kVertexSource = R"(
attribute float a_lifetime;
attribute vec3 a_startPosition;
attribute vec3 a_endPosition;
uniform float u_time;
uniform vec3 u_centerPosition;
uniform float fPSize;
uniform mat4 MVPMatrix;
varying mediump float v_lifetime;
void main() {
    if (u_time <= a_lifetime)
        gl_Position = MVPMatrix * vec4(a_startPosition + u_time * a_endPosition + u_centerPosition, 1.0);
    else
        gl_Position = vec4(-10000.0, -10000.0, 0.0, 0.0);
    v_lifetime = clamp(1.0 - u_time / a_lifetime, 0.0, 1.0);
    gl_PointSize = v_lifetime * v_lifetime * fPSize;
}
)";

const char* const kFragmentSource = R"(
precision mediump float;
uniform vec4 u_StartColor;
uniform vec4 u_EndColor;
uniform sampler2D s_texture;
uniform sampler2D alphaTexture;
varying float v_lifetime;
void main() {
    float alpha = texture2D(alphaTexture, gl_PointCoord).r;
    if (alpha <= 0.004) discard;
    vec4 color = u_EndColor * (1.0 - v_lifetime) + u_StartColor * v_lifetime;
    gl_FragColor = color * texture2D(s_texture, gl_PointCoord);
    gl_FragColor.a *= v_lifetime * alpha;
}
)";

// The program that all sets share, from the first to the last of them.
struct {
    uint32_t users;
    GLuint vertexShader, fragmentShader, program;
    GLint lifetime, startPosition, endPosition;  // attributes
    GLint time, centerPosition, pointSize, startColor, endColor, texture, alphaTexture, mvpMatrix;
} s_Program;

const QexProgramLocation kAttributes[] = {{&s_Program.lifetime, "a_lifetime"},
                                          {&s_Program.startPosition, "a_startPosition"},
                                          {&s_Program.endPosition, "a_endPosition"}},
                         kUniforms[] = {{&s_Program.time, "u_time"},
                                        {&s_Program.centerPosition, "u_centerPosition"},
                                        {&s_Program.pointSize, "fPSize"},
                                        {&s_Program.startColor, "u_StartColor"},
                                        {&s_Program.endColor, "u_EndColor"},
                                        {&s_Program.texture, "s_texture"},
                                        {&s_Program.alphaTexture, "alphaTexture"},
                                        {&s_Program.mvpMatrix, "MVPMatrix"}};

const QexProgramNames kProgramNames = {&s_Program.program, &s_Program.vertexShader,
                                       &s_Program.fragmentShader};

bool CreateProgram() {
    if (!QexProgram_Build({"QexParticleSet_Create", kVertexSource, kFragmentSource, nullptr, 0},
                          kProgramNames)) {
        QexError(QEX_TAG, "<QexParticleSet_Create> the particle sets' program cannot be built");
        return false;
    }
    const QexProgramLookup lookup = {QEX_MODULE, s_Program.program, false};
    lookup.Attributes(kAttributes);
    lookup.Uniforms(kUniforms);
    return true;
}

float s_PointSize;  // that the program was given last

void Forget() {
    s_Program.program = s_Program.vertexShader = s_Program.fragmentShader = 0;
}
bool Restore() {
    if (!s_Program.users) return true;
    if (!CreateProgram()) return false;
    QexRenderState_UseProgram(s_Program.program);
    QEX_GL(glUniform1f(s_Program.pointSize, s_PointSize));
    return true;
}
QexContextPart s_Part = {kRankPrograms, Forget, nullptr, Restore, nullptr, false};

void ReleaseProgram() {
    if (--s_Program.users == 0) QexProgram_Delete(kProgramNames);
}

bool IsRunning(const QexParticleSet* set) {
    return set && set->active && set->buffer && s_Program.program;
}

void SetUniforms(const QexParticleSet& set) {
    QEX_GL(glUniformMatrix4fv(s_Program.mvpMatrix, 1, GL_FALSE, set.mvpMatrix.m));
    QEX_GL(glUniform3fv(s_Program.centerPosition, 1, &set.centerPosition.x));
    QEX_GL(glUniform1f(s_Program.time, set.time));
    QEX_GL(glUniform1i(s_Program.texture, kDiffuseUnit));
    QEX_GL(glUniform1i(s_Program.alphaTexture, kAlphaUnit));
    QEX_GL(glUniform4fv(s_Program.startColor, 1, &set.startColor.x));
    QEX_GL(glUniform4fv(s_Program.endColor, 1, &set.endColor.x));
}

void PointAttribute(GLint location, GLint size, const void* data) {
    QEX_GL(glVertexAttribPointer(static_cast<GLuint>(location), size, GL_FLOAT, GL_FALSE,
                                 sizeof(QexParticleSetEntry), data));
}

void DrawDescribed(const QexParticleSet& set) {
    PointAttribute(s_Program.lifetime, 1, &set.buffer->lifetime);
    PointAttribute(s_Program.endPosition, 3, &set.buffer->velocity);
    PointAttribute(s_Program.startPosition, 3, &set.buffer->startPosition);
    for (const auto& attribute : kAttributes)
        QEX_GL(glEnableVertexAttribArray(static_cast<GLuint>(*attribute.location)));
    QEX_GL(glDrawArrays(GL_POINTS, 0, static_cast<GLsizei>(set.count)));
    for (const auto& attribute : kAttributes)
        QEX_GL(glDisableVertexAttribArray(static_cast<GLuint>(*attribute.location)));
}

void DrawLean(const QexParticleSet& set) {
    const GLuint buffer = QexLeanState_StreamBuffer();
    const QexFloatAttribute attributes[] = {
        {s_Program.lifetime, 1, offsetof(QexParticleSetEntry, lifetime)},
        {s_Program.endPosition, 3, offsetof(QexParticleSetEntry, velocity)},
        {s_Program.startPosition, 3, offsetof(QexParticleSetEntry, startPosition)}};
    QexLeanState_Fill(buffer, set.buffer, size_t{set.count} * sizeof *set.buffer, GL_STREAM_DRAW);
    QexLeanState_BindFloats({buffer, 0, sizeof *set.buffer, attributes, 3});
    glDrawArrays(GL_POINTS, 0, static_cast<GLsizei>(set.count));
}

}  // namespace

extern "C" {

int32_t QexParticleSet_Create(QexParticleSet* set, QexTexture* texture, QexTexture* alphaTexture,
                              uint32_t count, float pointSize, float duration) {
    if (!set) return -1;
    const QexMaking making;
    *set = {};
    if (!s_Program.users && !CreateProgram()) return -1;
    ++s_Program.users;
    set->buffer = QexMemory_AllocZeroed<QexParticleSetEntry>(count);
    if (!set->buffer) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        ReleaseProgram();
        return -1;
    }
    set->texture = texture;
    set->alphaTexture = alphaTexture;
    set->count = count;
    set->pointSize = pointSize;
    set->duration = duration;
    set->startColor = set->endColor = {1, 1, 1, 1};
    QexRenderState_UseProgram(s_Program.program);
    QEX_GL(glUniform1f(s_Program.pointSize, pointSize));
    s_PointSize = pointSize;
    QexContext_Register(&s_Part);
    if (!making.Failed()) return 0;
    QexParticleSet_Release(set);
    return -1;
}

int32_t QexParticleSet_GetBuffer(QexParticleSet* set, QexParticleSetEntry** buffer, uint32_t* count) {
    if (!set || !set->buffer) return -1;
    if (buffer) *buffer = set->buffer;
    if (count) *count = set->count;
    return 0;
}

void QexParticleSet_Trigger(QexParticleSet* set) {
    if (!set || !set->buffer) return;
    set->time = 0;
    set->active = 1;
}

void QexParticleSet_Update(QexParticleSet* set, float elapsed, const QexCamera* camera,
                           const QexMatrix* model) {
    if (!IsRunning(set)) return;
    QexRenderState_UseProgram(s_Program.program);
    set->time += elapsed;
    if (set->time >= set->duration) {
        set->active = 0;
        if (set->onFinished) set->onFinished(set, 1, 0);
        return;
    }
    QexMatrix modelView = camera->viewMatrix;
    if (model) QexMatrix_Multiply(&modelView, &modelView, model);
    QexMatrix_Multiply(&set->mvpMatrix, &camera->projectionMatrix, &modelView);
}

void QexParticleSet_Draw(QexParticleSet* set) {
    if (!IsRunning(set)) return;
    QexRenderState_UseProgram(s_Program.program);
    SetUniforms(*set);
    QexTexture_Set(set->texture, kDiffuseUnit);
    QexTexture_Set(set->alphaTexture, kAlphaUnit);
    QexRenderer_SetZWrite(0);
    (QexLeanState_IsLean() ? DrawLean : DrawDescribed)(*set);
    QexRenderer_SetZWrite(1);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
}

void QexParticleSet_Release(QexParticleSet* set) {
    if (!set || !set->buffer) return;
    QexMemory_FreeArray(set->buffer);
    set->active = 0;
    ReleaseProgram();
}

}  // extern "C"

static_assert(sizeof(QexParticleSetEntry) == 28, "7 floats");
#if UINTPTR_MAX == UINT32_MAX
static_assert(sizeof(QexParticleSet) == 144, "36 words");
#endif
