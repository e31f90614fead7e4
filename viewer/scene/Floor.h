// The floor that can be put under a scene: chequered, lit, in the XZ plane. It takes the scene's
// shadow and, half transparent, shows its mirror image.
#pragma once

#include <vector>

#include "Qex.h"

class Floor {
  public:
    Floor() = default;
    ~Floor();
    Floor(const Floor&) = delete;
    Floor& operator=(const Floor&) = delete;

    // Under these points at this height; where `mirrors` is set it lets its mirror image through.
    void Create(const std::vector<QexVec3>& points, float height, bool mirrors);
    // Null before Create.
    QexModel* Model() { return created_ ? &model_ : nullptr; }

    // Draws the mirror image of a model where the floor is. The floor itself is still to be drawn.
    void DrawMirrorImage(QexModel* scene, const QexLightSet& lights, const QexCamera& camera);

  private:
    bool created_ = false;
    float opacity_ = 1;
    std::vector<uint8_t> file_;  // that the model's keys lie in
    QexModel model_ = {};
    QexTexture* texture_ = nullptr;
    QexShaderModule* shader_ = nullptr;
};
