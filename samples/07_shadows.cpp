// Sample 7: shadows. A sphere and a bent worm cast theirs on a floor, twice: on the left half of the picture
// the floor darkens evenly, on the right the shadow fades with the distance from what casts it.
#include <cmath>
#include <initializer_list>

#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Shadows", argc, argv) != 0) return 1;
    QexModel worm, ball;
    Window_LoadModel(&window, &worm, "worm.pod");
    Window_LoadModel(&window, &ball, "red_ball.pod");
    for (QexModel* model : {&worm, &ball}) QexModel_UpdateModelBoundingBox(model, nullptr);
    QexShaderModule* even = QexGouraudShadowShader_CreateProgram();
    QexShaderModule* fading = QexGouraudShadowExtShader_CreateProgram();
    QexShaderModule* skinned = QexSkinningGouraudShader_CreateProgram();
    QexGouraudShadowExtShader_SetShadowFade(fading, 1.5f);

    // The map shows what casts. With the floor among that it is large enough for the worm in any pose: a
    // skinned node's box goes along with its first bone alone.
    const QexVec3 direction = {-1, -1.5f, -0.3f};
    const QexShadowCaster casters[] = {{&worm, 1, nullptr, 0}, {&ball, 1, nullptr, 0}};
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {direction.x, direction.y, direction.z}, {1, 1, 1, 1}};

    Window_Run(&window, [&] {
        const int half = window.width / 2;
        QexCamera camera = Window_Camera(&window, {0.3f, 3.4f, 5}, {-0.8f, 1.1f, 0});
        QexCamera_Project(&camera, 1, static_cast<float>(half) / static_cast<float>(window.height), 0.1f,
                          100);
        QexPODModel_SetFrame(&worm.scene, 1 + std::fmod(20 * window.seconds - 1, 58.0f));

        // Seen from the light into the shadow map first, then the picture.
        QexShadowInfo* shadow = QexModel_InitShadowInfo(&camera, &direction, casters, 2, 0.3f, 0.01f);
        QexModel_RenderShadow(&window.engine, nullptr, shadow);
        Window_Clear(&window, 0.25f, 0.3f, 0.4f);
        for (QexShaderModule* receiver : {even, fading}) {
            glViewport(receiver == even ? 0 : half, 0, half, window.height);
            for (QexModel* model : {&worm, &ball}) {
                QexModel_SetShaderProgramForAllNode(model, receiver, skinned);
                QexModel_RenderFromCameraWithShadow(model, &lights, &camera, nullptr, shadow, 0);
            }
        }
        QexModel_ReleaseShadowInfo(shadow);
    });

    QexModel_Unload(&worm);
    QexModel_Unload(&ball);
    QexGouraudShadowShader_Release(&even);
    QexGouraudShadowExtShader_Release(&fading);
    QexSkinningGouraudShader_Release(&skinned);
    return Window_Close(&window);
}
