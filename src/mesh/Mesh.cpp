// Shapes to begin with, and tangents.
#include "mesh/Mesh.h"

#include <cmath>
#include <cstring>
#include <initializer_list>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "math/Pi.h"
#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/meshes.h"

#define QEX_MODULE "src/QexMesh"

namespace {

constexpr float kPi = static_cast<float>(kQexPi);

// Writes a shape's vertices and triangles one after the other.
class Builder {
  public:
    explicit Builder(const QexMeshArrays& arrays) : arrays_(arrays) {}

    void Vertex(const QexVec3& position, const QexVec3& normal, float u, float v) {
        arrays_.positions[vertices_] = position;
        arrays_.normals[vertices_] = normal;
        arrays_.uvs[vertices_++] = {u, v};
    }
    void Triangle(uint32_t a, uint32_t b, uint32_t c) {
        for (const uint32_t index : {a, b, c}) arrays_.indices[indices_++] = static_cast<uint16_t>(index);
    }
    // Two triangles for each cell of a grid of vertices that begins at `first`, row by row from below.
    void Cells(uint32_t first, uint32_t columns, uint32_t rows) {
        for (uint32_t row = 0; row + 1 < rows; ++row)
            for (uint32_t column = 0; column + 1 < columns; ++column) {
                const uint32_t i = first + row * columns + column;
                Triangle(i, i + 1, i + columns);
                Triangle(i + columns, i + 1, i + columns + 1);
            }
    }
    uint32_t Count() const { return vertices_; }

  private:
    QexMeshArrays arrays_;
    uint32_t vertices_ = 0, indices_ = 0;
};

float Share(uint32_t i, uint32_t count) {
    return static_cast<float>(i) / static_cast<float>(count);
}

// The direction at a share of the way around the y axis, from behind over +X, +Z and -X: west to east for who
// looks from outside.
QexVec3 Around(float share) {
    const float angle = 2 * kPi * (share - 0.5f);
    return {std::sin(angle), 0, std::cos(angle)};
}

// The arrays for a shape, or null with a line.
bool Begin(QexMesh* mesh, QexMeshArrays* arrays, const char* function, bool sizes, bool segments,
           uint64_t vertices, uint64_t indices) {
    if (!mesh) return false;
    memset(mesh, 0, sizeof *mesh);
    if (!sizes || !segments) {
        QexError(QEX_TAG, "<%s> %s", function,
                 sizes ? "a number of segments that is out of range" : "sizes have to be above 0");
        return false;
    }
    if (QexMesh_Alloc(mesh, arrays, vertices, indices)) return true;
    QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
    return false;
}

// A disc that closes a cylinder: `up` is 1 above, -1 below.
void AddDisc(Builder* builder, float radius, float y, float up, uint32_t segments) {
    const uint32_t centre = builder->Count();
    const QexVec3 normal = {0, up, 0};
    builder->Vertex({0, y, 0}, normal, 0.5f, 0.5f);
    for (uint32_t i = 0; i <= segments; ++i) {
        const QexVec3 out = Around(Share(i, segments));
        builder->Vertex({radius * out.x, y, radius * out.z}, normal, 0.5f + 0.5f * out.x,
                        0.5f - 0.5f * up * out.z);
    }
    for (uint32_t i = 1; i <= segments; ++i)
        builder->Triangle(centre, centre + (up > 0 ? i : i + 1), centre + (up > 0 ? i + 1 : i));
}

// Any direction perpendicular to a normal, for vertices whose texture has none.
QexVec3 AnyTangent(const QexVec3& normal) {
    const QexVec3 axis = std::fabs(normal.x) < 0.9f ? QexVec3{1, 0, 0} : QexVec3{0, 1, 0};
    QexVec3 tangent;
    QexVec3_CrossProduct(&tangent, &axis, &normal);
    QexVec3_Normalize(&tangent, &tangent);
    return tangent;
}

// Adds the direction in which u grows over a triangle to its corners.
void AddTangent(const QexMesh& mesh, const uint32_t (&corner)[3], QexVec3* tangents) {
    const QexVec2 *a = &mesh.uvs[corner[0]], *b = &mesh.uvs[corner[1]], *c = &mesh.uvs[corner[2]];
    QexVec3 ab, ac, tangent;
    QexVec3_Subtract(&ab, &mesh.positions[corner[1]], &mesh.positions[corner[0]]);
    QexVec3_Subtract(&ac, &mesh.positions[corner[2]], &mesh.positions[corner[0]]);
    const float area = (b->x - a->x) * (c->y - a->y) - (c->x - a->x) * (b->y - a->y);
    if (area == 0) return;
    QexVec3_Scale(&ab, &ab, (c->y - a->y) / area);
    QexVec3_Scale(&ac, &ac, (b->y - a->y) / area);
    QexVec3_Subtract(&tangent, &ab, &ac);
    for (const uint32_t vertex : corner) QexVec3_Add(&tangents[vertex], &tangents[vertex], &tangent);
}

}  // namespace

