// Sample 12: a wall of billboards. Each column has another mode, from the left: no mode, screen, upright,
// camera, yaw; each row another rotation of its own. The camera stands to the right and above and is tilted.
#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Billboards", argc, argv) != 0) return 1;
    QexTexture arrow;
    Window_LoadTexture(&window, &arrow, "arrow.pvr");
    const int32_t modes[] = {0, QEX_BILLBOARD_SCREEN, QEX_BILLBOARD_UPRIGHT, QEX_BILLBOARD_CAMERA,
                             QEX_BILLBOARD_YAW};
    const QexVec3 rotations[] = {{0, 0, 0}, {0, 0, 30}, {50, 0, 0}, {0, 50, 0}};
    QexBillboard* billboard = QexBillboard_Create(&arrow);
    if (!billboard) return 1;
    billboard->scale = {0.9f / 64, 0.9f / 64, 1};

    Window_Run(&window, [&] {
        QexCamera camera = Window_Camera(&window, {5.5f, 3.8f, 6.6f}, {0, 0, 0});
        const QexVec3 up = {0.15f, 1, 0};
        QexCamera_LookAt(&camera, &camera.eye, &camera.target, &up);
        Window_Clear(&window, 0.9f, 0.88f, 0.82f);
        for (int column = 0; column < 5; ++column)
            for (int row = 0; row < 4; ++row) {
                billboard->mode = modes[column];
                billboard->rotation = rotations[row];
                billboard->position = {1.2f * static_cast<float>(column - 2),
                                       1.2f * (1.5f - static_cast<float>(row)), 0};
                // Drawing leaves culling on; these are seen from behind as well.
                QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
                QexBillboard_Draw(billboard, &camera);
            }
    });

    QexBillboard_Release(billboard);
    QexTexture_Release(&arrow);
    return Window_Close(&window);
}
