// The scene's own camera, and one that is placed so that everything is in the picture.
#include "scene/Camera.h"

#include <algorithm>
#include <cfloat>
#include <cmath>

#include "common/SceneBounds.h"

namespace {

constexpr float kDegree = 3.14159265f / 180;
constexpr float kMargin = 1.06f;  // of the picture around the points

// Length of a vector's part along an axis.
float Along(const QexVec3& v, const QexVec3& axis) {
    return QexVec3_DotProduct(&v, &axis);
}

QexVec3 Combine(const QexVec3& x, const QexVec3& y, const QexVec3& z, float a, float b, float c) {
    return {x.x * a + y.x * b + z.x * c, x.y * a + y.y * b + z.y * c, x.z * a + y.z * b + z.z * c};
}

// By UpAxis: the vertical, and where the camera stands at yaw 0.
const struct {
    QexVec3 up, front;
} kAxes[] = {{{1, 0, 0}, {0, 0, 1}},  {{0, 1, 0}, {0, 0, 1}},  {{0, 0, 1}, {0, -1, 0}},
             {{-1, 0, 0}, {0, 0, 1}}, {{0, -1, 0}, {0, 0, 1}}, {{0, 0, -1}, {0, 1, 0}}};

}  // namespace

bool UseSceneCamera(QexModel* model, uint32_t index, float aspect, QexCamera* camera) {
    QexVec3 eye, target, up;
    float fov, zNear = 0, zFar = 0;
    if (!QexModel_UpdateCamera(model, &eye, &target, &up, &fov, index)) return false;
    QexModel_GetCameraNearFar(model, &zNear, &zFar, index);
    if (!(zNear > 0)) zNear = 0.1f;
    if (!(zFar > zNear)) zFar = zNear * 100000;
    if (!(fov > 0.01f && fov < 3.1f)) fov = 0.785f;
    QexCamera_LookAt(camera, &eye, &target, &up);
    QexCamera_Project(camera, fov, aspect, zNear, zFar);
    return true;
}

OrbitView ChooseView(const std::vector<QexVec3>& points, OrbitView view) {
    const Bounds box = BoundsOf(points);
    const float width = box.high.x - box.low.x, height = box.high.y - box.low.y,
                depth = box.high.z - box.low.z;
    if (view.given || box.empty || depth > std::min(width, height) * 0.5f) return view;
    view.yaw = view.pitch = 0;
    return view;
}

void FramePoints(const std::vector<QexVec3>& points, const OrbitView& view, float aspect, QexCamera* camera) {
    const float yaw = view.yaw * kDegree, pitch = view.pitch * kDegree;
    const auto& axes = kAxes[static_cast<int>(view.up)];
    QexVec3 side, up;
    QexVec3_CrossProduct(&side, &axes.up, &axes.front);
    const QexVec3 back = Combine(side, axes.up, axes.front, std::sin(yaw) * std::cos(pitch), std::sin(pitch),
                                 std::cos(yaw) * std::cos(pitch));
    const QexVec3 right = Combine(side, axes.up, axes.front, std::cos(yaw), 0, -std::sin(yaw));
    QexVec3_CrossProduct(&up, &back, &right);
    // Bounds along the camera's own axes, seen from the origin.
    Bounds bounds;
    for (const QexVec3& p : points) bounds.Add({Along(p, right), Along(p, up), Along(p, back)});
    if (bounds.empty) bounds.Add({0, 0, 0});
    const float cx = (bounds.low.x + bounds.high.x) / 2, cy = (bounds.low.y + bounds.high.y) / 2;
    // The narrower side of the picture sees 40 degrees.
    const float half = std::tan(20 * kDegree);
    const float tanX = aspect > 1 ? half * aspect : half, tanY = aspect > 1 ? half : half / aspect;
    float distance = bounds.high.z;
    for (const QexVec3& p : points)
        distance = std::max({distance, Along(p, back) + std::fabs(Along(p, right) - cx) * kMargin / tanX,
                             Along(p, back) + std::fabs(Along(p, up) - cy) * kMargin / tanY});
    const float depth = std::max(distance - bounds.low.z, 1e-4f);
    const float size = std::max(bounds.LongestEdge(), 1e-4f);
    distance = std::max(distance, bounds.high.z + size * 0.05f);
    const float zNear = std::max((distance - bounds.high.z) * 0.5f, depth * 1e-3f);
    const QexVec3 eye = Combine(right, up, back, cx, cy, distance);
    const QexVec3 target = Combine(right, up, back, cx, cy, distance - 1);
    QexCamera_LookAt(camera, &eye, &target, &up);
    QexCamera_Project(camera, 2 * std::atan(tanX), aspect, zNear, (distance - bounds.low.z) * 1.5f + zNear);
}

QexVec3 UpOf(UpAxis up) {
    return kAxes[static_cast<int>(up)].up;
}

QexVec3 FrontOf(UpAxis up) {
    return kAxes[static_cast<int>(up)].front;
}

void LookAlong(const LookView& look, UpAxis axis, const std::vector<QexVec3>& points, float margin,
               float aspect, QexCamera* camera) {
    QexVec3 forward, right, up = UpOf(axis);
    QexVec3_Subtract(&forward, &look.target, &look.eye);
    QexVec3_Normalize(&forward, &forward);
    QexVec3_CrossProduct(&right, &forward, &up);
    // Straight up or down the vertical is no up.
    if (QexVec3_DotProduct(&right, &right) < 1e-8f) {
        up = FrontOf(axis);
        if (Along(forward, UpOf(axis)) > 0) QexVec3_Scale(&up, &up, -1);
        QexVec3_Scale(&up, &up, -1);
    }
    float nearest = FLT_MAX, farthest = 0;
    for (const QexVec3& p : points) {
        const float depth = Along(p, forward) - Along(look.eye, forward);
        nearest = std::min(nearest, depth - margin);
        farthest = std::max(farthest, depth + margin);
    }
    farthest = std::max(farthest, 1e-3f) * 1.5f;
    const float zNear = std::clamp(nearest * 0.5f, farthest * 5e-4f, farthest * 0.5f);
    QexCamera_LookAt(camera, &look.eye, &look.target, &up);
    // The engine's angle is the horizontal one.
    const float across = 2 * std::atan(std::tan(look.fov * kDegree / 2) * aspect);
    QexCamera_Project(camera, across, aspect, zNear, farthest);
}
