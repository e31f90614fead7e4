#include "support/RenderScenes.h"

#include "support/Capture.h"

pod::MeshArrays Rectangle(float left, float bottom, float right, float top) {
    pod::MeshArrays arrays;
    arrays.positions = {{left, bottom, 0}, {right, bottom, 0}, {left, top, 0}, {right, top, 0}};
    arrays.uvs = {{0, 0}, {1, 0}, {0, 1}, {1, 1}};
    arrays.indices = {0, 1, 2, 2, 1, 3};
    return arrays;
}

pod::Scene SceneOf(const pod::Mesh& mesh, const pod::Transform& place) {
    pod::Scene scene;
    scene.meshes = {mesh};
    scene.nodes = {pod::BuildNode("node", place, -1, 0, 0)};
    scene.meshNodeCount = 1;
    scene.materials.resize(1);
    scene.materials[0].name = "material";
    scene.materials[0].diffuseTexture = 0;
    scene.textures = {"wood.pvr"};
    scene.frameCount = 1;
    return scene;
}

pod::Element IntegerElement(uint32_t type, uint32_t components, const std::vector<double>& values) {
    pod::Element e;
    e.type = type;
    e.components = components;
    const uint32_t size = pod::DataTypeSize(type);
    e.stride = components * size;
    for (const double value : values) {
        const auto word = static_cast<uint32_t>(static_cast<int32_t>(value));
        for (uint32_t i = 0; i < size; ++i) e.data.push_back(static_cast<uint8_t>(word >> (8 * i)));
    }
    return e;
}

pod::Mesh SkinnedMesh(const pod::MeshArrays& arrays, uint32_t influences, uint32_t weightType,
                      const std::vector<int32_t>& bones) {
    pod::Mesh mesh = pod::BuildMesh(arrays);
    mesh.boneIndices.components = mesh.boneWeights.components = influences;
    mesh.boneWeights.type = weightType;
    mesh.batchBones = bones;
    mesh.batchBoneMax = static_cast<int32_t>(bones.size());
    mesh.bonesPerBatch = {mesh.batchBoneMax};
    mesh.batchOffsets = {0};
    mesh.batchCount = 1;
    return mesh;
}

QexTexture MakeTexture(int w, int h, const uint8_t* rgba) {
    std::vector<uint8_t> pixels(rgba, rgba + w * h * 4);
    QexTexture texture;
    QexTexture_CreateFromPixels(&texture, w, h, QEX_TEXFMT_RGBA8888, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP,
                                pixels.data());
    texture.pixels = nullptr;
    return texture;
}

QexTexture SolidTexture(Rgba colour) {
    const std::vector<uint8_t> pixel(colour.begin(), colour.end());
    return MakeTexture(1, 1, pixel.data());
}

QexCamera PixelCamera(glm::vec3 origin) {
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    camera.viewMatrix = ToQex(glm::translate(glm::mat4(1), origin));
    camera.projectionMatrix = PixelProjection();
    return camera;
}

LoadedModel::LoadedModel(const pod::Scene& scene) : file(pod::WritePod(scene)) {
    Capture out(STDOUT_FILENO), errors(STDERR_FILENO);
    QexModel_Create(&model);
    QexModel_LoadContentFromCache(&model, file.data(), static_cast<uint32_t>(file.size()), nullptr);
    log = ErrorLines(errors.Text());
}

void LoadedModel::Draw(const QexMatrix* modelMatrix) {
    const QexMatrix projection = PixelProjection();
    QexModel_RenderWithViewProjection(&model, nullptr, modelMatrix, &g_sMatIdentity, &projection, 0);
}

void LoadedModel::DrawNode(QexShaderModule* module, uint32_t node) {
    const QexMatrix projection = PixelProjection();
    module->render(module, &model, node, nullptr, nullptr, &g_sMatIdentity, &projection, nullptr);
}
