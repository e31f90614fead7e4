#include <gtest/gtest.h>

#include "PodBuild.h"
#include "PodWalker.h"

namespace {

using Floats = std::vector<float>;

TEST(PodWriter, NestsEveryRecordAndCountsIt) {
    const std::vector<uint8_t> version = {0xE8, 0x03, 0,    0,   11,   0,   0,   0,   'A',
                                          'B',  '.',  'P',  'O', 'D',  '.', '2', '.', '0',
                                          0,    0xE8, 0x03, 0,   0x80, 0,   0,   0,   0};
    pod::Scene scene;
    scene.exportOptions = "options";
    scene.history = "history";
    scene.cameras.resize(1);
    scene.cameras[0].animatedFov = {0.5f, 0.75f};
    scene.lights.resize(2);
    scene.meshes.resize(3);
    scene.nodes.resize(4);
    scene.textures = {"a.pvr", "b.pvr", "c.pvr", "d.pvr", "e.pvr"};
    scene.materials.resize(6);
    scene.frameCount = 2;
    const std::vector<uint8_t> bytes = pod::WritePod(scene);
    EXPECT_TRUE(std::equal(version.begin(), version.end(), bytes.begin()));
    const PodBlock file = PodWalker::Walk(bytes);
    EXPECT_EQ(file.children[1].id, 1002u);
    EXPECT_EQ(file.children[2].id, 1003u);
    const PodBlock& s = file[1001];
    // The block of each count, the blocks it counts, and how many there are.
    const uint32_t rows[][3] = {{2002, 2010, 1}, {2003, 2011, 2}, {2004, 2012, 3},
                                {2005, 2013, 4}, {2007, 2014, 5}, {2008, 2015, 6}};
    for (const auto& [counter, record, count] : rows) {
        EXPECT_EQ(s[counter].U32(), count) << counter;
        EXPECT_EQ(s.All(record).size(), count) << record;
    }
    EXPECT_EQ(s[2010][8004].Floats(), (Floats{0.5f, 0.75f}));
    EXPECT_EQ(s.All(2014)[4]->children[0].Text(), "e.pvr");
}

// The reader negates the fourth component, so a quarter turn about +Y, (0, sin 45, 0, cos 45), is stored with
// a negative w; after the reader, 2yw = +1 sends +X to -Z as a counter-clockwise turn does.
TEST(PodBuild, KeysHaveTheirWidthsAndFlagsAndNegatedW) {
    const float h = 0.70710678f;
    const pod::Transform t = {{{1, 2, 3}}, {{0, h, 0, h}, {0, 0, 0, 1}}, {{1, 2, 3}, {4, 5, 6}}, {}};
    pod::Scene scene;
    scene.nodes = {pod::BuildNode("n", t, 5, 6, 7)};
    const PodBlock node = PodWalker::Walk(pod::WritePod(scene))[1001][2013];
    EXPECT_EQ(node[5007].Floats(), (Floats{1, 2, 3}));
    EXPECT_EQ(node[5008].Floats(), (Floats{0, h, 0, -h, 0, 0, 0, -1}));
    EXPECT_EQ(node[5009].Floats(), (Floats{1, 2, 3, 0, 0, 0, 0, 4, 5, 6, 0, 0, 0, 0}));
    EXPECT_EQ(node[5012].U32(), 6u);
    EXPECT_EQ(node[5003].I32(), 5);
    EXPECT_EQ(node[5000].I32(), 6);
    EXPECT_EQ(node[5002].I32(), 7);
}

}  // namespace
