// qex info tells of scenes and textures what was written into them, and what of it would draw wrong.
#include <functional>
#include <map>

#include <nlohmann/json.hpp>

#include "Headless.h"
#include "qex/QexCommandTest.h"
#include "support/PodScenes.h"

using Json = nlohmann::json;

namespace {

// Everything of `expected` is in the document; arrays are compared whole.
void ExpectHolds(const Json& document, const char* expected) {
    Json merged = document;
    merged.merge_patch(Json::parse(expected));
    EXPECT_EQ(document, merged) << Json::diff(document, merged).dump(1);
}

class QexInfo : public QexCommandTest {
  protected:
    Json Info(const std::string& path) const {
        const CommandResult result = Run({"info", "--json", path});
        EXPECT_EQ(result.status, 0) << path;
        EXPECT_EQ(result.err, "") << path;
        return Json::parse(result.out, nullptr, false);
    }
    Json Info(const pod::Scene& scene) const {
        WriteScene(Path("scene.pod"), scene);
        return Info(Path("scene.pod"));
    }
    // The text holds every problem of the JSON and no other.
    std::string ExpectTextAgrees(const std::string& path, const Json& document) const {
        const CommandResult result = Run({"info", path});
        EXPECT_EQ(result.err, "");
        size_t lines = 0;
        for (size_t at = 0; (at = result.out.find("\n  - ", at)) != std::string::npos; ++at) ++lines;
        EXPECT_EQ(lines, document["problems"].size()) << result.out;
        for (const Json& problem : document["problems"])
            EXPECT_TRUE(Contains(result.out, "\n  - " + problem.get<std::string>() + "\n")) << problem;
        return result.out;
    }
};

// Two quads of which the second hangs from the first, a light, a camera and an aim; four frames.
pod::Scene FullScene() {
    pod::Scene scene = QuadScene();
    scene.history = "made by hand";
    pod::MeshArrays coloured = Quad(-1, -1, 1, 1);
    coloured.colours.assign(4, {255, 0, 0, 255});
    coloured.uvs.clear();
    scene.meshes.push_back(pod::BuildMesh(coloured, true));
    scene.meshes[1].unpackMatrix = {2, 0, 0, 0, 0, 2, 0, 0, 0, 0, 2, 0, 0, 0, 0, 1};
    const pod::Transform rising = {{{0, 0, 0}, {0, 1, 0}, {0, 2, 0}, {0, 5, 0}}, {}, {}, {}};
    scene.nodes = {pod::BuildNode("first", rising, -1, 0, 0),
                   pod::BuildNode("second", Placed(10, 0, 0), 0, 1, 1),
                   pod::BuildNode("lamp", Placed(0, 9, 0), -1, 0),
                   pod::BuildNode("eye", Placed(0, 0, 10), -1, 0), pod::BuildNode("aim", Placed(0, 0, 0), 3)};
    scene.meshNodeCount = 2;
    scene.cameras[0].target = 4;
    scene.cameras[0].fov = 1.0471976f;
    scene.lights.resize(1);
    scene.lights[0].colour = {1, 0.5f, 0.25f};
    scene.lights[0].type = pod::kDirectionalLight;
    scene.materials.resize(2);
    TextureQuad(&scene, "wood.pvr");
    scene.materials[1].name = "glass \"thin\"";
    scene.materials[1].opacity = 0.75f;
    scene.frameCount = 4;
    scene.fps = 25;
    return scene;
}

}  // namespace

