// What the qex command says to a wrong command line: one line that names what is expected, and status 2.
#include <sys/resource.h>
#include <sys/stat.h>

#include <csignal>
#include <map>
#include <sstream>

#include <nlohmann/json.hpp>

#include "qex/QexCommandTest.h"

namespace {

using namespace std::string_literals;
using Words = std::vector<std::string>;

class QexCli : public QexCommandTest {
  protected:
    std::string Triangle() const {
        WriteText(Path("tri.obj"), "v 0 0 0\nv 1 0 0\nv 0 2 0\nf 1 2 3\n");
        return Path("tri.obj");
    }
    std::string Scene() const {
        WriteScene(Path("a.pod"), QuadScene());
        return Path("a.pod");
    }
    std::string Png(const std::string& name, int width, int height, const Bytes& pixels) const {
        SavePicture(name, {width, height, pixels, false});
        return Path(name);
    }
};

}  // namespace

TEST_F(QexCli, UsageErrorsNameWhatIsExpected) {
    const std::string pod = Scene(), png = Path("a.png"), obj = Triangle();
    const struct {
        const char *before, *words, *part;
    } cases[] = {
        {"", "", "subcommand"},
        {"", "paint", "'paint'; expected info, render"},
        {"", "--bogus", "unknown option '--bogus'; expected info, render"},
        {"", "rendr", "did you mean render?"},
        {"render", "--outptu x", "unknown option '--outptu'; did you mean --output?"},
        {"render", "--fraems=1:2", "did you mean --frames?"},
        {"render", "--up w", "'w' is no axis; expected x, y, z, -x, -y or -z"},
        {"render", "--size 0x0", "expected WIDTHxHEIGHT"},
        {"render", "--frame abc", "'abc' is no number from 0 to 1000000"},
        {"render", "--frames 5:1:1", "FIRST <= LAST"},
        {"render", "--frames 0:5:0", "STEP > 0"},
        {"render", "--frames 0:1000000", "are no frames"},
        {"render", "--camera -1", "expected a number from 0 on, or auto"},
        {"render", "--camera 7", "no camera 7, the scene has 1"},
        {"render", "--orbit 10,95", "PITCH from -89 to 89"},
        {"render", "--background red", "expected RRGGBB"},
        {"render", "--shader toon", "'toon' is no shader; expected texture, "},
        {"render", "--light 0,0,0,80ff", "expected X,Y,Z or X,Y,Z,RRGGBB"},
        {"render", "--node a=fly:1,2,3", "expected NAME=hide"},
        {"render", "--node nix=hide", "no node 'nix'; the scene has "},
        {"render", "--mirror-node nix", "no node 'nix'; the scene has "},
        {"render", "--mirror low", "'low' is no height"},
        {"render", "--stereo 4,0", "expected MODE,SEPARATION"},
        {"render", "--dof 0.5,1,5", "expected FOCUS,RANGE[,SIGMA,SAMPLES]"},
        {"render", "--dof 0.5,nan", "'0.5,nan' is no depth of field"},
        {"render", "--dof 0.5,1,0,9", "SIGMA above 0"},
        {"render", "--dof 0,1 --stereo 3,0", "excludes --dof"},
        {"render", "--pick 7", "expected X,Y in pixels"},
        {"convert", "--texture-format dxt", "expected etc1, rgba8888 or rgb888"},
        {"convert", "--max-bones 17", "--max-bones: '17' is no whole number from 1"},
        {"convert", "--fps 29.97", "'29.97' is no whole number from 1 to 1000"},
        {"convert", "--scale 0", "'0' is no scale; expected a number above 0"},
        {"convert", "--scale fit:-1", "'fit:-1' is no scale"},
        {"convert", "--texture m=none.png", "none.png: no such file"},
        {"convert", "--clip walk", "'walk'; the scene has none"},
    };
    const std::map<std::string, Words> starts = {
        {"render", {"render", pod, "-o", png}}, {"convert", {"convert", obj, "-o", Path("b.pod")}}, {"", {}}};
    for (const auto& c : cases) {
        std::istringstream words(c.words);
        Words arguments = starts.at(c.before);
        arguments.insert(arguments.end(), std::istream_iterator<std::string>(words), {});
        ExpectRefused(arguments, 2, c.part);
    }
    for (const char* verb : {"render", "convert"}) ExpectRefused({verb, obj}, 2, "--output");
    ExpectRefused({"convert", "-", "-o", Path("b.pod")}, 2, "side by side");
    ExpectRefused({"convert", obj, "-o", Path("no/such/out.pod")}, 2, "folder does not exist");
    ExpectRefused({"convert", obj, "-o", folder_.string()}, 2, "no file name");
    ExpectRefused({"render", pod, "-o", Path("none/a.png")}, 2, "none/a.png: cannot be written");
    EXPECT_FALSE(std::filesystem::exists(png));
}

