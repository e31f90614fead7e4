/* Meshes of plain arrays: boxes, spheres, cylinders and planes to begin with.
 *
 * Their textures stand upright where the first row is the lower edge, as `qex convert` and
 * `qex texture --flip` write them. Front faces are counter-clockwise.
 */
#ifndef QEX_MESHES_H
#define QEX_MESHES_H

#include "Qex/base.h"
#include "Qex/math.h"

QEX_BEGIN

/** What 16-bit indices reach. */
#define QEX_MESH_MAX_VERTICES 65536u

/** A mesh. Zero it and set what there is; the arrays stay the application's. */
typedef struct QexMesh {
    uint32_t vertexCount;     /* 1 to QEX_MESH_MAX_VERTICES */
    const QexVec3* positions; /* not null */
    const QexVec3* normals;   /* of unit length; null: the model is drawn unlit */
    const QexVec2* uvs;       /* texture coordinates; null: none */
    const uint32_t* colours;  /* 0xAARRGGBB a vertex; null: white */
    uint32_t indexCount;      /* three a triangle; 0: each three vertices are one */
    const uint16_t* indices;  /* null where the count is 0 */
    void* memory;             /* arrays that QexMesh_Create... made, else null */
} QexMesh;

/** Makes the mesh of a box around the origin: 24 vertices, on each face the whole texture.
 *  @param mesh  out; what it held is overwritten, not released. Release with QexMesh_Release
 *  @param width, height, depth  along x, y and z, > 0
 *  @return 0; -1, with a line in the log and an empty mesh, for sizes that are not above 0 or when memory
 *  runs out; -1 for null. No GL context needed. */
QEX_API int32_t QexMesh_CreateBox(QexMesh* mesh, float width, float height, float depth);

/** Makes the mesh of a sphere around the origin: the texture once around from west to east, seen from
 *  outside, its lower edge at the pole -Y and its middle in the direction +Z.
 *  @param radius    > 0
 *  @param segments  3 to 128 from pole to pole, twice as many around
 *  @return as QexMesh_CreateBox, which says the rest; -1 also for other segments. */
QEX_API int32_t QexMesh_CreateSphere(QexMesh* mesh, float radius, uint32_t segments);

/** Makes the mesh of a cylinder about the y axis, its middle in the origin, closed by two discs: the texture
 *  once around its side, and its inscribed circle on each disc.
 *  @param radius, height  > 0
 *  @param segments        around, 3 to 4096
 *  @return as QexMesh_CreateSphere. */
QEX_API int32_t QexMesh_CreateCylinder(QexMesh* mesh, float radius, float height, uint32_t segments);

/** Makes the mesh of a rectangle at y = 0 around the origin that is seen from above, the texture's lower edge
 *  towards +Z.
 *  @param width, depth  along x and z, > 0
 *  @param segments      cells along each side, 1 to 255; vertex lighting gets finer with them
 *  @param repeat        how often the texture goes along each side; above 1 it has to wrap with
 *                       QEX_WRAP_REPEAT
 *  @return as QexMesh_CreateSphere. */
QEX_API int32_t QexMesh_CreatePlane(QexMesh* mesh, float width, float depth, uint32_t segments, float repeat);

/** Frees what QexMesh_Create... made and empties the mesh; the application's own arrays are left alone.
 *  @param mesh  null does nothing. No GL context needed. */
QEX_API void QexMesh_Release(QexMesh* mesh);

QEX_END

#endif
