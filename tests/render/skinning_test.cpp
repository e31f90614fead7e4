// Meshes that follow bones: what is sent for each batch, and where the vertices land.
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

// 150 triangles in batches of 100 and 50, in pairs: squares of 6 x 6 pixels. Of each batch three show, every
// one with its own texel of a palette, bones and weights; the others have no area.
constexpr int kQuads = 75, kShown = 6, kFirstOfSecondBatch = 50;
const glm::vec2 kCentres[kShown] = {{10, 20}, {30, 15}, {55, 20}, {80, 10}, {15, 50}, {65, 55}};
constexpr int kBytesOfWeights[4][4] = {{255, 0, 0, 0}, {155, 100, 0, 0}, {100, 80, 75, 0}, {90, 70, 55, 40}};
const std::vector<int> kBatches[] = {{1, 3, 2}, {4, 2}};  // scene nodes by index in the batch

size_t BoneOf(int shown, uint32_t influence) {
    return (static_cast<size_t>(shown) + influence) % kBatches[shown / 3].size();
}

pod::Mesh Squares(uint32_t influences, uint32_t weightType) {
    pod::MeshArrays arrays;
    for (int q = 0; q < kQuads; ++q) {
        const int inBatch = q % kFirstOfSecondBatch, shown = inBatch % 3 + q / kFirstOfSecondBatch * 3;
        const float half = inBatch < 3 ? 3 : 0;
        for (int corner = 0; corner < 4; ++corner) {
            arrays.positions.push_back({kCentres[shown].x + (corner % 2 ? half : -half),
                                        kCentres[shown].y + (corner / 2 ? half : -half), 0});
            arrays.uvs.push_back({(static_cast<float>(shown) + 0.5f) / 8, 0.5f});
            std::array<uint8_t, 4> bones, weights;
            for (uint32_t i = 0; i < 4; ++i) {
                bones[i] = static_cast<uint8_t>(BoneOf(shown, i));
                weights[i] = static_cast<uint8_t>(kBytesOfWeights[influences - 1][i]);
            }
            arrays.boneIndices.push_back(bones);
            arrays.boneWeights.push_back(weights);
        }
        for (const int i : {0, 1, 2, 2, 1, 3}) arrays.indices.push_back(static_cast<uint32_t>(4 * q + i));
    }
    return SkinnedMesh(arrays, influences, weightType, {kBatches[0], kBatches[1]},
                       {0, 2 * kFirstOfSecondBatch});
}

// What the matrices hold shows where the vertices land.
TEST_F(SkinningTest, EachBatchSendsItsBonesAndDrawsItsTriangles) {
    const Skeleton skeleton;
    LoadedModel model(skeleton.Scene(Squares(2, pod::kUint8Norm)));
    ASSERT_EQ(model.log, "");
    QexPODModel_SetFrame(&model.model.scene, 1);
    const QexShaderModule* module = model.Node().shader;
    ASSERT_EQ(module->render, QexSkinningTextureShader_Render);
    const GLCalls calls([&] { model.Draw(); });
    const std::string count = "glUniform1i(" + std::to_string(module->slots[0].location) + ", 2)\n";
    EXPECT_EQ(calls.Text({"glUniform1i", "glDrawElements"}),
              count + "glDrawElements(GL_TRIANGLES, 300, GL_UNSIGNED_SHORT, NULL)\n" + count +
                  "glDrawElements(GL_TRIANGLES, 150, GL_UNSIGNED_SHORT, 0x258)\n");
    const auto matrices = calls.Of({"glUniformMatrix4fv"});
    ASSERT_EQ(matrices.size(), 3u);
    for (const size_t batch : {0, 1}) {
        EXPECT_EQ(matrices[batch + 1]->argument[0].i, module->slots[1].location);
        EXPECT_EQ(matrices[batch + 1]->argument[1].i, static_cast<int64_t>(kBatches[batch].size()));
    }
    const QexMatrix extra = ToQex(Place({3, 4, 5}, 0.25f));
    // The box follows the first bone of the first batch, without the model matrix.
    QexModel_UpdateMeshNodeBoundingBox(&model.model, 0, &extra);
    const glm::vec4 farthest = skeleton.Skinning(1) * glm::vec4(83, 58, 0, 1);
    const QexVec3& corner = model.model.nodeBoxes[0].corners[7];
    EXPECT_LT(glm::distance(glm::vec3(corner.x, corner.y, corner.z), glm::vec3(farthest)), 1e-3f);
}

// The mean place of the pixels of a colour, counted from the lower left corner, and their number.
glm::vec3 FindSpot(const Picture& picture, Rgba colour) {
    glm::vec3 sum(0);
    for (int y = 0; y < kHeight; ++y)
        for (int x = 0; x < kWidth; ++x)
            if (picture.Pixel(x, y) == colour)
                sum += glm::vec3(static_cast<float>(x) + 0.5f, static_cast<float>(kHeight - y) - 0.5f, 1);
    return {glm::vec2(sum) / sum.z, sum.z};
}

TEST_F(SkinningTest, VerticesLandWhereTheirBonesCarryThem) {
    const Skeleton skeleton;
    std::vector<uint8_t> palette;
    for (int i = 0; i < 8; ++i)
        palette.insert(palette.end(), {uint8_t(30 * i + 20), uint8_t(200 - 20 * i), 90, 255});
    ScopedTexture texture(8, 1, palette.data());
    const glm::mat4 extra = Place({6, -4, 0}, 0.05f);
    const QexMatrix extraMatrix = ToQex(extra);
    for (uint32_t influences = 1; influences <= 4; ++influences)
        for (const uint32_t type : {pod::kUint8, pod::kUint8Norm, pod::kFloat32}) {
            LoadedModel model(skeleton.Scene(Squares(influences, type)));
            ASSERT_EQ(model.log, "");
            QexPODModel_SetFrame(&model.model.scene, 1);
            model.model.textures[0] = &texture;
            Clear();
            model.Draw(type == pod::kUint8 ? nullptr : &extraMatrix);
            const Picture picture = Read();
            for (int q = 0; q < kShown; ++q) {
                glm::mat4 blend(0);
                for (uint32_t i = 0; i < influences; ++i)
                    blend += skeleton.Skinning(kBatches[q / 3][BoneOf(q, i)]) *
                             (static_cast<float>(kBytesOfWeights[influences - 1][i]) / 255);
                if (type != pod::kUint8) blend = extra * blend;
                const glm::vec2 expected = glm::vec2(blend * glm::vec4(kCentres[q], 0, 1));
                const float area = 36 * std::fabs(glm::determinant(glm::mat2(blend)));
                const glm::vec3 spot = FindSpot(picture, {30 * q + 20, 200 - 20 * q, 90, 255});
                SCOPED_TRACE(testing::Message() << influences << " " << type << " " << q);
                EXPECT_NEAR(spot.z, area, 9);
                EXPECT_LT(glm::distance(glm::vec2(spot), expected), 0.5f);
            }
        }
}

TEST_F(SkinningTest, BatchesOfTooManyBonesAreRefused) {
    pod::Mesh mesh = Squares(1, pod::kUint8);
    mesh.batchBones.assign(34, 1);
    mesh.bonesPerBatch = {17, 2};
    mesh.batchBoneMax = 17;
    LoadedModel model(Skeleton().Scene(mesh));
    EXPECT_NE(model.log.find("mesh 0 has a bone batch of 17 bones, at most 16 are drawn\n"),
              std::string::npos);
    EXPECT_EQ(GLCalls([&] { model.Draw(); }).Size(), 0u);
}

}  // namespace
