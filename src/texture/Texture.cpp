// Texture records: pixels and TGA images become textures, which are set, filtered and released.
#include "texture/Texture.h"

#include <cstdio>
#include <cstring>

#include "base/Memory.h"
#include "data/ResFile.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "image/Tga.h"
#include "Qex/base.h"
#include "Qex/images.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/Kept.h"

#define QEX_MODULE "src/QexTexture"

namespace {

constexpr int32_t kUnknownCode = -2;
constexpr uint32_t kStages = 5;

// By format code, from 1.
const struct {
    uint8_t bytesPerPixel;
    GLenum format;
    GLenum type;
} kFormats[] = {
    {4, GL_RGBA, GL_UNSIGNED_BYTE},
    {3, GL_RGB, GL_UNSIGNED_BYTE},
    {2, GL_RGBA, GL_UNSIGNED_SHORT_4_4_4_4},
    {2, GL_RGBA, GL_UNSIGNED_SHORT_5_5_5_1},
};

bool IsFormat(uint32_t format) {
    return format >= 1 && format <= sizeof kFormats / sizeof kFormats[0];
}

// Two parameters of a texture that always have the same value, and the values by their codes.
struct Setting {
    GLenum first, second;
    struct {
        uint8_t code;
        GLint value;
    } values[2];
};

const Setting kFilter = {GL_TEXTURE_MIN_FILTER,
                         GL_TEXTURE_MAG_FILTER,
                         {{QEX_FILTER_NEAREST, GL_NEAREST}, {QEX_FILTER_LINEAR, GL_LINEAR}}};
const Setting kWrap = {
    GL_TEXTURE_WRAP_S, GL_TEXTURE_WRAP_T, {{QEX_WRAP_CLAMP, GL_CLAMP_TO_EDGE}, {QEX_WRAP_REPEAT, GL_REPEAT}}};

// Binds the texture in any case; `field` of the record keeps the code.
int32_t Set(QexTexture* texture, const Setting& setting, uint32_t code, uint8_t* field) {
    const GLenum target = QexTexture_Target(texture);
    QexRenderState_Bind(target, texture->glName);
    for (const auto& value : setting.values) {
        if (value.code != code) continue;
        QEX_GL(glTexParameteri(target, setting.first, value.value));
        QEX_GL(glTexParameteri(target, setting.second, value.value));
        *field = value.code;
        const bool filters = field == &texture->filter;
        QexKeptTexture_SetCodes(texture->glName, filters ? value.code : uint8_t{0},
                                filters ? uint8_t{0} : value.code);
        return 0;
    }
    return kUnknownCode;
}

uint64_t PixelBytes(const QexTexture& texture) {
    return uint64_t{static_cast<uint32_t>(texture.width)} * texture.height * texture.bytesPerPixel;
}

// Gives back the GL texture of a record that an error was found in.
int32_t Drop(QexTexture* texture) {
    if (texture->glName) glDeleteTextures(1, &texture->glName);
    QexKeptTexture_Drop(texture->glName);
    QexLeanState_ForgetTextures();
    texture->glName = 0;
    return -1;
}

// BGR(A) to RGB(A).
void SwapRedAndBlue(uint8_t* pixels, uint64_t bytes, uint32_t bytesPerPixel) {
    for (uint64_t i = 0; i < bytes; i += bytesPerPixel) {
        const uint8_t blue = pixels[i];
        pixels[i] = pixels[i + 2];
        pixels[i + 2] = blue;
    }
}

// Reads a whole file; false when that does not succeed. What follows its end cannot be reached.
bool ReadFile(FILE* file, QexScratch<uint8_t>* data, uint64_t* size) {
    if (fseek(file, 0, SEEK_END) != 0) return false;
    const long length = ftell(file);
    if (length < 0 || fseek(file, 0, SEEK_SET) != 0) return false;
    *size = static_cast<uint64_t>(length);
    return data->Alloc(*size) && fread(data->Get(), 1, *size, file) == *size;
}

}  // namespace

uint32_t QexTexture_Target(const QexTexture* texture) {
    return texture->flags & QEX_TEXFLAG_CUBEMAP ? GL_TEXTURE_CUBE_MAP : GL_TEXTURE_2D;
}

