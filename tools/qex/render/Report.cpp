// A progress bar, and figures of the GL tap and the system.
#include "render/Report.h"

#include <cstdio>
#include <string>

#include <sys/resource.h>
#include <unistd.h>

void ReportProgress(size_t done, size_t count) {
    if (count < 2 || !isatty(STDERR_FILENO)) return;
    const size_t width = 40, filled = width * done / count;
    fprintf(stderr, "\r[%s%s] %zu/%zu%s", std::string(filled, '=').c_str(),
            std::string(width - filled, ' ').c_str(), done, count, done == count ? "\n" : "");
}

void ReportStats(const RenderStats& stats) {
    const QexPODModel& scene = stats.model.scene;
    const double n = static_cast<double>(stats.pictures);
    rusage usage = {};
    getrusage(RUSAGE_SELF, &usage);
    uint64_t triangles = 0;
    for (uint32_t i = 0; i < scene.meshNodeCount; ++i) {
        const QexPODMesh& mesh = scene.meshes[scene.nodes[i].objectIndex];
        if (!mesh.stripCount) triangles += mesh.faceCount;
        for (uint32_t s = 0; s < mesh.stripCount; ++s) triangles += mesh.stripLengths[s];
    }
    printf("load         %10.1f ms\n", stats.loadTime);
    printf("picture      %10.1f ms (drawing and reading back)\n", stats.drawTime / n);
    printf("draw calls   %10.1f a picture\n", static_cast<double>(stats.draws) / n);
    printf("GL calls     %10.1f a picture (%s; %s: %llu)\n", static_cast<double>(stats.calls) / n,
           stats.lean ? "lean" : "described", stats.lean ? "described" : "lean",
           static_cast<unsigned long long>(stats.otherCalls));
    printf("triangles    %10llu in the scene\n", static_cast<unsigned long long>(triangles));
    printf("memory       %10.1f MB at most\n", static_cast<double>(usage.ru_maxrss) / 1024);
    printf("renderer     %s, %s\n", stats.context.Renderer().c_str(), stats.context.Version().c_str());
}
