// What an application makes itself: meshes, pictures of a HUD, a window of another size.
#include <GLES2/gl2.h>

#include <cmath>

#include "KtxWriter.h"
#include "support/Capture.h"
#include "support/ImageFiles.h"
#include "support/RenderScenes.h"

namespace {

class ResizeTest : public RenderTest {};
class MeshTest : public RenderTest {};
class PictureTest : public RenderTest {};

// The surface stays as it is; a smaller part of it, at the lower left, plays the window.
TEST_F(ResizeTest, TextQuadsAndEffectsFollow) {
    constexpr int kSmallWidth = 64, kSmallHeight = 48;
    const auto draw = [&] {
        Clear();
        QexFont_Draw();
        QexFont_DrawTempString(&runtime_, 40, 56, "B", 0xFFFF0000);
        QexTexture_Draw(&runtime_, nullptr, 4, 30, nullptr, 5, 5, 0xFF00FF00);
    };
    QexFont_AddString(&runtime_, 8, 40, "A", 0, 0, 255, 255);
    QexPostProcessing_Initialize(&runtime_);
    QexTexture_SetFilter(&QexPP_GetRenderTarget(1)->colorTexture, QEX_FILTER_LINEAR);
    draw();
    const Picture before = Read();
    EXPECT_EQ(QexEngine_Resize(&runtime_, kSmallWidth, kSmallHeight), 0);
    glViewport(0, 0, kSmallWidth, kSmallHeight);
    draw();
    const Picture after = Read();
    int drawn = 0;
    for (int y = 0; y < kSmallHeight; ++y)
        for (int x = 0; x < kSmallWidth; ++x) {
            ASSERT_EQ(after.Pixel(x, y + kHeight - kSmallHeight), before.Pixel(x, y)) << x << ", " << y;
            drawn += before.Pixel(x, y)[3] != 0;
        }
    EXPECT_GT(drawn, 40);
    for (const uint32_t i : {1u, 4u}) {
        const QexTexture& target = QexPP_GetRenderTarget(i)->colorTexture;
        EXPECT_EQ(target.width, i == 1 ? 32 : 64);
        EXPECT_EQ(target.height, i == 1 ? 24u : 48u);
        EXPECT_EQ(target.filter, i == 1 ? QEX_FILTER_LINEAR : QEX_FILTER_NEAREST);
    }
    // Effects of another size than the screen's are the application's affair.
    QexRuntimeContext quarter = runtime_;
    quarter.width = 16;
    QexPostProcessing_Initialize(&quarter);
    QexFont_ReleaseShader(1);  // nor is the font's program needed
    EXPECT_EQ(QexEngine_Resize(&runtime_, kWidth, kHeight), 0);
    EXPECT_EQ(QexPP_GetRenderTarget(2)->colorTexture.width, 16);
    QexPostProcessing_Finalize();
    Capture errors(STDERR_FILENO);
    EXPECT_EQ(QexEngine_Resize(&runtime_, 0, 48), -1);
    EXPECT_EQ(QexEngine_Resize(&runtime_, 64, -1), -1);
    EXPECT_EQ(QexEngine_Resize(nullptr, 64, 48), -1);
    EXPECT_EQ(errors.Text(),
              "E/Qex: <QexEngine_Resize> a surface of 0 x 48 pixels\n"
              "E/Qex: <QexEngine_Resize> a surface of 64 x -1 pixels\n"
              "E/Qex: <QexEngine_Resize> a surface of 64 x 48 pixels, no context\n");
    EXPECT_EQ(runtime_.width, kWidth);
}

// Closed shapes have the volume that geometry says, which takes every triangle, wound outwards; textures are
// not mirrored; normals are of unit length and on the outer side.
TEST_F(MeshTest, ShapesAreWholeAndTheirTexturesUnmirrored) {
    QexMesh mesh;
    const double pi = 3.14159265358979;
    const struct {
        std::function<int32_t()> create;
        double volume, area, error;
    } shapes[] = {
        {[&] { return QexMesh_CreateBox(&mesh, 2, 3, 4); }, 24, 52, 1e-4},
        {[&] { return QexMesh_CreateSphere(&mesh, 2, 64); }, 4 / 3.0 * pi * 8, 4 * pi * 4, 0.2},
        // A prism of 12 corners.
        {[&] { return QexMesh_CreateCylinder(&mesh, 2, 5, 12); }, 5 * 12,
         2 * 12 + 5 * 12 * 4 * std::sin(pi / 12), 1e-3},
        {[&] { return QexMesh_CreatePlane(&mesh, 3, 5, 7, 2); }, 0, 15, 1e-3},
    };
    for (const auto& shape : shapes) {
        ASSERT_EQ(shape.create(), 0);
        double volume = 0, area = 0;
        for (uint32_t i = 0; i < mesh.indexCount; i += 3) {
            const uint16_t* corner = mesh.indices + i;
            ASSERT_LT(std::max({corner[0], corner[1], corner[2]}), mesh.vertexCount);
            glm::vec3 p[3];
            glm::vec2 t[3];
            for (int c = 0; c < 3; ++c) {
                p[c] = glm::make_vec3(&mesh.positions[corner[c]].x);
                t[c] = glm::make_vec2(&mesh.uvs[corner[c]].x);
            }
            const glm::vec3 face = glm::cross(p[1] - p[0], p[2] - p[0]);
            const glm::vec2 s = t[1] - t[0], u = t[2] - t[0];
            volume += glm::dot(p[0], face) / 6;
            area += glm::length(face) / 2;
            if (glm::length(face) < 1e-6f) continue;  // at a pole
            EXPECT_GT(s.x * u.y - u.x * s.y, 0) << i;
            for (int c = 0; c < 3; ++c) {
                const glm::vec3 normal = glm::make_vec3(&mesh.normals[corner[c]].x);
                EXPECT_NEAR(glm::length(normal), 1, 1e-5f);
                EXPECT_GT(glm::dot(normal, glm::normalize(face)), 0.9f) << i;
            }
        }
        EXPECT_NEAR(volume, shape.volume, shape.error);
        EXPECT_NEAR(area, shape.area, shape.error);
        QexMesh_Release(&mesh);
        EXPECT_EQ(mesh.positions, nullptr);
    }
    Capture errors(STDERR_FILENO);
    EXPECT_EQ(QexMesh_CreateBox(&mesh, 1, 0, 1), -1);
    EXPECT_EQ(QexMesh_CreateSphere(&mesh, 1, 2), -1);
    EXPECT_EQ(mesh.vertexCount, 0u);
    QexMesh_Release(nullptr);
}

// A quad in pixels at z = 0, u to the right and v up.
struct Quad {
    explicit Quad(bool lit)
        : mesh{4, positions, lit ? normals : nullptr, uvs, nullptr, 6, indices, nullptr} {}
    QexVec3 positions[4] = {{20, 20, 0}, {60, 20, 0}, {20, 60, 0}, {60, 60, 0}};
    QexVec3 normals[4] = {{0, 0, 1}, {0, 0, 1}, {0, 0, 1}, {0, 0, 1}};
    QexVec2 uvs[4] = {{0, 0}, {1, 0}, {0, 1}, {1, 1}};
    uint16_t indices[6] = {0, 1, 2, 2, 1, 3};
    QexMesh mesh;
};

TEST_F(MeshTest, ModelsShowTextureColoursAndLightAndArePicked) {
    const uint32_t red[] = {0xFFFF0000, 0xFFFF0000, 0xFFFF0000, 0xFFFF0000};
    const uint32_t corners[] = {0xFF000000, 0xFFFF0000, 0xFF0000FF, 0xFFFF00FF};  // red to the right, blue up
    const uint8_t rows[] = {0, 255, 0, 255, 0, 0, 255, 255};                      // green below, blue above
    ScopedTexture texture(1, 2, rows);
    QexLightSet light = {};
    light.count = 1;
    light.lights[0] = {QEX_LIGHT_DIRECTIONAL, {0, 0, -1}, {1, 1, 1, 1}};
    const QexMatrix projection = PixelProjection();
    const struct {
        bool lit;
        const uint32_t* colours;
        QexTexture* texture;
        const QexLightSet* lights;
        Rgba lower, upper;  // at (30, 25) and (50, 55), counted from below
    } cases[] = {
        {false, nullptr, nullptr, nullptr, {255, 255, 255, 255}, {255, 255, 255, 255}},
        {false, nullptr, &texture, nullptr, {0, 255, 0, 255}, {0, 0, 255, 255}},
        {true, nullptr, &texture, &light, {0, 255, 0, 255}, {0, 0, 255, 255}},
        {true, nullptr, nullptr, nullptr, {51, 51, 51, 255}, {51, 51, 51, 255}},
        {true, red, nullptr, &light, {255, 0, 0, 255}, {255, 0, 0, 255}},
        {false, corners, nullptr, nullptr, {67, 0, 35, 255}, {194, 0, 226, 255}},
    };
    for (const auto& c : cases) {
        Quad quad(c.lit);
        quad.mesh.colours = c.colours;
        QexModel model;
        ASSERT_EQ(QexModel_CreateFromMesh(&model, &quad.mesh, c.texture), 0);
        Clear();
        QexModel_RenderWithViewProjection(&model, c.lights, nullptr, &g_sMatIdentity, &projection, 0);
        EXPECT_TRUE(Near(Read().Pixel(30, kHeight - 1 - 25), c.lower, 3));
        EXPECT_TRUE(Near(Read().Pixel(50, kHeight - 1 - 55), c.upper, 3));

        const QexCamera camera = PixelCamera();
        QexModel_UpdateModelBoundingBox(&model, nullptr);
        QexModel_CalcScreenBBox(&runtime_, &model, &camera);
        const QexVec2 inside = {25, kHeight - 55.0f};
        uint32_t hit;
        int32_t count;
        QexModel_Pick(&model, nullptr, &inside, &count, &hit, 1);
        EXPECT_EQ(count, 1);
        QexModel_Unload(&model);
    }
}

// On each face of a box, in the direction in which u grows.
TEST_F(MeshTest, TangentsFollowTheTexture) {
    QexMesh box;
    QexModel model;
    ASSERT_EQ(QexMesh_CreateBox(&box, 1, 1, 1), 0);
    ASSERT_EQ(QexModel_CreateFromMesh(&model, &box, nullptr), 0);
    const glm::vec3 expected[] = {{0, 0, -1}, {0, 0, 1}, {1, 0, 0}, {1, 0, 0}, {1, 0, 0}, {-1, 0, 0}};
    const CPODData& tangents = model.scene.meshes[0].tangents;
    ASSERT_EQ(tangents.componentCount, 3u);
    for (uint32_t v = 0; v < box.vertexCount; ++v) {
        QexVec4 t;
        QexPODVertex_ReadVec(&t.x, tangents.data + v * tangents.stride, tangents.type, 3);
        EXPECT_LT(glm::distance(glm::make_vec3(&t.x), expected[v / 4]), 1e-5f) << v;
    }
    QexModel_Unload(&model);
    QexMesh_Release(&box);
}

TEST_F(MeshTest, BadMeshesAreRefusedWithALine) {
    const char* const nothing = "no mesh, no positions, or no indices";
    const std::pair<void (*)(QexMesh*), std::string> cases[] = {
        {[](QexMesh* m) { m->positions = nullptr; }, nothing},
        {[](QexMesh* m) { m->indices = nullptr; }, nothing},
        {[](QexMesh* m) { m->vertexCount = 65537; }, "65537 vertices; 1 to 65536 can be drawn"},
        {[](QexMesh* m) { m->vertexCount = 3; }, "index 5 names vertex 3 of 3"},
        {[](QexMesh* m) { m->indexCount = 0; }, "4 corners are no whole triangles"},
    };
    QexModel model;
    for (const auto& [spoil, line] : cases) {
        Quad quad(true);
        spoil(&quad.mesh);
        Capture errors(STDERR_FILENO);
        EXPECT_EQ(QexModel_CreateFromMesh(&model, &quad.mesh, nullptr), -1);
        EXPECT_EQ(errors.Text(), "E/Qex: <QexModel_CreateFromMesh> " + line + "\n");
        QexModel_Unload(&model);
    }
    Capture errors(STDERR_FILENO);
    EXPECT_EQ(QexModel_CreateFromMesh(nullptr, nullptr, nullptr), -1);
    EXPECT_EQ(QexModel_CreateFromMesh(&model, nullptr, nullptr), -1);
}

// A file of three rows: red above, green, blue below.
Bytes Rows(bool topFirst, bool bgr = false) {
    Bytes bytes;
    for (const int row : {0, 1, 2})
        for (int i = 0; i < 8; ++i) {
            const int at = topFirst ? row : 2 - row, c = i % 4;
            bytes.push_back(c == 3 || c == (bgr ? 2 - at : at) ? 255 : 0);
        }
    return bytes;
}

Bytes PvrFile(bool topFirst) {
    return pod::WritePvr({pod::kPvrRgba8888, 2, 3, topFirst ? 0u : pod::kPvrFlipped, {{Rows(topFirst)}}});
}

Bytes KtxFile(bool topFirst, const char* orientation) {
    pod::KtxImage image = {GL_UNSIGNED_BYTE, GL_RGBA, GL_RGBA, GL_RGBA, 4, 2, 3, {}, {{Rows(topFirst)}}};
    if (orientation) image.keyValues = {{"author", std::string(301, 'x')}, {"KTXorientation", orientation}};
    return pod::WriteKtx(image);
}

Bytes UprightTga(bool topFirst) {
    Bytes file = TgaFile(2, 3, 32, Rows(topFirst, true));
    file[17] = topFirst ? 40 : 8;
    return file;
}

TEST_F(PictureTest, StandUprightWhicheverRowComesFirst) {
    const Bytes files[] = {
        PvrFile(true),          PvrFile(false),   KtxFile(true, "S=r,T=d"), KtxFile(false, "S=r,T=u"),
        KtxFile(true, nullptr), UprightTga(true), UprightTga(false)};
    const Rgba red = {255, 0, 0, 255}, green = {0, 255, 0, 255}, blue = {0, 0, 255, 255};
    const QexRect lower = {0, 1, 1, 2}, middle = {1, 1, 1, 1};
    for (const auto& bytes : files) {
        SCOPED_TRACE(&bytes - files);
        const MemoryFile file(bytes);
        QexPicture picture;
        ASSERT_EQ(QexPicture_Load(&picture, file.Path()), 0);
        QexTexture_SetFilter(&picture.texture, QEX_FILTER_NEAREST);
        Picture expected;
        expected.Fill(10, 20, 20, 23, red);
        expected.Fill(10, 23, 20, 26, green);
        expected.Fill(10, 26, 20, 29, blue);
        expected.Fill(40, 20, 42, 21, green);
        expected.Fill(40, 21, 42, 22, blue);
        expected.Fill(60, 20, 66, 24, green);
        Clear();
        QexRenderer_SetAlphaBlendMode(QEX_BLEND_NONE);
        const auto draw = [&](const QexRect* part, float x, float width, float height) {
            EXPECT_EQ(QexPicture_Draw(&runtime_, &picture, part, x, 20, width, height, 0xFFFFFFFF), 0);
        };
        draw(nullptr, 10, 10, 9);
        draw(&lower, 40, 0, 0);
        draw(&middle, 60, 6, 4);
        EXPECT_TRUE(SamePicture(Read(), expected));
        QexPicture_Release(&picture);
    }
}

TEST_F(PictureTest, AlphaFileRectanglesAndErrors) {
    const std::string path = OutputPath("picture.pvr");
    pod::WriteFile(path, PvrFile(true));
    pod::WriteFile(OutputPath("picture_a.pvr"), PvrFile(true));  // red, which counts, above alone
    QexPicture picture;
    ASSERT_EQ(QexPicture_Load(&picture, path.c_str()), 0);
    Clear(1, 1, 1, 1);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    EXPECT_EQ(QexPicture_Draw(&runtime_, &picture, nullptr, 10, 20, 10, 30, 0xFFFFFFFF), 0);
    EXPECT_EQ(QexPicture_Draw(&runtime_, nullptr, nullptr, 40, 20, 3, 2, 0xFF102030), 0);
    const Picture drawn = Read();
    EXPECT_TRUE(Near(drawn.Pixel(15, 22), {255, 0, 0, 255}, 2));
    EXPECT_TRUE(Near(drawn.Pixel(15, 48), {255, 255, 255, 255}, 2));
    EXPECT_EQ(drawn.Pixel(42, 21), (Rgba{16, 32, 48, 255}));
    EXPECT_EQ(drawn.Pixel(43, 21), (Rgba{255, 255, 255, 255}));
    EXPECT_EQ(drawn.Pixel(42, 22), (Rgba{255, 255, 255, 255}));
    Capture errors(STDERR_FILENO), out(STDOUT_FILENO);
    const QexRect beyond = {0, 0, 2, 2};
    EXPECT_EQ(QexPicture_Draw(&runtime_, &picture, &beyond, 0, 0, 1, 1, 0), -1);
    EXPECT_EQ(QexPicture_Draw(&runtime_, &picture, nullptr, 0, 0, -1, 1, 0), -1);
    EXPECT_EQ(QexPicture_Draw(nullptr, &picture, nullptr, 0, 0, 1, 1, 0), -1);
    QexPicture_Release(&picture);
    EXPECT_EQ(QexPicture_Draw(&runtime_, &picture, nullptr, 0, 0, 1, 1, 0), -1);
    const MemoryFile nothing(Bytes(7, 1));
    EXPECT_EQ(QexPicture_Load(&picture, nothing.Path()), -1);
    EXPECT_EQ(QexPicture_Load(&picture, "/nonexistent"), -1);
    QexPicture_Release(&picture);
    const std::string lines = errors.Text();
    out.Text();
    EXPECT_EQ(std::count(lines.begin(), lines.end(), '\n'), 7) << lines;
}

}  // namespace
