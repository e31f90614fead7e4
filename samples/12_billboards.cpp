// Sample 12: a wall of billboards. Each column has another mode, from the left: no mode, screen, upright,
// camera, yaw; each row another rotation of its own. The camera stands to the right and above and is tilted.
#include "Sample.h"

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    // An arrow that points up, red at its left edge.
    SampleTexture arrow(64, 64, [](float s, float t) {
        const float aside = std::fabs(s - 0.5f);
        if (s < 0.08f) return QexVec4{0.9f, 0.2f, 0.2f, 1};
        const bool inside = t > 0.5f ? aside < 0.8f * (0.95f - t) : aside < 0.12f && t > 0.1f;
        return inside ? QexVec4{1, 1, 1, 1} : QexVec4{0.2f, 0.5f, 0.8f, 0.7f};
    });
    const int32_t modes[] = {0, QEX_BILLBOARD_SCREEN, QEX_BILLBOARD_UPRIGHT, QEX_BILLBOARD_CAMERA,
                             QEX_BILLBOARD_YAW};
    const QexVec3 rotations[] = {{0, 0, 0}, {0, 0, 30}, {50, 0, 0}, {0, 50, 0}};

    sample.Clear();
    QexCamera camera = sample.Camera({5, 3.5f, 6}, {0, 0, 0});
    const QexVec3 up = {0.15f, 1, 0};
    QexCamera_LookAt(&camera, &camera.eye, &camera.target, &up);
    QexBillboard* billboard = QexBillboard_Create(&arrow.texture);
    if (!billboard) return 1;
    billboard->scale = {0.9f / 64, 0.9f / 64, 1};
    for (int column = 0; column < 5; ++column)
        for (int row = 0; row < 4; ++row) {
            billboard->mode = modes[column];
            billboard->rotation = rotations[row];
            billboard->position = {1.2f * static_cast<float>(column - 2),
                                   1.2f * (1.5f - static_cast<float>(row)), 0};
            // Drawing leaves culling on; these are seen from behind as well.
            QexRenderer_SetBackFaceCulling(0);
            QexBillboard_Draw(billboard, &camera);
        }
    QexBillboard_Release(billboard);
    return sample.Finish();
}
