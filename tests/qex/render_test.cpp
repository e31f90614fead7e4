// qex render draws pictures whose pixels were worked out by hand.
#include <array>
#include <functional>
#include <set>

#include "common/ImageFile.h"
#include "qex/QexCommandTest.h"

namespace {

using Rgb = std::array<int, 3>;

constexpr Rgb kBackground = {64, 72, 88};
constexpr pod::Vec3 kBackgroundColour = {64 / 255.0f, 72 / 255.0f, 88 / 255.0f};

Rgb At(const Image& image, int x, int y) {
    const uint8_t* p = image.Pixel(x, y);
    return {p[0], p[1], p[2]};
}

bool Near(const Rgb& a, const Rgb& b, int tolerance) {
    for (size_t i = 0; i < 3; ++i)
        if (std::abs(a[i] - b[i]) > tolerance) return false;
    return true;
}

using Box = std::array<int, 4>;  // the first column and row, and those behind the last

// The smallest box around the pixels that are not of the background.
Box Covered(const Image& image) {
    Box box = {image.width, image.height, 0, 0};
    for (int y = 0; y < image.height; ++y)
        for (int x = 0; x < image.width; ++x)
            if (!Near(At(image, x, y), kBackground, 1))
                box = {std::min(box[0], x), std::min(box[1], y), std::max(box[2], x + 1),
                       std::max(box[3], y + 1)};
    return box;
}

size_t Count(const Image& image, const Rgb& colour) {
    size_t count = 0;
    for (int y = 0; y < image.height; ++y)
        for (int x = 0; x < image.width; ++x) count += Near(At(image, x, y), colour, 2);
    return count;
}

// The quad from (0, 0) to (2, 1), 20 pixels a unit, around the middle of 200 x 100 pixels.
constexpr Box kQuad = {100, 30, 140, 50};

std::vector<std::string> With(std::vector<std::string> arguments, const std::vector<std::string>& more) {
    arguments.insert(arguments.end(), more.begin(), more.end());
    return arguments;
}

class QexRender : public QexCommandTest {
  protected:
    Image Load(const std::string& name) const {
        Image image;
        std::string error;
        EXPECT_TRUE(LoadImage(Path(name), &image, &error)) << name << " " << error;
        if (image.pixels.empty()) image = {1, 1, std::vector<uint8_t>(4), false};
        return image;
    }
    CommandResult Render(const std::string& scene, const std::string& png,
                         const std::vector<std::string>& more = {}) const {
        const CommandResult result = Run(With({"render", scene, "-o", Path(png), "--size", "200x100"}, more));
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(result.out, "");
        return result;
    }
    Image Picture(const pod::Scene& scene, const std::vector<std::string>& more = {}) const {
        WriteScene(Path("scene.pod"), scene);
        EXPECT_EQ(Render(Path("scene.pod"), "out.png", more).err, "");
        return Load("out.png");
    }
    void WritePng(const std::string& name, int size, const std::function<Rgb(int x, int y)>& colour) const {
        std::vector<uint8_t> pixels;
        std::string error;
        for (int y = 0; y < size; ++y)
            for (int x = 0; x < size; ++x) {
                for (const int c : colour(x, y)) pixels.push_back(static_cast<uint8_t>(c));
                pixels.push_back(255);
            }
        ASSERT_TRUE(SavePng(Path(name), size, size, pixels.data(), &error)) << error;
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
    const Image image = Picture(QuadScene());
    EXPECT_EQ(image.width, 200);
    EXPECT_EQ(image.height, 100);
    for (int y = 0; y < 100; ++y)
        for (int x = 0; x < 200; ++x) {
            const bool inside = x >= 100 && x < 140 && y >= 30 && y < 50;
            ASSERT_TRUE(Near(At(image, x, y), inside ? Rgb{255, 0, 0} : kBackground, 1)) << x << ", " << y;
        }
    pod::Scene nameless = QuadScene();
    nameless.nodes[0].name = "";
    EXPECT_EQ(Picture(nameless).pixels, image.pixels);
}

// The quad turned about its lower edge, 60 degrees away from the camera: half of a light from there falls on
// it.
TEST_F(QexRender, IsLitWhereThereAreNormals) {
    pod::Scene plain = QuadScene();
    const float half = 3.14159265f / 6;
    plain.materials[0].ambient = {0, 0, 0};
    PlaceQuad(&plain, {{}, {{-std::sin(half), 0, 0, std::cos(half)}}, {}, {}});
    pod::Scene bare = plain, white = plain, textured = plain, light = plain;
    pod::MeshArrays arrays = Quad(0, 0, 2, 1);
    arrays.normals.clear();
    bare.meshes = {pod::BuildMesh(arrays)};
    white.materials.clear();
    white.nodes[0].material = -1;
    TextureQuad(&textured, "tex.png");
    textured.materials[0].diffuse = {0.5f, 1, 0};
    WritePng("tex.png", 8, [](int, int) { return Rgb{255, 128, 255}; });
    light.lights.resize(1);
    light.lights[0].type = pod::kDirectionalLight;
    light.lights[0].colour = {0.5f, 1, 1};
    light.nodes.insert(light.nodes.begin() + 1, pod::BuildNode("sun", Placed(0, 0, 0), -1, 0));
    light.cameras[0].target = 3;
    const int lit = 166;  // of 255, 0.3 + 0.7 / 2
    const struct {
        const char* name;
        pod::Scene scene;
        Rgb colour;
        std::vector<std::string> more;
    } cases[] = {{"lit", plain, {lit, 0, 0}, {}},
                 {"flat", plain, {255, 0, 0}, {"--shader", "texture"}},
                 {"no normals", bare, {255, 0, 0}, {}},
                 {"no material", white, {lit, lit, lit}, {}},
                 {"texture", textured, {lit / 2, lit / 2, 0}, {}},
                 {"light", light, {121, 0, 0}, {}},  // 0.3 + 0.7 / 4
                 {"named", plain, {128, 0, 0}, {"--shader", "gouraud"}}};
    for (const auto& c : cases) {
        const Rgb seen = At(Picture(c.scene, With({"--camera", "0"}, c.more)), 120, 45);
        EXPECT_TRUE(Near(seen, c.colour, 2)) << c.name << " " << seen[0] << " " << seen[1] << " " << seen[2];
    }
}

TEST_F(QexRender, EdgesAreSmooth) {
    pod::Scene scene = QuadScene();
    PlaceQuad(&scene, {{}, {{0, 0, std::sin(0.1f), std::cos(0.1f)}}, {}, {}});
    const auto mixed = [&](const std::vector<std::string>& more) {
        const Image image = Picture(scene, more);
        size_t count = 0;
        double area = 0;
        for (int y = 20; y < image.height; ++y)
            for (int x = 0; x < image.width; ++x) {
                const double share = (At(image, x, y)[0] - 64) / (255.0 - 64);
                area += share;
                count += share > 0.1 && share < 0.9;
            }
        EXPECT_NEAR(area, 800, 12);
        return count;
    };
    EXPECT_EQ(mixed({"--antialias", "1"}), 0u);
    const size_t smooth = mixed({});
    EXPECT_GT(smooth, 60u);
    // Drawn into the targets of an effect.
    EXPECT_GT(mixed({"--dof", "0.09,0"}), 60u);
    EXPECT_GT(mixed({"--shadow", "--text", "I"}), 60u);
    // Letters have one size.
    const auto letters = [&](const std::vector<std::string>& more) {
        return Count(Picture(scene, With({"--text", "I am"}, more)), {255, 255, 255});
    };
    EXPECT_EQ(letters({}), letters({"--shadow"}));
}

TEST_F(QexRender, FramesAreNumberedAndMove) {
    const std::string pod = Path("scene.pod");
    WriteScene(pod, MovingScene());
    EXPECT_EQ(Render(pod, "out.png", {"--frames", "0:3:1"}).err, "");
    for (int frame = 0; frame < 4; ++frame) {
        const Box shifted = {100 - 10 * frame, 30, 140 - 10 * frame, 50};
        EXPECT_EQ(Covered(Load("out-000" + std::to_string(frame) + ".png")), shifted) << "frame " << frame;
    }
    EXPECT_FALSE(std::filesystem::exists(Path("out-0004.png")));
    EXPECT_FALSE(std::filesystem::exists(Path("out.png")));
    // Between two frames the quad stands between their places.
    EXPECT_EQ(Render(pod, "half.png", {"--frame", "1.5"}).err, "");
    EXPECT_EQ(Covered(Load("half.png")), (Box{85, 30, 125, 50}));
    // Names with the number's place in them; frames that there are not.
    EXPECT_EQ(Render(pod, "a%03db.jpg", {"--turn", "2"}).err, "");
    EXPECT_EQ(ReadText(Path("a001b.jpg")).substr(0, 2), "\xFF\xD8");
    EXPECT_TRUE(Contains(Render(pod, "end.png", {"--frame", "500"}).err, "the last frame is 4"));
    WriteScene(pod, QuadScene());
    EXPECT_TRUE(Contains(Render(pod, "still.png", {"--frames", "0:1:1"}).err, "has no animation"));
    EXPECT_TRUE(Contains(Render(pod, "still.png", {"--frame", "5"}).err, "has no animation"));
    // From standard input to standard output.
    const CommandResult piped = Run({"render", "-", "-o", "-", "--size", "200x100"}, pod);
    EXPECT_EQ(piped.err, "");
    WriteText(Path("piped.png"), piped.out);
    EXPECT_EQ(Covered(Load("piped.png")), kQuad);
    ExpectRefused({"render", "-", "-o", Path("x.png")}, 1, "standard input: is empty");
    ExpectRefused({"render", pod, "-o", "-", "--turn", "2"}, 2, "file name is expected");
    ExpectRefused({"render", pod, "-o", Path("x.gif")}, 2, ".png, .jpg, .bmp or .tga");
}

TEST_F(QexRender, SamePictureHoweverItIsAskedFor) {
    pod::Scene scene = MovingScene();
    scene.materials[0].opacity = 0.8f;
    WriteScene(Path("scene.pod"), scene);
    const struct {
        const char* name;
        std::vector<std::string> arguments;
    } runs[] = {{"one", {"--frame", "2", "--text", "same"}},
                {"run", {"--frames", "0:3:1", "--text", "same"}},
                {"first", {}},
                {"short", {"--frames", "0:0:1"}},
                {"turn", {"--turn", "3", "--orbit", "30,15"}},
                {"orbit", {"--orbit", "150,15"}},
                {"side", {"--camera", "auto", "--up", "-X"}},
                {"lower", {"--camera", "auto", "--up=-x"}}};
    for (const auto& run : runs) Render(Path("scene.pod"), std::string(run.name) + ".png", run.arguments);
    const auto file = [&](const char* name) { return ReadBytes(Path(name)); };
    EXPECT_GT(Count(Load("one.png"), {255, 255, 255}), 50u);  // the letters
    EXPECT_EQ(Count(Load("first.png"), {255, 255, 255}), 0u);
    EXPECT_EQ(file("one.png"), file("run-0002.png"));
    EXPECT_EQ(file("first.png"), file("short-0000.png"));
    EXPECT_EQ(file("orbit.png"), file("turn-0001.png"));
    EXPECT_EQ(file("side.png"), file("lower.png"));
    EXPECT_NE(file("side.png"), file("turn-0000.png"));
    EXPECT_NE(file("turn-0000.png"), file("turn-0001.png"));
}

TEST_F(QexRender, AutomaticCameraShowsTheWholeScene) {
    pod::Scene scene = QuadScene();
    PlaceQuad(&scene, Placed(500, -300, 40));
    const Box box = Covered(Picture(scene, {"--camera", "auto", "--orbit", "0,0"}));
    const int width = box[2] - box[0];
    // Twice as wide as high, whole, in the middle, and filling most of the picture.
    EXPECT_GT(width, 150);
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
        {[](auto* s) { PlaceQuad(s, Placed(50, 0, 0)); }, "outside the camera's view; try --camera auto",
         true},
        {[](auto* s) { PlaceQuad(s, Placed(0, 0, 20)); }, "behind the camera", true},
        {[](auto* s) { PlaceQuad(s, Placed(0, 0, -200)); }, "far plane", true},
        {FlattenQuad, "scale of 0"},
        {[](auto* s) { s->materials[0].opacity = 0.5f; }, "transparent"},
        {[](auto* s) { s->meshes[0].faceCount = 0; }, "no faces"},
        {[](auto* s) { s->materials[0].diffuse = kBackgroundColour; }, "colour of the background"},
        {RemoveQuad, "no mesh nodes"},
    };
    for (const auto& c : cases) {
        pod::Scene scene = QuadScene();
        c.change(&scene);
        WriteScene(Path("scene.pod"), scene);
        const CommandResult result = Render(Path("scene.pod"), "out.png", {"--camera", "0"});
        EXPECT_EQ(CountLines(result.err), 1) << result.err;
        EXPECT_TRUE(Contains(result.err, "warning: ") && Contains(result.err, c.part))
            << c.part << result.err;
        EXPECT_EQ(Count(Load("out.png"), kBackground), 20000u) << c.part;
        // Unless it is asked for, a camera that looks away gives way to one that does not.
        const std::string err = Render(Path("scene.pod"), "auto.png").err;
        EXPECT_EQ(CountLines(err), 1) << err;
        EXPECT_EQ(Contains(err, "the automatic camera is used"), c.away) << err;
        EXPECT_EQ(Covered(Load("auto.png"))[2] > 0, c.away) << c.part;
    }
    // A part of a sequence.
    pod::Scene moving = MovingScene();
    for (float& x : moving.nodes[0].positions) x *= 5;
    WriteScene(Path("scene.pod"), moving);
    const std::string err = Render(Path("scene.pod"), "run.png", {"--frames", "0:3:1"}).err;
    EXPECT_TRUE(Contains(err, "run-0003.png: nothing of the scene shows")) << err;
}

TEST_F(QexRender, TexturesAreFoundAsPvrThenKtxThenPicture) {
    pod::Scene scene = QuadScene();
    TextureQuad(&scene, "tex.png");
    WriteScene(Path("scene.pod"), scene);
    WriteBytes(Path("tex.pvr"), UniformPvr(pod::kPvrRgba8888, 8, {255, 0, 255, 255}));
    WriteBytes(Path("tex.ktx"), UniformKtx(8, {0, 255, 255, 255}));
    WritePng("tex.png", 8, [](int, int) { return Rgb{255, 255, 0}; });
    const struct {
        const char* file;
        Rgb colour;
    } cases[] = {{"tex.pvr", {255, 0, 255}}, {"tex.ktx", {0, 255, 255}}, {"tex.png", {255, 255, 0}}};
    for (const auto& c : cases) {
        const CommandResult result = Render(Path("scene.pod"), "out.png");
        EXPECT_EQ(result.err, "") << c.file;
        EXPECT_TRUE(Near(At(Load("out.png"), 120, 40), c.colour, 2)) << c.file;
        std::filesystem::remove(Path(c.file));
    }
    const CommandResult missing = Render(Path("scene.pod"), "out.png");
    EXPECT_TRUE(Contains(missing.err, "tex.png is missing")) << missing.err;
    EXPECT_EQ(Covered(Load("out.png")), kQuad);
}

// The quad and the pixels that it covers, after each change.
TEST_F(QexRender, NodesLightsAndEyes) {
    pod::Scene scene = QuadScene();
    scene.materials[0].diffuse = {1, 1, 1};
    scene.materials[0].ambient = {0, 0, 0};
    const auto drawn = [&](const std::vector<std::string>& more) { return Covered(Picture(scene, more)); };
    EXPECT_EQ(drawn({"--node", "quad=move:-2,0,0"}), (Box{60, 30, 100, 50}));
    EXPECT_EQ(drawn({"--node", "quad=move:-2,0,0", "--node", "quad=rotate:0,0,90"}), (Box{40, 10, 60, 50}));
    EXPECT_EQ(drawn({"--mirror", "0"}), (Box{100, 30, 140, 70}));
    // The lower left vertex lies straight under the light.
    const Rgb near = At(Picture(scene, {"--shader", "gouraud", "--light", "0,0,1,ff8000"}), 101, 48);
    EXPECT_TRUE(near[0] > 235 && near[2] == 0 && std::abs(near[1] - near[0] / 2) < 3) << near[0];
    const Image sides = Picture(scene, {"--stereo", "3,0", "--shader", "simple"});
    EXPECT_GT(Count(sides, {255, 255, 255}), 100u);
    EXPECT_FALSE(Near(At(sides, 60, 45), kBackground, 1) || Near(At(sides, 160, 45), kBackground, 1));

    // A light from above the camera throws the quad's shadow on the floor behind it, and nowhere else.
    const Image bright = Picture(scene, {"--floor=-1", "--light", "1,6,20", "--antialias", "1"});
    const Image shaded = Picture(scene, {"--floor=-1", "--light", "1,6,20", "--shadow", "--antialias", "1"});
    int darker = 0;
    for (int y = 0; y < bright.height; ++y)
        for (int x = 0; x < bright.width; ++x) {
            const int change = At(shaded, x, y)[0] - At(bright, x, y)[0];
            EXPECT_TRUE(change == 0 || (change < 0 && y > 50)) << x << " " << y;
            darker += change < 0;
        }
    EXPECT_GT(darker, 20);

    WriteScene(Path("scene.pod"), scene);
    const auto run = [&](const std::vector<std::string>& more) {
        return Run(With({"render", Path("scene.pod"), "-o", Path("p.png"), "--size", "200x100"}, more));
    };
    EXPECT_EQ(run({"--pick", "120,40", "--pick", "10,10"}).out, "120,40: quad\n10,10:\n");
    EXPECT_NE(run({"--node", "quad=hide"}).err.find("warning"), std::string::npos);
}

// The quad lies a tenth of the way to the far plane, the background at it. Columns 97 and 103 are beside the
// quad's left edge.
TEST_F(QexRender, DepthOfFieldIsSharpAtItsFocus) {
    const Rgb red = {255, 0, 0};
    const Image near = Picture(QuadScene(), {"--dof", "0.09,50"});
    EXPECT_TRUE(Near(At(near, 103, 40), red, 4));
    // Four steps to either side: eight pixels at half the resolution, four at full.
    EXPECT_GT(At(near, 94, 40)[0], kBackground[0] + 5);
    const Image full = Picture(QuadScene(), {"--dof", "0.09,50", "--dof-full"});
    EXPECT_GT(At(full, 97, 40)[0], kBackground[0] + 5);
    EXPECT_TRUE(Near(At(full, 94, 40), kBackground, 1));
    // The nodes have their own modules again for the next picture.
    WriteScene(Path("scene.pod"), MovingScene());
    EXPECT_EQ(Render(Path("scene.pod"), "run.png", {"--frames", "0:1:1", "--dof", "0.09,1"}).err, "");
    EXPECT_TRUE(Near(At(Load("run-0001.png"), 110, 40), red, 4));
}

TEST_F(QexRender, SkyIsSeenFromInsideAndMirroredInWater) {
    const char* const names[6] = {"px.png", "nx.png", "py.png", "ny.png", "pz.png", "nz.png"};
    const auto face = [](int i, int x, int y) {
        const int quarter = x / 16 + y / 16 * 2;
        return Rgb{40 * i + 20, 60 * quarter + 20, 255};
    };
    std::vector<std::string> six;
    for (int i = 0; i < 6; ++i) {
        WritePng(names[i], 32, [&](int x, int y) { return face(i, x, y); });
        six.insert(six.end(), {"--sky", Path(names[i])});
    }
    // Columns and rows of the cells; behind, an upright cross is upside down.
    const int cells[2][6][2] = {{{2, 1}, {0, 1}, {1, 0}, {1, 2}, {3, 1}, {1, 1}},
                                {{2, 1}, {0, 1}, {1, 0}, {1, 2}, {1, 3}, {1, 1}}};
    for (const bool upright : {false, true}) {
        const int width = upright ? 96 : 128, height = upright ? 128 : 96;
        std::vector<uint8_t> pixels(size_t(width * height * 4), 255);
        for (int i = 0; i < 6; ++i)
            for (int at = 0; at < 32 * 32; ++at) {
                const bool turned = upright && i == 4;
                const int x = cells[upright][i][0] * 32 + (turned ? 31 - at % 32 : at % 32);
                const int y = cells[upright][i][1] * 32 + (turned ? 31 - at / 32 : at / 32);
                const Rgb colour = face(i, at % 32, at / 32);
                std::copy(colour.begin(), colour.end(), &pixels[size_t(y * width + x) * 4]);
            }
        std::string error;
        ASSERT_TRUE(
            SavePng(Path(upright ? "upright.png" : "lying.png"), width, height, pixels.data(), &error));
    }
    pod::Scene scene = QuadScene();
    Image image = Picture(scene, six);
    EXPECT_TRUE(Near(At(image, 120, 40), {255, 0, 0}, 1));
    // The quad from 0 to 1 is seen from -1 to -2 in the water at -0.5, the sky's upper half below.
    const auto surface = Picture(scene, With(six, {"--water", "-0.5"}));
    EXPECT_TRUE(Near(At(surface, 120, 40), {255, 0, 0}, 1) && Near(At(surface, 120, 80), {255, 0, 0}, 1));
    EXPECT_TRUE(Near(At(surface, 50, 85), face(5, 0, 0), 4) && Near(At(surface, 50, 20), face(5, 0, 0), 2));
    // Faces, whichever way they come.
    const struct {
        const char* orbit;
        int face;
    } looks[] = {{"90,0", 1}, {"180,0", 4}, {"0,-89", 2}};
    FlattenQuad(&scene);
    for (const auto& look : looks) {
        const std::vector<std::string> camera = {"--camera", "auto", "--orbit", look.orbit};
        image = Picture(scene, With(camera, six));
        for (int quarter = 0; quarter < 4; ++quarter)
            EXPECT_TRUE(Near(At(image, quarter % 2 ? 150 : 50, quarter < 2 ? 15 : 85),
                             face(look.face, quarter % 2 * 16, quarter / 2 * 16), 2))
                << look.orbit << " " << quarter;
        for (const char* cross : {"lying.png", "upright.png"})
            EXPECT_EQ(Picture(scene, With(camera, {"--sky", Path(cross)})).pixels, image.pixels) << cross;
    }
    const std::vector<std::string> render = {"render", Path("scene.pod"), "-o", Path("no.png")};
    ExpectRefused(With(render, {"--water", "0"}), 2, "--sky");
    ExpectRefused(With(render, {"--sky", "a.png", "--sky", "b.png"}), 2, "expected one picture, or six");
    ExpectRefused(With(render, {"--sky", Path("none.png")}), 1, "none.png");
    ExpectRefused(With(render, {"--sky", Path("px.png")}), 1, "32 x 32 pixels are not 4 x 3 or 3 x 4");
}

// One particle a unit wide and high, 20 pixels, that moves to the right, past the quad.
TEST_F(QexRender, EmittersDrawTheirParticlesWithTheScene) {
    const std::string description =
        "emissionRate 1 1\nemitDuration 0\nlifetime -1 -1\nendOpacity 1\nscaleMin 0.015625 0.015625 1\n"
        "scaleMax 0 0 0\nvelocityMin 1 0 0\nvelocityMax 0 0 0\naccelerationMin 0 0 0\naccelerationMax 0 0 "
        "0\n";
    WriteText(Path("near.txt"), description + "position -4 0.5 0.01");
    WriteText(Path("behind.txt"), description + "position -4 0.5 -0.01");
    WritePng("halves.png", 64, [](int, int y) { return y < 32 ? Rgb{0, 255, 0} : Rgb{0, 0, 255}; });
    const auto picture = [this](const std::string& emitter, const std::string& time) {
        return Picture(QuadScene(), {"--emitter", Path(emitter), "--emitter-texture", Path("halves.png"),
                                     "--emitter-time", time});
    };
    // It is spawned by the first of 60 updates a second.
    Image image = picture("near.txt", "2");
    EXPECT_TRUE(Near(At(image, 60, 33), {0, 255, 0}, 2) && Near(At(image, 60, 46), {0, 0, 255}, 2));
    EXPECT_TRUE(Near(At(image, 52, 40), kBackground, 1) == false && Near(At(image, 47, 40), kBackground, 1));
    EXPECT_TRUE(Near(At(image, 72, 40), kBackground, 1));
    EXPECT_TRUE(Near(At(picture("near.txt", "5"), 120, 33), {0, 255, 0}, 2));
    EXPECT_TRUE(Near(At(picture("behind.txt", "5"), 120, 33), {255, 0, 0}, 2));
    // In a sky, whose units are others, it has the same size.
    std::vector<std::string> sky = {"--emitter", Path("near.txt"), "--emitter-time", "2"};
    WritePng("dark.png", 8, [](int, int) { return Rgb{10, 20, 30}; });
    for (int i = 0; i < 6; ++i) sky.insert(sky.end(), {"--sky", Path("dark.png")});
    const Image inSky = Picture(QuadScene(), sky);
    EXPECT_TRUE(Near(At(inSky, 60, 40), {255, 255, 255}, 12) && At(inSky, 54, 40)[0] > 60);
    EXPECT_TRUE(Near(At(inSky, 47, 40), {10, 20, 30}, 2) && Near(At(inSky, 72, 40), {10, 20, 30}, 2));
    // A white spot stands for the texture.
    image = Picture(QuadScene(), {"--emitter", Path("near.txt"), "--emitter-time", "2"});
    EXPECT_TRUE(Near(At(image, 60, 40), {255, 255, 255}, 12) && Near(At(image, 51, 31), kBackground, 2));
    // Time goes on from picture to picture, 30 frames a second.
    WriteScene(Path("scene.pod"), MovingScene());
    Render(Path("scene.pod"), "run.png",
           {"--frames", "0:60:30", "--emitter", Path("near.txt"), "--emitter-time", "1"});
    for (int i = 0; i < 3; ++i)
        EXPECT_TRUE(
            Near(At(Load("run-000" + std::to_string(i) + ".png"), 40 + 20 * i, 40), {255, 255, 255}, 12));
    // Of files of other programs: the first animation is drawn where none is in use, and odd values are said.
    ASSERT_EQ(Run({"emitter", Path("near.txt"), "-o", Path("near.emitter")}).status, 0);
    Bytes odd = ReadBytes(Path("near.emitter"));
    PutWord(&odd, 0, 7);
    PutWord(&odd, 888, 0);
    WriteBytes(Path("odd.emitter"), odd);
    WriteScene(Path("scene.pod"), QuadScene());
    EXPECT_TRUE(Contains(Render(Path("scene.pod"), "odd.png",
                                {"--emitter", Path("odd.emitter"), "--emitter-texture", Path("halves.png"),
                                 "--emitter-time", "2"})
                             .err,
                         "warning: " + Path("odd.emitter") + ": emitting: 7 is not"));
    EXPECT_TRUE(Near(At(Load("odd.png"), 60, 33), {0, 255, 0}, 2));
    const std::vector<std::string> render = {"render", Path("scene.pod"), "-o", Path("no.png")};
    WriteText(Path("bad.txt"), "lifetime 1 2\nemitting 2");
    ExpectRefused(With(render, {"--emitter", Path("bad.txt")}), 1, "bad.txt: line 2: emitting: 2 is not");
    ExpectRefused(With(render, {"--emitter", Path("near.txt"), "--emitter-texture", Path("none.png")}), 1,
                  "none.png");
}

TEST_F(QexRender, RealScenesShow) {
    const std::vector<std::string> scenes = RealFilesIn("scenes", ".pod");
    if (scenes.empty()) GTEST_SKIP() << "QEX_REAL_FILES names no folder with scenes/*.pod";
    for (const std::string& scene : scenes) {
        Render(scene, "out.png");
        const Image image = Load("out.png");
        const double share = 1 - static_cast<double>(Count(image, kBackground)) / (200.0 * 100);
        EXPECT_TRUE(share > 0.02 && share < 0.98) << scene << " " << share;
        // The automatic camera leaves a margin all around.
        const Box box = Covered(image);
        EXPECT_TRUE(box[0] > 0 && box[1] > 0 && box[2] < 200 && box[3] < 100) << scene;
    }
    Render(scenes[0], "run.png", {"--frames", "0:81:27"});
    std::set<Bytes> pictures;
    for (const char* number : {"0", "1", "2", "3"})
        pictures.insert(ReadBytes(Path("run-000" + std::string(number) + ".png")));
    EXPECT_EQ(pictures.size(), 4u);
}
