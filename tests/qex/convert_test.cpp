#include <cmath>
#include <map>

#include "common/SceneBounds.h"
#include "convert/Meshes.h"
#include "qex/ConvertSupport.h"

namespace {

using Floats = std::vector<float>;

void ExpectNear(const Floats& actual, const Floats& expected, float tolerance = 1e-5f) {
    ASSERT_EQ(actual.size(), expected.size());
    for (size_t i = 0; i < actual.size(); ++i)
        EXPECT_NEAR(actual[i], expected[i], tolerance) << "entry " << i;
}
void ExpectNear(const float* actual, const Floats& expected, float tolerance = 1e-5f) {
    ASSERT_NE(actual, nullptr);
    ExpectNear(Floats(actual, actual + expected.size()), expected, tolerance);
}

// A column, 0 to 2, of a node's rotation at a frame.
Floats Axis(QexPODModel* scene, QexPODNode* node, size_t column, uint32_t frame = 0) {
    QexMatrix m;
    QexPODModel_SetNodeAnimationFrameA(scene, node, static_cast<float>(frame));
    QexPODModel_GetRotationMatrix(scene, &m, node);
    return Floats(m.m + 4 * column, m.m + 4 * column + 3);
}

TEST_F(ConvertTest, QuadKeepsPositionsUvsAndMaterial) {
    const QexPODModel& s = ConvertQuad("Kd 0.5 0.25 1\nKa 0.125 0 0\nKs 1 1 1\nNs 64\nd 0.75\n");
    const QexPODMesh& mesh = s.meshes[0];
    ASSERT_EQ(mesh.vertexCount, 4u);
    ASSERT_EQ(mesh.faceCount, 2u);
    const auto at = [&](uint32_t vertex) { return VertexValue(mesh, mesh.vertices, vertex); };
    for (uint32_t i = 0; i < 4; ++i) {
        // v = 0 is the lower edge: on this quad u = (x + 1) / 2 and v = (y + 1) / 2.
        const QexVec4 uv = VertexValue(mesh, mesh.uvws[0], i);
        EXPECT_FLOAT_EQ(uv.x, (at(i).x + 1) / 2);
        EXPECT_FLOAT_EQ(uv.y, (at(i).y + 1) / 2);
        EXPECT_FLOAT_EQ(VertexValue(mesh, mesh.normals, i).z, 1);
    }
    // Both triangles keep their counter-clockwise order.
    for (uint32_t t = 0; t < 6; t += 3) {
        const QexVec4 a = at(VertexOfCorner(mesh, t)), b = at(VertexOfCorner(mesh, t + 1)),
                      c = at(VertexOfCorner(mesh, t + 2));
        EXPECT_FLOAT_EQ((b.x - a.x) * (c.y - a.y) - (b.y - a.y) * (c.x - a.x), 4);
    }
    const QexPODMaterial& material = s.materials[0];
    ExpectNear(material.diffuse, {0.5f, 0.25f, 1}, 0);
    ExpectNear(material.ambient, {0.125f, 0, 0}, 0);
    EXPECT_EQ(material.shininess, 64 / 256.0f);
    EXPECT_EQ(material.opacity, 0.75f);
    EXPECT_EQ(material.diffuseTexture, -1);
}

TEST_F(ConvertTest, LargeMeshIsSplitWithoutLoss) {
    pod::MeshArrays fan;
    for (int i = 0; i < 8; ++i) fan.positions.push_back({float(i), 0, 0});
    for (uint32_t i = 1; i < 7; ++i) fan.indices.insert(fan.indices.end(), {0, i, i + 1});
    size_t index = 0;
    for (const pod::MeshArrays& piece : SplitMesh(fan, 5)) {
        EXPECT_LE(piece.positions.size(), 5u);
        for (const uint32_t i : piece.indices)
            EXPECT_EQ(piece.positions.at(i), fan.positions[fan.indices.at(index++)]);
    }
    EXPECT_EQ(index, fan.indices.size());

    // One triangle after another, 70,002 vertices in all.
    std::string obj;
    for (int i = 1; i <= 70002; i += 3) {
        const std::string x = std::to_string(i);
        obj += "v " + x + " 0 0\nv " + x + " 1 0\nv " + x + " 0 1\n";
        obj += "f " + x + " " + std::to_string(i + 1) + " " + std::to_string(i + 2) + "\n";
    }
    WriteText(Path("large.obj"), obj);
    const QexPODModel& s = Convert(Path("large.obj"));
    uint32_t vertices = 0, triangles = 0;
    for (uint32_t i = 0; i < s.meshCount; ++i) {
        EXPECT_LE(s.meshes[i].vertexCount, 65535u);
        vertices += s.meshes[i].vertexCount;
        triangles += s.meshes[i].faceCount;
    }
    EXPECT_EQ(s.meshNodeCount, 2u);
    EXPECT_EQ(vertices, 70002u);
    EXPECT_EQ(triangles, 23334u);
}

// The triangle of a node "tri", which moves, a camera and a spot light below it, and a camera node "fly" that
// turns; the triangle twice more under matrices. Sampled at four frames a second over one second.
class ConvertNodes : public ConvertTest {
  protected:
    void SetUp() override {
        ConvertTest::SetUp();
        const float h = std::sqrt(0.5f);
        const Floats data = {0, 0, 0, 1, 0, 0, 0, 1, 0,  // triangle
                             0, 1,                       // times
                             0, 0, 0, 2, 4, 6,           // positions
                             0, 0, 0, 1, 0, h, 0, h};    // rotations: a quarter turn about +Y
        Bytes bin(data.size() * 4);
        std::memcpy(bin.data(), data.data(), bin.size());
        WriteBytes(Path("a.bin"), bin);
        WriteText(Path("a.gltf"), R"({"asset":{"version":"2.0"},"scene":0,"scenes":[{"nodes":[0,3,4,5]}],
 "extensionsUsed":["KHR_lights_punctual"],
 "extensions":{"KHR_lights_punctual":{"lights":[{"type":"spot","intensity":4,"color":[1,0.5,0.25],
   "spot":{"outerConeAngle":0.5}}]}},
 "cameras":[{"type":"perspective","perspective":{"aspectRatio":1.5,"yfov":0.6,"znear":0.1,"zfar":50}},
   {"type":"perspective","perspective":{"aspectRatio":1,"yfov":0.5,"znear":0.5,"zfar":5}}],
 "nodes":[{"name":"tri","mesh":0,"children":[1,2]},
  {"name":"eye","camera":0,"translation":[1,2,3]},
  {"name":"lamp","rotation":[0.70710678,0,0,0.70710678],"extensions":{"KHR_lights_punctual":{"light":0}}},
  {"name":"fly","camera":1},
  {"name":"mirror","mesh":0,"matrix":[-2,0,0,0,0,3,0,0,0,0,4,0,5,6,7,1]},
  {"name":"shear","mesh":0,"matrix":[1,0,0,0,1,1,0,0,0,0,1,0,5,6,7,1]}],
 "meshes":[{"primitives":[{"attributes":{"POSITION":0}}]}],
 "animations":[{"channels":[{"sampler":0,"target":{"node":0,"path":"translation"}},
   {"sampler":1,"target":{"node":3,"path":"rotation"}}],
  "samplers":[{"input":1,"output":2},{"input":1,"output":3}]}],
 "accessors":[{"bufferView":0,"componentType":5126,"count":3,"type":"VEC3","min":[0,0,0],"max":[1,1,0]},
  {"bufferView":0,"byteOffset":36,"componentType":5126,"count":2,"type":"SCALAR","min":[0],"max":[1]},
  {"bufferView":0,"byteOffset":44,"componentType":5126,"count":2,"type":"VEC3"},
  {"bufferView":0,"byteOffset":68,"componentType":5126,"count":2,"type":"VEC4"}],
 "bufferViews":[{"buffer":0,"byteLength":100}],"buffers":[{"byteLength":100,"uri":"a.bin"}]})");
        scene_ = &Convert(Path("a.gltf"), TextureFormat::kEtc1, 4);
        for (uint32_t i = 0; i < scene_->nodeCount; ++i) nodes_[scene_->nodes[i].name] = &scene_->nodes[i];
    }

