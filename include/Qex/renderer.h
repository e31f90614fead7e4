/* The context record, render state, renderer settings, stereo, shaders and programs. */
#ifndef QEX_RENDERER_H
#define QEX_RENDERER_H

#include "Qex/base.h"

QEX_BEGIN

/** The engine's context; the application allocates it, initialisation fills it. */
struct QexRuntimeContext {
    uint32_t startTime; /* what QexTime_Init returned */
    uint32_t windowWord1;
    uint32_t windowWord2;
    uint32_t windowWord3;
    uint32_t windowWord4;
    int32_t width; /* of the drawing surface, pixels */
    int32_t height;
    uint32_t windowWord7;
    uint32_t windowWord8;
    uint32_t reserved[2];   /* 0 */
    void* poolBlock;        /* the lent block as given */
    void* poolBase;         /* the same, rounded up to a multiple of 4 */
    uint32_t poolSize;      /* bytes from poolBase on */
    float stereoSeparation; /* pixels, see QexRenderer_EnableStereo3D */
    uint32_t stereoMode;    /* QEX_STEREO_... */
};

/* ======================================================================================================
 * Render state and renderer settings
 *
 * Every program change and every choice of a texture unit goes through a small cache, so that one that
 * changes nothing reaches no GL. An application that calls glUseProgram or glActiveTexture itself must use
 * the functions here instead, or call QexRenderState_Reset afterwards. Needs a current GL context.
 * ====================================================================================================== */

/** The cache. */
typedef struct QexRenderState {
    uint32_t boundTexture;  /* 0 after reset, all bits set after a change of the unit; binds are not cached */
    uint32_t activeTexture; /* GL_TEXTURE0 + n, or all bits set: unknown */
    uint32_t currentProgram; /* GL program, or all bits set: unknown */
} QexRenderState;

/** The process-wide cache. */
QEX_API extern QexRenderState g_QexCachedRenderStates;
/** Multiplies the opacity of everything that the shader modules draw; 1.0 at first. Set it with
 *  QexRenderer_SetGlobalAlpha. */
QEX_API extern float g_fQexGlobalAlpha;
#ifdef QEX_UNPREFIXED_NAMES
/** Alpha-test reference for the application; 0.95 at first. The engine does not read it. */
QEX_API extern float g_fAlphaTestCmpValue;
/** Specular switch for the application; 0 at first. The engine does not read it. */
QEX_API extern uint32_t g_bSpecularOn;
#endif

/** Forgets what is cached, so that the next choices reach GL; in lean drawing, everything that is known of
 * the GL. To be called after GL calls of the application's own.
 *  @param context  not read, may be null */
QEX_API void QexRenderState_Reset(QexRuntimeContext* context);

/** Makes a GL program current unless it is. @param program  GL name, 0 for none */
QEX_API void QexRenderState_UseProgram(uint32_t program);

/** Makes a texture unit active unless it is. @param unit  GL_TEXTURE0 + n */
QEX_API void QexRenderState_ActiveTexture(uint32_t unit);

/** Binds a texture on the active unit; in lean drawing only where it is not bound already.
 *  @param target  GL_TEXTURE_2D or GL_TEXTURE_CUBE_MAP
 *  @param name    GL name, 0 for none */
QEX_API void QexRenderState_Bind(uint32_t target, uint32_t name);

/* ---- Lost contexts ----
 *
 * A GL context may be lost: Android takes it from an application in the background, a browser from a page, a
 * driver after a fault. All GL objects are gone then. QexEngine_ContextLost tells the engine so, and
 * QexEngine_ContextRestored, called first of all in another context that shares nothing with others, makes
 * everything again: records, handles and pointers stay as they are, and the next frame is the one that would
 * have been drawn. Buffers come from the scenes in memory; textures from the files that they came from, from
 * copies (QexEngine_KeepTextures), or from the application (QexEngine_SetTextureSource). Contents of render
 * targets are gone. GL objects, parameters and state that the application made itself are its own affair, as
 * are programs from QexShader_CreateProgram.
 *
 * A loss that the GL tells of by an error (GL_CONTEXT_LOST) is not taken for a fault: it is logged, and
 * errors are not looked at until the context is restored.
 */

/** Forgets every GL object, without a GL call. Records may be released meanwhile; nothing can be made. */
QEX_API void QexEngine_ContextLost(void);

/** Makes everything again in the current context, in which no other GL object was made yet. Leaves no
 * program, buffer or vertex array object bound, and unit 0 active.
 *  @return 0, also when nothing was lost; -1, with lines in the log, when something could not be made: that
 *  is not drawn; or when the context was lost again: call this again in the next one. */
