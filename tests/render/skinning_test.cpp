// Meshes that follow bones: what is sent for each batch.
#include <cmath>

#include "Scenes.h"

namespace {

class SkinningTest : public RenderTest {};

glm::mat4 Place(glm::vec3 position, float angle) {
    return glm::rotate(glm::translate(glm::mat4(1), position), angle, glm::vec3(0, 0, 1));
}

// Node 0 draws the mesh; nodes 1 to 4 are bones, the second a child of the first. Between frame 0, the bind
// pose, and frame 1 all move.
struct Skeleton {
    struct Bone {
        int32_t parent;
        glm::vec3 position[2];
        float angle[2];
    };
    static constexpr Bone kBones[] = {{-1, {{20, 20, 0}, {20, 20, 0}}, {0, 0.5f}},
                                      {1, {{20, 0, 0}, {20, 3, 0}}, {0.2f, -0.7f}},
                                      {-1, {{64, 48, 0}, {70, 56, 0}}, {0, 0}},
                                      {-1, {{90, 30, 0}, {90, 30, 0}}, {0.1f, 0.6f}}};
    glm::vec3 mesh = {10, 5, 0};

    glm::mat4 World(int node, int frame) const {
        const Bone& bone = kBones[node - 1];
        const glm::mat4 local = Place(bone.position[frame], bone.angle[frame]);
        return bone.parent < 0 ? local : World(bone.parent, frame) * local;
    }
    glm::mat4 Skinning(int node) const {
        return World(node, 1) * glm::inverse(World(node, 0)) * glm::translate(glm::mat4(1), mesh);
    }
    pod::Scene Scene(const pod::Mesh& skinned) const {
        pod::Scene scene = SceneOf(skinned, {{{mesh.x, mesh.y, mesh.z}}, {}, {}, {}});
        for (const Bone& bone : kBones) {
            pod::Transform t;
            for (const int frame : {0, 1, 1}) {
                const glm::vec3& p = bone.position[frame];
                const float half = bone.angle[frame] / 2;
                t.positions.push_back({p.x, p.y, p.z});
                t.rotations.push_back({0, 0, std::sin(half), std::cos(half)});
            }
            scene.nodes.push_back(pod::BuildNode("bone", t, bone.parent));
        }
        scene.frameCount = 3;  // the last frame wraps to the first
        return scene;
    }
};
constexpr Skeleton::Bone Skeleton::kBones[];

// 150 triangles in batches of 100 and 50.
const std::vector<std::vector<int>> kBatches = {{1, 3, 2}, {4, 2}};  // scene nodes by index in the batch

pod::Mesh TwoBatches(const std::vector<std::vector<int>>& batches) {
    pod::MeshArrays arrays;
    arrays.positions = {{7, 12, 0}, {83, 58, 0}, {20, 20, 0}};
    arrays.boneIndices.resize(3);
    arrays.boneWeights.resize(3, {155, 100, 0, 0});
    for (int i = 0; i < 150; ++i) arrays.indices.insert(arrays.indices.end(), {0, 1, 2});
    return SkinnedMesh(arrays, 2, pod::kUint8Norm, batches, {0, 100});
}

// Where the vertices land then is tested with the lit modules.
TEST_F(SkinningTest, EachBatchSendsItsBonesAndDrawsItsTriangles) {
    const Skeleton skeleton;
    LoadedModel model(skeleton.Scene(TwoBatches(kBatches)));
    ASSERT_EQ(model.log, "");
    QexPODModel_SetFrame(&model.model.scene, 1);
    const QexShaderModule* module = model.Node().shader;
    ASSERT_EQ(module->render, QexSkinningTextureShader_Render);
    const glm::mat4 extra = Place({3, 4, 5}, 0.25f);
    const QexMatrix extraMatrix = ToQex(extra);
    for (const bool placed : {false, true}) {
        const GLCalls calls([&] { model.Draw(placed ? &extraMatrix : nullptr); });
        const std::string count = "glUniform1i(" + std::to_string(module->slots[0].location) + ", 2)\n";
        EXPECT_EQ(calls.Text({"glUniform1i", "glDrawElements"}),
                  count + "glDrawElements(GL_TRIANGLES, 300, GL_UNSIGNED_SHORT, NULL)\n" + count +
                      "glDrawElements(GL_TRIANGLES, 150, GL_UNSIGNED_SHORT, 0x258)\n");
        const auto matrices = calls.Of({"glUniformMatrix4fv"});
        ASSERT_EQ(matrices.size(), 3u);
        for (size_t batch = 0; batch < 2; ++batch) {
            const gltapCall* call = matrices[batch + 1];
            EXPECT_EQ(call->argument[0].i, module->slots[1].location);
            ASSERT_EQ(call->argument[1].i, static_cast<int64_t>(kBatches[batch].size()));
            for (size_t j = 0; j < kBatches[batch].size(); ++j) {
                const glm::mat4 bone = skeleton.Skinning(kBatches[batch][j]);
                EXPECT_TRUE(
                    SameMatrix(static_cast<const float*>(call->data) + 16 * j, placed ? extra * bone : bone))
                    << batch << " " << j;
            }
        }
    }
    // The box follows the first bone of the first batch, without the model matrix.
    QexModel_UpdateMeshNodeBoundingBox(&model.model, 0, &extraMatrix);
    const glm::vec4 farthest = skeleton.Skinning(1) * glm::vec4(83, 58, 0, 1);
    const QexVec3& corner = model.model.nodeBoxes[0].corners[7];
    EXPECT_LT(glm::distance(glm::vec3(corner.x, corner.y, corner.z), glm::vec3(farthest)), 1e-3f);
}

TEST_F(SkinningTest, BatchesOfTooManyBonesAreRefused) {
    LoadedModel model(Skeleton().Scene(TwoBatches({std::vector<int>(17, 1), {1, 2}})));
    EXPECT_NE(model.log.find("mesh 0 has a bone batch of 17 bones, at most 16 are drawn\n"),
              std::string::npos);
    EXPECT_EQ(GLCalls([&] { model.Draw(); }).Size(), 0u);
}

}  // namespace
