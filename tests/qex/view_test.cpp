// qex view in a window of a virtual screen.
#include <sstream>
#include <thread>

#include "qex/QexCommandTest.h"

namespace {

class QexView : public QexCommandTest {
  protected:
    // Runs in the test's folder, so that nothing of the user's settings is seen.
    CommandResult View(const std::string& words) const {
        // The command's status, not that of xvfb-run, which may trip over its own temporary files.
        WriteText(Path("run"), "XDG_CONFIG_HOME=\"$PWD\" '" QEX_COMMAND "' view --size 400x300 " + words +
                                   " >out.txt 2>err.txt; echo $? >status");
        const std::string line =
            "cd '" + Path("") +
            "' && rm -f status && xvfb-run -a -s '-screen 0 640x480x24' sh run >xvfb.txt 2>&1";
        if (system(line.c_str()) < 0) return {-1, "", ""};
        const std::string status = ReadText(Path("status"));
        return {status.empty() ? -1 : atoi(status.c_str()), ReadText(Path("out.txt")),
                ReadText(Path("err.txt"))};
    }
    CommandResult Script(const std::string& files, const std::string& script) const {
        WriteText(Path("script"), script);
        return View(files + " --script script");
    }
};

// Of a hundred pixels those that differ by more than so much in some channel.
double Differing(const Image& a, const Image& b, int most) {
    if (a.pixels.size() != b.pixels.size()) return 100;
    size_t count = 0;
    for (size_t i = 0; i < a.pixels.size(); i += 4) {
        int difference = 0;
        for (size_t c = i; c < i + 4; ++c)
            difference = std::max(difference, std::abs(a.pixels[c] - b.pixels[c]));
        count += difference > most;
    }
    return 400.0 * static_cast<double>(count) / static_cast<double>(a.pixels.size());
}

}  // namespace

TEST_F(QexView, ScreenshotsArePicturesOfTheCopiedLines) {
    pod::Scene scene = QuadScene();
    PlaceQuad(&scene, {{{0, 0, 0}, {-0.5f, 0, 0}, {-1, 0, 0}}, {}, {}, {}});
    scene.frameCount = 3;
    WriteScene(Path("a b.pod"), scene);
    ASSERT_EQ(Run({"emitter", "-o", Path("some.emitter"), "--set", "emissionRate=40,50", "--set",
                   "scaleMin=0.01,0.01,0.01", "--set", "scaleMax=0.01,0.01,0.01", "--set",
                   "velocityMin=-1,-1,-1", "--set", "velocityMax=1,1,1", "--set", "accelerationMin=0,0,0",
                   "--set", "accelerationMax=0,0,0"})
                  .status,
              0);
    const char* const steps[] = {"drag 100 100 130 80\nwheel 2\nscrub 1\nkey L\nclick 200 150\nselect",
                                 "key S\nkey D", "key M\nkey M", "open some.emitter\nframes 40",
                                 "key S\nkey L\nkey H"};
    std::string script;
    for (size_t i = 0; i < std::size(steps); ++i) {
        const std::string number = std::to_string(i) + ".png\n";
        script += std::string(steps[i]) + "\nscreenshot shown" + number + "line drawn" + number;
    }
    const CommandResult result = Script("'a b.pod'", script);
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(Contains(result.out, "selected quad\n")) << result.out;
    std::istringstream lines(result.out.substr(result.out.find("qex render")));
    Image before = {400, 300, Bytes(size_t{400} * 300 * 4), false};
    for (size_t i = 0; i < std::size(steps); ++i) {
        std::string line;
        std::getline(lines, line);
        line = "cd '" + Path("") + "' && '" QEX_COMMAND "'" + line.substr(3) + " 2>drawn.txt";
        ASSERT_EQ(system(line.c_str()), 0) << line;
        const Image shown = LoadPicture("shown" + std::to_string(i) + ".png");
        EXPECT_EQ(Differing(shown, LoadPicture("drawn" + std::to_string(i) + ".png"), 1), 0) << line;
        EXPECT_GT(Differing(shown, before, 8), 0.2) << i;
        before = shown;
    }
}

