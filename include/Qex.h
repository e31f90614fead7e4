/* Qex: a real-time 3D engine for OpenGL ES 2.0.
 *
 * This header declares everything that the library exports: functions, records, constants and data, for
 * C and C++. The functions come in families, one page each; a record's fields are described where it is
 * declared.
 *
 * Conventions that hold throughout:
 * - One thread. Every call comes from the thread that owns the GL context; nothing is locked. Functions
 *   that say "no GL context needed" issue no GL call.
 * - Matrices are column-major, vectors are columns: in a * b the transform b applies first. Space is
 *   right-handed; a camera looks down -Z with +Y up. Projected depth is 0 at the near plane, 1 at the far.
 * - Angles: degrees in the matrix rotation builders and node rotations, radians elsewhere; each function
 *   says which.
 * - Results: 0 for success and a negative code for failure, unless a function says otherwise. Pointers must
 *   not be null unless a function says that they may be.
 * - A GL error is fatal: it is logged with the module and line that found it, and the process ends with
 *   exit status 255. A library that was built with QEX_GL_CHECKS off does not look for them.
 * - GL object names and enumerants appear as uint32_t, so this header needs no GL header.
 * - Names begin with Qex, or with the record that they work on. A few others are exported as well
 *   (createWindow, fontdata, ...), where a program's own names may be the same: they are declared where
 *   QEX_UNPREFIXED_NAMES is defined before this header is included.
 */
#ifndef QEX_H
#define QEX_H

#include <stddef.h>
#include <stdint.h>

#if defined(__GNUC__)
#define QEX_API __attribute__((visibility("default")))
#define QEX_PRINTF(text, first) __attribute__((format(printf, text, first)))
#else
#define QEX_API
#define QEX_PRINTF(text, first)
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* Records that several pages share by pointer; each is described on its own page. */
typedef struct QexRuntimeContext QexRuntimeContext;
typedef struct QexPODModel QexPODModel;
typedef struct QexShaderModule QexShaderModule;
typedef struct QexTexture QexTexture;
typedef struct QexModel QexModel;
typedef struct QexLightSet QexLightSet;
typedef struct QexShadowInfo QexShadowInfo;

/* ======================================================================================================
 * Base: diagnostics, memory, time and float animation
 *
 * Messages go to the Android log; on other hosts the log is standard error, one line a message, as
 * "I/Qex: text" and "E/Qex: text". Everything is written at first; a program chooses how much with
 * QexLog_SetLevel and where to with QexLog_SetSink. No GL context needed on this page.
 * ====================================================================================================== */

/** Weights of messages. What QexSystem_Printf prints, as the loaders do, counts as an error or a warning when
 *  its format begins with "ERROR:" or "WARNING:" in any case, and as information otherwise. */
#define QEX_LOG_INFO 4
#define QEX_LOG_WARNING 5
#define QEX_LOG_ERROR 6
#define QEX_LOG_NONE 7 /* as a level: nothing */

/** Leaves lighter messages out, wherever the log goes; only the two lines of a fatal GL error are written at
 *  every level. From the first call of this function or of QexLog_SetSink on, what QexSystem_Printf,
 *  QexTime_UpdateFPS and the water print goes to the log, and no more to standard output or error.
 *  @param level  QEX_LOG_..., the lightest to be written; QEX_LOG_INFO at first
 *  @return the level before. */
QEX_API int32_t QexLog_SetLevel(int32_t level);

/** Receives the log's messages. It may not call functions of the engine.
 *  @param user    as given to QexLog_SetSink
 *  @param weight  QEX_LOG_INFO, QEX_LOG_WARNING or QEX_LOG_ERROR
 *  @param tag     "Qex", "QexEngine", "Emitter" ..., never null
 *  @param text    the message without the newline at its end; gone after the call */
typedef void (*QexLogSink)(void* user, int32_t weight, const char* tag, const char* text);

/** Sends the messages that the level lets through to a function instead of the log; see QexLog_SetLevel for
 *  what is printed.
 *  @param sink  null: the log again
 *  @param user  passed on to it, the application's; may be null */
QEX_API void QexLog_SetSink(QexLogSink sink, void* user);

/** Writes one message to the log at priority 4 (information).
 *  @param tag     log tag, "Qex" for the engine's own messages; null counts as ""
 *  @param format  printf format, not null; no trailing newline is needed, and no length limit set but that of
 *                 Android's log
 *  @return the log call's result: positive when the message was written, negative on failure; 0 when the
 *  level leaves it out. */
QEX_API int32_t QexLog(const char* tag, const char* format, ...) QEX_PRINTF(2, 3);

/** Writes one message to the log at priority 6 (error); otherwise as QexLog.
 *  @param tag     log tag; null counts as ""
 *  @param format  printf format, not null
 *  @return as QexLog. */
QEX_API int32_t QexError(const char* tag, const char* format, ...) QEX_PRINTF(2, 3);

/** Writes a text to standard output as it stands, then the same text to the log at priority 4, tag "Qex"; to
 *  the log alone after QexLog_SetLevel or QexLog_SetSink. See QEX_LOG_... for its weight.
 *  @param format  printf format, not null
 *  @return always 1. */
QEX_API int32_t QexSystem_Printf(const char* format, ...) QEX_PRINTF(1, 2);

/** Formats a block that the application lends as an empty two-level segregated-fit pool. The engine keeps
 *  only the pool's statistics in it: no allocation is served from it. The whole block is zeroed first, so a
 *  second call on the same block starts afresh. A block is refused, and nothing changes, when it is null,
 *  smaller than 3252 bytes, or not on a multiple of 4 bytes.
 *  @param start  start of the block; stays the caller's, must live until QexMemory_Shutdown
 *  @param size   size of the block in bytes
 *  @return always 0; QexMemory_GetIsInitialized tells whether the block was accepted. */
QEX_API int32_t QexMemory_Init(void* start, uint32_t size);

/** Takes the pool's signature away, after which the caller may reuse the block.
 *  @param start  start of a block of at least 4 bytes, usually the one given to QexMemory_Init; null does
 *                nothing */
QEX_API void QexMemory_Shutdown(void* start);

/** Tells whether the block last accepted by QexMemory_Init still holds a formatted pool.
 *  @return 1 when it does, else 0. */
QEX_API uint32_t QexMemory_GetIsInitialized(void);

/** Bytes of a formatted pool that are not available to allocations: control structure and headers.
 *  @param start  start of a block that QexMemory_Init accepted; null gives 0
 *  @return the size in bytes; it does not change while the pool stays formatted. */
QEX_API uint32_t QexMemory_GetUsed(const void* start);

/** Highest value that QexMemory_GetUsed has had for this pool.
 *  @param start  start of a block that QexMemory_Init accepted; null gives 0
 *  @return the size in bytes. */
QEX_API uint32_t QexMemory_GetMaxSize(const void* start);

/** Allocates a block from the process heap, its bytes undefined. Nothing is logged on failure.
 *  @param size  bytes; 0 gives a block of its own too; above 2147483647 is refused on every host
 *  @return the block, to be released with QexMemory_Free, or null. */
QEX_API void* QexMemory_Alloc(uint32_t size);

/** Resizes a block from QexMemory_Alloc, keeping the bytes that both sizes share.
 *  @param block  the block; null is refused: nothing is allocated
 *  @param size   new size in bytes; 0 keeps a block of no bytes; above 2147483647 is refused
 *  @return the block, perhaps moved, or null. After null the old block is still valid and the caller's. */
QEX_API void* QexMemory_ReAlloc(void* block, uint32_t size);

/** Releases a block from QexMemory_Alloc or QexMemory_ReAlloc.
 *  @param block  the block, or null, which does nothing */
QEX_API void QexMemory_Free(void* block);

/** A frame-rate record. Zero it before its first use. */
typedef struct QexFrameRate {
    uint32_t frames; /* frames counted since the first QexTime_UpdateFPS */
    float rate;      /* frames per second over the last completed period of five seconds */
} QexFrameRate;

/** Keys of up to 16 float values. Keys are records of (1 + valuesPerKey) floats: a time, then the values.
 *  Times rise from key to key, and the first is 0; their unit is that of the deltas of
 *  QexFloatAnimation_Animate. */
typedef struct QexFloatKeyFrameSequence {
    uint32_t keyCount;     /* keys, at least 2 to be played */
    uint32_t outputStride; /* bytes from one output value to the next */
    uint32_t valuesPerKey; /* values of a key, at most 16 */
    const float* keys;     /* the application's, alive as long as the sequence is used */
} QexFloatKeyFrameSequence;

/** QexFloatAnimation end mode: stay at the last key's values. Every other mode returns to the first key's. */
#define QEX_FLOAT_ANIMATION_HOLD 2

/** One running animation. Filled by QexFloatAnimation_Setup; set endMode afterwards where it matters. */
typedef struct QexFloatAnimation {
    void* output;                             /* value i is written at output + i * outputStride bytes */
    const QexFloatKeyFrameSequence* sequence; /* the keys; the application's */
    uint32_t playing;                         /* 1 while playing, 0 when stopped or finished */
    uint32_t setupWord;                       /* as given to QexFloatAnimation_Setup; not used */
    uint32_t loopCount;                       /* passes through the keys, 0 for endless */
    uint32_t endMode;                         /* QEX_FLOAT_ANIMATION_HOLD, or any other value; 0 at first */
    float position;                           /* time since the start of the current pass */
    float fromTime;                           /* time of the key before the position */
    float toTime;                             /* time of the key after the position */
    uint32_t fromKey;                         /* index of the key before the position */
    uint32_t toKey;                           /* index of the key after the position */
    uint32_t passesLeft;                      /* passes still to play, with the current one */
    float fromValues[16];                     /* values of the key before the position */
    float toValues[16];                       /* values of the key after the position */
} QexFloatAnimation;

/** Starts the millisecond clock from the wall clock.
 *  @return milliseconds within the wall-clock second at which the clock started, 0 to 999. */
QEX_API uint32_t QexTime_Init(void);

/** Reads the clock.
 *  @return milliseconds since QexTime_Init, wrapping at 32 bits, or 0xFFFFFFFF when it cannot be read. */
QEX_API uint32_t QexTime_Get(void);

/** Time between two calls, for frame deltas.
 *  @return milliseconds since the previous call; for the first call, since QexTime_Init. */
QEX_API uint32_t QexTime_GetElapsed(void);

/** Counts a frame. Once a period of five seconds is over, stores the mean rate in the record and writes
 *  "<QexTime_UpdateFPS>FPS=%7.3f" to standard error. Call it once a frame; one meter serves the process.
 *  @param record  in and out, zeroed before its first use, not null */
QEX_API void QexTime_UpdateFPS(QexFrameRate* record);

/** Fills a sequence. The keys are not copied.
 *  @param sequence      out, not null
 *  @param keyCount      keys, at least 2
 *  @param valuesPerKey  values of a key, 1 to 16
 *  @param outputStride  bytes from one output value to the next, 4 for consecutive floats
 *  @param keys          keyCount records of (1 + valuesPerKey) floats, alive as long as the sequence is used
 *  @return always 0. */
QEX_API int32_t QexFloatKeyFrameSequence_Setup(QexFloatKeyFrameSequence* sequence, uint32_t keyCount,
                                               uint32_t valuesPerKey, uint32_t outputStride,
                                               const float* keys);

/** Prepares an animation, stopped at its first key, end mode 0. The output is not written yet.
 *  @param animation  out, not null
 *  @param output     first output value, not null; alive as long as the animation is played
 *  @param sequence   filled sequence, not null; the application's, alive as long as the animation is used
 *  @param setupWord  stored for the application
 *  @param loopCount  passes through the keys, 0 for endless
 *  @return always 0. */
QEX_API int32_t QexFloatAnimation_Setup(QexFloatAnimation* animation, void* output,
                                        const QexFloatKeyFrameSequence* sequence, uint32_t setupWord,
                                        uint32_t loopCount);

/** Stops an animation and puts it back to the start of its first pass. The output is not written.
 *  @param animation  prepared animation, not null
 *  @return always 0. */
QEX_API int32_t QexFloatAnimation_Reset(QexFloatAnimation* animation);

/** Plays an animation from where it stands.
 *  @param animation  prepared animation, not null
 *  @return always 1. */
QEX_API int32_t QexFloatAnimation_Start(QexFloatAnimation* animation);

/** Advances a playing animation and writes its values, linear between the two keys around the new position.
 *  What a step runs past the last key is carried into the next pass. At the end of the last pass the output
 *  gets the last key's values (QEX_FLOAT_ANIMATION_HOLD) or the first key's, and the animation stops. A
 *  sequence of fewer than 2 keys or more than 16 values stops at once and writes nothing.
 *  @param animation  prepared animation, not null
 *  @param delta      time since the previous call, in the keys' unit, >= 0
 *  @return the playing field after the step: 1 while playing, 0 when finished or not playing. */
QEX_API uint32_t QexFloatAnimation_Animate(QexFloatAnimation* animation, float delta);

/* ======================================================================================================
 * Math: vectors, matrices, scalars
 *
 * Plain functions over the caller's records; nothing allocates. The output comes first, except in the
 * transforms and the reflection, where it comes last. No pointer may be null. Inputs are not changed, and an
 * output may be an input as well unless a function says otherwise. Functions with a pointer result return
 * their output. Input that has no answer (near = far, an axis of length 0, ...) gives zeros, infinities or
 * NaNs, never a crash. No GL context needed on this page.
 * ====================================================================================================== */

/** Two floats. */
typedef struct QexVec2 {
    float x, y; /* components */
} QexVec2;

/** Three floats: a point, a direction, a colour. */
typedef struct QexVec3 {
    float x, y, z; /* components */
} QexVec3;

/** Four floats. A plane a * x + b * y + c * z + d = 0 is the four floats (a, b, c, d), (a, b, c) of unit
 *  length. */
typedef struct QexVec4 {
    float x, y, z, w; /* components */
} QexVec4;

/** A 3x3 matrix, column-major. */
typedef struct QexMatrix3 {
    float m[9]; /* element (row r, column c) at 3 * c + r */
} QexMatrix3;

/** A 4x4 matrix, column-major, as GL takes it without transposing. Columns 0 to 2 are the transformed axes,
 *  elements 12 to 14 the translation. */
typedef struct QexMatrix {
    float m[16]; /* element (row r, column c) at 4 * c + r */
} QexMatrix;

/** The identity matrix. */
QEX_API extern const QexMatrix g_sMatIdentity;

/** out = (x, y). */
QEX_API void QexVec2_Set(QexVec2* out, float x, float y);

/** out = (x, y, z). */
QEX_API void QexVec3_Set(QexVec3* out, float x, float y, float z);

/** out = (x, y, z, w). */
QEX_API void QexVec4_Set(QexVec4* out, float x, float y, float z, float w);

/** out = a + b. */
QEX_API void QexVec3_Add(QexVec3* out, const QexVec3* a, const QexVec3* b);

/** out = a - b. */
QEX_API void QexVec3_Subtract(QexVec3* out, const QexVec3* a, const QexVec3* b);

/** out = a * s.
 *  @return out. */
QEX_API QexVec3* QexVec3_Scale(QexVec3* out, const QexVec3* a, float s);

/** out = a + (b - a) * t, with t not clamped. */
QEX_API void QexVec3_Lerp(QexVec3* out, const QexVec3* a, const QexVec3* b, float t);

/** @return the dot product of two vectors. */
QEX_API float QexVec3_DotProduct(const QexVec3* a, const QexVec3* b);

/** @return the dot product of two vectors, over four components. */
QEX_API float QexVec4_DotProduct(const QexVec4* a, const QexVec4* b);

/** out = a x b, right-handed. */
QEX_API void QexVec3_CrossProduct(QexVec3* out, const QexVec3* a, const QexVec3* b);

/** out = a at unit length. A vector of length 0 gives (0, 0, 0). Lengths from 1e-19 to 1e19 are good,
 *  others are off or give (0, 0, 0) as well.
 *  @return out. */
QEX_API QexVec3* QexVec3_Normalize(QexVec3* out, const QexVec3* a);

/** out = the identity.
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Identity(QexMatrix* out);

/** out = the translation by (x, y, z).
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Translate(QexMatrix* out, float x, float y, float z);

/** out = the scaling by (x, y, z) about the origin.
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Scale(QexMatrix* out, float x, float y, float z);

/** out = the rotation about +X, counter-clockwise seen from +X.
 *  @param degrees  angle in degrees
 *  @return out. */
QEX_API QexMatrix* QexMatrixRotateX(QexMatrix* out, float degrees);

/** out = the rotation about +Y, counter-clockwise seen from +Y.
 *  @param degrees  angle in degrees
 *  @return out. */
QEX_API QexMatrix* QexMatrix_RotateY(QexMatrix* out, float degrees);

/** out = the rotation about +Z, counter-clockwise seen from +Z.
 *  @param degrees  angle in degrees
 *  @return out. */
QEX_API QexMatrix* QexMatrixRotateZ(QexMatrix* out, float degrees);

/** out = Rz(z) * Ry(y) * Rx(x): the rotation about X is applied first.
 *  @param x  angle about X in degrees; y and z likewise
 *  @return out. */
QEX_API QexMatrix* QexMatrix_RotateXYZ(QexMatrix* out, float x, float y, float z);

/** out = the rotation about an axis, counter-clockwise seen from the axis' tip.
 *  @param degrees  angle in degrees
 *  @param x        axis, of any length but 0; y and z likewise
 *  @return out. */
QEX_API QexMatrix* QexMatrix_RotateAngelAxis(QexMatrix* out, float degrees, float x, float y, float z);

/** out = the right-handed perspective projection to depth 0 (near plane) .. 1 (far plane), divided by
 *  farPlane throughout, which leaves projected points where they are.
 *  @param fov        field of view across the width, in radians
 *  @param aspect     width / height: the vertical scale is the horizontal one times this
 *  @param nearPlane  distance of the near plane, > 0
 *  @param farPlane   distance of the far plane, > nearPlane
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Perspective(QexMatrix* out, float fov, float aspect, float nearPlane,
                                         float farPlane);

/** out = the orthographic projection of a box to -1 .. 1 along each axis. Z keeps its direction: nearPlane
 *  and farPlane are the z coordinates that map to -1 and 1.
 *  @param left  x that maps to -1; right maps to 1. bottom and top likewise for y
 *  @return out. */
QEX_API QexMatrix* QexMatrix_Orthographic(QexMatrix* out, float left, float right, float bottom, float top,
                                          float nearPlane, float farPlane);

/** out = the rotation into the space of a viewer at the origin, which looks down -Z with +Y up.
 *  @param direction  viewing direction, of any length but 0
 *  @param up         up direction, not parallel to direction
 *  @return out. */
QEX_API QexMatrix* QexMatrix_LookUp(QexMatrix* out, const QexVec3* direction, const QexVec3* up);

/** out = the right-handed view matrix of a camera, which looks down its -Z with +Y up.
 *  @param eye     position of the camera
 *  @param target  point looked at, not the eye
 *  @param up      up direction, not parallel to the viewing direction
 *  @return out. */
QEX_API QexMatrix* QexMatrix_LookAtRH(QexMatrix* out, const QexVec3* eye, const QexVec3* target,
                                      const QexVec3* up);

/** out = the mirror through a plane. A normal and its opposite give the same mirror.
 *  @param planePoint   a point on the plane
 *  @param planeNormal  normal of the plane, of any length but 0
 *  @return out. */
QEX_API QexMatrix* QexMatrix_CreateReflectionMatrix(const QexVec3* planePoint, const QexVec3* planeNormal,
                                                    QexMatrix* out);

/** out = the rotation that turns one direction onto another, about the axis perpendicular to both. The
 *  identity when they are less than 0.01 radians apart; opposite directions turn by half a circle about an
 *  axis perpendicular to them.
 *  @param from  direction, of any length but 0
 *  @param to    direction, of any length but 0
 *  @return out. */
QEX_API QexMatrix* QexMatrix_GetRotation(QexMatrix* out, const QexVec3* from, const QexVec3* to);

/** out = a * b: b is applied first. out may be a or b. */
QEX_API void QexMatrix_Multiply(QexMatrix* out, const QexMatrix* a, const QexMatrix* b);

