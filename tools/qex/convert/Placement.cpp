// Turns and scales what has been converted, not the file, whose animation would have to follow.
#include "convert/Placement.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstring>

#include <assimp/quaternion.h>
#include <assimp/vector3.h>
#include <CLI/CLI.hpp>

#include "common/EngineOutput.h"
#include "common/SceneBounds.h"
#include "common/TextureFiles.h"
#include "convert/Animation.h"

namespace {

constexpr float kHalfTurn = 3.14159265f;
constexpr char kFit[] = "fit:";

// By UpAxis: the turn that makes it +Y.
struct Turn {
    aiVector3D about;
    float angle;
};

const Turn kTurns[] = {{{0, 0, 1}, kHalfTurn / 2},  {{1, 0, 0}, 0},         {{1, 0, 0}, -kHalfTurn / 2},
                       {{0, 0, 1}, -kHalfTurn / 2}, {{0, 0, 1}, kHalfTurn}, {{1, 0, 0}, kHalfTurn / 2}};

// A factor, or fit:SIZE.
std::string ParseScale(const std::string& text, Placement* placement) {
    const NumberShape shape = {',',
                               {{NumberRange::kAny, FLT_TRUE_MIN, FLT_MAX}},
                               1,
                               "is no scale; expected a number above 0, or fit:SIZE for the longest edge"};
    Numbers n;
    const bool fit = Lower(text).rfind(kFit, 0) == 0;
    const std::string problem = ReadNumbers(fit ? text.substr(strlen(kFit)) : text, shape, &n);
    if (!problem.empty()) return "'" + text + "' " + shape.fault;
    (fit ? placement->fit : placement->scale) = static_cast<float>(n[0]);
    return "";
}

void TurnMatrix(const aiMatrix4x4& turn, float* m) {
    for (int column = 0; column < 4; ++column, m += 4) {
        aiVector3D v(m[0], m[1], m[2]);
        v *= turn;
        for (unsigned i = 0; i < 3; ++i) m[i] = v[i];
    }
}

void TurnNode(const aiQuaternion& turn, pod::Node* node) {
    const aiMatrix4x4 matrix(turn.GetMatrix());
    for (size_t i = 0; i + 16 <= node->matrices.size(); i += 16) TurnMatrix(matrix, &node->matrices[i]);
    if (!node->matrices.empty()) return;
    for (size_t i = 0; i + 3 <= node->positions.size(); i += 3) {
        aiVector3D v(node->positions[i], node->positions[i + 1], node->positions[i + 2]);
        v *= matrix;
        for (size_t k = 0; k < 3; ++k) node->positions[i + k] = v[static_cast<unsigned>(k)];
    }
    if (node->rotations.empty()) node->rotations = {0, 0, 0, -1};
    for (size_t i = 0; i + 4 <= node->rotations.size(); i += 4) {
        // The file holds w with its sign turned.
        float* r = &node->rotations[i];
        const aiQuaternion q = turn * aiQuaternion(-r[3], r[0], r[1], r[2]);
        const float turned[4] = {q.x, q.y, q.z, -q.w};
        std::memcpy(r, turned, sizeof turned);
    }
}

void ScaleNode(float scale, pod::Node* node) {
    for (float& p : node->positions) p *= scale;
    for (size_t i = 0; i < node->matrices.size(); ++i)
        if (i % 16 >= 12 && i % 16 < 15) node->matrices[i] *= scale;
}

void ScaleMesh(float scale, pod::Mesh* mesh) {
    for (uint32_t v = 0; v < mesh->vertexCount; ++v) {
        uint8_t* at = mesh->vertexBlock.data() + size_t{v} * mesh->vertices.stride + mesh->vertices.offset;
        float position[3];
        std::memcpy(position, at, sizeof position);
        for (float& p : position) p *= scale;
        std::memcpy(at, position, sizeof position);
    }
}

void ScaleScene(float scale, pod::Scene* scene) {
    for (pod::Node& node : scene->nodes) ScaleNode(scale, &node);
    for (pod::Mesh& mesh : scene->meshes) ScaleMesh(scale, &mesh);
    for (pod::Camera& camera : scene->cameras) {
        camera.nearPlane *= scale;
        camera.farPlane *= scale;
    }
    for (pod::Light& light : scene->lights) {
        light.linearAttenuation /= scale;
        light.quadraticAttenuation /= scale * scale;
    }
}

// At the clip's first frame, which comes after the bind pose of characters.
float LongestEdge(const pod::Scene& scene) {
    const std::vector<uint8_t> file = pod::WritePod(scene);
    std::vector<QexVec3> points;
    QexPODModel model = {};
    const bool skinned = std::any_of(scene.meshes.begin(), scene.meshes.end(),
                                     [](const pod::Mesh& mesh) { return mesh.batchCount > 0; });
    EngineOutput quiet;
    QexPODModel_ReadFromMemory(&model, file.data(), static_cast<uint32_t>(file.size()), 0, 0, 0, 0);
    if (model.runtime) QexPODModel_SetFrame(&model, skinned ? 1 : 0);
    for (uint32_t i = 0; model.runtime && i < model.meshNodeCount; ++i)
        CollectPoints(&model, i, SIZE_MAX, &points);
    QexPODModel_Release(&model);
    const Bounds bounds = BoundsOf(points);
    return bounds.empty ? 0 : bounds.LongestEdge();
}

}  // namespace

void SetUpPlacement(CLI::App* app, Placement* placement) {
    AddUpAxis(app, "the file's vertical axis: x, y, z, -x, -y or -z (y)", &placement->up);
    AddParsed(app, "--scale", "a factor, or fit:SIZE for the length of the longest edge (1)",
              [=](const std::string& text) { return ParseScale(text, placement); });
}

bool PlaceScene(const Placement& placement, pod::Scene* scene) {
    const Turn& turn = kTurns[static_cast<int>(placement.up)];
    for (pod::Node& node : scene->nodes)
        if (placement.up != UpAxis::kY && node.parent < 0)
            TurnNode(aiQuaternion(turn.about, turn.angle), &node);
    float scale = placement.scale;
    if (placement.fit > 0) {
        const float edge = LongestEdge(*scene);
        if (!(edge > 0) || !std::isfinite(placement.fit / edge)) return false;
        scale = placement.fit / edge;
    }
    if (scale < 1 || scale > 1) ScaleScene(scale, scene);
    return true;
}
