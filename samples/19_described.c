/* Sample 19: described drawing, in which every function makes the GL calls that its description names and
 * looks for errors after each. The other samples draw lean. Take this way while a program is being written,
 * to have a GL error named where it happens, or where GL calls are traced. Here the way changes every second,
 * and the picture does not. Text is drawn lean: its described calls read the program's memory, which WebGL
 * does not take. */
#include "window.h"

static void Draw(Window* window, void* crate) {
    static const char* const names[] = {"described", "lean"};
    static const QexVec3 eye = {0, 1.5f, 8}, middle = {0, 0, 0};
    static const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {-1, -1.5f, -2}, {1, 1, 1, 1}}}};
    const QexCamera camera = Window_Camera(window, eye, middle);
    const int32_t drawing = (int)window->seconds % 2 ? QEX_DRAWING_DESCRIBED : QEX_DRAWING_LEAN;
    int i;
    Window_Clear(window, 0.3f, 0.3f, 0.35f);
    QexRenderer_SetDrawing(drawing);
    for (i = 0; i < 25; ++i) {
        QexMatrix place;
        QexMatrix_Translate(&place, (float)(i % 5) - 2, (float)(i / 5) - 2, 0);
        QexModel_SetNodeRotation(crate, 0, 0, 40 * window->seconds + (float)(10 * i), 0);
        QexModel_RenderWithCamera(crate, &lights, &camera, &place, 0);
    }
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    QexFont_DrawTempString(&window->engine, 8, window->height, names[drawing == QEX_DRAWING_LEAN],
                           0xFFFFFFFF);
    QexRenderer_CheckErrors(); /* once a frame, for the lean ones */
}

int main(int argc, char** argv) {
    Window window;
    QexTexture wood;
    QexMesh box;
    QexModel crate;
    if (Window_Open(&window, "Ways of drawing", argc, argv) != 0) return 1;
    Window_LoadTexture(&window, &wood, "crate.pvr");
    QexMesh_CreateBox(&box, 0.8f, 0.8f, 0.8f);
    QexModel_CreateFromMesh(&crate, &box, &wood);
    QexMesh_Release(&box);

    Window_Run(&window, Draw, &crate);

    QexModel_Unload(&crate);
    QexTexture_Release(&wood);
    return Window_Close(&window);
}
