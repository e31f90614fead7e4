// A plane of the size of the scene, as a model of its own.
#include "scene/Floor.h"

#include <algorithm>

#include <GLES2/gl2.h>

#include "common/SceneBounds.h"
#include "PodBuild.h"
#include "scene/Textures.h"

namespace {

constexpr float kSpread = 4;        // sizes of the scene across
constexpr float kSquares = 24;      // of one colour each, along an edge
constexpr float kMirroring = 0.6f;  // opacity over a mirror image

Image Chequers() {
    constexpr int kSize = 128;
    Image image;
    image.width = image.height = kSize;
    for (int y = 0; y < kSize; ++y)
        for (int x = 0; x < kSize; ++x) {
            const uint8_t grey = (x < kSize / 2) == (y < kSize / 2) ? 210 : 150;
            image.pixels.insert(image.pixels.end(), {grey, grey, grey, 255});
        }
    return image;
}

pod::Scene PlaneScene(float size, const pod::Vec3& place) {
    pod::MeshArrays plane = pod::FloorMesh(size);
    for (pod::Vec2& uv : plane.uvs)
        for (float& t : uv) t *= kSquares / 2 / size;
    pod::Scene scene;
    scene.materials.resize(1);
    scene.meshes = {pod::BuildMesh(plane)};
    scene.nodes = {pod::BuildNode("floor", {{place}, {}, {}, {}}, -1, 0, 0)};
    scene.meshNodeCount = 1;
    return scene;
}

}  // namespace

Floor::~Floor() {
    if (!created_) return;
    QexModel_Unload(&model_);
    if (texture_) QexTexture_Release(texture_);
    QexMemory_Free(texture_);
    QexGouraudShadowShader_Release(&shader_);
}

void Floor::Create(const std::vector<QexVec3>& points, float height, bool mirrors) {
    const Bounds bounds = BoundsOf(points);
    if (bounds.empty) return;
    const pod::Vec3 place = {(bounds.low.x + bounds.high.x) / 2, height, (bounds.low.z + bounds.high.z) / 2};
    file_ = pod::WritePod(PlaneScene(kSpread * bounds.LongestEdge(), place));
    QexModel_Create(&model_);
    QexModel_LoadContentFromCache(&model_, file_.data(), static_cast<uint32_t>(file_.size()), nullptr);
    created_ = true;
    // A model from memory does not own its textures.
    texture_ = NewPictureTexture(Chequers(), "floor");
    QexModel_ReplaceTextureByIdx(&model_, texture_, 0);
    opacity_ = mirrors ? kMirroring : 1.0f;
    QexPODMaterial& material = model_.scene.materials[0];
    material.opacity = opacity_;
    for (int i = 0; i < 3; ++i) {
        material.diffuse[i] = 0.8f;
        material.ambient[i] = 0.2f;
    }
    shader_ = QexGouraudShadowShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&model_, shader_, nullptr);
}

void Floor::DrawMirrorImage(QexModel* scene, const QexLightSet& lights, const QexCamera& camera) {
    const QexShadowCaster all = {scene, 1, nullptr, 0};
    QexReflection* reflection = QexReflection_InitReflectionInfo(&model_, 0, &all, 1, 1);
    if (!reflection) return;
    // The reflection draws its plane without shadows: it is to leave no trace.
    model_.scene.materials[0].opacity = 0;
    glClearStencil(0);
    glClear(GL_STENCIL_BUFFER_BIT);
    QexReflection_RenderReflection(reflection, &lights, &camera);
    QexReflection_Release(reflection);
    model_.scene.materials[0].opacity = opacity_;
    QexModel_EnableNodeRendering(&model_, 0, 1);
}