TEST_F(QexCli, FilesThatCannotBeReadAreOneLineAndStatus1) {
    const std::string whole = ReadText(Scene()), none = "not written";
    std::filesystem::create_directory(Path("folder.pod"));
    ASSERT_EQ(mkfifo(Path("pipe.pod").c_str(), 0600), 0);
    const struct {
        const char *verbs, *name;
        std::string content;
        const char* part;
    } cases[] = {
        {"info render", "missing.pod", none, "missing.pod: no such file"},
        {"info render", "folder.pod", none, "folder.pod: is a directory"},
        {"info render", "pipe.pod", none, "pipe.pod: is not a regular file"},
        {"info render", "empty.pod", "", "empty.pod: is empty"},
        {"info render", "picture.pod", "\x89PNG\r\n\x1A\n", "picture.pod: is a PNG image"},
        {"info render", "cut.pod", whole.substr(0, whole.size() / 2), "cut.pod: "},
        {"info render", "start.pod", whole.substr(0, 3), "start.pod: "},
        {"info render", "text.pod", "hello world\n", "text.pod: "},
        {"info", "text.txt", "hello world\n", "is not a POD scene or a PVR, KTX or TGA texture"},
        {"info", "cut.pvr", "\x34\0\0\0\1\2\3"s, "cut short in the header of a PVR"},
        {"info", "cut.tga", std::string(17, 0), "cut short in the header of a TGA"},
        {"info", "new.pvr", "PVR\3\0\0\0\0"s, "PVR texture of version 3"},
        {"convert", "none.obj", none, "existing scene file is expected"},
        {"convert", "notes.txt", "no scene", "cannot be read as a scene"},
        {"convert", "points.obj", "v 0 0 0\nv 1 0 0\np 1 2\n", "holds no triangles"},
        {"convert", "broken.gltf", "{\"asset\":", "cannot be read as a scene"},
        {"convert", "skin.gltf", R"({"skins":[{"inverseBindMatrices":0},{"joints":[1]}]})",
         "skin 1 has no inverse"},
        {"convert", "skin.glb", "glTF\2\0\0\0\x20\0\0\0\x0e\0\0\0JSON{\"skins\":[{}]}"s,
         "skin 0 has no inverse"},
    };
    for (const auto& c : cases) {
        std::istringstream verbs(c.verbs);
        if (c.content != none) WriteText(Path(c.name), c.content);
        for (std::string verb; verbs >> verb;) {
            Words arguments = {verb, Path(c.name), "--json"};
            if (verb != "info") arguments = {verb, Path(c.name), "-o", Path("out.png")};
            ExpectRefused(arguments, 1, c.part);
        }
    }
    EXPECT_FALSE(std::filesystem::exists(Path("out.png")));
}

// In any case of the letters: +Z goes down, so +Y comes to lie along +Z, and the longest edge of 2 grows
// to 3.
TEST_F(QexCli, PlacementReachesTheConverter) {
    Run({"convert", Triangle(), "-o", Path("tri.pod"), "-q", "--up", "-Z", "--scale", "FIT:3"});
    const auto high = nlohmann::json::parse(Run({"info", "--json", Path("tri.pod")}).out)["bounds"]["high"];
    const float expected[] = {1.5f, 0, 3};
    for (size_t i = 0; i < 3; ++i) EXPECT_NEAR(high[i].get<float>(), expected[i], 1e-5f) << i;
}