bool QexMesh_Alloc(QexMesh* mesh, QexMeshArrays* arrays, uint64_t vertexCount, uint64_t indexCount) {
    memset(mesh, 0, sizeof *mesh);
    const uint64_t floats = vertexCount * 8;
    float* block = QexMemory_AllocArray<float>(floats + (indexCount + 1) / 2);
    if (!block) return false;
    arrays->positions = reinterpret_cast<QexVec3*>(block);
    arrays->normals = arrays->positions + vertexCount;
    arrays->uvs = reinterpret_cast<QexVec2*>(arrays->normals + vertexCount);
    arrays->indices = reinterpret_cast<uint16_t*>(arrays->uvs + vertexCount);
    *mesh = {static_cast<uint32_t>(vertexCount),
             arrays->positions,
             arrays->normals,
             arrays->uvs,
             nullptr,
             static_cast<uint32_t>(indexCount),
             arrays->indices,
             block};
    return true;
}

void QexMesh_MakeTangents(const QexMesh& mesh, QexVec3* tangents) {
    memset(tangents, 0, mesh.vertexCount * sizeof *tangents);
    const uint32_t corners = QexMesh_CornerCount(mesh);
    for (uint32_t i = 0; i + 3 <= corners; i += 3)
        AddTangent(mesh, {QexMesh_Corner(mesh, i), QexMesh_Corner(mesh, i + 1), QexMesh_Corner(mesh, i + 2)},
                   tangents);
    for (uint32_t v = 0; v < mesh.vertexCount; ++v) {
        const QexVec3& normal = mesh.normals[v];
        QexVec3 along;
        QexVec3_Scale(&along, &normal, QexVec3_DotProduct(&normal, &tangents[v]));
        QexVec3_Subtract(&tangents[v], &tangents[v], &along);
        QexVec3_Normalize(&tangents[v], &tangents[v]);
        if (!(QexVec3_DotProduct(&tangents[v], &tangents[v]) > 0.5f)) tangents[v] = AnyTangent(normal);
    }
}

