// The viewer without a window: camera, playback, and what a scene does under it.
#include <cmath>
#include <functional>
#include <set>

#include <nlohmann/json.hpp>

#include "common/ImageFile.h"
#include "common/SceneBounds.h"
#include "front/Properties.h"
#include "front/Viewer.h"
#include "Headless.h"
#include "qex/QexCommandTest.h"

namespace {

void ExpectNear(const QexVec3& a, const QexVec3& b, float tolerance) {
    EXPECT_NEAR(a.x, b.x, tolerance);
    EXPECT_NEAR(a.y, b.y, tolerance);
    EXPECT_NEAR(a.z, b.z, tolerance);
}

ViewerEvent At(ViewerEvent::Kind kind, float x, float y) {
    ViewerEvent event = {};
    event.kind = kind;
    event.x = x;
    event.y = y;
    event.button = 1;
    return event;
}

using nlohmann::json;

// Green, without compression.
Bytes Tga(uint8_t width, uint8_t height) {
    Bytes file = {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, width, 0, height, 0, 24, 0};
    for (int i = 0; i < width * height; ++i) file.insert(file.end(), {0, 255, 0});
    return file;
}

class Front : public FolderTest {
  protected:
    Front() : context_(qex::HeadlessContext::Create(200, 100, nullptr)), viewer_(200, 100) {}

    void Load(const std::string& path) {
        viewer_.Open(path);
        while (viewer_.IsLoading()) viewer_.Tick(0.01);
    }
    void Press(const std::string& key) {
        ViewerEvent event = {};
        event.kind = ViewerEvent::kKey;
        event.text = key;
        viewer_.Handle(event);
    }
    void Pointer(float x, float y, float toX, float toY) {
        ViewerEvent event = At(ViewerEvent::kPointerDown, x, y);
        viewer_.Handle(event);
        event = At(ViewerEvent::kPointerMove, toX, toY);
        viewer_.Handle(event);
        event.kind = ViewerEvent::kPointerUp;
        viewer_.Handle(event);
    }
    // Pixels that are not of the background.
    size_t Covered() {
        const Bytes pixels = viewer_.Picture(200, 100, 1);
        size_t count = 0;
        for (size_t i = 0; i < pixels.size(); i += 4) count += std::abs(pixels[i] - 0x40) > 3;
        return count;
    }

    std::unique_ptr<qex::HeadlessContext> context_;
    Viewer viewer_;
};

}  // namespace

TEST(OrbitCamera, StandsWhereItIsMoved) {
    OrbitCamera camera;  // 5 units from the origin
    const struct {
        UpAxis up;
        float yaw, pitch;
        QexVec3 eye;
    } cases[] = {{UpAxis::kY, 0, 0, {0, 0, 5}},
                 {UpAxis::kY, 90, 0, {5, 0, 0}},
                 {UpAxis::kY, 180, 30, {0, 2.5f, -4.3301f}},
                 {UpAxis::kZ, 0, 0, {0, -5, 0}},
                 {UpAxis::kMinusZ, 0, 89, {0, 0.0873f, -4.9992f}}};
    for (const auto& c : cases) {
        camera.SetUp(c.up);
        camera.Look(c.yaw, c.pitch);
        ExpectNear(camera.View().eye, c.eye, 1e-3f);
    }
    camera.SetUp(UpAxis::kY);
    camera.Look(0, 0);
    camera.Orbit(0, 400);
    EXPECT_EQ(camera.Pitch(), 89);
    camera.Look(0, 0);
    camera.Dolly(0.5f);
    camera.Fly(1, 0, 0);  // onto its target
    ExpectNear(camera.View().eye, {0, 0, 0}, 1e-5f);
    camera.FrameAll({{-1, -1, 2}, {1, 1, 2}}, 1);
    // 2 units and a margin of 6 in 100 in 40 degrees.
    ExpectNear(camera.View().eye, {0, 0, 2 + 1.06f / std::tan(20 * 3.14159265f / 180)}, 1e-3f);
}

TEST(Playback, GoesRoundItsRange) {
    Playback play;
    play.Start(11, 10);
    play.Tick(0.55);
    EXPECT_NEAR(play.Frame(), 5.5, 1e-9);
    play.Tick(0.5);
    EXPECT_NEAR(play.Frame(), 0.5, 1e-9);
    play.SetSpeed(-2);
    play.Tick(0.1);
    EXPECT_NEAR(play.Frame(), 8.5, 1e-9);
    play.Step(1);
    EXPECT_EQ(play.Frame(), 9);
    EXPECT_FALSE(play.Plays());
    play.Keep(5, 10);  // written anew, shorter
    EXPECT_EQ(play.Frame(), 4);
}