/** Transposes m in place. */
QEX_API void QexMatrix_Transpose(QexMatrix* m);

/** out = the inverse of an affine matrix, one whose bottom row is (0, 0, 0, 1). out may be m.
 *  @return out, or null when m is singular: out is not written. */
QEX_API QexMatrix* QexMatrix_Inverse(QexMatrix* out, const QexMatrix* m);

/** out = the inverse of any matrix, by elimination. A singular matrix gives infinities or NaNs. out may be m.
 *  @return out. */
QEX_API QexMatrix* QexMatrix_InverseEx(QexMatrix* out, const QexMatrix* m);

/** out = the upper left 3x3 of m. */
QEX_API void QexMatrix3_ConstructorFromMatrix(QexMatrix3* out, const QexMatrix* m);

/** out = the transpose of m. */
QEX_API void QexMatrix3_Transpose(QexMatrix3* out, const QexMatrix3* m);

/** out = the inverse of m. A singular matrix gives infinities or NaNs. out may be m.
 *  @return out. */
QEX_API QexMatrix3* QexMatrix3_Inverse(QexMatrix3* out, const QexMatrix3* m);

/** out = (v.y, -v.x, 0), which is perpendicular to v; (1, 0, 0) when v.x and v.y are 0. Not normalised. */
QEX_API void QexMatrix_GetPerpendicularVector(QexVec3* out, const QexVec3* v);

/** Prints m with QexSystem_Printf, row by row, the translation in the last column. */
QEX_API void QexMatrixPrint(const QexMatrix* m);

/** out = m * v. out may be v. */
QEX_API void QexMatrix_TransformVec4(const QexMatrix* m, const QexVec4* v, QexVec4* out);

/** out = transpose(m) * v, which carries a plane v through the inverse of m. out may be v. */
QEX_API void QexMatrix_TransformVec4Raw(const QexMatrix* m, const QexVec4* v, QexVec4* out);

/** out = m * v with a 3x3 matrix, for directions and normals. out may be v. */
QEX_API void QexMatrix_TransformVec3(const QexMatrix3* m, const QexVec3* v, QexVec3* out);

/** out = m * (v, w), divided by the w of the product. out may be v.
 *  @param w  fourth component of the input: 1 for points */
QEX_API void QexMatrix_TransformHomoVec3(const QexMatrix* m, const QexVec3* v, QexVec3* out, float w);

/** Transforms an array, without division: each out = the first three components of m * (in, w).
 *  @param in      count times three floats, stride bytes apart, of any alignment
 *  @param out     likewise; may be in
 *  @param w       fourth component of every input: 1 for points, 0 for directions
 *  @param count   number of vectors; 0 does nothing
 *  @param stride  bytes from one vector to the next, in both arrays */
QEX_API void QexMatrix_TransformVec3Array(const QexMatrix* m, const void* in, void* out, float w,
                                          uint32_t count, uint32_t stride);

/** Transforms an array of points: each out = m * (in, 1), divided by the w of the product.
 *  @param in       count times three floats, stride bytes apart, of any alignment
 *  @param out      likewise; may be in
 *  @param ignored  not used
 *  @param count    number of vectors; 0 does nothing
 *  @param stride   bytes from one vector to the next, in both arrays */
QEX_API void QexMatrix_TransformHomoVec3Array(const QexMatrix* m, const void* in, void* out, float ignored,
                                              uint32_t count, uint32_t stride);

/** @return 1 when a > 1e-7, -1 when a < -1e-7, else 0. */
QEX_API float Qex_Sign(float a);

/** Square root by Newton's iteration, to 1e-6 for a below 1, to 1e-7 of the root above.
 *  @return the root; 0 when a <= 0; infinity and NaN as they are. */
QEX_API float Qex_Sqrt(float a);

/** Arc tangent by a short series, to 1.4e-5.
 *  @param t  tangent, >= 0
 *  @return the angle in radians, 0 to pi/2. */
QEX_API float Qex_ArcTan(float t);

/** Angle of the point (x, y) by a short series, to 1.3e-6.
 *  @return the angle in radians: 0 to 2 pi when x is not 0; for x = 0, pi/2, -pi/2 or 0 by the sign of y.
 *          Points on the negative X axis (x < 0, y = 0) give 0. */
QEX_API float Qex_ArcTan2(float x, float y);

/** Arc sine by Qex_ArcTan.
 *  @param a  sine, 0 to 1
 *  @return the angle in radians, 0 to pi/2. */
QEX_API float Qex_ArcSin(float a);

/** Arc cosine by Qex_ArcTan.
 *  @param a  cosine, 0 to 1
 *  @return the angle in radians, 0 to pi/2. */
QEX_API float Qex_ArcCos(float a);

/** @return v clamped to the range between a and b, which may come in either order. */
QEX_API float QexMath_ClampFloat(float v, float a, float b);

#ifdef QEX_UNPREFIXED_NAMES
/** @return 1 when n is a power of two, else 0; 0 for 0. */
QEX_API uint32_t util_number_is_power_2(uint32_t n);
#endif

/** @return 1 when the host stores integers little-endian, else 0. */
QEX_API int32_t QexIsLittleEndian(void);

/* ======================================================================================================
 * Math: rotations and decomposition
 *
 * Quaternions and Euler angles. No pointer may be null except where a function says so. No GL context
 * needed on this page.
 * ====================================================================================================== */

/** A quaternion. The rotation by an angle about a unit axis is (axis * sin(angle / 2), cos(angle / 2)). */
typedef struct QexQuaternion {
    float x, y, z, w; /* vector part, then the scalar part */
} QexQuaternion;

/** q = (0, 0, 0, 1), no rotation. */
QEX_API void QexQuaternion_Identity(QexQuaternion* q);

/** Brings q to unit length, in place. A quaternion of length 0 stays as it is. */
QEX_API void QexQuaternion_Normalize(QexQuaternion* q);

/** out = a * b, normalised: the rotation b is applied first. out may be a or b. */
QEX_API void QexQuaternion_Multiply(QexQuaternion* out, const QexQuaternion* a, const QexQuaternion* b);

/** out = the rotation about an axis, normalised as a whole: give a unit axis, unless only the direction of
 *  the result's axis matters.
 *  @param axis   axis, unit length
 *  @param angle  angle in radians */
QEX_API void QexQuaternion_RotationAxis(QexQuaternion* out, const QexVec3* axis, float angle);

/** Splits a unit quaternion.
 *  @param q      unit quaternion
 *  @param axis   out, unit axis; not normalised when the angle is within 0.001 of 0 or 2 pi
 *  @param angle  out, radians, 0 to 2 pi */
QEX_API void QexQuaternion_ToAxisAngle(const QexQuaternion* q, QexVec3* axis, float* angle);

/** out = the rotation matrix of a unit quaternion. */
QEX_API void QexQuaternion_ToRotationMatrix(QexMatrix* out, const QexQuaternion* q);

/** out = the spherical interpolation from a to b along the shorter arc. out may be a or b.
 *  @param a  unit quaternion
 *  @param b  unit quaternion
 *  @param t  0 (a) to 1 (b); outside, out is the identity */
QEX_API void QexQuaternion_Slerp(QexQuaternion* out, const QexQuaternion* a, const QexQuaternion* b, float t);

/** Euler angles of a rotation matrix.
 *  @param m    rotation matrix, no scale
 *  @param out  out, three floats: angles about X, Y, Z in radians, as QexMatrix_RotateXYZ takes them in
 *              degrees. At the poles (Y at +-pi/2) Z is 0 and X has the opposite sign. */
QEX_API void QexMatrix_ToEulerAnglesXYZ(const QexMatrix* m, float* out);

#ifdef QEX_UNPREFIXED_NAMES
/** Both sets of Euler angles of a rotation matrix, for QexMatrix_RotateXYZ.
 *  @param m     rotation matrix, no scale; may be null
 *  @param out1  out, three floats: angles about X, Y, Z in degrees; may be null
 *  @param out2  out, three floats: the other solution; may be null
 *  @return 1 or 2, the solution whose squared angles have the smaller sum; 0, nothing written, when a
 *          pointer is null. */
QEX_API int32_t GetRotationXYZFromRotationMatrix(const QexMatrix* m, float* out1, float* out2);

/** As GetRotationXYZFromRotationMatrix, for a matrix with translation and scale, which are removed first.
 *  @param m     transform without shear; may be null
 *  @param out1  out, three floats, degrees; may be null
 *  @param out2  out, three floats, degrees; may be null
 *  @return 1 or 2, the solution with the smaller angles; 0, nothing written, when a pointer is null. */
QEX_API int32_t GetRotationXYZFromTransformMatrix(const QexMatrix* m, float* out1, float* out2);

/** out = the rotation in a transform: no translation, columns at unit length. A negative scale is not found.
 *  @param m    transform without shear or zero scale; may be null
 *  @param out  out; may be m; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetRotationMatrixFromMatrix(const QexMatrix* m, QexMatrix* out);

/** out = the scale in a transform: the lengths of its first three columns.
 *  @param m    transform without shear; may be null
 *  @param out  out; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetScaleFromMatrix(const QexMatrix* m, QexVec3* out);

/** out = the scaling matrix of GetScaleFromMatrix.
 *  @param m    transform without shear; may be null
 *  @param out  out; may be m; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetScaleMatrixFromMatrix(const QexMatrix* m, QexMatrix* out);

/** out = the translation in a transform.
 *  @param m    transform; may be null
 *  @param out  out; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetTranslationFromMatrix(const QexMatrix* m, QexVec3* out);

/** out = the translation matrix of GetTranslationFromMatrix.
 *  @param m    transform; may be null
 *  @param out  out; may be m; may be null
 *  @return 1, or 0 when a pointer is null. */
QEX_API int32_t GetTranslationMatrixFromMatrix(const QexMatrix* m, QexMatrix* out);
#endif

/* ======================================================================================================
 * Math: boxes, planes, equations, random numbers
 *
 * No pointer may be null except where a function says so. No GL context needed on this page.
 * ====================================================================================================== */

/** A box by its corners. QexBoundingBox_ComputeInterleaved builds one from vertices. */
typedef struct QexBoundingBox {
    QexVec3 corners[8]; /* with 0 for the minimum and 1 for the maximum of x, y, z: 000, 001, 010, 011, 100,
                           101, 110, 111; a transform moves the corners and keeps their order */
    QexVec3 centre;     /* centre of the axis-aligned box */
    QexVec3 halfExtent; /* half sizes along x, y, z */
    float reserved[3];  /* not used */
} QexBoundingBox;

/** An axis-aligned box. It is empty when a minimum is greater than its maximum. */
typedef struct QexAABB {
    QexVec3 min; /* smallest coordinates */
    QexVec3 max; /* largest coordinates */
} QexAABB;

/** aabb = the empty box (minimum FLT_MAX, maximum -FLT_MAX), which any union replaces. */
QEX_API void QexBoundingBox_InitAABB(QexAABB* aabb);

/** aabb = the axis-aligned box around the eight corners. */
QEX_API void QexBoundingBox_GetAABBNative(const QexBoundingBox* box, QexAABB* aabb);

/** The same as QexBoundingBox_GetAABBNative. */
QEX_API void QexBoundingBox_GetAABB(const QexBoundingBox* box, QexAABB* aabb);

/** out = the smallest box around a and b. out may be a or b. */
QEX_API void QexBoundingBox_UnionAAABB(QexAABB* out, const QexAABB* a, const QexAABB* b);

/** out = what a and b have in common, empty when nothing. out may be a or b. */
QEX_API void QexBoundingBox_IntersectionAABB(QexAABB* out, const QexAABB* a, const QexAABB* b);

/** @return 1 when a and b overlap by more than an edge in x and y, else 0; z does not count. */
QEX_API int32_t QexBoundingBox_isAABBIntersectedXY(const QexAABB* a, const QexAABB* b);

/** Transforms the corners as points, with division by w. Centre and half extents of out are left alone.
 *  @param matrix  transform
 *  @param in      box
 *  @param out     out; may be in */
QEX_API void QexBoundingBox_TransformBoundingBoxNative(const QexMatrix* matrix, const QexBoundingBox* in,
                                                       QexBoundingBox* out);

/** The same as QexBoundingBox_TransformBoundingBoxNative. */
QEX_API void QexBoundingBox_TransformBoundingBox(const QexMatrix* matrix, const QexBoundingBox* in,
                                                 QexBoundingBox* out);

/** Tests two boxes with corners in axis-aligned order; boxes that touch overlap.
 *  @param a        box
 *  @param b        box
 *  @param overlap  out, a's maximum less b's minimum along each axis up to the first that separates them, 0
 *                  from there on; may be null
 *  @return 1 when they overlap along all three axes, else 0. */
QEX_API int32_t QexBoundingBox_TestBBoxBBox(const QexBoundingBox* a, const QexBoundingBox* b,
                                            QexVec3* overlap);

/** Tests a box against a camera's view volume. The far plane does not count.
 *  @param box      box
 *  @param matrix   from the box's space to clip space, depth 0..1 (projection * view * model)
 *  @param partial  out, 1 when the box is visible and reaches over the near plane, else 0
 *  @return 0 when all eight corners lie outside one side plane or before the near plane, else 1. */
QEX_API int32_t QexBoundingBox_IsVisibleFromZAxis(const QexBoundingBox* box, const QexMatrix* matrix,
                                                  int32_t* partial);

/** out = the point where a line meets a plane. A parallel line gives infinities or NaNs.
 *  @param plane  plane (a, b, c, d)
 *  @param p0     point of the line; p1 another */
QEX_API void QexMath_CalcIntersectionLinePlane(QexVec3* out, const QexVec4* plane, const QexVec3* p0,
                                               const QexVec3* p1);

/** The part of an infinite plane that a camera sees from above, as a convex polygon. The view volume's far
 *  corners are scaled by farPlane about the origin: that is exact for a projection with w = -z, such as
 *  QexMatrix_Perspective's times its farPlane. For QexMatrix_Perspective's own, 1 is exact; the far distance
 *  gives a polygon that reaches further and strays from the picture by up to the eye's distance from the
 *  origin.
 *  @param out       out, room for 5 vertices of three floats each, of any alignment
 *  @param stride    bytes from one vertex to the next, 12 for consecutive ones
 *  @param plane     plane (a, b, c, d), unit normal
 *  @param matrix    inverse of projection * view
 *  @param eye       position of the camera
 *  @param farPlane  scale of the far corners
 *  @return the number of vertices, 0 to 5; 0 when the eye is below the plane. */
QEX_API int32_t QexMath_CalculateInfinitePlane(void* out, int32_t stride, const QexVec4* plane,
                                               const QexMatrix* matrix, const QexVec3* eye, float farPlane);

/** Solves n linear equations by elimination. A singular system gives infinities or NaNs.
 *  @param result  out, the n unknowns
 *  @param rows    n rows of n + 1 floats: the right side, then the coefficients; they are changed
 *  @param n       number of equations; below 1 nothing happens */
QEX_API void QexMath_LinearEqSolve(float* result, float** rows, int32_t n);

#ifdef QEX_UNPREFIXED_NAMES
/** A random number. The first call seeds the C library's lrand48 generator with the time.
 *  @return 0 to 2147483647. */
QEX_API int32_t GetRandomNumber(void);

/** @return a random number, 0 <= f < 1. */
QEX_API float GetRandomFloat(void);

/** @return min + (max - min) * GetRandomFloat(). */
QEX_API float GetRandomFloatByRange(float min, float max);

/** A random integer: (max - min + 1) * GetRandomFloat() + min in single precision, cut towards 0.
 *  @param min  smallest result, >= 0 for an even spread; for a negative one the cut moves every result
 *              below 0 up by one, so that min hardly ever comes
 *  @param max  largest result, >= min
 *  @return min to max; up to max + 1 when max is negative. */
QEX_API int32_t GetRandomInt(int32_t min, int32_t max);
#endif

/* ======================================================================================================
 * Math: camera
 *
 * A camera is the caller's record: set it with QexCamera_LookAt and QexCamera_Project, in any order. It owns
 * nothing. The renderer reads eye, viewMatrix and projectionMatrix. No GL context needed on this page.
 * ====================================================================================================== */

/** A camera. */
typedef struct QexCamera {
    int32_t tag;                /* the application's own, not read by the engine */
    QexVec3 eye;                /* position, world space */
    QexVec3 target;             /* point looked at, world space */
    QexVec3 up;                 /* up direction, (0, 1.0001, 0) by default */
    float fov;                  /* field of view across the width, radians */
    float nearPlane;            /* distance of the near plane, > 0 */
    float farPlane;             /* distance of the far plane, > nearPlane */
    float aspect;               /* width / height */
    QexMatrix viewMatrix;       /* world to camera space */
    QexMatrix projectionMatrix; /* camera to clip space, depth 0..1 */
    QexMatrix modelViewMatrix;  /* of the last QexCamera_BuildMVPMatrix */
} QexCamera;

/** Clears a camera.
 *  @param camera  out; all fields 0 except the tag
 *  @param tag     stored for the application
 *  @return always 0. */
QEX_API int32_t QexCamera_Create(QexCamera* camera, int32_t tag);

/** Clears a camera, its tag included. Nothing is freed.
 *  @param camera  camera */
QEX_API void QexCamera_Release(QexCamera* camera);

/** Places a camera and rebuilds its view matrix.
 *  @param camera  camera
 *  @param eye     position, or null to keep the stored one
 *  @param target  point looked at, or null to keep the stored one
 *  @param up      up direction, or null for the default (0, 1.0001, 0) */
QEX_API void QexCamera_LookAt(QexCamera* camera, const QexVec3* eye, const QexVec3* target,
                              const QexVec3* up);

/** Stores the projection parameters and rebuilds the projection matrix (QexMatrix_Perspective).
 *  @param camera     camera
 *  @param fov        field of view across the width, radians
 *  @param aspect     width / height
 *  @param nearPlane  distance of the near plane, > 0
 *  @param farPlane   distance of the far plane, > nearPlane
 *  @return the camera's projection matrix, which stays the camera's. */
QEX_API QexMatrix* QexCamera_Project(QexCamera* camera, float fov, float aspect, float nearPlane,
                                     float farPlane);

/** Joins a model matrix with a camera; modelViewMatrix becomes view * model.
 *  @param camera  camera
 *  @param out     out, projection * view * model; may be model
 *  @param model   model matrix */
QEX_API void QexCamera_BuildMVPMatrix(QexCamera* camera, QexMatrix* out, const QexMatrix* model);

/** The eight corners of a view volume in camera space, wider than the projection's: half its width at
 *  distance 1 is tan(fov), half its height tan(fov) * aspect. Shadow maps are fitted to it.
 *  @param camera  camera
 *  @param out     out, 8 corners: near (+x +y), (-x +y), (-x -y), (+x -y), then far in the same order */
QEX_API void QexCamera_GetFrustumVerticesInObjectSpace(const QexCamera* camera, QexVec3* out);

/* ======================================================================================================
 * Resources: whole files in memory, the bounded reading cursor, caches
 *
 * Records belong to the caller; what a Create function allocates is released by the matching Release. No GL
 * context needed on this page.
 * ====================================================================================================== */

/** A whole file in memory: read from disk into a block of its own, or a view of the caller's bytes. */
typedef struct QexResFile {
    uint32_t open;       /* 1 when the record holds data */
    uint32_t memoryFile; /* 1 when the data is the caller's and is not released */
    uint32_t size;       /* data bytes */
    uint8_t* data;       /* the bytes; those read from disk are followed by one extra 0 byte */
    char path[64];       /* the first 63 characters of the path; "" for a memory file */
} QexResFile;

/** Reads a whole file. Test QexResFile_IsOpen afterwards: a file that opens and cannot be read in full (a
 *  directory, 2 GiB or more, no memory) gives 0 with the record closed and no message.
 *  @param record  out; what it held is overwritten, not released
 *  @param path    path of the file; the record keeps its first 63 characters; null counts as missing
 *  @return 0 when the file could be opened, -1 when it could not or is a pipe (logged with the path). */
QEX_API int32_t QexResFile_Create(QexResFile* record, const char* path);

