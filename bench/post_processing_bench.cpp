// Depth of field at 960 x 540: a frame under the tap's null driver, where all time is the engine's and the
// tap's, against the same frame drawn by the machine's GL.
#include <cstdlib>

#include <GLES2/gl2.h>

#include "BenchEngine.h"
#include "gltap.h"
#include "Headless.h"
#include "Ratio.h"

namespace {

constexpr int kWidth = 960, kHeight = 540;

struct View {
    QexModel* model;
    const QexCamera* camera;
};
// The depth pass is called without the application's arguments.
const View* s_View;

int32_t DrawScene(QexRuntimeContext*, void*, void*, void*, QexShaderModule* module, QexShaderModule* skinned,
                  const float* colour) {
    QexModel* model = s_View->model;
    QexShaderModule* own = model->scene.nodes[0].shader;
    glClearColor(colour ? colour[0] : 0, colour ? colour[1] : 0, colour ? colour[2] : 0, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    if (module) QexModel_SetShaderProgramForAllNode(model, module, skinned);
    QexModel_RenderWithCamera(model, nullptr, s_View->camera, nullptr, 0);
    if (module) QexModel_SetShaderProgramForAllNode(model, own, own);
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
    BenchEngine engine(kWidth, kHeight, scenes::Grid(100));
    const QexCamera camera =
        BenchEngine::Camera({4.5f, 4.5f, 14}, {4.5f, 4.5f, 0}, static_cast<float>(kWidth) / kHeight);
    View view = {&engine.model, &camera};
    s_View = &view;
    if (QexPostProcessing_Initialize(&engine.context) != 0) abort();
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);

    for (const bool half : {false, true}) {
        const auto draw = [&engine, half] {
            const float step = half ? 2 : 1;
            QexPostProcessing_DrawDOF(&engine.context, nullptr, nullptr, nullptr, DrawScene, 0.5f, 4,
                                      step / kWidth, step / kHeight, 3, 9, half ? 0 : 2, 0, 1);
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
    QexPostProcessing_Finalize();
    return status;
}
