// Compiling, linking, looking up and deleting programs, with the reason when one is not to be had.
#include "gl/Program.h"

#include "base/Memory.h"
#include "gl/GL.h"
#include "Qex/base.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexShader"

namespace {

// A line with the GL's own words, and the same for the error handler. No checks: the failure itself is what
// is told.
void LogWords(const char* name, const char* what, uint32_t code, GLint length, uint32_t object,
              void (*read)(GLuint, GLsizei, GLsizei*, GLchar*)) {
    QexScratch<char> text(static_cast<uint64_t>(length > 0 ? length : 0) + 1);
    if (text) {
        text[0] = 0;
        if (length > 0) read(object, length, nullptr, text.Get());
        QexError(QEX_TAG, "<%s> %s: %s", name, what, text.Get());
    }
    QexDiagnostics_Refused(code, QEX_MODULE, __FILE__, __LINE__, text ? text.Get() : what);
}

void LogShader(const char* name, const char* what, uint32_t shader) {
    GLint compiled = GL_TRUE, length = 0;
    if (!shader) return;
    glGetShaderiv(shader, GL_COMPILE_STATUS, &compiled);
    if (compiled) return;
    glGetShaderiv(shader, GL_INFO_LOG_LENGTH, &length);
    LogWords(name, what, QEX_ERROR_SHADER, length, shader, glGetShaderInfoLog);
}

// A stage of a program, with the prefixes in front of its source; without a first there is none.
bool CompileStage(uint32_t* shader, const char* prefix, const char* second, const char* source,
                  GLenum stage) {
    if (!prefix) return QexShader_Create(shader, source, stage) == 0;
    const char* const pieces[] = {prefix, second ? second : "", source};
    GLint status = 0;
    *shader = glCreateShader(stage);
    QEX_GL(glShaderSource(*shader, 3, pieces, nullptr));
    QEX_GL(glCompileShader(*shader));
    QEX_GL(glGetShaderiv(*shader, GL_COMPILE_STATUS, &status));
    return status == GL_TRUE;
}

}  // namespace

void QexProgram_LogFailure(const char* name, uint32_t vertexShader, uint32_t fragmentShader,
                           uint32_t program) {
    GLint linked = GL_TRUE, length = 0;
    LogShader(name, "the vertex shader does not compile", vertexShader);
    LogShader(name, "the fragment shader does not compile", fragmentShader);
    if (!program) return;
    glGetProgramiv(program, GL_LINK_STATUS, &linked);
    if (linked) return;
    glGetProgramiv(program, GL_INFO_LOG_LENGTH, &length);
    LogWords(name, "the program does not link", QEX_ERROR_PROGRAM, length, program, glGetProgramInfoLog);
}

bool QexProgram_Compile(const QexProgramSource& source, const QexProgramNames& names) {
    const QexMaking making;
    const bool vertex =
        CompileStage(names.vertexShader, source.prefix, source.vertexPrefix, source.vertex, GL_VERTEX_SHADER);
    const bool fragment =
        CompileStage(names.fragmentShader, source.prefix, nullptr, source.fragment, GL_FRAGMENT_SHADER);
    const bool linked =
        !making.Failed() && QexShader_CreateProgram(names.program, *names.vertexShader, *names.fragmentShader,
                                                    source.attributes, source.attributeCount, nullptr) == 0;
    if (linked && vertex && fragment && !making.Failed()) return true;
    QexProgram_LogFailure(source.name, *names.vertexShader, *names.fragmentShader, *names.program);
    if (making.Failed()) QexProgram_Delete(names, false);
    return false;
}

bool QexProgram_Build(const QexProgramSource& source, const QexProgramNames& names) {
    if (QexProgram_Compile(source, names)) return true;
    QexProgram_Delete(names);
    return false;
}

void QexProgram_Delete(const QexProgramNames& names, bool checked) {
    QexRenderState_UseProgram(0);
    if (*names.program) QEX_GL_IF(checked, glDeleteProgram(*names.program));
    if (*names.vertexShader) QEX_GL_IF(checked, glDeleteShader(*names.vertexShader));
    if (*names.fragmentShader) QEX_GL_IF(checked, glDeleteShader(*names.fragmentShader));
    *names.program = *names.vertexShader = *names.fragmentShader = 0;
}

#undef QEX_MODULE
#define QEX_MODULE module

int32_t QexProgramLookup::Uniform(const char* name) const {
    int32_t location;
    QEX_GL_IF(checked, location = glGetUniformLocation(program, name));
    return location;
}

int32_t QexProgramLookup::Attribute(const char* name) const {
    int32_t location;
    QEX_GL_IF(checked, location = glGetAttribLocation(program, name));
    return location;
}

void QexProgramLookup::SetSampler(const QexProgramSampler& sampler) const {
    QEX_GL(glUniform1i(Uniform(sampler.name), sampler.unit));
}
