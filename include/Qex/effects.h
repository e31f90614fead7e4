/* Sky box and water, particles, post-processing. */
#ifndef QEX_EFFECTS_H
#define QEX_EFFECTS_H

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/overlay.h"
#include "Qex/textures.h"

QEX_BEGIN

/* ======================================================================================================
 * Sky box and water
 *
 * A sky from a cube map around the camera and, on demand, water at a fixed height out to the horizon. The
 * application describes both in a record and draws its own scene in a callback; QexSkyBox_Update draws the
 * frame in up to four passes: the scene mirrored, into a texture of 256 x 256 pixels; the water's surface,
 * which is that texture distorted by waves, into another one; scene and sky as they are; the water over them,
 * with the second texture. There is one sky box a process. Needs a current GL context, except where a
 * function says not.
 *
 * The sky: in direction d of the world the cube map is looked up at -d. What is to be seen towards +X is the
 * image of face -X, turned by half a turn, and so on for each axis: each face shows, unmirrored, the picture
 * that one sees from inside, its first row the lower edge and each row from right to left. Upright is +Y; the
 * pictures above and below continue the one towards -Z.
 *
 * The sky's corners are size * 0.87 from its centre; beyond the far plane they are cut off. Water outside of
 * the sky's cube is hidden by it: the horizon is where the two meet. A centre that follows the eye keeps the
 * sky at its distance.
 *
 * The water: its normal map repeats 833 and 2000 units apart, in two layers, and shifts the reflection by 30
 * units times the normal over the distance. A scene of a few units is to be scaled up, or its waves are flat
 * and its reflection torn: it looks best without a normal map. The waves stand still.
 * ====================================================================================================== */

struct QexSkyBox;

/** Draws the application's scene, with culling and depth as set; afterwards the engine draws the sky, over
 * what wrote no depth. Where blending leaves alpha below 1 in the reflection, water that is drawn with
 * blending on is translucent. Unit 1 may still have the reflection's texture bound.
 *  @param skyBox      the record given to QexSkyBox_Update
 *  @param view        view matrix; in the reflection mirrored in the water, so that front faces turn
 * clockwise and QexRenderer_SetBackFaceCulling(2), set before, hides back faces
 *  @param projection  projection matrix; in the reflection its near plane lies 2.5 units under the water */
typedef void (*QexSkySceneCallback)(struct QexSkyBox* skyBox, const QexMatrix* view,
                                    const QexMatrix* projection);

/** A sky box. The application fills it and keeps it, with all that it points at, until QexSkyBox_Release. */
typedef struct QexSkyBox {
    QexTexture* skyTexture;         /* cube map, not null */
    QexTexture* waterNormalTexture; /* 2 * colour - 1 is the normal: across in red and blue (x and z), up in
                                       green; repeated. Null: the water is smooth */
    float size;                     /* edge of the sky's cube */
    int32_t waterEnabled;           /* 1: with water; any other value: sky alone */
    float waterColour[4];           /* red, green and blue become the GL's clear colour in QexSkyBox_Create */
    QexVec3 centre;                 /* of the sky's cube */
    QexCamera* camera;              /* eye, target, up, fov, aspect, nearPlane, farPlane; its matrices are not
                                       read. Not null */
    int32_t reserved[4];            /* not read */
    float waterHeight;              /* d of the plane y + d = 0: the negative of the height. Read by
                                       QexSkyBox_Create */
    QexSkySceneCallback drawScene;  /* called once with, once without the mirror; null: no scene */
} QexSkyBox;

/** A program that shows a texture by texture coordinates. */
typedef struct QexTex2DShader {
    uint32_t program;     /* GL name, 0 while there is none */
    int32_t mvpMatrixLoc; /* "MVPMatrix" */
} QexTex2DShader;

#ifdef QEX_UNPREFIXED_NAMES
/** One for the application's use: attributes 0 inVertex, 1 inNormal, 2 inTexCoord, the texture on unit 0.
 * Read only. */
QEX_API extern QexTex2DShader m_Tex2DShader;
#endif

/** A program that shows a texture by the pixel's place on the screen. */
typedef struct QexPlaneTexShader {
    uint32_t program;         /* GL name, 0 while there is none */
    int32_t mvpMatrixLoc;     /* "MVPMatrix" */
    int32_t rcpWindowSizeLoc; /* "RcpWindowSize" */
} QexPlaneTexShader;

#ifdef QEX_UNPREFIXED_NAMES
/** The one that draws the water: attribute 0 inVertex, the texture on unit 0. Read only. */
QEX_API extern QexPlaneTexShader m_PlaneTexShader;
#endif

