// Sample 11: images and text over a scene. A frame, a gauge that shows part of its image, a round picture cut
// out by an alpha texture, a caption that stays, and numbers and text that are drawn for one frame only.
#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "HUD", argc, argv) != 0) return 1;
    QexModel models;
    Window_LoadModel(&window, &models, "playground.pod");
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&models, lit, nullptr);
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {0.6f, -1, -0.8f}, {1, 0.97f, 0.9f, 1}};
    QexPicture gauge, view;  // view_a.pvr cuts the view out
    Window_LoadPicture(&window, &gauge, "gauge.pvr");
    Window_LoadPicture(&window, &view, "view.pvr");

    QexRuntimeContext* engine = &window.engine;
    // A line of text begins 32 pixels further up than its y says.
    QexFont_SetScale(2);
    QexFont_AddString(engine, 16, 56, "Text that stays until it is replaced", 255, 255, 255, 255);
    QexFont_AddString(engine, 16, 92, "and may be added to, in another colour", 160, 220, 255, 255);

    Window_Run(&window, [&] {
        const float width = static_cast<float>(window.width), height = static_cast<float>(window.height);
        const QexCamera camera = Window_Camera(&window, {-1.8f, 2.1f, 4.2f}, {0.1f, 0.6f, 0});
        Window_Clear(&window, 0.62f, 0.75f, 0.86f);
        QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
        QexModel_RenderWithCamera(&models, &lights, &camera, nullptr, 0);

        // Pixels from here on: x from the left, y from the top.
        QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
        QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
        QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
        // Without a picture: a bar in the colour, translucent behind the text.
        QexPicture_Draw(engine, nullptr, nullptr, 0, 16, width, 88, 0xA0102030);
        // Three quarters of the gauge, over all of it in the dark.
        const QexRect full = {0, 0, 95, 15};
        QexPicture_Draw(engine, &gauge, nullptr, 16, height - 48, 256, 32, 0xFF404040);
        QexPicture_Draw(engine, &gauge, &full, 16, height - 48, 192, 32, 0xFFFFFFFF);
        QexPicture_Draw(engine, &view, nullptr, width - 144, height - 144, 128, 128, 0xFFFFFFFF);
        QexFont_Draw();
        QexFont_DrawTempString(engine, 288, window.height - 16, "energy", 0xFFFFE080);
        QexFont_DrawNum(engine, 400, window.height - 16, 75, 0xFFFFFFFF);
    });

    QexPicture_Release(&gauge);
    QexPicture_Release(&view);
    QexModel_Unload(&models);
    QexGouraudShader_Release(&lit);
    return Window_Close(&window);
}
