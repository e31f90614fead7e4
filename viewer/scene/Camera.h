// The cameras that a scene is seen through.
#pragma once

#include <vector>

#include "common/UpAxis.h"
#include "Qex.h"

struct OrbitView {
    float yaw = 30;    // degrees about the vertical: with Y up, 0 looks along -Z, 90 along -X
    float pitch = 15;  // degrees above the horizon
    UpAxis up = UpAxis::kY;
    bool given = false;  // otherwise flat scenes, such as writing, are seen from the front
};

// From a place to another.
struct LookView {
    QexVec3 eye, target;
    float fov = 45;  // vertical, degrees
};

// Fills the camera from a scene camera at the current frame. False when the scene has no such camera.
bool UseSceneCamera(QexModel* model, uint32_t index, float aspect, QexCamera* camera);

// The view as it was given, or the one that suits the points.
OrbitView ChooseView(const std::vector<QexVec3>& points, OrbitView view);

// Places the camera so that all points are in the picture, from the direction of the view.
void FramePoints(const std::vector<QexVec3>& points, const OrbitView& view, float aspect, QexCamera* camera);

// A place so far along an axis.
inline QexVec3 Offset(const QexVec3& from, const QexVec3& axis, float by) {
    return {from.x + axis.x * by, from.y + axis.y * by, from.z + axis.z * by};
}

// The vertical of an axis, and where the camera stands at yaw 0.
QexVec3 UpOf(UpAxis up);
QexVec3 FrontOf(UpAxis up);

// Looks as told, with depths around all points and what lies `margin` beyond them.
void LookAlong(const LookView& look, UpAxis up, const std::vector<QexVec3>& points, float margin,
               float aspect, QexCamera* camera);
