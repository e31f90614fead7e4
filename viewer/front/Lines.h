// Lines in space, drawn over or into a scene: grids, boxes, bones.
#pragma once

#include <cstdint>
#include <vector>

#include "Qex.h"

class Lines {
  public:
    Lines() = default;
    ~Lines();
    Lines(const Lines&) = delete;
    Lines& operator=(const Lines&) = delete;

    // The context is gone, and all that was made in it.
    void Forget() { program_ = buffer_ = 0; }
    void Clear() { points_.clear(); }
    void Add(const QexVec3& from, const QexVec3& to, uint32_t colour);  // RRGGBB
    void AddBox(const QexVec3 corners[8], uint32_t colour);             // as QexBoundingBox's corners
    // An octahedron with so far from its middle to its corners.
    void AddMark(const QexVec3& middle, float radius, uint32_t colour);
    // Squares around the origin, across the vertical; the two axes in colour.
    void AddGrid(float size, int squares, const QexVec3& up);
    // Between other drawings; `hidden`: behind what is nearer.
    void Draw(const QexCamera& camera, bool hidden);

  private:
    struct Point {
        QexVec3 place;
        uint8_t colour[4];
    };
    bool Prepare();

    std::vector<Point> points_;
    uint32_t shaders_[2] = {0, 0}, program_ = 0, buffer_ = 0;
    int matrix_ = -1;
};
