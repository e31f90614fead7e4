// The drawing of a scene.
#include "scene/SceneView.h"

#include <algorithm>
#include <cmath>

#include <GLES2/gl2.h>

#include "common/SceneBounds.h"

namespace {

constexpr size_t kFramingPoints = 200000;  // of each mesh node over all frames, about
constexpr size_t kFramingPictures = 200;   // of a sequence that the camera is fitted to, at most

}  // namespace

// The engine plays a loop, in which the last frame is the first again. A picture of the last frame shows its
// own keys.
void SceneView::SetFrame(double frame) {
    frame_ = frame;
    if (!model_) return;
    QexPODModel& scene = model_->scene;
    const float f = static_cast<float>(frame);
    QexPODModel_SetFrame(&scene, f);
    if (scene.frameCount < 2 || f != static_cast<float>(scene.frameCount - 1)) return;
    for (uint32_t i = 0; i < scene.nodeCount; ++i) QexPODModel_SetNodeAnimationFrame(&scene, i, f);
}

// Collects what the automatic camera has to show, over all frames, with its mirror image.
void SceneView::FitTo(const std::vector<double>& frames) {
    frames_ = frames;
    points_.clear();
    size_ = 1;
    if (!model_) return;
    const double shown = frame_;
    // Of long sequences some pictures stand for all.
    const size_t step = (frames.size() + kFramingPictures - 1) / kFramingPictures;
    const size_t share = std::max<size_t>(1000, kFramingPoints / (frames.size() / step));
    for (size_t picture = 0; picture < frames.size(); picture += step) {
        SetFrame(frames[picture]);
        for (uint32_t i = 0; i < model_->scene.meshNodeCount; ++i)
            CollectPoints(&model_->scene, i, share, &points_);
    }
    SetFrame(shown);
    const std::optional<float> mirror =
        options_.effects.mirror ? options_.effects.mirror : options_.effects.water;
    for (size_t i = 0, seen = mirror ? points_.size() : 0; i < seen; ++i) {
        const QexVec3 p = points_[i];
        points_.push_back({p.x, 2 * *mirror - p.y, p.z});
    }
    const Bounds bounds = BoundsOf(points_);
    const float edge = bounds.empty ? 0 : bounds.LongestEdge();
    if (edge > 0) size_ = edge;
}

// With the eyes side by side each has half the picture.
void SceneView::PlaceCamera(float turned) {
    const int whole = engine_->width / scale_;
    const int width = options_.effects.stereo == 3 ? std::max(whole / 2, 1) : whole;
    const float aspect = static_cast<float>(width) / static_cast<float>(engine_->height / scale_);
    QexCamera_Create(&camera_, 0);
    const uint32_t camera = static_cast<uint32_t>(options_.camera.value_or(0));
    if (options_.look)
        LookAlong(*options_.look, options_.view.up, points_, floor_ ? Size() : 0, aspect, &camera_);
    else if (UsesAutoCamera() || !model_ || !UseSceneCamera(model_.get(), camera, aspect, &camera_)) {
        OrbitView view = ChooseView(points_, options_.view);
        view.yaw += turned;
        FramePoints(points_, view, aspect, &camera_);
    }
}

void SceneView::Draw(float turned) {
    PlaceCamera(turned);
    glViewport(0, 0, engine_->width, engine_->height);
    if (!model_) {
        Clear(options_.background);
        return;
    }
    if (depthOfField_) {
        DrawWithDepthOfField(engine_, options_.effects, scale_,
                             [this](QexShaderModule* module, QexShaderModule* skinned) {
                                 Clear(module ? 0xFFFFFF : options_.background);
                                 module ? DrawDepth(module, skinned) : DrawScene(camera_);
                             });
        return;
    }
    Clear(options_.background);
    if (sky_)
        sky_->Draw(
            engine_, camera_, [this](const QexCamera& camera) { DrawOpaque(camera); },
            [this](const QexCamera& camera) { DrawBlended(camera); });
    else if (options_.effects.stereo)
        DrawBothEyes();
    else
        DrawScene(camera_);
}