/** Makes the sky's cube: six faces of four vertices, each a triangle strip, in the order -Z, +X, +Z, -X, +Y,
 *  -Y. Both arrays are freed by the caller with QexMemory_Free. No GL context needed.
 *  @param scale        half the edge
 *  @param inset        not 0: texture coordinates keep four texels from the edge, 0: they are 0 and 1
 *  @param textureSize  texels along an edge, read for the inset alone
 *  @param vertices     out, 24 positions of three floats; null does nothing
 *  @param texCoords    out, 24 texture coordinates of two floats; null does nothing. Both results are null,
 *                      with a line in the log, when memory runs out */
QEX_API void QexSky_NewVertices(float scale, int32_t inset, int32_t textureSize, float** vertices,
                                float** texCoords);

/** Makes everything that sky and water need; what an earlier call made is released first. The framebuffer
 *  stays bound; depth test (mode 3), depth writing, culling of back faces and blending (mode 1) are on
 *  afterwards. Where a program does not link, a line says so, and Update does nothing.
 *  @param skyBox  record, filled; size, waterHeight and the sky texture's width count as they are now
 *  @return 0; -1, with a line in the log, for null, without camera or sky texture, when memory runs out, or
 *  when the GL cannot draw into 256 x 256 pixels. QexSkyBox_Release frees what there is then. */
QEX_API int32_t QexSkyBox_Create(QexSkyBox* skyBox);

/** Draws a frame: scene, sky and water. Neither clears the screen nor allocates. Sky alone leaves framebuffer
 *  and viewport untouched. Water prints one line on standard output, "T0:..., S0:..., T1:..., S1:...", binds
 *  units 0 to 2, and sets the viewport to the screen's size, depth test to mode 3, depth writing on and
 * culling to back faces; the framebuffer stays bound. A camera that sees no water, or is under it, gets none,
 * but the reflection is drawn all the same. The scissor test has to be off, as it would cut the textures of
 * 256 x 256.
 *  @param context  its size is the screen's; null draws nothing
 *  @param skyBox   the record; null, or without camera or sky texture, draws nothing, as before a
 *                  QexSkyBox_Create that gave 0
 *  @param value    not read */
QEX_API void QexSkyBox_Update(const QexRuntimeContext* context, QexSkyBox* skyBox, int32_t value);

/** Deletes what QexSkyBox_Create made, after a failure too; otherwise, and the second time, nothing. The
 *  record and what it points at stay. */
QEX_API void QexSkyBox_Release(void);

/* ======================================================================================================
 * Particles: sets and emitters
 *
 * A set is a batch of point sprites that the vertex shader moves: the application fills the buffer, triggers
 * the set, and updates and draws it every frame until its duration has passed. An emitter spawns particles at
 * random, moves them on the CPU and draws each as a billboard. Random numbers come from GetRandomNumber.
 * ====================================================================================================== */

/** A particle of a set, which lies at startPosition + time * velocity + the set's centerPosition. */
typedef struct QexParticleSetEntry {
    float lifetime;        /* seconds, > 0; fades and shrinks until then, and does not show later */
    QexVec3 velocity;      /* units a second */
    QexVec3 startPosition; /* model space */
} QexParticleSetEntry;

/** A particle set; the application allocates it, QexParticleSet_Create fills it. */
typedef struct QexParticleSet {
    QexTexture* texture; /* sprite, or null for the default texture; the application's */
    QexTexture*
        alphaTexture; /* its red channel multiplies alpha, and leaves out what is <= 0.004; likewise */
    QexParticleSetEntry* buffer; /* count entries, the set's */
    uint32_t count;              /* particles */
    float pointSize;             /* pixels across at time 0; see QexParticleSet_Create */
    float duration;              /* seconds after which the set stops */
    QexVec4 startColor;          /* RGBA at time 0, (1, 1, 1, 1) at first */
    QexVec4 endColor;            /* RGBA at the end of a lifetime, (1, 1, 1, 1) at first */
    QexVec3 centerPosition;      /* added to every position, 0 at first */
    QexMatrix mvpMatrix;         /* of the last update */
    float time;                  /* seconds since the trigger */
    uint32_t active;             /* 1 while running */
    /* called as onFinished(set, 1, 0) when the duration is reached, may be null; may trigger the set again or
     * release it */
    void (*onFinished)(struct QexParticleSet* set, int32_t finished, int32_t zero);
} QexParticleSet;

