// Shader and program objects as applications make them.
#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"
#include "Qex/base.h"
#include "Qex/renderer.h"
#include "Qex/resources.h"

#define QEX_MODULE "src/QexShader"

namespace {

constexpr size_t kDefineBufferSize = 4096;

// Define lines and source of the last shader that was compiled with defines.
char QexDefineBuffer[kDefineBufferSize];

// Appends text to the define buffer; false when it does not fit.
bool Append(size_t* used, const char* text) {
    const size_t length = strlen(text);
    if (length >= kDefineBufferSize - *used) return false;
    memcpy(QexDefineBuffer + *used, text, length + 1);
    *used += length;
    return true;
}

bool Assemble(const char* source, const char* const* defines, uint32_t defineCount) {
    size_t used = 0;
    QexDefineBuffer[0] = 0;
    for (uint32_t i = 0; i < defineCount; ++i)
        if (!Append(&used, "#define ") || !Append(&used, defines[i]) || !Append(&used, "\n")) return false;
    return Append(&used, source);
}

// The log of a failed link, cut to fit the caller's buffer.
void ReadLinkLog(uint32_t program, char* log) {
    GLint length = 0;
    QEX_GL(glGetProgramiv(program, GL_INFO_LOG_LENGTH, &length));
    QexScratch<char> text(static_cast<uint64_t>(length > 0 ? length : 0) + 1);
    if (!text) return;
    text[0] = 0;
    QEX_GL(glGetProgramInfoLog(program, length, nullptr, text.Get()));
    text[static_cast<uint64_t>(length > 0 ? length : 0)] = 0;
    if (!log) return;
    strncpy(log, text.Get(), QEX_SHADER_LOG_SIZE - 1);
    log[QEX_SHADER_LOG_SIZE - 1] = 0;
}

// What the handler of an error leaves of a shader or a program.
int32_t Drop(uint32_t* name, void (*deleteObject)(GLuint)) {
    if (*name) deleteObject(*name);
    *name = 0;
    return -1;
}

}  // namespace

extern "C" {

int32_t QexShader_Create(uint32_t* shader, const char* source, uint32_t type) {
    GLint status = 0, length = 0;
    const QexMaking making;
    *shader = glCreateShader(type);
    QEX_GL(glShaderSource(*shader, 1, &source, nullptr));
    QEX_GL(glCompileShader(*shader));
    QEX_GL(glGetShaderiv(*shader, GL_COMPILE_STATUS, &status));
    if (making.Failed()) return Drop(shader, glDeleteShader);
    if (status == 1) return 0;
    // The log is fetched, so that it can be seen in a debugger or a GL trace, but not printed.
    QEX_GL(glGetShaderiv(*shader, GL_INFO_LOG_LENGTH, &length));
    QexScratch<char> log(static_cast<uint64_t>(length > 0 ? length : 0) + 1);
    if (log) QEX_GL(glGetShaderInfoLog(*shader, length, nullptr, log.Get()));
    return -1;
}

int32_t QexShader_CreateFromMemEx(uint32_t* shader, const char* source, uint32_t type,
                                  const char* const* defines, uint32_t defineCount) {
    if (Assemble(source, defines, defineCount)) return QexShader_Create(shader, QexDefineBuffer, type);
    *shader = 0;
    QexError(QEX_TAG, "<QexShader_CreateFromMemEx> defines and source exceed %zu bytes", kDefineBufferSize);
    return -1;
}

int32_t QexShader_CreateFromFileEx(uint32_t* shader, const char* path, uint32_t type,
                                   const char* const* defines, uint32_t defineCount) {
    QexResFile file;
    QexResFile_Create(&file, path);
    if (!QexResFile_IsOpen(&file)) {
        QexResFile_Release(&file);
        *shader = 0;
        QexSystem_Printf("ERROR:<QexShader_CreateFromFileEx> Read file %s failed!\n", path ? path : "");
        return -1;
    }
    const int32_t result =
        QexShader_CreateFromMemEx(shader, QexResFile_StringPtr(&file), type, defines, defineCount);
    QexResFile_Close(&file);
    return result;
}

int32_t QexShader_CreateWithBinary(uint32_t* shader, const void* binary, int32_t length, uint32_t format,
                                   uint32_t type) {
    const QexMaking making;
    *shader = glCreateShader(type);
    QEX_GL(glShaderBinary(1, shader, format, binary, length));
    return making.Failed() ? Drop(shader, glDeleteShader) : 0;
}

int32_t QexShader_CreateProgram(uint32_t* program, uint32_t vertexShader, uint32_t fragmentShader,
                                const char* const* attributes, int32_t attributeCount, char* log) {
    GLint status = 0;
    const QexMaking making;
    *program = glCreateProgram();
    if (log) log[0] = 0;
    QEX_GL(glAttachShader(*program, fragmentShader));
    QEX_GL(glAttachShader(*program, vertexShader));
    if (making.Failed()) return Drop(program, glDeleteProgram);
    for (int32_t i = 0; i < attributeCount; ++i)
        QEX_GL(glBindAttribLocation(*program, static_cast<GLuint>(i), attributes[i]));
    QEX_GL(glLinkProgram(*program));
    QEX_GL(glGetProgramiv(*program, GL_LINK_STATUS, &status));
    if (making.Failed()) return Drop(program, glDeleteProgram);
    if (status == GL_TRUE) {
        QexRenderState_UseProgram(*program);
        return 0;
    }
    ReadLinkLog(*program, log);
    return -1;
}

}  // extern "C"
