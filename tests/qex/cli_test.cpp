// What the qex command says to a wrong command line: one line that names what is expected, and status 2.
#include <sys/resource.h>
#include <sys/stat.h>

#include <csignal>

#include <nlohmann/json.hpp>

#include "common/ImageFile.h"
#include "qex/QexCommandTest.h"

using QexCli = QexCommandTest;

TEST_F(QexCli, UsageErrorsNameWhatIsExpected) {
    WriteScene(Path("a.pod"), QuadScene());
    WriteText(Path("tri.obj"), "v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n");
    const std::string pod = Path("a.pod"), png = Path("a.png");
    const struct {
        std::vector<std::string> arguments;
        const char* part;
    } cases[] = {
        {{}, "subcommand"},
        {{"paint", pod}, "'paint'; expected info, render"},
        {{"--bogus"}, "unknown option '--bogus'; expected info, render"},
        {{"rendr", pod}, "did you mean render?"},
        {{"render", pod, "--outptu", png}, "unknown option '--outptu'; did you mean --output?"},
        {{"render", pod, "-o", png, "--fraems=1:2"}, "did you mean --frames?"},
        {{"render", pod, "-o", png, "--up", "w"}, "'w' is no axis; expected x, y, z, -x, -y or -z"},
        {{"convert", "-", "-o", Path("b.pod")}, "side by side"},
        {{"render", pod}, "--output"},
        {{"render", pod, "-o", png, "--size", "0x0"}, "expected WIDTHxHEIGHT"},
        {{"render", pod, "-o", png, "--frame", "abc"}, "'abc' is no number from 0 to 1000000"},
        {{"render", pod, "-o", png, "--frames", "5:1:1"}, "FIRST <= LAST"},
        {{"render", pod, "-o", png, "--frames", "0:5:0"}, "STEP > 0"},
        {{"render", pod, "-o", png, "--camera", "-1"}, "expected a number from 0 on, or auto"},
        {{"render", pod, "-o", png, "--camera", "7"}, "no camera 7, the scene has 1"},
        {{"render", pod, "-o", png, "--orbit", "10,95"}, "PITCH from -89 to 89"},
        {{"render", pod, "-o", png, "--background", "red"}, "expected RRGGBB"},
        {{"render", pod, "-o", Path("none/a.png")}, "none/a.png: cannot be written"},
        {{"render", pod, "-o", png, "--shader", "toon"}, "'toon' is no shader; expected texture, "},
        {{"render", pod, "-o", png, "--frames", "0:1000000"}, "are no frames"},
        {{"render", pod, "-o", png, "--light", "0,0,0,80ff"}, "expected X,Y,Z or X,Y,Z,RRGGBB"},
        {{"render", pod, "-o", png, "--light", "1,2"}, "expected X,Y,Z or X,Y,Z,RRGGBB"},
        {{"render", pod, "-o", png, "--node", "a=fly:1,2,3"}, "expected NAME=hide"},
        {{"render", pod, "-o", png, "--node", "nix=hide"}, "no node 'nix'; the scene has "},
        {{"render", pod, "-o", png, "--mirror-node", "nix"}, "no node 'nix'; the scene has "},
        {{"render", pod, "-o", png, "--mirror", "low"}, "'low' is no height"},
        {{"render", pod, "-o", png, "--stereo", "4,0"}, "expected MODE,SEPARATION"},
        {{"render", pod, "-o", png, "--dof", "0.5,1,5"}, "expected FOCUS,RANGE[,SIGMA,SAMPLES]"},
        {{"render", pod, "-o", png, "--dof", "0.5,nan"}, "'0.5,nan' is no depth of field"},
        {{"render", pod, "-o", png, "--dof", "0.5,1,0,9"}, "SIGMA above 0"},
        {{"render", pod, "-o", png, "--dof", "0,1", "--stereo", "3,0"}, "excludes --dof"},
        {{"render", pod, "-o", png, "--pick", "7"}, "expected X,Y in pixels"},
        {{"convert", "a.obj"}, "--output"},
        {{"convert", "a.obj", "-o", "b.pod", "--texture-format", "dxt"}, "expected etc1, rgba8888 or rgb888"},
        {{"convert", "a.obj", "-o", "b.pod", "--max-bones", "17"},
         "--max-bones: '17' is no whole number from 1"},
        {{"convert", "a.obj", "-o", "b.pod", "--fps", "29.97"}, "'29.97' is no whole number from 1 to 1000"},
        {{"convert", "a.obj", "-o", "b.pod", "--up", "up"},
         "'up' is no axis; expected x, y, z, -x, -y or -z"},
        {{"convert", "a.obj", "-o", "b.pod", "--scale", "0"}, "'0' is no scale; expected a number above 0"},
        {{"convert", "a.obj", "-o", "b.pod", "--scale", "1x"}, "'1x' is no scale"},
        {{"convert", "a.obj", "-o", "b.pod", "--scale", "fit:-1"}, "'fit:-1' is no scale"},
        {{"convert", "a.obj", "-o", "b.pod", "--texture", "m=none.png"}, "none.png: no such file"},
        {{"convert", Path("tri.obj"), "-o", Path("b.pod"), "--clip", "walk"}, "'walk'; the scene has none"},
    };
    for (const auto& c : cases) ExpectRefused(c.arguments, 2, c.part);
    EXPECT_FALSE(std::filesystem::exists(png));
}

