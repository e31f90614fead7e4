// Characters that follow bones: their matrices against the same arithmetic written with GLM, drawing one
// against its GL calls, and the time that cutting a large one into batches takes.
#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdlib>
#include <numeric>
#include <random>

#include <glm/glm.hpp>
#include <glm/gtc/quaternion.hpp>
#include <glm/gtc/type_ptr.hpp>

#include "BenchEngine.h"
#include "gltap.h"
#include "Ratio.h"

namespace {

constexpr uint32_t kBones = 64, kFrames = 100;
constexpr double kBatchingLimit = 1000;  // milliseconds

// The matrices of every batch's bones, as they are uploaded.
void QexBoneMatrices(QexPODModel* scene, std::vector<QexMatrix>* out) {
    const QexBoneBatches& batches = scene->meshes[1].boneBatches;
    size_t n = 0;
    for (int32_t b = 0; b < batches.batchCount; ++b)
        for (int32_t i = 0; i < batches.bonesPerBatch[b]; ++i)
            QexPODModel_GetBoneWorldMatrix(scene, &(*out)[n++], &scene->nodes[1],
                                           &scene->nodes[batches.boneTable[b * batches.maxBones + i]]);
}

// The same with GLM: each bone once, then copied to where the batches want it.
struct GlmCharacter {
    std::vector<glm::vec3> positions;
    std::vector<std::vector<glm::quat>> rotations;
    std::vector<int> parents;
    std::vector<glm::mat4> inverseBind, world, bones;
    std::vector<size_t> order;  // of bones in the batches
    glm::mat4 mesh = glm::mat4(1);

    explicit GlmCharacter(QexPODModel* scene) {
        QexPODModel_SetFrame(scene, 0);
        for (uint32_t i = 0; i < kBones; ++i) {
            QexPODNode& node = scene->nodes[2 + i];
            QexMatrix bind;
            QexPODModel_GetWorldMatrix(scene, &bind, &node);
            positions.push_back(glm::make_vec3(node.position));
            rotations.emplace_back();
            for (uint32_t f = 0; f < kFrames; ++f)
                rotations.back().push_back(glm::make_quat(node.rotation + 4 * f));
            parents.push_back(node.parentIndex - 2);
            inverseBind.push_back(glm::inverse(glm::make_mat4(bind.m)));
        }
        world.resize(kBones);
        bones.resize(kBones);
        const QexBoneBatches& batches = scene->meshes[1].boneBatches;
        for (int32_t b = 0; b < batches.batchCount; ++b)
            for (int32_t i = 0; i < batches.bonesPerBatch[b]; ++i)
                order.push_back(static_cast<size_t>(batches.boneTable[b * batches.maxBones + i] - 2));
    }

