// Sample 10: a sky, and water that mirrors it and a boat. The engine calls back to have the scene drawn, for
// the reflection and for the screen. One unit is about 3 cm here: waves have fixed sizes in units.
#include "window.h"

static constexpr float kScale = 30;

struct Scene {
    QexModel boat;
    QexLightSet lights;
};
static Scene s_Scene;

static void DrawScene(QexSkyBox*, const QexMatrix* view, const QexMatrix* projection) {
    QexModel_RenderWithViewProjection(&s_Scene.boat, &s_Scene.lights, nullptr, view, projection, 0);
}

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Sky and water", argc, argv) != 0) return 1;
    Window_LoadModel(&window, &s_Scene.boat, "boat.pod");
    for (uint32_t i = 0; i < 2; ++i) QexModel_SetNodeScale(&s_Scene.boat, i, kScale, kScale, kScale);
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&s_Scene.boat, lit, nullptr);
    s_Scene.lights.count = 1;
    s_Scene.lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.5f, -0.7f, -0.4f}, {1, 0.95f, 0.85f, 1}};

    QexTexture sky, normals;
    Window_LoadTexture(&window, &sky, "sky.pvr");  // a cube map
    Window_LoadTexture(&window, &normals, "waves.pvr");
    QexTexture_SetWrapping(&normals, QEX_WRAP_REPEAT);
    QexCamera camera = {};
    QexSkyBox box = {};
    box.skyTexture = &sky;
    box.waterNormalTexture = &normals;
    box.size = 4000;
    box.waterEnabled = 1;
    for (float& channel : box.waterColour) channel = 0.3f;
    box.camera = &camera;
    box.waterHeight = 0;
    box.drawScene = DrawScene;
    const int32_t created = QexSkyBox_Create(&box);

    if (created == 0)
        Window_Run(&window, [&] {
            camera = Window_Camera(&window, {90, 40, 190}, {-15, 22, 0});
            QexCamera_Project(&camera, 0.9f,
                              static_cast<float>(window.width) / static_cast<float>(window.height), 1, 4000);
            box.centre = camera.eye;
            Window_Clear(&window, 0.25f, 0.3f, 0.4f);
            QexSkyBox_Update(&window.engine, &box, window.elapsed);
        });

    QexSkyBox_Release();
    QexTexture_Release(&normals);
    QexTexture_Release(&sky);
    QexModel_Unload(&s_Scene.boat);
    QexGouraudShader_Release(&lit);
    const int status = Window_Close(&window);
    return created == 0 ? status : 1;
}
