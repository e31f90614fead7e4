// Bone batching: the containers, small meshes worked out by hand, and what must hold for any mesh.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <random>
#include <set>
#include <vector>

#include "Qex.h"
#include "support/PodScenes.h"
#include "support/WalkScene.h"

namespace {

struct Vertex {
    uint32_t number;  // that nothing changes
    uint8_t bones[4];
    float weights[4];
};

struct Batched {
    int32_t result;
    QexBoneBatches batches = {};
    uint32_t vertexCount = 0;
    void* block = nullptr;
    std::vector<uint32_t> indices;

    Batched(const std::vector<Vertex>& vertices, std::vector<uint32_t> triangles, int32_t maxBones,
            uint32_t perVertex = 4)
        : indices(std::move(triangles)) {
        result = QexBoneBatches_Create(&batches, &vertexCount, &block, indices.data(),
                                       static_cast<uint32_t>(vertices.size()), vertices.data(),
                                       sizeof(Vertex), offsetof(Vertex, weights), QEX_POD_FLOAT,
                                       offsetof(Vertex, bones), QEX_POD_UNSIGNED_BYTE,
                                       static_cast<uint32_t>(indices.size() / 3), maxBones, perVertex);
    }
    ~Batched() {
        QexBoneBatches_Release(&batches);
        QexMemory_Free(block);
    }
    Batched(const Batched&) = delete;
    Batched& operator=(const Batched&) = delete;

