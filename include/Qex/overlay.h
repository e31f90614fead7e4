/* Text, textures and pictures on the screen, billboards. */
#ifndef QEX_OVERLAY_H
#define QEX_OVERLAY_H

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/textures.h"

QEX_BEGIN

/* ======================================================================================================
 * Text
 *
 * One built-in font of 8 x 16 pixel glyphs, one per process. A persistent text is built up with AddString and
 * ReplaceString and drawn every frame by QexFont_Draw; temporary strings and numbers are drawn at once.
 *
 * (x, y) places a text's upper left corner, x from the left edge of the surface, y downwards, but y is
 * counted from 32 pixels above the surface: y = 32 is its upper edge, and a first line that is to stand 8
 * pixels below the edge has y = 40. Below y = 32 it is cut off, at y = 16 and less one line cannot be seen.
 *
 * Strings are UTF-8. The characters 32 to 127 and 160 to 255 (Latin-1) have glyphs, others are drawn as an
 * empty box; a line feed starts a new line below the first. Lines are 16 pixels high, characters 8 wide,
 * times the scale. Up to 64 glyphs are one draw, fewer where characters below and above 127 mix. Needs a
 * current GL context, except where a function says not.
 * ====================================================================================================== */

#ifdef QEX_UNPREFIXED_NAMES
/** The font sheet: RGBA8888, 256 x 48, first row first; 32 columns and 3 rows of cells 8 x 16 with the
 *  characters 32 to 127; white, alpha 0 or 255. */
QEX_API extern const uint8_t fontdata[49152];
#endif

/** Creates the font for a surface of that size in pixels; the engine's initialisation calls it.
 *  @return 0 (also when it exists already), or -1 when the shaders or memory cannot be had. */
QEX_API int32_t QexFont_Create(int32_t width, int32_t height);

/** Creates the font's program and texture, in place of those that there are; QexFont_Create calls it.
 *  @return 0, or -1, with the GL's reason in the log, when the program cannot be built. */
QEX_API int32_t QexFont_CreateShader(void);

/** Deletes the font's program and shaders. Until QexFont_CreateShader makes them again, text and textures on
 *  the screen are not drawn, which the log says once. @param ignored  not read */
QEX_API void QexFont_ReleaseShader(int32_t ignored);

/** Releases the font. @return the log call's result. */
QEX_API int32_t QexFont_Release(void);

/** Appends a string to the persistent text. Running out of memory ends the process with exit status 1; with
 * an error handler the string is left out and the result is 0. No GL context needed.
 *  @param context     the engine's context; its height is read
 *  @param x, y        pixels
 *  @param r, g, b, a  0 to 255
 *  @return the string's length in bytes; 0, with a line in the log, before the font is created. */
QEX_API int32_t QexFont_AddString(const QexRuntimeContext* context, int32_t x, int32_t y, const char* string,
                                  int32_t r, int32_t g, int32_t b, int32_t a);

/** Makes the persistent text this one string; as QexFont_AddString, but running out of memory leaves the text
 *  empty. */
QEX_API int32_t QexFont_ReplaceString(const QexRuntimeContext* context, int32_t x, int32_t y,
                                      const char* string, int32_t r, int32_t g, int32_t b, int32_t a);

/** Sets the size of the texts that are given from now on; those that there are keep theirs. QexFont_Create
 * sets it to 1. No GL context needed.
 *  @param scale  pixels of the screen for a pixel of the glyphs, above 0, at most 1000; whole numbers look
 * best
 *  @return 0; -1, and no change, for a scale out of range. */
QEX_API int32_t QexFont_SetScale(float scale);

/** Measures a string as it would be drawn now: its longest line and all its lines, one for "". No GL context
 *  needed.
 *  @param width, height  out, pixels; either may be null */
QEX_API void QexFont_MeasureString(const char* string, float* width, float* height);

/** Empties the persistent text. No GL context needed. */
QEX_API void QexFont_ClearString(void);

/** Draws the persistent text from the engine's own memory: no GL buffer may be bound. Leaves blending on
 *  (source alpha over), the depth function at less or equal, texture unit 3 active, or 0 where characters
 *  below and above 127 mix. */
QEX_API void QexFont_Draw(void);

/** Draws a string at once. The longest so far decides how much memory is kept for it. Leaves the state that
 * QexFont_Draw leaves.
 *  @param colour  0xAARRGGBB */
QEX_API void QexFont_DrawTempString(const QexRuntimeContext* context, int32_t x, int32_t y,
                                    const char* string, uint32_t colour);