/** Creates a set. Needs a current GL context. The point size is kept in the program that all sets share, so
 *  that the set created last decides it for all.
 *  @param set           out, cleared first, so that a set which is to be made anew is released before; null
 * is refused
 *  @param texture       see QexParticleSet
 *  @param alphaTexture  see QexParticleSet
 *  @param count         particles; their entries are 0 until the application fills them
 *  @param pointSize     pixels, >= 0
 *  @param duration      seconds
 *  @return 0, or -1 when the shared program cannot be built or memory runs out; the set is inert then. */
QEX_API int32_t QexParticleSet_Create(QexParticleSet* set, QexTexture* texture, QexTexture* alphaTexture,
                                      uint32_t count, float pointSize, float duration);

/** Gives the entries of a set to fill. No GL context needed.
 *  @param buffer  out, valid until the set's release; may be null
 *  @param count   out, number of entries; may be null
 *  @return 0, or -1, with nothing written, when the set is null or has no buffer. */
QEX_API int32_t QexParticleSet_GetBuffer(QexParticleSet* set, QexParticleSetEntry** buffer, uint32_t* count);

/** Starts a set, or starts it again. No GL context needed. @param set  null or released: does nothing */
QEX_API void QexParticleSet_Trigger(QexParticleSet* set);

/** Moves a running set on, or ends it when its time reaches the duration. Needs a current GL context.
 *  @param set      null or not running: does nothing
 *  @param elapsed  seconds since the last update
 *  @param camera   view and projection, not null
 *  @param model    the set's model matrix; null means the identity */
QEX_API void QexParticleSet_Update(QexParticleSet* set, float elapsed, const QexCamera* camera,
                                   const QexMatrix* model);

/** Draws a running set from its own memory: no GL buffer may be bound. Blending is the caller's. Leaves the
 *  depth test on (less or equal) with depth writes on, and unit 3 active. Needs a current GL context.
 *  @param set  null or not running: does nothing */
QEX_API void QexParticleSet_Draw(QexParticleSet* set);

/** Frees a set's buffer; the last set deletes the program. Needs a current GL context.
 *  @param set  stays the application's; null or already released: does nothing */
QEX_API void QexParticleSet_Release(QexParticleSet* set);

/** Slots of an emitter, and how many particles live at most. */
#define QEX_EMITTER_SLOTS 300
#define QEX_EMITTER_MAX_PARTICLES 299
#define QEX_EMITTER_MAX_COLORS 10
#define QEX_EMITTER_MAX_ANIMATIONS 10
#define QEX_ANIMATION_MAX_FRAMES 10
/** Bytes of an emitter file, and of QexParticleEmitter on 32-bit targets. */
#define QEX_EMITTER_FILE_SIZE 45304

/** A texture animation of an emitter. */
typedef struct QexParticleAnimation {
    QexTexture* frames[QEX_ANIMATION_MAX_FRAMES]; /* the application's; null means the default texture */
    int32_t frameCount;                           /* frames in use, 0 to 10 */
    float frameDuration;                          /* seconds */
    int32_t loop;                                 /* 0 holds the last frame, others go back to the first */
} QexParticleAnimation;

/** A particle of an emitter. */
typedef struct QexParticleEx {
    int32_t active;                  /* 1 while it lives */
    float age;                       /* seconds */
    float lifetime;                  /* seconds; negative: endless */
    QexVec4 color;                   /* RGBA, for the application: drawing does not read it */
    float opacity;                   /* at present */
    float startOpacity;              /* at age 0 */
    float endOpacity;                /* at the end of the lifetime */
    QexVec3 scale;                   /* of the billboard */
    float scaleFactor;               /* multiplies the scale at every update */
    QexVec3 rotation;                /* degrees about x, y and z */
    QexVec3 angularVelocity;         /* degrees a second */
    QexVec3 angularAcceleration;     /* degrees a second, a second */
    QexVec3 position;                /* world space */
    QexVec3 velocity;                /* units a second */
    QexVec3 acceleration;            /* units a second, a second */
    QexParticleAnimation* animation; /* entry of its emitter */
    int32_t frame;                   /* of the animation, at present */
    float frameAge;                  /* age at the last change of frame */
    QexBillboard* billboard;         /* the particle's; null draws nothing */
    uint32_t spare;                  /* not read */
} QexParticleEx;

/** An emitter; the application writes the settings directly. Where a minimum is below its maximum, particles
 *  draw a value between them at random; otherwise they take the minimum. After the semicolon: the default. */