TEST_F(Front, ShowsPicksAndKeepsAScene) {
    WriteScene(Path("quad.pod"), QuadScene());
    Load(Path("quad.pod"));
    Press("1");
    const size_t covered = Covered();
    EXPECT_GT(covered, 2000u);
    Pointer(100, 50, 100, 50);
    EXPECT_EQ(viewer_.Selected(), 0);
    Pointer(2, 2, 2, 2);
    EXPECT_EQ(viewer_.Selected(), -1);
    // A quarter of a turn shows nothing of it, half a turn its other side.
    Pointer(20, 20, 245, 20);
    EXPECT_LT(Covered(), covered / 20);
    Pointer(20, 20, 245, 20);
    EXPECT_NEAR(static_cast<double>(Covered()), static_cast<double>(covered), 300.0);
    // What cannot be read leaves it where it is, and is said.
    WriteText(Path("broken.pod"), "no scene");
    for (const char* name : {"broken.pod", "nowhere.pod", "."}) Load(Path(name));
    EXPECT_EQ(viewer_.FailedLoads(), 3u);
    EXPECT_EQ(viewer_.Messages().size(), 3u);
    EXPECT_EQ(viewer_.Path(), Path("quad.pod"));
    Press("1");
    EXPECT_NEAR(static_cast<double>(Covered()), static_cast<double>(covered), 300.0);
    for (const auto& [width, height] : {std::pair(0, 0), {1, 1}, {0, 5}, {200, 100}})
        viewer_.Draw(width, height);
    EXPECT_NEAR(static_cast<double>(Covered()), static_cast<double>(covered), 300.0);
}

// The quad's parent is turned and twice as large.
TEST_F(Front, TheHandMovesNodesAndLights) {
    pod::Scene scene = QuadScene();
    scene.nodes[0].parent = 3;
    scene.nodes.push_back(
        pod::BuildNode("parent", {{}, {{0, 0, 0.70710678f, 0.70710678f}}, {{2, 2, 2}}, {}}));
    WriteScene(Path("quad.pod"), scene);
    Load(Path("quad.pod"));
    Press("1");
    const auto middle = [this] {
        const Bytes pixels = viewer_.Picture(200, 100, 1);
        double x = 0, y = 0, count = 0;
        for (size_t i = 0; i < pixels.size(); i += 4)
            if (std::abs(pixels[i] - 0x40) > 3)
                x += static_cast<double>(i / 4 % 200), y += static_cast<double>(i / 800), ++count;
        return std::pair(x / count, y / count);
    };
    const auto drag = [this](float dx, float dy, unsigned modifiers) {
        ViewerEvent event = At(ViewerEvent::kPointerDown, 100, 50);
        event.modifiers = modifiers;
        viewer_.Handle(event);
        for (const float part : {0.5f, 1.0f})
            viewer_.Handle(At(ViewerEvent::kPointerMove, 100 + part * dx, 50 + part * dy));
        viewer_.Handle(At(ViewerEvent::kPointerUp, 100 + dx, 50 + dy));
    };
    ViewerEvent away = At(ViewerEvent::kWheel, 0, 0);
    away.amount = -6;
    viewer_.Handle(away);
    const auto before = middle();
    Pointer(100, 50, 100, 50);
    const LookView look = *viewer_.Options().look;
    drag(20, -10, kShift | kControl);
    const auto after = middle();
    EXPECT_NEAR(after.first - before.first, 20, 1);
    EXPECT_NEAR(after.second - before.second, -10, 1);

    SceneOptions options = viewer_.Options();
    options.effects.nodes.clear();
    options.effects.lights = {{QEX_LIGHT_POINT, {look.target.x, look.target.y, look.target.z}, {1, 1, 1, 1}}};
    viewer_.SetOptions(options);
    drag(-15, 25, 0);
    // 40 degrees are 100 pixels.
    const float pixel = 2 * (look.eye.z - look.target.z) * std::tan(20 * 3.14159265f / 180) / 100;
    const float* place = viewer_.Options().effects.lights[0].vector;
    ExpectNear({place[0], place[1], place[2]},
               {look.target.x - 15 * pixel, look.target.y - 25 * pixel, look.target.z}, pixel / 2);
    ExpectNear(viewer_.Options().look->eye, look.eye, 1e-4f);
}

