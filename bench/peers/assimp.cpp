// One model from its file to memory: assimp's importer reads it as binary glTF, without any step after it,
// the engine as POD; once more with the engine's buffers filled, under the tap's null driver.
#include <cstdlib>

#include <assimp/scene.h>
#include <assimp/Importer.hpp>

#include "BenchEngine.h"
#include "gltap.h"
#include "Ratio.h"

namespace {

constexpr unsigned kTriangles = 180000;

unsigned Triangles(const aiScene& scene) {
    unsigned count = 0;
    for (unsigned i = 0; i < scene.mNumMeshes; ++i) count += scene.mMeshes[i]->mNumFaces;
    return count;
}

unsigned Triangles(const QexPODModel& scene) {
    unsigned count = 0;
    for (uint32_t i = 0; i < scene.meshCount; ++i) count += scene.meshes[i].faceCount;
    return count;
}

void Require(bool fine, const char* file) {
    if (fine) return;
    fprintf(stderr, "%s: not the model of %u triangles\n", file, kTriangles);
    exit(1);
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 3) return fprintf(stderr, "usage: %s MODEL.glb MODEL.pod [options]\n", argv[0]), 2;
    const char *glb = argv[1], *pod = argv[2];
    argc -= 2;
    std::copy(argv + 3, argv + 3 + argc, argv + 1);
    RatioBench bench(&argc, argv);
    gltapSetMode(GLTAP_NULL);
    BenchEngine engine(640, 480);

    const auto import = [&] {
        Assimp::Importer importer;
        const aiScene* scene = importer.ReadFile(glb, 0);
        Require(scene && Triangles(*scene) == kTriangles, glb);
    };
    const auto read = [&] {
        const Silence silence;
        QexPODModel scene;
        QexPODModel_ReadFromFile(&scene, pod, 0, 0, 0, 0);
        Require(scene.runtime && Triangles(scene) == kTriangles, pod);
        QexPODModel_Release(&scene);
    };
    const auto load = [&] {
        const Silence silence;
        QexModel model;
        QexModel_Create(&model);
        Require(QexModel_LoadContent(&model, "", pod) == 0 && Triangles(model.scene) == kTriangles, pod);
        QexModel_Unload(&model);
    };
    bench.Compare("180,000 triangles, POD and glb, assimp", 1, read, import);
    bench.Compare("the same, ready to draw, assimp as before", 1, load, import);
    return bench.Result();
}