    QexPODModel* scene_;
    std::map<std::string, QexPODNode*> nodes_;
};

TEST_F(ConvertNodes, KeysFollowTheAnimation) {
    EXPECT_EQ(scene_->frameCount, 5u);
    EXPECT_EQ(scene_->framesPerSecond, 4u);
    // Only the position of "tri" is animated: five keys on a straight line.
    const QexPODNode& tri = *nodes_["tri"];
    EXPECT_EQ(tri.animationFlags, QEX_NODE_POSITION_ANIMATED);
    ExpectNear(tri.position, {0, 0, 0, 0.5f, 1, 1.5f, 1, 2, 3, 1.5f, 3, 4.5f, 2, 4, 6});
    ExpectNear(tri.rotation, {0, 0, 0, 1});

    // "fly" turns a quarter about +Y. A camera node looks along -Y with -Z up, so at first its Y axis is +Z
    // and its Z axis -Y; at the end the view along -Z has become one along -X.
    EXPECT_EQ(nodes_["fly"]->animationFlags, QEX_NODE_ROTATION_ANIMATED);
    for (uint32_t k = 0; k < 5; ++k) {
        const float angle = float(k) * 22.5f * 3.14159265f / 180;
        ExpectNear(Axis(scene_, nodes_["fly"], 1, k), {std::sin(angle), 0, std::cos(angle)});
        ExpectNear(Axis(scene_, nodes_["fly"], 2, k), {0, -1, 0});
    }
}