QEX_API int32_t QexEngine_ContextRestored(void);

/** The same a few milliseconds at a time, so that an application may show that it goes on: to be called until
 *  it gives another result than 1. Until then models are not drawn, nor what has no program again yet;
 * records may be made and released.
 *  @param milliseconds  after which no other piece is begun: a block of 128 kB, a mip level, a program
 *  @param progress      out, how far the parts of the engine are, 0 to 1, or null
 *  @return 1 when there is more to do, else QexEngine_ContextRestored's result, which does the rest at once
 */
QEX_API int32_t QexEngine_ContinueRestore(float milliseconds, float* progress);

/** @return 1 from a loss, told or found, until the context is restored, else 0. */
QEX_API uint32_t QexEngine_IsContextLost(void);

/** Whether textures made from memory from now on (pixels, and images whose length is given) keep a copy of
 * it, from which they can be made again. 0 at first.
 *  @return the setting before */
QEX_API int32_t QexEngine_KeepTextures(int32_t keeps);

/** Makes a texture again that came from memory of which no copy was kept.
 *  @param user     as given with the function
 *  @param name     the texture's GL name, as in its record
 *  @param texture  an empty record: load the texture into it, with any function
 *  @return 0, or anything else when that failed */
typedef int32_t (*QexTextureSource)(void* user, uint32_t name, struct QexTexture* texture);

/** Sets who is asked for such textures. @param source  null: nobody, they have no image then */
QEX_API void QexEngine_SetTextureSource(QexTextureSource source, void* user);

/* ---- Ways of drawing ----
 *
 * Described drawing makes the GL calls that each function's description names: it reads the GL's error after
 * nearly all of them and unbinds what it has bound. Lean drawing draws the same pictures, to within 1/255,
 * with as few calls as there can be: it reads no errors, makes no call that changes nothing, sends what all
 * nodes of a call share once, leaves out nodes outside the view, and draws opaque nodes that follow each
 * other in the order that changes least. Opaque is every node while GL does not blend; while it does, one
 * whose opacity and the global alpha are 1 and whose alpha does not come from a texture. Where faces of two
 * such nodes coincide, either may be seen. Without depth test or depth writes, or with a depth function that
 * QexRenderer_SetZTestFunc made another than QEX_DEPTH_LESS and QEX_DEPTH_LESS_EQUAL, nodes keep the scene's
 * order.
 *
 * During a lean draw GL reads nothing of the application's memory: text, pictures, billboards, particle sets
 * and the water's plane go through buffers, and standing text that did not change is not sent again. The
 * passes of shadow and depth draw lean as well.
 *
 * After a lean draw, program, textures, vertex array object, attribute arrays and buffers stay as the draw
 * left them. An application that makes GL calls of its own says QexRenderState_Restore before them, which
 * leaves no vertex array object, no enabled array and no buffer bound, and QexRenderState_Reset after them.
 * Application modules and models with a texture hook are drawn in the described way, without the errors; what
 * a hook or a module changed in GL is taken to be unknown after it, as if it had called QexRenderState_Reset.
 */

/** Ways of drawing. */
#define QEX_DRAWING_DESCRIBED 0 /* at first */
#define QEX_DRAWING_LEAN 1

/** Chooses the way of drawing from now on. Another number changes nothing. Needs a current GL context: going
 *  back to described drawing deletes buffers that lean drawing shared. @return the way before. */
QEX_API int32_t QexRenderer_SetDrawing(int32_t drawing);
/** @return the way of drawing, QEX_DRAWING_... */
QEX_API int32_t QexRenderer_GetDrawing(void);

/** Before GL calls of the application's own in lean drawing: leaves no vertex array object, no attribute
 * array enabled and no buffer bound, as described drawing does after every draw, where this does nothing. */
QEX_API void QexRenderState_Restore(void);

/** Reads the GL's error once, as described drawing does after each call: a pending one is logged and ends the
 *  process. For lean drawing, once a frame. */
QEX_API void QexRenderer_CheckErrors(void);

/** Whether lean drawing uses vertex array objects (GL_OES_vertex_array_object) where the GL has them; 1 at
 * first. Some drivers forget a vertex array object's index buffer: pictures with missing or torn meshes go
 * away with 0. */
QEX_API void QexRenderer_AllowVertexArrays(int32_t allowed);

/** Finds a GL function by name, null when there is none. */
typedef void* (*QexGetProcAddress)(const char* name);

