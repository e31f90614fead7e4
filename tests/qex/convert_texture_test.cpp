#include <set>

#include "convert/Textures.h"
#include "qex/ConvertSupport.h"

namespace {

using ConvertTexture = ConvertTest;

constexpr Pixel kRed{255, 0, 0, 255}, kBlue{0, 0, 255, 255}, kGreen{0, 255, 0, 255};

TEST_F(ConvertTexture, StoresTheLowerEdgeFirstWithAllMipmaps) {
    WriteTga("Wood Floor.tga", 4, 2, {kRed, kRed, kRed, kRed, kBlue, kBlue, kBlue, kGreen});
    const QexPODModel& s = ConvertQuad("Kd 1 1 1\nmap_Kd Wood Floor.tga\n");
    EXPECT_EQ(said_, "");
    EXPECT_STREQ(s.textures[0].name, "Wood_Floor.pvr");
    EXPECT_EQ(s.materials[0].diffuseTexture, 0);
    const Bytes pvr = ReadBytes(Path("Wood_Floor.pvr"));
    EXPECT_EQ(pvr.size(), 52u + 4 * (8 + 2 + 1));
    EXPECT_EQ(Bytes(pvr.begin() + 4, pvr.begin() + 20),
              (Bytes{2, 0, 0, 0, 4, 0, 0, 0, 2, 0, 0, 0, 0x12, 1, 1, 0}));
    EXPECT_EQ(PvrBytes("Wood_Floor.pvr", 8, 12), (Bytes{0, 0, 255, 255, 0, 255, 0, 255, 255, 0, 0, 255}));
    // The mean of two red and two blue pixels.
    EXPECT_EQ(PvrBytes("Wood_Floor.pvr", 32, 4), (Bytes{128, 0, 128, 255}));
    EXPECT_FALSE(std::filesystem::exists(Path("Wood_Floor_a.pvr")));
}

TEST_F(ConvertTexture, AlphaGoesToAFileOfItsOwn) {
    WriteTga("leaf.tga", 1, 2, {{10, 20, 30, 128}, kRed});
    const QexPODMaterial& material = ConvertQuad("map_Kd leaf.tga\n", TextureFormat::kRgb888).materials[0];
    EXPECT_EQ(PvrBytes("leaf.pvr", 0, 6), (Bytes{255, 0, 0, 10, 20, 30}));
    EXPECT_EQ(PvrBytes("leaf_a.pvr", 0, 6), (Bytes{255, 255, 255, 128, 128, 128}));
    // Source alpha and one minus source alpha.
    EXPECT_EQ(material.blendSrcColour, 0x302u);
    EXPECT_EQ(material.blendDstColour, 0x303u);

    WriteTga("c.tga", 1, 1, {kGreen});
    WriteTga("mask.tga", 1, 1, {{77, 77, 77, 255}});
    ConvertQuad("map_Kd c.tga\nmap_d mask.tga\n");
    EXPECT_EQ(PvrBytes("c_a.pvr", 0, 1), Bytes{77});
}

TEST_F(ConvertTexture, NamesAreUniqueEvenWithTheAlphaSuffix) {
    WriteText(Path("q.obj"),
              "mtllib m.mtl\nv 0 0 0\nv 1 0 0\nv 0 1 0\nvt 0 0\nusemtl a\nf 1/1 2/1 3/1\n"
              "usemtl b\nf 1/1 3/1 2/1\nusemtl c\nf 2/1 3/1 1/1\n");
    WriteText(Path("m.mtl"),
              "newmtl a\nmap_Kd x\\Wood_a.tga\nnewmtl b\nmap_Kd y/wood.tga\nnewmtl c\nmap_Kd x/wood.tga\n");
    WriteTga("X/wood_A.tga", 1, 1, {kRed});  // found whatever its case
    WriteTga("y/wood.tga", 1, 1, {kRed});
    WriteTga("wood.tga", 1, 1, {kBlue});  // found by its name alone
    const QexPODModel& scene = Convert(Path("q.obj"));
    std::set<std::string> names;
    for (uint32_t i = 0; i < scene.textureCount; ++i) names.insert(scene.textures[i].name);
    ASSERT_EQ(names.size(), 3u) << said_;
    // wood.pvr would take Wood_a.pvr for its alpha.
    EXPECT_EQ(names.count("wood.pvr"), 0u);
    for (const std::string& name : names) EXPECT_EQ(PvrBytes(name, 0, 4).size(), 4u) << name;
    // One that is not found is a warning.
    EXPECT_EQ(ConvertQuad("map_Kd gone.png\n").textureCount, 0u);
    EXPECT_EQ(pod_->scene.materials[0].diffuseTexture, -1);
    EXPECT_TRUE(Contains(said_, "gone.png not found in " + folder_.string())) << said_;
}

TEST_F(ConvertTexture, NormalMapBringsTangentsAndSwapsRedWithGreen) {
    WriteTga("n.tga", 1, 1, {{140, 120, 250, 255}});
    const QexPODModel& s = ConvertQuad("norm n.tga\n");
    const QexPODMesh& mesh = s.meshes[0];
    // The picture's right is +X on this quad and its top is +Y.
    EXPECT_NEAR(VertexValue(mesh, mesh.tangents, 0).x, 1, 1e-5);
    EXPECT_NEAR(VertexValue(mesh, mesh.binormals, 0).y, 1, 1e-5);
    EXPECT_EQ(s.materials[0].bumpTexture, 0);
    EXPECT_EQ(PvrBytes("n.pvr", 0, 4), (Bytes{120, 140, 250, 255}));
}

TEST(EncodePvr, Etc1HasAllLevelsAndPowerOfTwoSides) {
    const int sides[][2] = {{1, 1}, {3, 4}, {5, 4}, {6, 8}, {100, 128}, {64, 64}, {5000, 4096}, {9000, 4096}};
    for (const auto& side : sides) EXPECT_EQ(PowerOfTwoSide(side[0]), side[1]) << side[0];
    const Image image = {12, 5, std::vector<uint8_t>(4 * 12 * 5, 200), false};
    const Bytes pvr = EncodePvr(image, TextureFormat::kEtc1);
    // 16 x 4, 8 x 2, 4 x 1, 2 x 1, 1 x 1 in blocks of 4 x 4: four, two, one, one, one.
    EXPECT_EQ(Bytes(pvr.begin() + 4, pvr.begin() + 20),
              (Bytes{4, 0, 0, 0, 16, 0, 0, 0, 4, 0, 0, 0, 0x36, 1, 1, 0}));
    EXPECT_EQ(pvr.size(), 52u + 72);
}

}  // namespace
