/* Textures and render targets. */
#ifndef QEX_TEXTURES_H
#define QEX_TEXTURES_H

#include "Qex/base.h"
#include "Qex/images.h"

QEX_BEGIN

/* ======================================================================================================
 * Textures
 *
 * A texture record is the engine's handle of a GL texture. The caller allocates it, a create or load function
 * fills it, QexTexture_Release empties it. Needs a current GL context, except where a function says not.
 * ====================================================================================================== */

/** Flags of a texture record. */
#define QEX_TEXFLAG_OWNS_PIXELS 0x10u /* `pixels` belong to the record and go with it */
#define QEX_TEXFLAG_CUBEMAP 0x80u     /* the GL object is a cube map */

/** Filter modes. */
#define QEX_FILTER_NEAREST 1
#define QEX_FILTER_LINEAR 16

/** Wrap modes. */
#define QEX_WRAP_CLAMP 1
#define QEX_WRAP_REPEAT 2

struct QexTexture {
    char name[32];         /* at most 31 characters and a NUL */
    uint8_t stage;         /* texture unit 0 to 4 that it is bound to */
    uint8_t bytesPerPixel; /* 4, 3 or 2, as the format; what its loader left where that has no code */
    uint8_t filter;        /* QEX_FILTER_... last applied */
    uint8_t wrap;          /* QEX_WRAP_... last applied */
    uint32_t flags;        /* QEX_TEXFLAG_... */
    uint32_t format;       /* QEX_TEXFMT_...; 0 where the format has no code */
    int32_t width;         /* pixels */
    uint32_t height;       /* pixels */
    uint32_t rowBytes;     /* bytesPerPixel * width */
    void* pixels;          /* client pixels for QexTexture_Download, or null */
    uint32_t glName;       /* GL texture, 0 when released */
};

/** Creates a 2D texture from pixels. The first row is the one at texture coordinate t = 0.
 *  @param texture  out, cleared first
 *  @param width, height  pixels, > 0
 *  @param format   QEX_TEXFMT_...
 *  @param ignored  not read
 *  @param stage    unit 0 to 4
 *  @param filter   QEX_FILTER_...
 *  @param wrap     QEX_WRAP_...
 *  @param pixels   width * height pixels, rows tightly packed; kept by pointer, not owned; null: the texture
 *                  has no image until QexTexture_Download
 *  @return 0. Unknown codes are skipped, as the single functions say. The name becomes "Noname". */
QEX_API int32_t QexTexture_CreateFromPixels(QexTexture* texture, int32_t width, int32_t height,
                                            uint32_t format, int32_t ignored, uint32_t stage, uint32_t filter,
                                            uint32_t wrap, void* pixels);

/** Creates a texture from an uncompressed 24- or 32-bit TGA image in memory. Only width, height and depth of
 *  its header are read; pixels follow the 18-byte header in stored order. The caller vouches for the length.
 *  @param ignored  not read; stage, filter, wrap as in QexTexture_CreateFromPixels
 *  @return 0; with a line in the log and without a GL texture -4 for another depth, -1 for a size of 0,
 * beyond GL's limit or too large to hold. */
QEX_API int32_t QexTexture_CreateTGAFromMem(QexTexture* texture, int32_t ignored, uint32_t stage,
                                            uint32_t filter, uint32_t wrap, const void* tga);

/** QexTexture_CreateTGAFromMem on an image of known length.
 *  @param tga   the file
 *  @param size  its bytes
 *  @return as QexTexture_CreateTGAFromMem; -1, with a line in the log, when the image does not fit into them.
 */
QEX_API int32_t QexTexture_CreateTGAFromMemSized(QexTexture* texture, int32_t ignored, uint32_t stage,
                                                 uint32_t filter, uint32_t wrap, const void* tga,
                                                 uint32_t size);

/** QexTexture_CreateTGAFromMem on a file, named after it (GetNameFromFullPath).
 *  @return 0 once the file could be opened; -1 when not, with the record as it was. A file that is cut short
 *  or of another kind leaves the record without a GL texture (glName 0), with a line in the log unless only
 *  its depth is another. */
QEX_API int32_t QexTexture_CreateTGAFromFile(QexTexture* texture, int32_t ignored, uint32_t stage,
                                             uint32_t filter, uint32_t wrap, const char* path);

/** Uploads level 0 in the record's format and size.
 *  @param pixels  pixels, or null: the record's own
 *  @return 0; -2 when there are none; -1 for a format without a code, or a cube map, which has no single
 *  level to fill. */
QEX_API int32_t QexTexture_Download(QexTexture* texture, const void* pixels);

/** Sets the format, and with it bytesPerPixel and rowBytes. No GL context needed.
 *  @return 0, or -2 for an unknown code. */
