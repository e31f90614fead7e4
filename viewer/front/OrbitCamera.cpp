// Yaw, pitch and distance about a target.
#include "front/OrbitCamera.h"

#include <algorithm>
#include <cmath>

#include "common/SceneBounds.h"

namespace {

constexpr float kDegree = 3.14159265f / 180;
constexpr float kPole = 89;
constexpr float kNearest = 1e-5f, kFarthest = 1e9f;  // distances, in units

float Dot(const QexVec3& a, const QexVec3& b) {
    return QexVec3_DotProduct(&a, &b);
}

// A camera's angle from below to above, in degrees; its own is the one across.
float Vertical(const QexCamera& camera) {
    return 2 * std::atan(std::tan(camera.fov / 2) / camera.aspect) / kDegree;
}

}  // namespace

OrbitCamera::Axes OrbitCamera::GetAxes() const {
    const float yaw = view_.yaw * kDegree, pitch = view_.pitch * kDegree;
    const QexVec3 vertical = UpOf(view_.up), front = FrontOf(view_.up), zero = {0, 0, 0};
    Axes axes;
    QexVec3 side;
    QexVec3_CrossProduct(&side, &vertical, &front);
    axes.right = Offset(Offset(zero, side, std::cos(yaw)), front, -std::sin(yaw));
    axes.back = Offset(Offset(Offset(zero, side, std::sin(yaw) * std::cos(pitch)), vertical, std::sin(pitch)),
                       front, std::cos(yaw) * std::cos(pitch));
    QexVec3_CrossProduct(&axes.up, &axes.back, &axes.right);
    return axes;
}

void OrbitCamera::Orbit(float yaw, float pitch) {
    Look(std::fmod(view_.yaw + yaw, 360.0f), view_.pitch + pitch);
}

void OrbitCamera::Look(float yaw, float pitch) {
    view_.yaw = yaw;
    view_.pitch = std::clamp(pitch, -kPole, kPole);
}

void OrbitCamera::Pan(float right, float up) {
    const Axes axes = GetAxes();
    const float height = 2 * distance_ * std::tan(fov_ * kDegree / 2);
    target_ = Offset(Offset(target_, axes.right, right * height), axes.up, up * height);
}

void OrbitCamera::Dolly(float factor) {
    distance_ = std::clamp(distance_ * factor, kNearest, kFarthest);
}

void OrbitCamera::Fly(float forward, float right, float up) {
    const Axes axes = GetAxes();
    target_ = Offset(Offset(Offset(target_, axes.back, -forward * distance_), axes.right, right * distance_),
                     axes.up, up * distance_);
}

void OrbitCamera::FrameAll(const std::vector<QexVec3>& points, float aspect) {
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    view_.given = true;
    FramePoints(points, view_, aspect, &camera);
    const QexVec3 back = GetAxes().back;
    const Bounds box = BoundsOf(points);
    const QexVec3 middle = box.empty ? QexVec3{0, 0, 0}
                                     : QexVec3{(box.low.x + box.high.x) / 2, (box.low.y + box.high.y) / 2,
                                               (box.low.z + box.high.z) / 2};
    distance_ = std::max(Dot(camera.eye, back) - Dot(middle, back), kNearest);
    target_ = Offset(camera.eye, back, -distance_);
    fov_ = Vertical(camera);
}

void OrbitCamera::Follow(const QexCamera& camera, float distance) {
    QexVec3 back, side;
    const QexVec3 vertical = UpOf(view_.up), front = FrontOf(view_.up);
    QexVec3_Subtract(&back, &camera.eye, &camera.target);
    QexVec3_Normalize(&back, &back);
    QexVec3_CrossProduct(&side, &vertical, &front);
    Look(std::atan2(Dot(back, side), Dot(back, front)) / kDegree,
         std::asin(std::clamp(Dot(back, vertical), -1.0f, 1.0f)) / kDegree);
    fov_ = Vertical(camera);
    distance_ = std::clamp(distance, kNearest, kFarthest);
    target_ = Offset(camera.eye, GetAxes().back, -distance_);
}

LookView OrbitCamera::View() const {
    return {Offset(target_, GetAxes().back, distance_), target_, fov_};
}