bool QexTexture_IsPossibleSize(uint32_t width, uint32_t height, bool cube) {
    GLint limit = 0;
    glGetIntegerv(cube ? GL_MAX_CUBE_MAP_TEXTURE_SIZE : GL_MAX_TEXTURE_SIZE, &limit);
    const uint32_t most = static_cast<uint32_t>(limit);
    return width && height && width <= most && height <= most && (!cube || width == height);
}

extern "C" {

int32_t QexTexture_CreateFromPixels(QexTexture* texture, int32_t width, int32_t height, uint32_t format,
                                    int32_t, uint32_t stage, uint32_t filter, uint32_t wrap, void* pixels) {
    const QexMaking making;
    memset(texture, 0, sizeof *texture);
    texture->pixels = pixels;
    texture->width = width;
    texture->height = static_cast<uint32_t>(height);
    QexTexture_SetStage(texture, stage);
    QexTexture_SetFormat(texture, format);
    texture->glName = QexKeptTexture_NewName();
    QexKeptTexture_Note(texture->glName, GL_TEXTURE_2D,
                        {kKeptPixels, nullptr, 0, width, height, format, 0, 0});
    QexRenderState_Bind(GL_TEXTURE_2D, texture->glName);
    QexTexture_SetFilter(texture, filter);
    QexTexture_SetWrapping(texture, wrap);
    QexTexture_Download(texture, nullptr);
    if (making.Failed()) return Drop(texture);
    return QexTexture_SetName(texture, "Noname");
}

int32_t QexTexture_CreateTGAFromMem(QexTexture* texture, int32_t, uint32_t stage, uint32_t filter,
                                    uint32_t wrap, const void* tga) {
    const uint8_t* file = static_cast<const uint8_t*>(tga);
    const QexTga header = QexTga_ReadHeader(file);
    const uint32_t bytesPerPixel = header.BytesPerPixel();
    const QexMaking making;
    memset(texture, 0, sizeof *texture);
    texture->width = static_cast<int32_t>(header.width);
    texture->height = header.height;
    texture->bytesPerPixel = static_cast<uint8_t>(bytesPerPixel);
    QexTexture_SetStage(texture, stage);
    if (bytesPerPixel != 4 && bytesPerPixel != 3) {
        QexError(QEX_TAG, "<QexTexture_CreateTGAFromMem> %d bytes a pixel; images have 3 or 4",
                 bytesPerPixel);
        return -4;
    }
    if (!QexTexture_IsPossibleSize(header.width, header.height, false)) {
        QexError(QEX_TAG, "<QexTexture_CreateTGAFromMem> %d x %d pixels are not possible here", header.width,
                 header.height);
        return -1;
    }
    QexTexture_SetFormat(texture, bytesPerPixel == 4 ? QEX_TEXFMT_RGBA8888 : QEX_TEXFMT_RGB888);
    QexScratch<uint8_t> copy(header.PixelBytes());
    if (!copy) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return -1;
    }
    memcpy(copy.Get(), file + kQexTgaHeaderSize, header.PixelBytes());
    SwapRedAndBlue(copy.Get(), header.PixelBytes(), bytesPerPixel);
    QexRenderState_ActiveTexture(GL_TEXTURE0);
    texture->glName = QexKeptTexture_NewName();
    QexKeptTexture_Note(texture->glName, GL_TEXTURE_2D,
                        {kKeptTga, tga, kQexTgaHeaderSize + header.PixelBytes(), 0, 0, 0, 0, 0});
    QexRenderState_Bind(GL_TEXTURE_2D, texture->glName);
    QexTexture_SetFilter(texture, filter);
    QexTexture_SetWrapping(texture, wrap);
    QexTexture_Download(texture, copy.Get());
    if (making.Failed()) return Drop(texture);
    if (texture->flags & QEX_TEXFLAG_OWNS_PIXELS) texture->pixels = copy.Take();
    return 0;
}

int32_t QexTexture_CreateTGAFromMemSized(QexTexture* texture, int32_t ignored, uint32_t stage,
                                         uint32_t filter, uint32_t wrap, const void* tga, uint32_t size) {
    if (tga && QexTga_IsWhole({static_cast<const uint8_t*>(tga), size}))
        return QexTexture_CreateTGAFromMem(texture, ignored, stage, filter, wrap, tga);
    memset(texture, 0, sizeof *texture);
    QexError(QEX_TAG, "<QexTexture_CreateTGAFromMem> %u bytes are not a whole uncompressed TGA image", size);
    return -1;
}

