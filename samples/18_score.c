/* Sample 18: a HUD in a few lines: a picture, a bar of energy, a score, a line of text. */
#include <stdio.h>

#include "window.h"

int main(int argc, char** argv) {
    Window window;
    QexPicture gauge;
    char path[256];
    if (Window_Open(&window, "Score", argc, argv) != 0) return 1;
    snprintf(path, sizeof path, "%sgauge.pvr", window.files);
    if (QexPicture_Load(&gauge, path) != 0) return 1;

    while (Window_Frame(&window)) {
        const QexRect part = {0, 0, 95, 15}; /* three quarters */
        Window_Clear(&window, 0.2f, 0.35f, 0.3f);
        QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
        QexPicture_Draw(&window.engine, NULL, NULL, 8, 8, 208, 40, 0x80000000); /* behind it all */
        QexPicture_Draw(&window.engine, &gauge, &part, 16, 16, 144, 24, 0xFFFFFFFF);
        QexFont_DrawNum(&window.engine, 168, 52, (int)(100 * window.seconds), 0xFFFFE080);
        QexFont_DrawTempString(&window.engine, 16, window.height, "Press Escape to leave", 0xFFFFFFFF);
    }

    QexPicture_Release(&gauge);
    return Window_Close(&window);
}
