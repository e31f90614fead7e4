/* What samples' windows do on every system. */
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include "window_platform.h"

enum { kMostPath = 640 };

int Window_Fail(const char* what, const char* why) {
    fprintf(stderr, "%s: %s\n", what, why);
    return 1;
}

int Window_Open(Window* window, const char* title, int argc, char** argv) {
    QexEngineConfig config = {0};
    memset(window, 0, sizeof *window);
    window->width = 960;
    window->height = 540;
    window->picture = argc > 1 ? argv[1] : NULL;
    if (WindowPlatform_Open(window, title, argc > 2 ? atoi(argv[2]) : 4)) return 1;
    window->pointer.x = 0.75f * (float)window->width;
    window->pointer.y = 0.54f * (float)window->height;
    config.width = window->width;
    config.height = window->height;
    QexLog_SetLevel(QEX_LOG_WARNING);
    if (QexEngine_Init(&window->engine, sizeof config, &config) != 0)
        return Window_Fail("the engine", "cannot start");
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    return 0;
}

void Window_BeginFrame(Window* window) {
    const float elapsed = (float)QexTime_GetElapsed() / 1000;
    window->elapsed = window->frames++ && !window->picture ? elapsed : 0;
    window->seconds = window->picture ? 1 : window->seconds + window->elapsed;
}

void Window_Resize(Window* window, int width, int height) {
    window->width = width;
    window->height = height;
    QexEngine_Resize(&window->engine, width, height);
}

void Window_Run(Window* window, void (*draw)(Window* window, void* user), void* user) {
    WindowPlatform_Run(window, draw, user);
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
    QexCamera_Project(&camera, 1, (float)window->width / (float)window->height, 0.1f, 100);
    return camera;
}

void Window_LoadTexture(const Window* window, QexTexture* texture, const char* name) {
    char path[kMostPath];
    snprintf(path, sizeof path, "%s%s", window->files, name);
    memset(texture, 0, sizeof *texture);
    if (QexTexture_LoadPVRFromFile(texture, path, NULL, 1, 0) != 0)
        exit(Window_Fail(path, "cannot be loaded"));
    QexTexture_SetFilter(texture, QEX_FILTER_LINEAR);
    QexTexture_SetWrapping(texture, QEX_WRAP_CLAMP);
}

void Window_LoadPicture(const Window* window, QexPicture* picture, const char* name) {
    char path[kMostPath];
    snprintf(path, sizeof path, "%s%s", window->files, name);
    if (QexPicture_Load(picture, path) != 0) exit(Window_Fail(path, "cannot be loaded"));
}

void Window_LoadModel(const Window* window, QexModel* model, const char* name) {
    QexModel_Create(model);
    if (QexModel_LoadContent(model, window->files, name) != 0) exit(Window_Fail(name, "cannot be loaded"));
}

int Window_Close(Window* window) {
    QexEngine_Shutdown(&window->engine);
    return WindowPlatform_Close();
}