// In any case of the letters: +Z goes down, so +Y comes to lie along +Z, and the longest edge of 2 grows
// to 3.
TEST_F(QexCli, PlacementReachesTheConverter) {
    WriteText(Path("tri.obj"), "v 0 0 0\nv 1 0 0\nv 0 2 0\nf 1 2 3\n");
    const CommandResult made =
        Run({"convert", Path("tri.obj"), "-o", Path("tri.pod"), "-q", "--up", "-Z", "--scale", "FIT:3"});
    EXPECT_EQ(made.err, "");
    const auto high = nlohmann::json::parse(Run({"info", "--json", Path("tri.pod")}).out)["bounds"]["high"];
    const float expected[] = {1.5f, 0, 3};
    for (size_t i = 0; i < 3; ++i) EXPECT_NEAR(high[i].get<float>(), expected[i], 1e-5f) << i;
}

TEST_F(QexCli, FilesThatCannotBeReadAreOneLineAndStatus1) {
    const Bytes whole = pod::WritePod(QuadScene());
    WriteBytes(Path("empty.pod"), {});
    WriteBytes(Path("picture.pod"), {0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n', 0, 0, 0, 13});
    for (const char* name : {"text.pod", "text.txt"}) WriteText(Path(name), "hello world\n");
    WriteBytes(Path("cut.pod"), Bytes(whole.begin(), whole.begin() + static_cast<long>(whole.size() / 2)));
    WriteBytes(Path("start.pod"), Bytes(whole.begin(), whole.begin() + 3));
    WriteBytes(Path("cut.pvr"), Bytes{52, 0, 0, 0, 1, 2, 3});
    WriteBytes(Path("cut.tga"), Bytes(17));
    WriteBytes(Path("new.pvr"), {'P', 'V', 'R', 3, 0, 0, 0, 0});
    std::filesystem::create_directory(Path("folder.pod"));
    ASSERT_EQ(mkfifo(Path("pipe.pod").c_str(), 0600), 0);
    const struct {
        const char* name;
        const char* part;
        bool scene;  // also given to qex render
    } cases[] = {
        {"missing.pod", "missing.pod: no such file", true},
        {"empty.pod", "empty.pod: is empty", true},
        {"folder.pod", "folder.pod: is a directory", true},
        {"pipe.pod", "pipe.pod: is not a regular file", true},
        {"picture.pod", "picture.pod: is a PNG image", true},
        {"cut.pod", "cut.pod: ", true},
        {"start.pod", "start.pod: ", true},
        {"text.pod", "text.pod: ", true},
        {"text.txt", "is not a POD scene or a PVR, KTX or TGA texture", false},
        {"cut.pvr", "cut short in the header of a PVR", false},
        {"cut.tga", "cut short in the header of a TGA", false},
        {"new.pvr", "PVR texture of version 3", false},
    };
    for (const auto& c : cases) {
        ExpectRefused({"info", Path(c.name)}, 1, c.part);
        ExpectRefused({"info", "--json", Path(c.name)}, 1, c.part);
        if (c.scene) ExpectRefused({"render", Path(c.name), "-o", Path("a.png")}, 1, c.part);
    }
    EXPECT_FALSE(std::filesystem::exists(Path("a.png")));
}

// A limit on the size of files stands for a full disk: writing fails in the middle.
TEST_F(QexCli, WhatIsNotWrittenWholeIsSaidAndLeavesWhatWasThere) {
    std::string error;
    Bytes noise(4 * 64 * 64);
    for (size_t i = 0; i < noise.size(); ++i) noise[i] = static_cast<uint8_t>(i * i % 251);
    const std::string png = Path("a.png"), pod = Path("a.pod"), obj = Path("a.obj"), old = Path("old");
    ASSERT_TRUE(SavePng(png, 64, 64, noise.data(), &error)) << error;
    WriteScene(pod, QuadScene());
    WriteText(obj, "v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n");
    const std::vector<std::vector<std::string>> verbs = {
        {"sheet", png}, {"texture", png}, {"convert", obj, "-q"}, {"emitter"}, {"render", pod}};
    const char* const extensions[] = {".png", ".pvr", ".pod", ".emitter", ".png"};
    for (size_t i = 0; i < verbs.size(); ++i) {
        const std::string output = old + extensions[i];
        const auto to = [&](const std::string& path) {
            std::vector<std::string> arguments = verbs[i];
            arguments.insert(arguments.end(), {"-o", path});
            return arguments;
        };
        ExpectRefused(to("/dev/full"), 2, "No space left on device");
        WriteText(output, "old");
        const rlimit limit = {200, RLIM_INFINITY}, none = {RLIM_INFINITY, RLIM_INFINITY};
        signal(SIGXFSZ, SIG_IGN);
        setrlimit(RLIMIT_FSIZE, &limit);
        ExpectRefused(to(output), 2, output + ": cannot be written");
        setrlimit(RLIMIT_FSIZE, &none);
        EXPECT_EQ(ReadText(output), "old");
    }
    // Nothing half written lies about.
    for (const auto& entry : std::filesystem::directory_iterator(folder_))
        EXPECT_EQ(entry.path().filename().string().find(".qex"), std::string::npos) << entry.path();
    for (const std::vector<std::string>& arguments : {std::vector<std::string>{"info", pod},
                                                      {"convert", obj, "-o", Path("o.pod")},
                                                      {"emitter"},
                                                      {"--help"},
                                                      {"render", pod, "-o", "-"}}) {
        const CommandResult result = Run(arguments, "/dev/null", "/dev/full");
        EXPECT_EQ(result.status, 2) << arguments[0];
        EXPECT_TRUE(Contains(result.err, "No space left on device")) << result.err;
    }
}

TEST_F(QexCli, AnOutputIsNoneOfTheInputs) {
    std::string error;
    const Bytes red = {255, 0, 0, 255};
    const std::string png = Path("a.png"), pod = Path("a.pod"), pvr = Path("a.pvr"), text = Path("a.txt");
    ASSERT_TRUE(SavePng(png, 1, 1, red.data(), &error)) << error;
    pod::Scene scene = QuadScene();
    TextureQuad(&scene, "a.pvr");
    WriteScene(pod, scene);
    WriteBytes(pvr, UniformPvr(pod::kPvrRgba8888, 4, red));
    WriteText(text, "lifetime 1 2\n");
    std::filesystem::create_symlink("a.pod", Path("link.png"));
    std::filesystem::create_hard_link(png, Path("hard.png"));
    std::filesystem::create_symlink("a.pvr", Path("texture.png"));
    const std::vector<std::string> cases[] = {
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
    WriteText(Path("target.png"), "old");
    chmod(Path("target.png").c_str(), 0640);
    std::filesystem::create_symlink("target.png", Path("out.png"));
    EXPECT_EQ(Run({"sheet", png, "-o", Path("out.png")}).err, "");
    EXPECT_TRUE(std::filesystem::is_symlink(Path("out.png")));
    Image image;
    EXPECT_TRUE(LoadImage(Path("target.png"), &image, &error)) << error;
    struct stat status = {};
    stat(Path("target.png").c_str(), &status);
    EXPECT_EQ(status.st_mode & 0777, 0640u);
    std::filesystem::remove(Path("target.png"));
    EXPECT_EQ(Run({"sheet", png, "-o", Path("out.png")}).err, "");
    EXPECT_TRUE(std::filesystem::is_symlink(Path("out.png")) &&
                LoadImage(Path("target.png"), &image, &error));
}

TEST_F(QexCli, SheetPutsPicturesSideBySide) {
    const std::string left = Path("left.png"), right = Path("right.png"), out = Path("out.png");
    const Bytes red = {255, 0, 0, 255, 255, 0, 0, 255}, blue = {0, 0, 255, 255, 0, 0, 255, 255};
    std::string error;
    ASSERT_TRUE(SavePng(left, 2, 1, red.data(), &error) && SavePng(right, 1, 2, blue.data(), &error))
        << error;
    EXPECT_EQ(Run({"sheet", left, right, "-o", out, "--gap", "1"}).err, "");
    Image sheet;
    ASSERT_TRUE(LoadImage(out, &sheet, &error)) << error;
    ASSERT_EQ(sheet.width, 7);
    ASSERT_EQ(sheet.height, 4);
    // Cells of 2 x 2 with a white pixel around each.
    const char* rows[] = {"wwwwwww", "wrrwbww", "wwwwbww", "wwwwwww"};
    for (int y = 0; y < 4; ++y)
        for (int x = 0; x < 7; ++x) {
            const uint8_t* p = sheet.Pixel(x, y);
            EXPECT_EQ(p[0] ? p[2] ? 'w' : 'r' : 'b', rows[y][x]) << x << ", " << y;
        }
    EXPECT_EQ(Run({"sheet", left, left, left, "-o", out, "--columns", "2", "--gap", "0"}).err, "");
    ASSERT_TRUE(LoadImage(out, &sheet, &error)) << error;
    EXPECT_EQ(sheet.width * 10 + sheet.height, 42);
    ExpectRefused({"sheet", left, Path("gone.png"), "-o", out}, 1, "gone.png");
}

TEST_F(QexCli, StandardStreamsStandForFiles) {
    std::string error;
    const Bytes pixels = {255, 0, 0, 255, 0, 0, 255, 255};
    const std::string png = Path("a.png"), pod = Path("a.pod");
    ASSERT_TRUE(SavePng(png, 2, 1, pixels.data(), &error)) << error;
    WriteScene(pod, QuadScene());
    for (const std::vector<std::string>& verb :
         {std::vector<std::string>{"texture", "-", "-o", "-"}, {"sheet", "-", "-o", "-", "--gap", "0"}}) {
        const CommandResult piped = Run(verb, png);
        ASSERT_EQ(piped.status, 0) << verb[0] << piped.err;
        WriteText(Path("piped.png"), piped.out);
        Image image;
        ASSERT_TRUE(LoadImage(Path("piped.png"), &image, &error)) << verb[0] << error;
        EXPECT_EQ(image.pixels, pixels) << verb[0];
    }
    WriteText(Path("a.emitter"), Run({"emitter", "-o", "-"}).out);
    EXPECT_EQ(Run({"emitter", "-"}, Path("a.emitter")).out, Run({"emitter"}).out);
    // Several files: those that can be read are shown.
    const CommandResult several = Run({"info", "--json", "-", png, pod}, pod);
    EXPECT_EQ(several.status, 1);
    EXPECT_EQ(CountLines(several.err), 1) << several.err;
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
        if (system(groff.c_str()) == 0) {
            EXPECT_EQ(ReadText(Path("said")), "");
        }
    }
}