/** Opens a view of a block. The block is not copied and stays the caller's.
 *  @param record  out; what it held is overwritten, not released
 *  @param data    the bytes, alive until the record is closed; null with a size above 0 leaves it closed
 *  @param size    number of bytes
 *  @return always 0. */
QEX_API int32_t QexResFile_CreateFromMemory(QexResFile* record, const void* data, uint32_t size);

/** @return 1 when the record holds data, else 0. */
QEX_API uint32_t QexResFile_IsOpen(const QexResFile* record);

/** @return 1 when the data belongs to the caller of QexResFile_CreateFromMemory, else 0. */
QEX_API uint32_t QexResFile_IsMemoryFile(const QexResFile* record);

/** @return the number of data bytes, 0 for a closed record. */
QEX_API uint32_t QexResFile_GetSize(const QexResFile* record);

/** @return the data, null for a closed record; it stays the record's, valid until it is closed. */
QEX_API uint8_t* QexResFile_DataPtr(const QexResFile* record);

/** The data as text. Only a file read from disk is sure to end in a 0 byte.
 *  @return the data, null for a closed record; it stays the record's, valid until it is closed. */
QEX_API char* QexResFile_StringPtr(const QexResFile* record);

/** @return the record's path field, at most 63 characters, never null; kept when the record is closed. */
QEX_API const char* QexResFile_GetReadPath(const QexResFile* record);

/** Replaces the record's path field. Nothing is read.
 *  @param record  record, not null
 *  @param path    new path, of which the first 63 characters are kept, or null for an empty one */
QEX_API void QexResFile_SetReadPath(QexResFile* record, const char* path);

/** Closes a record: releases the data unless it is the caller's. The path is kept. A closed record is left
 *  as it is.
 *  @param record  created record, not null */
QEX_API void QexResFile_Close(QexResFile* record);

/** The same as QexResFile_Close.
 *  @param record  created record, not null */
QEX_API void QexResFile_Release(QexResFile* record);

/** @param path  path of a file; null counts as missing
 *  @return 1 when the file can be opened for reading, else 0; 0 for a pipe. */
QEX_API int32_t QexResFile_Exists(const char* path);

/** A forward-reading cursor over a whole file. Words are little-endian in the data on every host. Nothing is
 *  read past the end; every read of a stream that is not open fails. */
typedef struct QexSourceStream {
    QexResFile* file;  /* the stream's own; null when it is not open */
    uint32_t position; /* offset of the next byte, 0 to the file's size */
} QexSourceStream;

/** Opens a file from disk.
 *  @param stream  out; what it held is overwritten, not released
 *  @param path    path of the file
 *  @return 1, or 0 with the stream not open (logged). Release with QexSourceStream_Release. */
QEX_API int32_t QexSourceStream_Create(QexSourceStream* stream, const char* path);

/** Opens a view of a block. The block is not copied and stays the caller's.
 *  @param stream  out; what it held is overwritten, not released
 *  @param data    the bytes, alive until the stream is released
 *  @param size    number of bytes
 *  @return 1, or 0 with the stream not open (logged): no memory, or null data with a size above 0. */
QEX_API int32_t QexSourceStream_CreateFromMemory(QexSourceStream* stream, const void* data, uint32_t size);

/** Closes a stream and releases its file. A stream that is not open is left as it is.
 *  @param stream  created stream, not null */
QEX_API void QexSourceStream_Release(QexSourceStream* stream);

/** Copies the next bytes and advances.
 *  @param stream       stream, not null
 *  @param destination  out, count bytes; not written on failure
 *  @param count        number of bytes
 *  @return 1, or 0 when fewer bytes are left: the position stays, nothing is logged. */
QEX_API int32_t QexSourceStream_Read(QexSourceStream* stream, uint8_t* destination, uint32_t count);

/** Reads one 16-bit word.
 *  @param stream       stream, not null
 *  @param destination  out; not written on failure
 *  @return 1, or 0 when fewer than 2 bytes are left (logged): the position stays. */
QEX_API int32_t QexSourceStream_Read16(QexSourceStream* stream, uint16_t* destination);

/** Reads one 32-bit word.
 *  @param stream       stream, not null
 *  @param destination  out; not written on failure
 *  @return 1, or 0 when fewer than 4 bytes are left: the position stays, nothing is logged. */
QEX_API int32_t QexSourceStream_Read32(QexSourceStream* stream, uint32_t* destination);

/** Reads 16-bit words. When the data ends early, the elements that are there are read, and each missing one
 *  is logged, up to 32 of them.
 *  @param stream       stream, not null
 *  @param destination  out, count words
 *  @param count        number of words; 0 succeeds
 *  @return 1 when all were read, else 0. */
QEX_API int32_t QexSourceStream_ReadArray16(QexSourceStream* stream, uint16_t* destination, uint32_t count);

/** Reads 32-bit words. When the data ends early, the elements that are there are read, and one line is
 *  logged.
 *  @param stream       stream, not null
 *  @param destination  out, count words
 *  @param count        number of words; 0 succeeds
 *  @return 1 when all were read, else 0. */
QEX_API int32_t QexSourceStream_ReadArray32(QexSourceStream* stream, uint32_t* destination, uint32_t count);

/** Reads a block marker of the POD format: the identifier, then the block's length in bytes.
 *  @param stream      stream, not null
 *  @param identifier  out
 *  @param length      out
 *  @return 1, or 0 at the end of the data: silently when no identifier is left, logged when the marker is
 *          cut after its identifier (which is then read). */
QEX_API int32_t QexSourceStream_ReadMarker(QexSourceStream* stream, uint32_t* identifier, uint32_t* length);

/** Advances without copying.
 *  @param stream  stream, not null
 *  @param count   number of bytes
 *  @return 1, or 0 when fewer bytes are left (logged): the position stays. */
QEX_API int32_t QexSourceStream_Skip(QexSourceStream* stream, uint32_t count);

/** Cache results. */
#define QEX_CACHE_NO_MEMORY (-6) /* allocation failed, or no cache */
#define QEX_CACHE_PRESENT (-5)   /* the name is in the cache already */
#define QEX_CACHE_NO_ENTRY (-2)  /* no entry at that index */

/** A growable array of elements of one size, stored by value. */
typedef struct QexDataCache {
    void* data;           /* the elements; the cache's own */
    uint32_t elementSize; /* bytes of an element */
    uint32_t capacity;    /* elements that the block can hold */
    uint32_t count;       /* elements that it holds */
} QexDataCache;

/** Bytes of a name in a QexNameCache. A longer name is cut; one of 32 bytes has no terminating 0. */
#define QEX_CACHE_NAME_SIZE 32

/** Elements found by name. Entry i of one cache belongs to entry i of the other. */
typedef struct QexNameCache {
    QexDataCache names;    /* slots of QEX_CACHE_NAME_SIZE bytes */
    QexDataCache elements; /* the elements */
} QexNameCache;

/** Prepares a cache.
 *  @param cache        out; what it held is overwritten, not released
 *  @param capacity     elements to make room for at once; 0 allocates nothing yet
 *  @param elementSize  bytes of an element
 *  @return 0, or QEX_CACHE_NO_MEMORY with an empty cache. Release with QexDataCache_Release. */
QEX_API int32_t QexDataCache_Create(QexDataCache* cache, uint32_t capacity, uint32_t elementSize);

/** Appends a copy of an element. A full block of at most 1024 bytes doubles, a larger one grows by a fifth
 *  (by one element at least), which may move it.
 *  @param cache    cache; null gives QEX_CACHE_NO_MEMORY
 *  @param element  elementSize bytes; may be an element of the same cache
 *  @return 0, or QEX_CACHE_NO_MEMORY with the cache as it was. */
QEX_API int32_t QexDataCache_Add(QexDataCache* cache, const void* element);

/** @param cache  cache, not null
 *  @param index  slot, 0 to capacity - 1; slots from count on hold undefined bytes
 *  @return the slot, valid until the cache grows or is released; null when the index is not below the
 *          capacity. */
QEX_API void* QexDataCache_Get(const QexDataCache* cache, uint32_t index);

/** @return the number of elements that the cache holds. */
QEX_API uint32_t QexDataCache_GetSize(const QexDataCache* cache);

/** Removes an element; those after it move down by one slot.
 *  @param cache  cache, not null
 *  @param index  element, 0 to count - 1; others are ignored */
QEX_API void QexDataCache_Remove(QexDataCache* cache, uint32_t index);

/** Forgets all elements and keeps the block.
 *  @param cache  cache, not null */
QEX_API void QexDataCache_Clear(QexDataCache* cache);

/** Releases the block. The cache is empty afterwards, with capacity 0, and may be added to again.
 *  @param cache  cache, not null */
QEX_API void QexDataCache_Release(QexDataCache* cache);

/** Prepares a name cache.
 *  @param cache        out; what it held is overwritten, not released
 *  @param capacity     entries to make room for at once; 0 allocates nothing yet
 *  @param elementSize  bytes of an element
 *  @return 0, or QEX_CACHE_NO_MEMORY with an empty cache. Release with QexNameCache_Release. */
QEX_API int32_t QexNameCache_Create(QexNameCache* cache, uint32_t capacity, uint32_t elementSize);

/** Appends an entry under a name that is not in the cache yet.
 *  @param cache    cache; null gives QEX_CACHE_NO_MEMORY
 *  @param name     name, of which the first 32 bytes count; null counts as ""
 *  @param element  elementSize bytes, copied
 *  @return 0, QEX_CACHE_PRESENT, or QEX_CACHE_NO_MEMORY; the cache is as it was after both failures. */
QEX_API int32_t QexNameCache_Add(QexNameCache* cache, const char* name, const void* element);

/** Looks an entry up by name, in order.
 *  @param cache    cache, not null
 *  @param name     name, of which the first 32 bytes count; null counts as ""
 *  @param element  out, the element's slot, or null when there is no such entry; may be null
 *  @return the entry's index, or -1. */
QEX_API int32_t QexNameCache_Find(const QexNameCache* cache, const char* name, void** element);

/** @param cache  cache, not null
 *  @param name   name, of which the first 32 bytes count
 *  @return the element under that name, valid until the cache grows or changes, or null. */
QEX_API void* QexNameCache_GetDataByName(const QexNameCache* cache, const char* name);

/** @param cache  cache, not null
 *  @param index  slot, 0 to the elements' capacity - 1
 *  @return the element's slot, valid until the cache grows or changes, or null. */
QEX_API void* QexNameCache_GetData(const QexNameCache* cache, uint32_t index);

/** Copies an entry's name, always with a terminating 0.
 *  @param cache        cache, not null
 *  @param index        entry, 0 to count - 1
 *  @param destination  out, at least 33 bytes; not written on failure
 *  @return 0, or QEX_CACHE_NO_ENTRY. */
QEX_API int32_t QexNameCache_GetName(const QexNameCache* cache, uint32_t index, char* destination);

/** @return the number of entries. */
QEX_API uint32_t QexNameCache_GetSize(const QexNameCache* cache);

/** Removes an entry; those after it move down by one.
 *  @param cache  cache, not null
 *  @param index  entry, 0 to count - 1; others are ignored */
QEX_API void QexNameCache_Remove(QexNameCache* cache, uint32_t index);

/** Removes the entry under a name; an unknown name changes nothing.
 *  @param cache  cache, not null
 *  @param name   name, of which the first 32 bytes count */
QEX_API void QexNameCache_RemoveByName(QexNameCache* cache, const char* name);

/** Forgets all entries and keeps the blocks.
 *  @param cache  cache, not null */
QEX_API void QexNameCache_Clear(QexNameCache* cache);

/** Releases both blocks. The cache is empty afterwards and may be added to again.
 *  @param cache  cache, not null */
QEX_API void QexNameCache_Release(QexNameCache* cache);

/* ======================================================================================================
 * POD scenes: records, reading, vertex access
 *
 * A scene is read from a POD 2.0 file into plain records whose arrays belong to the scene. Reading checks
 * everything that drawing relies on (indices, parents, materials, textures, bones, batches, strips, keys,
 * offsets), so that a scene that was read is safe to draw. No GL context needed on this page.
 * ====================================================================================================== */

/** POD data types of a vertex element. Integer types are converted as they are, normalised types to 0..1 or
 *  -1..1 by the divisor named. */
#define QEX_POD_FLOAT 1                /* 32-bit float */
#define QEX_POD_INT 2                  /* 32-bit signed integer */
#define QEX_POD_UNSIGNED_SHORT 3       /* 16-bit unsigned integer */
#define QEX_POD_RGBA 4                 /* one word, R in the top byte, then G, B, A; / 255 */
#define QEX_POD_ARGB 5                 /* one word, A in the top byte, then R, G, B; / 255 */
#define QEX_POD_D3DCOLOR 6             /* as QEX_POD_ARGB */
#define QEX_POD_UBYTE4 7               /* four bytes in memory order */
#define QEX_POD_DEC3N 8                /* one word of three signed 10-bit fields; / 511 */
#define QEX_POD_FIXED16_16 9           /* 16.16 fixed point; / 65536 */
#define QEX_POD_UNSIGNED_BYTE 10       /* 8-bit unsigned integer */
#define QEX_POD_SHORT 11               /* 16-bit signed integer */
#define QEX_POD_SHORT_NORM 12          /* 16-bit signed; / 32767 */
#define QEX_POD_BYTE 13                /* 8-bit integer */
#define QEX_POD_BYTE_NORM 14           /* 8-bit; / 127 */
#define QEX_POD_UNSIGNED_BYTE_NORM 15  /* 8-bit unsigned; / 255 */
#define QEX_POD_UNSIGNED_SHORT_NORM 16 /* 16-bit unsigned; / 65535 */
#define QEX_POD_UNSIGNED_INT 17        /* 32-bit unsigned integer */

/** One vertex element (positions, normals, a UV channel, ...) or the face indices of a mesh. */
typedef struct CPODData {
    uint32_t type;           /* QEX_POD_FLOAT .. QEX_POD_UNSIGNED_INT; 0 or 1 while unset */
    uint32_t componentCount; /* components a vertex, 0 when the mesh has no such element */
    uint32_t stride;         /* bytes from one vertex to the next; 0 for tightly packed own data */
    uint8_t* data; /* the element's own bytes, or its byte offset into the mesh's interleaved block */
} CPODData;

/** A scene camera. Its node is node (meshNodeCount + lightCount + camera index). */
typedef struct QexPODCamera {
    int32_t targetIndex; /* node that it looks at, -1 for none */
    float fov;           /* field of view in radians, horizontal */
    float farPlane;      /* distance of the far plane */
    float nearPlane;     /* distance of the near plane */
    float* animatedFov;  /* field of view per frame, or null */
} QexPODCamera;

/** Light types of QexPODLight. */
#define QEX_POD_LIGHT_POINT 0
#define QEX_POD_LIGHT_DIRECTIONAL 1
#define QEX_POD_LIGHT_SPOT 2

/** A scene light. Its node is node (meshNodeCount + light index). */
typedef struct QexPODLight {
    int32_t targetIndex; /* node that it shines at, -1 for none */
    float colour[3];     /* red, green, blue */
    uint32_t type;       /* QEX_POD_LIGHT_POINT, _DIRECTIONAL or _SPOT */
    float constantAttenuation;
    float linearAttenuation;
    float quadraticAttenuation;
    float fallOffAngle; /* radians */
    float fallOffExponent;
} QexPODLight;

/** A texture: only its file name; loading it is the model's business. */
typedef struct QexPODTexture {
    char* name; /* file name as the scene gives it */
} QexPODTexture;

/** A material. Texture indices are -1 for none. */
typedef struct QexPODMaterial {
    char* name;
    int32_t diffuseTexture;
    int32_t ambientTexture;
    int32_t specularColourTexture;
    int32_t specularLevelTexture;
    int32_t bumpTexture;
    int32_t emissiveTexture;
    int32_t glossinessTexture;
    int32_t opacityTexture;
    int32_t reflectionTexture;
    int32_t refractionTexture;
    float opacity;    /* 0 invisible to 1 opaque */
    float ambient[3]; /* red, green, blue */
    float diffuse[3];
    float specular[3];
    float shininess;         /* 0..1; the shaders use 256 times this */
    char* effectFile;        /* effect file name, or null */
    char* effectName;        /* effect name, or null */
    uint32_t blendSrcColour; /* GL blend factors and operations */
    uint32_t blendSrcAlpha;
    uint32_t blendDstColour;
    uint32_t blendDstAlpha;
    uint32_t blendOpColour;
    uint32_t blendOpAlpha;
    float blendColour[4];
    float blendFactor[4];
    uint32_t flags;
} QexPODMaterial;

/** The batches of a skinned mesh: each draws a run of triangles with a small set of bones. */
typedef struct QexBoneBatches {
    int32_t* boneTable;     /* batchCount rows of maxBones node indices; -1: follows the mesh node */
    int32_t* bonesPerBatch; /* bones used in each row */
    int32_t* offsets;       /* first triangle of each batch, rising from 0 */
    int32_t maxBones;       /* length of a row of boneTable */
    int32_t batchCount;     /* 0 when the mesh has no batches */
} QexBoneBatches;

/** Vertex elements in the order of QexPODMesh.attributes. */
typedef enum QexVertexElement {
    QEX_ELEMENT_POSITION,
    QEX_ELEMENT_NORMAL,
    QEX_ELEMENT_TANGENT,
    QEX_ELEMENT_BINORMAL,
    QEX_ELEMENT_UV0,
    QEX_ELEMENT_BONE_INDEX,
    QEX_ELEMENT_BONE_WEIGHT,
    QEX_ELEMENT_COUNT
} QexVertexElement;

/** How one element lies in the mesh's GL vertex buffer, ready for glVertexAttribPointer. */
typedef struct QexVertexAttribute {
    int32_t componentCount; /* 1 to 4, 0 when the mesh has no such element */
    uint32_t glType;        /* GL_FLOAT, GL_UNSIGNED_BYTE, ... */
    uint32_t normalised;    /* 1 when integers map to 0..1 or -1..1 */
    uint32_t stride;        /* bytes from vertex to vertex */
    uint32_t offset;        /* bytes from the start of the buffer */
} QexVertexAttribute;

/** A mesh. */
typedef struct QexPODMesh {
    uint32_t vertexCount;
    uint32_t faceCount; /* triangles */
    uint32_t uvwChannelCount;
    CPODData faces;         /* indices, 16- or 32-bit, always with their own data; no data: not indexed */
    uint32_t* stripLengths; /* triangles in each strip, or null */
    uint32_t stripCount;    /* 0 when the faces are a plain list */
    CPODData vertices;      /* positions */
    CPODData normals;
    CPODData tangents;
    CPODData binormals;
    CPODData* uvws; /* uvwChannelCount UV channels */
    CPODData colours;
    CPODData boneIndices; /* indices into the bone list of the vertex's batch */
    CPODData boneWeights;
    uint8_t* interleaved;      /* the vertex block that the elements' data are offsets into, or null */
    uint32_t interleavedBytes; /* its length */
    uint32_t skinned;          /* 1 when the mesh follows bones */
    uint32_t passID;           /* pass that draws it, see QexPODModel_SetPassID */
    QexBoneBatches boneBatches;
    uint32_t reserved;
    QexMatrix unpackMatrix; /* turns stored positions into model positions; identity unless given */
    /* Filled by QexModel_DownloadGeometry: */
    QexBoundingBox localBox;                          /* box of the positions */
    QexVertexAttribute attributes[QEX_ELEMENT_COUNT]; /* layout of the GL vertex buffer */
} QexPODMesh;

/** Animation flags of a node: which of its keys change from frame to frame. */
#define QEX_NODE_POSITION_ANIMATED 1u
#define QEX_NODE_ROTATION_ANIMATED 2u
#define QEX_NODE_SCALE_ANIMATED 4u
#define QEX_NODE_MATRIX_ANIMATED 8u

/** State flags of a node. */
#define QEX_NODE_ANIMATION_ENABLED 0x01u
#define QEX_NODE_RENDERING_ENABLED 0x02u
#define QEX_NODE_POSITION_CHANGED 0x04u
#define QEX_NODE_ROTATION_CHANGED 0x08u
#define QEX_NODE_SCALE_CHANGED 0x10u
#define QEX_NODE_OVERRIDDEN 0x20u