TEST_F(ConvertNodes, ComeInOrderWithCamerasAndLights) {
    const struct {
        const char* name;
        int object, parent;
    } rows[] = {{"tri", 0, -1}, {"mirror", 0, -1}, {"shear", 0, -1},
                {"lamp", 0, 0}, {"eye", 0, 0},     {"fly", 1, -1}};
    ASSERT_EQ(scene_->nodeCount, 6u);
    EXPECT_EQ(scene_->meshNodeCount, 3u);
    for (size_t i = 0; i < 6; ++i) {
        EXPECT_STREQ(scene_->nodes[i].name, rows[i].name);
        EXPECT_EQ(scene_->nodes[i].objectIndex, rows[i].object);
        EXPECT_EQ(scene_->nodes[i].parentIndex, rows[i].parent);
    }
    // A quarter turn about +X carries the light's -Z to +Y; lights shine along their node's -Z.
    ExpectNear(Axis(scene_, nodes_["lamp"], 2), {0, -1, 0});
    const QexPODLight& lamp = scene_->lights[0];
    EXPECT_EQ(lamp.type, uint32_t{pod::kSpotLight});
    ExpectNear(lamp.colour, {1, 0.5f, 0.25f});
    EXPECT_NEAR(lamp.fallOffAngle, 0.5f, 1e-5f);
    ExpectNear(nodes_["eye"]->position, {1, 2, 3});
    // The width's angle of a height's angle 0.6 at an aspect of 1.5: 2 atan(1.5 tan 0.3).
    const QexPODCamera& eye = scene_->cameras[0];
    ExpectNear({eye.fov, eye.farPlane, eye.nearPlane}, {0.868878f, 50, 0.1f});
    EXPECT_EQ(eye.targetIndex, -1);
}

TEST_F(ConvertNodes, MirrorAndShear) {
    QexMatrix world;
    QexPODModel_GetWorldMatrix(scene_, &world, nodes_["mirror"]);
    ExpectNear(world.m, {-2, 0, 0, 0, 0, 3, 0, 0, 0, 0, 4, 0, 5, 6, 7, 1});
    // No rotation and scale make a shear: the node has a column-major matrix instead.
    const QexPODNode& shear = *nodes_["shear"];
    EXPECT_EQ(shear.position, nullptr);
    ExpectNear(shear.matrix, {1, 0, 0, 0, 1, 1, 0, 0, 0, 0, 1, 0, 5, 6, 7, 1});
    EXPECT_EQ(shear.animationFlags, 0u);
}

// ---- Placement ----

std::vector<QexVec3> PointsAt(QexPODModel* scene, float frame) {
    std::vector<QexVec3> points;
    QexPODModel_SetFrame(scene, frame);
    for (uint32_t i = 0; i < scene->meshNodeCount; ++i) CollectPoints(scene, i, 100000, &points);
    return points;
}