    void Matrices(float frame, std::vector<glm::mat4>* out) {
        const size_t key = static_cast<size_t>(frame);
        const float t = frame - static_cast<float>(key);
        for (size_t i = 0; i < kBones; ++i) {
            glm::mat4 local = glm::mat4_cast(glm::slerp(rotations[i][key], rotations[i][key + 1], t));
            local[3] = glm::vec4(positions[i], 1);
            world[i] = parents[i] < 0 ? local : world[static_cast<size_t>(parents[i])] * local;
            bones[i] = world[i] * (inverseBind[i] * mesh);
        }
        for (size_t i = 0; i < order.size(); ++i) (*out)[i] = bones[order[i]];
    }
};

// A cloth of 158 x 158 cells, its 49,928 triangles in random order, over 10 x 10 bones; each vertex follows
// the four bones around it. The shortest of three runs, in milliseconds.
double BatchingTime() {
    constexpr uint32_t kCells = 158, kAcross = 10;
    struct Vertex {
        float bones[4], weights[4];
    };
    std::vector<Vertex> vertices;
    for (uint32_t y = 0; y <= kCells; ++y)
        for (uint32_t x = 0; x <= kCells; ++x) {
            const float u = static_cast<float>(x) / (kCells + 1) * (kAcross - 1);
            const float v = static_cast<float>(y) / (kCells + 1) * (kAcross - 1);
            const float column = std::floor(u), row = std::floor(v), a = u - column, b = v - row;
            const float first = row * kAcross + column;
            vertices.push_back({{first, first + 1, first + kAcross, first + kAcross + 1},
                                {(1 - a) * (1 - b), a * (1 - b), (1 - a) * b, a * b}});
        }
    std::vector<uint32_t> cells(kCells * kCells), indices;
    std::iota(cells.begin(), cells.end(), 0u);
    std::shuffle(cells.begin(), cells.end(), std::mt19937(1));
    for (const uint32_t cell : cells) {
        const uint32_t i = cell / kCells * (kCells + 1) + cell % kCells;
        for (const uint32_t corner : {i, i + 1, i + kCells + 1, i + kCells + 1, i + 1, i + kCells + 2})
            indices.push_back(corner);
    }
    double shortest = 1e9;
    for (int run = 0; run < 3; ++run) {
        std::vector<uint32_t> triangles = indices;
        QexBoneBatches batches;
        uint32_t count;
        void* block;
        const auto start = std::chrono::steady_clock::now();
        if (QexBoneBatches_Create(&batches, &count, &block, triangles.data(),
                                  static_cast<uint32_t>(vertices.size()), vertices.data(), sizeof(Vertex),
                                  offsetof(Vertex, weights), QEX_POD_FLOAT, offsetof(Vertex, bones),
                                  QEX_POD_FLOAT, static_cast<uint32_t>(triangles.size() / 3), 16, 4) != 0)
            abort();
        const std::chrono::duration<double, std::milli> time = std::chrono::steady_clock::now() - start;
        shortest = std::min(shortest, time.count());
        if (run == 0) printf("%d batches, %u vertices of %zu\n", batches.batchCount, count, vertices.size());
        QexBoneBatches_Release(&batches);
        QexMemory_Free(block);
    }
    return shortest;
}

}  // namespace

int main(int argc, char** argv) {
    const bool check =
        std::any_of(argv, argv + argc, [](const char* a) { return strcmp(a, "--check") == 0; });
    RatioBench bench(&argc, argv);
    gltapSetMode(GLTAP_NULL);
    BenchEngine engine(640, 480, scenes::Worm(kBones, kFrames));
    QexModel& model = engine.model;
    QexPODModel* scene = &model.scene;
    if (QexModel_GetNumMeshNodes(&model) != 2 || !scene->meshes[1].boneBatches.batchCount) abort();

    GlmCharacter character(scene);
    std::vector<QexMatrix> qexMatrices(character.order.size());
    std::vector<glm::mat4> glmMatrices(character.order.size());
    const auto next = [](float* frame) { return *frame = *frame > kFrames - 3 ? 1.5f : *frame + 0.25f; };
    float qexFrame = 1, glmFrame = 1, drawFrame = 1, matrixFrame = 1;
    bench.Compare(
        "matrices of a 64-bone character / GLM", 1.5,
        [&] {
            QexPODModel_SetFrame(scene, next(&qexFrame));
            QexBoneMatrices(scene, &qexMatrices);
            KeepValue(qexMatrices[0]);
        },
        [&] {
            character.Matrices(next(&glmFrame), &glmMatrices);
            KeepValue(glmMatrices[0]);
        },
        kBones);

    const QexCamera camera = BenchEngine::Camera({0, 2, 10}, {0, 2, 0}, 4.0f / 3);
    const auto draw = [&] {
        QexPODModel_SetFrame(scene, next(&drawFrame));
        QexModel_RenderNodeWithCamera(&model, 1, nullptr, &camera, nullptr);
    };
    draw();
    gltapBeginRecording();
    draw();
    gltapRecording* recording = gltapEndRecording();
    bench.Compare("draw a skinned node / its GL calls and matrices", 1.3, draw, [&] {
        QexPODModel_SetFrame(scene, next(&matrixFrame));
        QexBoneMatrices(scene, &qexMatrices);
        gltapReplay(recording);
    });
    int status = bench.Result();
    const double batching = BatchingTime();
    printf("QexBoneBatches_Create, 49,928 triangles, 100 bones: %.0f ms, limit %.0f%s\n", batching,
           kBatchingLimit, batching > kBatchingLimit ? "  OVER" : "");
    if (check && batching > kBatchingLimit) status = 1;
    gltapReleaseRecording(recording);
    return status;
}