extern "C" {

int32_t QexMesh_CreateBox(QexMesh* mesh, float width, float height, float depth) {
    // Normal and the direction of u; v goes in the direction of normal x u.
    static const QexVec3 faces[6][2] = {{{1, 0, 0}, {0, 0, -1}}, {{-1, 0, 0}, {0, 0, 1}},
                                        {{0, 1, 0}, {1, 0, 0}},  {{0, -1, 0}, {1, 0, 0}},
                                        {{0, 0, 1}, {1, 0, 0}},  {{0, 0, -1}, {-1, 0, 0}}};
    QexMeshArrays arrays;
    if (!Begin(mesh, &arrays, "QexMesh_CreateBox", width > 0 && height > 0 && depth > 0, true, 24, 36))
        return -1;
    Builder builder(arrays);
    for (const auto& face : faces) {
        QexVec3 up;
        QexVec3_CrossProduct(&up, &face[0], &face[1]);
        const uint32_t first = builder.Count();
        for (int i = 0; i < 4; ++i) {
            QexVec3 right, at;
            QexVec3_Scale(&right, &face[1], i & 1 ? 1.0f : -1.0f);
            QexVec3_Scale(&at, &up, i & 2 ? 1.0f : -1.0f);
            QexVec3_Add(&at, &at, &right);
            QexVec3_Add(&at, &at, &face[0]);
            builder.Vertex({at.x * width / 2, at.y * height / 2, at.z * depth / 2}, face[0],
                           static_cast<float>(i & 1), static_cast<float>(i >> 1));
        }
        builder.Cells(first, 2, 2);
    }
    return 0;
}

int32_t QexMesh_CreateSphere(QexMesh* mesh, float radius, uint32_t segments) {
    const uint32_t columns = 2 * segments + 1, rows = segments + 1;
    QexMeshArrays arrays;
    if (!Begin(mesh, &arrays, "QexMesh_CreateSphere", radius > 0, segments >= 3 && segments <= 128,
               uint64_t{columns} * rows, uint64_t{segments} * segments * 12))
        return -1;
    Builder builder(arrays);
    for (uint32_t row = 0; row < rows; ++row)
        for (uint32_t column = 0; column < columns; ++column) {
            const float u = Share(column, columns - 1), v = Share(row, segments);
            const float up = kPi * (v - 0.5f), across = std::cos(up);
            const QexVec3 out = Around(u), normal = {across * out.x, std::sin(up), across * out.z};
            builder.Vertex({radius * normal.x, radius * normal.y, radius * normal.z}, normal, u, v);
        }
    builder.Cells(0, columns, rows);
    return 0;
}

int32_t QexMesh_CreateCylinder(QexMesh* mesh, float radius, float height, uint32_t segments) {
    QexMeshArrays arrays;
    if (!Begin(mesh, &arrays, "QexMesh_CreateCylinder", radius > 0 && height > 0,
               segments >= 3 && segments <= 4096, uint64_t{segments} * 4 + 6, uint64_t{segments} * 12))
        return -1;
    Builder builder(arrays);
    for (const float end : {-0.5f, 0.5f})
        for (uint32_t i = 0; i <= segments; ++i) {
            const QexVec3 out = Around(Share(i, segments));
            builder.Vertex({radius * out.x, end * height, radius * out.z}, out, Share(i, segments),
                           end + 0.5f);
        }
    builder.Cells(0, segments + 1, 2);
    AddDisc(&builder, radius, -height / 2, -1, segments);
    AddDisc(&builder, radius, height / 2, 1, segments);
    return 0;
}

int32_t QexMesh_CreatePlane(QexMesh* mesh, float width, float depth, uint32_t segments, float repeat) {
    const uint32_t side = segments + 1;
    QexMeshArrays arrays;
    if (!Begin(mesh, &arrays, "QexMesh_CreatePlane", width > 0 && depth > 0, segments >= 1 && segments <= 255,
               uint64_t{side} * side, uint64_t{segments} * segments * 6))
        return -1;
    Builder builder(arrays);
    for (uint32_t row = 0; row < side; ++row)
        for (uint32_t column = 0; column < side; ++column) {
            const float u = Share(column, segments), v = Share(row, segments);
            builder.Vertex({width * (u - 0.5f), 0, depth * (0.5f - v)}, {0, 1, 0}, repeat * u, repeat * v);
        }
    builder.Cells(0, side, side);
    return 0;
}

void QexMesh_Release(QexMesh* mesh) {
    if (!mesh) return;
    QexMemory_Free(mesh->memory);
    memset(mesh, 0, sizeof *mesh);
}

}  // extern "C"