int32_t QexTexture_CreateTGAFromFile(QexTexture* texture, int32_t ignored, uint32_t stage, uint32_t filter,
                                     uint32_t wrap, const char* path) {
    FILE* file = QexResFile_OpenForReading(path);
    if (!file) return -1;
    const QexKeptPath kept(path);
    QexScratch<uint8_t> data;
    uint64_t size = 0;
    const QexMaking making;
    if (ReadFile(file, &data, &size) && size <= UINT32_MAX) {
        QexTexture_CreateTGAFromMemSized(texture, ignored, stage, filter, wrap, data.Get(),
                                         static_cast<uint32_t>(size));
    } else {
        memset(texture, 0, sizeof *texture);
        QexError(QEX_TAG, "<QexTexture_CreateTGAFromFile> %s cannot be read", path);
    }
    fclose(file);
    const char* name = GetNameFromFullPath(path);
    QexTexture_SetName(texture, name ? name : "");
    return making.Failed() ? -1 : 0;
}

int32_t QexTexture_Download(QexTexture* texture, const void* pixels) {
    if (!pixels) pixels = texture->pixels;
    if (!pixels) return -2;
    QexRenderState_Bind(QexTexture_Target(texture), texture->glName);
    if (!IsFormat(texture->format) || texture->flags & QEX_TEXFLAG_CUBEMAP) return -1;
    const auto& format = kFormats[texture->format - 1];
    const QexMaking making;
    // Rows are tightly packed, whatever the application set.
    QEX_GL(glPixelStorei(GL_UNPACK_ALIGNMENT, 1));
    QEX_GL(glTexImage2D(GL_TEXTURE_2D, 0, static_cast<GLint>(format.format), texture->width,
                        static_cast<GLsizei>(texture->height), 0, format.format, format.type, pixels));
    if (making.Failed()) return -1;
    QexKeptTexture_Replace(*texture, pixels, PixelBytes(*texture));
    return making.Failed() ? -1 : 0;
}

int32_t QexTexture_SetFormat(QexTexture* texture, uint32_t format) {
    if (!IsFormat(format)) return kUnknownCode;
    texture->format = format;
    texture->bytesPerPixel = kFormats[format - 1].bytesPerPixel;
    texture->rowBytes = texture->bytesPerPixel * static_cast<uint32_t>(texture->width);
    return 0;
}

int32_t QexTexture_SetStage(QexTexture* texture, uint32_t stage) {
    texture->stage = static_cast<uint8_t>(stage);
    if (stage >= kStages) return -3;
    QexRenderState_ActiveTexture(GL_TEXTURE0 + stage);
    QexRenderState_Bind(QexTexture_Target(texture), texture->glName);
    return 0;
}

int32_t QexTexture_SetFilter(QexTexture* texture, uint32_t filter) {
    return Set(texture, kFilter, filter, &texture->filter);
}

int32_t QexTexture_SetWrapping(QexTexture* texture, uint32_t wrap) {
    return Set(texture, kWrap, wrap, &texture->wrap);
}

void QexTexture_Set(QexTexture* texture, uint32_t stage) {
    if (!texture) texture = Qextexture_GetDefault();
    QexTexture_SetStage(texture, stage);
    QexRenderState_Bind(QexTexture_Target(texture), texture->glName);
}

void QexTexture_Release(QexTexture* texture) {
    QexKeptTexture_Drop(texture->glName);
    if (!g_QexContextLost) QEX_GL(glDeleteTextures(1, &texture->glName));
    QexLeanState_ForgetTextures();
    texture->glName = 0;
    if (!(texture->flags & QEX_TEXFLAG_OWNS_PIXELS)) return;
    QexMemory_Free(texture->pixels);
    texture->pixels = nullptr;
}

int32_t QexTexture_SetName(QexTexture* texture, const char* name) {
    strncpy(texture->name, name, sizeof texture->name - 1);
    return 0;
}

const char* GetNameFromFullPath(const char* path) {
    if (!*path) return nullptr;
    const char* at = path + strlen(path) - 1;
    while (at > path && *at != '/' && *at != '\\' && *at != ':') --at;
    return at;
}

}  // extern "C"
