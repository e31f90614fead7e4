// Sample 11: images and text over a scene. A frame, a gauge that shows part of its image, a round picture cut
// out by an alpha texture, a caption that stays, and numbers and text that are drawn for one frame only.
#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "HUD", argc, argv) != 0) return 1;
    QexModel cubes;
    Window_LoadModel(&window, &cubes, "grid.pod");
    QexPicture gauge, view;  // view_a.pvr cuts the view out
    Window_LoadPicture(&window, &gauge, "gauge.pvr");
    Window_LoadPicture(&window, &view, "view.pvr");

    QexRuntimeContext* engine = &window.engine;
    // A line of text begins 32 pixels further up than its y says.
    QexFont_AddString(engine, 8, 48, "Text that stays until it is replaced", 255, 255, 255, 255);
    QexFont_AddString(engine, 8, 66, "and may be added to, in another colour", 160, 220, 255, 255);

    Window_Run(&window, [&] {
        const float width = static_cast<float>(window.width), height = static_cast<float>(window.height);
        const QexCamera camera = Window_Camera(&window, {2.5f, 2.2f, 4}, {1, 1, 0});
        Window_Clear(&window, 0.25f, 0.3f, 0.4f);
        QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
        QexModel_RenderWithCamera(&cubes, nullptr, &camera, nullptr, 0);

        // Pixels from here on: x from the left, y from the top.
        QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
        QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
        QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
        // Without a picture: a bar in the colour, translucent behind the text.
        QexPicture_Draw(engine, nullptr, nullptr, 0, 10, width, 46, 0xA0102030);
        // Three quarters of the gauge, over all of it in the dark.
        const QexRect full = {0, 0, 95, 15};
        QexPicture_Draw(engine, &gauge, nullptr, 8, height - 24, 0, 0, 0xFF404040);
        QexPicture_Draw(engine, &gauge, &full, 8, height - 24, 0, 0, 0xFFFFFFFF);
        QexPicture_Draw(engine, &view, nullptr, width - 72, height - 72, 64, 64, 0xFFFFFFFF);
        QexFont_Draw();
        QexFont_DrawTempString(engine, 144, window.height + 8, "energy", 0xFFFFE080);
        QexFont_DrawNum(engine, 200, window.height + 8, 75, 0xFFFFFFFF);
    });

    QexPicture_Release(&gauge);
    QexPicture_Release(&view);
    QexModel_Unload(&cubes);
    return Window_Close(&window);
}
