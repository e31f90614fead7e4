#include <cmath>
#include <csignal>
#include <new>

#include "convert/Process.h"
#include "qex/ConvertSupport.h"

namespace {

using Colour = std::array<float, 4>;
using Rgb = std::array<int, 3>;

class ConvertMaterial : public ConvertTest {
  protected:
    // Two triangles that make a square, corner by corner in the colours given, in linear light.
    QexPODModel& ConvertSquare(const std::string& material, const std::vector<Colour>& colours = {}) {
        std::string bin;
        const auto add = [&bin](float value) { bin.append(reinterpret_cast<const char*>(&value), 4); };
        for (const float x : {0, 0, 0, 1, 0, 0, 1, 1, 0, 0, 0, 0, 1, 1, 0, 0, 1, 0}) add(x);
        for (const Colour& c : colours) std::for_each(c.begin(), c.end(), add);
        WriteText(Path("s.bin"), bin);
        const std::string bytes = std::to_string(bin.size());
        WriteText(Path("s.gltf"),
                  R"({"asset":{"version":"2.0"},"scene":0,"scenes":[{"nodes":[0]}],"nodes":[{"mesh":0}],
 "meshes":[{"primitives":[{"material":0,"attributes":{"POSITION":0)" +
                      std::string(colours.empty() ? "" : ",\"COLOR_0\":1") +
                      R"(}}]}],"materials":[{"name":"m",)" + material + R"(}],
 "images":[{"uri":"pic.tga"}],"textures":[{"source":0}],
 "accessors":[{"bufferView":0,"componentType":5126,"count":6,"type":"VEC3","min":[0,0,0],"max":[1,1,0]},
  {"bufferView":0,"componentType":5126,)" +
                      (colours.empty() ? R"("count":4)" : R"("byteOffset":72,"count":6)") +
                      R"(,"type":"VEC4"}],
 "bufferViews":[{"buffer":0,"byteLength":)" +
                      bytes + R"(}],"buffers":[{"uri":"s.bin","byteLength":)" + bytes + "}]}");
        return Convert(Path("s.gltf"));
    }
    // Red, green and blue of a texture without mipmaps, filtered.
    Rgb Sample(const std::string& name, float u, float v) const {
        const Bytes file = ReadBytes(Path(name));
        uint32_t height, width;
        std::memcpy(&height, &file.at(4), 4);
        std::memcpy(&width, &file.at(8), 4);
        EXPECT_EQ(file.size(), 52 + 3u * width * height) << name;
        const float x = u * float(width) - 0.5f, y = v * float(height) - 0.5f;
        Rgb mixed;
        for (size_t c = 0; c < 3; ++c) {
            float sum = 0;
            for (const float dx : {0.0f, 1.0f})
                for (const float dy : {0.0f, 1.0f}) {
                    const float column = std::floor(x) + dx, row = std::floor(y) + dy;
                    const size_t texel = size_t(row) % height * width + size_t(column) % width;
                    sum += float(file.at(52 + 3 * texel + c)) * (1 - std::fabs(x - column)) *
                           (1 - std::fabs(y - row));
                }
            mixed[c] = int(std::lround(sum));
        }
        return mixed;
    }
    static void ExpectNear(const float* actual, const std::array<float, 3>& expected) {
        for (size_t i = 0; i < 3; ++i) EXPECT_NEAR(actual[i], expected[i], 1e-3f) << i;
    }
};

// Linear 0.5 is 0.7354 as monitors have it, 0.25 is 0.5371, 0.002 is 0.0258.
TEST_F(ConvertMaterial, LinearColoursAreEncoded) {
    const auto pbr = [](const char* factor) {
        return std::string(R"("pbrMetallicRoughness":{"baseColorFactor":)") + factor + "}";
    };
    const QexPODMaterial* m = &ConvertSquare(pbr("[0.5,0.25,0.002,0.75]")).materials[0];
    ExpectNear(m->diffuse, {0.7354f, 0.5371f, 0.0258f});
    EXPECT_FLOAT_EQ(m->opacity, 0.75f);
    EXPECT_EQ(m->diffuseTexture, -1);
    EXPECT_EQ(said_, "");
    ConvertSquare(pbr("[1,1,1,0.5]"));
    EXPECT_TRUE(Contains(said_, "1 material of an opacity up to 0.5: not drawn")) << said_;
    // Glow in one colour: a texel of all the light there can be, and shares of it.
    m = &ConvertSquare(pbr("[0.25,0,0.25,1]") + R"(,"emissiveFactor":[0.25,0.5,0])").materials[0];
    ASSERT_EQ(m->diffuseTexture, 0);
    EXPECT_EQ(Sample("m.pvr", 0.5f, 0.5f), (Rgb{255, 188, 137}));
    ExpectNear(m->diffuse, {0.5371f, 0, 1});
    ExpectNear(m->ambient, {1.2f * 0.5371f, 1, 0.2f});
    EXPECT_EQ(said_, "");
    // With a texture of its own the colour goes into the ambient one.
    WriteTga("pic.tga", 1, 1, {{9, 9, 9, 255}});
    const std::string textured = R"("pbrMetallicRoughness":{"baseColorTexture":{"index":0}})";
    m = &ConvertSquare(textured + R"(,"emissiveFactor":[0.5,0,0])").materials[0];
    ExpectNear(m->ambient, {0.9354f, 0.2f, 0.2f});
    // A texture that glows is drawn where there is no other.
    const std::string glowing = R"("emissiveFactor":[1,1,1],"emissiveTexture":{"index":0})";
    m = &ConvertSquare(pbr("[0,0,0,1]") + "," + glowing).materials[0];
    EXPECT_EQ(m->diffuseTexture, 0);
    ExpectNear(m->ambient, {1, 1, 1});
    EXPECT_EQ(said_, "");
    ConvertSquare(pbr("[1,0,0,1]") + "," + glowing);
    EXPECT_TRUE(Contains(said_, "the emissive texture of material m is not drawn")) << said_;
}

TEST_F(ConvertMaterial, VerticesKeepTheirColoursInATexture) {
    // In linear light; of 255: 100, 120 and 140 on the first triangle, blue on the second.
    const float a = 0.12744f, b = 0.18782f, c = 0.26225f;
    const std::vector<Colour> colours = {{a, b, 1, 1}, {b, b, 1, 1}, {c, a, 1, 1},
                                         {0, 0, 1, 1}, {0, 0, 1, 1}, {0, 0, 1, 1}};
    for (const int blue : {255, 128}) {
        const std::string factor = blue == 255 ? "[1,1,1,1]" : "[1,1,0.2159,1]";
        const QexPODModel& s =
            ConvertSquare(R"("pbrMetallicRoughness":{"baseColorFactor":)" + factor + "}", colours);
        EXPECT_EQ(said_, "");
        EXPECT_STREQ(s.textures[0].name, "colours.pvr");
        ExpectNear(s.materials[0].diffuse, {1, 1, 1});
        const QexPODMesh& mesh = s.meshes[0];
        EXPECT_EQ(mesh.colours.componentCount, 0u);
        for (uint32_t triangle = 0; triangle < 6; triangle += 3) {
            QexVec4 middle = {};
            bool first = false;
            for (uint32_t i = triangle; i < triangle + 3; ++i) {
                const uint32_t vertex = VertexOfCorner(mesh, i);
                const QexVec4 at = VertexValue(mesh, mesh.vertices, vertex),
                              uv = VertexValue(mesh, mesh.uvws[0], vertex);
                middle.x += uv.x / 3;
                middle.y += uv.y / 3;
                if (at.x == at.y) continue;
                first |= at.x > at.y;
                EXPECT_EQ(Sample("colours.pvr", uv.x, uv.y),
                          (at.x > at.y ? Rgb{120, 120, blue} : Rgb{0, 0, blue}));
            }
            EXPECT_EQ(Sample("colours.pvr", middle.x, middle.y),
                      (first ? Rgb{120, 113, blue} : Rgb{0, 0, blue}));
        }
    }
    WriteTga("pic.tga", 1, 1, {{9, 9, 9, 255}});
    ConvertSquare(R"("pbrMetallicRoughness":{"baseColorTexture":{"index":0}})", colours);
    EXPECT_TRUE(Contains(said_, "vertex colours of 1 mesh part with textures are not drawn")) << said_;
    // Where colours are not linear they are kept, and stand in the place of the material's, unless all are
    // black.
    for (const auto& [rgb, textures] : {std::pair<std::string, uint32_t>{" 1 0.5 0\n", 1}, {" 0 0 0\n", 0}}) {
        WriteText(Path("c.obj"), "v 0 0 0" + rgb + "v 1 0 0" + rgb + "v 0 1 0" + rgb + "f 1 2 3\n");
        EXPECT_EQ(Convert(Path("c.obj")).textureCount, textures);
    }
    EXPECT_EQ(Sample("colours.pvr", 0.5f, 0.5f), (Rgb{255, 128, 0}));
}

TEST(RunInProcess, TellsHowTheImporterEnded) {
    const struct {
        int (*work)();
        int status;
        const char* says;
    } rows[] = {
        {[] { return fprintf(stderr, "qex convert: f: bad\nnoise\n") ? 1 : 0; }, 1, "f: bad\n"},
        {[] { return fprintf(stderr, "noise\nqex convert: f: warning: x\n") ? 0 : 1; }, 0, "f: warning: x\n"},
        {[] { return fprintf(stderr, "heap is corrupt\n") ? raise(SIGABRT) : 0; }, 1,
         "f: cannot be converted: the importer crashed, Aborted (heap is corrupt)\n"},
        {[] { return raise(SIGSEGV); }, 1,
         "f: cannot be converted: the importer crashed, Segmentation fault\n"},
        {[] { return fprintf(stderr, "qex convert: f: warning: x\n") ? 3 : 0; }, 1,
         "f: warning: x\nqex convert: f: cannot be converted: the importer ended the process with status "
         "3\n"},
        {[]() noexcept {
             static void* volatile block = ::operator new(SIZE_MAX / 2);
             return block ? 0 : 1;
         },
         1, "f: needs more than 100 MB of memory; --memory"},
    };
    for (const auto& row : rows) {
        testing::internal::CaptureStderr();
        EXPECT_EQ(RunInProcess("f", 100, row.work), row.status) << row.says;
        const std::string said = testing::internal::GetCapturedStderr();
#ifndef __SANITIZE_ADDRESS__  // whose reports are passed on
        EXPECT_EQ(said.rfind(std::string("qex convert: ") + row.says, 0), 0u) << said;
        EXPECT_EQ(CountLines(said), 1 + Contains(row.says, "x\nqex")) << said;
#endif
    }
}

#ifndef __SANITIZE_ADDRESS__  // which takes more memory than a limit could allow
TEST_F(ConvertTest, MemoryIsLimited) {
    std::string obj;
    for (int i = 0; i < 2000000; ++i) obj += "v 0 1 0\n";
    WriteText(Path("big.obj"), obj + "v 1 0 0\nv 0 0 1\nf -1 -2 -3\n");
    ConvertOptions options = Options(Path("big.obj"));
    for (const int megabytes : {4096, 64}) {
        options.memory = megabytes;
        EXPECT_EQ(Run(options), megabytes == 64) << said_;
    }
    EXPECT_EQ(said_,
              "qex convert: " + options.input + ": needs more than 64 MB of memory; --memory allows more\n");
}
#endif

TEST_F(ConvertTest, SaysThatThereAreNoMeshesOrClips) {
    WriteText(Path("m.bvh"),
              "HIERARCHY\nROOT a\n{\nOFFSET 0 0 0\nCHANNELS 0\nEnd Site\n{\nOFFSET 0 1 0\n}\n}\n"
              "MOTION\nFrames: 1\nFrame Time: 0.1\n\n");
    Convert(Path("m.bvh"));
    EXPECT_TRUE(Contains(said_, "the file has no meshes; pointed bodies")) << said_;
    WriteText(Path("q.obj"), "v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n");
    ConvertOptions options = Options(Path("q.obj"));
    options.listClips = true;
    EXPECT_EQ(Run(options), 0);
    EXPECT_EQ(said_, "qex convert: " + Path("q.obj") + ": has no animations\n");
}

}  // namespace
