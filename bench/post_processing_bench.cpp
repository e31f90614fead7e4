// Depth of field at 960 x 540: a frame under the tap's null driver, where all time is the engine's and the
// tap's, against the same frame drawn by the machine's GL.
#include <cstdlib>

#include <GLES2/gl2.h>

#include "gltap.h"
#include "Headless.h"
#include "Qex.h"
#include "Ratio.h"
#include "Scenes.h"
#include "Silence.h"

namespace {

constexpr int kWidth = 960, kHeight = 540;
QexModel s_Model;
QexCamera s_Camera;

int32_t DrawScene(QexRuntimeContext*, void*, void*, void*, QexShaderModule* module, QexShaderModule* skinned,
                  const float* colour) {
    QexShaderModule* own = s_Model.scene.nodes[0].shader;
    glClearColor(colour ? colour[0] : 0, colour ? colour[1] : 0, colour ? colour[2] : 0, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    if (module) QexModel_SetShaderProgramForAllNode(&s_Model, module, skinned);
    QexModel_RenderWithCamera(&s_Model, nullptr, &s_Camera, nullptr, 0);
    if (module) QexModel_SetShaderProgramForAllNode(&s_Model, own, own);
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    std::string error;
    const auto gl = qex::HeadlessContext::Create(kWidth, kHeight, &error);
    if (!gl) {
        fprintf(stderr, "post_processing_bench: %s\n", error.c_str());
        return 1;
    }
    const std::vector<uint8_t> file = pod::WritePod(scenes::Grid(100));
    QexRuntimeContext context;
    QexEngineConfig config = {};
    config.width = kWidth;
    config.height = kHeight;
    QexModel_Create(&s_Model);
    {
        const Silence silence;
        QexEngine_Init(&context, sizeof config, &config);
        QexModel_LoadContentFromCache(&s_Model, file.data(), static_cast<uint32_t>(file.size()), nullptr);
        if (QexPostProcessing_Initialize(&context) != 0) abort();
    }
    QexCamera_Create(&s_Camera, 0);
    const QexVec3 eye = {4.5f, 4.5f, 14}, target = {4.5f, 4.5f, 0};
    QexCamera_LookAt(&s_Camera, &eye, &target, nullptr);
    QexCamera_Project(&s_Camera, 0.785f, static_cast<float>(kWidth) / kHeight, 1, 100);
    QexRenderer_SetZTestFunc(3);

    for (const bool half : {false, true}) {
        const auto draw = [&context, half] {
            const float step = half ? 2 : 1;
            QexPostProcessing_DrawDOF(&context, nullptr, nullptr, nullptr, DrawScene, 0.5f, 4, step / kWidth,
                                      step / kHeight, 3, 9, half ? 0 : 2, 0, 1);
            glFinish();
        };
        bench.Compare(
            half ? "depth of field, half resolution: own time / frame" : "depth of field: own time / frame",
            0.15,
            [draw] {
                gltapSetMode(GLTAP_NULL);
                draw();
                gltapSetMode(GLTAP_FORWARD);
            },
            draw);
    }
    const int status = bench.Result();
    printf("GL: %s\n", gl->Renderer().c_str());
    const Silence silence;
    QexPostProcessing_Finalize();
    QexModel_Unload(&s_Model);
    QexEngine_Shutdown(&context);
    return status;
}
