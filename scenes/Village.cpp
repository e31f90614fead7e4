// Houses, trees, and the ground they stand on.
#include "Village.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <string>

#include "Shapes.h"

namespace scenes {

namespace {

using pod::MeshArrays;
using pod::Vec3;
using shapes::UvRect;

constexpr UvRect kWhole = {0, 0, 1, 1};
// Parts of the walls' texture: a front with its door, a side, plain plaster.
constexpr UvRect kFront = {0, 0, 0.5f, 1}, kSide = {0.5f, 0, 1, 1}, kPlaster = {0.74f, 0.8f, 0.76f, 0.82f};
// Parts of the trees' texture.
constexpr UvRect kBark = {0, 0, 0.25f, 1}, kLeaves = {0.28f, 0, 1, 1};

struct Look {
    const char* texture;
    Vec3 diffuse, ambient;
};
constexpr Vec3 kSun = {0.85f, 0.85f, 0.85f}, kShade = {0.36f, 0.4f, 0.48f}, kDim = {0.25f, 0.25f, 0.3f},
               kNone = {0, 0, 0}, kFull = {1, 1, 1};
const Look kLooks[] = {
    {"dome.pvr", kNone, kFull},   {"grass.pvr", kSun, kShade},   {"cobbles.pvr", kSun, kShade},
    {"walls.pvr", kSun, kShade},  {"roof.pvr", kSun, kShade},    {"tree.pvr", kSun, kShade},
    {"stones.pvr", kSun, kShade}, {"planks.pvr", kSun, kShade},  {"lamp.pvr", kNone, kFull},
    {"amphora.pvr", kSun, kDim},  {"porcelain.pvr", kSun, kDim}, {"fruit.pvr", kSun, kDim},
    {"table.pvr", kSun, kDim}};

int32_t LookOf(const char* texture) {
    int32_t index = 0;
    while (strcmp(kLooks[index].texture, texture) != 0) ++index;
    return index;
}

// Scenes of meshes that several nodes draw.
class Builder {
  public:
    Builder() {
        for (const Look& look : kLooks) {
            pod::Material material;
            material.name = look.texture;
            material.diffuseTexture = static_cast<int32_t>(scene_.textures.size());
            material.diffuse = look.diffuse;
            material.ambient = look.ambient;
            scene_.textures.push_back(look.texture);
            scene_.materials.push_back(material);
        }
    }

    int32_t AddMesh(const MeshArrays& mesh) {
        scene_.meshes.push_back(pod::BuildMesh(mesh));
        return static_cast<int32_t>(scene_.meshes.size()) - 1;
    }

    // Turned about the vertical, in degrees.
    void Place(const std::string& name, int32_t mesh, const char* texture, const Vec3& at, float turn = 0,
               float size = 1) {
        const float half = turn * 3.14159265f / 360;
        const pod::Transform place = {
            {at}, {{0, std::sin(half), 0, std::cos(half)}}, {{size, size, size}}, {}};
        scene_.nodes.push_back(pod::BuildNode(name, place, -1, mesh, LookOf(texture)));
    }

    // Of the last node.
    void Shine(float specular, float shininess) {
        pod::Material material = scene_.materials[static_cast<size_t>(scene_.nodes.back().material)];
        material.specular.fill(specular);
        material.shininess = shininess;
        scene_.nodes.back().material = static_cast<int32_t>(scene_.materials.size());
        scene_.materials.push_back(material);
    }

    pod::Scene Take() {
        scene_.meshNodeCount = static_cast<uint32_t>(scene_.nodes.size());
        return std::move(scene_);
    }

