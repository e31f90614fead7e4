// Where textures come from: what qex render finds for the names in a scene, and which way up it lays them.
#include "qex/QexCommandTest.h"

namespace {

// The picture: green above blue. A scene's quad that shows it covers the rows 30 to 49 of 100.
constexpr char kUpright[] = "green above blue", kTurned[] = "blue above green", kPlain[] = "red";

class QexLookup : public QexCommandTest {
  protected:
    void WritePicture(const std::string& name) const {
        WriteText(Path(name), "");  // makes the folder
        Image image = {8, 8, {}, false};
        for (int i = 0; i < 64; ++i)
            image.pixels.insert(image.pixels.end(),
                                {0, uint8_t(i < 32 ? 255 : 0), uint8_t(i < 32 ? 0 : 255), 255});
        SavePicture(name, image);
    }
    std::string Draw(const std::vector<std::string>& more = {}, bool piped = false) const {
        std::vector<std::string> arguments = {
            "render", piped ? "-" : Path("s.pod"), "-o", Path("out.png"), "--size", "200x100", "--shader",
            "texture"};
        arguments.insert(arguments.end(), more.begin(), more.end());
        const CommandResult result = Run(arguments, piped ? Path("s.pod") : "/dev/null");
        if (result.status) return result.err;
        const Image image = LoadPicture("out.png");
        const auto at = [&](int y) -> std::string {
            const uint8_t* p = image.Pixel(120, y);
            if (p[0] > 200 && p[1] > 200) return "white";
            return p[0] > 200 ? "red" : p[1] > 200 ? "green" : p[2] > 200 ? "blue" : "background";
        };
        return at(34) == at(45) ? at(34) : at(34) + " above " + at(45);
    }
    void WriteQuad(const std::string& texture, const std::string& options = "") const {
        pod::Scene scene = QuadScene();
        scene.exportOptions = options;
        if (!texture.empty()) TextureQuad(&scene, texture);
        WriteScene(Path("s.pod"), scene);
    }
};

}  // namespace

TEST_F(QexLookup, FollowsTheExportOptionThatTurnsVOver) {
    WritePicture("tex.png");
    const struct {
        const char* options;
        std::vector<std::string> arguments;
        const char *drawn, *info;
    } rows[] = {{"", {}, kUpright, nullptr},
                {"bIndexed=1\nbFlipTextureV=0\n", {}, kUpright, "V runs up"},
                {"bFlipTextureV=1\nbIndexed=1\n", {}, kTurned, "V runs down"},
                {"bFlipTextureV=1", {"--flip-textures", "No"}, kUpright, "V runs down"},
                {"", {"--flip-textures", "yes"}, kTurned, nullptr}};
    for (const auto& row : rows) {
        WriteQuad("tex.png", row.options);
        EXPECT_EQ(Draw(row.arguments), row.drawn) << row.options;
        const std::string text = Run({"info", Path("s.pod")}).out;
        EXPECT_TRUE(row.info ? Contains(text, row.info) : !Contains(text, "V runs")) << text;
    }
    WriteQuad("", "bFlipTextureV=1");
    EXPECT_EQ(Draw({"--texture", "paint=" + Path("tex.png")}, true), kTurned);
}

TEST_F(QexLookup, NamesMayDifferInCaseAndFolder) {
    WritePicture("Maps/Wood.PNG");
    WritePicture("stone.png");
    WriteBytes(Path("Grass.PVR"), UniformPvr(pod::kPvrRgb565, 8, {0x00, 0xF8}));
    for (const char* name :
         {"maps/wood.png", "MAPS\\WOOD.tga", "C:\\old\\Stone.bmp", "../x/STONE.png", "textures/grass.png"}) {
        WriteQuad(name);
        EXPECT_EQ(Draw(), Contains(name, "grass") ? kPlain : kUpright) << name;
        EXPECT_FALSE(Contains(Run({"info", Path("s.pod")}).out, "is missing")) << name;
    }
}

TEST_F(QexLookup, PvrGoesBeforeKtxAndKtxBeforePictures) {
    WriteBytes(Path("tex.pvr"), UniformPvr(pod::kPvrRgb565, 8, {0x00, 0xF8}));
    WriteBytes(Path("tex.ktx"), UniformKtx(8, {0, 0, 255, 255}));
    WritePicture("tex.png");
    WriteQuad("tex.png");
    const std::pair<const char*, std::string> rows[] = {
        {"tex.pvr", kPlain}, {"tex.ktx", "blue"}, {"tex.png", kUpright}, {"", "white"}};
    for (const auto& [file, drawn] : rows) {
        EXPECT_EQ(Draw(), drawn) << file;
        if (*file) std::filesystem::remove(Path(file));
    }
    const CommandResult missing = Run({"render", Path("s.pod"), "-o", Path("out.png")});
    EXPECT_TRUE(Contains(missing.err, "tex.png is missing")) << missing.err;
}

TEST_F(QexLookup, MaterialsTakeTexturesOfOnesChoice) {
    WritePicture("mine.png");
    WriteBytes(Path("mine.pvr"), UniformPvr(pod::kPvrRgb565, 8, {0x1F, 0x00}));
    const std::string mine = "paint=" + Path("mine.png"), none = "x=" + Path("mine.png");
    for (const char* own : {"", "gone.png"}) {
        WriteQuad(own);
        EXPECT_EQ(Draw({"--texture", mine}), kUpright);
        EXPECT_EQ(Draw({"--texture", none, "--texture", mine}),
                  "qex render: " + Path("s.pod") + ": no material 'x'; the scene has paint\n");
    }
    EXPECT_EQ(Draw({"--texture", "paint=" + Path("mine.pvr")}), "blue");
    ExpectRefused({"render", Path("s.pod"), "-o", Path("o.png"), "--texture", "paint"}, 2,
                  "expected MATERIAL=FILE");
    // Of a model that is converted, too.
    WriteText(Path("q.obj"), "mtllib m.mtl\nusemtl m\nv 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n");
    WriteText(Path("m.mtl"), "newmtl m\nmap_Kd gone.tga\n");
    const std::string out = Path("folder/q.pod");
    std::filesystem::create_directory(Path("folder"));
    EXPECT_EQ(Run({"convert", Path("q.obj"), "-o", out, "--texture", "m=" + Path("mine.png")}).err, "");
    EXPECT_TRUE(Contains(Run({"info", out}).out, "mine.pvr"));
    EXPECT_GT(ReadBytes(Path("folder/mine.pvr")).size(), 52u);
    ExpectRefused({"convert", Path("q.obj"), "-o", out, "--texture", none}, 2,
                  "no material 'x'; the scene has ");
}
