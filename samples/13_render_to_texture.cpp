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
    QexModel models, screen;
    Window_LoadModel(&window, &models, "playground.pod");
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&models, lit, nullptr);
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {0.6f, -1, -0.8f}, {1, 0.97f, 0.9f, 1}};
    QexRenderTarget picture, corner;
    QexRenderTarget_Create(&picture, 512, 512, 0);
    QexRenderTarget_Create(&corner, 256, 192, 0);
    QexTexture_SetFilter(&picture.colorTexture, QEX_FILTER_LINEAR);

    // The cube shows the picture as it is: without normals there is no light.
    QexMesh box;
    QexMesh_CreateBox(&box, 2, 2, 2);
    box.normals = nullptr;
    QexModel_CreateFromMesh(&screen, &box, &picture.colorTexture);
    QexMesh_Release(&box);

    Window_Run(&window, [&] {
        Window_Clear(&window, 0.42f, 0.4f, 0.38f);
        QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);

        // Drawing into one target inside drawing into another: the end of the inner one goes back to the
        // outer.
        QexRenderTarget_BeginScene(&corner);
        ClearTarget(0.1f, 0.1f, 0.1f);
        QexRenderTarget_BeginScene(&picture);
        ClearTarget(0.62f, 0.75f, 0.86f);
        QexCamera camera = Window_Camera(&window, {2, 2, 3.6f}, {0.1f, 0.6f, 0});
        QexCamera_Project(&camera, 0.8f, 1, 0.1f, 100);
        QexModel_RenderWithCamera(&models, &lights, &camera, nullptr, 0);
        QexRenderTarget_EndScene(&picture);

        // The cube, small in the corner and large on the screen.
        camera = Window_Camera(&window, {3.4f, 2.3f, 4.6f}, {0, 0, 0});
        QexModel_RenderWithCamera(&screen, nullptr, &camera, nullptr, 0);
        QexRenderTarget_EndScene(&corner);
        QexModel_RenderWithCamera(&screen, nullptr, &camera, nullptr, 0);

        QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
        QexTexture_Draw(&window.engine, &corner.colorTexture, 16, 16, nullptr, 1, 1, 0xFFFFFFFF);
    });

    QexModel_Unload(&screen);
    QexModel_Unload(&models);
    QexGouraudShader_Release(&lit);
    QexRenderTarget_Release(&corner);
    QexRenderTarget_Release(&picture);
    return Window_Close(&window);
}