// A limit on the size of files stands for a full disk: writing fails in the middle.
TEST_F(QexCli, WhatIsNotWrittenWholeIsSaidAndLeavesWhatWasThere) {
    const std::string pod = Scene(), obj = Triangle(), png = Png("a.png", 64, 64, Noise(4 * 64 * 64));
    const std::pair<const char*, Words> verbs[] = {{".png", {"sheet", png}},
                                                   {".pvr", {"texture", png}},
                                                   {".pod", {"convert", obj, "-q"}},
                                                   {".emitter", {"emitter"}},
                                                   {".png", {"render", pod}}};
    for (auto [extension, arguments] : verbs) {
        const std::string output = Path("old") + extension;
        arguments.insert(arguments.end(), {"-o", "/dev/full"});
        ExpectRefused(arguments, 2, "No space left on device");
        arguments.back() = output;
        WriteText(output, "old");
        const rlimit limit = {200, RLIM_INFINITY}, none = {RLIM_INFINITY, RLIM_INFINITY};
        signal(SIGXFSZ, SIG_IGN);
        setrlimit(RLIMIT_FSIZE, &limit);
        ExpectRefused(arguments, 2, output + ": cannot be written");
        setrlimit(RLIMIT_FSIZE, &none);
        EXPECT_EQ(ReadText(output), "old");
    }
    // Nothing half written lies about.
    for (const auto& entry : std::filesystem::directory_iterator(folder_))
        EXPECT_EQ(entry.path().filename().string().find(".qex"), std::string::npos) << entry.path();
    const Words printing[] = {{"info", pod},
                              {"convert", obj, "-o", Path("o.pod")},
                              {"emitter"},
                              {"--help"},
                              {"render", pod, "-o", "-"}};
    for (const Words& arguments : printing) {
        const CommandResult result = Run(arguments, "/dev/null", "/dev/full");
        EXPECT_EQ(result.status, 2) << arguments[0];
        EXPECT_TRUE(Contains(result.err, "No space left on device")) << result.err;
    }
}

TEST_F(QexCli, AnOutputIsNoneOfTheInputs) {
    const Bytes red = {255, 0, 0, 255};
    const std::string png = Png("a.png", 1, 1, red), pod = Path("a.pod"), pvr = Path("a.pvr"),
                      text = Path("a.txt");
    pod::Scene scene = QuadScene();
    TextureQuad(&scene, "a.pvr");
    WriteScene(pod, scene);
    WriteBytes(pvr, UniformPvr(pod::kPvrRgba8888, 4, red));
    WriteText(text, "lifetime 1 2\n");
    std::filesystem::create_symlink("a.pod", Path("link.png"));
    std::filesystem::create_symlink("a.pvr", Path("texture.png"));
    std::filesystem::create_hard_link(png, Path("hard.png"));
    const Words cases[] = {
        {"render", pod, "-o", Path("link.png")},
        {"render", pod, "-o", Path("texture.png")},
        {"render", pod, "--sky", png, "-o", png},
        {"sheet", png, "-o", Path("hard.png")},
        {"texture", pvr, "-o", Path("./a.pvr")},
        {"texture", png, "-o", png, "--flip"},
        {"emitter", text, "--set", "rotationMin=1,1,1", "-o", text},
        {"convert", pod, "-o", Path("link.png")},
    };
    for (const auto& arguments : cases) ExpectRefused(arguments, 2, "is the input");
    EXPECT_EQ(ReadBytes(pod), pod::WritePod(scene));
    EXPECT_EQ(ReadText(text), "lifetime 1 2\n");
    // A link that is no input stays one, and what it leads to keeps its mode.
    const std::string target = Path("target.png"), link = Path("out.png");
    WriteText(target, "old");
    chmod(target.c_str(), 0640);
    std::filesystem::create_symlink("target.png", link);
    for (const bool exists : {true, false}) {
        EXPECT_EQ(Run({"sheet", png, "-o", link}).err, "");
        EXPECT_TRUE(std::filesystem::is_symlink(link));
        EXPECT_EQ(LoadPicture("target.png").width, 9);
        struct stat status = {};
        stat(target.c_str(), &status);
        EXPECT_EQ((status.st_mode & 0777) == 0640u, exists);
        std::filesystem::remove(target);
    }
}

TEST_F(QexCli, SheetPutsPicturesSideBySide) {
    const std::string left = Png("left.png", 2, 1, {255, 0, 0, 255, 255, 0, 0, 255}),
                      right = Png("right.png", 1, 2, {0, 0, 255, 255, 0, 0, 255, 255}), out = Path("out.png");
    EXPECT_EQ(Run({"sheet", left, right, "-o", out, "--gap", "1"}).err, "");
    Image sheet = LoadPicture("out.png");
    ASSERT_EQ(std::pair(sheet.width, sheet.height), std::pair(7, 4));
    // Cells of 2 x 2 with a white pixel around each.
    const char* rows[] = {"wwwwwww", "wrrwbww", "wwwwbww", "wwwwwww"};
    for (int y = 0; y < 4; ++y)
        for (int x = 0; x < 7; ++x) {
            const uint8_t* p = sheet.Pixel(x, y);
            EXPECT_EQ(p[0] ? p[2] ? 'w' : 'r' : 'b', rows[y][x]) << x << ", " << y;
        }
    EXPECT_EQ(Run({"sheet", left, left, left, "-o", out, "--columns", "2", "--gap", "1"}).err, "");
    sheet = LoadPicture("out.png");
    ASSERT_EQ(std::pair(sheet.width, sheet.height), std::pair(7, 5));
    EXPECT_EQ(sheet.Pixel(1, 3)[2], 0);  // the third is red
    ExpectRefused({"sheet", left, Path("gone.png"), "-o", out}, 1, "gone.png");
}

