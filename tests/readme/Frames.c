/* Stands in for showing a frame: looks at the first one, has the window made smaller for the second one, and
 * closes it after that. */
#include <stdlib.h>
#include <string.h>

#include <GLES2/gl2.h>
#include <Qex.h>
#include <SDL.h>

/* A program's own names, which the header would clash with if it declared them unasked. */
enum { createWindow, destroyWindow, fontdata, GetRandomInt, GetScaleFromMatrix, blurShaderProgram, g_VecUp };

void __wrap_SDL_GL_SwapWindow(SDL_Window* window);

/* A scene's middle is no background, and its corner is. */
static int ShowsScene(void) {
    unsigned char middle[4], corner[4];
    glReadPixels(320, 240, 1, 1, GL_RGBA, GL_UNSIGNED_BYTE, middle);
    glReadPixels(0, 0, 1, 1, GL_RGBA, GL_UNSIGNED_BYTE, corner);
    return memcmp(middle, corner, 3) != 0 && corner[0] == 64 && corner[2] == 102;
}

void __wrap_SDL_GL_SwapWindow(SDL_Window* window) {
    static int frame;
    GLint viewport[4];
    SDL_Event quit;
    memset(&quit, 0, sizeof quit);
    quit.type = SDL_QUIT;
    glGetIntegerv(GL_VIEWPORT, viewport);
    if (++frame == 1) {
        if (!ShowsScene()) exit(3);
        SDL_SetWindowSize(window, 320, 200);
    } else {
        if (viewport[2] != 320 || viewport[3] != 200) exit(4);
        SDL_PushEvent(&quit);
    }
}
