// Sample 5: a normal map. The module binds a flat one on unit 1; the bind hook, which every node calls before
// its textures are bound, puts the real one in its place. A second argument names a picture of normals;
// without it the map is made of a pattern of knobs.
#include "Sample.h"

#include <cmath>

namespace {

QexTexture g_normals;

int32_t BindNormals(QexModel*, uint32_t) {
    QexTexture_Set(&g_normals, 1);
    return 0;  // the model's own texture is still to be bound
}

uint8_t ToByte(float value) {
    return static_cast<uint8_t>(127.5f + 127.5f * value);
}

// Round knobs on a flat ground, stored as the module reads normals: x in green, y in red, z in blue.
Image Knobs() {
    constexpr int kSize = 64;
    constexpr float kRadius = 0.4f;
    Image image;
    image.width = image.height = kSize;
    for (int y = 0; y < kSize; ++y)
        for (int x = 0; x < kSize; ++x) {
            float nx = (static_cast<float>(x) / kSize - 0.5f) / kRadius;
            float ny = (static_cast<float>(y) / kSize - 0.5f) / kRadius;
            if (nx * nx + ny * ny >= 1) nx = ny = 0;
            const float nz = std::sqrt(1 - nx * nx - ny * ny);
            image.pixels.insert(image.pixels.end(), {ToByte(ny), ToByte(nx), ToByte(nz), 255});
        }
    return image;
}

// A picture has x in red and y in green, and its first row at the top.
Image FromPicture(const Image& picture) {
    Image image = picture;
    const size_t row = static_cast<size_t>(picture.width) * 4;
    for (size_t i = 0; i < picture.pixels.size(); i += 4) {
        const size_t from = (static_cast<size_t>(picture.height) - 1 - i / row) * row + i % row;
        image.pixels[i] = picture.pixels[from + 1];
        image.pixels[i + 1] = picture.pixels[from];
        image.pixels[i + 2] = picture.pixels[from + 2];
    }
    return image;
}

}  // namespace

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    Image normals = Knobs();
    if (argc > 2) {
        Image picture;
        std::string error;
        if (!LoadImage(argv[2], &picture, &error))
            return fprintf(stderr, "%s: %s\n", argv[2], error.c_str()), 1;
        normals = FromPicture(picture);
    }
    QexTexture_CreateFromPixels(&g_normals, normals.width, normals.height, QEX_TEXFMT_RGBA8888, 0, 0,
                                QEX_FILTER_LINEAR, QEX_WRAP_REPEAT, normals.pixels.data());
    g_normals.pixels = nullptr;
    glGenerateMipmap(GL_TEXTURE_2D);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_LINEAR_MIPMAP_LINEAR);

    // Several repetitions of the map around the sphere.
    const float times = argc > 2 ? 4 : 12;
    pod::MeshArrays sphere = scenes::Sphere(32);
    for (pod::Vec2& uv : sphere.uvs) uv = {times * uv[0], times / 2 * uv[1]};
    SampleModel ball(scenes::Still({{"ball", sphere, {0, 0, 0}}}));
    QexModel* model = &ball.model;
    ball.SetChequers(0, 0xA8A8B0, 0xA0A0A8);
    ball.SetLightColours(1, 0.1f);
    QexShaderModule* module = QexGouraudNormalMapShader_CreateProgram();
    QexModel_SetShaderProgram(model, 0, module);
    model->bindTextureHook = BindNormals;

    QexLightSet lights = {};
    lights.count = 1;
    lights.lights[0] = {QEX_LIGHT_POINT, {-5, 5, 6}, {1, 1, 1, 1}};
    const QexCamera camera = sample.Camera({0, 0, 3.2f}, {0, 0, 0});
    sample.Clear();
    QexModel_RenderWithCamera(model, &lights, &camera, nullptr, 0);

    const int status = sample.Finish();
    QexGouraudNormalMapShader_Release(&module);
    QexTexture_Release(&g_normals);
    return status;
}
