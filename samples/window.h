/* What samples need around the engine: a window, or a page's canvas, with an OpenGL ES 2.0 context, and the
 * engine started on it. With a picture's name as the first argument there is no window: the sample draws one
 * frame and saves it as PNG; a number behind the name is how many samples a pixel has, 4 without. Put your
 * own window in its place; README.md shows one in a program of its own. */
#ifndef QEX_SAMPLES_WINDOW_H
#define QEX_SAMPLES_WINDOW_H

#include <GLES2/gl2.h>
#include <Qex.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef struct Window {
    QexRuntimeContext engine;
    int width, height;   /* pixels */
    float seconds;       /* since the first frame; 1 in a picture */
    float elapsed;       /* since the frame before */
    QexVec2 pointer;     /* the mouse or finger, pixels from the upper left; a fixed place in a picture */
    const char* picture; /* file that is saved, null in a window */
    const char* files;   /* folder of the samples' scenes and textures, with a slash at its end */
    int frames;          /* that were begun */
} Window;

/* Opens a window and starts the engine, which draws lean. 0, or 1 with a line on standard error. */
int Window_Open(Window* window, const char* title, int argc, char** argv);

/* Calls `draw` for each frame, shows what it drew, and follows the window's size, until the window is closed
 * or the picture is drawn. A page is never closed: there it does not return, and what its caller has stays
 * alive. */
void Window_Run(Window* window, void (*draw)(Window* window, void* user), void* user);

/* Clears the window, and sets what most scenes want: the whole viewport, depth test, alpha blending. */
void Window_Clear(const Window* window, float red, float green, float blue);

/* A camera at `eye` that looks at `target`; its field of view is 1 across, its planes at 0.1 and 100. */
QexCamera Window_Camera(const Window* window, QexVec3 eye, QexVec3 target);

/* Loads a PVR file of the samples, linearly filtered and clamped; the program ends where that fails. */
void Window_LoadTexture(const Window* window, QexTexture* texture, const char* name);

/* Loads a picture of the samples; the program ends where that fails. */
void Window_LoadPicture(const Window* window, QexPicture* picture, const char* name);

/* Loads a scene of the samples with its textures; the program ends where that fails. */
void Window_LoadModel(const Window* window, QexModel* model, const char* name);

/* Ends the engine and the window. The program's exit status: 0, or 1 when the picture could not be saved. */
int Window_Close(Window* window);

#ifdef __cplusplus
}

/* The same for a function object: Window_Run(&window, [&] { ... }). */
template <typename Draw>
void Window_Run(Window* window, Draw draw) {
    Window_Run(
        window, [](Window*, void* user) { (*static_cast<Draw*>(user))(); }, &draw);
}
#endif

#endif
