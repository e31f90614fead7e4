// Vertex colours as a texture: no shader module reads colours of vertices, all read a texture.
//
// A triangle gets a patch of 4 x 4 texels, its corners in the middles of three corner texels. Linear
// filtering between texels of a colour that changes evenly is exact, so the triangle shows what interpolating
// between its vertices would.
#include "mesh/Colours.h"

#include "base/Memory.h"
#include "mesh/Mesh.h"
#include "Qex/meshes.h"

namespace {

constexpr uint32_t kPatch = 4;  // texels along a side

uint8_t Channel(uint32_t colour, int c) {
    return static_cast<uint8_t>(colour >> (c == 3 ? 24 : 16 - 8 * c));
}

// Beyond the triangle's long side colours go on evenly, as far as bytes can hold them.
void PaintPatch(uint8_t* out, uint32_t rowBytes, const uint32_t (&corner)[3]) {
    for (uint32_t y = 0; y < kPatch; ++y)
        for (uint32_t x = 0; x < kPatch; ++x)
            for (int c = 0; c < 4; ++c) {
                const int32_t origin = Channel(corner[0], c), last = kPatch - 1;
                const int32_t toX = Channel(corner[1], c) - origin, toY = Channel(corner[2], c) - origin;
                const int32_t value =
                    origin + (toX * static_cast<int32_t>(x) + toY * static_cast<int32_t>(y)) / last;
                out[y * rowBytes + x * 4 + static_cast<uint32_t>(c)] =
                    static_cast<uint8_t>(value < 0     ? 0
                                         : value > 255 ? 255
                                                       : value);
            }
}

bool OneColour(const QexMesh& mesh) {
    for (uint32_t i = 1; i < mesh.vertexCount; ++i)
        if (mesh.colours[i] != mesh.colours[0]) return false;
    return true;
}

// Patches along a side of the texture.
uint32_t GridSide(uint32_t triangles) {
    uint32_t side = 1;
    while (side * side < triangles) ++side;
    return side;
}

bool AllocPixels(QexMeshColours* colours, uint32_t side) {
    *colours = {QexMemory_AllocZeroed<uint8_t>(uint64_t{side} * side * 4), side, side};
    return colours->pixels != nullptr;
}

// The vertices of one triangle, its texture coordinates in the patch at (column, row).
void PartTriangle(const QexMesh& mesh, uint32_t triangle, uint32_t column, uint32_t row, uint32_t side,
                  const QexMeshArrays& out) {
    for (uint32_t i = 0; i < 3; ++i) {
        const uint32_t at = 3 * triangle + i, from = QexMesh_Corner(mesh, at);
        const uint32_t x = column * kPatch + (i == 1 ? kPatch - 1 : 0);
        const uint32_t y = row * kPatch + (i == 2 ? kPatch - 1 : 0);
        out.positions[at] = mesh.positions[from];
        if (mesh.normals) out.normals[at] = mesh.normals[from];
        out.uvs[at] = {(static_cast<float>(x) + 0.5f) / static_cast<float>(side),
                       (static_cast<float>(y) + 0.5f) / static_cast<float>(side)};
    }
}

}  // namespace

const char* QexMesh_BakeColours(const QexMesh& mesh, QexMesh* parted, QexMeshColours* colours) {
    static const char* const noMemory = "out of memory";
    *parted = {};
    *colours = {};
    if (OneColour(mesh)) {
        if (!AllocPixels(colours, 1)) return noMemory;
        for (int c = 0; c < 4; ++c) colours->pixels[c] = Channel(mesh.colours[0], c);
        return nullptr;
    }
    const uint32_t triangles = QexMesh_CornerCount(mesh) / 3, grid = GridSide(triangles);
    if (triangles * 3 > QEX_MESH_MAX_VERTICES) return "at most 21845 triangles can have colours";
    QexMeshArrays arrays;
    if (!AllocPixels(colours, grid * kPatch) || !QexMesh_Alloc(parted, &arrays, uint64_t{triangles} * 3, 0)) {
        QexMemory_FreeArray(colours->pixels);
        return noMemory;
    }
    if (!mesh.normals) parted->normals = nullptr;
    const uint32_t rowBytes = colours->width * 4;
    for (uint32_t i = 0; i < triangles; ++i) {
        const uint32_t column = i % grid, row = i / grid;
        PartTriangle(mesh, i, column, row, colours->width, arrays);
        PaintPatch(colours->pixels + row * kPatch * rowBytes + column * kPatch * 4, rowBytes,
                   {mesh.colours[QexMesh_Corner(mesh, 3 * i)], mesh.colours[QexMesh_Corner(mesh, 3 * i + 1)],
                    mesh.colours[QexMesh_Corner(mesh, 3 * i + 2)]});
    }
    return nullptr;
}
