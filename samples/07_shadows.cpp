// Sample 7: shadows. A sphere and a bent worm cast theirs on a floor, twice: on the left half of the picture
// the floor darkens evenly, on the right the shadow fades with the distance from what casts it.
#include "Sample.h"

constexpr int kHalf = Sample::kWidth / 2;

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel worm(scenes::Worm(20, 60));
    SampleModel ball(scenes::Still({{"ball", scenes::Sphere(24), {-2, 0.8f, -0.5f}}}));
    worm.SetChequers(0, 0xE0E0E0, 0xA0B0C0);
    worm.SetChequers(1, 0xF0D890, 0xC07030);
    ball.SetChequers(0, 0xD06050, 0xD06050);
    for (SampleModel* model : {&worm, &ball}) {
        model->SetLightColours(0.8f, 0.2f);
        QexModel_UpdateModelBoundingBox(&model->model, nullptr);
    }
    QexPODModel_SetFrame(&worm.model.scene, 20);
    QexShaderModule* even = QexGouraudShadowShader_CreateProgram();
    QexShaderModule* fading = QexGouraudShadowExtShader_CreateProgram();
    QexShaderModule* skinned = QexSkinningGouraudShader_CreateProgram();
    QexGouraudShadowExtShader_SetShadowFade(fading, 1.5f);

    // The map shows what casts. With the floor among that it is large enough for the worm in any pose: a
    // skinned node's box goes along with its first bone alone.
    const QexVec3 direction = {-1, -1.5f, -0.3f};
    const QexShadowCaster casters[] = {{&worm.model, 1, nullptr, 0}, {&ball.model, 1, nullptr, 0}};
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {direction.x, direction.y, direction.z}, {1, 1, 1, 1}};
    QexCamera camera = sample.Camera({0.3f, 3.4f, 5}, {-0.8f, 1.1f, 0});

    QexCamera_Project(&camera, 1, static_cast<float>(kHalf) / Sample::kHeight, 0.1f, 100);

    // Seen from the light into the shadow map first, then the picture.
    QexShadowInfo* shadow = QexModel_InitShadowInfo(&camera, &direction, casters, 2, 0.3f, 0.01f);
    QexModel_RenderShadow(&sample.engine, nullptr, shadow);
    sample.Clear();
    for (QexShaderModule* receiver : {even, fading}) {
        glViewport(receiver == even ? 0 : kHalf, 0, kHalf, Sample::kHeight);
        for (QexModel* model : {&worm.model, &ball.model}) {
            QexModel_SetShaderProgramForAllNode(model, receiver, skinned);
            QexModel_RenderFromCameraWithShadow(model, &lights, &camera, nullptr, shadow, 0);
        }
    }
    QexModel_ReleaseShadowInfo(shadow);

    const int status = sample.Finish();
    QexGouraudShadowShader_Release(&even);
    QexGouraudShadowExtShader_Release(&fading);
    QexSkinningGouraudShader_Release(&skinned);
    return status;
}
