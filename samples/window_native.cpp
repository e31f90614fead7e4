// A window through SDL2, or a picture through EGL without a window system.
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>

#define SDL_MAIN_HANDLED
#include <SDL.h>
#define STB_IMAGE_WRITE_STATIC
#define STB_IMAGE_WRITE_IMPLEMENTATION
#include <stb/stb_image_write.h>

#include "Headless.h"
#include "window_platform.h"

static SDL_Window* s_Window;
static SDL_GLContext s_Context;
static std::unique_ptr<qex::HeadlessContext> s_Picture;
static int s_Failed;
static std::string s_Files;

// Without a display SDL may fall back to a driver that shows nothing, which only who names it wants.
static bool HasDisplay() {
    const char* driver = SDL_GetCurrentVideoDriver();
    return getenv("SDL_VIDEODRIVER") || (strcmp(driver, "offscreen") != 0 && strcmp(driver, "dummy") != 0);
}

static int OpenWindow(Window* window, const char* title, int samples) {
    SDL_SetMainReady();
    if (SDL_Init(SDL_INIT_VIDEO) != 0 || !HasDisplay())
        return Window_Fail("no window", "name a picture's file as argument to draw without one");
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_PROFILE_MASK, SDL_GL_CONTEXT_PROFILE_ES);
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_MAJOR_VERSION, 2);
    SDL_GL_SetAttribute(SDL_GL_CONTEXT_MINOR_VERSION, 0);
    SDL_GL_SetAttribute(SDL_GL_DEPTH_SIZE, 24);
    SDL_GL_SetAttribute(SDL_GL_STENCIL_SIZE, 8);
    // A display without multisampling gets a window without.
    for (const int tried : {samples, 0}) {
        SDL_GL_SetAttribute(SDL_GL_MULTISAMPLEBUFFERS, tried > 1);
        SDL_GL_SetAttribute(SDL_GL_MULTISAMPLESAMPLES, tried);
        s_Window = SDL_CreateWindow(title, SDL_WINDOWPOS_CENTERED, SDL_WINDOWPOS_CENTERED, window->width,
                                    window->height, SDL_WINDOW_OPENGL | SDL_WINDOW_RESIZABLE);
        s_Context = s_Window ? SDL_GL_CreateContext(s_Window) : nullptr;
        if (s_Context) break;
        if (s_Window) SDL_DestroyWindow(s_Window);
    }
    if (!s_Context) return Window_Fail("no window", SDL_GetError());
    SDL_GL_SetSwapInterval(1);
    SDL_GL_GetDrawableSize(s_Window, &window->width, &window->height);
    return 0;
}

static int OpenPicture(const Window& window, int samples) {
    std::string error;
    s_Picture =
        qex::HeadlessContext::Create(window.width, window.height, &error, qex::HeadlessGL::kContext, samples);
    return s_Picture ? 0 : Window_Fail("EGL", error.c_str());
}

// Opaque, whatever blending left in alpha.
static void SavePicture(const Window& window) {
    std::vector<uint8_t> pixels = s_Picture->ReadPixels();
    for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 255;
    s_Failed =
        !stbi_write_png(window.picture, window.width, window.height, 4, pixels.data(), 4 * window.width);
    if (s_Failed) Window_Fail(window.picture, "cannot be written");
}

// False when the window is to be closed.
static bool HandleEvents(Window* window) {
    SDL_Event event;
    while (SDL_PollEvent(&event)) {
        if (event.type == SDL_QUIT || (event.type == SDL_KEYDOWN && event.key.keysym.sym == SDLK_ESCAPE))
            return false;
        if (event.type == SDL_MOUSEMOTION)
            window->pointer = {static_cast<float>(event.motion.x), static_cast<float>(event.motion.y)};
        if (event.type != SDL_WINDOWEVENT || event.window.event != SDL_WINDOWEVENT_SIZE_CHANGED) continue;
        int width, height;
        SDL_GL_GetDrawableSize(s_Window, &width, &height);
        Window_Resize(window, width, height);
    }
    return true;
}

extern "C" {

int WindowPlatform_Open(Window* window, const char* title, int samples) {
    char* base = SDL_GetBasePath();
    s_Files = std::string(base ? base : "") + "scenes/";
    SDL_free(base);
    window->files = s_Files.c_str();
    return window->picture ? OpenPicture(*window, samples) : OpenWindow(window, title, samples);
}

void WindowPlatform_Run(Window* window, void (*draw)(Window* window, void* user), void* user) {
    while (window->picture || HandleEvents(window)) {
        Window_BeginFrame(window);
        draw(window, user);
        if (window->picture) return SavePicture(*window);
        SDL_GL_SwapWindow(s_Window);
    }
}

int WindowPlatform_Close() {
    s_Picture.reset();
    if (s_Context) SDL_GL_DeleteContext(s_Context);
    if (s_Window) SDL_DestroyWindow(s_Window);
    SDL_Quit();
    return s_Failed;
}

}  // extern "C"
