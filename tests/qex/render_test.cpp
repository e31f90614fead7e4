// qex render draws pictures whose pixels were worked out by hand.
#include <array>
#include <functional>
#include <tuple>

#include "qex/QexCommandTest.h"

namespace {

using Rgb = std::array<int, 3>;
using Words = std::vector<std::string>;

constexpr Rgb kBackground = {64, 72, 88}, kRed = {255, 0, 0}, kGreen = {0, 255, 0}, kBlue = {0, 0, 255},
              kWhite = {255, 255, 255};

Rgb At(const Image& image, int x, int y) {
    const uint8_t* p = image.Pixel(x, y);
    return {p[0], p[1], p[2]};
}

bool Near(const Rgb& a, const Rgb& b, int tolerance) {
    for (size_t i = 0; i < 3; ++i)
        if (std::abs(a[i] - b[i]) > tolerance) return false;
    return true;
}

struct Seen {
    int x, y;
    Rgb colour;
};

void ExpectSeen(const Image& image, const std::vector<Seen>& pixels, int tolerance = 2) {
    for (const Seen& p : pixels)
        EXPECT_PRED3(Near, At(image, p.x, p.y), p.colour, tolerance) << p.x << ", " << p.y;
}

using Box = std::array<int, 4>;  // the first column and row, and those behind the last

// The smallest box around the pixels that are not of the background.
Box Covered(const Image& image) {
    Box box = {image.width, image.height, 0, 0};
    for (int i = 0; i < image.width * image.height; ++i) {
        const int x = i % image.width, y = i / image.width;
        if (Near(At(image, x, y), kBackground, 1)) continue;
        box = {std::min(box[0], x), std::min(box[1], y), std::max(box[2], x + 1), std::max(box[3], y + 1)};
    }
    return box;
}

size_t Count(const Image& image, const Rgb& colour) {
    size_t count = 0;
    for (int i = 0; i < image.width * image.height; ++i)
        count += Near(At(image, i % image.width, i / image.width), colour, 2);
    return count;
}

// The quad from (0, 0) to (2, 1), 20 pixels a unit, around the middle of 200 x 100 pixels.
constexpr Box kQuad = {100, 30, 140, 50};

Words With(Words arguments, const Words& more) {
    arguments.insert(arguments.end(), more.begin(), more.end());
    return arguments;
}

class QexRender : public QexCommandTest {
  protected:
    CommandResult Render(const std::string& scene, const std::string& png, const Words& more = {}) const {
        const CommandResult result = Run(With({"render", scene, "-o", Path(png), "--size", "200x100"}, more));
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(result.out, "");
        return result;
    }
    Image Picture(const pod::Scene& scene, const Words& more = {}) const {
        WriteScene(Path("scene.pod"), scene);
        return Redrawn(more);
    }
    // Draws the scene written last.
    Image Redrawn(const Words& more) const {
        EXPECT_EQ(Render(Path("scene.pod"), "out.png", more).err, "");
        return LoadPicture("out.png");
    }
    void WritePng(const std::string& name, int width, int height,
                  const std::function<Rgb(int x, int y)>& colour) const {
        Image image = {width, height, {}, false};
        for (int i = 0; i < width * height; ++i) {
            for (const int c : colour(i % width, i / width)) image.pixels.push_back(static_cast<uint8_t>(c));
            image.pixels.push_back(255);
        }
        SavePicture(name, image);
    }
    // Six pictures, and the words that make a sky of them.
    Words WriteSky(const std::function<Rgb(int face, int x, int y)>& colour) const {
        Words words;
        for (int i = 0; i < 6; ++i) {
            const std::string name = std::to_string(i) + ".png";
            WritePng(name, 32, 32, [&](int x, int y) { return colour(i, x, y); });
            words.insert(words.end(), {"--sky", Path(name)});
        }
        return words;
    }
};

// The quad moves to the left by half a unit a frame. At the last of its frames it starts over.
pod::Scene MovingScene() {
    pod::Scene scene = QuadScene();
    PlaceQuad(&scene, {{{0, 0, 0}, {-0.5f, 0, 0}, {-1, 0, 0}, {-1.5f, 0, 0}, {-2, 0, 0}}, {}, {}, {}});
    scene.frameCount = 5;
    return scene;
}

}  // namespace

