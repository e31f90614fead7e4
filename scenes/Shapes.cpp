// Quads and what is turned on a lathe.
#include "Shapes.h"

#include <algorithm>
#include <cmath>

namespace shapes {

namespace {

constexpr float kTurn = 6.2831853f;

uint32_t AddVertex(const pod::Vec3& position, const pod::Vec3& normal, const pod::Vec2& uv,
                   pod::MeshArrays* mesh) {
    mesh->positions.push_back(position);
    mesh->normals.push_back(normal);
    mesh->uvs.push_back(uv);
    return static_cast<uint32_t>(mesh->positions.size()) - 1;
}

}  // namespace

pod::Vec3 NormalOf(const pod::Vec3& a, const pod::Vec3& b, const pod::Vec3& c) {
    pod::Vec3 normal;
    for (size_t i = 0; i < 3; ++i) {
        const size_t j = (i + 1) % 3, k = (i + 2) % 3;
        normal[i] = (b[j] - a[j]) * (c[k] - a[k]) - (b[k] - a[k]) * (c[j] - a[j]);
    }
    const float length = std::hypot(normal[0], normal[1], normal[2]);
    for (float& axis : normal) axis /= length > 0 ? length : 1;
    return normal;
}

void AddGridIndices(uint32_t first, uint32_t across, uint32_t up, pod::MeshArrays* mesh) {
    for (uint32_t y = 0; y + 1 < up; ++y)
        for (uint32_t x = 0; x + 1 < across; ++x) {
            const uint32_t i = first + y * across + x;
            for (const uint32_t index : {i, i + 1, i + across, i + across, i + 1, i + across + 1})
                mesh->indices.push_back(index);
        }
}

void AddTriangle(const std::array<pod::Vec3, 3>& corners, const std::array<pod::Vec2, 3>& uvs,
                 pod::MeshArrays* mesh) {
    const pod::Vec3 normal = NormalOf(corners[0], corners[1], corners[2]);
    for (size_t i = 0; i < 3; ++i) mesh->indices.push_back(AddVertex(corners[i], normal, uvs[i], mesh));
}

void AddQuad(const std::array<pod::Vec3, 4>& corners, const UvRect& uv, pod::MeshArrays* mesh) {
    const pod::Vec2 uvs[4] = {
        {uv.left, uv.bottom}, {uv.right, uv.bottom}, {uv.right, uv.top}, {uv.left, uv.top}};
    const pod::Vec3 normal = NormalOf(corners[0], corners[1], corners[2]);
    uint32_t index[4];
    for (size_t i = 0; i < 4; ++i) index[i] = AddVertex(corners[i], normal, uvs[i], mesh);
    for (const int i : {0, 1, 2, 0, 2, 3}) mesh->indices.push_back(index[i]);
}

void AddBox(const pod::Vec3& low, const pod::Vec3& high, const UvRect& uv, pod::MeshArrays* mesh) {
    const auto at = [&](int x, int y, int z) {
        return pod::Vec3{x ? high[0] : low[0], y ? high[1] : low[1], z ? high[2] : low[2]};
    };
    AddQuad({at(0, 0, 1), at(1, 0, 1), at(1, 1, 1), at(0, 1, 1)}, uv, mesh);
    AddQuad({at(1, 0, 1), at(1, 0, 0), at(1, 1, 0), at(1, 1, 1)}, uv, mesh);
    AddQuad({at(1, 0, 0), at(0, 0, 0), at(0, 1, 0), at(1, 1, 0)}, uv, mesh);
    AddQuad({at(0, 0, 0), at(0, 0, 1), at(0, 1, 1), at(0, 1, 0)}, uv, mesh);
    const UvRect point = {uv.left, uv.top, uv.left, uv.top};
    AddQuad({at(0, 1, 1), at(1, 1, 1), at(1, 1, 0), at(0, 1, 0)}, point, mesh);
    AddQuad({at(0, 0, 0), at(1, 0, 0), at(1, 0, 1), at(0, 0, 1)}, point, mesh);
}

void AddTurned(const Turned& shape, const pod::Vec3& place, const UvRect& uv, pod::MeshArrays* mesh) {
    const float rise = shape.high - shape.low, slope = shape.bottom - shape.top;
    const float length = std::hypot(rise, slope);
    const auto ring = [&](float radius, float height, float turn) {
        return pod::Vec3{place[0] + radius * std::sin(turn), place[1] + height,
                         place[2] + radius * std::cos(turn)};
    };
    const auto outward = [&](float turn) {
        return pod::Vec3{std::sin(turn) * rise / length, slope / length, std::cos(turn) * rise / length};
    };
    for (int side = 0; side < shape.sides; ++side) {
        const float part = 1 / static_cast<float>(shape.sides), s = static_cast<float>(side) * part;
        const float from = kTurn * s, to = kTurn * (s + part), middle = (from + to) / 2;
        const float u = uv.left + (uv.right - uv.left) * s, v = u + (uv.right - uv.left) * part;
        const struct {
            pod::Vec3 position;
            float turn, s, t;
        } corners[4] = {{ring(shape.bottom, shape.low, from), from, u, uv.bottom},
                        {ring(shape.bottom, shape.low, to), to, v, uv.bottom},
                        {ring(shape.top, shape.high, to), to, v, uv.top},
                        {ring(shape.top, shape.high, from), from, u, uv.top}};
        uint32_t index[4];
        for (size_t i = 0; i < 4; ++i)
            index[i] = AddVertex(corners[i].position, outward(shape.flat ? middle : corners[i].turn),
                                 {corners[i].s, corners[i].t}, mesh);
        for (const int i : {0, 1, 2, 0, 2, 3}) mesh->indices.push_back(index[i]);
        if (shape.top > 0)
            AddTriangle(
                {ring(shape.top, shape.high, from), ring(shape.top, shape.high, to), ring(0, shape.high, 0)},
                {{{u, uv.top}, {v, uv.top}, {u, uv.top}}}, mesh);
    }
}

void AddLathe(const std::vector<pod::Vec2>& profile, int sides, const UvRect& uv, pod::MeshArrays* mesh) {
    constexpr size_t kSteps = 4;
    std::vector<pod::Vec2> curve;
    for (size_t i = 0; i + 1 < profile.size(); ++i)
        for (size_t step = 0; step < kSteps; ++step) {
            // Catmull and Rom's, whose end points repeat.
            const pod::Vec2 &a = profile[i ? i - 1 : 0], &b = profile[i], &c = profile[i + 1],
                            &d = profile[std::min(i + 2, profile.size() - 1)];
            const float t = static_cast<float>(step) / kSteps;
            pod::Vec2 point;
            for (size_t k = 0; k < 2; ++k)
                point[k] =
                    b[k] +
                    0.5f * t *
                        (c[k] - a[k] +
                         t * (2 * a[k] - 5 * b[k] + 4 * c[k] - d[k] + t * (3 * (b[k] - c[k]) + d[k] - a[k])));
            curve.push_back({std::max(point[0], 0.0f), point[1]});
        }
    curve.push_back(profile.back());
    const auto first = static_cast<uint32_t>(mesh->positions.size());
    const float low = profile.front()[1], high = profile.back()[1];
    for (size_t i = 0; i < curve.size(); ++i) {
        const pod::Vec2 &before = curve[i ? i - 1 : 0], &after = curve[std::min(i + 1, curve.size() - 1)];
        const float along = after[1] - before[1], out = before[0] - after[0],
                    length = std::max(std::hypot(along, out), 1e-6f);
        for (int side = 0; side <= sides; ++side) {
            const float s = static_cast<float>(side) / static_cast<float>(sides), x = std::sin(kTurn * s),
                        z = std::cos(kTurn * s);
            const float t = (curve[i][1] - low) / (high - low);
            AddVertex({curve[i][0] * x, curve[i][1], curve[i][0] * z},
                      {x * along / length, out / length, z * along / length},
                      {uv.left + (uv.right - uv.left) * s, uv.bottom + (uv.top - uv.bottom) * t}, mesh);
        }
    }
    AddGridIndices(first, static_cast<uint32_t>(sides) + 1, static_cast<uint32_t>(curve.size()), mesh);
}

void AddBlob(const pod::Vec3& centre, const pod::Vec3& radii, int sides, const UvRect& uv,
             pod::MeshArrays* mesh) {
    const auto first = static_cast<uint32_t>(mesh->positions.size());
    const auto across = static_cast<uint32_t>(sides), up = across / 2;
    for (uint32_t i = 0; i <= up; ++i)
        for (uint32_t j = 0; j <= across; ++j) {
            const float t = static_cast<float>(i) / static_cast<float>(up),
                        s = static_cast<float>(j) / static_cast<float>(across);
            const float height = kTurn / 2 * (t - 0.5f);
            pod::Vec3 out = {std::cos(height) * std::sin(kTurn * s), std::sin(height),
                             std::cos(height) * std::cos(kTurn * s)};
            pod::Vec3 position;
            for (size_t k = 0; k < 3; ++k) position[k] = centre[k] + radii[k] * out[k];
            AddVertex(position, out,
                      {uv.left + (uv.right - uv.left) * s, uv.bottom + (uv.top - uv.bottom) * t}, mesh);
        }
    AddGridIndices(first, across + 1, up + 1, mesh);
}

}  // namespace shapes
