// Sample 11: images and text over a scene. A frame, a gauge that shows part of its image, a round picture cut
// out by an alpha texture, a caption that stays, and numbers and text that are drawn for one frame only.
#include "Sample.h"

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel cubes(scenes::Grid(9));
    cubes.SetChequers(0, 0xF0D890, 0x3070A0);
    // From red to green, in segments.
    SampleTexture gauge(128, 16, [](float s, float) {
        const float segment = std::floor(s * 16), within = s * 16 - segment;
        const float bright = within < 0.8f ? 1 : 0.2f;
        return QexVec4{bright * (1 - segment / 16), bright * segment / 16, 0.1f * bright, 1};
    });
    // A sky over hills, with the sun on the right: upside-down or mirrored it would show.
    SampleTexture view(64, 64, [](float s, float t) {
        if (std::hypot(s - 0.7f, t - 0.7f) < 0.15f) return QexVec4{1, 0.9f, 0.3f, 1};
        return t > 0.35f + 0.1f * std::sin(9 * s) ? QexVec4{0.4f, 0.6f, 1, 1} : QexVec4{0.2f, 0.5f, 0.2f, 1};
    });
    SampleTexture disc(64, 64, [](float s, float t) {
        return QexVec4{(0.5f - std::hypot(s - 0.5f, t - 0.5f)) * 32, 0, 0, 1};
    });

    sample.Clear();
    QexRenderer_SetBackFaceCulling(1);
    const QexCamera camera = sample.Camera({2.5f, 2.2f, 4}, {1, 1, 0});
    QexModel_RenderWithCamera(&cubes.model, nullptr, &camera, nullptr, 0);

    // Pixels from here on: x from the left, y from the top.
    QexRenderer_SetZTestFunc(7);
    QexRenderer_SetBackFaceCulling(0);
    QexRenderer_SetAlphaBlendMode(1);
    QexRuntimeContext* engine = &sample.engine;
    // Without a texture: a bar in the colour, translucent behind the text.
    QexTexture_Draw(engine, nullptr, 0, 194, nullptr, 320, 46, 0xA0102030);
    // Three quarters of the gauge, over all of it in the dark.
    const QexRect whole = {0, 0, 127, 15}, full = {0, 0, 95, 15};
    QexTexture_Draw(engine, &gauge.texture, 8, 8, &whole, 1, 1, 0xFF404040);
    QexTexture_Draw(engine, &gauge.texture, 8, 8, &full, 1, 1, 0xFFFFFFFF);
    QexTexture_Draw2(engine, &view.texture, &disc.texture, 248, 8, nullptr, 1, 1, 0xFFFFFFFF);

    // A line of text begins 32 pixels further up than its y says.
    QexFont_ReplaceString(engine, 8, 232, "Text that stays until it is replaced", 255, 255, 255, 255);
    QexFont_AddString(engine, 8, 250, "and may be added to, in another colour", 160, 220, 255, 255);
    QexFont_Draw();
    QexFont_DrawTempString(engine, 144, 40, "energy", 0xFFFFE080);
    QexFont_DrawNum(engine, 200, 40, 75, 0xFFFFFFFF);
    return sample.Finish();
}