TEST_F(QexRender, DrawsTheQuadWhereTheCameraSeesIt) {
    pod::Scene scene = QuadScene();
    for (const char* name : {"quad", ""}) {
        scene.nodes[0].name = name;
        const Image image = Picture(scene);
        EXPECT_EQ(Covered(image), kQuad);
        EXPECT_EQ(Count(image, kRed), 800u);
        EXPECT_EQ(Count(image, kBackground), 19200u);
    }
}

// The quad turned about its lower edge, 60 degrees away from the camera: half of a light from there falls on
// it.
TEST_F(QexRender, IsLitWhereThereAreNormals) {
    const int lit = 166;  // of 255, 0.3 + 0.7 / 2
    const auto asItIs = [](auto*) {};
    WritePng("tex.png", 8, 8, [](int, int) { return Rgb{255, 128, 255}; });
    const struct {
        std::function<void(pod::Scene*)> change;
        Rgb colour;
        Words more;
    } cases[] = {
        // clang-format off
        {asItIs, {lit, 0, 0}, {}},
        {asItIs, kRed, {"--shader", "texture"}},
        {asItIs, {128, 0, 0}, {"--shader", "gouraud"}},
        {[](auto* s) { s->meshes[0].normals.components = 0; }, kRed, {}},
        {[](auto* s) { s->materials.clear(); s->nodes[0].material = -1; }, {lit, lit, lit}, {}},
        {[](auto* s) { TextureQuad(s, "tex.png"); s->materials[0].diffuse = {0.5f, 1, 0}; }, {lit / 2, lit / 2, 0}, {}},
        {[](auto* s) { AddLight(s, pod::kDirectionalLight, {0.5f, 1, 1}); }, {121, 0, 0}, {}},  // 0.3 + 0.7 / 4
        // clang-format on
    };
    for (const auto& c : cases) {
        pod::Scene scene = QuadScene();
        scene.materials[0].ambient = {0, 0, 0};
        PlaceQuad(&scene, {{}, {{-0.5f, 0, 0, std::sqrt(0.75f)}}, {}, {}});
        c.change(&scene);
        SCOPED_TRACE(&c - cases);
        ExpectSeen(Picture(scene, With({"--camera", "0"}, c.more)), {{120, 45, c.colour}});
    }
}

TEST_F(QexRender, EdgesAreSmooth) {
    pod::Scene scene = QuadScene();
    PlaceQuad(&scene, {{}, {{0, 0, std::sin(0.1f), std::cos(0.1f)}}, {}, {}});
    const struct {
        Words more;
        bool smooth;
    } cases[] = {{{"--antialias", "1"}, false},
                 {{}, true},
                 // Drawn into the targets of an effect.
                 {{"--dof", "0.09,0"}, true},
                 {{"--shadow", "--text", "I"}, true}};
    for (const auto& c : cases) {
        const Image image = Picture(scene, c.more);
        size_t mixed = 0;
        double area = 0;
        for (int i = 20 * 200; i < 200 * 100; ++i) {
            const double share = (At(image, i % 200, i / 200)[0] - 64) / (255.0 - 64);
            area += share;
            mixed += share > 0.1 && share < 0.9;
        }
        EXPECT_NEAR(area, 800, 12);
        EXPECT_EQ(mixed > (c.smooth ? 60 : 0), c.smooth) << mixed;
    }
    // Letters have one size.
    EXPECT_EQ(Count(Redrawn({"--text", "I am"}), kWhite),
              Count(Redrawn({"--text", "I am", "--shadow"}), kWhite));
}

