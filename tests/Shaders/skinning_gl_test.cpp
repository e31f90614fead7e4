// Meshes that follow bones: where their vertices land, however they are batched.
#include <cmath>

#include "support/RenderScenes.h"

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

// Two batches of three squares of 6 x 6 pixels, every one with its own texel of a palette, bones and weights.
constexpr int kQuads = 6;
const glm::vec2 kCentres[kQuads] = {{10, 20}, {30, 15}, {55, 20}, {80, 10}, {15, 50}, {65, 55}};
constexpr int kWeights[4][4] = {{255, 0, 0, 0}, {155, 100, 0, 0}, {60, 45, 150, 0}, {90, 40, 105, 20}};
const std::vector<int> kBatches[] = {{1, 3, 2}, {4, 2}};  // scene nodes by index in the batch

size_t BoneOf(int quad, uint32_t influence) {
    return (static_cast<size_t>(quad) + influence) % kBatches[quad / 3].size();
}

pod::Mesh Squares(uint32_t influences) {
    std::vector<float> positions, uvs;
    std::vector<double> bones, weights;
    std::vector<uint32_t> indices;
    for (int q = 0; q < kQuads; ++q) {
        for (int corner = 0; corner < 4; ++corner) {
            positions.insert(positions.end(), {kCentres[q].x + (corner % 2 ? 3.0f : -3.0f),
                                               kCentres[q].y + (corner / 2 ? 3.0f : -3.0f), 0});
            uvs.insert(uvs.end(), {(static_cast<float>(q) + 0.5f) / 8, 0.5f});
            for (uint32_t i = 0; i < influences; ++i) bones.push_back(double(BoneOf(q, i)));
            weights.insert(weights.end(), kWeights[influences - 1], kWeights[influences - 1] + influences);
        }
        for (const int i : {0, 1, 2, 2, 1, 3}) indices.push_back(static_cast<uint32_t>(4 * q + i));
    }
    pod::Mesh mesh;
    mesh.vertexCount = kQuads * 4;
    mesh.faceCount = kQuads * 2;
    mesh.faces = pod::IndexElement(indices);
    mesh.vertices = pod::FloatElement(positions.data(), positions.size(), 3);
    mesh.uvw = {pod::FloatElement(uvs.data(), uvs.size(), 2)};
    mesh.boneIndices = IntegerElement(pod::kUint8, influences, bones);
    mesh.boneWeights = IntegerElement(pod::kUint8, influences, weights);
    mesh.batchBones = {1, 3, 2, 4, 2, 0};
    mesh.bonesPerBatch = {3, 2};
    mesh.batchOffsets = {0, 6};
    mesh.batchBoneMax = 3;
    mesh.batchCount = 2;
    return mesh;
}

TEST_F(SkinningTest, BoxesAndBonesThatAreMissing) {
    const Skeleton skeleton;
    LoadedModel model(skeleton.Scene(Squares(1)));
    ASSERT_EQ(model.log, "");
    QexPODModel_SetFrame(&model.model.scene, 1);
    // The box follows the first bone of the first batch, without the model matrix.
    const QexMatrix extra = ToQex(Place({3, 4, 5}, 0.25f));
    QexModel_UpdateMeshNodeBoundingBox(&model.model, 0, &extra);
    const glm::vec4 farthest = skeleton.Skinning(1) * glm::vec4(83, 58, 0, 1);
    const QexVec3& corner = model.model.nodeBoxes[0].corners[7];
    EXPECT_LT(glm::distance(glm::vec3(corner.x, corner.y, corner.z), glm::vec3(farthest)), 1e-3f);
    // In lean drawing it holds what all bones carry.
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    QexModel_UpdateMeshNodeBoundingBox(&model.model, 0, nullptr);
    QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
    glm::vec3 low(1e9f), high(-1e9f);
    for (int q = 0; q < kQuads; ++q)
        for (int c = 0; c < 4; ++c) {
            const glm::vec2 at = kCentres[q] + glm::vec2(c & 1 ? 3 : -3, c & 2 ? 3 : -3);
            const glm::vec3 point = skeleton.Skinning(kBatches[q / 3][BoneOf(q, 0)]) * glm::vec4(at, 0, 1);
            low = glm::min(low, point);
            high = glm::max(high, point);
        }
    const QexVec3* corners = model.model.nodeBoxes[0].corners;
    EXPECT_LT(glm::distance(glm::vec3(corners[0].x, corners[0].y, corners[0].z), low), 1e-3f);
    EXPECT_GE(corners[7].x, high.x - 1e-3f);
    EXPECT_GE(corners[7].y, high.y - 1e-3f);
    // By that box it is left out where none of it would be seen, here left of the picture.
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    const QexMatrix projection = PixelProjection();
    for (const float right : {1.0f, -1.0f}) {
        const QexMatrix placed = ToQex(glm::translate(glm::mat4(1), {right - corners[7].x, 0, 0}));
        const GLCalls drawn([&] {
            QexModel_RenderWithViewProjection(&model.model, nullptr, &placed, &g_sMatIdentity, &projection,
                                              0);
        });
        EXPECT_EQ(drawn.Of({"glDrawElements"}).size(), right > 0 ? 2u : 0u);
    }
    QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED);
    // What follows a bone that the scene does not have goes with the mesh node.
    model.model.scene.meshes[0].boneBatches.boneTable[1] = -1;
    const GLCalls calls([&] { model.Draw(); });
    const float* second = static_cast<const float*>(calls.Of({"glUniformMatrix4fv"}).at(1)->data) + 16;
    EXPECT_TRUE(SameMatrix(second, glm::translate(glm::mat4(1), skeleton.mesh)));
}

