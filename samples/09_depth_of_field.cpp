// Sample 9: depth of field. A row of spheres goes away from the camera. On the left of the picture the near
// ones are sharp, on the right the far ones; above the rest is blurred at full resolution, below at half.
#include "Sample.h"

constexpr int kWidth = Sample::kWidth / 2, kHeight = Sample::kHeight / 2;

struct Row {
    QexModel* model;
    QexCamera camera;
    QexLightSet lights;
};
// The depth pass is called without the application's arguments.
static Row s_Row;

// Draws the row with its own modules, or with those that show depth.
static int32_t DrawRow(QexRuntimeContext*, void*, void*, void*, QexShaderModule* module,
                       QexShaderModule* skinned, const float* colour) {
    QexRenderer_SetZTestFunc(3);
    if (colour)
        glClearColor(colour[0], colour[1], colour[2], 1);
    else
        glClearColor(0.25f, 0.3f, 0.4f, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexShaderModule* own = s_Row.model->scene.nodes[0].shader;
    QexModel_SetShaderProgramForAllNode(s_Row.model, module, skinned);
    QexModel_RenderWithCamera(s_Row.model, &s_Row.lights, &s_Row.camera, nullptr, 0);
    QexModel_SetShaderProgramForAllNode(s_Row.model, own, own);
    return 0;
}

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    std::vector<scenes::Object> objects;
    for (int i = 0; i < 5; ++i) {
        const float step = static_cast<float>(i);
        objects.push_back(
            {"ball", scenes::Sphere(32), {-1.1f + 1.2f * step, -1.6f + 1.4f * step, -2.5f * step}});
    }
    SampleModel row(scenes::Still(objects));
    for (uint32_t i = 0; i < objects.size(); ++i) row.SetChequers(i, 0xF0D890, i % 2 ? 0x3070A0 : 0xC05030);
    row.SetLightColours(0.8f, 0.3f);
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&row.model, lit, nullptr);
    s_Row.model = &row.model;
    s_Row.camera = sample.Camera({0.3f, 0.5f, 7.4f}, {0.7f, 0.8f, 0});
    QexCamera_Project(&s_Row.camera, 0.7f, static_cast<float>(kWidth) / kHeight, 1, 22);
    s_Row.lights.count = 1;
    s_Row.lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {1, -2, -1.5f}, {1, 1, 1, 1}};

    // The effect takes a quarter of the picture for its screen.
    QexRuntimeContext quarter = sample.engine;
    quarter.width = kWidth;
    quarter.height = kHeight;
    QexPostProcessing_Initialize(&quarter);
    for (const uint32_t halfTarget : {0, 1})
        QexTexture_SetFilter(&QexPP_GetRenderTarget(halfTarget)->colorTexture, QEX_FILTER_LINEAR);
    sample.Clear();
    for (const bool half : {false, true})
        for (const bool far : {false, true}) {
            glViewport(far ? kWidth : 0, half ? 0 : kHeight, kWidth, kHeight);
            // Both blur as far: a pixel at half the resolution is two.
            const float step = half ? 2 : 1, sigma = half ? 1.5f : 3;
            QexPostProcessing_DrawDOF(&quarter, nullptr, nullptr, nullptr, DrawRow, far ? 0.8f : 0.25f, 2.5f,
                                      step / kWidth, step / kHeight, sigma, 9, half ? 0 : 2, 0, 1);
        }
    QexPostProcessing_Finalize();

    const int status = sample.Finish();
    QexGouraudShader_Release(&lit);
    return status;
}
