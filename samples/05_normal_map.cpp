// Sample 5: a normal map. The module binds a flat one on unit 1; the bind hook, which every node calls before
// its textures are bound, puts the real one in its place. The map has x in green and y in red, as `qex
// convert` writes it.
#include "window.h"

static QexTexture s_Normals;

static int32_t BindNormals(QexModel*, uint32_t) {
    QexTexture_Set(&s_Normals, 1);
    return 0;  // the model's own texture is still to be bound
}

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Normal map", argc, argv) != 0) return 1;
    QexModel ball;
    Window_LoadModel(&window, &ball, "ball.pod");
    Window_LoadTexture(&window, &s_Normals, "stones_n.pvr");
    QexTexture_SetWrapping(&s_Normals, QEX_WRAP_REPEAT);

    QexShaderModule* module = QexGouraudNormalMapShader_CreateProgram();
    QexModel_SetShaderProgram(&ball, 0, module);
    ball.bindTextureHook = BindNormals;
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_POINT, {-5, 5, 6}, {1, 1, 1, 1}};
    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {0, 0.4f, 3.6f}, {0, 0, 0});
        Window_Clear(&window, 0.12f, 0.13f, 0.15f);
        QexModel_SetNodeRotation(&ball, 0, 0, 20 * (window.seconds - 1), 0);
        QexModel_RenderWithCamera(&ball, &lights, &camera, nullptr, 0);
    });

    QexModel_Unload(&ball);
    QexGouraudNormalMapShader_Release(&module);
    QexTexture_Release(&s_Normals);
    return Window_Close(&window);
}
