#include <assimp/postprocess.h>
#include <assimp/scene.h>

#include <algorithm>
#include <assimp/Importer.hpp>
#include <cmath>
#include <map>
#include <random>
#include <set>

#include "convert/Animation.h"
#include "convert/Meshes.h"
#include "convert/Scene.h"
#include "qex/ConvertSupport.h"

namespace {

// Every triangle comes out once, in a batch that has its bones, whether the engine's list of 512 batches
// holds them all, the pieces are small or the batches are.
TEST(BatchSkin, LosesNoTriangleOfALargeMesh) {
    std::minstd_rand random(3);
    std::vector<VertexBones> vertices(3000);
    std::vector<uint32_t> indices(6000);
    for (VertexBones& vertex : vertices) {
        const auto bone = uint32_t(random() % 100);
        vertex.bones = {bone, bone + 1 + uint32_t(random()) % 3, bone + 4 + uint32_t(random()) % 30, 0};
        vertex.weights = {235, 10, 10, 0};
    }
    for (uint32_t& index : indices) index = uint32_t(random() % 3000);
    std::multiset<std::array<uint32_t, 3>> in;
    for (size_t i = 0; i < indices.size(); i += 3) in.insert({indices[i], indices[i + 1], indices[i + 2]});
    for (const auto& [maxBones, maxVertices] : {std::pair(16, 65535u), {16, 50u}, {12, 65535u}}) {
        auto left = in;
        for (const SkinPiece& piece : BatchSkin(vertices, indices, maxBones, maxVertices)) {
            EXPECT_LE(piece.sources.size(), maxVertices);
            size_t batch = 0;
            for (size_t i = 0; i < piece.indices.size(); ++i) {
                if (batch + 1 < piece.batchOffsets.size() && i >= 3 * size_t(piece.batchOffsets[batch + 1]))
                    ++batch;
                const std::vector<int32_t>& bones = piece.batchBones[batch];
                EXPECT_LE(bones.size(), size_t(maxBones));
                const uint32_t* corner = &piece.indices[i];
                const uint32_t source = piece.sources.at(*corner);
                for (size_t k = 0; k < 3; ++k)
                    EXPECT_EQ(uint32_t(bones.at(piece.boneIndices.at(*corner)[k])),
                              vertices[source].bones[k]);
                if (i % 3) continue;
                const auto found =
                    left.find({source, piece.sources.at(corner[1]), piece.sources.at(corner[2])});
                ASSERT_NE(found, left.end());
                left.erase(found);
            }
        }
        EXPECT_TRUE(left.empty());
    }
}

aiMatrix4x4 LocalAt(const aiNode& node, const aiAnimation* clip, double seconds) {
    for (unsigned i = 0; clip && i < clip->mNumChannels; ++i) {
        const aiNodeAnim& c = *clip->mChannels[i];
        if (c.mNodeName != node.mName) continue;
        const double ticks = seconds * (clip->mTicksPerSecond > 0 ? clip->mTicksPerSecond : 25);
        return Compose(SampleChannel(c, ticks, {}));
    }
    return node.mTransformation;
}

aiMatrix4x4 WorldAt(const aiNode* node, const aiAnimation* clip, double seconds) {
    return node ? WorldAt(node->mParent, clip, seconds) * LocalAt(*node, clip, seconds) : aiMatrix4x4();
}

const aiNode* HolderOf(const aiNode* node, unsigned mesh) {
    if (std::count(node->mMeshes, node->mMeshes + node->mNumMeshes, mesh)) return node;
    for (unsigned i = 0; i < node->mNumChildren; ++i)
        if (const aiNode* found = HolderOf(node->mChildren[i], mesh)) return found;
    return nullptr;
}

struct Skinned {
    aiVector3D position;
    float tolerance;  // what weights rounded to bytes may move it
};
using Place = std::array<float, 3>;

// Where each vertex is at a time, by its place in the file; there may be several in one place.
std::multimap<Place, Skinned> SkinAt(const aiScene& scene, const aiAnimation* clip, double seconds) {
    std::multimap<Place, Skinned> out;
    for (unsigned m = 0; m < scene.mNumMeshes; ++m) {
        const aiMesh& mesh = *scene.mMeshes[m];
        std::vector<std::vector<std::pair<float, aiVector3D>>> moved(mesh.mNumVertices);
        for (const aiBone* b : std::vector<aiBone*>(mesh.mBones, mesh.mBones + mesh.mNumBones)) {
            const aiNode* node = scene.mRootNode->FindNode(b->mName);
            if (!node || b->mOffsetMatrix.Determinant() == 0) continue;
            const aiMatrix4x4 bone = WorldAt(node, clip, seconds) * b->mOffsetMatrix;
            for (const aiVertexWeight* w = b->mWeights; w != b->mWeights + b->mNumWeights; ++w)
                if (w->mWeight > 0)
                    moved[w->mVertexId].push_back({w->mWeight, bone * mesh.mVertices[w->mVertexId]});
        }
        for (unsigned v = 0; v < mesh.mNumVertices; ++v) {
            auto& list = moved[v];
            const auto more = [](const auto& a, const auto& b) { return a.first > b.first; };
            std::stable_sort(list.begin(), list.end(), more);
            list.resize(std::min<size_t>(list.size(), 4));
            if (list.empty())
                list = {{1.0f, WorldAt(HolderOf(scene.mRootNode, m), clip, seconds) * mesh.mVertices[v]}};
            float sum = 0;
            for (const auto& influence : list) sum += influence.first;
            Skinned skinned = {{}, 0};
            for (const auto& [weight, position] : list) {
                skinned.position += position * (weight / sum);
                skinned.tolerance += (position - list[0].second).Length() / 255;
            }
            const aiVector3D& p = mesh.mVertices[v];
            out.insert({{p.x, p.y, p.z}, skinned});
        }
    }
    return out;
}

// Where the engine's bone matrices carry a vertex of a batch with these bones.
aiVector3D Move(QexPODModel* scene, QexPODNode* node, const int32_t* bones, uint32_t vertex) {
    const QexPODMesh& mesh = scene->meshes[node->objectIndex];
    const QexVec4 position = VertexValue(mesh, mesh.vertices, vertex),
                  index = VertexValue(mesh, mesh.boneIndices, vertex),
                  weight = VertexValue(mesh, mesh.boneWeights, vertex);
    EXPECT_NEAR(weight.x + weight.y + weight.z + weight.w, 1, 1e-6);
    aiVector3D sum;
    for (int k = 0; k < 4; ++k) {
        QexMatrix matrix;
        QexVec4 moved;
        QexPODModel_GetBoneWorldMatrix(scene, &matrix, node, &scene->nodes[bones[int((&index.x)[k])]]);
        QexMatrix_TransformVec4(&matrix, &position, &moved);
        sum += aiVector3D(moved.x, moved.y, moved.z) * (&weight.x)[k];
    }
    return sum;
}

// Compares every vertex of every skinned mesh at a frame with those of `expected`; returns their number.
size_t ExpectSkinned(QexPODModel* scene, float frame, const std::multimap<Place, Skinned>& expected,
                     float precision) {
    size_t count = 0;
    QexPODModel_SetFrame(scene, frame);
    for (uint32_t n = 0; n < scene->meshNodeCount; ++n) {
        QexPODNode* node = &scene->nodes[n];
        const QexPODMesh& mesh = scene->meshes[node->objectIndex];
        const QexBoneBatches& batches = mesh.boneBatches;
        EXPECT_TRUE(mesh.skinned);
        for (uint32_t i = 0; i < 3 * mesh.faceCount; ++i, ++count) {
            const uint32_t vertex = VertexOfCorner(mesh, i);
            const int32_t* bones = &batches.boneTable[BatchOfTriangle(batches, i / 3) * batches.maxBones];
            const aiVector3D moved = Move(scene, node, bones, vertex);
            const QexVec4 place = VertexValue(mesh, mesh.vertices, vertex);
            const auto [begin, end] = expected.equal_range({place.x, place.y, place.z});
            const auto near = [&](const auto& e) {
                return (moved - e.second.position).Length() <= e.second.tolerance + precision;
            };
            if (std::any_of(begin, end, near)) continue;
            ADD_FAILURE() << "node " << n << " vertex " << vertex << " frame " << frame;
            return 0;
        }
    }
    return count;
}

class ConvertSkin : public ConvertTest {
  protected:
    // Converts a scene made in the test.
    ExitStatus ConvertMade(const aiScene& scene, const SceneSettings& settings = {}) {
        ConvertLog log("made");
        TextureSet textures(&scene, Path("made"), folder_.string(), TextureFormat::kEtc1, &log);
        pod::Scene out;
        testing::internal::CaptureStderr();
        const ExitStatus status = ConvertScene(scene, settings, &textures, &log, &out, &error_);
        said_ = testing::internal::GetCapturedStderr();
        WriteBytes(Path("out.pod"), pod::WritePod(out));
        return status;
    }

