// Sample 7: shadows. Houses and trees cast theirs on the ground, twice: on the left half of the picture the
// ground darkens evenly, on the right the shadow fades with the distance from what casts it.
#include <cmath>
#include <initializer_list>
#include <numeric>
#include <vector>

#include "window.h"

constexpr int32_t kFirst = 3;  // node that casts; those before are the sky, the grass and the square

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Shadows", argc, argv) != 0) return 1;
    QexModel village;
    QexModel_SetShadowMapSize(1024, 1024);
    Window_LoadModel(&window, &village, "village.pod");
    QexModel_UpdateModelBoundingBox(&village, nullptr);
    QexShaderModule* even = QexGouraudShadowShader_CreateProgram();
    QexShaderModule* fading = QexGouraudShadowExtShader_CreateProgram();
    QexGouraudShadowExtShader_SetShadowFade(fading, 3);

    std::vector<int32_t> nodes(QexModel_GetNumMeshNodes(&village) - kFirst);
    std::iota(nodes.begin(), nodes.end(), kFirst);
    const QexShadowCaster caster = {&village, 0, nodes.data(), static_cast<uint32_t>(nodes.size())};
    QexLightSet lights = {};
    lights.count = 1;

    Window_Run(&window, [&] {
        // The sun goes around.
        const float turn = 0.15f * window.seconds + 1.1f;
        const QexVec3 direction = {std::sin(turn), -0.7f, -std::cos(turn)};
        lights.lights[0] = {
            QEX_LIGHT_DIRECTIONAL, {direction.x, direction.y, direction.z}, {1, 0.97f, 0.9f, 1}};
        const int half = window.width / 2;
        QexCamera camera = Window_Camera(&window, {3.2f, 5.4f, 13}, {0.3f, 0.6f, 0});
        QexCamera_Project(&camera, 0.85f, static_cast<float>(half) / static_cast<float>(window.height), 0.5f,
                          100);

        // Seen from the light into the shadow map first, then the picture.
        QexShadowInfo* shadow = QexModel_InitShadowInfo(&camera, &direction, &caster, 1, 0.35f, 0.012f);
        QexModel_RenderShadow(&window.engine, nullptr, shadow);
        Window_Clear(&window, 0.6f, 0.75f, 0.9f);
        for (QexShaderModule* receiver : {even, fading}) {
            glViewport(receiver == even ? 0 : half, 0, half, window.height);
            QexModel_SetShaderProgramForAllNode(&village, receiver, nullptr);
            QexModel_RenderFromCameraWithShadow(&village, &lights, &camera, nullptr, shadow, 0);
        }
        QexModel_ReleaseShadowInfo(shadow);
    });

    QexModel_Unload(&village);
    QexGouraudShadowShader_Release(&even);
    QexGouraudShadowExtShader_Release(&fading);
    return Window_Close(&window);
}
