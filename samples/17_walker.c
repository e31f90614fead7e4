/* Sample 17: a figure walks on a floor that takes its shadow. */
#include <math.h>

#include "window.h"

static QexModel s_Walker, s_Floor;

static void Draw(Window* window, void* user) {
    static const QexVec3 eye = {2, 1.8f, 3.4f}, middle = {0, 0.85f, 0}, sun = {-1, -1.6f, -0.8f};
    static const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {-1, -1.6f, -0.8f}, {1, 1, 1, 1}}}};
    static const QexShadowCaster casters[] = {{&s_Walker, 1, NULL, 0}, {&s_Floor, 1, NULL, 0}};
    const QexCamera camera = Window_Camera(window, eye, middle);
    QexShadowInfo* shadow;
    (void)user;
    QexPODModel_SetFrame(&s_Walker.scene, 1 + fmodf(30 * window->seconds, 32)); /* 1 to 33 */
    QexModel_UpdateModelBoundingBox(&s_Walker, NULL);
    QexModel_UpdateModelBoundingBox(&s_Floor, NULL);
    shadow = QexModel_InitShadowInfo(&camera, &sun, casters, 2, 0.4f, 0.01f);
    QexModel_RenderShadow(&window->engine, NULL, shadow);
    Window_Clear(window, 0.55f, 0.7f, 0.85f);
    QexModel_RenderFromCameraWithShadow(&s_Floor, &lights, &camera, NULL, shadow, 0);
    QexModel_RenderFromCameraWithShadow(&s_Walker, &lights, &camera, NULL, shadow, 0);
    QexModel_ReleaseShadowInfo(shadow);
}

int main(int argc, char** argv) {
    Window window;
    QexMesh plane;
    QexShaderModule *skinned, *receiver;
    if (Window_Open(&window, "Walker", argc, argv) != 0) return 1;
    Window_LoadModel(&window, &s_Walker, "walker.pod");
    QexMesh_CreatePlane(&plane, 5, 5, 8, 1);
    QexModel_CreateFromMesh(&s_Floor, &plane, NULL);
    QexMesh_Release(&plane);
    skinned = QexSkinningGouraudShader_CreateProgram();
    receiver = QexGouraudShadowShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&s_Walker, NULL, skinned);
    QexModel_SetShaderProgramForAllNode(&s_Floor, receiver, NULL);

    Window_Run(&window, Draw, NULL);

    QexModel_Unload(&s_Walker);
    QexModel_Unload(&s_Floor);
    QexSkinningGouraudShader_Release(&skinned);
    QexGouraudShadowShader_Release(&receiver);
    return Window_Close(&window);
}
