// A camera that people move: around a place, along the picture, nearer and farther.
#pragma once

#include <vector>

#include "scene/Camera.h"

class OrbitCamera {
  public:
    void SetUp(UpAxis up) { view_.up = up; }
    UpAxis Up() const { return view_.up; }

    void Orbit(float yaw, float pitch);              // degrees; stops short of the poles
    void Pan(float right, float up);                 // heights of the picture at the target
    void Dolly(float factor);                        // of the distance to the target
    void Fly(float forward, float right, float up);  // distances to the target
    void Look(float yaw, float pitch);               // from there on to the same target
    // Everything in the picture from the same direction, as the automatic camera sees it.
    void FrameAll(const std::vector<QexVec3>& points, float aspect);
    // Stands where a camera stands; what it is rolled about its axis is lost.
    void Follow(const QexCamera& camera, float distance);

    LookView View() const;
    float Yaw() const { return view_.yaw; }
    float Pitch() const { return view_.pitch; }
    float Distance() const { return distance_; }
    QexVec3 Target() const { return target_; }

  private:
    // The camera's own axes.
    struct Axes {
        QexVec3 right, up, back;
    };
    Axes GetAxes() const;

    QexVec3 target_ = {0, 0, 0};
    float distance_ = 5, fov_ = 40;
    OrbitView view_;
};