QEX_API int32_t QexTexture_SetFormat(QexTexture* texture, uint32_t format);

/** Chooses a unit and binds the texture there. @return 0, or -3 for a unit above 4 (stored all the same). */
QEX_API int32_t QexTexture_SetStage(QexTexture* texture, uint32_t stage);

/** Binds the texture and sets both filters. @return 0, or -2 for an unknown mode. */
QEX_API int32_t QexTexture_SetFilter(QexTexture* texture, uint32_t filter);

/** Binds the texture and sets both wrap modes. @return 0, or -2 for an unknown mode. */
QEX_API int32_t QexTexture_SetWrapping(QexTexture* texture, uint32_t wrap);

/** Binds a texture for drawing.
 *  @param texture  null: the white default texture
 *  @param stage    unit 0 to 4 */
QEX_API void QexTexture_Set(QexTexture* texture, uint32_t stage);

/** Binds the flat normal map. @param stage  unit 0 to 4 */
QEX_API void QexTexture_SetBlankNormalMap(uint32_t stage);

/** Deletes the GL texture and frees pixels that the record owns; the other fields keep their values. */
QEX_API void QexTexture_Release(QexTexture* texture);

/** Names a texture: at most 31 characters. No GL context needed. @return 0. */
QEX_API int32_t QexTexture_SetName(QexTexture* texture, const char* name);

#ifdef QEX_UNPREFIXED_NAMES
/** Finds the last '/', '\\' or ':' of a path. No GL context needed.
 *  @return a pointer to that character (it is part of the result), to the start of the path when there is
 * none after the first character, or null for an empty path. */
QEX_API const char* GetNameFromFullPath(const char* path);
#endif

/** @return the white default texture, empty before QexTexture_CreateDefault. No GL context needed. */
QEX_API QexTexture* Qextexture_GetDefault(void);

/** Creates the default texture (64 x 64, white) and the flat normal map (16 x 16) unless they exist. The
 *  engine's initialisation calls it. @return 0. */
QEX_API int32_t QexTexture_CreateDefault(void);

/** Releases what QexTexture_CreateDefault made, if it did. @return the log call's result. */
QEX_API int32_t QexTexture_ReleaseDefault(void);

/** Makes a cube map whose texels hold the positive parts of the unit direction through them.
 *  @param texture  out; name, stage, filter and wrap are left alone
 *  @param size     edge in pixels, > 0
 *  @return 0, or -1, with a line printed, for a size that the GL does not take or when memory runs out. */
QEX_API int32_t QexTexture_GenerateNormalisationCubeMap(QexTexture* texture, int32_t size);

/** Loads a legacy PVR image, or a KTX 1.1 image, from memory. ETC1 goes to the GL as it is, or is decoded to
 *  RGB where the GL does not take it or mipmaps are missing; PVRTC is decoded to RGBA. Where the header asks
 *  for mipmaps that the file lacks, the GL makes them; a GL that has none of that size gets level 0 alone,
 *  with a line printed. GL filters linearly in the nearest mipmap, repeats powers of two, clamps others.
 *  @param texture     out; cleared by the caller: name, stage, filter and wrap are left alone
 *  @param file        the whole file; the caller vouches for its length
 *  @param header      out, the PVR header in its current form, or null
 *  @param decode      0: PVRTC is refused
 *  @param firstLevel  levels above it are skipped; it becomes level 0; width and height stay the file's
 *  @param pixelData   the pixels when they do not follow the header, or null
 *  @return 0; -1, with a line printed, for anything that cannot be loaded; a KTX image gives the result of
 *  QexTexture_LoadKTXFromMem. */
QEX_API int32_t QexTexture_LoadPVRFromMem(QexTexture* texture, const void* file, QexPVRHeader* header,
                                          int32_t decode, uint32_t firstLevel, const void* pixelData);

/** QexTexture_LoadPVRFromMem on an image of known length: nothing is read past it.
 *  @param size       bytes of `file`
 *  @param pixelData  the pixels when they do not follow the header, or null; the caller vouches for their
 *                    length
 *  @return as QexTexture_LoadPVRFromMem; -1, with a line printed, also for an image that is cut short. */
QEX_API int32_t QexTexture_LoadPVRFromMemSized(QexTexture* texture, const void* file, uint32_t size,
                                               QexPVRHeader* header, int32_t decode, uint32_t firstLevel,
                                               const void* pixelData);

/** QexTexture_LoadPVRFromMem on a file; one that is shorter than its header says is refused.
 *  @return as that; -1, with nothing printed, when there is no such file. */
QEX_API int32_t QexTexture_LoadPVRFromFile(QexTexture* texture, const char* path, QexPVRHeader* header,
                                           int32_t decode, uint32_t firstLevel);