typedef struct QexParticleEmitter {
    int32_t emitting;      /* 1 while new particles are spawned; 1 at first */
    float emitDuration;    /* seconds left to emit, 0 stops at the next update, negative never; -1 */
    float emissionRate[2]; /* particles an update, minimum and maximum; 0.5, 0.8 */
    float lifetime[2];     /* seconds, minimum and maximum, negative for endless; 5, 6 */
    QexVec4 colors[QEX_EMITTER_MAX_COLORS]; /* RGBA, one of them for each particle; the first (1, 1, 1, 1) */
    int32_t colorCount;                     /* colours in use, 1 to 10; 1 */
    float startOpacity;                     /* 1 */
    float endOpacity;                       /* 0 */
    QexVec3 scaleMin;                       /* (1, 1, 1) */
    QexVec3 scaleMax;                       /* (1, 1, 1) */
    float scaleFactor;                      /* at every update; 1 */
    QexVec3 rotationMin;                    /* degrees about x, y and z; 0 */
    QexVec3 rotationMax;
    QexVec3 angularVelocityMin; /* degrees a second; 0 */
    QexVec3 angularVelocityMax;
    QexVec3 angularAccelerationMin; /* degrees a second, a second; 0 */
    QexVec3 angularAccelerationMax;
    QexVec3 position;        /* of the emitter; 0 */
    QexVec3 positionSpread;  /* plus or minus, for each axis where it is above 0; 0 */
    QexVec3 velocityMin;     /* units a second; (-80, 300, -80) */
    QexVec3 velocityMax;     /* (80, 400, 80) */
    QexVec3 accelerationMin; /* units a second, a second; (0, -98, 0) */
    QexVec3 accelerationMax; /* (0, -98, 0) */
    QexParticleAnimation animations[QEX_EMITTER_MAX_ANIMATIONS]; /* one of them for each particle */
    int32_t animationCount;                     /* animations in use, 1 to 10; 1, of the default texture */
    QexParticleEx particles[QEX_EMITTER_SLOTS]; /* the living ones come first, in order of age */
    int32_t particleCount;                      /* living particles, 0 to 299 */
    float currentRate;                          /* particles an update, drawn from emissionRate */
    float accumulator;                          /* particles due, below 1 after an update */
} QexParticleEmitter;

/** Creates an emitter of the defaults that its fields name. No GL context needed.
 *  @return the emitter, to be released with QexParticleEmitter_Release, or null when memory runs out. */
QEX_API QexParticleEmitter* QexParticleEmitter_Create(void);

/** Moves the particles on, drops those whose lifetime was over at the update before, and spawns the ones that
 *  are due, each with a billboard. Writes a line a particle to the log, tag "Emitter". Needs a current GL
 *  context where particles are spawned or dropped.
 *  @param emitter  null does nothing
 *  @param elapsed  seconds since the last update
 *  @param ignored  not read */
QEX_API void QexParticleEmitter_Update(QexParticleEmitter* emitter, float elapsed, void* ignored);

/** Moves one particle on. No GL context needed.
 *  @param particle  null or not active: does nothing
 *  @param elapsed   seconds since its last update */
QEX_API void QexParticleEx_Update(QexParticleEx* particle, float elapsed);

/** Draws an emitter's particles as billboards, in order, without depth writes, which are on afterwards.
 * Writes a line to the log, tag "Particle emitter". Nothing is drawn, nor written, when the emitter is at its
 * end. Otherwise as QexBillboard_Draw.
 *  @param emitter  null does nothing
 *  @param camera   see QexBillboard_Draw */
QEX_API void QexParticleEmitter_Draw(QexParticleEmitter* emitter, const QexCamera* camera);

/** Writes an emitter to a file of QEX_EMITTER_FILE_SIZE bytes: the record as it lies in memory on 32-bit
 *  little-endian targets, pointers as 0. No GL context needed.
 *  @param path  file, created or replaced
 *  @return 0; -2 when an argument is null; -1 when the file cannot be created or, with a line in the log,
 *  written. */
QEX_API int32_t QexParticleEmitter_WriteToBinFile(const QexParticleEmitter* emitter, const char* path);

/** Reads an emitter from a file of QexParticleEmitter_WriteToBinFile. Its pointers are null: set the frame
 *  textures of the animations in use, or they show the default texture. Living particles in the file are left
 *  out, with a line in the log. No GL context needed.
 *  @return the emitter, to be released with QexParticleEmitter_Release; null when the path is null or the
 * file cannot be opened, and, with a line in the log, when it is cut, a count in it is out of range, a
 * setting is no finite number, or memory runs out. */
