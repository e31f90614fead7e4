// Writes the scenes, textures and particle emitters of the samples to a folder.
#include "SceneFiles.h"

#include <cstdio>
#include <cstdlib>

#include <sys/stat.h>

#include "Scenes.h"
#include "Village.h"

namespace {

struct Surface {
    const char* texture;
    float diffuse, ambient;
};

// Gives a material its texture, and how much light it gives back.
void Paint(pod::Scene* scene, size_t material, const Surface& surface) {
    pod::Material& m = scene->materials[material];
    m.diffuseTexture = static_cast<int32_t>(scene->textures.size());
    scene->textures.push_back(surface.texture);
    m.diffuse.fill(surface.diffuse);
    m.ambient.fill(surface.ambient);
}

// A scene whose materials have these surfaces.
pod::Scene Painted(pod::Scene scene, const std::vector<Surface>& surfaces) {
    for (size_t i = 0; i < surfaces.size(); ++i) Paint(&scene, i, surfaces[i]);
    return scene;
}

pod::Scene ThreeSpheres() {
    const pod::MeshArrays sphere = scenes::Sphere(24);
    const Surface surface = {"wood.pvr", 1, 0.15f};
    pod::Scene scene = Painted(scenes::Still({{"diffuse", sphere, {-2.2f, 0, 0}},
                                              {"specular", sphere, {0, 0, 0}},
                                              {"unlit", sphere, {2.2f, 0, 0}}}),
                               {surface, surface, surface});
    scene.materials[1].specular.fill(0.8f);
    scene.materials[1].shininess = 0.15f;
    return scene;
}

// Several repetitions of a texture around a ball.
pod::Scene Ball() {
    pod::MeshArrays sphere = scenes::Sphere(32);
    for (pod::Vec2& uv : sphere.uvs) uv = {4 * uv[0], 2 * uv[1]};
    return Painted(scenes::Still({{"ball", sphere, {0, 0, 0}}}), {{"stones.pvr", 1, 0.1f}});
}

pod::MeshArrays Scaled(pod::MeshArrays mesh, float factor) {
    for (pod::Vec3& position : mesh.positions)
        for (float& axis : position) axis *= factor;
    return mesh;
}

// Crates and balls on a floor, 8 across.
pod::Scene Playground() {
    const pod::MeshArrays crate = Scaled(scenes::Cube(), 0.5f), ball = scenes::Sphere(24);
    return Painted(scenes::Still({{"floor", pod::FloorMesh(8), {0, 0, 0}},
                                  {"crate", crate, {-1.1f, 0.5f, -0.6f}},
                                  {"second crate", crate, {0.1f, 0.5f, -0.9f}},
                                  {"upper crate", crate, {-0.5f, 1.5f, -0.75f}},
                                  {"red ball", Scaled(ball, 0.6f), {1.4f, 0.6f, -0.2f}},
                                  {"blue ball", Scaled(ball, 0.4f), {-0.2f, 0.4f, 0.8f}},
                                  {"wooden ball", Scaled(ball, 0.25f), {0.7f, 0.25f, 1}}}),
                   {{"floor.pvr", 0.75f, 0.3f},
                    {"crate.pvr", 0.8f, 0.3f},
                    {"crate.pvr", 0.8f, 0.3f},
                    {"crate.pvr", 0.8f, 0.3f},
                    {"red.pvr", 0.8f, 0.3f},
                    {"blue.pvr", 0.8f, 0.3f},
                    {"wood.pvr", 0.8f, 0.3f}});
}

}  // namespace

void WriteFile(const std::string& path, const std::vector<uint8_t>& bytes) {
    FILE* file = fopen(path.c_str(), "wb");
    const bool written = file && fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size();
    if (file && fclose(file) == 0 && written) return;
    fprintf(stderr, "%s: cannot be written\n", path.c_str());
    exit(1);
}

int main(int argc, char** argv) {
    if (argc != 2) {
        fprintf(stderr, "Usage: qex_scene_files FOLDER\n");
        return 2;
    }
    const std::string folder = std::string(argv[1]) + "/";
    mkdir(argv[1], 0777);
    const Surface rings = {"rings.pvr", 1, 0.2f};
    const struct {
        const char* name;
        pod::Scene scene;
    } files[] = {
        {"spheres.pod", ThreeSpheres()},
        {"ball.pod", Ball()},
        {"tentacle.pod", Painted(scenes::Worm(40, 60), {{"floor.pvr", 1, 0.2f}, rings})},
        {"worm.pod", Painted(scenes::Worm(20, 60), {{"floor.pvr", 0.8f, 0.2f}, {"rings.pvr", 0.8f, 0.2f}})},
        {"red_ball.pod", Painted(scenes::Still({{"ball", scenes::Sphere(24), {-2, 0.8f, -0.5f}}}),
                                 {{"plain.pvr", 0.8f, 0.2f}})},
        {"playground.pod", Playground()},
        {"boat.pod", Painted(scenes::Boat(), {{"hull.pvr", 0.8f, 0.35f}, {"sails.pvr", 0.8f, 0.35f}})},
        {"still.pod", scenes::StillLife()},
        {"vases.pod", scenes::RowOfVases()},
        {"globe.pod", Painted(scenes::Still({{"globe", Scaled(scenes::Sphere(24), 0.42f), {0, 0, 0}}}),
                              {{"globe.pvr", 1, 1}})},
        {"village.pod", scenes::Village()},
        {"walker.pod", Painted(scenes::Walker(33), {{"walker.pvr", 0.8f, 0.25f}})},
    };
    for (const auto& file : files) WriteFile(folder + file.name, pod::WritePod(file.scene));
    WriteTextures(folder);
    WriteVillageTextures(folder);
    WriteEmitters(folder);
    return 0;
}
