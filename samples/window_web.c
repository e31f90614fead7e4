/* A page's canvas, the element #canvas, with a WebGL 1 context. */
#include <stddef.h>

#include <emscripten.h>
#include <emscripten/html5.h>

#include "window_platform.h"

static const char kCanvas[] = "#canvas";

static struct {
    EMSCRIPTEN_WEBGL_CONTEXT_HANDLE context;
    Window* window;
    void (*draw)(Window* window, void* user);
    void* user;
} s_Page;

/* The size on the page in pixels of the screen; a picture has its own. */
static void Measure(int* width, int* height) {
    const double ratio = emscripten_get_device_pixel_ratio();
    double across = 0, down = 0;
    emscripten_get_element_css_size(kCanvas, &across, &down);
    *width = across * ratio < 1 ? 1 : (int)(across * ratio + 0.5);
    *height = down * ratio < 1 ? 1 : (int)(down * ratio + 0.5);
}

static EM_BOOL Move(int type, const EmscriptenMouseEvent* event, void* user) {
    const float ratio = (float)emscripten_get_device_pixel_ratio();
    (void)type, (void)user;
    s_Page.window->pointer.x = ratio * (float)event->targetX;
    s_Page.window->pointer.y = ratio * (float)event->targetY;
    return EM_FALSE;
}

/* Taking the event lets the browser give the context back. */
static EM_BOOL Lose(int type, const void* reserved, void* user) {
    (void)type, (void)reserved, (void)user;
    QexEngine_ContextLost();
    return EM_TRUE;
}

static void DrawFrame(void* user) {
    Window* window = s_Page.window;
    int width, height;
    (void)user;
    if (QexEngine_IsContextLost()) return;
    Measure(&width, &height);
    if (!window->picture && (width != window->width || height != window->height)) {
        emscripten_set_canvas_element_size(kCanvas, width, height);
        Window_Resize(window, width, height);
    }
    Window_BeginFrame(window);
    s_Page.draw(window, s_Page.user);
    if (window->frames == 1 || window->picture)
        EM_ASM({ Module["onFrame"] && Module["onFrame"]($0); }, window->frames);
    if (window->picture) emscripten_pause_main_loop();
}

static EM_BOOL Restore(int type, const void* reserved, void* user) {
    (void)type, (void)reserved, (void)user;
    emscripten_webgl_make_context_current(s_Page.context);
    /* Extensions are to be asked for anew. */
    EM_ASM({
        GL.currentContext.initExtensionsDone = false;
        GL.initExtensions(GL.currentContext);
    });
    if (QexEngine_ContextRestored() != 0) Window_Fail("context", "not everything could be made again");
    emscripten_resume_main_loop();
    return EM_TRUE;
}

int WindowPlatform_Open(Window* window, const char* title, int samples) {
    EmscriptenWebGLContextAttributes attributes;
    (void)title;
    window->files = "/";
    emscripten_webgl_init_context_attributes(&attributes);
    attributes.alpha = EM_FALSE;
    attributes.stencil = EM_TRUE;
    attributes.antialias = samples > 1;
    attributes.preserveDrawingBuffer = window->picture != NULL;
    if (!window->picture) Measure(&window->width, &window->height);
    emscripten_set_canvas_element_size(kCanvas, window->width, window->height);
    s_Page.window = window;
    s_Page.context = emscripten_webgl_create_context(kCanvas, &attributes);
    if (s_Page.context <= 0) return Window_Fail("canvas", "this browser has no WebGL");
    QexEngine_KeepTextures(1); /* pictures come back as well */
    emscripten_set_webglcontextlost_callback(kCanvas, NULL, EM_FALSE, Lose);
    emscripten_set_webglcontextrestored_callback(kCanvas, NULL, EM_FALSE, Restore);
    emscripten_set_mousemove_callback(kCanvas, NULL, EM_FALSE, Move);
    return emscripten_webgl_make_context_current(s_Page.context) == EMSCRIPTEN_RESULT_SUCCESS
               ? 0
               : Window_Fail("canvas", "its context cannot be used");
}

void WindowPlatform_Run(Window* window, void (*draw)(Window* window, void* user), void* user) {
    s_Page.window = window;
    s_Page.draw = draw;
    s_Page.user = user;
    emscripten_set_main_loop_arg(DrawFrame, NULL, 0, EM_TRUE);
}

int WindowPlatform_Close(void) {
    emscripten_webgl_destroy_context(s_Page.context);
    return 0;
}