/** Ownership flags of a node: arrays that lie in the memory that the scene was read from. */
#define QEX_NODE_SHARED_MATRIX 0x40u
#define QEX_NODE_SHARED_SCALE 0x80u
#define QEX_NODE_SHARED_POSITION 0x200u

/** Bit of QexPODNode.blendFlags: the node is drawn in the opaque pass. */
#define QEX_NODE_OPAQUE 0x80u

/** A node. Mesh nodes come first, then the lights', then the cameras', then all others. Key arrays that lie
 *  in the caller's memory may be unaligned: read them with memcpy. */
typedef struct QexPODNode {
    int32_t objectIndex; /* its mesh, light or camera */
    char* name;
    int32_t materialIndex;   /* -1 for none */
    int32_t parentIndex;     /* -1 for a root */
    uint32_t animationFlags; /* QEX_NODE_..._ANIMATED */
    uint32_t* positionIndex; /* per frame the float offset of its key, or null: keys follow each other */
    float* position;         /* 3 floats a key, or null */
    uint32_t* rotationIndex;
    float* rotation; /* quaternions x, y, z, w, 4 floats a key */
    uint32_t* scaleIndex;
    float* scale; /* 7 floats a key, the first three the scale */
    uint32_t* matrixIndex;
    float* matrix;             /* 16 floats a key; a node with matrices ignores the other keys */
    float speed;               /* factor on the frame advance, 1 after reading */
    float frameFraction;       /* the node's own frame: fraction */
    uint32_t frame;            /* and integer part */
    uint32_t stateFlags;       /* QEX_NODE_ANIMATION_ENABLED .. QEX_NODE_OVERRIDDEN */
    float overrideScale[3];    /* (1, 1, 1) after reset */
    float overrideRotation[3]; /* Euler angles in degrees, (0, 0, 0) after reset */
    float overridePosition[3]; /* (0, 0, 0) after reset */
    uint32_t ownershipFlags;   /* QEX_NODE_SHARED_... */
    QexMatrix overrideScaleMatrix;
    QexMatrix overrideRotationMatrix;
    QexMatrix overrideTranslationMatrix;
    QexMatrix overrideMatrix; /* applied in front of the animated matrix while QEX_NODE_OVERRIDDEN is set */
    QexShaderModule* shader;  /* draws the node; null: never drawn */
    uint8_t blendFlags;       /* QEX_NODE_OPAQUE */
    int32_t blendOrder;       /* for the application, see QexModel_SetAlphaBlendingNodesWithOrder */
    /* Frames that have keys of their own, of position, rotation, scale and matrix; later frames hold the last
       key. 0: all frames have. */
    uint32_t keyFrames[4];
} QexPODNode;

/** The run-time part of a scene: current frame and world matrices. */
typedef struct SPVRTPODImpl {
    float frame;               /* frame last set, as given */
    float frameFraction;       /* the same within the animation: fraction */
    uint32_t frameInteger;     /* and integer part */
    float* cacheKeys;          /* per node: frame + fraction that its cached matrix belongs to, -1 none */
    QexMatrix* cachedMatrices; /* per node: world matrix */
    QexMatrix* bindPose;       /* per node: world matrix at frame 0 */
    uint32_t reserved;
    QexMatrix* inverseBindPose; /* per node: affine inverse of bindPose */
    QexMatrix* boneMatrices;    /* per node: its matrix as a bone of the mesh node named next */
    int32_t* boneMeshNodes;     /* per node: index of that mesh node, -1 while the matrix is not valid */
} SPVRTPODImpl;

/** A scene. */
struct QexPODModel {
    float backgroundColour[3];
    float ambientColour[3];
    uint32_t cameraCount;
    QexPODCamera* cameras;
    uint32_t lightCount;
    QexPODLight* lights;
    uint32_t meshCount;
    QexPODMesh* meshes;
    uint32_t nodeCount;     /* all nodes */
    uint32_t meshNodeCount; /* the first nodes: those that draw meshes */
    QexPODNode* nodes;
    uint32_t textureCount;
    QexPODTexture* textures;
    uint32_t materialCount;
    QexPODMaterial* materials;
    uint32_t frameCount;      /* 0 or 1: not animated */
    uint32_t framesPerSecond; /* 30 unless the file says otherwise */
    uint32_t flags;
    SPVRTPODImpl* runtime; /* null until the scene was read whole */
    uint32_t cacheStale;   /* 1: every world matrix is recomputed when next asked for */
    uint32_t highestPass;  /* highest pass given to QexPODModel_SetPassID */
};

/** Reads a POD file.
 *  @param scene    filled; its former contents are overwritten, not released
 *  @param path     file path
 *  @param optionA  passed on to QexPODModel_ReadFromSourceStream, like the three after it
 *  @return 0 when the file could be read, -1 when not. What its bytes hold does not show here: a scene
 *  that was read whole has a non-null `runtime`; otherwise it is partly filled. Release it in both cases. */
QEX_API int32_t QexPODModel_ReadFromFile(QexPODModel* scene, const char* path, uint32_t optionA,
                                         uint32_t option2, uint32_t optionB, uint32_t option4);

/** Reads a POD scene from memory. Position, scale and matrix keys stay in `data` where its bytes can serve as
 *  they are (QEX_NODE_SHARED_...), so `data` must outlive the scene.
 *  @param size  bytes of data
 *  @return 0, or -1 when the stream could not be created; see QexPODModel_ReadFromFile for the rest. */
QEX_API int32_t QexPODModel_ReadFromMemory(QexPODModel* scene, const void* data, uint32_t size,
                                           uint32_t optionA, uint32_t option2, uint32_t optionB,
                                           uint32_t option4);

/** Reads a POD scene from an open stream, from its position to its end.
 *  @param scene    filled; null reads and checks only the blocks outside the scene, which ends in -1 unless
 *                  optionA or optionB is set
 *  @param stream   open stream; null or closed gives -1, without a line
 *  @param optionA  non-zero: the end of the stream finishes the read even without version or scene
 *  @param option2  not read
 *  @param optionB  as optionA
 *  @param option4  not read
 *  @return 0, or -1 with one line in the log that says what is wrong and where. After -1 the scene is partly
 *  filled and only good to be released. */
QEX_API int32_t QexPODModel_ReadFromSourceStream(QexPODModel* scene, QexSourceStream* stream,
                                                 uint32_t optionA, uint32_t option2, uint32_t optionB,
                                                 uint32_t option4);

/** Builds the run-time part of a scene (frame 0, bind pose); an existing one is replaced. Reading calls it.
 *  @return 0, or -1 when memory runs out. */
QEX_API int32_t QexPODModel_InitImpl(QexPODModel* scene);

/** Frees everything that the scene holds and clears the pointers; memory that it was read from is left alone.
 *  A scene of zeros, or a partly read one, is fine. */
QEX_API void QexPODModel_Release(QexPODModel* scene);

/** Sets all fields of the run-time part to zero. */
QEX_API void SPVRTPODImpl_Contructor(SPVRTPODImpl* impl);

/** Frees the arrays of the run-time part (not the record) and clears their pointers. */
QEX_API void SPVRTPODImpl_Destructor(SPVRTPODImpl* impl);

/** Frees an element's own data and resets it: type 1, 0 components, stride 0. Not for elements whose data is
 *  an offset into an interleaved block. */
QEX_API void CPODData_Reset(CPODData* element);

/** @return the number of indices that drawing the mesh takes: 3 a face, or for strips the sum of their
 *  lengths + 2. */
QEX_API uint32_t QexPODModel_CountIndices(const QexPODMesh* mesh);

/** Gives a mesh the pass in which it is drawn (0 after reading) and raises the scene's highest pass.
 *  @param mesh  a mesh of the scene */
QEX_API void QexPODModel_SetPassID(QexPODModel* scene, QexPODMesh* mesh, uint32_t passID);

/** Reads one vertex element as floats.
 *  @param out     4 floats; starts as (0, 0, 0, 1)
 *  @param source  the element's bytes, of any alignment
 *  @param type    QEX_POD_...; another value leaves (0, 0, 0, 1)
 *  @param count   components, 1 to 4; types that hold a fixed number ignore it
 *  Bytes of types 13 and 14 are read as unsigned. */
QEX_API void QexPODVertex_ReadVec(float* out, const void* source, uint32_t type, int32_t count);

/** Reads one index.
 *  @param out   not written unless type is QEX_POD_UNSIGNED_SHORT or QEX_POD_UNSIGNED_INT */
QEX_API void QexPODVertex_ReadInt(uint32_t* out, const void* source, uint32_t type);

/** Writes one vertex element: the inverse of QexPODVertex_ReadVec. Integers are truncated, colours clamped to
 *  0..1, normalised types scaled by their divisor; values beyond a type's range are clamped to it.
 *  @param destination  of any alignment
 *  @param values       4 floats */
QEX_API void QexVertexWriteVec(void* destination, uint32_t type, int32_t count, const float* values);

/** Computes the box of float positions in an interleaved block: corners, centre, half extents.
 *  @param box     out
 *  @param data    the block
 *  @param count   vertices; 0 or less gives a box of zeros
 *  @param offset  byte offset of the position (3 floats) in a vertex
 *  @param stride  bytes a vertex */
QEX_API void QexBoundingBox_ComputeInterleaved(QexBoundingBox* box, const void* data, int32_t count,
                                               uint32_t offset, uint32_t stride);

/* ======================================================================================================
 * POD scenes: bone batching
 *
 * A skinned mesh may follow more bones than a vertex shader has room for matrices. Batching cuts it into runs
 * of triangles that need few bones each. Scenes read from files usually bring their batches; these functions
 * make them for other data, and export the small containers that the work uses. No pointer may be null except
 * where a function says so. No GL context needed.
 * ====================================================================================================== */

/** A set of bone indices with a fixed capacity. */
typedef struct CBatch {
    int32_t capacity;
    int32_t count;
    int32_t* bones; /* capacity entries, owned; null before CBatch_SetSize */
} CBatch;

/** An array of elements of one size that grows at its end. */
typedef struct CGrowableArray {
    void* data;           /* owned; from QexMemory_Alloc */
    uint32_t elementSize; /* bytes */
    uint32_t elementCount;
} CGrowableArray;

/** A growing array of integers. */
typedef struct CStdVectorInt {
    uint32_t capacity;
    uint32_t size;
    int32_t* data; /* owned */
} CStdVectorInt;

/** Makes an empty set without room. */
QEX_API void CBatch_Constructor(CBatch* batch);

/** Frees the set's storage. CBatch_Constructor makes it usable again. */
QEX_API void CBatch_Destructor(CBatch* batch);

/** Empties the set and gives it room for `capacity` bones; without memory, or below 1, for none. */
QEX_API void CBatch_SetSize(CBatch* batch, int32_t capacity);

/** Empties the set. */
QEX_API void CBatch_Clear(CBatch* batch);

/** Adds a bone. @return 1, also when it is there already; 0 when it is negative or the set is full. */
QEX_API int32_t CBatch_Add(CBatch* batch, int32_t bone);

/** @return 1 when the set holds the bone, else 0. */
QEX_API int32_t CBatch_ContainsIdx(const CBatch* batch, int32_t bone);

/** @return 1 when every bone of b is in a (an empty b always is), else 0. */
QEX_API int32_t CBatch_Contains(const CBatch* a, const CBatch* b);

/** @return the number of b's bones that a lacks, or -1 when a has no room for them. */
QEX_API int32_t CBatch_TestMerge(const CBatch* a, const CBatch* b);

/** Adds b's bones to a, as far as there is room. */
QEX_API void CBatch_Merge(CBatch* a, const CBatch* b);

/** Makes a's bones those of b, as far as there is room. */
QEX_API void CBatch_Assign(CBatch* a, const CBatch* b);

/** Makes a new set with b's capacity and bones. @param a  uninitialised */
QEX_API void CBatch_CopyConstructor(CBatch* a, const CBatch* b);

/** Copies the bones out. @param destination  room for the set's bones  @param count  their number, out */
QEX_API void CBatch_Write(const CBatch* batch, int32_t* destination, int32_t* count);

/** Turns a vertex's bones into positions within the set.
 *  @param indices  n bone indices, changed: a bone of weight 0 becomes 0, one that is not in the set stays
 *  @param weights  n weights */
QEX_API void CBatch_GetVertexBoneIndices(const CBatch* batch, float* indices, const float* weights,
                                         int32_t n);

/** Makes an empty array. @param elementSize  bytes */
QEX_API void CGrowableArray_Constructor(CGrowableArray* array, uint32_t elementSize);

/** Frees the array's block and empties it. */
QEX_API void CGrowableArray_Destructor(CGrowableArray* array);

/** Copies n elements to the end; without memory nothing changes, and a line is printed. */
QEX_API void CGrowableArray_Append(CGrowableArray* array, const void* source, uint32_t n);

/** @return the address of element i, which is below the count; good until the array grows. */
QEX_API void* CGrowableArray_at(const CGrowableArray* array, uint32_t i);

/** @return the address of the last element, or null. */
QEX_API void* CGrowableArray_last(const CGrowableArray* array);

/** @return the number of elements. */
QEX_API uint32_t CGrowableArray_size(const CGrowableArray* array);

/** Hands the block over and empties the array.
 *  @param block  out; the caller frees it with QexMemory_Free; null when there were no elements
 *  @return the number of elements. */
QEX_API uint32_t CGrowableArray_Surrender(CGrowableArray* array, void** block);

/** Makes an empty array with room for `capacity` integers. */
QEX_API void CStdVectorInt_Constructor(CStdVectorInt* vector, uint32_t capacity);

/** Frees the array and zeroes the record. */
QEX_API void CStdVectorInt_Destructor(CStdVectorInt* vector);

/** Appends an integer; the room grows by 64 when only one place is left. Without memory nothing changes, and
 *  a line is printed. */
QEX_API void CStdVectorInt_PushBack(CStdVectorInt* vector, int32_t value);

/** @return element i, which is below the size. */
QEX_API int32_t CStdVectorInt_At(const CStdVectorInt* vector, uint32_t i);

/** @return the number of integers. */
QEX_API uint32_t CStdVectorInt_Size(const CStdVectorInt* vector);

/** Cuts a skinned mesh into batches. In triangle order, a triangle's bones go into the first batch that holds
 * them all, or widen the first one whose bones they include, or become a new batch; then every triangle goes
 * to the first batch that holds its bones. A vertex that triangles of several batches share is repeated; bone
 * indices count within the batch afterwards, and a bone of weight 0 has index 0.
 *  @param batches         out; overwritten; release with QexBoneBatches_Release. maxBones entries a row
 *  @param outVertexCount  out: the number of new vertices; may be null
 *  @param outVertices     out: the new vertices, of the same layout; the caller frees them with
 * QexMemory_Free
 *  @param indices         3 * triangleCount vertex numbers, replaced by those of the new vertices, grouped by
 *                         batch
 *  @param vertices        vertexCount vertices of `stride` bytes; bone indices there are node indices
 *  @param weightType, indexType      QEX_POD_...
 *  @param weightOffset, indexOffset  bytes from the start of a vertex
 *  @param maxBones        bones a batch, 1 or more; the skinned modules draw at most QEX_MAX_BATCH_BONES
 *  @param bonesPerVertex  1 to 4 weights and bone indices a vertex
 *  @return 0, or -1 with the indices unchanged: another number of bones a vertex, a triangle with more bones
 *  than maxBones, a bone or vertex index out of range, elements that reach beyond the stride, more than 512
 *  batches, or no memory. outVertices is not written then, and batches holds nothing to release. */
QEX_API int32_t QexBoneBatches_Create(QexBoneBatches* batches, uint32_t* outVertexCount, void** outVertices,
                                      uint32_t* indices, uint32_t vertexCount, const void* vertices,
                                      uint32_t stride, uint32_t weightOffset, uint32_t weightType,
                                      uint32_t indexOffset, uint32_t indexType, uint32_t triangleCount,
                                      int32_t maxBones, uint32_t bonesPerVertex);

/** Frees the three tables and sets the batch count to 0. */
QEX_API void QexBoneBatches_Release(QexBoneBatches* batches);

/* ======================================================================================================
 * POD scenes: animation and world matrices
 *
 * Every node has its own frame. A world matrix is computed once and kept until a frame, an override or the
 * scene's `cacheStale` flag changes. Frames beyond the last key hold the last key. Scenes with 0 or 1 frames
 * stand still. Result codes: -9 null argument, -11 no node of that name, -12 node index out of range.
 * No GL context needed on this page.
 * ====================================================================================================== */

/** Moves every node whose animation is enabled to a frame (nodes of a speed other than 1 move a part of the
 *  way forward, of a whole turn where they are there already), wrapped into the animation, whose last frame
 *  is where it starts again and shows the first.
 *  @param frame  in frames, fraction included; below 0 the loop is counted backwards from its end; what is no
 *                finite number, or 4294967040 and more either way, counts as 0 */
QEX_API void QexPODModel_SetFrame(QexPODModel* scene, float frame);

/** Sets one node's frame, wrapped by the frame count when it lies beyond the last; below 0 counts as 0.
 *  @return 0, or -12. */
QEX_API int32_t QexPODModel_SetNodeAnimationFrame(QexPODModel* scene, uint32_t index, float frame);

/** Sets one node's frame as it is, without wrapping.
 *  @param node  may be null: only the cache is marked stale
 *  @return 0. */
QEX_API int32_t QexPODModel_SetNodeAnimationFrameA(QexPODModel* scene, QexPODNode* node, float frame);

/** QexPODModel_SetNodeAnimationFrame by name. @return 0, or -11. */
QEX_API int32_t QexPODModel_SetNodeAnimationFrameByName(QexPODModel* scene, const char* name, float frame);

/** Sets one node's frame by time.
 *  @param time  seconds; the frame is framesPerSecond * time
 *  @return 0, or -1 (logged) for an index out of range. */
QEX_API int32_t QexPODModel_SetNodeAnimationTime(QexPODModel* scene, uint32_t index, float time);

/** QexPODModel_SetNodeAnimationTime by name. @return as that, or -11. */
QEX_API int32_t QexPODModel_SetNodeAnimationTimeByName(QexPODModel* scene, const char* name, float time);

/** Sets the frame of every bone of a skinned mesh node (the nodes in its batches' bone lists). A node whose
 *  mesh is not skinned, or that draws no mesh, is left as it is.
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexPODModel_SetMeshNodeBoneAnimationFrame(QexPODModel* scene, uint32_t index, float frame);

/** The same for a node given directly. @return 0, or -9 when scene or node is null. */
QEX_API int32_t QexPODModel_SetMeshNodeBoneAnimationFrameA(QexPODModel* scene, QexPODNode* node, float frame);

/** The same by name. @return 0, or -11 when no node has that name. */
QEX_API int32_t QexPODModel_SetMeshNodeBoneAnimationFrameByName(QexPODModel* scene, const char* name,
                                                                float frame);

/** Lets QexPODModel_SetFrame move a node, or not.
 *  @param enable  its lowest bit counts
 *  @return the previous bit; 0 for an index out of range. */
QEX_API uint32_t QexPODModel_EnableNodeAnimation(QexPODModel* scene, uint32_t index, uint32_t enable);

/** Lets the shader modules draw a node, or not. Arguments and result as QexPODModel_EnableNodeAnimation. */
QEX_API uint32_t QexPODModel_EnableNodeRendering(QexPODModel* scene, uint32_t index, uint32_t enable);

/** QexPODModel_EnableNodeAnimation by name; 0 when no node has that name. */
QEX_API uint32_t QexPODModel_EnableNodeAnimationByName(QexPODModel* scene, const char* name, uint32_t enable);

/** QexPODModel_EnableNodeRendering by name; 0 when no node has that name. */
QEX_API uint32_t QexPODModel_EnableNodeRenderingByName(QexPODModel* scene, const char* name, uint32_t enable);

/** Sets the position part of a node's override, which is applied in front of its animated matrix
 *  (translation * rotation * scale). An index out of range is ignored. */
QEX_API void QexPODModel_SetNodePosition(QexPODModel* scene, uint32_t index, float x, float y, float z);

