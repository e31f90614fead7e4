/* Sample 16: a crate that turns, from a box of the engine and a texture, lit from the upper right. */
#include "window.h"

static void Draw(Window* window, void* crate) {
    static const QexVec3 eye = {0, 1.1f, 2.7f}, middle = {0, 0, 0};
    static const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {-1, -1.5f, -2}, {1, 1, 1, 1}}}};
    const QexCamera camera = Window_Camera(window, eye, middle);
    Window_Clear(window, 0.58f, 0.66f, 0.72f);
    QexModel_SetNodeRotation(crate, 0, 0, 40 * window->seconds, 0); /* degrees */
    QexModel_RenderWithCamera(crate, &lights, &camera, NULL, 0);
}

int main(int argc, char** argv) {
    Window window;
    QexTexture wood;
    QexMesh box;
    QexModel crate;
    if (Window_Open(&window, "Crate", argc, argv) != 0) return 1;
    Window_LoadTexture(&window, &wood, "crate.pvr");
    QexMesh_CreateBox(&box, 1, 1, 1);
    QexModel_CreateFromMesh(&crate, &box, &wood);
    QexMesh_Release(&box); /* the model has a copy */

    Window_Run(&window, Draw, &crate);

    QexModel_Unload(&crate);
    QexTexture_Release(&wood);
    return Window_Close(&window);
}
