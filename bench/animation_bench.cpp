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

// The scene's nodes with keys of their own: those that lie in the file's bytes are not aligned.
class AlignedNodes {
  public:
    explicit AlignedNodes(const QexPODModel& scene) {
        for (uint32_t i = 0; i < kNodes; ++i) {
            const QexPODNode& node = scene.nodes[i];
            nodes_.push_back({reinterpret_cast<const glm::vec3*>(Copy(node.position, 3)),
                              reinterpret_cast<const glm::quat*>(Copy(node.rotation, 4)), Copy(node.scale, 7),
                              node.parentIndex});
        }
    }
    const std::vector<Node>& Nodes() const { return nodes_; }

  private:
    const float* Copy(const float* keys, size_t floats) {
        copies_.emplace_back(floats * kFrames);
        memcpy(copies_.back().data(), keys, copies_.back().size() * sizeof(float));
        return copies_.back().data();
    }

    std::vector<std::vector<float>> copies_;
    std::vector<Node> nodes_;
};

// What both comparisons work on; they run when all are registered.
struct Work {
    QexPODModel* scene;
    AlignedNodes aligned;
    std::vector<QexMatrix> world, cached;
    std::vector<glm::mat4> glmWorld;
    std::vector<float> nodeKeys, cacheKeys;
    float qexFrame = 0.5f, glmFrame = 0.5f;

    explicit Work(QexPODModel* read)
        : scene(read),
          aligned(*read),
          world(kNodes),
          cached(kNodes),
          glmWorld(kNodes),
          nodeKeys(kNodes, 1.0f),
          cacheKeys(kNodes, 1.0f) {}
};

void CompareChanged(RatioBench* bench, Work* work) {
    const auto advance = [](float* frame) { *frame = *frame > kFrames - 3 ? 0.5f : *frame + 0.25f; };
    bench->Compare(
        "world matrix of a changed node / mix, slerp, mat4_cast", 1.5,
        [=] {
            advance(&work->qexFrame);
            QexPODModel_SetFrame(work->scene, work->qexFrame);
            QexWorldMatrices(work->scene, work->world.data());
            KeepValue(work->world[0]);
        },
        [=] {
            advance(&work->glmFrame);
            GlmWorldMatrices(work->aligned.Nodes(), work->glmFrame, &work->glmWorld);
            KeepValue(work->glmWorld[0]);
        },
        kNodes);
}

// The test of the cache, and the copy that the call asks for.
void CompareUnchanged(RatioBench* bench, Work* work) {
    bench->Compare(
        "world matrix of an unchanged node / compare and copy", 2.0,
        [=] {
            QexWorldMatrices(work->scene, work->world.data());
            KeepValue(work->world[0]);
        },
        [=] {
            for (uint32_t i = 0; i < kNodes; ++i) {
                KeepValue(work->nodeKeys[i]);
                if (work->nodeKeys[i] == work->cacheKeys[i]) work->world[i] = work->cached[i];
            }
            KeepValue(work->world[0]);
        },
        kNodes);
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
    Work work(&scene);
    CompareChanged(&bench, &work);
    CompareUnchanged(&bench, &work);
    const int status = bench.Result();
    QexPODModel_Release(&scene);
    return status;
}
