// What people take hold of in the picture and move along it: the selected node, and lights by their marks.
#include <algorithm>
#include <cmath>

#include "front/Viewer.h"

namespace {

constexpr float kReach = 12;  // pixels around a light's mark

}  // namespace

bool Viewer::See(const QexVec3& place, Spot* spot) const {
    const QexCamera& camera = view_->Camera();
    QexVec3 forward, right, down, to;
    QexVec3_Subtract(&forward, &camera.target, &camera.eye);
    QexVec3_Normalize(&forward, &forward);
    QexVec3_CrossProduct(&right, &forward, &camera.up);
    QexVec3_Normalize(&right, &right);
    QexVec3_CrossProduct(&down, &forward, &right);
    QexVec3_Subtract(&to, &place, &camera.eye);
    const float depth = QexVec3_DotProduct(&to, &forward), width = static_cast<float>(engine_.width);
    const float pixel = 2 * depth * std::tan(camera.fov / 2) / width;
    if (!(depth > 0 && pixel > 0)) return false;
    spot->pixel = pixel;
    spot->x = width / 2 + QexVec3_DotProduct(&to, &right) / pixel;
    spot->y = static_cast<float>(engine_.height) / 2 + QexVec3_DotProduct(&to, &down) / pixel;
    QexVec3_Scale(&spot->right, &right, pixel);
    QexVec3_Scale(&spot->down, &down, pixel);
    return true;
}

// The nearest light's mark; with Ctrl and Shift, as window managers have Alt, the selected node, wherever it
// is.
int Viewer::HeldAt(float x, float y, unsigned modifiers) const {
    if (modifiers == (kShift | kControl)) return selected_ >= 0 && view_->Model() ? kNode : kNothing;
    int held = kNothing;
    float nearest = kReach;
    const std::vector<QexLight>& lights = options_.effects.lights;
    for (size_t i = 0; i < lights.size() && view_->Model() && !modifiers; ++i) {
        Spot spot;
        if (!See({lights[i].vector[0], lights[i].vector[1], lights[i].vector[2]}, &spot)) continue;
        const float away = std::hypot(spot.x - x, spot.y - y);
        if (away < nearest) held = static_cast<int>(i);
        nearest = std::min(nearest, away);
    }
    return held;
}

void Viewer::MoveHeld(int held, float dx, float dy) {
    QexModel* model = view_->Model();
    SceneOptions options = options_;
    Spot spot;
    if (held != kNode) {
        if (static_cast<size_t>(held) >= options.effects.lights.size()) return;
        float* at = options.effects.lights[static_cast<size_t>(held)].vector;
        if (!See({at[0], at[1], at[2]}, &spot)) return;
        const QexVec3 moved = Offset(Offset({at[0], at[1], at[2]}, spot.right, dx), spot.down, dy);
        at[0] = moved.x, at[1] = moved.y, at[2] = moved.z;
        return SetOptions(options);
    }
    if (!model || selected_ < 0) return;
    const uint32_t index = static_cast<uint32_t>(selected_);
    QexVec3 place;
    if (QexModel_GetNodeWorldPos(model, index, &place) != 0 || !See(place, &spot)) return;
    const QexVec3 across = Offset(Offset({0, 0, 0}, spot.right, dx), spot.down, dy);
    QexVec4 way = {across.x, across.y, across.z, 0};
    // Changes are in the space of the node's parent.
    const int32_t parent = model->scene.nodes[index].parentIndex;
    QexMatrix world;
    if (parent >= 0 && QexModel_GetNodeWorldMatrix(model, static_cast<uint32_t>(parent), &world) == 0) {
        QexMatrix_Inverse(&world, &world);
        QexMatrix_TransformVec4(&world, &way, &way);
    }
    for (const float number : {way.x, way.y, way.z})
        if (!std::isfinite(number)) return;
    const std::string node = NodeWord(model->scene, index);
    const NodeChange* before = FindChange(options.effects.nodes, node, NodeChange::kMove);
    const QexVec3 from = before ? before->value : QexVec3{0, 0, 0};
    SetChange(&options.effects.nodes,
              {node, NodeChange::kMove, {from.x + way.x, from.y + way.y, from.z + way.z}});
    SetOptions(options);
}

void Viewer::TakeSceneLights() {
    QexModel* model = view_->Model();
    if (!model) return;
    QexLightSet set = {};
    QexModel_GetLight(model, &set);
    // From where its rays are as good as parallel, and numbers still exact enough.
    const float far = view_->Size() * 100;
    SceneOptions options = options_;
    options.effects.lights.clear();
    for (uint32_t i = 0; i < set.count; ++i) {
        QexLight light = set.lights[i];
        QexVec3 along = {light.vector[0], light.vector[1], light.vector[2]};
        if (light.type == QEX_LIGHT_DIRECTIONAL) {
            QexVec3_Normalize(&along, &along);
            QexVec3_Scale(&along, &along, -far);
            light = {QEX_LIGHT_POINT, {along.x, along.y, along.z}, {1, 1, 1, 1}};
        }
        std::copy_n(set.lights[i].colour, 3, light.colour);
        options.effects.lights.push_back(light);
    }
    if (set.count)
        SetOptions(options);
    else
        Say("the scene has no lights");
}