QEX_API QexParticleEmitter* QexParticleEmitter_CreateFromBinFile(const char* path);

/** Frees an emitter and its living particles' billboards, which needs a current GL context if there are any.
 *  @param emitter  not to be used afterwards; null does nothing */
QEX_API void QexParticleEmitter_Release(QexParticleEmitter* emitter);

/* ======================================================================================================
 * Post-processing
 *
 * Depth of field. The application draws its scene in a callback, once in colour and once as depth; the
 * engine blurs the colours in two passes and mixes sharp and blurred pixels by their distance from a focus.
 * Start it once the screen's size is known; QexEngine_Resize follows the size. Functions that draw return -1,
 * with a line in the log, before QexPostProcessing_Initialize, and -9 without an argument they need, and
 * draw nothing then. Quads are drawn without depth test, blending and culling, which are put back; the
 * program, the active unit and the textures of units 0 to 2 change. Needs a current GL context without bound
 * buffers.
 * ====================================================================================================== */

#define QEX_POST_PROCESSING_TARGETS 5

/** Draws the application's scene, clearing first, into the framebuffer and the viewport that are set.
 *  @param user1, user2, user3  as given by the application in the colour pass, null in the depth pass
 *  @param shader         what to draw all nodes with, null in the colour pass: their own modules
 *  @param skinnedShader  the same for skinned nodes; QexModel_SetShaderProgramForAllNode takes both
 *  @param colour         null in the colour pass; else red, green and blue of the farthest depth, to clear to
 *  @return not read */
typedef int32_t (*QexSceneCallback)(QexRuntimeContext* context, void* user1, void* user2, void* user3,
                                    QexShaderModule* shader, QexShaderModule* skinnedShader,
                                    const float* colour);

#ifdef QEX_UNPREFIXED_NAMES
/** The targets. 0 and 1: first and second blur pass at half resolution; 2: the sharp picture; 3: the first
 *  blur pass at full resolution, then the depth; 4: the second blur pass at full resolution. */
QEX_API extern QexRenderTarget PostProcessingRenderTargets[QEX_POST_PROCESSING_TARGETS];

/** The modules between QexPostProcessing_Initialize and QexPostProcessing_Finalize, null otherwise. */
QEX_API extern QexShaderModule* depthShaderProgram;
QEX_API extern QexShaderModule* skinningDepthShaderProgram;
QEX_API extern QexShaderModule* blurShaderProgram;
QEX_API extern QexShaderModule* DOFShaderProgram;

/** GL name of the program that copies a picture, 0 while there is none. */
QEX_API extern uint32_t m_iProgNamePP;

/** The sources that QexPP_CreateShader compiles. Others may be put in their place, with the attributes
 *  a_v4Position and a_v2TexCoord and the uniforms u_m4Projection, u_s2dTexture (unit 0) and u_s2dAlpha (unit
 *  3). */
QEX_API extern const char* pVertexShaderPP;
QEX_API extern const char* pFragmentShaderPP;
#endif

/** Creates the quad, the targets and the programs for a screen. What an earlier call made is released first.
 *  @param context  its size is the screen's
 *  @return 0; -9 for null; -1, with a line in the log, for a size below 1 or above what the GL draws into:
 *  what an earlier call made stays then; -1 when the copy program cannot be made or memory runs out: nothing
 *  is left then. */
QEX_API int32_t QexPostProcessing_Initialize(const QexRuntimeContext* context);

/** Releases what QexPostProcessing_Initialize made; without it, nothing. @return 0. */
QEX_API int32_t QexPostProcessing_Finalize(void);

/** Draws the scene with depth of field into the framebuffer and the viewport that are set, which stay so.
 *  @param user1, user2, user3  for the callback's colour pass
 *  @param callback  draws the scene, called twice
 *  @param focus     depth that stays sharp, 0 to 1, as QexDepthShader computes it from zNear and zFar
 *  @param range     blur per unit of depth; a pixel is all blurred 1 / range away from the focus; 0 and
 * below: all sharp. What is no number in focus or range leaves the picture undefined
 *  @param blurH     step between samples in texture coordinates; 1 / width is a pixel of the screen
 *  @param blurV     the same for columns; 1 / height
 *  @param sigma     as QexBlurShader's, in steps
 *  @param samples   9, 7, 5 or any other number, as QexBlurShader's
 *  @param mode      below 2: blurs at half the resolution, else at full
 *  @param zNear     nearest depth, in clip-space z as QexDepthShader_SetParameters takes it, which
 * QexCamera_Project lets run from 0 at the near plane to 1 at the far plane
 *  @param zFar      farthest depth, above zNear
 *  @return 0, or as said above. */