    const Vertex& At(size_t corner) const { return static_cast<const Vertex*>(block)[indices[corner]]; }
    std::vector<int32_t> Bones(int32_t batch) const {
        const int32_t* row = batches.boneTable + batch * batches.maxBones;
        return {row, row + batches.bonesPerBatch[batch]};
    }
};

// One vertex for each set of bones, all of the same weight.
std::vector<Vertex> Vertices(const std::vector<std::vector<int>>& bones) {
    std::vector<Vertex> vertices;
    for (const auto& set : bones) {
        Vertex v = {static_cast<uint32_t>(vertices.size()), {9, 9, 9, 9}, {0, 0, 0, 0}};
        for (size_t i = 0; i < set.size(); ++i) {
            v.bones[i] = static_cast<uint8_t>(set[i]);
            v.weights[i] = 1.0f / static_cast<float>(set.size());
        }
        vertices.push_back(v);
    }
    return vertices;
}

TEST(BoneBatch, SetsOfBones) {
    CBatch a, b, c;
    CBatch_Constructor(&a);
    EXPECT_EQ(CBatch_Add(&a, 1), 0) << "no room yet";
    CBatch_SetSize(&a, 4);
    for (const int bone : {1, 2, 3, 2}) EXPECT_EQ(CBatch_Add(&a, bone), 1);
    EXPECT_EQ(CBatch_Add(&a, -1), 0);
    CBatch_CopyConstructor(&b, &a);
    EXPECT_TRUE(b.capacity == 4 && b.count == 3 && CBatch_Contains(&a, &b) && CBatch_Contains(&b, &a));
    CBatch_Clear(&b);
    EXPECT_EQ(CBatch_Contains(&a, &b), 1) << "an empty set is in every one";
    CBatch_Add(&b, 3);
    CBatch_Add(&b, 4);
    EXPECT_EQ(CBatch_TestMerge(&a, &b), 1);
    CBatch_Add(&b, 5);
    EXPECT_EQ(CBatch_TestMerge(&a, &b), -1);
    CBatch_Merge(&a, &b);
    EXPECT_TRUE(CBatch_ContainsIdx(&a, 4) && !CBatch_ContainsIdx(&a, 5)) << "as far as there is room";
    float indices[] = {3, 2, 7, 4};
    const float weights[] = {0.5f, 0, 0.1f, 0.4f};
    CBatch_GetVertexBoneIndices(&a, indices, weights, 4);
    EXPECT_TRUE(indices[0] == 2 && indices[1] == 0 && indices[2] == 7 && indices[3] == 3);
    CBatch_CopyConstructor(&c, &a);
    int32_t written[4], count = 0;
    CBatch_Write(&c, written, &count);
    EXPECT_TRUE(count == 4 && written[0] == 1 && written[3] == 4);
    for (CBatch* batch : {&a, &b, &c}) CBatch_Destructor(batch);
}

TEST(BoneBatch, GrowingArrays) {
    CGrowableArray array;
    CGrowableArray_Constructor(&array, 8);
    EXPECT_EQ(CGrowableArray_last(&array), nullptr);
    std::vector<uint64_t> values = {10, 11, 12};
    for (int i = 0; i < 100; ++i) CGrowableArray_Append(&array, values.data(), 3);
    uint64_t value = 0;
    std::memcpy(&value, CGrowableArray_at(&array, 298), 8);
    EXPECT_TRUE(CGrowableArray_size(&array) == 300 && value == 11);
    std::memcpy(&value, CGrowableArray_last(&array), 8);
    EXPECT_EQ(value, 12u);
    void* block = nullptr;
    EXPECT_EQ(CGrowableArray_Surrender(&array, &block), 300u);
    EXPECT_TRUE(block && CGrowableArray_size(&array) == 0);
    QexMemory_Free(block);
    CGrowableArray_Destructor(&array);

    CStdVectorInt vector;
    CStdVectorInt_Constructor(&vector, 16);
    for (int i = 0; i < 15; ++i) CStdVectorInt_PushBack(&vector, i);
    EXPECT_EQ(vector.capacity, 16u);
    CStdVectorInt_PushBack(&vector, 15);
    EXPECT_TRUE(vector.capacity == 80 && CStdVectorInt_Size(&vector) == 16 &&
                CStdVectorInt_At(&vector, 15) == 15);
    CStdVectorInt_Destructor(&vector);
    EXPECT_TRUE(!vector.data && !vector.size && !vector.capacity);
}

TEST(BoneBatch, SmallMeshesByHand) {
    const Batched one(Vertices({{3, 5, 7}, {5}, {7, 3}, {3}}), {0, 1, 2, 2, 1, 3}, 4);
    ASSERT_EQ(one.batches.batchCount, 1);
    EXPECT_EQ(one.Bones(0), (std::vector<int32_t>{3, 5, 7}));
    EXPECT_EQ(one.indices, (std::vector<uint32_t>{0, 1, 2, 2, 1, 3}));
    // {1} starts a batch, {2} another, {1, 3} widens the first, {4, 2} the second; {3} fits into the first.
    const Batched grown(Vertices({{1}, {2}, {1, 3}, {4, 2}, {3}}),
                        {0, 0, 0, 1, 1, 1, 2, 0, 0, 3, 1, 1, 4, 4, 4}, 2);
    ASSERT_EQ(grown.batches.batchCount, 2);
    EXPECT_EQ(grown.Bones(0), (std::vector<int32_t>{1, 3}));
    EXPECT_EQ(grown.Bones(1), (std::vector<int32_t>{4, 2}));
    EXPECT_EQ(grown.batches.offsets[1], 3);
    EXPECT_EQ(grown.At(6).number, 4u) << "the third triangle of the first batch";
    EXPECT_EQ(grown.At(6).bones[0], 1);
    // A vertex of two batches is there twice where its bone has another place in each.
    const Batched shared(Vertices({{1}, {2}, {3}}), {1, 0, 0, 0, 2, 2}, 2);
    EXPECT_EQ(shared.vertexCount, 4u);

    const std::vector<Vertex> three = Vertices({{1}, {2}, {3}});
    const uint32_t refusals[][3] = {{4, 2, 2}, {0, 3, 2}, {5, 3, 2}, {4, 0, 2}, {4, 3, 3}};
    for (const auto& [perVertex, maxBones, last] : refusals) {
        const Batched refused(three, {0, 1, last}, static_cast<int32_t>(maxBones), perVertex);
        EXPECT_EQ(refused.result, -1);
        EXPECT_EQ(refused.indices, (std::vector<uint32_t>{0, 1, last}));
        EXPECT_EQ(refused.block, nullptr);
    }
}

// Eight gigabytes for the vertices are not to be had.
TEST(BoneBatch, RunningOutOfMemoryIsSaid) {
    QexBoneBatches batches;
    void* block = nullptr;
    uint32_t count = 0;
    Capture out(STDOUT_FILENO);
    EXPECT_EQ(QexBoneBatches_Create(&batches, &count, &block, nullptr, 0x7FFFFFFF, nullptr, 32, 0,
                                    QEX_POD_FLOAT, 16, QEX_POD_FLOAT, 0, 16, 4),
              -1);
    EXPECT_EQ(block, nullptr);
    EXPECT_NE(out.Text().find("Error: Out of memory at src/QexBoneBatches:"), std::string::npos);
}

// In the end: 513 sets without one in another are one batch too many.
TEST(BoneBatch, AnyMeshKeepsItsTriangles) {
    std::minstd_rand random(7);
    for (int round = 0; round < 30; ++round) {
        const int bones = 5 + round, maxBones = 12 + round % 5;
        std::vector<std::vector<int>> sets;
        for (int v = 0; v < 60; ++v) {
            std::set<int> set;
            for (uint32_t i = 0; i <= random() % 4; ++i) set.insert(int(random() % unsigned(bones)));
            sets.emplace_back(set.begin(), set.end());
        }
        const std::vector<Vertex> vertices = Vertices(sets);
        std::vector<uint32_t> triangles;
        for (int i = 0; i < 3 * 100; ++i) triangles.push_back(random() % 60);
        const Batched made(vertices, triangles, maxBones);
        ASSERT_EQ(made.result, 0);
        std::multiset<std::array<uint32_t, 3>> before, after;
        for (size_t t = 0; t < 300; t += 3) {
            before.insert({triangles[t], triangles[t + 1], triangles[t + 2]});
            const auto table = made.Bones(BatchOfTriangle(made.batches, static_cast<uint32_t>(t / 3)));
            after.insert({made.At(t).number, made.At(t + 1).number, made.At(t + 2).number});
            for (size_t corner = t; corner < t + 3; ++corner) {
                const Vertex& v = made.At(corner);
                const Vertex& source = vertices[v.number];
                for (int i = 0; i < 4; ++i) {
                    ASSERT_EQ(v.weights[i], source.weights[i]);
                    if (v.weights[i] == 0) continue;
                    ASSERT_LT(v.bones[i], table.size());
                    ASSERT_EQ(table[v.bones[i]], source.bones[i]);
                }
            }
        }
        EXPECT_EQ(before, after);
    }
    std::vector<std::vector<int>> pairs;
    std::vector<uint32_t> triangles;
    for (uint32_t i = 0; i < 513; ++i) {
        pairs.push_back({int(i % 16), 16 + int(i / 16)});
        triangles.insert(triangles.end(), {i, i, i});
    }
    EXPECT_EQ(Batched(Vertices(pairs), triangles, 2).result, -1);
    triangles.resize(512 * 3);
    EXPECT_EQ(Batched(Vertices(pairs), triangles, 2).batches.batchCount, 512);
}

// A mesh without batches whose 780 triangles follow 780 pairs of 40 nodes: as the batches that are made for
// it are joined, they need not be one for each pair. A vertex lies where its bone's number says.
TEST(BoneBatch, MadeAtLoadAreJoined) {
    pod::Scene scene;
    pod::MeshArrays arrays;
    for (uint8_t a = 0; a < 40; ++a) {
        scene.nodes.push_back(pod::BuildNode("n", {}, -1, a ? -1 : 0));
        for (uint8_t b = 0; b < a; ++b)
            for (const uint8_t bone : {a, b, a}) {
                arrays.indices.push_back(static_cast<uint32_t>(arrays.positions.size()));
                arrays.positions.push_back({static_cast<float>(bone), 0, 0});
                arrays.boneIndices.push_back({bone, 200, 0, 0});
                arrays.boneWeights.push_back({255, 0, 0, 0});
            }
    }
    scene.meshes = {pod::BuildMesh(arrays)};
    scene.meshNodeCount = 1;
    const LoadedPod loaded(scene);
    ASSERT_EQ(loaded.result, 0) << loaded.log;
    const QexPODMesh& mesh = loaded.scene.meshes[0];
    const QexBoneBatches& batches = mesh.boneBatches;
    ASSERT_EQ(mesh.skinned, 1u);
    EXPECT_GE(batches.batchCount, 7) << "at most 120 pairs to a batch of 16";
    EXPECT_LE(batches.batchCount, 30);
    for (int32_t b = 0; b < batches.batchCount; ++b) EXPECT_LE(batches.bonesPerBatch[b], 16);
    for (uint32_t corner = 0; corner < 3 * 780; ++corner) {
        const uint32_t vertex = VertexOfCorner(mesh, corner);
        const int32_t* bones = batches.boneTable + BatchOfTriangle(batches, corner / 3) * batches.maxBones;
        EXPECT_EQ(bones[int(VertexValue(mesh, mesh.boneIndices, vertex).x)],
                  VertexValue(mesh, mesh.vertices, vertex).x);
    }
}

}  // namespace
