// Sample 2: what is under a pixel? Works out where each node is on the screen, picks at a point, brings the
// nearest node that was hit up and writes its name above the point.
#include <cstdio>

#include "window.h"

constexpr int kMostHits = 16;
constexpr uint32_t kFirst = 3;  // behind the sky, the grass and the square, which are around everything

// The mesh node nearest to the eye whose box on the screen is around the point, or -1.
static int Nearest(Window* window, QexModel* model, const QexCamera& camera, const QexVec2& point) {
    // The boxes in the world, from them those on the screen, and among these the ones around the point.
    uint32_t hits[kMostHits];
    int32_t count;
    QexModel_UpdateModelBoundingBox(model, nullptr);
    QexModel_CalcScreenBBox(&window->engine, model, &camera);
    QexModel_Pick(model, nullptr, &point, &count, hits, kMostHits);
    const QexBoundingBox* boxes = model->screenBoxes;
    int nearest = -1;
    for (int32_t i = 0; i < count; ++i)
        if (hits[i] >= kFirst && (nearest < 0 || boxes[hits[i]].centre.z < boxes[nearest].centre.z))
            nearest = static_cast<int>(hits[i]);
    return nearest;
}

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Picking", argc, argv) != 0) return 1;
    QexModel village;
    Window_LoadModel(&window, &village, "village.pod");
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&village, lit, nullptr);
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.6f, -0.8f, -0.5f}, {1, 0.95f, 0.85f, 1}};
    int hit = -1;

    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {-3, 6.5f, 14}, {0.5f, 1.2f, 0});
        const QexVec2 point = window.pointer;
        for (uint32_t i = 0; i < QexModel_GetNumMeshNodes(&village); ++i)
            QexModel_SetNodePosition(&village, i, 0, 0, 0);
        hit = Nearest(&window, &village, camera, point);
        if (hit >= 0) QexModel_SetNodePosition(&village, static_cast<uint32_t>(hit), 0, 0.5f, 0);

        Window_Clear(&window, 0.25f, 0.3f, 0.4f);
        QexModel_RenderWithCamera(&village, &lights, &camera, nullptr, 0);
        const char* name = hit >= 0 ? QexModel_GetNodeName(&village, static_cast<uint32_t>(hit)) : "nothing";
        QexFont_SetScale(2);
        QexFont_DrawTempString(&window.engine, static_cast<int32_t>(point.x), static_cast<int32_t>(point.y),
                               name, 0xFFFFFFFF);
    });
    printf("hit: node %d\n", hit);

    QexModel_Unload(&village);
    QexGouraudShader_Release(&lit);
    const int status = Window_Close(&window);
    return hit >= 0 ? status : 1;
}
