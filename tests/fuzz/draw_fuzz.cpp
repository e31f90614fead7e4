// A scene of any bytes loaded as a model and drawn in many ways, without a driver: the tap reads what a GL
// would read, and knows who reads too far. Aborts then, and when something is left behind.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <memory>

#include "gltap.h"
#include "Qex.h"

namespace {

[[noreturn]] void Abort(const char* what, const char* text) {
    fprintf(stderr, "%s: %s\n", what, text);
    abort();
}

void Draw(QexModel* model, const QexCamera& camera) {
    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_POINT, {0, 0, 9}, {1, 1, 1, 1}};
    TransparentSPODNodeInfo* list = static_cast<TransparentSPODNodeInfo*>(
        calloc(model->scene.meshNodeCount + size_t{1}, sizeof(TransparentSPODNodeInfo)));
    uint32_t count = 0;
    QexModel_RenderWithCamera(model, &lights, &camera, nullptr, 0);
    QexModel_RenderWithCameraEx(model, &lights, &camera, nullptr, 0, QEX_RENDER_OPAQUE, list, &count);
    QexModel_RenderAlphaBlendingNodes(list, count, 0);
    free(list);
    const QexMatrix places[] = {g_sMatIdentity, g_sMatIdentity};
    QexModel_RenderInstances(model, &lights, &camera, places, nullptr, 2, 0);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    gltapReset();
    gltapSetMode(GLTAP_NULL);
    gltapBeginReads();
    const std::unique_ptr<uint8_t[]> block(new uint8_t[size]);
    std::copy(data, data + size, block.get());
    QexRuntimeContext engine;
    QexEngineConfig config = {};
    config.width = config.height = 64;
    QexEngine_Init(&engine, sizeof config, &config);
    QexModel model;
    QexModel_Create(&model);
    QexModel_LoadContentFromCache(&model, block.get(), static_cast<uint32_t>(size), nullptr);
    QexCamera camera = {};
    QexMatrix_Perspective(&camera.projectionMatrix, 1, 1, 0.1f, 1000);
    camera.viewMatrix = g_sMatIdentity;
    QexShaderModule* modules[] = {QexGouraudNormalMapShader_CreateProgram(),
                                  QexSkinningGouraudNormalMapShader_CreateProgram()};
    for (int32_t way : {QEX_DRAWING_DESCRIBED, QEX_DRAWING_LEAN}) {
        QexRenderer_SetDrawing(way);
        for (const float frame : {0.0f, 1.5f, 1e9f}) {
            if (model.scene.runtime) QexPODModel_SetFrame(&model.scene, frame);
            Draw(&model, camera);
            if (frame == 0) QexModel_SetShaderProgramForAllNode(&model, modules[0], modules[1]);
        }
    }
    QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
    QexGouraudNormalMapShader_Release(&modules[0]);
    QexSkinningGouraudNormalMapShader_Release(&modules[1]);
    QexModel_Unload(&model);
    QexEngine_Shutdown(&engine);
    char text[200];
    if (gltapReadFaults(text, sizeof text)) Abort("a draw reads what is not there", text);
    if (gltapDescribeObjects(text, sizeof text)) Abort("objects are left", text);
    return 0;
}
