// Loading a scene of 20 MB with textures of 28 MB in parts of 2 milliseconds, under the tap's null driver:
// how long the longest call works, how many calls there are, and what parting costs.
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <string>
#include <vector>

#include "BenchEngine.h"
#include "gltap.h"
#include "PvrWriter.h"
#include "Scenes.h"

namespace {

constexpr float kBudget = 2;  // milliseconds
constexpr double kLimit = 4;
constexpr int kRounds = 7;

// Of this thread's work, so that what else runs on the machine does not count.
double Milliseconds() {
    timespec now;
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}

// A folder that goes with its files.
class Folder {
  public:
    Folder() {
        if (!mkdtemp(path_)) abort();
    }
    ~Folder() {
        for (const std::string& name : names_) unlink((Path() + name).c_str());
        rmdir(path_);
    }
    std::string Path() const { return std::string(path_) + "/"; }
    void Write(const std::string& name, const std::vector<uint8_t>& bytes) {
        names_.push_back(name);
        if (!pod::WriteFile(Path() + name, bytes)) abort();
    }

  private:
    char path_[32] = "/tmp/load_bench_XXXXXX";
    std::vector<std::string> names_;
};

void WriteTexture(Folder* folder, pod::Scene* scene, const std::string& name, uint32_t type, uint32_t size) {
    pod::PvrImage image;
    image.type = type;
    image.width = image.height = size;
    image.surfaces.resize(1);
    for (uint32_t side = size; side; side /= 2)
        image.surfaces[0].emplace_back(pod::PvrLevelSize(type, side, side), uint8_t{170});
    folder->Write(name, pod::WritePvr(image));
    scene->materials.emplace_back();
    scene->materials.back().diffuseTexture = static_cast<int32_t>(scene->textures.size());
    scene->textures.push_back(name);
}

// The scenes of exporters, and one whose vertices are laid out anew and whose indices are narrowed.
pod::Scene Write(Folder* folder) {
    pod::Scene scene = scenes::Large(20u << 20);
    pod::MeshArrays ball = scenes::Sphere(175);
    ball.binormals.clear();
    scene.meshes[0] = pod::BuildMesh(ball, true);
    WriteTexture(folder, &scene, "pvrtc.pvr", pod::kPvrtc4, 2048);
    WriteTexture(folder, &scene, "etc.pvr", pod::kPvrEtc1, 2048);
    WriteTexture(folder, &scene, "rgba.pvr", pod::kPvrRgba8888, 2048);
    folder->Write("scene.pod", pod::WritePod(scene));
    return scene;
}

struct Figures {
    double longest = 0, all = 0;
    int calls = 0;
    float at = 0;  // progress at the end of the longest call
};

Figures LoadInParts(QexModel* model, const std::string& folder) {
    Figures figures;
    if (QexModel_BeginLoad(model, folder.c_str(), "scene.pod") != 0) abort();
    for (int32_t result = 1; result == 1; ++figures.calls) {
        float progress;
        const double start = Milliseconds();
        result = QexModel_ContinueLoad(model, kBudget, &progress);
        const double took = Milliseconds() - start;
        if (result < 0) abort();
        figures.all += took;
        if (took > figures.longest) figures.at = progress;
        figures.longest = std::max(figures.longest, took);
    }
    QexModel_Unload(model);
    return figures;
}

double LoadAtOnce(QexModel* model, const std::string& folder) {
    const double start = Milliseconds();
    if (QexModel_LoadContent(model, folder.c_str(), "scene.pod") != 0) abort();
    const double took = Milliseconds() - start;
    QexModel_Unload(model);
    return took;
}

}  // namespace

int main(int argc, char** argv) {
    gltapSetMode(GLTAP_NULL);
    BenchEngine engine(320, 240);
    const Silence silence;
    Folder folder;
    Write(&folder);
    QexModel model;
    QexModel_Create(&model);
    std::vector<Figures> rounds;
    double atOnce = LoadAtOnce(&model, folder.Path());
    for (int i = 0; i < kRounds; ++i) {
        rounds.push_back(LoadInParts(&model, folder.Path()));
        atOnce = std::min(atOnce, LoadAtOnce(&model, folder.Path()));
    }
    std::sort(rounds.begin(), rounds.end(),
              [](const Figures& a, const Figures& b) { return a.longest < b.longest; });
    const Figures& median = rounds[kRounds / 2];
    printf("in parts of %.0f ms: %d calls, %.1f ms in all; at once %.1f ms\n", double{kBudget}, median.calls,
           median.all, atOnce);
    printf(
        "the longest call %.2f ms, at %.0f %% of the progress (the worst of %d rounds %.2f ms); limit %.0f "
        "ms\n",
        median.longest, double{median.at} * 100, kRounds, rounds.back().longest, kLimit);
    const bool check = argc > 1 && std::string(argv[1]) == "--check";
    return check && median.longest > kLimit ? 1 : 0;
}
