/* Sample 17: a figure walks on a floor that takes its shadow. */
#include <math.h>

#include "window.h"

int main(int argc, char** argv) {
    Window window;
    QexModel walker, floor;
    QexMesh plane;
    const QexVec3 eye = {2, 1.8f, 3.4f}, middle = {0, 0.85f, 0}, sun = {-1, -1.6f, -0.8f};
    const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {-1, -1.6f, -0.8f}, {1, 1, 1, 1}}}};
    const QexShadowCaster casters[] = {{&walker, 1, NULL, 0}, {&floor, 1, NULL, 0}};
    if (Window_Open(&window, "Walker", argc, argv) != 0) return 1;
    Window_LoadModel(&window, &walker, "walker.pod");
    QexMesh_CreatePlane(&plane, 5, 5, 8, 1);
    QexModel_CreateFromMesh(&floor, &plane, NULL);
    QexMesh_Release(&plane);
    QexShaderModule* skinned = QexSkinningGouraudShader_CreateProgram();
    QexShaderModule* receiver = QexGouraudShadowShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&walker, NULL, skinned);
    QexModel_SetShaderProgramForAllNode(&floor, receiver, NULL);

    while (Window_Frame(&window)) {
        const QexCamera camera = Window_Camera(&window, eye, middle);
        QexPODModel_SetFrame(&walker.scene, 1 + fmodf(30 * window.seconds, 32)); /* 1 to 33 */
        QexModel_UpdateModelBoundingBox(&walker, NULL);
        QexModel_UpdateModelBoundingBox(&floor, NULL);
        QexShadowInfo* shadow = QexModel_InitShadowInfo(&camera, &sun, casters, 2, 0.4f, 0.01f);
        QexModel_RenderShadow(&window.engine, NULL, shadow);
        Window_Clear(&window, 0.55f, 0.7f, 0.85f);
        QexModel_RenderFromCameraWithShadow(&floor, &lights, &camera, NULL, shadow, 0);
        QexModel_RenderFromCameraWithShadow(&walker, &lights, &camera, NULL, shadow, 0);
        QexModel_ReleaseShadowInfo(shadow);
    }
    QexModel_Unload(&walker);
    QexModel_Unload(&floor);
    QexSkinningGouraudShader_Release(&skinned);
    QexGouraudShadowShader_Release(&receiver);
    return Window_Close(&window);
}