TEST_F(QexRender, FramesAreNumberedAndMove) {
    const std::string pod = Path("scene.pod");
    WriteScene(pod, MovingScene());
    EXPECT_EQ(Render(pod, "out.png", {"--frames", "0:3:1"}).err, "");
    for (int frame = 0; frame < 4; ++frame) {
        const Box shifted = {100 - 10 * frame, 30, 140 - 10 * frame, 50};
        EXPECT_EQ(Covered(LoadPicture("out-000" + std::to_string(frame) + ".png")), shifted)
            << "frame " << frame;
    }
    EXPECT_FALSE(std::filesystem::exists(Path("out-0004.png")));
    EXPECT_FALSE(std::filesystem::exists(Path("out.png")));
    // Between two frames the quad stands between their places.
    EXPECT_EQ(Render(pod, "half.png", {"--frame", "1.5"}).err, "");
    EXPECT_EQ(Covered(LoadPicture("half.png")), (Box{85, 30, 125, 50}));
    // Names with the number's place in them; frames that there are not.
    EXPECT_EQ(Render(pod, "a%03db.jpg", {"--turn", "2"}).err, "");
    EXPECT_EQ(ReadText(Path("a001b.jpg")).substr(0, 2), "\xFF\xD8");
    EXPECT_TRUE(Contains(Render(pod, "end.png", {"--frame", "500"}).err, "the last frame is 4"));
    WriteScene(pod, QuadScene());
    for (const Words& asked : {Words{"--frames", "0:1:1"}, {"--frame", "5"}})
        EXPECT_TRUE(Contains(Render(pod, "still.png", asked).err, "has no animation"));
    // From standard input to standard output.
    WriteText(Path("piped.png"), Run({"render", "-", "-o", "-", "--size", "200x100"}, pod).out);
    EXPECT_EQ(Covered(LoadPicture("piped.png")), kQuad);
    ExpectRefused({"render", "-", "-o", Path("x.png")}, 1, "standard input: is empty");
    ExpectRefused({"render", pod, "-o", "-", "--turn", "2"}, 2, "file name is expected");
    ExpectRefused({"render", pod, "-o", Path("x.gif")}, 2, ".png, .jpg, .bmp or .tga");
}

TEST_F(QexRender, SamePictureHoweverItIsAskedFor) {
    pod::Scene scene = MovingScene();
    scene.materials[0].opacity = 0.8f;
    WriteScene(Path("scene.pod"), scene);
    const std::pair<const char*, Words> runs[] = {{"one.png", {"--frame", "2", "--text", "same"}},
                                                  {"run.png", {"--frames", "0:3:1", "--text", "same"}},
                                                  {"first.png", {}},
                                                  {"short.png", {"--frames", "0:0:1"}},
                                                  {"turn.png", {"--turn", "3", "--orbit", "30,15"}},
                                                  {"orbit.png", {"--orbit", "150,15"}},
                                                  {"side.png", {"--camera", "auto", "--up", "-X"}},
                                                  {"lower.png", {"--camera", "auto", "--up=-x"}}};
    for (const auto& [name, arguments] : runs) Render(Path("scene.pod"), name, arguments);
    EXPECT_GT(Count(LoadPicture("one.png"), kWhite), 50u);  // the letters
    EXPECT_EQ(Count(LoadPicture("first.png"), kWhite), 0u);
    const std::tuple<const char*, const char*, bool> pairs[] = {
        {"one.png", "run-0002.png", true},    {"first.png", "short-0000.png", true},
        {"orbit.png", "turn-0001.png", true}, {"side.png", "lower.png", true},
        {"side.png", "turn-0000.png", false}, {"turn-0000.png", "turn-0001.png", false}};
    for (const auto& [a, b, same] : pairs)
        EXPECT_EQ(ReadBytes(Path(a)) == ReadBytes(Path(b)), same) << a << b;
}

TEST_F(QexRender, AutomaticCameraShowsTheWholeScene) {
    pod::Scene scene = QuadScene();
    PlaceQuad(&scene, Placed(500, -300, 40));
    const Box box = Covered(Picture(scene, {"--camera", "auto", "--orbit", "0,0"}));
    const int width = box[2] - box[0];
    // Twice as wide as high, whole, in the middle, and filling most of the picture.
    EXPECT_NEAR(width, 175, 24);
    EXPECT_NEAR(box[0], 200 - box[2], 1);
    EXPECT_NEAR(box[1], 100 - box[3], 1);
    EXPECT_NEAR(width, 2 * (box[3] - box[1]), 2);
}