/** Where functions beyond OpenGL ES 2.0 are looked up: eglGetProcAddress, SDL_GL_GetProcAddress and the like.
 *  Without one, or with null, the process's own symbols and its eglGetProcAddress are asked. */
QEX_API void QexRenderer_SetGetProcAddress(QexGetProcAddress function);

/** Depth functions: how a pixel's depth has to compare with the one that is there for it to be drawn. */
#define QEX_DEPTH_NEVER 0
#define QEX_DEPTH_LESS 1
#define QEX_DEPTH_EQUAL 2
#define QEX_DEPTH_LESS_EQUAL 3 /* what scenes want */
#define QEX_DEPTH_GREATER 4
#define QEX_DEPTH_NOT_EQUAL 5
#define QEX_DEPTH_GREATER_EQUAL 6
#define QEX_DEPTH_ALWAYS 7 /* what text and pictures over a scene want */

/** Culling modes: the faces that are left out. The corners of a front face run counter-clockwise. */
#define QEX_CULL_NONE 0
#define QEX_CULL_BACK 1
#define QEX_CULL_FRONT 2
#define QEX_CULL_BOTH 3

/** Blending modes: what becomes of the colour that is there. */
#define QEX_BLEND_NONE 0      /* replaced */
#define QEX_BLEND_ALPHA 1     /* covered as far as the new one's alpha says */
#define QEX_BLEND_ADD_ALPHA 2 /* the new one times its alpha is added */
#define QEX_BLEND_ADD 3       /* the new one is added */

/** As alphaMode of QexRenderer_SetAlphaBlendModeSeparate: the alpha that is there stays. */
#define QEX_BLEND_KEEP_ALPHA 0

/** Blend factors of QexRenderer_SetBlendFactor, GL's own. */
#define QEX_FACTOR_ZERO 0x0000u
#define QEX_FACTOR_ONE 0x0001u
#define QEX_FACTOR_SRC_COLOR 0x0300u
#define QEX_FACTOR_ONE_MINUS_SRC_COLOR 0x0301u
#define QEX_FACTOR_SRC_ALPHA 0x0302u
#define QEX_FACTOR_ONE_MINUS_SRC_ALPHA 0x0303u
#define QEX_FACTOR_DST_ALPHA 0x0304u
#define QEX_FACTOR_ONE_MINUS_DST_ALPHA 0x0305u
#define QEX_FACTOR_DST_COLOR 0x0306u
#define QEX_FACTOR_ONE_MINUS_DST_COLOR 0x0307u
#define QEX_FACTOR_SRC_ALPHA_SATURATE 0x0308u

/** Enables the depth test and sets its function.
 *  @param mode  QEX_DEPTH_...; any other keeps the function */
QEX_API void QexRenderer_SetZTestFunc(uint32_t mode);

/** Switches depth writes. @param flag  0 off, any other on */
QEX_API void QexRenderer_SetZWrite(int32_t flag);

/** Sets face culling. @param mode  QEX_CULL_...; any other is ignored */
QEX_API void QexRenderer_SetBackFaceCulling(int32_t mode);

/** Sets GL's blend factors without enabling blending. @param source, destination  QEX_FACTOR_... */
QEX_API void QexRenderer_SetBlendFactor(uint32_t source, uint32_t destination);

/** Sets blending. @param mode  QEX_BLEND_NONE to QEX_BLEND_ADD; any other is ignored */
QEX_API void QexRenderer_SetAlphaBlendMode(int32_t mode);

/** Sets blending apart for colour and alpha.
 *  @param mode       as QexRenderer_SetAlphaBlendMode
 *  @param alphaMode  QEX_BLEND_ALPHA to QEX_BLEND_ADD likewise for the alpha channel; any other is
 *                    QEX_BLEND_KEEP_ALPHA */
QEX_API void QexRenderer_SetAlphaBlendModeSeparate(int32_t mode, uint32_t alphaMode);

/** Sets g_fQexGlobalAlpha. @return the value before. No GL context needed. */
QEX_API float QexRenderer_SetGlobalAlpha(float alpha);

/** Sets g_fAlphaTestCmpValue. No GL context needed. */
QEX_API void QexRenderer_SetAlphaTestCmpValue(float value);

/** Sets g_bSpecularOn. No GL context needed. */
QEX_API void QexRenderer_EnableSpecular(uint32_t flag);

/** Draws triangles from the bound element array buffer of 16-bit indices, from its start.
 *  @param ignored  not read
 *  @param count    indices */
QEX_API void QexRenderer_Draw(uint32_t ignored, int32_t count);