TEST_F(QexInfo, TellsWhatASceneHolds) {
    for (const char* name : {"wood.pvr", "wood_a.pvr"})
        WriteBytes(Path(name), UniformPvr(pod::kPvrRgb565, 16, {0, 0}));
    const Json d = Info(FullScene());
    // The first quad reaches from (0, 0) to (2, 1); the second, scaled by 2, lies around (10, 0). Both rise
    // by 5 until the last frame.
    ExpectHolds(d, R"({
        "format":"POD", "exporter":"made by hand", "frames":4, "framesPerSecond":25, "problems":[],
        "counts":{"cameras":1,"lights":1,"meshes":2,"nodes":5,"meshNodes":2,"textures":1,"materials":2},
        "bounds":{"low":[0.0,-2.0,0.0],"high":[12.0,2.0,0.0]},
        "boundsOverFrames":{"low":[0.0,-2.0,0.0]},
        "nodes":[
        {"index":0,"name":"first","kind":"mesh","depth":0,"parent":-1,"mesh":0,"material":0,"animated":["position"]},
        {"index":1,"name":"second","kind":"mesh","depth":1,"parent":0,"mesh":1,"material":1},
        {"index":2,"name":"lamp","kind":"light","depth":0,"parent":-1},
        {"index":3,"name":"eye","kind":"camera","depth":0,"parent":-1},
        {"index":4,"name":"aim","kind":"plain","depth":1,"parent":3}],
        "meshes":[
        {"index":0,"vertices":4,"faces":2,"strips":0,"indexBits":16,"interleaved":true,"skinned":false,
         "unpackMatrix":false,"elements":[{"name":"positions","type":"float","components":3,"stride":32},
         {"name":"normals","type":"float","components":3,"stride":32},
         {"name":"UV 0","type":"float","components":2,"stride":32}]},
        {"index":1,"vertices":4,"faces":2,"strips":0,"indexBits":32,"interleaved":true,"skinned":false,
         "unpackMatrix":true,"elements":[{"name":"positions","type":"float","components":3,"stride":28},
         {"name":"normals","type":"float","components":3,"stride":28},
         {"name":"colours","type":"normalised unsigned byte","components":4,"stride":28}]}],
        "lights":[{"index":0,"node":2,"type":"directional","colour":[1.0,0.5,0.25],"target":-1}]})");
    EXPECT_NEAR(d["boundsOverFrames"]["high"][1].get<double>(), 7, 1e-4);
    EXPECT_EQ(d["bytes"], std::filesystem::file_size(Path("scene.pod")));
    ExpectHolds(d["materials"][0], R"({"textures":{"diffuse":{"texture":0,"name":"wood.pvr"}}})");
    ExpectHolds(d["materials"][1], R"({"name":"glass \"thin\"","opacity":0.75,"diffuse":[1.0,1.0,1.0]})");
    ExpectHolds(d["textures"][0], R"({"content":{"pixelType":"RGB 565"}})");
    EXPECT_EQ(d["textures"][0]["alphaFile"], Path("wood_a.pvr"));
    EXPECT_EQ(d["translucent"].size(), 2u);
    ExpectHolds(d["cameras"][0], R"({"near":1.0,"far":100.0,"target":4})");
    EXPECT_NEAR(d["cameras"][0]["fovDegrees"].get<double>(), 60, 1e-4);
    const std::string text = ExpectTextAgrees(Path("scene.pod"), d);
    for (const char* part :
         {"made by hand", "  0 first: mesh 0, material 0, animated position\n    1 second: mesh 1",
          "2 lamp: light", "4 frames, 25 a second", "32-bit indices", "glass \"thin\"", "60 degrees",
          "\nTranslucent\n  0 paint: opacity 1, alpha from ",
          "\n  1 glass \"thin\": opacity 0.75; drawn after"})
        EXPECT_TRUE(Contains(text, part)) << part << "\n" << text;
}

