// The least that a page wants: a scene from a file, lit, drawn lean. bench/peers/web-size says how large it
// is.
#include <EGL/egl.h>
#include <emscripten.h>

#include <Qex.h>

namespace {

QexRuntimeContext s_Engine;
QexModel s_Model;
QexCamera s_Camera;

void MakeContext() {
    static const EGLint config[] = {EGL_NONE}, version[] = {EGL_CONTEXT_CLIENT_VERSION, 2, EGL_NONE};
    const EGLDisplay display = eglGetDisplay(EGL_DEFAULT_DISPLAY);
    EGLConfig chosen;
    EGLint count;
    eglInitialize(display, nullptr, nullptr);
    eglChooseConfig(display, config, &chosen, 1, &count);
    const EGLSurface surface = eglCreateWindowSurface(display, chosen, 0, nullptr);
    eglMakeCurrent(display, surface, surface, eglCreateContext(display, chosen, EGL_NO_CONTEXT, version));
}

void DrawFrame() {
    static const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {-1, -1, -1}, {1, 1, 1, 1}}}};
    QexModel_RenderWithCamera(&s_Model, &lights, &s_Camera, nullptr, 0);
}

}  // namespace

int main() {
    const QexVec3 eye = {0, 0, 5}, target = {0, 0, 0};
    QexEngineConfig config = {};
    config.width = 320;
    config.height = 240;
    MakeContext();
    QexEngine_Init(&s_Engine, sizeof config, &config);
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    QexModel_Create(&s_Model);
    QexModel_LoadContent(&s_Model, "/", "scene.pod");
    QexModel_SetShaderProgramForAllNode(&s_Model, QexGouraudShader_CreateProgram(), nullptr);
    QexCamera_Create(&s_Camera, 0);
    QexCamera_LookAt(&s_Camera, &eye, &target, nullptr);
    QexCamera_Project(&s_Camera, 0.8f, 4.0f / 3, 1, 100);
    emscripten_set_main_loop(DrawFrame, 0, 0);
}
