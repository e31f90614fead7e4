// The viewer in a page: what its script calls. Texts are UTF-8; those returned are valid until the next call.
#include <string>

#include <emscripten.h>
#include <emscripten/html5.h>

#include "emitter/Description.h"
#include "front/Properties.h"
#include "front/Viewer.h"

namespace {

EMSCRIPTEN_WEBGL_CONTEXT_HANDLE s_Context;
Viewer* s_Viewer;
std::string s_Text;

const char* Return(const std::string& text) {
    s_Text = text;
    return s_Text.c_str();
}

}  // namespace

extern "C" {

// On the element #canvas, whose picture stays readable if it is `kept`. 0, or -1 without WebGL.
EMSCRIPTEN_KEEPALIVE int Page_Start(int width, int height, int antialias, int kept) {
    EmscriptenWebGLContextAttributes attributes;
    emscripten_webgl_init_context_attributes(&attributes);
    attributes.alpha = EM_FALSE;
    attributes.stencil = EM_TRUE;
    attributes.antialias = antialias;
    attributes.preserveDrawingBuffer = kept;
    s_Context = emscripten_webgl_create_context("#canvas", &attributes);
    if (s_Context <= 0) return -1;
    emscripten_webgl_make_context_current(s_Context);
    s_Viewer = new Viewer(width, height, LoadEmitter);
    return 0;
}

EMSCRIPTEN_KEEPALIVE void Page_Frame(double seconds, int width, int height) {
    s_Viewer->Tick(seconds);
    s_Viewer->Draw(width, height);
}

// The picture alone, for a file.
EMSCRIPTEN_KEEPALIVE void Page_DrawPlain(int width, int height) {
    s_Viewer->FitToFrame();
    s_Viewer->Draw(width, height, false);
}

// As ViewerEvent; `kind` is its number.
EMSCRIPTEN_KEEPALIVE void Page_Event(int kind, float x, float y, int button, float amount, unsigned modifiers,
                                     const char* text) {
    s_Viewer->Handle({static_cast<ViewerEvent::Kind>(kind), x, y, button, amount, modifiers, text});
}

EMSCRIPTEN_KEEPALIVE void Page_Add(const char* name, const void* bytes, size_t size) {
    s_Viewer->OpenBytes(name, bytes, size);
}

// Without showing it: a picture for the sky.
EMSCRIPTEN_KEEPALIVE const char* Page_Keep(const char* name, const void* bytes, size_t size) {
    return Return(s_Viewer->KeepBytes(name, bytes, size));
}

EMSCRIPTEN_KEEPALIVE const char* Page_Choices() {
    return Return(DescribeChoices());
}

EMSCRIPTEN_KEEPALIVE const char* Page_Scene() {
    return Return(DescribeScene(s_Viewer));
}

EMSCRIPTEN_KEEPALIVE const char* Page_Emitters() {
    return Return(DescribeEmitters(s_Viewer));
}

EMSCRIPTEN_KEEPALIVE const char* Page_State() {
    return Return(DescribeState(s_Viewer));
}

EMSCRIPTEN_KEEPALIVE int Page_Set(const char* json) {
    return SetProperties(s_Viewer, json) ? 0 : -1;
}

// The command line that draws this picture.
EMSCRIPTEN_KEEPALIVE const char* Page_Command(int width, int height) {
    return Return("qex " + ShellLine(RenderWords(s_Viewer->AsRenderOptions(width, height))));
}

EMSCRIPTEN_KEEPALIVE void Page_ContextLost() {
    s_Viewer->ContextLost();
}

EMSCRIPTEN_KEEPALIVE void Page_ContextRestored() {
    emscripten_webgl_make_context_current(s_Context);
    // Extensions are to be asked for anew.
    EM_ASM({
        GL.currentContext.initExtensionsDone = false;
        GL.initExtensions(GL.currentContext);
    });
    s_Viewer->ContextRestored();
}
}