/* ======================================================================================================
 * Stereo
 *
 * A frame for two eyes: QexRenderer_PrepareLeft, draw, QexRenderer_PrepareRight, draw again (from a camera
 * moved aside, if the application likes), QexRenderer_FinishStereo3D. Either both eyes use the whole surface,
 * kept apart by colour and shifted by the separation, or each has one half. Clears obey the depth mask: leave
 * writing of depth on. These three functions need a current GL context, the settings do not.
 * ====================================================================================================== */

/** Stereo modes; in another, as in QEX_STEREO_OFF, the eyes are not told apart. */
#define QEX_STEREO_OFF 0
#define QEX_STEREO_RED_BLUE 1     /* left eye red, right eye blue */
#define QEX_STEREO_RED_CYAN 2     /* left eye red, right eye green and blue */
#define QEX_STEREO_SIDE_BY_SIDE 3 /* left eye on the left half, right eye on the right */

/** Sets mode and separation; they stay until changed.
 *  @param mode        QEX_STEREO_...
 *  @param separation  pixels by which the left eye's picture moves to the left and the right eye's to the
 * right, in the colour modes; cut towards 0 to whole pixels; what is no number, or 65536 and more, counts as
 * 0
 *  @return 0. */
QEX_API int32_t QexRenderer_EnableStereo3D(QexRuntimeContext* context, uint32_t mode, float separation);

/** Sets the separation alone; see QexRenderer_EnableStereo3D. */
QEX_API void QexRenderer_SetDepthSeperation(QexRuntimeContext* context, float separation);

/** Sets the mode QEX_STEREO_OFF. */
QEX_API void QexRenderer_DisableStereo3D(QexRuntimeContext* context);

/** Clears colour and depth, in every mode, and sets colour mask and viewport for the left eye. Of a surface
 *  of an odd width, the last column belongs to neither half. */
QEX_API void QexRenderer_PrepareLeft(const QexRuntimeContext* context);

/** Clears the depth and sets colour mask and viewport for the right eye; does nothing in QEX_STEREO_OFF. */
QEX_API void QexRenderer_PrepareRight(const QexRuntimeContext* context);

/** Sets the whole colour mask and the viewport of the whole surface, in every mode. */
QEX_API void QexRenderer_FinishStereo3D(const QexRuntimeContext* context);

/* ======================================================================================================
 * Shaders and programs
 *
 * From GLSL ES 1.00 text to a linked program. Needs a current GL context.
 * ====================================================================================================== */

/** Compiles a shader.
 *  @param shader  out, the GL shader object, which exists even when compiling fails
 *  @param source  GLSL ES text
 *  @param type    GL_VERTEX_SHADER or GL_FRAGMENT_SHADER
 *  @return 0, or -1 when it does not compile (nothing is printed). */
QEX_API int32_t QexShader_Create(uint32_t* shader, const char* source, uint32_t type);

/** Compiles a shader with "#define NAME" lines in front.
 *  @param defines      the names, may be null when there are none
 *  @param defineCount  their number
 *  @return as QexShader_Create; -1, with a line in the log and no shader object (0), when lines, text and the
 *  closing NUL exceed 4,096 bytes. */
QEX_API int32_t QexShader_CreateFromMemEx(uint32_t* shader, const char* source, uint32_t type,
                                          const char* const* defines, uint32_t defineCount);

/** QexShader_CreateFromMemEx on the contents of a file.
 *  @return as that, or -1 (with a line printed) when the file cannot be read. */
QEX_API int32_t QexShader_CreateFromFileEx(uint32_t* shader, const char* path, uint32_t type,
                                           const char* const* defines, uint32_t defineCount);

/** Loads a precompiled shader with glShaderBinary; a GL error is fatal.
 *  @param length  bytes of binary
 *  @param format  GL binary format
 *  @return 0. */
QEX_API int32_t QexShader_CreateWithBinary(uint32_t* shader, const void* binary, int32_t length,
                                           uint32_t format, uint32_t type);

/** Size of the log buffer of QexShader_CreateProgram, in bytes. */
#define QEX_SHADER_LOG_SIZE 256

/** Links a program and makes it current.
 *  @param program         out, the GL program object, which exists even when linking fails
 *  @param attributes      names bound to the attribute indices 0, 1, ...; may be null when the count is 0
 *  @param attributeCount  their number; 0 or less binds none
 *  @param log             QEX_SHADER_LOG_SIZE bytes that receive the link log (cut to fit, empty when linking
 *                         succeeds), or null
 *  @return 0, or -1 when linking fails. */
QEX_API int32_t QexShader_CreateProgram(uint32_t* program, uint32_t vertexShader, uint32_t fragmentShader,
                                        const char* const* attributes, int32_t attributeCount, char* log);

