// Sample 4: light. One sphere lit per vertex, one with a highlight, one unlit, under a white light from the
// upper left and a blue one from the right.
#include "Sample.h"

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    const pod::MeshArrays sphere = scenes::Sphere(24);
    SampleModel spheres(scenes::Still({{"diffuse", sphere, {-2.2f, 0, 0}},
                                       {"specular", sphere, {0, 0, 0}},
                                       {"unlit", sphere, {2.2f, 0, 0}}}));
    for (uint32_t material = 0; material < 3; ++material) spheres.SetChequers(material, 0xE0C080, 0xB08040);
    QexModel* model = &spheres.model;

    // A material's colours weigh ambient, diffuse and specular light; the shader takes 256 times the
    // shininess.
    spheres.SetLightColours(1, 0.15f);
    for (float& value : model->scene.materials[1].specular) value = 0.8f;
    model->scene.materials[1].shininess = 0.15f;

    // Each node has its own module; the engine's choice is unlit.
    QexShaderModule* diffuse = QexGouraudShader_CreateProgram();
    QexShaderModule* specular = QexGouraudSpecularShader_CreateProgram();
    QexModel_SetShaderProgram(model, 0, diffuse);
    QexModel_SetShaderProgram(model, 1, specular);

    QexLightSet lights = {};
    lights.count = 2;
    lights.lights[0] = {QEX_LIGHT_POINT, {-4, 5, 6}, {1, 1, 1, 1}};
    lights.lights[1] = {QEX_LIGHT_DIRECTIONAL, {-1, 0, 0}, {0.2f, 0.3f, 0.9f, 1}};
    const QexCamera camera = sample.Camera({0, 0, 8}, {0, 0, 0});
    sample.Clear();
    QexModel_RenderWithCamera(model, &lights, &camera, nullptr, 0);

    const int status = sample.Finish();
    QexGouraudShader_Release(&diffuse);
    QexGouraudSpecularShader_Release(&specular);
    return status;
}
