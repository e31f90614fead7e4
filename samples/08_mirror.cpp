// Sample 8: a mirror. The floor is drawn half transparent over the mirror image of all other nodes; the
// stencil keeps the image inside the floor's edges.
#include <cmath>

#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Mirror", argc, argv) != 0) return 1;
    QexModel worm;
    Window_LoadModel(&window, &worm, "worm.pod");
    const uint32_t floor = 0;
    QexModel_SetOpacity(&worm, floor, 0.6f);
    QexShaderModule* still = QexGouraudShader_CreateProgram();
    QexShaderModule* skinned = QexSkinningGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&worm, still, skinned);

    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_POINT, {-4, 6, 5}, {1, 1, 1, 1}};
    const QexShadowCaster everything = {&worm, 1, nullptr, 0};
    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {1, 3.4f, 9}, {0, 1.1f, 0});
        QexPODModel_SetFrame(&worm.scene, 1 + std::fmod(20 * window.seconds - 1, 58.0f));

        // The mirror image and the floor over it first; then the scene, in which the floor is switched off by
        // then.
        QexModel_EnableNodeRendering(&worm, floor, 1);
        QexReflection* mirror = QexReflection_InitReflectionInfo(&worm, floor, &everything, 1, 1);
        Window_Clear(&window, 0.25f, 0.3f, 0.4f);
        QexReflection_RenderReflection(mirror, &lights, &camera);
        QexModel_RenderWithCamera(&worm, &lights, &camera, nullptr, 0);
        QexReflection_Release(mirror);
    });

    QexModel_Unload(&worm);
    QexGouraudShader_Release(&still);
    QexSkinningGouraudShader_Release(&skinned);
    return Window_Close(&window);
}