// The squares as a file without batches has them: vertices name nodes.
pod::Mesh WithoutBatches(uint32_t influences) {
    pod::Mesh mesh = Squares(influences);
    for (size_t v = 0; v < mesh.vertexCount; ++v)
        for (size_t i = 0; i < influences; ++i) {
            uint8_t& bone = mesh.boneIndices.data[v * influences + i];
            bone = static_cast<uint8_t>(kBatches[v < 12 ? 0 : 1][bone]);
        }
    mesh.batchBones = mesh.bonesPerBatch = mesh.batchOffsets = {};
    mesh.batchBoneMax = mesh.batchCount = 0;
    return mesh;
}

// One batch of 17 bones: the nodes in turn.
pod::Mesh WithLargeBatch(uint32_t influences) {
    pod::Mesh mesh = WithoutBatches(influences);
    for (uint8_t& bone : mesh.boneIndices.data) bone = static_cast<uint8_t>(bone + 11);  // 12 to 15
    for (int i = 0; i < 17; ++i) mesh.batchBones.push_back(1 + i % 4);
    mesh.bonesPerBatch = {17};
    mesh.batchOffsets = {0};
    mesh.batchBoneMax = 17;
    mesh.batchCount = 1;
    return mesh;
}

TEST_F(SkinningTest, VerticesFollowTheirBonesWhateverTheBatches) {
    const Skeleton skeleton;
    std::vector<uint8_t> palette;
    for (int i = 0; i < 8; ++i)
        palette.insert(palette.end(), {uint8_t(30 * i + 20), uint8_t(200 - 20 * i), 90, 255});
    ScopedTexture texture(8, 1, palette.data());
    const glm::mat4 placed = Place({6, -4, 0}, 0.05f);
    const QexMatrix placedMatrix = ToQex(placed);
    const auto draw = [&](const pod::Mesh& mesh) {
        LoadedModel model(skeleton.Scene(mesh));
        EXPECT_EQ(model.log, "");
        EXPECT_EQ(model.model.scene.meshes[0].boneBatches.batchCount, mesh.batchCount > 1 ? 2 : 1);
        QexPODModel_SetFrame(&model.model.scene, 1);
        model.model.textures[0] = &texture;
        Clear();
        model.Draw(&placedMatrix);
        return Read();
    };
    for (uint32_t influences = 1; influences <= 4; ++influences) {
        SCOPED_TRACE(influences);
        const Picture expected = draw(Squares(influences));
        for (int q = 0; q < kQuads; ++q) {
            glm::vec4 at(0);
            for (uint32_t i = 0; i < influences; ++i)
                at += placed * skeleton.Skinning(kBatches[q / 3][BoneOf(q, i)]) *
                      glm::vec4(kCentres[q], 0, 1) * (static_cast<float>(kWeights[influences - 1][i]) / 255);
            const Rgba colour = {30 * q + 20, 200 - 20 * q, 90, 255};
            EXPECT_EQ(expected.Pixel(int(at.x), int(kHeight - at.y)), colour) << q;
        }
        EXPECT_TRUE(SamePicture(expected, draw(WithoutBatches(influences))));
        EXPECT_TRUE(SamePicture(expected, draw(WithLargeBatch(influences))));
        // Each square as a strip of two triangles; the second of them is turned over.
        pod::Mesh strips = WithoutBatches(influences);
        std::vector<uint32_t> indices;
        for (uint32_t i = 0; i < strips.vertexCount; ++i) indices.push_back(i);
        strips.faces = pod::IndexElement(indices, true);
        strips.stripLengths.assign(kQuads, 2);
        QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
        EXPECT_TRUE(SamePicture(draw(WithoutBatches(influences)), draw(strips)));
        QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    }
}

}  // namespace
