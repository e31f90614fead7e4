/* GL tap: stands between a program and OpenGL ES 2.0 (with GL_OES_vertex_array_object).
 *
 * libgltap.so defines every function of OpenGL ES 2.0. Linked before libGLESv2, or preloaded, it receives a
 * program's calls and forwards them to the driver, or answers them itself (the null driver). It counts the
 * calls, follows the GL state and the objects, and on demand records calls, replays them and injects errors.
 *
 * This interface controls it from within the program, in C or C++. Nothing here calls GL, gltapReplay apart.
 * One thread at a time, like a GL context. Functions that write text work like snprintf: at most `size`
 * bytes with the terminating zero, the result is the full length; text may be null when size is 0.
 */
#ifndef GLTAP_H
#define GLTAP_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

#define GLTAP_API __attribute__((visibility("default")))

/* ---- Where calls go ---- */

typedef enum gltapMode {
    GLTAP_FORWARD, /* to the driver, libGLESv2.so.2 (the default) */
    GLTAP_NULL     /* nowhere: each call is answered at once, as a driver without errors would */
} gltapMode;

GLTAP_API void gltapSetMode(gltapMode mode);
GLTAP_API gltapMode gltapGetMode(void);

/* Forgets counts, followed state, live objects, injected errors and an unfinished recording; the mode stays.
 * To be called when a new context becomes current: the tap does not see EGL. */
GLTAP_API void gltapReset(void);

/* ---- Functions and counts ---- */

/* Functions are numbered from 0 to gltapFunctionCount() - 1, in alphabetical order. */
GLTAP_API int gltapFunctionCount(void);
/* "glClear"; null for a number out of range. */
GLTAP_API const char* gltapFunctionName(int function);
/* The number of a function, -1 for an unknown name. */
GLTAP_API int gltapFunctionNumber(const char* name);

/* Calls of one function since the counts were reset; 0 for an unknown name. Always counted. */
GLTAP_API uint64_t gltapCount(const char* name);
/* Calls of all functions. */
GLTAP_API uint64_t gltapCountAll(void);
GLTAP_API void gltapResetCounts(void);
/* One line for each function called, the most frequent first: count and name. */
GLTAP_API size_t gltapDescribeCounts(char* text, size_t size);

/* ---- Recording ---- */

typedef union gltapValue {
    int64_t i;     /* integers, enums, booleans, sizes and offsets */
    double f;      /* floats */
    const void* p; /* pointers */
} gltapValue;

/* One recorded call. What a pointer argument points at is copied where GL reads it during the call: uniform
 * and attribute values, strings (zero-terminated), buffer and texture contents, names to delete, indices when
 * no element buffer is bound; the argument then points at the copy. The pieces of a glShaderSource are joined
 * into one. The names that a glGen* returns are copied too. Other pointers, the address of a client-side
 * vertex array among them, are kept as they were given. */
typedef struct gltapCall {
    uint16_t function;
    uint16_t argumentCount;
    uint32_t dataSize; /* bytes at data, 0 for none */
    const void* data;
    gltapValue argument[9];
    gltapValue result; /* i, or p for glGetString; 0 for functions without a result */
} gltapCall;

typedef struct gltapRecording gltapRecording;

/* Starts to record; a recording under way is dropped. */
GLTAP_API void gltapBeginRecording(void);
/* Ends the recording and returns it; the caller releases it. Null when none was begun. */
GLTAP_API gltapRecording* gltapEndRecording(void);
GLTAP_API void gltapReleaseRecording(gltapRecording* recording);

GLTAP_API size_t gltapRecordingSize(const gltapRecording* recording);
/* The call at an index; null out of range. It lives as long as the recording. */
GLTAP_API const gltapCall* gltapRecordingCall(const gltapRecording* recording, size_t index);

/* 1 when both recordings hold the same calls with the same arguments and data, else 0 and one line about the
 * first difference. Addresses that were not copied from and results are not compared. */
GLTAP_API int gltapSameRecording(const gltapRecording* a, const gltapRecording* b, char* text, size_t size);

/* The call as source text: "glBindTexture(GL_TEXTURE_2D, 3)", with " = 5" where there is a result. */
GLTAP_API size_t gltapDescribeCall(const gltapCall* call, char* text, size_t size);
/* The whole recording, one call a line. */
GLTAP_API size_t gltapDescribeRecording(const gltapRecording* recording, char* text, size_t size);

/* Issues the recorded calls again through the same gl* functions, with nothing between two calls but the
 * reading of the record. They go where the mode says, are counted, and are recorded if a recording is under
 * way. Names and locations are used as recorded: replay what uses objects, not what creates them. What GL
 * returns through pointers is thrown away. Client-side vertex arrays must still be where they were. */
