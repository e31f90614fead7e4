// What reading a scene refuses, each with its line, and what it puts right.
#include <gtest/gtest.h>

#include <functional>

#include "support/PodScenes.h"
#include "support/WalkScene.h"

namespace {

using everything::kHip;
using everything::kKnee;
using pod::IndexElement;
using pod::Mesh;
using pod::Scene;

bool Has(const std::string& text, const std::string& part) {
    return text.find(part) != std::string::npos;
}

uint8_t& BoneOf(Mesh& mesh, size_t vertex) {
    return mesh.vertexBlock[vertex * mesh.boneIndices.stride + mesh.boneIndices.offset];
}

struct Refusal {
    const char* line;
    std::function<void(Scene&, Mesh&)> damage;  // of the scene, and of its first mesh
};

// clang-format off
const Refusal kRefusals[] = {
    {"node 0: it draws mesh 3 of 3", [](Scene& s, Mesh&) { s.nodes[0].object = 3; }},
    {"node 1: it draws mesh -1 of 3", [](Scene& s, Mesh&) { s.nodes[1].object = -1; }},
    {"node 6: its parent is node 11 of 11", [](Scene& s, Mesh&) { s.nodes[kHip].parent = 11; }},
    {"node 6: its parent is node -2 of 11", [](Scene& s, Mesh&) { s.nodes[kHip].parent = -2; }},
    {"node 6: its parents form a circle", [](Scene& s, Mesh&) { s.nodes[kHip].parent = kHip; }},
    {"its parents form a circle", [](Scene& s, Mesh&) { s.nodes[kHip].parent = kKnee; }},
    {"11 nodes, but 9 mesh nodes, 2 lights and 1 cameras", [](Scene& s, Mesh&) { s.meshNodeCount = 9; }},
    {"the scene counts 12 node records but holds 11", [](Scene& s, Mesh&) { s.counts.nodes = 12; }},
    {"4294967295 node records, more than the file can hold", [](Scene& s, Mesh&) { s.counts.nodes = UINT32_MAX; }},
    {"more node records than the 10", [](Scene& s, Mesh&) { s.counts.nodes = 10; }},

    {"positions of unknown type 18", [](Scene&, Mesh& m) { m.vertices.type = 18; }},
    {"normals of 5 components", [](Scene&, Mesh& m) { m.normals.components = 5; }},
    {"texture coordinates of 6 vertices reach byte", [](Scene&, Mesh& m) { m.uvw[0].offset += 21; }},
    {"tangents of 6 vertices reach byte 4294967", [](Scene&, Mesh& m) { m.tangents.offset = UINT32_MAX; }},
    {"binormals of 6 vertices reach byte", [](Scene&, Mesh& m) { m.binormals.stride = UINT32_MAX; }},
    {"colours of 4 bytes with a stride of 3", [](Scene&, Mesh& m) { m.colours.stride = 3; }},
    {"positions of 4 vertices reach byte 48 of 44", [](Scene& s, Mesh&) { s.meshes[1].vertices.data.resize(44); }},
    {"a mesh has more UV channels than the 1", [](Scene& s, Mesh&) { s.meshes[1].uvwCount = 1; }},
    {"a mesh has 9 UV channels, at most 8", [](Scene&, Mesh& m) { m.uvwCount = 9; }},

    {"mesh 0: a face uses vertex 6 of 6", [](Scene&, Mesh& m) { m.faces = IndexElement({0, 1, 2, 3, 4, 6}); }},
    {"a face uses vertex 70000 of 6", [](Scene&, Mesh& m) { m.faces = IndexElement({0, 1, 70000, 0, 2, 3}, true); }},
    {"its faces need 9 indices, it has 6", [](Scene&, Mesh& m) { m.faceCount = 3; }},
    {"more faces than can be drawn", [](Scene&, Mesh& m) { m.faceCount = 0x55555556; }},
    {"its faces need 9 vertices, it has 6", [](Scene&, Mesh& m) { m.faces = {}; m.faceCount = 3; }},
    {"its faces need 6 vertices, it has 0", [](Scene&, Mesh& m) { m.faces = {}; m.vertices = {}; }},
    {"face indices of type 10", [](Scene&, Mesh& m) { m.faces.type = pod::kUint8; }},
    {"its faces need 8 indices, it has 7", [](Scene& s, Mesh&) { s.meshes[2].stripLengths = {1, 3}; }},
    {"more faces than can be drawn", [](Scene& s, Mesh&) { s.meshes[2].stripLengths = {1, UINT32_MAX}; }},

    {"batch 0 has 3 bones of 2", [](Scene&, Mesh& m) { m.bonesPerBatch[0] = 3; }},
    {"batch 1 has -1 bones of 2", [](Scene&, Mesh& m) { m.bonesPerBatch[1] = -1; }},
    {"batch 0 covers faces 1 to 1 of 2", [](Scene&, Mesh& m) { m.batchOffsets = {1, 1}; }},
    {"batch 0 covers faces 0 to 3 of 2", [](Scene&, Mesh& m) { m.batchOffsets = {0, 3}; }},
    {"batch 0 covers faces 0 to 4294967295 of 2", [](Scene&, Mesh& m) { m.batchOffsets = {0, -1}; }},
    {"3 batches of 2 bones, but shorter tables", [](Scene&, Mesh& m) { m.batchCount = 3; }},
    {"2 batches of 3 bones, but shorter tables", [](Scene&, Mesh& m) { m.batchBoneMax = 3; }},
    {"-1 batches of 2 bones", [](Scene&, Mesh& m) { m.batchCount = -1; }},
    {"2147483647 batches of 2147483647 bones", [](Scene&, Mesh& m) { m.batchCount = m.batchBoneMax = INT32_MAX; }},
    {"4 bone indices, but 2 weights a vertex", [](Scene&, Mesh& m) { m.boneWeights.components = 2; }},
    // The second batch has one bone; vertex 4 follows its second. A normalised type changes nothing.
    {"vertex 4 follows bone 1 of a batch of 1", [](Scene&, Mesh& m) { BoneOf(m, 4) = 1; }},
    {"vertex 4 follows bone 1 of a batch of 1",
     [](Scene&, Mesh& m) { BoneOf(m, 4) = 1; m.boneIndices.type = pod::kUint8Norm; }},
};
// clang-format on

TEST(PodCheck, RefusesWhatCannotBeDrawn) {
    for (const Refusal& refusal : kRefusals) {
        Scene scene = everything::Scene();
        refusal.damage(scene, scene.meshes[0]);
        const LoadedPod loaded(scene);
        EXPECT_EQ(loaded.result, -1) << refusal.line;
        EXPECT_EQ(loaded.scene.runtime, nullptr) << refusal.line;
        EXPECT_TRUE(Has(loaded.Error(), refusal.line)) << refusal.line << "\n" << loaded.Error();
    }
    // What is refused is not put right before.
    Scene odd = everything::Scene();
    odd.nodes[kHip].positions.resize(9);
    odd.nodes[kKnee].parent = 11;
    EXPECT_FALSE(Has(LoadedPod(odd).log, "fewer keys"));
    // World matrices are found by recursion, so the depth has a limit.
    for (const int32_t generations : {1000, 1100}) {
        Scene scene;
        for (int32_t i = 0; i < generations; ++i) scene.nodes.push_back(pod::BuildNode("n", {}, i - 1));
        const LoadedPod loaded(scene);
        EXPECT_EQ(loaded.result, generations == 1000 ? 0 : -1);
        EXPECT_EQ(Has(loaded.Error(), "or more than 1000 of them"), generations != 1000) << loaded.log;
    }
}

// Indices of what is not there count as none, with one line a kind. What they would have led to is left out.
TEST(PodCheck, DanglingIndicesAreNone) {
    Scene scene = everything::Scene();
    scene.nodes[0].material = 2;
    scene.nodes[1].material = INT32_MIN;
    scene.nodes[7].material = -2;  // a light draws nothing
    for (int i = 0; i < 10; ++i) (&scene.materials[1].diffuseTexture)[i] = i % 2 ? 2 : -2;
    scene.cameras[0].target = 11;
    scene.lights[1].target = -5;
    scene.meshes[0].batchBones[1] = 11;
    LoadedPod loaded(scene);
    ASSERT_EQ(loaded.result, 0) << loaded.log;
    for (const char* line : {"2 node(s) name a material", "10 texture(s) that materials name",
                             "1 camera(s) have a target", "1 light(s) have a target", "1 bone(s) of batches"})
        EXPECT_TRUE(Has(loaded.log, line)) << line << loaded.log;
    EXPECT_EQ(loaded.scene.nodes[0].materialIndex, -1);
    EXPECT_EQ(loaded.scene.materials[1].bumpTexture, -1);
    EXPECT_EQ(loaded.scene.cameras[0].targetIndex, -1);
    EXPECT_EQ(loaded.scene.lights[1].targetIndex, -1);
    EXPECT_EQ(loaded.scene.meshes[0].boneBatches.boneTable[1], -1);
    EXPECT_EQ(SceneWalk(&loaded.scene).fault, nullptr);
}

TEST(PodCheck, RefusesBlocksThatContradictEachOther) {
    const auto own = [](PodBlocks& b) {
        b.Begin(6006).Words(9000, {1}).Words(9001, {3}).Words(9002, {12}).Floats(9003, {1, 2, 3}).End(6006);
    };
    const struct {
        const char* line;  // null: it loads
        std::function<void(PodBlocks&)> blocks;
    } cases[] = {
        // clang-format off
        {"interleaved block comes after its elements", [&](PodBlocks& b) { own(b), b.Floats(6014, {1, 2, 3}); }},
        {"two interleaved blocks", [](PodBlocks& b) { b.Floats(6014, {1}).Floats(6014, {1}); }},
        {"counts its UV channels twice", [](PodBlocks& b) { b.Words(6002, {1}).Words(6002, {1}); }},
        {"counts its mesh records twice", [](PodBlocks& b) { b.End(2012).Words(2004, {1}).Begin(2012); }},
        {"more mesh records than the 1", [](PodBlocks& b) { b.End(2012).Begin(2012); }},
        {"block 6000 holds 2 bytes instead of 4", [](PodBlocks& b) { b.Bytes(6000, "xy", 2); }},
        {"1 strips, but 0 strip lengths", [](PodBlocks& b) { b.Words(6005, {1}); }},
        // Elements read twice keep the later data, and what was read before is not lost.
        {nullptr, [&](PodBlocks& b) { own(b), own(b); }},
        // Data shorter than one component is none, so a block may still follow.
        {nullptr, [](PodBlocks& b) { b.Begin(6006).Bytes(9003, "x", 1).End(6006).Floats(6014, {1, 2, 3}); }},
        // clang-format on
    };
    for (const auto& c : cases) {
        PodBlocks file;
        file.Version().Begin(1001).Words(2004, {1}).Begin(2012).Words(6000, {1});
        c.blocks(file);
        const LoadedPod loaded(file.End(2012).End(1001).bytes);
        EXPECT_EQ(loaded.result, c.line ? -1 : 0) << loaded.log;
        EXPECT_TRUE(Has(loaded.Error(), c.line ? c.line : "")) << c.line << "\n" << loaded.log;
    }
}

// Four frames. Each damage leaves keys that tell frames 0 and 1 apart; from there on the last good one holds.
TEST(PodCheck, KeysForTooFewFramesHoldTheLast) {
    const struct {
        const char* line;
        std::function<void(pod::Node&)> damage;
        uint32_t lastFrame;  // whose key frame 3 shows
    } cases[] = {
        // clang-format off
        {"position has fewer keys than frames; it holds the last key", [](pod::Node& n) { n.positions.resize(9); }, 2},
        {"rotation has fewer keys than frames; it holds the last key", [](pod::Node& n) { n.rotations.resize(12); }, 2},
        {"scale has fewer keys than frames; it holds the last key", [](pod::Node& n) { n.scales.resize(14); }, 1},
        {"position has fewer key indices than frames", [](pod::Node& n) { n.positionIndex = {0, 3, 6}; }, 2},
        {"rotation has key indices beyond its keys", [](pod::Node& n) { n.rotationIndex = {0, 4, 8, 13}; }, 3},
        {"scale has key indices beyond its keys", [](pod::Node& n) { n.scaleIndex = {0, 7, 14, UINT32_MAX}; }, 3},
        // The last scale key may be cut short after the three floats that count.
        {nullptr, [](pod::Node& n) { n.scales.resize(3 * 7 + 3); }, 3},
        // clang-format on
    };
    const auto local = [](LoadedPod* loaded, float frame) {
        QexMatrix t, r, s;
        QexPODNode* hip = &loaded->scene.nodes[kHip];
        QexPODModel_SetNodeAnimationFrame(&loaded->scene, kHip, frame);
        QexPODModel_GetTranslationMatrix(&loaded->scene, &t, hip);
        QexPODModel_GetRotationMatrix(&loaded->scene, &r, hip);
        QexPODModel_GetScalingMatrix(&loaded->scene, &s, hip);
        return std::vector<std::vector<float>>{{t.m, t.m + 16}, {r.m, r.m + 16}, {s.m, s.m + 16}};
    };
    LoadedPod whole(everything::Scene());
    for (const auto& c : cases) {
        Scene scene = everything::Scene();
        c.damage(scene.nodes[kHip]);
        LoadedPod loaded(scene);
        ASSERT_EQ(loaded.result, 0) << loaded.log;
        EXPECT_EQ(Has(loaded.log, std::string("node 6: ") + (c.line ? c.line : "")), c.line != nullptr)
            << loaded.log;
        const size_t channel = !c.line || *c.line == 's' ? 2 : *c.line == 'p' ? 0 : 1;
        EXPECT_EQ(local(&loaded, 1)[channel], local(&whole, 1)[channel]) << c.line;
        EXPECT_EQ(local(&loaded, 3)[channel], local(&whole, static_cast<float>(c.lastFrame))[channel])
            << c.line;
        EXPECT_EQ(SceneWalk(&loaded.scene).fault, nullptr) << loaded.log;
    }
    Scene scene = everything::Scene();
    scene.nodes[kHip].positions.resize(2);
    LoadedPod none(scene);
    EXPECT_TRUE(Has(none.log, "node 6: position has not even one key; it stands still")) << none.log;
    EXPECT_EQ(none.scene.nodes[kHip].animationFlags, 6u);
}

TEST(PodCheck, OddCamerasAndBonesArePutRight) {
    Scene scene = everything::Scene();
    scene.cameras[0].animatedFov.pop_back();
    LoadedPod loaded(scene);
    ASSERT_EQ(loaded.result, 0);
    EXPECT_TRUE(Has(loaded.log, "camera 0: fewer fields of view than frames"));
    float position[3], target[3];
    EXPECT_EQ(QexPODModel_GetCameraPos(&loaded.scene, position, target, 0), 0.8f);

    const QexPODMesh& mesh = loaded.scene.meshes[0];
    for (uint32_t v = 0; v < 6; ++v) {
        const QexVec4 bones = VertexValue(mesh, mesh.boneIndices, v);
        EXPECT_EQ(bones.z, 0) << "bone 99 without weight";
        EXPECT_EQ(bones.y, v < 3 ? 1 : 0);
    }
    // Strips of batched bones, and vertices without batches that follow no node, are drawn as they are.
    for (const bool strips : {false, true}) {
        scene = everything::Scene();
        Mesh& changed = scene.meshes[0];
        if (strips)
            changed.stripLengths = {1, 1};
        else
            changed.batchCount = changed.batchBoneMax = 0, BoneOf(changed, 4) = 11;
        const LoadedPod still(scene);
        ASSERT_EQ(still.result, 0) << still.log;
        EXPECT_EQ(still.scene.meshes[0].skinned, 0u);
        EXPECT_TRUE(Has(still.log, strips ? "mesh 0: follows bones, but is not a list of indexed triangles"
                                          : "no bone batches, and vertex 4 follows what is no node"))
            << still.log;
    }
}

}  // namespace
