// Sizes that a GL takes, the texture that the levels of a file go into, and levels that are decoded for it.
#include "texture/Upload.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "image/Pvrtc.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/Kept.h"

#define QEX_MODULE "src/QexLoadPODModel"

namespace {

// A band of at most a piece's bytes, in whole blocks. False when memory runs out.
bool DecodeBand(QexTextureLoad* load, const QexPixelFormat& format, const QexImageLevel& level,
                const uint8_t* data) {
    const bool etc = format.coding == kQexETC1;
    const int32_t w = static_cast<int32_t>(level.width), h = static_cast<int32_t>(level.height);
    const int32_t row = static_cast<int32_t>(load->decodedRows);
    const uint32_t fitting = load->piece / (4 * level.width) / 4 * 4, band = fitting ? fitting : 4;
    const int32_t rows = band < level.height - load->decodedRows ? static_cast<int32_t>(band) : h - row;
    uint8_t* const out = load->decoded + uint64_t{4} * level.width * load->decodedRows;
    load->decodedRows += static_cast<uint32_t>(rows);
    if (!etc) {
        QexPvrtc_DecodeRows(data, format.bits == 2, w, h, row, rows, load->decoded);
        return true;
    }
    const uint64_t blocks = (uint64_t{level.width} + 3) / 4 * (static_cast<uint32_t>(row) / 4);
    if (QexDecompressETC(data + 8 * blocks, w, rows, out, 0) < 0) return false;
    // RGBA becomes RGB.
    const uint64_t first = uint64_t{level.width} * static_cast<uint32_t>(row);
    const uint64_t end = uint64_t{level.width} * load->decodedRows;
    for (uint64_t i = first ? first : 1; i < end; ++i)
        memmove(load->decoded + 3 * i, load->decoded + 4 * i, 3);
    return true;
}

}  // namespace

int32_t QexTextureLoad_Run(QexTextureLoad* load, QexStep (*first)(QexTextureLoad* load)) {
    load->step = first;
    QexStep_Run(load, QexTextureLoad_Step);
    QexTextureLoad_End(load);
    return load->result;
}

QexStep QexTextureLoad_Step(QexTextureLoad* load) {
    const QexMaking making;
    const QexStep step = load->step(load);
    if (!making.Failed()) return step;
    if (load->result == 0) QexTexture_Release(load->texture);
    load->result = -1;
    if (step != QexStep::kFailed)
        QexTextureLoad_Refuse("QexTexture_LoadPVRFromMem", "glTexImage2D() failed.");
    return QexStep::kFailed;
}

void QexTextureLoad_End(QexTextureLoad* load) {
    QexMemory_FreeArray(load->decoded);
    if (!load->name) return;
    if (load->context == g_QexContexts && !g_QexContextLost) QEX_GL(glDeleteTextures(1, &load->name));
    QexLeanState_ForgetTextures();
    load->name = 0;
}

void QexTextureLoad_Resume(const QexTextureLoad* load) {
    if (!load->name) return;
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    QexLeanState_ForgetTextures();
    QexRenderState_Bind(QexTexture_Target(load->texture), load->name);
}

QexStep QexTextureLoad_Complete(QexTextureLoad* load) {
    const QexKeptPath kept(load->path);
    const bool known = !load->pixelData && load->file.size != kQexUnknownSize;
    if (!QexKeptTexture_Note(load->name, QexTexture_Target(load->texture),
                             {kKeptImage, known ? load->file.bytes : nullptr, load->file.size, 0, 0, 0,
                              load->decode, load->firstLevel}))
        return QexStep::kFailed;
    load->texture->glName = load->name;
    load->name = 0;
    load->result = 0;
    return QexStep::kDone;
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

void QexTextureLoad_Begin(QexTextureLoad* load, bool cube) {
    QexTexture* texture = load->texture;
    texture->pixels = nullptr;
    texture->rowBytes = texture->bytesPerPixel * static_cast<uint32_t>(texture->width);
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    load->name = QexKeptTexture_NewName();
    load->context = g_QexContexts;
    texture->flags = cube ? QEX_TEXFLAG_CUBEMAP : 0;
    QexRenderState_Bind(QexTexture_Target(texture), load->name);
}

bool QexTextureLoad_TakesMipmaps(uint32_t width, uint32_t height) {
    if (QexImage_IsPowerOfTwo(width, height)) return true;
    const char* extensions = reinterpret_cast<const char*>(glGetString(GL_EXTENSIONS));
    return extensions && strstr(extensions, "GL_OES_texture_npot");
}

void QexTextureLoad_GenerateMipmaps(uint32_t target) {
    glGenerateMipmap(target);
    QexGL_TakeError();  // of a GL that knows mipmaps of powers of two only; level 0 is there
}

uint32_t QexTextureLoad_FaceTarget(bool cube, uint32_t face) {
    return cube ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + face : GL_TEXTURE_2D;
}

void QexTextureLoad_SetWrap(uint32_t target, uint32_t width, uint32_t height) {
    const GLint wrap = QexImage_IsPowerOfTwo(width, height) ? GL_REPEAT : GL_CLAMP_TO_EDGE;
    glTexParameteri(target, GL_TEXTURE_WRAP_S, wrap);
    glTexParameteri(target, GL_TEXTURE_WRAP_T, wrap);
}

QexStep QexTextureLoad_UploadDecoded(QexTextureLoad* load, uint32_t target, const QexPixelFormat& format,
                                     const QexImageLevel& level, int32_t index, const uint8_t* data) {
    const GLenum order = format.coding == kQexETC1 ? GL_RGB : GL_RGBA;
    if (!load->decoded) {
        load->decoded = QexMemory_AllocArray<uint8_t>(uint64_t{4} * level.width * level.height);
        load->decodedRows = 0;
    }
    if (!load->decoded || !DecodeBand(load, format, level, data)) return QexStep::kFailed;
    if (load->decodedRows < level.height) return QexStep::kMore;
    QEX_GL(glTexImage2D(target, index, static_cast<GLint>(order), static_cast<GLsizei>(level.width),
                        static_cast<GLsizei>(level.height), 0, order, GL_UNSIGNED_BYTE, load->decoded));
    QexMemory_FreeArray(load->decoded);
    return QexStep::kDone;
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
