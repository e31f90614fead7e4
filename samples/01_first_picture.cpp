// Sample 1: the shortest way from a scene to a picture. Opens a window, starts the engine in it, loads a
// scene, places a camera and draws frame by frame.
#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "First picture", argc, argv) != 0) return 1;

    QexModel model;
    QexModel_Create(&model);
    QexModel_LoadContent(&model, window.files, "village.pod");  // a folder and a file
    // Light from the upper left; the engine's own choice is to draw without.
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&model, lit, nullptr);
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {0.55f, -0.8f, -0.5f}, {1, 0.97f, 0.9f, 1}};

    Window_Run(&window, [&] {
        QexCamera camera;
        const QexVec3 eye = {4.6f, 2.4f, 12}, target = {0, 2, 0};
        QexCamera_Create(&camera, 0);
        QexCamera_LookAt(&camera, &eye, &target, nullptr);
        QexCamera_Project(&camera, 1, static_cast<float>(window.width) / static_cast<float>(window.height),
                          0.1f, 100);

        glViewport(0, 0, window.width, window.height);
        QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
        QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
        glClearColor(0.62f, 0.75f, 0.86f, 1);
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
        QexModel_RenderWithCamera(&model, &lights, &camera, nullptr, 0);
        QexFont_SetScale(2);
        QexFont_DrawTempString(&window.engine, 24, window.height - 20, "Hello from Qex", 0xFFFFFFFF);
    });

    QexModel_Unload(&model);
    QexGouraudShader_Release(&lit);
    return Window_Close(&window);
}