TEST_F(QexRender, SaysWhyNothingShows) {
    const struct {
        std::function<void(pod::Scene*)> change;
        const char* part;
        bool away = false;  // of the camera
    } cases[] = {
        // clang-format off
        {[](auto* s) { PlaceQuad(s, Placed(50, 0, 0)); }, "outside the camera's view; try --camera auto", true},
        {[](auto* s) { PlaceQuad(s, Placed(0, 0, 20)); }, "behind the camera", true},
        {[](auto* s) { PlaceQuad(s, Placed(0, 0, -200)); }, "far plane", true},
        {FlattenQuad, "scale of 0"},
        {[](auto* s) { s->materials[0].opacity = 0.5f; }, "transparent"},
        {[](auto* s) { s->meshes[0].faceCount = 0; }, "no faces"},
        {[](auto* s) { s->materials[0].diffuse = {64 / 255.0f, 72 / 255.0f, 88 / 255.0f}; }, "colour of the background"},
        {RemoveQuad, "no mesh nodes"},
        // clang-format on
    };
    for (const auto& c : cases) {
        pod::Scene scene = QuadScene();
        c.change(&scene);
        WriteScene(Path("scene.pod"), scene);
        std::string err = Render(Path("scene.pod"), "out.png", {"--camera", "0"}).err;
        EXPECT_EQ(CountLines(err), 1) << err;
        for (const char* part : {"warning: ", c.part}) EXPECT_TRUE(Contains(err, part)) << part << err;
        EXPECT_EQ(Count(LoadPicture("out.png"), kBackground), 20000u) << c.part;
        // Unless it is asked for, a camera that looks away gives way to one that does not.
        err = Render(Path("scene.pod"), "auto.png").err;
        EXPECT_EQ(CountLines(err), 1) << err;
        EXPECT_EQ(Contains(err, "the automatic camera is used"), c.away) << err;
        EXPECT_EQ(Covered(LoadPicture("auto.png"))[2] > 0, c.away) << c.part;
    }
    // A part of a sequence.
    pod::Scene moving = MovingScene();
    for (float& x : moving.nodes[0].positions) x *= 5;
    WriteScene(Path("scene.pod"), moving);
    const std::string err = Render(Path("scene.pod"), "run.png", {"--frames", "0:3:1"}).err;
    EXPECT_TRUE(Contains(err, "run-0003.png: nothing of the scene shows")) << err;
}

// The quad and the pixels that it covers, after each change.
TEST_F(QexRender, NodesLightsAndEyes) {
    pod::Scene scene = QuadScene();
    scene.materials[0].diffuse = {1, 1, 1};
    scene.materials[0].ambient = {0, 0, 0};
    const auto drawn = [&](const Words& more) { return Covered(Picture(scene, more)); };
    EXPECT_EQ(drawn({"--node", "quad=move:-2,0,0"}), (Box{60, 30, 100, 50}));
    EXPECT_EQ(drawn({"--node", "quad=move:-2,0,0", "--node", "quad=rotate:0,0,90"}), (Box{40, 10, 60, 50}));
    EXPECT_EQ(drawn({"--mirror", "0"}), (Box{100, 30, 140, 70}));
    // The lower left vertex lies straight under the light.
    ExpectSeen(Picture(scene, {"--shader", "gouraud", "--light", "0,0,1,ff8000"}), {{101, 48, {245, 123, 0}}},
               10);
    const Image sides = Picture(scene, {"--stereo", "3,0", "--shader", "simple"});
    EXPECT_GT(Count(sides, kWhite), 100u);
    for (const int x : {60, 160}) EXPECT_NE(At(sides, x, 45), kBackground) << x;

    // A light from above the camera throws the quad's shadow on the floor behind it, and nowhere else.
    const Words light = {"--floor=-1", "--light", "1,6,20", "--antialias", "1"};
    const Image bright = Picture(scene, light), shaded = Picture(scene, With(light, {"--shadow"}));
    EXPECT_LT(At(shaded, 113, 64)[0], At(bright, 113, 64)[0] - 5);
    for (const auto& [x, y] : {std::pair{80, 64}, {150, 64}, {113, 40}})
        EXPECT_EQ(At(shaded, x, y), At(bright, x, y)) << x;

    const Words render = {"render", Path("scene.pod"), "-o", Path("p.png"), "--size", "200x100"};
    EXPECT_EQ(Run(With(render, {"--pick", "120,40", "--pick", "10,10"})).out, "120,40: quad\n10,10:\n");
    EXPECT_TRUE(Contains(Run(With(render, {"--node", "quad=hide"})).err, "warning"));
}