/** Sets the rotation part of a node's override: degrees about x, then y, then z. */
QEX_API void QexPODModel_SetNodeRotation(QexPODModel* scene, uint32_t index, float x, float y, float z);

/** Sets the scale part of a node's override. */
QEX_API void QexPODModel_SetNodeScale(QexPODModel* scene, uint32_t index, float x, float y, float z);

/** Sets a node's whole override matrix; it is used as it is until a part is set, which replaces it. */
QEX_API void QexPODModel_SetNodeMatrix(QexPODModel* scene, uint32_t index, const QexMatrix* matrix);

/** Takes a node's override away. The world matrices that are cached stay until the next change of a frame or
 *  an override. */
QEX_API void QexPODModel_ResetNodeTransform(QexPODNode* node);

/** The node's translation at its current frame, as a matrix; identity without position keys. */
QEX_API void QexPODModel_GetTranslationMatrix(const QexPODModel* scene, QexMatrix* out,
                                              const QexPODNode* node);

/** The node's rotation at its current frame (spherical interpolation); identity without rotation keys. */
QEX_API void QexPODModel_GetRotationMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node);

/** The node's scale at its current frame; identity without scale keys. */
QEX_API void QexPODModel_GetScalingMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node);

/** The node's matrix key at its current frame, never interpolated; identity without matrix keys. */
QEX_API void QexPODModel_GetTransformationMatrix(const QexPODModel* scene, QexMatrix* out,
                                                 const QexPODNode* node);

/** The node's world matrix, from the cache while it is valid.
 *  @param node  a node of the scene */
QEX_API void QexPODModel_GetWorldMatrix(QexPODModel* scene, QexMatrix* out, QexPODNode* node);

/** The node's world matrix, computed anew (its parents' come from the cache). */
QEX_API void QexPODModel_GetWorldMatrixNoCache(QexPODModel* scene, QexMatrix* out, QexPODNode* node);

/** Goes back to frame 0 and takes the bind pose from there. */
QEX_API void QexPODModel_FlushCache(QexPODModel* scene);

/** The matrix that carries a skinned vertex from its mesh into the world along one bone:
 *  world(bone) * inverse(bind pose(bone)) * bind pose(mesh node). */
QEX_API void QexPODModel_GetBoneWorldMatrix(QexPODModel* scene, QexMatrix* out, QexPODNode* meshNode,
                                            QexPODNode* boneNode);

/** Reads a camera's position and target.
 *  @param position  out, 3 floats, world space
 *  @param target    out, 3 floats; not written when the camera has no target node
 *  @param index     0 to cameraCount - 1
 *  @return the field of view in radians at the current frame; 0, with nothing written, for a bad index. */
QEX_API float QexPODModel_GetCameraPos(QexPODModel* scene, float* position, float* target, uint32_t index);

/** Reads a camera's position and axes.
 *  @param position  out, 3 floats
 *  @param target    out, 3 floats: position minus the world matrix's second column
 *  @param up        out, 3 floats: the negated third column
 *  @return as QexPODModel_GetCameraPos. */
QEX_API float QexPODModel_GetCameraPosEx(QexPODModel* scene, float* position, float* target, float* up,
                                         uint32_t index);

/** Reads a camera's clip distances; nothing is written for a bad index. */
QEX_API void QexPODModel_GetCameraNearFar(const QexPODModel* scene, float* zNear, float* zFar,
                                          uint32_t index);

/** Reads a light's position and direction (the negated third column of its node's world matrix), 3 floats
 *  each; nothing is written for a bad index. */
QEX_API void QexPODModel_GetLight(QexPODModel* scene, float* position, float* direction, uint32_t index);

/** Reads a light's direction as 4 floats, the fourth 0.
 *  @return 0, or -1 for a point light, whose direction is given as (0.5, 0, 0.5, 0), or a bad index. */
QEX_API int32_t QexPODModel_GetLightDirection(QexPODModel* scene, uint32_t index, float* direction);

/** A point of a mesh node's plane: its first vertex in the world, 3 floats. Meshes without an interleaved
 *  block give (0, 0, 0) and a line in the log. */
QEX_API void QexPODModel_GetNodePlanePoint(QexPODModel* scene, uint32_t index, float* point);

/** The normal of a mesh node's plane: its first normal in the world, 3 floats, not normalised. Meshes without
 *  an interleaved block give (0, 1, 0) and a line in the log. */
QEX_API void QexPODModel_GetNodePlaneNormal(QexPODModel* scene, uint32_t index, float* normal);

/** @return the first node of exactly that name, or null. */
QEX_API QexPODNode* QexPODModel_FindNodeByName(const QexPODModel* scene, const char* name);

/** @return the index of the first node of exactly that name, or -1. */
QEX_API int32_t QexPODModel_FindNodeIdxByName(const QexPODModel* scene, const char* name);

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

/** Forgets what is cached, so that the next choices reach GL.
 *  @param context  not read, may be null */
QEX_API void QexRenderState_Reset(QexRuntimeContext* context);

/** Makes a GL program current unless it is. @param program  GL name, 0 for none */
QEX_API void QexRenderState_UseProgram(uint32_t program);

/** Makes a texture unit active unless it is. @param unit  GL_TEXTURE0 + n */
QEX_API void QexRenderState_ActiveTexture(uint32_t unit);

/** Binds a texture on the active unit; always reaches GL.
 *  @param target  GL_TEXTURE_2D or GL_TEXTURE_CUBE_MAP
 *  @param name    GL name, 0 for none */
QEX_API void QexRenderState_Bind(uint32_t target, uint32_t name);

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

/* ======================================================================================================
 * Textures
 *
 * A texture record is the engine's handle of a GL texture. The caller allocates it, a create or load function
 * fills it, QexTexture_Release empties it. Needs a current GL context, except where a function says not.
 * ====================================================================================================== */

/** Flags of a texture record. */
#define QEX_TEXFLAG_OWNS_PIXELS 0x10u /* `pixels` belong to the record and go with it */
#define QEX_TEXFLAG_CUBEMAP 0x80u     /* the GL object is a cube map */

/** Format codes. */
#define QEX_TEXFMT_RGBA8888 1
#define QEX_TEXFMT_RGB888 2
#define QEX_TEXFMT_RGBA4444 3
#define QEX_TEXFMT_RGBA5551 4

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

/** The legacy PVR header, as QexTexture_LoadPVRFromMem gives it back. */
typedef struct QexPVRHeader {
    uint32_t headerSize;  /* 52, or 44 for the oldest files */
    uint32_t height;      /* pixels */
    uint32_t width;       /* pixels */
    uint32_t mipmapCount; /* levels below level 0 */
    uint32_t flags;       /* bits 0..7 pixel type; 0x100 mipmaps, 0x200 twiddled, 0x1000 cube map */
    uint32_t dataSize;    /* bytes of one surface with all its levels */
    uint32_t bitsPerPixel;
    uint32_t redMask;
    uint32_t greenMask;
    uint32_t blueMask;
    uint32_t alphaMask;
    uint32_t tag; /* "PVR!" */
    uint32_t numSurfaces;
} QexPVRHeader;

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

/** Decodes one level of ETC1 to RGBA. A width or height that is no multiple of 4, 1 and 2 among them, takes
 * the upper left pixels of its last blocks, and a temporary image from QexMemory_Alloc; nothing else
 * allocates. In a block whose second base colour is out of range, which ETC1 leaves undefined, that one wraps
 * (modulo 32). No GL context needed.
 *  @param source       blocks of 8 bytes, row by row: ceil(width / 4) * ceil(height / 4) of them
 *  @param width        pixels
 *  @param height       pixels
 *  @param destination  out, width * height pixels of R, G, B, A bytes, first row first, rows not padded; A is
 * 255
 *  @param unused       not read
 *  @return the bytes of source that were used; 0, and nothing written, when a size is below 1; -1, and
 * nothing written, when memory runs out, a pointer is null, or the level has 2 GiB or more. */
QEX_API int32_t QexDecompressETC(const void* source, int32_t width, int32_t height, void* destination,
                                 int32_t unused);

/** Decodes one level of PVRTC, the first version, to RGBA. A level of less than two words a side is the upper
 *  left part of one of two words a side. Allocates nothing. No GL context needed.
 *  @param source       words of 8 bytes, in the interleaved order of PVRTC: max(width, 8) * max(height, 8) /
 * 2 bytes, or max(width, 16) * max(height, 8) / 4 with 2 bits a pixel
 *  @param twoBits      0: 4 bits a pixel; else 2
 *  @param width        pixels, a power of two
 *  @param height       pixels, a power of two
 *  @param destination  out, width * height pixels of R, G, B, A bytes, first row first, rows not padded. All
 * are 0 when source is null or a size is no power of two. Nothing is written when it is null or a size is
 * below 1. */
QEX_API void QexDecompressPVRTC(const void* source, int32_t twoBits, int32_t width, int32_t height,
                                void* destination);

/* ======================================================================================================
 * Built-in shader modules
 *
 * A module draws one mesh node of a model with one pair of GLSL ES shaders. All share one record and one
 * contract: CreateProgram makes a module, its `render` draws nodes, Release ends it; one module serves any
 * number of nodes and models. Texture units: 0 diffuse, 1 normal map, 2 shadow map, 3 alpha texture. Alpha is
 * opacity (material's times g_fQexGlobalAlpha) times the alpha source, and 0 when that is not above the
 * module's threshold; a node without a material is opaque. A mesh without one of the attributes that a module
 * reads supplies (0, 0, 0, 1) for it. DrawMesh does not check its node: it has to be a mesh node of a model
 * whose geometry is loaded. When the GL does not take a module's shaders, its reason is logged and the GL
 * error ends the process. Needs a current GL context, except to set or get thresholds, shifts and fades.
 * ====================================================================================================== */

/** Draws one node.
 *  @param module       the instance whose `render` is called
 *  @param model        a loaded model
 *  @param nodeIndex    a mesh node; one whose rendering flag is clear is skipped, as is any other number
 *  @param lights       the lights; only lit modules read them
 *  @param modelMatrix  applied in front of the node's world matrix, or null
 *  @param view         world to camera
 *  @param projection   camera to clip space
 *  @param shadow       shadow parameters; only shadow-receiving modules read them; null otherwise */
typedef void (*QexShaderRenderFn)(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                  const QexLightSet* lights, const QexMatrix* modelMatrix,
                                  const QexMatrix* view, const QexMatrix* projection,
                                  const QexShadowInfo* shadow);

/** One word of a module's record: a uniform's location or a parameter. */
typedef union QexShaderSlot {
    int32_t location;
    float value;
} QexShaderSlot;

#define QEX_SHADER_SLOTS 28

/** A module. The slots hold the uniform locations in the module's own order, then its parameters. */
struct QexShaderModule {
    QexShaderRenderFn render; /* draws a node */
    uint32_t vertexShader;    /* GL names */
    uint32_t fragmentShader;
    uint32_t program;
    QexShaderSlot slots[QEX_SHADER_SLOTS];
};

/* QexTextureShader (QEX_SHADER_TEXTURE): unlit, diffuse texture, alpha from the red of the alpha texture. It
 * takes a node whose material has an alpha texture out of the opaque pass.
 * Slots: mvpMatrix, opacity, alphaThreshold locations; the threshold. */

/** Creates the unlit texture module, threshold 0.5. @return the module, owned by the caller; null when memory
 *  runs out. */
QEX_API QexShaderModule* QexTextureShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexTextureShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexTextureShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexTextureShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexTextureShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexTextureShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexTextureShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                     const QexLightSet* lights, const QexMatrix* modelMatrix,
                                     const QexMatrix* view, const QexMatrix* projection,
                                     const QexShadowInfo* shadow);

/* QexTextureNoAlphaShader (QEX_SHADER_TEXTURE_NOALPHA): unlit, alpha from the diffuse texture's own alpha. It
 * never changes a node's pass; a node without a material keeps what is bound on unit 0.
 * Slots: mvpMatrix, opacity, alphaThreshold locations; the threshold. */

/** Creates the unlit module without alpha texture, threshold 0.5. @return as QexTextureShader_CreateProgram.
 */
QEX_API QexShaderModule* QexTextureNoAlphaShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexTextureNoAlphaShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexTextureNoAlphaShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexTextureNoAlphaShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexTextureNoAlphaShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexTextureNoAlphaShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                 uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexTextureNoAlphaShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                            const QexLightSet* lights, const QexMatrix* modelMatrix,
                                            const QexMatrix* view, const QexMatrix* projection,
                                            const QexShadowInfo* shadow);

/* QexSkinningTextureShader (QEX_SHADER_SKINNING_TEXTURE): as QexTextureShader for meshes that follow bones,
 * one draw a bone batch, up to 16 bones a batch and 4 a vertex; other meshes are not drawn. It leaves the
 * node's pass alone. Slots: boneCount, boneMatrixArray, viewProjMatrix, opacity, alphaThreshold locations;
 * the threshold. */

/** Most bones in a batch that the skinned modules draw. */
#define QEX_MAX_BATCH_BONES 16

/** Creates the unlit skinned module, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexSkinningTextureShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexSkinningTextureShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexSkinningTextureShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexSkinningTextureShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexSkinningTextureShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's batches; the module's program is current and its uniforms set.
 *  @param modelMatrix  applied in front of the bone matrices, or null
 *  @return 0. */
QEX_API int32_t QexSkinningTextureShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                  uint32_t nodeIndex, const QexMatrix* modelMatrix);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexSkinningTextureShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                             const QexLightSet* lights, const QexMatrix* modelMatrix,
                                             const QexMatrix* view, const QexMatrix* projection,
                                             const QexShadowInfo* shadow);

/* QexSimpleShader: flat white, a mask; no textures, no threshold. Slots: mvpMatrix location. */

/** Creates the flat white module. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexSimpleShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexSimpleShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexSimpleShader_Release(QexShaderModule** module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexSimpleShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexSimpleShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                    const QexLightSet* lights, const QexMatrix* modelMatrix,
                                    const QexMatrix* view, const QexMatrix* projection,
                                    const QexShadowInfo* shadow);

/* QexUVDisplacementShader (QEX_SHADER_UV_DISPLACEMENT): as QexTextureShader with the texture coordinates
 * shifted by an amount that may change from frame to frame. Slots: displacement, mvpMatrix, opacity,
 * alphaThreshold locations; shift u, shift v, threshold. */

/** Creates the unlit module with shifted texture coordinates, threshold 0.5, shift (0, 0). @return as
 * QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexUVDisplacementShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexUVDisplacementShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexUVDisplacementShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexUVDisplacementShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexUVDisplacementShader_GetAlphaThreshold(const QexShaderModule* module);
/** Sets the shift, in texture widths and heights, used from the next Render on. */
QEX_API void QexUVDisplacementShader_SetDisplacement(QexShaderModule* module, float u, float v);
/** Returns the shift through u and v. */
QEX_API void QexUVDisplacementShader_GetDisplacement(const QexShaderModule* module, float* u, float* v);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexUVDisplacementShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                 uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexUVDisplacementShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                            const QexLightSet* lights, const QexMatrix* modelMatrix,
                                            const QexMatrix* view, const QexMatrix* projection,
                                            const QexShadowInfo* shadow);

/* QexUVDisplacementNoAlphaShader (no kind): as QexTextureNoAlphaShader with shifted texture coordinates.
 * Slots as QexUVDisplacementShader. */

/** Creates the unlit module with shifted texture coordinates and without alpha texture, threshold 0.5, shift
 * (0, 0). @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexUVDisplacementNoAlphaShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexUVDisplacementNoAlphaShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexUVDisplacementNoAlphaShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexUVDisplacementNoAlphaShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexUVDisplacementNoAlphaShader_GetAlphaThreshold(const QexShaderModule* module);
/** Sets the shift, in texture widths and heights, used from the next Render on. */
QEX_API void QexUVDisplacementNoAlphaShader_SetDisplacement(QexShaderModule* module, float u, float v);
/** Returns the shift through u and v. */
QEX_API void QexUVDisplacementNoAlphaShader_GetDisplacement(const QexShaderModule* module, float* u,
                                                            float* v);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexUVDisplacementNoAlphaShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                        uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexUVDisplacementNoAlphaShader_Render(QexShaderModule* module, QexModel* model,
                                                   uint32_t nodeIndex, const QexLightSet* lights,
                                                   const QexMatrix* modelMatrix, const QexMatrix* view,
                                                   const QexMatrix* projection, const QexShadowInfo* shadow);

/* QexGouraudShader (QEX_SHADER_GOURAUD): lit per vertex: texture times (diffuse light times the material's
 * diffuse colour, plus its ambient colour). Diffuse light is the sum over the first three lights of max(0, N
 * . L) times the light's colour; it does not fall off with distance. Like all lit modules it takes a node
 * whose material has an alpha texture out of the opaque pass; a null light set is an empty one. Slots:
 * transMatrix, normalMatrix, mvpMatrix, lightCount, lightType, lightPosDir, lightColor, sceneAmbient,
 * sceneDiffuse, opacity, alphaThreshold locations; the threshold. */

/** Creates the module lit per vertex, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexGouraudShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexGouraudShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexGouraudShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexGouraudShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexGouraudShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexGouraudShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexGouraudShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                     const QexLightSet* lights, const QexMatrix* modelMatrix,
                                     const QexMatrix* view, const QexMatrix* projection,
                                     const QexShadowInfo* shadow);

/* QexGouraudSpecularShader (QEX_SHADER_GOURAUD_SPECULAR): as QexGouraudShader plus highlights per fragment:
 * the material's specular colour times the sum over three lights of pow(N . H, 256 * shininess) times the
 * light's colour, H halfway between light and camera. The camera is taken to stand at the negated translation
 * of the view matrix. Slots: as QexGouraudShader, with cameraPos before lightCount, sceneSpecular and
 * shininess before opacity. */

/** Creates the lit module with highlights, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexGouraudSpecularShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexGouraudSpecularShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexGouraudSpecularShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexGouraudSpecularShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexGouraudSpecularShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexGouraudSpecularShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                  uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexGouraudSpecularShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                             const QexLightSet* lights, const QexMatrix* modelMatrix,
                                             const QexMatrix* view, const QexMatrix* projection,
                                             const QexShadowInfo* shadow);

/* QexGouraudNormalMapShader (QEX_SHADER_GOURAUD_NORMALMAP): as QexGouraudShader, lit per fragment with a
 * tangent-space normal map on unit 1, whose texels hold the normal's x in green, y in red, z in blue, from -1
 * to 1 as 0 to 1. The module binds the blank map; a real one comes from the model's bindTextureHook. Meshes
 * need tangents; where they have those and normals, but no binormals, QexModel_DownloadGeometry makes them.
 * Slots as QexGouraudShader. */

/** Creates the normal-mapped module, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexGouraudNormalMapShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexGouraudNormalMapShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexGouraudNormalMapShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexGouraudNormalMapShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexGouraudNormalMapShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexGouraudNormalMapShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                   uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexGouraudNormalMapShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                              const QexLightSet* lights, const QexMatrix* modelMatrix,
                                              const QexMatrix* view, const QexMatrix* projection,
                                              const QexShadowInfo* shadow);

/* QexGouraudShadowShader (QEX_SHADER_GOURAUD_SHADOW): as QexGouraudShader, with the diffuse part of shadowed
 * fragments times the shadow intensity. A fragment is in shadow when it faces the shadow light, lies within
 * the shadow map, and the map holds a depth below its own less the bias. Null shadow parameters mean no
 * shadow. Slots: as QexGouraudShader, then shadowLightDir, shadowSpaceMatrix, biasValue, shadowIntensity; the
 * threshold. */

