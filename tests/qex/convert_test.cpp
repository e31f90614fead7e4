#include <cmath>
#include <cstring>
#include <map>
#include <set>

#include "common/SceneBounds.h"
#include "qex/ConvertSupport.h"

namespace {

using Floats = std::vector<float>;

void ExpectNear(const Floats& actual, const Floats& expected, float tolerance = 1e-5f) {
    for (size_t i = 0; i < expected.size(); ++i)
        EXPECT_NEAR(actual[i], expected[i], tolerance) << "entry " << i;
}
// A scene's numbers lie in its file, wherever they begin.
void ExpectNear(const float* actual, const Floats& expected, float tolerance = 1e-5f) {
    ASSERT_NE(actual, nullptr);
    Floats values(expected.size());
    memcpy(values.data(), actual, values.size() * sizeof(float));
    ExpectNear(values, expected, tolerance);
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
    const auto corner = [&](uint32_t i) { return at(VertexOfCorner(mesh, i)); };
    for (uint32_t t = 0; t < 6; t += 3) {
        const QexVec4 a = corner(t), b = corner(t + 1), c = corner(t + 2);
        EXPECT_FLOAT_EQ((b.x - a.x) * (c.y - a.y) - (b.y - a.y) * (c.x - a.x), 4);
    }
    const QexPODMaterial& m = s.materials[0];
    ExpectNear(m.diffuse, {0.5f, 0.25f, 1}, 0);
    ExpectNear(m.ambient, {0.125f, 0, 0}, 0);
    ExpectNear({m.shininess, m.opacity}, {64 / 256.0f, 0.75f}, 0);
    EXPECT_EQ(m.diffuseTexture, -1);
}

// A fan of 70,000 vertices around the first one; a vertex is as far from it as its number says.
TEST_F(ConvertTest, LargeMeshIsSplitWithoutLoss) {
    std::string obj = "v 0 0 0\nv 2 0 0\n";
    for (int i = 3; i <= 70000; ++i) {
        const std::string last = std::to_string(i - 1), next = std::to_string(i);
        obj += "v " + next + (i % 2 ? " 1" : " 0") + " 0\nf 1 " + last + " " + next + "\n";
    }
    WriteText(Path("fan.obj"), obj);
    const QexPODModel& s = Convert(Path("fan.obj"));
    EXPECT_EQ(s.meshNodeCount, 2u);
    std::set<float> edges;
    for (uint32_t m = 0; m < s.meshCount; ++m) {
        const QexPODMesh& mesh = s.meshes[m];
        EXPECT_LE(mesh.vertexCount, 65535u);
        for (uint32_t t = 0; t < 3 * mesh.faceCount; t += 3) {
            std::set<float> x;
            for (uint32_t i = t; i < t + 3; ++i)
                x.insert(VertexValue(mesh, mesh.vertices, VertexOfCorner(mesh, i)).x);
            edges.insert(*x.rbegin());
            EXPECT_EQ(x, (std::set<float>{0, *x.rbegin() - 1, *x.rbegin()}));
        }
    }
    EXPECT_EQ(edges.size(), 69998u);
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
    std::string nodes;  // with their objects and parents
    for (const QexPODNode* n = scene_->nodes; n != scene_->nodes + scene_->nodeCount; ++n)
        nodes +=
            n->name + (" " + std::to_string(n->objectIndex)) + " " + std::to_string(n->parentIndex) + ", ";
    EXPECT_EQ(nodes, "tri 0 -1, mirror 0 -1, shear 0 -1, lamp 0 0, eye 0 0, fly 1 -1, ");
    EXPECT_EQ(scene_->meshNodeCount, 3u);
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
    const std::pair<const char*, Floats> rows[] = {
        {"mirror", {-2, 0, 0, 0, 0, 3, 0, 0, 0, 0, 4, 0, 5, 6, 7, 1}},
        {"shear", {1, 0, 0, 0, 1, 1, 0, 0, 0, 0, 1, 0, 5, 6, 7, 1}}};
    for (const auto& [name, matrix] : rows) {
        QexMatrix world;
        QexPODModel_GetWorldMatrix(scene_, &world, nodes_[name]);
        ExpectNear(world.m, matrix);
    }
    // No rotation and scale make a shear: the node has a matrix instead.
    EXPECT_EQ(nodes_["shear"]->position, nullptr);
}

// ---- Placement

// Where the meshes, cameras and lights of a scene are at a frame, and the tips of the latter's axes.
std::vector<QexVec3> PointsAt(QexPODModel* scene, float frame, float axis = 1) {
    std::vector<QexVec3> points;
    QexPODModel_SetFrame(scene, frame);
    for (uint32_t i = 0; i < scene->meshNodeCount; ++i) CollectPoints(scene, i, 100000, &points);
    for (uint32_t i = 0; i < scene->lightCount + scene->cameraCount; ++i) {
        QexMatrix m;
        QexPODModel_GetWorldMatrix(scene, &m, &scene->nodes[scene->meshNodeCount + i]);
        for (const QexVec3& tip : {QexVec3{0, 0, 0}, {axis, 0, 0}, {0, axis, 0}, {0, 0, axis}})
            QexMatrix_TransformHomoVec3(&m, &tip, &points.emplace_back(), 1);
    }
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
        ConvertOptions options = Options(file);
        Convert(file);
        const auto before = std::move(pod_);
        for (const auto& row : rows) {
            options.placement = {row.up, row.factor};
            ASSERT_EQ(Run(options), 0) << said_;
            QexPODModel &was = before->scene, &is = Read();
            for (const float frame : {0.0f, 1.0f, 17.5f}) {
                const auto from = PointsAt(&was, frame), to = PointsAt(&is, frame, row.factor);
                ASSERT_EQ(from.size(), to.size());
                for (size_t i = 0; i < from.size() && !HasFailure(); ++i) {
                    Floats at(3);
                    for (size_t k = 0; k < 9; ++k)
                        at[k % 3] += row.factor * row.turn[k] * (&from[i].x)[k / 3];
                    ExpectNear(&to[i].x, at, 1e-4f * row.factor);
                }
            }
            for (uint32_t i = 0; i < was.lightCount; ++i)
                EXPECT_NEAR(is.lights[i].quadraticAttenuation * row.factor * row.factor,
                            was.lights[i].quadraticAttenuation, 1e-5f);
            for (uint32_t i = 0; i < was.cameraCount; ++i)
                ExpectNear({is.cameras[i].nearPlane, is.cameras[i].farPlane},
                           {was.cameras[i].nearPlane * row.factor, was.cameras[i].farPlane * row.factor});
        }
        if (file != bison) continue;  // which has no cameras and lights
        options.placement = {UpAxis::kY, 1, 7.5f};
        ASSERT_EQ(Run(options), 0) << said_;
        EXPECT_NEAR(BoundsOf(PointsAt(&Read(), 1)).LongestEdge(), 7.5f, 1e-3f);
    }
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
    for (const auto& row : rows) {
        if (!std::filesystem::exists(row.file)) GTEST_SKIP() << row.file << " is not installed";
        const QexPODModel& s = Convert(row.file, TextureFormat::kEtc1);
        uint32_t triangles = 0;
        for (uint32_t i = 0; i < s.meshCount; ++i) triangles += s.meshes[i].faceCount;
        EXPECT_EQ(triangles, row.triangles) << row.file;
        EXPECT_EQ(s.cameraCount, row.cameras);
        EXPECT_EQ(s.lightCount, row.lights);
        EXPECT_EQ(s.textureCount, row.textures);
    }
}

}  // namespace