    std::string error_;
};

// Characters of the system's packages against the importer's own matrices. The clip starts at frame 1.
TEST_F(ConvertSkin, CharactersMoveAsTheImporterSays) {
    const std::string models = "/usr/share/assimp/models/";
    const struct {
        const char *file, *clip;
        size_t triangles, nodes;
        float size;  // of the scene, about
    } rows[] = {{"X/Testwuson.X", "Wuson_Walk", 3732, 39, 3},
                {"X/Testwuson.X", "0", 3732, 39, 3},
                {"X/BCN_Epileptic.X", "", 5126, 57, 2},
                {"FBX/animation_with_skeleton.fbx", "", 2112, 20, 7000},
                {"glTF2/simple_skin/simple_skin.gltf", "", 8, 3, 2}};
    for (const auto& row : rows) {
        const std::string file = models + row.file;
        if (!std::filesystem::exists(file)) GTEST_SKIP() << file << " is not installed";
        Assimp::Importer importer;
        const aiScene* scene = importer.ReadFile(file, aiProcess_Triangulate);
        ASSERT_TRUE(scene);
        const aiAnimation* clip = scene->mAnimations[std::string(row.clip) == "Wuson_Walk" ? 1 : 0];
        QexPODModel& pod = Convert(file, TextureFormat::kEtc1, 30, row.clip);
        ASSERT_GT(pod.frameCount, 20u);
        EXPECT_EQ(pod.nodeCount, row.nodes) << file;  // the bones are nodes of the file
        std::set<float> seen;
        for (const uint32_t frame : {1u, 2u, 9u, pod.frameCount / 2, pod.frameCount - 2}) {
            const auto expected = SkinAt(*scene, clip, (frame - 1) / 30.0);
            EXPECT_EQ(ExpectSkinned(&pod, float(frame), expected, 2e-5f * row.size), 3 * row.triangles)
                << file;
            seen.insert(expected.rbegin()->second.position.x + expected.begin()->second.position.y);
        }
        EXPECT_GE(seen.size(), 2u) << file << " does not move";
    }
}

// A root with nodes "a" and "b", b below a, and one mesh node of triangles for each list of bones, a larger
// one each time.
struct MadeBone {
    const char* node;
    aiMatrix4x4 offset;
    std::vector<aiVertexWeight> weights;
};

// The scene's records own arrays that they delete themselves.
template <class T>
T* Array(const std::vector<T>& values, unsigned* count) {
    *count = unsigned(values.size());
    T* array = new T[values.size()];
    std::copy(values.begin(), values.end(), array);
    return array;
}

// Over two seconds "a" turns and "b" moves.
aiAnimation* MakeClip(const aiQuaternion& turn) {
    const auto channel = [](const char* name, float x, const aiQuaternion& turned) {
        aiNodeAnim* c = new aiNodeAnim;
        c->mNodeName = name;
        c->mPositionKeys = Array<aiVectorKey>({{0, {0, 1, 0}}, {2, {x, 1, 0}}}, &c->mNumPositionKeys);
        c->mRotationKeys = Array<aiQuatKey>({{0, aiQuaternion()}, {2, turned}}, &c->mNumRotationKeys);
        c->mScalingKeys = Array<aiVectorKey>({{0, aiVector3D(1)}}, &c->mNumScalingKeys);
        return c;
    };
    aiAnimation* clip = new aiAnimation;
    clip->mTicksPerSecond = 1;
    clip->mDuration = 2;
    clip->mChannels = Array<aiNodeAnim*>({channel("a", 0, turn), channel("b", 3, {})}, &clip->mNumChannels);
    return clip;
}

std::unique_ptr<aiScene> MakeScene(const std::vector<std::vector<MadeBone>>& meshes,
                                   const std::vector<aiVector3D>& corners = {
                                       {1, 0, 0}, {0, 1, 0}, {0, 0, 1}}) {
    auto scene = std::make_unique<aiScene>();
    const aiVector3D one(1, 1, 1);
    const auto node = [](const char* name, aiNode* parent, const aiMatrix4x4& matrix) {
        aiNode* n = new aiNode(name);
        n->mTransformation = matrix;
        if (parent) parent->addChildren(1, &n);
        return n;
    };
    const aiQuaternion tilt(aiVector3D(1, 2, 3).Normalize(), 0.4f);
    scene->mRootNode = node("root", nullptr, aiMatrix4x4({2, 1, 1}, tilt, {5, 0, 0}));
    aiNode* a = node("a", scene->mRootNode, aiMatrix4x4(one, tilt, {0, 1, 0}));
    node("b", a, aiMatrix4x4(one, tilt, {0, 2, 0}));
    scene->mMeshes = Array(std::vector<aiMesh*>(meshes.size()), &scene->mNumMeshes);
    for (unsigned m = 0; m < meshes.size(); ++m) {
        aiMesh* mesh = scene->mMeshes[m] = new aiMesh;
        mesh->mName = "mesh" + std::to_string(m);
        mesh->mPrimitiveTypes = aiPrimitiveType_TRIANGLE;
        mesh->mVertices = Array(corners, &mesh->mNumVertices);
        for (size_t i = 0; i < corners.size(); ++i) mesh->mVertices[i] *= 1 + float(m);
        mesh->mFaces = new aiFace[mesh->mNumFaces = mesh->mNumVertices / 3];
        for (unsigned f = 0; f < mesh->mNumFaces; ++f)
            mesh->mFaces[f].mIndices =
                Array<unsigned>({3 * f, 3 * f + 1, 3 * f + 2}, &mesh->mFaces[f].mNumIndices);
        std::vector<aiBone*> bones;
        for (const MadeBone& from : meshes[m]) {
            aiBone* bone = bones.emplace_back(new aiBone);
            bone->mName = from.node;
            bone->mOffsetMatrix = from.offset;
            bone->mWeights = Array(from.weights, &bone->mNumWeights);
        }
        mesh->mBones = Array(bones, &mesh->mNumBones);
        aiNode* holder =
            node(mesh->mName.C_Str(), scene->mRootNode, aiMatrix4x4(one, tilt, {0, 0, float(m)}));
        holder->mMeshes = Array<unsigned>({m}, &holder->mNumMeshes);
    }
    scene->mAnimations = Array<aiAnimation*>({MakeClip(tilt)}, &scene->mNumAnimations);
    return scene;
}

// Bind poses that one skeleton cannot hold are all kept: meshes put the same bone in several places, a bone
// shears in its parent, and its own pose is far from all of them. Weights that mean nothing are left out and
// told.
TEST_F(ConvertSkin, BadWeightsAndBonesAreDefinedAndTold) {
    const float nan = NAN, inf = INFINITY;
    std::vector<MadeBone> bones;
    // Six bones of vertex 0, different by their offsets; the two least of them fall away.
    for (int i = 0; i < 6; ++i) {
        aiMatrix4x4 offset;
        offset.a4 = float(i);
        bones.push_back({i % 2 ? "a" : "b", offset, {{0, 0.1f + 0.1f * float(i)}}});
    }
    bones.push_back(
        {"a", {}, {{1, nan}, {1, inf}, {1, -1.0f}, {99, 1}}});     // vertex 1 is left without a weight
    bones.push_back({"b", {}, {{2, 1e38f}, {2, 3e38f}, {2, 0}}});  // and 2 has the same bone twice
    bones.push_back({"gone", {}, {{1, 1}}});
    bones.push_back({"a", aiMatrix4x4({0, 1, 1}, aiQuaternion(), {}), {{1, 1}}});
    const aiMatrix4x4 moved({1, 1, 1}, aiQuaternion(aiVector3D(0, 0, 1), 0.7f), {3, 4, 5});
    aiMatrix4x4 sheared;
    sheared.a2 = 0.5f;
    auto scene = MakeScene({{{"a", moved, {{0, 1}, {1, 0.5f}}}, {"b", {}, {{1, 0.5f}, {2, 1}}}},
                            {{"a", moved, {{0, 1}, {1, 0.3f}}}, {"b", moved * moved, {{1, 0.7f}, {2, 1}}}},
                            {{"b", sheared, {{0, 1}, {1, 1}, {2, 0.2f}}}, {"a", {}, {{2, 0.8f}}}},
                            bones});
    ASSERT_EQ(ConvertMade(*scene), kDone) << error_;
    EXPECT_EQ(CountLines(said_), 4) << said_;
    for (const char* line :
         {": 2 bones without a node", ": 4 bone weights", ": 1 vertex of more than four bones",
          ": 1 vertex of skinned meshes without weights"})
        EXPECT_TRUE(Contains(said_, line)) << said_;

    // The reference takes no weights that are not numbers, either.
    scene->mMeshes[3]->mBones[6]->mNumWeights = 0;
    scene->mMeshes[3]->mBones[7]->mNumWeights = 1;
    for (const unsigned channels : {2u, 0u}) {
        if (!channels) {
            scene->mAnimations[0]->mNumChannels = channels;
            ASSERT_EQ(ConvertMade(*scene), kDone) << error_;
        }
        QexPODModel& pod = Read();
        for (const uint32_t frame : {1u, 30u, 60u}) {
            const auto expected = SkinAt(*scene, scene->mAnimations[0], (frame - 1) / 30.0);
            EXPECT_EQ(ExpectSkinned(&pod, float(frame), expected, 1e-4f), 12u);
        }
    }
    scene->mAnimations[0]->mNumChannels = 2;

    // A mesh that keeps none of its bones stands still.
    scene = MakeScene({{{"gone", {}, {{0, 1}}}}});
    ASSERT_EQ(ConvertMade(*scene), kDone);
    const QexPODModel& still = Read();
    EXPECT_FALSE(still.meshes[0].skinned);
    EXPECT_EQ(still.nodes[0].parentIndex, 1);
}

// Two triangles with an edge in common.
TEST_F(ConvertSkin, JoinsVerticesThatFollowTheSameBones) {
    for (const char* other : {"a", "b"}) {
        const auto scene =
            MakeScene({{{"a", {}, {{0, 1}, {1, 1}, {2, 1}}}, {other, {}, {{3, 1}, {4, 1}, {5, 1}}}}},
                      {{0, 0, 0}, {1, 0, 0}, {0, 1, 0}, {0, 1, 0}, {1, 0, 0}, {1, 1, 0}});
        ASSERT_EQ(ConvertMade(*scene), kDone) << error_;
        const QexPODMesh& mesh = Read().meshes[0];
        EXPECT_EQ(mesh.vertexCount, *other == 'a' ? 4u : 6u);
        EXPECT_EQ(mesh.faceCount, 2u);
        EXPECT_EQ(mesh.boneBatches.maxBones, *other == 'a' ? 1 : 2);
    }
}

TEST_F(ConvertSkin, MaxBonesHasToHoldATriangle) {
    const auto scene =
        MakeScene({{{"root", {}, {{0, 1}}}}, {{"a", {}, {{0, 1}, {1, 1}}}, {"b", {}, {{1, 1}, {2, 1}}}}});
    SceneSettings settings;
    settings.maxBones = 1;
    EXPECT_EQ(ConvertMade(*scene, settings), kBadArgument);
    EXPECT_EQ(error_, "a triangle of mesh 'mesh1' follows 2 bones; --max-bones 2 or more is expected");
}

TEST_F(ConvertSkin, ClipsAreListedAndChosen) {
    auto scene = MakeScene({});
    aiAnimation* clips[] = {scene->mAnimations[0], new aiAnimation, new aiAnimation};
    delete[] scene->mAnimations;
    scene->mAnimations = Array<aiAnimation*>({clips[0], clips[1], clips[2]}, &scene->mNumAnimations);
    clips[0]->mName = "walk\n";
    clips[1]->mName = "2";
    testing::internal::CaptureStdout();
    ListClips(*scene);
    EXPECT_EQ(testing::internal::GetCapturedStdout(), "0\twalk?\t2.000\t2\n1\t2\t0.000\t0\n2\t\t0.000\t0\n");
    std::string error;
    const std::pair<const char*, int> rows[] = {{"walk\n", 0}, {"0", 0}, {"1", 1}, {"2", 1}};
    for (const auto& [wanted, index] : rows) EXPECT_EQ(FindClip(*scene, wanted, &error), index) << wanted;
    EXPECT_EQ(error, "");
    for (const char* wanted : {"3", "Walk", "01", "-1"}) {
        EXPECT_EQ(FindClip(*scene, wanted, &error), -1);
        EXPECT_EQ(error, std::string("no animation '") + wanted + "'; expected one of: 0 walk?, 1 2, 2");
    }
}

}  // namespace
