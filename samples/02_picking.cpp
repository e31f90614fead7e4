// Sample 2: what is under a pixel? Works out where each node is on the screen, picks at a point, brings the
// nearest node that was hit forward and writes its name above the point.
#include <cstdio>

#include <GLES2/gl2.h>

#include "Headless.h"
#include "ImageFile.h"
#include "Qex.h"
#include "Scenes.h"

constexpr int kWidth = 320, kHeight = 240;
constexpr int kMostHits = 9;

int main(int argc, char** argv) {
    const char* output = argc > 1 ? argv[1] : "picking.png";
    std::string error;
    const auto gl = qex::HeadlessContext::Create(kWidth, kHeight, &error);
    if (!gl) return fprintf(stderr, "%s\n", error.c_str()), 1;
    QexRuntimeContext engine;
    QexEngineConfig config = {};
    config.width = kWidth;
    config.height = kHeight;
    if (QexEngine_Init(&engine, sizeof config, &config) != 0) return 1;

    const std::vector<uint8_t> file = pod::WritePod(scenes::Grid(9));
    QexModel model;
    QexModel_Create(&model);
    QexModel_LoadContentFromCache(&model, file.data(), static_cast<uint32_t>(file.size()), nullptr);
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    const QexVec3 eye = {3, 2, 4}, target = {1, 1, 0};
    QexCamera_LookAt(&camera, &eye, &target, nullptr);
    QexCamera_Project(&camera, 0.8f, static_cast<float>(kWidth) / kHeight, 0.1f, 100);

    // The boxes in the world, from them those on the screen, and among these the ones around the point.
    const QexVec2 point = {240, 130};
    uint32_t hits[kMostHits];
    int32_t count;
    QexModel_UpdateModelBoundingBox(&model, nullptr);
    QexModel_CalcScreenBBox(&engine, &model, &camera);
    QexModel_Pick(&model, nullptr, &point, &count, hits, kMostHits);
    const QexBoundingBox* boxes = model.screenBoxes;
    uint32_t nearest = count ? hits[0] : 0;
    for (int32_t i = 1; i < count; ++i)
        if (boxes[hits[i]].centre.z < boxes[nearest].centre.z) nearest = hits[i];

    glViewport(0, 0, kWidth, kHeight);
    glClearColor(0.25f, 0.3f, 0.4f, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexRenderer_SetZTestFunc(3);
    QexRenderer_SetAlphaBlendMode(1);
    if (count) QexModel_SetNodePosition(&model, nearest, 0, 0, 0.7f);
    QexModel_RenderWithCamera(&model, nullptr, &camera, nullptr, 0);
    const char* name = count ? QexModel_GetNodeName(&model, nearest) : "nothing";
    QexFont_DrawTempString(&engine, static_cast<int32_t>(point.x), static_cast<int32_t>(point.y), name,
                           0xFFFF4040);
    printf("%d boxes around %.0f, %.0f; nearest: %s\n", count, static_cast<double>(point.x),
           static_cast<double>(point.y), name);

    const std::vector<uint8_t> pixels = gl->ReadPixels();
    const bool saved = SavePng(output, kWidth, kHeight, pixels.data(), &error);
    if (!saved) fprintf(stderr, "%s: %s\n", output, error.c_str());
    QexModel_Unload(&model);
    QexEngine_Shutdown(&engine);
    return saved && count ? 0 : 1;
}
