// Runs the qex command as a user does: a process of its own, whose standard output, standard error and exit
// status come back. And small scenes for it, whose pictures can be worked out by hand.
#pragma once

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cmath>

#include "common/ImageFile.h"
#include "PodBuild.h"
#include "PvrWriter.h"
#include "support/FolderTest.h"
#include "support/ImageFiles.h"

struct CommandResult {
    int status = -1;  // exit status, or 1000 + the signal that ended it
    std::string out, err;
};

class QexCommandTest : public FolderTest {
  protected:
    // Standard input comes from a file, standard output goes to one.
    CommandResult Run(const std::vector<std::string>& arguments, const std::string& input = "/dev/null",
                      std::string out = "") const {
        const std::string err = Path("stderr.txt");
        if (out.empty()) out = Path("stdout.txt");
        std::vector<char*> argv = {const_cast<char*>(QEX_COMMAND)};
        for (const std::string& argument : arguments) argv.push_back(const_cast<char*>(argument.c_str()));
        argv.push_back(nullptr);
        const pid_t child = fork();
        if (child == 0) {
            const int flags = O_WRONLY | O_CREAT | O_TRUNC;
            dup2(open(input.c_str(), O_RDONLY), STDIN_FILENO);
            dup2(open(out.c_str(), flags, 0600), STDOUT_FILENO);
            dup2(open(err.c_str(), flags, 0600), STDERR_FILENO);
            execv(QEX_COMMAND, argv.data());
            _exit(127);
        }
        int status = 0;
        waitpid(child, &status, 0);
        return {WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status),
                std::filesystem::is_regular_file(out) ? ReadText(out) : "", ReadText(err)};
    }

    Image LoadPicture(const std::string& name) const {
        Image image;
        std::string error;
        EXPECT_TRUE(LoadImage(Path(name), &image, &error)) << name << " " << error;
        if (image.pixels.empty()) image = {1, 1, Bytes(4), false};
        return image;
    }
    void SavePicture(const std::string& name, const Image& image) const {
        std::string error;
        EXPECT_TRUE(SavePng(Path(name), image.width, image.height, image.pixels.data(), &error)) << error;
    }

    // One line on standard error that contains `part`, nothing on standard output.
    void ExpectRefused(const std::vector<std::string>& arguments, int status, const std::string& part) const {
        const CommandResult result = Run(arguments);
        std::string command = "qex";
        for (const std::string& argument : arguments) command += " " + argument;
        EXPECT_EQ(result.status, status) << command << "\n" << result.err;
        EXPECT_EQ(result.out, "") << command;
        EXPECT_EQ(CountLines(result.err), 1) << command << "\n" << result.err;
        EXPECT_TRUE(Contains(result.err, part)) << command << "\n" << result.err;
        EXPECT_EQ(result.err.rfind("qex", 0), 0u) << result.err;
    }
};

// A quad in the plane z = 0, its UVs running from (0, 0) at the low corner to (1, 1).
inline pod::MeshArrays Quad(float x0, float y0, float x1, float y1) {
    pod::MeshArrays quad;
    quad.positions = {{x0, y0, 0}, {x1, y0, 0}, {x1, y1, 0}, {x0, y1, 0}};
    quad.normals.assign(4, {0, 0, 1});
    quad.uvs = {{0, 0}, {1, 0}, {1, 1}, {0, 1}};
    quad.indices = {0, 1, 2, 0, 2, 3};
    return quad;
}

inline pod::Transform Placed(float x, float y, float z) {
    return {{{x, y, z}}, {}, {}, {}};
}

// A quad from (0, 0) to (2, 1) in one colour, and a camera at (0, 0, 10) that looks at the origin and sees 10
// units from left to right: in a picture of 200 x 100 pixels a unit is 20 pixels, and the origin is its
// middle.
inline pod::Scene QuadScene() {
    pod::Scene scene;
    scene.meshes = {pod::BuildMesh(Quad(0, 0, 2, 1))};
    scene.materials.resize(1);
    scene.materials[0].name = "paint";
    scene.materials[0].diffuse = {1, 0, 0};
    scene.cameras.resize(1);
    scene.cameras[0].target = 2;
    scene.cameras[0].fov = 2 * std::atan(0.5f);
    scene.cameras[0].nearPlane = 1;
    scene.cameras[0].farPlane = 100;
    scene.nodes = {pod::BuildNode("quad", Placed(0, 0, 0), -1, 0, 0),
                   pod::BuildNode("eye", Placed(0, 0, 10), -1, 0), pod::BuildNode("aim", Placed(0, 0, 0))};
    scene.meshNodeCount = 1;
    return scene;
}

inline void PlaceQuad(pod::Scene* scene, const pod::Transform& transform) {
    scene->nodes[0] = pod::BuildNode("quad", transform, -1, 0, 0);
}

inline void FlattenQuad(pod::Scene* scene) {
    PlaceQuad(scene, {{}, {}, {{0, 0, 0}}, {}});
}

inline void RemoveQuad(pod::Scene* scene) {
    scene->meshNodeCount = 0;
    scene->nodes.erase(scene->nodes.begin());
    scene->cameras[0].target = 1;
}

// The camera's aim moves behind it.
inline void AddLight(pod::Scene* scene, int32_t type, const pod::Vec3& colour) {
    scene->lights.resize(1);
    scene->lights[0].type = type;
    scene->lights[0].colour = colour;
    scene->nodes.insert(scene->nodes.begin() + 1, pod::BuildNode("lamp", Placed(0, 0, 0), -1, 0));
    scene->cameras[0].target = 3;
}

inline void TextureQuad(pod::Scene* scene, const std::string& texture) {
    scene->textures = {texture};
    scene->materials[0].diffuseTexture = 0;
    scene->materials[0].diffuse = {1, 1, 1};
}

inline void WriteScene(const std::string& path, const pod::Scene& scene) {
    WriteBytes(path, pod::WritePod(scene));
}

// One level of pixels that are all the same.
inline Bytes Pixels(uint32_t size, const Bytes& pixel) {
    Bytes pixels;
    for (uint32_t i = 0; i < size * size; ++i) pixels.insert(pixels.end(), pixel.begin(), pixel.end());
    return pixels;
}

inline Bytes UniformPvr(uint32_t type, uint32_t size, const Bytes& pixel) {
    pod::PvrImage image;
    image.type = type;
    image.width = image.height = size;
    image.surfaces = {{Pixels(size, pixel)}};
    return pod::WritePvr(image);
}

// RGBA, with one key and value pair.
inline Bytes UniformKtx(uint32_t size, const Bytes& pixel) {
    const std::string pair("\x0a\0\0\0author\0me\0\0\0", 16);
    Ktx ktx;
    ktx.width = ktx.height = size;
    ktx.levels = {{Pixels(size, pixel)}};
    ktx.keyValues.assign(pair.begin(), pair.end());
    return ktx.File();
}