/** Types of QexShaderProgram. */
#define QEX_PROGRAM_TEXTURE_COLOUR 1 /* attributes 0 inVertex, 1 inNormal, 2 inColor, 3 inTexCoord */
#define QEX_PROGRAM_TEXTURE_LIGHT 2  /* attributes 0 inVertex, 1 inNormal, 2 inTexCoord */

/** A ready-made program for geometry that the application draws itself: textured and vertex-coloured, or
 *  textured and lit by one directional light. Its texture is on unit 0; the application sets the uniforms. */
typedef struct QexShaderProgram {
    uint32_t type;             /* QEX_PROGRAM_..., as given to create */
    uint32_t program;          /* GL program */
    int32_t mvpMatrixLoc;      /* "MVPMatrix", mat4 */
    int32_t lightDirectionLoc; /* "LightDirection", vec3 in object space (QEX_PROGRAM_TEXTURE_LIGHT) */
    int32_t lightColorLoc;     /* "LightColor", vec3 (QEX_PROGRAM_TEXTURE_LIGHT) */
    int32_t globalAlphaLoc;    /* "GlobalAlpha", float (QEX_PROGRAM_TEXTURE_LIGHT) */
} QexShaderProgram;

/** Creates a ready-made program.
 *  @param record  out; its type is stored even when it is not one
 *  @param type    QEX_PROGRAM_TEXTURE_COLOUR or QEX_PROGRAM_TEXTURE_LIGHT
 *  @return 0, or -1 for another type. The shaders of the last created record belong to all of them: releasing
 *  any record deletes them, which harms no linked program. */
QEX_API int32_t QexShaderProgram_Create(QexShaderProgram* record, uint32_t type);

/** Makes the record's program current, or none. @param record  may be null: program 0 */
QEX_API void QexShaderProgram_Apply(const QexShaderProgram* record);

/** Deletes the record's program, then the shaders of the last created one. The record keeps its values. */
QEX_API void QexShaderProgram_Release(QexShaderProgram* record);

/** Numbers of the built-in shader modules. */
typedef enum QexShaderKind {
    QEX_SHADER_TEXTURE = 1,
    QEX_SHADER_TEXTURE_NOALPHA = 2,
    QEX_SHADER_UV_DISPLACEMENT = 3,
    QEX_SHADER_GOURAUD = 7,
    QEX_SHADER_GOURAUD_SHADOW = 8,
    QEX_SHADER_GOURAUD_NORMALMAP = 9,
    QEX_SHADER_GOURAUD_SPECULAR = 10,
    QEX_SHADER_SKINNING_TEXTURE = 11,
    QEX_SHADER_SKINNING_GOURAUD = 12,
    QEX_SHADER_SKINNING_GOURAUD_NORMALMAP = 13,
    QEX_SHADER_SKINNING_GOURAUD_SPECULAR = 14,
    QEX_SHADER_SKINNING_TEXTURE_NOALPHA = 16,
    QEX_SHADER_GOURAUD_SHADOW_EXT = 17
} QexShaderKind;

/** Creates a built-in shader module by number.
 *  @param kind  a QexShaderKind
 *  @return the module, owned by the caller until QexShaders_ReleaseShaderProgram; null when there is none of
 *  that number in this build. */
QEX_API QexShaderModule* QexShaders_CreateShaderProgram(uint32_t kind);

/** Releases a module by number. The caller's pointer is not cleared.
 *  @param module  may be null: nothing happens
 *  @param kind    the number it was created with; another value does nothing */
QEX_API void QexShaders_ReleaseShaderProgram(QexShaderModule* module, uint32_t kind);

/** @return the module's alpha threshold, 0.0 for a null module or an unknown number. */
QEX_API float QexShaders_GetShaderAlphaThreshold(QexShaderModule* module, uint32_t kind);

/** Sets the module's alpha threshold; ignored for a null module or an unknown number. */
QEX_API void QexShaders_SetShaderAlphaThreshold(QexShaderModule* module, uint32_t kind, float threshold);

/** Reads the texture-coordinate shift of a QEX_SHADER_UV_DISPLACEMENT module; other kinds write nothing. */
QEX_API void QexShaders_GetShaderUVDisplacement(QexShaderModule* module, uint32_t kind, float* u, float* v);

/** Sets the texture-coordinate shift of a QEX_SHADER_UV_DISPLACEMENT module; other kinds are ignored. */
QEX_API void QexShaders_SetShaderUVDisplacement(QexShaderModule* module, uint32_t kind, float u, float v);

QEX_END

#endif
