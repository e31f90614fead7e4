// Drawing 1,000 nodes with the texture module against the same GL calls replayed from a record, both under
// the tap's null driver: what is left is the engine's own work.
#include <cstdlib>

#include "gltap.h"
#include "Qex.h"
#include "Ratio.h"
#include "Scenes.h"
#include "Silence.h"

namespace {

constexpr uint32_t kNodes = 1000;

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    gltapSetMode(GLTAP_NULL);
    const std::vector<uint8_t> file = pod::WritePod(scenes::Grid(kNodes));
    QexRuntimeContext context;
    QexEngineConfig config = {};
    config.width = 640;
    config.height = 480;
    QexModel model;
    QexModel_Create(&model);
    {
        const Silence silence;
        QexEngine_Init(&context, sizeof config, &config);
        QexModel_LoadContentFromCache(&model, file.data(), static_cast<uint32_t>(file.size()), nullptr);
    }
    if (QexModel_GetNumMeshNodes(&model) != kNodes) abort();

    QexCamera camera;
    QexCamera_Create(&camera, 0);
    const QexVec3 eye = {16, 16, 60}, target = {16, 16, 0};
    QexCamera_LookAt(&camera, &eye, &target, nullptr);
    QexCamera_Project(&camera, 0.785f, 4.0f / 3.0f, 1, 100);
    const auto draw = [&] { QexModel_RenderWithCamera(&model, nullptr, &camera, nullptr, 0); };

    draw();
    gltapBeginRecording();
    draw();
    gltapRecording* recording = gltapEndRecording();
    const size_t calls = gltapRecordingSize(recording);
    bench.Compare(
        "draw a node with the texture module / its GL calls", 1.3, draw, [&] { gltapReplay(recording); },
        kNodes);
    const int status = bench.Result();
    printf("GL calls a node: %.1f\n", static_cast<double>(calls) / kNodes);
    gltapReleaseRecording(recording);
    const Silence silence;
    QexModel_Unload(&model);
    QexEngine_Shutdown(&context);
    return status;
}
