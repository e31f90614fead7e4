// Sample 6: a skinned character, at five moments of its animation beside each other, before a village. The
// scene brings no bone batches: the engine cuts the mesh into pieces of at most 16 bones when it reads it.
#include <cmath>
#include <cstdio>

#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Character", argc, argv) != 0) return 1;
    QexModel worm, village;
    Window_LoadModel(&window, &worm, "tentacle.pod");

    Window_LoadModel(&window, &village, "village.pod");
    // Static nodes take the first module, nodes that follow bones the second.
    QexShaderModule* still = QexGouraudShader_CreateProgram();
    QexShaderModule* skinned = QexSkinningGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&worm, still, skinned);
    QexModel_SetShaderProgramForAllNode(&village, still, nullptr);
    QexModel_EnableNodeRendering(&worm, 0, 0);  // the floor
    printf("40 bones in %d batches\n", worm.scene.meshes[1].boneBatches.batchCount);

    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.6f, -0.8f, -0.6f}, {1, 0.95f, 0.85f, 1}};
    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {1.5f, 2.2f, 13}, {0, 2.3f, 0});
        Window_Clear(&window, 0.6f, 0.75f, 0.9f);
        QexModel_RenderWithCamera(&village, &lights, &camera, nullptr, 0);
        for (int i = 0; i < 5; ++i) {
            // Frame 0 is the bind pose; the animation is 59 frames from 1 on.
            const float frame = 30 * (window.seconds - 1) + 12 * static_cast<float>(i);
            QexPODModel_SetFrame(&worm.scene, 1 + std::fmod(frame, 58.0f));
            QexMatrix place;
            QexMatrix_Translate(&place, 1.9f * static_cast<float>(i - 2), 0, 3.5f);
            QexModel_RenderWithCamera(&worm, &lights, &camera, &place, 0);
        }
    });

    QexModel_Unload(&worm);
    QexModel_Unload(&village);
    QexGouraudShader_Release(&still);
    QexSkinningGouraudShader_Release(&skinned);
    return Window_Close(&window);
}
