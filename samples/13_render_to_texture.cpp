// Sample 13: a picture within the picture. The scene is drawn into a texture first, that texture onto a cube,
// and the cube's picture into the corner of the screen.
#include "window.h"

static void ClearTarget(float red, float green, float blue) {
    glClearColor(red, green, blue, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
}

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Render to texture", argc, argv) != 0) return 1;
    QexModel cubes, screen;
    Window_LoadModel(&window, &cubes, "grid.pod");
    QexRenderTarget picture, corner;
    QexRenderTarget_Create(&picture, 128, 128, 0);
    QexRenderTarget_Create(&corner, 96, 72, 0);
    QexTexture_SetFilter(&picture.colorTexture, QEX_FILTER_LINEAR);

    // The cube shows the picture as it is: without normals there is no light.
    QexMesh box;
    QexMesh_CreateBox(&box, 2, 2, 2);
    box.normals = nullptr;
    QexModel_CreateFromMesh(&screen, &box, &picture.colorTexture);
    QexMesh_Release(&box);

    Window_Run(&window, [&] {
        Window_Clear(&window, 0.25f, 0.3f, 0.4f);
        QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);

        // Drawing into one target inside drawing into another: the end of the inner one goes back to the
        // outer.
        QexRenderTarget_BeginScene(&corner);
        ClearTarget(0.1f, 0.1f, 0.1f);
        QexRenderTarget_BeginScene(&picture);
        ClearTarget(0.6f, 0.3f, 0.3f);
        QexCamera camera = Window_Camera(&window, {2.5f, 2.2f, 3}, {1, 1, 0});
        QexCamera_Project(&camera, 0.8f, 1, 0.1f, 100);
        QexModel_RenderWithCamera(&cubes, nullptr, &camera, nullptr, 0);
        QexRenderTarget_EndScene(&picture);

        // The cube, small in the corner and large on the screen.
        camera = Window_Camera(&window, {3, 2, 4}, {0, 0, 0});
        QexModel_RenderWithCamera(&screen, nullptr, &camera, nullptr, 0);
        QexRenderTarget_EndScene(&corner);
        QexModel_RenderWithCamera(&screen, nullptr, &camera, nullptr, 0);

        QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
        QexTexture_Draw(&window.engine, &corner.colorTexture, 8, 8, nullptr, 1, 1, 0xFFFFFFFF);
    });

    QexModel_Unload(&screen);
    QexModel_Unload(&cubes);
    QexRenderTarget_Release(&corner);
    QexRenderTarget_Release(&picture);
    return Window_Close(&window);
}
