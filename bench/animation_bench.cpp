// World matrices of animated nodes against the same arithmetic written with GLM.
#include <cstdlib>
#include <cstring>

#include <glm/glm.hpp>
#include <glm/gtc/quaternion.hpp>
#include <glm/gtc/type_ptr.hpp>

#include "Qex.h"
#include "Ratio.h"
#include "Scenes.h"
#include "Silence.h"

namespace {

constexpr uint32_t kChains = 64, kLength = 8, kFrames = 100;
constexpr uint32_t kNodes = kChains * kLength;

struct Node {
    const glm::vec3* positions;
    const glm::quat* rotations;
    const float* scales;  // seven floats a key
    int parent;
};

// What the engine does for a node: interpolate the three keys, build the local matrix, put the parent in
// front.
void GlmWorldMatrices(const std::vector<Node>& nodes, float frame, std::vector<glm::mat4>* world) {
    const int key = static_cast<int>(frame);
    const float t = frame - static_cast<float>(key);
    for (size_t i = 0; i < nodes.size(); ++i) {
        const Node& node = nodes[i];
        const glm::vec3 position = glm::mix(node.positions[key], node.positions[key + 1], t);
        const glm::quat rotation = glm::slerp(node.rotations[key], node.rotations[key + 1], t);
        const glm::vec3 scale =
            glm::mix(glm::make_vec3(node.scales + 7 * key), glm::make_vec3(node.scales + 7 * (key + 1)), t);
        glm::mat4 local = glm::mat4_cast(rotation);
        local[0] *= scale.x;
        local[1] *= scale.y;
        local[2] *= scale.z;
        local[3] = glm::vec4(position, 1);
        (*world)[i] = node.parent < 0 ? local : (*world)[static_cast<size_t>(node.parent)] * local;
    }
}

void QexWorldMatrices(QexPODModel* scene, QexMatrix* world) {
    for (uint32_t i = 0; i < scene->nodeCount; ++i)
        QexPODModel_GetWorldMatrix(scene, &world[i], &scene->nodes[i]);
}

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    const std::vector<uint8_t> file = pod::WritePod(scenes::Chains(kChains, kLength, kFrames));
    QexPODModel scene;
    {
        const Silence silence;
        QexPODModel_ReadFromMemory(&scene, file.data(), static_cast<uint32_t>(file.size()), 0, 0, 0, 0);
    }
    if (!scene.runtime) abort();

    // The same keys; those that lie in the file's own bytes are copied out, for alignment.
    std::vector<std::vector<float>> keys;
    std::vector<Node> nodes;
    for (uint32_t i = 0; i < kNodes; ++i) {
        const QexPODNode& node = scene.nodes[i];
        const float* sources[] = {node.position, node.rotation, node.scale};
        const size_t floats[] = {3 * kFrames, 4 * kFrames, 7 * kFrames};
        for (int k = 0; k < 3; ++k) {
            keys.emplace_back(floats[k]);
            memcpy(keys.back().data(), sources[k], floats[k] * sizeof(float));
        }
        const size_t last = keys.size() - 1;
        nodes.push_back({reinterpret_cast<const glm::vec3*>(keys[last - 2].data()),
                         reinterpret_cast<const glm::quat*>(keys[last - 1].data()), keys[last].data(),
                         node.parentIndex});
    }

    std::vector<QexMatrix> qexWorld(kNodes);
    std::vector<glm::mat4> glmWorld(kNodes);
    float qexFrame = 0.5f, glmFrame = 0.5f;
    const auto advance = [](float* frame) { *frame = *frame > kFrames - 3 ? 0.5f : *frame + 0.25f; };
    bench.Compare(
        "world matrix of a changed node / mix, slerp, mat4_cast", 1.5,
        [&] {
            advance(&qexFrame);
            QexPODModel_SetFrame(&scene, qexFrame);
            QexWorldMatrices(&scene, qexWorld.data());
            KeepValue(qexWorld[0]);
        },
        [&] {
            advance(&glmFrame);
            GlmWorldMatrices(nodes, glmFrame, &glmWorld);
            KeepValue(glmWorld[0]);
        },
        kNodes);

    // Nothing changed: the test of the cache, and the copy that the call asks for.
    const std::vector<QexMatrix> cached = qexWorld;
    std::vector<float> nodeKeys(kNodes, 1.0f), cacheKeys(kNodes, 1.0f);
    bench.Compare(
        "world matrix of an unchanged node / compare and copy", 2.0,
        [&] {
            QexWorldMatrices(&scene, qexWorld.data());
            KeepValue(qexWorld[0]);
        },
        [&] {
            for (uint32_t i = 0; i < kNodes; ++i) {
                KeepValue(nodeKeys[i]);
                if (nodeKeys[i] == cacheKeys[i]) qexWorld[i] = cached[i];
            }
            KeepValue(qexWorld[0]);
        },
        kNodes);
    const int status = bench.Result();
    QexPODModel_Release(&scene);
    return status;
}