// The quad lies a tenth of the way to the far plane, the background at it. Columns 97 and 103 are beside the
// quad's left edge.
TEST_F(QexRender, DepthOfFieldIsSharpAtItsFocus) {
    const Image near = Picture(QuadScene(), {"--dof", "0.09,50"});
    const Image full = Redrawn({"--dof", "0.09,50", "--dof-full"});
    // Four steps to either side: eight pixels at half the resolution, four at full.
    for (const int seen : {At(near, 94, 40)[0], At(full, 97, 40)[0]}) EXPECT_GT(seen, kBackground[0] + 5);
    ExpectSeen(full, {{94, 40, kBackground}});
    ExpectSeen(near, {{103, 40, kRed}}, 4);
    // The nodes have their own modules again for the next picture.
    WriteScene(Path("scene.pod"), MovingScene());
    EXPECT_EQ(Render(Path("scene.pod"), "run.png", {"--frames", "0:1:1", "--dof", "0.09,1"}).err, "");
    for (const Image& image : {near, LoadPicture("run-0001.png")}) ExpectSeen(image, {{110, 40, kRed}}, 4);
}

TEST_F(QexRender, SkyIsSeenFromInsideAndMirroredInWater) {
    const auto face = [](int i, int x, int y) {
        return Rgb{40 * i + 20, 60 * (x / 16 + y / 16 * 2) + 20, 255};
    };
    const Words six = WriteSky(face);
    // The faces of the cells, column by column from the left; behind, an upright cross is upside down.
    WritePng("lying.png", 128, 96, [&](int x, int y) {
        const int cells[3][4] = {{2, 2, 2, 2}, {1, 5, 0, 4}, {3, 3, 3, 3}};
        return face(cells[y / 32][x / 32], x % 32, y % 32);
    });
    WritePng("upright.png", 96, 128, [&](int x, int y) {
        const int cells[4] = {2, 5, 3, 4};
        if (y >= 96) return face(4, 31 - x % 32, 31 - y % 32);
        return face(x / 32 == 1 ? cells[y / 32] : x < 32 ? 1 : 0, x % 32, y % 32);
    });
    pod::Scene scene = QuadScene();
    ExpectSeen(Picture(scene, six), {{120, 40, kRed}}, 1);
    // The quad from 0 to 1 is seen from -1 to -2 in the water at -0.5, the sky's upper half below.
    const Image water = Redrawn(With(six, {"--water", "-0.5"}));
    ExpectSeen(water, {{120, 40, kRed}, {120, 80, kRed}, {50, 85, face(5, 0, 0)}, {50, 20, face(5, 0, 0)}},
               4);
    // Faces, whichever way they come.
    const std::pair<const char*, int> looks[] = {{"90,0", 1}, {"180,0", 4}, {"0,-89", 2}};
    FlattenQuad(&scene);
    for (const auto& [orbit, i] : looks) {
        SCOPED_TRACE(orbit);
        const Words camera = {"--camera", "auto", "--orbit", orbit};
        const Image image = Picture(scene, With(camera, six));
        for (const int x : {50, 150})
            for (const int y : {15, 85})
                ExpectSeen(image, {{x, y, face(i, x > 100 ? 16 : 0, y > 50 ? 16 : 0)}});
        for (const char* cross : {"lying.png", "upright.png"})
            EXPECT_EQ(Redrawn(With(camera, {"--sky", Path(cross)})).pixels, image.pixels) << cross;
    }
    const Words render = {"render", Path("scene.pod"), "-o", Path("no.png")};
    ExpectRefused(With(render, {"--water", "0"}), 2, "--sky");
    ExpectRefused(With(render, {"--sky", "a.png", "--sky", "b.png"}), 2, "expected one picture, or six");
    ExpectRefused(With(render, {"--sky", Path("none.png")}), 1, "none.png");
    ExpectRefused(With(render, {"--sky", Path("0.png")}), 1, "32 x 32 pixels are not 4 x 3 or 3 x 4");
}