void SceneView::Clear(uint32_t colour) {
    const auto channel = [&](int shift) { return static_cast<float>(colour >> shift & 0xFF) / 255.0f; };
    QexRenderer_SetZWrite(1);
    glClearColor(channel(16), channel(8), channel(0), 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
}

// Everything that can be seen, with modules that show its depth.
void SceneView::DrawDepth(QexShaderModule* module, QexShaderModule* skinned) {
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_NONE);
    QexModel* floor = floor_ ? floor_->Model() : nullptr;
    const ShaderOverride floorDepth(floor, module, skinned), modelDepth(model_.get(), module, skinned);
    if (floor) QexModel_RenderWithCamera(floor, nullptr, &camera_, nullptr, 0);
    for (uint32_t pass = 0; pass <= model_->scene.highestPass; ++pass)
        QexModel_RenderWithCamera(model_.get(), nullptr, &camera_, nullptr, pass);
}

// The eyes are a thirtieth of the way to the target apart.
void SceneView::DrawBothEyes() {
    QexVec3 forward, right;
    QexVec3_Subtract(&forward, &camera_.target, &camera_.eye);
    QexVec3_CrossProduct(&right, &forward, &camera_.up);
    QexVec3_Normalize(&right, &right);
    const float half = sqrtf(QexVec3_DotProduct(&forward, &forward)) / 60;
    QexRenderer_EnableStereo3D(engine_, options_.effects.stereo,
                               options_.effects.separation * static_cast<float>(scale_));
    for (const float side : {-half, half}) {
        QexCamera eye = camera_;
        const QexVec3 place = {eye.eye.x + side * right.x, eye.eye.y + side * right.y,
                               eye.eye.z + side * right.z};
        QexCamera_LookAt(&eye, &place, &camera_.target, &camera_.up);
        (side < 0 ? QexRenderer_PrepareLeft : QexRenderer_PrepareRight)(engine_);
        DrawScene(eye);
    }
    QexRenderer_FinishStereo3D(engine_);
}

void SceneView::DrawScene(const QexCamera& camera) {
    DrawOpaque(camera);
    DrawBlended(camera);
}

void SceneView::DrawOpaque(const QexCamera& camera) {
    transparentCount_ = 0;
    const QexLightSet lights = ChooseLights(model_.get(), options_.effects, camera);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetAlphaBlendModeSeparate(QEX_BLEND_ALPHA, QEX_BLEND_KEEP_ALPHA);
    QexModel* floor = floor_ ? floor_->Model() : nullptr;
    if (floor && options_.effects.mirror)
        floor_->DrawMirrorImage(model_.get(), lights, camera);
    else
        DrawMirrored(model_.get(), options_.effects, lights, camera);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    if (options_.effects.shadow) {
        DrawWithShadow(engine_, floor, model_.get(), lights, camera);
        return;
    }
    if (floor) QexModel_RenderWithCamera(floor, &lights, &camera, nullptr, 0);
    for (uint32_t pass = 0; pass <= model_->scene.highestPass; ++pass)
        QexModel_RenderWithCameraEx(model_.get(), &lights, &camera, nullptr, pass, QEX_RENDER_OPAQUE,
                                    transparent_.data(), &transparentCount_);
}

// Draws what was put off, and the particles.
void SceneView::DrawBlended(const QexCamera& camera) {
    // The far sides of transparent bodies first, then the near ones.
    QexRenderer_SetZWrite(0);
    for (int32_t culled : {QEX_CULL_FRONT, QEX_CULL_BACK}) {
        QexRenderer_SetBackFaceCulling(culled);
        for (uint32_t pass = 0; pass <= model_->scene.highestPass; ++pass)
            QexModel_RenderAlphaBlendingNodes(transparent_.data(), transparentCount_, pass);
    }
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetZWrite(1);
    if (emitters_) emitters_->Draw(camera);
}

std::vector<uint32_t> SceneView::Pick(float x, float y) {
    if (!model_) return {};
    std::vector<uint32_t> hit(model_->scene.meshNodeCount + size_t{1});
    QexModel_UpdateModelBoundingBox(model_.get(), nullptr);
    QexModel_CalcScreenBBox(engine_, model_.get(), &camera_);
    const float s = static_cast<float>(scale_);
    const QexVec2 point = {x * s, y * s};
    int32_t count = 0;
    QexModel_Pick(model_.get(), nullptr, &point, &count, hit.data(),
                  static_cast<int32_t>(model_->scene.meshNodeCount));
    hit.resize(static_cast<size_t>(count));
    return hit;
}
