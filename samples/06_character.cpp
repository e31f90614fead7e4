// Sample 6: a skinned character, at five moments of its animation beside each other. The scene brings no bone
// batches: the engine cuts the mesh into pieces of at most 16 bones when it reads it.
#include "Sample.h"

constexpr uint32_t kBones = 40, kFrames = 60;

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel worm(scenes::Worm(kBones, kFrames));
    worm.SetChequers(1, 0xF0D890, 0xC07030);
    QexModel* model = &worm.model;
    worm.SetLightColours(1, 0.2f);

    // Static nodes take the first module, nodes that follow bones the second.
    QexShaderModule* still = QexGouraudShader_CreateProgram();
    QexShaderModule* skinned = QexSkinningGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(model, still, skinned);
    QexModel_EnableNodeRendering(model, 0, 0);  // the floor

    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-1, -1, -2}, {1, 1, 1, 1}};
    const QexCamera camera = sample.Camera({0, 2.5f, 15}, {0, 2, 0});
    sample.Clear();
    for (int i = 0; i < 5; ++i) {
        QexPODModel_SetFrame(&model->scene, static_cast<float>(1 + i * 12));
        QexMatrix place;
        QexMatrix_Translate(&place, 2.6f * static_cast<float>(i - 2), 0, 0);
        QexModel_RenderWithCamera(model, &lights, &camera, &place, 0);
    }
    printf("%d bones in %d batches\n", static_cast<int>(kBones),
           model->scene.meshes[1].boneBatches.batchCount);

    const int status = sample.Finish();
    QexGouraudShader_Release(&still);
    QexSkinningGouraudShader_Release(&skinned);
    return status;
}