// Every point, camera and light of a scene is where the one of the scene as it was goes to when space is
// turned and scaled: in a scene with animation, mirror and shear, and in one with bones.
TEST_F(ConvertNodes, StandUprightInAnySize) {
    const struct {
        UpAxis up;
        float factor;
        Floats turn;  // where +X, +Y and +Z go
    } rows[] = {{UpAxis::kY, 0.5f, {1, 0, 0, 0, 1, 0, 0, 0, 1}},
                {UpAxis::kZ, 3, {1, 0, 0, 0, 0, -1, 0, 1, 0}},
                {UpAxis::kMinusZ, 1, {1, 0, 0, 0, 0, 1, 0, -1, 0}},
                {UpAxis::kX, 2, {0, 1, 0, -1, 0, 0, 0, 0, 1}},
                {UpAxis::kMinusX, 1e-3f, {0, -1, 0, 1, 0, 0, 0, 0, 1}},
                {UpAxis::kMinusY, 1, {-1, 0, 0, 0, -1, 0, 0, 0, 1}}};
    const std::string bison = "/usr/share/assimp/models/X/Testwuson.X";
    for (const std::string& file : {Path("a.gltf"), bison}) {
        if (!std::filesystem::exists(file)) continue;
        Convert(file);
        const auto before = std::move(pod_);
        for (const auto& row : rows) {
            ConvertOptions options = Options(file);
            options.placement = {row.up, row.factor};
            ASSERT_EQ(Run(options), 0) << said_;
            QexPODModel &was = before->scene, &is = Read();
            const auto moved = [&](const QexVec3& p, float factor) -> QexVec3 {
                const float* t = row.turn.data();
                return {factor * (t[0] * p.x + t[3] * p.y + t[6] * p.z),
                        factor * (t[1] * p.x + t[4] * p.y + t[7] * p.z),
                        factor * (t[2] * p.x + t[5] * p.y + t[8] * p.z)};
            };
            const auto expectSame = [&](const QexVec3& a, const QexVec3& b, float factor) {
                EXPECT_NEAR(a.x, b.x, 1e-4f * factor);
                EXPECT_NEAR(a.y, b.y, 1e-4f * factor);
                EXPECT_NEAR(a.z, b.z, 1e-4f * factor);
            };
            for (const float frame : {0.0f, 1.0f, 17.5f}) {
                const auto from = PointsAt(&was, frame), to = PointsAt(&is, frame);
                ASSERT_EQ(from.size(), to.size());
                for (size_t i = 0; i < from.size() && !HasFailure(); ++i)
                    expectSame(to[i], moved(from[i], row.factor), row.factor);
                // Lights and cameras come after the meshes; their axes keep their length.
                for (uint32_t i = was.meshNodeCount; i < was.meshNodeCount + was.lightCount + was.cameraCount;
                     ++i) {
                    QexMatrix a, b;
                    QexPODModel_GetWorldMatrix(&was, &a, &was.nodes[i]);
                    QexPODModel_GetWorldMatrix(&is, &b, &is.nodes[i]);
                    for (int c = 0; c < 4; ++c) {
                        const float factor = c == 3 ? row.factor : 1, *p = a.m + 4 * c, *q = b.m + 4 * c;
                        expectSame({q[0], q[1], q[2]}, moved({p[0], p[1], p[2]}, factor), factor);
                    }
                }
            }
            for (uint32_t i = 0; i < was.lightCount; ++i)
                EXPECT_NEAR(is.lights[i].quadraticAttenuation * row.factor * row.factor,
                            was.lights[i].quadraticAttenuation, 1e-5f);
            for (uint32_t i = 0; i < was.cameraCount; ++i)
                ExpectNear({is.cameras[i].nearPlane, is.cameras[i].farPlane},
                           {was.cameras[i].nearPlane * row.factor, was.cameras[i].farPlane * row.factor});
        }
        ConvertOptions options = Options(file);
        options.placement.fit = 7.5f;
        ASSERT_EQ(Run(options), 0) << said_;
        EXPECT_NEAR(BoundsOf(PointsAt(&Read(), file == bison ? 1 : 0)).LongestEdge(), 7.5f, 1e-3f);
    }
}

