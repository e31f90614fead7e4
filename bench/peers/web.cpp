// The engine's side of the browser comparison: 1,000 small lit cubes in four ways, on the WebGL context of
// the page.
#include <cmath>
#include <vector>

#include <emscripten.h>
#include <emscripten/html5.h>

#include <GLES2/gl2.h>
#include "Qex.h"

#include "Scenes.h"

namespace {

constexpr uint32_t kCount = 1000;

QexRuntimeContext s_Context;
QexModel s_Cube, s_Nodes, s_Meshes;
QexCamera s_Camera;
QexLightSet s_Lights;
std::vector<QexMatrix> s_Places;

// A model of a scene built in code, lit.
void Load(QexModel* model, const pod::Scene& scene, QexShaderModule* lit) {
    const std::vector<uint8_t> file = pod::WritePod(scene);
    QexModel_Create(model);
    QexModel_LoadContentFromCache(model, file.data(), static_cast<uint32_t>(file.size()), nullptr);
    QexModel_SetShaderProgramForAllNode(model, lit, lit);
}

pod::Scene OwnMeshes(pod::Scene scene) {
    scene.meshes.resize(kCount, scene.meshes[0]);
    for (uint32_t i = 0; i < kCount; ++i) scene.nodes[i].object = static_cast<int32_t>(i);
    return scene;
}

void DrawByMatrix() {
    for (const QexMatrix& place : s_Places)
        QexModel_RenderWithCamera(&s_Cube, &s_Lights, &s_Camera, &place, 0);
}
void DrawNodes() {
    QexModel_RenderWithCamera(&s_Nodes, &s_Lights, &s_Camera, nullptr, 0);
}
void DrawMeshes() {
    QexModel_RenderWithCamera(&s_Meshes, &s_Lights, &s_Camera, nullptr, 0);
}
void DrawInstances() {
    QexModel_RenderInstances(&s_Cube, &s_Lights, &s_Camera, s_Places.data(), nullptr, kCount, 0);
}
void (*const kWays[])() = {DrawByMatrix, DrawNodes, DrawMeshes, DrawInstances};

}  // namespace

extern "C" {

EMSCRIPTEN_KEEPALIVE int Start(int width, int height, int lean) {
    EmscriptenWebGLContextAttributes attributes;
    emscripten_webgl_init_context_attributes(&attributes);
    attributes.antialias = false;
    emscripten_webgl_make_context_current(emscripten_webgl_create_context("#engine", &attributes));
    QexEngineConfig config = {};
    config.width = width;
    config.height = height;
    QexLog_SetLevel(QEX_LOG_WARNING);
    if (QexEngine_Init(&s_Context, sizeof config, &config) != 0) return 1;
    QexRenderer_SetDrawing(lean);
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    Load(&s_Cube, scenes::Grid(1), lit);
    Load(&s_Nodes, scenes::Grid(kCount), lit);
    Load(&s_Meshes, OwnMeshes(scenes::Grid(kCount)), lit);
    s_Lights.count = 1;
    s_Lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.5f, -0.7f, -1}, {1, 1, 1, 1}};
    for (uint32_t i = 0; i < kCount; ++i) {
        QexMatrix place;
        s_Places.push_back(
            *QexMatrix_Translate(&place, static_cast<float>(i % 32), static_cast<float>(i / 32), 0));
    }
    glViewport(0, 0, width, height);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    return 0;
}

// A frame in one of the ways, the camera a little further.
EMSCRIPTEN_KEEPALIVE void Frame(int way, double seconds) {
    const QexVec3 target = {16, 16, 0};
    const QexVec3 eye = {16 + 5 * static_cast<float>(std::sin(seconds)), 16, 50};
    QexCamera_Create(&s_Camera, 0);
    QexCamera_LookAt(&s_Camera, &eye, &target, nullptr);
    QexCamera_Project(&s_Camera, 0.8f, 4.0f / 3, 1, 100);
    glClearColor(0.2f, 0.2f, 0.3f, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    kWays[way]();
}

}  // extern "C"
