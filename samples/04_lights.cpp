// Sample 4: light. One sphere lit per vertex, one with a highlight, one unlit, under a white light from the
// upper left and a blue one from the right.
#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Lights", argc, argv) != 0) return 1;
    QexModel spheres;
    Window_LoadModel(&window, &spheres, "spheres.pod");

    // Each node has its own module; the engine's choice is unlit. A material's colours weigh ambient, diffuse
    // and specular light; the shader takes 256 times its shininess.
    QexShaderModule* diffuse = QexGouraudShader_CreateProgram();
    QexShaderModule* specular = QexGouraudSpecularShader_CreateProgram();
    QexModel_SetShaderProgram(&spheres, 0, diffuse);
    QexModel_SetShaderProgram(&spheres, 1, specular);

    QexLightSet lights = {};
    lights.count = 2;
    lights.lights[0] = {QEX_LIGHT_POINT, {-4, 5, 6}, {1, 1, 1, 1}};
    lights.lights[1] = {QEX_LIGHT_DIRECTIONAL, {-1, 0, 0}, {0.2f, 0.3f, 0.9f, 1}};
    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {0, 0, 6.6f}, {0, 0, 0});
        Window_Clear(&window, 0.25f, 0.3f, 0.4f);
        QexModel_RenderWithCamera(&spheres, &lights, &camera, nullptr, 0);
    });

    QexModel_Unload(&spheres);
    QexGouraudShader_Release(&diffuse);
    QexGouraudSpecularShader_Release(&specular);
    return Window_Close(&window);
}
