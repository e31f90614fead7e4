// Sample 4: light. A vase lit per vertex, one with a highlight, one unlit, under a white light that goes to
// and fro and a blue one from the right.
#include <cmath>

#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Lights", argc, argv) != 0) return 1;
    QexModel still;
    Window_LoadModel(&window, &still, "still.pod");

    // Each node has its own module; the engine's choice, here of node 2, is unlit. A material's colours weigh
    // ambient, diffuse and specular light; the shader takes 256 times its shininess.
    QexShaderModule* diffuse = QexGouraudShader_CreateProgram();
    QexShaderModule* specular = QexGouraudSpecularShader_CreateProgram();
    for (uint32_t i = 0; i < QexModel_GetNumMeshNodes(&still); ++i)
        if (i != 2) QexModel_SetShaderProgram(&still, i, i == 0 || i == 3 ? diffuse : specular);

    QexLightSet lights = {};
    lights.count = 2;
    lights.lights[1] = {QEX_LIGHT_DIRECTIONAL, {-1, 0, 0}, {0.2f, 0.3f, 0.9f, 1}};
    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {0.5f, 2.5f, 6.6f}, {0, 0.9f, 0});
        const float x = 4 * std::sin(0.7f * window.seconds + 3.4f);
        lights.lights[0] = {QEX_LIGHT_POINT, {x, 4, 5}, {1, 0.97f, 0.9f, 1}};
        Window_Clear(&window, 0.12f, 0.11f, 0.12f);
        QexModel_RenderWithCamera(&still, &lights, &camera, nullptr, 0);
    });

    QexModel_Unload(&still);
    QexGouraudShader_Release(&diffuse);
    QexGouraudSpecularShader_Release(&specular);
    return Window_Close(&window);
}
