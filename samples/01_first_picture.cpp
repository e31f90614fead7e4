// Sample 1: the shortest way from a scene to a picture. Makes a GL context, starts the engine, loads a scene,
// places a camera, draws one frame and saves it.
#include <cstdio>

#include <GLES2/gl2.h>

#include "Headless.h"
#include "ImageFile.h"
#include "Qex.h"
#include "Scenes.h"

constexpr int kWidth = 320, kHeight = 240;

int main(int argc, char** argv) {
    const char* output = argc > 1 ? argv[1] : "first_picture.png";

    // The application owns the context; the engine draws into the one that is current.
    std::string error;
    const auto gl = qex::HeadlessContext::Create(kWidth, kHeight, &error);
    if (!gl) return fprintf(stderr, "%s\n", error.c_str()), 1;

    QexRuntimeContext engine;
    QexEngineConfig config = {};
    config.width = kWidth;
    config.height = kHeight;
    if (QexEngine_Init(&engine, sizeof config, &config) != 0) return 1;

    // An application calls QexModel_LoadContent with a directory and a file; here the file is made in memory,
    // and stays there as long as the model.
    const std::vector<uint8_t> file = pod::WritePod(scenes::Grid(9));
    QexModel model;
    QexModel_Create(&model);
    QexModel_LoadContentFromCache(&model, file.data(), static_cast<uint32_t>(file.size()), nullptr);

    QexCamera camera;
    QexCamera_Create(&camera, 0);
    const QexVec3 eye = {3, 3, 4}, target = {1, 1, 0};
    QexCamera_LookAt(&camera, &eye, &target, nullptr);
    QexCamera_Project(&camera, 0.8f, static_cast<float>(kWidth) / kHeight, 0.1f, 100);

    glViewport(0, 0, kWidth, kHeight);
    glClearColor(0.25f, 0.3f, 0.4f, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexRenderer_SetZTestFunc(3);
    QexRenderer_SetAlphaBlendMode(1);
    QexModel_RenderWithCamera(&model, nullptr, &camera, nullptr, 0);
    QexFont_DrawTempString(&engine, 8, 40, "Hello from Qex", 0xFFFFC040);

    const std::vector<uint8_t> pixels = gl->ReadPixels();
    const bool saved = SavePng(output, kWidth, kHeight, pixels.data(), &error);
    if (!saved) fprintf(stderr, "%s: %s\n", output, error.c_str());

    QexModel_Unload(&model);
    QexEngine_Shutdown(&engine);
    return saved ? 0 : 1;
}