/** Creates the shadow-receiving module, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexGouraudShadowShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexGouraudShadowShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexGouraudShadowShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexGouraudShadowShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexGouraudShadowShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexGouraudShadowShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexGouraudShadowShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                           const QexLightSet* lights, const QexMatrix* modelMatrix,
                                           const QexMatrix* view, const QexMatrix* projection,
                                           const QexShadowInfo* shadow);

/* QexGouraudShadowExtShader (QEX_SHADER_GOURAUD_SHADOW_EXT): as QexGouraudShadowShader, with shadows that
 * lighten with the distance between what casts and what receives them: intensity + depth difference * fade,
 * from 0 to 1. Slots: as QexGouraudShadowShader to shadowIntensity (14), then the location of shadowFade
 * (15), the threshold (16) and the fade (17). */

/** Creates the module that receives fading shadows, threshold 0.5, fade 1. @return as
 * QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexGouraudShadowExtShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexGouraudShadowExtShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexGouraudShadowExtShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexGouraudShadowExtShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexGouraudShadowExtShader_GetAlphaThreshold(const QexShaderModule* module);
/** Sets how fast shadows lighten, in brightness per unit of shadow-map depth, used from the next Render on.
 */
QEX_API void QexGouraudShadowExtShader_SetShadowFade(QexShaderModule* module, float fade);
/** @return the fade. */
QEX_API float QexGouraudShadowExtShader_GetShadowFade(const QexShaderModule* module);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexGouraudShadowExtShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                   uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexGouraudShadowExtShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                              const QexLightSet* lights, const QexMatrix* modelMatrix,
                                              const QexMatrix* view, const QexMatrix* projection,
                                              const QexShadowInfo* shadow);

/* QexSkinningTextureNoAlphaShader (QEX_SHADER_SKINNING_TEXTURE_NOALPHA): as QexTextureNoAlphaShader for
 * meshes that follow bones; the model's bindTextureHook is not asked. Slots as QexSkinningTextureShader. */

/** Creates the unlit skinned module without alpha texture, threshold 0.5. @return as
 * QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexSkinningTextureNoAlphaShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexSkinningTextureNoAlphaShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexSkinningTextureNoAlphaShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexSkinningTextureNoAlphaShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexSkinningTextureNoAlphaShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's batches; as QexSkinningTextureShader_DrawMesh. @return 0. */
QEX_API int32_t QexSkinningTextureNoAlphaShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                         uint32_t nodeIndex, const QexMatrix* modelMatrix);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexSkinningTextureNoAlphaShader_Render(QexShaderModule* module, QexModel* model,
                                                    uint32_t nodeIndex, const QexLightSet* lights,
                                                    const QexMatrix* modelMatrix, const QexMatrix* view,
                                                    const QexMatrix* projection, const QexShadowInfo* shadow);

/* QexSkinningGouraudShader (QEX_SHADER_SKINNING_GOURAUD): as QexGouraudShader for meshes that follow bones.
 * Slots: viewProjMatrix, boneCount, boneMatrixArray, boneVecMatrixArray, lightCount, lightType, lightPosDir,
 * lightColor, sceneAmbient, sceneDiffuse, opacity, alphaThreshold locations; the threshold. */

/** Creates the lit skinned module, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexSkinningGouraudShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexSkinningGouraudShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexSkinningGouraudShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexSkinningGouraudShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexSkinningGouraudShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's batches; as QexSkinningTextureShader_DrawMesh. @return 0. */
QEX_API int32_t QexSkinningGouraudShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                  uint32_t nodeIndex, const QexMatrix* modelMatrix);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexSkinningGouraudShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                             const QexLightSet* lights, const QexMatrix* modelMatrix,
                                             const QexMatrix* view, const QexMatrix* projection,
                                             const QexShadowInfo* shadow);

/* QexSkinningGouraudSpecularShader (QEX_SHADER_SKINNING_GOURAUD_SPECULAR): highlights on meshes that follow
 * bones: all four lights count, and the highlight is multiplied by the texture. Slots: as
 * QexSkinningGouraudShader, with cameraPos before lightCount, sceneSpecular and shininess before opacity. */

/** Creates the skinned module with highlights, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexSkinningGouraudSpecularShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexSkinningGouraudSpecularShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexSkinningGouraudSpecularShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexSkinningGouraudSpecularShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexSkinningGouraudSpecularShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's batches; as QexSkinningTextureShader_DrawMesh. @return 0. */
QEX_API int32_t QexSkinningGouraudSpecularShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                          uint32_t nodeIndex, const QexMatrix* modelMatrix);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexSkinningGouraudSpecularShader_Render(QexShaderModule* module, QexModel* model,
                                                     uint32_t nodeIndex, const QexLightSet* lights,
                                                     const QexMatrix* modelMatrix, const QexMatrix* view,
                                                     const QexMatrix* projection,
                                                     const QexShadowInfo* shadow);

/* QexSkinningGouraudNormalMapShader (QEX_SHADER_SKINNING_GOURAUD_NORMALMAP): as QexGouraudNormalMapShader for
 * meshes that follow bones; all four lights count. Slots as QexSkinningGouraudShader. */

/** Creates the normal-mapped skinned module, threshold 0.5. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexSkinningGouraudNormalMapShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexSkinningGouraudNormalMapShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexSkinningGouraudNormalMapShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexSkinningGouraudNormalMapShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexSkinningGouraudNormalMapShader_GetAlphaThreshold(const QexShaderModule* module);
/** Draws a node's batches; as QexSkinningTextureShader_DrawMesh. @return 0. */
QEX_API int32_t QexSkinningGouraudNormalMapShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                           uint32_t nodeIndex, const QexMatrix* modelMatrix);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexSkinningGouraudNormalMapShader_Render(QexShaderModule* module, QexModel* model,
                                                      uint32_t nodeIndex, const QexLightSet* lights,
                                                      const QexMatrix* modelMatrix, const QexMatrix* view,
                                                      const QexMatrix* projection,
                                                      const QexShadowInfo* shadow);

/* QexDepthShader (no kind): depth as a grey level: 0 nearer than near, 1 beyond far, z / (far - near)
 * between, z being the clip-space z. No threshold; textures are bound and a node's pass changes as by
 * QexTextureShader. Slots: near, far, mvpMatrix locations. */

/** Creates the depth module; near and far are not set yet. @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexDepthShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexDepthShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexDepthShader_Release(QexShaderModule** module);
/** Sets near and far, in clip-space z, for the module's program, which must be current. far above near. */
QEX_API void QexDepthShader_SetParameters(QexShaderModule* module, float zNear, float zFar);
/** Draws a node's geometry; the module's program is current and its uniforms set. @return 0. */
QEX_API int32_t QexDepthShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexDepthShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                   const QexLightSet* lights, const QexMatrix* modelMatrix,
                                   const QexMatrix* view, const QexMatrix* projection,
                                   const QexShadowInfo* shadow);

/* QexSkinningDepthShader (no kind): as QexDepthShader for meshes that follow bones, alpha 0 where it is
 * for QexSkinningTextureShader, else 1; it leaves the node's pass alone. Slots: near, far, boneCount,
 * boneMatrixArray, viewProjMatrix, opacity, alphaThreshold locations; the threshold. */

/** Creates the skinned depth module, threshold 0.5; near and far are not set yet. @return as
 * QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexSkinningDepthShader_CreateProgram(void);
/** Compiles and links into a module's record, in place of what it holds; CreateProgram calls it. @return 0.
 */
QEX_API int32_t QexSkinningDepthShader_SetupProgram(QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexSkinningDepthShader_Release(QexShaderModule** module);
/** Sets the alpha threshold, used from the next Render on. */
QEX_API void QexSkinningDepthShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
/** @return the alpha threshold. */
QEX_API float QexSkinningDepthShader_GetAlphaThreshold(const QexShaderModule* module);
/** Sets near and far, in clip-space z, for the module's program, which must be current. far above near. */
QEX_API void QexSkinningDepthShader_SetParameters(QexShaderModule* module, float zNear, float zFar);
/** Draws a node's batches; as QexSkinningTextureShader_DrawMesh. @return 0. */
QEX_API int32_t QexSkinningDepthShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                                const QexMatrix* modelMatrix);
/** Draws a node, see QexShaderRenderFn. */
QEX_API void QexSkinningDepthShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                           const QexLightSet* lights, const QexMatrix* modelMatrix,
                                           const QexMatrix* view, const QexMatrix* projection,
                                           const QexShadowInfo* shadow);

/* QexBlurShader (no kind, no render function): one direction of a Gaussian blur, for quads over the screen;
 * it reads the attributes a_v4Position and a_v2TexCoord and the texture on unit 0. A pixel becomes the mean
 * of those beside it, the one i steps away weighted with exp(-i * i / (2 * sigma * sigma)), its alpha 1.
 * `samples` is 9, 7, 5 or anything else, no number included: 4, 3, 2 or 1 pixels on each side. The sign of
 * sigma does not count; 0, or what is no number, leaves the picture as it is.
 * Slots: a_v4Position, u_m4Projection, a_v2TexCoord, u_s2dTexture, sigma, blurSize, horizontal_or_vertical,
 * samples locations; the projection, 16 floats by columns. */

/** Creates the blur module with sigma 5, 9 samples, steps of a pixel of the screen, for the upper left
 *  quarter of the screen.
 *  @param context  its size is the screen's, 1 and more
 *  @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexBlurShader_CreateProgram(const QexRuntimeContext* context);
/** Compiles and links into a module's record, whose projection is set; CreateProgram calls it. @return 0. */
QEX_API int32_t QexBlurShader_SetupProgram(const QexRuntimeContext* context, QexShaderModule* module,
                                           float sigma, float samples);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexBlurShader_Release(QexShaderModule** module);
/** Sets the uniforms and the record's projection for the module's program, which must be current.
 *  @param ignored    not read
 *  @param direction  0: blurs along s, else along t
 *  @param sigma      standard deviation in steps
 *  @param samples    9, 7, 5 or another number, see above
 *  @param blurSize   one step in texture coordinates: 1 / width of the texture is a pixel */
QEX_API void QexBlurShader_SetParameters(QexShaderModule* module, const void* ignored, float direction,
                                         float sigma, float samples, float blurSize);

/* QexDOFShader (no kind, no render function): the mix of a sharp and a blurred picture (units 0 and 2) by
 * clamp(range * |focus - depth|, 0, 1), depth being the red of a third (unit 1); for quads over the screen,
 * attributes as QexBlurShader. A range of 0 or below gives the sharp picture.
 * Slots: a_v4Position, u_m4Projection, a_v2TexCoord, u_s2dNormal, u_s2dDepth, u_s2dBlur, focus, range
 * locations. */

/** Creates the depth-of-field module; focus and range are not set yet. Its projection shows the whole screen.
 *  @param context  its size is the screen's, 1 and more
 *  @return as QexTextureShader_CreateProgram. */
QEX_API QexShaderModule* QexDOFShader_CreateProgram(const QexRuntimeContext* context);
/** Compiles and links into a module's record, with the projection of the module created last; CreateProgram
 *  calls it. @param context  not read  @return 0. */
