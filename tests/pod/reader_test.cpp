#include <gtest/gtest.h>

#include "support/PodScenes.h"
#include "support/WalkScene.h"

namespace {

template <class Read, class Written>
void ExpectSame(const Read* read, const Written& written, const char* what) {
    if (written.empty()) return;
    ASSERT_NE(read, nullptr) << what;
    EXPECT_EQ(std::memcmp(read, written.data(), written.size() * sizeof(written[0])), 0) << what;
}

void ExpectSameElement(const CPODData& read, const pod::Element& written, bool interleaved,
                       const char* what) {
    EXPECT_EQ(read.componentCount, written.components) << what;
    if (!written.components) return;
    EXPECT_EQ(std::pair(read.type, read.stride), std::pair(written.type, written.stride)) << what;
    if (interleaved)
        EXPECT_EQ(reinterpret_cast<uintptr_t>(read.data), written.offset) << what;
    else
        ExpectSame(read.data, written.data, what);
}

void ExpectSameMesh(const QexPODMesh& read, const pod::Mesh& written) {
    const QexBoneBatches& batches = read.boneBatches;
    const size_t counts[][2] = {{read.vertexCount, written.vertexCount},
                                {read.faceCount, written.faceCount},
                                {read.uvwChannelCount, written.uvw.size()},
                                {read.stripCount, written.stripLengths.size()},
                                {read.skinned, written.batchCount ? 1u : 0u},
                                {size_t(batches.batchCount), size_t(written.batchCount)},
                                {size_t(batches.maxBones), size_t(written.batchBoneMax)}};
    for (const auto& count : counts) EXPECT_EQ(count[0], count[1]) << &count - counts;
    ExpectSameElement(read.faces, written.faces, false, "faces");
    // Both records have these in the same order, but for the UV channels.
    const CPODData* elements[] = {&read.vertices, &read.normals,     &read.tangents,   &read.binormals,
                                  &read.colours,  &read.boneIndices, &read.boneWeights};
    for (size_t i = 0; i < std::size(elements); ++i)
        ExpectSameElement(*elements[i], (&written.vertices)[i], written.interleaved, "element");
    for (size_t i = 0; i < written.uvw.size(); ++i)
        ExpectSameElement(read.uvws[i], written.uvw[i], written.interleaved, "uvw");
    ExpectSame(read.stripLengths, written.stripLengths, "strips");
    if (written.unpackMatrix) ExpectSame(read.unpackMatrix.m, *written.unpackMatrix, "unpack matrix");
    ExpectSame(batches.boneTable, written.batchBones, "bone table");
    ExpectSame(batches.bonesPerBatch, written.bonesPerBatch, "bones per batch");
    ExpectSame(batches.offsets, written.batchOffsets, "batch offsets");
}

void ExpectSameNode(const QexPODNode& read, const pod::Node& written) {
    SCOPED_TRACE(written.name);
    EXPECT_EQ(read.objectIndex, written.object);
    EXPECT_STREQ(read.name, written.name.c_str());
    EXPECT_EQ(read.materialIndex, written.material);
    EXPECT_EQ(read.parentIndex, written.parent);
    EXPECT_EQ(read.animationFlags, written.animationFlags.value_or(0));
    EXPECT_EQ(read.speed, 1.0f);
    EXPECT_EQ(read.stateFlags, 3u);
    ExpectSame(read.position, written.positions, "positions");
    ExpectSame(read.scale, written.scales, "scales");
    ExpectSame(read.matrix, written.matrices, "matrices");
    for (size_t i = 0; i < written.rotations.size(); ++i)
        EXPECT_EQ(read.rotation[i], i % 4 == 3 ? -written.rotations[i] : written.rotations[i]) << i;
    ExpectSame(read.positionIndex, written.positionIndex, "position index");
    ExpectSame(read.rotationIndex, written.rotationIndex, "rotation index");
    ExpectSame(read.scaleIndex, written.scaleIndex, "scale index");
    ExpectSame(read.matrixIndex, written.matrixIndex, "matrix index");
}

TEST(PodReader, EveryBlockIsStoredInItsField) {
    pod::Scene written = everything::Scene();
    written.textures.resize(12, "more.pvr");
    // clang-format off
    written.materials[0] = {"all", 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 0.5f, {1, 2, 3}, {4, 5, 6}, {7, 8, 9}, 0.25f,
                            "file", "name", 11, 12, 13, 14, 15, 16, {.1f, .2f, .3f, .4f}, {.5f, .6f, .7f, .8f}, 17};
    // clang-format on
    written.nodes[everything::kMatrices].matrixIndex = {48, 32, 16, 0};
    const MemoryFile file(pod::WritePod(written));
    QexPODModel scene;
    {
        BothOutputs quiet;
        ASSERT_EQ(QexPODModel_ReadFromFile(&scene, file.Path(), 0, 0, 0, 0), 0);
    }
    ASSERT_NE(scene.runtime, nullptr);

    const uint32_t head[] = {
        scene.meshNodeCount, scene.frameCount,   scene.framesPerSecond, scene.flags,     scene.cameraCount,
        scene.lightCount,    scene.textureCount, scene.materialCount,   scene.meshCount, scene.nodeCount};
    ASSERT_EQ(std::vector<uint32_t>(std::begin(head), std::end(head)),
              std::vector<uint32_t>({3, everything::kFrames, 24, 5, 1, 2, 12, 2, 3, everything::kNodes}));
    ExpectSame(scene.backgroundColour, written.background, "background");
    ExpectSame(scene.ambientColour, written.ambient, "ambient");
    const QexPODCamera& camera = scene.cameras[0];
    EXPECT_EQ(camera.targetIndex, everything::kHip);
    EXPECT_TRUE(camera.fov == 0.8f && camera.farPlane == 500 && camera.nearPlane == 0.5f);
    ExpectSame(camera.animatedFov, written.cameras[0].animatedFov, "animated field of view");
    // Neither record has padding, so the words of the light blocks follow each other in both.
    static_assert(sizeof(pod::Light) == 40 && sizeof(QexPODLight) == 40);
    ExpectSame(scene.lights, written.lights, "lights");
    EXPECT_STREQ(scene.textures[1].name, "stone.pvr");
    const QexPODMaterial& material = scene.materials[0];
    EXPECT_EQ(std::string(material.name) + material.effectFile + material.effectName, "allfilename");
    // Ten texture indices, opacity, three colours and shininess; then the blend words.
    EXPECT_EQ(std::memcmp(&material.diffuseTexture, &written.materials[0].diffuseTexture, 84), 0);
    EXPECT_EQ(std::memcmp(&material.blendSrcColour, &written.materials[0].blendSourceRgb, 60), 0);
    for (size_t i = 0; i < 3; ++i) ExpectSameMesh(scene.meshes[i], written.meshes[i]);
    for (size_t i = 0; i < everything::kOlder; ++i) ExpectSameNode(scene.nodes[i], written.nodes[i]);
    QexPODModel_Release(&scene);
    EXPECT_EQ(scene.runtime, nullptr);
    QexPODModel_Release(&scene);
}

TEST(PodReader, WhatIsNotGivenHasItsDefault) {
    PodBlocks file;
    file.Version().Begin(1001).Words(2008, {1}).Words(2005, {2}).Words(2004, {1});
    file.Begin(2015).End(2015).Begin(2012).End(2012);
    // An older file: any static value brings all three, and keys beside them count as animated.
    file.Begin(2013).Words(5002, {UINT32_MAX}).Words(5003, {UINT32_MAX}).Floats(5006, {2, 3, 4}).End(2013);
    file.Begin(2013).Words(5002, {UINT32_MAX}).Words(5003, {UINT32_MAX}).Floats(5004, {5, 6, 7});
    file.Floats(5008, {0, 0, 0, 1}).End(2013).End(1001);
    const LoadedPod loaded(file.bytes);
    ASSERT_EQ(loaded.result, 0) << loaded.log;
    EXPECT_EQ(loaded.scene.framesPerSecond, 30u);
    const QexPODMaterial& material = loaded.scene.materials[0];
    for (const int32_t* i = &material.diffuseTexture; i <= &material.refractionTexture; ++i)
        EXPECT_EQ(*i, -1);
    const uint32_t blend[] = {1, 1, 0, 0, 0x8006, 0x8006};
    EXPECT_EQ(std::memcmp(&material.blendSrcColour, blend, sizeof blend), 0);
    EXPECT_EQ(std::memcmp(&loaded.scene.meshes[0].unpackMatrix, &g_sMatIdentity, sizeof g_sMatIdentity), 0);

    const QexPODNode* nodes = loaded.scene.nodes;
    ExpectSame(nodes[0].position, std::vector<float>{0, 0, 0}, "position");
    ExpectSame(nodes[0].rotation, std::vector<float>{0, 0, 0, 1}, "rotation");
    ExpectSame(nodes[0].scale, std::vector<float>{2, 3, 4, 0, 0, 0, 0}, "scale");
    EXPECT_EQ(nodes[0].animationFlags, 0u);
    ExpectSame(nodes[1].position, std::vector<float>{5, 6, 7}, "position");
    ExpectSame(nodes[1].rotation, std::vector<float>{0, 0, 0, -1}, "rotation key");
    ExpectSame(nodes[1].scale, std::vector<float>{1, 1, 1, 0, 0, 0, 0}, "scale");
    EXPECT_EQ(nodes[1].animationFlags, QEX_NODE_ROTATION_ANIMATED);
}

TEST(PodReader, KeysInMemoryStayThere) {
    const std::vector<uint8_t> file = pod::WritePod(everything::Scene());
    LoadedPod loaded(file);
    ASSERT_EQ(loaded.result, 0);
    const QexPODNode& indexed = loaded.scene.nodes[everything::kIndexed];
    const QexPODNode& matrices = loaded.scene.nodes[everything::kMatrices];
    for (const float* keys : {indexed.position, indexed.scale, matrices.matrix})
        EXPECT_TRUE(loaded.Holds(keys));
    EXPECT_FALSE(loaded.Holds(indexed.rotation));
    EXPECT_EQ(indexed.ownershipFlags, 0x280u);
    EXPECT_EQ(matrices.ownershipFlags, 0x40u);
    EXPECT_NE(loaded.log.find("point directly to 4 node animation matrix"), std::string::npos);
    EXPECT_NE(loaded.log.find("- 2 node animation scale data from ROM"), std::string::npos);
    const SceneWalk walk(&loaded.scene);
    EXPECT_EQ(walk.fault, nullptr);
    EXPECT_EQ(std::memcmp(loaded.block.get(), file.data(), file.size()), 0) << "the block was changed";

    const MemoryFile disk(file);
    QexPODModel scene;
    BothOutputs outputs;
    QexPODModel_ReadFromFile(&scene, disk.Path(), 0, 0, 0, 0);
    EXPECT_NE(outputs.Out().find("    - read 4 node animation matrix\n"), std::string::npos);
    for (uint32_t i = 0; i < scene.nodeCount; ++i) EXPECT_EQ(scene.nodes[i].ownershipFlags, 0u);
    EXPECT_EQ(SceneWalk(&scene).sum, walk.sum) << "from a file it is another scene";
    QexPODModel_Release(&scene);
    EXPECT_EQ(QexPODModel_ReadFromFile(&scene, "/nonexistent.pod", 0, 0, 0, 0), -1);
}

// The scene with a block that nobody knows at the beginning of every record. Blocks of every length put the
// keys at every alignment.
TEST(PodReader, UnknownBlocksArePassedOverAndUnalignedKeysGiveTheSameScene) {
    const std::vector<uint8_t> file = pod::WritePod(everything::Scene());
    LoadedPod plain(file);
    const SceneWalk expected(&plain.scene);
    for (size_t length = 0; length <= 4; ++length) {
        std::vector<uint8_t> padded;
        for (size_t at = 0; at < file.size();) {
            uint32_t marker[2];
            std::memcpy(marker, &file[at], 8);
            const auto from = file.begin() + static_cast<long>(at);
            padded.insert(padded.end(), from, from + 8 + marker[1]);
            at += 8 + marker[1];
            if (marker[1] || marker[0] >> 31) continue;
            PodBlocks unknown;
            unknown.Bytes(9999, "junk", length).End(9999);
            padded.insert(padded.end(), unknown.bytes.begin(), unknown.bytes.end());
        }
        LoadedPod loaded(padded);
        ASSERT_EQ(loaded.result, 0) << loaded.log;
        EXPECT_EQ(SceneWalk(&loaded.scene).sum, expected.sum) << length;
        EXPECT_NE(loaded.log.find("I/Qex: <QexPODFile_ReadMaterial> skip unknown block\n"),
                  std::string::npos);
    }
}

TEST(PodReader, VersionByteOrderAndOptions) {
    PodBlocks none, scene, swapped, empty, text, longer, versionOnly, twice;
    scene.Begin(1001).End(1001);
    swapped.Marker(0xE8030000u, 0x0B000000u).Bytes(0, "AB.POD.2.0", 11);
    empty.Version().Begin(1001).End(1001);
    text.Bytes(1000, "AB.POD.2.1", 11).Begin(1001).End(1001);
    longer.Bytes(1000, "AB.POD.2.0\0", 12).Begin(1001).End(1001);
    versionOnly.Version();
    twice.Version().Begin(1001).End(1001).Begin(1001).End(1001);
    const struct {
        const PodBlocks& file;
        uint32_t optionA, optionB;
        const char* error;  // null: it loads
    } cases[] = {
        {empty, 0, 0, nullptr},
        {none, 0, 0, "no version block"},
        {scene, 0, 0, "no version block"},
        {scene, 1, 0, nullptr},
        {scene, 0, 7, nullptr},
        {versionOnly, 0, 0, "no scene"},
        {versionOnly, 1, 0, nullptr},
        {none, 0, 1, nullptr},
        {text, 1, 1, "the version is not"},
        {longer, 1, 1, "holds 12 bytes instead of 11"},
        {swapped, 1, 1, "the other byte order"},
        {twice, 1, 1, "two scenes"},
    };
    for (const auto& c : cases) {
        LoadedPod loaded(c.file.bytes, c.optionA, c.optionB);
        EXPECT_EQ(loaded.result, c.error ? -1 : 0) << (c.error ? c.error : loaded.log);
        EXPECT_EQ(loaded.scene.runtime != nullptr, !c.error);
        EXPECT_NE(loaded.Error().find(c.error ? c.error : ""), std::string::npos) << loaded.log;
    }
    // A marker cut after its identifier ends the file, with a line; less is no marker.
    for (size_t stray = 1; stray < 8; ++stray) {
        std::vector<uint8_t> file = empty.bytes;
        file.resize(file.size() + stray, 7);
        const LoadedPod loaded(file);
        EXPECT_EQ(loaded.result, 0);
        EXPECT_EQ(loaded.log.find("<QexSourceStream_ReadMarker> read marker fail") != std::string::npos,
                  stray >= 4);
    }
    EXPECT_EQ(LoadedPod(swapped.bytes).out, "  - POD endianness mismatch!\n");
    EXPECT_EQ(LoadedPod(empty.bytes).out, "  - POD version string AB.POD.2.0\n");
}

TEST(PodReader, EveryCutFailsAndNoWordIsTrusted) {
    const std::vector<uint8_t> file = pod::WritePod(everything::Scene());
    int results[2] = {};  // scenes that load, and that are refused
    const auto read = [&](const std::vector<uint8_t>& changed, size_t at, uint32_t value) {
        LoadedPod loaded(changed);
        EXPECT_EQ(loaded.result == 0, loaded.scene.runtime != nullptr);
        ++results[loaded.result != 0];
        if (loaded.result)
            EXPECT_NE(loaded.Error(), "") << "byte " << at << " is " << value << ": " << loaded.log;
        else
            EXPECT_EQ(SceneWalk(&loaded.scene).fault, nullptr) << "byte " << at << " is " << value;
    };
    for (size_t size = 0; size < file.size(); ++size)
        read({file.begin(), file.begin() + static_cast<long>(size)}, size, 0);
    EXPECT_EQ(results[0], 0);
    for (const size_t at : WordOffsets(file)) {
        uint32_t word;
        std::memcpy(&word, &file[at], 4);
        for (const uint32_t value : {UINT32_MAX, 0x7FFFFFFFu, 0u, word + 1}) {
            std::vector<uint8_t> changed = file;
            std::memcpy(&changed[at], &value, 4);
            read(changed, at, value);
        }
    }
    EXPECT_GT(results[0], 1000);
}

}  // namespace
