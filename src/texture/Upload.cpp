// Sizes that a GL takes, the texture that the levels of a file go into, and levels that are decoded for it.
#include "texture/Upload.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "base/Memory.h"
#include "gl/GL.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/Kept.h"

#define QEX_MODULE "src/QexLoadPODModel"

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
    *name = QexKeptTexture_NewName();
    texture->flags = cube ? QEX_TEXFLAG_CUBEMAP : 0;
    QexRenderState_Bind(QexTexture_Target(texture), *name);
}

bool QexTextureLoad_TakesMipmaps(uint32_t width, uint32_t height) {
    if (QexImage_IsPowerOfTwo(width, height)) return true;
    const char* extensions = reinterpret_cast<const char*>(glGetString(GL_EXTENSIONS));
    return extensions && strstr(extensions, "GL_OES_texture_npot");
}

void QexTextureLoad_GenerateMipmaps(uint32_t target) {
    glGenerateMipmap(target);
    glGetError();  // of a GL that knows mipmaps of powers of two only; level 0 is there
}

uint32_t QexTextureLoad_FaceTarget(bool cube, uint32_t face) {
    return cube ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + face : GL_TEXTURE_2D;
}

void QexTextureLoad_SetWrap(uint32_t target, uint32_t width, uint32_t height) {
    const GLint wrap = QexImage_IsPowerOfTwo(width, height) ? GL_REPEAT : GL_CLAMP_TO_EDGE;
    glTexParameteri(target, GL_TEXTURE_WRAP_S, wrap);
    glTexParameteri(target, GL_TEXTURE_WRAP_T, wrap);
}

bool QexTextureLoad_UploadDecoded(uint32_t target, int32_t index, const QexPixelFormat& format,
                                  const QexImageLevel& level, const uint8_t* data) {
    const uint64_t pixels = uint64_t{level.width} * level.height;
    const GLsizei w = static_cast<GLsizei>(level.width), h = static_cast<GLsizei>(level.height);
    const bool etc = format.coding == kQexETC1;
    const GLenum order = etc ? GL_RGB : GL_RGBA;
    QexScratch<uint8_t> decoded;
    if (!decoded.Alloc(4 * pixels)) return false;
    if (!etc)
        QexDecompressPVRTC(data, format.bits == 2, w, h, decoded.Get());
    else if (QexDecompressETC(data, w, h, decoded.Get(), 0) < 0)
        return false;
    for (uint64_t i = 1; etc && i < pixels; ++i) memmove(decoded.Get() + 3 * i, decoded.Get() + 4 * i, 3);
    QEX_GL(glTexImage2D(target, index, static_cast<GLint>(order), w, h, 0, order, GL_UNSIGNED_BYTE,
                        decoded.Get()));
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
