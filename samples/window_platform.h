/* What differs between systems: window_native.cpp has SDL2 and EGL, window_web.c a page's canvas. */
#ifndef QEX_SAMPLES_WINDOW_PLATFORM_H
#define QEX_SAMPLES_WINDOW_PLATFORM_H

#include "window.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Makes a context of the window's size current, or sets that size where the system knows better; `samples`
 * are the samples of a pixel. Sets the folder of files. 0, or 1 with a line on standard error. */
int WindowPlatform_Open(Window* window, const char* title, int samples);

/* Calls WindowPlatform's frames: Window_BeginFrame, `draw`, and shows what was drawn, until the window is
 * closed. */
void WindowPlatform_Run(Window* window, void (*draw)(Window* window, void* user), void* user);

/* Ends what Open began. 1 when the picture could not be saved. */
int WindowPlatform_Close(void);

/* Moves the window's clock on. */
void Window_BeginFrame(Window* window);

/* The drawing surface has another size. */
void Window_Resize(Window* window, int width, int height);

/* Writes "what: why" to standard error. 1. */
int Window_Fail(const char* what, const char* why);

#ifdef __cplusplus
}
#endif

#endif