TEST_F(ConvertTest, ErrorsAreOneLineAndAStatus) {
    WriteText(Path("q.obj"), "v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n");
    WriteText(Path("points.obj"), "v 0 0 0\nv 1 0 0\np 1 2\n");
    WriteText(Path("broken.gltf"), "{\"asset\":");
    WriteText(Path("skin.gltf"), R"({"skins":[{"inverseBindMatrices":0},{"joints":[1]}]})");
    WriteText(Path("skin.glb"), std::string("glTF\2\0\0\0\x20\0\0\0\x0e\0\0\0JSON{\"skins\":[{}]}", 34));
    WriteText(Path("notes.txt"), "no scene");
    const std::string good = Path("q.obj"), out = Path("out.pod");
    const struct {
        std::string input, output;
        int status;
        const char* says;
    } rows[] = {
        {good, Path("no/such/out.pod"), 2, "folder does not exist"},
        {good, folder_.string(), 2, "no file name"},
        {good, "", 2, "no file name"},
        {good, good, 2, "is the input"},
        {Path("none.obj"), out, 1, "existing scene file is expected"},
        {Path("broken.gltf"), out, 1, "cannot be read as a scene"},
        {Path("skin.gltf"), out, 1, "skin 1 has no inverse bind matrices"},
        {Path("skin.glb"), out, 1, "skin 0 has no inverse bind matrices"},
        {Path("notes.txt"), out, 1, "cannot be read as a scene"},
        {Path("points.obj"), out, 1, "holds no triangles"},
    };
    for (const auto& row : rows) {
        ConvertOptions options = Options(row.input);
        options.output = row.output;
        EXPECT_EQ(Run(options), row.status) << said_;
        EXPECT_TRUE(Contains(said_, row.says)) << said_;
        EXPECT_EQ(said_.rfind("qex convert: ", 0), 0u) << said_;
        EXPECT_EQ(CountLines(said_), 1) << said_;
    }
    EXPECT_FALSE(std::filesystem::exists(out));
}

// Models of the system's packages, and the counts of their files: the duck's 4,212 triangles are the <p>
// lists of its .dae.
TEST_F(ConvertTest, ModelsFromThePackages) {
    const std::string assimp = "/usr/share/assimp/models/", glmark = "/usr/share/glmark2/models/";
    const struct {
        std::string file;
        uint32_t triangles, cameras, lights, textures;
    } rows[] = {{assimp + "OBJ/spider.obj", 1312, 0, 0, 4},
                {assimp + "glTF2/BoxTextured-glTF-Binary/BoxTextured.glb", 12, 0, 0, 1},
                {glmark + "horse.3ds", 7172, 0, 0, 0},
                {assimp + "Collada/duck.dae", 4212, 1, 1, 1}};
    QexPODModel* s = nullptr;
    for (const auto& row : rows) {
        if (!std::filesystem::exists(row.file)) GTEST_SKIP() << row.file << " is not installed";
        s = &Convert(row.file, TextureFormat::kEtc1);
        uint32_t triangles = 0;
        for (uint32_t i = 0; i < s->meshCount; ++i) triangles += s->meshes[i].faceCount;
        EXPECT_EQ(triangles, row.triangles) << row.file;
        EXPECT_EQ(s->cameraCount, row.cameras);
        EXPECT_EQ(s->lightCount, row.lights);
        EXPECT_EQ(s->textureCount, row.textures);
        for (uint32_t i = 0; i < s->textureCount; ++i)
            EXPECT_FALSE(ReadBytes(Path(s->textures[i].name)).empty());
    }
    // The duck's camera: 37.8492 degrees high at an aspect of 1.5 is 54.43 degrees across. It looks along its
    // node's -Z, which the file's matrix gives as (-0.536475, -0.621148, 0.571288).
    EXPECT_NEAR(s->cameras[0].fov, 0.950019f, 1e-4f);
    for (uint32_t i = 0; i < s->nodeCount; ++i)
        if (s->nodes[i].name == std::string("camera1"))
            return ExpectNear(Axis(s, &s->nodes[i], 1), {0.536475f, 0.621148f, -0.571288f}, 1e-4f);
    FAIL() << "no node camera1";
}

}  // namespace