TEST_F(QexCli, StandardStreamsStandForFiles) {
    const Bytes pixels = {255, 0, 0, 255, 0, 0, 255, 255};
    const std::string png = Png("a.png", 2, 1, pixels), pod = Scene();
    for (const Words& verb : {Words{"texture", "-", "-o", "-"}, {"sheet", "-", "-o", "-", "--gap", "0"}}) {
        WriteText(Path("piped.png"), Run(verb, png).out);
        EXPECT_EQ(LoadPicture("piped.png").pixels, pixels) << verb[0];
    }
    WriteText(Path("a.emitter"), Run({"emitter", "-o", "-"}).out);
    EXPECT_EQ(Run({"emitter", "-"}, Path("a.emitter")).out, Run({"emitter"}).out);
    // Several files: those that can be read are shown.
    const CommandResult several = Run({"info", "--json", "-", png, pod}, pod);
    EXPECT_EQ(several.status, CountLines(several.err)) << several.err;
    const nlohmann::json shown = nlohmann::json::parse(several.out);
    ASSERT_EQ(shown.size(), 2u);
    EXPECT_EQ(shown[0]["file"], "standard input");
    EXPECT_EQ(shown[0]["nodes"], shown[1]["nodes"]);
    EXPECT_EQ(Run({"info", "--quiet", pod, pod}).out, "");
    EXPECT_TRUE(Contains(Run({"render", pod, "-o", png, "--verbose"}).err, "I/")) << "the engine's log";
}

// Every option that --help shows is in the manual page and is completed.
TEST_F(QexCli, ManualAndCompletionHoldAllOptions) {
    EXPECT_EQ(Run({"--version"}).out.rfind("qex ", 0), 0u);
    WriteText(Path("completion"), Run({"completion", "bash"}).out);
    const auto complete = [&](const std::string& words) {
        const std::string script = "source " + Path("completion") + "; COMP_WORDS=(qex " + words +
                                   "); COMP_CWORD=$((${#COMP_WORDS[@]} - 1)); _qex; echo \"${COMPREPLY[*]}\"";
        const std::string command = "bash -c '" + script + "' > " + Path("reply") + " 2>&1";
        EXPECT_EQ(system(command.c_str()), 0);
        return ReadText(Path("reply"));
    };
    EXPECT_EQ(complete("ren"), "render\n");
    EXPECT_EQ(complete("render --shader tex"), "texture texture-noalpha\n");
    EXPECT_EQ(complete("convert --texture-f"), "--texture-format\n");
    WriteText(Path("two  words.obj"), "");
    EXPECT_EQ(complete("convert " + Path("two")), Path("two  words.obj") + "\n");
    for (const char* verb : {"info", "render", "convert", "texture", "emitter", "sheet"}) {
        const std::string help = Run({verb, "--help"}).out, page = Run({"man", verb}).out;
        EXPECT_TRUE(Contains(help, "Exit status: 0")) << help;
        const std::string options = " " + complete(std::string(verb) + " -");
        size_t count = 0;
        for (size_t at = help.find("--"); at != std::string::npos; at = help.find("--", at + 2)) {
            const std::string option = help.substr(at, help.find_first_of(" ,\n=", at) - at);
            if (help[at - 1] != ',' && help.substr(at - 3, 3) != "\n  ") continue;  // not in a description
            std::string escaped;
            for (const char c : option) escaped += c == '-' ? "\\-" : std::string(1, c);
            EXPECT_TRUE(Contains(page, "\\fB" + escaped + "\\fR")) << verb << option;
            EXPECT_TRUE(Contains(options, " " + option)) << verb << option << options;
            ++count;
        }
        EXPECT_GE(count, 4u) << help;
        // Where there is a formatter, it has nothing to say against the page.
        WriteText(Path("page"), page);
        const std::string groff = "command -v groff > /dev/null && groff -man -Tutf8 -ww " + Path("page") +
                                  " 2>&1 > /dev/null | cat > " + Path("said");
        EXPECT_EQ(system(groff.c_str()) == 0 ? ReadText(Path("said")) : "", "");
    }
}
