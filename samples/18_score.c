/* Sample 18: a HUD in a few lines over a scene: a round picture, a bar of energy, a score, a line of text. */
#include "window.h"

static QexPicture s_View, s_Gauge;
static QexModel s_Village;

static void Draw(Window* window, void* user) {
    static const QexRect part = {0, 0, 95, 15}; /* three quarters of the gauge */
    static const QexVec3 eye = {-5, 3.4f, 10.5f}, middle = {0.6f, 1.2f, 0};
    static const QexLightSet lights = {1,
                                       {{QEX_LIGHT_DIRECTIONAL, {0.6f, -0.8f, -0.5f}, {1, 0.95f, 0.85f, 1}}}};
    const QexCamera camera = Window_Camera(window, eye, middle);
    (void)user;
    QexFont_SetScale(2);
    Window_Clear(window, 0.6f, 0.75f, 0.9f);
    QexModel_RenderWithCamera(&s_Village, &lights, &camera, NULL, 0);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
    QexPicture_Draw(&window->engine, NULL, NULL, 80, 32, 432, 80, 0x80000000); /* behind it all */
    QexPicture_Draw(&window->engine, &s_View, NULL, 16, 8, 128, 128, 0xFFFFFFFF);
    QexPicture_Draw(&window->engine, &s_Gauge, &part, 160, 48, 240, 48, 0xFFFFFFFF);
    QexFont_DrawNum(&window->engine, 420, 88, (int)(100 * window->seconds), 0xFFFFE080);
    QexFont_DrawTempString(&window->engine, 24, window->height - 16, "Press Escape to leave", 0xFFFFFFFF);
}

int main(int argc, char** argv) {
    Window window;
    QexShaderModule* lit;
    if (Window_Open(&window, "Score", argc, argv) != 0) return 1;
    Window_LoadModel(&window, &s_Village, "village.pod");
    lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&s_Village, lit, NULL);
    Window_LoadPicture(&window, &s_View, "view.pvr");
    Window_LoadPicture(&window, &s_Gauge, "gauge.pvr");

    Window_Run(&window, Draw, NULL);

    QexModel_Unload(&s_Village);
    QexGouraudShader_Release(&lit);
    QexPicture_Release(&s_View);
    QexPicture_Release(&s_Gauge);
    return Window_Close(&window);
}