  private:
    pod::Scene scene_;
};

// Seen from inside.
MeshArrays Dome() {
    MeshArrays mesh;
    shapes::AddBlob({0, -2, 0}, {-70, 70, 70}, 24, kWhole, &mesh);
    return mesh;
}

MeshArrays Ground() {
    constexpr int kCells = 30;
    constexpr float kCell = 3;
    MeshArrays mesh;
    for (int z = 0; z <= kCells; ++z)
        for (int x = 0; x <= kCells; ++x) {
            const float east = kCell * static_cast<float>(x - kCells / 2),
                        south = kCell * static_cast<float>(z - kCells / 2);
            const auto height = [&](float dx, float dz) { return VillageGround(east + dx, south + dz); };
            const float across = height(-0.5f, 0) - height(0.5f, 0),
                        along = height(0, -0.5f) - height(0, 0.5f);
            const float length = std::hypot(across, 1.0f, along);
            mesh.positions.push_back({east, height(0, 0), south});
            mesh.normals.push_back({across / length, 1 / length, along / length});
            mesh.uvs.push_back({east / 5, south / 5});
        }
    for (uint32_t z = 0; z < kCells; ++z)
        for (uint32_t x = 0; x < kCells; ++x) {
            const uint32_t a = z * (kCells + 1) + x, b = a + kCells + 1;
            for (const uint32_t i : {a, b, a + 1, a + 1, b, b + 1}) mesh.indices.push_back(i);
        }
    return mesh;
}

// A disc, and a lane from it to the south.
MeshArrays Square() {
    constexpr int kSides = 28;
    MeshArrays mesh;
    const auto at = [](float x, float z) { return Vec3{x, VillageGround(x, z) + 0.04f, z}; };
    const auto uv = [](const Vec3& p) { return pod::Vec2{p[0] / 2, p[2] / 2}; };
    for (int i = 0; i < kSides; ++i) {
        const float from = 6.2831853f * static_cast<float>(i) / kSides,
                    to = 6.2831853f * static_cast<float>(i + 1) / kSides;
        const Vec3 a = at(0, 0), b = at(5 * std::sin(from), 5 * std::cos(from)),
                   c = at(5 * std::sin(to), 5 * std::cos(to));
        shapes::AddTriangle({a, b, c}, {uv(a), uv(b), uv(c)}, &mesh);
    }
    for (int i = 0; i < 20; ++i) {
        const auto edge = [&](int step, float side) {
            const float along = 4.5f + static_cast<float>(step);
            return at(0.8f * std::sin(along * 0.25f - 1.1f) + side, along);
        };
        const Vec3 a = edge(i, -1.1f), b = edge(i + 1, -1.1f), c = edge(i + 1, 1.1f), d = edge(i, 1.1f);
        shapes::AddTriangle({a, b, c}, {uv(a), uv(b), uv(c)}, &mesh);
        shapes::AddTriangle({a, c, d}, {uv(a), uv(c), uv(d)}, &mesh);
    }
    return mesh;
}

// Around the origin, its front towards +Z; the ridge runs along X.
struct HouseShape {
    float width, depth, walls, ridge;
};

MeshArrays Walls(const HouseShape& s) {
    MeshArrays mesh;
    const float x = s.width / 2, z = s.depth / 2, h = s.walls;
    shapes::AddQuad({{{-x, 0, z}, {x, 0, z}, {x, h, z}, {-x, h, z}}}, kFront, &mesh);
    shapes::AddQuad({{{x, 0, z}, {x, 0, -z}, {x, h, -z}, {x, h, z}}}, kSide, &mesh);
    shapes::AddQuad({{{x, 0, -z}, {-x, 0, -z}, {-x, h, -z}, {x, h, -z}}}, kSide, &mesh);
    shapes::AddQuad({{{-x, 0, -z}, {-x, 0, z}, {-x, h, z}, {-x, h, -z}}}, kSide, &mesh);
    const pod::Vec2 plain = {kPlaster.left, kPlaster.bottom};
    shapes::AddTriangle({{{x, h, z}, {x, h, -z}, {x, s.ridge, 0}}}, {plain, plain, plain}, &mesh);
    shapes::AddTriangle({{{-x, h, -z}, {-x, h, z}, {-x, s.ridge, 0}}}, {plain, plain, plain}, &mesh);
    return mesh;
}

MeshArrays Roof(const HouseShape& s) {
    MeshArrays mesh;
    const float over = 0.35f, x = s.width / 2 + over, slope = (s.ridge - s.walls) / (s.depth / 2);
    const float z = s.depth / 2 + over, low = s.walls - over * slope, top = s.ridge + 0.06f;
    const UvRect tiles = {0, 0, s.width * 0.6f, 2};
    for (const float side : {1.0f, -1.0f}) {
        const Vec3 a = {-side * x, low, side * z}, b = {side * x, low, side * z}, c = {side * x, top, 0},
                   d = {-side * x, top, 0};
        shapes::AddQuad({a, b, c, d}, tiles, &mesh);
        // From below, as the edge is seen.
        const auto under = [](Vec3 corner) { return Vec3{corner[0], corner[1] - 0.08f, corner[2]}; };
        shapes::AddQuad({under(b), under(a), under(d), under(c)}, {0, 0, 0.02f, 0.02f}, &mesh);
        shapes::AddQuad({under(a), under(b), b, a}, {0, 0, 1, 0.02f}, &mesh);
    }
    shapes::AddBox({s.width * 0.22f, s.walls, -0.6f}, {s.width * 0.22f + 0.5f, s.ridge + 0.5f, -0.1f},
                   {0, 0, 0.4f, 1}, &mesh);
    return mesh;
}

MeshArrays LeafTree() {
    MeshArrays mesh;
    shapes::AddTurned({0.2f, 0.12f, 0, 1.4f, 7, false}, {0, 0, 0}, kBark, &mesh);
    for (const auto& [centre, radius] : {std::pair(Vec3{0, 2, 0}, 0.95f),
                                         {{0.55f, 1.6f, 0.25f}, 0.62f},
                                         {{-0.5f, 1.65f, -0.2f}, 0.66f},
                                         {{0.05f, 2.7f, -0.05f}, 0.6f}})
        shapes::AddBlob(centre, {radius, radius * 0.85f, radius}, 12, kLeaves, &mesh);
    return mesh;
}

MeshArrays Fir() {
    MeshArrays mesh;
    shapes::AddTurned({0.16f, 0.12f, 0, 0.7f, 6, false}, {0, 0, 0}, kBark, &mesh);
    for (const auto& [low, radius] : {std::pair(0.5f, 1.0f), {1.3f, 0.8f}, {2.1f, 0.55f}})
        shapes::AddTurned({radius, 0, low, low + 1.4f, 9, false}, {0, 0, 0}, kLeaves, &mesh);
    return mesh;
}

MeshArrays Well() {
    MeshArrays mesh;
    shapes::AddTurned({0.85f, 0.85f, 0, 0.75f, 12, false}, {0, 0, 0}, {0, 0, 3, 0.5f}, &mesh);
    for (const float x : {-0.75f, 0.75f})
        shapes::AddBox({x - 0.07f, 0.7f, -0.07f}, {x + 0.07f, 2, 0.07f}, {0, 0, 0.1f, 0.6f}, &mesh);
    shapes::AddTurned({1.25f, 0, 1.95f, 2.7f, 4, true}, {0, 0, 0}, {0, 0, 2, 0.6f}, &mesh);
    return mesh;
}

// The post, or the lamp on it.
MeshArrays Lantern(bool lamp) {
    MeshArrays mesh;
    if (lamp) {
        shapes::AddTurned({0.11f, 0.17f, 2.02f, 2.4f, 6, true}, {0, 0, 0}, kWhole, &mesh);
        return mesh;
    }
    shapes::AddTurned({0.09f, 0.05f, 0, 2, 6, false}, {0, 0, 0}, {0, 0, 0.2f, 1}, &mesh);
    shapes::AddTurned({0.26f, 0, 2.4f, 2.65f, 6, true}, {0, 0, 0}, {0, 0, 0.2f, 0.2f}, &mesh);
    return mesh;
}

MeshArrays Mill(bool roof) {
    MeshArrays mesh;
    if (roof)
        shapes::AddTurned({1.45f, 0, 4.9f, 6.3f, 8, true}, {0, 0, 0}, {0, 0, 4, 1.2f}, &mesh);
    else
        shapes::AddTurned({1.75f, 1.2f, -0.6f, 5, 8, true}, {0, 0, 0}, {0, 0, 6, 3}, &mesh);
    return mesh;
}

// Four around their hub, in the XY plane.
MeshArrays Sails() {
    MeshArrays mesh;
    for (int i = 0; i < 4; ++i) {
        const float turn = 1.5707963f * static_cast<float>(i) + 0.4f, c = std::cos(turn), s = std::sin(turn);
        const auto at = [&](float along, float aside, float z) {
            return Vec3{along * c - aside * s, along * s + aside * c, z};
        };
        const auto board = [&](float from, float to, float low, float high, float z) {
            const Vec3 a = at(from, low, z), b = at(to, low, z), d = at(to, high, z), e = at(from, high, z);
            shapes::AddQuad({a, b, d, e}, {0, 0, 1, 0.7f}, &mesh);
            shapes::AddQuad({b, a, e, d}, {0, 0, 1, 0.7f}, &mesh);
        };
        board(0, 3.5f, -0.07f, 0.07f, 0.05f);
        board(0.9f, 3.4f, 0.05f, 0.75f, 0);
    }
    shapes::AddBlob({0, 0, 0.05f}, {0.25f, 0.25f, 0.2f}, 8, {0, 0, 0.2f, 0.2f}, &mesh);
    return mesh;
}

void PlaceHouses(Builder* builder) {
    const struct {
        const char* name;
        HouseShape shape;
        float x, z, turn;
    } houses[] = {{"inn", {6, 4.2f, 3, 5.4f}, -7.6f, -3, 62},
                  {"bakery", {4.6f, 4, 2.6f, 4.8f}, -2.2f, -8.6f, 12},
                  {"smithy", {5, 4, 2.5f, 4.6f}, 4.6f, -8, -24},
                  {"farm", {5.4f, 4.2f, 2.6f, 5}, 9, -1.6f, -78}};
    for (const auto& house : houses) {
        const Vec3 at = {house.x, VillageGround(house.x, house.z), house.z};
        builder->Place(house.name, builder->AddMesh(Walls(house.shape)), "walls.pvr", at, house.turn);
        builder->Place(house.name + std::string(" roof"), builder->AddMesh(Roof(house.shape)), "roof.pvr", at,
                       house.turn);
    }
}

void PlaceTrees(Builder* builder) {
    const int32_t kinds[] = {builder->AddMesh(LeafTree()), builder->AddMesh(Fir())};
    const struct {
        float x, z, size;
        int kind;
    } trees[] = {
        {-5.6f, 2.4f, 1.25f, 0}, {6.2f, 4.4f, 1.35f, 0}, {-9.5f, 3.8f, 1.5f, 0}, {1.5f, -11.8f, 1.5f, 0},
        {12.5f, -6.5f, 1.6f, 0}, {-12, -7.5f, 1.9f, 1},  {-14, -3, 1.7f, 1},     {-9.5f, -12, 2, 1},
        {9.5f, -13.5f, 2.1f, 1}, {13.5f, 3, 1.8f, 1},    {-6, -15, 2.2f, 1},     {4, -17, 2.3f, 1},
        {16, -3, 1.9f, 1},       {-16, 5, 1.9f, 1},      {11, 9, 1.5f, 0},       {-11, 10, 1.6f, 0},
        {17.5f, 8, 2, 1},        {-19, -10, 2.4f, 1},    {20, -12, 2.4f, 1},     {-15, 14, 1.7f, 0}};
    int number = 0;
    for (const auto& tree : trees) {
        ++number;
        builder->Place((tree.kind ? "fir " : "tree ") + std::to_string(number), kinds[tree.kind], "tree.pvr",
                       {tree.x, VillageGround(tree.x, tree.z) - 0.05f, tree.z},
                       40.0f * static_cast<float>(number), tree.size);
    }
}

const std::vector<pod::Vec2> kVase = {{0, 0},         {0.34f, 0.01f}, {0.3f, 0.1f},   {0.46f, 0.4f},
                                      {0.68f, 0.9f},  {0.62f, 1.35f}, {0.36f, 1.7f},  {0.24f, 1.95f},
                                      {0.27f, 2.15f}, {0.42f, 2.3f},  {0.36f, 2.31f}, {0.2f, 2.1f}},
                             kBottle = {{0, 0},         {0.42f, 0.01f}, {0.46f, 0.15f},
                                        {0.42f, 0.7f},  {0.2f, 1.1f},   {0.13f, 1.4f},
                                        {0.14f, 1.75f}, {0.19f, 1.8f},  {0.12f, 1.82f}},
                             kBowl = {{0, 0},     {0.4f, 0.02f},  {0.36f, 0.1f}, {0.8f, 0.35f},
                                      {1, 0.62f}, {0.96f, 0.64f}, {0.75f, 0.4f}, {0, 0.2f}};

MeshArrays Lathed(const std::vector<pod::Vec2>& profile) {
    MeshArrays mesh;
    shapes::AddLathe(profile, 32, kWhole, &mesh);
    return mesh;
}

MeshArrays TableTop(const Vec3& low, const Vec3& high) {
    MeshArrays mesh;
    const float across = (high[0] - low[0]) / 2.5f, along = (high[2] - low[2]) / 2.5f;
    shapes::AddQuad({{{low[0], high[1], high[2]},
                      {high[0], high[1], high[2]},
                      {high[0], high[1], low[2]},
                      {low[0], high[1], low[2]}}},
                    {0, 0, across, along}, &mesh);
    shapes::AddQuad({{{low[0], low[1], high[2]},
                      {high[0], low[1], high[2]},
                      {high[0], high[1], high[2]},
                      {low[0], high[1], high[2]}}},
                    {0, 0, across, 0.15f}, &mesh);
    return mesh;
}

}  // namespace

pod::Scene StillLife() {
    Builder builder;
    const int32_t vase = builder.AddMesh(Lathed(kVase));
    builder.Place("left vase", vase, "amphora.pvr", {-2, 0, 0}, 30);
    builder.Place("middle vase", vase, "amphora.pvr", {0, 0, 0}, 75);
    builder.Shine(0.8f, 0.12f);
    builder.Place("right vase", vase, "amphora.pvr", {2, 0, 0}, 120);
    builder.Place("table", builder.AddMesh(TableTop({-4.5f, -0.2f, -2.5f}, {4.5f, 0, 1.8f})), "table.pvr",
                  {0, 0, 0});
    builder.Place("bottle", builder.AddMesh(Lathed(kBottle)), "porcelain.pvr", {-3.2f, 0, -0.9f});
    builder.Shine(0.9f, 0.2f);
    builder.Place("bowl", builder.AddMesh(Lathed(kBowl)), "porcelain.pvr", {3.3f, 0, -0.7f});
    builder.Shine(0.9f, 0.2f);
    MeshArrays fruit;
    shapes::AddBlob({0, 0.27f, 0}, {0.3f, 0.27f, 0.3f}, 16, kWhole, &fruit);
    const int32_t apple = builder.AddMesh(fruit);
    int number = 0;
    for (const Vec3& at : {Vec3{3.1f, 0.35f, -0.5f},
                           {3.6f, 0.38f, -0.75f},
                           {3.2f, 0.4f, -1},
                           {-1.2f, 0, 0.9f},
                           {-0.8f, 0, 1.25f}}) {
        ++number;
        builder.Place("apple " + std::to_string(number), apple, "fruit.pvr", at,
                      60.0f * static_cast<float>(number));
        builder.Shine(0.4f, 0.1f);
    }
    return builder.Take();
}

pod::Scene RowOfVases() {
    Builder builder;
    builder.Place("table", builder.AddMesh(TableTop({-2.4f, -2, -16}, {5.5f, -1.6f, 3})), "table.pvr",
                  {0, 0, 0});
    const int32_t kinds[] = {builder.AddMesh(Lathed(kVase)), builder.AddMesh(Lathed(kBottle))};
    for (int i = 0; i < 6; ++i) {
        const float step = static_cast<float>(i);
        builder.Place((i % 2 ? "bottle " : "vase ") + std::to_string(i), kinds[i % 2],
                      i % 2 ? "porcelain.pvr" : "fruit.pvr", {-1 + 0.85f * step, -1.6f, 0.6f - 2.4f * step},
                      50 * step, i % 2 ? 1.25f : 1.1f);
    }
    return builder.Take();
}

float VillageGround(float x, float z) {
    const float away = std::clamp((std::hypot(x, z) - 10) / 26, 0.0f, 1.0f);
    const float hills = 3.2f + 1.8f * std::sin(0.19f * x + 0.5f) * std::cos(0.16f * z) +
                        0.8f * std::sin(0.37f * z - 0.2f * x);
    // Open to the south, whence people look.
    const float open = std::clamp(z / 24, 0.0f, 0.75f);
    return away * away * (3 - 2 * away) * hills * (1 - open);
}

pod::Scene Village() {
    Builder builder;
    builder.Place("sky", builder.AddMesh(Dome()), "dome.pvr", {0, 0, 0});
    builder.Place("grass", builder.AddMesh(Ground()), "grass.pvr", {0, 0, 0});
    builder.Place("square", builder.AddMesh(Square()), "cobbles.pvr", {0, 0, 0});
    PlaceHouses(&builder);
    builder.Place("well", builder.AddMesh(Well()), "stones.pvr", {-0.6f, 0, -1.2f}, 20);
    const Vec3 mill = {-3.5f, VillageGround(-3.5f, -21), -21};
    builder.Place("mill", builder.AddMesh(Mill(false)), "stones.pvr", mill);
    builder.Place("mill roof", builder.AddMesh(Mill(true)), "roof.pvr", mill);
    builder.Place("sails", builder.AddMesh(Sails()), "planks.pvr", {mill[0], mill[1] + 5.2f, mill[2] + 1.7f});
    const int32_t post = builder.AddMesh(Lantern(false)), lamp = builder.AddMesh(Lantern(true));
    const struct {
        const char* name;
        float x, z;
    } lanterns[] = {{"west", -3.2f, 2.6f}, {"east", 3.4f, 2.2f}, {"north", 0.8f, -4.4f}};
    for (const auto& [name, x, z] : lanterns) {
        builder.Place(std::string("lantern ") + name, post, "planks.pvr", {x, 0, z});
        builder.Place(std::string("lamp ") + name, lamp, "lamp.pvr", {x, 0, z});
    }
    PlaceTrees(&builder);
    return builder.Take();
}

}  // namespace scenes
