// Vertex colours as a texture.
#pragma once

#include <cstdint>

#include "Qex/meshes.h"

// The colours of a mesh as a texture: RGBA, width x height, the first row at t = 0.
struct QexMeshColours {
    uint8_t* pixels;  // owned; from QexMemory_Alloc
    uint32_t width, height;
};

// Bakes vertex colours. One colour for all leaves the mesh as it is, and `parted` empty; otherwise `parted`
// is the mesh with three vertices of its own for each triangle and the texture coordinates of its patch.
// Null, or why it cannot be done.
const char* QexMesh_BakeColours(const QexMesh& mesh, QexMesh* parted, QexMeshColours* colours);