/** Draws a number in decimal at once; as QexFont_DrawTempString. */
QEX_API void QexFont_DrawNum(const QexRuntimeContext* context, int32_t x, int32_t y, int32_t number,
                             uint32_t colour);

/* ======================================================================================================
 * Textures on the screen
 *
 * Images in pixels, drawn with the font's program: (x, y) is the upper left corner, y counts down from the
 * upper edge of the surface that the font was created for. Blending, depth test and culling are left as the
 * application set them, texture unit 3 is active; the arrays are the engine's own memory, so no buffer may be
 * bound to GL_ARRAY_BUFFER or GL_ELEMENT_ARRAY_BUFFER. Where there is no font yet, one is created.
 * ====================================================================================================== */

/** A rectangle of texels; top and bottom count down from the image's upper edge, right and bottom belong to
 * it. */
typedef struct QexRect {
    int32_t left, top, right, bottom;
} QexRect;

/** Draws a texture, or a part of it, texel by pixel at scale 1.
 *  @param texture    its filter and wrap stay as they are; null: the default texture, 65 / 64 pixels wide
 *  @param rectangle  the part to draw: right + 1 - left by bottom + 1 - top pixels at scale 1, onto which the
 *                    texels up to right - 1 and bottom - 1 are stretched; null: all of it, on one pixel more
 *                    each way
 *  @param colour     0xAARRGGBB, multiplies the texels
 *  @return 0; what the log call returns when there is no font and it cannot be created */
QEX_API int32_t QexTexture_Draw(const QexRuntimeContext* context, QexTexture* texture, float x, float y,
                                const QexRect* rectangle, float scaleX, float scaleY, uint32_t colour);

/** As QexTexture_Draw, with the red of a second texture as alpha.
 *  @param texture       its filter becomes QEX_FILTER_LINEAR; null: the default texture
 *  @param alphaTexture  sampled at the same coordinates; null: all opaque */
QEX_API int32_t QexTexture_Draw2(const QexRuntimeContext* context, QexTexture* texture,
                                 QexTexture* alphaTexture, float x, float y, const QexRect* rectangle,
                                 float scaleX, float scaleY, uint32_t colour);

/* ======================================================================================================
 * Pictures on the screen
 *
 * Images of a HUD from files. Texture files may begin with the picture's upper edge (`qex texture` as it is)
 * or with its lower one (`qex texture --flip`, `qex convert`, TGA) and say so in their header. GL and
 * QexTexture_Draw take the first row for the lower edge; a picture remembers, and stands upright either way.
 * Blending (QEX_BLEND_ALPHA for what is translucent), depth test and culling are left as the application sets
 * them.
 * ====================================================================================================== */

/** A picture. */
typedef struct QexPicture {
    QexTexture texture;
    QexTexture alpha;  /* from the second file, its red counts; glName 0 for none */
    uint32_t topFirst; /* 1: the first row is the upper edge */
} QexPicture;

/** Loads a picture from a PVR, KTX or TGA file, and its alpha from the file with "_a" before the extension if
 *  there is one, as `qex texture --format etc1` writes it. It is filtered linearly and clamped.
 *  @param picture  out; what it held is overwritten, not released
 *  @param path     not null; above 253 characters no second file is looked for
 *  @return 0; -1, with a line in the log and an empty picture, when it cannot be loaded. Needs a current GL
 *  context; release with QexPicture_Release. */
QEX_API int32_t QexPicture_Load(QexPicture* picture, const char* path);

/** Draws a picture, or a part of it, upright.
 *  @param context        its size is the screen's
 *  @param picture        loaded; null: a plain rectangle in the colour
 *  @param part           pixels of the picture, within it, right and bottom included; null: all of it
 *  @param x, y           upper left corner, pixels from the screen's upper left
 *  @param width, height  pixels on the screen, > 0; 0 both: as many as the picture or the part has
 *  @param colour         0xAARRGGBB, multiplied; 0xFFFFFFFF as it is
 *  @return 0; -1, with a line in the log and nothing drawn, without a context or for an empty picture, a part
 *  that is not within it, or no size. Needs a current GL context without bound buffers. */
QEX_API int32_t QexPicture_Draw(const QexRuntimeContext* context, QexPicture* picture, const QexRect* part,
                                float x, float y, float width, float height, uint32_t colour);

/** Releases a picture's textures and empties it. Needs a current GL context. @param picture  loaded, or
 *  zeroed; null does nothing */
QEX_API void QexPicture_Release(QexPicture* picture);

