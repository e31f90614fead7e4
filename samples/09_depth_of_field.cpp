// Sample 9: depth of field. A row of vases goes away from the camera. On the left of the picture the near
// ones are sharp, on the right the far ones; above the rest is blurred at full resolution, below at half.
#include <initializer_list>

#include "window.h"

struct Row {
    QexModel model;
    QexCamera camera;
    QexLightSet lights;
    QexShaderModule* lit;
};
// The depth pass is called without the application's arguments.
static Row s_Row;

// Draws the row lit, or with modules that show depth.
static int32_t DrawRow(QexRuntimeContext*, void*, void*, void*, QexShaderModule* module,
                       QexShaderModule* skinned, const float* colour) {
    static const float background[] = {0.45f, 0.42f, 0.4f};
    const float* c = colour ? colour : background;
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    glClearColor(c[0], c[1], c[2], 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexModel_SetShaderProgramForAllNode(&s_Row.model, module ? module : s_Row.lit, skinned);
    QexModel_RenderWithCamera(&s_Row.model, &s_Row.lights, &s_Row.camera, nullptr, 0);
    return 0;
}

// The effect takes a quarter of the window for its screen.
static void StartEffect(QexRuntimeContext* quarter, const Window& window) {
    *quarter = window.engine;
    quarter->width = window.width / 2;
    quarter->height = window.height / 2;
    QexPostProcessing_Initialize(quarter);
    for (const uint32_t halfTarget : {0, 1})
        QexTexture_SetFilter(&QexPP_GetRenderTarget(halfTarget)->colorTexture, QEX_FILTER_LINEAR);
}

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Depth of field", argc, argv) != 0) return 1;
    Window_LoadModel(&window, &s_Row.model, "vases.pod");
    s_Row.lit = QexGouraudShader_CreateProgram();
    s_Row.lights.count = 1;
    s_Row.lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {0.7f, -1.2f, -0.8f}, {0.8f, 0.76f, 0.7f, 1}};
    QexRuntimeContext quarter = {};

    Window_Run(&window, [&] {
        if (quarter.width != window.width / 2 || quarter.height != window.height / 2)
            StartEffect(&quarter, window);
        const int width = quarter.width, height = quarter.height;
        s_Row.camera = Window_Camera(&window, {0.1f, 0.9f, 7}, {0.5f, -0.35f, 0});
        QexCamera_Project(&s_Row.camera, 0.7f, static_cast<float>(width) / static_cast<float>(height), 1, 22);
        Window_Clear(&window, 0.25f, 0.3f, 0.4f);
        for (const bool half : {false, true})
            for (const bool far : {false, true}) {
                glViewport(far ? width : 0, half ? 0 : height, width, height);
                // Both blur as far: a pixel at half the resolution is two.
                const float step = half ? 2 : 1, sigma = half ? 2 : 4;
                QexPostProcessing_DrawDOF(&quarter, nullptr, nullptr, nullptr, DrawRow, far ? 0.8f : 0.25f,
                                          2.5f, step / static_cast<float>(width),
                                          step / static_cast<float>(height), sigma, 9, half ? 0 : 2, 0, 1);
            }
    });

    QexPostProcessing_Finalize();
    QexModel_Unload(&s_Row.model);
    QexGouraudShader_Release(&s_Row.lit);
    return Window_Close(&window);
}
