// Drawing 1,000 nodes with the texture module against the same GL calls replayed from a record, and lean
// against described drawing, all under the tap's null driver: what is left is the engine's own work.
#include <cstdlib>

#include "BenchEngine.h"
#include "gltap.h"
#include "Ratio.h"

namespace {

constexpr uint32_t kNodes = 1000;

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    gltapSetMode(GLTAP_NULL);
    BenchEngine engine(640, 480, scenes::Grid(kNodes));
    if (QexModel_GetNumMeshNodes(&engine.model) != kNodes) abort();
    const QexCamera camera = BenchEngine::Camera({16, 16, 60}, {16, 16, 0}, 4.0f / 3);
    const auto draw = [&] { QexModel_RenderWithCamera(&engine.model, nullptr, &camera, nullptr, 0); };

    draw();
    gltapBeginRecording();
    draw();
    gltapRecording* recording = gltapEndRecording();
    const size_t calls = gltapRecordingSize(recording);
    bench.Compare(
        "draw a node with the texture module / its GL calls", 1.3, draw, [&] { gltapReplay(recording); },
        kNodes);
    const auto drawLean = [&] {
        QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
        draw();
        QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
    };
    bench.Compare("draw a node lean / in the described way", 0.4, drawLean, draw, kNodes);
    drawLean();
    gltapResetCounts();
    drawLean();
    const uint64_t leanCalls = gltapCountAll();
    const int status = bench.Result();
    printf("GL calls a node: %.1f described, %.1f lean\n", static_cast<double>(calls) / kNodes,
           static_cast<double>(leanCalls) / kNodes);
    gltapReleaseRecording(recording);
    return status;
}