QEX_API int32_t QexPostProcessing_DrawDOF(QexRuntimeContext* context, void* user1, void* user2, void* user3,
                                          QexSceneCallback callback, float focus, float range, float blurH,
                                          float blurV, float sigma, float samples, int32_t mode, float zNear,
                                          float zFar);

/** Sets the quad that QexPP_DrawDOF and QexPP_DrawImage draw: the screen, and a pixel more on the right and
 *  below. No GL context needed. @return 0; -9 for null. */
QEX_API int32_t QexPP_CreateQuad(const QexRuntimeContext* context);

/** Creates the copy program; one that is there is released first.
 *  @param context  its size is the screen's
 *  @return 0; -9 for null; -1 when a source does not compile or they do not link. */
QEX_API int32_t QexPP_CreateShader(const QexRuntimeContext* context);

/** Deletes the copy program and its shaders, if they are there. */
QEX_API void QexPP_ReleaseShader(void);

/** @param index  0 to 4  @return that target; null from 5 on. No GL context needed. */
QEX_API QexRenderTarget* QexPP_GetRenderTarget(uint32_t index);

/** Colour pass: calls the callback, its shaders and colour null.
 *  @param target  drawn into, then framebuffer and viewport of before are back; null: the screen, which stays
 *                 set
 *  @return 0; -9 without a context or a callback. */
QEX_API int32_t QexPP_DrawNormalScene(QexRuntimeContext* context, void* user1, void* user2, void* user3,
                                      QexSceneCallback callback, QexRenderTarget* target);

/** Blurs a picture of the screen's size, first along its rows, then along its columns.
 *  @param user1, user2, user3  not read
 *  @param sigma, samples, blurH, blurV  as in QexPostProcessing_DrawDOF
 *  @param source  the picture, none of the targets' own
 *  @param first   takes the rows: as wide as the screen, or half as wide, rounded down
 *  @param second  takes the result, of the same size
 *  @return 0, or as said above; -10 for another width: `first` stays bound (QexRenderTarget_EndScene takes it
 *  back). */
QEX_API int32_t QexPP_DrawBlurImage(const QexRuntimeContext* context, void* user1, void* user2, void* user3,
                                    float sigma, float samples, float blurH, float blurV, QexTexture* source,
                                    QexRenderTarget* first, QexRenderTarget* second);

/** Draws a texture blurred in one direction, with the blur module's projection: from the upper left corner of
 *  the screen one unit a texel, and one more.
 *  @param direction  0: along rows, 1: along columns
 *  @param half       non-zero: at half the texture's size
 *  @return 0, or as said above. */
QEX_API int32_t QexPP_DrawBlurQuad(const QexRuntimeContext* context, QexTexture* texture, float direction,
                                   float sigma, float samples, float blurSize, int32_t half);

/** Depth pass: sets near and far of both depth modules and calls the callback with them, white, and null for
 *  the application's arguments.
 *  @param user1, user2, user3  not read
 *  @param zNear, zFar  as in QexPostProcessing_DrawDOF
 *  @param target       drawn into
 *  @return 0, or as said above. */
QEX_API int32_t QexPP_DrawDepthImage(QexRuntimeContext* context, void* user1, void* user2, void* user3,
                                     QexSceneCallback callback, float zNear, float zFar,
                                     QexRenderTarget* target);

/** Mixes three pictures of the screen's shape with QexDOFShader into the framebuffer that is bound.
 *  @param user1, user2, user3  not read
 *  @param focus, range  as in QexPostProcessing_DrawDOF
 *  @param ignored       not read
 *  @return 0, or as said above. */
QEX_API int32_t QexPP_DrawDOF(const QexRuntimeContext* context, void* user1, void* user2, void* user3,
                              float focus, float range, QexTexture* sharp, QexTexture* depth,
                              QexTexture* blurred, int32_t ignored);

/** Shows a target as it is.
 *  @param user1, user2, user3  not read
 *  @param destination  another target, then framebuffer and viewport of before are back; null: the screen,
 *                      which stays set
 *  @return 0, or as said above. */
QEX_API int32_t QexPP_DrawImage(const QexRuntimeContext* context, void* user1, void* user2, void* user3,
                                QexRenderTarget* source, QexRenderTarget* destination);

QEX_END

#endif