TEST_F(QexInfo, NamesEveryProblem) {
    Bytes cut = UniformPvr(pod::kPvrRgba8888, 8, {1, 2, 3, 4});
    cut.pop_back();
    WriteBytes(Path("bgra.pvr"), UniformPvr(pod::kPvrBgra8888, 8, {1, 2, 3, 4}));
    WriteBytes(Path("cut.pvr"), cut);
    WriteText(Path("junk.pvr"), "junk");
    WriteText(Path("broken.png"), "no picture");
    WriteBytes(Path("photo.tga"), TgaFile(1, 1, 32, {1, 2, 3, 128}));
    WriteBytes(Path("sound.pvr"), UniformPvr(pod::kPvrRgba8888, 8, {1, 2, 3, 4}));
    pod::MeshArrays many;
    many.positions.resize(70000);
    many.indices = {0, 1, 2};
    pod::Mesh wide = everything::SkinnedMesh();
    wide.batchBoneMax = wide.bonesPerBatch[0] = 17;
    wide.batchBones.assign(34, 2);
    const std::pair<std::function<void(pod::Scene*)>, const char*> cases[] = {
        // clang-format off
        {[](auto* s) { TextureQuad(s, "gone.png"); }, "texture 0 (gone.png) is missing"},
        {[](auto* s) { TextureQuad(s, "bgra.png"); }, "BGRA 8888 pixels"},
        {[](auto* s) { TextureQuad(s, "cut.pvr"); }, "cut short: 255 bytes of pixels instead of 256"},
        {[](auto* s) { TextureQuad(s, "junk.pvr"); }, "junk.pvr: is neither a PVR texture"},
        {[](auto* s) { s->meshes[0].vertices.components = 0; }, "mesh 0 has no positions"},
        {[](auto* s) { s->meshes[0].normals.components = 0; }, "mesh 0 has no normals"},
        {[](auto* s) { s->meshes[0].faceCount = 0; }, "mesh 0 has no faces"},
        {[](auto* s) { TextureQuad(s, "gone.png"); s->meshes[0].uvw.clear(); }, "mesh 0 has no UVs"},
        {[](auto* s) { s->meshes = {pod::BuildMesh(Quad(NAN, 0, INFINITY, 1))}; },
         "mesh 0: 4 of 4 positions are not finite"},
        {[&](auto* s) { s->meshes = {pod::BuildMesh(many, true)}; },
         "70000 vertices, at most 65,536 can be drawn: the scene is refused"},
        {[&](auto* s) { s->meshes[0] = wide; }, "a batch of 17 bones, at most 16"},
        {FlattenQuad, "mesh node 0 (quad) is scaled to 0: it is not drawn"},
        {[](auto* s) { PlaceQuad(s, {{}, {}, {{0, 0, 0}, {1, 1, 1}}, {}}); s->frameCount = 2; },
         "scaled to 0 at frame 0"},
        {[](auto* s) { s->materials[0].opacity = 0.5f; }, "material 0 (paint) has an opacity of 0.5"},
        {[](auto* s) { s->nodes[0].material = -1; }, "mesh node 0 (quad) has no material"},
        {[](auto* s) { s->nodes[0].material = 9; }, "1 node(s) name a material that is not there"},
        {[](auto* s) { s->cameras[0].target = 9; }, "1 camera(s) have a target that is not there"},
        {[](auto* s) { AddLight(s, pod::kSpotLight, {1, 1, 1}); }, "light 0 is a spot light"},
        {[](auto* s) { s->cameras.clear(); }, "it has no camera"},
        {[](auto* s) { s->cameras[0].nearPlane = 0; }, "camera 0 has its near plane at 0"},
        {RemoveQuad, "it has no mesh nodes"},
        {[](auto* s) { s->materials[0].effectFile = "water.pfx"; },
         "material 0 (paint) has an effect of its own, water.pfx: it is not read"},
        {[](auto* s) { s->textures = {"sound.pvr"}; }, "texture 0 (sound.pvr) belongs to no material"},
        {[](auto* s) { TextureQuad(s, "Photo.PNG"); }, "texture 0 (Photo.PNG) is there as a picture only"},
        {[](auto* s) { TextureQuad(s, "broken.png"); }, "broken.png: is no PNG, JPEG, TGA"},
        {[](auto* s) { PlaceQuad(s, {{{0, 0, 0}, {1, 0, 0}}, {}, {}, {}}); s->nodes.assign(3, s->nodes[0]);
                       s->meshNodeCount = 3; s->cameras.clear(); s->frameCount = 12; },
         "node 0: position has fewer keys than frames; it holds the last key (and 2 more like this)"},
        // clang-format on
    };
    for (const auto& [change, part] : cases) {
        pod::Scene scene = QuadScene();
        change(&scene);
        const std::string text = ExpectTextAgrees(Path("scene.pod"), Info(scene));
        EXPECT_TRUE(Contains(text.substr(text.find("\n  - ")), part)) << part << "\n" << text;
    }
}

TEST_F(QexInfo, NodesMayLeanAndNamesMayHoldAnything) {
    pod::Scene scene = QuadScene();
    PlaceQuad(&scene, {{}, {}, {}, {{1, 0, 0, 0, 0.5f, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}}});
    scene.nodes[0].name = "a\nb\x1b[31m\xff";
    const Json document = Info(scene);
    EXPECT_EQ(document["problems"], Json::array());
    EXPECT_EQ(document["nodes"][0]["name"], "a b?[31m\xEF\xBF\xBD");
    EXPECT_EQ(document["bounds"]["high"], Json::parse("[2.5,1.0,0.0]"));
    EXPECT_FALSE(Contains(Run({"info", Path("scene.pod")}).out, "\x1b"));
}

