// Sample 10: a sky, and water that mirrors it and a boat. The engine calls back to have the scene drawn, for
// the reflection and for the screen. One unit is about 3 cm here: waves have fixed sizes in units.
#include "Sample.h"

static constexpr float kScale = 30;

struct Scene {
    QexModel* model;
    QexLightSet lights;
};
static Scene s_Scene;

static void DrawScene(QexSkyBox*, const QexMatrix* view, const QexMatrix* projection) {
    QexModel_RenderWithViewProjection(s_Scene.model, &s_Scene.lights, nullptr, view, projection, 0);
}

// Blue above, bright at the horizon, with a sun that is low in the west and clouds around it.
static std::array<uint8_t, 4> PaintSky(const pod::Vec3& direction) {
    const float length = std::hypot(direction[0], direction[1], direction[2]);
    const float x = direction[0] / length, y = direction[1] / length, z = direction[2] / length;
    const float up = std::max(y, 0.0f);
    const float sun = -0.74f * x + 0.18f * y - 0.65f * z;
    const float glow = std::pow(std::max(sun, 0.0f), 40.0f), disc = sun > 0.995f ? 1.0f : 0.0f;
    const float cloud = 0.12f * std::max(0.0f, std::sin(9 * x + 3 * z) * std::sin(14 * up + 2 * x) + 0.1f);
    const float sky[] = {0.75f - 0.55f * up, 0.8f - 0.4f * up, 0.9f - 0.15f * up};
    const float warm[] = {0.5f, 0.25f, 0};
    std::array<uint8_t, 4> colour = {0, 0, 0, 255};
    for (size_t i = 0; i < 3; ++i)
        colour[i] = static_cast<uint8_t>(255 * std::min(1.0f, sky[i] + glow * warm[i] + cloud + disc));
    return colour;
}

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel boat(scenes::Boat());
    QexModel* model = &boat.model;
    boat.SetChequers(0, 0xA04030, 0x803020);
    boat.SetChequers(1, 0xFFFFF0, 0xF0F0E0);
    boat.SetLightColours(0.8f, 0.35f);
    for (uint32_t i = 0; i < 2; ++i) QexModel_SetNodeScale(model, i, kScale, kScale, kScale);
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(model, lit, nullptr);
    s_Scene.model = model;
    s_Scene.lights.count = 1;
    s_Scene.lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.5f, -0.7f, -0.4f}, {1, 0.95f, 0.85f, 1}};

    std::vector<uint8_t> file = pod::WritePvr(scenes::SkyCube(64, PaintSky));
    QexTexture sky = {};
    if (QexTexture_LoadPVRFromMemSized(&sky, file.data(), static_cast<uint32_t>(file.size()), nullptr, 0, 0,
                                       nullptr) != 0)
        return 1;
    QexTexture_SetFilter(&sky, QEX_FILTER_LINEAR);
    QexTexture_SetWrapping(&sky, QEX_WRAP_CLAMP);
    constexpr int kWaves = 256;
    std::vector<uint8_t> waves = scenes::Waves(kWaves);
    QexTexture normals;
    QexTexture_CreateFromPixels(&normals, kWaves, kWaves, QEX_TEXFMT_RGBA8888, 0, 0, QEX_FILTER_LINEAR,
                                QEX_WRAP_REPEAT, waves.data());

    QexCamera camera = sample.Camera({90, 40, 190}, {-15, 22, 0});
    QexCamera_Project(&camera, 0.9f, static_cast<float>(Sample::kWidth) / Sample::kHeight, 1, 4000);
    QexSkyBox box = {};
    box.skyTexture = &sky;
    box.waterNormalTexture = &normals;
    box.size = 4000;
    box.waterEnabled = 1;
    for (float& channel : box.waterColour) channel = 0.3f;
    box.centre = camera.eye;
    box.camera = &camera;
    box.waterHeight = 0;
    box.drawScene = DrawScene;
    sample.Clear();
    int status = 1;
    if (QexSkyBox_Create(&box) == 0) {
        QexSkyBox_Update(&sample.engine, &box, 0);
        status = sample.Finish();
    }
    QexSkyBox_Release();
    QexTexture_Release(&normals);
    QexTexture_Release(&sky);
    QexGouraudShader_Release(&lit);
    return status;
}