/** Loads a KTX 1.1 image of either byte order from memory: a compressed format that the GL takes as it is,
 *  ETC1 and PVRTC (of powers of two) on any GL, or RGB / RGBA of bytes or of 16-bit pixels (565, 4444, 5551).
 *  Rows may be padded to 4 bytes or tight. GL's own filter, which asks for all mipmaps, stays: those that the
 *  file lacks, or from one that is not of its size on, the GL makes. Where it cannot, of a single level that
 *  is compressed, say, the filter is linear without mipmaps. Powers of two repeat, other sizes are clamped.
 *  @param file  the whole file; the caller vouches for its length; the arguments after it are not read
 *  @return 0; -3 when it is no KTX 1.1; with a line printed, -4 for any other uncompressed format and -1 for
 *  sizes that cannot be or a compressed format that the GL does not take. */
QEX_API int32_t QexTexture_LoadKTXFromMem(QexTexture* texture, const void* file, QexPVRHeader* header,
                                          int32_t decode, uint32_t firstLevel, const void* pixelData);

/** QexTexture_LoadKTXFromMem on an image of known length: nothing is read past it.
 *  @param size  bytes of `file`; the arguments after it are not read
 *  @return as QexTexture_LoadKTXFromMem; -1, with a line printed, also for an image that is cut short. */
QEX_API int32_t QexTexture_LoadKTXFromMemSized(QexTexture* texture, const void* file, uint32_t size,
                                               QexPVRHeader* header, int32_t decode, uint32_t firstLevel,
                                               const void* pixelData);

/** QexTexture_LoadKTXFromMem on a file; one that is shorter than its levels is refused.
 *  @return as that; -1 when the file cannot be opened. */
QEX_API int32_t QexTexture_LoadKTXFromFile(QexTexture* texture, const char* path, QexPVRHeader* header,
                                           int32_t decode, uint32_t firstLevel);

/** @return 1 when the GL takes ETC1 textures, else 0. */
QEX_API int32_t QexTexture_IsETCSupported(void);

/* ======================================================================================================
 * Render targets
 *
 * Framebuffers to draw into instead of the screen, with an RGBA texture for colour and a 16-bit depth buffer.
 * The record is the caller's. Targets do not follow the size of the screen. Needs a current GL context.
 * ====================================================================================================== */

/** A render target. */
typedef struct QexRenderTarget {
    uint32_t created;        /* 1 after QexRenderTarget_Create */
    uint32_t framebuffer;    /* GL name, 0 for none, as the two below */
    QexTexture colorTexture; /* what was drawn; unfiltered, its format the GL enumerant GL_RGBA, flags 1 */
    uint32_t depthRenderbuffer;
    int32_t viewport[4];      /* x, y, width, height while it is drawn into */
    int32_t savedViewport[4]; /* of before QexRenderTarget_BeginScene */
    int32_t savedFramebuffer;
} QexRenderTarget;

/** Creates a target of that many pixels; whatever the record held is forgotten, not released. The framebuffer
 * that is bound stays bound; unit 0 becomes active and keeps the new texture bound. A GL error is fatal.
 *  @param width, height  1 to the GL's limit (the lesser of GL_MAX_TEXTURE_SIZE and GL_MAX_RENDERBUFFER_SIZE)
 *  @param ignored  not read
 *  @return 0, or -1, with a line in the log and the record zeroed, for a size that the GL cannot draw into */
QEX_API int32_t QexRenderTarget_Create(QexRenderTarget* target, int32_t width, int32_t height,
                                       int32_t ignored);

/** Does nothing.
 *  @return 0 */
QEX_API int32_t QexRenderTarget_CreateFromTexture(QexRenderTarget* target, QexTexture* texture);

/** Draws into the target from now on; framebuffer and viewport of before are kept for
 * QexRenderTarget_EndScene. Pairs of different targets may nest.
 *  @return 0 */
QEX_API int32_t QexRenderTarget_BeginScene(QexRenderTarget* target);

/** Goes back to the framebuffer and the viewport of before QexRenderTarget_BeginScene. */
QEX_API void QexRenderTarget_EndScene(QexRenderTarget* target);

/** Draws into the target from now on, or into the screen, with the whole of it as viewport. Nothing is kept.
 *  @param context  its size is the screen's
 *  @param target   null: the screen
 *  @return 0 */
QEX_API int32_t QexRenderTarget_SetRenderTarget(const QexRuntimeContext* context, QexRenderTarget* target);

/** Deletes the GL objects that are there. Null and a target that was released do nothing. */
QEX_API void QexRenderTarget_Release(QexRenderTarget* target);

QEX_END

#endif
