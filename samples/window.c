/* A window through SDL2, or a picture through EGL without a window system. */
#include "window.h"

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <EGL/egl.h>
#include <EGL/eglext.h>
#define SDL_MAIN_HANDLED
#include <SDL.h>

#define STB_IMAGE_WRITE_STATIC
#define STB_IMAGE_WRITE_IMPLEMENTATION
#include <stb/stb_image_write.h>

static SDL_Window* s_Window;
static SDL_GLContext s_Context;
static int s_Failed;
static char s_Files[512];

static int Fail(const char* what, const char* why) {
    fprintf(stderr, "%s: %s\n", what, why);
    return 1;
}

/* Without a display SDL may fall back to a driver that shows nothing, which only who names it wants. */
static int HasDisplay(void) {
    const char* driver = SDL_GetCurrentVideoDriver();
    return getenv("SDL_VIDEODRIVER") || (strcmp(driver, "offscreen") != 0 && strcmp(driver, "dummy") != 0);
}

static int OpenWindow(Window* window, const char* title) {
    SDL_SetMainReady();
    if (SDL_Init(SDL_INIT_VIDEO) != 0 || !HasDisplay())
        return Fail("no window", "name a picture's file as argument to draw without one");
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_PROFILE_MASK, SDL_GL_CONTEXT_PROFILE_ES);
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_MAJOR_VERSION, 2);
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_MINOR_VERSION, 0);
    SDL_GL_SetAttribute(SDL_GL_DEPTH_SIZE, 24);
    SDL_GL_SetAttribute(SDL_GL_STENCIL_SIZE, 8);
    s_Window = SDL_CreateWindow(title, SDL_WINDOWPOS_CENTERED, SDL_WINDOWPOS_CENTERED, 2 * window->width,
                                2 * window->height, SDL_WINDOW_OPENGL | SDL_WINDOW_RESIZABLE);
    s_Context = s_Window ? SDL_GL_CreateContext(s_Window) : NULL;
    if (!s_Context) return Fail("no window", SDL_GetError());
    SDL_GL_SetSwapInterval(1);
    SDL_GL_GetDrawableSize(s_Window, &window->width, &window->height);
    return 0;
}

static int OpenPicture(const Window* window) {
    static const EGLint format[] = {EGL_SURFACE_TYPE,
                                    EGL_PBUFFER_BIT,
                                    EGL_RED_SIZE,
                                    8,
                                    EGL_RENDERABLE_TYPE,
                                    EGL_OPENGL_ES2_BIT,
                                    EGL_DEPTH_SIZE,
                                    24,
                                    EGL_STENCIL_SIZE,
                                    8,
                                    EGL_NONE};
    static const EGLint version[] = {EGL_CONTEXT_CLIENT_VERSION, 2, EGL_NONE};
    const EGLint size[] = {EGL_WIDTH, window->width, EGL_HEIGHT, window->height, EGL_NONE};
    const PFNEGLGETPLATFORMDISPLAYEXTPROC getDisplay =
        (PFNEGLGETPLATFORMDISPLAYEXTPROC)eglGetProcAddress("eglGetPlatformDisplayEXT");
    EGLDisplay display = getDisplay ? getDisplay(EGL_PLATFORM_SURFACELESS_MESA, NULL, NULL)
                                    : eglGetDisplay(EGL_DEFAULT_DISPLAY);
    EGLConfig config;
    EGLint count = 0;
    EGLSurface surface;
    EGLContext context;
    if (!eglInitialize(display, NULL, NULL) || !eglChooseConfig(display, format, &config, 1, &count) ||
        !count)
        return Fail("EGL", "no display");
    eglBindAPI(EGL_OPENGL_ES_API);
    surface = eglCreatePbufferSurface(display, config, size);
    context = eglCreateContext(display, config, EGL_NO_CONTEXT, version);
    return eglMakeCurrent(display, surface, surface, context) ? 0 : Fail("EGL", "no context");
}