/* ======================================================================================================
 * Billboards
 *
 * A textured quad in the scene, turned by one of five modes. One texel of its texture is one unit wide and
 * high at scale 1. All billboards share one program, which lives from the first QexBillboard_Create to the
 * last QexBillboard_Release: an application whose emitters run empty in between keeps a billboard of its own,
 * so that it is not built anew in the middle of a frame. Needs a current GL context, except where a function
 * says not.
 * ====================================================================================================== */

/** Modes; with any other number the billboard has the rotation of its own (x, y, z) alone. */
#define QEX_BILLBOARD_SCREEN 1  /* faces the screen, unrotated */
#define QEX_BILLBOARD_UPRIGHT 2 /* faces the screen about its own up axis */
/* turned towards the eye in yaw, rotated about z, and tilted about the world's x axis by the eye's pitch: the
 * upper edge comes forward where the eye is above, so this mode is for eyes at about the same height */
#define QEX_BILLBOARD_CAMERA 3
#define QEX_BILLBOARD_YAW 4 /* turned towards the eye in yaw alone, then rotated about z */

/** A billboard. The application writes scale, rotation, position, mode and opacity directly. */
typedef struct QexBillboard {
    QexTexture* texture; /* image, the application's; alive as long as the billboard */
    float width;         /* of the texture, pixels */
    float height;
    float unitScale;  /* 1; not read */
    QexVec3 scale;    /* x and y multiply the size; z is not read */
    QexVec3 rotation; /* degrees about x, y and z, x first */
    QexVec3 position; /* centre, world space */
    int32_t mode;     /* QEX_BILLBOARD_... */
    float opacity;    /* multiplies the texture's alpha; products of 0.001 and less become 0 */
} QexBillboard;

#ifdef QEX_UNPREFIXED_NAMES
/** GL names of the shared program and its shaders, 0 while there is none. Read only. */
QEX_API extern uint32_t g_BillboardVShader;
QEX_API extern uint32_t g_BillboardFShader;
QEX_API extern uint32_t g_BillboardShaderProgramID;
/** Attribute locations of inVertex and inTexCoord. Read only. */
QEX_API extern int32_t g_BillboardInPosLoc;
QEX_API extern int32_t g_BillboardUVLoc;
/** Uniform locations of mvpMatrix, opacity, alphaThreshold and sTexture. Read only. */
QEX_API extern int32_t g_BillboardMvpMatrixLoc;
QEX_API extern int32_t g_BillboardOpacityLoc;
QEX_API extern int32_t g_BillboardAlphaThresholdLoc;
QEX_API extern int32_t g_BillboardTextureLoc;
/** Billboards created and not released. Read only. */
QEX_API extern int32_t g_BillboardCount;
/** The unit quad: four positions (x, y, z), texture coordinates (s, t), and the indices of its strip. */
QEX_API extern const float g_BB_Vertices[12];
QEX_API extern const float g_BB_UVs[8];
QEX_API extern const uint8_t g_BB_indices[4];
/** The directions (0, 1, 0) and (0, 0, 1), which building the program sets. */
QEX_API extern QexVec3 g_VecUp;
QEX_API extern QexVec3 g_VecNormal;
#endif

/** Creates a billboard in mode QEX_BILLBOARD_SCREEN at the origin, of scale 1 and opacity 1.
 *  @param texture  see QexBillboard.texture; null means the default texture
 *  @return the billboard, to be released with QexBillboard_Release, or null when memory runs out or the
 *  program cannot be built. */
QEX_API QexBillboard* QexBillboard_Create(QexTexture* texture);

/** Gives a billboard another image: its texture, width, height and unitScale change. No GL context needed.
 *  @param billboard  billboard; null does nothing
 *  @param texture    as for QexBillboard_Create */
QEX_API void QexBillboard_SetTexture(QexBillboard* billboard, QexTexture* texture);

/** Draws a billboard from the engine's own memory: no GL buffer may be bound. Blending and depth are the
 *  caller's. Leaves culling on and unit 0 active, and issues no GL error check of its own.
 *  @param billboard  billboard; null does nothing
 *  @param camera     eye, view and projection; null draws nothing */
QEX_API void QexBillboard_Draw(QexBillboard* billboard, const QexCamera* camera);

/** Releases a billboard; the last one deletes the program. The texture stays.
 *  @param billboard  not to be used afterwards; null does nothing */
QEX_API void QexBillboard_Release(QexBillboard* billboard);

QEX_END

#endif
