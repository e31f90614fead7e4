// Sample 1: the shortest way from a scene to a picture. Opens a window, starts the engine in it, loads a
// scene, places a camera and draws frame by frame.
#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "First picture", argc, argv) != 0) return 1;

    QexModel model;
    QexModel_Create(&model);
    QexModel_LoadContent(&model, window.files, "grid.pod");  // a folder and a file

    Window_Run(&window, [&] {
        QexCamera camera;
        const QexVec3 eye = {3, 3, 4}, target = {1, 1, 0};
        QexCamera_Create(&camera, 0);
        QexCamera_LookAt(&camera, &eye, &target, nullptr);
        QexCamera_Project(&camera, 0.8f, static_cast<float>(window.width) / static_cast<float>(window.height),
                          0.1f, 100);

        glViewport(0, 0, window.width, window.height);
        QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
        QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
        glClearColor(0.25f, 0.3f, 0.4f, 1);
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
        QexModel_RenderWithCamera(&model, nullptr, &camera, nullptr, 0);
        QexFont_DrawTempString(&window.engine, 8, 40, "Hello from Qex", 0xFFFFC040);
    });

    QexModel_Unload(&model);
    return Window_Close(&window);
}