TEST_F(QexView, FilesThatChangeAreShownAnewFromTheSamePlace) {
    pod::Scene scene = QuadScene();
    WriteScene(Path("quad.pod"), scene);
    scene.materials[0].diffuse = {0, 1, 0};
    WriteScene(Path("green"), scene);
    std::thread change([this] {
        for (int i = 0; i < 300 && !std::filesystem::exists(Path("one.png")); ++i) usleep(20000);
        std::filesystem::rename(Path("green"), Path("quad.pod"));
    });
    const CommandResult result = Script(
        "quad.pod", "drag 100 100 120 80\nscreenshot one.png\nline x\nwait 2\nscreenshot two.png\nline x\n");
    change.join();
    ASSERT_EQ(result.status, 0) << result.err;
    const Image one = LoadPicture("one.png"), two = LoadPicture("two.png");
    const size_t middle = one.pixels.size() / 2 + 4 * static_cast<size_t>(one.width / 2);
    EXPECT_GT(one.pixels[middle], one.pixels[middle + 1] + 50);
    EXPECT_GT(two.pixels[middle + 1], two.pixels[middle] + 50);
    const std::string first = result.out.substr(0, result.out.find('\n') + 1);
    EXPECT_EQ(result.out, first + first);  // the camera
}

TEST_F(QexView, AGltfFileIsDropped) {
    const std::string file = "/usr/share/assimp/models/glTF2/simple_skin/simple_skin.gltf";
    if (!std::filesystem::exists(file)) GTEST_SKIP() << file << " is not installed";
    WriteScene(Path("quad.pod"), QuadScene());
    const CommandResult result =
        Script("quad.pod", "screenshot before.png\nopen " + file + "\nscreenshot after.png\nline x.png\n");
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(
        result.out.rfind("qex convert " + file + " -o simple_skin.pod && qex render simple_skin.pod ", 0), 0u)
        << result.out;
    const Image after = LoadPicture("after.png");
    EXPECT_GT(Differing(LoadPicture("before.png"), after, 8), 5);
    EXPECT_GT(Differing({after.width, after.height, Bytes(after.pixels.size(), 0x40), false}, after, 60), 1);
}

TEST_F(QexView, AnotherAnimationIsChosen) {
    const std::string animated = "/usr/share/assimp/models/X/Testwuson.X";
    if (!std::filesystem::exists(animated)) GTEST_SKIP() << animated << " is not installed";
    const CommandResult result = Script(
        animated, "scrub 3\nscreenshot first.png\nclip 1\nscrub 3\nline drawn.png\nscreenshot shown.png\n");
    ASSERT_EQ(result.status, 0) << result.err;
    const size_t at = result.out.find("qex render");
    ASSERT_TRUE(at != std::string::npos && Contains(result.out, " --clip=1 && ")) << result.out;
    std::string line = "cd '" + Path("") + "' && " + result.out;
    for (size_t i = 0; (i = line.find("qex ", i)) != std::string::npos; i += strlen(QEX_COMMAND) + 2)
        line.replace(i, 3, "'" QEX_COMMAND "'");
    ASSERT_EQ(system(line.c_str()), 0) << line;
    EXPECT_EQ(Differing(LoadPicture("shown.png"), LoadPicture("drawn.png"), 1), 0) << line;
    EXPECT_GT(Differing(LoadPicture("shown.png"), LoadPicture("first.png"), 8), 0.2);
    EXPECT_NE(Script(animated, "clip 9\n").status, 0);
}

TEST_F(QexView, SaysWhatItCannotShow) {
    WriteScene(Path("quad.pod"), QuadScene());
    WriteText(Path("broken.pod"), "no scene");
    WriteText(Path("quad.obj"), "v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n");
    WriteText(Path("odd.xyz"), "no scene");
    WriteText(Path("qex/view.json"), "{broken");
    const CommandResult result = View("--batch quad.pod quad.obj broken.pod odd.xyz nowhere.pod");
    EXPECT_EQ(result.status, 3) << result.err;
    for (const char* part :
         {"view.json: is no JSON object", "broken.pod: ", "odd.xyz: ", "nowhere.pod: no such file"})
        EXPECT_TRUE(Contains(result.err, part)) << part << "\n" << result.err;
    unsetenv("DISPLAY");
    unsetenv("WAYLAND_DISPLAY");
    ExpectRefused({"view", Path("quad.pod")}, 1, "qex render");
}

TEST_F(QexView, LivesThroughRandomEvents) {
    WriteScene(Path("quad.pod"), QuadScene());
    const CommandResult result = View("quad.pod --random-events 10000 --seed 5");
    EXPECT_EQ(result.status, 0) << result.err;
}

TEST_F(QexView, ThumbnailsOfScenesThatAreConverted) {
    WriteText(Path("quad.obj"), "v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n");
    EXPECT_EQ(Run({"thumbnail", Path("quad.obj"), Path("small.png"), "--size", "64"}).err, "");
    const Image image = LoadPicture("small.png");
    EXPECT_EQ(std::pair(image.width, image.height), std::pair(64, 64));
    EXPECT_GT(Differing(image, {64, 64, Bytes(image.pixels.size(), 0x40), false}, 60), 10);
    ExpectRefused({"thumbnail", Path("nowhere.obj"), Path("x.png")}, 1, "nowhere.obj");
}