TEST_F(QexInfo, TellsWhatTexturesHold) {
    WriteBytes(Path("a.ktx"), UniformKtx(4, {1, 2, 3, 4}));
    ExpectHolds(Info(Path("a.ktx")), R"json({"glFormat":"GL_RGBA (0x1908)", "loads":true,
        "keyValues":[{"key":"author","value":"me"}], "levelSizes":[{"width":4,"height":4,"bytes":64}]})json");

    pod::PvrImage cube;
    cube.type = pod::kPvrRgb888;
    cube.width = cube.height = 4;
    cube.surfaces.assign(6, {Bytes(48), Bytes(12), Bytes(3)});
    WriteBytes(Path("cube.pvr"), pod::WritePvr(cube));
    ExpectHolds(Info(Path("cube.pvr")), R"({"header":"52 bytes", "pixelType":"RGB 888", "levels":3,
        "surfaces":6, "cubeMap":true, "surfaceBytes":63, "pixelBytes":378})");

    // Sound; compressed; grey; 16 bits a pixel; 32, for which the bytes do not reach; no width.
    const size_t changes[][2] = {{2, 2}, {2, 10}, {2, 3}, {16, 16}, {16, 32}, {12, 0}};
    for (const auto& [at, value] : changes) {
        Bytes tga = TgaFile(3, 2, 24, Bytes(18));
        tga[17] = 0x20;
        tga[at] = static_cast<uint8_t>(value);
        WriteBytes(Path("a.tga"), tga);
        const Json document = Info(Path("a.tga"));
        for (const bool sound : {bool(document["loads"]), document["problems"].empty()})
            EXPECT_EQ(sound, value == 2) << document;
        EXPECT_EQ(document["origin"], "upper left");
        ExpectTextAgrees(Path("a.tga"), document);
    }
}

// What it says of a texture is what the engine then does with it: all PVR types, every kind of damage.
TEST_F(QexInfo, JudgesTexturesAsTheEngineDoes) {
    std::string error;
    const auto context = qex::HeadlessContext::Create(16, 16, &error);
    ASSERT_TRUE(context) << error;
    std::vector<std::string> files;
    const auto add = [&](const std::string& name, const Bytes& bytes) {
        WriteBytes(Path(name), bytes);
        files.push_back(Path(name));
    };
    for (uint32_t type = 0; type < 0x40; ++type)
        add("type" + std::to_string(type) + ".pvr", UniformPvr(type, 16, Bytes(4)));
    // Header words, each set to values that fit and that do not.
    for (const uint32_t value : {0u, 1u, 2u, 7u, 0x1907u, 0x8034u, 0xFFFFFFFFu})
        for (size_t at = 4; at < 64; at += 4) {
            Bytes ktx = UniformKtx(4, {1, 2, 3, 4}), pvr = UniformPvr(pod::kPvrRgba8888, 4, {1, 2, 3, 4});
            PutWord(&ktx, at, value);
            PutWord(&pvr, at, value);
            const std::string name = std::to_string(at) + "_" + std::to_string(value);
            if (at >= 12) add(name + ".ktx", ktx);
            if (at < 52) add(name + ".pvr", pvr);
        }
    std::vector<std::string> arguments = {"info", "--json"};
    arguments.insert(arguments.end(), files.begin(), files.end());
    std::map<std::string, bool> said;  // what is no texture at all is missing
    for (const Json& document : Json::parse(Run(arguments).out)) {
        // Compressed KTX formats other than ETC1 are up to the GL.
        if (Contains(document.dump(), "only a GL with the extension")) continue;
        said[document["file"]] = document["loads"];
    }
    for (const std::string& file : files) {
        BothOutputs outputs;
        QexTexture texture = {};
        const bool loads = QexTexture_LoadPVRFromFile(&texture, file.c_str(), nullptr, 1, 0) == 0;
        if (loads) QexTexture_Release(&texture);
        EXPECT_EQ(said[file], loads) << file;
    }
}

TEST_F(QexInfo, DamagedScenesAreShownOrRefusedInOneLine) {
    const Bytes whole = pod::WritePod(FullScene());
    int results[2] = {};  // shown and refused
    for (size_t at = 0; at + 4 <= whole.size(); at += 28) {
        Bytes file = whole;
        PutWord(&file, at, 0xFFFFFFFF);
        WriteBytes(Path("damaged.pod"), file);
        const CommandResult result = Run({"info", Path("damaged.pod")});
        EXPECT_EQ(CountLines(result.err), result.status) << "word at " << at << "\n" << result.err;
        EXPECT_EQ(result.out.empty(), result.status == 1) << "word at " << at;
        ++results[result.status != 0];
    }
    EXPECT_GT(std::min(results[0], results[1]), 5);
}
