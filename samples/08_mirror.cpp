// Sample 8: a mirror. The floor is drawn half transparent over the mirror image of all other nodes; the
// stencil keeps the image inside the floor's edges.
#include "Sample.h"

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel worm(scenes::Worm(20, 60));
    worm.SetChequers(0, 0xC0D0E0, 0x8090A0);
    worm.SetChequers(1, 0xF0D890, 0xC07030);
    QexModel* model = &worm.model;
    worm.SetLightColours(0.8f, 0.2f);
    QexModel_SetOpacity(model, 0, 0.6f);
    QexPODModel_SetFrame(&model->scene, 20);
    QexShaderModule* still = QexGouraudShader_CreateProgram();
    QexShaderModule* skinned = QexSkinningGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(model, still, skinned);

    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_POINT, {-4, 6, 5}, {1, 1, 1, 1}};
    const QexCamera camera = sample.Camera({1, 4, 10}, {0, 0.8f, 0});
    const uint32_t floor = 0;
    const QexShadowCaster everything = {model, 1, nullptr, 0};
    QexReflection* mirror = QexReflection_InitReflectionInfo(model, floor, &everything, 1, 1);

    // The mirror image and the floor over it first; then the scene, in which the floor is switched off by
    // then.
    sample.Clear();
    QexReflection_RenderReflection(mirror, &lights, &camera);
    QexModel_RenderWithCamera(model, &lights, &camera, nullptr, 0);
    QexReflection_Release(mirror);

    const int status = sample.Finish();
    QexGouraudShader_Release(&still);
    QexSkinningGouraudShader_Release(&skinned);
    return status;
}
