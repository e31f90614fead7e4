#include "texture/Upload.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"

#define QEX_MODULE "src/QexLoadPODModel"

uint32_t QexTextureLoad_ChainLength(uint32_t width, uint32_t height) {
    uint32_t levels = 1;
    for (uint32_t size = width > height ? width : height; size > 1; size /= 2) ++levels;
    return levels;
}

uint64_t QexTextureLoad_ETCSize(uint32_t width, uint32_t height) {
    return (uint64_t{width} + 3) / 4 * ((uint64_t{height} + 3) / 4) * 8;
}

int32_t QexTextureLoad_Refuse(const char* function, const char* format, ...) {
    char text[160];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    QexSystem_Printf("ERROR:<%s> %s\n", function, text);
    return -1;
}

bool QexTextureLoad_CheckSize(const char* function, uint32_t width, uint32_t height, bool cube) {
    if (QexTexture_IsPossibleSize(width, height, cube)) return true;
    QexTextureLoad_Refuse(function, "%u x %u pixels are not possible here.", width, height);
    return false;
}

void QexTextureLoad_Begin(QexTexture* texture, uint32_t* name, bool cube) {
    texture->pixels = nullptr;
    texture->rowBytes = texture->bytesPerPixel * static_cast<uint32_t>(texture->width);
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    QEX_GL(glGenTextures(1, name));
    texture->flags = cube ? QEX_TEXFLAG_CUBEMAP : 0;
    QexRenderState_Bind(QexTexture_Target(texture), *name);
}

bool QexTextureLoad_TakesMipmaps(uint32_t width, uint32_t height) {
    if (util_number_is_power_2(width) && util_number_is_power_2(height)) return true;
    const char* extensions = reinterpret_cast<const char*>(glGetString(GL_EXTENSIONS));
    return extensions && strstr(extensions, "GL_OES_texture_npot");
}

void QexTextureLoad_GenerateMipmaps(uint32_t target) {
    glGenerateMipmap(target);
    glGetError();  // of a GL that knows mipmaps of powers of two only; level 0 is there
}

void QexTextureLoad_SetWrap(uint32_t target, uint32_t width, uint32_t height) {
    const bool repeats = util_number_is_power_2(width) && util_number_is_power_2(height);
    const GLint wrap = repeats ? GL_REPEAT : GL_CLAMP_TO_EDGE;
    glTexParameteri(target, GL_TEXTURE_WRAP_S, wrap);
    glTexParameteri(target, GL_TEXTURE_WRAP_T, wrap);
}

bool QexTextureLoad_UploadDecodedETC(uint32_t target, int32_t level, uint32_t width, uint32_t height,
                                     const uint8_t* data) {
    const uint64_t pixels = uint64_t{width} * height;
    const GLsizei w = static_cast<GLsizei>(width), h = static_cast<GLsizei>(height);
    QexScratch<uint8_t> decoded;
    if (!decoded.Alloc(4 * pixels) || QexDecompressETC(data, w, h, decoded.Get(), 0) < 0) return false;
    for (uint64_t i = 1; i < pixels; ++i) memmove(decoded.Get() + 3 * i, decoded.Get() + 4 * i, 3);
    QEX_GL(glTexImage2D(target, level, GL_RGB, w, h, 0, GL_RGB, GL_UNSIGNED_BYTE, decoded.Get()));
    return true;
}

bool QexTextureLoad_UploadDecodedPVRTC(uint32_t target, int32_t level, uint32_t width, uint32_t height,
                                       bool twoBits, const uint8_t* data) {
    const GLsizei w = static_cast<GLsizei>(width), h = static_cast<GLsizei>(height);
    QexScratch<uint8_t> decoded;
    if (!decoded.Alloc(uint64_t{width} * height * 4)) return false;
    QexDecompressPVRTC(data, twoBits, w, h, decoded.Get());
    QEX_GL(glTexImage2D(target, level, GL_RGBA, w, h, 0, GL_RGBA, GL_UNSIGNED_BYTE, decoded.Get()));
    return true;
}

bool QexTexture_IsCompressedFormat(uint32_t internalFormat) {
    GLint count = 0;
    QEX_GL(glGetIntegerv(GL_NUM_COMPRESSED_TEXTURE_FORMATS, &count));
    QexScratch<GLint> formats;
    if (count <= 0 || !formats.Alloc(static_cast<uint64_t>(count))) return false;
    QEX_GL(glGetIntegerv(GL_COMPRESSED_TEXTURE_FORMATS, formats.Get()));
    for (GLint i = 0; i < count; ++i)
        if (static_cast<uint32_t>(formats[static_cast<uint64_t>(i)]) == internalFormat) return true;
    return false;
}

extern "C" {

int32_t QexTexture_IsETCSupported(void) {
    return QexTexture_IsCompressedFormat(GL_ETC1_RGB8_OES) ? 1 : 0;
}

}  // extern "C"