QEX_API int32_t QexDOFShader_SetupProgram(const QexRuntimeContext* context, QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexDOFShader_Release(QexShaderModule** module);
/** Sets focus, a depth from 0 to 1, and range, blur per unit of depth, for the module's program, which must
 * be current. */
QEX_API void QexDOFShader_SetParameters(QexShaderModule* module, float focus, float range);

/* ======================================================================================================
 * Models: records and loading
 *
 * A model joins a POD scene with its GL buffers, textures and shader modules. The caller owns the record,
 * which stays in place from QexModel_Create to QexModel_Unload. Needs a current GL context, except where a
 * function says not.
 * ====================================================================================================== */

/** Bit of QexModel.flags: the model loaded its textures from files and owns them. */
#define QEX_MODEL_OWNS_TEXTURES 0x01u
/** Bit of QexModel.flags: the model holds no share of the default shaders (its load failed, or it was
 *  unloaded), so that unloading it gives none back. */
#define QEX_MODEL_NO_SHADERS 0x02u

/** Called before a node's diffuse texture is bound. @return non-zero: the hook bound a texture itself. */
typedef int32_t (*QexBindTextureHook)(QexModel* model, uint32_t nodeIndex);
/** Called before a material's texture is loaded.
 *  @param path      directory and texture name; may be rewritten, which the alpha texture's does not follow
 *  @param capacity  characters that path holds, besides the NUL
 *  @return 0: the engine loads `path`. Non-zero: the hook dealt with it; the material's record (the last
 *  non-null entry of model->textures) is zeroed, and the hook may fill it with a texture of its own, which
 * the model then owns. QexModel_LoadTextureFromCache makes no record: there the material's entries stay null.
 */
typedef int32_t (*QexLoadTextureHook)(QexModel* model, char* path, int32_t capacity);
/** Called once for each mesh node near the end of loading; the default modules are set after it. @return not
 *  read. */
typedef int32_t (*QexMeshNodeLoadedHook)(QexModel* model, QexPODMesh* mesh, uint32_t meshNodeIndex);

struct QexModel {
    uint32_t flags; /* QEX_MODEL_... */
    QexPODModel scene;
    QexTexture** textures;              /* diffuse texture of each material, null where none */
    QexTexture** alphaTextures;         /* alpha texture of each material, null where none */
    QexBoundingBox* nodeBoxes;          /* box of each mesh node in the world: its corners, as of
                                           QexModel_UpdateModelBoundingBox, 0 before */
    QexBoundingBox* screenBoxes;        /* box of each mesh node on screen, see QexModel_CalcScreenBBox */
    uint32_t* vertexBuffers;            /* GL buffer of each mesh */
    uint32_t* indexBuffers;             /* GL buffer of each mesh, 0 for one without indices */
    float currentFrame;                 /* animation position in frames */
    QexBindTextureHook bindTextureHook; /* the three hooks: optional, set between */
    QexLoadTextureHook loadTextureHook; /* QexModel_Create and loading */
    QexMeshNodeLoadedHook meshNodeLoadedHook;
    uint32_t
        sharedGeneration; /* the engine's: which set of shared shaders its nodes were given, 0 for none */
};

/** Light types of QexLight. */
#define QEX_LIGHT_POINT 0
#define QEX_LIGHT_DIRECTIONAL 1

/** One light of a light set. */
typedef struct QexLight {
    int32_t type;    /* QEX_LIGHT_POINT: vector is its position; otherwise the direction in which it shines */
    float vector[3]; /* world space */
    float colour[4]; /* red, green, blue, 1 */
} QexLight;

#define QEX_MAX_LIGHTS 4

/** The lights that a render call hands to the modules. */
struct QexLightSet {
    uint32_t count; /* 0 to QEX_MAX_LIGHTS */
    QexLight lights[QEX_MAX_LIGHTS];
};

/** A model that may cast shadows. */
typedef struct QexShadowCaster {
    QexModel* model;
    uint8_t allMeshNodes; /* non-zero: every mesh node; zero: those listed */
    int32_t* nodeIndices; /* mesh nodes */
    uint32_t nodeCount;   /* length of nodeIndices */
} QexShadowCaster;

/** What a shadow pass hands to the shadow-receiving modules. */
struct QexShadowInfo {
    QexVec3 lightDir;
    QexMatrix lightViewProj;     /* world to the light's clip space */
    QexMatrix shadowSpaceMatrix; /* world to shadow-map coordinates, 0..1 */
    QexShadowCaster* casters;
    uint32_t casterCount;
    uint32_t shadowTexture; /* GL texture */
    float shadowIntensity;  /* brightness factor of shadowed pixels */
    float biasValue;        /* depth bias */
};

/** The skinned shadow program that all models share. */
typedef struct QexSkinShadowProgram {
    uint32_t program;           /* GL program, 0 while there is none */
    int32_t viewProjMatrixLoc;  /* "viewProjMatrix" */
    int32_t boneCountLoc;       /* "boneCount" */
    int32_t boneMatrixArrayLoc; /* "boneMatrixArray" */
} QexSkinShadowProgram;

/** The static shadow program that all models share. */
typedef struct QexModelShadowProgram {
    uint32_t program;     /* GL program, 0 while there is none */
    int32_t mvpMatrixLoc; /* "mvpMatrix" */
} QexModelShadowProgram;

#ifdef QEX_UNPREFIXED_NAMES
/** The shared shadow programs, made with the default shaders. */
QEX_API extern QexSkinShadowProgram m_SkinShadowShaderProgram;
QEX_API extern QexModelShadowProgram m_uModelShadowShaderProgram;
#endif

/** Clears a model record. No GL context needed. @return 0. */
QEX_API int32_t QexModel_Create(QexModel* model);

/** Loads a model whole: scene, default shaders, buffers, textures; then calls the hook for each mesh node and
 *  gives all of them the default modules. A model that was loaded before is unloaded first.
 *  @param directory  put in front of the file's and the textures' names as it is, with its separator
 *  @param file       POD file; directory and name together at most 255 characters
 *  @return 0, or the failing step's result, with lines in the log that say what is wrong; the model then
 * holds nothing but may be unloaded all the same. Missing textures fail nothing. */
QEX_API int32_t QexModel_LoadContent(QexModel* model, const char* directory, const char* file);

/** Loads a model whole from memory, its textures from a cache.
 *  @param data   the POD file; must outlive the model, which uses its animation keys in place
 *  @param size   bytes of data
 *  @param cache  name cache of QexTexture records or of pointers to them (its element size tells), or null
 * for none; keeps owning the textures. Records must stay in place while the model uses them: such a cache may
 * not grow.
 *  @return 0, also when reading the scene fails; -1 when its geometry cannot be drawn or memory runs out.
 *  Failures put a line in the log; the model then holds nothing and draws nothing. */
QEX_API int32_t QexModel_LoadContentFromCache(QexModel* model, const void* data, uint32_t size,
                                              QexNameCache* cache);

/** Reads the scene only, in place of what the model holds. No GL context needed, unless that is GL objects.
 *  @return 0; -1 when the file cannot be opened or does not hold a sound scene (nothing is kept then). */
QEX_API int32_t QexModel_LoadFromFile(QexModel* model, const char* directory, const char* file);

/** QexModel_LoadFromFile from memory, which must outlive the scene. @return 0, or -1. */
QEX_API int32_t QexModel_LoadFromMemory(QexModel* model, const void* data, uint32_t size);

/** Creates the GL buffers and works out each mesh's box and attribute layout. Vertices are laid out
 *  interleaved where the file does not; 32-bit indices become 16-bit ones; batches of more than
 *  QEX_MAX_BATCH_BONES bones are cut into smaller ones; binormals that are missing next to normals and
 *  tangents are made.
 *  @return 0; -1 with a line in the log when memory runs out, a mesh needs more than 16-bit indices, or a
 *  batch cannot be cut. */
QEX_API int32_t QexModel_DownloadGeometry(QexModel* model);

/** Loads each material's diffuse texture (directory and name) and alpha texture ("_a" before the last four
 *  characters), PVR or KTX. A texture that fails to load is null. @return 0, or -1 when memory runs out. */
QEX_API int32_t QexModel_LoadTextureFromFile(QexModel* model, const char* directory);

/** Takes each material's textures from a cache, by name; see QexModel_LoadContentFromCache. Textures that the
 *  model owned are released. @return 0, or -1 when memory runs out. */
QEX_API int32_t QexModel_LoadTextureFromCache(QexModel* model, QexNameCache* cache);

/** Creates the shader modules and the shadow target that models share, on the first call; counts every call.
 *  @return 0. */
QEX_API int32_t QexModel_CreateDefaultShader(void);

/** Balances one QexModel_CreateDefaultShader; the last one frees the shared set.
 *  @param force  1: frees it whatever the count; models that were loaded with it are no longer drawn then,
 *                with a line in the log each, until they are loaded again */
QEX_API void QexModel_ReleaseShader(int32_t force);

/** Sets the size of the shadow target that is made with the next shared set; 512 x 512 at first. No GL
 *  context needed.
 *  @param width   pixels, 1 and more; what the GL cannot draw into is cut, with a line in the log, when the
 *                 target is made
 *  @param height  likewise. A size below 1 is refused with a line and changes nothing */
QEX_API void QexModel_SetShadowMapSize(int32_t width, int32_t height);

/** Frees everything that the model holds. A second call does nothing. */
QEX_API void QexModel_Unload(QexModel* model);

/** Deletes the GL buffers. */
QEX_API void QexModel_UnloadGeometry(QexModel* model);

/** Releases the textures that the model owns and forgets the others. */
QEX_API void QexModel_UnloadTextures(QexModel* model);

/** Replaces a material's diffuse texture. A model that owns its textures (QEX_MODEL_OWNS_TEXTURES) releases
 * the new one too and frees it with QexMemory_Free. No GL context needed.
 *  @param texture  may be null
 *  @param index    material
 *  @return the texture before, now the caller's; null, with nothing changed, for a bad index. */
QEX_API QexTexture* QexModel_ReplaceTextureByIdx(QexModel* model, QexTexture* texture, uint32_t index);

/** Replaces a material's alpha texture; as QexModel_ReplaceTextureByIdx. */
QEX_API QexTexture* QexModel_ReplaceAlphaTextureByIdx(QexModel* model, QexTexture* texture, uint32_t index);

/** @return the scene's number of animation frames. No GL context needed. */
QEX_API uint32_t QexModel_GetNumFrames(const QexModel* model);
/** @return the scene's frames per second. No GL context needed. */
QEX_API uint32_t QexModel_GetFPS(const QexModel* model);
/** @return the scene's number of nodes. No GL context needed. */
QEX_API uint32_t QexModel_GetNumNodes(const QexModel* model);
/** @return the scene's number of mesh nodes. No GL context needed. */
QEX_API uint32_t QexModel_GetNumMeshNodes(const QexModel* model);

/* ======================================================================================================
 * Models from arrays
 *
 * Geometry that the application makes: a mesh of plain arrays becomes a model in one call. Boxes, spheres,
 * cylinders and planes are there to begin with. Their textures stand upright where the first row is the lower
 * edge, as `qex convert` and `qex texture --flip` write them. Front faces are counter-clockwise.
 * ====================================================================================================== */

/** What 16-bit indices reach. */
#define QEX_MESH_MAX_VERTICES 65536u

/** A mesh. Zero it and set what there is; the arrays stay the application's. */
typedef struct QexMesh {
    uint32_t vertexCount;     /* 1 to QEX_MESH_MAX_VERTICES */
    const QexVec3* positions; /* not null */
    const QexVec3* normals;   /* of unit length; null: the model is drawn unlit */
    const QexVec2* uvs;       /* texture coordinates; null: none */
    const uint32_t* colours;  /* 0xAARRGGBB a vertex; null: white */
    uint32_t indexCount;      /* three a triangle; 0: each three vertices are one */
    const uint16_t* indices;  /* null where the count is 0 */
    void* memory;             /* arrays that QexMesh_Create... made, else null */
} QexMesh;

/** Makes the mesh of a box around the origin: 24 vertices, on each face the whole texture.
 *  @param mesh  out; what it held is overwritten, not released. Release with QexMesh_Release
 *  @param width, height, depth  along x, y and z, > 0
 *  @return 0; -1, with a line in the log and an empty mesh, for sizes that are not above 0 or when memory
 *  runs out; -1 for null. No GL context needed. */
QEX_API int32_t QexMesh_CreateBox(QexMesh* mesh, float width, float height, float depth);

/** Makes the mesh of a sphere around the origin: the texture once around from west to east, seen from
 *  outside, its lower edge at the pole -Y and its middle in the direction +Z.
 *  @param radius    > 0
 *  @param segments  3 to 128 from pole to pole, twice as many around
 *  @return as QexMesh_CreateBox, which says the rest; -1 also for other segments. */
QEX_API int32_t QexMesh_CreateSphere(QexMesh* mesh, float radius, uint32_t segments);

/** Makes the mesh of a cylinder about the y axis, its middle in the origin, closed by two discs: the texture
 *  once around its side, and its inscribed circle on each disc.
 *  @param radius, height  > 0
 *  @param segments        around, 3 to 4096
 *  @return as QexMesh_CreateSphere. */
QEX_API int32_t QexMesh_CreateCylinder(QexMesh* mesh, float radius, float height, uint32_t segments);

/** Makes the mesh of a rectangle at y = 0 around the origin that is seen from above, the texture's lower edge
 *  towards +Z.
 *  @param width, depth  along x and z, > 0
 *  @param segments      cells along each side, 1 to 255; vertex lighting gets finer with them
 *  @param repeat        how often the texture goes along each side; above 1 it has to wrap with
 *                       QEX_WRAP_REPEAT
 *  @return as QexMesh_CreateSphere. */
QEX_API int32_t QexMesh_CreatePlane(QexMesh* mesh, float width, float depth, uint32_t segments, float repeat);

/** Frees what QexMesh_Create... made and empties the mesh; the application's own arrays are left alone.
 *  @param mesh  null does nothing. No GL context needed. */
QEX_API void QexMesh_Release(QexMesh* mesh);

/** Makes a model of a mesh: one mesh node, "mesh", with a white material of ambient 0.2 and diffuse 0.8. It
 * is drawn, moved, picked and unloaded like any other. With normals its module is lit (an even 0.2 where no
 *  lights are given), without them unlit; meshes with normals and texture coordinates get tangents, for
 *  QexGouraudNormalMapShader. No module reads vertex colours: one colour for all vertices becomes a texture
 *  of one pixel, others a texture with a patch for each triangle, whose vertices are parted then, so that at
 *  most 21,845 triangles can have colours; such a mesh gets no tangents. Neither module regards the
 *  alpha of texture or colours; QexTextureNoAlphaShader does. The mesh is copied.
 *  @param model    cleared first; unload before what it holds
 *  @param mesh     arrays of at least the counts; vertices that no index names are allowed
 *  @param texture  stays the application's, alive as long as the model; colours are left out with it, with a
 *                  line in the log; null: the colours, or white
 *  @return 0; -1, with a line in the log and an empty model, for null pointers, counts out of range or of no
 *  whole triangles, an index that names no vertex, or when memory runs out. Needs a current GL context. */
QEX_API int32_t QexModel_CreateFromMesh(QexModel* model, const QexMesh* mesh, QexTexture* texture);

/* ======================================================================================================
 * Models: rendering
 *
 * The render calls draw mesh nodes in index order, each through its shader module. A `pass` argument draws
 * only the nodes whose mesh has that pass ID (0 after reading). `modelMatrix` is applied in front of every
 * node's world matrix and may be null; so may `lights`, for no light. Nothing is allocated.
 * Needs a current GL context, except where a function says not.
 * ====================================================================================================== */

/** A transparent node that was put off. */
typedef struct TransparentSPODNodeInfo {
    QexModel* model; /* null: an empty entry */
    uint32_t nodeIndex;
    float distance; /* squared distance from the eye, filled when the list is drawn */
    QexLightSet lights;
    QexMatrix modelMatrix;
    QexVec3 eye;
    QexMatrix view;
    QexMatrix projection;
    int32_t passID; /* pass of the call that put it off */
} TransparentSPODNodeInfo;

#ifdef QEX_UNPREFIXED_NAMES
/** The eye of the last camera that a render call used. */
QEX_API extern QexVec3 g_VecEyePos;
#endif

/** Draws the model from a camera, without regard to opacity. */
QEX_API void QexModel_RenderWithCamera(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                                       const QexMatrix* modelMatrix, uint32_t pass);

/** Draws the model with a view and a projection matrix, without regard to opacity. */
QEX_API void QexModel_RenderWithViewProjection(QexModel* model, const QexLightSet* lights,
                                               const QexMatrix* modelMatrix, const QexMatrix* view,
                                               const QexMatrix* projection, uint32_t pass);

/** Draws one mesh node from a camera, whatever its pass; a bad index draws nothing. */
QEX_API void QexModel_RenderNodeWithCamera(QexModel* model, uint32_t nodeIndex, const QexLightSet* lights,
                                           const QexCamera* camera, const QexMatrix* modelMatrix);

/** Draws one mesh node with a view and a projection matrix, whatever its pass. */
QEX_API void QexModel_RenderNodeWithViewProjection(QexModel* model, uint32_t nodeIndex,
                                                   const QexLightSet* lights, const QexMatrix* modelMatrix,
                                                   const QexMatrix* view, const QexMatrix* projection);

/** Node choices of the Ex calls. */
#define QEX_RENDER_ALL 0         /* opaque nodes are drawn */
#define QEX_RENDER_OPAQUE 1      /* those outside the alpha-blending list are drawn */
#define QEX_RENDER_ALPHA_NODES 2 /* those in the alpha-blending list are drawn */

/** Draws the opaque nodes from a camera and puts the others off; see QexModel_RenderWithViewProjectionEx. */
QEX_API void QexModel_RenderWithCameraEx(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                                         const QexMatrix* modelMatrix, uint32_t pass, uint32_t mode,
                                         TransparentSPODNodeInfo* list, uint32_t* count);

/** Draws each node whose material's opacity and whose global alpha are at least 1 and whom the mode allows;
 * the others go to the list.
 *  @param eye    3 floats of the eye position, for sorting
 *  @param mode   QEX_RENDER_...; another draws none
 *  @param list   room for every mesh node that may be put off, or null: they are dropped
 *  @param count  in and out, entries in the list; may be null when list is */
QEX_API void QexModel_RenderWithViewProjectionEx(QexModel* model, const QexLightSet* lights,
                                                 const QexMatrix* modelMatrix, const QexVec3* eye,
                                                 const QexMatrix* view, const QexMatrix* projection,
                                                 uint32_t pass, uint32_t mode, TransparentSPODNodeInfo* list,
                                                 uint32_t* count);

/** Sorts the list by distance (with the C library's qsort, which may allocate for long lists) and draws the
 *  entries of the pass, farthest first. Entries of several models and cameras may share a list. The distance
 * is that from the eye to the node's own place in its scene: a model matrix that moves the model does not
 * count, so transparent instances of one model, told apart by their matrices alone, are to be drawn list by
 * list. */
QEX_API void QexModel_RenderAlphaBlendingNodes(TransparentSPODNodeInfo* list, uint32_t count, uint32_t pass);

/** qsort comparison of two list entries, nearest first. No GL context needed. @return -1, 0 or 1. */
QEX_API int TransparentSPODNodeInfo_Compare(const void* a, const void* b);

/** Advances the animation and sets the scene's frame; past the end it starts again at 0, before 0 it goes to
 *  the last frame. No GL context needed.
 *  @param ignored  not read, may be null
 *  @param dt       seconds, may be negative */
QEX_API void QexModel_Update(void* ignored, QexModel* model, float dt);

/** Sets the opacity of a node's material, and so of every node that shares it. No GL context needed.
 *  @param opacity  0 to 1
 *  @return the value before; 0, with nothing changed, for a node without a material or a bad index. */
QEX_API float QexModel_SetOpacity(QexModel* model, uint32_t nodeIndex, float opacity);

/** QexModel_SetOpacity on every descendant of a node, not on the node itself. No GL context needed. */
QEX_API void QexModel_SetOpacityR(QexModel* model, uint32_t nodeIndex, float opacity);

/** Puts all mesh nodes into the opaque pass, then those named into the alpha-blending list. No GL context
 *  needed.
 *  @param names  node names, or null for none */
QEX_API void QexModel_SetAlphaBlendingNodes(QexModel* model, const char* const* names, int32_t count);

/** Puts the named nodes into the alpha-blending list and stores their blend order. Other nodes are left
 * alone. No GL context needed.
 *  @param names   node names, or null: nothing happens
 *  @param orders  one value per node of the scene, indexed by node; null: orders stay */
QEX_API void QexModel_SetAlphaBlendingNodesWithOrder(QexModel* model, const char* const* names,
                                                     const int32_t* orders, int32_t count);

/** Gives a node a shader module. No GL context needed.
 *  @param module  null: the node is not drawn */
QEX_API void QexModel_SetShaderProgram(QexModel* model, uint32_t nodeIndex, QexShaderModule* module);

/** Gives all mesh nodes a module. No GL context needed.
 *  @param staticModule   for meshes that follow no bones, or null: they keep theirs
 *  @param skinnedModule  for meshes that do, or null. With both, a model of an earlier start of the engine
 * can be drawn again */
QEX_API void QexModel_SetShaderProgramForAllNode(QexModel* model, QexShaderModule* staticModule,
                                                 QexShaderModule* skinnedModule);

/** Sets the alpha threshold of the modules that models get by default, the lit one of models from arrays
 *  included, where they exist. No GL context needed. */
QEX_API void QexModel_SetAlphaTestCmpValue(float threshold);

/** Does nothing; kept for callers. */
QEX_API void QexModel_SetAnimatedUVUniform(QexModel* model, float u, float v);

/** Recomputes a mesh node's box (nodeBoxes): its mesh's box carried by the node, for a skinned mesh by the
 * first bone of its first batch. No GL context needed.
 *  @param modelMatrix  applied in front for meshes that are not skinned, or null */
QEX_API void QexModel_UpdateMeshNodeBoundingBox(QexModel* model, uint32_t meshNodeIndex,
                                                const QexMatrix* modelMatrix);

/** QexModel_UpdateMeshNodeBoundingBox for every mesh node. No GL context needed. */
QEX_API void QexModel_UpdateModelBoundingBox(QexModel* model, const QexMatrix* modelMatrix);

/** Reads the scene's first lights, at most QEX_MAX_LIGHTS. A light that is neither point nor directional, a
 * spot light for one, is counted but leaves its entry as it was: zero the set first, and the entry is a black
 * point light. No GL context needed. @param set  out */
QEX_API void QexModel_GetLight(QexModel* model, QexLightSet* set);

/** Reads a scene camera at the current frame. No GL context needed.
 *  @param eye, target  out; not written when the result is 0
 *  @param up           out; (0, 1, 0) but for a camera without a target node
 *  @param fov          out, radians, horizontal; 0.785 when the result is 0
 *  @return 1, or 0 when the scene has no such camera. */
QEX_API int32_t QexModel_UpdateCamera(QexModel* model, QexVec3* eye, QexVec3* target, QexVec3* up, float* fov,
                                      uint32_t index);

/** Reads a scene camera's clip distances. No GL context needed.
 *  @param zNear, zFar  out, > 0; not written when the result is 0
 *  @return 1, or 0 when the scene has no such camera. */
QEX_API int32_t QexModel_GetCameraNearFar(const QexModel* model, float* zNear, float* zFar, uint32_t index);

/* ======================================================================================================
 * Models: shadows
 *
 * Shadow maps for one directional light. A frame goes: QexModel_UpdateModelBoundingBox for each casting
 * model, QexModel_InitShadowInfo, QexModel_RenderShadow, then the nodes whose module receives shadows
 * (QexGouraudShadowShader, QexGouraudShadowExtShader) with the calls below, QexModel_ReleaseShadowInfo. The
 * map is a grey picture in the shadow target that all models share: 0 is nearest to the light, 1 is empty.
 * Needs a current GL context, except where a function says not.
 * ====================================================================================================== */

/** Lists the casters that may throw a shadow into the camera's view, and builds the light's matrices around
 * them. A node counts when its box in nodeBoxes overlaps the view volume as seen from the light; how far it
 * is from the light does not matter. With no caster in sight the matrices show the whole view and the map
 * stays empty. Indices that are no mesh nodes are left out. No GL context needed.
 *  @param lightDir         where the light shines, of any length but 0
 *  @param casters          casterCount requests; copied
 *  @param shadowIntensity  brightness factor of shadowed pixels, 0 to 1
 *  @param biasValue        taken off a receiver's depth (0..1 through the map), against surfaces that shade
 *                          themselves; the map has 256 steps
 *  @return the shadow parameters for one frame, to be released with QexModel_ReleaseShadowInfo; null, with a
 * line, when memory runs out. The models must stay loaded until then. */
QEX_API QexShadowInfo* QexModel_InitShadowInfo(const QexCamera* camera, const QexVec3* lightDir,
                                               const QexShadowCaster* casters, uint32_t casterCount,
                                               float shadowIntensity, float biasValue);

/** Frees the shadow parameters. Null is fine. No GL context needed. */
QEX_API void QexModel_ReleaseShadowInfo(QexShadowInfo* info);

/** Draws the casters into the shadow map. Leaves the framebuffer as it was; the viewport covers the context's
 *  surface, the scissor test is on (an application that does not use it switches it off again), depth is
 * written and tested with less or equal, back faces are culled, the clear colour is white.
 *  @param context      its width and height are read
 *  @param modelMatrix  in front of the world matrices of casters that follow no bones, or null
 *  @param info         null does nothing */
QEX_API void QexModel_RenderShadow(const QexRuntimeContext* context, const QexMatrix* modelMatrix,
                                   const QexShadowInfo* info);

/** Draws the listed casters that are enabled with the depth programs, into whatever is bound. A model's
 * bindTextureHook is called for each node and may bind an alpha texture to unit 3: where its red is at most
 * 0.01 the caster has a hole. Skinned casters follow three bones a vertex and take no model matrix. Leaves no
 * buffer bound. */
QEX_API void QexModel_RenderFromShadowCamera(const QexMatrix* modelMatrix, const QexShadowInfo* info);

/** Draws a mesh node's positions (attribute 0) and texture coordinates (1) with the current program. */
QEX_API void QexModel_DrawShadowMesh(QexModel* model, uint32_t nodeIndex);

/** The same for a node that follows bones, batch by batch, with weights (attribute 2), bone indices (3) and
 * the matrices of the skinned depth program. */
QEX_API void QexModel_DrawSkinShadowMesh(QexModel* model, uint32_t nodeIndex);

/** Deletes the shadow target; it comes back with the next shared set. Until then there are no shadows. */
QEX_API void QexModel_ReleaseShadowTexture(void);

/** As QexModel_RenderWithViewProjection, with shadow parameters for the modules that receive shadows. */
QEX_API void QexModel_RenderFromViewPerspectiveWithShadow(QexModel* model, const QexLightSet* lights,
                                                          const QexMatrix* modelMatrix, const QexMatrix* view,
                                                          const QexMatrix* projection,
                                                          const QexShadowInfo* info, uint32_t pass);

/** As QexModel_RenderWithCamera, with shadow parameters. */
QEX_API void QexModel_RenderFromCameraWithShadow(QexModel* model, const QexLightSet* lights,
                                                 const QexCamera* camera, const QexMatrix* modelMatrix,
                                                 const QexShadowInfo* info, uint32_t pass);

/** As QexModel_RenderNodeWithViewProjection, with shadow parameters. */
QEX_API void QexModel_RenderNodeFromViewPerspectiveWithShadow(
    QexModel* model, uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
    const QexMatrix* view, const QexMatrix* projection, const QexShadowInfo* info);

/* ======================================================================================================
 * Models: planar reflection
 *
 * Mirror images in a plane: a mesh node (a floor, water, a mirror) or an endless plane. The casters are drawn
 * reflected, within the plane node's pixels when the stencil is used, and the plane node over them. Render
 * the reflection before the scene of each frame. Needs a current GL context, except where a function says
 * not.
 * ====================================================================================================== */

/** A reflecting plane and what it reflects. */
typedef struct QexReflection {
    uint8_t infinite;   /* 1: an endless plane without node */
    uint8_t useStencil; /* 1: the image shows only within the plane node's pixels */
    QexModel* model;    /* holds the plane node */
    uint32_t planeNode; /* mesh node index */
    QexShadowCaster* casters;
    uint32_t casterCount;
    QexVec3 planeNormal;
    QexVec3 planePoint;
    QexMatrix reflectionMatrix; /* mirrors the world in the plane */
} QexReflection;

/** Makes a reflection in a mesh node, whose mesh must be flat: the plane goes through its first vertex, along
 *  its first normal, as the node stands now. A mesh without an interleaved block, as QexModel_CreateFromMesh
 *  makes them, gives the plane y = 0 of the world, with lines in the log. No GL context needed.
 *  @param casters     casterCount models and nodes to reflect; copied. The plane node itself is not drawn for
 * an entry of its own model that asks for all nodes
 *  @param useStencil  1 needs a stencil buffer, cleared to 0 at the start of each frame
 *  @return the record, to be released before the models are unloaded; null, with a line, when memory runs
 * out. */
QEX_API QexReflection* QexReflection_InitReflectionInfo(QexModel* model, uint32_t planeNode,
                                                        const QexShadowCaster* casters, uint32_t casterCount,
                                                        uint8_t useStencil);

/** Makes a reflection in an endless plane. No GL context needed.
 *  @param model        kept in the record; may be null
 *  @param planeNormal  of any length but 0
 *  @return as QexReflection_InitReflectionInfo. */
QEX_API QexReflection* QexReflection_InitReflectionInfoInfinite(QexModel* model, const QexVec3* planeNormal,
                                                                const QexVec3* planePoint,
                                                                const QexShadowCaster* casters,
                                                                uint32_t casterCount);

/** Frees the record. Null is fine. No GL context needed. */
QEX_API void QexReflection_Release(QexReflection* reflection);

/** Draws the reflected casters and the plane node over them. Clears the depth buffer; back faces are culled
 * afterwards, the stencil test is off when it was used, and the plane node's rendering is off, so that the
 * scene does not draw it again. */
QEX_API void QexReflection_RenderReflection(QexReflection* reflection, const QexLightSet* lights,
                                            const QexCamera* camera);

/** Sets the stencil to 1 where a plane node is, and leaves the stencil test on: what is drawn next shows only
 *  there. The depth test and the whole colour mask are on afterwards.
 *  @param modelMatrix  in front of the node's world matrix, or null */
QEX_API void QexModel_RenderReflectionPlaneStencil(QexModel* model, uint32_t planeNode,
                                                   const QexLightSet* lights, const QexMatrix* modelMatrix,
                                                   const QexMatrix* view, const QexMatrix* projection);

/* ======================================================================================================
 * Models: node control, picking
 *
 * Finds a loaded model's nodes by name, moves and aims them, switches their animation and rendering, and
 * tells where they are in the world and on the screen. A ...ByName function takes the first node of exactly
 * that name; an unknown or null name changes nothing. A ...R function is applied to a node and then, depth
 * first, to all below it, and returns the last result. A node index out of range changes nothing. No GL
 * context needed on this page.
 * ====================================================================================================== */

/** @return the index of the first node of exactly that name, mesh node or not; -1 when there is none. */
QEX_API int32_t QexModel_FindNodeIdxByName(const QexModel* model, const char* name);

/** @return the node's name, owned by the scene; null for a node without one or a bad index. */
QEX_API const char* QexModel_GetNodeName(const QexModel* model, uint32_t nodeIndex);

/** @return the scene's name of the diffuse texture of the node's material, owned by the scene; null for a
 * node without material or texture or a bad index. */
QEX_API const char* QexModel_GetNodeTextureName(const QexModel* model, uint32_t nodeIndex);

/** Sets the position of a node's override, which is applied in front of its keys: the node goes to
 *  translation * rotation * scale * its own transform, in its parent's space. Parts not set keep (0, 0, 0),
 * no rotation, (1, 1, 1). So keys that place a node are turned and scaled about its parent's origin. */
QEX_API void QexModel_SetNodePosition(QexModel* model, uint32_t nodeIndex, float x, float y, float z);

/** QexModel_SetNodePosition by name. */
QEX_API void QexModel_SetNodePositionByName(QexModel* model, const char* name, float x, float y, float z);

/** Sets the rotation of a node's override: degrees about X, then Y, then Z. */
QEX_API void QexModel_SetNodeRotation(QexModel* model, uint32_t nodeIndex, float x, float y, float z);

/** QexModel_SetNodeRotation by name. */
QEX_API void QexModel_SetNodeRotationByName(QexModel* model, const char* name, float x, float y, float z);

/** Sets the scale of a node's override. */
QEX_API void QexModel_SetNodeScale(QexModel* model, uint32_t nodeIndex, float x, float y, float z);

/** QexModel_SetNodeScale by name. */
QEX_API void QexModel_SetNodeScaleByName(QexModel* model, const char* name, float x, float y, float z);

/** Sets a node's whole override. It is used as it is until a part is set: then the parts replace it.
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexModel_SetNodeMatrix(QexModel* model, uint32_t nodeIndex, const QexMatrix* matrix);

/** QexModel_SetNodeMatrix by name. @return 0, or -1 when no node has that name. */
QEX_API int32_t QexModel_SetNodeMatrixByName(QexModel* model, const char* name, const QexMatrix* matrix);

/** Takes a node's override away: it follows its keys alone. */
QEX_API void QexModel_ResetNodeTransform(QexModel* model, uint32_t nodeIndex);

/** Turns a node's local +Z axis towards a point in the world, with the smallest turn from +Z, by setting the
 *  override's rotation; half a turn about Y where the point lies straight along -Z. Exact for a node that
 *  neither its parents nor its own keys turn or mirror and that its keys do not move from its parent's
 * origin. The node's own position as target changes nothing.
 *  @param target  world space */
QEX_API void QexModel_SetNodeFaceTo(QexModel* model, uint32_t nodeIndex, const QexVec3* target);

/** QexModel_SetNodeFaceTo by name. */
QEX_API void QexModel_SetNodeFaceToByName(QexModel* model, const char* name, const QexVec3* target);

/** Sets one node's frame; see QexPODModel_SetNodeAnimationFrame. The next QexModel_Update moves it on, unless
 *  its animation is disabled.
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexModel_SetNodeAnimationFrame(QexModel* model, uint32_t nodeIndex, float frame);

/** QexModel_SetNodeAnimationFrame by name. @return 0, or -11 when no node has that name. */
QEX_API int32_t QexModel_SetNodeAnimationFrameByName(QexModel* model, const char* name, float frame);

/** QexModel_SetNodeAnimationFrame on a node and all below it. */
QEX_API int32_t QexModel_SetNodeAnimationFrameR(QexModel* model, uint32_t nodeIndex, float frame);

/** Sets the frame of every bone of a skinned mesh node; see QexPODModel_SetMeshNodeBoneAnimationFrame.
 *  @return 0 (also for a node without mesh or bones), or -12 for an index out of range. */
QEX_API int32_t QexModel_SetMeshNodeBoneAnimationFrame(QexModel* model, uint32_t nodeIndex, float frame);

/** QexModel_SetMeshNodeBoneAnimationFrame by name. @return as that, or -11 when no node has that name. */
QEX_API int32_t QexModel_SetMeshNodeBoneAnimationFrameByName(QexModel* model, const char* name, float frame);

/** QexModel_SetMeshNodeBoneAnimationFrame on a node and all below it. @return the last node's result. */
QEX_API int32_t QexModel_SetMeshNodeBoneAnimationFrameR(QexModel* model, uint32_t nodeIndex, float frame);

/** Lets the shader modules draw a node, or not.
 *  @param enable  its lowest bit counts
 *  @return the bit before, 0 or 1; 0 for an index out of range. */
QEX_API uint32_t QexModel_EnableNodeRendering(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** QexModel_EnableNodeRendering by name. @return as that; 0 when no node has that name. */
QEX_API uint32_t QexModel_EnableNodeRenderingByName(QexModel* model, const char* name, uint32_t enable);

/** QexModel_EnableNodeRendering on a node and all below it. */
QEX_API uint32_t QexModel_EnableNodeRenderingR(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** Lets QexModel_Update move a node along its keys, or not. Arguments and result as
 *  QexModel_EnableNodeRendering. */
QEX_API uint32_t QexModel_EnableNodeAnimation(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** QexModel_EnableNodeAnimation by name. @return as that; 0 when no node has that name. */
QEX_API uint32_t QexModel_EnableNodeAnimationByName(QexModel* model, const char* name, uint32_t enable);

/** QexModel_EnableNodeAnimation on a node and all below it. */
QEX_API uint32_t QexModel_EnableNodeAnimationR(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** Sets how fast a node follows the animation.
 *  @param speed  share of the way to the new frame that an update goes; 1 for the whole
 *  @return the node, or null when no node has that name. */
QEX_API QexPODNode* QexModel_SetNodeAnimationSpeed(QexModel* model, const char* name, float speed);

/** Reads a node's world matrix at its current frame, model matrices of render calls left out.
 *  @param out  out; not written on failure
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexModel_GetNodeWorldMatrix(QexModel* model, uint32_t nodeIndex, QexMatrix* out);

/** QexModel_GetNodeWorldMatrix by name. @return 0, or -1 when no node has that name. */
QEX_API int32_t QexModel_GetNodeWorldMatrixByName(QexModel* model, const char* name, QexMatrix* out);

/** Reads a node's position in the world. Arguments and result as QexModel_GetNodeWorldMatrix. */
QEX_API int32_t QexModel_GetNodeWorldPos(QexModel* model, uint32_t nodeIndex, QexVec3* out);

/** QexModel_GetNodeWorldPos by name. @return 0, or -1 when no node has that name. */
QEX_API int32_t QexModel_GetNodeWorldPosByName(QexModel* model, const char* name, QexVec3* out);

/** Tests the world boxes of two mesh nodes, of one model or two; see QexBoundingBox_TestBBoxBBox, which wants
 *  boxes that no rotation has turned. Call QexModel_UpdateModelBoundingBox before.
 *  @param overlap  out, may be null; not written for an index that is no mesh node's
 *  @return 1 when they overlap or touch, else 0; 0 for an index that is no mesh node's. */
QEX_API int32_t QexModel_TestNodes(const QexModel* modelA, uint32_t nodeA, const QexModel* modelB,
                                   uint32_t nodeB, QexVec3* overlap);

/** QexModel_TestNodes by name. @return as that; 0 when either name is unknown. */
QEX_API int32_t QexModel_TestNodesByName(const QexModel* modelA, const char* nameA, const QexModel* modelB,
                                         const char* nameB, QexVec3* overlap);

/** Works out where the mesh nodes are on the screen, from their world boxes (call
 *  QexModel_UpdateModelBoundingBox before). Fills screenBoxes: corners in the order of an axis-aligned box, x
 *  and y in pixels from the upper left corner of the surface, y downwards, z the depth; centre and halfExtent
 *  in normalised device coordinates. The corners' x and y are all 0 for a node whose rendering is disabled
 *  (its centre is not written), for a box that reaches past the far plane or behind the eye, and for one
 * wholly at depths below -1, close before the eye. A box that goes from that close to behind the eye has no
 *  meaningful place.
 *  @param context  the engine's context; its width and height are read
 *  @param camera   view and projection */
QEX_API void QexModel_CalcScreenBBox(const QexRuntimeContext* context, QexModel* model,
                                     const QexCamera* camera);

/** Tells whether a mesh node's screen box lies wholly on the surface; call QexModel_CalcScreenBBox before.
 *  @return 1 or 0; 0 for an index that is no mesh node's. The empty box of a disabled node lies on it. */
QEX_API int32_t QexModel_IsNodeInScreen(const QexRuntimeContext* context, const QexModel* model,
                                        uint32_t meshNodeIndex);

/** Lists the mesh nodes whose screen boxes contain a point, in index order, whatever their depth; call
 *  QexModel_CalcScreenBBox before. The nearest is the one of the least screenBoxes[i].centre.z. Nodes whose
 *  rendering is disabled are never listed.
 *  @param ignored   not read, may be null
 *  @param point     pixels from the upper left corner of the surface, y downwards
 *  @param count     out, entries written
 *  @param indices   out, room for `capacity` mesh node indices
 *  @param capacity  below 1 lists nothing */
QEX_API void QexModel_Pick(const QexModel* model, const void* ignored, const QexVec2* point, int32_t* count,
                           uint32_t* indices, int32_t capacity);

/* ======================================================================================================
 * Scene nodes
 *
 * A small tree above the models, for what carries what: nodes with a position, rotation and scale, some of
 * which draw a model. The caller allocates the records, which stay in place while they are linked; the engine
 * sets the links. Update and render calls cover a node, the siblings after it and everything below these,
 * each node once and before its children. No call needs more stack for a deeper tree. No GL context needed,
 * except where a function says so.
 * ====================================================================================================== */

/** Values of QexNode.type. */
#define QEX_SCENE_NODE_PLAIN 0
#define QEX_SCENE_NODE_MODEL 4

/** Bits of QexNode.nodeFlags. */
#define QEX_SCENE_NODE_CHANGED 0x0001u      /* position, rotation or scale set since the last update */
#define QEX_SCENE_NODE_MATRIX_GIVEN 0x0002u /* the local matrix was given and stays as it is */
#define QEX_SCENE_NODE_HAS_MESH 0x1000u     /* the model had a mesh when the node was created */

/** A scene node. */
typedef struct QexNode QexNode;
struct QexNode {
    int32_t type;          /* QEX_SCENE_NODE_PLAIN or QEX_SCENE_NODE_MODEL */
    char name[16];         /* at most 15 characters and the NUL */
    QexNode* parent;       /* null for a root; stays when the node is removed */
    QexNode* next;         /* next sibling */
    QexNode* firstChild;   /* first child */
    QexVec3 scale;         /* factors */
    QexVec3 rotation;      /* degrees about X, then Y, then Z */
    QexVec3 position;      /* in the parent's space */
    uint32_t nodeFlags;    /* QEX_SCENE_NODE_... */
    QexMatrix worldMatrix; /* parent's world matrix * localMatrix, as of the last update */
    QexMatrix localMatrix; /* translation * rotation * scale, as of the last update */
    QexModel* model;       /* of a model node; not owned */
};

/** Creates a node, as the last child of its parent.
 *  @param node    every field but `model` is set
 *  @param name    its first 15 characters are kept; may be null for ""
 *  @param parent  a created node, or null for a root
 *  @param matrix  local matrix, or null for none (position 0, scale 1). Updates keep it until position,
 *                 rotation or scale is set for the first time: then the other two are taken from it, without
 *                 its shear or mirroring. Until then the three fields are 0.
 *  @return 0. */
QEX_API int32_t QexNode_Create(QexNode* node, const char* name, QexNode* parent, const QexMatrix* matrix);

/** Creates a node that draws a model.
 *  @param model  stays the caller's and in place while the node is used; null draws nothing. One model may
 *                hang on several nodes: every one of them advances its animation
 *  @return 0. */
QEX_API int32_t QexModelNode_Create(QexNode* node, const char* name, QexNode* parent, QexModel* model);

/** Sets a node's position in its parent's space; the next update applies it. */
QEX_API void QexNode_SetPosition(QexNode* node, float x, float y, float z);

/** QexNode_SetPosition from a vector. */
QEX_API void QexNode_SetPosVec3(QexNode* node, const QexVec3* position);

/** Sets a node's rotation: degrees about X, then Y, then Z. */
QEX_API void QexNode_SetRotation(QexNode* node, float x, float y, float z);

/** Sets a node's scale factors. */
QEX_API void QexNode_SetScale(QexNode* node, float x, float y, float z);

/** @return the sibling before a node; null for a root, a first child, or a node that was removed. */
QEX_API QexNode* QexNode_GetPreviousSibling(const QexNode* node);

/** Takes a node, with all below it, out of its parent's children. Its `parent` field stays.
 *  @return 0 (also when it was removed before), or -1 for a root, which is left as it is. */
QEX_API int32_t QexNode_Remove(QexNode* node);

/** Modes of QexNode_Release: what becomes of the records below the node. */
#define QEX_SCENE_NODE_KEEP 0  /* they stay below the node */
#define QEX_SCENE_NODE_FREE 1  /* freed with QexMemory_Free, from which they must come */
#define QEX_SCENE_NODE_CLEAR 2 /* cleared to zero, as for any other mode */

/** Removes a node and lets go of all below it, each once. The node's own record and all models stay.
 *  @param mode  QEX_SCENE_NODE_KEEP, _FREE or _CLEAR
 *  @return 0. */
QEX_API int32_t QexNode_Release(QexNode* node, int32_t mode);

/** Recomputes local and world matrices and advances the model nodes' animation (QexModel_Update).
 *  @param ignored  not read, may be null
 *  @param node     first node; null does nothing. Its parent's world matrix is used as it is
 *  @param dt       seconds, may be negative */
QEX_API void QexNode_Update(void* ignored, QexNode* node, float dt);

/** Draws pass 0 of the model nodes, each with its world matrix as the model matrix and its own scene's lights
 *  (QexModel_GetLight). Needs a current GL context.
 *  @param node  first node; null draws nothing */
QEX_API void QexNode_RenderWithCamera(QexNode* node, const QexCamera* camera);

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

/** Appends a string to the persistent text. Running out of memory ends the process with exit status 1. No GL
 * context needed.
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

/* ======================================================================================================
 * Engine: start and end
 *
 * The application owns window, surface and GL context; it makes the context current, initialises the engine
 * once, draws any number of frames, swaps buffers itself, and shuts the engine down.
 * ====================================================================================================== */

/** Size of QexEngineConfig on 32-bit targets. Both init functions take this and sizeof(QexEngineConfig). */
#define QEX_ENGINE_CONFIG_SIZE 44u

/** What the application asks for. The window-system words are copied to the context and not read. */
typedef struct QexEngineConfig {
    uint32_t reserved; /* not read */
    uint32_t windowWord1;
    uint32_t windowWord2;
    uint32_t windowWord3;
    uint32_t windowWord4;
    int32_t width; /* of the drawing surface, pixels */
    int32_t height;
    uint32_t windowWord7;
    uint32_t windowWord8;
    void* memory;        /* block lent for the memory pool until shutdown, may be null */
    uint32_t memorySize; /* its bytes */
} QexEngineConfig;

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

/** Initialises the engine and sets the engine flag.
 *  @param context     filled
 *  @param configSize  QEX_ENGINE_CONFIG_SIZE or sizeof(QexEngineConfig)
 *  @param config      read; its window-system words and size are written back
 *  @return 0; -1, with nothing changed, for another size, a null context or configuration, or, with a line in
 *  the log, where no GL context is current. */
QEX_API int32_t QexEngine_Init(QexRuntimeContext* context, uint32_t configSize, QexEngineConfig* config);

/** Initialises the engine on a surface that the application draws: memory pool, clock, render state, built-in
 *  textures, font. Arguments and result as QexEngine_Init; 0, too, when the font cannot be made, with a line
 *  in the log. */
QEX_API int32_t QexEngine_InitForOwnerDraw(QexRuntimeContext* context, uint32_t configSize,
                                           QexEngineConfig* config);

/** Tells the engine that the drawing surface has another size. The context's size, the text with its standing
 *  strings, stereo and everything else that reads the context follow; so does post-processing that was
 *  initialised at the former size, with the filters of its targets. Cameras, the GL viewport and the
 *  application's own render targets do not: project and set them anew. Needs a current GL context.
 *  @param context        initialised
 *  @param width, height  pixels, 1 and more
 *  @return 0; -1, with a line in the log and nothing changed, for a smaller size or a null context; -1 when
 *  post-processing cannot be had at the new size, which all else has then. */
QEX_API int32_t QexEngine_Resize(QexRuntimeContext* context, int32_t width, int32_t height);

/** Ends what QexEngine_Init began, in the same GL context. The shaders that models share go with it: a model
 *  that is not unloaded before is drawn no more, but may still be unloaded. What other families created
 *  (sky box, post-processing, billboards, particle sets, textures) is for the application to release. */
QEX_API void QexEngine_Shutdown(QexRuntimeContext* context);

/** Ends what QexEngine_InitForOwnerDraw began. */
QEX_API void QexEngine_ShutdownForOwnerDraw(QexRuntimeContext* context);

/** @return 1 after QexEngine_Init, else 0. */
QEX_API uint32_t QexEngine_IsInitialized(void);

/** @return 1 after either init function, else 0. */
QEX_API uint32_t QexEngine_IsOwnerDrawInitialized(void);

/** Does nothing: the application presents the frame. */
QEX_API void QexRenderer_Present(void);

/** Window-system step of QexEngine_Init; does nothing. @return 0. */
QEX_API int32_t QexInitEGL(QexRuntimeContext* context);

/** Window-system step of QexEngine_Shutdown; does nothing. @return 0. */
QEX_API int32_t QexShutdownEGL(QexRuntimeContext* context);

#ifdef QEX_UNPREFIXED_NAMES
/** Does nothing. @return 0. */
QEX_API int32_t createWindow(void);

/** Does nothing. @return 0. */
QEX_API int32_t destroyWindow(void);
#endif

#ifdef __cplusplus
}
#endif

#endif /* QEX_H */
