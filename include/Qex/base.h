/* The base: diagnostics, memory, time and float animation.
 *
 * Messages go to the Android log; on other hosts the log is standard error, one line a message, as
 * "I/Qex: text" and "E/Qex: text". Everything is written at first; a program chooses how much with
 * QexLog_SetLevel and where to with QexLog_SetSink. No GL context needed on this page.
 */
#ifndef QEX_BASE_H
#define QEX_BASE_H

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
#define QEX_BEGIN extern "C" {
#define QEX_END }
#else
#define QEX_BEGIN
#define QEX_END
#endif

QEX_BEGIN

/* Records that several pages share by pointer; each is described on its own page. */
typedef struct QexRuntimeContext QexRuntimeContext;
typedef struct QexPODModel QexPODModel;
typedef struct QexShaderModule QexShaderModule;
typedef struct QexTexture QexTexture;
typedef struct QexModel QexModel;
typedef struct QexLightSet QexLightSet;
typedef struct QexShadowInfo QexShadowInfo;

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

/** What an error handler is told of, besides the GL's own errors, which have the GL's numbers (0x0500 and
 *  more). */
#define QEX_ERROR_SHADER 1u      /* a shader does not compile; the message is the GL's log */
#define QEX_ERROR_PROGRAM 2u     /* a program does not link; likewise */
#define QEX_ERROR_FRAMEBUFFER 3u /* a framebuffer is incomplete */
#define QEX_ERROR_MEMORY 4u      /* memory was not to be had */

/** @param user     as given with the handler
 *  @param code     a GL error or QEX_ERROR_...
 *  @param module   of the engine, as in the log: "src/QexModel"
 *  @param file     of its source: "model/Model.cpp"
 *  @param line     there
 *  @param message  one line or the GL's log; like the other texts, valid during the call alone */
typedef void (*QexErrorHandler)(void* user, uint32_t code, const char* module, const char* file, int32_t line,
                                const char* message);

/** Says who is called when the GL reports an error, refuses a shader, a program or a framebuffer, or memory
 *  runs out. Without a handler, which is how the engine starts, a GL error ends the process with exit status
 *  255. With one, the lines are logged all the same, and when it returns the call that found the error fails
 *  as it says it may: what it was making is given back whole. A call that draws leaves out what it has not
 *  drawn yet; the next frame is drawn as ever.
 *
 *  A handler may call any function of the engine that releases or asks, not one that draws or loads; errors
 *  found meanwhile are logged and not handed to it. What is being drawn or made at the moment must stay:
 *  release that afterwards. It has to return: a jump out of it (longjmp, an exception) leaves the engine in
 *  no defined state. Builds without checks of GL errors report all but those.
 *  @param handler  null: none
 *  @param user     handed to it */
QEX_API void QexEngine_SetErrorHandler(QexErrorHandler handler, void* user);

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

QEX_END

#endif