/* The rows from above, as pictures have them, and opaque, whatever blending left in alpha. */
static void SavePicture(const Window* window) {
    const size_t row = (size_t)window->width * 4, size = row * (size_t)window->height;
    unsigned char* pixels = malloc(size);
    size_t i;
    s_Failed = 1;
    if (pixels) {
        glReadPixels(0, 0, window->width, window->height, GL_RGBA, GL_UNSIGNED_BYTE, pixels);
        for (i = 3; i < size; i += 4) pixels[i] = 255;
        stbi_flip_vertically_on_write(1);
        s_Failed = !stbi_write_png(window->picture, window->width, window->height, 4, pixels, (int)row);
    }
    free(pixels);
    if (s_Failed) Fail(window->picture, "cannot be written");
}

int Window_Open(Window* window, const char* title, int argc, char** argv) {
    QexEngineConfig config = {0};
    char* base = SDL_GetBasePath();
    memset(window, 0, sizeof *window);
    snprintf(s_Files, sizeof s_Files, "%sscenes/", base ? base : "");
    SDL_free(base);
    window->files = s_Files;
    window->width = 320;
    window->height = 240;
    window->picture = argc > 1 ? argv[1] : NULL;
    if (window->picture ? OpenPicture(window) : OpenWindow(window, title)) return 1;
    config.width = window->width;
    config.height = window->height;
    QexLog_SetLevel(QEX_LOG_WARNING);
    if (QexEngine_Init(&window->engine, sizeof config, &config) != 0)
        return Fail("the engine", "cannot start");
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    return 0;
}

/* 0 when the window is to be closed. */
static int HandleEvents(Window* window) {
    SDL_Event event;
    while (SDL_PollEvent(&event)) {
        if (event.type == SDL_QUIT || (event.type == SDL_KEYDOWN && event.key.keysym.sym == SDLK_ESCAPE))
            return 0;
        if (event.type != SDL_WINDOWEVENT || event.window.event != SDL_WINDOWEVENT_SIZE_CHANGED) continue;
        SDL_GL_GetDrawableSize(s_Window, &window->width, &window->height);
        QexEngine_Resize(&window->engine, window->width, window->height);
    }
    return 1;
}

int Window_Frame(Window* window) {
    const int first = window->frames++ == 0;
    if (window->picture) {
        window->seconds = 1;
        if (!first) SavePicture(window);
        return first;
    }
    if (!first) SDL_GL_SwapWindow(s_Window);
    window->elapsed = (float)QexTime_GetElapsed() / 1000;
    if (first) window->elapsed = 0;
    window->seconds += window->elapsed;
    return HandleEvents(window);
}

void Window_Clear(const Window* window, float red, float green, float blue) {
    glViewport(0, 0, window->width, window->height);
    QexRenderer_SetZWrite(1);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    glClearColor(red, green, blue, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT | GL_STENCIL_BUFFER_BIT);
}

QexCamera Window_Camera(const Window* window, QexVec3 eye, QexVec3 target) {
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    QexCamera_LookAt(&camera, &eye, &target, NULL);
    QexCamera_Project(&camera, 0.8f, (float)window->width / (float)window->height, 0.1f, 100);
    return camera;
}

void Window_LoadTexture(const Window* window, QexTexture* texture, const char* name) {
    char path[sizeof s_Files + 64];
    snprintf(path, sizeof path, "%s%s", window->files, name);
    memset(texture, 0, sizeof *texture);
    if (QexTexture_LoadPVRFromFile(texture, path, NULL, 1, 0) != 0) exit(Fail(path, "cannot be loaded"));
    QexTexture_SetFilter(texture, QEX_FILTER_LINEAR);
    QexTexture_SetWrapping(texture, QEX_WRAP_CLAMP);
}

void Window_LoadPicture(const Window* window, QexPicture* picture, const char* name) {
    char path[sizeof s_Files + 64];
    snprintf(path, sizeof path, "%s%s", window->files, name);
    if (QexPicture_Load(picture, path) != 0) exit(Fail(path, "cannot be loaded"));
}

void Window_LoadModel(const Window* window, QexModel* model, const char* name) {
    QexModel_Create(model);
    if (QexModel_LoadContent(model, window->files, name) != 0) exit(Fail(name, "cannot be loaded"));
}

int Window_Close(Window* window) {
    QexEngine_Shutdown(&window->engine);
    if (s_Context) SDL_GL_DeleteContext(s_Context);
    if (s_Window) SDL_DestroyWindow(s_Window);
    SDL_Quit();
    return s_Failed;
}