TEST_F(Front, LightsOfTheSceneAreTakenOver) {
    for (const int32_t type : {QEX_LIGHT_POINT, QEX_LIGHT_DIRECTIONAL}) {
        pod::Scene scene = QuadScene();
        AddLight(&scene, type, {1, 0.4f, 1});
        // A lamp shines down its own Y axis.
        scene.nodes[1] =
            pod::BuildNode("lamp", {{{0.5f, 0.2f, 1}}, {{0.5f, 0, 0, 0.8660254f}}, {}, {}}, -1, 0);
        WriteScene(Path("quad.pod"), scene);
        Load(Path("quad.pod"));
        Press("1");
        const Bytes own = viewer_.Picture(200, 100, 1);
        viewer_.TakeSceneLights();
        ASSERT_EQ(viewer_.Options().effects.lights.size(), 1u) << type;
        EXPECT_EQ(viewer_.Options().effects.lights[0].type, QEX_LIGHT_POINT);
        const Bytes taken = viewer_.Picture(200, 100, 1);
        int most = 0;
        for (size_t i = 0; i < own.size(); ++i) most = std::max(most, std::abs(own[i] - taken[i]));
        EXPECT_LE(most, 2) << type;
        SceneOptions dark = viewer_.Options();
        dark.effects.lights[0].colour[0] = 0.2f;
        viewer_.SetOptions(dark);
        EXPECT_NE(viewer_.Picture(200, 100, 1), taken) << type;
    }
}

TEST_F(Front, KeysChangeThePictureAndChangeItBack) {
    WriteScene(Path("quad.pod"), QuadScene());
    Load(Path("quad.pod"));
    Press("2");
    const Bytes before = viewer_.Picture(200, 100, 1);
    Press("L");
    EXPECT_NE(viewer_.Picture(200, 100, 1), before);
    Press("L");
    EXPECT_EQ(viewer_.Picture(200, 100, 1), before);
    std::set<Bytes> pictures;
    for (size_t i = 0; i < ShaderNames().size() + 1; ++i, Press("M"))
        pictures.insert(viewer_.Picture(200, 100, 1));
    EXPECT_GE(pictures.size(), 3u);  // in colour, white, depth
    EXPECT_EQ(viewer_.Picture(200, 100, 1), before);
}

TEST_F(Front, PropertiesAreReadAndSetAsJson) {
    WriteScene(Path("quad.pod"), QuadScene());
    Load(Path("quad.pod"));
    const std::string node = json::parse(DescribeScene(&viewer_))["nodes"][0]["name"];
    const json wanted = {
        {"shader", "gouraud"},
        {"lean", false},
        {"background", "#102030"},
        {"floor", -2.5},
        {"shadow", true},
        {"up", "-z"},
        {"overlays", {{"grid", true}}},
        {"hidden", {node}},
        {"lights", {{{"place", {1, 2, 3}}, {"colour", {1, 0, 0}}}}},
        {"selected", 0},
        {"node",
         {{"name", node}, {"mesh", true}, {"move", {0, 1, 0}}, {"turn", {0, 0, 30}}, {"shader", "depth"}}},
        {"material", {{"index", 0}, {"opacity", 0.25}}}};
    viewer_.Select(0);
    EXPECT_TRUE(SetProperties(&viewer_, wanted.dump()));
    const json state = json::parse(DescribeState(&viewer_));
    for (const auto& [name, value] : wanted.items())
        if (name != "overlays" && name != "material") {
            EXPECT_EQ(state[name], value) << name;
        }
    EXPECT_EQ(state["overlays"]["grid"], true);
    EXPECT_EQ(json::parse(DescribeScene(&viewer_))["materials"][0]["opacity"], 0.25);
    EXPECT_EQ(viewer_.AsRenderOptions(9, 9).background, 0x102030u);
    // What is no property or value is said and changes nothing.
    const char* const wrong[] = {"[1]",
                                 "{",
                                 R"({"nothing": 1})",
                                 R"({"shader": "none"})",
                                 R"({"floor": "low"})",
                                 R"({"background": "#12345g"})",
                                 R"({"lights": [{"place": [1, 2]}]})",
                                 R"({"hidden": [3]})",
                                 R"({"node": {"shader": "none"}})",
                                 R"({"node": {"move": [1, 2]}})",
                                 R"({"sky": ["one.png", "two.png"]})",
                                 R"({"material": {"index": 1e300, "opacity": 1}})",
                                 R"({"material": {"index": 0, "diffuse": [1, "a", 2]}})",
                                 R"({"depthOfField": {"sigma": null}})"};
    const std::string before = json::parse(DescribeState(&viewer_))["lights"].dump();
    for (const char* text : wrong) {
        const size_t said = viewer_.Said();
        EXPECT_FALSE(SetProperties(&viewer_, text)) << text;
        EXPECT_EQ(viewer_.Said(), said + 1) << text;
    }
    EXPECT_EQ(json::parse(DescribeState(&viewer_))["lights"].dump(), before);
}

