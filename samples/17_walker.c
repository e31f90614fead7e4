/* Sample 17: a figure walks through a village, whose ground takes its shadow. */
#include <math.h>

#include "window.h"

static QexModel s_Walker, s_Village;

static void Draw(Window* window, void* user) {
    static const QexVec3 eye = {1.6f, 1.5f, 3.6f}, middle = {-0.2f, 1, 0}, sun = {-0.8f, -1, -0.7f};
    static const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {-0.8f, -1, -0.7f}, {1, 1, 1, 1}}}};
    static const QexShadowCaster caster = {&s_Walker, 1, NULL, 0};
    const QexCamera camera = Window_Camera(window, eye, middle);
    QexShadowInfo* shadow;
    QexMatrix place;
    (void)user;
    QexMatrix_Translate(&place, -0.6f, -0.04f, -3);
    QexPODModel_SetFrame(&s_Walker.scene, 1 + fmodf(30 * window->seconds, 32)); /* 1 to 33 */
    QexModel_UpdateModelBoundingBox(&s_Walker, NULL);
    shadow = QexModel_InitShadowInfo(&camera, &sun, &caster, 1, 0.4f, 0.01f);
    QexModel_RenderShadow(&window->engine, NULL, shadow);
    Window_Clear(window, 0.55f, 0.7f, 0.85f);
    QexModel_RenderFromCameraWithShadow(&s_Village, &lights, &camera, &place, shadow, 0);
    QexModel_RenderFromCameraWithShadow(&s_Walker, &lights, &camera, NULL, shadow, 0);
    QexModel_ReleaseShadowInfo(shadow);
}

int main(int argc, char** argv) {
    Window window;
    QexShaderModule *skinned, *receiver;
    if (Window_Open(&window, "Walker", argc, argv) != 0) return 1;
    Window_LoadModel(&window, &s_Walker, "walker.pod");
    Window_LoadModel(&window, &s_Village, "village.pod");
    skinned = QexSkinningGouraudShader_CreateProgram();
    receiver = QexGouraudShadowShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&s_Walker, NULL, skinned);
    QexModel_SetShaderProgramForAllNode(&s_Village, receiver, NULL);

    Window_Run(&window, Draw, NULL);

    QexModel_Unload(&s_Walker);
    QexModel_Unload(&s_Village);
    QexSkinningGouraudShader_Release(&skinned);
    QexGouraudShadowShader_Release(&receiver);
    return Window_Close(&window);
}