// One particle a unit wide and high, 20 pixels, that moves to the right, past the quad.
TEST_F(QexRender, EmittersDrawTheirParticlesWithTheScene) {
    const std::string description =
        "emissionRate 1 1\nemitDuration 0\nlifetime -1 -1\nendOpacity 1\nscaleMin 0.015625 0.015625 1\n"
        "scaleMax 0 0 0\nvelocityMin 1 0 0\nvelocityMax 0 0 0\naccelerationMin 0 0 0\n"
        "accelerationMax 0 0 0\n";
    WriteText(Path("near.txt"), description + "position -4 0.5 0.01");
    WriteText(Path("behind.txt"), description + "position -4 0.5 -0.01");
    WritePng("halves.png", 64, 64, [](int, int y) { return y < 32 ? kGreen : kBlue; });
    const auto drawn = [this](const char* emitter, const char* time, const Words& more) {
        return Picture(QuadScene(), With({"--emitter", Path(emitter), "--emitter-time", time}, more));
    };
    const Words halves = {"--emitter-texture", Path("halves.png")};
    // It is spawned by the first of 60 updates a second.
    const Image early = drawn("near.txt", "2", halves);
    ExpectSeen(early, {{60, 33, kGreen}, {60, 46, kBlue}, {47, 40, kBackground}, {72, 40, kBackground}});
    ExpectSeen(drawn("near.txt", "5", halves), {{120, 33, kGreen}});
    ExpectSeen(drawn("behind.txt", "5", halves), {{120, 33, kRed}});
    // A white spot stands for the texture. In a sky, whose units are others, it has the same size.
    const Rgb dark = {10, 20, 30};
    const Words sky = WriteSky([&](int, int, int) { return dark; });
    const Image inSky = drawn("near.txt", "2", sky), outside = drawn("near.txt", "2", {});
    ExpectSeen(inSky, {{47, 40, dark}, {72, 40, dark}});
    EXPECT_GT(At(inSky, 54, 40)[0], 60);
    ExpectSeen(outside, {{51, 31, kBackground}});
    // Time goes on from picture to picture, 30 frames a second.
    WriteScene(Path("scene.pod"), MovingScene());
    Render(Path("scene.pod"), "run.png",
           {"--frames", "0:60:30", "--emitter", Path("near.txt"), "--emitter-time", "1"});
    for (const Image& image : {inSky, outside, LoadPicture("run-0001.png")})
        ExpectSeen(image, {{60, 40, kWhite}}, 12);
    ExpectSeen(LoadPicture("run-0002.png"), {{80, 40, kWhite}}, 12);
    // Of files of other programs: the first animation is drawn where none is in use, and odd values are said.
    ASSERT_EQ(Run({"emitter", Path("near.txt"), "-o", Path("odd.emitter")}).status, 0);
    Bytes odd = ReadBytes(Path("odd.emitter"));
    PutWord(&odd, 0, 7);
    PutWord(&odd, 888, 0);
    WriteBytes(Path("odd.emitter"), odd);
    WriteScene(Path("scene.pod"), QuadScene());
    const Words other = With(halves, {"--emitter", Path("odd.emitter"), "--emitter-time", "2"});
    const std::string err = Render(Path("scene.pod"), "odd.png", other).err;
    EXPECT_TRUE(Contains(err, "warning: " + Path("odd.emitter") + ": emitting: 7 is not")) << err;
    ExpectSeen(LoadPicture("odd.png"), {{60, 33, kGreen}});
    const Words render = {"render", Path("scene.pod"), "-o", Path("no.png")};
    WriteText(Path("bad.txt"), "lifetime 1 2\nemitting 2");
    ExpectRefused(With(render, {"--emitter", Path("bad.txt")}), 1, "bad.txt: line 2: emitting: 2 is not");
    ExpectRefused(With(render, {"--emitter-texture", Path("none.png"), "--emitter", Path("near.txt")}), 1,
                  "none.png");
}