TEST_F(Front, ShowsFilesThatComeAsBytes) {
    const auto add = [this](const std::string& name, const Bytes& bytes) {
        viewer_.OpenBytes(name, bytes.data(), bytes.size());
        do viewer_.Tick(0.01);
        while (viewer_.IsLoading());
    };
    pod::Scene scene = QuadScene();
    scene.textures = {"picture.pvr"};
    scene.materials.resize(1);
    scene.materials[0].diffuseTexture = 0;
    add("folder/../quad.pod", pod::WritePod(scene));
    EXPECT_EQ(viewer_.Name(), "quad.pod");
    EXPECT_EQ(viewer_.Messages().size(), 1u);  // its texture is missing
    Press("1");
    const Bytes before = viewer_.Picture(200, 100, 1);
    // Six green squares in a cross, and what is no cross.
    const std::string sky = viewer_.KeepBytes("sky.tga", Tga(8, 6).data(), Tga(8, 6).size());
    EXPECT_TRUE(SetProperties(&viewer_, json({{"sky", {sky}}}).dump()));
    const Bytes green = viewer_.Picture(200, 100, 1);
    EXPECT_GT(green[1], green[0] + 100);
    const size_t said = viewer_.Said();
    viewer_.KeepBytes("sky.tga", Tga(7, 6).data(), Tga(7, 6).size());
    for (const json& files : {json::array(), json({sky}), json::array()})
        EXPECT_TRUE(SetProperties(&viewer_, json({{"sky", files}}).dump()));
    EXPECT_EQ(viewer_.Said(), said + 1);
    EXPECT_EQ(viewer_.Picture(200, 100, 1), before);
    add("words.txt", {'w'});
    EXPECT_EQ(viewer_.FailedLoads(), 1u);
    add("picture.tga", Tga(2, 4));
    EXPECT_EQ(viewer_.Loads(), 2u);  // again, with its texture
    EXPECT_EQ(viewer_.Name(), "quad.pod");
    EXPECT_NE(viewer_.Picture(200, 100, 1), before);
    // By itself it is twice as high as wide.
    add("other.tga", Tga(2, 4));
    EXPECT_EQ(viewer_.Name(), "other.tga");
    const Bounds box = BoundsOf(viewer_.View().Points());
    EXPECT_FLOAT_EQ((box.high.y - box.low.y) / (box.high.x - box.low.x), 2);
}

// What the command draws is what the viewer shows, but for the samples of edges.
TEST_F(Front, CommandLinesSayWhatIsShown) {
    WriteScene(Path("quad.pod"), QuadScene());
    Load(Path("quad.pod"));
    Press("1");
    const Bytes plain = viewer_.Picture(200, 100, 1);
    const std::function<void(EffectOptions*)> changes[] = {
        [](EffectOptions* e) {
            e->materials = {{"#0", MaterialChange::kDiffuse, {0.1f, 0.2f, 1}}};
        },
        [](EffectOptions* e) {
            e->materials = {{"#0", MaterialChange::kOpacity, {0.25f, 0, 0}}};
        },
        [](EffectOptions* e) {
            e->nodes = {{"quad", NodeChange::kMove, {0.4f, 0.1f, 0}}};
        },
        [](EffectOptions* e) {
            e->nodes = {{"quad", NodeChange::kShader, {0, 0, 0}, "depth"}};
        },
        [](EffectOptions* e) {
            e->lights = {{QEX_LIGHT_POINT, {-2, 1, 1}, {1, 0.2f, 0, 1}}};
        },
    };
    for (const auto& change : changes) {
        SceneOptions options = viewer_.Options();
        options.effects = {};
        change(&options.effects);
        viewer_.SetOptions(options);
        const Bytes shown = viewer_.Picture(200, 100, 1);
        RenderOptions render = viewer_.AsRenderOptions(200, 100);
        render.output = Path("drawn.png");
        const std::string line = ShellLine(RenderWords(render));
        ASSERT_EQ(system(("'" QEX_COMMAND "' " + line).c_str()), 0) << line;
        Image drawn;
        std::string problem;
        ASSERT_TRUE(LoadImage(Path("drawn.png"), &drawn, &problem)) << problem;
        size_t wrong = 0, changed = 0;
        for (size_t i = 0; i < shown.size(); ++i) {
            wrong += std::abs(shown[i] - drawn.pixels[i]) > 64;
            changed += std::abs(shown[i] - plain[i]) > 3;
        }
        EXPECT_LT(wrong, shown.size() / 400) << line;
        EXPECT_GT(changed, shown.size() / 50) << line;
    }
}
