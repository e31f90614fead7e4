/* The engine: start and end.
 *
 * The application owns window, surface and GL context; it makes the context current, initialises the engine
 * once, draws any number of frames, swaps buffers itself, and shuts the engine down.
 */
#ifndef QEX_ENGINE_H
#define QEX_ENGINE_H

#include "Qex/base.h"

QEX_BEGIN

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

QEX_END

#endif
