// Sample 3: a tree of scene nodes, seen with two eyes. A planet goes around a sun and a moon around the
// planet, by turning nodes alone; all draw one model. The picture is for red-cyan glasses.
#include <cstdio>

#include <GLES2/gl2.h>

#include "Headless.h"
#include "ImageFile.h"
#include "Qex.h"
#include "Scenes.h"

constexpr int kWidth = 320, kHeight = 240;

int main(int argc, char** argv) {
    const char* output = argc > 1 ? argv[1] : "scene_nodes.png";
    std::string error;
    const auto gl = qex::HeadlessContext::Create(kWidth, kHeight, &error);
    if (!gl) return fprintf(stderr, "%s\n", error.c_str()), 1;
    QexRuntimeContext engine;
    QexEngineConfig config = {};
    config.width = kWidth;
    config.height = kHeight;
    if (QexEngine_Init(&engine, sizeof config, &config) != 0) return 1;

    const std::vector<uint8_t> file = pod::WritePod(scenes::Grid(1));
    QexModel cube;
    QexModel_Create(&cube);
    QexModel_LoadContentFromCache(&cube, file.data(), static_cast<uint32_t>(file.size()), nullptr);

    // A plain node turns what hangs on it; the records are the application's.
    QexNode sun, orbit, planet, moonOrbit, moon;
    QexModelNode_Create(&sun, "sun", nullptr, &cube);
    QexNode_Create(&orbit, "orbit", &sun, nullptr);
    QexModelNode_Create(&planet, "planet", &orbit, &cube);
    QexNode_Create(&moonOrbit, "moon orbit", &planet, nullptr);
    QexModelNode_Create(&moon, "moon", &moonOrbit, &cube);
    QexNode_SetPosition(&planet, 1, 0, 0);
    QexNode_SetScale(&planet, 0.6f, 0.6f, 0.6f);
    QexNode_SetPosition(&moon, 0.8f, 0, 0);
    QexNode_SetScale(&moon, 0.5f, 0.5f, 0.5f);
    QexNode_SetRotation(&orbit, 0, 35, 20);
    QexNode_SetRotation(&moonOrbit, 0, 0, -70);
    QexNode_Update(nullptr, &sun, 0);

    QexCamera camera;
    QexCamera_Create(&camera, 0);
    QexCamera_Project(&camera, 0.8f, static_cast<float>(kWidth) / kHeight, 0.1f, 100);
    const QexVec3 target = {0.3f, 0.1f, 0};
    QexVec3 eye = {0, 1, 3};
    glClearColor(0, 0, 0, 1);
    QexRenderer_SetZTestFunc(3);
    QexRenderer_EnableStereo3D(&engine, QEX_STEREO_RED_CYAN, 2);
    for (const bool left : {true, false}) {
        left ? QexRenderer_PrepareLeft(&engine) : QexRenderer_PrepareRight(&engine);
        eye.x = left ? -0.05f : 0.05f;
        QexCamera_LookAt(&camera, &eye, &target, nullptr);
        QexNode_RenderWithCamera(&sun, &camera);
    }
    QexRenderer_FinishStereo3D(&engine);

    const std::vector<uint8_t> pixels = gl->ReadPixels();
    const bool saved = SavePng(output, kWidth, kHeight, pixels.data(), &error);
    if (!saved) fprintf(stderr, "%s: %s\n", output, error.c_str());
    QexModel_Unload(&cube);
    QexEngine_Shutdown(&engine);
    return saved ? 0 : 1;
}