GLTAP_API void gltapReplay(const gltapRecording* recording);

/* ---- Errors ---- */

/* Makes the nth call from now of a function (1 = the next one) fail with a GL error: the call is not carried
 * out, as GL ignores a call that is in error, and the next glGetError returns the error, once. Several may
 * wait at a time. Returns 0 for an unknown function, glGetError itself, nth = 0 or error = 0. */
GLTAP_API int gltapInjectError(const char* function, uint32_t nth, uint32_t error);
/* Injections that still wait for their call. */
GLTAP_API size_t gltapPendingInjections(void);

/* ---- What a draw reads ---- */

/* From now on, until gltapReset, keeps what buffers hold and looks at each draw before it is made: its
 * indices and all vertices that they name lie within their buffers, and there is a program. What lies in
 * memory of the program, images too, is read, so that a sanitizer says where that is too short. To be called
 * before the first buffer is made. */
GLTAP_API void gltapBeginReads(void);
/* The number of faults since then; the first one as a line. */
GLTAP_API size_t gltapReadFaults(char* text, size_t size);

/* ---- A poorer GL ---- */

/* From now on glGetIntegerv gives this value for a name: a limit lower than the driver's, or a number of
 * compressed formats of 0, for example. What the driver takes stays the same. gltapReset forgets it. */
GLTAP_API void gltapSetInteger(uint32_t name, int32_t value);
/* Leaves an extension out of what glGetString(GL_EXTENSIONS) gives. gltapReset forgets it. */
GLTAP_API void gltapHideExtension(const char* name);

/* ---- Objects ---- */

typedef enum gltapObject {
    GLTAP_TEXTURE,
    GLTAP_BUFFER,
    GLTAP_FRAMEBUFFER,
    GLTAP_RENDERBUFFER,
    GLTAP_SHADER,
    GLTAP_PROGRAM,
    GLTAP_VERTEX_ARRAY,
    GLTAP_OBJECT_KINDS
} gltapObject;

/* Objects created and not yet deleted, in ascending order of their names. Writes at most max of them (names
 * may be null when max is 0) and returns their number. */
GLTAP_API size_t gltapLiveObjects(gltapObject kind, uint32_t* names, size_t max);
/* One line for each kind with live objects: "textures: 2 (3 7)"; an empty text when nothing lives. */
GLTAP_API size_t gltapDescribeObjects(char* text, size_t size);

/* ---- State ---- */

#define GLTAP_UNITS 32

/* The GL state as the calls have set it since the start or gltapReset, beginning with GL's initial values
 * (viewport and scissor box begin as 0, since GL takes them from the window). A call that GL rejects is
 * followed all the same. Pairs are RGB and alpha, or front and back face. */
typedef struct gltapState {
    uint32_t program;
    uint32_t activeUnit; /* 0, 1, ... */
    uint32_t texture2D[GLTAP_UNITS];
    uint32_t textureCube[GLTAP_UNITS];
    uint32_t vertexArray;
    uint32_t arrayBuffer;
    uint32_t elementBuffer; /* of the bound vertex array object, as attributeArrays */
    uint32_t framebuffer, renderbuffer;
    uint32_t attributeArrays; /* bit i: attribute array i is enabled */
    /* capabilities, 0 or 1 */
    uint32_t blend, cullFace, depthTest, dither, polygonOffsetFill, sampleAlphaToCoverage, sampleCoverage;
    uint32_t scissorTest, stencilTest;
    uint32_t blendSource[2], blendDestination[2], blendEquation[2];
    float blendColor[4];
    uint32_t colorMask[4];
    uint32_t cullFaceMode, frontFace;
    uint32_t depthMask, depthFunc;
    float depthRange[2];
    float polygonOffset[2];
    float lineWidth;
    uint32_t stencilFunc[2], stencilValueMask[2], stencilWriteMask[2];
    int32_t stencilReference[2];
    uint32_t stencilFail[2], stencilDepthFail[2], stencilPass[2];
    int32_t viewport[4], scissor[4];
    float clearColor[4], clearDepth;
    int32_t clearStencil;
    uint32_t packAlignment, unpackAlignment;
} gltapState;

GLTAP_API void gltapGetState(gltapState* state);
/* One line for each value that differs, "depthFunc: GL_LESS -> GL_LEQUAL"; an empty text for equal states. */
GLTAP_API size_t gltapDiffState(const gltapState* before, const gltapState* after, char* text, size_t size);

#ifdef __cplusplus
}
#endif

#endif
