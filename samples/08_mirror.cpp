// Sample 8: a mirror. A polished table is drawn half transparent over the mirror image of all other nodes;
// the stencil keeps the image inside its edges.
#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Mirror", argc, argv) != 0) return 1;
    QexModel still;
    Window_LoadModel(&window, &still, "still.pod");
    const uint32_t table = 3;
    QexModel_SetOpacity(&still, table, 0.6f);
    QexShaderModule* lit = QexGouraudSpecularShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&still, lit, nullptr);

    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_POINT, {-4, 6, 5}, {1, 1, 1, 1}};
    const QexShadowCaster everything = {&still, 1, nullptr, 0};
    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {0.6f, 2.3f, 6.6f}, {0.1f, 0.6f, 0});
        for (uint32_t vase = 0; vase < 3; ++vase)
            QexModel_SetNodeRotation(&still, vase, 0, 25 * window.seconds, 0);

        // The mirror image and the table over it first; then the scene, in which the table is switched off by
        // then.
        QexModel_EnableNodeRendering(&still, table, 1);
        QexReflection* mirror = QexReflection_InitReflectionInfo(&still, table, &everything, 1, 1);
        Window_Clear(&window, 0.35f, 0.33f, 0.36f);
        QexReflection_RenderReflection(mirror, &lights, &camera);
        QexModel_RenderWithCamera(&still, &lights, &camera, nullptr, 0);
        QexReflection_Release(mirror);
    });

    QexModel_Unload(&still);
    QexGouraudSpecularShader_Release(&lit);
    return Window_Close(&window);
}
